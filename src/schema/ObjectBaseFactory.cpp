#include "lodestack/schema/ObjectBaseFactory.h"

#include "gom/RecordFactory.h"
#include "lodestack/schema/PositionEstimate.h"
#include "lodestack/schema/Wlan.h"

namespace lodestack {
namespace schema {

gom::SharedPointer<gom::ObjectBase> ObjectBaseFactory::createObject(unsigned short id) {
  switch (id) {
    case PositionEstimate::kTypeId:
      return PositionEstimate::create();
    case WlanDn::kTypeId:
      return WlanDn::create();
    case WlanApMeasurement::kTypeId:
      return WlanApMeasurement::create();
    default:
      return gom::SharedPointer<gom::ObjectBase>();
  }
}

namespace {
// The object model reads code-14 variants through this factory.
[[maybe_unused]] const bool registered = gom::installRecordFactory(&ObjectBaseFactory::createObject);
}  // namespace

}  // namespace schema
}  // namespace lodestack
