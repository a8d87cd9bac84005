#include <gtest/gtest.h>

#include <string>

#include "framework/layout/CSwiftViewScope.h"
#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/layout/CZilSyntaxError.h"

namespace Tarsa {
namespace {

std::unique_ptr<CViewProxy> Layout(const std::string& text) {
  CZilGenerator generator;
  return generator.Layout(text);
}

std::int32_t IntOf(const CViewProxy& proxy, const char* name) {
  std::int32_t value = -999;
  proxy.properties.GetInt(name, value);
  return value;
}

TEST(ZilParser, SyntaxErrorsSayWhatAndWhere) {
  struct Case {
    const char* text;
    int line;
    const char* says;
  };
  const Case cases[] = {
      {"W(\n  width: 10\n  height: 5);", 3,
       "expected ')' after the parameters of W, found 'height'"},
      {"x = 'abc;\nW();", 1, "never closed"},
      {"W() {\n  V();\n", 3, "expected '}' to close the block of W, found the end of the file"},
      {"W();\n}", 2, "a '}' with no '{'"},
      {"W();\nV();\n 5", 3, "expected a statement"},
      {"a = b;\nW();", 1, "'b' is not defined"},
      {"W(width: 1 +);", 1, "expected a number, a name or '('"},
      {"W() {\n align_centers(0, 10, 20, &a);\n}", 2, "as many names as heights"},
      {"W() { step(1, 2); }", 1, "expected ','"},
      {"W(width: 3 $ 4);", 1, "unexpected character '$'"},
      {"W(\n\nwidth 3);", 3, "expected ':' after the parameter width"},
      {"W() { a = 1 }", 1, "expected ';' to end the assignment to a"},
      {"W()", 1, "expected ';' or a block after the view W"},
      {"W() { x; }", 1, "expected '=' or '(' after 'x'"},
      {"W(h: (1 < 2 < 3));", 1, "only one comparison"},
      {"W(w: 4 / 0);", 1, "division by zero"},
  };
  for (const Case& c : cases) {
    try {
      Layout(c.text);
      ADD_FAILURE() << "no error for: " << c.text;
    } catch (const CZilSyntaxError& error) {
      EXPECT_EQ(error.Line(), c.line) << c.text << " -> " << error.what();
      EXPECT_NE(std::string(error.what()).find(c.says), std::string::npos)
          << c.text << " -> " << error.what();
      EXPECT_EQ(std::string(error.what()).rfind("line " + std::to_string(c.line) + ": ", 0), 0u);
    }
  }
}

TEST(ZilParser, TheFileMustHoldExactlyOneRootView) {
  EXPECT_THROW(Layout(""), std::logic_error);
  EXPECT_THROW(Layout("  a = 1;  "), std::logic_error);
  try {
    Layout("W();\nW();");
    ADD_FAILURE();
  } catch (const std::logic_error& error) {
    EXPECT_NE(std::string(error.what()).find("2 views at the top"), std::string::npos);
  }
  // A zero byte ends the text, as it would a resource read as a C string.
  EXPECT_NO_THROW(Layout(std::string("W();\0garbage", 12)));
}

TEST(ZilParser, ValuesNamesStringsAndFourCharacterCodes) {
  const auto root = Layout(
      "s = 'hello'; n = 7;\n"
      "W(t: s, k: n, code: 'ZILf', name: 'abc', sum: n * 2 + 1, u: nothing + 1, both: code);");
  std::string text;
  EXPECT_TRUE(root->properties.GetString("t", text));
  EXPECT_EQ(text, "hello");
  EXPECT_EQ(IntOf(*root, "k"), 7);
  EXPECT_EQ(IntOf(*root, "code"), 0x5A494C66);
  EXPECT_TRUE(root->properties.GetString("code", text));
  EXPECT_EQ(text, "ZILf");
  EXPECT_EQ(IntOf(*root, "name"), -999);  // a string of another length has no int
  EXPECT_EQ(IntOf(*root, "sum"), 15);
  EXPECT_FALSE(root->properties.Has("u"));  // undefined: absent
  // A name alone copies the whole symbol, int and string, from earlier
  // parameters of the same view.
  EXPECT_EQ(IntOf(*root, "both"), 0x5A494C66);
  EXPECT_EQ(root->properties.FindVariable("sum")->Expression(), "n * 2 + 1");
}

TEST(ZilParser, AssignmentsInABlockReachOnlyViewsBelowThem) {
  const auto root = Layout(
      "W() {\n"
      "  P() { a = 3; b = a + 1; V(v: b); }\n"
      "  V(w: a + 0, x: 1);\n"
      "}");
  ASSERT_EQ(root->children.size(), 2u);
  EXPECT_EQ(IntOf(*root->children[0]->children[0], "v"), 4);
  EXPECT_FALSE(root->children[1]->properties.Has("w"));
  EXPECT_EQ(IntOf(*root->children[1], "x"), 1);
}

TEST(ZilParser, StepNumbersAndAlignCentersCentres) {
  const auto root = Layout(
      "step(10, 5, &a, &b, &c);\n"
      "align_centers(100, 20, 30, 24, &y1, &y2, &y3);\n"
      "W(a: a, b: b, c: c, y1: y1, y2: y2, y3: y3);");
  EXPECT_EQ(IntOf(*root, "a"), 10);
  EXPECT_EQ(IntOf(*root, "b"), 15);
  EXPECT_EQ(IntOf(*root, "c"), 20);
  // The tallest is 30: y = 100 + (30 - h) / 2.
  EXPECT_EQ(IntOf(*root, "y1"), 105);
  EXPECT_EQ(IntOf(*root, "y2"), 100);
  EXPECT_EQ(IntOf(*root, "y3"), 103);
}

TEST(ZilParser, KeywordsAndFontsReachTheViewsInside) {
  const auto root = Layout(
      "W(placement: place_row, b: kBind_FixedBottomRight + kBind_XSizeable) {\n"
      "  text_font = kFont_UISmall;\n"
      "  V(); V(text_font: kFont_UIBold);\n"
      "}");
  EXPECT_EQ(root->placement, kPlace_Row);
  EXPECT_EQ(IntOf(*root, "b"), 193);
  EXPECT_EQ(IntOf(*root->children[0], "text_font"), 14);
  EXPECT_EQ(IntOf(*root->children[1], "text_font"), 3);
}

TEST(ZilParser, MarginsFallBackFromSideToAxisToAll) {
  const auto root = Layout("W(margin: 4, margin_top: 0, margin_width: 6, margin_left: 1);");
  EXPECT_EQ(root->marginLeft, 1);
  EXPECT_EQ(root->marginRight, 6);
  EXPECT_EQ(root->marginTop, 0);
  EXPECT_EQ(root->marginBottom, 4);
  const auto plain = Layout("W(margin: 4, margin_top: 0);");
  EXPECT_EQ(plain->marginLeft, 4);
  EXPECT_EQ(plain->marginRight, 4);
  EXPECT_EQ(plain->marginTop, 0);
  EXPECT_EQ(plain->marginBottom, 4);
}

TEST(ZilParser, SizesAreBoundedAndDeepNestingIsRefused) {
  const auto root = Layout("W(width: 2000000000, height: -5);");
  EXPECT_EQ(root->measuredWidth, 65535);
  EXPECT_EQ(root->measuredHeight, 0);
  std::string deep;
  for (int i = 0; i < 200; ++i) deep += "V() {";
  deep += std::string(200, '}');
  EXPECT_THROW(Layout(deep), CZilSyntaxError);
  std::string many = "W() {";
  for (int i = 0; i < CZilGenerator::kMaxViews + 1; ++i) many += "V();";
  EXPECT_THROW(Layout(many + "}"), CZilSyntaxError);
}

TEST(ZilParser, AViewScopeNeedsAGenerator) {
  EXPECT_THROW(CSwiftViewScope scope(nullptr), std::logic_error);
  CZilGenerator generator;
  CSwiftViewScope root(nullptr, &generator);
  CSwiftViewScope inner(&root);
  EXPECT_EQ(&inner.Generator(), &generator);
  EXPECT_TRUE(inner.AllowsLogic() && inner.AllowsSets());
}

TEST(ZilParser, TheListenerSeesEveryTokenAndChangesNothing) {
  const std::string text = "n = 'ab';\nW(w: (n + 2) * 3) { V(); }";
  CZilGenerator generator;
  std::string seen;
  std::size_t strings = 0;
  generator.SetListener([&](EZilToken kind, std::size_t start, std::size_t end) {
    if (kind == EZilToken::kString) ++strings;
    seen += text.substr(start, end - start);
  });
  const auto root = generator.Layout(text);
  EXPECT_EQ(seen, "n='ab';W(w:(n+2)*3){V();}");
  EXPECT_EQ(strings, 1u);
  EXPECT_FALSE(root->properties.Has("w"));  // n has no int: the product is undefined
  EXPECT_EQ(generator.Furthest(), text.size());
}

}  // namespace
}  // namespace Tarsa
