#pragma once

#include <cstdint>
#include <initializer_list>
#include <string_view>
#include <vector>

namespace Tarsa::testing {

// Expected bytes written out by hand: a list of pieces, each either byte
// values or the characters of a text (no terminator).
struct Piece {
  Piece(std::initializer_list<int> values) {
    for (const int v : values) bytes.push_back(static_cast<std::uint8_t>(v));
  }
  Piece(const char* text) : Piece(std::string_view(text)) {}
  Piece(std::string_view text) : bytes(text.begin(), text.end()) {}
  std::vector<std::uint8_t> bytes;
};

inline std::vector<std::uint8_t> Join(std::initializer_list<Piece> pieces) {
  std::vector<std::uint8_t> all;
  for (const Piece& piece : pieces) all.insert(all.end(), piece.bytes.begin(), piece.bytes.end());
  return all;
}

}  // namespace Tarsa::testing
