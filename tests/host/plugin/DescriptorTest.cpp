#include <gtest/gtest.h>

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

TEST(DescriptorTest, SuiteRoundTripThroughHandleKeepsValuesAndKeyOrder) {
  const Tarsa::HostDescriptorSuite* suite = DescriptorSuite::Table();
  std::vector<uint8_t> blob(301);
  for (size_t i = 0; i < blob.size(); ++i) blob[i] = static_cast<uint8_t>(i * 7);

  Tarsa::HostDescriptor made = nullptr;
  ASSERT_EQ(suite->make(&made), 0);
  ASSERT_EQ(suite->putInteger(made, FourCC("zeta"), -7), 0);
  ASSERT_EQ(suite->putFloat(made, FourCC("alph"), 0.1), 0);
  ASSERT_EQ(suite->putEnumerated(made, FourCC("mid "), FourCC("prjM"), FourCC("fisP")), 0);
  ASSERT_EQ(suite->putData(made, FourCC("blob"), static_cast<int32_t>(blob.size()), blob.data()),
            0);
  ASSERT_EQ(suite->putData(made, FourCC("none"), 0, nullptr), 0);
  // Putting a key again replaces its value where it stands.
  ASSERT_EQ(suite->putFloat(made, FourCC("alph"), -2.5e-300), 0);
  Tarsa::HostHandle handle = nullptr;
  ASSERT_EQ(suite->asHandle(made, &handle), 0);
  suite->free(made);

  Tarsa::HostDescriptor read = nullptr;
  ASSERT_EQ(suite->fromHandle(handle, &read), 0);
  MemoryHandles::Dispose(handle);
  uint32_t count = 0;
  ASSERT_EQ(suite->count(read, &count), 0);
  EXPECT_EQ(count, 5u);
  const uint32_t order[] = {FourCC("zeta"), FourCC("alph"), FourCC("mid "), FourCC("blob"),
                            FourCC("none")};
  for (uint32_t i = 0; i < 5; ++i) {
    uint32_t key = 0;
    ASSERT_EQ(suite->keyAt(read, i, &key), 0);
    EXPECT_EQ(key, order[i]) << i;
  }
  uint32_t key = 0;
  EXPECT_NE(suite->keyAt(read, 5, &key), 0);

  int32_t integer = 0;
  double number = 0;
  uint32_t type = 0, value = 0;
  int32_t length = -1;
  EXPECT_EQ(suite->getInteger(read, FourCC("zeta"), &integer), 0);
  EXPECT_EQ(integer, -7);
  EXPECT_EQ(suite->getFloat(read, FourCC("alph"), &number), 0);
  EXPECT_EQ(number, -2.5e-300);
  EXPECT_EQ(suite->getEnumerated(read, FourCC("mid "), &type, &value), 0);
  EXPECT_EQ(type, FourCC("prjM"));
  EXPECT_EQ(value, FourCC("fisP"));
  EXPECT_EQ(suite->getDataLength(read, FourCC("blob"), &length), 0);
  ASSERT_EQ(length, 301);
  std::vector<uint8_t> bytes(301);
  EXPECT_EQ(suite->getData(read, FourCC("blob"), bytes.data()), 0);
  EXPECT_EQ(bytes, blob);
  EXPECT_EQ(suite->getDataLength(read, FourCC("none"), &length), 0);
  EXPECT_EQ(length, 0);

  EXPECT_EQ(suite->getInteger(read, FourCC("alph"), &integer), HostCodes::kWrongType);
  EXPECT_EQ(suite->getFloat(read, FourCC("gone"), &number), HostCodes::kNoSuchKey);
  suite->free(read);
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

}  // namespace
}  // namespace Host
