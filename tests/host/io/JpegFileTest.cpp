#include "host/io/JpegFile.h"

#include <gtest/gtest.h>

#include <jpeglib.h>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/ImageFile.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using testing::LargestDifference;
using testing::PhotoLikeDocument;
using testing::ScratchFolder;

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
    EXPECT_LT(testing::ReadBytes(folder.File("rough.jpg")).size(),
              testing::ReadBytes(folder.File("best.jpg")).size());
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

// A JPEG file in memory: gray, of a busy pattern, baseline or progressive.
std::string GrayJpeg(int side, bool progressive) {
  jpeg_compress_struct jpeg;
  jpeg_error_mgr errors;
  jpeg.err = jpeg_std_error(&errors);
  jpeg_create_compress(&jpeg);
  unsigned char* bytes = nullptr;
  unsigned long size = 0;
  jpeg_mem_dest(&jpeg, &bytes, &size);
  jpeg.image_width = static_cast<JDIMENSION>(side);
  jpeg.image_height = static_cast<JDIMENSION>(side);
  jpeg.input_components = 1;
  jpeg.in_color_space = JCS_GRAYSCALE;
  jpeg_set_defaults(&jpeg);
  if (progressive) jpeg_simple_progression(&jpeg);
  jpeg_start_compress(&jpeg, TRUE);
  std::vector<JSAMPLE> row(static_cast<size_t>(side));
  for (int y = 0; y < side; ++y) {
    for (int x = 0; x < side; ++x) row[x] = static_cast<JSAMPLE>((x * 37 + y * 91) % 256);
    JSAMPROW rows[] = {row.data()};
    jpeg_write_scanlines(&jpeg, rows, 1);
  }
  jpeg_finish_compress(&jpeg);
  std::string file(reinterpret_cast<const char*>(bytes), size);
  jpeg_destroy_compress(&jpeg);
  std::free(bytes);
  return file;
}

void ExpectRefused(const std::string& path, const char* says) {
  try {
    JpegFile::Read(path);
    ADD_FAILURE() << path << " was read";
  } catch (const HostError& error) {
    EXPECT_NE(std::string(error.what()).find(says), std::string::npos) << error.what();
  }
}

// A short file must not stand for a large image: data that end before the
// image does are refused, however the file ends, and so is a progressive
// file of thousands of scans, each a pass over the whole image (past 1000;
// a few scans more than it needs still read).
TEST(JpegFileTest, ScansThatEndEarlyOrNumberThousandsAreRefused) {
  ScratchFolder folder;
  const std::string path = folder.File("damaged.jpg");
  const std::string baseline = GrayJpeg(64, false);
  const size_t scan = baseline.find("\xff\xda");
  ASSERT_NE(scan, std::string::npos);
  const size_t middle = scan + (baseline.size() - scan) / 2;
  testing::WriteBytes(path, baseline.substr(0, middle));
  ExpectRefused(path, "cut short");
  // Closed with the end marker, libjpeg would read the rest as gray.
  testing::WriteBytes(path, baseline.substr(0, middle) + "\xff\xd9");
  ExpectRefused(path, "cut short");

  // The first scan (the DC terms, read the same whatever came before)
  // repeated after itself.
  const std::string progressive = GrayJpeg(16, true);
  const size_t first = progressive.find("\xff\xda");
  const size_t second = progressive.find("\xff\xda", first + 2);
  ASSERT_NE(second, std::string::npos);
  const std::string firstScan = progressive.substr(first, second - first);
  for (const int repeats : {3, 1200}) {
    SCOPED_TRACE(repeats);
    std::string damaged = progressive.substr(0, second);
    for (int i = 0; i < repeats; ++i) damaged += firstScan;
    testing::WriteBytes(path, damaged + progressive.substr(second));
    if (repeats < 1000) {
      EXPECT_NO_THROW(JpegFile::Read(path));
    } else {
      ExpectRefused(path, "scans");
    }
  }
}

}  // namespace
}  // namespace Host
