#include "framework/files/CContainer.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdint>
#include <filesystem>
#include <vector>

#include "framework/files/CBlockContainer.h"
#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"
#include "framework/files/CMemoryBlock.h"
#include "framework/files/CMemoryContainer.h"
#include "tests/framework/files/FilesTestSupport.h"

namespace Tarsa {
namespace {

using testing::Bytes;
using testing::FailsWith;
using testing::kEndOfData;
using testing::SystemCode;

constexpr const char* kOutOfMemory =
    "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";

Bytes Contents(const CMemoryContainer& c) { return Bytes(c.Data(), c.Data() + c.Size()); }

// The same end-of-data rules on every store.
void ExpectReadsStopAtTheEnd(CContainer& c) {
  ASSERT_EQ(c.Size(), 4u);
  std::uint8_t buffer[4] = {0xAA, 0xAA, 0xAA, 0xAA};
  c.SetPosition(2);
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.Read(buffer, 3); }));
  EXPECT_EQ(c.Position(), 2u);
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.SkipRead(3); }));
  EXPECT_EQ(c.Position(), 2u);
  c.Read(buffer, 2);
  EXPECT_EQ((Bytes{buffer[0], buffer[1]}), (Bytes{3, 4}));
  c.Read(buffer, 0);  // zero bytes at the end is no read at all
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.Read(buffer, 1); }));
  EXPECT_EQ(c.Position(), 4u);
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.ReadAt(buffer, 1, 5); }));
  EXPECT_EQ(c.Position(), 4u);
  c.ReadAt(buffer, 1, 0);
  EXPECT_EQ(buffer[0], 1);
  c.SetPosition(4);
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.SetPosition(5); }));
  EXPECT_EQ(c.Position(), 4u);
}

TEST(CContainer, ReadsStopAtTheEndInMemoryAndInFiles) {
  CMemoryContainer memory;
  memory.Write(Bytes{1, 2, 3, 4}.data(), 4);
  ExpectReadsStopAtTheEnd(memory);

  testing::ScratchFolder folder;
  folder.Put("four.bin", {1, 2, 3, 4});
  CFileContainer file(CFile(folder.File("four.bin")));
  ExpectReadsStopAtTheEnd(file);
}

TEST(CContainer, SkipWriteGrowsAndSetSizeClipsThePosition) {
  CMemoryContainer c;
  c.Write(Bytes{1, 2, 3}.data(), 3);
  c.SkipWrite(2);
  EXPECT_EQ(c.Size(), 5u);
  EXPECT_EQ(c.Position(), 5u);
  c.WriteByte(9);
  // The gap a skip leaves is zero, never stale heap bytes.
  EXPECT_EQ(Contents(c), (Bytes{1, 2, 3, 0, 0, 9}));

  c.SetSize(2);
  EXPECT_EQ(c.Position(), 2u);
  c.WriteByte(7);
  EXPECT_EQ(Contents(c), (Bytes{1, 2, 7}));

  c.SetPosition(1);
  c.SetSize(8);  // growing leaves the position where it was
  EXPECT_EQ(c.Position(), 1u);
  EXPECT_EQ(Contents(c), (Bytes{1, 2, 7, 0, 0, 0, 0, 0}));
}

TEST(CContainer, MemoryGrowsInGranularStepsAndKeepsItsBytes) {
  CMemoryBlock block(4096);
  EXPECT_EQ(block.CapacityFor(4097), 8192u);
  EXPECT_EQ(block.CapacityFor(0xFFFFFFFFu), 0x100000000u);  // no wrap near 4 GiB
  EXPECT_EQ(CMemoryBlock(1).CapacityFor(4097), 4097u);

  // Byte-by-byte writes across several steps; ASan checks every copy.
  CMemoryContainer c;
  for (int i = 0; i < 10000; ++i) c.WriteByte(static_cast<std::uint8_t>(i * 7));
  bool same = true;
  for (int i = 0; i < 10000; ++i) same = same && c.Data()[i] == static_cast<std::uint8_t>(i * 7);
  EXPECT_TRUE(same);

  // A block holds less than 4 GiB: beyond that is out of memory, with nothing moved.
  EXPECT_TRUE(FailsWith(kOutOfMemory, [&] { c.SetSize(std::uint64_t{1} << 32); }));
  EXPECT_TRUE(FailsWith(kOutOfMemory, [&] { c.SkipWrite(std::uint64_t{1} << 32); }));
  EXPECT_EQ(c.Size(), 10000u);
  EXPECT_EQ(c.Position(), 10000u);
}

TEST(CBlockContainer, WritesIntoAnOutsideBlockOrMovesAloneWithNone) {
  CMemoryBlock block(16);
  {
    CBlockContainer c(&block);
    c.Write(Bytes{5, 6}.data(), 2);
    EXPECT_EQ(c.Size(), 2u);
  }
  {
    CBlockContainer c(&block);  // picks up the block's size, at 0
    EXPECT_EQ(c.Size(), 2u);
    EXPECT_EQ(c.ReadByte(), 5);
    EXPECT_EQ(c.ReadByte(), 6);
  }
  ASSERT_EQ(block.Size(), 2u);  // the block outlives its containers
  EXPECT_EQ((Bytes{block.Data()[0], block.Data()[1]}), (Bytes{5, 6}));

  CBlockContainer none(nullptr);
  none.Write(Bytes{1, 2, 3}.data(), 3);
  none.SkipWrite(5);
  EXPECT_EQ(none.Size(), 8u);
  none.SetSize(2);
  EXPECT_EQ(none.Position(), 2u);
  none.SetPosition(0);
  none.SkipRead(2);
  EXPECT_EQ(none.Position(), 2u);
}

TEST(CFileContainer, WriteAtPastTheEndExtendsTheFileFirst) {
  testing::ScratchFolder folder;
  folder.Put("f.bin", {'a', 'b', 'c'});
  {
    CFileContainer c(CFile(folder.File("f.bin")), CFilePort::kMode_ReadWrite);
    c.WriteAt("XY", 2, 6);
    EXPECT_EQ(c.Size(), 8u);
    EXPECT_EQ(c.Position(), 8u);
    c.SetSize(7);  // cuts the file, position follows
    EXPECT_EQ(c.Position(), 7u);
  }
  EXPECT_EQ(folder.Get("f.bin"), (Bytes{'a', 'b', 'c', 0, 0, 0, 'X'}));
}

TEST(CFileContainer, MissingFilesAreNeverMadeAndReadModeRefusesWrites) {
  testing::ScratchFolder folder;
  const std::string missing = folder.File("missing.bin");
  for (int mode : {CFilePort::kMode_Read, CFilePort::kMode_ReadWrite}) {
    EXPECT_EQ(SystemCode([&] { CFileContainer c(CFile::FromPath(missing), mode); }), ENOENT);
    EXPECT_FALSE(std::filesystem::exists(missing));
  }
  EXPECT_EQ(SystemCode([&] { CFileContainer c(CFile::FromPath(folder.Dir())); }), EISDIR);

  folder.Put("ro.bin", {1, 2});
  CFileContainer c(CFile(folder.File("ro.bin")), CFilePort::kMode_Read);
  EXPECT_EQ(SystemCode([&] { c.WriteByte(9); }), EBADF);
  EXPECT_EQ(folder.Get("ro.bin"), (Bytes{1, 2}));
}

}  // namespace
}  // namespace Tarsa
