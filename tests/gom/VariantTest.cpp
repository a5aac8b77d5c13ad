#include <cmath>
#include <functional>
#include <limits>

#include <gtest/gtest.h>

#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/stream/BufferStream.h"

namespace lodestack::gom {
namespace {

TEST(Variant, NeverChangesKind) {
  Variant v(1);
  EXPECT_EQ(v.setUint8Value(200), Ok);
  EXPECT_EQ(v.setInt8Value(-1), Refused);
  unsigned char u8 = 0;
  EXPECT_EQ(v.getUint8Value(u8), Ok);
  EXPECT_EQ(u8, 200) << "a refused setter leaves the value";

  signed char i8 = 99;
  EXPECT_EQ(v.getInt8Value(i8), Refused);
  EXPECT_EQ(i8, 99) << "no conversion between kinds";

  Variant empty;
  bool b;
  EXPECT_EQ(empty.getBooleanValue(b), Refused);
  EXPECT_EQ(empty.setStringValue(CharacterData::create("x", 1)), Ok);
  EXPECT_EQ(empty.setUint32Value(1), Refused);
}

TEST(Variant, EqualityIsByKeyKindAndBitImage) {
  Variant a(1), b(2);
  ASSERT_EQ(a.setUint32Value(5), Ok);
  ASSERT_EQ(b.setUint32Value(5), Ok);
  EXPECT_NE(a, b) << "another key makes another variant";
  EXPECT_EQ(a, Variant(1, b));

  const double nan = std::numeric_limits<double>::quiet_NaN();
  Variant n1(1), n2(1), z1(1), z2(1);
  ASSERT_EQ(n1.setDoubleValue(nan), Ok);
  ASSERT_EQ(n2.setDoubleValue(nan), Ok);
  ASSERT_EQ(z1.setFloatValue(0.0f), Ok);
  ASSERT_EQ(z2.setFloatValue(-0.0f), Ok);
  EXPECT_EQ(n1, n2) << "the identical NaN is equal to itself";
  EXPECT_NE(z1, z2) << "+0 and -0 differ bitwise";

  Variant i8(1), u8(1);
  ASSERT_EQ(i8.setInt8Value(1), Ok);
  ASSERT_EQ(u8.setUint8Value(1), Ok);
  EXPECT_NE(i8, u8) << "kinds differ";
}

TEST(Variant, CopiesShareAndClonesCopy) {
  SharedPointer<GenericObject> inner = GenericObject::create(5);
  ASSERT_EQ(inner->setUint8Property(1, 1), Ok);
  Variant v(3);
  ASSERT_EQ(v.setGenericObjectValue(inner), Ok);
  EXPECT_EQ(inner->referenceCount(), 2);

  Variant shared = v;
  EXPECT_EQ(inner->referenceCount(), 3) << "a copy shares the object";

  SharedPointer<GenericObject> got;
  Variant* deep = v.clone();
  ASSERT_NE(deep, nullptr);
  ASSERT_EQ(deep->getGenericObjectValue(got), Ok);
  EXPECT_NE(got, inner) << "a clone holds its own object";
  EXPECT_EQ(*deep, v) << "which compares equal by content";
  got.clear();
  delete deep;

  SharedPointer<ValueCollection> list = ValueCollection::create();
  Variant holder(4);
  ASSERT_EQ(holder.setCollectionValue(list), Ok);
  EXPECT_EQ(list->referenceCount(), 2);
  holder = v;
  EXPECT_EQ(list->referenceCount(), 1) << "assignment releases the held collection";
  shared = Variant();
  v = Variant();
  holder = Variant();
  EXPECT_EQ(inner->referenceCount(), 1);
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
