#include "framework/strings/CStringTable.h"

#include <gtest/gtest.h>

#include "tests/framework/strings/StringTestSupport.h"

namespace Tarsa {
namespace {

using StringTableService = testing::FreshStringTable;

TEST(StringTable, HashMatchesHandComputedValues) {
  EXPECT_EQ(CStringTable::Hash(""), 0u);
  EXPECT_EQ(CStringTable::Hash("/A"), 866u);    // 47 -> (47*256 + 65) mod 1021
  EXPECT_EQ(CStringTable::Hash("/Key"), 179u);  // 47 -> 876 -> 758 -> 179
  EXPECT_EQ(CStringTable::Hash("\xFF"), 255u);  // bytes count unsigned
}

TEST(StringTable, InsertReplacesOnlyWhenAskedAndKeepsChainsApart) {
  // All three hash to 535 ("/Zz": 47 -> 891 -> 535), so they share a chain.
  ASSERT_EQ(CStringTable::Hash("/bt"), 535u);
  ASSERT_EQ(CStringTable::Hash("/fq"), 535u);
  CStringTable table;
  EXPECT_TRUE(table.Insert("/Zz", "zz", false));
  EXPECT_TRUE(table.Insert("/bt", "bt", false));
  EXPECT_TRUE(table.Insert("/fq", "fq", false));
  EXPECT_FALSE(table.Insert("/bt", "no", false));
  EXPECT_TRUE(table.Insert("/bt", "BT", true));  // in the middle of the chain
  EXPECT_EQ(table.Find("/Zz")->Str(), "zz");
  EXPECT_EQ(table.Find("/bt")->Str(), "BT");
  EXPECT_EQ(table.Find("/fq")->Str(), "fq");
  EXPECT_EQ(table.Find("/jn"), nullptr);  // same chain, never inserted
  EXPECT_EQ(table.Find("/zz"), nullptr);
  EXPECT_EQ(table.Count(), 3u);
}

TEST_F(StringTableService, IsCreatedOnDemandAndDropped) {
  EXPECT_EQ(CStringTable::Get(false), nullptr);
  CStringTable* table = CStringTable::Get(true);
  ASSERT_NE(table, nullptr);
  EXPECT_EQ(CStringTable::Get(false), table);
  table->Insert("/K", "v", false);
  CStringTable::Drop();
  EXPECT_EQ(CStringTable::Get(false), nullptr);
  EXPECT_EQ(CStringTable::Get(true)->Find("/K"), nullptr);  // a new, empty table
}

}  // namespace
}  // namespace Tarsa
