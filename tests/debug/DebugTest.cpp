#include <sys/stat.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdio>
#include <filesystem>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "lodestack/debug/Debug.h"
#include "lodestack/debug/DebugCommon.h"
#include "lodestack/debug/DebugLinux.h"
#include "support/TemporaryDirectory.h"

namespace lodestack {
namespace {

using testing::readText;
using testing::TemporaryDirectory;
using testing::writeText;

// A platform subclass that marks its lines "P  name/42" and records what
// reaches the platform log.
class RecordingDebug : public DebugCommon {
 public:
  explicit RecordingDebug(bool* destroyed = nullptr) : destroyed_(destroyed) {}
  ~RecordingDebug() override {
    if (destroyed_) *destroyed_ = true;
  }
  std::vector<std::string> platformLines;

 protected:
  void makePrefix(char* buffer, bool, const char*) override { std::snprintf(buffer, kPrefixSize, "P"); }
  void platformInit() override {}
  bool checkLogFileName(const char* name) override { return std::string(name) != "refused.log"; }
  int platformId() override { return 42; }
  void platformLog(const char*, const char* component, int, const char* format, va_list args) override {
    char text[256];
    std::vsnprintf(text, sizeof text, format, args);
    platformLines.push_back(std::string(component) + ":" + text);
  }

 private:
  bool* destroyed_;
};

const char kFailure[] = "P  default/42  DEBUG: couldn't read config file\n";

TEST(DebugCommon, ConfigurationLines) {
  TemporaryDirectory dir;
  ASSERT_EQ(mkdir(dir.file("logs").c_str(), 0700), 0);
  writeText(dir.file("debug.cfg"),
            "; a comment line\n\n;core 15 ignored.log\n; 15 ignored.log\n"
            "Measurements 0 off.log\n"
            "core 1 console\r\n"
            "crypto\t4 shared.log\n"
            "path " + dir.file("logs") + "\n"
            "RadioAdapt 8 shared.log\n"
            "datatypes 2 shared.log\n"
            "default 3 main.log\n"
            "no_platform_logging\n");
  RecordingDebug logger;
  EXPECT_TRUE(logger.readConfig(dir.file("debug.cfg").c_str(), dir.path().c_str(), nullptr));
  const auto measurements = logger.getComponentLogSettings("Measurements");
  EXPECT_TRUE(measurements.mask == 0 && measurements.file == nullptr) << "mask 0 opens nothing";
  const auto core = logger.getComponentLogSettings("core");
  EXPECT_TRUE(core.mask == 1 && core.file == stdout);
  EXPECT_NE(logger.getComponentLogSettings("crypto").file, logger.getComponentLogSettings("RadioAdapt").file)
      << "same name, another directory";
  EXPECT_EQ(logger.getComponentLogSettings("unnamed").mask, 3u) << "the default line";
  for (const char* name : {"ignored.log", "off.log", "lodestack.log"})
    EXPECT_FALSE(std::filesystem::exists(dir.file(name))) << name;

  logger.writeLogEll(Debug::Level1, false, "Measurements", "silenced\n");
  logger.writeLogEll(Debug::Level8, false, "RadioAdapt", "radio\n");
  logger.writeLogEll(Debug::Level2, true, "datatypes", "raw\n");
  logger.writeLogEll(Debug::Level4, false, "datatypes", "masked\n");
  logger.writeLogEll(Debug::Level2, false, "WPOXEL", "fallback\n");
  EXPECT_EQ(readText(dir.file("logs/shared.log")), "P  RadioAdapt/42  radio\nraw\n");
  EXPECT_EQ(readText(dir.file("logs/main.log")), "P  WPOXEL/42  fallback\n");
  EXPECT_TRUE(logger.platformLines.empty()) << "no_platform_logging";
}

TEST(DebugCommon, MissingConfigurationsLongLinesAndUnopenableFiles) {
  TemporaryDirectory dir;
  RecordingDebug missing;
  EXPECT_FALSE(missing.readConfig(dir.file("missing.cfg").c_str(), dir.path().c_str(), nullptr));
  EXPECT_EQ(readText(dir.file("lodestack.log")), kFailure);
  EXPECT_EQ(missing.getComponentLogSettings("anything").mask, 15u) << "everything to the default file";
  missing.writeLogEll(Debug::Level8, false, "core", "eight %d\n", 8);
  missing.writeLogEll(static_cast<Debug::LogLevel>(16), false, "core", "sixteen\n");
  EXPECT_EQ(readText(dir.file("lodestack.log")), std::string(kFailure) + "P  core/42  eight 8\n");
  EXPECT_EQ(missing.platformLines.size(), 2u) << "the platform log sees what passes the mask";

  // A directory in place of the configuration file opens but cannot be read.
  RecordingDebug directory;
  EXPECT_FALSE(directory.readConfig(dir.path().c_str(), dir.path().c_str(), "other.log"));
  EXPECT_EQ(readText(dir.file("other.log")), kFailure);

  const std::string longName(120, 'x');
  // A 127-character piece ends inside the file name, and the rest of the
  // line becomes a line of its own (here a component without a mask). The
  // tail of a long comment is read the same way.
  writeText(dir.file("debug.cfg"), "core 1 " + longName + "tail.log\n;" + std::string(126, 'c') +
                                       "crypto 1 fromComment.log\n");
  RecordingDebug logger;
  EXPECT_TRUE(logger.readConfig(dir.file("debug.cfg").c_str(), dir.path().c_str(), nullptr));
  EXPECT_TRUE(std::filesystem::exists(dir.file(longName)));
  EXPECT_TRUE(std::filesystem::exists(dir.file("fromComment.log")));
  EXPECT_EQ(logger.getComponentLogSettings("tail.log").mask, 15u) << "no such component";

  // A file the subclass refuses, a missing name, a directory in the way and
  // a path through a regular file: each fails the configuration, the rest
  // still applies.
  ASSERT_EQ(mkdir(dir.file("folder.log").c_str(), 0700), 0);
  ASSERT_EQ(mkdir(dir.file("last").c_str(), 0700), 0);
  writeText(dir.file("bad.cfg"),
            "core 1 refused.log\ncrypto 1\ndatatypes 1 folder.log\nRadioAdapt 1 good.log\n"
            "path " + dir.file("debug.cfg") + "\nMeasurements 1 under-a-file.log\n"
            "path " + dir.file("last") + "\n");
  RecordingDebug bad;
  EXPECT_FALSE(bad.readConfig(dir.file("bad.cfg").c_str(), dir.path().c_str(), "main.log"));
  for (const char* component : {"core", "crypto", "datatypes", "Measurements"}) {
    const auto setting = bad.getComponentLogSettings(component);
    EXPECT_TRUE(setting.mask == 1 && setting.file == nullptr) << component;
  }
  EXPECT_NE(bad.getComponentLogSettings("RadioAdapt").file, nullptr);
  EXPECT_EQ(bad.addLogFile(dir.file("missing").c_str(), "x.log"), nullptr);
  EXPECT_EQ(readText(dir.file("last/main.log")), kFailure) << "the default file lies in the last path";
}

TEST(DebugCommon, ReferenceCountingAndTheFacade) {
  TemporaryDirectory dir;
  Debug::log(Debug::Level1, "core", "nothing is installed\n");
  EXPECT_EQ(Debug::init(), nullptr);
  Debug::release();

  bool destroyed = false;
  RecordingDebug* logger = new RecordingDebug(&destroyed);
  writeText(dir.file("debug.cfg"), "default 15 main.log\ncore 1 core.log\n");
  ASSERT_TRUE(logger->readConfig(dir.file("debug.cfg").c_str(), dir.path().c_str(), nullptr));
  ASSERT_EQ(DebugCommon::install(logger), Ok);
  RecordingDebug second;
  EXPECT_EQ(DebugCommon::install(&second), Refused) << "one logger per process";
  EXPECT_EQ(logger->addRef(), 2);

  Debug::log(Debug::Level1, "core", "value %d\n", 7);
  Debug::log(Debug::Level2, "core", "masked\n");
  Debug::log2(Debug::Level2, "default component\n");
  Debug::testLog(Debug::Level1, "core", "raw\n");
  const unsigned char bytes[18] = {0, 1, 2, 0xab, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 0xff, 16, 17};
  Debug::dump2(Debug::Level4, bytes, sizeof bytes);
  Debug::perf(Debug::Level1, "core", "mark %s\n", "here");
  Debug::systemLog("system %d\n", 1);
  EXPECT_EQ(logger->platformLines.back(), "WPOXEL:system 1\n") << "the platform log only";
  EXPECT_EQ(logger->removeRef(), 1);
  Debug::release();
  EXPECT_TRUE(destroyed) << "the last reference destroys the logger";
  Debug::log(Debug::Level1, "core", "after release\n");

  const std::string core = readText(dir.file("core.log"));
  unsigned long long micros = 0;
  int consumed = 0;
  EXPECT_EQ(std::sscanf(core.c_str(), "P  core/42  value 7\nraw\nP  core/42  PERF %llu: mark here\n%n",
                        &micros, &consumed), 1)
      << core;
  EXPECT_EQ(static_cast<size_t>(consumed), core.size()) << core;
  EXPECT_EQ(readText(dir.file("main.log")),
            "P  default/42  DebugCommon::addRef: counter 1\n"
            "P  default/42  DebugCommon::addRef: counter 2\n"
            "P  WPOXEL/42  default component\n"
            "P  WPOXEL/42  00000000  00 01 02 ab 04 05 06 07 08 09 0a 0b 0c 0d 0e ff\n"
            "P  WPOXEL/42  00000010  10 11\n"
            "P  default/42  DebugCommon::removeRef: counter 2\n"
            "P  default/42  DebugCommon::removeRef: counter 1\n");
}

TEST(DebugLinux, InstallsFromAConfigurationFile) {
  TemporaryDirectory dir;
  writeText(dir.file("debug.cfg"), "no_platform_logging\ndefault 1 main.log\nRadioAdapt 3 radio.log\n");
  ASSERT_EQ(DebugLinux::install(dir.file("debug.cfg").c_str(), dir.path().c_str()), Ok);
  EXPECT_EQ(DebugLinux::install(dir.file("debug.cfg").c_str(), dir.path().c_str()), Refused);
  std::vector<std::thread> writers;
  for (int t = 0; t < 4; ++t)
    writers.emplace_back([t] {
      for (int i = 0; i < 200; ++i)
        Debug::log(Debug::Level2, gRadioAdaptationComponentName, "thread %d line %d\n", t, i);
    });
  for (std::thread& writer : writers) writer.join();
  Debug::release();

  const std::string pid = std::to_string(getpid());
  std::istringstream radio(readText(dir.file("radio.log")));
  int lines = 0;
  for (std::string text; std::getline(radio, text); ++lines) {
    // "YYYY-MM-DD HH:MM:SS.mmm  RadioAdapt/<pid>  thread T line I"
    int date[7], id = 0, thread = 0, line = 0, end = 0;
    ASSERT_EQ(std::sscanf(text.c_str(), "%4d-%2d-%2d %2d:%2d:%2d.%3d  RadioAdapt/%d  thread %d line %d%n",
                          &date[0], &date[1], &date[2], &date[3], &date[4], &date[5], &date[6], &id,
                          &thread, &line, &end), 10)
        << text;
    EXPECT_TRUE(text[10] == ' ' && text[23] == ' ' && end == static_cast<int>(text.size())) << text;
    EXPECT_EQ(std::to_string(id), pid);
  }
  EXPECT_EQ(lines, 800) << "every line whole";

  // Log files are plain names in the log directory; a missing
  // configuration still installs, with the defaults.
  writeText(dir.file("escape.cfg"), "core 1 ../escape.log\ncrypto 1 a/b.log\n");
  EXPECT_EQ(DebugLinux::install(dir.file("escape.cfg").c_str(), dir.path().c_str()), FileError);
  Debug::release();
  EXPECT_EQ(DebugLinux::install(dir.file("missing.cfg").c_str(), dir.path().c_str()), FileError);
  Debug::log(Debug::Level4, "anything", "kept\n");
  Debug::release();
  EXPECT_NE(readText(dir.file("lodestack.log")).find("anything/" + pid + "  kept"), std::string::npos);
}

}  // namespace
}  // namespace lodestack
