#include "lens/metadata/PhotoInfo.h"

#include <gtest/gtest.h>

#include <cmath>
#include <string>

#include "tests/support/MetadataPackets.h"

namespace Project::testing {
namespace {

[[maybe_unused]] ::testing::Environment* const kToolkit =
    ::testing::AddGlobalTestEnvironment(new ToolkitEnvironment);

TEST(PhotoInfoTest, NamesAreTrimmedAndExposureIsRead) {
  const PhotoInfo info = Read(
      Packet("tiff:Make=\"  NIKON CORPORATION \" tiff:Model=\"&#9;NIKON D90&#10;\" "
             "aux:Lens=\" 10.5mm f/2.8 \" aux:LensID=\" 137 \" exif:FNumber=\"28/10\" "
             "exif:ExposureTime=\"1/250\" tiff:XResolution=\"300/1\" "
             "aux:ApproximateFocusDistance=\"15/10\"",
             "<exif:ISOSpeedRatings><rdf:Seq><rdf:li>400</rdf:li><rdf:li>800</rdf:li></rdf:Seq>"
             "</exif:ISOSpeedRatings>"));
  EXPECT_EQ(info.GetMake(), "NIKON CORPORATION");
  EXPECT_EQ(info.GetModel(), "NIKON D90");
  EXPECT_EQ(info.GetLens(), "10.5mm f/2.8");
  EXPECT_EQ(info.GetLensId(), "137");
  EXPECT_FLOAT_EQ(info.GetExposureTime(), 0.004f);
  EXPECT_EQ(info.GetIsoSpeed(), 400u);
  EXPECT_NEAR(info.GetAperture(), 2.9708f, 1e-4f);         // APEX: 2 log2(2.8)
  EXPECT_NEAR(info.GetXResolution(), 300 / 2.54f, 1e-3f);  // inches to centimetres
  EXPECT_FLOAT_EQ(info.GetSubjectDistance(), 1.5f);        // the focus distance stands in
}

TEST(PhotoInfoTest, CropFactorFromFocalLengths) {
  struct Case {
    const char* make;
    const char* focal;
    const char* focal35;
    float crop;
  };
  const Case cases[] = {
      // A make holding "NIKON" snaps near 1.0 and 1.5; others keep the ratio.
      {"NIKON CORPORATION", "50/1", "75", 1.5f},
      {"Canon", "50/1", "75", 1.5f},
      {"Nikon", "52/1", "75", 1.5f},
      {"Canon", "52/1", "75", 75.0f / 52.0f},
      {"NIKON", "40/1", "44", 1.0f},
      {"NIKON", "10/1", "48", 4.8f},
      {"Canon", "35/0", "56", 1.6f},  // a zero denominator reads the numerator alone
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(std::string(c.make) + " " + c.focal);
    const PhotoInfo info =
        Read(Packet(std::string("tiff:Make=\"") + c.make + "\" exif:FocalLength=\"" + c.focal +
                    "\" exif:FocalLengthIn35mmFilm=\"" + c.focal35 + "\""));
    EXPECT_FLOAT_EQ(info.GetCropFactor(), c.crop);
  }
}

TEST(PhotoInfoTest, CropFactorFromSensorSizeThenKnownCameras) {
  // 3000 x 2000 pixels at 1250 a centimetre: 24 x 16 mm, 2/3 of a full frame's diagonal.
  PhotoInfo info =
      Read(Packet("exif:FocalPlaneResolutionUnit=\"3\" exif:FocalPlaneXResolution=\"1250/1\" "
                  "exif:FocalPlaneYResolution=\"1250/1\""));
  EXPECT_FLOAT_EQ(info.GetSensorWidth(), 24.0f);
  EXPECT_FLOAT_EQ(info.GetCropFactor(), 1.5f);
  // Inches otherwise: 3600 x 2400 at 2540 an inch is a full frame, which
  // goes before the table's answer for the camera.
  info = Read(Packet("tiff:Make=\"Canon\" tiff:Model=\"Canon EOS 40D\" "
                     "exif:FocalPlaneXResolution=\"2540/1\" exif:FocalPlaneYResolution=\"2540\""),
              3600, 2400);
  EXPECT_FLOAT_EQ(info.GetCropFactor(), 1.0f);

  struct Case {
    const char* make;
    const char* model;
    float crop;
  };
  const Case cases[] = {
      {"Canon", " Canon EOS 40D ", 1.6f},
      {"OLYMPUS IMAGING CORP.", "E-620", 2.0f},
      {"canon", "Canon EOS 40D", 0.0f},  // exact names only
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.model);
    info = Read(Packet(std::string("tiff:Make=\"") + c.make + "\" tiff:Model=\"" + c.model + "\""));
    EXPECT_FLOAT_EQ(info.GetCropFactor(), c.crop);
  }
}

TEST(PhotoInfoTest, ThirtyFiveMillimetreEquivalentAndFocalFraction) {
  // 24 mm at the table's 1.5 is 36 mm equivalent, the longer side of a 3:2
  // full frame: the focal length is the longer image side.
  PhotoInfo info = Read(Packet(
      "tiff:Make=\"NIKON CORPORATION\" tiff:Model=\"NIKON D300\" exif:FocalLength=\"24/1\""));
  EXPECT_FLOAT_EQ(info.GetFocal35mm(), 36.0f);
  EXPECT_NEAR(info.FocalFromMetadata(), 1.0f, 1e-6f);
  // A square image: diagonal / side x 36 / sqrt(1872).
  info = Read(Packet("exif:FocalLength=\"36/1\" exif:FocalLengthIn35mmFilm=\"35\""), 1000, 1000);
  EXPECT_FLOAT_EQ(info.GetFocal35mm(), 35.0f);  // recorded: it wins
  EXPECT_NEAR(info.FocalFromMetadata(), std::sqrt(2.0f) * 35 / std::sqrt(1872.0f), 1e-6f);
  // Nothing to go on, or no image: 0.
  info = Read(Packet("exif:FocalLength=\"24/1\""));
  EXPECT_EQ(info.GetFocal35mm(), 0.0f);
  EXPECT_EQ(info.FocalFromMetadata(), 0.0f);
  info = Read(Packet("exif:FocalLength=\"24/1\" exif:FocalLengthIn35mmFilm=\"36\""), 0, 0);
  EXPECT_EQ(info.FocalFromMetadata(), 0.0f);
}

TEST(PhotoInfoTest, PanoramaRecord) {
  PhotoInfo info = Read(Packet("panorama:Transformation=\"Spherical\" "
                               "panorama:VirtualFocalLength=\"0.3183\" "
                               "panorama:VirtualImageXCenter=\"0.5\" "
                               "panorama:VirtualImageYCenter=\"0.25\""),
                        4000, 2000);
  EXPECT_TRUE(info.HasPanorama());
  const PanoramaProjection panorama = info.Panorama();
  EXPECT_EQ(panorama.type, PanoramaProjection::kSpherical);
  EXPECT_FLOAT_EQ(panorama.focal, 0.3183f * 4000);  // fractions of the longer side
  EXPECT_FLOAT_EQ(panorama.centerX, 2000.0f);
  EXPECT_FLOAT_EQ(panorama.centerY, 1000.0f);
  EXPECT_FLOAT_EQ(panorama.imageWidth, 4000.0f);

  // Known by its URI, whatever prefix the packet binds.
  info = Read(Packet("xmlns:pano=\"" + std::string(PXmpMeta::kPanoramaNamespace) +
                     "\" pano:Transformation=\"Cylindrical\" pano:VirtualFocalLength=\"1\" "
                     "pano:VirtualImageXCenter=\"0\" pano:VirtualImageYCenter=\"0\""));
  EXPECT_TRUE(info.HasPanorama());

  const std::string centres =
      " panorama:VirtualImageXCenter=\"0.5\" panorama:VirtualImageYCenter=\"0.5\"";
  const std::string incomplete[] = {
      "panorama:Transformation=\"Perspective\"" + centres,
      "panorama:Transformation=\"Perspective\" panorama:VirtualFocalLength=\"0\"" + centres,
      "panorama:Transformation=\"Perspective\" panorama:VirtualFocalLength=\"1\" "
      "panorama:VirtualImageXCenter=\"0.5\"",
      "panorama:Transformation=\"Fisheye\" panorama:VirtualFocalLength=\"1\"" + centres,
  };
  for (const std::string& attributes : incomplete) {
    SCOPED_TRACE(attributes);
    EXPECT_FALSE(Read(Packet(attributes)).HasPanorama());
  }
}

}  // namespace
}  // namespace Project::testing
