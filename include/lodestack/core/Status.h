// Status: the library-wide result code.
//
// Returned by value from the object model, the core layer and the measurement
// service; thrown as a bare value by the typed schema wrappers. A measurement
// result is usable when its status is Ok or UnreliableMeasurement.
#ifndef LODESTACK_CORE_STATUS_H
#define LODESTACK_CORE_STATUS_H

#include "lodestack/core/Export.h"

namespace lodestack {

enum LODESTACK_EXPORT Status : int {
  Ok = 0,
  Failed = 1,             // generic failure
  WrongObjectType = 2,    // wrong object type, unsupported operation, bad argument
  OutOfMemory = 3,        // an allocation failed
  NotFound = 4,           // no such property, request or item
  Reserved = 5,           // never produced; keeps the numbering of the format
  Refused = 6,            // wrong kind of value or object; not ready
  NotSupported = 7,       // not provided here or for this argument
  AlreadyPending = 8,     // a request of the same kind is pending
  Timeout = 9,            // a request's cancel timer expired
  UnreliableMeasurement = 10,  // measured in an unreliable modem state; has data
  InvalidArgument = 11,   // out of range, bad length, bad type mask
  FileError = 12          // a file could not be opened or buffered
};

// True for the two codes that carry a usable measurement.
inline bool isUsable(Status status) {
  return status == Ok || status == UnreliableMeasurement;
}

// A short fixed name of the code ("Ok", "Failed", ...); "Unknown" outside 0-12.
LODESTACK_EXPORT const char* statusName(Status status);

}  // namespace lodestack

#endif  // LODESTACK_CORE_STATUS_H
