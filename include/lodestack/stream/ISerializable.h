// ISerializable: what can be written to and read back from an IStream.
//
// write() and read() return false when the stream fails; how much of a
// failed read shows in the object is said by each implementation.
#ifndef LODESTACK_STREAM_ISERIALIZABLE_H
#define LODESTACK_STREAM_ISERIALIZABLE_H

#include "lodestack/core/Export.h"

namespace lodestack {

class IStream;

class LODESTACK_EXPORT ISerializable {
 public:
  virtual ~ISerializable() = default;
  virtual bool write(IStream& stream) const = 0;
  virtual bool read(IStream& stream) = 0;
};

}  // namespace lodestack

#endif  // LODESTACK_STREAM_ISERIALIZABLE_H
