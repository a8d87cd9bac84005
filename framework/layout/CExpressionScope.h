#pragma once

#include <array>
#include <cstdint>
#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include "framework/layout/CNamePool.h"
#include "framework/layout/CZilLexer.h"

namespace Tarsa {

class CZilFunctions;

// The symbol table of a layout file's block, and the parser of its integer
// expressions. Symbols hang in 127 buckets by a hash of their names; a
// symbol holds an int, a string or both, and the int kUndefined stands for
// "none". Look-up walks up the chain of parents. Names and strings lie in
// the scope's own pool and die with it; the parent and the functions table
// are borrowed.
//
// Logic (!, &&, ||, comparisons inside parentheses) and the set function
// `in` are accepted only where the scope allows them.
class CExpressionScope {
 public:
  static constexpr std::int32_t kUndefined = std::numeric_limits<std::int32_t>::min();
  static constexpr std::uint32_t kBuckets = 127;
  // Nesting of parentheses and calls an expression may have.
  static constexpr int kMaxDepth = 64;

  struct Symbol {
    Symbol* link = nullptr;
    std::string_view name;
    std::int32_t value = kUndefined;
    std::string_view string;
    bool hasString = false;
  };

  explicit CExpressionScope(CExpressionScope* parent = nullptr, bool allowLogic = false,
                            bool allowSets = false);
  virtual ~CExpressionScope();
  CExpressionScope(const CExpressionScope&) = delete;
  CExpressionScope& operator=(const CExpressionScope&) = delete;

  // h = h * 63 + v over the characters, in unsigned 32-bit arithmetic.
  static std::uint32_t Hash(std::string_view name);
  static std::uint32_t Bucket(std::string_view name) { return Hash(name) % kBuckets; }

  // Defines (or redefines) a name in this scope.
  void Define(std::string_view name, std::int32_t value);
  void DefineString(std::string_view name, std::string_view string);
  void DefineSymbol(std::string_view name, std::int32_t value, std::string_view string,
                    bool hasString);

  // The symbol in this scope or the nearest enclosing one; null when none.
  const Symbol* Find(std::string_view name) const;
  const Symbol* FindHere(std::string_view name) const;
  // The int of a name, or kUndefined.
  std::int32_t Value(std::string_view name) const;
  // This scope's own symbols, in the order they were first defined.
  const std::vector<Symbol*>& Symbols() const { return order_; }

  CExpressionScope* Parent() const { return parent_; }
  bool AllowsLogic() const { return allowLogic_; }
  bool AllowsSets() const { return allowSets_; }
  void SetFunctions(CZilFunctions* functions) { functions_ = functions; }

  // Parses one expression at the lexer and gives its value (kUndefined when
  // a name in it did not resolve). Syntax faults throw CZilSyntaxError.
  std::int32_t Evaluate(CZilLexer& lexer);
  // The last name that did not resolve, and a message that says so.
  const std::string& UndefinedName() const { return undefinedName_; }
  std::string UndefinedMessage() const;

 private:
  Symbol* Lookup(std::string_view name) const;
  CZilFunctions* Functions() const;

  std::int32_t ParseOr(CZilLexer& lexer, int depth);
  std::int32_t ParseAnd(CZilLexer& lexer, int depth);
  std::int32_t ParseRelation(CZilLexer& lexer, int depth);
  std::int32_t ParseEquality(CZilLexer& lexer, int depth);
  std::int32_t ParseSum(CZilLexer& lexer, int depth);
  std::int32_t ParseProduct(CZilLexer& lexer, int depth);
  std::int32_t ParseUnary(CZilLexer& lexer, int depth);
  std::int32_t ParsePrimary(CZilLexer& lexer, int depth);
  std::int32_t ParseCall(CZilLexer& lexer, std::string_view name, int depth);
  std::vector<std::int32_t> ParseArguments(CZilLexer& lexer, std::string_view name, int depth);

  CExpressionScope* parent_;
  bool allowLogic_;
  bool allowSets_;
  CZilFunctions* functions_ = nullptr;
  std::array<Symbol*, kBuckets> buckets_{};
  std::vector<Symbol*> order_;
  std::vector<std::unique_ptr<Symbol>> owned_;
  CNamePool pool_;
  std::string undefinedName_;
  int undefinedLine_ = 0;
};

}  // namespace Tarsa
