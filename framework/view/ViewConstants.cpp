#include "framework/view/ViewConstants.h"

namespace Tarsa {

std::uint32_t ViewFlagsOf(std::uint32_t options) {
  std::uint32_t flags = kViewFlag_Visible | kViewFlag_Enabled;
  if ((options & kView_Invisible) != 0) flags &= ~kViewFlag_Visible;
  if ((options & kView_Disabled) != 0) flags &= ~kViewFlag_Enabled;
  // Each step up of the focus options implies the ones below it.
  if ((options & (kView_Target | kView_Bullseye | kView_TabStop)) != 0) flags |= kViewFlag_Target;
  if ((options & (kView_Bullseye | kView_TabStop)) != 0) flags |= kViewFlag_Bullseye;
  if ((options & kView_TabStop) != 0) flags |= kViewFlag_TabStop;
  struct Pair {
    std::uint32_t option;
    std::uint32_t flag;
  };
  static constexpr Pair kPlain[] = {
      {kView_TargetRing, kViewFlag_TargetRing},
      {kView_ContextClick, kViewFlag_ContextClick},
      {kView_InvalidOnActivate, kViewFlag_InvalidOnActivate},
      {kView_DrawBuffer, kViewFlag_DrawBuffer},
      {kView_DrawParts, kViewFlag_DrawParts},
      {kView_ChunkyScroll, kViewFlag_ChunkyScroll},
      {kView_EntireScroll, kViewFlag_EntireScroll},
      {kView_BigCoordinates, kViewFlag_BigCoordinates},
      {kView_IgnoreMouseEvents, kViewFlag_IgnoreMouse},
      {kView_MultiOnMouseUp, kViewFlag_MultiOnMouseUp},
      {kView_NoFocusOnClick, kViewFlag_NoFocusOnClick},
      {kView_NoTabNavigate, kViewFlag_NoTabNavigate},
      {kView_SupressSurrenders, kViewFlag_SupressSurrenders},
  };
  for (const Pair& pair : kPlain) {
    if ((options & pair.option) != 0) flags |= pair.flag;
  }
  return flags;
}

}  // namespace Tarsa
