#include <gtest/gtest.h>

#include <string>

#include "framework/layout/CExpressionScope.h"
#include "framework/layout/CZilSyntaxError.h"

namespace Tarsa {
namespace {

constexpr std::int32_t kUndef = CExpressionScope::kUndefined;

std::int32_t Eval(CExpressionScope& scope, const std::string& text) {
  CZilLexer lexer(text);
  const std::int32_t value = scope.Evaluate(lexer);
  EXPECT_TRUE(lexer.AtEnd()) << text;
  return value;
}

std::int32_t Plain(const std::string& text) {
  CExpressionScope scope;
  return Eval(scope, text);
}

std::int32_t Logic(const std::string& text) {
  CExpressionScope scope(nullptr, true, true);
  return Eval(scope, text);
}

TEST(ExpressionScope, HashAndBucketMatchHandComputation) {
  // a: 36. Ab: 10 x 63 + 37 = 667, 667 - 5 x 127 = 32.
  EXPECT_EQ(CExpressionScope::Hash("a"), 36u);
  EXPECT_EQ(CExpressionScope::Hash("Ab"), 667u);
  EXPECT_EQ(CExpressionScope::Bucket("Ab"), 32u);
  // x_1: (59 x 63 + 62) x 63 + 1 = 238078 = 1874 x 127 + 80.
  EXPECT_EQ(CExpressionScope::Hash("x_1"), 238078u);
  EXPECT_EQ(CExpressionScope::Bucket("x_1"), 80u);
  // zzzzzz: 61 x (63^6 - 1) / 62 = 61515058624, less 14 x 2^32.
  EXPECT_EQ(CExpressionScope::Hash("zzzzzz"), 1385516480u);
  EXPECT_EQ(CExpressionScope::Bucket("zzzzzz"), 74u);
  // Other characters count 0.
  EXPECT_EQ(CExpressionScope::Hash("-"), 0u);
  EXPECT_EQ(CExpressionScope::Hash("a-"), 36u * 63u);
}

TEST(ExpressionScope, NamesInOneBucketStayApart) {
  // "a" (36) and "-a" (0 x 63 + 36) share a bucket; so do "b" and "_b"'s
  // neighbours: the chain must tell them apart by name.
  CExpressionScope scope;
  scope.Define("a", 1);
  scope.Define("Ab", 2);
  for (int i = 0; i < 300; ++i) scope.Define("n" + std::to_string(i), i);
  EXPECT_EQ(scope.Value("a"), 1);
  EXPECT_EQ(scope.Value("Ab"), 2);
  EXPECT_EQ(scope.Value("n299"), 299);
  EXPECT_EQ(scope.Value("n300"), kUndef);
  scope.Define("a", 5);
  EXPECT_EQ(scope.Value("a"), 5);
  EXPECT_EQ(scope.Symbols().size(), 302u);
}

TEST(ExpressionScope, LookUpWalksParentsThroughEmptyScopes) {
  CExpressionScope root;
  root.Define("a", 3);
  CExpressionScope empty(&root);
  CExpressionScope inner(&empty);
  EXPECT_EQ(inner.Value("a"), 3);
  inner.Define("a", 4);
  EXPECT_EQ(inner.Value("a"), 4);
  EXPECT_EQ(root.Value("a"), 3);
  EXPECT_EQ(Eval(inner, "a * 10 + a"), 44);
}

TEST(ExpressionScope, ArithmeticPrecedenceAndDivisionWithPercent) {
  EXPECT_EQ(Plain("1 + 2 * 3"), 7);
  EXPECT_EQ(Plain("10 - 3 - 2"), 5);
  EXPECT_EQ(Plain("(10 - 3) * -2"), -14);
  EXPECT_EQ(Plain("100 / 7 / 2"), 7);
  // '%' divides: the language has no remainder.
  EXPECT_EQ(Plain("7 % 2"), 3);
  EXPECT_EQ(Plain("- - +4"), 4);
  // 32-bit wrap, not a fault.
  EXPECT_EQ(Plain("2147483647 + 2"), -2147483647);
}

TEST(ExpressionScope, UndefinedNamesPropagateAndAreReported) {
  CExpressionScope scope;
  scope.Define("w", 10);
  EXPECT_EQ(Eval(scope, "w + 1"), 11);
  EXPECT_TRUE(scope.UndefinedName().empty());
  EXPECT_EQ(Eval(scope, "w + missing * 2"), kUndef);
  EXPECT_EQ(scope.UndefinedName(), "missing");
  EXPECT_EQ(scope.UndefinedMessage(), "line 1: 'missing' is not defined");
  EXPECT_EQ(Eval(scope, "-(gone)"), kUndef);
  EXPECT_EQ(scope.UndefinedName(), "gone");
  CExpressionScope logic(nullptr, true, true);
  // Comparisons and logic read an undefined operand as false.
  EXPECT_EQ(Eval(logic, "(x > -5)"), 0);
  EXPECT_EQ(Eval(logic, "(x == x)"), 0);
  EXPECT_EQ(Eval(logic, "(x || 1)"), 0);
  EXPECT_EQ(Eval(logic, "(1 && x)"), 0);
  EXPECT_EQ(Eval(logic, "in(x, 1, 2)"), 0);
}

TEST(ExpressionScope, LogicAndComparisonsOnlyWhereAllowed) {
  EXPECT_EQ(Logic("(0 || 2)"), 1);
  EXPECT_EQ(Logic("(0 || 0)"), 0);
  EXPECT_EQ(Logic("(3 && 0)"), 0);
  EXPECT_EQ(Logic("(1 + 1 == 2 && 3 >= 3)"), 1);
  EXPECT_EQ(Logic("(2 < 1 || 4 != 5)"), 1);
  EXPECT_EQ(Logic("!0 + !7"), 1);
  EXPECT_EQ(Logic("(5 > 2) * 10"), 10);
  // Not in a plain scope, and never outside parentheses.
  EXPECT_THROW(Plain("(1 < 2)"), CZilSyntaxError);
  EXPECT_THROW(Plain("(1 || 2)"), CZilSyntaxError);
  EXPECT_THROW(Plain("!1"), CZilSyntaxError);
  EXPECT_THROW(Logic("1 < 2"), CZilSyntaxError);
  // At most one comparison in a row.
  EXPECT_THROW(Logic("(1 < 2 < 3)"), CZilSyntaxError);
  EXPECT_THROW(Logic("(1 == 1 == 1)"), CZilSyntaxError);
}

TEST(ExpressionScope, FunctionsAndSetsOnlyWhereAllowed) {
  EXPECT_EQ(Plain("min(3, 1, 2)"), 1);
  EXPECT_EQ(Plain("max(3, 1, 2) + 1"), 4);
  EXPECT_EQ(Plain("dim(3, 5)"), 0);
  EXPECT_EQ(Plain("dim(5, 3)"), 2);
  EXPECT_EQ(Logic("in(5, 1, 5, 40)"), 1);
  EXPECT_EQ(Logic("in(4, 1, 5, 40)"), 0);
  EXPECT_EQ(Logic("in(40, 40)"), 0);
  EXPECT_EQ(Logic("in(-1, -1)"), 0);
  EXPECT_THROW(Plain("in(5, 5)"), CZilSyntaxError);
  EXPECT_THROW(Plain("min(1)"), CZilSyntaxError);
  EXPECT_THROW(Plain("dim(1, 2, 3)"), CZilSyntaxError);
  EXPECT_THROW(Plain("nosuch(1)"), CZilSyntaxError);
}

TEST(ExpressionScope, FaultsAreSyntaxErrorsWithTheirLine) {
  auto lineOf = [](const std::string& text) {
    try {
      Logic(text);
    } catch (const CZilSyntaxError& error) {
      return error.Line();
    }
    return 0;
  };
  EXPECT_EQ(lineOf("1 +\n\n 2 / (3 - 3)"), 3);
  EXPECT_EQ(lineOf("\n99999999999"), 2);
  EXPECT_EQ(lineOf("(1 +\n 2"), 2);
  EXPECT_EQ(lineOf("\n\n\n#"), 4);
  // Nesting is bounded, so no input runs the stack out.
  EXPECT_GT(lineOf(std::string(100000, '(') + "1"), 0);
  EXPECT_GT(lineOf(std::string(100000, '-') + "1"), 0);
}

}  // namespace
}  // namespace Tarsa
