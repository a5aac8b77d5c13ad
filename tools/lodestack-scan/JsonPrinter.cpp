#include "JsonPrinter.h"

#include "MeasurementTree.h"

namespace lodestack {
namespace scan {

void JsonPrinter::print(const Result& result) {
  out_ << resultTree(result).dump() << '\n' << std::flush;
}

void GeolocationPrinter::print(const Result& result) { round_.take(result); }

void GeolocationPrinter::endRound() {
  out_ << round_.request().dump() << '\n' << std::flush;
  round_.clear();
}

}  // namespace scan
}  // namespace lodestack
