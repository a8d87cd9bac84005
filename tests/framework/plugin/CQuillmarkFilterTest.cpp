#include "framework/plugin/CQuillmarkFilter.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "framework/memory/CHeapBlock.h"
#include "framework/memory/CMemoryService.h"
#include "framework/memory/CVirtualAllocator.h"
#include "framework/native/NativeSystem.h"
#include "framework/plugin/CQuillmarkError.h"
#include "framework/process/CReporter.h"
#include "framework/strings/CStringTable.h"
#include "tests/framework/plugin/ProbeFilter.h"
#include "tests/support/RealHost.h"

namespace Tarsa::testing {
namespace {

using Strings = std::vector<std::string>;

class FilterRecord : public PluginRunTest {
 protected:
  void SetUp() override {
    PluginRunTest::SetUp();
    ProbeFilter::Plan() = ProbeFilter::Script{};
    filter = std::make_unique<ProbeFilter>();
  }
  void TearDown() override {
    filter.reset();
    PluginRunTest::TearDown();
  }
  // A filter selector: from here on the record is the filter's.
  void Enter() { ASSERT_EQ(filter->HandleParameters(host.Record(), nullptr), 0); }

  RealHost host;
  std::unique_ptr<ProbeFilter> filter;
};

TEST_F(FilterRecord, WithoutAFilterRecordEveryAccessorAnswersEmpty) {
  host.MakeDocument(Host::ImageMode::kRgb, 30, 20, true);
  host.Properties().Override(FourCC("TSiz"), 512);
  // About hands over a record, but it is no filter record.
  ASSERT_EQ(filter->HandleAbout(host.Record(), nullptr), 0);
  EXPECT_EQ(filter->FilterRecord(), nullptr);
  EXPECT_EQ(filter->HostRecord(), host.Record());
  EXPECT_EQ(filter->ImageRect(), CRect{});
  EXPECT_EQ(filter->FilterRect(), CRect{});
  EXPECT_EQ(filter->TileOffset(), CPoint{});
  EXPECT_EQ(filter->Depth(), 0u);
  EXPECT_EQ(filter->ColorPlanes(), 0u);
  EXPECT_FALSE(filter->HasTransparency());
  EXPECT_EQ(filter->ResolutionX(), 0.0);
  EXPECT_TRUE(filter->DocumentTitle().IsEmpty());
  filter->Use32BitCoordinates(true);
  EXPECT_EQ(host.Coords().enabled, 0u);

  CMemoryPixmap pixmap(CRect{0, 0, 4, 4}, 2, 8);
  pixmap.Fill(0, pixmap.Bounds(), 9);
  filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_EQ(pixmap.Sample(0, 3, 3), 0u) << "nothing to read: zeros";
  filter->WritePixmap(pixmap, pixmap.Bounds(), 0);
  EXPECT_EQ(host.advanceCalls, 0);
  // Properties go through the about record: the host's tile size is known.
  EXPECT_EQ(filter->HostTileSize(), 512);
}

TEST_F(FilterRecord, ThirtyTwoBitBlockIsTheOnlySourceOnceEnabled) {
  host.MakeDocument(Host::ImageMode::kRgb, 40000, 3, false);
  host.Record()->imageWidth16 = host.Record()->imageHeight16 = -7;  // nonsense, never read
  host.Record()->filterRect16 = HostRect16{-7, -7, -7, -7};
  Enter();
  filter->Use32BitCoordinates(true);
  EXPECT_EQ(filter->ImageSize(), (CSize{40000, 3}));
  EXPECT_EQ(filter->FilterRect(), (CRect{0, 0, 40000, 3}));
  EXPECT_EQ(filter->ImageRect(), (CRect{0, 0, 40000, 3}));
  // Disabled, the block is ignored entirely: the 16-bit fields (nonsense
  // here) are read, never a mix of both.
  filter->Use32BitCoordinates(false);
  EXPECT_EQ(host.Coords().enabled, 0u);
  EXPECT_EQ(filter->ImageSize(), (CSize{-7, -7}));
  EXPECT_EQ(filter->FilterRect(), (CRect{-7, -7, -7, -7}));
  // An old host without the block: the switch does nothing.
  host.Record()->coordinates32 = nullptr;
  filter->Use32BitCoordinates(true);
  EXPECT_EQ(filter->ImageSize(), (CSize{-7, -7}));
}

TEST_F(FilterRecord, HostPropertiesAndTheirDefaults) {
  Enter();
  EXPECT_TRUE(filter->TooltipsOn());
  EXPECT_EQ(filter->HostTileSize(), Host::HostProperties::kTileSize);
  host.Properties().Override(FourCC("tltp"), 0);
  host.Properties().Withhold(FourCC("TSiz"));
  EXPECT_FALSE(filter->TooltipsOn());
  EXPECT_EQ(filter->HostTileSize(), 16384);

  host.Properties().Override(FourCC("UIBR"), 7);  // out of range: the default
  host.Properties().Override(FourCC("HLCR"), 2);
  host.Properties().Override(FourCC("LGTB"), 1);
  host.Properties().Override(FourCC("HDPI"), 1);
  filter->ReadDisplayProperties(host.Record());
  EXPECT_EQ(filter->UIBrightness(), 2);
  EXPECT_TRUE(filter->UIFlagHLCR());
  EXPECT_TRUE(filter->UIFlagLGTB());
  EXPECT_EQ(filter->DisplayScale(), 1);
  host.Properties().Override(FourCC("UIBR"), 0);
  host.Properties().Override(FourCC("HLCR"), 1);
  filter->ReadDisplayProperties(host.Record());
  EXPECT_EQ(filter->UIBrightness(), 0);
  EXPECT_FALSE(filter->UIFlagHLCR());

  filter->SuspendWatchCursor(true);
  EXPECT_TRUE(host.Properties().WatchSuspended());
  // A table that counts fewer entries than needed is not called.
  host.propertyProcs.header.count = 0;
  host.Properties().Override(FourCC("TSiz"), 1024);
  EXPECT_EQ(filter->HostTileSize(), 16384);
  filter->SuspendWatchCursor(false);
  EXPECT_EQ(host.propertyWrites.size(), 1u);
}

TEST_F(FilterRecord, TitleAndScratchVolumesComeFromHandlesThatAreDisposed) {
  host.settings.properties.scratchVolumes = {"/scratch/a", "/b"};
  host.MakeDocument(Host::ImageMode::kRgb, 4, 4, false);
  Enter();
  const char16_t title[] = u"\u015Ctreet.tif";  // with its trailing zero
  host.Properties().Override(FourCC("unnm"),
                             std::string(reinterpret_cast<const char*>(title), sizeof title));
  host.Properties().Override(FourCC("titl"), std::string("plain.tif\0", 10));
  EXPECT_EQ(filter->DocumentTitle().Str(), "\xC5\x9Ctreet.tif");
  host.Properties().Withhold(FourCC("unnm"));
  EXPECT_EQ(filter->DocumentTitle().Str(), "plain.tif");
  EXPECT_EQ(filter->ScratchVolumes(), (Strings{"/scratch/a", "/b"}));
  EXPECT_EQ(host.disposed, 3);
}

TEST_F(FilterRecord, HandleFailuresAreHostErrors) {
  Enter();
  auto codeOf = [](auto call) -> int {
    try {
      call();
    } catch (const CQuillmarkError& e) {
      return e.Code();
    }
    return 0;
  };
  EXPECT_EQ(codeOf([&] { filter->LockHandle(nullptr); }), -109);
  host.handleProcs.newHandle = [](std::int32_t) -> HostHandle { return nullptr; };
  EXPECT_EQ(codeOf([&] { filter->NewHandle(10); }), -108);
  host.handleProcs.newHandle = nullptr;
  EXPECT_EQ(codeOf([&] { filter->NewHandle(10); }), -50);
  EXPECT_EQ(CReporter::AlertText(CQuillmarkError(-108)).Str(), "There is not enough memory.");
  EXPECT_EQ(CReporter::AlertText(CQuillmarkError(5)).Str(), "An unknown host error has occurred.");
}

TEST_F(FilterRecord, SuitesAreAcquiredOnceAndReleasedInTableOrder) {
  using ESuite = CQuillmarkPlugin::ESuite;
  Enter();
  EXPECT_EQ(filter->Suite(ESuite::kDescriptor), Host::SuiteAccess::Find(kDescriptorSuite, 5));
  EXPECT_EQ(filter->Suite(ESuite::kBuffer), Host::SuiteAccess::Find(kBufferSuite, 1));
  EXPECT_EQ(filter->Suite(ESuite::kZString), Host::SuiteAccess::Find(kZStringSuite, 1));
  EXPECT_NE(filter->Suite(ESuite::kChannelPorts), nullptr);
  EXPECT_NE(filter->Suite(ESuite::kDescriptor), nullptr);
  EXPECT_EQ(filter->Suite(ESuite::kAux5c92), nullptr);  // a suite the host lacks
  EXPECT_EQ(filter->Suite(ESuite::kAux5c92), nullptr);
  EXPECT_EQ(host.acquired.size(), 4u) << "a success is cached, a failure is asked again";
  filter.reset();
  EXPECT_EQ(host.released,
            (Strings{std::string(kChannelPortsSuite) + "#3", std::string(kZStringSuite) + "#1",
                     std::string(kBufferSuite) + "#1", std::string(kDescriptorSuite) + "#5"}));
}

// String suites that answer the keys holding one of their words: the first
// knows "/First", the second also "/Second" (with a text longer than the
// first buffer), the third every key.
struct Known {
  std::vector<const char*> words;
  std::string text;
};
const Known kKnown[] = {{{"/First"}, "from ZString"},
                        {{"/First", "/Second"}, std::string(300, 'u')},
                        {{"/"}, "from SwiftView"}};
template <int kSuite>
HostStatus Lookup(const char* keyed, char* buffer, std::int32_t size, std::int32_t* length) {
  for (const char* word : kKnown[kSuite].words) {
    if (std::strstr(keyed, word) == nullptr) continue;
    *length = std::int32_t(kKnown[kSuite].text.size());
    if (*length < size) std::memcpy(buffer, kKnown[kSuite].text.c_str(), std::size_t(*length) + 1);
    return 0;
  }
  return -1;
}

TEST_F(FilterRecord, KeyedStringsAskTheHostSuitesInTurn) {
  const HostStringSuite zstring{&Lookup<0>}, utilities{&Lookup<1>}, swiftView{&Lookup<2>};
  host.AddSuite(kZStringSuite, 1, &zstring);
  host.AddSuite(kUtilitiesSuite, 1, &utilities);
  host.AddSuite(kSwiftViewSuite, 3, &swiftView);
  Enter();
  CStringTable::Drop();
  EXPECT_EQ(ResolveText("$$$/Test/Plugin/First=default").Str(), "from ZString");
  EXPECT_EQ(ResolveText("$$$/Test/Plugin/Second=default").Str(), std::string(300, 'u'));
  EXPECT_EQ(ResolveText("$$$/Test/Plugin/Third=default").Str(), "from SwiftView");
  CStringTable::Drop();
}

// A buffer suite that lends heap blocks and counts them.
struct CountingBuffers {
  static int& Live() {
    static int live = 0;
    return live;
  }
  static void* Allocate(std::uint32_t size, std::uint32_t* actual) {
    ++Live();
    *actual = size;
    return std::malloc(size);
  }
  static void Release(void** block) {
    --Live();
    std::free(*block);
    *block = nullptr;
  }
};

TEST_F(FilterRecord, MemoryServiceTakesTheClampedShareAndTheHostsBuffers) {
  const HostBufferSuite buffers{&CountingBuffers::Allocate, &CountingBuffers::Release};
  host.AddSuite(kBufferSuite, 1, &buffers);
  host.Properties().Override(FourCC("svls"), std::string("/scratch\0", 9));
  host.Record()->bufferShare = 0x1000;  // below the floor of 32 MiB
  Enter();
  filter->InitMemory();
  CMemoryService* service = CMemoryService::Get(false);
  ASSERT_NE(service, nullptr);
  EXPECT_EQ(service->MemoryLimit(), 0x2000000u);
  EXPECT_TRUE(service->HasSwap());
  EXPECT_EQ(service->ScratchVolumes(), Strings{"/scratch"});
  ASSERT_NE(CVirtualAllocator::Current(), nullptr);
  {
    CHeapBlock block(2);
    EXPECT_TRUE(block.FromAllocator());
    EXPECT_EQ(block.Size(), 1024u);
    EXPECT_EQ(CountingBuffers::Live(), 1);
  }
  EXPECT_EQ(CountingBuffers::Live(), 0);

  // Once per object: a second call changes nothing.
  host.Record()->bufferShare = 0x7FFFFFFF;
  filter->InitMemory();
  EXPECT_EQ(service->MemoryLimit(), 0x2000000u);

  // A fresh object without the buffer suite, and a share above the ceiling:
  // the heap serves, and the limit is the smaller clamped value.
  filter.reset();
  CPluginEntry::TearDown();
  filter = std::make_unique<ProbeFilter>();
  filter->SetUseBufferSuite(false);
  Enter();
  filter->InitMemory();
  EXPECT_EQ(CVirtualAllocator::Current(), nullptr);
  const std::uint64_t half = Native::PhysicalMemoryBytes() / 2;
  EXPECT_EQ(
      CMemoryService::Get(false)->MemoryLimit(),
      std::min<std::uint64_t>(0x40000000, std::clamp<std::uint64_t>(half, 0x2000000, 0x40000000)));
  CHeapBlock heap(0);
  EXPECT_FALSE(heap.FromAllocator());
}

TEST_F(FilterRecord, PalettesHideAroundARunButNotInAbout) {
  static std::vector<int> calls;
  calls.clear();
  const HostPaletteSuite palette{[](std::uint8_t hide) -> HostStatus {
    calls.push_back(hide);
    return 0;
  }};
  host.AddSuite(kPaletteSuite, 1, &palette);
  ASSERT_EQ(filter->HandleAbout(host.Record(), nullptr), 0);
  EXPECT_TRUE(calls.empty());
  Enter();
  filter->BeginProcess();
  filter->EndProcess();
  filter->EndProcess();  // shows only what it hid
  EXPECT_EQ(calls, (std::vector<int>{1, 0}));
}

}  // namespace
}  // namespace Tarsa::testing
