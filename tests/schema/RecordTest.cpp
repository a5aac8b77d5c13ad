// The value-record conventions, on two small records made for the test.
#include <cmath>

#include "schema/SchemaTestSupport.h"

namespace {

class Inner : public Record<Inner, 7001,
                            FieldTable<unsigned char, Field<unsigned char, 1>,
                                       Field<unsigned short, 2>, Field<signed char, 8>,
                                       Field<float, 16>>> {
 public:
  LODESTACK_RECORD_PROPERTY(0, a, setA)
  LODESTACK_RECORD_PROPERTY(1, b, setB)
  LODESTACK_RECORD_PROPERTY(2, c, setC)
  LODESTACK_RECORD_PROPERTY(3, d, setD)
};

class Outer : public Record<Outer, 7002,
                            FieldTable<unsigned char, Field<SharedPointer<Inner>, 1>,
                                       Field<unsigned int, 4>>> {
 public:
  LODESTACK_RECORD_PROPERTY(0, inner, setInner)
  LODESTACK_RECORD_PROPERTY(1, n, setN)
};

}  // namespace

TEST(Record, PresenceSettersAndEquality) {
  SharedPointer<Inner> x = Inner::create();
  SharedPointer<Inner> y = Inner::create();
  EXPECT_EQ(Ok, x->setA(5));
  EXPECT_EQ(Ok, x->setC(-3));
  EXPECT_EQ(9, x->presenceMask());
  EXPECT_FALSE(x->valueExists(1 | 2)) << "every bit asked must be present";

  // Absent values do not take part in equality, whatever they hold.
  y->setA(5);
  y->setC(-3);
  y->setB(77);
  y->unset(2);
  EXPECT_EQ(77, y->b()) << "unset clears the bit only";
  EXPECT_TRUE(*x == *y);
  y->setB(77);
  EXPECT_FALSE(*x == *y) << "a present value against an absent one";
  x->setB(78);
  EXPECT_FALSE(x->compare(y.get()));
  x->setB(77);

  // The ObjectBase part decides last.
  y->extension();
  EXPECT_FALSE(*x == *y);
  y->deleteExtension();

  // Record-valued fields: by content; an empty pointer is absent.
  SharedPointer<Outer> o1 = Outer::create();
  SharedPointer<Outer> o2 = Outer::create();
  o1->setInner(x);
  o2->setInner(Inner::create(x));
  EXPECT_TRUE(*o1 == *o2);
  o2->inner()->setD(1.5f);
  EXPECT_FALSE(*o1 == *o2);
  EXPECT_FALSE(x->valueExists(16)) << "the copy is deep";
  o2->setInner(SharedPointer<Inner>());
  EXPECT_FALSE(o2->valueExists(1));
  EXPECT_FALSE(o1->compare(x.get())) << "records of another class";
}

TEST(Record, BytesAndClone) {
  SharedPointer<Inner> x = Inner::create();
  x->setB(0x1234);
  x->setC(-2);
  x->setD(1.0f);
  const Bytes expected = {1, 2 | 8 | 16, 0x34, 0x12, 0xFE, 0x00, 0x00, 0x80, 0x3F};
  EXPECT_EQ(expected, bytesOf(*x)) << "version, mask, present fields at their widths";

  SharedPointer<Outer> outer = Outer::create();
  outer->setInner(x);
  outer->setN(0xA0B0C0D0u);
  outer->extension()->setUint8Property(1, 1);  // not part of the bytes
  Bytes bytes = bytesOf(*outer);
  EXPECT_EQ(2u + expected.size() + 4u, bytes.size());
  SharedPointer<Outer> back = Outer::create();
  ASSERT_TRUE(readFrom(*back, bytes));

  // A clone copies the nested record and the extension.
  SharedPointer<Outer> copy = SharedPointer<Outer>::cast(outer->clone());
  ASSERT_TRUE(copy);
  EXPECT_TRUE(*copy == *outer);
  EXPECT_NE(copy->inner().get(), outer->inner().get());
  EXPECT_NE(copy->extensionReference().get(), outer->extensionReference().get());
  outer->deleteExtension();
  EXPECT_TRUE(*outer == *back);
  EXPECT_FALSE(Outer::create(SharedPointer<Outer>()));

  // A NaN read back equals itself, so a record always equals its own copy.
  x->setD(std::nanf(""));
  SharedPointer<Inner> nan = Inner::create();
  ASSERT_TRUE(readFrom(*nan, bytesOf(*x)));
  EXPECT_TRUE(*nan == *x);

  // Wrong version or short input: failure, record cleared.
  bytes[0] = 2;
  EXPECT_FALSE(readFrom(*back, bytes));
  EXPECT_EQ(0, back->presenceMask());
  bytes[0] = 1;
  bytes.pop_back();
  EXPECT_FALSE(readFrom(*back, bytes));
  EXPECT_EQ(0, back->presenceMask());
  EXPECT_FALSE(back->inner());
}
