#include "framework/controls/CControl.h"

#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/process/CProcess.h"
#include "framework/strings/CString.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

CControl::CControl(CObjID id, CView* parent, const CRect& frame, std::uint32_t options,
                   std::uint32_t binding)
    : CPane(id, parent, frame, options, binding) {}

std::string ShownText(std::string_view keyed) {
  const std::string text = ResolveText(keyed).Str();
  std::string shown;
  shown.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    // "&" marks a mnemonic letter; "&&" is an ampersand.
    if (text[i] == '&') {
      if (i + 1 < text.size() && text[i + 1] == '&') shown += '&', ++i;
      continue;
    }
    shown += text[i];
  }
  return shown;
}

void CControl::SetLabel(const std::string& label) {
  label_ = ShownText(label);
  Invalidate();
}

void CControl::MouseEnter() {
  hovered_ = true;
  Invalidate();
}

void CControl::MouseLeave() {
  hovered_ = false;
  Invalidate();
}

std::uint32_t CControl::KeyDownCode(const CMessage& message) {
  const CMessageNames& names = CMessageNames::Get();
  if (message.name != names.keyDown && message.name != names.sysKeyDown) return 0;
  const auto* key = dynamic_cast<const CValMsg<std::uint32_t>*>(&message);
  return key != nullptr ? key->value : 0;
}

void CControl::DrawFocus(CPort& port, const CRect& rect) const {
  if (IsTarget()) port.FrameRoundRect(rect, 4.0, Skin::kFocus, 2.0);
}

bool CControl::TrackPress(const CMouseMessage& message) {
  CProcess* process = CProcess::Current();
  if (message.clicks == 0 || process == nullptr) return true;
  if (message.button != kButton_Left) return false;

  class PressTracker : public CMouseTracking {
   public:
    explicit PressTracker(CControl& control) : control_(control) {}
    std::uint32_t Button() const override { return kButton_Left; }
    void Track(const CNativeEvent& event) override {
      const bool inside = control_.HitTest(control_.WindowToLocal({event.where.x, event.where.y}));
      if (inside != control_.pressed_) {
        control_.pressed_ = inside;
        control_.Invalidate();
      }
    }
    void OnEnd(const CNativeEvent& event) override {
      released_ = control_.HitTest(control_.WindowToLocal({event.where.x, event.where.y}));
    }
    bool released_ = false;

   private:
    CControl& control_;
  };

  pressed_ = true;
  Redraw();
  PressTracker tracker(*this);
  process->PumpWhileTracking(tracker);
  pressed_ = false;
  Invalidate();
  return tracker.released_;
}

}  // namespace Tarsa
