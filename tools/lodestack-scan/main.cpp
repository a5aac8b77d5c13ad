// lodestack-scan: requests measurements from lodestack and prints every
// result as it arrives; `lodestack-scan decode FILE` prints a results file.
// See --help and the README.
#include <iostream>

#include "Options.h"
#include "Scan.h"

int main(int argc, char** argv) {
  using namespace lodestack::scan;
  Options options;
  const int status = parseOptions(argc, argv, options, std::cout, std::cerr);
  if (status >= 0) return status;
  return options.decode ? runDecode(options, std::cout, std::cerr)
                        : runScan(options, std::cout, std::cerr);
}
