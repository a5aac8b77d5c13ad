// IFile: a reference-counted byte stream over a file, the medium under the
// encrypted file.
//
// Besides the IStream contract it promises positions that may stand at the
// end of the contents (seekFromStart(size) and seekFromEnd(0) succeed) and
// writes that extend the file there. Keep one in a
// gom::SharedPointer<IFile>; one thread at a time.
#ifndef LODESTACK_CORE_IFILE_H
#define LODESTACK_CORE_IFILE_H

#include "lodestack/core/Export.h"
#include "lodestack/gom/ReferenceCountable.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT IFile : public gom::ReferenceCountable, public IStream {
 public:
  ~IFile() override;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_IFILE_H
