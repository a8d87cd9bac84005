#include "tests/fuzz/FuzzSupport.h"

#include <sys/mman.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>

namespace Fuzz {

const std::string& FileHolding(const std::uint8_t* data, std::size_t size) {
  static const int fd = memfd_create("fuzz-input", 0);
  static const std::string path = "/proc/self/fd/" + std::to_string(fd);
  if (fd < 0 || ftruncate(fd, 0) != 0) Broken("cannot make the in-memory input file");
  std::size_t written = 0;
  while (written < size) {
    const ssize_t n = pwrite(fd, data + written, size - written, static_cast<off_t>(written));
    if (n <= 0) Broken("cannot write the in-memory input file");
    written += static_cast<std::size_t>(n);
  }
  return path;
}

void Broken(const char* what) {
  std::fprintf(stderr, "fuzz target: %s\n", what);
  std::abort();
}

}  // namespace Fuzz
