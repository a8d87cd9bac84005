#include "framework/native/NativeScratch.h"

#include <stdlib.h>
#include <unistd.h>

#include <cerrno>
#include <vector>

#include "framework/core/CException.h"

namespace Tarsa::Native {

std::string CreateUniqueFile(const std::string& directory, const std::string& prefix,
                             const std::string& suffix) {
  std::string path = directory;
  if (!path.empty() && path.back() != '/') path += '/';
  path += prefix + "XXXXXX" + suffix;
  std::vector<char> name(path.begin(), path.end());
  name.push_back('\0');
  const int handle = mkstemps(name.data(), int(suffix.size()));
  if (handle < 0) throw CSystemError::FromLastError();
  close(handle);
  return std::string(name.data());
}

}  // namespace Tarsa::Native
