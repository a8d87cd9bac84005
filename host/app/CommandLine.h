#pragma once

#include <optional>
#include <string>
#include <vector>

namespace Host {

// What the user asked the program to do, parsed from its arguments. A value.
class CommandLine {
 public:
  enum class Command { kHelp, kApply, kEdit };

  Command command = Command::kHelp;
  std::optional<std::string> action;
  std::optional<std::string> saveAction;
  std::optional<std::string> output;
  std::optional<std::string> module;
  bool noGraphicsProcessor = false;
  bool timings = false;
  int hostVersion = 18;
  std::vector<std::string> inputs;

  // Options take their value as the next argument or after '='; "--" ends
  // the options. Throws HostError with the fault, to be shown with the usage
  // hint.
  static CommandLine Parse(const std::vector<std::string>& arguments);
};

}  // namespace Host
