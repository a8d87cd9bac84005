#include "host/io/ImageFile.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <csignal>
#include <random>
#include <vector>

#include "host/io/HostError.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using testing::LargestDifference;
using testing::PhotoLikeDocument;
using testing::RandomDocument;
using testing::ReadBytes;
using testing::ScratchFolder;
using testing::WriteBytes;

std::span<const uint8_t> Bytes(const char* text, size_t length) {
  return {reinterpret_cast<const uint8_t*>(text), length};
}

TEST(ImageFileTest, ChoosesFormatsByExtensionAndByContents) {
  EXPECT_EQ(ImageFile::FormatFromName("a/b.TIF"), FileFormat::kTiff);
  EXPECT_EQ(ImageFile::FormatFromName("b.JPEG"), FileFormat::kJpeg);
  EXPECT_EQ(ImageFile::FormatFromName("folder.png/b"), FileFormat::kNone);
  EXPECT_EQ(ImageFile::FormatFromContents(Bytes("MM\0*\0\0\0\x08", 8)), FileFormat::kTiff);
  EXPECT_EQ(ImageFile::FormatFromContents(Bytes("\x89PNG\r\n\x1a\n", 8)), FileFormat::kPng);
  EXPECT_EQ(ImageFile::FormatFromContents(Bytes("\xff\xd8\xff\xe0", 4)), FileFormat::kJpeg);
  EXPECT_EQ(ImageFile::FormatFromContents(Bytes("\x89PNG", 4)), FileFormat::kNone);
}

TEST(ImageFileTest, ReadsByContentsWhateverTheName) {
  ScratchFolder folder;
  auto original = RandomDocument(8, 8, ImageMode::kRgb, false, 5);
  ImageFile::Write(*original, folder.File("really.jpg"), FileFormat::kPng);
  auto copy = ImageFile::Read(folder.File("really.jpg"));
  EXPECT_EQ(copy->SourceFormat(), FileFormat::kPng);
  EXPECT_EQ(LargestDifference(*original, *copy), 0);
}

TEST(ImageFileTest, RefusesWhatAFormatCannotHoldAndWritesNothing) {
  ScratchFolder folder;
  for (const char* name : {"old.png", "old.jpg", "old.gif"}) WriteBytes(folder.File(name), "old");
  const std::string listing = folder.Listing();
  struct Case {
    ImageMode mode;
    bool alpha;
    const char* file;
    const char* says;
  };
  for (const Case& c : {Case{ImageMode::kLab, false, "old.png", "PNG cannot hold Lab 8-bit"},
                        Case{ImageMode::kCmyk64, false, "old.png", "PNG cannot hold CMYK 16-bit"},
                        Case{ImageMode::kRgb48, false, "old.jpg", "JPEG cannot hold RGB 16-bit"},
                        Case{ImageMode::kRgb, true, "old.jpg", "JPEG cannot hold transparency"},
                        Case{ImageMode::kLab, false, "old.jpg", "cannot hold Lab"},
                        Case{ImageMode::kRgb, false, "old.gif", "format to write is unknown"}}) {
    try {
      ImageFile::Write(*HostDocument::Create(4, 4, c.mode, c.alpha), folder.File(c.file));
      ADD_FAILURE() << ModeName(c.mode) << " was written to " << c.file;
    } catch (const HostError& error) {
      EXPECT_NE(std::string(error.what()).find(c.says), std::string::npos) << error.what();
      EXPECT_EQ(error.Path(), folder.File(c.file));
    }
  }
  EXPECT_EQ(folder.Listing(), listing);
  for (const char* name : {"old.png", "old.jpg", "old.gif"}) {
    EXPECT_EQ(ReadBytes(folder.File(name)), "old");
  }
}

// Makes every write past `bytes` into a file fail, as a full disk would,
// while alive.
class FileSizeLimit {
 public:
  explicit FileSizeLimit(rlim_t bytes) {
    getrlimit(RLIMIT_FSIZE, &old_);
    oldHandler_ = std::signal(SIGXFSZ, SIG_IGN);
    rlimit limited = old_;
    limited.rlim_cur = bytes;
    setrlimit(RLIMIT_FSIZE, &limited);
  }
  ~FileSizeLimit() {
    setrlimit(RLIMIT_FSIZE, &old_);
    std::signal(SIGXFSZ, oldHandler_);
  }

 private:
  rlimit old_;
  void (*oldHandler_)(int);
};

TEST(ImageFileTest, FailedWriteLeavesTheOldFileAndNoTemporary) {
  ScratchFolder folder;
  // Noise does not compress: each file is far above the 16 KiB limit.
  auto document = RandomDocument(300, 200, ImageMode::kRgb, false, 9);
  for (const char* name : {"old.tif", "old.png", "old.jpg"}) {
    SCOPED_TRACE(name);
    WriteBytes(folder.File(name), "old contents");
    const std::string listing = folder.Listing();
    {
      FileSizeLimit limit(16 * 1024);
      EXPECT_THROW(ImageFile::Write(*document, folder.File(name)), HostError);
    }
    EXPECT_EQ(ReadBytes(folder.File(name)), "old contents");
    EXPECT_EQ(folder.Listing(), listing);
  }
}

TEST(ImageFileTest, ReplacesAFileWholeAndKeepsItsPermissions) {
  ScratchFolder folder;
  const std::string path = folder.File("photo.tif");
  ImageFile::Write(*RandomDocument(16, 16, ImageMode::kRgb, false, 1), path);
  ASSERT_EQ(chmod(path.c_str(), 0640), 0);
  // Read a file and write the result over it, as the host does in place.
  auto document = ImageFile::Read(path);
  document->SetSample(0, 3, 3, 77);
  ImageFile::Write(*document, path);
  EXPECT_EQ(ImageFile::Read(path)->Sample(0, 3, 3), 77);
  struct stat info;
  ASSERT_EQ(stat(path.c_str(), &info), 0);
  EXPECT_EQ(info.st_mode & 0777, 0640u);
  EXPECT_EQ(folder.Listing(), "photo.tif\n");
}

TEST(ImageFileTest, WideImagesRoundTrip) {
  // 40000 columns overflow 16-bit coordinates and make long rows.
  ScratchFolder folder;
  for (const char* name : {"wide.tif", "wide.png", "wide.jpg"}) {
    SCOPED_TRACE(name);
    const bool jpeg = std::string(name) == "wide.jpg";
    auto original = jpeg ? PhotoLikeDocument(40000, 2, ImageMode::kRgb, 4)
                         : RandomDocument(40000, 2, ImageMode::kRgb48, true, 4);
    WriteOptions best;
    best.jpegQuality = 100;
    ImageFile::Write(*original, folder.File(name), best);
    auto copy = ImageFile::Read(folder.File(name));
    ASSERT_EQ(copy->Width(), 40000);
    ASSERT_EQ(copy->Height(), 2);
    // JPEG: the same bound as for smaller images at quality 100.
    EXPECT_LE(LargestDifference(*original, *copy), jpeg ? 6 : 0);
  }
}

TEST(ImageFileTest, MissingEmptyAndFolderPathsAreRefusedByName) {
  ScratchFolder folder;
  WriteBytes(folder.File("empty.png"), "");
  for (const std::string& path :
       {folder.File("missing.tif"), folder.File("empty.png"), folder.File("")}) {
    try {
      ImageFile::Read(path);
      ADD_FAILURE() << path << " was read";
    } catch (const HostError& error) {
      EXPECT_EQ(error.Path(), path);
    }
  }
}

// Valid files of each format, for spoiling.
std::vector<std::string> SampleFiles(const ScratchFolder& folder) {
  std::vector<std::string> files;
  auto rgb = PhotoLikeDocument(64, 48, ImageMode::kRgb, 11);
  auto lab = RandomDocument(40, 30, ImageMode::kLab48, true, 12);
  WriteOptions plain;
  plain.tiffCompression = TiffCompression::kNone;
  ImageFile::Write(*rgb, folder.File("plain.tif"), plain);
  ImageFile::Write(*lab, folder.File("deflate.tif"));
  ImageFile::Write(*rgb, folder.File("image.png"));
  ImageFile::Write(*rgb, folder.File("image.jpg"));
  for (const char* name : {"plain.tif", "deflate.tif", "image.png", "image.jpg"}) {
    files.push_back(ReadBytes(folder.File(name)));
  }
  return files;
}

TEST(ImageFileTest, CutNoisyAndDamagedFilesFailCleanly) {
  ScratchFolder folder;
  const std::string path = folder.File("spoiled");
  std::mt19937 random(4321);
  std::uniform_int_distribution<int> byte(0, 255);
  int refused = 0;
  for (const std::string& bytes : SampleFiles(folder)) {
    // Cut anywhere: refused.
    const size_t n = bytes.size();
    for (size_t length :
         {size_t{0}, size_t{3}, size_t{20}, size_t{200}, n / 4, n / 2, n * 3 / 4, n - 1}) {
      WriteBytes(path, bytes.substr(0, length));
      EXPECT_THROW(ImageFile::Read(path), HostError) << "cut to " << length << " of " << n;
    }
    // Bytes overwritten anywhere, headers included: read (JPEG data can absorb
    // it) or refused; any other exception or a crash fails the test.
    std::uniform_int_distribution<size_t> at(0, n - 1);
    for (int i = 0; i < 60; ++i) {
      std::string damaged = bytes;
      for (int k = 1 + static_cast<int>(random() % 8); k > 0; --k) {
        damaged[at(random)] = static_cast<char>(byte(random));
      }
      WriteBytes(path, damaged);
      try {
        ImageFile::Read(path);
      } catch (const HostError&) {
        ++refused;
      }
    }
  }
  EXPECT_GT(refused, 0);
  // Noise alone, and noise behind each format's signature: refused.
  using namespace std::string_literals;  // the TIFF signatures hold zero bytes
  for (const std::string& signature :
       {""s, "II*\0"s, "MM\0*"s, "\x89PNG\r\n\x1a\n"s, "\xff\xd8\xff"s}) {
    for (int i = 0; i < 40; ++i) {
      std::string bytes = signature;
      for (size_t k = 1 + random() % 5000; k > 0; --k)
        bytes.push_back(static_cast<char>(byte(random)));
      WriteBytes(path, bytes);
      EXPECT_THROW(ImageFile::Read(path), HostError) << "signature " << signature.size();
    }
  }
}

}  // namespace
}  // namespace Host
