#include "JsonPrinter.h"

#include "GeolocationRequest.h"
#include "MeasurementTree.h"

namespace lodestack {
namespace scan {

void JsonPrinter::print(const Result& result) {
  out_ << resultTree(result).dump() << '\n' << std::flush;
}

void GeolocationPrinter::print(const Result& result) {
  if (!isUsable(result.status) || !result.measurements) return;
  gom::SharedPointer<schema::MeasurementContainer> container =
      schema::MeasurementContainer::create(result.measurements);
  if (!container) throw WrongObjectType;
  if (result.kind == IMeasurementsObserver::Cellular) cellular_ = container;
  if (result.kind == IMeasurementsObserver::Wlan) wlan_ = container;
}

void GeolocationPrinter::endRound() {
  out_ << geolocationRequest(cellular_, wlan_).dump() << '\n' << std::flush;
  cellular_ = nullptr;
  wlan_ = nullptr;
}

}  // namespace scan
}  // namespace lodestack
