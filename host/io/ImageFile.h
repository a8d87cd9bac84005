#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>

#include "host/io/FileFormat.h"
#include "host/io/HostDocument.h"
#include "host/io/WriteOptions.h"

namespace Host {

// The host's image files: which format a file is, reading it into a document
// and writing a document out. A namespace of operations, no state. Reading
// goes by the file's first bytes, so a misnamed file still reads; writing goes
// by the name's extension. Writing is all or nothing: the image is written
// under a temporary name beside the target and renamed over it only when
// complete, so a refusal or a failure leaves any old file as it was.
class ImageFile {
 public:
  ImageFile() = delete;

  // By extension, ignoring case: .tif/.tiff, .png, .jpg/.jpeg; kNone otherwise.
  static FileFormat FormatFromName(const std::string& path);
  // By the first bytes of a file; kNone when they match no format.
  static FileFormat FormatFromContents(std::span<const uint8_t> head);

  // Why a document cannot be written in a format, in words for the user
  // ("PNG cannot hold CMYK 8-bit images; ..."); empty when it can.
  static std::string WriteRefusal(const HostDocument& document, FileFormat format);

  // Throws HostError naming the file when it is missing, unreadable,
  // damaged, cut short or in a layout the host does not take.
  static std::unique_ptr<HostDocument> Read(const std::string& path);

  // Throws HostError naming the file on refusal or failure.
  static void Write(const HostDocument& document, const std::string& path,
                    const WriteOptions& options = {});
  static void Write(const HostDocument& document, const std::string& path, FileFormat format,
                    const WriteOptions& options = {});
};

}  // namespace Host
