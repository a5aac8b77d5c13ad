#include "ResultPrinter.h"

#include "JsonPrinter.h"
#include "TextPrinter.h"

namespace lodestack {
namespace scan {

std::unique_ptr<ResultPrinter> makePrinter(const Options& options, std::ostream& out) {
  if (options.geolocation) return std::make_unique<GeolocationPrinter>(out);
  if (options.json) return std::make_unique<JsonPrinter>(out);
  return std::make_unique<TextPrinter>(out);
}

}  // namespace scan
}  // namespace lodestack
