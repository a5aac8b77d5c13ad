// ObjectBase: the base of compact typed records (cell identities, frequency
// infos, cells, position estimates, ...) that carry their own fields and
// their own serialisation, and travel inside generic objects as variants of
// code 14 (a 2-byte record type id, then the record's write()).
//
// A record may carry an extension: an optional GenericObject of extra
// properties, created on first use by extension(). Records are reference
// counted and belong to one thread at a time.
//
// Every concrete record overrides write() and read(); the base versions
// throw Status WrongObjectType, because a record without its own format
// cannot be serialised.
#ifndef LODESTACK_GOM_OBJECTBASE_H
#define LODESTACK_GOM_OBJECTBASE_H

#include "lodestack/gom/GenericObject.h"

namespace lodestack {
namespace gom {

class LODESTACK_EXPORT ObjectBase : public ReferenceCountable, public ISerializable {
 public:
  explicit ObjectBase(unsigned short key);
  // Takes the source's key and shares its extension.
  ObjectBase(const ObjectBase& source);
  ~ObjectBase() override;

  virtual void dump() const;
  // A deep copy of the record (extension included); null on failure.
  virtual SharedPointer<ObjectBase> clone() const = 0;
  // Field-by-field equality with another record; false for another class.
  virtual bool compare(const ObjectBase* other) const = 0;
  // Throw Status WrongObjectType: concrete records override both.
  bool write(IStream& stream) const override;
  bool read(IStream& stream) override;

  unsigned short key() const { return key_; }
  bool isExtended() const { return bool(extension_); }
  const SharedPointer<GenericObject>& extensionReference() const { return extension_; }
  // The extension, created on first use with the record's own key; null
  // only when memory is exhausted.
  SharedPointer<GenericObject> extension();
  void deleteExtension() { extension_.clear(); }

  // Keys and extensions only (fields are compared by compare()): without
  // extensions on both sides the records are equal; with one, unequal.
  bool operator==(const ObjectBase& other) const;
  bool operator!=(const ObjectBase& other) const { return !(*this == other); }
  // Shares the source's extension; the key stays.
  ObjectBase& operator=(const ObjectBase& source);
  // Assigns, then gives this record its own shallow copy of the source's
  // extension. OutOfMemory when that copy cannot be made.
  Status copy(const ObjectBase& source);
  // Replaces the extension by a deep clone of the source's (or none).
  Status cloneFrom(const ObjectBase& source);

 private:
  unsigned short key_;
  SharedPointer<GenericObject> extension_;
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_OBJECTBASE_H
