// A file's embedded ICC profile is read with the image and written back with
// it, so a CMYK document keeps the colours it was printed for.

#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <vector>

#include "host/io/ImageFile.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using testing::RandomDocument;
using testing::ScratchFolder;

TEST(ColourProfileTest, TiffAndJpegCarryTheProfileBothWays) {
  ScratchFolder folder;
  // Longer than one JPEG marker holds (65519 bytes), so the reader must join
  // the pieces in order. The files do not look inside, so any bytes serve.
  std::vector<uint8_t> profile(150000);
  std::mt19937 random(11);
  for (uint8_t& byte : profile) byte = static_cast<uint8_t>(random());
  for (const char* name : {"cmyk.tif", "cmyk.jpg"}) {
    SCOPED_TRACE(name);
    auto document = RandomDocument(9, 5, ImageMode::kCmyk, false, 3);
    document->SetColourProfile(profile);
    EXPECT_EQ(document->Duplicate()->ColourProfile(), profile);
    ImageFile::Write(*document, folder.File(name));
    EXPECT_EQ(ImageFile::Read(folder.File(name))->ColourProfile(), profile);

    // A document without one is written without one.
    document->SetColourProfile({});
    ImageFile::Write(*document, folder.File(name));
    EXPECT_TRUE(ImageFile::Read(folder.File(name))->ColourProfile().empty());
  }
}

}  // namespace
}  // namespace Host
