#include "framework/strings/CString.h"

#include <cmath>
#include <cstdio>
#include <utility>

#include "framework/strings/CStringSource.h"
#include "framework/strings/CStringTable.h"
#include "framework/strings/Unicode.h"

namespace Tarsa {

namespace {

const std::shared_ptr<const std::string>& EmptyText() {
  static const auto empty = std::make_shared<const std::string>();
  return empty;
}

struct Sequence {
  char after;         // the character after the caret or backslash
  const char* gives;  // UTF-8
};

// The caret sequences; "^+hhhh" is handled apart. A pair not listed stays as
// written.
constexpr Sequence kCaretSequences[] = {
    {'!', "\u00AC"},  {'"', "\""},     {'U', "\""},     {'#', "\u2318"}, {'*', "*"},
    {'A', "'"},       {'B', "\u2022"}, {'C', "\u00A9"}, {'D', "\u00B0"}, {'E', "\u00EA"},
    {'F', "/"},       {'I', "\u2206"}, {'L', "\\"},     {'l', "\\"},     {'N', "\r\n"},
    {'O', "Control"}, {'P', "Alt"},    {'Q', "?"},      {'R', "\u00AE"}, {'S', "\u2211"},
    {'T', "\u2122"},  {'V', "|"},      {'[', "\u201C"}, {']', "\u201D"}, {'^', "^"},
    {'`', "`"},       {'b', "\b"},     {'e', "\u00E9"}, {'n', "\n"},     {'o', "control"},
    {'p', "alt"},     {'r', "\r"},     {'t', "\t"},     {'{', "\u2018"}, {'}', "\u2019"},
};

// The C escapes; any other backslash pair stays as written.
constexpr Sequence kCEscapes[] = {
    {'"', "\""}, {'\\', "\\"}, {'n', "\n"}, {'r', "\r"}, {'t', "\t"},
};

template <std::size_t N>
const char* Lookup(const Sequence (&table)[N], char after) {
  for (const Sequence& s : table) {
    if (s.after == after) return s.gives;
  }
  return nullptr;
}

int HexValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
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

void CString::Resolve() {
  const std::string& s = *text_;
  if (s.size() < 3 || s.compare(0, 3, "$$$") != 0) return;

  const std::size_t eq = s.find('=', 3);
  const std::string key = s.substr(3, eq == std::string::npos ? std::string::npos : eq - 3);
  if (key.empty()) {
    *this = CString();
    return;
  }
  if (const CString* known = CStringTable::Get(true)->Find(key)) {
    *this = *known;
    return;
  }

  // Ask the host once per key and run; whatever comes out is remembered
  // below, without replacing, so a later resolve finds it in the table.
  CString text;
  CStringSource* source = CStringSource::Current();
  const bool fromSource =
      source != nullptr && !source->UsesDefaultStrings() && source->LookupString(*this, text);
  if (!fromSource) {
    text = eq == std::string::npos ? CString() : CString(s.substr(eq + 1));
    text.ParseEscapes();
  }
  // The source may have dropped or rebuilt the table while it ran.
  CStringTable::Get(true)->Insert(key, text, false);
  *this = std::move(text);
}

void CString::ParseEscapes() {
  // Walking bytes is walking code points here: every sequence is ASCII, and
  // the bytes of a multi-byte character are never ASCII, so they are copied
  // through untouched (and a caret or backslash before one stays as well).
  const std::string& s = *text_;
  if (s.find_first_of("\\^") == std::string::npos) return;

  std::string out;
  out.reserve(s.size());
  bool changed = false;
  const std::size_t n = s.size();
  for (std::size_t i = 0; i < n; ++i) {
    const char c = s[i];
    if ((c != '\\' && c != '^') || i + 1 == n) {
      out.push_back(c);
      continue;
    }
    const char next = s[i + 1];
    const auto code = static_cast<unsigned char>(next);
    if (c == '\\') {
      if (code < 34 || code > 116) {
        out.push_back(c);  // not an escape; the next character is read normally
        continue;
      }
      if (const char* gives = Lookup(kCEscapes, next)) {
        out += gives;
        changed = true;
      } else {
        out.push_back(c);
        out.push_back(next);
      }
      ++i;
      continue;
    }
    if (next == '+') {
      char32_t value = 0;
      std::size_t j = i + 2;
      for (int digits = 0; digits < 4 && j < n && HexValue(s[j]) >= 0; ++digits, ++j) {
        value = value * 16 + static_cast<char32_t>(HexValue(s[j]));
      }
      if (value != 0) AppendUtf8(out, value);
      changed = true;
      i = j - 1;
      continue;
    }
    const char* gives = (code >= 33 && code <= 125) ? Lookup(kCaretSequences, next) : nullptr;
    if (gives != nullptr) {
      out += gives;
      changed = true;
    } else {
      out.push_back(c);
      out.push_back(next);
    }
    ++i;
  }
  if (changed) *this = CString(std::move(out));
}

CString CString::Replace(int index, const CString& value) const {
  CString copy = *this;
  copy.Resolve();
  std::string pattern = std::to_string(index);
  pattern.insert(pattern.begin(), '^');
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

CString NumberToText(double value, int digits, bool fixed) {
  const long double r = std::pow(10.0L, static_cast<long double>(digits));
  const long double x = value;
  long double v = x >= 0 ? std::floor(x * r + 0.5L) / r : std::ceil(x * r - 0.5L) / r;
  // Past the range of long double the rounding means nothing; keep the value.
  if (!std::isfinite(v) && std::isfinite(x)) v = x;
  // A negative value that rounds to zero is shown as "0", not "-0".
  if (v == 0) v = 0;

  const int decimals = digits > 0 ? digits : 0;
  const int length = fixed ? std::snprintf(nullptr, 0, "%.*Lf", decimals, v)
                           : std::snprintf(nullptr, 0, "%.13Lg", v);
  if (length <= 0) return CString();
  std::string out(static_cast<std::size_t>(length) + 1, '\0');
  if (fixed) {
    std::snprintf(out.data(), out.size(), "%.*Lf", decimals, v);
  } else {
    std::snprintf(out.data(), out.size(), "%.13Lg", v);
  }
  out.resize(static_cast<std::size_t>(length));
  return CString(std::move(out));
}

}  // namespace Tarsa
