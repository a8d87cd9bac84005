#include "host/io/ImageFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <cerrno>
#include <cstring>
#include <new>

#include "host/io/HostError.h"
#include "host/io/JpegFile.h"
#include "host/io/PngFile.h"
#include "host/io/TemporaryFile.h"
#include "host/io/TiffFile.h"

namespace Host {

namespace {

std::string LowerExtension(const std::string& path) {
  const size_t slash = path.rfind('/');
  const size_t dot = path.rfind('.');
  if (dot == std::string::npos || (slash != std::string::npos && dot < slash)) return {};
  std::string extension = path.substr(dot + 1);
  std::ranges::transform(extension, extension.begin(),
                         [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  return extension;
}

bool StartsWith(std::span<const uint8_t> head, std::initializer_list<uint8_t> magic) {
  return head.size() >= magic.size() && std::equal(magic.begin(), magic.end(), head.begin());
}

// Reads a file's first bytes; throws when it cannot be opened.
std::array<uint8_t, 8> ReadHead(const std::string& path, size_t& length) {
  std::array<uint8_t, 8> head{};
  const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) throw HostError(path, std::string("cannot open: ") + std::strerror(errno));
  struct stat info;
  if (::fstat(fd, &info) == 0 && S_ISDIR(info.st_mode)) {
    ::close(fd);
    throw HostError(path, "is a folder, not an image file");
  }
  ssize_t got;
  do {
    got = ::read(fd, head.data(), head.size());
  } while (got < 0 && errno == EINTR);
  const int error = errno;
  ::close(fd);
  if (got < 0) throw HostError(path, std::string("cannot read: ") + std::strerror(error));
  length = static_cast<size_t>(got);
  return head;
}

}  // namespace

FileFormat ImageFile::FormatFromName(const std::string& path) {
  const std::string extension = LowerExtension(path);
  if (extension == "tif" || extension == "tiff") return FileFormat::kTiff;
  if (extension == "png") return FileFormat::kPng;
  if (extension == "jpg" || extension == "jpeg") return FileFormat::kJpeg;
  return FileFormat::kNone;
}

FileFormat ImageFile::FormatFromContents(std::span<const uint8_t> head) {
  // Classic TIFF ("II*\0", "MM\0*") and BigTIFF ("II+\0", "MM\0+").
  if (StartsWith(head, {'I', 'I', 42, 0}) || StartsWith(head, {'M', 'M', 0, 42}) ||
      StartsWith(head, {'I', 'I', 43, 0}) || StartsWith(head, {'M', 'M', 0, 43})) {
    return FileFormat::kTiff;
  }
  if (StartsWith(head, {0x89, 'P', 'N', 'G', '\r', '\n', 0x1a, '\n'})) return FileFormat::kPng;
  if (StartsWith(head, {0xff, 0xd8, 0xff})) return FileFormat::kJpeg;
  return FileFormat::kNone;
}

std::string ImageFile::WriteRefusal(const HostDocument& document, FileFormat format) {
  const std::string mode = ModeName(document.Mode());
  switch (format) {
    case FileFormat::kTiff:
      return {};
    case FileFormat::kPng:
      if (document.Model() == ColourModel::kGray || document.Model() == ColourModel::kRgb)
        return {};
      return "PNG cannot hold " + mode + " images; save as TIFF instead";
    case FileFormat::kJpeg:
      if (document.Depth() != 8) {
        return "JPEG cannot hold " + mode + " images; save as TIFF or PNG instead";
      }
      if (document.Model() == ColourModel::kLab) {
        return "JPEG files written here cannot hold Lab images; save as TIFF instead";
      }
      if (document.HasTransparency()) {
        return "JPEG cannot hold transparency; save as TIFF or PNG instead";
      }
      return {};
    case FileFormat::kNone:
      break;
  }
  return "the file name does not end in .tif, .tiff, .png, .jpg or .jpeg, so the format to write "
         "is unknown";
}

std::unique_ptr<HostDocument> ImageFile::Read(const std::string& path) {
  size_t length = 0;
  const std::array<uint8_t, 8> head = ReadHead(path, length);
  if (length == 0) throw HostError(path, "is empty");
  const FileFormat format = FormatFromContents(std::span(head.data(), length));
  try {
    switch (format) {
      case FileFormat::kTiff:
        return TiffFile::Read(path);
      case FileFormat::kPng:
        return PngFile::Read(path);
      case FileFormat::kJpeg:
        return JpegFile::Read(path);
      case FileFormat::kNone:
        break;
    }
  } catch (const HostError& error) {
    if (!error.Path().empty()) throw;
    throw HostError(path, error.Problem());
  } catch (const std::bad_alloc&) {
    throw HostError(path, "is too large for the memory available");
  }
  throw HostError(path, "is not a TIFF, PNG or JPEG file");
}

void ImageFile::Write(const HostDocument& document, const std::string& path,
                      const WriteOptions& options) {
  Write(document, path, FormatFromName(path), options);
}

void ImageFile::Write(const HostDocument& document, const std::string& path, FileFormat format,
                      const WriteOptions& options) {
  const std::string refusal = WriteRefusal(document, format);
  if (!refusal.empty()) throw HostError(path, refusal);
  if (format == FileFormat::kJpeg && (options.jpegQuality < 1 || options.jpegQuality > 100)) {
    throw HostError(path,
                    "JPEG quality " + std::to_string(options.jpegQuality) + " is outside 1 to 100");
  }
  TemporaryFile temporary(path);
  try {
    switch (format) {
      case FileFormat::kTiff:
        TiffFile::Write(document, temporary.Path(), options);
        break;
      case FileFormat::kPng:
        PngFile::Write(document, temporary.Path());
        break;
      case FileFormat::kJpeg:
        JpegFile::Write(document, temporary.Path(), options.jpegQuality);
        break;
      case FileFormat::kNone:
        break;
    }
  } catch (const HostError& error) {
    // Messages name the file the user asked for, not the temporary.
    throw HostError(path, error.Problem());
  } catch (const std::bad_alloc&) {
    throw HostError(path, "not enough memory to write the image");
  }
  temporary.Commit();
}

}  // namespace Host
