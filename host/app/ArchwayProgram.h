#pragma once

#include <string>
#include <vector>

namespace Host {

// The program users run: parses the command line, finds and inspects the
// module, and runs it over each image, writing results and actions. Errors
// are reported on standard error as "archway: ..."; the exit status is 0 when
// every image was corrected, 1 when any failed, 2 for a wrong command line
// and 130 after Ctrl-C. Operations only; each call owns what it loads.
class ArchwayProgram {
 public:
  static constexpr int kFailed = 1;
  static constexpr int kUsage = 2;
  static constexpr int kInterrupted = 130;

  ArchwayProgram() = delete;

  static int Main(int argc, char** argv);
  static int Run(const std::vector<std::string>& arguments);
  static const char* Usage();
};

}  // namespace Host
