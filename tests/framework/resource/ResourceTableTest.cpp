#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "framework/resource/CResourceTable.h"
#include "framework/resource/CResourceWriter.h"
#include "framework/resource/FourCharCode.h"
#include "tests/framework/resource/HandBytes.h"

namespace Tarsa {
namespace {

using Bytes = std::vector<std::uint8_t>;
using testing::Join;

constexpr std::uint32_t kAbcd = FourCharCode("ABCD");
constexpr std::uint32_t kWxyz = FourCharCode("WXYZ");

Bytes View(std::span<const std::uint8_t> data) { return {data.begin(), data.end()}; }

TEST(ResourceTable, WriterLaysOutTheDocumentedFormat) {
  CResourceWriter writer;
  writer.Add(kAbcd, 7, Bytes{1, 2, 3});
  writer.Add(kAbcd, "Nm", Bytes{});
  // Header, then one entry per line.
  // clang-format off
  const auto expected = Join({
      "TRES", {1, 0, 0, 0}, {2, 0, 0, 0}, {0x40, 0, 0, 0},
      "DCBA", {7, 0, 0, 0}, {0, 0, 0, 0}, {3, 0, 0, 0}, {1, 2, 3, 0, 0, 0, 0, 0},
      "DCBA", {0, 0, 0, 0}, {2, 0, 0, 0}, {0, 0, 0, 0}, "Nm", {0, 0, 0, 0, 0, 0},
  });
  // clang-format on
  EXPECT_EQ(writer.Write(), expected);
}

TEST(ResourceTable, RoundTripAndLookups) {
  std::mt19937 rng(7411);
  CResourceWriter writer;
  std::vector<Bytes> numbered;
  for (int i = 0; i < 20; ++i) {
    Bytes data(rng() % 40);
    for (auto& b : data) b = static_cast<std::uint8_t>(rng());
    writer.Add(i % 2 ? kAbcd : kWxyz, i - 5, data);
    numbered.push_back(data);
  }
  writer.Add(kAbcd, "PDialog.zil", Bytes{'z'});
  writer.Add(kWxyz, "PDialog.zil", Bytes{'w'});
  auto table = CResourceTable::Adopt(writer.Write());

  ASSERT_EQ(table.Count(), 22u);
  for (int i = 0; i < 20; ++i) {
    const auto* entry = table.Find(i % 2 ? kAbcd : kWxyz, i - 5);
    ASSERT_NE(entry, nullptr) << i;
    EXPECT_EQ(View(entry->data), numbered[i]) << i;
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(entry->data.data()) % 8, 0u);  // vector: 16-aligned
  }
  // Names go without regard to case, and per type; numbers do not find names.
  EXPECT_EQ(View(table.Get(kAbcd, "PDIALOG.ZIL")), Bytes{'z'});
  EXPECT_EQ(View(table.Get(kWxyz, "pdialog.zil")), Bytes{'w'});
  EXPECT_EQ(table.Find(kWxyz, 0), nullptr);   // the named entry's number field is 0
  EXPECT_EQ(table.Find(kWxyz, -4), nullptr);  // -4 went to the other type
  EXPECT_EQ(table.Find(kAbcd, ""), nullptr);
  EXPECT_EQ(table.Find(kAbcd, "PDialog.zi"), nullptr);
  EXPECT_THROW(table.Get(kAbcd, 1000), CError);
  EXPECT_THROW(table.Get(FourCharCode("none"), "PDialog.zil"), CError);

  // Enumeration keeps the order of the blob.
  std::vector<int> numbers;
  for (const auto* entry : table.EntriesOfType(kAbcd)) numbers.push_back(entry->number);
  EXPECT_EQ(numbers, (std::vector<int>{-4, -2, 0, 2, 4, 6, 8, 10, 12, 14, 0}));
  EXPECT_EQ(table.EntriesOfType(kAbcd).back()->name, "PDialog.zil");

  // Entries stay valid when the table moves.
  const auto* first = &table.Entries().front();
  const CResourceTable moved = std::move(table);
  EXPECT_EQ(&moved.Entries().front(), first);
  EXPECT_EQ(View(moved.Entries().front().data), numbered[0]);
}

TEST(ResourceTable, WriterRefusesAmbiguousOrBadEntries) {
  CResourceWriter writer;
  writer.Add(kAbcd, 1, Bytes{});
  writer.Add(kAbcd, "Name", Bytes{});
  EXPECT_THROW(writer.Add(kAbcd, 1, Bytes{}), CError);
  EXPECT_THROW(writer.Add(kAbcd, "NAME", Bytes{}), CError);
  EXPECT_THROW(writer.Add(kAbcd, "", Bytes{}), CError);
  EXPECT_THROW(writer.Add(kAbcd, std::string(256, 'n'), Bytes{}), CError);
  EXPECT_THROW(writer.Add(kAbcd, "tab\there", Bytes{}), CError);
  writer.Add(kWxyz, 1, Bytes{});  // same number, other type
  EXPECT_EQ(CResourceTable::Adopt(writer.Write()).Count(), 3u);
}

TEST(ResourceTable, DamagedBlobsAreRefused) {
  CResourceWriter writer;
  writer.Add(kAbcd, 1, Bytes{1, 2, 3, 4, 5});
  writer.Add(kAbcd, 2, Bytes{6});
  const Bytes blob = writer.Write();
  ASSERT_EQ(CResourceTable::Borrow(blob).Count(), 2u);
  const auto refusal = [](std::span<const std::uint8_t> bytes) -> std::string {
    try {
      CResourceTable::Borrow(bytes);
    } catch (const CError& error) {
      return error.ErrorText();
    }
    return "accepted";
  };
  // Running out anywhere is damage in the table's own words.
  const std::string damaged = "$$$/Tarsa/Resource/Error/Damaged=The resource table is damaged.";
  for (std::size_t size = 0; size < blob.size(); ++size) {
    EXPECT_EQ(refusal(std::span(blob).first(size)), damaged) << size;
  }
  // Bytes past the blob's own size are section padding.
  Bytes padded = blob;
  padded.resize(blob.size() + 16, 0);
  EXPECT_EQ(CResourceTable::Borrow(padded).Count(), 2u);

  const auto patched = [&blob](std::size_t offset, std::uint8_t value) {
    Bytes copy = blob;
    copy[offset] = value;
    return copy;
  };
  EXPECT_NE(refusal(patched(0, 'X')), "accepted");  // magic
  EXPECT_THAT(refusal(patched(4, 2)), ::testing::HasSubstr("/Error/Version="));
  EXPECT_NE(refusal(patched(8, 3)), "accepted");      // count
  EXPECT_NE(refusal(patched(12, 0x38)), "accepted");  // size short of the end
  EXPECT_EQ(refusal(patched(28, 0x30)), damaged);     // data past the end
  EXPECT_NE(refusal(patched(38, 9)), "accepted");     // padding not zero
  EXPECT_THAT(refusal(patched(44, 1)), ::testing::HasSubstr("'ABCD' 1 twice"));
  EXPECT_NE(refusal(patched(24, 1)), "accepted");  // a number and a name
}

TEST(ResourceTable, RandomDamageNeverReadsOutside) {
  CResourceWriter writer;
  writer.Add(kAbcd, 16000, Bytes(37, 0xAA));
  writer.Add(kAbcd, "Strings", Bytes{0xFF, 0xFE});
  writer.Add(kWxyz, -1, Bytes(9, 0x55));
  const Bytes blob = writer.Write();
  std::mt19937 rng(90210);
  int parsed = 0;
  for (int round = 0; round < 4000; ++round) {
    Bytes damaged = blob;
    for (int flips = 1 + static_cast<int>(rng() % 3); flips > 0; --flips) {
      damaged[rng() % damaged.size()] = static_cast<std::uint8_t>(rng() % 4 ? rng() : 0);
    }
    if (round % 8 == 0) damaged.resize(rng() % damaged.size());
    try {
      const auto table = CResourceTable::Borrow(damaged);
      for (const auto& entry : table.Entries()) {
        ASSERT_GE(entry.data.data(), damaged.data());
        ASSERT_LE(entry.data.data() + entry.data.size(), damaged.data() + damaged.size());
      }
      ++parsed;
    } catch (const CError&) {
    }
  }
  EXPECT_GT(parsed, 0);  // some damage (data bytes) leaves a readable table
}

}  // namespace
}  // namespace Tarsa
