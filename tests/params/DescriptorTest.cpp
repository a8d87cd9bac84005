// The filter's descriptor keys against the host program's descriptor suite.

#include "params/Descriptor.h"

#include <gtest/gtest.h>

#include <limits>
#include <vector>

#include "host/plugin/Descriptor.h"
#include "host/plugin/DescriptorSuite.h"
#include "host/plugin/MemoryHandles.h"

namespace Project {
namespace {

namespace Key = DescriptorKey;
namespace Value = DescriptorValue;
using Bytes = std::vector<std::uint8_t>;
using Host::MemoryHandles;
using Tarsa::HostDescriptor;
using Tarsa::HostStatus;

constexpr std::int32_t kWidth = 3600;

// The host's suite with `free` counted, so every reader can be seen freed.
int freed = 0;
const Tarsa::HostDescriptorSuite kSuite = [] {
  Tarsa::HostDescriptorSuite suite = *Host::DescriptorSuite::Table();
  suite.free = [](HostDescriptor d) {
    ++freed;
    return Host::DescriptorSuite::Table()->free(d);
  };
  return suite;
}();

// Reads descriptor through a handle, as the record's script block holds it.
bool Read(const Host::Descriptor& descriptor, PSettings& s, Bytes& blob,
          const Tarsa::HostDescriptorSuite* suite = &kSuite, DescriptorReport* report = nullptr) {
  const Tarsa::HostHandle handle = MemoryHandles::FromBytes(descriptor.ToBytes());
  const bool read = ReadDescriptor(suite, handle, s, blob, report);
  MemoryHandles::Dispose(handle);
  return read;
}

// Writes source and takes over the handle.
Host::Descriptor Write(const PSettings& source, const Bytes& blob) {
  const Tarsa::HostHandle handle = WriteDescriptor(&kSuite, source, blob);
  EXPECT_NE(handle, nullptr);
  Host::Descriptor written = Host::Descriptor::FromBytes(MemoryHandles::Bytes(handle));
  MemoryHandles::Dispose(handle);
  return written;
}

// Unknown enumerated values read as the fallbacks, and are reported so that
// a scripted run can refuse them; fusP and panP, which stored actions carry,
// are known.
TEST(Descriptor, ReportsTheKeysReadAndTheEnumeratedValuesItDoesNotKnow) {
  Host::Descriptor stored;
  stored.PutEnumerated(Key::kProjectionModel, Key::kProjectionModel, Tarsa::FourCharCode("xxxx"));
  stored.PutEnumerated(Key::kRegularizerModel, Key::kRegularizerModel, Value::kMercator);
  stored.PutFloat(Key::kFocalLength, 900.0);
  PSettings s(kWidth);
  Bytes blob;
  DescriptorReport report;
  ASSERT_TRUE(Read(stored, s, blob, &kSuite, &report));
  EXPECT_EQ(s.projectionModel, PSettings::kModelFisheye);
  EXPECT_EQ(report.keys, (std::vector<std::uint32_t>{Key::kProjectionModel, Key::kRegularizerModel,
                                                     Key::kFocalLength}));
  ASSERT_EQ(report.unknownValues.size(), 1u);
  EXPECT_EQ(report.unknownValues[0].key, Key::kProjectionModel);
  EXPECT_EQ(report.unknownValues[0].value, Tarsa::FourCharCode("xxxx"));
  EXPECT_EQ(KnownValuesText(Key::kProjectionModel), "fisP, perP, panP, autP, fusP");

  for (const std::uint32_t kept : {Value::kFullSpherical, Value::kPanorama}) {
    stored.PutEnumerated(Key::kProjectionModel, Key::kProjectionModel, kept);
    ASSERT_TRUE(Read(stored, s, blob, &kSuite, &report));
    EXPECT_TRUE(report.unknownValues.empty());
  }
}

TEST(Descriptor, ReadsEveryKeyAndIgnoresOthers) {
  Host::Descriptor stored;
  stored.PutInteger(Key::kActionVersion, 7);
  stored.PutFloat(Tarsa::FourCharCode("zzzz"), 1.0);
  stored.PutEnumerated(Key::kProjectionModel, Key::kProjectionModel, Value::kPerspective);
  stored.PutEnumerated(Key::kRegularizerModel, Key::kRegularizerModel, Value::kPanini);
  stored.PutFloat(Key::kFocalLength, 1234.56789012345);
  stored.PutFloat(Key::kPhysicalFocal, 17.5);
  stored.PutFloat(Key::kCropFactor, 1.6);
  stored.PutInteger(Key::kImageScale, 80);
  stored.PutFloat(Key::kImageCenterX, 0.4);
  stored.PutFloat(Key::kImageCenterY, 1e300);
  stored.PutData(Key::kConstraintData, Bytes{1, 2, 3});
  PSettings s(kWidth);
  Bytes blob = {9, 9};
  freed = 0;
  EXPECT_TRUE(Read(stored, s, blob));
  EXPECT_EQ(s.projectionModel, PSettings::kModelPerspective);
  EXPECT_EQ(s.regularizerModel, PSettings::kRegularizerPanini);
  EXPECT_EQ(s.focalLength, static_cast<float>(1234.56789012345));
  EXPECT_EQ(s.physicalFocal, 17.5f);
  EXPECT_EQ(s.cropFactor, static_cast<float>(1.6));
  EXPECT_EQ(s.imageScale, 80);
  EXPECT_EQ(s.imageCenterX, static_cast<float>(0.4));
  EXPECT_EQ(s.imageCenterY, std::numeric_limits<float>::infinity());
  EXPECT_EQ(blob, (Bytes{1, 2, 3}));
  EXPECT_EQ(freed, 1);
}

TEST(Descriptor, EnumerationsMapAsStored) {
  const std::uint32_t odd = Tarsa::FourCharCode("what");
  const struct {
    std::uint32_t key, value;
    std::int32_t expected;
  } cases[] = {
      {Key::kProjectionModel, Value::kFisheye, 1},
      {Key::kProjectionModel, Value::kPanorama, 1},
      {Key::kProjectionModel, Value::kAutoProjection, 3},
      {Key::kProjectionModel, Value::kFullSpherical, 4},
      {Key::kProjectionModel, odd, 1},
      {Key::kRegularizerModel, Value::kStereographic, 1},
      {Key::kRegularizerModel, Value::kMercator, 2},
      {Key::kRegularizerModel, odd, 4},
  };
  for (const auto& c : cases) {
    Host::Descriptor stored;
    stored.PutEnumerated(c.key, c.key, c.value);
    PSettings s(kWidth);
    s.projectionModel = s.regularizerModel = 0;
    Bytes blob;
    ASSERT_TRUE(Read(stored, s, blob));
    EXPECT_EQ(c.key == Key::kProjectionModel ? s.projectionModel : s.regularizerModel, c.expected)
        << Tarsa::FourCharText(c.value);
  }
}

TEST(Descriptor, WritesKeysInOrderAndModelsAsStored) {
  PSettings s(kWidth);
  s.projectionModel = PSettings::kModelAuto;
  s.regularizerModel = PSettings::kRegularizerMercator;
  s.focalLength = 1000.25f;
  s.imageScale = 150;
  const Host::Descriptor written = Write(s, {5, 6});
  std::vector<std::uint32_t> keys;
  for (const auto& item : written.Items()) keys.push_back(item.key);
  EXPECT_EQ(keys, (std::vector<std::uint32_t>{
                      Key::kActionVersion, Key::kConstraintData, Key::kProjectionModel,
                      Key::kRegularizerModel, Key::kFocalLength, Key::kPhysicalFocal,
                      Key::kCropFactor, Key::kImageScale, Key::kImageCenterX, Key::kImageCenterY}));
  EXPECT_EQ(written.Find(Key::kActionVersion)->integer, 0);
  EXPECT_EQ(written.Find(Key::kConstraintData)->data, (Bytes{5, 6}));
  EXPECT_EQ(written.Find(Key::kProjectionModel)->enumType, Key::kProjectionModel);
  EXPECT_EQ(written.Find(Key::kProjectionModel)->enumValue, Value::kAutoProjection);
  EXPECT_EQ(written.Find(Key::kRegularizerModel)->enumValue, Value::kMercator);
  EXPECT_EQ(written.Find(Key::kFocalLength)->number, 1000.25);
  EXPECT_EQ(written.Find(Key::kImageScale)->type, Host::Descriptor::Type::kInteger);
  EXPECT_EQ(written.Find(Key::kImageScale)->integer, 150);

  // No constraints, no key; unknown models go out as Auto.
  s.projectionModel = 0;
  s.regularizerModel = 9;
  const Host::Descriptor bare = Write(s, {});
  EXPECT_EQ(bare.Count(), 9u);
  EXPECT_EQ(bare.Find(Key::kConstraintData), nullptr);
  EXPECT_EQ(bare.Find(Key::kProjectionModel)->enumValue, Value::kAutoProjection);
  EXPECT_EQ(bare.Find(Key::kRegularizerModel)->enumValue, Value::kAutoRegularizer);
  s.projectionModel = PSettings::kModelFisheye;  // what a Panorama action replays as
  EXPECT_EQ(Write(s, {}).Find(Key::kProjectionModel)->enumValue, Value::kFisheye);
}

TEST(Descriptor, FailedCallsGiveFalseAndStillFreeTheReader) {
  Host::Descriptor stored;
  stored.PutFloat(Key::kFocalLength, 50.0);
  stored.PutInteger(Key::kCropFactor, 2);  // stored with the wrong type
  stored.PutData(Key::kConstraintData, Bytes{1});
  stored.PutInteger(Key::kImageScale, 70);
  PSettings s(kWidth);
  Bytes blob;
  freed = 0;
  EXPECT_FALSE(Read(stored, s, blob));
  EXPECT_EQ(s.focalLength, 50.0f);  // what could be read still stands
  EXPECT_EQ(s.cropFactor, 1.0f);
  EXPECT_EQ(s.imageScale, 70);
  EXPECT_EQ(blob, Bytes{1});
  stored.PutFloat(Key::kConstraintData, 1.0);  // replaced by the wrong type
  EXPECT_FALSE(Read(stored, s, blob));
  EXPECT_TRUE(blob.empty());
  Tarsa::HostDescriptorSuite failing = kSuite;
  failing.count = [](HostDescriptor, std::uint32_t*) -> HostStatus { return -1; };
  EXPECT_FALSE(Read(stored, s, blob, &failing));
  EXPECT_EQ(freed, 3);

  // Bytes that are no descriptor; no handle; no suite; a table of nulls.
  const Bytes junk = {1, 2, 3};
  const Tarsa::HostHandle damaged = MemoryHandles::FromBytes(junk);
  EXPECT_FALSE(ReadDescriptor(&kSuite, damaged, s, blob));
  MemoryHandles::Dispose(damaged);
  EXPECT_FALSE(ReadDescriptor(&kSuite, nullptr, s, blob));
  EXPECT_FALSE(Read(stored, s, blob, nullptr));
  const Tarsa::HostDescriptorSuite empty{};
  EXPECT_FALSE(Read(stored, s, blob, &empty));
  EXPECT_EQ(WriteDescriptor(&empty, s, {}), nullptr);
  failing.make = [](HostDescriptor*) -> HostStatus { return -1; };
  EXPECT_EQ(WriteDescriptor(&failing, s, {}), nullptr);
}

}  // namespace
}  // namespace Project
