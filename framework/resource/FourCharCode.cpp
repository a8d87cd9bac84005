#include "framework/resource/FourCharCode.h"

namespace Tarsa {

std::string FourCharText(std::uint32_t code) {
  static constexpr char kHex[] = "0123456789ABCDEF";
  std::string text;
  for (int shift = 24; shift >= 0; shift -= 8) {
    const auto c = static_cast<unsigned char>(code >> shift);
    if (c >= 0x20 && c < 0x7F) {
      text += static_cast<char>(c);
    } else {
      text += "\\x";
      text += kHex[c >> 4];
      text += kHex[c & 0xF];
    }
  }
  return text;
}

}  // namespace Tarsa
