#include "host/io/MetadataPacket.h"

#include <exiv2/exiv2.hpp>

#include <exception>

namespace Host {

namespace {

// Lens and body tags of newer EXIF that the standard conversion leaves out,
// and the aux properties that hold them in XMP. An embedded value wins.
struct ExtraTag {
  const char* exif;
  const char* xmp;
};
constexpr ExtraTag kExtraTags[] = {
    {"Exif.Photo.LensModel", "Xmp.aux.Lens"},
    {"Exif.Photo.LensSpecification", "Xmp.aux.LensInfo"},
    {"Exif.Photo.BodySerialNumber", "Xmp.aux.SerialNumber"},
};

}  // namespace

std::string MetadataPacket::FromFile(const std::string& path) {
  try {
    auto image = Exiv2::ImageFactory::open(path);
    if (image.get() == nullptr) return {};
    image->readMetadata();
    Exiv2::XmpData xmp = image->xmpData();
    const Exiv2::ExifData& exif = image->exifData();
    for (const ExtraTag& tag : kExtraTags) {
      const auto found = exif.findKey(Exiv2::ExifKey(tag.exif));
      if (found != exif.end() && xmp.findKey(Exiv2::XmpKey(tag.xmp)) == xmp.end()) {
        xmp[tag.xmp] = found->toString();
      }
    }
    Exiv2::copyExifToXmp(exif, xmp);
    std::string packet;
    // No packet wrapper, so no padding: the packet is read, never edited in place.
    if (Exiv2::XmpParser::encode(
            packet, xmp,
            Exiv2::XmpParser::useCompactFormat | Exiv2::XmpParser::omitPacketWrapper) != 0) {
      return {};
    }
    return packet;
  } catch (const std::exception&) {
    return {};
  }
}

}  // namespace Host
