#pragma once

#include <cstdint>
#include <string>

namespace Host {

// What the host asks of the operating system about the machine and itself.
// Operations only, no state.
class SystemInfo {
 public:
  SystemInfo() = delete;

  // Physical memory in bytes; 0 when the system does not say.
  static uint64_t PhysicalMemory();
  // The folder of the running executable, links resolved; empty when unknown.
  static std::string ExecutableFolder();
  // $TMPDIR, or /tmp.
  static std::string TemporaryFolder();
  // Whether standard error is a terminal.
  static bool ErrorIsTerminal();
};

}  // namespace Host
