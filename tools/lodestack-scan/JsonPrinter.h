// The JSON printers, one object per line:
//  - JsonPrinter: every result as it arrives, its resultTree() (see
//    MeasurementTree.h);
//  - GeolocationPrinter: one geolocation request per round (see
//    GeolocationRequest.h), built from the round's last usable cellular and
//    WLAN results; GNSS fixes and unusable results add nothing.
#ifndef LODESTACK_SCAN_JSONPRINTER_H
#define LODESTACK_SCAN_JSONPRINTER_H

#include <ostream>

#include "GeolocationRequest.h"
#include "ResultPrinter.h"

namespace lodestack {
namespace scan {

class JsonPrinter : public ResultPrinter {
 public:
  explicit JsonPrinter(std::ostream& out) : out_(out) {}
  void print(const Result& result) override;

 private:
  std::ostream& out_;
};

class GeolocationPrinter : public ResultPrinter {
 public:
  explicit GeolocationPrinter(std::ostream& out) : out_(out) {}
  void print(const Result& result) override;
  void endRound() override;

 private:
  std::ostream& out_;
  RoundMeasurements round_;
};

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_JSONPRINTER_H
