#pragma once

#include "filter/PResult.h"
#include "filter/PScaledStage.h"

namespace Project {

// The full-size result reduced to the display: reads the full result stage,
// which the image hub owns and which outlives this one.
class PResultScaled : public PScaledStage {
 public:
  explicit PResultScaled(PResult& result)
      : PScaledStage(result.Planes(), result.PixelDepth()), result_(result) {
    AddInput(result);
  }

 protected:
  Tarsa::CPixProcess& Input() override { return result_; }
  const Tarsa::CPixmap* InputPixels() override { return result_.Pixels(); }

 private:
  PResult& result_;
};

}  // namespace Project
