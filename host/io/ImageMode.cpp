#include "host/io/ImageMode.h"

namespace Host {

const char* ModeName(ImageMode mode) {
  switch (mode) {
    case ImageMode::kGray:
      return "grayscale 8-bit";
    case ImageMode::kRgb:
      return "RGB 8-bit";
    case ImageMode::kCmyk:
      return "CMYK 8-bit";
    case ImageMode::kLab:
      return "Lab 8-bit";
    case ImageMode::kGray16:
      return "grayscale 16-bit";
    case ImageMode::kRgb48:
      return "RGB 16-bit";
    case ImageMode::kLab48:
      return "Lab 16-bit";
    case ImageMode::kCmyk64:
      return "CMYK 16-bit";
  }
  return "unknown mode";
}

}  // namespace Host
