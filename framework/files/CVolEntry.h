#pragma once

#include <cstdint>
#include <string>
#include <utility>

namespace Tarsa {

class CDirectory;

// A name on disk: an entry holds a path and never an open file, so it is
// cheap to copy and says nothing about the disk until asked. Files and
// directories refine what existence means; a directory's path ends in '/'.
class CVolEntry {
 public:
  CVolEntry() = default;
  // Takes path as it is, without touching the disk.
  explicit CVolEntry(std::string path) : path_(std::move(path)) {}
  virtual ~CVolEntry() = default;

  CVolEntry(const CVolEntry&) = default;
  CVolEntry& operator=(const CVolEntry&) = default;

  virtual bool Exists() const;
  // Exists and is not a directory.
  virtual bool IsFile() const;
  virtual bool IsDirectory() const;
  virtual std::string GetPath() const { return path_; }
  // The leaf with its extension; a root's label, which is the root itself.
  virtual std::string GetName() const;
  // GetName up to its last '.'.
  virtual std::string GetBaseName() const;
  // What follows the last '.' of GetName; empty for a leading dot.
  virtual std::string GetExtension() const;
  // Up to four extension characters packed from the high byte down, 0 when
  // there are none or more than four.
  virtual std::uint32_t GetTypeCode() const;
  // Opens the containing folder in the desktop's file manager; the outcome
  // is not reported.
  virtual void Reveal() const;
  virtual std::string GetDisplayName() const { return GetName(); }
  virtual std::string GetDisplayPath() const { return GetPath(); }
  // How many parents the path has.
  virtual int GetDepth() const;
  virtual CDirectory GetParent() const;
  // The path levels up; returns how many levels could be climbed.
  virtual int GetParentPath(std::string& out, int levels = 1) const;
  // Nanoseconds since 1970 UTC; false, with all three 0, when the entry
  // cannot be read. `created` is the birth time where the file system keeps
  // one, else the status change time.
  virtual bool GetTimes(std::uint64_t& created, std::uint64_t& accessed,
                        std::uint64_t& written) const;
  std::uint64_t GetCreationTime() const;
  std::uint64_t GetAccessTime() const;
  std::uint64_t GetWriteTime() const;
  // Removes a file, or a directory with all it holds. A symbolic link is
  // removed itself, never what it points to.
  virtual void Delete();
  // Moves the entry to `path` on the same volume, replacing a file there at
  // once; this entry then names the new path.
  void Rename(const std::string& path);

 protected:
  std::string path_;
};

}  // namespace Tarsa
