// The two things lodestack-scan does: scan (request rounds of measurements
// and print the results) and decode (print a results file again).
#ifndef LODESTACK_SCAN_SCAN_H
#define LODESTACK_SCAN_SCAN_H

#include <ostream>

#include "Options.h"

namespace lodestack {
namespace scan {

// Runs the rounds `options` ask for on the calling thread, which becomes the
// library's dispatcher thread (the poll-driven kind). Results go to `out`,
// one-line errors to `err`. SIGINT and SIGTERM end the run cleanly: pending
// requests are cancelled and the results file is closed. Returns the exit
// status: ExitOk, ExitFailure, or 128 plus the signal's number.
int runScan(const Options& options, std::ostream& out, std::ostream& err);

// Prints the records of the results file `options.decodePath` as a scan
// would have printed them. A truncated or corrupt record ends the output
// with an error naming its byte offset (ExitFailure).
int runDecode(const Options& options, std::ostream& out, std::ostream& err);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_SCAN_H
