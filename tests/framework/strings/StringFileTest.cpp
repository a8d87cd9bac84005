#include "framework/strings/StringFile.h"

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

#include "framework/strings/CStringTable.h"
#include "tests/framework/strings/StringTestSupport.h"

namespace Tarsa {
namespace {

using Entries = std::map<std::string, std::string>;

Entries Contents(const CStringTable& table) {
  Entries out;
  table.ForEach(
      [&](std::string_view key, const CString& value) { out[std::string(key)] = value.Str(); });
  return out;
}

Entries Load(std::u16string_view text, bool littleEndian = true, bool withMark = true) {
  const auto bytes = testing::Utf16File(text, littleEndian, withMark);
  CStringTable table;
  LoadStringFile(table, bytes.data(), bytes.size());
  return Contents(table);
}

TEST(StringFile, EntriesKeysAndValues) {
  std::u16string unpaired = u"/Lone=";
  unpaired += {char16_t{0xD800}, u'x'};  // a high surrogate with no partner
  const struct {
    std::u16string text;
    bool littleEndian, withMark;
    Entries expected;
  } cases[] = {
      // Both byte orders; without a mark the text is big-endian from its
      // first byte; the last entry needs no line end.
      {u"\"$$$/A=alpha\"\r\n\"$$$/B=beta\"", true, true, {{"/A", "alpha"}, {"/B", "beta"}}},
      {u"\"$$$/A=alpha\"\r\n\"$$$/B=beta\"", false, true, {{"/A", "alpha"}, {"/B", "beta"}}},
      {u"\"$$$/A=alpha\"\r\n\"$$$/B=beta\"", false, false, {{"/A", "alpha"}, {"/B", "beta"}}},
      // A key starts at its slash, whatever came before.
      {u"/Bare=1\n$$$/Dollars=2\n\"\"$\"$/Mixed=3\n/In\"Key$=4\n=no key\n\n",
       true,
       true,
       {{"/Bare", "1"}, {"/Dollars", "2"}, {"/Mixed", "3"}, {"/In\"Key$", "4"}}},
      // A backslash takes the next character literally, so the file's "\\n"
      // reaches ParseEscapes as "\n", a LF; a trailing quote is dropped once.
      {u"\"$$$/Say=say \\\"hi\\\" ^n\\\\n=\"\n\"$$$/Quote=q\"\"",
       true,
       true,
       {{"/Say", "say \"hi\" \n\n="}, {"/Quote", "q\""}}},
      // Values become UTF-8; a lone surrogate becomes U+FFFD.
      {u"/Cafe=caf\u00E9 \U0001F600", false, true, {{"/Cafe", "caf\xC3\xA9 \xF0\x9F\x98\x80"}}},
      {unpaired,
       false,
       true,
       {{"/Lone",
         "\xEF\xBF\xBD"
         "x"}}},
  };
  for (const auto& c : cases) EXPECT_EQ(Load(c.text, c.littleEndian, c.withMark), c.expected);
}

TEST(StringFile, LaterEntriesAndLaterFilesOverride) {
  CStringTable table;
  const auto first = testing::Utf16File(u"/A=one\n/B=keep\n/A=two\n", true, true);
  const auto second = testing::Utf16File(u"/A=three", false, true);
  LoadStringFile(table, first.data(), first.size());
  EXPECT_EQ(Contents(table), (Entries{{"/A", "two"}, {"/B", "keep"}}));
  LoadStringFile(table, second.data(), second.size());
  EXPECT_EQ(Contents(table), (Entries{{"/A", "three"}, {"/B", "keep"}}));
}

TEST(StringFile, TinyInputsReadNothing) {
  EXPECT_EQ(Load(u""), Entries{});                              // a mark alone
  EXPECT_EQ(Load(u"/", false, /*withMark=*/false), Entries{});  // one unit
  auto odd = testing::Utf16File(u"/K=v", false, true);
  odd.push_back(0x41);  // half a unit at the end is ignored
  CStringTable table;
  LoadStringFile(table, odd.data(), odd.size());
  LoadStringFile(table, nullptr, 100);
  EXPECT_EQ(Contents(table), (Entries{{"/K", "v"}}));
}

}  // namespace
}  // namespace Tarsa
