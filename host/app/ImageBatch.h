#pragma once

#include <optional>
#include <string>
#include <vector>

namespace Host {

// The images of one call and where each result goes. A folder stands for its
// image files (by extension, sorted by name), leaving out hidden files and
// earlier results ("*-archway.*"). A result goes to the -o file when there is
// one input, into the -o folder under the input's name, or by default beside
// the input as "<name>-archway.<extension>". Operations only.
class ImageBatch {
 public:
  struct Job {
    std::string input;
    std::string output;
  };

  static constexpr const char* kResultSuffix = "-archway";

  ImageBatch() = delete;

  // Throws HostError when a folder holds no image, when -o names a file for
  // several images or a folder that does not exist, when a result would
  // replace an input, or when two results would share a name.
  static std::vector<Job> Plan(const std::vector<std::string>& arguments,
                               const std::optional<std::string>& output);

  static std::string DefaultOutput(const std::string& input);
};

}  // namespace Host
