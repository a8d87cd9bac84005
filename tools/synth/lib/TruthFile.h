#pragma once

#include <string>
#include <vector>

#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/TruthTracer.h"

namespace Synth {

// The ground truth beside a photograph, as text. Lines starting with '#' are
// comments (the header names the image size, the projection, its focal
// length in pixels and centre). Then one line per visible edge run:
//
//   id x0 y0 z0 x1 y1 z1 n u1 v1 u2 v2 ... un vn
//
// id has no spaces; (x0, y0, z0) and (x1, y1, z1) are the run's 3-D end
// points in metres (x forward, y right, z up); n is the number of image
// points that follow, in pixels with y downwards, the pixel (i, j) being the
// square [i, i + 1) x [j, j + 1). Neighbouring points are at most one pixel
// apart. Operations only.
class TruthFile {
 public:
  TruthFile() = delete;

  static std::string Format(const RenderResult& photo);
  // Throws HostError naming the file when it cannot be written; the file
  // appears complete or not at all.
  static void Write(const RenderResult& photo, const std::string& path);
};

}  // namespace Synth
