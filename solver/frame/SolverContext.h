#pragma once

#include <cstdint>
#include <memory>

#include "lens/metadata/PhotoInfo.h"
#include "lens/sphere/Image.h"
#include "lens/sphere/PhotoToSphere.h"
#include "params/PSettings.h"

namespace Project {

// What a Solver needs of the filter that runs it: the working settings, the
// photo, the preview's size and the result panes to tell. The filter
// implements it; a Solver keeps a reference and never owns it.
class SolverContext {
 public:
  virtual ~SolverContext() = default;

  // The run's settings; the solver reads them and, for a wide picture,
  // rewrites the regulariser model.
  virtual PSettings& Settings() = 0;
  // The photo's metadata, or null when it has none.
  virtual const PhotoInfo* Photo() const = 0;
  virtual std::int32_t SourceWidth() const = 0;
  virtual std::int32_t SourceHeight() const = 0;
  // The preview image's size in pixels.
  virtual std::int32_t PreviewWidth() const = 0;
  virtual std::int32_t PreviewHeight() const = 0;
  // The sphere image model of the settings' projection model over image;
  // false, with model untouched, when none can be built.
  virtual bool BuildImageModel(const std::shared_ptr<const Image>& image,
                               std::shared_ptr<PhotoToSphere>& model) = 0;
  // After each solve: whether it failed, for the dialog's warning line.
  virtual void ReportSolve(bool failed) = 0;
  // The mesh changed: rebuild the result panes from it and redraw them.
  virtual void RebuildResults() = 0;
  // Only redraw the result panes.
  virtual void RedrawResults() = 0;
};

}  // namespace Project
