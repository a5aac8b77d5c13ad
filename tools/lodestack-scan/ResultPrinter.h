// ResultPrinter: where the tool's results go, one call per result as it
// arrives and one at the end of each round of requests.
#ifndef LODESTACK_SCAN_RESULTPRINTER_H
#define LODESTACK_SCAN_RESULTPRINTER_H

#include <memory>
#include <ostream>

#include "Options.h"
#include "Result.h"

namespace lodestack {
namespace scan {

class ResultPrinter {
 public:
  virtual ~ResultPrinter() = default;
  // May throw Status WrongObjectType for a tree the schema cannot walk.
  virtual void print(const Result& result) = 0;
  // Every result the round asked for has arrived.
  virtual void endRound() {}
};

// The printer the options ask for, writing to `out`: a GeolocationPrinter
// for --geolocation-request, a JsonPrinter for --json, else a TextPrinter.
std::unique_ptr<ResultPrinter> makePrinter(const Options& options, std::ostream& out);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_RESULTPRINTER_H
