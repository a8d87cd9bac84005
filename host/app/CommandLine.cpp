#include "host/app/CommandLine.h"

#include <charconv>

#include "host/io/HostError.h"

namespace Host {

CommandLine CommandLine::Parse(const std::vector<std::string>& arguments) {
  CommandLine line;
  if (arguments.empty()) throw HostError("no command given");
  for (const std::string& argument : arguments) {
    if (argument == "--help" || argument == "-h") return line;
  }
  const std::string& command = arguments[0];
  if (command == "apply") {
    line.command = Command::kApply;
  } else if (command == "edit") {
    line.command = Command::kEdit;
  } else {
    throw HostError("unknown command '" + command + "'");
  }

  bool options = true;
  for (size_t i = 1; i < arguments.size(); ++i) {
    std::string argument = arguments[i];
    if (!options || argument.empty() || argument[0] != '-' || argument == "-") {
      line.inputs.push_back(argument);
      continue;
    }
    if (argument == "--") {
      options = false;
      continue;
    }
    std::optional<std::string> attached;
    if (const size_t equals = argument.find('=');
        argument.starts_with("--") && equals != std::string::npos) {
      attached = argument.substr(equals + 1);
      argument.resize(equals);
    }
    auto value = [&]() -> std::string {
      if (attached) return *attached;
      if (i + 1 >= arguments.size()) throw HostError("the option " + argument + " needs a value");
      return arguments[++i];
    };
    if (argument == "--action") {
      line.action = value();
    } else if (argument == "--save-action") {
      line.saveAction = value();
    } else if (argument == "-o" || argument == "--output") {
      line.output = value();
    } else if (argument == "--module") {
      line.module = value();
    } else if (argument == "--host-version") {
      const std::string text = value();
      int version = 0;
      const auto result = std::from_chars(text.data(), text.data() + text.size(), version);
      if (result.ec != std::errc() || result.ptr != text.data() + text.size() || version < 0 ||
          version > 32767) {
        throw HostError("--host-version takes a whole number from 0 to 32767, not '" + text + "'");
      }
      line.hostVersion = version;
    } else if (argument == "--no-gpu" && !attached) {
      line.noGraphicsProcessor = true;
    } else if (argument == "--timings" && !attached) {
      line.timings = true;
    } else {
      throw HostError("unknown option '" + arguments[i] + "'");
    }
  }
  if (line.inputs.empty()) throw HostError("no image or folder given");
  return line;
}

}  // namespace Host
