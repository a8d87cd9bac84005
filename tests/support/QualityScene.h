#pragma once

// Solved scenes from the synthetic photograph generator: one photograph with
// a constraint list on its solver, the scene's straight edges picked as a
// user would click them, and scene planes for polygons. The measures of how
// straight, level and flat the solve leaves them are in QualityMeasures.h.

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "solver/constraints/ConstraintList.h"
#include "solver/constraints/LineConstraint.h"
#include "solver/frame/Solver.h"
#include "tests/support/QualityContext.h"
#include "tools/synth/lib/Geometry.h"

namespace Project::testing {

// Finds the mesh cell of photograph points that come one after another
// along a curve: first around the last point's cell, then by the solver's
// full search.
class CellLocator {
 public:
  CellLocator(const Solver& solver, const SolverContext& context)
      : solver_(solver), width_(context.SourceWidth()), height_(context.SourceHeight()) {}

  // The point's texture fraction and its cell; false off the mesh.
  bool Locate(Synth::Point2 p, float fraction[2], OctaMap::Cell& cell);

  const Solver& solver() const { return solver_; }

 private:
  const Solver& solver_;
  double width_, height_;
  OctaMap::Cell last_;
};

// A straight scene edge chosen as a constraint: its image curve from the
// generator, cut back to the mesh, and how it is pinned.
struct PickedLine {
  std::string id;
  std::vector<Synth::Point2> curve;
  std::int32_t orientation = LineConstraint::kUnfixed;
  std::int32_t constraintId = -1;
};

// Narrows [first, last] of a curve's points to the stretch that lies on the
// mesh; false when there is none.
using OnMesh = std::function<bool(const std::vector<Synth::Point2>& points, std::size_t& first,
                                  std::size_t& last)>;

// Edges of the scene as the camera sees it, taken in turn from the longest
// vertical, level-and-square-to-the-view and other edges: verticals pinned
// vertical and level ones horizontal when `pin` is set, the rest free. Each
// run is cut back to the stretch about its middle that lies on the mesh,
// and 2 pixels more, as a user's clicks would: a run may end on the
// picture's border or where the lens's field ends, beyond the mesh's last
// whole cell.
std::vector<PickedLine> PickLines(const Synth::Scene& scene, const Synth::Camera& camera,
                                  std::size_t count, bool pin, const OnMesh& onMesh,
                                  double minLength = 100.0);

// A planar rectangle of the scene, by its corner and two edge vectors.
struct ScenePlane {
  Synth::Vec3 origin;
  Synth::Vec3 u;
  Synth::Vec3 v;
  Synth::Vec3 At(double s, double t) const { return origin + s * u + t * v; }
};

// The far wall of the room, a little inside its edges.
ScenePlane RoomFarWall();
// The middle of the facade's wall, which is turned 30 degrees from square.
ScenePlane FacadeWall();
// The checker board, a little inside its edges.
ScenePlane CheckerBoard();

// One generated photograph with a constraint list on its solver, solved
// once without constraints as the filter starts. `adjust` may change the
// default settings first.
struct QualityScene {
  explicit QualityScene(const CameraCase& c,
                        const std::function<void(PSettings&)>& adjust = nullptr);
  Solver& solver() { return list.GetSolver(); }

  // Adds the lines as constraints; answers how many traced.
  std::size_t AddLines(std::vector<PickedLine>& lines);
  // A polygon on the plane's corners; false when a corner is off the photo.
  bool AddPolygon(const ScenePlane& plane);
  void RemoveAll() { list.RemoveAll(); }

  // The stretch of a curve about its middle that lies on the mesh; false
  // when its middle does not.
  bool OnMesh(const std::vector<Synth::Point2>& points, std::size_t& first, std::size_t& last);
  std::vector<PickedLine> Pick(std::size_t count, bool pin);

  CameraCase shot;
  Synth::Scene scene;
  Synth::Camera camera;
  QualityContext context;
  ConstraintList list;
};

}  // namespace Project::testing
