#include "host/io/TiffFile.h"

#include <tiffio.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdarg>
#include <cstdio>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/SampleCoding.h"

namespace Host {

namespace {

// libtiff reports through callbacks and then fails the call; the first report
// is kept as the most telling one. The buffer is plain so the callback, which
// runs inside libtiff, never allocates or throws.
struct TiffMessages {
  char text[400] = {};
};

int OnTiffError(TIFF*, void* user, const char* module, const char* format, va_list args) {
  auto* messages = static_cast<TiffMessages*>(user);
  if (messages->text[0] == '\0') {
    char body[320];
    std::vsnprintf(body, sizeof body, format, args);
    std::snprintf(messages->text, sizeof messages->text, "%s%s%s", module ? module : "",
                  module ? ": " : "", body);
  }
  return 1;  // handled: the global handler, which prints, is not called
}

int OnTiffWarning(TIFF*, void*, const char*, const char*, va_list) { return 1; }

struct TiffCloser {
  void operator()(TIFF* tiff) const { TIFFClose(tiff); }
};
using TiffHandle = std::unique_ptr<TIFF, TiffCloser>;

// libtiff's own buffers, and the reader's strip or tile buffer, stay below
// this and below the document limit; a damaged header cannot make either
// allocate more.
tmsize_t LargestAllocation() {
  return static_cast<tmsize_t>(
      std::min<uint64_t>(uint64_t{1} << 31, std::max<uint64_t>(HostDocument::MemoryLimit(), 1)));
}

TiffHandle Open(const std::string& path, const char* mode, TiffMessages& messages) {
  TIFFOpenOptions* options = TIFFOpenOptionsAlloc();
  if (options == nullptr) throw std::bad_alloc();
  TIFFOpenOptionsSetErrorHandlerExtR(options, OnTiffError, &messages);
  TIFFOpenOptionsSetWarningHandlerExtR(options, OnTiffWarning, nullptr);
  TIFFOpenOptionsSetMaxSingleMemAlloc(options, LargestAllocation());
  TiffHandle tiff(TIFFOpenExt(path.c_str(), mode, options));
  TIFFOpenOptionsFree(options);
  return tiff;
}

[[noreturn]] void Fail(const std::string& path, const TiffMessages& messages,
                       const std::string& fallback) {
  if (messages.text[0] != '\0') {
    throw HostError(path, fallback + " (" + messages.text + ")");
  }
  throw HostError(path, fallback);
}

// What the reader makes of a file's tags.
struct TiffLayout {
  uint32_t width = 0;
  uint32_t height = 0;
  uint16_t bitsPerSample = 1;
  uint16_t samplesPerPixel = 1;
  uint16_t photometric = 0;
  uint16_t planarConfig = PLANARCONFIG_CONTIG;
  ColourModel model = ColourModel::kGray;
  std::array<SampleCoding, 4> codings{};
  int colourSamples = 1;
  bool hasTransparency = false;
  bool associatedAlpha = false;
  bool throughRgba = false;  // decoded by libtiff's RGBA interface
};

double ResolutionOf(TIFF* tiff, ttag_t tag, uint16_t unit) {
  float value = 0;
  if (!TIFFGetField(tiff, tag, &value) || !std::isfinite(value) || value <= 0) return 72.0;
  if (unit == RESUNIT_CENTIMETER) return value * 2.54;
  if (unit == RESUNIT_NONE) return 72.0;
  return value;
}

TiffLayout Inspect(TIFF* tiff, const std::string& path, const TiffMessages& messages) {
  TiffLayout layout;
  if (!TIFFGetField(tiff, TIFFTAG_IMAGEWIDTH, &layout.width) ||
      !TIFFGetField(tiff, TIFFTAG_IMAGELENGTH, &layout.height)) {
    Fail(path, messages, "the file does not give the image size");
  }
  uint16_t sampleFormat = SAMPLEFORMAT_UINT;
  uint16_t compression = COMPRESSION_NONE;
  TIFFGetFieldDefaulted(tiff, TIFFTAG_BITSPERSAMPLE, &layout.bitsPerSample);
  TIFFGetFieldDefaulted(tiff, TIFFTAG_SAMPLESPERPIXEL, &layout.samplesPerPixel);
  TIFFGetFieldDefaulted(tiff, TIFFTAG_PLANARCONFIG, &layout.planarConfig);
  TIFFGetFieldDefaulted(tiff, TIFFTAG_SAMPLEFORMAT, &sampleFormat);
  TIFFGetFieldDefaulted(tiff, TIFFTAG_COMPRESSION, &compression);
  if (!TIFFGetField(tiff, TIFFTAG_PHOTOMETRIC, &layout.photometric)) {
    layout.photometric = layout.samplesPerPixel >= 3 ? PHOTOMETRIC_RGB : PHOTOMETRIC_MINISBLACK;
  }
  if (sampleFormat == SAMPLEFORMAT_IEEEFP || sampleFormat == SAMPLEFORMAT_COMPLEXIEEEFP) {
    throw HostError(path, "floating-point TIFF images are not supported");
  }

  SampleCoding colour = SampleCoding::kDirect;
  switch (layout.photometric) {
    case PHOTOMETRIC_MINISWHITE:
      colour = SampleCoding::kInverted;
      [[fallthrough]];
    case PHOTOMETRIC_MINISBLACK:
      layout.model = ColourModel::kGray;
      layout.codings = {colour};
      layout.throughRgba = layout.bitsPerSample < 8;
      break;
    case PHOTOMETRIC_RGB:
      layout.model = ColourModel::kRgb;
      break;
    case PHOTOMETRIC_SEPARATED: {
      uint16_t inkSet = INKSET_CMYK;
      TIFFGetFieldDefaulted(tiff, TIFFTAG_INKSET, &inkSet);
      if (inkSet != INKSET_CMYK) {
        throw HostError(path, "separated TIFF images with inks other than CMYK are not supported");
      }
      layout.model = ColourModel::kCmyk;
      // The file counts ink from 0; the host counts paper from 0.
      layout.codings.fill(SampleCoding::kInverted);
      break;
    }
    case PHOTOMETRIC_CIELAB:
      layout.model = ColourModel::kLab;
      layout.codings = {SampleCoding::kDirect, SampleCoding::kSignedCentre,
                        SampleCoding::kSignedCentre};
      break;
    case PHOTOMETRIC_ICCLAB:
      layout.model = ColourModel::kLab;
      break;
    case PHOTOMETRIC_YCBCR:
      layout.model = ColourModel::kRgb;
      if (compression == COMPRESSION_JPEG || compression == COMPRESSION_OJPEG) {
        // The JPEG codec converts to RGB itself, keeping the fast path.
        TIFFSetField(tiff, TIFFTAG_JPEGCOLORMODE, JPEGCOLORMODE_RGB);
      } else {
        layout.throughRgba = true;
      }
      break;
    case PHOTOMETRIC_PALETTE:
      layout.model = ColourModel::kRgb;
      layout.throughRgba = true;
      break;
    default:
      throw HostError(path, "TIFF colour interpretation " + std::to_string(layout.photometric) +
                                " is not supported");
  }
  layout.colourSamples =
      layout.photometric == PHOTOMETRIC_PALETTE ? 1 : ColourPlanesOf(layout.model);
  if (layout.samplesPerPixel < layout.colourSamples) {
    throw HostError(path, "the TIFF image has " + std::to_string(layout.samplesPerPixel) +
                              " samples per pixel, too few for its colours");
  }
  if (!layout.throughRgba && layout.bitsPerSample != 8 && layout.bitsPerSample != 16) {
    throw HostError(path, std::to_string(layout.bitsPerSample) +
                              "-bit TIFF images are not supported; only 8 and 16 bits");
  }

  // The first extra sample is transparency when it says so. An RGB image with
  // a fourth sample and no word on it is taken as premultiplied, as libtiff's
  // own RGBA reader takes it.
  uint16_t extraCount = 0;
  uint16_t* extraTypes = nullptr;
  TIFFGetFieldDefaulted(tiff, TIFFTAG_EXTRASAMPLES, &extraCount, &extraTypes);
  const int extra = layout.samplesPerPixel - layout.colourSamples;
  if (extra > 0) {
    if (extraCount > 0 && extraTypes != nullptr) {
      layout.hasTransparency =
          extraTypes[0] == EXTRASAMPLE_ASSOCALPHA || extraTypes[0] == EXTRASAMPLE_UNASSALPHA;
      layout.associatedAlpha = extraTypes[0] == EXTRASAMPLE_ASSOCALPHA;
    } else if (layout.photometric == PHOTOMETRIC_RGB && extra == 1) {
      layout.hasTransparency = true;
      layout.associatedAlpha = true;
    }
  }
  return layout;
}

// Reads the image through libtiff's RGBA interface, which expands palettes,
// low depths and subsampled YCbCr to 8-bit RGBA with premultiplied alpha.
std::unique_ptr<HostDocument> ReadThroughRgba(TIFF* tiff, const TiffLayout& layout,
                                              const std::string& path,
                                              const TiffMessages& messages) {
  char text[1024] = {};
  if (!TIFFRGBAImageOK(tiff, text)) throw HostError(path, std::string("cannot read: ") + text);
  TIFFRGBAImage image;
  // Stop at the first error: otherwise libtiff passes over a strip it
  // cannot decode, leaving its rows as they were, and a damaged file reads
  // as sound (trying again for every chunk of rows, a small damaged file
  // held the reader for minutes).
  if (!TIFFRGBAImageBegin(&image, tiff, 1, text)) {
    throw HostError(path, std::string("cannot read: ") + text);
  }
  struct Ender {
    TIFFRGBAImage* image;
    ~Ender() { TIFFRGBAImageEnd(image); }
  } ender{&image};
  image.req_orientation = ORIENTATION_TOPLEFT;

  const bool gray = layout.model == ColourModel::kGray;
  const bool alpha = image.alpha != 0;
  std::unique_ptr<HostDocument> document = HostDocument::CreateUnfilled(
      static_cast<int32_t>(layout.width), static_cast<int32_t>(layout.height),
      gray ? ImageMode::kGray : ImageMode::kRgb, alpha);
  // Never more rows than the image has: a wide, short image must not cost
  // 64 rows of raster.
  const uint32_t chunkRows = std::min<uint32_t>(64, layout.height);
  std::vector<uint32_t> raster(static_cast<size_t>(layout.width) * chunkRows);
  std::vector<uint8_t> pixels(static_cast<size_t>(layout.width) * 4);
  for (uint32_t top = 0; top < layout.height; top += chunkRows) {
    const uint32_t rows = std::min(chunkRows, layout.height - top);
    image.row_offset = static_cast<int>(top);
    image.col_offset = 0;
    if (!TIFFRGBAImageGet(&image, raster.data(), layout.width, rows)) {
      Fail(path, messages, "the image data are damaged");
    }
    for (uint32_t r = 0; r < rows; ++r) {
      const uint32_t* from = raster.data() + static_cast<size_t>(r) * layout.width;
      for (uint32_t x = 0; x < layout.width; ++x) {
        pixels[4 * x] = static_cast<uint8_t>(TIFFGetR(from[x]));
        pixels[4 * x + 1] = static_cast<uint8_t>(TIFFGetG(from[x]));
        pixels[4 * x + 2] = static_cast<uint8_t>(TIFFGetB(from[x]));
        pixels[4 * x + 3] = static_cast<uint8_t>(TIFFGetA(from[x]));
      }
      if (gray) {
        SpreadSamples(pixels.data(), 4, 0, 1, *document, 0, static_cast<int32_t>(top + r),
                      static_cast<int32_t>(layout.width));
        if (alpha) {
          SpreadSamples(pixels.data() + 3, 4, 1, 1, *document, 0, static_cast<int32_t>(top + r),
                        static_cast<int32_t>(layout.width));
        }
      } else {
        SpreadSamples(pixels.data(), 4, 0, document->PlaneCount(), *document, 0,
                      static_cast<int32_t>(top + r), static_cast<int32_t>(layout.width));
      }
    }
  }
  const std::array<SampleCoding, 3> direct{};
  DecodePlanes(*document, direct, alpha);
  return document;
}

std::unique_ptr<HostDocument> ReadSamples(TIFF* tiff, const TiffLayout& layout,
                                          const std::string& path, const TiffMessages& messages) {
  const ImageMode mode = ModeOf(layout.model, layout.bitsPerSample);
  std::unique_ptr<HostDocument> document = HostDocument::CreateUnfilled(
      static_cast<int32_t>(layout.width), static_cast<int32_t>(layout.height), mode,
      layout.hasTransparency);
  const int kept = document->PlaneCount();
  const bool separate = layout.planarConfig == PLANARCONFIG_SEPARATE;
  const int stride = separate ? 1 : layout.samplesPerPixel;
  const int bytes = layout.bitsPerSample / 8;
  // Separate planes: one pass per stored sample, skipping extras we drop.
  const int passes = separate ? kept : 1;

  const bool tiled = TIFFIsTiled(tiff);
  uint32_t blockWidth = layout.width;
  uint32_t blockHeight = 0;
  if (tiled) {
    if (!TIFFGetField(tiff, TIFFTAG_TILEWIDTH, &blockWidth) ||
        !TIFFGetField(tiff, TIFFTAG_TILELENGTH, &blockHeight) || blockWidth == 0 ||
        blockHeight == 0) {
      Fail(path, messages, "the file's tile size is missing or damaged");
    }
  } else {
    TIFFGetFieldDefaulted(tiff, TIFFTAG_ROWSPERSTRIP, &blockHeight);
    blockHeight = std::clamp<uint32_t>(blockHeight, 1, layout.height);
  }
  const tmsize_t blockSize = tiled ? TIFFTileSize(tiff) : TIFFStripSize(tiff);
  const uint64_t rowBytes = static_cast<uint64_t>(blockWidth) * stride * bytes;
  if (blockSize <= 0 || blockSize > LargestAllocation() ||
      static_cast<uint64_t>(blockSize) < rowBytes) {
    Fail(path, messages, "the file's strip or tile layout is damaged");
  }
  std::vector<uint8_t> block(static_cast<size_t>(blockSize));

  for (int pass = 0; pass < passes; ++pass) {
    const int firstPlane = separate ? pass : 0;
    const int planes = separate ? 1 : kept;
    const auto sample = static_cast<uint16_t>(pass);
    for (uint32_t top = 0; top < layout.height; top += blockHeight) {
      for (uint32_t left = 0; left < layout.width; left += blockWidth) {
        const uint32_t rows = std::min(blockHeight, layout.height - top);
        const uint32_t columns = std::min(blockWidth, layout.width - left);
        tmsize_t got;
        if (tiled) {
          got = TIFFReadEncodedTile(tiff, TIFFComputeTile(tiff, left, top, 0, sample), block.data(),
                                    blockSize);
        } else {
          got = TIFFReadEncodedStrip(tiff, TIFFComputeStrip(tiff, top, sample), block.data(),
                                     blockSize);
        }
        if (got < 0 || static_cast<uint64_t>(got) < rowBytes * rows) {
          Fail(path, messages, "the image data are damaged or cut short");
        }
        for (uint32_t r = 0; r < rows; ++r) {
          SpreadSamples(block.data() + r * rowBytes, stride, firstPlane, planes, *document,
                        static_cast<int32_t>(left), static_cast<int32_t>(top + r),
                        static_cast<int32_t>(columns));
        }
      }
    }
  }
  DecodePlanes(*document, std::span(layout.codings.data(), document->ColourPlanes()),
               layout.associatedAlpha);
  return document;
}

uint16_t PhotometricOf(ColourModel model) {
  switch (model) {
    case ColourModel::kGray:
      return PHOTOMETRIC_MINISBLACK;
    case ColourModel::kRgb:
      return PHOTOMETRIC_RGB;
    case ColourModel::kCmyk:
      return PHOTOMETRIC_SEPARATED;
    case ColourModel::kLab:
      return PHOTOMETRIC_CIELAB;
  }
  return PHOTOMETRIC_MINISBLACK;
}

std::array<SampleCoding, 4> WriteCodings(ColourModel model) {
  switch (model) {
    case ColourModel::kCmyk:
      return {SampleCoding::kInverted, SampleCoding::kInverted, SampleCoding::kInverted,
              SampleCoding::kInverted};
    case ColourModel::kLab:
      return {SampleCoding::kDirect, SampleCoding::kSignedCentre, SampleCoding::kSignedCentre};
    default:
      return {};
  }
}

}  // namespace

std::unique_ptr<HostDocument> TiffFile::Read(const std::string& path) {
  TiffMessages messages;
  TiffHandle tiff = Open(path, "r", messages);
  if (!tiff) Fail(path, messages, "cannot be read as a TIFF file");
  const TiffLayout layout = Inspect(tiff.get(), path, messages);
  if (layout.width < 1 || layout.height < 1 || layout.width > HostDocument::kMaxSide ||
      layout.height > HostDocument::kMaxSide) {
    throw HostError(path, "the image size " + std::to_string(layout.width) + " x " +
                              std::to_string(layout.height) + " is damaged or too large");
  }
  std::unique_ptr<HostDocument> document = layout.throughRgba
                                               ? ReadThroughRgba(tiff.get(), layout, path, messages)
                                               : ReadSamples(tiff.get(), layout, path, messages);
  uint16_t unit = RESUNIT_INCH;
  TIFFGetFieldDefaulted(tiff.get(), TIFFTAG_RESOLUTIONUNIT, &unit);
  document->SetResolution(ResolutionOf(tiff.get(), TIFFTAG_XRESOLUTION, unit),
                          ResolutionOf(tiff.get(), TIFFTAG_YRESOLUTION, unit));
  uint32_t profileBytes = 0;
  const uint8_t* profile = nullptr;
  if (TIFFGetField(tiff.get(), TIFFTAG_ICCPROFILE, &profileBytes, &profile) && profile != nullptr) {
    document->SetColourProfile(std::vector<uint8_t>(profile, profile + profileBytes));
  }
  document->SetSource(path, FileFormat::kTiff);
  return document;
}

void TiffFile::Write(const HostDocument& document, const std::string& path,
                     const WriteOptions& options) {
  // Classic TIFF addresses 4 GiB; larger images go to BigTIFF.
  const uint64_t rawBytes = static_cast<uint64_t>(document.SamplesPerPlane()) *
                            document.PlaneCount() * (document.Depth() / 8);
  const bool big = rawBytes > (uint64_t{3} << 30);
  TiffMessages messages;
  TiffHandle tiff = Open(path, big ? "w8" : "w", messages);
  if (!tiff) Fail(path, messages, "cannot be opened for writing");
  TIFF* t = tiff.get();

  const auto width = static_cast<uint32_t>(document.Width());
  const auto height = static_cast<uint32_t>(document.Height());
  const auto planes = static_cast<uint16_t>(document.PlaneCount());
  bool ok = TIFFSetField(t, TIFFTAG_IMAGEWIDTH, width) &&
            TIFFSetField(t, TIFFTAG_IMAGELENGTH, height) &&
            TIFFSetField(t, TIFFTAG_BITSPERSAMPLE, static_cast<uint16_t>(document.Depth())) &&
            TIFFSetField(t, TIFFTAG_SAMPLESPERPIXEL, planes) &&
            TIFFSetField(t, TIFFTAG_SAMPLEFORMAT, SAMPLEFORMAT_UINT) &&
            TIFFSetField(t, TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG) &&
            TIFFSetField(t, TIFFTAG_PHOTOMETRIC, PhotometricOf(document.Model())) &&
            TIFFSetField(t, TIFFTAG_ORIENTATION, ORIENTATION_TOPLEFT) &&
            TIFFSetField(t, TIFFTAG_XRESOLUTION, static_cast<float>(document.ResolutionX())) &&
            TIFFSetField(t, TIFFTAG_YRESOLUTION, static_cast<float>(document.ResolutionY())) &&
            TIFFSetField(t, TIFFTAG_RESOLUTIONUNIT, RESUNIT_INCH);
  if (ok && document.Model() == ColourModel::kCmyk) {
    ok = TIFFSetField(t, TIFFTAG_INKSET, INKSET_CMYK);
  }
  const std::vector<uint8_t>& profile = document.ColourProfile();
  if (ok && !profile.empty()) {
    ok = TIFFSetField(t, TIFFTAG_ICCPROFILE, static_cast<uint32_t>(profile.size()), profile.data());
  }
  if (ok && document.HasTransparency()) {
    const uint16_t extra[] = {EXTRASAMPLE_UNASSALPHA};
    ok = TIFFSetField(t, TIFFTAG_EXTRASAMPLES, 1, extra);
  }
  if (ok) {
    switch (options.tiffCompression) {
      case TiffCompression::kNone:
        ok = TIFFSetField(t, TIFFTAG_COMPRESSION, COMPRESSION_NONE);
        break;
      case TiffCompression::kLzw:
        ok = TIFFSetField(t, TIFFTAG_COMPRESSION, COMPRESSION_LZW) &&
             TIFFSetField(t, TIFFTAG_PREDICTOR, PREDICTOR_HORIZONTAL);
        break;
      case TiffCompression::kDeflate:
        ok = TIFFSetField(t, TIFFTAG_COMPRESSION, COMPRESSION_ADOBE_DEFLATE) &&
             TIFFSetField(t, TIFFTAG_PREDICTOR, PREDICTOR_HORIZONTAL);
        break;
    }
  }
  ok = ok && TIFFSetField(t, TIFFTAG_ROWSPERSTRIP, TIFFDefaultStripSize(t, 0));
  if (!ok) Fail(path, messages, "cannot describe the image to libtiff");

  const std::array<SampleCoding, 4> codings = WriteCodings(document.Model());
  std::vector<uint8_t> row(static_cast<size_t>(TIFFScanlineSize(t)));
  for (uint32_t y = 0; y < height; ++y) {
    EncodeRow(document, static_cast<int32_t>(y), codings, row.data());
    if (TIFFWriteScanline(t, row.data(), y, 0) < 0) Fail(path, messages, "cannot write the file");
  }
  if (!TIFFFlush(t) || messages.text[0] != '\0') Fail(path, messages, "cannot write the file");
  TIFFClose(tiff.release());
  if (messages.text[0] != '\0') Fail(path, messages, "cannot write the file");
}

}  // namespace Host
