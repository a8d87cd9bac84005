#pragma once

#include <string>

namespace Host {

// The XMP packet the host keeps with a document, made from its image file:
// the file's embedded XMP with its EXIF added in the standard tiff, exif and
// aux namespaces, so that what a camera wrote is read like what a raw
// converter wrote. Operations only.
class MetadataPacket {
 public:
  MetadataPacket() = delete;

  // The packet of the file at path; empty when the file has no metadata, or
  // none that can be read (metadata is a help to the filter, never a
  // condition of a run).
  static std::string FromFile(const std::string& path);
};

}  // namespace Host
