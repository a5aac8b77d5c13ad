// Builds a small measurement-like object tree, writes it to bytes, reads the
// bytes back and prints both trees and the bytes.
#include <cstdio>
#include <string>

#include <lodestack/lodestack.h>

using namespace lodestack;
using namespace lodestack::gom;

namespace {

void print(const GenericObject& object, int indent);

void printVariant(const Variant& v, int indent) {
  std::printf("%*s[%u] ", indent, "", v.key());
  switch (v.dataType()) {
    case Variant::TypeUint8: { unsigned char x = 0; (void)v.getUint8Value(x); std::printf("uint8 %u\n", x); break; }
    case Variant::TypeInt16: { short x = 0; (void)v.getInt16Value(x); std::printf("int16 %d\n", x); break; }
    case Variant::TypeUint32: { unsigned int x = 0; (void)v.getUint32Value(x); std::printf("uint32 %u\n", x); break; }
    case Variant::TypeDouble: { double x = 0; (void)v.getDoubleValue(x); std::printf("double %.7f\n", x); break; }
    case Variant::TypeString: {
      SharedPointer<CharacterData> s;
      (void)v.getStringValue(s);
      std::printf("string \"%s\"\n", s && s->data() ? s->data() : "");
      break;
    }
    case Variant::TypeGenericObject: {
      SharedPointer<GenericObject> o;
      (void)v.getGenericObjectValue(o);
      std::printf("object\n");
      print(*o, indent + 2);
      break;
    }
    case Variant::TypeCollection: {
      SharedPointer<ValueCollection> c;
      (void)v.getCollectionValue(c);
      std::printf("collection of %u\n", c->size());
      for (const Variant* item : *c) printVariant(*item, indent + 2);
      break;
    }
    default:
      std::printf("code %u\n", v.dataType());
  }
}

void print(const GenericObject& object, int indent) {
  std::printf("%*sobject key %u, %u properties\n", indent, "", object.key(), object.propertyCount());
  for (const InternalVariant& p : object.properties()) printVariant(p, indent + 2);
}

SharedPointer<GenericObject> makeCell(unsigned int cellId, short rxLevel) {
  SharedPointer<GenericObject> cell = GenericObject::create(2);
  (void)cell->setUint32Property(205, 1700000000u);
  (void)cell->setUint32Property(1, cellId);
  (void)cell->setInt16Property(2, rxLevel);
  return cell;
}

}  // namespace

int main() {
  SharedPointer<GenericObject> container = GenericObject::create(1);
  SharedPointer<ValueCollection> cells = ValueCollection::create();
  for (unsigned int i = 0; i < 3; ++i) {
    Variant* item = Variant::create();
    (void)item->setGenericObjectValue(makeCell(1000 + i, static_cast<short>(-70 - 5 * static_cast<int>(i))));
    if (cells->add(item) != Ok) delete item;
  }
  (void)container->setCollectionProperty(300, cells);
  const char name[] = "host";
  (void)container->setStringProperty(10, CharacterData::create(name, sizeof name - 1));
  (void)container->setDoubleProperty(11, 60.1699);

  BufferStream stream;
  if (!container->write(stream)) {
    std::fprintf(stderr, "writing failed\n");
    return 1;
  }
  std::printf("written:\n");
  print(*container, 2);
  std::printf("%u bytes:", stream.buffer().size());
  for (unsigned int i = 0; i < stream.buffer().size(); ++i)
    std::printf("%s%02X", i % 24 ? " " : "\n  ", stream.buffer().data()[i]);
  std::printf("\n");

  SharedPointer<GenericObject> back = GenericObject::create(stream);
  if (!back) {
    std::fprintf(stderr, "reading failed\n");
    return 1;
  }
  std::printf("read back:\n");
  print(*back, 2);
  const bool same = *back == *container;
  std::printf("round trip %s\n", same ? "equal" : "DIFFERENT");
  return same ? 0 : 1;
}
