#include <gtest/gtest.h>

#include <array>

#include "framework/core/CException.h"
#include "framework/icons/CPNGFormat.h"
#include "tests/framework/icons/ContactSheet.h"

namespace Tarsa::testing {
namespace {

using Bytes = std::vector<std::uint8_t>;

// 3 by 2 pixels, each different, with alpha from clear to opaque.
Bytes SmallPng() {
  const Bytes rgba = {200, 100, 50, 128, 0,   0,   0,   0,   10, 20, 30,  255,  //
                      1,   2,   3,  4,   255, 255, 255, 255, 0,  90, 180, 64};
  return PngOfRgba(3, 2, rgba);
}

std::uint32_t Crc32(const std::uint8_t* data, std::size_t size) {
  std::uint32_t crc = 0xFFFFFFFF;
  for (std::size_t i = 0; i < size; ++i) {
    crc ^= data[i];
    for (int bit = 0; bit < 8; ++bit) crc = (crc >> 1) ^ (0xEDB88320 & (0 - (crc & 1)));
  }
  return ~crc;
}

void PutU32BigEndian(Bytes& bytes, std::size_t at, std::uint32_t value) {
  for (int i = 0; i < 4; ++i) bytes[at + i] = static_cast<std::uint8_t>(value >> (24 - 8 * i));
}

// The header chunk restated with a new size and a matching checksum, so
// that only the stated size is wrong.
Bytes WithStatedSize(Bytes png, std::uint32_t width, std::uint32_t height) {
  PutU32BigEndian(png, 16, width);
  PutU32BigEndian(png, 20, height);
  PutU32BigEndian(png, 29, Crc32(png.data() + 12, 17));
  return png;
}

TEST(PNGFormat, DecodesToStraightRgbaInMemoryOrder) {
  const Bytes png = SmallPng();
  ASSERT_TRUE(CPNGFormat::HasSignature(png));
  const auto pixmap = CPNGFormat::Decode(png);
  ASSERT_EQ(pixmap->Bounds().Width(), 3);
  ASSERT_EQ(pixmap->Bounds().Height(), 2);
  ASSERT_EQ(pixmap->Planes(), 4u);
  const std::uint8_t* first = pixmap->Data();
  EXPECT_EQ((std::array{first[0], first[1], first[2], first[3]}),
            (std::array<std::uint8_t, 4>{200, 100, 50, 128}));
  const std::uint8_t* last = pixmap->Data() + pixmap->RowBytes() + 8;
  EXPECT_EQ((std::array{last[0], last[1], last[2], last[3]}),
            (std::array<std::uint8_t, 4>{0, 90, 180, 64}));
}

TEST(PNGFormat, RefusesWhatIsNoWholePng) {
  const Bytes png = SmallPng();
  EXPECT_THROW(CPNGFormat::Decode(Bytes{}), CError);
  EXPECT_THROW(CPNGFormat::Decode(Bytes{'G', 'I', 'F', '8', '9', 'a', 0, 0}), CError);
  EXPECT_THROW(CPNGFormat::Decode(Bytes(png.begin(), png.begin() + 8)), CError);
  for (const std::size_t keep : {png.size() / 2, png.size() - 13}) {
    EXPECT_THROW(CPNGFormat::Decode(Bytes(png.begin(), png.begin() + keep)), CError) << keep;
  }
  Bytes damaged = png;
  damaged[png.size() - 20] ^= 0x5A;  // inside the pixel data
  EXPECT_THROW(CPNGFormat::Decode(damaged), CError);
}

// A file that states a vast image is refused before its pixels are
// allocated; the sanitizer run would report the allocation otherwise.
TEST(PNGFormat, RefusesStatedSizesAboveTheLimit) {
  const Bytes png = SmallPng();
  EXPECT_THROW(CPNGFormat::Decode(WithStatedSize(png, 1000000, 1000000)), CError);
  EXPECT_THROW(CPNGFormat::Decode(WithStatedSize(png, 0x7FFFFFFF, 1)), CError);
  EXPECT_THROW(CPNGFormat::Decode(WithStatedSize(png, 0, 2)), CError);
  EXPECT_THROW(CPNGFormat::Decode(png, 2), CError);
  EXPECT_NO_THROW(CPNGFormat::Decode(png, 3));
}

}  // namespace
}  // namespace Tarsa::testing
