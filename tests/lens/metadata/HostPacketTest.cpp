#include <gtest/gtest.h>

#include <exiv2/exiv2.hpp>

#include <memory>
#include <string>

#include "framework/plugin/CQuillmarkPlugin.h"
#include "host/io/HostDocument.h"
#include "host/io/ImageFile.h"
#include "host/plugin/HostRecord.h"
#include "lens/metadata/PXmpMeta.h"
#include "lens/metadata/PhotoInfo.h"
#include "tests/support/TestSupport.h"

namespace Project::testing {
namespace {

// The module's side of the host's property callbacks, over one record.
class RecordPlugin : public Tarsa::CQuillmarkPlugin {
 public:
  explicit RecordPlugin(Tarsa::HostFilterRecord* record) : record_(record) {}
  Tarsa::HostFilterRecord* HostRecord() const override { return record_; }

 private:
  Tarsa::HostFilterRecord* record_;
};

class QuietObserver : public Host::RunObserver {
  bool AbortRequested() override { return false; }
  void Progress(int32_t, int32_t) override {}
};

// The photo as the module loads it from a document read from path (null:
// a document made in memory).
PhotoInfo LoadThroughHost(const std::string* path) {
  std::unique_ptr<Host::HostDocument> document =
      path != nullptr ? Host::ImageFile::Read(*path)
                      : Host::HostDocument::Create(60, 40, Host::ImageMode::kRgb);
  QuietObserver observer;
  Host::HostRecord served(*document, {}, observer);
  Host::HostRecord::Scope scope(served);
  RecordPlugin plugin(served.Record());
  PhotoInfo info;
  info.Load(plugin, std::uint32_t(document->Width()), std::uint32_t(document->Height()));
  return info;
}

TEST(HostPacketTest, ExifAndEmbeddedXmpOfAnImageFileReachThePhoto) {
  Tarsa::testing::ScratchFolder folder;
  const std::string path = folder.File("photo.jpg");
  Host::ImageFile::Write(*Host::HostDocument::Create(60, 40, Host::ImageMode::kRgb), path);
  {
    auto image = Exiv2::ImageFactory::open(path);
    image->readMetadata();
    Exiv2::ExifData& exif = image->exifData();
    exif["Exif.Image.Make"] = "Canon ";
    exif["Exif.Image.Model"] = "Canon EOS 40D";
    exif["Exif.Photo.FocalLength"] = Exiv2::Rational(10, 1);
    exif["Exif.Photo.ISOSpeedRatings"] = uint16_t(200);
    exif["Exif.Photo.LensModel"] = "EF-S10-22mm f/3.5-4.5 USM";
    Exiv2::XmpProperties::registerNs(PXmpMeta::kPanoramaNamespace, "panorama");
    Exiv2::XmpData& xmp = image->xmpData();
    xmp["Xmp.panorama.Transformation"] = "Cylindrical";
    xmp["Xmp.panorama.VirtualFocalLength"] = "0.5";
    xmp["Xmp.panorama.VirtualImageXCenter"] = "0.5";
    xmp["Xmp.panorama.VirtualImageYCenter"] = "0.25";
    image->writeMetadata();
  }
  const PhotoInfo info = LoadThroughHost(&path);
  EXPECT_EQ(info.GetMake(), "Canon");
  EXPECT_EQ(info.GetModel(), "Canon EOS 40D");
  EXPECT_EQ(info.GetLens(), "EF-S10-22mm f/3.5-4.5 USM");
  EXPECT_FLOAT_EQ(info.GetFocalLength(), 10.0f);
  EXPECT_EQ(info.GetIsoSpeed(), 200u);
  EXPECT_FLOAT_EQ(info.GetCropFactor(), 1.6f);  // a camera of the table
  EXPECT_TRUE(info.HasPanorama());
  EXPECT_FLOAT_EQ(info.GetVirtualFocalLength(), 30.0f);
  EXPECT_FLOAT_EQ(info.GetVirtualCenterY(), 15.0f);
}

TEST(HostPacketTest, WithoutMetadataThePhotoIsUnknown) {
  Tarsa::testing::ScratchFolder folder;
  const std::string path = folder.File("plain.png");
  Host::ImageFile::Write(*Host::HostDocument::Create(60, 40, Host::ImageMode::kRgb), path);
  for (const std::string* source : {&path, static_cast<const std::string*>(nullptr)}) {
    const PhotoInfo info = LoadThroughHost(source);
    EXPECT_TRUE(info.GetMake().empty());
    EXPECT_EQ(info.GetFocalLength(), 0.0f);
    EXPECT_EQ(info.GetImageWidth(), 60u);
  }
}

}  // namespace
}  // namespace Project::testing
