#pragma once

#include <cstdint>

#include "framework/view/CPort.h"
#include "solver/constraints/Constraint.h"
#include "workspace/ScreenGeometry.h"

namespace Project {

// Draws the solver's mesh over the preview: every cell of its grid that the
// solver keeps in its mask, as the closed outline of its four corners, all
// cells in one stroke, anti-aliased with a pen of 1, in the colour made
// opaque. The corners are the warped positions while the result is shown,
// the photograph's otherwise (env says which). Nothing is drawn before the
// solver has a mesh.
void DrawMesh(const ConstraintEnv& env, Tarsa::CPort& port, const ScreenTransform& screen,
              std::uint32_t argb);

}  // namespace Project
