#include "params/Descriptor.h"

#include <algorithm>
#include <span>

#include <cmath>
#include <limits>
#include <new>

namespace Project {

namespace {

using Tarsa::HostDescriptor;
using Tarsa::HostDescriptorSuite;

// Floats travel as doubles; values beyond the float range saturate to an
// infinity rather than be undefined.
float Narrow(double value) {
  constexpr double kMax = std::numeric_limits<float>::max();
  if (value > kMax) return std::numeric_limits<float>::infinity();
  if (value < -kMax) return -std::numeric_limits<float>::infinity();
  return static_cast<float>(value);
}

std::int32_t ProjectionFromValue(std::uint32_t value) {
  switch (value) {
    case DescriptorValue::kPerspective:
      return PSettings::kModelPerspective;
    case DescriptorValue::kAutoProjection:
      return PSettings::kModelAuto;
    case DescriptorValue::kFullSpherical:
      return PSettings::kModelFullSpherical;
    default:
      return PSettings::kModelFisheye;  // fisP, panP and anything unknown
  }
}

std::uint32_t ProjectionToValue(std::int32_t model) {
  switch (model) {
    case PSettings::kModelFisheye:
      return DescriptorValue::kFisheye;
    case PSettings::kModelPerspective:
      return DescriptorValue::kPerspective;
    case PSettings::kModelFullSpherical:
      return DescriptorValue::kFullSpherical;
    default:
      return DescriptorValue::kAutoProjection;
  }
}

std::int32_t RegularizerFromValue(std::uint32_t value) {
  switch (value) {
    case DescriptorValue::kStereographic:
      return PSettings::kRegularizerStereographic;
    case DescriptorValue::kMercator:
      return PSettings::kRegularizerMercator;
    case DescriptorValue::kPanini:
      return PSettings::kRegularizerPanini;
    default:
      return PSettings::kRegularizerAuto;
  }
}

std::uint32_t RegularizerToValue(std::int32_t model) {
  switch (model) {
    case PSettings::kRegularizerStereographic:
      return DescriptorValue::kStereographic;
    case PSettings::kRegularizerMercator:
      return DescriptorValue::kMercator;
    case PSettings::kRegularizerPanini:
      return DescriptorValue::kPanini;
    default:
      return DescriptorValue::kAutoRegularizer;
  }
}

// Calls one suite entry; a missing entry is a failed call.
template <class Entry, class... Args>
bool Call(Entry entry, Args... args) {
  return entry != nullptr && entry(args...) == 0;
}

// Owns a descriptor made by the suite and frees it when it goes.
class OwnedDescriptor {
 public:
  explicit OwnedDescriptor(const HostDescriptorSuite& suite) : suite_(suite) {}
  ~OwnedDescriptor() {
    if (descriptor_ != nullptr && suite_.free != nullptr) suite_.free(descriptor_);
  }
  OwnedDescriptor(const OwnedDescriptor&) = delete;
  OwnedDescriptor& operator=(const OwnedDescriptor&) = delete;

  HostDescriptor* Out() { return &descriptor_; }
  HostDescriptor Get() const { return descriptor_; }

 private:
  const HostDescriptorSuite& suite_;
  HostDescriptor descriptor_ = nullptr;
};

namespace V = DescriptorValue;
constexpr std::uint32_t kKnownProjections[] = {V::kFisheye, V::kPerspective, V::kPanorama,
                                               V::kAutoProjection, V::kFullSpherical};
constexpr std::uint32_t kKnownRegularizers[] = {V::kStereographic, V::kMercator, V::kPanini,
                                                V::kAutoRegularizer};

std::span<const std::uint32_t> KnownValues(std::uint32_t key) {
  if (key == DescriptorKey::kProjectionModel) return kKnownProjections;
  if (key == DescriptorKey::kRegularizerModel) return kKnownRegularizers;
  return {};
}

// Reads the value under one key into target; false when a call failed. An
// enumerated value the reader does not know goes to unknown.
bool ReadKey(const HostDescriptorSuite& suite, HostDescriptor d, std::uint32_t key,
             PSettings& target, std::vector<std::uint8_t>& constraintData,
             std::vector<DescriptorReport::Unknown>& unknown) {
  namespace K = DescriptorKey;
  std::int32_t integer = 0;
  double real = 0;
  std::uint32_t type = 0;
  std::uint32_t value = 0;
  switch (key) {
    case K::kActionVersion:
      return Call(suite.getInteger, d, key, &integer);
    case K::kConstraintData: {
      std::int32_t length = 0;
      if (!Call(suite.getDataLength, d, key, &length)) return false;
      if (length <= 0) return true;
      std::vector<std::uint8_t> bytes;
      try {
        bytes.resize(static_cast<std::size_t>(length));
      } catch (const std::bad_alloc&) {
        return true;  // no room for the constraints: the key is skipped
      }
      if (!Call(suite.getData, d, key, static_cast<void*>(bytes.data()))) return false;
      constraintData = std::move(bytes);
      return true;
    }
    case K::kProjectionModel:
    case K::kRegularizerModel: {
      if (!Call(suite.getEnumerated, d, key, &type, &value)) return false;
      if (key == K::kProjectionModel) target.projectionModel = ProjectionFromValue(value);
      if (key == K::kRegularizerModel) target.regularizerModel = RegularizerFromValue(value);
      const auto known = KnownValues(key);
      if (std::find(known.begin(), known.end(), value) == known.end()) {
        unknown.push_back({key, value});
      }
      return true;
    }
    case K::kImageScale:
      if (!Call(suite.getInteger, d, key, &integer)) return false;
      target.imageScale = integer;
      return true;
    case K::kFocalLength:
    case K::kPhysicalFocal:
    case K::kCropFactor:
    case K::kImageCenterX:
    case K::kImageCenterY: {
      if (!Call(suite.getFloat, d, key, &real)) return false;
      const float narrowed = Narrow(real);
      if (key == K::kFocalLength) target.focalLength = narrowed;
      if (key == K::kPhysicalFocal) target.physicalFocal = narrowed;
      if (key == K::kCropFactor) target.cropFactor = narrowed;
      if (key == K::kImageCenterX) target.imageCenterX = narrowed;
      if (key == K::kImageCenterY) target.imageCenterY = narrowed;
      return true;
    }
    default:
      return true;  // not ours
  }
}

}  // namespace

bool ReadDescriptor(const HostDescriptorSuite* suite, Tarsa::HostHandle handle, PSettings& target,
                    std::vector<std::uint8_t>& constraintData, DescriptorReport* report) {
  constraintData.clear();
  DescriptorReport ignored;
  DescriptorReport& out = report != nullptr ? *report : ignored;
  out = DescriptorReport();
  if (suite == nullptr || handle == nullptr) return false;
  OwnedDescriptor reader(*suite);
  if (!Call(suite->fromHandle, handle, reader.Out())) return false;
  std::uint32_t count = 0;
  if (!Call(suite->count, reader.Get(), &count)) return false;
  bool succeeded = true;
  for (std::uint32_t i = 0; i < count; ++i) {
    std::uint32_t key = 0;
    if (!Call(suite->keyAt, reader.Get(), i, &key)) {
      succeeded = false;
      continue;
    }
    if (!ReadKey(*suite, reader.Get(), key, target, constraintData, out.unknownValues)) {
      succeeded = false;
    } else {
      out.keys.push_back(key);
    }
  }
  return succeeded;
}

std::string KnownValuesText(std::uint32_t key) {
  std::string text;
  for (const std::uint32_t value : KnownValues(key)) {
    if (!text.empty()) text += ", ";
    text += Tarsa::FourCharText(value);
  }
  return text;
}

Tarsa::HostHandle WriteDescriptor(const HostDescriptorSuite* suite, const PSettings& source,
                                  std::span<const std::uint8_t> constraintData) {
  if (suite == nullptr) return nullptr;
  OwnedDescriptor writer(*suite);
  if (!Call(suite->make, writer.Out())) return nullptr;
  const HostDescriptor d = writer.Get();
  namespace K = DescriptorKey;
  // A failed put leaves that key out; the rest of the record still helps a
  // replay, so it goes on.
  Call(suite->putInteger, d, K::kActionVersion, std::int32_t{0});
  if (!constraintData.empty() &&
      constraintData.size() <= static_cast<std::size_t>(std::numeric_limits<std::int32_t>::max())) {
    Call(suite->putData, d, K::kConstraintData, static_cast<std::int32_t>(constraintData.size()),
         static_cast<const void*>(constraintData.data()));
  }
  Call(suite->putEnumerated, d, K::kProjectionModel, K::kProjectionModel,
       ProjectionToValue(source.projectionModel));
  Call(suite->putEnumerated, d, K::kRegularizerModel, K::kRegularizerModel,
       RegularizerToValue(source.regularizerModel));
  Call(suite->putFloat, d, K::kFocalLength, static_cast<double>(source.focalLength));
  Call(suite->putFloat, d, K::kPhysicalFocal, static_cast<double>(source.physicalFocal));
  Call(suite->putFloat, d, K::kCropFactor, static_cast<double>(source.cropFactor));
  Call(suite->putInteger, d, K::kImageScale, source.imageScale);
  Call(suite->putFloat, d, K::kImageCenterX, static_cast<double>(source.imageCenterX));
  Call(suite->putFloat, d, K::kImageCenterY, static_cast<double>(source.imageCenterY));
  Tarsa::HostHandle handle = nullptr;
  if (!Call(suite->asHandle, d, &handle)) return nullptr;
  return handle;
}

}  // namespace Project
