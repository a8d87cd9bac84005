#include "framework/strings/StringFile.h"

#include <string>

#include "framework/strings/CString.h"
#include "framework/strings/CStringTable.h"
#include "framework/strings/Unicode.h"

namespace Tarsa {

namespace {

// The entry being read and the parser's three flags.
struct Entry {
  std::string key;
  std::u16string value;
  bool inValue = false;
  bool inKey = false;
  bool escaped = false;

  void Close(CStringTable& table) {
    if (!value.empty() && value.back() == u'"') value.pop_back();
    if (!key.empty()) {
      CString text(Utf16ToUtf8(value));
      text.ParseEscapes();
      table.Insert(key, text, true);
    }
    *this = Entry();
  }

  void Add(char16_t c) {
    if (c == u'=' && !inValue) {
      inValue = true;
      inKey = true;
    } else if (!inValue) {
      // The key starts at its "/", whether or not the entry is quoted.
      if (!inKey && (c == u'"' || c == u'$')) return;
      inKey = true;
      key.push_back(static_cast<char>(c & 0xFF));
    } else if (c == u'\\' && !escaped) {
      escaped = true;
    } else {
      value.push_back(c);
      escaped = false;
    }
  }
};

}  // namespace

void LoadStringFile(CStringTable& table, const void* bytes, std::size_t size) {
  if (bytes == nullptr) return;
  const auto* b = static_cast<const unsigned char*>(bytes);
  const std::size_t units = size / 2;
  if (units < 2) return;

  bool littleEndian = false;
  std::size_t i = 0;
  if (b[0] == 0xFF && b[1] == 0xFE) {
    littleEndian = true;
    i = 1;
  } else if (b[0] == 0xFE && b[1] == 0xFF) {
    i = 1;
  }

  Entry entry;
  for (; i < units; ++i) {
    const unsigned first = b[2 * i];
    const unsigned second = b[2 * i + 1];
    const auto c =
        static_cast<char16_t>(littleEndian ? (second << 8) | first : (first << 8) | second);
    if (c == u'\r' || c == u'\n') {
      entry.Close(table);
    } else {
      entry.Add(c);
    }
  }
  entry.Close(table);
}

}  // namespace Tarsa
