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

// A list node that owns the next one.
struct Node : Probe {
  using Probe::Probe;
  SharedPointer<Node> next;
};

// Popping a list assigns a handle from a member of the object it releases.
TEST(SharedPointer, AssignmentFromAMemberOfTheOldPointee) {
  int destroyed = 0;
  SharedPointer<Node> head;
  for (int i = 0; i < 4; ++i) {
    SharedPointer<Node> node(new Node(&destroyed));
    node->next = head;
    head = node;
  }
  head = head->next;
  EXPECT_EQ(destroyed, 1) << "only the old head goes";
  EXPECT_EQ(head->referenceCount(), 1);
  head = std::move(head->next);
  EXPECT_EQ(destroyed, 2);
  EXPECT_EQ(head->referenceCount(), 1);

  // The handle assigned to may itself live inside the object it releases:
  // in a two-node cycle, the last node's handle releases the first, which
  // holds the last.
  head->next->next = head;
  Node* last = head->next.get();
  head.clear();
  SharedPointer<Node> spare(new Node(&destroyed));
  last->next = spare;
  EXPECT_EQ(destroyed, 4);
  EXPECT_EQ(spare->referenceCount(), 1);
}

}  // namespace
}  // namespace lodestack::gom
