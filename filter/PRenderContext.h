#pragma once

namespace Tarsa {
class CQuillmarkFilter;
}

namespace Project {

class Solver;
class PSettings;

// What the render stages see of the run: the host that serves and takes
// the pixels (its record, sizes and callbacks), the settings that say how
// the mesh is drawn, and the solver whose mesh they draw. The filter
// implements it; the image hub and its stages hold a reference and never
// outlive it. They read through it each time, so a new solve or a changed
// setting is seen on the next tile.
class PRenderContext {
 public:
  virtual Tarsa::CQuillmarkFilter& RenderHost() = 0;
  virtual const PSettings& RenderSettings() = 0;
  virtual const Solver& RenderSolver() = 0;

 protected:
  ~PRenderContext() = default;
};

}  // namespace Project
