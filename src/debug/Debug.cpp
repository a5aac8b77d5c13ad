#include "lodestack/debug/Debug.h"

#include <time.h>

#include <cstdio>

#include "lodestack/debug/DebugCommon.h"

namespace lodestack {

const char* const gCoreDebugComponentName = "core";
const char* const gCryptoDebugComponentName = "crypto";
const char* const gDatatypesComponentName = "datatypes";
const char* const gMeasurementsComponentName = "Measurements";
const char* const gRadioAdaptationComponentName = "RadioAdapt";
const char* const Debug::defaultComponentName = "WPOXEL";

void Debug::log(LogLevel level, const char* component, const char* format, ...) {
  va_list args;
  va_start(args, format);
  DebugCommon::forward(level, false, component, format, args);
  va_end(args);
}

void Debug::log2(LogLevel level, const char* format, ...) {
  va_list args;
  va_start(args, format);
  DebugCommon::forward(level, false, defaultComponentName, format, args);
  va_end(args);
}

void Debug::logva(LogLevel level, const char* component, const char* format, va_list args) {
  DebugCommon::forward(level, false, component, format, args);
}

void Debug::testLog(LogLevel level, const char* component, const char* format, ...) {
  va_list args;
  va_start(args, format);
  DebugCommon::forward(level, true, component, format, args);
  va_end(args);
}

void Debug::testLog2(LogLevel level, const char* format, ...) {
  va_list args;
  va_start(args, format);
  DebugCommon::forward(level, true, defaultComponentName, format, args);
  va_end(args);
}

void Debug::dump(LogLevel level, const char* component, const void* data, unsigned int length) {
  if (!data || !DebugCommon::installed()) return;
  const unsigned char* bytes = static_cast<const unsigned char*>(data);
  for (unsigned int line = 0; line < length; line += 16) {
    char text[80];
    int at = std::snprintf(text, sizeof text, "%08x ", line);
    for (unsigned int i = line; i < length && i < line + 16; ++i)
      at += std::snprintf(text + at, sizeof text - at, " %02x", bytes[i]);
    log(level, component, "%s\n", text);
  }
}

void Debug::dump2(LogLevel level, const void* data, unsigned int length) {
  dump(level, defaultComponentName, data, length);
}

namespace {

void mark(Debug::LogLevel level, const char* component, const char* format, va_list args)
    LODESTACK_PRINTF(3, 0);

void mark(Debug::LogLevel level, const char* component, const char* format, va_list args) {
  if (!format) return;
  timespec now;
  clock_gettime(CLOCK_MONOTONIC, &now);
  const unsigned long long micros =
      static_cast<unsigned long long>(now.tv_sec) * 1000000ull + now.tv_nsec / 1000;
  char text[512];
  std::vsnprintf(text, sizeof text, format, args);
  Debug::log(level, component, "PERF %llu: %s", micros, text);
}

}  // namespace

void Debug::perf(LogLevel level, const char* component, const char* format, ...) {
  if (!DebugCommon::installed()) return;
  va_list args;
  va_start(args, format);
  mark(level, component, format, args);
  va_end(args);
}

void Debug::perf2(LogLevel level, const char* format, ...) {
  if (!DebugCommon::installed()) return;
  va_list args;
  va_start(args, format);
  mark(level, defaultComponentName, format, args);
  va_end(args);
}

void Debug::systemLog(const char* format, ...) {
  va_list args;
  va_start(args, format);
  DebugCommon::forwardToPlatform(format, args);
  va_end(args);
}

void Debug::release() { DebugCommon::releaseInstalled(); }

DebugCommon* Debug::init() { return nullptr; }

}  // namespace lodestack
