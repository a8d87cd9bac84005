#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "framework/resource/ElfResources.h"
#include "framework/resource/ModuleResources.h"
#include "tests/support/TestSupport.h"

// The probe module's export: what ModuleResourceBytes() sees inside it.
extern "C" const std::uint8_t* ArchwayResourceProbe(std::size_t* size);

namespace Tarsa {
namespace {

using Bytes = std::vector<std::uint8_t>;
using ::testing::HasSubstr;

Bytes View(std::span<const std::uint8_t> data) { return {data.begin(), data.end()}; }

Bytes ProbeFile() {
  const std::string bytes = Tarsa::testing::ReadBytes(ARCHWAY_RESOURCE_PROBE);
  return {bytes.begin(), bytes.end()};
}

// The refusal's text for a file of these bytes (none: no file at all), or
// "" when the file was read.
std::string RefusalOf(const std::optional<Bytes>& bytes) {
  const Tarsa::testing::ScratchFolder folder;
  if (bytes) folder.Put("module.so", *bytes);
  try {
    ReadResourcesFromElf(folder.File("module.so"));
  } catch (const CError& error) {
    return error.ErrorText();
  }
  return "";
}

TEST(ModuleResources, TableHoldsTheModuleResourcesInOrder) {
  // The property list and terminology first, as the manifest lists them;
  // the icons and layouts follow.
  const auto table = ModuleResourceTable();
  ASSERT_GE(table.Count(), 3u);
  EXPECT_EQ(table.Entries()[0].type, kPropertyListType);
  EXPECT_EQ(table.Entries()[1].type, kTerminologyType);
  const auto strings = table.EntriesOfType(kStringsType);
  ASSERT_EQ(strings.size(), 1u);
  EXPECT_EQ(strings[0]->name, "SharedTarsaStrings");
  EXPECT_EQ(View(strings[0]->data), (Bytes{0xFF, 0xFE}));
  for (const auto& entry : table.Entries()) {
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(entry.data.data()) % 8, 0u);
  }
}

TEST(ModuleResources, SharedLibraryFindsItsOwnSection) {
  std::size_t size = 0;
  const std::uint8_t* probe = ArchwayResourceProbe(&size);
  const auto own = ModuleResourceBytes();
  ASSERT_NE(probe, nullptr);
  EXPECT_NE(probe, own.data());  // each module sees its own copy
  EXPECT_EQ(Bytes(probe, probe + size), View(own));
}

TEST(ModuleResources, ElfReaderGetsTheSameBytesFromTheFile) {
  const auto file = ReadResourcesFromElf(ARCHWAY_RESOURCE_PROBE);
  const auto own = ModuleResourceTable();
  ASSERT_EQ(file.Count(), own.Count());
  EXPECT_EQ(View(file.Get(kPropertyListType, kPropertyListNumber)),
            View(own.Get(kPropertyListType, kPropertyListNumber)));
  EXPECT_EQ(View(file.Get(kTerminologyType, kTerminologyNumber)),
            View(own.Get(kTerminologyType, kTerminologyNumber)));
}

TEST(ModuleResources, ElfReaderRefusesForeignAndDamagedFiles) {
  const Bytes module = ProbeFile();
  ASSERT_GT(module.size(), 4096u);
  const auto changed = [&module](std::size_t offset, std::uint8_t value) {
    Bytes copy = module;
    copy[offset] = value;
    return copy;
  };

  EXPECT_THAT(RefusalOf(std::nullopt), HasSubstr("could not be opened"));
  EXPECT_THAT(RefusalOf(Bytes{'h', 'e', 'l', 'l', 'o'}), HasSubstr("not an ELF file"));
  EXPECT_THAT(RefusalOf(Bytes{}), HasSubstr("not an ELF file"));
  EXPECT_THAT(RefusalOf(changed(4, 1)), HasSubstr("32-bit"));
  EXPECT_THAT(RefusalOf(changed(5, 2)), HasSubstr("little-endian"));
  EXPECT_THAT(RefusalOf(Bytes(module.begin(), module.begin() + 200)), HasSubstr("beyond its end"));

  // The section under another name: the file carries no table.
  Bytes renamed = module;
  const std::string name("archway_res\0", 12);
  for (auto at = renamed.begin();
       (at = std::search(at, renamed.end(), name.begin(), name.end())) != renamed.end();) {
    *(at + 10) = 'z';
  }
  EXPECT_THAT(RefusalOf(renamed), HasSubstr("no resource table"));

  // The table itself damaged inside a sound file.
  Bytes damaged = module;
  const std::string magic("TRES\x01\x00\x00\x00", 8);
  const auto table = std::search(damaged.begin(), damaged.end(), magic.begin(), magic.end());
  ASSERT_NE(table, damaged.end());
  *(table + 8) = 0x7F;  // the count
  EXPECT_THAT(RefusalOf(damaged), HasSubstr("damaged resource"));
}

TEST(ModuleResources, ElfReaderSurvivesRandomHeaderDamage) {
  const Bytes module = ProbeFile();
  // The ELF header, and the section headers at the end of the file: any
  // refusal is the framework's error, and nothing crashes.
  const std::size_t tail = module.size() - 2048;
  std::mt19937 rng(4242);
  for (int round = 0; round < 300; ++round) {
    Bytes damaged = module;
    for (int flips = 0; flips < 4; ++flips) {
      const std::size_t at = rng() % 2 ? rng() % 64 : tail + rng() % 2048;
      damaged[at] = static_cast<std::uint8_t>(rng());
    }
    RefusalOf(damaged);
  }
}

}  // namespace
}  // namespace Tarsa
