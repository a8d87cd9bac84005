// archway-lensprofile: writes a lens profile from a calibration text.
#include <cstdio>
#include <cstring>
#include <exception>
#include <fstream>
#include <sstream>
#include <string>

#include "tools/lensprofile/lib/Calibration.h"
#include "tools/lensprofile/lib/ProfileXmp.h"

namespace {

constexpr const char* kUsage =
    "Usage: archway-lensprofile CALIBRATION.txt PROFILE.xmp\n"
    "Writes the lens profile of a calibration. The calibration is lines of\n"
    "'Name: value'; lines before the first [entry] are shared by all entries,\n"
    "and each entry has one [PerspectiveModel] or [FisheyeModel] section with\n"
    "its parameters (FocalLengthX, ImageXCenter, RadialDistortParam1, ...).\n";

}  // namespace

int main(int argc, char** argv) {
  if (argc == 2 && (std::strcmp(argv[1], "--help") == 0 || std::strcmp(argv[1], "-h") == 0)) {
    std::fputs(kUsage, stdout);
    return 0;
  }
  if (argc != 3) {
    std::fputs(kUsage, stderr);
    return 2;
  }
  try {
    std::ifstream input(argv[1], std::ios::binary);
    if (!input) {
      std::fprintf(stderr, "archway-lensprofile: '%s' cannot be read\n", argv[1]);
      return 1;
    }
    std::ostringstream text;
    text << input.rdbuf();
    LensTool::ProfileXmp::WriteFile(LensTool::Calibration::Parse(text.str()), argv[2]);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "archway-lensprofile: %s: %s\n", argv[1], error.what());
    return 1;
  }
  return 0;
}
