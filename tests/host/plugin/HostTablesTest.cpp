#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "host/plugin/HostCodes.h"
#include "host/plugin/HostProperties.h"
#include "host/plugin/MemoryHandles.h"
#include "host/plugin/SuiteAccess.h"

namespace Host {
namespace {

using Tarsa::FourCC;

TEST(MemoryHandlesTest, HandlesResizeKeepTheirBytesAndDoNotGrowWhileLocked) {
  const Tarsa::HostHandleProcs* procs = MemoryHandles::Procs();
  ASSERT_EQ(procs->header.count, 8);
  Tarsa::HostHandle handle = procs->newHandle(10);
  ASSERT_NE(handle, nullptr);
  EXPECT_EQ(procs->getSize(handle), 10);
  char* bytes = procs->lock(handle, 0);
  std::memcpy(bytes, "0123456789", 10);
  EXPECT_EQ(procs->setSize(handle, 20), HostCodes::kMemFullErr);
  EXPECT_EQ(procs->setSize(handle, 4), 0);
  EXPECT_EQ(procs->lock(handle, 0), bytes);  // shrinking does not move them
  procs->unlock(handle);
  procs->unlock(handle);
  ASSERT_EQ(procs->setSize(handle, 100000), 0);
  EXPECT_EQ(procs->getSize(handle), 100000);
  EXPECT_EQ(std::string(procs->lock(handle, 0), 4), "0123");
  procs->unlock(handle);
  procs->disposeRegularHandle(handle);

  EXPECT_EQ(procs->newHandle(-1), nullptr);
  EXPECT_EQ(procs->getSize(nullptr), 0);
  EXPECT_EQ(procs->setSize(nullptr, 1), HostCodes::kNilHandleErr);
  EXPECT_EQ(procs->lock(nullptr, 0), nullptr);
}

// The simple values are read by the module's tests through this host, and
// the program's tests set the version and the graphics processor.
TEST(HostPropertiesTest, AnswersComplexPropertiesInNewHandles) {
  HostProperties::Settings settings;
  settings.title =
      "Fa\xc3\xa7"
      "ade \xf0\x9f\x93\xb7.tif";  // ç and a surrogate pair
  settings.scratchVolumes = {"/tmp", "/scratch"};
  HostProperties properties(settings);
  const uint32_t host = Tarsa::kHostSignature;
  intptr_t value = 0;
  EXPECT_EQ(properties.Get(host, FourCC("xmpd"), 0, &value, nullptr), HostCodes::kNotAvailable);
  EXPECT_EQ(properties.Get(FourCC("ELSE"), FourCC("vers"), 0, &value, nullptr),
            HostCodes::kNotAvailable);

  Tarsa::HostHandle title = nullptr;
  ASSERT_EQ(properties.Get(host, FourCC("unnm"), 0, nullptr, &title), 0);
  const std::u16string expected = u"Fa\u00e7ade \U0001F4F7.tif";
  const auto bytes = MemoryHandles::Bytes(title);
  ASSERT_EQ(bytes.size(), expected.size() * 2);
  EXPECT_EQ(std::memcmp(bytes.data(), expected.data(), bytes.size()), 0);
  MemoryHandles::Dispose(title);

  Tarsa::HostHandle volumes = nullptr;
  ASSERT_EQ(properties.Get(host, FourCC("svls"), 0, nullptr, &volumes), 0);
  const auto list = MemoryHandles::Bytes(volumes);
  EXPECT_EQ(std::string(list.begin(), list.end()), std::string("/tmp\0/scratch\0", 14));
  MemoryHandles::Dispose(volumes);

  EXPECT_FALSE(properties.WatchSuspended());
  EXPECT_EQ(properties.Set(host, FourCC("wtch"), 0, 1, nullptr), 0);
  EXPECT_TRUE(properties.WatchSuspended());
}

TEST(HostPropertiesTest, MalformedUtf8BecomesReplacementCharacters) {
  EXPECT_EQ(HostProperties::Utf16("a\xff"
                                  "b\xc3"),
            u"a\ufffdb\ufffd");
  EXPECT_EQ(HostProperties::Utf16("\xc0\xaf"), u"\ufffd\ufffd");  // overlong '/'
}

TEST(SuiteAccessTest, ServesSuitesByNameAndVersion) {
  const Tarsa::HostSuiteAccess* access = SuiteAccess::Table();
  const void* suite = nullptr;
  EXPECT_EQ(access->acquire(Tarsa::kDescriptorSuite, 5, &suite), 0);
  EXPECT_NE(suite, nullptr);
  EXPECT_NE(access->acquire(Tarsa::kDescriptorSuite, 4, &suite), 0);
  EXPECT_EQ(suite, nullptr);
  EXPECT_NE(access->acquire("No Such Suite", 1, &suite), 0);
  for (int version = 1; version <= 4; ++version) {
    EXPECT_EQ(access->acquire(Tarsa::kUIHooksSuite, version, &suite), 0) << version;
  }
  ASSERT_EQ(access->acquire(Tarsa::kZStringSuite, 1, &suite), 0);
  char text[16];
  int32_t length = -1;
  EXPECT_NE(static_cast<const Tarsa::HostStringSuite*>(suite)->lookup("$$$/a/b=c", text,
                                                                      sizeof text, &length),
            0);
}

}  // namespace
}  // namespace Host
