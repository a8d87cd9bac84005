#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "framework/process/CTimer.h"
#include "framework/view/CWindow.h"

namespace Tarsa {
class CCheckButton;
class CEditSlider;
class CPushButton;
class CRadioPopup;
class CStaticText;
}  // namespace Tarsa

namespace Project {

class PDetailedPreviewPane;
class PFilter;
class PPreviewPane;

// The workspace: one resizable window, built from the layout file
// PDialog.zil, with the preview, the loupe, the correction's options and OK
// and Cancel. It owns no image data: every control writes the run's
// settings and asks the filter's solver for the work the change needs (a
// full rebuild for the projection, focal length or crop factor; the output
// transform alone for the scale), and the preview follows through the
// image hub. OK solves afresh from the settings and renders the final image
// into the host; Cancel, Escape and closing the window leave it untouched.
// The filter outlives the dialog; the views belong to the window.
class PDialog : public Tarsa::CWindow {
 public:
  // The layout file's builder makes it with these.
  PDialog(Tarsa::CObjID id, Tarsa::EWindowKind kind, const std::string& title, Tarsa::CSize size,
          const Tarsa::CWindow* owner);
  ~PDialog() override;

  // Fills and arms every control from the settings; run once, at opening.
  void SetUpControls();
  bool Accepted() const { return accepted_; }

  PPreviewPane& PreviewPane() const { return *preview_; }
  PDetailedPreviewPane* DetailPane() const { return detail_; }

  // Rewrites the controls from the settings (full), and the focal range.
  void SyncControls(bool full);
  void UpdateTitle();
  void ShowSolverInfo(bool show, const std::string& text);

  void HandleMessage(Tarsa::CMessage& message) override;

  // The option rows shown: 4 with the focal length, crop factor and As
  // Shot rows, 1 without them (automatic and full-spherical models).
  std::int32_t OptionRows() const { return optionRows_; }

 protected:
  void CloseRequested() override;

 private:
  class PollTimer : public Tarsa::CTimer {
   public:
    explicit PollTimer(PDialog& dialog) : Tarsa::CTimer(1.0 / 15.0), dialog_(dialog) {}
    void Fire(double /*time*/, double /*elapsed*/) override { dialog_.Poll(); }

   private:
    PDialog& dialog_;
  };

  template <class T>
  T* Control(const char* id) const;
  void UpdateOptionRows();
  void UpdateFocalRange();
  void ApplyPreviewCheck();
  void ChangeProjection(std::int32_t model);
  void ChangeScale(double value);
  void ChangeFocal(double millimetres);
  void ChangeCrop(double crop);
  void ApplyAsShot();
  // The three entries by which a change reaches the solver.
  void FullRebuild();
  void Redraw();
  void Ok();
  void Cancel();
  void Reset();
  bool HandleKey(const Tarsa::CMessage& message, bool down);
  void Poll();

  PFilter& filter_;
  PPreviewPane* preview_ = nullptr;
  PDetailedPreviewPane* detail_ = nullptr;
  std::string titleName_;
  PollTimer pollTimer_;
  bool resetMode_ = false;
  bool accepted_ = false;
  std::int32_t optionRows_ = 4;
  // As shot: the photo's focal length (mm) and crop factor, when usable.
  bool asShotUsable_ = false;
  float asShotFocal_ = 0;
  float asShotCrop_ = 0;
};

}  // namespace Project
