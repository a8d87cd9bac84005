#pragma once

#include <string>

#include "tools/lensprofile/lib/Calibration.h"

namespace LensTool {

// Writes a calibration as a lens profile: an RDF document whose array
// CameraProfiles holds one struct per entry, with the model's parameters in
// a nested struct. Operations only.
class ProfileXmp {
 public:
  ProfileXmp() = delete;

  static std::string Write(const Calibration& calibration);
  // Writes under a side name and renames, so a profile is never half there.
  // Throws ToolError when the file cannot be written.
  static void WriteFile(const Calibration& calibration, const std::string& path);
};

}  // namespace LensTool
