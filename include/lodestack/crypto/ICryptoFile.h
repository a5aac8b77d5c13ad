// ICryptoFile: a stream whose contents are stored encrypted in an underlying
// core::IFile.
//
// Format: no header, no trailer; the stored file is exactly as long as the
// contents and byte n is stored at offset n. It is cut into 512-byte blocks,
// block i (offsets 512i to 512i + 511, the last one possibly short) being
// encrypted by itself with AES-128-CTR, the store's key, and an initial
// counter block made of the store's IV with bytes 12 to 15 replaced by the
// big-endian 32-bit value 32i. The whole file is thus one continuous CTR key
// stream (counter bytes 12 to 15 starting at zero), and any block can be
// rewritten alone. There is no authentication: a wrong key reads as noise.
//
// Positions lie between 0 and the size of the contents: a seek beyond the
// end is refused. A stream that has been read from is not written through
// (canWrite() false, write() takes nothing): open another one to write.
// Writes are buffered one block at a time; flush() (or destroying the
// stream) writes the block back. eof() and getSize() describe the contents
// as seen through this stream, the unflushed block included.
//
// The stream does not own the IFile, which must outlive it and must not be
// used by anyone else meanwhile. One thread at a time.
#ifndef LODESTACK_CRYPTO_ICRYPTOFILE_H
#define LODESTACK_CRYPTO_ICRYPTOFILE_H

#include "lodestack/core/Export.h"
#include "lodestack/core/IFile.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {

class ICryptographyUtility;

class LODESTACK_EXPORT ICryptoFile : public IStream {
 public:
  static const unsigned int kBlockSize = 512;

  ~ICryptoFile() override;

  // A CryptoFileLin over `file`, keyed with the utility's key and IV (copied
  // now). The caller owns the result and deletes it before the file; null
  // when it cannot be allocated.
  static ICryptoFile* open(core::IFile& file, ICryptographyUtility& utility);
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_ICRYPTOFILE_H
