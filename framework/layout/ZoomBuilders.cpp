#include "framework/layout/ZoomBuilders.h"

#include <cstdlib>
#include <string>
#include <string_view>

#include "framework/controls/CZoomProgressCombo.h"
#include "framework/layout/CZilPropertyList.h"

namespace Tarsa {
namespace {

// The combo's width, and the height of a scroll bar's row.
constexpr CSize kComboSize{kZoomCombo_DefaultWidth, 18};

// A number written as an int or as a text such as '0.001'. A text of four
// characters is an int too (its character code), which must not win.
bool Number(const CZilPropertyList& properties, std::string_view name, double& out) {
  std::string text;
  if (!properties.GetString(name, text)) return properties.GetDouble(name, out);
  char* end = nullptr;
  const double value = std::strtod(text.c_str(), &end);
  if (end == text.c_str()) return false;
  out = value;
  return true;
}

}  // namespace

void ConfigureZoomPane(CZoomPane& pane, const CZilPropertyList& properties) {
  double zoomMin = pane.ZoomMin();
  double zoomMax = pane.ZoomMax();
  const bool hasMin = Number(properties, "zoom_min", zoomMin);
  const bool hasMax = Number(properties, "zoom_max", zoomMax);
  if (hasMin || hasMax) pane.SetZoomLimits(zoomMin, zoomMax);
  std::int32_t cushion = pane.FitCushion();
  if (properties.GetInt("fit_in_view_cushion", cushion)) pane.SetFitCushion(cushion);
  // The layout placed the pane as one of a column; in a scroller it goes
  // where the bars leave room.
  if (auto* scroller = dynamic_cast<CScroller*>(pane.Parent())) scroller->Arrange();
}

void ConfigureScroller(CScroller& scroller, const CZilPropertyList& properties) {
  std::int32_t attributes = std::int32_t(scroller.Attributes());
  properties.GetInt("scroller_attributes", attributes);
  const auto flag = [&](const char* name, std::uint32_t bit) {
    bool on = false;
    if (!properties.GetBool(name, on)) return;
    attributes = on ? std::int32_t(std::uint32_t(attributes) | bit)
                    : std::int32_t(std::uint32_t(attributes) & ~bit);
  };
  flag("scroller_horizontal_bar", kScroller_XBar);
  flag("scroller_vertical_bar", kScroller_YBar);
  flag("scroller_well_frame", kScroller_WellFrame);
  scroller.SetAttributes(std::uint32_t(attributes));
  std::int32_t gap = 0;
  if (properties.GetInt("scroller_gap_left", gap)) scroller.SetGapLeft(gap);
}

void RegisterZoomBuilders() {
  CViewBuilder::Register("CZoomPane", MakeZoomPaneBuilder<CZoomPane>());
  CViewBuilder::Register("CScroller", MakeScrollerBuilder<CScroller>());
  CViewBuilder::Register("CZoomProgressCombo",
                         std::make_unique<CPaneBuilder<CZoomProgressCombo>>(
                             [](CView* parent, CZilGenerator& g) {
                               return new CZoomProgressCombo(g.ViewId(), parent, g.Frame(),
                                                             g.Options(kView_TabStop), g.Binding());
                             },
                             [](CZoomProgressCombo& combo, CZilGenerator& g) {
                               std::int32_t interior = 0;
                               g.Properties().GetInt("frame_interior", interior);
                               auto* scroller = dynamic_cast<CScroller*>(combo.Parent());
                               if (scroller != nullptr && interior == kInterior_ScrollerGapLeft) {
                                 scroller->SetGapView(&combo);
                               }
                             },
                             [](const CViewProxy&) { return kComboSize; }));
}

}  // namespace Tarsa
