#include "tools/synth/lib/Surface.h"

#include <cmath>
#include <utility>

namespace Synth {

Surface::Surface(std::string name, Vec3 origin, Vec3 uAxis, Vec3 vAxis, double uLength,
                 double vLength, Rgb colour)
    : name_(std::move(name)),
      origin_(origin),
      uAxis_(uAxis),
      vAxis_(vAxis),
      normal_(Cross(uAxis, vAxis)),
      uLength_(uLength),
      vLength_(vLength),
      colour_(colour) {}

Surface Surface::Bar(std::string name, Vec3 start, Vec3 end, double width, const Vec3& facing,
                     Rgb colour) {
  const Vec3 along = end - start;
  const Vec3 sight = 0.5 * (start + end) - facing;
  // Square to the segment and to the sight line to its middle, hence to the
  // sight line to every point of it: the segment and that line span one plane.
  const Vec3 across = Normalised(Cross(along, sight));
  Surface bar(std::move(name), start - (0.5 * width) * across, Normalised(along), across,
              Length(along), width, colour);
  bar.bar_ = true;
  return bar;
}

void Surface::SetChecker(double cell, Rgb other) {
  checkerCell_ = cell;
  checkerOther_ = other;
}

void Surface::AddPatch(Patch patch) { patches_.push_back(std::move(patch)); }

Vec3 Surface::At(double u, double v) const { return origin_ + u * uAxis_ + v * vAxis_; }

bool Surface::Intersect(const Vec3& from, const Vec3& direction, double* t, double* u,
                        double* v) const {
  const double facing = Dot(normal_, direction);
  if (facing == 0.0) return false;
  const double hit = Dot(normal_, origin_ - from) / facing;
  if (!(hit > 0.0)) return false;
  const Vec3 local = from + hit * direction - origin_;
  const double pu = Dot(local, uAxis_);
  const double pv = Dot(local, vAxis_);
  if (pu < 0.0 || pu > uLength_ || pv < 0.0 || pv > vLength_) return false;
  *t = hit;
  *u = pu;
  *v = pv;
  return true;
}

Rgb Surface::ColourAt(double u, double v) const {
  for (auto patch = patches_.rbegin(); patch != patches_.rend(); ++patch) {
    if (u >= patch->u0 && u < patch->u1 && v >= patch->v0 && v < patch->v1) return patch->colour;
  }
  if (checkerCell_ > 0.0) {
    const auto cells = static_cast<long long>(std::floor(u / checkerCell_)) +
                       static_cast<long long>(std::floor(v / checkerCell_));
    if (cells % 2 != 0) return checkerOther_;
  }
  return colour_;
}

std::vector<Edge> Surface::Edges() const {
  std::vector<Edge> edges;
  if (bar_) {
    edges.push_back({name_, At(0, 0.5 * vLength_), At(uLength_, 0.5 * vLength_)});
    return edges;
  }
  edges.push_back({name_ + ".bottom", At(0, 0), At(uLength_, 0)});
  edges.push_back({name_ + ".right", At(uLength_, 0), At(uLength_, vLength_)});
  edges.push_back({name_ + ".top", At(uLength_, vLength_), At(0, vLength_)});
  edges.push_back({name_ + ".left", At(0, vLength_), At(0, 0)});
  if (checkerCell_ > 0.0) {
    // Interior cell lines only; the outermost ones are the outline.
    const int uCells = static_cast<int>(std::lround(uLength_ / checkerCell_));
    const int vCells = static_cast<int>(std::lround(vLength_ / checkerCell_));
    for (int i = 1; i < uCells; ++i) {
      const double u = i * checkerCell_;
      edges.push_back({name_ + ".u" + std::to_string(i), At(u, 0), At(u, vLength_)});
    }
    for (int j = 1; j < vCells; ++j) {
      const double v = j * checkerCell_;
      edges.push_back({name_ + ".v" + std::to_string(j), At(0, v), At(uLength_, v)});
    }
  }
  // A patch side that lies on the outline is the outline's edge already.
  for (const Patch& p : patches_) {
    const std::string id = name_ + "." + p.name;
    if (p.v0 > 0.0) edges.push_back({id + ".bottom", At(p.u0, p.v0), At(p.u1, p.v0)});
    if (p.u1 < uLength_) edges.push_back({id + ".right", At(p.u1, p.v0), At(p.u1, p.v1)});
    if (p.v1 < vLength_) edges.push_back({id + ".top", At(p.u1, p.v1), At(p.u0, p.v1)});
    if (p.u0 > 0.0) edges.push_back({id + ".left", At(p.u0, p.v1), At(p.u0, p.v0)});
  }
  return edges;
}

}  // namespace Synth
