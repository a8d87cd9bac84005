#include "workspace/PDialog.h"

#include <algorithm>
#include <cmath>

#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PPreview.h"
#include "framework/controls/CCheckButton.h"
#include "framework/controls/CEditNumber.h"
#include "framework/controls/CEditSlider.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CRadioPopup.h"
#include "framework/controls/CSlider.h"
#include "framework/controls/CStaticText.h"
#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/process/CProcess.h"
#include "framework/process/CValMsg.h"
#include "framework/strings/CString.h"
#include "params/PSettings.h"
#include "solver/frame/Solver.h"
#include "workspace/PDetailedPreviewPane.h"
#include "workspace/PPreviewPane.h"

namespace Project {

namespace {

constexpr const char* kTitleFormat = "$$$/Archway/Dialog/Title=Archway (^0 @ ^1%)";
constexpr const char* kCameraLine = "$$$/Archway/Dialog/CameraEXIFInfo=Camera Model: ^0 (^1)";
constexpr const char* kLensLine = "$$$/Archway/Dialog/LensEXIFInfo=Lens Model: ^0";
constexpr const char* kCancelText = "$$$/Archway/Dialog/CancelButton=Cancel";
constexpr const char* kResetText = "$$$/Archway/Dialog/ResetButton=Reset";
constexpr const char* kSolveFailedText = "$$$/Archway/Warning/SolveFailed=Solve failed";
constexpr const char* kProgressTitle = "$$$/Archway/Final/Progress/Title=Progress";
constexpr const char* kProgressMessage = "$$$/Archway/Final/Progress/Message=Applying Archway.";

constexpr const char* kPreviewPane = "Project/Dialog/PreviewPane";
constexpr const char* kDetailPane = "Project/Dialog/DetailedPreviewPane";
constexpr const char* kModelPopup = "Project/Dialog/ProjectionModelPopup";
constexpr const char* kScaleSlider = "Project/Dialog/ImageScaleSlider";
constexpr const char* kFocalSlider = "Project/Dialog/FocalLengthSlider";
constexpr const char* kCropSlider = "Project/Dialog/CropFactorSlider";
constexpr const char* kAsShot = "Project/Dialog/AsShotCheck";
constexpr const char* kPreviewCheck = "Project/Dialog/PreviewResultCheck";
constexpr const char* kConstraintsCheck = "Project/Dialog/ShowConstraintsCheck";
constexpr const char* kMeshCheck = "Project/Dialog/ShowMeshCheck";
constexpr const char* kOkButton = "Project/Dialog/OKButton";
constexpr const char* kCancelButton = "Project/Dialog/CancelButton";
constexpr const char* kOptionPane = "Project/Dialog/CorrectionOptionPane";
constexpr const char* kLoupePane = "Project/Dialog/LoupePane";
constexpr const char* kFocalPane = "Project/Dialog/FocalLengthPane";
constexpr const char* kCropPane = "Project/Dialog/CropFactorPane";
constexpr const char* kSolverPane = "Project/Dialog/SolverInfoPane";
constexpr const char* kSolverText = "Project/Dialog/SolverInfoText";

// The scale is kept with an offset: the settings' 120 shows as 100.
constexpr std::int32_t kScaleOffset = 20;
// A change of the option rows moves the column below by this much a row.
constexpr std::int32_t kOptionRowHeight = 35;

Tarsa::CObjID Id(const char* text) { return Tarsa::CObjID::Intern(text); }

std::string Shown(const char* keyed) {
  Tarsa::CString text(keyed);
  text.Resolve();
  return text.Str();
}

// The popup's items are the models 1 to 4 in order.
std::int32_t ModelOfItem(int item) { return item + 1; }
int ItemOfModel(std::int32_t model) {
  return model == PSettings::kModelFisheye || model == PSettings::kModelPerspective ||
                 model == PSettings::kModelFullSpherical
             ? model - 1
             : PSettings::kModelAuto - 1;
}

}  // namespace

PDialog::PDialog(Tarsa::CObjID id, Tarsa::EWindowKind kind, const std::string& title,
                 Tarsa::CSize size, const Tarsa::CWindow* owner)
    : Tarsa::CWindow(id, kind, title, size, owner),
      filter_(*PFilter::Current()),
      pollTimer_(*this) {}

PDialog::~PDialog() { pollTimer_.Stop(); }

template <class T>
T* PDialog::Control(const char* id) const {
  return dynamic_cast<T*>(const_cast<PDialog*>(this)->FindView(Id(id)));
}

void PDialog::SetUpControls() {
  PSettings& settings = filter_.Settings();
  titleName_ = filter_.DocumentTitle().Str();
  preview_ = Control<PPreviewPane>(kPreviewPane);
  detail_ = Control<PDetailedPreviewPane>(kDetailPane);
  UpdateFocalRange();
  // The dialog decides when it closes: an OK whose rendering is cancelled,
  // or a Cancel that resets, leaves it open.
  for (const char* id : {kOkButton, kCancelButton}) {
    if (auto* button = Control<Tarsa::CPushButton>(id)) button->SetEndsModal(false);
  }

  // As shot: the photo's own focal length and crop factor, or its 35 mm
  // equivalent over the crop factor.
  const PFilter::FocalData photo = filter_.PhotoFocalData();
  if (photo.focalLength > 0 && photo.cropFactor >= 0.1f) {
    asShotUsable_ = true;
    asShotFocal_ = photo.focalLength;
    asShotCrop_ = photo.cropFactor;
  } else if (photo.focalLength35mm > 0) {
    asShotUsable_ = true;
    asShotCrop_ = settings.cropFactor >= 0.1f ? settings.cropFactor : 1.0f;
    asShotFocal_ = photo.focalLength35mm / asShotCrop_;
  }
  UpdateOptionRows();
  if (auto* crop = Control<Tarsa::CEditSlider>(kCropSlider)) {
    crop->Field().SetRange(0.1, crop->Field().Maximum());
    crop->Slider().SetRange(0.1, crop->Slider().Maximum());
  }
  settings.constraintsVisible = 1;
  SyncControls(true);
  if (const PhotoInfo* info = filter_.Photo()) {
    if (auto* camera = Control<Tarsa::CStaticText>("Project/Dialog/CameraEXIFInfo"))
      camera->SetText(Tarsa::CString(kCameraLine)
                          .Replace(0, Tarsa::CString(info->GetMake()))
                          .Replace(1, Tarsa::CString(info->GetModel()))
                          .Str());
    if (auto* lens = Control<Tarsa::CStaticText>("Project/Dialog/LensEXIFInfo"))
      lens->SetText(Tarsa::CString(kLensLine).Replace(0, Tarsa::CString(info->GetLens())).Str());
  }
  if (preview_ != nullptr) {
    preview_->Attach(filter_);
    preview_->FitInView();
  }
  if (detail_ != nullptr) detail_->Attach(filter_);
  UpdateTitle();
  pollTimer_.Start();
}

void PDialog::SyncControls(bool full) {
  UpdateFocalRange();
  if (!full) return;
  const PSettings& settings = filter_.Settings();
  const bool calibrated = settings.projectionModel == PSettings::kModelFisheye ||
                          settings.projectionModel == PSettings::kModelPerspective;
  if (auto* popup = Control<Tarsa::CRadioPopup>(kModelPopup))
    popup->SetChosen(ItemOfModel(settings.projectionModel));
  if (auto* scale = Control<Tarsa::CEditSlider>(kScaleSlider))
    scale->SetValue(settings.imageScale - kScaleOffset);
  if (auto* focal = Control<Tarsa::CEditSlider>(kFocalSlider)) {
    focal->SetValue(settings.physicalFocal);
    focal->SetEnabled(calibrated);
  }
  if (auto* crop = Control<Tarsa::CEditSlider>(kCropSlider)) {
    crop->SetValue(settings.cropFactor);
    crop->SetEnabled(calibrated);
  }
  if (auto* asShot = Control<Tarsa::CCheckButton>(kAsShot)) {
    asShot->SetEnabled(asShotUsable_);
    asShot->SetChecked(asShotUsable_ && std::fabs(settings.physicalFocal - asShotFocal_) <= 0.01f &&
                       std::fabs(settings.cropFactor - asShotCrop_) <= 0.01f);
  }
  if (auto* check = Control<Tarsa::CCheckButton>(kPreviewCheck))
    check->SetChecked(settings.previewResult != 0);
  if (auto* check = Control<Tarsa::CCheckButton>(kConstraintsCheck))
    check->SetChecked(settings.constraintsVisible != 0);
  if (auto* check = Control<Tarsa::CCheckButton>(kMeshCheck))
    check->SetChecked(settings.meshVisible != 0);
}

void PDialog::UpdateFocalRange() {
  float low = 0, high = 0;
  if (!filter_.PhysicalFocalRange(low, high)) return;
  if (auto* focal = Control<Tarsa::CEditSlider>(kFocalSlider)) {
    focal->Field().SetRange(low, high);
    focal->Slider().SetRange(low, high);
  }
}

void PDialog::UpdateOptionRows() {
  const std::int32_t model = filter_.Settings().projectionModel;
  const std::int32_t target =
      model == PSettings::kModelAuto || model == PSettings::kModelFullSpherical ? 1 : 4;
  if (target == optionRows_) return;
  const std::int32_t d = (target - optionRows_) * kOptionRowHeight;
  optionRows_ = target;
  if (Tarsa::CView* options = FindView(Id(kOptionPane))) {
    const Tarsa::CRect frame = options->Frame();
    options->SetFrame({frame.left, frame.top, frame.right, frame.bottom + d});
  }
  if (Tarsa::CView* loupe = FindView(Id(kLoupePane))) {
    Tarsa::CRect frame = loupe->Frame();
    loupe->SetFrame(frame.Offset(0, d));
  }
  for (const char* id : {kFocalPane, kCropPane, kAsShot}) {
    if (Tarsa::CView* view = FindView(Id(id))) view->SetShown(target > 1);
  }
  Invalidate();
}

void PDialog::UpdateTitle() {
  const double zoom = preview_ != nullptr ? preview_->Zoom() : 1.0;
  SetTitle(Tarsa::CString(kTitleFormat)
               .Replace(0, Tarsa::CString(titleName_))
               .Replace(1, Tarsa::NumberToText(zoom * 100.0, 1, false))
               .Str());
}

void PDialog::ShowSolverInfo(bool show, const std::string& text) {
  Tarsa::CView* pane = FindView(Id(kSolverPane));
  if (pane == nullptr || pane->IsShown() == show) return;
  if (show) {
    if (auto* line = Control<Tarsa::CStaticText>(kSolverText)) line->SetText(text);
  }
  pane->SetShown(show);
  Invalidate();
}

void PDialog::FullRebuild() {
  Solver& solver = filter_.Constraints().GetSolver();
  solver.RefreshWarp(true);
  Redraw();
}

void PDialog::Redraw() {
  // The hub's rebuild makes the preview's tiles stale with the results.
  if (filter_.HasImageHub()) filter_.ImageHub().RebuildResults();
  Invalidate();
}

void PDialog::ApplyPreviewCheck() {
  PSettings& settings = filter_.Settings();
  if (auto* check = Control<Tarsa::CCheckButton>(kPreviewCheck))
    settings.previewResult = check->IsChecked() ? 1 : 0;
  SyncControls(true);
  Solver& solver = filter_.Constraints().GetSolver();
  if (solver.Solved()) {
    solver.Update(false, true);
  } else {
    solver.RefreshWarp(false);
  }
  Redraw();
}

void PDialog::ChangeProjection(std::int32_t model) {
  PSettings& settings = filter_.Settings();
  if (model == settings.projectionModel) return;
  const std::int32_t old = settings.projectionModel;
  settings.projectionModel = model;
  // Full spherical needs a 2:1 picture; the filter puts the old model back
  // (and says why) when it is not.
  filter_.ResolveProjectionModel(old, false, true);
  SyncControls(true);
  if (settings.projectionModel == old) return;
  UpdateOptionRows();
  FullRebuild();
  SyncControls(true);
}

void PDialog::ChangeScale(double value) {
  PSettings& settings = filter_.Settings();
  const auto scale = std::int32_t(std::lround(value));
  if (scale + kScaleOffset == settings.imageScale) return;
  settings.imageScale = scale + kScaleOffset;
  filter_.Constraints().GetSolver().ApplyView(true);
  Redraw();
}

void PDialog::ChangeFocal(double millimetres) {
  PSettings& settings = filter_.Settings();
  if (std::fabs(millimetres - settings.physicalFocal) <= 0.01) return;
  settings.physicalFocal = float(millimetres);
  settings.focalLength = filter_.ImageFocal();
  SyncControls(true);
  FullRebuild();
  SyncControls(true);
}

void PDialog::ChangeCrop(double crop) {
  PSettings& settings = filter_.Settings();
  const double value = std::max(0.1, crop);
  const double rounded = double(std::int32_t(value * 100 + 0.5)) / 100;
  const double stored = double(std::int32_t(settings.cropFactor * 100)) / 100;
  if (rounded == stored) return;
  settings.cropFactor = float(rounded);
  // The focal range follows the crop factor: the slider may clamp the
  // focal length, which is read back before it is used.
  SyncControls(true);
  if (auto* focal = Control<Tarsa::CEditSlider>(kFocalSlider))
    settings.physicalFocal = float(focal->Value());
  settings.focalLength = filter_.ImageFocal();
  FullRebuild();
  SyncControls(true);
}

void PDialog::ApplyAsShot() {
  if (!asShotUsable_) return;
  PSettings& settings = filter_.Settings();
  settings.cropFactor = asShotCrop_;
  settings.physicalFocal = asShotFocal_;
  settings.focalLength = filter_.ImageFocal();
  SyncControls(true);
  FullRebuild();
}

void PDialog::Ok() {
  // The image written is the one a replay of the stored action gives: the
  // grid is built and solved afresh from the settings alone.
  filter_.SolveAfresh();
  if (!filter_.ImageHub().RenderFinalWithDialog(1.0, Shown(kProgressTitle),
                                                Shown(kProgressMessage)))
    return;
  accepted_ = true;
  pollTimer_.Stop();
  EndModal(Id(kOkButton));
  Hide();
}

void PDialog::Cancel() {
  accepted_ = false;
  pollTimer_.Stop();
  EndModal(Id(kCancelButton));
  Hide();
}

void PDialog::Reset() {
  PSettings& settings = filter_.Settings();
  filter_.Constraints().RemoveAll();
  filter_.ResolveProjectionModel(PSettings::kModelFisheye, true, false);
  settings.focalLength = filter_.FocalFromMetadata(false);
  settings.imageScale = 120;
  settings.imageCenterX = settings.imageCenterY = 0.5f;
  UpdateOptionRows();
  FullRebuild();
  SyncControls(true);
}

void PDialog::CloseRequested() { Cancel(); }

bool PDialog::HandleKey(const Tarsa::CMessage& message, bool down) {
  const auto* key = dynamic_cast<const Tarsa::CValMsg<std::uint32_t>*>(&message);
  if (key == nullptr || preview_ == nullptr) return false;
  const std::uint32_t modifiers =
      message.modifiers &
      (Tarsa::kModifier_Control | Tarsa::kModifier_Alt | Tarsa::kModifier_Shift);
  if (modifiers != 0) return false;
  const auto letter = [&](char c) { return key->value == Tarsa::kKey_A + std::uint32_t(c - 'a'); };
  if (letter('q')) {
    preview_->SetKeyLoupe(down);
  } else if (letter('x')) {
    preview_->SetTempZoom(down);
  } else if (letter('l')) {
    preview_->SetShowSource(down);
    if (detail_ != nullptr) detail_->SetShowSource(down);
  } else if (letter('p')) {
    if (down) {
      if (auto* check = Control<Tarsa::CCheckButton>(kPreviewCheck)) {
        check->SetChecked(!check->IsChecked());
        ApplyPreviewCheck();
      }
    }
  } else {
    return false;
  }
  return true;
}

void PDialog::Poll() {
  // Alt held turns Cancel into Reset, read from the keyboard as it is now:
  // holding a modifier sends nothing.
  if (Tarsa::CProcess* process = Tarsa::CProcess::Current()) {
    const bool alt = (process->EventSource().Modifiers() & Tarsa::kModifier_Alt) != 0;
    if (alt != resetMode_) {
      resetMode_ = alt;
      if (auto* cancel = Control<Tarsa::CPushButton>(kCancelButton)) {
        cancel->SetLabel(Shown(alt ? kResetText : kCancelText));
        cancel->Invalidate();
      }
    }
  }
  ShowSolverInfo(filter_.SolveFailed(), Shown(kSolveFailedText));
}

void PDialog::HandleMessage(Tarsa::CMessage& message) {
  const Tarsa::CMessageNames& names = Tarsa::CMessageNames::Get();
  const Tarsa::CObjID name = message.name;
  if (name == names.keyDown || name == names.keyUp) {
    if (HandleKey(message, name == names.keyDown)) {
      message.SetHandled();
      return;
    }
    // Return in a number field or a popup ends the edit there, rather than
    // pressing OK: the focus goes back to the picture.
    const auto* key = dynamic_cast<const Tarsa::CValMsg<std::uint32_t>*>(&message);
    Tarsa::CMessenger* focus = Tarsa::CMessenger::Target();
    if (name == names.keyDown && key != nullptr && key->value == Tarsa::kKey_Return &&
        (dynamic_cast<Tarsa::CEditNumber*>(focus) != nullptr ||
         dynamic_cast<Tarsa::CRadioPopup*>(focus) != nullptr) &&
        preview_ != nullptr) {
      preview_->BecomeTarget(true);
      message.SetHandled();
      return;
    }
  }
  if (name == Tarsa::CZoomPane::ZoomChangedName()) {
    UpdateTitle();
    return;
  }
  const auto* value = dynamic_cast<const Tarsa::CValueMessage*>(&message);
  if (value == nullptr) {
    Tarsa::CWindow::HandleMessage(message);
    return;
  }
  const auto number = [&]() {
    const auto* n = dynamic_cast<const Tarsa::CValMsg<Tarsa::CNumber>*>(&message);
    return n != nullptr ? n->value.value : 0.0;
  };
  const bool settled = value->change != Tarsa::CValueMessage::kChange_Tracking;
  if (name == Id(kModelPopup)) {
    if (auto* popup = Control<Tarsa::CRadioPopup>(kModelPopup))
      ChangeProjection(ModelOfItem(popup->Chosen()));
  } else if (name == Id(kScaleSlider)) {
    ChangeScale(number());
  } else if (name == Id(kFocalSlider)) {
    // Dragging the thumb solves nothing until it is let go.
    if (settled) ChangeFocal(number());
  } else if (name == Id(kCropSlider)) {
    if (settled) ChangeCrop(number());
  } else if (name == Id(kAsShot)) {
    if (auto* check = Control<Tarsa::CCheckButton>(kAsShot); check != nullptr && check->IsChecked())
      ApplyAsShot();
  } else if (name == Id(kPreviewCheck)) {
    ApplyPreviewCheck();
  } else if (name == Id(kMeshCheck)) {
    if (auto* check = Control<Tarsa::CCheckButton>(kMeshCheck))
      filter_.Settings().meshVisible = check->IsChecked() ? 1 : 0;
    Invalidate();
  } else if (name == Id(kConstraintsCheck)) {
    if (auto* check = Control<Tarsa::CCheckButton>(kConstraintsCheck))
      filter_.Settings().constraintsVisible = check->IsChecked() ? 1 : 0;
    Invalidate();
  } else if (name == Id(kOkButton)) {
    Ok();
  } else if (name == Id(kCancelButton)) {
    if (resetMode_ || (message.modifiers & Tarsa::kModifier_Alt) != 0) {
      Reset();
    } else {
      Cancel();
    }
  } else {
    Tarsa::CWindow::HandleMessage(message);
    return;
  }
  message.SetHandled();
}

}  // namespace Project
