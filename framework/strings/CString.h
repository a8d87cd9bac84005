#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>

namespace Tarsa {

// The framework's text: UTF-8 bytes shared between copies by an atomic count
// and copied only when one of the copies changes. User-visible texts are
// written as keyed strings, "$$$/key=Default text", and Resolve() turns one
// into the text to show (string table, host lookup, default).
class CString {
 public:
  CString();
  CString(const char* utf8);       // NOLINT(google-explicit-constructor): texts flow freely
  CString(std::string_view utf8);  // NOLINT(google-explicit-constructor)
  CString(std::string utf8);       // NOLINT(google-explicit-constructor)

  const std::string& Str() const { return *text_; }
  const char* c_str() const { return text_->c_str(); }
  std::size_t ByteLength() const { return text_->size(); }
  // Code points, counting each UTF-8 lead byte.
  std::size_t CharCount() const;
  bool IsEmpty() const { return text_->empty(); }
  // How many CString objects share these bytes.
  long ShareCount() const { return text_.use_count(); }

  // In place: a keyed string becomes its text; any other string is left alone.
  // The text comes from the string table, else from the current
  // CStringSource (unless it prefers defaults), else from the default after
  // "=" with its escapes parsed; the answer is then kept in the table, so the
  // source is asked once per key. "$$$/key" without "=" defaults to empty and
  // an empty key gives an empty text.
  void Resolve();
  // In place: C escapes (\" \\ \n \r \t) and caret sequences (^n, ^C,
  // ^+hhhh, ...) become the characters they name; "^0", "^1", ... stay, for
  // Replace. The bytes are shared still when nothing changed.
  void ParseEscapes();
  // The resolved text with the first "^index" replaced by value.
  CString Replace(int index, const CString& value) const;

  friend bool operator==(const CString& a, const CString& b) { return a.Str() == b.Str(); }

 private:
  std::shared_ptr<const std::string> text_;
};

// A keyed string resolved, in one call.
CString ResolveText(std::string_view keyed);

// value rounded to digits decimals, halves away from zero; "%.13Lg" or, when
// fixed, exactly digits decimals.
CString NumberToText(double value, int digits, bool fixed);

}  // namespace Tarsa
