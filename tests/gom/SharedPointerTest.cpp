#include <gtest/gtest.h>

#include "lodestack/gom/SharedPointer.h"

namespace lodestack::gom {
namespace {

struct Probe : ReferenceCountable {
  explicit Probe(int* destroyed) : destroyed(destroyed) {}
  ~Probe() override { ++*destroyed; }
  int* destroyed;
};
struct DerivedProbe : Probe {
  using Probe::Probe;
};

TEST(SharedPointer, CountsConvertsAndCasts) {
  int destroyed = 0;
  SharedPointer<Probe> a(new Probe(&destroyed));
  EXPECT_EQ(a->referenceCount(), 1);
  {
    SharedPointer<Probe> b = a;
    EXPECT_EQ(a->referenceCount(), 2);
  }
  EXPECT_EQ(a->referenceCount(), 1);
  EXPECT_EQ(destroyed, 0);

  a = a;  // self-assignment keeps the count
  EXPECT_EQ(a->referenceCount(), 1);

  a = SharedPointer<Probe>();  // null over the last reference
  EXPECT_EQ(destroyed, 1);
  EXPECT_FALSE(a);

  a.clear();  // on null: nothing
  EXPECT_TRUE(a.isNull());

  destroyed = 0;
  SharedPointer<DerivedProbe> derived(new DerivedProbe(&destroyed));
  SharedPointer<Probe> base = derived;
  EXPECT_EQ(base->referenceCount(), 2);
  EXPECT_EQ(SharedPointer<DerivedProbe>::cast(base), derived);

  SharedPointer<Probe> plain(new Probe(&destroyed));
  EXPECT_FALSE(SharedPointer<DerivedProbe>::cast(plain)) << "another class gives null";

  SharedPointer<Probe> moved = std::move(base);
  EXPECT_FALSE(base);
  EXPECT_EQ(moved->referenceCount(), 2) << "a move takes no new reference";
  derived.clear();
  moved.clear();
  plain.clear();
  EXPECT_EQ(destroyed, 2);
}

}  // namespace
}  // namespace lodestack::gom
