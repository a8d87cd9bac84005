#include "framework/strings/CString.h"

#include <utility>

namespace Tarsa {

namespace {
const std::shared_ptr<const std::string>& EmptyText() {
  static const auto empty = std::make_shared<const std::string>();
  return empty;
}
}  // namespace

CString::CString() : text_(EmptyText()) {}
CString::CString(const char* utf8)
    : text_(std::make_shared<const std::string>(utf8 != nullptr ? utf8 : "")) {}
CString::CString(std::string_view utf8) : text_(std::make_shared<const std::string>(utf8)) {}
CString::CString(std::string utf8) : text_(std::make_shared<const std::string>(std::move(utf8))) {}

std::size_t CString::CharCount() const {
  std::size_t count = 0;
  for (unsigned char c : *text_) {
    if ((c & 0xC0) != 0x80) ++count;
  }
  return count;
}

// Partial until the string table lands: a keyed string becomes its default.
void CString::Resolve() {
  const std::string& s = *text_;
  if (s.size() < 3 || s.compare(0, 3, "$$$") != 0) return;
  const std::size_t eq = s.find('=', 3);
  if (eq == std::string::npos || eq == 3) {
    *this = CString();
    return;
  }
  *this = CString(s.substr(eq + 1));
}

void CString::ParseEscapes() {}

CString CString::Replace(int index, const CString& value) const {
  CString copy = *this;
  copy.Resolve();
  const std::string pattern = "^" + std::to_string(index);
  const std::size_t at = copy.Str().find(pattern);
  if (at == std::string::npos) return copy;
  std::string out = copy.Str();
  out.replace(at, pattern.size(), value.Str());
  return CString(std::move(out));
}

CString ResolveText(std::string_view keyed) {
  CString s(keyed);
  s.Resolve();
  return s;
}

}  // namespace Tarsa
