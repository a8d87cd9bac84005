#include "host/io/JpegFile.h"

// jpeglib.h needs FILE and size_t declared first.
#include <cstddef>
#include <cstdio>
// clang-format off
#include <jpeglib.h>
#include <jerror.h>
// clang-format on

#include <algorithm>
#include <array>
#include <cerrno>
#include <cmath>
#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <vector>

#include "host/io/HostError.h"
#include "host/io/SampleCoding.h"

namespace Host {

namespace {

// libjpeg's error manager, extended with where to jump and what was said.
struct JpegErrors {
  jpeg_error_mgr manager;
  std::jmp_buf jump;
  char message[JMSG_LENGTH_MAX];
  bool endedEarly;
};

void OnJpegError(j_common_ptr info) {
  auto* errors = reinterpret_cast<JpegErrors*>(info->err);
  (*info->err->format_message)(info, errors->message);
  std::longjmp(errors->jump, 1);
}

// Warnings are dropped, except the two for image data that end early: at
// the end of the file, or at a marker (a file cut short and closed with an
// end marker, or one whose data stop before the next segment). libjpeg then
// pads the image with gray and carries on, which the host refuses: a few
// hundred bytes could otherwise stand for a whole image of gray.
void OnJpegMessage(j_common_ptr info, int level) {
  auto* errors = reinterpret_cast<JpegErrors*>(info->err);
  const int code = info->err->msg_code;
  if (level < 0 && (code == JWRN_JPEG_EOF || code == JWRN_HIT_MARKER)) errors->endedEarly = true;
}

// Shared by the callbacks and the C-style steps: plain data only, so that a
// longjmp across it leaves nothing to destroy.
struct JpegReadJob {
  jpeg_decompress_struct jpeg;
  JpegErrors errors;
  jpeg_progress_mgr progress;
  bool created;
  std::FILE* file;
  bool adobe;
  J_COLOR_SPACE fileSpace;
  JSAMPROW row;
  HostDocument* target;
  JOCTET* profile;  // libjpeg's malloc, freed with the job
  unsigned profileBytes;
};

struct JpegWriteJob {
  jpeg_compress_struct jpeg;
  JpegErrors errors;
  bool created;
  std::FILE* file;
  int quality;
  JSAMPROW row;
  const HostDocument* source;
};

// Real files hold about ten scans; each scan of a progressive file is a
// pass over the whole image, so a short file of many empty scans could keep
// the reader busy for minutes. Past this many the file is refused.
constexpr int kMostScans = 1000;

void OnJpegProgress(j_common_ptr info) {
  if (!info->is_decompressor) return;
  if (reinterpret_cast<j_decompress_ptr>(info)->input_scan_number <= kMostScans) return;
  auto* errors = reinterpret_cast<JpegErrors*>(info->err);
  std::snprintf(errors->message, sizeof errors->message, "more than %d scans", kMostScans);
  std::longjmp(errors->jump, 1);
}

void InitErrors(JpegErrors* errors) {
  jpeg_std_error(&errors->manager);
  errors->manager.error_exit = OnJpegError;
  errors->manager.emit_message = OnJpegMessage;
  errors->message[0] = '\0';
  errors->endedEarly = false;
}

// Each step returns false when libjpeg failed; errors.message then says why.

bool ReadJpegHeader(JpegReadJob* job) {
  job->jpeg.err = &job->errors.manager;
  if (setjmp(job->errors.jump)) return false;
  jpeg_create_decompress(&job->jpeg);
  job->created = true;
  job->progress.progress_monitor = OnJpegProgress;
  job->jpeg.progress = &job->progress;
  // libjpeg's whole-image buffers (progressive and multi-scan files) are
  // held to the document limit; past it the file is refused.
  job->jpeg.mem->max_memory_to_use = static_cast<long>(
      std::min<uint64_t>(HostDocument::MemoryLimit(), std::numeric_limits<long>::max()));
  jpeg_stdio_src(&job->jpeg, job->file);
  // An embedded colour profile comes in APP2 markers, which libjpeg drops
  // unless asked to keep them.
  jpeg_save_markers(&job->jpeg, JPEG_APP0 + 2, 0xFFFF);
  jpeg_read_header(&job->jpeg, TRUE);
  // Only now: the saved markers are gone once decompression is finished.
  // A damaged profile is a warning, and the image is read without it.
  if (!jpeg_read_icc_profile(&job->jpeg, &job->profile, &job->profileBytes)) {
    job->profile = nullptr;
  }
  job->adobe = job->jpeg.saw_Adobe_marker;
  job->fileSpace = job->jpeg.jpeg_color_space;
  switch (job->fileSpace) {
    case JCS_GRAYSCALE:
      job->jpeg.out_color_space = JCS_GRAYSCALE;
      break;
    case JCS_CMYK:
    case JCS_YCCK:
      job->jpeg.out_color_space = JCS_CMYK;
      break;
    default:
      job->jpeg.out_color_space = JCS_RGB;
      break;
  }
  job->jpeg.dct_method = JDCT_ISLOW;
  jpeg_calc_output_dimensions(&job->jpeg);
  return true;
}

bool ReadJpegRows(JpegReadJob* job) {
  if (setjmp(job->errors.jump)) return false;
  jpeg_start_decompress(&job->jpeg);
  const int components = job->jpeg.output_components;
  const auto width = static_cast<int32_t>(job->jpeg.output_width);
  while (job->jpeg.output_scanline < job->jpeg.output_height) {
    const auto y = static_cast<int32_t>(job->jpeg.output_scanline);
    if (jpeg_read_scanlines(&job->jpeg, &job->row, 1) != 1) return false;
    // Stop at once: a damaged size could otherwise have libjpeg pad out a
    // huge image row by row.
    if (job->errors.endedEarly) return false;
    SpreadSamples(job->row, components, 0, components, *job->target, 0, y, width);
  }
  jpeg_finish_decompress(&job->jpeg);
  return true;
}

bool WriteJpegRows(JpegWriteJob* job) {
  job->jpeg.err = &job->errors.manager;
  if (setjmp(job->errors.jump)) return false;
  jpeg_create_compress(&job->jpeg);
  job->created = true;
  jpeg_stdio_dest(&job->jpeg, job->file);
  const HostDocument& source = *job->source;
  job->jpeg.image_width = static_cast<JDIMENSION>(source.Width());
  job->jpeg.image_height = static_cast<JDIMENSION>(source.Height());
  job->jpeg.input_components = source.ColourPlanes();
  switch (source.Model()) {
    case ColourModel::kGray:
      job->jpeg.in_color_space = JCS_GRAYSCALE;
      break;
    case ColourModel::kCmyk:
      job->jpeg.in_color_space = JCS_CMYK;
      break;
    default:
      job->jpeg.in_color_space = JCS_RGB;
      break;
  }
  jpeg_set_defaults(&job->jpeg);
  jpeg_set_quality(&job->jpeg, job->quality, TRUE);
  if (job->quality >= 90) {
    for (int c = 0; c < job->jpeg.num_components; ++c) {
      job->jpeg.comp_info[c].h_samp_factor = 1;
      job->jpeg.comp_info[c].v_samp_factor = 1;
    }
  }
  job->jpeg.dct_method = JDCT_ISLOW;
  job->jpeg.optimize_coding = TRUE;
  job->jpeg.density_unit = 1;  // dots per inch
  job->jpeg.X_density =
      static_cast<UINT16>(std::clamp(std::lround(source.ResolutionX()), 1L, 65535L));
  job->jpeg.Y_density =
      static_cast<UINT16>(std::clamp(std::lround(source.ResolutionY()), 1L, 65535L));
  jpeg_start_compress(&job->jpeg, TRUE);
  const std::vector<uint8_t>& profile = source.ColourProfile();
  if (!profile.empty()) {
    jpeg_write_icc_profile(&job->jpeg, profile.data(), static_cast<unsigned>(profile.size()));
  }
  // The host's CMYK counts paper, as Adobe-marked files do: no change.
  const std::array<SampleCoding, 4> direct{};
  while (job->jpeg.next_scanline < job->jpeg.image_height) {
    EncodeRow(source, static_cast<int32_t>(job->jpeg.next_scanline), direct, job->row);
    jpeg_write_scanlines(&job->jpeg, &job->row, 1);
  }
  jpeg_finish_compress(&job->jpeg);
  return true;
}

[[noreturn]] void Fail(const std::string& path, const JpegErrors& errors, const std::string& what) {
  if (errors.message[0] != '\0') throw HostError(path, what + " (" + errors.message + ")");
  throw HostError(path, what);
}

double DotsPerInch(int unit, int density) {
  if (density <= 0) return 72.0;
  if (unit == 1) return density;
  if (unit == 2) return density * 2.54;
  return 72.0;  // an aspect ratio only
}

}  // namespace

std::unique_ptr<HostDocument> JpegFile::Read(const std::string& path) {
  JpegReadJob job{};
  InitErrors(&job.errors);
  struct Owner {
    JpegReadJob& job;
    ~Owner() {
      if (job.created) jpeg_destroy_decompress(&job.jpeg);
      if (job.file != nullptr) std::fclose(job.file);
      std::free(job.profile);
    }
  } owner{job};
  job.file = std::fopen(path.c_str(), "rb");
  if (job.file == nullptr)
    throw HostError(path, std::string("cannot open: ") + std::strerror(errno));
  if (!ReadJpegHeader(&job)) Fail(path, job.errors, "is not a readable JPEG file");
  if (job.errors.endedEarly) throw HostError(path, "is cut short");

  const int components = job.jpeg.output_components;
  ColourModel model;
  switch (job.jpeg.out_color_space) {
    case JCS_GRAYSCALE:
      model = ColourModel::kGray;
      break;
    case JCS_CMYK:
      model = ColourModel::kCmyk;
      break;
    default:
      model = ColourModel::kRgb;
      break;
  }
  if (components != ColourPlanesOf(model)) {
    throw HostError(path, "has a JPEG layout this host cannot read");
  }
  std::unique_ptr<HostDocument> document = HostDocument::CreateUnfilled(
      static_cast<int32_t>(job.jpeg.output_width), static_cast<int32_t>(job.jpeg.output_height),
      ModeOf(model, 8), false);
  std::vector<JSAMPLE> row(static_cast<size_t>(job.jpeg.output_width) * components);
  job.row = row.data();
  job.target = document.get();
  const bool read = ReadJpegRows(&job);
  if (job.errors.endedEarly) throw HostError(path, "is cut short: the image data end early");
  if (!read) Fail(path, job.errors, "is damaged");

  std::array<SampleCoding, 4> codings{};
  if (model == ColourModel::kCmyk && !job.adobe) codings.fill(SampleCoding::kInverted);
  DecodePlanes(*document, codings, false);
  if (job.jpeg.saw_JFIF_marker) {
    document->SetResolution(DotsPerInch(job.jpeg.density_unit, job.jpeg.X_density),
                            DotsPerInch(job.jpeg.density_unit, job.jpeg.Y_density));
  }
  if (job.profile != nullptr) {
    document->SetColourProfile(std::vector<uint8_t>(job.profile, job.profile + job.profileBytes));
  }
  document->SetSource(path, FileFormat::kJpeg);
  return document;
}

void JpegFile::Write(const HostDocument& document, const std::string& path, int quality) {
  if (document.Depth() != 8) {
    throw HostError(path, std::string("JPEG cannot hold ") + ModeName(document.Mode()) + " images");
  }
  if (document.Model() == ColourModel::kLab) {
    throw HostError(path, "JPEG files from this host cannot hold Lab images");
  }
  if (document.HasTransparency()) throw HostError(path, "JPEG cannot hold transparency");
  if (quality < 1 || quality > 100) {
    throw HostError(path, "JPEG quality " + std::to_string(quality) + " is outside 1 to 100");
  }
  JpegWriteJob job{};
  InitErrors(&job.errors);
  struct Owner {
    JpegWriteJob& job;
    ~Owner() {
      if (job.created) jpeg_destroy_compress(&job.jpeg);
      if (job.file != nullptr) std::fclose(job.file);
    }
  } owner{job};
  job.file = std::fopen(path.c_str(), "wb");
  if (job.file == nullptr) {
    throw HostError(path, std::string("cannot open for writing: ") + std::strerror(errno));
  }
  std::vector<JSAMPLE> row(static_cast<size_t>(document.Width()) * document.ColourPlanes());
  job.row = row.data();
  job.source = &document;
  job.quality = quality;
  if (!WriteJpegRows(&job)) Fail(path, job.errors, "cannot be written");
  std::FILE* file = job.file;
  job.file = nullptr;
  const bool failed = std::ferror(file) != 0;
  if (std::fclose(file) != 0 || failed) {
    throw HostError(path, std::string("cannot be written: ") + std::strerror(errno));
  }
}

}  // namespace Host
