#include "host/io/PngFile.h"

#include <gtest/gtest.h>
#include <png.h>

#include <csetjmp>
#include <cstdio>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/ImageFile.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using testing::LargestDifference;
using testing::RandomDocument;
using testing::ScratchFolder;

// A PNG laid out by hand with libpng, to test the reader against files it did
// not write. Rows are given as the file stores them: packed, big-endian.
struct RawPng {
  png_uint_32 width;
  png_uint_32 height;
  int bitDepth;
  int colourType;
  std::vector<std::vector<png_byte>> rows;
  bool interlaced = false;
  std::vector<png_color> palette = {};
  std::vector<png_byte> transparency = {};  // per palette entry
};

void OnRawError(png_structp png, png_const_charp) { png_longjmp(png, 1); }

// Plain C-style: nothing with a destructor lives across the jump.
bool WriteRawPngTo(std::FILE* file, const RawPng& shape, png_bytepp rows) {
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, OnRawError, nullptr);
  png_infop info = png_create_info_struct(png);
  if (setjmp(png_jmpbuf(png))) {
    png_destroy_write_struct(&png, &info);
    return false;
  }
  png_init_io(png, file);
  png_set_IHDR(png, info, shape.width, shape.height, shape.bitDepth, shape.colourType,
               shape.interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE,
               PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  if (!shape.palette.empty()) {
    png_set_PLTE(png, info, shape.palette.data(), static_cast<int>(shape.palette.size()));
  }
  if (!shape.transparency.empty()) {
    png_set_tRNS(png, info, shape.transparency.data(), static_cast<int>(shape.transparency.size()),
                 nullptr);
  }
  png_write_info(png, info);
  png_write_image(png, rows);
  png_write_end(png, info);
  png_destroy_write_struct(&png, &info);
  return true;
}

// Writes the file and reads it back through the code under test.
std::unique_ptr<HostDocument> ReadRawPng(const ScratchFolder& folder, RawPng shape) {
  std::vector<png_bytep> rows;
  for (auto& row : shape.rows) rows.push_back(row.data());
  std::FILE* file = std::fopen(folder.File("raw.png").c_str(), "wb");
  EXPECT_NE(file, nullptr);
  const bool written = WriteRawPngTo(file, shape, rows.data());
  std::fclose(file);
  EXPECT_TRUE(written);
  return ImageFile::Read(folder.File("raw.png"));
}

TEST(PngFileTest, GrayAndRgbAtBothDepthsRoundTripExactly) {
  ScratchFolder folder;
  uint32_t seed = 100;
  for (ImageMode mode :
       {ImageMode::kGray, ImageMode::kRgb, ImageMode::kGray16, ImageMode::kRgb48}) {
    for (bool alpha : {false, true}) {
      SCOPED_TRACE(std::string(ModeName(mode)) + (alpha ? " with alpha" : ""));
      auto original = RandomDocument(29, 17, mode, alpha, seed++);
      original->SetResolution(300, 96);
      ImageFile::Write(*original, folder.File("image.png"));
      auto copy = ImageFile::Read(folder.File("image.png"));
      EXPECT_EQ(LargestDifference(*original, *copy), 0);
      EXPECT_EQ(copy->SourceFormat(), FileFormat::kPng);
      // Stored as 11811 and 3780 pixels per metre, read back as whole dpi.
      EXPECT_EQ(copy->ResolutionX(), 300);
      EXPECT_EQ(copy->ResolutionY(), 96);
    }
  }
}

TEST(PngFileTest, ExpandsPalettesLowDepthsAndGrayAlpha) {
  ScratchFolder folder;
  // A 2-bit palette with a half-transparent third entry: pixels 0 1 2 3.
  auto rgba = ReadRawPng(folder, {4,
                                  1,
                                  2,
                                  PNG_COLOR_TYPE_PALETTE,
                                  {{0b00011011}},
                                  false,
                                  {{255, 0, 0}, {0, 255, 0}, {0, 0, 255}, {7, 8, 9}},
                                  {255, 255, 128}});
  ASSERT_EQ(rgba->Mode(), ImageMode::kRgb);
  ASSERT_TRUE(rgba->HasTransparency());
  EXPECT_EQ(rgba->Sample(0, 0, 0), 255);
  EXPECT_EQ(rgba->Sample(2, 2, 0), 255);
  EXPECT_EQ(rgba->Sample(3, 2, 0), 128);
  EXPECT_EQ(rgba->Sample(1, 3, 0), 8);
  EXPECT_EQ(rgba->Sample(3, 3, 0), 255);  // past the tRNS entries: opaque

  // 16-bit gray with alpha, big-endian in the file: 0x0102 = 258 -> 129,
  // 0xffff -> 32768, 0x0001 -> 1 (0.50001 rounds up).
  auto gray16 = ReadRawPng(
      folder, {2, 1, 16, PNG_COLOR_TYPE_GRAY_ALPHA, {{0x01, 0x02, 0xff, 0xff, 0x00, 0x01, 0, 0}}});
  ASSERT_EQ(gray16->Mode(), ImageMode::kGray16);
  ASSERT_TRUE(gray16->HasTransparency());
  EXPECT_EQ(gray16->Sample(0, 0, 0), 129);
  EXPECT_EQ(gray16->Sample(1, 0, 0), 32768);
  EXPECT_EQ(gray16->Sample(0, 1, 0), 1);
  EXPECT_EQ(gray16->Sample(1, 1, 0), 0);
}

TEST(PngFileTest, ReadsInterlacedFiles) {
  ScratchFolder folder;
  // 13 x 11 RGB, a size that leaves some Adam7 passes short.
  std::vector<std::vector<png_byte>> rows(11, std::vector<png_byte>(13 * 3));
  for (int y = 0; y < 11; ++y) {
    for (int i = 0; i < 13 * 3; ++i) rows[y][i] = static_cast<png_byte>(y * 40 + i * 3);
  }
  auto document = ReadRawPng(folder, {13, 11, 8, PNG_COLOR_TYPE_RGB, rows, true});
  ASSERT_EQ(document->Mode(), ImageMode::kRgb);
  for (int y = 0; y < 11; ++y) {
    for (int x = 0; x < 13; ++x) {
      for (int c = 0; c < 3; ++c) {
        ASSERT_EQ(document->Sample(c, x, y), rows[y][x * 3 + c]) << x << "," << y;
      }
    }
  }
}

}  // namespace
}  // namespace Host
