// The typed wrapper of a generic object and the collection helpers.
#include "schema/SchemaTestSupport.h"

TEST(GenericObjectWrapper, TypedAccessThrows) {
  EXPECT_EQ(WrongObjectType,
            thrownBy([] { GenericObjectWrapper::create(SharedPointer<gom::GenericObject>()); }));

  SharedPointer<GenericObjectWrapper> w = GenericObjectWrapper::create(9);
  ASSERT_TRUE(w);
  int v = 0;
  EXPECT_EQ(NotFound, thrownBy([&] { w->getProperty(1, v, "v"); })) << "a missing property";
  w->setProperty(1, 42, "v");
  unsigned char wrongKind = 0;
  EXPECT_EQ(Refused, thrownBy([&] { w->getProperty(1, wrongKind, "v"); })) << "a kind mismatch";
  EXPECT_EQ(Refused, thrownBy([&] { w->setProperty(1, wrongKind, "v"); }));

  // clone() is a deep copy of the wrapped object.
  SharedPointer<gom::GenericObject> clone = w->clone();
  EXPECT_NE(clone.get(), w->wrappedObject().get());
  EXPECT_TRUE(*clone == w->object());
}

TEST(InternalUtility, CollectionOperations) {
  SharedPointer<gom::GenericObject> o = gom::GenericObject::create(1);
  SharedPointer<gom::ValueCollection> c;
  bool created = false;
  ASSERT_EQ(Ok, InternalUtility::getCollection(o, 300, c, created));
  EXPECT_TRUE(created);
  ASSERT_EQ(Ok, InternalUtility::getCollection(o, 300, c, created));
  EXPECT_FALSE(created);

  SharedPointer<gom::GenericObject> item = gom::GenericObject::create(2);
  ASSERT_EQ(Ok, InternalUtility::addGenericObjectToCollection(o, 301, item));
  EXPECT_TRUE(o->propertyExists(301));
  ASSERT_EQ(Ok, o->setUint8Property(302, 1));
  EXPECT_EQ(Refused, InternalUtility::addGenericObjectToCollection(o, 302, item));
  EXPECT_EQ(Refused, InternalUtility::getCollection(o, 302, c, created));
}
