// TextPrinter: results as indented text for people. Each result is a
// header line "<kind> request <id>: <status>" followed by its measurement
// tree (see MeasurementTree.h), one value per line, "name: value", list
// items named "name[i]". An object of plain values and of objects of plain
// values fits on one line:
//   nwMeasurements[0]: frequencyInfo (bsic 12, arfcn 62), rxLevel 20
#ifndef LODESTACK_SCAN_TEXTPRINTER_H
#define LODESTACK_SCAN_TEXTPRINTER_H

#include <ostream>
#include <string>

#include "MeasurementTree.h"
#include "ResultPrinter.h"

namespace lodestack {
namespace scan {

class TextPrinter : public ResultPrinter {
 public:
  explicit TextPrinter(std::ostream& out) : out_(out) {}
  void print(const Result& result) override;

 private:
  std::ostream& out_;
};

// The text of a resultTree(), ending in a newline.
std::string resultText(const Json& tree);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_TEXTPRINTER_H
