#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace Host {

// Base64 in the standard alphabet with '=' padding (RFC 4648, section 4).
// Decoding is strict: no whitespace, no missing padding, no stray bits.
// Operations only.
class Base64 {
 public:
  Base64() = delete;

  static std::string Encode(std::span<const uint8_t> bytes);
  // Nullopt for text that is not strict Base64.
  static std::optional<std::vector<uint8_t>> Decode(std::string_view text);
};

}  // namespace Host
