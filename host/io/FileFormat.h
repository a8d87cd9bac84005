#pragma once

namespace Host {

// The image file formats the host reads and writes.
enum class FileFormat { kNone, kTiff, kPng, kJpeg };

// "TIFF", "PNG", "JPEG", or "no format".
const char* FormatName(FileFormat format);

}  // namespace Host
