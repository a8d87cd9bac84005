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
#include "tests/framework/plugin/TestHost.h"

namespace Tarsa::testing {
namespace {

using Strings = std::vector<std::string>;

class FilterRecord : public ::testing::Test {
 protected:
  void SetUp() override {
    CPluginEntry::TearDown();
    ProbeFilter::Plan() = ProbeFilter::Script{};
    filter = std::make_unique<ProbeFilter>();
  }
  void TearDown() override {
    filter.reset();
    CPluginEntry::TearDown();
  }
  // A filter selector: from here on the record is the filter's.
  void Enter() { ASSERT_EQ(filter->HandleParameters(&host.record, nullptr), 0); }

  TestHost host;
  std::unique_ptr<ProbeFilter> filter;
};

TEST_F(FilterRecord, WithoutAFilterRecordEveryAccessorAnswersEmpty) {
  host.MakeDocument(kHostModeRGB, 30, 20, true);
  host.properties[FourCC("TSiz")] = 512;
  host.complexProperties[FourCC("unnm")] = std::string("a\0b\0", 4);
  // About hands over a record, but it is no filter record.
  ASSERT_EQ(filter->HandleAbout(&host.record, nullptr), 0);
  EXPECT_EQ(filter->FilterRecord(), nullptr);
  EXPECT_EQ(filter->HostRecord(), &host.record);
  EXPECT_EQ(filter->ImageRect(), CRect{});
  EXPECT_EQ(filter->FilterRect(), CRect{});
  EXPECT_EQ(filter->TileOffset(), CPoint{});
  EXPECT_EQ(filter->Depth(), 0u);
  EXPECT_EQ(filter->ColorPlanes(), 0u);
  EXPECT_FALSE(filter->HasTransparency());
  EXPECT_EQ(filter->ResolutionX(), 0.0);
  EXPECT_TRUE(filter->DocumentTitle().IsEmpty());
  filter->Use32BitCoordinates(true);
  EXPECT_EQ(host.coords.enabled, 0u);

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
  host.MakeDocument(kHostModeRGB, 40000, 3, false, /*use32=*/true);
  Enter();
  EXPECT_EQ(filter->ImageSize(), (CSize{40000, 3}));
  EXPECT_EQ(filter->FilterRect(), (CRect{0, 0, 40000, 3}));
  EXPECT_EQ(filter->ImageRect(), (CRect{0, 0, 40000, 3}));
  // Disabled, the block is ignored entirely: the 16-bit fields (nonsense
  // here) are read, never a mix of both.
  filter->Use32BitCoordinates(false);
  EXPECT_EQ(host.coords.enabled, 0u);
  EXPECT_EQ(filter->ImageSize(), (CSize{-7, -7}));
  EXPECT_EQ(filter->FilterRect(), (CRect{-7, -7, -7, -7}));
  // An old host without the block: the switch does nothing.
  host.record.coordinates32 = nullptr;
  filter->Use32BitCoordinates(true);
  EXPECT_EQ(filter->ImageSize(), (CSize{-7, -7}));
}

TEST_F(FilterRecord, FloatingSelectionMovesTheImageRectangle) {
  host.MakeDocument(kHostModeGray, 10, 8, false);
  host.record.floatsOverImage = 1;
  host.record.floatOrigin16 = HostPoint16{3, 5};  // y, x
  host.record.wholeSize16 = HostPoint16{20, 30};  // height, width
  Enter();
  EXPECT_EQ(filter->ImageRect(), (CRect{-5, -3, 25, 17}));
  EXPECT_EQ(filter->TileOffset(), (CPoint{5, 3}));
  EXPECT_EQ(filter->LayerRect(), (CRect{0, 0, 10, 8}));

  // Not floating: the image is at the origin, and the channels are offset by
  // the float origin less the filtered area's corner.
  host.record.floatsOverImage = 0;
  host.record.floatOrigin16 = HostPoint16{0, 0};
  host.record.filterRect16 = HostRect16{1, 2, 8, 10};
  EXPECT_EQ(filter->ImageRect(), (CRect{0, 0, 10, 8}));
  EXPECT_EQ(filter->TileOffset(), (CPoint{-2, -1}));
}

TEST_F(FilterRecord, HostPropertiesAndTheirDefaults) {
  Enter();
  EXPECT_TRUE(filter->TooltipsOn());
  EXPECT_EQ(filter->HostTileSize(), 16384);
  host.properties[FourCC("tltp")] = 0;
  host.properties[FourCC("TSiz")] = 1024;
  EXPECT_FALSE(filter->TooltipsOn());
  EXPECT_EQ(filter->HostTileSize(), 1024);

  host.properties[FourCC("UIBR")] = 7;  // out of range: the default
  host.properties[FourCC("HLCR")] = 2;
  host.properties[FourCC("LGTB")] = 1;
  host.properties[FourCC("HDPI")] = 1;
  filter->ReadDisplayProperties(&host.record);
  EXPECT_EQ(filter->UIBrightness(), 2);
  EXPECT_TRUE(filter->UIFlagHLCR());
  EXPECT_TRUE(filter->UIFlagLGTB());
  EXPECT_EQ(filter->DisplayScale(), 1);
  host.properties[FourCC("UIBR")] = 0;
  host.properties[FourCC("HLCR")] = 1;
  filter->ReadDisplayProperties(&host.record);
  EXPECT_EQ(filter->UIBrightness(), 0);
  EXPECT_FALSE(filter->UIFlagHLCR());

  filter->SuspendWatchCursor(true);
  ASSERT_EQ(host.propertyWrites.size(), 1u);
  EXPECT_EQ(host.propertyWrites[0], std::make_pair(FourCC("wtch"), std::intptr_t(1)));

  // A table that counts fewer entries than needed is not called.
  host.propertyProcs.header.count = 0;
  EXPECT_EQ(filter->HostTileSize(), 16384);
  filter->SuspendWatchCursor(false);
  EXPECT_EQ(host.propertyWrites.size(), 1u);
}

TEST_F(FilterRecord, TitleAndScratchVolumesComeFromHandlesThatAreDisposed) {
  Enter();
  const char16_t title[] = u"\u015Ctreet.tif";  // with its trailing zero
  host.complexProperties[FourCC("unnm")] =
      std::string(reinterpret_cast<const char*>(title), sizeof title);
  host.complexProperties[FourCC("titl")] = std::string("plain.tif\0", 10);
  EXPECT_EQ(filter->DocumentTitle().Str(), "\xC5\x9Ctreet.tif");
  host.complexProperties.erase(FourCC("unnm"));
  EXPECT_EQ(filter->DocumentTitle().Str(), "plain.tif");

  host.complexProperties[FourCC("svls")] = std::string("/scratch/a\0/b\0", 14);
  EXPECT_EQ(filter->ScratchVolumes(), (Strings{"/scratch/a", "/b"}));
  EXPECT_EQ(host.disposed, 3);
  EXPECT_TRUE(host.liveHandles.empty());
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
  int tables[4] = {};
  host.AddSuite(kDescriptorSuite, 5, &tables[0]);
  host.AddSuite(kBufferSuite, 1, &tables[1]);
  host.AddSuite(kZStringSuite, 1, &tables[2]);
  host.AddSuite(kChannelPortsSuite, 3, &tables[3]);
  Enter();
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kDescriptor), &tables[0]);
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kBuffer), &tables[1]);
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kZString), &tables[2]);
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kChannelPorts), &tables[3]);
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kDescriptor), &tables[0]);
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kHelp2), nullptr);
  EXPECT_EQ(filter->Suite(CQuillmarkPlugin::ESuite::kHelp2), nullptr);
  EXPECT_EQ(host.acquired.size(), 4u) << "a success is cached, a failure is asked again";
  filter.reset();
  EXPECT_EQ(host.released,
            (Strings{std::string(kChannelPortsSuite) + "#3", std::string(kZStringSuite) + "#1",
                     std::string(kBufferSuite) + "#1", std::string(kDescriptorSuite) + "#5"}));
}

// Three string suites, each knowing some keys.
struct StringSuite {
  static HostStatus Answer(const char* text, char* buffer, std::int32_t size,
                           std::int32_t* length) {
    *length = std::int32_t(std::strlen(text));
    if (*length < size) std::memcpy(buffer, text, std::size_t(*length) + 1);
    return 0;
  }
  static HostStatus ZString(const char* keyed, char* buffer, std::int32_t size,
                            std::int32_t* length) {
    if (std::strstr(keyed, "/First") == nullptr) return -1;
    return Answer("from ZString", buffer, size, length);
  }
  static HostStatus Utilities(const char* keyed, char* buffer, std::int32_t size,
                              std::int32_t* length) {
    if (std::strstr(keyed, "/Second") == nullptr && std::strstr(keyed, "/First") == nullptr) {
      return -1;
    }
    static const std::string kLong(300, 'u');  // longer than the first buffer
    return Answer(std::strstr(keyed, "/Second") ? kLong.c_str() : "from Utilities", buffer, size,
                  length);
  }
  static HostStatus SwiftView(const char*, char* buffer, std::int32_t size, std::int32_t* length) {
    return Answer("from SwiftView", buffer, size, length);
  }
};

TEST_F(FilterRecord, KeyedStringsAskTheHostSuitesInTurn) {
  const HostStringSuite zstring{&StringSuite::ZString};
  const HostStringSuite utilities{&StringSuite::Utilities};
  const HostStringSuite swiftView{&StringSuite::SwiftView};
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
  host.complexProperties[FourCC("svls")] = std::string("/scratch\0", 9);
  host.record.bufferShare = 0x1000;  // below the floor of 32 MiB
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
  host.record.bufferShare = 0x7FFFFFFF;
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
  ASSERT_EQ(filter->HandleAbout(&host.record, nullptr), 0);
  EXPECT_TRUE(calls.empty());
  Enter();
  filter->BeginProcess();
  filter->EndProcess();
  filter->EndProcess();  // shows only what it hid
  EXPECT_EQ(calls, (std::vector<int>{1, 0}));
}

}  // namespace
}  // namespace Tarsa::testing
