#pragma once

#include <string>
#include <vector>

#include "framework/plugin/HostSuites.h"

namespace Host {

// The lens profile service: answers the filter's query with the profiles,
// in the profile folders, of the photo's camera make and, when the photo
// names its lens, of that lens, otherwise of its camera model. Names compare
// without regard to case or surrounding space; the filter ranks what comes
// back. Each query reads the folders anew, so a profile dropped in takes
// effect at the next run; the service keeps no state.
//
// A profile is an XMP file (".xmp") whose array CameraProfiles names the
// camera and lens in its first entry. A file that cannot be read or parsed is
// passed over.
class LensProfileService {
 public:
  LensProfileService() = delete;

  static const Tarsa::HostLensProfilesSuite* Suite();
  // The folders searched, in order: "Profiles" beside the program, then the
  // user's $XDG_DATA_HOME/archway/profiles (~/.local/share/...).
  static std::vector<std::string> Folders();
};

}  // namespace Host
