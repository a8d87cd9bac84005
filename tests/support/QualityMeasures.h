#pragma once

// How straight, level and flat a solve leaves what a generated scene says
// is straight, level and flat, and how close to conformal it leaves the
// rest. Every measure is taken on the solved mesh from the generator's own
// geometry (its image curves of the scene's edges, its projection of scene
// points) and fitted here, not by the solver.

#include <cstddef>
#include <cstdint>
#include <vector>

#include "tests/support/QualityScene.h"
#include "tests/support/StraightLineFit.h"

namespace Project::testing {

// Fits in result-plane units.
struct LineQuality {
  StraightLineFit samples;      // the traced samples, as the solve holds them
  StraightLineFit truth;        // the generator's image curve, through the mesh as drawn
  double directionError = 0.0;  // degrees, of the truth's fit; 0 for free lines
  // The same without the two end cells, where a line's end sample lies
  // inside a cell rather than on its edges.
  StraightLineFit innerSamples;
  StraightLineFit innerTruth;
  double innerDirectionError = 0.0;
};

// The ratio of the larger to the smaller singular value of the cells' maps
// from the sphere to the result plane; 1 is conformal.
struct Conformality {
  double median = 0.0;
  double p95 = 0.0;
  std::size_t cells = 0;
};

struct SceneReport {
  std::size_t picked = 0;  // lines asked for and found in the scene
  std::size_t traced = 0;
  std::size_t pinned = 0;  // of them horizontal or vertical
  bool polygon = false;    // a polygon was asked for and traced
  bool succeeded = false;
  std::int32_t iterations = 0;
  double pixelsPerUnit = 0.0;
  // The worst line of each measure, in output pixels and degrees.
  double samplesMax = 0.0, samplesRms = 0.0;
  double truthMax = 0.0, truthRms = 0.0;
  double directionError = 0.0;
  double innerSamplesMax = 0.0, innerSamplesRms = 0.0;
  double innerTruthMax = 0.0, innerTruthRms = 0.0;
  double innerDirectionError = 0.0;
  double polygonError = 0.0;        // pixels, through the mesh; 0 without a polygon
  double polygonVertexError = 0.0;  // pixels, at the polygon's own grid vertices
  Conformality constrained;         // away from the constraints, after the solve
  Conformality plain;               // the same cells, solved without constraints
  std::vector<PickedLine> lines;
  std::vector<LineQuality> qualities;  // per line, in the plane's units
};

// Adds `lineCount` of the scene's longest edges (pinned where `pin`) and,
// when given, a scene plane as a polygon, solves once and measures.
SceneReport RunScene(QualityScene& scene, std::size_t lineCount, bool pin,
                     const ScenePlane* polygon);

}  // namespace Project::testing
