#include "host/plugin/LensProfileService.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <exiv2/exiv2.hpp>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <string_view>
#include <system_error>

#include "framework/core/CException.h"
#include "framework/files/FilePaths.h"
#include "host/platform/SystemInfo.h"
#include "host/plugin/HostBuffers.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/HostProperties.h"

namespace Host {
namespace {

constexpr const char* kProfilesNamespace = "http://ns.archway.invalid/quillmark/1.0/";
// Larger files are not profiles; reading one whole would only cost memory.
constexpr std::uintmax_t kLargestProfile = 16u << 20;

// What a profile says about itself, from its first entry.
struct Profile {
  std::string path;
  std::string make;
  std::string model;
  std::string lens;
  std::string modelDisplay;
  std::string lensDisplay;
  float cropFactor = 0;
  bool fromUser = false;
};

std::string Trimmed(std::string_view text) {
  const auto first = text.find_first_not_of(" \t\r\n");
  if (first == std::string_view::npos) return {};
  return std::string(text.substr(first, text.find_last_not_of(" \t\r\n") - first + 1));
}

bool SameName(std::string_view a, std::string_view b) {
  const std::string x = Trimmed(a);
  const std::string y = Trimmed(b);
  return std::equal(x.begin(), x.end(), y.begin(), y.end(), [](char p, char q) {
    return std::tolower(static_cast<unsigned char>(p)) ==
           std::tolower(static_cast<unsigned char>(q));
  });
}

std::string Text(const char* text) { return text != nullptr ? text : ""; }

// The first entry's names and crop factor; false when the file is no profile.
bool ReadProfile(const std::filesystem::path& file, Profile& profile) {
  std::error_code error;
  const std::uintmax_t size = std::filesystem::file_size(file, error);
  if (error || size == 0 || size > kLargestProfile) return false;
  std::ifstream input(file, std::ios::binary);
  const std::string packet((std::istreambuf_iterator<char>(input)),
                           std::istreambuf_iterator<char>());
  if (!input.good() && !input.eof()) return false;

  Exiv2::XmpData data;
  try {
    Exiv2::XmpProperties::registerNs(kProfilesNamespace, "qmprofiles");
    if (Exiv2::XmpParser::decode(data, packet) != 0) return false;
  } catch (const Exiv2::AnyError&) {
    return false;
  }
  // Keys read "Xmp.<prefix>.CameraProfiles[1]/<prefix>:<Field>"; the fields'
  // prefix is the file's own, so only their local names are compared.
  const std::string first =
      "Xmp." + Exiv2::XmpProperties::prefix(kProfilesNamespace) + ".CameraProfiles[1]/";
  std::map<std::string, std::string> fields;
  for (const Exiv2::Xmpdatum& datum : data) {
    const std::string key = datum.key();
    if (key.compare(0, first.size(), first) != 0) continue;
    const std::string rest = key.substr(first.size());
    const auto colon = rest.find(':');
    if (rest.find('/') != std::string::npos || colon == std::string::npos) continue;
    fields.emplace(rest.substr(colon + 1), datum.toString());
  }
  if (fields.empty()) return false;
  profile.path = file.string();
  profile.make = Trimmed(fields["Make"]);
  profile.model = Trimmed(fields["Model"]);
  profile.lens = Trimmed(fields["Lens"]);
  profile.modelDisplay = fields["CameraPrettyName"];
  profile.lensDisplay = fields["LensPrettyName"];
  char* end = nullptr;
  const std::string& crop = fields["SensorFormatFactor"];
  const float value = std::strtof(crop.c_str(), &end);
  profile.cropFactor = end != crop.c_str() && std::isfinite(value) ? value : 0.0f;
  return true;
}

std::vector<Profile> Matching(const std::string& make, const std::string& model,
                              const std::string& lens) {
  std::vector<Profile> found;
  const std::vector<std::string> folders = LensProfileService::Folders();
  for (std::size_t f = 0; f < folders.size(); ++f) {
    std::error_code error;
    std::vector<std::filesystem::path> files;
    for (std::filesystem::directory_iterator it(folders[f], error), end; !error && it != end;
         it.increment(error)) {
      std::string extension = it->path().extension().string();
      for (char& c : extension) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
      if (extension == ".xmp" && it->is_regular_file(error)) files.push_back(it->path());
    }
    std::sort(files.begin(), files.end());
    for (const std::filesystem::path& file : files) {
      Profile profile;
      if (!ReadProfile(file, profile) || !SameName(profile.make, make)) continue;
      const bool fits =
          Trimmed(lens).empty() ? SameName(profile.model, model) : SameName(profile.lens, lens);
      if (!fits) continue;
      profile.fromUser = f > 0 || SystemInfo::ExecutableFolder().empty();
      found.push_back(std::move(profile));
    }
  }
  return found;
}

char* Block(const std::string& text) {
  auto* block =
      static_cast<char*>(HostBuffers::Suite()->allocate(std::uint32_t(text.size() + 1), nullptr));
  if (block != nullptr) std::memcpy(block, text.c_str(), text.size() + 1);
  return block;
}

char16_t* WideBlock(const std::string& text) {
  const std::u16string wide = HostProperties::Utf16(text);
  const std::size_t bytes = (wide.size() + 1) * sizeof(char16_t);
  auto* block =
      static_cast<char16_t*>(HostBuffers::Suite()->allocate(std::uint32_t(bytes), nullptr));
  if (block != nullptr) std::memcpy(block, wide.c_str(), bytes);
  return block;
}

void Free(void* block) { HostBuffers::Suite()->release(&block); }

void FreeResult(Tarsa::HostLensResult* result) {
  if (result == nullptr) return;
  for (void* field : {static_cast<void*>(result->widePath), static_cast<void*>(result->path),
                      static_cast<void*>(result->make), static_cast<void*>(result->model),
                      static_cast<void*>(result->modelDisplay), static_cast<void*>(result->lens),
                      static_cast<void*>(result->lensDisplay)}) {
    Free(field);
  }
  Free(result);
}

Tarsa::HostLensResult* MakeResult(const Profile& profile, const std::string& queryModel) {
  auto* result = static_cast<Tarsa::HostLensResult*>(
      HostBuffers::Suite()->allocate(sizeof(Tarsa::HostLensResult), nullptr));
  if (result == nullptr) return nullptr;
  *result = {};
  // The path goes both ways: the filter takes the wide one when that file
  // exists, and the bytes otherwise (a name that is not UTF-8).
  result->widePath = WideBlock(profile.path);
  result->path = Block(profile.path);
  result->make = Block(profile.make);
  result->model = Block(profile.model);
  result->modelDisplay = Block(profile.modelDisplay);
  result->lens = Block(profile.lens);
  result->lensDisplay = Block(profile.lensDisplay);
  // flagA: the user's own profile; flagB: made on the photo's own body.
  result->flagA = profile.fromUser ? 1 : 0;
  result->flagB = SameName(profile.model, queryModel) ? 1 : 0;
  result->pathIsWide = 1;
  result->cropFactor = profile.cropFactor;
  if (result->widePath == nullptr || result->path == nullptr || result->make == nullptr ||
      result->model == nullptr || result->modelDisplay == nullptr || result->lens == nullptr ||
      result->lensDisplay == nullptr) {
    FreeResult(result);
    return nullptr;
  }
  return result;
}

Tarsa::HostStatus Query(void* block) {
  if (block == nullptr) return HostCodes::kParamErr;
  auto* query = static_cast<Tarsa::HostLensQuery*>(block);
  query->results = nullptr;
  query->resultCount = 0;
  const std::string model = Text(query->model);
  std::vector<Profile> profiles;
  try {
    profiles = Matching(Text(query->make), model, Text(query->lens));
  } catch (const std::exception&) {
    return HostCodes::kMemFullErr;
  }
  if (profiles.empty()) return HostCodes::kNoError;

  auto* results = static_cast<Tarsa::HostLensResult**>(HostBuffers::Suite()->allocate(
      std::uint32_t(profiles.size() * sizeof(Tarsa::HostLensResult*)), nullptr));
  if (results == nullptr) return HostCodes::kMemFullErr;
  for (std::size_t i = 0; i < profiles.size(); ++i) {
    results[i] = MakeResult(profiles[i], model);
    if (results[i] == nullptr) {
      for (std::size_t j = 0; j < i; ++j) FreeResult(results[j]);
      Free(results);
      return HostCodes::kMemFullErr;
    }
  }
  query->results = results;
  query->resultCount = std::uint32_t(profiles.size());
  return HostCodes::kNoError;
}

// The folders are read at each query; there is nothing to get ready.
Tarsa::HostStatus Prepare() { return HostCodes::kNoError; }

constexpr Tarsa::HostLensProfilesSuite kSuite = {nullptr, Query, Prepare};

}  // namespace

const Tarsa::HostLensProfilesSuite* LensProfileService::Suite() { return &kSuite; }

std::vector<std::string> LensProfileService::Folders() {
  std::vector<std::string> folders;
  const std::string program = SystemInfo::ExecutableFolder();
  if (!program.empty()) folders.push_back(program + "/Profiles");
  try {
    folders.push_back(Tarsa::GetSpecialFolderPath(Tarsa::SpecialFolder::kUserData) +
                      "archway/profiles");
  } catch (const Tarsa::CException&) {
    // No home directory: the installed profiles alone.
  }
  return folders;
}

}  // namespace Host
