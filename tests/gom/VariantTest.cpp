#include <functional>
#include <limits>
#include <memory>

#include <gtest/gtest.h>

#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/stream/BufferStream.h"

namespace lodestack::gom {
namespace {

// A variant keeps the kind it first took, and compares by key, kind and
// bit image.
TEST(Variant, KindsAndEquality) {
  Variant u8(1), i8(1);
  EXPECT_EQ(u8.setUint8Value(200), Ok);
  EXPECT_EQ(u8.setInt8Value(-1), Refused);
  unsigned char u = 0;
  EXPECT_EQ(u8.getUint8Value(u), Ok);
  EXPECT_EQ(u, 200) << "a refused setter leaves the value";
  signed char i = 99;
  EXPECT_EQ(u8.getInt8Value(i), Refused);
  EXPECT_EQ(i, 99) << "no conversion between kinds";
  bool b;
  EXPECT_EQ(Variant().getBooleanValue(b), Refused) << "an empty variant has no kind";
  ASSERT_EQ(i8.setInt8Value(-56), Ok);
  EXPECT_NE(i8, u8) << "the same bits in another kind";

  Variant other(2, u8);
  EXPECT_NE(other, u8) << "another key makes another variant";
  EXPECT_EQ(Variant(1, other), u8);

  const double nan = std::numeric_limits<double>::quiet_NaN();
  Variant n1(1), n2(1), z1(1), z2(1);
  ASSERT_EQ(n1.setDoubleValue(nan), Ok);
  ASSERT_EQ(n2.setDoubleValue(nan), Ok);
  ASSERT_EQ(z1.setFloatValue(0.0f), Ok);
  ASSERT_EQ(z2.setFloatValue(-0.0f), Ok);
  EXPECT_EQ(n1, n2) << "the identical NaN is equal to itself";
  EXPECT_NE(z1, z2) << "+0 and -0 differ bitwise";
}

TEST(Variant, CopiesShareAndClonesCopy) {
  SharedPointer<GenericObject> inner = GenericObject::create(5);
  ASSERT_EQ(inner->setUint8Property(1, 1), Ok);
  Variant v(3);
  ASSERT_EQ(v.setGenericObjectValue(inner), Ok);
  Variant shared = v;
  EXPECT_EQ(inner->referenceCount(), 3) << "a copy shares the object";

  std::unique_ptr<Variant> deep(v.clone());
  SharedPointer<GenericObject> got;
  ASSERT_TRUE(deep && deep->getGenericObjectValue(got) == Ok);
  EXPECT_NE(got, inner) << "a clone holds its own object";
  EXPECT_EQ(*deep, v) << "which compares equal by content";

  shared = Variant();
  v = Variant();
  EXPECT_EQ(inner->referenceCount(), 1) << "assignment releases the object";
}

// A variant that holds the last reference to an object is assigned one of
// that object's properties: copy, move and deep copy read it before the
// object goes (ASan and valgrind watch).
TEST(Variant, AssignedFromInsideTheObjectItReleases) {
  const std::function<void(Variant&, Variant&)> forms[] = {
      [](Variant& to, Variant& from) { to = from; },
      [](Variant& to, Variant& from) { to = std::move(from); },
      [](Variant& to, Variant& from) { EXPECT_EQ(to.cloneFrom(from), Ok); }};
  for (const auto& assign : forms) {
    SharedPointer<GenericObject> object = GenericObject::create(5);
    ASSERT_EQ(object->setStringProperty(7, CharacterData::create("abc", 3)), Ok);
    Variant v(1);
    ASSERT_EQ(v.setGenericObjectValue(object), Ok);
    InternalVariant* property = object->findProperty(7);
    object.clear();
    assign(v, *property);
    SharedPointer<CharacterData> text;
    EXPECT_EQ(v.key(), 7);
    ASSERT_EQ(v.getStringValue(text), Ok);
    EXPECT_STREQ(text->data(), "abc");
    EXPECT_EQ(text->referenceCount(), 2) << "held by the variant and here";
  }
}

TEST(ValueCollection, OrderedEqualityCloneAndRemoval) {
  SharedPointer<ValueCollection> ab = ValueCollection::create();
  SharedPointer<ValueCollection> ba = ValueCollection::create();
  Variant a(1), b(2);
  ASSERT_EQ(a.setUint32Value(10), Ok);
  ASSERT_EQ(b.setUint32Value(20), Ok);
  ASSERT_TRUE(ab->add(new Variant(a)) == Ok && ab->add(new Variant(b)) == Ok);
  ASSERT_TRUE(ba->add(new Variant(b)) == Ok && ba->add(new Variant(a)) == Ok);
  EXPECT_NE(*ab, *ba);

  SharedPointer<ValueCollection> copy = ab->clone();
  ASSERT_TRUE(copy);
  EXPECT_EQ(*copy, *ab);
  EXPECT_NE(copy->item(0), ab->item(0));
  EXPECT_EQ(copy->item(2), nullptr);

  Variant** next = nullptr;
  ASSERT_EQ(copy->remove(&(*copy)[0], next), Ok);
  ASSERT_NE(next, nullptr);
  EXPECT_EQ(**next, b);
  ASSERT_EQ(copy->remove(next, next), Ok);
  EXPECT_EQ(next, nullptr);
  EXPECT_TRUE(copy->empty());
  EXPECT_EQ(copy->remove(&(*ab)[0], next), NotFound) << "an element of another collection";
}

TEST(CharacterData, EmptyFromTextDiffersFromEmptyFromBytes) {
  SharedPointer<CharacterData> fromText = CharacterData::create("", 0);
  ASSERT_TRUE(fromText);
  ASSERT_NE(fromText->data(), nullptr);
  BufferStream s;
  ASSERT_TRUE(fromText->write(s));
  SharedPointer<CharacterData> fromBytes = CharacterData::create(s);
  ASSERT_TRUE(fromBytes);
  EXPECT_EQ(fromBytes->data(), nullptr);
  EXPECT_NE(*fromText, *fromBytes) << "kept asymmetry: one holds an array, the other none";
  EXPECT_EQ(*fromBytes, *fromBytes->clone());

  SharedPointer<CharacterData> ab = CharacterData::create("abc", 2);
  EXPECT_STREQ(ab->data(), "ab");
  EXPECT_EQ(ab->length(), 2u);
  EXPECT_EQ(*ab, *ab->clone());
  EXPECT_NE(*ab, *CharacterData::create("ac", 2));
}

}  // namespace
}  // namespace lodestack::gom
