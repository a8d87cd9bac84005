#pragma once

#include <stdexcept>
#include <string>

namespace Host {

// The host program's failure: what went wrong, worded for the user, and the
// file it concerns when there is one. The host is not inside the framework and
// does not use its exceptions; main() prints what() and exits non-zero.
class HostError : public std::runtime_error {
 public:
  explicit HostError(const std::string& problem) : std::runtime_error(problem), problem_(problem) {}
  HostError(const std::string& path, const std::string& problem)
      : std::runtime_error("'" + path + "': " + problem), path_(path), problem_(problem) {}

  // The file concerned; empty when the failure is not about one file.
  const std::string& Path() const { return path_; }
  // The message without the file name.
  const std::string& Problem() const { return problem_; }

 private:
  std::string path_;
  std::string problem_;
};

}  // namespace Host
