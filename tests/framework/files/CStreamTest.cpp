#include "framework/files/CStream.h"

#include <gtest/gtest.h>

#include <bit>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "framework/files/CDirectory.h"
#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"
#include "framework/files/CMemoryContainer.h"
#include "tests/framework/files/FilesTestSupport.h"

namespace Tarsa {
namespace {

using testing::Bytes;
using testing::FailsWith;
using testing::kEndOfData;

struct Tagged {
  std::uint32_t tag;
  std::uint8_t payload[4];
};

// One value of every kind, in a fixed order.
void WriteSample(CStream& s) {
  s.WriteByte(0x12);
  s.WriteU16(0x3456);
  s.WriteU32(0x789ABCDE);
  s.WriteBool(true);
  s.WriteU64(0x0102030405060708);
  s.WriteI16(-2);
  s.WriteI32(-0x12345678);
  s.WriteFloat(1.0f);
  s.WriteDouble(-2.0);
  s.WriteObject(Tagged{0x41424344, {1, 2, 3, 4}});
}

// The sample laid out by hand in each byte order; only the object's first
// word follows the order.
const Bytes kBigEndian = {0x12, 0x34, 0x56, 0x78, 0x9A, 0xBC, 0xDE, 0x01, 0x01, 0x02, 0x03,
                          0x04, 0x05, 0x06, 0x07, 0x08, 0xFF, 0xFE, 0xED, 0xCB, 0xA9, 0x88,
                          0x3F, 0x80, 0x00, 0x00, 0xC0, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00,
                          0x00, 0x41, 0x42, 0x43, 0x44, 0x01, 0x02, 0x03, 0x04};
const Bytes kLittleEndian = {0x12, 0x56, 0x34, 0xDE, 0xBC, 0x9A, 0x78, 0x01, 0x08, 0x07, 0x06,
                             0x05, 0x04, 0x03, 0x02, 0x01, 0xFE, 0xFF, 0x88, 0xA9, 0xCB, 0xED,
                             0x00, 0x00, 0x80, 0x3F, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00,
                             0xC0, 0x44, 0x43, 0x42, 0x41, 0x01, 0x02, 0x03, 0x04};

// What a stream with this switch writes: the other order than the machine's
// when set.
const Bytes& ExpectedLayout(bool swap) {
  const bool littleMachine = std::endian::native == std::endian::little;
  return swap == littleMachine ? kBigEndian : kLittleEndian;
}

void ExpectSample(CStream& s) {
  EXPECT_EQ(s.ReadByte(), 0x12);
  EXPECT_EQ(s.ReadU16(), 0x3456);
  EXPECT_EQ(s.ReadU32(), 0x789ABCDEu);
  EXPECT_TRUE(s.ReadBool());
  EXPECT_EQ(s.ReadU64(), 0x0102030405060708u);
  EXPECT_EQ(s.ReadI16(), -2);
  EXPECT_EQ(s.ReadI32(), -0x12345678);
  EXPECT_EQ(s.ReadFloat(), 1.0f);
  EXPECT_EQ(s.ReadDouble(), -2.0);
  Tagged object{};
  s.ReadObject(object);
  EXPECT_EQ(object.tag, 0x41424344u);
  EXPECT_EQ(Bytes(object.payload, object.payload + 4), (Bytes{1, 2, 3, 4}));
}

// Replaces c's contents by bytes, at position 0.
void Fill(CMemoryContainer& c, const Bytes& bytes) {
  c.SetSize(0);
  c.Write(bytes.data(), bytes.size());
  c.SetPosition(0);
}

TEST(CStream, TypedValuesRoundTripInBothOrdersInMemoryAndInFiles) {
  testing::ScratchFolder folder;
  for (bool swap : {false, true}) {
    SCOPED_TRACE(swap ? "swapped" : "machine order");
    CMemoryContainer memory;
    memory.SetSwapBytes(swap);
    WriteSample(memory);
    EXPECT_EQ(Bytes(memory.Data(), memory.Data() + memory.Size()), ExpectedLayout(swap));
    memory.SetPosition(0);
    ExpectSample(memory);
    EXPECT_EQ(memory.Position(), memory.Size());

    const CFile file(CDirectory(folder.Dir()), "sample.bin", true);
    {
      CFileContainer out(file, CFilePort::kMode_ReadWrite);
      out.SetSwapBytes(swap);
      WriteSample(out);
      out.Flush();
    }
    EXPECT_EQ(folder.Get("sample.bin"), ExpectedLayout(swap));
    CFileContainer in(file);
    in.SetSwapBytes(swap);
    ExpectSample(in);
    EXPECT_EQ(in.Position(), kBigEndian.size());
  }
}

TEST(CStream, ReadIntoTakesExactlyTheBytesAndTheByteOrder) {
  CMemoryContainer source, target, empty;
  Fill(source, {1, 2, 3, 4, 5, 6, 7, 8, 9, 10});
  source.SetSwapBytes(true);
  source.SetPosition(2);
  Fill(target, {0xEE, 0xEE, 0xEE});
  source.ReadInto(target, 5);
  EXPECT_EQ(Bytes(target.Data(), target.Data() + target.Size()), (Bytes{3, 4, 5, 6, 7}));
  EXPECT_EQ(target.Position(), 0u);
  EXPECT_TRUE(target.SwapBytes());
  EXPECT_EQ(source.Position(), 7u);

  // More than is left fails before the target is touched.
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { source.ReadInto(target, 4); }));
  EXPECT_EQ(target.Size(), 5u);
  EXPECT_EQ(source.Position(), 7u);

  // Zero bytes: an empty target at 0 that still takes the byte order.
  Fill(empty, {9, 9});
  source.ReadInto(empty, 0);
  EXPECT_EQ(empty.Size(), 0u);
  EXPECT_EQ(empty.Position(), 0u);
  EXPECT_TRUE(empty.SwapBytes());

  // WriteAll ignores the container's position.
  target.SetPosition(3);
  CMemoryContainer copy;
  copy.WriteAll(target);
  copy.WriteAll(empty);
  EXPECT_EQ(Bytes(copy.Data(), copy.Data() + copy.Size()), (Bytes{3, 4, 5, 6, 7}));
}

TEST(CStream, TruncatedSamplesFailWithEndOfData) {
  for (bool swap : {false, true}) {
    const Bytes& full = ExpectedLayout(swap);
    for (std::size_t length = 0; length < full.size(); ++length) {
      CMemoryContainer c;
      Fill(c, Bytes(full.begin(), full.begin() + length));
      c.SetSwapBytes(swap);
      EXPECT_TRUE(FailsWith(kEndOfData, [&] { ExpectSample(c); })) << "length " << length;
    }
  }
}

TEST(CStream, PascalStringsAreALengthByteThenTheCharacters) {
  CMemoryContainer c;
  c.WritePascalString("abc");
  c.WritePascalString("");
  c.WritePascalString(std::string(255, 'z'));
  // Too long for its length byte: refused, nothing written.
  EXPECT_TRUE(
      FailsWith(CStream::kStringTooLongText, [&] { c.WritePascalString(std::string(256, 'z')); }));
  ASSERT_EQ(c.Size(), 4u + 1u + 256u);
  EXPECT_EQ(Bytes(c.Data(), c.Data() + 5), (Bytes{3, 'a', 'b', 'c', 0}));
  EXPECT_EQ(c.Data()[5], 255);

  c.SetPosition(0);
  EXPECT_EQ(c.ReadPascalString(), "abc");
  EXPECT_EQ(c.ReadPascalString(), "");
  EXPECT_EQ(c.ReadPascalString(), std::string(255, 'z'));

  // A length byte that promises more than is there.
  Fill(c, {4, 'a', 'b', 'c'});
  EXPECT_TRUE(FailsWith(kEndOfData, [&] { c.ReadPascalString(); }));
}

// A reader whose steps and lengths come from the data itself, as a damaged
// file would drive a real parser. It runs until the data gives out.
void ParseForever(CStream& s, CMemoryContainer& scratch) {
  for (;;) {
    switch (s.ReadU32() % 5) {
      case 0: {
        Tagged object{};
        s.ReadObject(object);
        break;
      }
      case 1:
        for (std::uint16_t n = s.ReadU16(); n > 0; --n) s.ReadDouble();
        break;
      case 2:
        s.ReadInto(scratch, s.ReadU32());
        break;
      case 3:
        s.SkipRead(s.ReadU32());
        break;
      default:
        s.ReadFloat();
        s.ReadI16();
        s.ReadBool();
        s.ReadU64();
        break;
    }
  }
}

TEST(CStream, RandomBytesThroughADataDrivenReaderEndInEndOfData) {
  std::mt19937 random(20240611);
  std::uniform_int_distribution<int> length(0, 96);
  std::uniform_int_distribution<int> byte(0, 255);
  for (int round = 0; round < 500; ++round) {
    Bytes bytes(static_cast<std::size_t>(length(random)));
    for (auto& b : bytes) b = static_cast<std::uint8_t>(byte(random));
    CMemoryContainer c;
    Fill(c, bytes);
    c.SetSwapBytes(round % 2 == 1);
    CMemoryContainer scratch;
    EXPECT_TRUE(FailsWith(kEndOfData, [&] { ParseForever(c, scratch); })) << "round " << round;
    EXPECT_LE(c.Position(), c.Size());
  }
}

}  // namespace
}  // namespace Tarsa
