#pragma once

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "framework/strings/CStringSource.h"
#include "framework/strings/CStringTable.h"

namespace Tarsa::testing {

// Starts and ends every test without a string table service, so tests that
// fill it cannot leak into one another.
class FreshStringTable : public ::testing::Test {
 protected:
  void SetUp() override { CStringTable::Drop(); }
  void TearDown() override { CStringTable::Drop(); }
};

// A host that knows some keyed strings and counts how often it is asked.
class FakeSource : public CStringSource {
 public:
  explicit FakeSource(bool prefersDefaults = false) : prefersDefaults_(prefersDefaults) {}
  bool PrefersDefaultStrings() override {
    ++preferenceQuestions;
    return prefersDefaults_;
  }
  bool LookupString(const CString& keyed, CString& text) override {
    ++lookups;
    const auto found = answers.find(keyed.Str());
    if (found != answers.end()) text = CString(found->second);
    return found != answers.end();
  }

  std::map<std::string, std::string> answers;  // whole keyed string -> text
  int lookups = 0;
  int preferenceQuestions = 0;

 private:
  bool prefersDefaults_;
};

// The bytes of a UTF-16 string file, optionally led by a byte-order mark.
inline std::vector<unsigned char> Utf16File(std::u16string_view text, bool littleEndian,
                                            bool withMark) {
  std::vector<unsigned char> bytes;
  std::u16string all = withMark ? u"\uFEFF" : u"";
  all += text;
  for (char16_t c : all) {
    bytes.push_back(static_cast<unsigned char>(littleEndian ? c & 0xFF : c >> 8));
    bytes.push_back(static_cast<unsigned char>(littleEndian ? c >> 8 : c & 0xFF));
  }
  return bytes;
}

// Well-formed UTF-8: shortest forms, no surrogates, nothing past U+10FFFF.
inline bool IsValidUtf8(std::string_view s) {
  for (std::size_t i = 0; i < s.size();) {
    const auto b = static_cast<unsigned char>(s[i]);
    const std::size_t extra = b < 0x80   ? 0
                              : b < 0xC2 ? 9
                              : b < 0xE0 ? 1
                              : b < 0xF0 ? 2
                              : b < 0xF5 ? 3
                                         : 9;
    if (extra == 9 || (extra > 0 && i + extra >= s.size())) return false;
    char32_t cp = extra == 0 ? b : b & (0x3F >> extra);
    for (std::size_t k = 1; k <= extra; ++k) {
      const auto c = static_cast<unsigned char>(s[i + k]);
      if ((c & 0xC0) != 0x80) return false;
      cp = (cp << 6) | (c & 0x3F);
    }
    if ((extra == 2 && cp < 0x800) || (extra == 3 && cp < 0x10000)) return false;
    if ((cp >= 0xD800 && cp <= 0xDFFF) || cp > 0x10FFFF) return false;
    i += extra + 1;
  }
  return true;
}

}  // namespace Tarsa::testing
