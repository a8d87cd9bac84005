// The final rendering where the result shows more than the photo covers, and
// of an image whose pixel stages do not fit under the memory limit, through
// the real host library.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "filter/PFilter.h"
#include "framework/memory/CMemoryService.h"
#include "framework/memory/CVirtualHeap.h"
#include "framework/plugin/CPluginEntry.h"
#include "host/plugin/Descriptor.h"
#include "host/plugin/MemoryHandles.h"
#include "params/Descriptor.h"
#include "solver/frame/Solver.h"
#include "tests/support/FilterFixture.h"
#include "tests/support/RealHost.h"
#include "tests/support/ReferenceRender.h"

namespace Project::testing {
namespace {

using Host::ImageMode;
using Tarsa::testing::RealHost;

// ---- Margins ----------------------------------------------------------------------

// A descriptor in the record's script block, as a host replaying an action
// puts it there. The run leaves a descriptor of its own in the block, which
// the host record disposes; this one is ours to dispose.
class ScriptedScale {
 public:
  ScriptedScale(RealHost& host, std::int32_t imageScale) : host_(host) {
    Host::Descriptor descriptor;
    descriptor.PutInteger(DescriptorKey::kImageScale, imageScale);
    handle_ = Host::MemoryHandles::FromBytes(descriptor.ToBytes());
    Block().descriptor = handle_;
  }
  ~ScriptedScale() {
    if (Block().descriptor != handle_) Host::MemoryHandles::Dispose(handle_);
  }
  ScriptedScale(const ScriptedScale&) = delete;
  ScriptedScale& operator=(const ScriptedScale&) = delete;

 private:
  Tarsa::HostScriptBlock& Block() {
    return *static_cast<Tarsa::HostScriptBlock*>(host_.Record()->scriptBlock);
  }

  RealHost& host_;
  Tarsa::HostHandle handle_ = nullptr;
};

using Margins = FilterRunTest;

// At 100 % the whole mesh shows: around it the result has no cells, and its
// outer ring of cells, one mesh step past the picture, maps outside it. The
// photo is one bright colour, so anything of it outside the picture would be
// the edge repeated. The picture's edge (and the fisheye's circle, where the
// default camera's cover ends) is drawn anti-aliased: an edge pixel holds
// its covered share, in the alpha alone where the image has transparency and
// in every plane where it has none; past the edge every plane is exactly 0.
TEST_F(Margins, OutsideThePictureIsZeroNotTheEdgeRepeated) {
  constexpr std::int32_t kWidth = 300, kHeight = 200;
  for (const bool transparency : {true, false}) {
    SCOPED_TRACE(::testing::Message() << "transparency " << transparency);
    Tarsa::CPluginEntry::TearDown();
    RealHost host(ImageMode::kRgb, kWidth, kHeight, transparency);
    Host::HostDocument& document = *host.document;
    const int inside[4] = {250, 219, 31, 255};
    const int planes = document.PlaneCount();
    Host::testing::FillPlanes(document, {inside[0], inside[1], inside[2], inside[3]});
    const ScriptedScale scale(host, 100);
    ShaderPFilter filter;
    ASSERT_EQ(RunScripted(host, filter), 0);
    ASSERT_EQ(filter.Settings().imageScale, 100) << "the run took the scripted scale";

    // Only the geometry is wanted: where each result pixel's source point is
    // and how much of it is covered.
    const ReferenceImage reference =
        RenderReference(filter.Constraints().GetSolver(), kWidth, kHeight, 1,
                        [](std::int32_t, std::int32_t, std::int32_t) { return 1.0; });
    int bare = 0, beyond = 0, edge = 0, within = 0;
    int failedZero = 0, failedEdge = 0, failedWithin = 0;
    for (std::int32_t y = 0; y < kHeight; ++y) {
      for (std::int32_t x = 0; x < kWidth; ++x) {
        const auto every = [&](auto test) {
          for (int p = 0; p < planes; ++p)
            if (!test(p, document.Sample(p, x, y), inside[p])) return false;
          return true;
        };
        const auto zero = [](int, int value, int) { return value == 0; };
        if (!reference.Covered(x, y)) {
          ++bare;
          failedZero += !every(zero);
          continue;
        }
        const double share = reference.covered[reference.Index(x, y)];
        if (share == 0.0) {
          ++beyond;
          failedZero += !every(zero);
        } else if (share < 1.0) {
          ++edge;
          // Float texture coordinates on the GPU against double here, and
          // the rounding of the share: three steps.
          constexpr int kSteps = 3;
          failedEdge += !every([&](int p, int value, int full) {
            const bool faded = !transparency || p == planes - 1;
            return std::abs(value - (faded ? full * share : full)) <= kSteps;
          });
        } else {
          ++within;
          // Float rounding of weights that sum to one: one step either way.
          failedWithin +=
              !every([](int, int value, int full) { return std::abs(value - full) <= 1; });
        }
      }
    }
    // The scene shows what it is for: a frame with no cells, a ring of cells
    // past the picture and the circle several pixels wide, and an edge.
    EXPECT_GT(bare, kWidth * kHeight / 10);
    EXPECT_GT(beyond, 300);
    EXPECT_GT(edge, 300);
    EXPECT_GT(within, kWidth * kHeight / 2);
    EXPECT_EQ(failedZero, 0) << "of " << bare + beyond << " outside";
    EXPECT_EQ(failedEdge, 0) << "of " << edge << " on the edge";
    EXPECT_EQ(failedWithin, 0) << "of " << within << " inside";
  }
}

// ---- Swap -------------------------------------------------------------------------

// What one final rendering left: the host's colour planes and the heap's
// counts, taken while the run's stages still hold their tiles.
struct Rendered {
  std::vector<std::vector<std::uint16_t>> planes;
  bool changed = false;  // the result differs from the source somewhere
  std::uint64_t hostLimit = 0;
  std::uint64_t swapOuts = 0;
  std::uint64_t swapIns = 0;
  std::uint64_t residentBytes = 0;
  std::vector<std::string> swapFiles;
};

constexpr std::int32_t kSwapWidth = 640, kSwapHeight = 512;

// A 16-bit run over random samples with the host's scratch volume; limit 0
// leaves the limit that the host's memory offer gave.
void RenderWithLimit(std::uint64_t limit, const std::string& scratch, Rendered& out) {
  Tarsa::CPluginEntry::TearDown();
  RealHost host;
  host.settings.properties.scratchVolumes = {scratch};
  host.MakeDocument(ImageMode::kRgb48, kSwapWidth, kSwapHeight, false);
  std::vector<std::vector<std::uint16_t>> source;
  for (int p = 0; p < 3; ++p) {
    const auto plane = host.document->Plane16(p);
    source.emplace_back(plane.begin(), plane.end());
  }
  ShaderPFilter filter;
  ASSERT_EQ(filter.HandlePrepare(host.Record(), nullptr), 0);
  Tarsa::CMemoryService* service = Tarsa::CMemoryService::Get(false);
  ASSERT_NE(service, nullptr) << "the prepare set up the memory service";
  out.hostLimit = service->MemoryLimit();
  if (limit != 0) service->SetMemoryLimit(limit);
  ASSERT_EQ(filter.HandleStart(host.Record(), nullptr), 0);
  const Tarsa::CVirtualHeap& heap = service->Heap();
  out.swapOuts = heap.SwapOuts();
  out.swapIns = heap.SwapIns();
  out.residentBytes = heap.ResidentBytes();
  out.swapFiles = heap.SwapFilePaths();
  for (int p = 0; p < 3; ++p) {
    const auto plane = host.document->Plane16(p);
    out.planes.emplace_back(plane.begin(), plane.end());
    out.changed |= out.planes.back() != source[std::size_t(p)];
  }
}

using Swap = FilterRunTest;

// The host's offer cannot take the limit below its floor of 32 MiB, more
// than stages of a size that renders quickly; the service's setter, which
// the prepare calls with the host's figure, takes it to 256 KiB, a
// twentieth of the source and result stages of this image: less than the
// source tiles a tile's texture reads ahead, so tiles go out before they
// have been used. The tiles sent out must come back as they went: the
// result equals, bit for bit, the same run held in memory (same tiles, same
// order, same GL state).
TEST_F(Swap, ImageAboveTheLimitRendersThroughTheSwapAsInMemory) {
  const Tarsa::testing::ScratchFolder scratch;
  constexpr std::uint64_t kLimit = 1 << 18;
  Rendered swapped, held;
  ASSERT_NO_FATAL_FAILURE(RenderWithLimit(kLimit, scratch.Dir(), swapped));
  EXPECT_EQ(swapped.hostLimit, 0x2000000u) << "no offer: the floor";
  EXPECT_LE(swapped.residentBytes, kLimit);
  EXPECT_GT(swapped.swapOuts, 0u);
  EXPECT_GT(swapped.swapIns, 0u) << "tiles sent out were needed again";
  ASSERT_EQ(swapped.swapFiles.size(), 1u);
  EXPECT_EQ(std::filesystem::path(swapped.swapFiles[0]).parent_path(),
            std::filesystem::path(scratch.Dir()).parent_path())
      << "the swap is on the host's scratch volume";
  Tarsa::CPluginEntry::TearDown();
  EXPECT_EQ(scratch.Listing(), "") << "the swap file goes with the heap";

  ASSERT_NO_FATAL_FAILURE(RenderWithLimit(0, scratch.Dir(), held));
  EXPECT_EQ(held.swapOuts, 0u);
  EXPECT_GT(held.residentBytes, 4 * kLimit) << "the stages outgrow the lower limit";
  EXPECT_TRUE(held.changed) << "the run rendered something";
  ASSERT_EQ(swapped.planes.size(), held.planes.size());
  for (std::size_t p = 0; p < held.planes.size(); ++p) {
    const auto& a = swapped.planes[p];
    const auto& b = held.planes[p];
    const auto differ = std::mismatch(a.begin(), a.end(), b.begin());
    EXPECT_TRUE(differ.first == a.end())
        << "plane " << p << " first differs at sample " << differ.first - a.begin();
  }
}

}  // namespace
}  // namespace Project::testing
