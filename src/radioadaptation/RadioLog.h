// One line of the radio adaptation's diagnostics, at the library's level 1
// under its component ("RadioAdapt"); written only when a logger is installed.
#ifndef LODESTACK_SRC_RADIOADAPTATION_RADIOLOG_H
#define LODESTACK_SRC_RADIOADAPTATION_RADIOLOG_H

#include <cstdarg>

#include "lodestack/debug/Debug.h"

namespace lodestack {
namespace radioadaptation {

inline void radioLog(const char* format, ...) LODESTACK_PRINTF(1, 2);
inline void radioLog(const char* format, ...) {
  va_list args;
  va_start(args, format);
  Debug::logva(Debug::Level1, gRadioAdaptationComponentName, format, args);
  va_end(args);
}

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_SRC_RADIOADAPTATION_RADIOLOG_H
