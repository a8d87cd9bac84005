#include <gtest/gtest.h>
#include <sys/resource.h>

#include <csignal>
#include <cstdint>
#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "framework/memory/CMemoryService.h"
#include "framework/memory/CVirtualHeap.h"
#include "framework/pixels/CVirtualPixmap.h"
#include "tests/support/TestSupport.h"

namespace Tarsa {
namespace {

using Tarsa::testing::ScratchFolder;

constexpr const char* kSwapFailed =
    "$$$/Tarsa/Memory/Error/SwapFailed=There is not enough memory, and the scratch disks could "
    "not take the rest of the image.";

struct Shape {
  std::uint32_t blockClass, width, height;
  bool operator==(const Shape&) const = default;
};

Shape ShapeOf(std::uint32_t depthCode, std::int32_t sizeClass) {
  Shape s{};
  EXPECT_TRUE(CVirtualPixmap::TileShape(depthCode, sizeClass, s.blockClass, s.width, s.height));
  return s;
}

TEST(CVirtualPixmap, TileShapesFollowTheClassTableAndStridesTheLayout) {
  // The first class, from 1 to 32 bits a sample.
  const Shape first[] = {{0, 64, 32}, {0, 32, 32}, {0, 32, 16}, {0, 16, 16}, {0, 16, 8}, {0, 8, 8}};
  for (std::uint32_t d = 0; d < 6; ++d) EXPECT_EQ(ShapeOf(d, 0), first[d]) << d;
  EXPECT_EQ(ShapeOf(0, 1), (Shape{1, 64, 64}));
  EXPECT_EQ(ShapeOf(1, 1), (Shape{1, 64, 32}));
  EXPECT_EQ(ShapeOf(0, 2), (Shape{2, 128, 64}));
  EXPECT_EQ(ShapeOf(1, 2), (Shape{2, 64, 64}));
  // Negative classes: block classes 1..6, 3..8, 5..10, 7..12 by depth, that
  // is 64 to 512 pixels square at every depth.
  EXPECT_EQ(ShapeOf(0, -1), (Shape{1, 64, 64}));
  EXPECT_EQ(ShapeOf(5, -1), (Shape{6, 64, 64}));
  EXPECT_EQ(ShapeOf(3, -2), (Shape{6, 128, 128}));
  EXPECT_EQ(ShapeOf(4, -4), (Shape{11, 512, 512}));
  std::uint32_t c, w, h;
  EXPECT_FALSE(CVirtualPixmap::TileShape(3, -5, c, w, h));
  EXPECT_FALSE(CVirtualPixmap::TileShape(6, 0, c, w, h));

  CVirtualHeap heap;
  // 16 x 16 tiles on lines through the origin: -1..71 across takes the
  // tiles from -16 to 80, six; -1..21 down three.
  CVirtualPixmap apart(3, 70, 20, 3, 0, CPoint{1, 1}, false, false, &heap);
  EXPECT_EQ(apart.Columns(), 6u);
  EXPECT_EQ(apart.Rows(), 3u);
  EXPECT_EQ(apart.Bounds(), (CRect{-1, -1, 71, 21}));
  // Plane 2, column 3, row 1; a row of tiles is 6 columns x 3 planes.
  EXPECT_EQ(apart.TileIndex(2, 3, 1), 1u * 18 + 3 + 2 * 6);
  CVirtualPixmap together(3, 70, 20, 3, 0, CPoint{1, 1}, true, false, &heap);
  EXPECT_EQ(together.TileIndex(2, 3, 1), 1u * 18 + 3 * 3 + 2);
  EXPECT_EQ(together.Block().TileCount(), 6u * 3 * 3);
  // The lattice runs through the origin: pixel (0, 0) opens a tile.
  std::uint32_t col, row;
  together.TileAt(0, 0, col, row);
  EXPECT_EQ(col, 1u);
  EXPECT_EQ(row, 1u);
  together.TileAt(-1, 15, col, row);
  EXPECT_EQ(col, 0u);
  EXPECT_EQ(row, 1u);
}

std::size_t SwapFilesIn(const ScratchFolder& folder) {
  std::size_t n = 0;
  for (const auto& entry : std::filesystem::directory_iterator(folder.Dir())) {
    if (entry.path().extension() == ".tmp") ++n;
  }
  return n;
}

// Random samples for a pixmap's rows, kept to compare with.
std::vector<std::vector<std::uint8_t>> RandomRows(const CVirtualPixmap& p, std::uint32_t seed) {
  std::mt19937 random(seed);
  const std::uint32_t top = p.Depth() >= 8 ? 255 : (1u << p.Depth()) - 1;
  std::vector<std::vector<std::uint8_t>> rows(p.Planes() * std::size_t(p.Bounds().Height()));
  for (auto& row : rows) {
    row.resize(std::size_t(p.Bounds().Width()) * p.RowSampleBytes());
    for (auto& b : row) b = std::uint8_t(random() % (top + 1));
  }
  return rows;
}

::testing::AssertionResult ReadsBack(const CVirtualPixmap& p,
                                     const std::vector<std::vector<std::uint8_t>>& rows) {
  const CRect b = p.Bounds();
  std::vector<std::uint8_t> got(std::size_t(b.Width()) * p.RowSampleBytes());
  for (std::uint32_t k = 0; k < p.Planes(); ++k) {
    for (std::int32_t y = b.top; y < b.bottom; ++y) {
      const auto& want = rows[k * std::size_t(b.Height()) + std::size_t(y - b.top)];
      p.ReadRow(k, b.left, y, std::uint32_t(b.Width()), got.data());
      if (got != want) return ::testing::AssertionFailure() << "plane " << k << " row " << y;
    }
  }
  return ::testing::AssertionSuccess();
}

void WriteAll(CVirtualPixmap& p, const std::vector<std::vector<std::uint8_t>>& rows) {
  const CRect b = p.Bounds();
  for (std::uint32_t k = 0; k < p.Planes(); ++k) {
    for (std::int32_t y = b.top; y < b.bottom; ++y) {
      p.WriteRow(k, b.left, y, std::uint32_t(b.Width()),
                 rows[k * std::size_t(b.Height()) + std::size_t(y - b.top)].data());
    }
  }
}

TEST(CVirtualPixmap, AnImageLargerThanTheLimitComesBackExactlyThroughTheSwap) {
  ScratchFolder scratch;
  {
    // The framework's heap, as the filter sets it up: a limit of 16 tiles
    // of 64 x 64 bytes for an image of 6 x 5 x 3 of them.
    CMemoryService* service = CMemoryService::Get(true);
    service->SetMemoryLimit(16 * 4096);
    service->StartSwap({scratch.Dir()});
    CVirtualHeap& heap = service->Heap();
    CVirtualPixmap pixmap(3, 300, 200, 3, -1, CPoint{1, 1});
    pixmap.SetOrigin(CPoint{-40, 25});
    const auto rows = RandomRows(pixmap, 11);
    WriteAll(pixmap, rows);
    EXPECT_LE(heap.ResidentBytes(), heap.Limit());
    // All but the 16 newest tiles have gone out once.
    EXPECT_EQ(heap.SwapOuts(), 90u - 16);
    EXPECT_EQ(SwapFilesIn(scratch), 1u);

    // The first tile went out long ago; touching it brings it back.
    const std::size_t first = pixmap.TileIndex(0, 0, 0);
    ASSERT_TRUE(pixmap.Block().IsSwapped(first));
    const CRect b = pixmap.Bounds();
    EXPECT_EQ(pixmap.Sample(0, b.left, b.top), rows[0][0]);
    EXPECT_TRUE(pixmap.Block().IsResident(first));
    EXPECT_TRUE(ReadsBack(pixmap, rows));
    EXPECT_GT(heap.SwapIns(), 0u);
    EXPECT_LE(heap.ResidentBytes(), heap.Limit());

    // Sub-byte and wide samples through the same swap, on small tiles.
    for (const std::uint32_t depthCode : {0u, 2u, 4u, 5u}) {
      CVirtualPixmap small(depthCode, 150, 70, 2, 0, CPoint{}, depthCode % 2 == 0);
      const auto smallRows = RandomRows(small, depthCode);
      WriteAll(small, smallRows);
      EXPECT_TRUE(ReadsBack(small, smallRows)) << "depth code " << depthCode;
      EXPECT_TRUE(ReadsBack(pixmap, rows));
    }
  }
  // Ending the service ends the heap and its files.
  CMemoryService::Drop();
  EXPECT_EQ(SwapFilesIn(scratch), 0u);
}

// Rows of 64 samples, one tile wide: a row written is a row in one tile.
void WriteRowsUntilFailure(CVirtualPixmap& p, const std::vector<std::vector<std::uint8_t>>& rows,
                           std::int32_t& written) {
  for (written = 0; written < std::int32_t(rows.size()); ++written) {
    p.WriteRow(0, 0, written, 64, rows[std::size_t(written)].data());
  }
}

TEST(CVirtualHeap, AScratchFolderThatCannotTakeTheFileLosesNothing) {
  ScratchFolder scratch;
  scratch.Put("plain", "not a folder");
  const std::string unusable = scratch.File("plain") + "/";
  CVirtualHeap heap(4 * 4096, {unusable});
  CVirtualPixmap pixmap(3, 64, 64 * 8, 1, -1, CPoint{}, false, false, &heap);
  const auto rows = RandomRows(pixmap, 5);
  std::int32_t written = 0;
  try {
    WriteRowsUntilFailure(pixmap, rows, written);
    FAIL() << "no room was needed";
  } catch (const CError& e) {
    EXPECT_EQ(e.ErrorText(), kSwapFailed);
  }
  // Four tiles filled, the fifth could not be made.
  EXPECT_EQ(written, 4 * 64);
  EXPECT_EQ(heap.SwappedTiles(), 0u);
  heap.SetLimit(0);
  std::vector<std::uint8_t> got(64);
  for (std::int32_t y = 0; y < 8 * 64; ++y) {
    pixmap.ReadRow(0, 0, y, 64, got.data());
    ASSERT_EQ(got, y < written ? rows[std::size_t(y)] : std::vector<std::uint8_t>(64, 0)) << y;
  }

  // With a usable folder after it, the swap goes there.
  heap.SetLimit(4 * 4096);
  heap.SetVolumes({unusable, scratch.Dir()});
  WriteRowsUntilFailure(pixmap, rows, written);
  EXPECT_EQ(SwapFilesIn(scratch), 1u);
  EXPECT_TRUE(ReadsBack(pixmap, rows));
}

TEST(CVirtualHeap, AFullDiskMidRunLosesNothing) {
  ScratchFolder scratch;
  CVirtualHeap heap(4 * 4096, {scratch.Dir()});
  CVirtualPixmap pixmap(3, 64, 64 * 12, 1, -1, CPoint{}, false, false, &heap);
  const auto rows = RandomRows(pixmap, 9);
  for (std::int32_t y = 0; y < 8 * 64; ++y)
    pixmap.WriteRow(0, 0, y, 64, rows[std::size_t(y)].data());
  ASSERT_EQ(heap.SwapFilePaths().size(), 1u);
  const auto full = std::filesystem::file_size(heap.SwapFilePaths()[0]);

  // The file may not grow: the next new tile finds no room on disk.
  rlimit old{};
  getrlimit(RLIMIT_FSIZE, &old);
  const auto oldSignal = std::signal(SIGXFSZ, SIG_IGN);
  rlimit capped = old;
  capped.rlim_cur = full;
  setrlimit(RLIMIT_FSIZE, &capped);
  std::int32_t written = 8 * 64;
  try {
    for (; written < 12 * 64; ++written)
      pixmap.WriteRow(0, 0, written, 64, rows[std::size_t(written)].data());
  } catch (const CError& e) {
    EXPECT_EQ(e.ErrorText(), kSwapFailed);
  }
  setrlimit(RLIMIT_FSIZE, &old);
  std::signal(SIGXFSZ, oldSignal);
  EXPECT_EQ(written, 8 * 64);

  heap.SetLimit(0);
  std::vector<std::uint8_t> got(64);
  for (std::int32_t y = 0; y < 12 * 64; ++y) {
    pixmap.ReadRow(0, 0, y, 64, got.data());
    ASSERT_EQ(got, y < written ? rows[std::size_t(y)] : std::vector<std::uint8_t>(64, 0)) << y;
  }
}

}  // namespace
}  // namespace Tarsa
