#include "lodestack/debug/DebugCommon.h"

#include <atomic>
#include <cstdlib>
#include <cstring>

#include "lodestack/core/Lockable.h"

namespace lodestack {

namespace {

const char kDefaultComponent[] = "default";
const char kDefaultFileName[] = "lodestack.log";
const char kDefaultDirectory[] = "./";
const unsigned int kDefaultMask = 15;
const char kDelimiters[] = " \t\r\n";
const int kLineBuffer = 128;

// Written under the DebugMutex; read without it by the facade's quick check.
std::atomic<DebugCommon*> gInstalled{nullptr};

LockableBase& debugMutex() {
  // Never destroyed: a static object's destructor may still log at exit.
  static LockableBase* mutex = new LockableBase;
  return *mutex;
}

}  // namespace

void DebugCommon::lock() { debugMutex().lock(); }
void DebugCommon::unlock() { debugMutex().unlock(); }

DebugCommon::DebugCommon()
    : default_{0, nullptr}, logDir_(kDefaultDirectory), platformLogging_(true), counter_(0) {}

DebugCommon::~DebugCommon() {
  DebugCommon* self = this;
  gInstalled.compare_exchange_strong(self, nullptr);
  for (const auto& file : files_)
    if (file.second != stdout) std::fclose(file.second);
}

bool DebugCommon::readConfig(const char* configFile, const char* logDir,
                             const char* defaultFileName) {
  lock();
  platformInit();
  settings_.clear();
  platformLogging_ = true;
  logDir_ = logDir ? logDir : kDefaultDirectory;
  bool success = true;
  FILE* config = configFile ? std::fopen(configFile, "re") : nullptr;
  if (config) {
    // A line longer than the buffer arrives in pieces, each taken as a line.
    char line[kLineBuffer];
    while (std::fgets(line, sizeof line, config)) applyLine(line, success);
    // A directory opens but does not read.
    if (std::ferror(config)) success = false;
    std::fclose(config);
  } else {
    success = false;
  }
  const auto named = settings_.find(kDefaultComponent);
  if (named != settings_.end()) {
    default_ = named->second;
    settings_.erase(named);
  } else {
    default_.mask = kDefaultMask;
    default_.file = openLogFile(logDir_.c_str(), defaultFileName ? defaultFileName : kDefaultFileName);
    if (!default_.file) success = false;
  }
  if (!success) writeEll(Debug::Level1, false, kDefaultComponent, "DEBUG: couldn't read config file\n");
  unlock();
  return success;
}

void DebugCommon::applyLine(char* line, bool& success) {
  char* rest = nullptr;
  const char* first = strtok_r(line, kDelimiters, &rest);
  if (!first || first[0] == ';') return;
  if (std::strcmp(first, "path") == 0) {
    if (const char* dir = strtok_r(nullptr, kDelimiters, &rest)) logDir_ = dir;
    return;
  }
  if (std::strcmp(first, "no_platform_logging") == 0) {
    platformLogging_ = false;
    return;
  }
  const char* maskText = strtok_r(nullptr, kDelimiters, &rest);
  if (!maskText) return;  // not a setting, e.g. the tail of a long line
  const char* fileName = strtok_r(nullptr, kDelimiters, &rest);
  ComponentSetting setting{static_cast<unsigned int>(std::strtol(maskText, nullptr, 10)), nullptr};
  if (setting.mask != 0) {
    setting.file = openLogFile(logDir_.c_str(), fileName);
    if (!setting.file) success = false;
  }
  settings_[first] = setting;
}

FILE* DebugCommon::addLogFile(const char* dir, const char* name) {
  lock();
  FILE* file = openLogFile(dir, name);
  unlock();
  return file;
}

FILE* DebugCommon::openLogFile(const char* dir, const char* name) {
  if (!name) return nullptr;
  if (std::strcmp(name, "console") == 0) return stdout;
  if (!checkLogFileName(name)) return nullptr;
  std::string path = dir ? dir : "";
  if (!path.empty() && path.back() != '/') path += '/';
  path += name;
  const auto opened = files_.find(path);
  if (opened != files_.end()) return opened->second;
  FILE* file = std::fopen(path.c_str(), "we");
  if (file) files_[path] = file;
  return file;
}

DebugCommon::ComponentSetting DebugCommon::getComponentLogSettings(const char* component) {
  lock();
  const ComponentSetting setting = settingOf(component);
  unlock();
  return setting;
}

const DebugCommon::ComponentSetting& DebugCommon::settingOf(const char* component) const {
  if (!component) return default_;
  const auto found = settings_.find(component);
  return found == settings_.end() ? default_ : found->second;
}

void DebugCommon::writeLogVa(Debug::LogLevel level, bool raw, const char* component,
                             const char* format, va_list args) {
  lock();
  write(level, raw, component, format, args);
  unlock();
}

void DebugCommon::writeLogVa(FILE* file, bool raw, const char* component, const char* format,
                             va_list args) {
  lock();
  writeTo(file, raw, component, format, args);
  unlock();
}

void DebugCommon::writeLogEll(Debug::LogLevel level, bool raw, const char* component,
                              const char* format, ...) {
  va_list args;
  va_start(args, format);
  writeLogVa(level, raw, component, format, args);
  va_end(args);
}

void DebugCommon::write(unsigned int level, bool raw, const char* component, const char* format,
                        va_list args) {
  const ComponentSetting& setting = settingOf(component);
  if ((level & setting.mask) != 0) writeTo(setting.file, raw, component, format, args);
}

void DebugCommon::writeEll(unsigned int level, bool raw, const char* component,
                           const char* format, ...) {
  va_list args;
  va_start(args, format);
  write(level, raw, component, format, args);
  va_end(args);
}

void DebugCommon::writeTo(FILE* file, bool raw, const char* component, const char* format,
                          va_list args) {
  if (!format) return;
  const char* name = component ? component : "";
  char prefix[kPrefixSize] = "";
  makePrefix(prefix, raw, name);
  prefix[kPrefixSize - 1] = '\0';
  const int id = platformId();
  if (file) {
    // Another writer of the same file may have moved its end.
    std::fseek(file, 0, SEEK_END);
    if (!raw) std::fprintf(file, "%s  %s/%d  ", prefix, name, id);
    std::fseek(file, 0, SEEK_END);
    va_list copy;
    va_copy(copy, args);
    std::vfprintf(file, format, copy);
    va_end(copy);
    std::fflush(file);
  }
  if (platformLogging_) platformLog(prefix, name, id, format, args);
}

std::string DebugCommon::logPath() const {
  lock();
  std::string path = logDir_;
  unlock();
  return path;
}

int DebugCommon::addRef() {
  lock();
  const int count = reference();
  unlock();
  return count;
}

int DebugCommon::removeRef() {
  lock();
  const int count = release();
  unlock();
  return count;
}

int DebugCommon::reference() {
  const int count = ++counter_;
  writeEll(Debug::Level1, false, kDefaultComponent, "DebugCommon::addRef: counter %d\n", count);
  return count;
}

int DebugCommon::release() {
  writeEll(Debug::Level1, false, kDefaultComponent, "DebugCommon::removeRef: counter %d\n",
           counter_);
  const int count = --counter_;
  if (count == 0) delete this;  // the destructor uninstalls it
  return count;
}

Status DebugCommon::install(DebugCommon* logger) {
  if (!logger) return Refused;
  lock();
  const bool vacant = gInstalled.load() == nullptr;
  if (vacant) {
    gInstalled.store(logger);
    logger->reference();
  }
  unlock();
  return vacant ? Ok : Refused;
}

void DebugCommon::forward(unsigned int level, bool raw, const char* component, const char* format,
                          va_list args) {
  if (!gInstalled.load(std::memory_order_acquire)) return;
  lock();
  if (DebugCommon* logger = gInstalled.load()) logger->write(level, raw, component, format, args);
  unlock();
}

void DebugCommon::forwardToPlatform(const char* format, va_list args) {
  if (!gInstalled.load(std::memory_order_acquire) || !format) return;
  lock();
  if (DebugCommon* logger = gInstalled.load()) {
    char prefix[kPrefixSize] = "";
    logger->makePrefix(prefix, false, Debug::defaultComponentName);
    prefix[kPrefixSize - 1] = '\0';
    logger->platformLog(prefix, Debug::defaultComponentName, logger->platformId(), format, args);
  }
  unlock();
}

bool DebugCommon::installed() { return gInstalled.load(std::memory_order_acquire) != nullptr; }

void DebugCommon::releaseInstalled() {
  if (!gInstalled.load(std::memory_order_acquire)) return;
  lock();
  if (DebugCommon* logger = gInstalled.load()) logger->release();
  unlock();
}

}  // namespace lodestack
