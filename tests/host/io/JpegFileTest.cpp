#include "host/io/JpegFile.h"

#include <gtest/gtest.h>

#include <jpeglib.h>
#include <cstddef>
#include <cstdio>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/ImageFile.h"
#include "tests/host/io/TestImages.h"

namespace Host {
namespace {

using Testing::LargestDifference;
using Testing::PhotoLikeDocument;
using Testing::ScratchFolder;

TEST(JpegFileTest, GrayRgbAndCmykStayCloseAtFullQuality) {
  ScratchFolder folder;
  WriteOptions best;
  best.jpegQuality = 100;
  for (ImageMode mode : {ImageMode::kGray, ImageMode::kRgb, ImageMode::kCmyk}) {
    SCOPED_TRACE(ModeName(mode));
    auto original = PhotoLikeDocument(64, 48, mode, 7);
    original->SetResolution(300, 240);
    ImageFile::Write(*original, folder.File("best.jpg"), best);
    auto copy = ImageFile::Read(folder.File("best.jpg"));
    EXPECT_EQ(copy->Mode(), mode);
    EXPECT_EQ(copy->SourceFormat(), FileFormat::kJpeg);
    // Quality 100 still rounds every DCT coefficient to an integer (about a
    // level); RGB also passes through 8-bit YCbCr, whose chroma errors grow up
    // to 1.772 times on the way back (measured: 1 for gray and CMYK, 4 for RGB).
    EXPECT_LE(LargestDifference(*original, *copy), mode == ImageMode::kRgb ? 6 : 2);
    if (mode != ImageMode::kCmyk) {  // CMYK files carry no JFIF density
      EXPECT_EQ(copy->ResolutionX(), 300);
      EXPECT_EQ(copy->ResolutionY(), 240);
    }

    // Lower quality: a smaller file and a larger error, so the setting is used.
    WriteOptions rough;
    rough.jpegQuality = 30;
    ImageFile::Write(*original, folder.File("rough.jpg"), rough);
    EXPECT_LT(Testing::ReadBytes(folder.File("rough.jpg")).size(),
              Testing::ReadBytes(folder.File("best.jpg")).size());
    EXPECT_GT(LargestDifference(*original, *ImageFile::Read(folder.File("rough.jpg"))),
              LargestDifference(*original, *copy));
  }
}

// Writes CMYK samples with libjpeg as given, without the Adobe marker, the
// way a plain libjpeg program stores ink amounts.
void WritePlainCmykJpeg(const std::string& path, int width, int height,
                        const std::vector<JSAMPLE>& samples) {
  jpeg_compress_struct jpeg;
  jpeg_error_mgr errors;
  jpeg.err = jpeg_std_error(&errors);
  jpeg_create_compress(&jpeg);
  std::FILE* file = std::fopen(path.c_str(), "wb");
  ASSERT_NE(file, nullptr);
  jpeg_stdio_dest(&jpeg, file);
  jpeg.image_width = width;
  jpeg.image_height = height;
  jpeg.input_components = 4;
  jpeg.in_color_space = JCS_CMYK;
  jpeg_set_defaults(&jpeg);
  jpeg_set_quality(&jpeg, 100, TRUE);
  jpeg.write_Adobe_marker = FALSE;
  jpeg_start_compress(&jpeg, TRUE);
  for (int y = 0; y < height; ++y) {
    JSAMPROW row = const_cast<JSAMPLE*>(samples.data()) + static_cast<size_t>(y) * width * 4;
    jpeg_write_scanlines(&jpeg, &row, 1);
  }
  jpeg_finish_compress(&jpeg);
  jpeg_destroy_compress(&jpeg);
  std::fclose(file);
}

TEST(JpegFileTest, CmykWithoutTheAdobeMarkerCountsInk) {
  ScratchFolder folder;
  // Flat ink amounts (one per plate) survive JPEG almost untouched.
  const int ink[4] = {0, 40, 200, 255};
  std::vector<JSAMPLE> samples;
  for (int i = 0; i < 16 * 16; ++i) samples.insert(samples.end(), {0, 40, 200, 255});
  WritePlainCmykJpeg(folder.File("ink.jpg"), 16, 16, samples);
  auto document = ImageFile::Read(folder.File("ink.jpg"));
  ASSERT_EQ(document->Mode(), ImageMode::kCmyk);
  for (int p = 0; p < 4; ++p) {
    // A flat block has only a DC term; its rounding moves a sample by 1 at most.
    EXPECT_NEAR(document->Sample(p, 5, 9), 255 - ink[p], 1) << "plate " << p;
  }
}

}  // namespace
}  // namespace Host
