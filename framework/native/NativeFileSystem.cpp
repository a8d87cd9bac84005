#include "framework/native/NativeFileSystem.h"

#include <dirent.h>
#include <fcntl.h>
#include <pwd.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>
#include <cstdio>

#include <cerrno>
#include <cstdlib>
#include <limits>
#include <memory>

#include "framework/core/CException.h"

extern char** environ;

namespace Tarsa::Native {

namespace {

[[noreturn]] void ThrowErrno() { throw CSystemError::FromLastError(); }

// Offsets beyond what off_t holds cannot name a place in any file.
off_t ToOffset(std::uint64_t position) {
  if (position > static_cast<std::uint64_t>(std::numeric_limits<off_t>::max())) {
    throw CSystemError(EOVERFLOW);
  }
  return static_cast<off_t>(position);
}

std::uint64_t ToNanoseconds(std::int64_t seconds, std::uint32_t nanoseconds) {
  if (seconds < 0) return 0;
  return static_cast<std::uint64_t>(seconds) * 1000000000u + nanoseconds;
}

struct DirCloser {
  void operator()(DIR* dir) const { closedir(dir); }
};

}  // namespace

EntryKind GetEntryKind(const std::string& path, bool followLinks) {
  struct stat info {};
  const int rc = followLinks ? stat(path.c_str(), &info) : lstat(path.c_str(), &info);
  if (rc != 0) return EntryKind::kMissing;
  return S_ISDIR(info.st_mode) ? EntryKind::kDirectory : EntryKind::kFile;
}

bool GetEntryTimes(const std::string& path, EntryTimes& times) {
  times = EntryTimes{};
  struct statx extended {};
  if (statx(AT_FDCWD, path.c_str(), 0, STATX_BASIC_STATS | STATX_BTIME, &extended) == 0) {
    const struct statx_timestamp& birth =
        (extended.stx_mask & STATX_BTIME) != 0 ? extended.stx_btime : extended.stx_ctime;
    times.created = ToNanoseconds(birth.tv_sec, birth.tv_nsec);
    times.accessed = ToNanoseconds(extended.stx_atime.tv_sec, extended.stx_atime.tv_nsec);
    times.written = ToNanoseconds(extended.stx_mtime.tv_sec, extended.stx_mtime.tv_nsec);
    return true;
  }
  // Some sandboxes refuse statx itself; plain stat has no birth time.
  struct stat info {};
  if (stat(path.c_str(), &info) != 0) return false;
  times.created =
      ToNanoseconds(info.st_ctim.tv_sec, static_cast<std::uint32_t>(info.st_ctim.tv_nsec));
  times.accessed =
      ToNanoseconds(info.st_atim.tv_sec, static_cast<std::uint32_t>(info.st_atim.tv_nsec));
  times.written =
      ToNanoseconds(info.st_mtim.tv_sec, static_cast<std::uint32_t>(info.st_mtim.tv_nsec));
  return true;
}

int OpenFile(const std::string& path, bool readWrite) {
  int handle;
  do {
    // O_NONBLOCK keeps a FIFO from hanging the open; regular files ignore it.
    handle = open(path.c_str(), (readWrite ? O_RDWR : O_RDONLY) | O_CLOEXEC | O_NONBLOCK);
  } while (handle < 0 && errno == EINTR);
  if (handle < 0) ThrowErrno();
  struct stat info {};
  if (fstat(handle, &info) != 0 || S_ISDIR(info.st_mode)) {
    const int code = S_ISDIR(info.st_mode) ? EISDIR : errno;
    close(handle);
    throw CSystemError(code);
  }
  return handle;
}

void CloseFile(int handle) noexcept {
  if (handle != kInvalidHandle) close(handle);
}

std::uint64_t GetFileSize(int handle) {
  struct stat info {};
  if (fstat(handle, &info) != 0) ThrowErrno();
  return static_cast<std::uint64_t>(info.st_size);
}

void SetFileSize(int handle, std::uint64_t size) {
  const off_t length = ToOffset(size);
  int rc;
  do {
    rc = ftruncate(handle, length);
  } while (rc != 0 && errno == EINTR);
  if (rc != 0) ThrowErrno();
}

std::size_t ReadFileAt(int handle, void* buffer, std::size_t count, std::uint64_t position) {
  auto* bytes = static_cast<char*>(buffer);
  std::size_t done = 0;
  while (done < count) {
    const ssize_t got = pread(handle, bytes + done, count - done, ToOffset(position + done));
    if (got < 0) {
      if (errno == EINTR) continue;
      ThrowErrno();
    }
    if (got == 0) break;
    done += static_cast<std::size_t>(got);
  }
  return done;
}

void WriteFileAt(int handle, const void* buffer, std::size_t count, std::uint64_t position) {
  const auto* bytes = static_cast<const char*>(buffer);
  std::size_t done = 0;
  while (done < count) {
    const ssize_t put = pwrite(handle, bytes + done, count - done, ToOffset(position + done));
    if (put < 0) {
      if (errno == EINTR) continue;
      ThrowErrno();
    }
    if (put == 0) throw CSystemError(EIO);
    done += static_cast<std::size_t>(put);
  }
}

void FlushFile(int handle) {
  if (fsync(handle) != 0) ThrowErrno();
}

void CreateFile(const std::string& path) {
  int handle;
  do {
    handle = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
  } while (handle < 0 && errno == EINTR);
  if (handle < 0) ThrowErrno();
  close(handle);
}

void MakeDirectory(const std::string& path) {
  if (mkdir(path.c_str(), 0755) != 0) ThrowErrno();
}

void RemoveFile(const std::string& path) {
  if (unlink(path.c_str()) != 0) ThrowErrno();
}

void RemoveDirectory(const std::string& path) {
  if (rmdir(path.c_str()) != 0) ThrowErrno();
}

void RenameEntry(const std::string& from, const std::string& to) {
  if (rename(from.c_str(), to.c_str()) != 0) ThrowErrno();
}

std::vector<std::string> ListDirectory(const std::string& path) {
  std::unique_ptr<DIR, DirCloser> dir(opendir(path.c_str()));
  if (!dir) ThrowErrno();
  std::vector<std::string> names;
  for (;;) {
    errno = 0;
    const dirent* entry = readdir(dir.get());
    if (entry == nullptr) {
      if (errno != 0) ThrowErrno();
      break;
    }
    const std::string name = entry->d_name;
    if (name != "." && name != "..") names.push_back(name);
  }
  return names;
}

std::string GetWorkingDirectory() {
  std::unique_ptr<char, decltype(&std::free)> cwd(getcwd(nullptr, 0), &std::free);
  if (!cwd) ThrowErrno();
  return cwd.get();
}

std::string GetHomeDirectory() {
  if (const char* home = std::getenv("HOME"); home != nullptr && home[0] != '\0') return home;
  long size = sysconf(_SC_GETPW_R_SIZE_MAX);
  std::vector<char> buffer(size > 0 ? static_cast<std::size_t>(size) : 16384);
  struct passwd entry {};
  struct passwd* found = nullptr;
  if (getpwuid_r(getuid(), &entry, buffer.data(), buffer.size(), &found) != 0 || found == nullptr ||
      found->pw_dir == nullptr) {
    return {};
  }
  return found->pw_dir;
}

void LaunchDetached(const std::string& program, const std::vector<std::string>& args) {
  // A short-lived shell starts the program in the background and exits at
  // once; reaping the shell leaves no zombie, and the program is adopted by
  // init, so nobody waits on it.
  std::vector<std::string> words = {"/bin/sh", "-c", "\"$0\" \"$@\" </dev/null >/dev/null 2>&1 &",
                                    program};
  words.insert(words.end(), args.begin(), args.end());
  std::vector<char*> argv;
  for (std::string& word : words) argv.push_back(word.data());
  argv.push_back(nullptr);
  pid_t pid = 0;
  if (posix_spawn(&pid, "/bin/sh", nullptr, nullptr, argv.data(), environ) != 0) return;
  int status = 0;
  while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
  }
}

}  // namespace Tarsa::Native
