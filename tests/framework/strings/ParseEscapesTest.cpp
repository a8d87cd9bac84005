#include <gtest/gtest.h>

#include <string>

#include "framework/strings/CString.h"

namespace Tarsa {
namespace {

std::string Parsed(const std::string& text) {
  CString s(text);
  s.ParseEscapes();
  return s.Str();
}

TEST(ParseEscapes, CaretSequencesGiveTheirCharacters) {
  // The whole table, the expected UTF-8 bytes written out by hand.
  EXPECT_EQ(Parsed("^! ^\" ^U ^# ^* ^A ^B ^C ^D ^E ^F ^I ^L ^l ^N ^O ^P ^Q"),
            "\xC2\xAC \" \" \xE2\x8C\x98 * ' \xE2\x80\xA2 \xC2\xA9 \xC2\xB0 \xC3\xAA / "
            "\xE2\x88\x86 \\ \\ \r\n Control Alt ?");
  EXPECT_EQ(Parsed("^R ^S ^T ^V ^[ ^] ^^ ^` ^b ^e ^n ^o ^p ^r ^t ^{ ^}"),
            "\xC2\xAE \xE2\x88\x91 \xE2\x84\xA2 | \xE2\x80\x9C \xE2\x80\x9D ^ ` \x08 \xC3\xA9 \n "
            "control alt \r \t \xE2\x80\x98 \xE2\x80\x99");
}

TEST(ParseEscapes, CaretPlusTakesUpToFourHexDigits) {
  EXPECT_EQ(Parsed("^+41 ^+00e9 ^+20AC"), "A \xC3\xA9 \xE2\x82\xAC");
  EXPECT_EQ(Parsed("^+12345"),
            "\xE1\x88\xB4"
            "5");                                       // the fifth digit is text
  EXPECT_EQ(Parsed("a^+zz a^+0000z a^+"), "azz az a");  // no digits or zero: nothing
  EXPECT_EQ(Parsed("^+D800"), "\xEF\xBF\xBD");          // a lone surrogate is not text
}

TEST(ParseEscapes, CEscapes) {
  EXPECT_EQ(Parsed("say \\\"hi\\\"\\n\\ttab\\r"), "say \"hi\"\n\ttab\r");
  EXPECT_EQ(Parsed("C:\\\\temp\\\\new"), "C:\\temp\\new");  // "\\n" is no newline here
  EXPECT_EQ(Parsed("\\q \\a end\\"), "\\q \\a end\\");      // unknown pairs stay
  // A backslash pair is read as one, so the caret after it is not a sequence.
  EXPECT_EQ(Parsed("\\^n"), "\\^n");
}

TEST(ParseEscapes, EverythingElsePassesThrough) {
  EXPECT_EQ(Parsed("^0 of ^1"), "^0 of ^1");  // parameters outlive the parse
  EXPECT_EQ(Parsed("^^0"), "^0");
  EXPECT_EQ(Parsed("^z ^G ^ ^~ end^"), "^z ^G ^ ^~ end^");
  EXPECT_EQ(Parsed("^\xC3\xA9 caf\xC3\xA9^n"), "^\xC3\xA9 caf\xC3\xA9\n");
}

}  // namespace
}  // namespace Tarsa
