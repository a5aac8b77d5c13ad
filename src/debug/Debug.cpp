#include "lodestack/debug/Debug.h"

namespace lodestack {

const char* const gCoreDebugComponentName = "core";
const char* const gCryptoDebugComponentName = "crypto";
const char* const gDatatypesComponentName = "datatypes";
const char* const gMeasurementsComponentName = "Measurements";
const char* const gRadioAdaptationComponentName = "RadioAdapt";
const char* const Debug::defaultComponentName = "WPOXEL";

// No logger can be installed yet: every entry point writes nothing.
void Debug::log(LogLevel, const char*, const char*, ...) {}
void Debug::log2(LogLevel, const char*, ...) {}
void Debug::logva(LogLevel, const char*, const char*, va_list) {}

}  // namespace lodestack
