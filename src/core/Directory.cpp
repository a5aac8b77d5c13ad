#include "lodestack/core/Directory.h"

#include <errno.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utime.h>

#include <cstdio>
#include <cstdlib>
#include <new>

#include "lodestack/core/DirectoryLinux.h"
#include "lodestack/core/File.h"
#include "lodestack/core/Status.h"
#include "lodestack/core/Unicode.h"

namespace lodestack {
namespace core {

namespace {

bool narrow(const std::wstring& path, std::string& out) {
  return Unicode::convertFromUnicodeToUtf8(path, out);
}

bool isDirectory(const std::string& path) {
  struct stat info;
  return stat(path.c_str(), &info) == 0 && S_ISDIR(info.st_mode);
}

bool writeAll(int fd, const char* data, size_t n) {
  while (n > 0) {
    const ssize_t done = ::write(fd, data, n);
    if (done < 0 && errno == EINTR) continue;
    if (done <= 0) return false;
    data += done;
    n -= static_cast<size_t>(done);
  }
  return true;
}

bool copyDescriptor(int in, int out) {
  char chunk[65536];
  for (;;) {
    const ssize_t got = ::read(in, chunk, sizeof chunk);
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) return false;
    if (got == 0) return true;
    if (!writeAll(out, chunk, static_cast<size_t>(got))) return false;
  }
}

File* openThrough(const std::wstring& path, const char* mode, unsigned int bufferSize) {
  try {
    return openCrtFile(path, mode, bufferSize);
  } catch (Status) {
    return nullptr;
  }
}

}  // namespace

bool Directory::pathExists(const std::wstring& path) {
  std::string name;
  struct stat info;
  return narrow(path, name) && lstat(name.c_str(), &info) == 0;
}

IDirectory* Directory::open(const std::wstring& path) {
  if (!pathExists(path)) return nullptr;
  return new (std::nothrow) DirectoryLinux(path);
}

bool Directory::mkDir(const std::wstring& path) {
  std::string name;
  if (!narrow(path, name)) return false;
  return mkdir(name.c_str(), 0777) == 0 || errno == EEXIST;
}

bool Directory::mkPath(const std::wstring& path) {
  std::string name;
  if (!narrow(path, name)) return false;
  // Each prefix that ends before a separator is one component to make; a
  // failure other than "exists" is left for the final check to report.
  for (size_t at = name.find('/', 1); at != std::string::npos; at = name.find('/', at + 1)) {
    if (name[at - 1] == '/') continue;
    mkdir(name.substr(0, at).c_str(), 0777);
  }
  mkdir(name.c_str(), 0777);
  return isDirectory(name);
}

bool Directory::rmFile(const std::wstring& path) {
  std::string name;
  return narrow(path, name) && std::remove(name.c_str()) == 0;
}

bool Directory::renameFile(const std::wstring& from, const std::wstring& to) {
  std::string a, b;
  return narrow(from, a) && narrow(to, b) && std::rename(a.c_str(), b.c_str()) == 0;
}

bool Directory::setFileModificationTime(const std::wstring& path, unsigned int time) {
  std::string name;
  if (!narrow(path, name)) return false;
  if (time == 0) return utime(name.c_str(), nullptr) == 0;
  utimbuf times;
  times.actime = static_cast<time_t>(time);
  times.modtime = static_cast<time_t>(time);
  return utime(name.c_str(), &times) == 0;
}

const wchar_t* Directory::findFileName(const std::wstring& path, unsigned int& length) {
  length = 0;
  if (path.empty() || path.back() == kSeparator) return nullptr;
  const size_t last = path.rfind(kSeparator);
  const size_t start = last == std::wstring::npos ? 0 : last + 1;
  length = static_cast<unsigned int>(path.size() - start);
  return path.c_str() + start;
}

std::wstring Directory::concat(const std::wstring& a, const std::wstring& b) {
  if (a.empty()) return b;
  if (b.empty()) return a;
  size_t end = a.size();
  while (end > 1 && a[end - 1] == kSeparator) --end;
  size_t begin = 0;
  while (begin < b.size() && b[begin] == kSeparator) ++begin;
  std::wstring joined(a, 0, end);
  if (joined.back() != kSeparator) joined += kSeparator;
  joined.append(b, begin, std::wstring::npos);
  return joined;
}

bool Directory::copyFile(const std::wstring& from, const std::wstring& to) {
  std::string source, target;
  if (!narrow(from, source) || !narrow(to, target)) return false;
  const int in = ::open(source.c_str(), O_RDONLY | O_CLOEXEC);
  if (in < 0) return false;
  struct stat inInfo, outInfo;
  if (fstat(in, &inInfo) != 0 || !S_ISREG(inInfo.st_mode)) {
    close(in);
    return false;
  }
  // Truncating the source itself would lose it: refuse before opening
  // with O_TRUNC.
  if (stat(target.c_str(), &outInfo) == 0 && outInfo.st_dev == inInfo.st_dev &&
      outInfo.st_ino == inInfo.st_ino) {
    close(in);
    return false;
  }
  const int out = ::open(target.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
  if (out < 0) {
    close(in);
    return false;
  }
  const bool copied = copyDescriptor(in, out);
  close(in);
  const bool closed = close(out) == 0;
  if (copied && closed) return true;
  unlink(target.c_str());
  return false;
}

std::wstring Directory::currentDir() {
  std::wstring out;
  char* name = get_current_dir_name();
  if (name) {
    Unicode::convertFromUtf8ToUnicode(name, out);
    std::free(name);
  }
  return out;
}

void Directory::getPreinstalledFilesPath(std::wstring& out) { out = L"/opt/usr/share/oxel"; }

void Directory::getDefaultStoragePath(std::wstring& out, bool& removable) {
  getPreinstalledFilesPath(out);
  removable = false;
}

File* Directory::openFile(const std::wstring& path, bool forWriting, unsigned int bufferSize) {
  return openThrough(path, forWriting ? "r+b" : "rb", bufferSize);
}

File* Directory::createFile(const std::wstring& path, unsigned int bufferSize) {
  return openThrough(path, "w+b", bufferSize);
}

}  // namespace core
}  // namespace lodestack
