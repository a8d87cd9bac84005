#include "host/io/PngFile.h"

#include <png.h>

#include <array>
#include <bit>
#include <cerrno>
#include <cmath>
#include <csetjmp>
#include <cstdio>
#include <cstring>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/SampleCoding.h"

namespace Host {

namespace {

constexpr double kMetresPerInch = 0.0254;

// Shared by the libpng callbacks and the C-style steps: plain data only, so
// that a longjmp across it leaves nothing to destroy.
struct PngJob {
  std::FILE* file = nullptr;
  png_structp png = nullptr;
  png_infop info = nullptr;
  char error[256] = {};
  // Header, after the reading transformations.
  png_uint_32 width = 0;
  png_uint_32 height = 0;
  int bitDepth = 0;
  int colourType = 0;
  int channels = 0;
  bool interlaced = false;
  png_uint_32 pixelsPerMetreX = 0;
  png_uint_32 pixelsPerMetreY = 0;
  // Rows: one row buffer, or, for interlaced files, row pointers into a
  // buffer holding the whole image.
  png_bytep row = nullptr;
  png_bytepp rows = nullptr;
  HostDocument* target = nullptr;
  const HostDocument* source = nullptr;
};

void OnPngError(png_structp png, png_const_charp message) {
  auto* job = static_cast<PngJob*>(png_get_error_ptr(png));
  std::snprintf(job->error, sizeof job->error, "%s", message);
  png_longjmp(png, 1);
}

void OnPngWarning(png_structp, png_const_charp) {}

// Each step returns false when libpng failed; job->error then says why.

bool ReadPngHeader(PngJob* job) {
  if (setjmp(png_jmpbuf(job->png))) return false;
  png_init_io(job->png, job->file);
  png_set_user_limits(job->png, HostDocument::kMaxSide, HostDocument::kMaxSide);
  png_read_info(job->png, job->info);
  // Palettes become RGB, low depths 8 bits, a transparent colour an alpha
  // channel; 16-bit samples arrive in the machine's order.
  png_set_expand(job->png);
  if (std::endian::native == std::endian::little) png_set_swap(job->png);
  job->interlaced = png_set_interlace_handling(job->png) > 1;
  png_read_update_info(job->png, job->info);
  job->width = png_get_image_width(job->png, job->info);
  job->height = png_get_image_height(job->png, job->info);
  job->bitDepth = png_get_bit_depth(job->png, job->info);
  job->colourType = png_get_color_type(job->png, job->info);
  job->channels = png_get_channels(job->png, job->info);
  int unit = 0;
  if (!png_get_pHYs(job->png, job->info, &job->pixelsPerMetreX, &job->pixelsPerMetreY, &unit) ||
      unit != PNG_RESOLUTION_METER) {
    job->pixelsPerMetreX = job->pixelsPerMetreY = 0;
  }
  return true;
}

bool ReadPngRows(PngJob* job) {
  if (setjmp(png_jmpbuf(job->png))) return false;
  if (job->interlaced) {
    png_read_image(job->png, job->rows);
  } else {
    const int32_t width = static_cast<int32_t>(job->width);
    for (png_uint_32 y = 0; y < job->height; ++y) {
      png_read_row(job->png, job->row, nullptr);
      SpreadSamples(job->row, job->channels, 0, job->channels, *job->target, 0,
                    static_cast<int32_t>(y), width);
    }
  }
  // Reads up to the end marker, so that a file cut short after its image
  // data is still noticed.
  png_read_end(job->png, nullptr);
  return true;
}

bool WritePngRows(PngJob* job) {
  if (setjmp(png_jmpbuf(job->png))) return false;
  png_init_io(job->png, job->file);
  png_set_IHDR(job->png, job->info, job->width, job->height, job->bitDepth, job->colourType,
               PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  png_set_pHYs(job->png, job->info, job->pixelsPerMetreX, job->pixelsPerMetreY,
               PNG_RESOLUTION_METER);
  png_write_info(job->png, job->info);
  if (job->bitDepth == 16 && std::endian::native == std::endian::little) png_set_swap(job->png);
  const std::array<SampleCoding, 3> direct{};
  for (png_uint_32 y = 0; y < job->height; ++y) {
    EncodeRow(*job->source, static_cast<int32_t>(y), direct, job->row);
    png_write_row(job->png, job->row);
  }
  png_write_end(job->png, job->info);
  return true;
}

// Owns what a job opened; runs in the C++ frames around the C-style steps.
class PngJobOwner {
 public:
  PngJobOwner(PngJob& job, bool reading) : job_(job), reading_(reading) {}
  ~PngJobOwner() {
    if (reading_) {
      png_destroy_read_struct(&job_.png, &job_.info, nullptr);
    } else {
      png_destroy_write_struct(&job_.png, &job_.info);
    }
    if (job_.file != nullptr) std::fclose(job_.file);
  }
  PngJobOwner(const PngJobOwner&) = delete;
  PngJobOwner& operator=(const PngJobOwner&) = delete;

 private:
  PngJob& job_;
  bool reading_;
};

[[noreturn]] void Fail(const std::string& path, const PngJob& job, const std::string& what) {
  if (job.error[0] != '\0') throw HostError(path, what + " (" + job.error + ")");
  throw HostError(path, what);
}

png_uint_32 PixelsPerMetre(double dpi) {
  const double value = std::round(dpi / kMetresPerInch);
  return value >= 1 && value < 4e9 ? static_cast<png_uint_32>(value) : 2835;
}

// Whole pixels per metre cannot hold most whole dpi values (96 dpi is 3779.5);
// a count that a whole dpi value rounds to is read back as that value.
double DotsPerInch(png_uint_32 pixelsPerMetre) {
  const double dpi = pixelsPerMetre * kMetresPerInch;
  const double whole = std::round(dpi);
  return PixelsPerMetre(whole) == pixelsPerMetre ? whole : dpi;
}

}  // namespace

std::unique_ptr<HostDocument> PngFile::Read(const std::string& path) {
  PngJob job;
  PngJobOwner owner(job, true);
  job.file = std::fopen(path.c_str(), "rb");
  if (job.file == nullptr)
    throw HostError(path, std::string("cannot open: ") + std::strerror(errno));
  job.png = png_create_read_struct(PNG_LIBPNG_VER_STRING, &job, OnPngError, OnPngWarning);
  if (job.png != nullptr) job.info = png_create_info_struct(job.png);
  if (job.info == nullptr) throw std::bad_alloc();
  if (!ReadPngHeader(&job)) Fail(path, job, "is not a readable PNG file");
  if ((job.bitDepth != 8 && job.bitDepth != 16) || job.channels < 1 || job.channels > 4) {
    throw HostError(path, "has a PNG layout this host cannot read");
  }
  const bool colour = (job.colourType & PNG_COLOR_MASK_COLOR) != 0;
  const bool alpha = (job.colourType & PNG_COLOR_MASK_ALPHA) != 0;
  const ImageMode mode = ModeOf(colour ? ColourModel::kRgb : ColourModel::kGray, job.bitDepth);
  std::unique_ptr<HostDocument> document = HostDocument::CreateUnfilled(
      static_cast<int32_t>(job.width), static_cast<int32_t>(job.height), mode, alpha);
  if (document->PlaneCount() != job.channels) {
    throw HostError(path, "has a PNG layout this host cannot read");
  }
  job.target = document.get();

  const size_t rowBytes = png_get_rowbytes(job.png, job.info);
  std::vector<png_byte> image;
  std::vector<png_bytep> rows;
  if (job.interlaced) {
    image.resize(rowBytes * job.height);
    rows.resize(job.height);
    for (png_uint_32 y = 0; y < job.height; ++y) rows[y] = image.data() + rowBytes * y;
    job.rows = rows.data();
  } else {
    image.resize(rowBytes);
    job.row = image.data();
  }
  if (!ReadPngRows(&job)) Fail(path, job, "is damaged or cut short");
  if (job.interlaced) {
    for (png_uint_32 y = 0; y < job.height; ++y) {
      SpreadSamples(rows[y], job.channels, 0, job.channels, *document, 0, static_cast<int32_t>(y),
                    static_cast<int32_t>(job.width));
    }
  }
  DecodePlanes(*document, std::array<SampleCoding, 3>{}, false);
  if (job.pixelsPerMetreX != 0 && job.pixelsPerMetreY != 0) {
    document->SetResolution(DotsPerInch(job.pixelsPerMetreX), DotsPerInch(job.pixelsPerMetreY));
  }
  document->SetSource(path, FileFormat::kPng);
  return document;
}

void PngFile::Write(const HostDocument& document, const std::string& path) {
  const ColourModel model = document.Model();
  if (model != ColourModel::kGray && model != ColourModel::kRgb) {
    throw HostError(path, std::string("PNG cannot hold ") + ModeName(document.Mode()) + " images");
  }
  PngJob job;
  PngJobOwner owner(job, false);
  job.file = std::fopen(path.c_str(), "wb");
  if (job.file == nullptr) {
    throw HostError(path, std::string("cannot open for writing: ") + std::strerror(errno));
  }
  job.png = png_create_write_struct(PNG_LIBPNG_VER_STRING, &job, OnPngError, OnPngWarning);
  if (job.png != nullptr) job.info = png_create_info_struct(job.png);
  if (job.info == nullptr) throw std::bad_alloc();
  job.width = static_cast<png_uint_32>(document.Width());
  job.height = static_cast<png_uint_32>(document.Height());
  job.bitDepth = document.Depth();
  job.colourType = (model == ColourModel::kRgb ? PNG_COLOR_MASK_COLOR : 0) |
                   (document.HasTransparency() ? PNG_COLOR_MASK_ALPHA : 0);
  job.pixelsPerMetreX = PixelsPerMetre(document.ResolutionX());
  job.pixelsPerMetreY = PixelsPerMetre(document.ResolutionY());
  std::vector<png_byte> row(static_cast<size_t>(document.Width()) * document.PlaneCount() *
                            (document.Depth() / 8));
  job.row = row.data();
  job.source = &document;
  if (!WritePngRows(&job)) Fail(path, job, "cannot be written");
  std::FILE* file = job.file;
  job.file = nullptr;
  if (std::fclose(file) != 0) {
    throw HostError(path, std::string("cannot be written: ") + std::strerror(errno));
  }
}

}  // namespace Host
