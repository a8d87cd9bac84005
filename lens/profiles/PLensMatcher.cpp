#include "lens/profiles/PLensMatcher.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <iterator>
#include <new>
#include <set>

#include "framework/core/CException.h"
#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"
#include "framework/process/CReporter.h"
#include "framework/strings/Unicode.h"
#include "lens/metadata/PXmpMeta.h"

namespace Project {

namespace {

constexpr float kEps = PGenericCameraModel::kEps;
// Nothing the XMP reader would take is larger.
constexpr std::uint64_t kLargestProfile = PXmpMeta::kMaxSize;
// A path longer than this in the host's wide form is not taken as one.
constexpr std::size_t kLongestWidePath = 1u << 16;

constexpr const char* kTexts[] = {
    "",
    "$$$/Archway/LensProfileWarning/AcquireLensProfileSuiteFailed=Failed to acquire lens "
    "profiles.",
    "$$$/Archway/LensProfileWarning/AcquirePluginSuiteFailed=Failed to acquire required plugin "
    "suites.",
    "$$$/Archway/LensProfileWarning/NoMatchedProfile=No matching lens profile found.",
    "$$$/Archway/LensProfileWarning/ReadProfileError=Failed to read the required lens profile.",
    "$$$/Archway/LensProfileWarning/IncorrectProfile=Incorrect lens profile.",
    "$$$/Archway/LensProfileWarning/OutOfMemoryWhenLoadingProfile=Out of memory.",
};

// A zero-terminated copy of text in a block of the basic suite; null when
// the suite has no memory.
char* HostString(const Tarsa::HostBufferSuite& basic, const std::string& text) {
  if (text.size() >= UINT32_MAX) return nullptr;
  std::uint32_t actual = 0;
  auto* block = static_cast<char*>(basic.allocate(std::uint32_t(text.size() + 1), &actual));
  if (block != nullptr) std::memcpy(block, text.c_str(), text.size() + 1);
  return block;
}

template <typename T>
void Free(const Tarsa::HostBufferSuite& basic, T*& block) {
  if (block == nullptr) return;
  void* untyped = const_cast<void*>(static_cast<const void*>(block));
  basic.release(&untyped);
  block = nullptr;
}

std::string CopyOf(const char* text) { return text != nullptr ? text : ""; }

// The host's wide path, when it is one and that file exists.
bool WidePath(const char16_t* wide, std::string& out) {
  if (wide == nullptr) return false;
  std::size_t length = 0;
  while (wide[length] != 0) {
    if (++length > kLongestWidePath) return false;
  }
  const std::string path = Tarsa::Utf16ToUtf8(std::u16string_view(wide, length));
  try {
    if (path.empty() || !Tarsa::CFile::FromPath(path).Exists()) return false;
  } catch (const Tarsa::CException&) {
    return false;
  }
  out = path;
  return true;
}

// The whole file; false when it is missing, empty, too large or unreadable.
bool ReadWhole(const std::string& path, std::string& data) {
  try {
    const Tarsa::CFile file = Tarsa::CFile::FromPath(path);
    if (!file.Exists()) return false;
    Tarsa::CFileContainer container(file);
    const std::uint64_t size = container.Size();
    if (size == 0 || size > kLargestProfile) return false;
    data.resize(std::size_t(size));
    container.Read(data.data(), data.size());
    return true;
  } catch (const Tarsa::CException&) {
    return false;
  }
}

}  // namespace

const char* PLensMatcher::TextOf(std::int32_t code) {
  return code > 0 && code < std::int32_t(std::size(kTexts)) ? kTexts[code] : "";
}

bool PLensMatcher::MatchProfile(bool warn) {
  lastError_ = 0;
  std::int32_t code = 0;
  bool matched = false;
  const Tarsa::HostBufferSuite* basic = run_.BasicSuite();
  const Tarsa::HostLensProfilesSuite* suite = nullptr;
  const PhotoInfo* photo = nullptr;
  if (basic == nullptr || basic->allocate == nullptr || basic->release == nullptr) {
    code = kNoBasicSuite;
  } else if (suite = run_.LensProfilesSuite(); suite == nullptr || suite->query == nullptr) {
    code = kNoLensSuite;
  } else if (photo = run_.LensPhoto(); photo == nullptr || photo->GetMake().empty()) {
    code = kNoMatch;
  } else if (code = QueryCandidates(*basic, *suite, *photo); code == 0) {
    if (!candidates_.empty() && !LoadProfile(*candidates_.front())) {
      code = lastError_ == kOutOfMemory ? kOutOfMemory : kUnreadableProfile;
    }
    PhotoInfo& record = run_.LensRecord();
    const PGenericCameraModel* model = record.GetCameraModel();
    if (model != nullptr && (model->focalX <= kEps || model->focalY <= kEps)) {
      std::unique_ptr<PGenericCameraModel> fixed = model->Clone();
      fixed->focalX = fixed->focalY = photo->FocalFromMetadata();
      record.SetCameraModel(std::move(fixed));
      model = record.GetCameraModel();
    }
    // A model still without a focal length would put the sphere models'
    // focal length at 0, so it is no match either.
    matched =
        PLensProfiles::IsUsable(record) && model->HasFocalLength() && run_.LensCropRatio() > 0.001f;
    if (!matched && code == 0) code = kNoMatch;
  }
  lastError_ = code;
  if (warn) Report(code);
  return matched;
}

std::int32_t PLensMatcher::QueryCandidates(const Tarsa::HostBufferSuite& basic,
                                           const Tarsa::HostLensProfilesSuite& suite,
                                           const PhotoInfo& photo) {
  candidates_.clear();
  const float crop = photo.GetCropFactor();

  Tarsa::HostLensQuery query = {};
  query.make = HostString(basic, photo.GetMake());
  query.lens = HostString(basic, photo.GetLens());
  query.model = HostString(basic, photo.GetModel());
  query.cropFactor = crop;
  query.constant36 = 1;
  query.constant40 = 1;
  query.constant44 = 0;
  if (query.make == nullptr || query.lens == nullptr || query.model == nullptr) {
    ReleaseQuery(basic, query);
    return kOutOfMemory;
  }
  suite.query(&query);

  std::int32_t code = 0;
  try {
    std::set<PLensRepresent, decltype(&PLensRepresent::IdentityLess)> unique(
        &PLensRepresent::IdentityLess);
    if (query.results != nullptr) {
      for (std::uint32_t i = 0; i < query.resultCount; ++i) {
        if (query.results[i] != nullptr) unique.insert(Candidate(*query.results[i]));
      }
    }
    for (const PLensRepresent& candidate : unique) {
      candidates_.push_back(std::make_unique<PLensRepresent>(candidate));
    }
    // For the ranking an unknown crop factor counts as 100, which puts every
    // profile's sensor at least as large as the photo's.
    PLensRepresent reference;
    reference.make = photo.GetMake();
    reference.model = photo.GetModel();
    reference.lens = photo.GetLens();
    reference.cropFactor = crop < 0.001f ? 100.0f : crop;
    std::stable_sort(candidates_.begin(), candidates_.end(),
                     [&reference](const std::unique_ptr<PLensRepresent>& a,
                                  const std::unique_ptr<PLensRepresent>& b) {
                       return PLensRepresent::RankLess(*a, *b, reference);
                     });
  } catch (const std::bad_alloc&) {
    candidates_.clear();
    code = kOutOfMemory;
  }
  ReleaseQuery(basic, query);
  return code;
}

PLensRepresent PLensMatcher::Candidate(const Tarsa::HostLensResult& result) {
  PLensRepresent candidate;
  if (result.pathIsWide == 0 || !WidePath(result.widePath, candidate.path)) {
    candidate.path = CopyOf(result.path);
  }
  candidate.make = CopyOf(result.make);
  candidate.model = CopyOf(result.model);
  candidate.lens = CopyOf(result.lens);
  candidate.modelDisplay = CopyOf(result.modelDisplay);
  candidate.lensDisplay = CopyOf(result.lensDisplay);
  candidate.flagA = result.flagA != 0;
  candidate.flagB = result.flagB != 0;
  candidate.cropFactor = result.cropFactor;
  return candidate;
}

void PLensMatcher::ReleaseQuery(const Tarsa::HostBufferSuite& basic, Tarsa::HostLensQuery& query) {
  if (query.results != nullptr) {
    for (std::uint32_t i = 0; i < query.resultCount; ++i) {
      Tarsa::HostLensResult* result = query.results[i];
      if (result == nullptr) continue;
      Free(basic, result->widePath);
      Free(basic, result->path);
      Free(basic, result->make);
      Free(basic, result->model);
      Free(basic, result->modelDisplay);
      Free(basic, result->lens);
      Free(basic, result->lensDisplay);
      Free(basic, result);
    }
    Free(basic, query.results);
  }
  Free(basic, query.make);
  Free(basic, query.reserved4);
  Free(basic, query.lens);
  Free(basic, query.reserved12);
  Free(basic, query.reserved16);
  Free(basic, query.model);
  query = {};
}

bool PLensMatcher::LoadProfile(const PLensRepresent& candidate) {
  PhotoInfo& record = run_.LensRecord();
  try {
    profiles_.Clear();
    run_.LensKey().clear();
    if (candidate.path.empty()) {
      record = PhotoInfo();
      return false;
    }
    std::string data;
    if (ReadWhole(candidate.path, data) && profiles_.ParseFile(data.data(), data.size(), false)) {
      const PhotoInfo none;
      const PhotoInfo* photo = run_.LensPhoto();
      const PhotoInfo* best = profiles_.BestProfile(photo != nullptr ? *photo : none);
      if (best != nullptr) {
        record = *best;
        return true;
      }
    }
    record = PhotoInfo();
    profiles_.Clear();
    return true;
  } catch (const std::bad_alloc&) {
    profiles_.Clear();
    record = PhotoInfo();
    lastError_ = kOutOfMemory;
    return false;
  }
}

void PLensMatcher::Report(std::int32_t code) {
  if (code != 0) lastError_ = code;
  if (lastError_ != 0) {
    Tarsa::CReporter::ShowAlert(Tarsa::CReporter::AlertTitle(), TextOf(lastError_));
  }
  lastError_ = 0;
}

float PLensMatcher::CropRatio(const PhotoInfo& record, const PhotoInfo& photo) {
  if (record.GetMake() == photo.GetMake() && record.GetModel() == photo.GetModel() &&
      record.GetLens() == photo.GetLens()) {
    return 1.0f;
  }
  const float c1 = photo.GetCropFactor();
  const float c2 = record.GetSensorFormatFactor();
  if (std::fabs(c1 - c2) <= 0.01f) return 1.0f;
  if (c1 > 0 && c2 > 0) return c1 / c2;
  return 0.0f;
}

}  // namespace Project
