#include "tools/synth/lib/Scene.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace Synth {
namespace {

const Vec3 kX{1.0, 0.0, 0.0};
const Vec3 kY{0.0, 1.0, 0.0};
const Vec3 kZ{0.0, 0.0, 1.0};

}  // namespace

const char* SceneName(SceneKind kind) {
  switch (kind) {
    case SceneKind::kRoom:
      return "room";
    case SceneKind::kFacade:
      return "facade";
    case SceneKind::kChecker:
      return "checker";
    case SceneKind::kSegments:
      return "segments";
  }
  return "?";
}

bool SceneFromName(const std::string& name, SceneKind* kind) {
  for (SceneKind candidate :
       {SceneKind::kRoom, SceneKind::kFacade, SceneKind::kChecker, SceneKind::kSegments}) {
    if (name == SceneName(candidate)) {
      *kind = candidate;
      return true;
    }
  }
  return false;
}

Scene Scene::Make(SceneKind kind) {
  switch (kind) {
    case SceneKind::kFacade:
      return Facade();
    case SceneKind::kChecker:
      return Checker();
    case SceneKind::kSegments:
      return Segments();
    case SceneKind::kRoom:
      break;
  }
  return Room();
}

Scene Scene::Room() {
  Scene scene({0.62, 0.76, 0.92}, {1.5, 0.4, 1.4});
  const Rgb frame{0.97, 0.97, 0.95};
  const Rgb glass{0.30, 0.40, 0.50};
  const Rgb doorFrame{0.35, 0.25, 0.18};
  const Rgb door{0.60, 0.42, 0.28};
  auto addWindow = [&](Surface* wall, double u0, double v0, double u1, double v1) {
    wall->AddPatch({"window.frame", u0, v0, u1, v1, frame});
    wall->AddPatch({"window.glass", u0 + 0.1, v0 + 0.1, u1 - 0.1, v1 - 0.1, glass});
  };
  auto addDoor = [&](Surface* wall, double u0, double u1) {
    wall->AddPatch({"door.frame", u0 - 0.1, 0.0, u1 + 0.1, 2.2, doorFrame});
    wall->AddPatch({"door", u0, 0.0, u1, 2.1, door});
  };

  Surface far("far-wall", {8, -3, 0}, kY, kZ, 6, 3, {0.86, 0.68, 0.55});
  addWindow(&far, 2.0, 0.9, 4.0, 2.4);
  scene.surfaces_.push_back(far);
  Surface left("left-wall", {0, -3, 0}, kX, kZ, 8, 3, {0.50, 0.56, 0.62});
  addWindow(&left, 3.0, 1.0, 5.0, 2.2);
  scene.surfaces_.push_back(left);
  Surface right("right-wall", {0, 3, 0}, kX, kZ, 8, 3, {0.90, 0.86, 0.70});
  addDoor(&right, 5.0, 6.0);
  scene.surfaces_.push_back(right);
  Surface back("back-wall", {0, 3, 0}, {0, -1, 0}, kZ, 6, 3, {0.62, 0.74, 0.80});
  addDoor(&back, 2.5, 3.5);
  scene.surfaces_.push_back(back);
  // After the walls, so that the edges they share are named by the walls.
  Surface floor("floor", {0, -3, 0}, kX, kY, 8, 6, {0.42, 0.36, 0.30});
  floor.SetChecker(0.5, {0.22, 0.18, 0.15});
  scene.surfaces_.push_back(floor);
  scene.surfaces_.emplace_back("ceiling", Vec3{0, -3, 3}, kX, kY, 8, 6, Rgb{0.96, 0.95, 0.93});
  return scene;
}

Scene Scene::Facade() {
  Scene scene({0.62, 0.76, 0.92}, {0.0, 0.0, 1.6});
  Surface ground("ground", {-50, -100, 0}, kX, kY, 250, 200, {0.36, 0.36, 0.34});
  scene.surfaces_.push_back(ground);

  // The wall's middle stands 14 m ahead; it runs to the right and away.
  const double turn = std::numbers::pi / 6.0;
  const Vec3 along{-std::sin(turn), std::cos(turn), 0.0};
  const Vec3 middle{14.0, 0.0, 0.0};
  Surface wall("facade", middle - 14.0 * along, along, kZ, 28, 16, {0.66, 0.40, 0.32});
  for (int floorIndex = 0; floorIndex < 5; ++floorIndex) {
    for (int column = 0; column < 7; ++column) {
      const double u = 2.0 + 4.0 * column;
      const double v = 1.2 + 3.0 * floorIndex;
      wall.AddPatch({"window" + std::to_string(floorIndex) + std::to_string(column), u - 0.7, v,
                     u + 0.7, v + 1.7, Rgb{0.16, 0.20, 0.26}});
    }
  }
  scene.surfaces_.push_back(wall);
  return scene;
}

Scene Scene::Checker() {
  Scene scene({0.45, 0.55, 0.65}, {0.0, 0.0, 0.0});
  Surface board("board", {2.0, -1.5, -1.125}, kY, kZ, 3.0, 2.25, {0.92, 0.92, 0.92});
  board.SetChecker(0.25, {0.08, 0.08, 0.08});
  scene.surfaces_.push_back(board);
  return scene;
}

Scene Scene::Segments() {
  const Vec3 eye{0.0, 0.0, 1.6};
  Scene scene({0.90, 0.91, 0.92}, eye);
  // Dark blue-grey: far from the haze, and never pure black, which is what a
  // corrected image has outside the picture.
  const Rgb ink{0.14, 0.16, 0.22};
  // Each bar is 0.0056 of its distance wide, about 4 to 12 pixels across in
  // a 3000 by 2000 image from a 10 mm fisheye to a 24 mm rectilinear lens.
  const auto add = [&](const std::string& name, const Vec3& start, const Vec3& end) {
    const double distance = Length(0.5 * (start + end) - eye);
    scene.surfaces_.push_back(Surface::Bar("bar." + name, start, end, 0.0056 * distance, eye, ink));
  };
  // The inner and middle rings lie in the plane 5 m ahead, placed by their
  // image positions in a rectilinear view (tangents of the angle right and
  // up): the inner ring inside a 24 mm frame, the middle one outside it but
  // inside a 14 mm frame, so that neither straddles those frames' edges.
  const auto ahead = [&](double right, double up) { return eye + 5.0 * Vec3{1.0, right, up}; };
  add("centre.vertical", ahead(0.08, -0.30), ahead(0.08, 0.30));
  add("centre.level", ahead(-0.50, 0.12), ahead(-0.05, 0.12));
  add("low.level", ahead(0.15, -0.38), ahead(0.60, -0.38));
  add("top.level", ahead(-0.30, 0.42), ahead(0.35, 0.42));
  add("left.vertical", ahead(-0.66, -0.40), ahead(-0.66, 0.30));
  add("right.vertical", ahead(0.66, -0.30), ahead(0.66, 0.40));
  add("right.oblique", ahead(0.20, 0.00), ahead(0.55, 0.20));
  add("left.oblique", ahead(-0.54, -0.02), ahead(-0.36, -0.37));
  add("floor.away", eye + Vec3{2.8, -0.8, -1.3}, eye + Vec3{9.0, -0.8, -1.3});
  add("far-left.vertical", ahead(-1.00, -0.60), ahead(-1.00, 0.50));
  add("far-right.vertical", ahead(1.05, -0.20), ahead(1.05, 0.65));
  add("upper.level", ahead(-0.60, 0.68), ahead(0.50, 0.68));
  add("lower.level", ahead(-0.50, -0.66), ahead(0.70, -0.66));
  add("upper-left.oblique", ahead(-1.18, 0.62), ahead(-0.76, 0.80));
  add("lower-right.oblique", ahead(0.90, -0.60), ahead(1.18, -0.30));
  // The outer ring, outside a 14 mm frame and within 64 degrees of the view
  // axis: placed by the direction of its middle, 5 m away.
  const auto around = [&](const std::string& name, double lonDegrees, double latDegrees,
                          const Vec3& along, double length) {
    constexpr double kDegree = std::numbers::pi / 180.0;
    const Vec3 middle = eye + 5.0 * DirectionOf(lonDegrees * kDegree, latDegrees * kDegree);
    const Vec3 half = (0.5 * length) * Normalised(along);
    add(name, middle - half, middle + half);
  };
  around("zenith.level", 0, 56, kY, 2.6);
  around("nadir.level", 5, -54, kY, 2.6);
  around("far-left-edge.vertical", -64, 0, kZ, 3.0);
  around("far-right-edge.vertical", 62, 6, kZ, 3.0);
  around("top-left.oblique", -48, 40, {0.0, 1.0, 1.0}, 2.2);
  around("bottom-right.oblique", 50, -38, {0.2, 1.0, 0.5}, 2.2);
  return scene;
}

bool Scene::NearestHit(const Vec3& from, const Vec3& direction, double* t) const {
  bool found = false;
  for (const Surface& surface : surfaces_) {
    double hit = 0.0;
    double u = 0.0;
    double v = 0.0;
    if (surface.Intersect(from, direction, &hit, &u, &v) && (!found || hit < *t)) {
      *t = hit;
      found = true;
    }
  }
  return found;
}

Rgb Scene::Trace(const Vec3& from, const Vec3& direction) const {
  const Surface* nearest = nullptr;
  double nearestT = 0.0;
  double nearestU = 0.0;
  double nearestV = 0.0;
  for (const Surface& surface : surfaces_) {
    double t = 0.0;
    double u = 0.0;
    double v = 0.0;
    if (surface.Intersect(from, direction, &t, &u, &v) && (!nearest || t < nearestT)) {
      nearest = &surface;
      nearestT = t;
      nearestU = u;
      nearestV = v;
    }
  }
  return nearest ? nearest->ColourAt(nearestU, nearestV) : sky_;
}

std::vector<Edge> Scene::Edges() const {
  std::vector<Edge> edges;
  for (const Surface& surface : surfaces_) {
    for (Edge& edge : surface.Edges()) {
      const bool known = std::any_of(edges.begin(), edges.end(), [&](const Edge& other) {
        return (other.start == edge.start && other.end == edge.end) ||
               (other.start == edge.end && other.end == edge.start);
      });
      if (!known) edges.push_back(std::move(edge));
    }
  }
  return edges;
}

}  // namespace Synth
