#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "lens/metadata/PXmpMeta.h"
#include "lens/metadata/PhotoInfo.h"
#include "tests/support/MetadataPackets.h"

namespace Project::testing {
namespace {

// A packet with something in every field that is read.
std::string FullPacket() {
  return Packet(
      "tiff:Make=\"Canon\" tiff:Model=\"Canon EOS 40D\" aux:Lens=\"EF-S 10-22\" "
      "exif:FocalLength=\"10/1\" exif:FocalLengthIn35mmFilm=\"16\" exif:FNumber=\"4/1\" "
      "exif:ApertureValue=\"4/1\" exif:ExposureProgram=\"2\" exif:SubjectDistance=\"3/1\" "
      "exif:FocalPlaneResolutionUnit=\"2\" exif:FocalPlaneXResolution=\"5000/1\" "
      "exif:FocalPlaneYResolution=\"5000/1\" tiff:XResolution=\"72/1\" "
      "panorama:Transformation=\"Cylindrical\" panorama:VirtualFocalLength=\"0.5\" "
      "panorama:VirtualImageXCenter=\"0.5\" panorama:VirtualImageYCenter=\"0.5\"",
      "  <exif:ISOSpeedRatings><rdf:Seq><rdf:li>200</rdf:li></rdf:Seq></exif:ISOSpeedRatings>\n");
}

bool IsDefault(const PhotoInfo& info) {
  return info.GetMake().empty() && info.GetModel().empty() && info.GetLens().empty() &&
         info.GetFocalLength() == 0 && info.GetFocalLength35mm() == 0 && info.GetIsoSpeed() == 0 &&
         info.GetSensorWidth() == 0 && info.GetCropFactor() == 0 && !info.HasPanorama();
}

// Whatever was read, every number that comes out is finite.
void ExpectFinite(const PhotoInfo& info) {
  for (float value :
       {info.GetCropFactor(), info.GetFocal35mm(), info.GetAperture(), info.FocalFromMetadata(),
        info.GetSensorWidth(), info.GetSensorHeight(), info.GetXResolution(),
        info.GetVirtualFocalLength(), info.GetVirtualCenterX(), info.GetVirtualCenterY()}) {
    ASSERT_TRUE(std::isfinite(value));
  }
}

TEST(HostilePacketTest, RandomTruncatedAndMutatedPacketsNeverCrash) {
  const std::string full = FullPacket();
  ASSERT_FALSE(IsDefault(Read(full)));  // the packet does read
  std::mt19937 random(20240611);
  // The toolkit reports what it refuses on standard error; kept out of the log.
  ::testing::internal::CaptureStderr();
  for (int i = 0; i < 1000; ++i) {
    std::string bytes(random() % 600, '\0');
    for (char& c : bytes) c = char(random() % 256);
    if (i % 2 == 1 && !bytes.empty()) bytes[0] = '<';
    const PhotoInfo info = Read(bytes);
    ASSERT_TRUE(IsDefault(info)) << "random packet " << i;
  }
  for (std::size_t size = 0; size < full.size(); size += 3) {
    ExpectFinite(Read(full.substr(0, size)));
  }
  const std::string marks = "<>/\"'=:&;[]!?-#x0 \n";
  for (int i = 0; i < 2000; ++i) {
    std::string bytes = full;
    for (int flips = 1 + int(random() % 6); flips > 0; --flips) {
      const std::size_t at = random() % bytes.size();
      bytes[at] = random() % 3 == 0 ? char(random() % 256) : marks[random() % marks.size()];
    }
    ExpectFinite(Read(bytes));
  }
  ::testing::internal::GetCapturedStderr();
}

TEST(HostilePacketTest, HostilePacketsLeaveDefaults) {
  std::vector<std::string> packets;
  // Nesting deep enough to exhaust a recursive parser's stack.
  std::string deep;
  for (int i = 0; i < 100000; ++i) deep += "<exif:Deep rdf:parseType=\"Resource\">";
  for (int i = 0; i < 100000; ++i) deep += "</exif:Deep>";
  packets.push_back(Packet("tiff:Make=\"Canon\"", deep));
  // Entity expansion.
  std::string laughs = "<?xml version=\"1.0\"?><!DOCTYPE r [<!ENTITY a \"aaaaaaaaaa\">";
  for (char e = 'b'; e <= 'j'; ++e) {
    std::string tenfold;
    for (int k = 0; k < 10; ++k) tenfold += std::string("&") + char(e - 1) + ";";
    laughs += std::string("<!ENTITY ") + e + " \"" + tenfold + "\">";
  }
  laughs += "]>" + Packet("tiff:Make=\"&j;\"");
  packets.push_back(laughs);
  // Past the size any photo's metadata has.
  packets.push_back(Packet("tiff:Make=\"Canon\"", std::string(PXmpMeta::kMaxSize, ' ')));
  // A NUL inside.
  packets.push_back(Packet("tiff:Make=\"Canon\"") + std::string(1, '\0') + "tail");
  ::testing::internal::CaptureStderr();
  for (const std::string& packet : packets) EXPECT_TRUE(IsDefault(Read(packet)));

  // Values out of range or of the wrong type read as absent.
  const PhotoInfo info = Read(
      Packet("exif:FocalLength=\"1e39\" exif:FocalLengthIn35mmFilm=\"nan\" exif:FNumber=\"inf/1\" "
             "exif:ExposureProgram=\"three\" exif:FocalPlaneXResolution=\"1e-45\" "
             "exif:FocalPlaneYResolution=\"1e-45\" exif:ISOSpeedRatings=\"400\" "
             "panorama:Transformation=\"Spherical\" panorama:VirtualFocalLength=\"1e300\" "
             "panorama:VirtualImageXCenter=\"0.5\" panorama:VirtualImageYCenter=\"0.5\"",
             "  <tiff:Make><rdf:Bag><rdf:li>Canon</rdf:li></rdf:Bag></tiff:Make>\n"
             "  <tiff:Model rdf:parseType=\"Resource\"><tiff:Inner>x</tiff:Inner></tiff:Model>\n"));
  ::testing::internal::GetCapturedStderr();
  EXPECT_TRUE(IsDefault(info));
  EXPECT_EQ(info.GetFNumber(), 0.0f);
  EXPECT_EQ(info.GetExposureProgram(), 0u);
  EXPECT_EQ(info.GetVirtualFocalLength(), 0.0f);
}

}  // namespace
}  // namespace Project::testing
