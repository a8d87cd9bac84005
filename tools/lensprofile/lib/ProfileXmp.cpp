#include "tools/lensprofile/lib/ProfileXmp.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <system_error>

#include "lens/metadata/PXmpMeta.h"
#include "tools/lensprofile/lib/ToolError.h"

namespace LensTool {
namespace {

// The namespaces the module reads profiles in.
constexpr const char* kProfilesNamespace = Project::PXmpMeta::kQuillmarkNamespace;
constexpr const char* kEntryNamespace = Project::PXmpMeta::kCameraProfileNamespace;

std::string Escaped(const std::string& text) {
  std::string out;
  for (const char c : text) {
    switch (c) {
      case '&':
        out += "&amp;";
        break;
      case '<':
        out += "&lt;";
        break;
      case '>':
        out += "&gt;";
        break;
      default:
        out += c;
    }
  }
  return out;
}

void WriteFields(std::string& out, const std::vector<ProfileField>& fields, const char* indent) {
  for (const ProfileField& field : fields) {
    out += indent;
    out += "<cp:" + field.name + ">" + Escaped(field.value) + "</cp:" + field.name + ">\n";
  }
}

}  // namespace

std::string ProfileXmp::Write(const Calibration& calibration) {
  std::string out =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
      "<rdf:RDF xmlns:rdf=\"http://www.w3.org/1999/02/22-rdf-syntax-ns#\">\n"
      " <rdf:Description rdf:about=\"\"\n"
      "   xmlns:qm=\"";
  out += kProfilesNamespace;
  out += "\"\n   xmlns:cp=\"";
  out += kEntryNamespace;
  out +=
      "\">\n"
      "  <qm:CameraProfiles>\n"
      "   <rdf:Seq>\n";
  for (const ProfileEntry& entry : calibration.entries) {
    out += "    <rdf:li rdf:parseType=\"Resource\">\n";
    WriteFields(out, entry.fields, "     ");
    out += "     <cp:" + entry.modelStruct + " rdf:parseType=\"Resource\">\n";
    bool hasVersion = false;
    for (const ProfileField& field : entry.modelFields) hasVersion |= field.name == "Version";
    if (!hasVersion) out += "      <cp:Version>1</cp:Version>\n";
    WriteFields(out, entry.modelFields, "      ");
    out += "     </cp:" + entry.modelStruct + ">\n";
    out += "    </rdf:li>\n";
  }
  out +=
      "   </rdf:Seq>\n"
      "  </qm:CameraProfiles>\n"
      " </rdf:Description>\n"
      "</rdf:RDF>\n";
  return out;
}

void ProfileXmp::WriteFile(const Calibration& calibration, const std::string& path) {
  const std::string text = Write(calibration);
  const std::string side = path + ".part";
  {
    std::ofstream file(side, std::ios::binary | std::ios::trunc);
    file.write(text.data(), static_cast<std::streamsize>(text.size()));
    file.close();
    if (!file) {
      std::remove(side.c_str());
      throw ToolError("'" + path + "': cannot be written");
    }
  }
  std::error_code error;
  std::filesystem::rename(side, path, error);
  if (error) {
    std::remove(side.c_str());
    throw ToolError("'" + path + "': " + error.message());
  }
}

}  // namespace LensTool
