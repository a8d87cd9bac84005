// Writes the seed corpora that the project's own writers make: descriptors
// and constraint blobs from actions, preferences as the filter saves them,
// photographs in every layout the host writes, and their XMP packets.
// scripts/fuzz-seeds.sh runs it over generated photographs and actions.
//
//   fuzz_seed_maker <corpus folder> <action>... -- <photograph>...
#include <cstdio>
// clang-format off
#include <jpeglib.h>
// clang-format on
#include <png.h>
#include <tiffio.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string>
#include <vector>

#include "framework/files/CMemoryContainer.h"
#include "host/actions/ActionFile.h"
#include "host/io/HostDocument.h"
#include "host/io/ImageFile.h"
#include "host/io/MetadataPacket.h"
#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "params/PPreferences.h"

namespace {

namespace fs = std::filesystem;

fs::path corpus;

void Put(const std::string& target, const std::string& name, const void* bytes, size_t size) {
  fs::create_directories(corpus / target);
  std::ofstream out(corpus / target / name, std::ios::binary | std::ios::trunc);
  out.write(static_cast<const char*>(bytes), static_cast<std::streamsize>(size));
  if (!out) throw std::runtime_error("cannot write " + (corpus / target / name).string());
}

template <class Bytes>
void Put(const std::string& target, const std::string& name, const Bytes& bytes) {
  Put(target, name, bytes.data(), bytes.size());
}

void FromAction(const fs::path& path) {
  const std::string stem = path.stem().string();
  const Host::Descriptor descriptor = Host::ActionFile::Read(path.string());
  Put("action_file", stem + ".action", Host::ActionFile::Format(descriptor));
  Put("descriptor", stem + ".desc", descriptor.ToBytes());
  const auto* blob = descriptor.Find(Project::DescriptorKey::kConstraintData);
  if (blob != nullptr && !blob->data.empty()) {
    Put("constraint_blob", stem + ".cnsd", blob->data);
  }
}

void Preferences() {
  Project::PPreferences preferences(640);
  Tarsa::CMemoryContainer native;
  preferences.Write(native);
  std::vector<uint8_t> bytes(native.Size());
  native.SetPosition(0);
  native.Read(bytes.data(), static_cast<uint32_t>(bytes.size()));
  Put("preferences", "defaults.qmp", bytes);

  preferences.displayFlags = 1;
  preferences.windowLocation = {40, 60, 1240, 860};
  preferences.settings.lastLoadDirectory = Tarsa::CString(std::string("/home/photos/2024"));
  preferences.settings.focalLength = 14.5f;
  Tarsa::CMemoryContainer swapped;
  swapped.SetSwapBytes(true);
  preferences.Write(swapped);
  bytes.resize(swapped.Size());
  swapped.SetPosition(0);
  swapped.Read(bytes.data(), static_cast<uint32_t>(bytes.size()));
  Put("preferences", "placed-other-byte-order.qmp", bytes);
}

void Polygons() {
  Project::BlobPolygon polygon;
  polygon.points = {{10, 10}, {50, 12}, {48, 40}, {12, 38}};
  polygon.edgeKinds = {2, 3, 2, 3};
  Project::BlobLine arbitrary{5, 5, 60, 30, 4, 25.0f};
  Put("constraint_blob", "polygon-and-angled-line.cnsd",
      Project::ConstraintBlob::Encode({polygon, arbitrary}));
}

void FromPhotograph(const fs::path& path) {
  const std::string stem = path.stem().string();
  const std::string packet = Host::MetadataPacket::FromFile(path.string());
  if (!packet.empty()) Put("xmp", stem + ".xmp", packet);

  const auto document = Host::ImageFile::Read(path.string());
  const fs::path scratch = fs::temp_directory_path() / "archway-seed";
  fs::create_directories(scratch);
  const auto write = [&](const std::string& target, const std::string& name,
                         const Host::HostDocument& image, const Host::WriteOptions& options) {
    const fs::path file = scratch / name;
    if (!Host::ImageFile::WriteRefusal(image, Host::ImageFile::FormatFromName(name)).empty()) {
      return;
    }
    Host::ImageFile::Write(image, file.string(), options);
    std::ifstream in(file, std::ios::binary);
    const std::string bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    Put(target, name, bytes);
  };
  Host::WriteOptions options;
  options.tiffCompression = Host::TiffCompression::kNone;
  write("tiff", stem + ".tif", *document, options);
  options.tiffCompression = Host::TiffCompression::kLzw;
  write("tiff", stem + "-lzw.tif", *document, options);
  write("png", stem + ".png", *document, options);
  options.jpegQuality = 60;
  write("jpeg", stem + ".jpg", *document, options);
}

// The layouts the host reads but does not write, made with the image
// libraries themselves: a gradient of 32 x 24 in each.
std::vector<uint8_t> Gradient(int width, int height, int samples) {
  std::vector<uint8_t> pixels(static_cast<size_t>(width) * height * samples);
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      for (int c = 0; c < samples; ++c) {
        pixels[(static_cast<size_t>(y) * width + x) * samples + c] =
            static_cast<uint8_t>(x * 8 + y * 5 + c * 60);
      }
    }
  }
  return pixels;
}

std::string FileBytes(const fs::path& file) {
  std::ifstream in(file, std::ios::binary);
  return std::string((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
}

struct TiffLayout {
  const char* name;
  uint16_t photometric;
  uint16_t samples;
  uint16_t bits;
  uint16_t planar;
  bool tiled;
  uint16_t compression;
  uint16_t extra;  // the first extra sample's kind, when samples has one
};

void TiffLayouts(const fs::path& scratch) {
  constexpr int kWidth = 32, kHeight = 24;
  const TiffLayout layouts[] = {
      {"rgb-tiled", PHOTOMETRIC_RGB, 3, 8, PLANARCONFIG_CONTIG, true, COMPRESSION_NONE, 0},
      {"rgba-separate-associated", PHOTOMETRIC_RGB, 4, 8, PLANARCONFIG_SEPARATE, false,
       COMPRESSION_PACKBITS, EXTRASAMPLE_ASSOCALPHA},
      {"rgb16-separate-tiled", PHOTOMETRIC_RGB, 3, 16, PLANARCONFIG_SEPARATE, true,
       COMPRESSION_ADOBE_DEFLATE, 0},
      {"palette", PHOTOMETRIC_PALETTE, 1, 8, PLANARCONFIG_CONTIG, false, COMPRESSION_LZW, 0},
      {"bilevel-white-is-zero", PHOTOMETRIC_MINISWHITE, 1, 1, PLANARCONFIG_CONTIG, false,
       COMPRESSION_CCITTFAX4, 0},
      {"gray4", PHOTOMETRIC_MINISBLACK, 1, 4, PLANARCONFIG_CONTIG, false, COMPRESSION_NONE, 0},
      {"ycbcr-jpeg", PHOTOMETRIC_YCBCR, 3, 8, PLANARCONFIG_CONTIG, false, COMPRESSION_JPEG, 0},
      {"icclab", PHOTOMETRIC_ICCLAB, 3, 8, PLANARCONFIG_CONTIG, false, COMPRESSION_NONE, 0},
  };
  for (const TiffLayout& layout : layouts) {
    const fs::path file = scratch / (std::string(layout.name) + ".tif");
    TIFF* tiff = TIFFOpen(file.c_str(), "w");
    if (tiff == nullptr) throw std::runtime_error("cannot write " + file.string());
    TIFFSetField(tiff, TIFFTAG_IMAGEWIDTH, kWidth);
    TIFFSetField(tiff, TIFFTAG_IMAGELENGTH, kHeight);
    TIFFSetField(tiff, TIFFTAG_BITSPERSAMPLE, layout.bits);
    TIFFSetField(tiff, TIFFTAG_SAMPLESPERPIXEL, layout.samples);
    TIFFSetField(tiff, TIFFTAG_PHOTOMETRIC, layout.photometric);
    TIFFSetField(tiff, TIFFTAG_PLANARCONFIG, layout.planar);
    TIFFSetField(tiff, TIFFTAG_COMPRESSION, layout.compression);
    if (layout.extra != 0) {
      const uint16_t extra[] = {layout.extra};
      TIFFSetField(tiff, TIFFTAG_EXTRASAMPLES, 1, extra);
    }
    if (layout.photometric == PHOTOMETRIC_PALETTE) {
      std::vector<uint16_t> r(256), g(256), b(256);
      for (int i = 0; i < 256; ++i) {
        r[i] = static_cast<uint16_t>(i * 257);
        g[i] = static_cast<uint16_t>((255 - i) * 257);
        b[i] = static_cast<uint16_t>((i * 7 % 256) * 257);
      }
      TIFFSetField(tiff, TIFFTAG_COLORMAP, r.data(), g.data(), b.data());
    }
    if (layout.compression == COMPRESSION_JPEG) {
      TIFFSetField(tiff, TIFFTAG_JPEGCOLORMODE, JPEGCOLORMODE_RGB);
      TIFFSetField(tiff, TIFFTAG_YCBCRSUBSAMPLING, 2, 2);
      TIFFSetField(tiff, TIFFTAG_ROWSPERSTRIP, 16);
    } else if (!layout.tiled) {
      TIFFSetField(tiff, TIFFTAG_ROWSPERSTRIP, 8);
    }
    if (layout.tiled) {
      TIFFSetField(tiff, TIFFTAG_TILEWIDTH, 16);
      TIFFSetField(tiff, TIFFTAG_TILELENGTH, 16);
    }
    const int planes = layout.planar == PLANARCONFIG_SEPARATE ? layout.samples : 1;
    const std::vector<uint8_t> pixels = Gradient(kWidth * 2, kHeight, layout.samples);
    bool ok = true;
    for (int plane = 0; plane < planes && ok; ++plane) {
      const auto sample = static_cast<uint16_t>(plane);
      if (layout.tiled) {
        std::vector<uint8_t> tile(static_cast<size_t>(TIFFTileSize(tiff)));
        for (int y = 0; y < kHeight; y += 16) {
          for (int x = 0; x < kWidth; x += 16) {
            for (size_t i = 0; i < tile.size(); ++i) tile[i] = pixels[(i + x + y) % pixels.size()];
            ok = ok && TIFFWriteTile(tiff, tile.data(), x, y, 0, sample) >= 0;
          }
        }
      } else {
        const size_t row = static_cast<size_t>(TIFFScanlineSize(tiff));
        for (int y = 0; y < kHeight && ok; ++y) {
          std::vector<uint8_t> line(pixels.begin() + static_cast<long>(y * row),
                                    pixels.begin() + static_cast<long>((y + 1) * row));
          ok = TIFFWriteScanline(tiff, line.data(), y, sample) >= 0;
        }
      }
    }
    TIFFClose(tiff);
    if (!ok) throw std::runtime_error("libtiff could not write " + file.string());
    Put("tiff", file.filename().string(), FileBytes(file));
  }
}

void PngLayout(const fs::path& scratch, const char* name, int colourType, int depth,
               bool interlaced, bool transparentColour) {
  constexpr int kWidth = 32, kHeight = 24;
  const fs::path file = scratch / (std::string(name) + ".png");
  std::FILE* out = std::fopen(file.c_str(), "wb");
  if (out == nullptr) throw std::runtime_error("cannot write " + file.string());
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
  png_infop info = png_create_info_struct(png);
  png_init_io(png, out);
  png_set_IHDR(png, info, kWidth, kHeight, depth, colourType,
               interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
               PNG_FILTER_TYPE_DEFAULT);
  if (colourType == PNG_COLOR_TYPE_PALETTE) {
    png_color palette[16];
    png_byte alpha[16];
    for (int i = 0; i < 16; ++i) {
      palette[i] = {static_cast<png_byte>(i * 16), static_cast<png_byte>(255 - i * 16),
                    static_cast<png_byte>(i * 40)};
      alpha[i] = static_cast<png_byte>(i * 17);
    }
    png_set_PLTE(png, info, palette, 16);
    png_set_tRNS(png, info, alpha, 16, nullptr);
  } else if (transparentColour) {
    png_color_16 colour{};
    colour.gray = 3;
    colour.red = colour.green = colour.blue = 40;
    png_set_tRNS(png, info, nullptr, 0, &colour);
  }
  png_write_info(png, info);
  const int samples = png_get_channels(png, info);
  const size_t rowBytes = png_get_rowbytes(png, info);
  const std::vector<uint8_t> pixels = Gradient(kWidth * 2, kHeight, samples);
  std::vector<png_bytep> rows(kHeight);
  std::vector<uint8_t> image(rowBytes * kHeight);
  for (int y = 0; y < kHeight; ++y) {
    std::copy_n(pixels.begin() + static_cast<long>(y * rowBytes), rowBytes,
                image.begin() + static_cast<long>(y * rowBytes));
    rows[y] = image.data() + y * rowBytes;
  }
  png_write_image(png, rows.data());
  png_write_end(png, info);
  png_destroy_write_struct(&png, &info);
  std::fclose(out);
  Put("png", file.filename().string(), FileBytes(file));
}

void JpegLayout(const fs::path& scratch, const char* name, J_COLOR_SPACE space, int components,
                bool progressive) {
  constexpr int kWidth = 32, kHeight = 24;
  const fs::path file = scratch / (std::string(name) + ".jpg");
  std::FILE* out = std::fopen(file.c_str(), "wb");
  if (out == nullptr) throw std::runtime_error("cannot write " + file.string());
  jpeg_compress_struct jpeg{};
  jpeg_error_mgr errors{};
  jpeg.err = jpeg_std_error(&errors);
  jpeg_create_compress(&jpeg);
  jpeg_stdio_dest(&jpeg, out);
  jpeg.image_width = kWidth;
  jpeg.image_height = kHeight;
  jpeg.input_components = components;
  jpeg.in_color_space = space;
  jpeg_set_defaults(&jpeg);
  jpeg_set_quality(&jpeg, 50, TRUE);
  if (progressive) jpeg_simple_progression(&jpeg);
  // Without the Adobe marker a CMYK file counts ink.
  if (space == JCS_CMYK) jpeg.write_Adobe_marker = FALSE;
  jpeg_start_compress(&jpeg, TRUE);
  const std::vector<uint8_t> pixels = Gradient(kWidth, kHeight, components);
  while (jpeg.next_scanline < jpeg.image_height) {
    JSAMPROW row = const_cast<JSAMPROW>(pixels.data()) +
                   static_cast<size_t>(jpeg.next_scanline) * kWidth * components;
    jpeg_write_scanlines(&jpeg, &row, 1);
  }
  jpeg_finish_compress(&jpeg);
  jpeg_destroy_compress(&jpeg);
  std::fclose(out);
  Put("jpeg", file.filename().string(), FileBytes(file));
}

void OtherLayouts() {
  const fs::path scratch = fs::temp_directory_path() / "archway-seed-layouts";
  fs::create_directories(scratch);
  TiffLayouts(scratch);
  PngLayout(scratch, "palette-transparent", PNG_COLOR_TYPE_PALETTE, 4, false, false);
  PngLayout(scratch, "gray-alpha-interlaced", PNG_COLOR_TYPE_GRAY_ALPHA, 8, true, false);
  PngLayout(scratch, "rgba16-interlaced", PNG_COLOR_TYPE_RGB_ALPHA, 16, true, false);
  PngLayout(scratch, "gray2-transparent-colour", PNG_COLOR_TYPE_GRAY, 2, false, true);
  PngLayout(scratch, "rgb-transparent-colour", PNG_COLOR_TYPE_RGB, 8, false, true);
  JpegLayout(scratch, "rgb-progressive", JCS_RGB, 3, true);
  JpegLayout(scratch, "cmyk-ink-progressive", JCS_CMYK, 4, true);
  JpegLayout(scratch, "gray-progressive", JCS_GRAYSCALE, 1, true);
  fs::remove_all(scratch);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 2) {
    std::cerr << "usage: fuzz_seed_maker <corpus folder> <action>... -- <photograph>...\n";
    return 2;
  }
  try {
    corpus = argv[1];
    bool photographs = false;
    for (int i = 2; i < argc; ++i) {
      const std::string argument = argv[i];
      if (argument == "--") {
        photographs = true;
      } else if (photographs) {
        FromPhotograph(argument);
      } else {
        FromAction(argument);
      }
    }
    Preferences();
    Polygons();
    OtherLayouts();
  } catch (const std::exception& error) {
    std::cerr << "fuzz_seed_maker: " << error.what() << "\n";
    return 1;
  }
  return 0;
}
