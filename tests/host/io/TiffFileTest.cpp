#include "host/io/TiffFile.h"

#include <gtest/gtest.h>
#include <tiffio.h>

#include <cmath>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/ImageFile.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using testing::LargestDifference;
using testing::RandomDocument;
using testing::ScratchFolder;

// A TIFF laid out by hand with libtiff, to test the reader against files it
// did not write. Samples are given interleaved, as unsigned file values.
struct RawTiff {
  RawTiff(uint32_t width, uint32_t height, uint16_t bits, uint16_t samples = 1,
          uint16_t photometric = PHOTOMETRIC_MINISBLACK)
      : width(width), height(height), bits(bits), samples(samples), photometric(photometric) {}
  uint32_t width;
  uint32_t height;
  uint16_t bits;
  uint16_t samples;
  uint16_t photometric;
  uint16_t planar = PLANARCONFIG_CONTIG;
  uint32_t tile = 0;                        // tile side; 0 for strips
  uint32_t strip = 7;                       // rows per strip
  int extraType = -1;                       // EXTRASAMPLE_*, or none
  uint16_t compression = COMPRESSION_NONE;  // JPEG: from RGB at quality 95
  std::vector<uint16_t> colourMap;
};

void WriteRawTiff(const std::string& path, const RawTiff& shape,
                  const std::vector<uint32_t>& values) {
  TIFF* tiff = TIFFOpen(path.c_str(), "w");
  ASSERT_NE(tiff, nullptr);
  TIFFSetField(tiff, TIFFTAG_IMAGEWIDTH, shape.width);
  TIFFSetField(tiff, TIFFTAG_IMAGELENGTH, shape.height);
  TIFFSetField(tiff, TIFFTAG_BITSPERSAMPLE, shape.bits);
  TIFFSetField(tiff, TIFFTAG_SAMPLESPERPIXEL, shape.samples);
  TIFFSetField(tiff, TIFFTAG_PHOTOMETRIC, shape.photometric);
  TIFFSetField(tiff, TIFFTAG_PLANARCONFIG, shape.planar);
  TIFFSetField(tiff, TIFFTAG_COMPRESSION, shape.compression);
  if (shape.compression == COMPRESSION_JPEG) {
    TIFFSetField(tiff, TIFFTAG_JPEGCOLORMODE, JPEGCOLORMODE_RGB);
    TIFFSetField(tiff, TIFFTAG_JPEGQUALITY, 95);
  }
  if (shape.extraType >= 0) {
    const uint16_t extra[] = {static_cast<uint16_t>(shape.extraType)};
    TIFFSetField(tiff, TIFFTAG_EXTRASAMPLES, 1, extra);
  }
  if (!shape.colourMap.empty()) {
    const size_t n = shape.colourMap.size() / 3;
    TIFFSetField(tiff, TIFFTAG_COLORMAP, shape.colourMap.data(), shape.colourMap.data() + n,
                 shape.colourMap.data() + 2 * n);
  }
  const bool separate = shape.planar == PLANARCONFIG_SEPARATE;
  const uint32_t blockWidth = shape.tile ? shape.tile : shape.width;
  const uint32_t blockHeight = shape.tile ? shape.tile : shape.strip;
  if (shape.tile) {
    TIFFSetField(tiff, TIFFTAG_TILEWIDTH, shape.tile);
    TIFFSetField(tiff, TIFFTAG_TILELENGTH, shape.tile);
  } else {
    TIFFSetField(tiff, TIFFTAG_ROWSPERSTRIP, blockHeight);
  }
  const int perPixel = separate ? 1 : shape.samples;
  const size_t bytes = shape.bits / 8;
  for (int pass = 0; pass < (separate ? shape.samples : 1); ++pass) {
    for (uint32_t top = 0; top < shape.height; top += blockHeight) {
      for (uint32_t left = 0; left < shape.width; left += blockWidth) {
        std::vector<uint8_t> block(blockWidth * blockHeight * perPixel * bytes, 0);
        for (uint32_t r = 0; r < blockHeight && top + r < shape.height; ++r) {
          for (uint32_t c = 0; c < blockWidth && left + c < shape.width; ++c) {
            for (int k = 0; k < perPixel; ++k) {
              const size_t pixel = static_cast<size_t>(top + r) * shape.width + left + c;
              const uint32_t v = values[pixel * shape.samples + (separate ? pass : k)];
              const size_t at = (static_cast<size_t>(r) * blockWidth + c) * perPixel + k;
              if (bytes == 2) {
                reinterpret_cast<uint16_t*>(block.data())[at] = static_cast<uint16_t>(v);
              } else {
                block[at] = static_cast<uint8_t>(v);
              }
            }
          }
        }
        // Whole blocks even at the bottom edge; readers ignore the excess.
        const uint16_t sample = static_cast<uint16_t>(pass);
        const auto size = static_cast<tmsize_t>(block.size());
        const tmsize_t written =
            shape.tile ? TIFFWriteEncodedTile(tiff, TIFFComputeTile(tiff, left, top, 0, sample),
                                              block.data(), size)
                       : TIFFWriteEncodedStrip(tiff, TIFFComputeStrip(tiff, top, sample),
                                               block.data(), size);
        ASSERT_EQ(written, size);
      }
    }
  }
  TIFFClose(tiff);
}

// The samples of a contiguous, stripped TIFF, interleaved.
std::vector<uint32_t> ReadRawTiff(const std::string& path) {
  TIFF* tiff = TIFFOpen(path.c_str(), "r");
  EXPECT_NE(tiff, nullptr);
  if (tiff == nullptr) return {};
  uint32_t width = 0;
  uint32_t height = 0;
  uint16_t bits = 0;
  uint16_t samples = 0;
  TIFFGetField(tiff, TIFFTAG_IMAGEWIDTH, &width);
  TIFFGetField(tiff, TIFFTAG_IMAGELENGTH, &height);
  TIFFGetField(tiff, TIFFTAG_BITSPERSAMPLE, &bits);
  TIFFGetField(tiff, TIFFTAG_SAMPLESPERPIXEL, &samples);
  std::vector<uint8_t> row(TIFFScanlineSize(tiff));
  std::vector<uint32_t> values;
  for (uint32_t y = 0; y < height; ++y) {
    TIFFReadScanline(tiff, row.data(), y, 0);
    for (size_t i = 0; i < static_cast<size_t>(width) * samples; ++i) {
      values.push_back(bits == 16 ? reinterpret_cast<uint16_t*>(row.data())[i] : row[i]);
    }
  }
  TIFFClose(tiff);
  return values;
}

// File 16-bit value to host, computed independently of the code under test.
int HostOf(double file) { return static_cast<int>(std::lround(file * 32768.0 / 65535.0)); }

constexpr ImageMode kAllModes[] = {ImageMode::kGray,  ImageMode::kRgb,    ImageMode::kCmyk,
                                   ImageMode::kLab,   ImageMode::kGray16, ImageMode::kRgb48,
                                   ImageMode::kLab48, ImageMode::kCmyk64};

TEST(TiffFileTest, EveryModeDepthTransparencyAndCompressionRoundTripsExactly) {
  ScratchFolder folder;
  uint32_t seed = 1;
  for (ImageMode mode : kAllModes) {
    for (bool alpha : {false, true}) {
      for (TiffCompression compression :
           {TiffCompression::kNone, TiffCompression::kLzw, TiffCompression::kDeflate}) {
        SCOPED_TRACE(std::string(ModeName(mode)) + (alpha ? " with alpha" : "") + " compression " +
                     std::to_string(static_cast<int>(compression)));
        auto original = RandomDocument(37, 23, mode, alpha, seed++);
        original->SetResolution(300, 150.5);
        const std::string path = folder.File("image.tif");
        WriteOptions options;
        options.tiffCompression = compression;
        ImageFile::Write(*original, path, options);
        auto copy = ImageFile::Read(path);
        EXPECT_EQ(LargestDifference(*original, *copy), 0);
        EXPECT_EQ(copy->ResolutionX(), 300);
        EXPECT_EQ(copy->ResolutionY(), 150.5);
        EXPECT_EQ(copy->SourcePath(), path);
        EXPECT_EQ(copy->SourceFormat(), FileFormat::kTiff);
      }
    }
  }
}

TEST(TiffFileTest, EverySixteenBitHostValueSurvivesEachCoding) {
  // One row holding 0..32768 in every plane: gray is direct, CMYK inverted,
  // Lab a and b signed; each must come back unchanged.
  ScratchFolder folder;
  for (ImageMode mode : {ImageMode::kGray16, ImageMode::kCmyk64, ImageMode::kLab48}) {
    auto original = HostDocument::Create(32769, 1, mode, true);
    for (int p = 0; p < original->PlaneCount(); ++p) {
      for (int x = 0; x <= 32768; ++x) original->SetSample(p, x, 0, x);
    }
    ImageFile::Write(*original, folder.File("ramp.tif"));
    EXPECT_EQ(LargestDifference(*original, *ImageFile::Read(folder.File("ramp.tif"))), 0)
        << ModeName(mode);
  }
}

TEST(TiffFileTest, SixteenBitSamplesAreScaledToTheFilesFullRange) {
  ScratchFolder folder;
  auto document = HostDocument::Create(5, 1, ImageMode::kGray16);
  const int host[] = {0, 1, 16384, 32767, 32768};
  for (int x = 0; x < 5; ++x) document->SetSample(0, x, 0, host[x]);
  ImageFile::Write(*document, folder.File("gray.tif"));
  // By hand: round(h * 65535 / 32768); 1 -> 1.99997 -> 2, 32767 -> 65533.00003.
  EXPECT_EQ(ReadRawTiff(folder.File("gray.tif")),
            (std::vector<uint32_t>{0, 2, 32768, 65533, 65535}));

  // And from file to host: round(f * 32768 / 65535).
  RawTiff shape(6, 1, 16);
  WriteRawTiff(folder.File("raw.tif"), shape, {0, 1, 2, 32768, 65534, 65535});
  auto read = ImageFile::Read(folder.File("raw.tif"));
  const int expected[] = {0, 1, 1, 16384, 32767, 32768};
  for (int x = 0; x < 6; ++x) EXPECT_EQ(read->Sample(0, x, 0), expected[x]) << x;
}

TEST(TiffFileTest, LabAAndBAreSignedInTheFile) {
  ScratchFolder folder;
  auto lab = HostDocument::Create(3, 1, ImageMode::kLab);
  const int host8[3][3] = {{255, 128, 128}, {0, 0, 255}, {100, 100, 200}};
  for (int x = 0; x < 3; ++x) {
    for (int p = 0; p < 3; ++p) lab->SetSample(p, x, 0, host8[x][p]);
  }
  ImageFile::Write(*lab, folder.File("lab8.tif"));
  const std::vector<uint32_t> raw8 = ReadRawTiff(folder.File("lab8.tif"));
  std::vector<int> file8;
  for (size_t i = 0; i < raw8.size(); ++i) {
    file8.push_back(i % 3 == 0 ? static_cast<int>(raw8[i]) : static_cast<int8_t>(raw8[i]));
  }
  // L as is; a and b less 128, as two's complement bytes.
  EXPECT_EQ(file8, (std::vector<int>{255, 0, 0, 0, -128, 127, 100, -28, 72}));

  // From a file written by hand: 8-bit (128, -5, 7) and 16-bit (65535, -3, 32767).
  RawTiff shape8(1, 1, 8, 3, PHOTOMETRIC_CIELAB);
  WriteRawTiff(folder.File("in8.tif"), shape8, {128, static_cast<uint8_t>(-5), 7});
  auto in8 = ImageFile::Read(folder.File("in8.tif"));
  EXPECT_EQ(in8->Mode(), ImageMode::kLab);
  EXPECT_EQ(in8->Sample(0, 0, 0), 128);
  EXPECT_EQ(in8->Sample(1, 0, 0), 123);
  EXPECT_EQ(in8->Sample(2, 0, 0), 135);
  RawTiff shape16 = shape8;
  shape16.bits = 16;
  WriteRawTiff(folder.File("in16.tif"), shape16, {65535, static_cast<uint16_t>(-3), 32767});
  auto in16 = ImageFile::Read(folder.File("in16.tif"));
  EXPECT_EQ(in16->Mode(), ImageMode::kLab48);
  EXPECT_EQ(in16->Sample(0, 0, 0), 32768);
  // -3 / 2 = -1.5 rounds up to -1; 32767 / 2 = 16383.5 rounds up to full scale.
  EXPECT_EQ(in16->Sample(1, 0, 0), 16383);
  EXPECT_EQ(in16->Sample(2, 0, 0), 32768);
}

TEST(TiffFileTest, CmykIsInkInTheFileAndPaperInTheHost) {
  ScratchFolder folder;
  auto cmyk = HostDocument::Create(2, 1, ImageMode::kCmyk);  // blank: no ink
  const int inks[] = {0, 55, 200, 255};
  for (int p = 0; p < 4; ++p) cmyk->SetSample(p, 1, 0, inks[p]);
  ImageFile::Write(*cmyk, folder.File("cmyk.tif"));
  EXPECT_EQ(ReadRawTiff(folder.File("cmyk.tif")),
            (std::vector<uint32_t>{0, 0, 0, 0, 255, 200, 55, 0}));
}

TEST(TiffFileTest, ReadsRgbaInEveryPlanarAndTiledLayout) {
  ScratchFolder folder;
  struct Layout {
    uint16_t bits;
    uint16_t planar;
    uint32_t tile;
  };
  for (const Layout& layout :
       {Layout{8, PLANARCONFIG_SEPARATE, 0}, Layout{8, PLANARCONFIG_SEPARATE, 16},
        Layout{8, PLANARCONFIG_CONTIG, 16}, Layout{16, PLANARCONFIG_SEPARATE, 16},
        Layout{16, PLANARCONFIG_CONTIG, 16}, Layout{16, PLANARCONFIG_SEPARATE, 0}}) {
    SCOPED_TRACE(std::to_string(layout.bits) + " bits, planar " + std::to_string(layout.planar) +
                 ", tile " + std::to_string(layout.tile));
    // 40 x 35 does not fill the 16 x 16 tiles or 7-row strips evenly; the
    // alpha sample is unassociated.
    RawTiff shape(40, 35, layout.bits, 4, PHOTOMETRIC_RGB);
    shape.planar = layout.planar;
    shape.tile = layout.tile;
    shape.extraType = EXTRASAMPLE_UNASSALPHA;
    const uint32_t max = layout.bits == 16 ? 65535 : 255;
    std::vector<uint32_t> values;
    for (uint32_t i = 0; i < 40 * 35 * 4; ++i) values.push_back(i * 2731 % (max + 1));
    WriteRawTiff(folder.File("layout.tif"), shape, values);
    auto document = ImageFile::Read(folder.File("layout.tif"));
    ASSERT_EQ(document->Mode(), layout.bits == 16 ? ImageMode::kRgb48 : ImageMode::kRgb);
    ASSERT_TRUE(document->HasTransparency());
    for (uint32_t i = 0; i < values.size(); ++i) {
      const int expected = layout.bits == 16 ? HostOf(values[i]) : static_cast<int>(values[i]);
      ASSERT_EQ(document->Sample(i % 4, i / 4 % 40, i / 160), expected) << "sample " << i;
    }
  }
}

TEST(TiffFileTest, AssociatedAlphaIsDividedOut) {
  ScratchFolder folder;
  // Gray, premultiplied: (60, 120) is 60 * 255 / 120 = 127.5 -> 128; full
  // alpha leaves the sample; zero alpha leaves zero.
  RawTiff shape(3, 1, 8, 2);
  shape.extraType = EXTRASAMPLE_ASSOCALPHA;
  WriteRawTiff(folder.File("assoc8.tif"), shape, {60, 120, 200, 255, 0, 0});
  auto gray = ImageFile::Read(folder.File("assoc8.tif"));
  ASSERT_TRUE(gray->HasTransparency());
  EXPECT_EQ(gray->Sample(0, 0, 0), 128);
  EXPECT_EQ(gray->Sample(0, 1, 0), 200);
  EXPECT_EQ(gray->Sample(0, 2, 0), 0);
  EXPECT_EQ(gray->Sample(1, 0, 0), 120);

  // 16-bit: 1000 at alpha 32768 is 1000 * 65535 / 32768 = 1999.97 -> 2000 in
  // the file's scale, then halved to the host's.
  shape.bits = 16;
  WriteRawTiff(folder.File("assoc16.tif"), shape, {1000, 32768, 40000, 65535, 0, 0});
  auto gray16 = ImageFile::Read(folder.File("assoc16.tif"));
  EXPECT_EQ(gray16->Sample(0, 0, 0), HostOf(2000));
  EXPECT_EQ(gray16->Sample(0, 1, 0), HostOf(40000));
  EXPECT_EQ(gray16->Sample(1, 0, 0), HostOf(32768));
}

TEST(TiffFileTest, ExpandsPalettes) {
  ScratchFolder folder;
  // Palette of four colours; libtiff's colour map runs 0..65535.
  RawTiff palette(4, 2, 8, 1, PHOTOMETRIC_PALETTE);
  palette.colourMap.assign(3 * 256, 0);
  const int colours[4][3] = {{255, 0, 0}, {0, 255, 0}, {10, 20, 30}, {255, 255, 255}};
  for (int i = 0; i < 4; ++i) {
    for (int c = 0; c < 3; ++c) palette.colourMap[c * 256 + i] = colours[i][c] * 257;
  }
  WriteRawTiff(folder.File("palette.tif"), palette, {0, 1, 2, 3, 3, 2, 1, 0});
  auto rgb = ImageFile::Read(folder.File("palette.tif"));
  ASSERT_EQ(rgb->Mode(), ImageMode::kRgb);
  for (int c = 0; c < 3; ++c) {
    EXPECT_EQ(rgb->Sample(c, 2, 0), colours[2][c]);  // top row stays on top
    EXPECT_EQ(rgb->Sample(c, 0, 1), colours[3][c]);
  }
}

// Palettes and low depths are read through libtiff's RGBA interface, which
// passes over a strip it cannot decode unless told to stop: such a file
// was read as sound, its rows left blank.
TEST(TiffFileTest, DamagedDataReadThroughRgbaAreRefused) {
  ScratchFolder folder;
  RawTiff palette(64, 64, 8, 1, PHOTOMETRIC_PALETTE);
  palette.strip = 64;
  palette.compression = COMPRESSION_LZW;
  palette.colourMap.assign(3 * 256, 0);
  for (int i = 0; i < 256; ++i) palette.colourMap[i] = static_cast<uint16_t>(i * 257);
  std::vector<uint32_t> values(64 * 64);
  for (size_t i = 0; i < values.size(); ++i) values[i] = (i * 37 + i / 64 * 11) % 256;
  const std::string path = folder.File("palette.tif");
  WriteRawTiff(path, palette, values);
  ASSERT_NO_THROW(ImageFile::Read(path));
  // The strip's codes, which follow the 8-byte header, garbled.
  std::string bytes = testing::ReadBytes(path);
  for (size_t i = 12; i < 60; ++i) bytes[i] = '\xff';
  testing::WriteBytes(path, bytes);
  EXPECT_THROW(ImageFile::Read(path), HostError);
}

TEST(TiffFileTest, ReadsJpegCompressedYCbCr) {
  ScratchFolder folder;
  // Flat 16 x 16 colour blocks: JPEG keeps each block's mean to a level or two.
  const int colours[2][3] = {{200, 40, 90}, {20, 220, 140}};
  RawTiff shape(32, 16, 8, 3, PHOTOMETRIC_YCBCR);
  shape.compression = COMPRESSION_JPEG;
  shape.strip = 16;
  std::vector<uint32_t> values;
  for (int i = 0; i < 32 * 16 * 3; ++i) values.push_back(colours[i / 3 % 32 / 16][i % 3]);
  WriteRawTiff(folder.File("ycbcr.tif"), shape, values);
  auto rgb = ImageFile::Read(folder.File("ycbcr.tif"));
  ASSERT_EQ(rgb->Mode(), ImageMode::kRgb);
  for (int c = 0; c < 3; ++c) {
    // Quantisation of a flat block's mean, plus YCbCr rounding: a few levels.
    EXPECT_NEAR(rgb->Sample(c, 4, 4), colours[0][c], 3);
    EXPECT_NEAR(rgb->Sample(c, 27, 11), colours[1][c], 3);
  }
}

}  // namespace
}  // namespace Host
