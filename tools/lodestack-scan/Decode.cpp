#include <memory>
#include <string>

#include "ResultPrinter.h"
#include "ResultsFile.h"
#include "Scan.h"

namespace lodestack {
namespace scan {

int runDecode(const Options& options, std::ostream& out, std::ostream& err) {
  ResultsReader reader;
  std::string error;
  if (!reader.open(options.decodePath, options.store, error)) {
    err << "lodestack-scan: " << error << "\n";
    return ExitFailure;
  }
  Options printing;
  printing.json = options.json;
  const std::unique_ptr<ResultPrinter> printer = makePrinter(printing, out);
  for (;;) {
    Result result;
    const ResultsReader::Outcome outcome = reader.next(result, error);
    if (outcome == ResultsReader::End) return ExitOk;
    if (outcome == ResultsReader::Record) {
      try {
        printer->print(result);
        continue;
      } catch (Status) {
        // Bytes that read as objects but not as a measurement container.
        error = options.decodePath + ": corrupt record at byte offset " +
                std::to_string(reader.recordOffset());
      }
    }
    err << "lodestack-scan: " << error << "\n";
    return ExitFailure;
  }
}

}  // namespace scan
}  // namespace lodestack
