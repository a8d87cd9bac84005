#pragma once

#include <string>
#include <vector>

#include "tools/synth/lib/Geometry.h"

namespace Synth {

// A straight edge of the scene: where two colours meet along a segment.
struct Edge {
  std::string id;
  Vec3 start;
  Vec3 end;
};

// A flat rectangle of the scene, painted. It spans origin + u U + v V for u
// in [0, uLength] and v in [0, vLength], with U and V orthonormal. Its paint
// is a base colour, optionally a checker of cells alternating with a second
// colour, and on top rectangles of other colours (windows, doors, frames),
// the later over the earlier. Every boundary between two paints is a straight
// edge and is listed by Edges(), and so is the rectangle's own outline. A
// bar is a long narrow rectangle that stands for its centreline: its edge is
// the centreline along U, named after the bar, and nothing else.
class Surface {
 public:
  struct Patch {
    std::string name;
    double u0, v0, u1, v1;
    Rgb colour;
  };

  Surface(std::string name, Vec3 origin, Vec3 uAxis, Vec3 vAxis, double uLength, double vLength,
          Rgb colour);

  // A bar of the given width along the straight segment from start to end,
  // turned about that segment to face the point `facing` (a camera's
  // standpoint), so that its width is square to the line of sight all along.
  static Surface Bar(std::string name, Vec3 start, Vec3 end, double width, const Vec3& facing,
                     Rgb colour);

  void SetChecker(double cell, Rgb other);
  void AddPatch(Patch patch);

  // The ray's parameter t > 0 where it meets the rectangle, and the point's
  // (u, v); false when it misses.
  bool Intersect(const Vec3& from, const Vec3& direction, double* t, double* u, double* v) const;
  Rgb ColourAt(double u, double v) const;
  std::vector<Edge> Edges() const;

 private:
  Vec3 At(double u, double v) const;

  std::string name_;
  Vec3 origin_;
  Vec3 uAxis_;
  Vec3 vAxis_;
  Vec3 normal_;
  double uLength_;
  double vLength_;
  Rgb colour_;
  double checkerCell_ = 0.0;
  Rgb checkerOther_;
  std::vector<Patch> patches_;
  bool bar_ = false;
};

}  // namespace Synth
