#include "workspace/PWorkspaceFilter.h"

#include <memory>

#include "framework/core/CException.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/native/SdlEventSource.h"
#include "workspace/PDialog.h"
#include "workspace/PPreviewPane.h"
#include "workspace/WorkspaceBuilders.h"

namespace Project {

bool PWorkspaceFilter::RunDialog() {
  RegisterWorkspaceBuilders();
  // The filter began as a process with no window system: a scripted run
  // never needs one.
  UseEventSource(std::make_unique<Tarsa::Native::SdlEventSource>());
  // The preview shows the mesh a scripted run would render.
  Solve();
  Tarsa::CZilGenerator generator;
  std::unique_ptr<Tarsa::CWindow> window = generator.GenerateWindow("PDialog.zil", nullptr);
  auto* dialog = dynamic_cast<PDialog*>(window.get());
  if (dialog == nullptr)
    throw Tarsa::CError("$$$/Archway/Error/NoDialog=The workspace could not be opened.");
  dialog->SetUpControls();
  dialog->Show();
  // The keys go to the picture first: none of the dialog's fields is being
  // edited yet.
  dialog->PreviewPane().BecomeTarget(true);
  // A title set before the window showed may not reach it.
  dialog->UpdateTitle();
  dialog->RunModal();
  return dialog->Accepted();
}

}  // namespace Project
