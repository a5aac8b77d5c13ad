// A program outside the project that uses the installed library.
#include <cstdio>

#include <lodestack/lodestack.h>

int main() {
  using namespace lodestack;
  gom::SharedPointer<gom::GenericObject> object = gom::GenericObject::create(7);
  if (!object || object->setUint32Property(1, 42) != Ok) return 1;
  BufferStream stream;
  if (!object->write(stream)) return 2;
  gom::SharedPointer<gom::GenericObject> back = gom::GenericObject::create(stream);
  if (!back || !(*back == *object)) return 3;
  std::printf("consumer ok (%u bytes)\n", stream.buffer().size());
  return 0;
}
