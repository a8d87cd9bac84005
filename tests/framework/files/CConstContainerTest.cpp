#include "framework/files/CConstContainer.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <span>

#include "tests/framework/files/FilesTestSupport.h"

namespace Tarsa {
namespace {

using testing::Bytes;
using testing::FailsWith;
using testing::kEndOfData;

constexpr const char* kReadOnly =
    "$$$/Tarsa/Container/Error/ReadOnly=The container cannot be written to.";

TEST(CConstContainer, ReadsStayInsideTheBorrowedBytes) {
  const Bytes bytes = {0x34, 0x12, 0xAA, 0xBB, 0xCC, 0x01, 0x02};
  CConstContainer c(bytes);
  EXPECT_EQ(c.Size(), 7u);
  c.SetSwapBytes(true);
  EXPECT_EQ(c.ReadU16(), 0x3412u);

  // A view points into the caller's bytes; nothing is copied.
  const auto view = c.ReadView(3);
  EXPECT_EQ(view.data(), bytes.data() + 2);
  EXPECT_EQ(view.size(), 3u);

  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.ReadU32(); }));
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.ReadView(3); }));
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.ReadView(std::numeric_limits<std::size_t>::max()); }));
  EXPECT_EQ(c.Position(), 5u);
  const auto rest = c.ReadView(2);
  EXPECT_EQ(Bytes(rest.begin(), rest.end()), (Bytes{0x01, 0x02}));
  EXPECT_TRUE(c.ReadView(0).empty());

  CConstContainer empty(std::span<const std::uint8_t>{});
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { empty.ReadByte(); }));
}

TEST(CConstContainer, EveryWriteIsRefusedAndChangesNothing) {
  const Bytes original = {1, 2, 3, 4};
  Bytes bytes = original;
  CConstContainer c(bytes);
  c.SetPosition(2);
  const std::uint8_t data[2] = {9, 9};
  EXPECT_TRUE(FailsWith(kReadOnly, [&] { c.Write(data, 2); }));
  EXPECT_TRUE(FailsWith(kReadOnly, [&] { c.WriteU32(7); }));
  EXPECT_TRUE(FailsWith(kReadOnly, [&] { c.WriteAt(data, 1, 0); }));
  EXPECT_TRUE(FailsWith(kReadOnly, [&] { c.SkipWrite(1); }));
  EXPECT_TRUE(FailsWith(kReadOnly, [&] { c.SetSize(8); }));
  EXPECT_TRUE(FailsWith(kReadOnly, [&] { c.SetSize(1); }));
  EXPECT_EQ(bytes, original);
  EXPECT_EQ(c.Size(), 4u);
  EXPECT_EQ(c.Position(), 2u);
  EXPECT_EQ(c.ReadByte(), 3);
}

}  // namespace
}  // namespace Tarsa
