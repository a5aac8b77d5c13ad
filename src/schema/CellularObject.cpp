#include "lodestack/schema/CellularObject.h"

namespace lodestack {
namespace schema {

namespace {

using Dn = CellularObjectDn;

bool validNwType(Dn::NwType t) { return t >= Dn::Geran && t <= Dn::Cdma; }
bool validIdType(Dn::IdType t) { return t >= Dn::Layer1 && t <= Dn::Layer3; }

gom::SharedPointer<Dn> make(const Dn& value) {
  gom::SharedPointer<Dn> dn(new (std::nothrow) Dn(value));
  return dn;
}

// The layers of a derived identity, as far as idType asks.
gom::SharedPointer<Dn> layered(Dn::NwType nwType, Dn::IdType idType, unsigned short layer1,
                               unsigned short layer2, Dn::L3IdType l3IdType, unsigned int layer3) {
  switch (idType) {
    case Dn::Layer1:
      return make(Dn(nwType, layer1));
    case Dn::Layer2:
      return make(Dn(nwType, layer1, layer2));
    case Dn::Layer3:
      return make(Dn(nwType, layer1, layer2, l3IdType, layer3));
  }
  return gom::SharedPointer<Dn>();
}

}  // namespace

CellularObjectDn::CellularObjectDn() : CellularObjectDn(NwType(0), 0) { idType_ = 0; }

CellularObjectDn::CellularObjectDn(NwType nwType, unsigned short layer1)
    : CellularObjectDn(nwType, layer1, 0, L3IdType(0), 0) {
  idType_ = Layer1;
}

CellularObjectDn::CellularObjectDn(NwType nwType, unsigned short layer1, unsigned short layer2)
    : CellularObjectDn(nwType, layer1, layer2, L3IdType(0), 0) {
  idType_ = Layer2;
}

CellularObjectDn::CellularObjectDn(NwType nwType, unsigned short layer1, unsigned short layer2,
                                   L3IdType l3IdType, unsigned int layer3)
    : gom::ObjectBase(kTypeId), idType_(Layer3), nwType_(nwType), layer1_(layer1),
      layer2_(layer2), l3IdType_(l3IdType), layer3_(layer3) {}

gom::SharedPointer<Dn> CellularObjectDn::create() { return make(Dn(NwType(0), 0)); }

gom::SharedPointer<Dn> CellularObjectDn::create(NwType nwType, unsigned short layer1) {
  return validNwType(nwType) ? make(Dn(nwType, layer1)) : gom::SharedPointer<Dn>();
}

gom::SharedPointer<Dn> CellularObjectDn::create(NwType nwType, unsigned short layer1,
                                                unsigned short layer2) {
  return validNwType(nwType) ? make(Dn(nwType, layer1, layer2)) : gom::SharedPointer<Dn>();
}

gom::SharedPointer<Dn> CellularObjectDn::create(NwType nwType, unsigned short layer1,
                                                unsigned short layer2, L3IdType l3IdType,
                                                unsigned int layer3) {
  if (!validNwType(nwType) || l3IdType < LocationAreaCode || l3IdType > TrackingAreaCode) {
    return gom::SharedPointer<Dn>();
  }
  return make(Dn(nwType, layer1, layer2, l3IdType, layer3));
}

gom::SharedPointer<Dn> CellularObjectDn::create(const gom::SharedPointer<GeranCellDn>& dn,
                                                IdType idType) {
  if (!dn || !validIdType(idType)) return gom::SharedPointer<Dn>();
  return layered(Geran, idType, dn->mcc(), dn->mnc(), LocationAreaCode, dn->lac());
}

gom::SharedPointer<Dn> CellularObjectDn::create(NwType nwType,
                                                const gom::SharedPointer<UtraCellDn>& dn,
                                                IdType idType) {
  if (!dn || !validIdType(idType)) return gom::SharedPointer<Dn>();
  return layered(nwType, idType, dn->mcc(), dn->mnc(), RncId, dn->rncId());
}

gom::SharedPointer<Dn> CellularObjectDn::create(const gom::SharedPointer<Dn>& source) {
  if (!source) return gom::SharedPointer<Dn>();
  gom::SharedPointer<Dn> copy = make(*source);
  if (copy && copy->cloneFrom(*source) != Ok) copy.clear();
  return copy;
}

bool CellularObjectDn::operator==(const Dn& other) const {
  if (idType_ != other.idType_ || nwType_ != other.nwType_ || layer1_ != other.layer1_) {
    return false;
  }
  if (idType_ > Layer1 && layer2_ != other.layer2_) return false;
  if (idType_ != Layer1 && idType_ != Layer2 &&
      (l3IdType_ != other.l3IdType_ || layer3_ != other.layer3_)) {
    return false;
  }
  return gom::ObjectBase::operator==(other);
}

gom::SharedPointer<gom::ObjectBase> CellularObjectDn::clone() const {
  gom::SharedPointer<Dn> copy = make(*this);
  if (copy && copy->cloneFrom(*this) != Ok) copy.clear();
  return copy;
}

bool CellularObjectDn::compare(const gom::ObjectBase* other) const {
  const Dn* dn = dynamic_cast<const Dn*>(other);
  return dn && *this == *dn;
}

bool CellularObjectDn::write(IStream& s) const {
  return s.writeUint8(1) && s.writeUint8(idType_) && s.writeUint8(nwType_) &&
         s.writeUint16(layer1_) && s.writeUint16(layer2_) && s.writeUint8(l3IdType_) &&
         s.writeUint32(layer3_);
}

bool CellularObjectDn::read(IStream& s) {
  Dn value;
  unsigned char version = 0;
  const bool ok = s.readUint8(version) && version == 1 && s.readUint8(value.idType_) &&
                  s.readUint8(value.nwType_) && s.readUint16(value.layer1_) &&
                  s.readUint16(value.layer2_) && s.readUint8(value.l3IdType_) &&
                  s.readUint32(value.layer3_);
  if (!ok) value = Dn();
  // The fields only: the extension is not part of the bytes.
  idType_ = value.idType_;
  nwType_ = value.nwType_;
  layer1_ = value.layer1_;
  layer2_ = value.layer2_;
  l3IdType_ = value.l3IdType_;
  layer3_ = value.layer3_;
  return ok;
}

}  // namespace schema
}  // namespace lodestack
