#include "lodestack/core/Status.h"

namespace lodestack {

const char* statusName(Status status) {
  static const char* const kNames[] = {
      "Ok",      "Failed",       "WrongObjectType", "OutOfMemory",
      "NotFound", "Reserved",    "Refused",         "NotSupported",
      "AlreadyPending", "Timeout", "UnreliableMeasurement",
      "InvalidArgument", "FileError"};
  const int index = static_cast<int>(status);
  if (index < 0 || index >= static_cast<int>(sizeof kNames / sizeof kNames[0]))
    return "Unknown";
  return kNames[index];
}

}  // namespace lodestack
