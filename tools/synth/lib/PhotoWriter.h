#pragma once

#include <string>

#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/RenderSpec.h"

namespace Synth {

// Writes a rendered photograph as a TIFF, PNG or JPEG file (by the name's
// extension) with the metadata a camera would leave: EXIF make, model, lens
// model, focal length, 35 mm equivalent focal length and pixel dimensions,
// the lens name again as XMP aux:Lens, and for cylindrical and
// equirectangular images the panorama record (Transformation, and the virtual
// focal length and centre as fractions of the longer side). The file appears
// complete or not at all. Operations only.
class PhotoWriter {
 public:
  // The panorama namespace, under the project's own URI host.
  static constexpr const char* kPanoramaNamespace =
      "http://ns.archway.invalid/quillmark/1.0/panorama-profile/";

  PhotoWriter() = delete;

  // Throws SynthError (or the host's HostError) naming the file.
  static void Write(const RenderResult& photo, const CameraSpec& camera, const std::string& path);

 private:
  static void AddMetadata(const RenderResult& photo, const CameraSpec& camera,
                          const std::string& path);
};

}  // namespace Synth
