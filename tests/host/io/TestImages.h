#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "host/io/HostDocument.h"

namespace Host::Testing {

// A fresh folder under the temporary directory, removed with its contents at
// the end of the test.
class ScratchFolder {
 public:
  ScratchFolder();
  ~ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;

  std::string File(const std::string& name) const { return path_ + "/" + name; }
  // The folder's entry names, sorted, one per line.
  std::string Listing() const;

 private:
  std::string path_;
};

// Every sample drawn uniformly from the whole host range, from a fixed seed.
std::unique_ptr<HostDocument> RandomDocument(int32_t width, int32_t height, ImageMode mode,
                                             bool transparency, uint32_t seed);
// Smooth waves with a little noise, like a photograph; lossy codecs are
// judged on these rather than on pure noise.
std::unique_ptr<HostDocument> PhotoLikeDocument(int32_t width, int32_t height, ImageMode mode,
                                                uint32_t seed);
// The largest difference between two documents' samples; -1 when they differ
// in size, mode or planes.
int LargestDifference(const HostDocument& a, const HostDocument& b);

std::string ReadBytes(const std::string& path);
void WriteBytes(const std::string& path, const std::string& bytes);

}  // namespace Host::Testing
