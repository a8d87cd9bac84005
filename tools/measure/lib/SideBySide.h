#pragma once

#include <memory>

#include "host/io/HostDocument.h"

namespace Measure {

// Two images side by side in one 8-bit RGB image, for showing a photograph
// beside its correction: both at the height of the shorter one (the taller
// scaled down, keeping its proportions), a thin light gap between. Gray and
// RGB images of either depth; throws MeasureError for others. Stateless.
class SideBySide {
 public:
  static constexpr int kGap = 16;

  SideBySide() = delete;

  static std::unique_ptr<Host::HostDocument> Compose(const Host::HostDocument& left,
                                                     const Host::HostDocument& right);
};

}  // namespace Measure
