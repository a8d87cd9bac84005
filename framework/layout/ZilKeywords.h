#pragma once

#include <cstdint>
#include <span>
#include <string_view>

namespace Tarsa {

class CExpressionScope;

// The names a layout file finds defined before it starts: the placement
// and alignment words, true and false, the frame styles, and the constants
// of the view classes (kView_, kBind_, kWin_, kFont_...).
struct CZilKeyword {
  std::string_view name;
  std::int32_t value;
};

std::span<const CZilKeyword> ZilKeywords();
void DefineZilKeywords(CExpressionScope& scope);

// The window kinds and features, and the interiors a child can go in.
inline constexpr std::int32_t kZilWin_Document = 1;
inline constexpr std::int32_t kZilWin_Dialog = 3;
inline constexpr std::int32_t kZilWin_Palette = 4;

}  // namespace Tarsa
