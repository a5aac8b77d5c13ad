#include "lodestack/schema/Injection.h"

namespace lodestack {
namespace schema {

gom::SharedPointer<CellularObjectInjection> CellularObjectInjection::create(
    const gom::SharedPointer<CellularObjectDn>& dn, unsigned int timeStamp,
    const gom::SharedPointer<Area>& coverage) {
  gom::SharedPointer<CellularObjectInjection> i(new (std::nothrow) CellularObjectInjection());
  if (!i || !i->MeasurementBase::baseCreate(kTypeId, timeStamp) ||
      i->object_->setObjectProperty(kInjectionDnId, dn) != Ok ||
      i->object_->setObjectProperty(kInjectionCoverageId, coverage) != Ok)
    return gom::SharedPointer<CellularObjectInjection>();
  return i;
}

CellularObjectInjection::~CellularObjectInjection() = default;

gom::SharedPointer<CellularObjectDn> CellularObjectInjection::dn() const {
  return optionalRecord<CellularObjectDn>(kInjectionDnId);
}

void CellularObjectInjection::setDn(const gom::SharedPointer<CellularObjectDn>& dn) {
  setRecord(kInjectionDnId, dn, "dn");
}

unsigned int CellularObjectInjection::timeStamp() const {
  return optionalUint32(kInjectionTimeStampId);
}

gom::SharedPointer<Area> CellularObjectInjection::coverage() const {
  return optionalRecord<Area>(kInjectionCoverageId);
}

void CellularObjectInjection::setCoverage(const gom::SharedPointer<Area>& area) {
  setRecord(kInjectionCoverageId, area, "coverage");
}

Injection::~Injection() = default;

}  // namespace schema
}  // namespace lodestack
