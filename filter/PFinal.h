#pragma once

#include <cstdint>

#include "framework/core/CRect.h"
#include "framework/pixels/CPixProcess.h"

namespace Tarsa {
class CQuillmarkFilter;
}

namespace Project {

class PResult;

// The last stage of a run: walks the layer in 128 x 128 tiles, demands each
// from the full result and hands it to the host. Made for one final
// rendering. Its step counts include those of the result and the source.
class PFinal : public Tarsa::CPixProcess {
 public:
  PFinal(PResult& result, Tarsa::CQuillmarkFilter& host);

  // An empty rectangle clears the stage.
  void SetRect(const Tarsa::CRect& rect);

  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t arg1, std::intptr_t arg2) override;

 private:
  PResult& result_;
  Tarsa::CQuillmarkFilter& host_;
  Tarsa::CRect rect_;
  std::int32_t colorPlanes_;
  std::uint32_t hasTransparency_;
  std::int32_t planesToWrite_;
};

}  // namespace Project
