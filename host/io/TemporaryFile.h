#pragma once

#include <string>

namespace Host {

// A file being written under a temporary name beside its target, so that the
// target is replaced only by a complete file. The temporary is created empty
// on construction; writers open it by Path(). Commit() flushes it to disk and
// renames it over the target; a TemporaryFile destroyed before Commit()
// removes its file, leaving the target as it was. Owns the temporary file.
class TemporaryFile {
 public:
  // Throws HostError when no file can be created in the target's folder.
  explicit TemporaryFile(std::string target);
  ~TemporaryFile();

  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;

  const std::string& Path() const { return path_; }
  const std::string& Target() const { return target_; }

  // Throws HostError when the file cannot be flushed or renamed; the
  // temporary is then still removed on destruction.
  void Commit();

 private:
  std::string target_;
  std::string path_;
  bool committed_ = false;
};

}  // namespace Host
