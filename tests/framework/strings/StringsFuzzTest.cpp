#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

#include "framework/strings/CString.h"
#include "framework/strings/CStringTable.h"
#include "framework/strings/StringFile.h"
#include "tests/framework/strings/StringTestSupport.h"

namespace Tarsa {
namespace {

using StringsFuzz = testing::FreshStringTable;
using testing::IsValidUtf8;

TEST_F(StringsFuzz, StringFileParserTakesAnyBytes) {
  // Bytes that steer the parser into its states, mixed with random ones.
  const unsigned char steer[] = {0x00, 0xFF, 0xFE, 0xD8, 0xDC, '\r', '\n', '=', '"',
                                 '$',  '\\', '^',  '+',  '/',  'A',  'n',  '0'};
  std::mt19937 rng(20240611);
  for (int round = 0; round < 3000; ++round) {
    std::vector<unsigned char> bytes(rng() % 80);
    for (auto& b : bytes) {
      b = rng() % 3 == 0 ? static_cast<unsigned char>(rng()) : steer[rng() % std::size(steer)];
    }
    CStringTable table;
    LoadStringFile(table, bytes.data(), bytes.size());
    table.ForEach([&](std::string_view key, const CString& value) {
      EXPECT_FALSE(key.empty());
      EXPECT_TRUE(IsValidUtf8(value.Str())) << "round " << round;
    });
  }
}

TEST_F(StringsFuzz, TruncatedFileKeepsEveryCompleteEntry) {
  const std::u16string text =
      u"\"$$$/A=alpha ^n\"\r\n/B=b\\\"e\\\\ta\n\"$$$/C=caf\u00E9 \U0001F600\"\n";
  const auto full = testing::Utf16File(text, /*littleEndian=*/true, /*withMark=*/true);
  CStringTable whole;
  LoadStringFile(whole, full.data(), full.size());
  ASSERT_EQ(whole.Count(), 3u);

  const char* keys[] = {"/A", "/B", "/C"};
  std::vector<std::size_t> lineEnds;  // byte offset just past each LF, mark included
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == u'\n') lineEnds.push_back(2 + 2 * (i + 1));
  }
  for (std::size_t cut = 0; cut <= full.size(); ++cut) {
    CStringTable part;
    LoadStringFile(part, full.data(), cut);
    for (std::size_t k = 0; k < 3 && cut >= lineEnds[k]; ++k) {
      ASSERT_NE(part.Find(keys[k]), nullptr) << "cut " << cut;
      EXPECT_EQ(part.Find(keys[k])->Str(), whole.Find(keys[k])->Str()) << "cut " << cut;
    }
    part.ForEach([&](std::string_view, const CString& value) {
      EXPECT_TRUE(IsValidUtf8(value.Str())) << "cut " << cut;
    });
  }
}

TEST_F(StringsFuzz, EscapesAndResolveTakeAnyText) {
  ASSERT_FALSE(IsValidUtf8("\xED\xA0\x80"));  // the checker itself rejects a surrogate
  const char pieces[] = {'$', '/', '=', '^', '^', '+', '\\', '\\', 'n', 'A',    'f',
                         '0', '1', 'D', '8', '"', 'U', '{',  '~',  ' ', '\xC3', '\xA9'};
  std::mt19937 rng(7);
  for (int round = 0; round < 4000; ++round) {
    std::string text(rng() % 24, ' ');
    for (char& c : text) c = pieces[rng() % std::size(pieces)];
    if (rng() % 2 == 0) text.insert(0, "$$$");

    CString escaped(text);
    escaped.ParseEscapes();
    if (IsValidUtf8(text)) {  // sequences only ever add well-formed characters
      EXPECT_TRUE(IsValidUtf8(escaped.Str())) << text;
    }
    CString resolved(text);
    resolved.Resolve();
    if (resolved.Str().rfind("$$$", 0) != 0) {
      EXPECT_EQ(ResolveText(resolved.Str()).Str(), resolved.Str()) << text;
    }
    EXPECT_EQ(resolved.Replace(9, "v").Str(), ResolveText(resolved.Str()).Str());  // no "^9"
  }
}

}  // namespace
}  // namespace Tarsa
