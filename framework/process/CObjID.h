#pragma once

#include <compare>
#include <cstdint>
#include <string>
#include <string_view>

namespace Tarsa {

// An interned name: a text such as "tarsa/command/undo" turned once into a
// small integer, so that ids and message names compare as integers. The
// table behind it lives for the whole process and only grows; it is used from
// the main thread only. The null id (0) names nothing.
class CObjID {
 public:
  constexpr CObjID() = default;
  constexpr explicit CObjID(std::uint32_t atom) : atom_(atom) {}

  // The atom of text, made on first use. The empty text gives the null id.
  static CObjID Intern(std::string_view text);
  // The atom of text when it has been made, else the null id.
  static CObjID Find(std::string_view text);

  std::uint32_t Value() const { return atom_; }
  bool IsNull() const { return atom_ == 0; }
  // The text the atom was made from; empty for the null id and for numbers
  // that no Intern gave out.
  const std::string& Text() const;

  friend constexpr bool operator==(CObjID a, CObjID b) = default;
  friend constexpr auto operator<=>(CObjID a, CObjID b) = default;

 private:
  std::uint32_t atom_ = 0;
};

}  // namespace Tarsa
