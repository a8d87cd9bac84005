#include <gtest/gtest.h>

#include <unistd.h>
#include <cmath>
#include <exiv2/exiv2.hpp>
#include <filesystem>
#include <fstream>
#include <numbers>
#include <sstream>
#include <string>

#include "host/io/ImageFile.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/SynthError.h"
#include "tools/synth/lib/TruthFile.h"

namespace Synth {
namespace {

class PhotoFile : public testing::Test {
 protected:
  void SetUp() override {
    folder_ = std::filesystem::temp_directory_path() /
              ("archway-synth-" + std::to_string(::getpid()) + "-" +
               testing::UnitTest::GetInstance()->current_test_info()->name());
    std::filesystem::create_directories(folder_);
  }
  void TearDown() override { std::filesystem::remove_all(folder_); }
  std::string File(const std::string& name) const { return (folder_ / name).string(); }

 private:
  std::filesystem::path folder_;
};

struct Written {
  const char* file;
  ProjectionKind projection;
  Host::ColourModel colour;
  int depth;
  int width, height;
  const char* transformation;  // panorama record, or nullptr for none
};

// Each file reads back through the host with its size and mode, and its
// metadata reads back through the toolkit with the values the CameraSpec
// gave; a lossless file keeps the rendered pixels exactly.
TEST_F(PhotoFile, ReadsBackWithItsMetadata) {
  const Written cases[] = {
      {"cylinder.tif", ProjectionKind::kCylindrical, Host::ColourModel::kRgb, 16, 96, 48,
       "Cylindrical"},
      {"sphere.png", ProjectionKind::kEquirectangular, Host::ColourModel::kGray, 8, 96, 48,
       "Spherical"},
      {"fisheye.jpg", ProjectionKind::kFisheyeEquisolid, Host::ColourModel::kCmyk, 8, 64, 48,
       nullptr},
  };
  for (const Written& c : cases) {
    SCOPED_TRACE(c.file);
    CameraSpec camera;
    camera.projection = c.projection;
    camera.colour = c.colour;
    camera.depth = c.depth;
    camera.width = c.width;
    camera.height = c.height;
    camera.focalMm = 10.5;
    camera.cropFactor = 1.5;
    camera.samplesPerAxis = 1;
    camera.make = "Archway Optics";
    camera.model = "Test Body 300";
    camera.lens = "10.5mm f/2.8 Fisheye";
    const RenderResult photo = Render({SceneKind::kRoom}, camera);
    const std::string path = File(c.file);
    PhotoWriter::Write(photo, camera, path);

    const auto read = Host::ImageFile::Read(path);
    EXPECT_EQ(read->Width(), c.width);
    EXPECT_EQ(read->Height(), c.height);
    EXPECT_EQ(read->Mode(), Host::ModeOf(c.colour, c.depth));
    if (c.projection == ProjectionKind::kCylindrical) {
      for (int plane = 0; plane < 3; ++plane) {
        for (int y = 0; y < c.height; ++y) {
          for (int x = 0; x < c.width; ++x) {
            ASSERT_EQ(read->Sample(plane, x, y), photo.document->Sample(plane, x, y));
          }
        }
      }
    }

    auto image = Exiv2::ImageFactory::open(path);
    image->readMetadata();
    const Exiv2::ExifData& exif = image->exifData();
    auto text = [&](const char* key) {
      const auto found = exif.findKey(Exiv2::ExifKey(key));
      return found == exif.end() ? std::string("(absent)") : found->toString();
    };
    EXPECT_EQ(text("Exif.Image.Make"), "Archway Optics");
    EXPECT_EQ(text("Exif.Image.Model"), "Test Body 300");
    EXPECT_EQ(text("Exif.Photo.LensModel"), "10.5mm f/2.8 Fisheye");
    EXPECT_EQ(text("Exif.Photo.FocalLength"), "1050/100");
    EXPECT_EQ(text("Exif.Photo.FocalLengthIn35mmFilm"), "16");  // 15.75, rounded
    EXPECT_EQ(text("Exif.Photo.PixelXDimension"), std::to_string(c.width));
    EXPECT_EQ(text("Exif.Photo.PixelYDimension"), std::to_string(c.height));

    // The panorama record, found by its namespace URI in the packet itself.
    const std::string& packet = image->xmpPacket();
    const std::string uri = std::string("xmlns:panorama=\"") + PhotoWriter::kPanoramaNamespace;
    ASSERT_EQ(packet.find(uri) != std::string::npos, c.transformation != nullptr) << packet;
    if (!c.transformation) continue;
    const Exiv2::XmpData& xmp = image->xmpData();
    auto value = [&](const char* key) {
      const auto found = xmp.findKey(Exiv2::XmpKey(key));
      return found == xmp.end() ? -1.0 : std::stod(found->toString());
    };
    EXPECT_EQ(xmp.findKey(Exiv2::XmpKey("Xmp.panorama.Transformation"))->toString(),
              c.transformation);
    // Fractions of the longer side (96), written with nine digits.
    const double focal = c.projection == ProjectionKind::kEquirectangular
                             ? 48 / std::numbers::pi
                             : 10.5 * 1.5 * std::hypot(96, 48) / std::hypot(36, 24);
    EXPECT_NEAR(value("Xmp.panorama.VirtualFocalLength"), focal / 96, 1e-8);
    EXPECT_NEAR(value("Xmp.panorama.VirtualImageXCenter"), 0.5, 1e-8);
    EXPECT_NEAR(value("Xmp.panorama.VirtualImageYCenter"), 0.25, 1e-8);
  }
}

TEST_F(PhotoFile, RefusesWhatNoFileCanHold) {
  CameraSpec camera;
  camera.width = 8;
  camera.height = 8;
  camera.depth = 16;
  const RenderResult photo = Render({SceneKind::kChecker}, camera);
  EXPECT_THROW(PhotoWriter::Write(photo, camera, File("deep.jpg")), SynthError);
  EXPECT_THROW(PhotoWriter::Write(photo, camera, File("picture.bmp")), SynthError);
  EXPECT_TRUE(std::filesystem::is_empty(File("")));  // and leaves nothing behind
}

// The truth file's lines hold what the truth in memory holds.
TEST_F(PhotoFile, TruthFileListsEverySegment) {
  CameraSpec camera;
  camera.width = 120;
  camera.height = 80;
  camera.samplesPerAxis = 1;
  const RenderResult photo = Render({SceneKind::kChecker}, camera);
  TruthFile::Write(photo, File("board.lines"));
  std::ifstream in(File("board.lines"));
  std::string line;
  size_t segment = 0;
  while (std::getline(in, line)) {
    if (line.starts_with("#")) continue;
    ASSERT_LT(segment, photo.truth.size());
    const TruthSegment& truth = photo.truth[segment++];
    std::istringstream fields(line);
    std::string id;
    Vec3 start;
    Vec3 end;
    size_t count = 0;
    fields >> id >> start.x >> start.y >> start.z >> end.x >> end.y >> end.z >> count;
    EXPECT_EQ(id, truth.id);
    EXPECT_LT(Length(start - truth.start) + Length(end - truth.end), 1e-7);  // nine digits
    ASSERT_EQ(count, truth.points.size());
    for (const Point2& point : truth.points) {
      Point2 read;
      fields >> read.x >> read.y;
      EXPECT_NEAR(read.x, point.x, 1e-4);  // four decimals
      EXPECT_NEAR(read.y, point.y, 1e-4);  // as above
    }
    EXPECT_TRUE(fields && (fields >> std::ws).eof()) << id;
  }
  EXPECT_EQ(segment, photo.truth.size());
}

}  // namespace
}  // namespace Synth
