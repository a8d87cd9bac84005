#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

// The framework's only door to the POSIX file system. Everything above speaks
// in UTF-8 paths with '/' separators and raw file descriptors held as ints;
// every failure comes back as a CSystemError carrying errno, unless a
// function says it reports by its result.
namespace Tarsa::Native {

inline constexpr int kInvalidHandle = -1;

enum class EntryKind {
  kMissing,  // no entry, or one whose attributes cannot be read
  kFile,     // anything that is not a directory
  kDirectory,
};

// With followLinks clear, a symbolic link is a file whatever it points to.
EntryKind GetEntryKind(const std::string& path, bool followLinks = true);

// Nanoseconds since 1970-01-01 UTC. `created` is the birth time where the
// file system records one, else the status change time.
struct EntryTimes {
  std::uint64_t created = 0;
  std::uint64_t accessed = 0;
  std::uint64_t written = 0;
};
// False, with all three times 0, when the entry's status cannot be read.
bool GetEntryTimes(const std::string& path, EntryTimes& times);

// Opens an existing file, never creating one; a directory is refused (EISDIR).
int OpenFile(const std::string& path, bool readWrite);
void CloseFile(int handle) noexcept;
std::uint64_t GetFileSize(int handle);
void SetFileSize(int handle, std::uint64_t size);
// Reads up to count bytes at position, retrying short reads until the count
// is met or the file ends; returns the count transferred.
std::size_t ReadFileAt(int handle, void* buffer, std::size_t count, std::uint64_t position);
// Writes all count bytes at position.
void WriteFileAt(int handle, const void* buffer, std::size_t count, std::uint64_t position);
void FlushFile(int handle);

// Makes an empty file (mode 0644) if none is there; an existing one is kept.
void CreateFile(const std::string& path);
void MakeDirectory(const std::string& path);
void RemoveFile(const std::string& path);
void RemoveDirectory(const std::string& path);
// Moves an entry to a new path on the same volume, replacing a file there in
// one step: readers see the old file or the new one, never a part.
void RenameEntry(const std::string& from, const std::string& to);
// Entry names of a directory, without "." and "..", in the system's order.
std::vector<std::string> ListDirectory(const std::string& path);

// The working directory, without a trailing '/'.
std::string GetWorkingDirectory();
// $HOME, else the password database's entry; empty when neither is known.
std::string GetHomeDirectory();

// Starts program (looked up in PATH) with args and does not wait for it; a
// program that cannot start is not reported.
void LaunchDetached(const std::string& program, const std::vector<std::string>& args);

}  // namespace Tarsa::Native
