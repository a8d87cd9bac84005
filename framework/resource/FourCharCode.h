#pragma once

#include <cstdint>
#include <string>

namespace Tarsa {

// A four-character code as one 32-bit value, the first character in the high
// byte: FourCharCode("QPrp") == 0x51507270. Written little-endian, its
// characters therefore lie reversed in a file.
constexpr std::uint32_t FourCharCode(const char (&text)[5]) {
  return (static_cast<std::uint32_t>(static_cast<unsigned char>(text[0])) << 24) |
         (static_cast<std::uint32_t>(static_cast<unsigned char>(text[1])) << 16) |
         (static_cast<std::uint32_t>(static_cast<unsigned char>(text[2])) << 8) |
         static_cast<std::uint32_t>(static_cast<unsigned char>(text[3]));
}

// The four characters, first the high byte; bytes outside printable ASCII
// are shown as "\xHH", so the text is always safe to put into a message.
std::string FourCharText(std::uint32_t code);

}  // namespace Tarsa
