#pragma once

#include <string>
#include <vector>

namespace LensTool {

// One named value of a profile, kept as the text it was given in so that a
// number is written exactly as the calibration states it.
struct ProfileField {
  std::string name;
  std::string value;
};

// One entry of a profile: its shooting data and names, and one camera model
// struct ("PerspectiveModel" or "FisheyeModel") with its parameters.
struct ProfileEntry {
  std::vector<ProfileField> fields;
  std::string modelStruct;
  std::vector<ProfileField> modelFields;
};

// The calibration of one lens on one body, as the profile writer reads it
// from text. The text is lines of "Name: value"; '#' starts a comment. Lines
// before the first "[entry]" are shared by every entry; "[entry]" starts an
// entry, and "[PerspectiveModel]" or "[FisheyeModel]" starts its model,
// whose parameters follow. Names are the profile's own field names. A value.
class Calibration {
 public:
  // Throws ToolError naming the line and fault: an unknown name, a number
  // that is not one, a model outside an entry or a second one, an entry
  // without a model, or fisheye and perspective entries in one profile.
  static Calibration Parse(const std::string& text);

  std::vector<ProfileEntry> entries;
};

}  // namespace LensTool
