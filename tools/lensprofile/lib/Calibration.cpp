#include "tools/lensprofile/lib/Calibration.h"

#include <cerrno>
#include <cmath>
#include <cstdlib>
#include <string_view>

#include "tools/lensprofile/lib/ToolError.h"

namespace LensTool {
namespace {

enum class Kind { kText, kNumber, kInteger, kBoolean };

struct Known {
  const char* name;
  Kind kind;
};

constexpr Known kEntryFields[] = {
    {"Make", Kind::kText},
    {"Model", Kind::kText},
    {"SerialNumber", Kind::kText},
    {"Lens", Kind::kText},
    {"LensInfo", Kind::kText},
    {"CameraPrettyName", Kind::kText},
    {"LensPrettyName", Kind::kText},
    {"ImageWidth", Kind::kNumber},
    {"ImageLength", Kind::kNumber},
    {"FocalLength", Kind::kNumber},
    {"ApertureValue", Kind::kNumber},
    {"SensorFormatFactor", Kind::kNumber},
    {"CameraRawProfile", Kind::kBoolean},
    {"FocusDistance", Kind::kNumber},
};

constexpr Known kModelFields[] = {
    {"Version", Kind::kInteger},
    {"FocalLengthX", Kind::kNumber},
    {"FocalLengthY", Kind::kNumber},
    {"ImageXCenter", Kind::kNumber},
    {"ImageYCenter", Kind::kNumber},
    {"ScaleFactor", Kind::kNumber},
    {"RadialDistortParam1", Kind::kNumber},
    {"RadialDistortParam2", Kind::kNumber},
    {"RadialDistortParam3", Kind::kNumber},
    {"TangentialDistortParam1", Kind::kNumber},
    {"TangentialDistortParam2", Kind::kNumber},
    {"ResidualMeanError", Kind::kNumber},
    {"ResidualStandardDeviation", Kind::kNumber},
};

constexpr std::string_view kPerspective = "PerspectiveModel";
constexpr std::string_view kFisheye = "FisheyeModel";

std::string_view Trim(std::string_view text) {
  const auto first = text.find_first_not_of(" \t\r");
  if (first == std::string_view::npos) return {};
  const auto last = text.find_last_not_of(" \t\r");
  return text.substr(first, last - first + 1);
}

template <std::size_t N>
const Known* Find(const Known (&table)[N], std::string_view name) {
  for (const Known& known : table) {
    if (name == known.name) return &known;
  }
  return nullptr;
}

// The value as the profile will hold it; throws on a malformed one.
std::string Checked(const Known& known, std::string_view value, const std::string& where) {
  const std::string text(value);
  switch (known.kind) {
    case Kind::kText:
      return text;
    case Kind::kBoolean:
      if (text == "true" || text == "True") return "True";
      if (text == "false" || text == "False") return "False";
      throw ToolError(where + known.name + " must be true or false");
    case Kind::kNumber:
    case Kind::kInteger: {
      char* end = nullptr;
      errno = 0;
      const double number = known.kind == Kind::kNumber
                                ? std::strtod(text.c_str(), &end)
                                : static_cast<double>(std::strtol(text.c_str(), &end, 10));
      if (text.empty() || *end != '\0' || errno != 0 || !std::isfinite(number)) {
        throw ToolError(where + known.name + " must be " +
                        (known.kind == Kind::kNumber ? "a number" : "a whole number"));
      }
      return text;
    }
  }
  return text;
}

void Put(std::vector<ProfileField>& fields, const std::string& name, const std::string& value) {
  for (ProfileField& field : fields) {
    if (field.name == name) {
      field.value = value;
      return;
    }
  }
  fields.push_back({name, value});
}

}  // namespace

Calibration Calibration::Parse(const std::string& text) {
  Calibration calibration;
  std::vector<ProfileField> shared;
  enum class Section { kShared, kEntry, kModel } section = Section::kShared;
  std::size_t lineNumber = 0;
  std::size_t start = 0;
  while (start <= text.size()) {
    std::size_t end = text.find('\n', start);
    if (end == std::string::npos) end = text.size();
    std::string_view line(text.data() + start, end - start);
    start = end + 1;
    ++lineNumber;
    const std::string where = "line " + std::to_string(lineNumber) + ": ";
    if (const auto hash = line.find('#'); hash != std::string_view::npos) {
      line = line.substr(0, hash);
    }
    line = Trim(line);
    if (line.empty()) continue;

    if (line.front() == '[') {
      if (line.back() != ']') throw ToolError(where + "a section name must end in ']'");
      const std::string_view name = Trim(line.substr(1, line.size() - 2));
      if (name == "entry") {
        calibration.entries.push_back({shared, {}, {}});
        section = Section::kEntry;
      } else if (name == kPerspective || name == kFisheye) {
        if (section != Section::kEntry) {
          throw ToolError(where + "a model belongs to an entry, once");
        }
        calibration.entries.back().modelStruct = std::string(name);
        section = Section::kModel;
      } else {
        throw ToolError(where + "unknown section '" + std::string(name) + "'");
      }
      continue;
    }

    const auto colon = line.find(':');
    if (colon == std::string_view::npos) throw ToolError(where + "expected 'Name: value'");
    const std::string_view name = Trim(line.substr(0, colon));
    const std::string_view value = Trim(line.substr(colon + 1));
    const Known* known =
        section == Section::kModel ? Find(kModelFields, name) : Find(kEntryFields, name);
    if (known == nullptr) throw ToolError(where + "unknown name '" + std::string(name) + "'");
    const std::string checked = Checked(*known, value, where);
    if (section == Section::kShared) {
      Put(shared, known->name, checked);
    } else if (section == Section::kEntry) {
      Put(calibration.entries.back().fields, known->name, checked);
    } else {
      Put(calibration.entries.back().modelFields, known->name, checked);
    }
  }

  if (calibration.entries.empty()) throw ToolError("the calibration has no [entry]");
  for (std::size_t i = 0; i < calibration.entries.size(); ++i) {
    const ProfileEntry& entry = calibration.entries[i];
    if (entry.modelStruct.empty()) {
      throw ToolError("entry " + std::to_string(i + 1) + " has no model");
    }
    if ((entry.modelStruct == kFisheye) != (calibration.entries[0].modelStruct == kFisheye)) {
      throw ToolError("fisheye and perspective entries cannot share a profile");
    }
  }
  return calibration;
}

}  // namespace LensTool
