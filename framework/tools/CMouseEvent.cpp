#include "framework/tools/CMouseEvent.h"

#include "framework/process/CKeyCodes.h"

namespace Tarsa {

CObjID CMouseEvent::Primary() {
  static const CObjID id = CObjID::Intern("Tarsa/MouseButton/Primary");
  return id;
}

CObjID CMouseEvent::Context() {
  static const CObjID id = CObjID::Intern("Tarsa/MouseButton/Context");
  return id;
}

CObjID CMouseEvent::Tertiary() {
  static const CObjID id = CObjID::Intern("Tarsa/MouseButton/Tertiary");
  return id;
}

CObjID CMouseEvent::Backward() {
  static const CObjID id = CObjID::Intern("Tarsa/MouseButton/Backward");
  return id;
}

CObjID CMouseEvent::Forward() {
  static const CObjID id = CObjID::Intern("Tarsa/MouseButton/Forward");
  return id;
}

std::uint32_t CMouseEvent::NativeButton(CObjID button) {
  if (button == Primary()) return kButton_Left;
  if (button == Tertiary()) return kButton_Middle;
  if (button == Context()) return kButton_Right;
  return 0;
}

CObjID CMouseEvent::ButtonOf(std::uint32_t nativeButton) {
  switch (nativeButton) {
    case kButton_Left:
      return Primary();
    case kButton_Middle:
      return Tertiary();
    case kButton_Right:
      return Context();
    default:
      return CObjID();
  }
}

}  // namespace Tarsa
