#include <gtest/gtest.h>

#include <chrono>
#include <cstring>
#include <vector>

#include "host/io/HostError.h"
#include "host/plugin/Descriptor.h"
#include "host/plugin/DescriptorSuite.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/MemoryHandles.h"

namespace Host {
namespace {

using Tarsa::FourCC;

// The documented byte form, written out by hand for one integer item.
TEST(DescriptorTest, ByteFormIsTheDocumentedOne) {
  Descriptor descriptor;
  descriptor.PutInteger(FourCC("actV"), -2);
  const std::vector<uint8_t> expected = {
      0x63, 0x73, 0x44, 0x41,  // "ADsc" as a little-endian word
      1,    0,    0,    0,     // version
      1,    0,    0,    0,     // one item
      0x56, 0x74, 0x63, 0x61,  // 'actV'
      0x67, 0x6e, 0x6f, 0x6c,  // 'long'
      0xfe, 0xff, 0xff, 0xff,  // -2
  };
  EXPECT_EQ(descriptor.ToBytes(), expected);
}

// What the filter's descriptor tests through this suite do not reach: a key
// put again, data whose length is no multiple of four, empty data, and the
// codes of failed lookups.
TEST(DescriptorTest, SuiteRoundTripThroughAHandleKeepsValuesAndKeyOrder) {
  const Tarsa::HostDescriptorSuite* suite = DescriptorSuite::Table();
  std::vector<uint8_t> blob(301);
  for (size_t i = 0; i < blob.size(); ++i) blob[i] = static_cast<uint8_t>(i * 7);
  Tarsa::HostDescriptor made = nullptr;
  ASSERT_EQ(suite->make(&made), 0);
  ASSERT_EQ(suite->putFloat(made, FourCC("alph"), 0.1), 0);
  ASSERT_EQ(suite->putData(made, FourCC("blob"), static_cast<int32_t>(blob.size()), blob.data()),
            0);
  ASSERT_EQ(suite->putData(made, FourCC("none"), 0, nullptr), 0);
  ASSERT_EQ(suite->putFloat(made, FourCC("alph"), -2.5e-300), 0);  // replaced where it stands
  Tarsa::HostHandle handle = nullptr;
  ASSERT_EQ(suite->asHandle(made, &handle), 0);
  suite->free(made);
  Tarsa::HostDescriptor held = nullptr;
  ASSERT_EQ(suite->fromHandle(handle, &held), 0);
  MemoryHandles::Dispose(handle);
  const Descriptor& read = *DescriptorSuite::Of(held);
  ASSERT_EQ(read.Count(), 3u);
  EXPECT_EQ(read.Items()[0].key, FourCC("alph"));
  EXPECT_EQ(read.Items()[0].number, -2.5e-300);
  EXPECT_EQ(read.Find(FourCC("blob"))->data, blob);
  EXPECT_TRUE(read.Find(FourCC("none"))->data.empty());

  uint32_t key = 0;
  int32_t integer = 0;
  double number = 0;
  EXPECT_NE(suite->keyAt(held, 3, &key), 0);
  EXPECT_EQ(suite->getInteger(held, FourCC("alph"), &integer), HostCodes::kWrongType);
  EXPECT_EQ(suite->getFloat(held, FourCC("gone"), &number), HostCodes::kNoSuchKey);
  suite->free(held);
}

TEST(DescriptorTest, DamagedBytesAreRefused) {
  Descriptor descriptor;
  descriptor.PutInteger(FourCC("actV"), 0);
  descriptor.PutFloat(FourCC("focL"), 12.5);
  descriptor.PutEnumerated(FourCC("prjM"), FourCC("prjM"), FourCC("autP"));
  descriptor.PutData(FourCC("cnsD"), std::vector<uint8_t>{1, 2, 3, 4, 5});
  const std::vector<uint8_t> whole = descriptor.ToBytes();
  EXPECT_EQ(Descriptor::FromBytes(whole), descriptor);

  // Cut anywhere, the bytes are refused, never misread.
  for (size_t size = 0; size < whole.size(); ++size) {
    EXPECT_THROW(Descriptor::FromBytes(std::span(whole).first(size)), HostError) << size;
  }
  auto damaged = [&](size_t offset, uint8_t byte) {
    std::vector<uint8_t> bytes = whole;
    bytes[offset] = byte;
    return bytes;
  };
  EXPECT_THROW(Descriptor::FromBytes(damaged(0, 'x')), HostError);    // magic
  EXPECT_THROW(Descriptor::FromBytes(damaged(4, 2)), HostError);      // version
  EXPECT_THROW(Descriptor::FromBytes(damaged(11, 0x40)), HostError);  // absurd count
  EXPECT_THROW(Descriptor::FromBytes(damaged(16, 'x')), HostError);   // unknown type
  // The second key made equal to the first.
  std::vector<uint8_t> twice = whole;
  std::memcpy(&twice[24], &twice[12], 4);
  EXPECT_THROW(Descriptor::FromBytes(twice), HostError);
  std::vector<uint8_t> longer = whole;
  longer.push_back(0);
  EXPECT_THROW(Descriptor::FromBytes(longer), HostError);

  Tarsa::HostHandle handle = MemoryHandles::FromBytes(std::span(whole).first(whole.size() - 1));
  Tarsa::HostDescriptor read = nullptr;
  EXPECT_EQ(DescriptorSuite::Table()->fromHandle(handle, &read), HostCodes::kParamErr);
  EXPECT_EQ(read, nullptr);
  EXPECT_EQ(DescriptorSuite::Table()->fromHandle(nullptr, &read), HostCodes::kNilHandleErr);
  MemoryHandles::Dispose(handle);
}

// Every key is looked up as it is read; a descriptor of many keys, as a
// damaged or hostile file may hold, must still read in time proportional to
// its size (the lookups were once a walk of all keys before).
TEST(DescriptorTest, ManyKeysReadInLinearTime) {
  Descriptor descriptor;
  constexpr uint32_t kKeys = 200000;
  for (uint32_t key = 0; key < kKeys; ++key) descriptor.PutInteger(key, static_cast<int32_t>(key));
  const std::vector<uint8_t> bytes = descriptor.ToBytes();
  const auto start = std::chrono::steady_clock::now();
  const Descriptor read = Descriptor::FromBytes(bytes);
  const auto took = std::chrono::steady_clock::now() - start;
  EXPECT_EQ(read, descriptor);
  ASSERT_NE(read.Find(kKeys - 1), nullptr);
  EXPECT_EQ(read.Find(kKeys - 1)->integer, static_cast<int32_t>(kKeys - 1));
  // Linear, this is well under a second even under the sanitizers; the
  // quadratic walk took minutes.
  EXPECT_LT(took, std::chrono::seconds(10));
}

}  // namespace
}  // namespace Host
