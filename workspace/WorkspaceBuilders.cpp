#include "workspace/WorkspaceBuilders.h"

#include <memory>

#include "framework/layout/CPaneBuilder.h"
#include "framework/layout/CWindowBuilder.h"
#include "framework/layout/ZoomBuilders.h"
#include "workspace/PDetailedPreviewPane.h"
#include "workspace/PDialog.h"
#include "workspace/PPreviewPane.h"
#include "workspace/PPreviewScroller.h"

namespace Project {

void RegisterWorkspaceBuilders() {
  if (Tarsa::CViewBuilder::Find("PDialog") != nullptr) return;
  Tarsa::CViewBuilder::Register("PDialog", std::make_unique<Tarsa::CWindowBuilder<PDialog>>());
  Tarsa::CViewBuilder::Register(
      "PPreviewPane", std::make_unique<Tarsa::CPaneBuilder<PPreviewPane>>(
                          Tarsa::CPaneBuilder<PPreviewPane>::Factory{},
                          [](PPreviewPane& pane, Tarsa::CZilGenerator& generator) {
                            double low = 0.001, high = 16.0, cushion = 3;
                            generator.Properties().GetDouble("zoom_min", low);
                            generator.Properties().GetDouble("zoom_max", high);
                            generator.Properties().GetDouble("fit_in_view_cushion", cushion);
                            pane.SetZoomLimits(low, high);
                            pane.SetFitCushion(int(cushion));
                          }));
  Tarsa::CViewBuilder::Register("PDetailedPreviewPane",
                                std::make_unique<Tarsa::CPaneBuilder<PDetailedPreviewPane>>());
}

}  // namespace Project
