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
  Tarsa::CViewBuilder::Register("PPreviewPane", Tarsa::MakeZoomPaneBuilder<PPreviewPane>());
  Tarsa::CViewBuilder::Register("PPreviewScroller", Tarsa::MakeScrollerBuilder<PPreviewScroller>());
  Tarsa::CViewBuilder::Register("PDetailedPreviewPane",
                                std::make_unique<Tarsa::CPaneBuilder<PDetailedPreviewPane>>());
}

}  // namespace Project
