// CryptoFileCommon: the block buffering of an encrypted file (ICryptoFile),
// over the two hooks that encrypt and decrypt one block.
//
// One 512-byte block of plain text is held at a time. Reading loads the
// block under the position; writing loads it too, unless the write covers
// the whole block or the block lies past the end of the stored contents, and
// a full block goes back to the underlying file at once. Moving to another
// block writes the current one back when it changed. The stream starts at
// the underlying file's position when it is made. A derived class's
// destructor must call settle(): the hooks are gone once this class's
// destructor runs.
#ifndef LODESTACK_CRYPTO_CRYPTOFILECOMMON_H
#define LODESTACK_CRYPTO_CRYPTOFILECOMMON_H

#include "lodestack/core/IFile.h"
#include "lodestack/crypto/ICryptoFile.h"

namespace lodestack {

class LODESTACK_EXPORT CryptoFileCommon : public ICryptoFile {
 public:
  ~CryptoFileCommon() override;
  CryptoFileCommon(const CryptoFileCommon&) = delete;
  CryptoFileCommon& operator=(const CryptoFileCommon&) = delete;

  bool good() const override;
  // Both seeks settle the current block first (a failed write-back fails
  // the seek) and refuse a position beyond the end of the contents;
  // seekFromEnd(0) is the end itself.
  bool seekFromStart(unsigned int pos) override;
  bool seekFromEnd(unsigned int n) override;
  unsigned int offset() const override;
  bool eof() const override;
  bool getSize(unsigned int& size) override;
  bool canRead() const override;
  bool canSeek() const override;
  // False once the stream has been read from; else the file's answer.
  bool canWrite() const override;
  // Stops at the end of the contents or at a block that cannot be loaded.
  unsigned int read(unsigned char* dst, unsigned int n) override;
  // Stops at a block that cannot be loaded or written back; the bytes taken
  // into the buffer count as written. Takes nothing once read from.
  unsigned int write(const unsigned char* src, unsigned int n) override;
  // Writes the block back when it changed and flushes the file; the
  // position is unchanged.
  bool flush() override;

 protected:
  // Room after a block for what a cipher may add at its end.
  static const unsigned int kCipherSlack = 32;

  explicit CryptoFileCommon(core::IFile& file);

  // Turn `length` (at most 512) bytes of block `blockIndex` into cipher text
  // or back, into `out` (room for 512 + kCipherSlack bytes).
  virtual bool encryptBlock(unsigned int blockIndex, const unsigned char* in, unsigned int length,
                            unsigned char* out) = 0;
  virtual bool decryptBlock(unsigned int blockIndex, const unsigned char* in, unsigned int length,
                            unsigned char* out) = 0;

  // Writes the buffered block back when it changed; true when nothing is
  // left unwritten.
  bool settle();

 private:
  enum Mode { Untouched = 0, Reading = 1, Writing = 2 };

  bool loadBlock(bool forWrite, bool wholeBlock);
  void nextBlock();
  bool positionFile(unsigned int at);
  bool storedSize(unsigned int& size) const;
  bool contentsSize(unsigned int& size) const;

  core::IFile& file_;
  Mode mode_;
  // The position is block_ * 512 + position_, position_ from 0 to 512; the
  // buffer holds block block_ when loaded_, its first valid_ bytes being
  // contents (the rest zero).
  unsigned int block_;
  unsigned int position_;
  unsigned int valid_;
  bool loaded_;
  bool dirty_;
  // What this stream knows of the file, so that sequential work needs no
  // seek and no size query per block: the file is used by no one else.
  bool fileOffsetKnown_;
  unsigned int fileOffset_;
  mutable bool sizeKnown_;
  mutable unsigned int size_;  // of the stored contents
  unsigned char buffer_[kBlockSize + kCipherSlack];
  unsigned char cipherText_[kBlockSize + kCipherSlack];
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_CRYPTOFILECOMMON_H
