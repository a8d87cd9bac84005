#include "host/io/TemporaryFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <random>

#include "host/io/HostError.h"

namespace Host {

namespace {

std::string FolderOf(const std::string& path) {
  const size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  if (slash == 0) return "/";
  return path.substr(0, slash);
}

std::string NameOf(const std::string& path) {
  const size_t slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

}  // namespace

TemporaryFile::TemporaryFile(std::string target) : target_(std::move(target)) {
  // A hidden name in the same folder, so the final rename stays on one file
  // system and cannot be seen half-done. O_EXCL with a random suffix avoids
  // both other writers and files left by a crash. Mode 0666 lets the umask
  // decide, as for any new file; an existing target's mode is kept instead.
  const std::string folder = FolderOf(target_);
  std::random_device entropy;
  std::mt19937_64 random(static_cast<uint64_t>(entropy()) << 32 | entropy());
  int error = 0;
  for (int attempt = 0; attempt < 16; ++attempt) {
    char suffix[20];
    std::snprintf(suffix, sizeof suffix, "%012llx",
                  static_cast<unsigned long long>(random() & 0xffffffffffffULL));
    const std::string candidate = folder + "/." + NameOf(target_) + "." + suffix + ".tmp";
    const int fd = ::open(candidate.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (fd >= 0) {
      struct stat old;
      if (::stat(target_.c_str(), &old) == 0 && S_ISREG(old.st_mode)) {
        ::fchmod(fd, old.st_mode & 07777);
      }
      ::close(fd);
      path_ = candidate;
      return;
    }
    error = errno;
    if (error != EEXIST) break;
  }
  throw HostError(target_,
                  std::string("cannot create a file in its folder: ") + std::strerror(error));
}

TemporaryFile::~TemporaryFile() {
  if (!committed_) ::unlink(path_.c_str());
}

void TemporaryFile::Commit() {
  const int fd = ::open(path_.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0 || ::fsync(fd) != 0) {
    const int error = errno;
    if (fd >= 0) ::close(fd);
    throw HostError(target_, std::string("cannot write the file to disk: ") + std::strerror(error));
  }
  ::close(fd);
  if (::rename(path_.c_str(), target_.c_str()) != 0) {
    throw HostError(target_, std::string("cannot replace the file: ") + std::strerror(errno));
  }
  committed_ = true;
}

}  // namespace Host
