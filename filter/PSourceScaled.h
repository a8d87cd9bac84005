#pragma once

#include "filter/PScaledStage.h"
#include "filter/PSource.h"

namespace Project {

// The source reduced to the display: reads the full source stage, which the
// image hub owns and which outlives this one.
class PSourceScaled : public PScaledStage {
 public:
  explicit PSourceScaled(PSource& source)
      : PScaledStage(source.Planes(), source.PixelDepth()), source_(source) {
    AddInput(source);
  }

 protected:
  Tarsa::CPixProcess& Input() override { return source_; }
  const Tarsa::CPixmap* InputPixels() override { return source_.Pixels(); }

 private:
  PSource& source_;
};

}  // namespace Project
