// File: an IFile over a standard I/O stream (FILE*), and openCrtFile, which
// makes one from a wide path.
//
// The File owns its FILE* and closes it when destroyed. Reading and writing
// may alternate freely: the File inserts the repositioning that standard I/O
// requires between the two directions. The capability flags are bits of one
// value (CanRead 1, CanSeek 2, CanWrite 4); openCrtFile sets all three
// whatever the mode, so a file opened with "r" still answers canWrite() true
// and its writes fail. Offsets and sizes are unsigned 32-bit: files of
// 4 GiB and more are not supported. Reference counted (keep it in a
// gom::SharedPointer<File> or <IFile>); one thread at a time.
#ifndef LODESTACK_CORE_FILE_H
#define LODESTACK_CORE_FILE_H

#include <cstdio>
#include <string>

#include "lodestack/core/Export.h"
#include "lodestack/core/IFile.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT File : public IFile {
 public:
  enum Capability : unsigned int { CanRead = 1, CanSeek = 2, CanWrite = 4, CanAll = 7 };

  // Takes ownership of `file` (null gives a stream that is not good()).
  File(FILE* file, unsigned int capabilities);
  ~File() override;
  File(const File&) = delete;
  File& operator=(const File&) = delete;

  // No error is pending on the stream (ferror), and it exists.
  bool good() const override;
  bool seekFromStart(unsigned int pos) override;
  // n bytes before the end; seekFromEnd(0) is the end itself.
  bool seekFromEnd(unsigned int n) override;
  // The current position, or 0 when it cannot be told.
  unsigned int offset() const override;
  // The end-of-file indicator of standard I/O: set by a read that hit the
  // end, cleared by a seek. A file positioned at its end but not yet read
  // there answers false.
  bool eof() const override;
  // The size including bytes still in the write buffer; false for a stream
  // that is not a regular file or is 4 GiB or more.
  bool getSize(unsigned int& size) override;
  bool canRead() const override;
  bool canSeek() const override;
  bool canWrite() const override;
  unsigned int read(unsigned char* dst, unsigned int n) override;
  unsigned int write(const unsigned char* src, unsigned int n) override;
  bool flush() override;

  // Gives the stream a full buffer of `size` bytes, owned by the File. Call
  // it before the first read or write; false when it cannot be set.
  bool setBuffer(unsigned int size);

  FILE* stream() const { return file_; }

 private:
  enum LastOperation { None, Reading, Writing };
  void switchTo(LastOperation next);

  FILE* file_;
  unsigned int capabilities_;
  LastOperation last_;
  unsigned char* buffer_;  // the stream's buffer when the File provides it
};

// Converts `path`, opens it with fopen(path, mode) and, for a non-zero
// `bufferSize`, gives the stream a full buffer of that size (allocated and
// owned by the File). Returns a new
// File (count 0, owned by the caller) or null when the path does not convert,
// the file cannot be opened or the object cannot be allocated. Throws
// Status FileError (12) when the buffer cannot be set; the file is closed
// first.
LODESTACK_EXPORT File* openCrtFile(const std::wstring& path, const char* mode,
                                   unsigned int bufferSize);

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_FILE_H
