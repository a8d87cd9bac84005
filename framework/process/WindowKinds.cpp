#include "framework/process/WindowKinds.h"

namespace Tarsa {

namespace {
constexpr std::uint32_t FourChars(const char (&c)[5]) {
  return (static_cast<std::uint32_t>(static_cast<unsigned char>(c[0])) << 24) |
         (static_cast<std::uint32_t>(static_cast<unsigned char>(c[1])) << 16) |
         (static_cast<std::uint32_t>(static_cast<unsigned char>(c[2])) << 8) |
         static_cast<std::uint32_t>(static_cast<unsigned char>(c[3]));
}
}  // namespace

const char* WindowClassName(int kind) {
  switch (kind) {
    case 2:
      return "Tarsa_ModalClass";
    case 3:
      return "Tarsa_FloatingClass";
    case 4:
      return "Tarsa_PopupClass";
    case 5:
      return "Tarsa_LayeredClass";
    case 6:
      return "Tarsa_MDIFrameClass";
    case 7:
      return "Tarsa_MDIChildClass";
    default:
      return "Tarsa_WindowClass";
  }
}

std::uint32_t WindowKindTag(int kind) {
  switch (kind) {
    case 1:
      return FourChars("Mmvw");
    case 2:
      return FourChars("Mctl");
    case 3:
      return FourChars("Mpop");
    case 4:
      return FourChars("Mcbx");
    default:
      return FourChars("Mwin");
  }
}

}  // namespace Tarsa
