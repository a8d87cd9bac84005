#include "tools/synth/lib/PhotoWriter.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <exiv2/exiv2.hpp>

#include "host/io/ImageFile.h"
#include "host/io/TemporaryFile.h"
#include "tools/synth/lib/SynthError.h"

namespace Synth {
namespace {

std::string Number(double value) {
  char text[32];
  std::snprintf(text, sizeof text, "%.9g", value);
  return text;
}

}  // namespace

void PhotoWriter::Write(const RenderResult& photo, const CameraSpec& camera,
                        const std::string& path) {
  const Host::FileFormat format = Host::ImageFile::FormatFromName(path);
  if (format == Host::FileFormat::kNone) {
    throw SynthError("'" + path + "': the name must end in .tif, .tiff, .png, .jpg or .jpeg");
  }
  const std::string refusal = Host::ImageFile::WriteRefusal(*photo.document, format);
  if (!refusal.empty()) throw SynthError("'" + path + "': " + refusal);
  Host::TemporaryFile file(path);
  Host::ImageFile::Write(*photo.document, file.Path(), format);
  try {
    AddMetadata(photo, camera, file.Path());
  } catch (const Exiv2::AnyError& error) {
    throw SynthError("'" + path + "': cannot write the metadata: " + error.what());
  }
  file.Commit();
}

void PhotoWriter::AddMetadata(const RenderResult& photo, const CameraSpec& camera,
                              const std::string& path) {
  auto image = Exiv2::ImageFactory::open(path);
  image->readMetadata();
  Exiv2::ExifData& exif = image->exifData();
  exif["Exif.Image.Make"] = camera.make;
  exif["Exif.Image.Model"] = camera.model;
  exif["Exif.Photo.LensModel"] = LensName(camera);
  // Hundredths of a millimetre, as cameras store it.
  exif["Exif.Photo.FocalLength"] =
      Exiv2::URational(static_cast<uint32_t>(std::lround(camera.focalMm * 100.0)), 100);
  exif["Exif.Photo.FocalLengthIn35mmFilm"] =
      static_cast<uint16_t>(std::lround(std::min(camera.focalMm * camera.cropFactor, 65535.0)));
  exif["Exif.Photo.PixelXDimension"] = static_cast<uint32_t>(camera.width);
  exif["Exif.Photo.PixelYDimension"] = static_cast<uint32_t>(camera.height);

  Exiv2::XmpData& xmp = image->xmpData();
  xmp["Xmp.aux.Lens"] = LensName(camera);
  const ProjectionKind kind = photo.camera.Lens().Kind();
  if (kind == ProjectionKind::kCylindrical || kind == ProjectionKind::kEquirectangular) {
    Exiv2::XmpProperties::registerNs(kPanoramaNamespace, "panorama");
    const double side = std::max(camera.width, camera.height);
    const Projection& lens = photo.camera.Lens();
    xmp["Xmp.panorama.Transformation"] =
        kind == ProjectionKind::kCylindrical ? "Cylindrical" : "Spherical";
    xmp["Xmp.panorama.VirtualFocalLength"] = Number(lens.Focal() / side);
    xmp["Xmp.panorama.VirtualImageXCenter"] = Number(lens.Centre().x / side);
    xmp["Xmp.panorama.VirtualImageYCenter"] = Number(lens.Centre().y / side);
  }
  image->writeMetadata();
}

}  // namespace Synth
