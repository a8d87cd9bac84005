#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "framework/process/CNativeWindowHandler.h"
#include "framework/process/CValMsg.h"
#include "framework/view/CPane.h"

namespace Tarsa {

// The framework's look: one place for the colours every control draws with.
namespace Skin {
inline constexpr std::uint32_t kFace = 0xFFF6F6F6;
inline constexpr std::uint32_t kFaceHover = 0xFFFFFFFF;
inline constexpr std::uint32_t kFacePressed = 0xFFD9D9D9;
inline constexpr std::uint32_t kEdge = 0xFF9A9A9A;
inline constexpr std::uint32_t kEdgeDisabled = 0xFFC8C8C8;
inline constexpr std::uint32_t kText = 0xFF1E1E1E;
inline constexpr std::uint32_t kTextDisabled = 0xFF9C9C9C;
inline constexpr std::uint32_t kAccent = 0xFF2F6FD0;
inline constexpr std::uint32_t kAccentLight = 0xFFCFE0FA;
inline constexpr std::uint32_t kField = 0xFFFFFFFF;
inline constexpr std::uint32_t kWell = 0xFFDADADA;
inline constexpr std::uint32_t kFocus = 0xFF2F6FD0;
}  // namespace Skin

// A user-visible text as shown: a keyed string resolved, and the mnemonic
// marks ("&") taken out.
std::string ShownText(std::string_view keyed);

// What the controls share: a label, the hover and pressed looks, and the
// value messages a control sends up its chain when the user changes it
// (named by the control's id, with the kind of change: set, tracking, end
// of a drag). A dialog hears them in its HandleMessage.
class CControl : public CPane {
 public:
  CControl(CObjID id, CView* parent, const CRect& frame, std::uint32_t options = kView_TabStop,
           std::uint32_t binding = kBind_Fixed);

  const std::string& Label() const { return label_; }
  // A keyed string or plain text; shown as ShownText makes it.
  void SetLabel(const std::string& label);

 protected:
  // Sends a value message of the control's id up the chain.
  template <class T>
  void Notify(T value, std::int32_t change = CValueMessage::kChange_Set) {
    CValMsg<T> message(GetId(), value, change, 0.0, 0, reinterpret_cast<std::uintptr_t>(this));
    if (Supervisor() != nullptr) Supervisor()->HandleMessage(message);
  }

  // Follows a press of the left button until it is released: inside tells
  // each move whether the pointer is over the control; the answer is
  // whether it was released over it. A press not made by the mouse (Return
  // or Escape pressing the control, clicks 0) answers true at once.
  bool TrackPress(const CMouseMessage& message);
  // The key-down code of a message, or 0 when it is none.
  static std::uint32_t KeyDownCode(const CMessage& message);

  void MouseEnter() override;
  void MouseLeave() override;
  bool Hovered() const { return hovered_; }
  bool Pressed() const { return pressed_; }
  std::uint32_t TextColor() const { return IsEnabled() ? Skin::kText : Skin::kTextDisabled; }
  // The focus ring around rect, when the control is the target.
  void DrawFocus(CPort& port, const CRect& rect) const;

 private:
  std::string label_;
  bool hovered_ = false;
  bool pressed_ = false;
};

}  // namespace Tarsa
