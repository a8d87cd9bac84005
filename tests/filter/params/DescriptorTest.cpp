#include "filter/params/Descriptor.h"

#include <gtest/gtest.h>

#include <cstring>
#include <limits>
#include <memory>
#include <vector>

namespace Project {
namespace {

namespace Key = DescriptorKey;
namespace Value = DescriptorValue;
using Tarsa::HostDescriptor;
using Tarsa::HostHandle;
using Tarsa::HostStatus;

constexpr std::int32_t kWidth = 3600;
constexpr HostStatus kFailed = -1;

// A stand-in for the host's descriptor service over a vector of entries. A
// handle and a descriptor are both a FakeDescriptor; one made from a handle
// remembers it, so that the test can count the readers freed. Leaks of
// descriptors made for writing show in the sanitizer build.
struct Entry {
  std::uint32_t key;
  char type;  // 'i' integer, 'f' float, 'e' enumerated, 'd' data
  double number = 0;
  std::uint32_t enumType = 0;
  std::vector<std::uint8_t> data = {};
};

struct FakeDescriptor {
  std::vector<Entry> entries;
  std::uint32_t failingKey = 0;  // every call on this key fails
  bool failFromHandle = false;
  bool failCount = false;
  FakeDescriptor* madeFrom = nullptr;
  int readersFreed = 0;
};

FakeDescriptor* Of(HostDescriptor d) { return reinterpret_cast<FakeDescriptor*>(d); }
HostHandle HandleOf(FakeDescriptor& d) { return reinterpret_cast<HostHandle>(&d); }

HostStatus Put(HostDescriptor d, Entry entry) {
  if (entry.key == Of(d)->failingKey) return kFailed;
  Of(d)->entries.push_back(std::move(entry));
  return 0;
}

const Entry* Find(HostDescriptor d, std::uint32_t key, char type) {
  if (key == Of(d)->failingKey) return nullptr;
  for (const Entry& e : Of(d)->entries) {
    if (e.key == key) return e.type == type ? &e : nullptr;
  }
  return nullptr;
}

Tarsa::HostDescriptorSuite FakeSuite() {
  Tarsa::HostDescriptorSuite s{};
  s.make = [](HostDescriptor* d) -> HostStatus {
    *d = reinterpret_cast<HostDescriptor>(new FakeDescriptor);
    return 0;
  };
  s.free = [](HostDescriptor d) -> HostStatus {
    if (Of(d)->madeFrom != nullptr) ++Of(d)->madeFrom->readersFreed;
    delete Of(d);
    return 0;
  };
  s.keyAt = [](HostDescriptor d, std::uint32_t i, std::uint32_t* key) -> HostStatus {
    if (i >= Of(d)->entries.size()) return kFailed;
    *key = Of(d)->entries[i].key;
    return 0;
  };
  s.count = [](HostDescriptor d, std::uint32_t* n) -> HostStatus {
    *n = static_cast<std::uint32_t>(Of(d)->entries.size());
    return Of(d)->failCount ? kFailed : 0;
  };
  s.putInteger = [](HostDescriptor d, std::uint32_t k, std::int32_t v) {
    return Put(d, {k, 'i', double(v)});
  };
  s.putFloat = [](HostDescriptor d, std::uint32_t k, double v) { return Put(d, {k, 'f', v}); };
  s.putEnumerated = [](HostDescriptor d, std::uint32_t k, std::uint32_t t, std::uint32_t v) {
    return Put(d, {k, 'e', double(v), t});
  };
  s.putData = [](HostDescriptor d, std::uint32_t k, std::int32_t n, const void* p) {
    const auto* b = static_cast<const std::uint8_t*>(p);
    return Put(d, {k, 'd', 0, 0, std::vector<std::uint8_t>(b, b + n)});
  };
  s.getInteger = [](HostDescriptor d, std::uint32_t k, std::int32_t* v) -> HostStatus {
    const Entry* e = Find(d, k, 'i');
    return e ? (*v = std::int32_t(e->number), 0) : kFailed;
  };
  s.getFloat = [](HostDescriptor d, std::uint32_t k, double* v) -> HostStatus {
    const Entry* e = Find(d, k, 'f');
    return e ? (*v = e->number, 0) : kFailed;
  };
  s.getEnumerated = [](HostDescriptor d, std::uint32_t k, std::uint32_t* t,
                       std::uint32_t* v) -> HostStatus {
    const Entry* e = Find(d, k, 'e');
    return e ? (*t = e->enumType, *v = std::uint32_t(e->number), 0) : kFailed;
  };
  s.getDataLength = [](HostDescriptor d, std::uint32_t k, std::int32_t* n) -> HostStatus {
    const Entry* e = Find(d, k, 'd');
    return e ? (*n = std::int32_t(e->data.size()), 0) : kFailed;
  };
  s.getData = [](HostDescriptor d, std::uint32_t k, void* out) -> HostStatus {
    const Entry* e = Find(d, k, 'd');
    if (e == nullptr) return kFailed;
    std::memcpy(out, e->data.data(), e->data.size());
    return 0;
  };
  s.asHandle = [](HostDescriptor d, HostHandle* h) -> HostStatus {
    *h = reinterpret_cast<HostHandle>(new FakeDescriptor{Of(d)->entries});
    return 0;
  };
  s.fromHandle = [](HostHandle h, HostDescriptor* d) -> HostStatus {
    auto* record = reinterpret_cast<FakeDescriptor*>(h);
    if (record->failFromHandle) return kFailed;
    *d = reinterpret_cast<HostDescriptor>(
        new FakeDescriptor{record->entries, record->failingKey, false, record->failCount, record});
    return 0;
  };
  return s;
}

const Tarsa::HostDescriptorSuite kSuite = FakeSuite();

Entry Enum(std::uint32_t key, std::uint32_t value) { return {key, 'e', double(value), key}; }

// Writes source and takes over the handle, as the host would.
std::unique_ptr<FakeDescriptor> Write(const PSettings& source, std::vector<std::uint8_t> blob) {
  return std::unique_ptr<FakeDescriptor>(
      reinterpret_cast<FakeDescriptor*>(WriteDescriptor(&kSuite, source, blob)));
}

TEST(Descriptor, ReadsEveryKeyAndIgnoresOthers) {
  FakeDescriptor stored{{
      {Key::kActionVersion, 'i', 7},
      {Tarsa::FourCharCode("zzzz"), 'f', 1.0},
      Enum(Key::kProjectionModel, Value::kPerspective),
      Enum(Key::kRegularizerModel, Value::kPanini),
      {Key::kFocalLength, 'f', 1234.56789012345},
      {Key::kPhysicalFocal, 'f', 17.5},
      {Key::kCropFactor, 'f', 1.6},
      {Key::kImageScale, 'i', 80},
      {Key::kImageCenterX, 'f', 0.4},
      {Key::kImageCenterY, 'f', 1e300},
      {Key::kConstraintData, 'd', 0, 0, {1, 2, 3}},
  }};
  PSettings s(kWidth);
  std::vector<std::uint8_t> blob = {9, 9};
  EXPECT_TRUE(ReadDescriptor(&kSuite, HandleOf(stored), s, blob));
  EXPECT_EQ(s.projectionModel, PSettings::kModelPerspective);
  EXPECT_EQ(s.regularizerModel, PSettings::kRegularizerPanini);
  EXPECT_EQ(s.focalLength, static_cast<float>(1234.56789012345));
  EXPECT_EQ(s.physicalFocal, 17.5f);
  EXPECT_EQ(s.cropFactor, static_cast<float>(1.6));
  EXPECT_EQ(s.imageScale, 80);
  EXPECT_EQ(s.imageCenterX, static_cast<float>(0.4));
  EXPECT_EQ(s.imageCenterY, std::numeric_limits<float>::infinity());
  EXPECT_EQ(blob, (std::vector<std::uint8_t>{1, 2, 3}));
  EXPECT_EQ(stored.readersFreed, 1);
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
    FakeDescriptor stored{{Enum(c.key, c.value)}};
    PSettings s(kWidth);
    s.projectionModel = s.regularizerModel = 0;
    std::vector<std::uint8_t> blob;
    ASSERT_TRUE(ReadDescriptor(&kSuite, HandleOf(stored), s, blob));
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
  const auto written = Write(s, {5, 6});
  ASSERT_NE(written, nullptr);
  std::vector<std::uint32_t> keys;
  for (const Entry& e : written->entries) keys.push_back(e.key);
  EXPECT_EQ(keys, (std::vector<std::uint32_t>{
                      Key::kActionVersion, Key::kConstraintData, Key::kProjectionModel,
                      Key::kRegularizerModel, Key::kFocalLength, Key::kPhysicalFocal,
                      Key::kCropFactor, Key::kImageScale, Key::kImageCenterX, Key::kImageCenterY}));
  const auto& e = written->entries;
  EXPECT_EQ(e[0].number, 0);
  EXPECT_EQ(e[1].data, (std::vector<std::uint8_t>{5, 6}));
  EXPECT_EQ(e[2].enumType, Key::kProjectionModel);
  EXPECT_EQ(e[2].number, Value::kAutoProjection);
  EXPECT_EQ(e[3].number, Value::kMercator);
  EXPECT_EQ(e[4].number, 1000.25);
  EXPECT_EQ(e[7].type, 'i');
  EXPECT_EQ(e[7].number, 150);

  // No constraints, no key; unknown models go out as Auto.
  s.projectionModel = 0;
  s.regularizerModel = 9;
  const auto bare = Write(s, {});
  ASSERT_EQ(bare->entries.size(), 9u);
  EXPECT_EQ(bare->entries[1].number, Value::kAutoProjection);
  EXPECT_EQ(bare->entries[2].number, Value::kAutoRegularizer);
  s.projectionModel = PSettings::kModelFisheye;  // what a Panorama action replays as
  EXPECT_EQ(Write(s, {})->entries[1].number, Value::kFisheye);
}

TEST(Descriptor, FailedCallsGiveFalseAndStillFreeTheReader) {
  FakeDescriptor stored{{
      {Key::kFocalLength, 'f', 50.0},
      {Key::kCropFactor, 'i', 2},  // stored with the wrong type
      {Key::kConstraintData, 'd', 0, 0, {1}},
      {Key::kImageScale, 'i', 70},
  }};
  PSettings s(kWidth);
  std::vector<std::uint8_t> blob;
  EXPECT_FALSE(ReadDescriptor(&kSuite, HandleOf(stored), s, blob));
  EXPECT_EQ(s.focalLength, 50.0f);  // what could be read still stands
  EXPECT_EQ(s.cropFactor, 1.0f);
  EXPECT_EQ(s.imageScale, 70);
  stored.failingKey = Key::kConstraintData;
  EXPECT_FALSE(ReadDescriptor(&kSuite, HandleOf(stored), s, blob));
  EXPECT_TRUE(blob.empty());
  stored.failCount = true;
  EXPECT_FALSE(ReadDescriptor(&kSuite, HandleOf(stored), s, blob));
  EXPECT_EQ(stored.readersFreed, 3);

  stored.failFromHandle = true;
  EXPECT_FALSE(ReadDescriptor(&kSuite, HandleOf(stored), s, blob));
  EXPECT_FALSE(ReadDescriptor(&kSuite, nullptr, s, blob));
  EXPECT_FALSE(ReadDescriptor(nullptr, HandleOf(stored), s, blob));
  const Tarsa::HostDescriptorSuite empty{};  // a host table with no entries
  EXPECT_FALSE(ReadDescriptor(&empty, HandleOf(stored), s, blob));
  EXPECT_EQ(WriteDescriptor(&empty, s, {}), nullptr);
  Tarsa::HostDescriptorSuite failingMake = kSuite;
  failingMake.make = [](HostDescriptor*) -> HostStatus { return kFailed; };
  EXPECT_EQ(WriteDescriptor(&failingMake, s, {}), nullptr);
}

}  // namespace
}  // namespace Project
