// Fuzzes the readers of the byte format: generic objects, variants, value
// collections and strings, including records reached through code-14
// variants. Whatever reads successfully must write back to bytes that read
// to an equal object, and its deep clone must compare equal.
#include <cstdint>
#include <cstdlib>

#include <lodestack/lodestack.h>

using namespace lodestack;
using namespace lodestack::gom;

namespace {

// An object of key 0 reads back from its own bytes differently on purpose
// (the reader stops after the key), so trees holding one skip the round trip.
bool hasKeyZero(const Variant& v) {
  SharedPointer<GenericObject> object;
  SharedPointer<ValueCollection> collection;
  if (v.getGenericObjectValue(object) == Ok && object) {
    if (object->key() == 0) return true;
    for (const InternalVariant& p : object->properties())
      if (hasKeyZero(p)) return true;
  } else if (v.getCollectionValue(collection) == Ok && collection) {
    for (const Variant* item : *collection)
      if (hasKeyZero(*item)) return true;
  }
  return false;
}

// Writes `first`, reads the bytes into `second` and requires equality.
template <class T>
void checkRoundTrip(const T& first, T& second) {
  BufferStream out;
  if (!first.write(out)) std::abort();
  BufferStream in(out.buffer());
  if (!second.read(in) || !(first == second)) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size < 1) return 0;
  const unsigned char selector = data[0] % 4;
  BufferStream stream(data + 1, static_cast<unsigned int>(size - 1));
  Variant holder;  // the value read, for the key-0 check
  switch (selector) {
    case 0: {
      SharedPointer<GenericObject> object = GenericObject::create(stream);
      if (!object) break;
      SharedPointer<GenericObject> clone = object->clone();
      if (!clone || !(*clone == *object)) std::abort();
      SharedPointer<GenericObject> back = GenericObject::create(1);
      if (holder.setGenericObjectValue(object) == Ok && !hasKeyZero(holder))
        checkRoundTrip(*object, *back);
      break;
    }
    case 1: {
      Variant v;
      if (!v.read(stream)) break;
      Variant* clone = v.clone();
      if (!clone || !(*clone == v)) std::abort();
      delete clone;
      Variant back;
      if (!hasKeyZero(v)) checkRoundTrip(v, back);
      break;
    }
    case 2: {
      SharedPointer<ValueCollection> collection = ValueCollection::create();
      if (!collection->read(stream)) break;
      SharedPointer<ValueCollection> back = ValueCollection::create();
      if (holder.setCollectionValue(collection) == Ok && !hasKeyZero(holder))
        checkRoundTrip(*collection, *back);
      break;
    }
    default: {
      SharedPointer<CharacterData> string = CharacterData::create(stream);
      if (!string) break;
      SharedPointer<CharacterData> back = CharacterData::create("", 0);
      checkRoundTrip(*string, *back);
      break;
    }
  }
  return 0;
}
