#include "host/io/FileFormat.h"

namespace Host {

const char* FormatName(FileFormat format) {
  switch (format) {
    case FileFormat::kTiff:
      return "TIFF";
    case FileFormat::kPng:
      return "PNG";
    case FileFormat::kJpeg:
      return "JPEG";
    case FileFormat::kNone:
      break;
  }
  return "no format";
}

}  // namespace Host
