#include "host/platform/SystemInfo.h"

#include <sys/sysinfo.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <system_error>

namespace Host {

uint64_t SystemInfo::PhysicalMemory() {
  struct sysinfo info = {};
  if (::sysinfo(&info) != 0) return 0;
  return static_cast<uint64_t>(info.totalram) * info.mem_unit;
}

std::string SystemInfo::ExecutableFolder() {
  std::error_code error;
  const std::filesystem::path self = std::filesystem::read_symlink("/proc/self/exe", error);
  if (error) return {};
  return self.parent_path().string();
}

std::string SystemInfo::TemporaryFolder() {
  const char* folder = std::getenv("TMPDIR");
  return folder != nullptr && *folder != '\0' ? folder : "/tmp";
}

bool SystemInfo::ErrorIsTerminal() { return ::isatty(STDERR_FILENO) == 1; }

}  // namespace Host
