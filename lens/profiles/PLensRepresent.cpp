#include "lens/profiles/PLensRepresent.h"

#include <cmath>
#include <tuple>

namespace Project {

bool PLensRepresent::IdentityLess(const PLensRepresent& a, const PLensRepresent& b) {
  return std::tie(a.path, a.make, a.model, a.modelDisplay, a.lensDisplay, a.lens, a.cropFactor) <
         std::tie(b.path, b.make, b.model, b.modelDisplay, b.lensDisplay, b.lens, b.cropFactor);
}

bool PLensRepresent::RankLess(const PLensRepresent& a, const PLensRepresent& b,
                              const PLensRepresent& reference) {
  // Each rule decides only when the two differ under it.
  const auto decides = [](bool aHolds, bool bHolds, bool& answer) {
    if (aHolds == bHolds) return false;
    answer = aHolds;
    return true;
  };
  bool answer = false;
  if (decides(a.make == reference.make, b.make == reference.make, answer)) return answer;
  if (decides(a.lens == reference.lens, b.lens == reference.lens, answer)) return answer;
  if (decides(a.model == reference.model, b.model == reference.model, answer)) return answer;
  // A profile from a sensor no smaller than the photo's (crop factor not
  // above it) goes before one from a smaller sensor, however close that is.
  const float crop = reference.cropFactor;
  if (decides(a.cropFactor <= crop, b.cropFactor <= crop, answer)) return answer;
  return std::fabs(b.cropFactor - crop) > std::fabs(a.cropFactor - crop);
}

}  // namespace Project
