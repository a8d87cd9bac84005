#include "framework/layout/CExpressionScope.h"

#include <algorithm>

#include "framework/layout/CZilFunctions.h"
#include "framework/layout/CZilSyntaxError.h"

namespace Tarsa {
namespace {

constexpr std::int32_t kUndef = CExpressionScope::kUndefined;

// 32-bit arithmetic that wraps rather than overflowing.
std::int32_t Wrap(std::uint32_t v) { return static_cast<std::int32_t>(v); }
std::uint32_t U(std::int32_t v) { return static_cast<std::uint32_t>(v); }

bool IsLogicToken(const CZilToken& token) {
  if (token.kind != EZilToken::kPunct) return false;
  const std::string_view t = token.text;
  return t == "||" || t == "&&" || t == "<" || t == "<=" || t == ">" || t == ">=" || t == "==" ||
         t == "!=";
}

}  // namespace

CExpressionScope::CExpressionScope(CExpressionScope* parent, bool allowLogic, bool allowSets)
    : parent_(parent), allowLogic_(allowLogic), allowSets_(allowSets) {}

CExpressionScope::~CExpressionScope() = default;

std::uint32_t CExpressionScope::Hash(std::string_view name) {
  std::uint32_t h = 0;
  for (const char c : name) {
    std::uint32_t v = 0;
    if (c >= '0' && c <= '9') {
      v = static_cast<std::uint32_t>(c - '0');
    } else if (c >= 'A' && c <= 'Z') {
      v = static_cast<std::uint32_t>(c - 'A' + 10);
    } else if (c >= 'a' && c <= 'z') {
      v = static_cast<std::uint32_t>(c - 'a' + 36);
    } else if (c == '_') {
      v = 62;
    }
    h = h * 63u + v;
  }
  return h;
}

void CExpressionScope::Define(std::string_view name, std::int32_t value) {
  DefineSymbol(name, value, {}, false);
}

void CExpressionScope::DefineString(std::string_view name, std::string_view string) {
  DefineSymbol(name, kUndef, string, true);
}

void CExpressionScope::DefineSymbol(std::string_view name, std::int32_t value,
                                    std::string_view string, bool hasString) {
  Symbol* symbol = const_cast<Symbol*>(FindHere(name));
  if (symbol == nullptr) {
    owned_.push_back(std::make_unique<Symbol>());
    symbol = owned_.back().get();
    symbol->name = pool_.Store(name);
    Symbol*& head = buckets_[Bucket(name)];
    symbol->link = head;
    head = symbol;
    order_.push_back(symbol);
  }
  symbol->value = value;
  symbol->string = hasString ? pool_.Store(string) : std::string_view();
  symbol->hasString = hasString;
}

const CExpressionScope::Symbol* CExpressionScope::FindHere(std::string_view name) const {
  for (Symbol* s = buckets_[Bucket(name)]; s != nullptr; s = s->link) {
    if (s->name == name) return s;
  }
  return nullptr;
}

CExpressionScope::Symbol* CExpressionScope::Lookup(std::string_view name) const {
  for (const CExpressionScope* scope = this; scope != nullptr; scope = scope->parent_) {
    if (scope->order_.empty()) continue;  // nothing defined here yet
    if (const Symbol* s = scope->FindHere(name)) return const_cast<Symbol*>(s);
  }
  return nullptr;
}

const CExpressionScope::Symbol* CExpressionScope::Find(std::string_view name) const {
  return Lookup(name);
}

std::int32_t CExpressionScope::Value(std::string_view name) const {
  const Symbol* s = Lookup(name);
  return s != nullptr ? s->value : kUndef;
}

CZilFunctions* CExpressionScope::Functions() const {
  for (const CExpressionScope* scope = this; scope != nullptr; scope = scope->parent_) {
    if (scope->functions_ != nullptr) return scope->functions_;
  }
  return nullptr;
}

std::string CExpressionScope::UndefinedMessage() const {
  if (undefinedName_.empty()) return {};
  return "line " + std::to_string(undefinedLine_) + ": '" + undefinedName_ + "' is not defined";
}

std::int32_t CExpressionScope::Evaluate(CZilLexer& lexer) {
  const std::int32_t value = ParseSum(lexer, 0);
  if (IsLogicToken(lexer.Peek())) {
    lexer.Fail(allowLogic_ ? "a comparison or logic must stand in parentheses"
                           : "comparisons and logic are not allowed here");
  }
  return value;
}

std::int32_t CExpressionScope::ParseOr(CZilLexer& lexer, int depth) {
  std::int32_t left = ParseAnd(lexer, depth);
  while (lexer.Accept("||")) {
    const std::int32_t right = ParseAnd(lexer, depth);
    left = (left == kUndef || right == kUndef) ? 0 : (left != 0 || right != 0) ? 1 : 0;
  }
  return left;
}

std::int32_t CExpressionScope::ParseAnd(CZilLexer& lexer, int depth) {
  std::int32_t left = ParseRelation(lexer, depth);
  while (lexer.Accept("&&")) {
    const std::int32_t right = ParseRelation(lexer, depth);
    left = (left == kUndef || right == kUndef || left == 0 || right == 0) ? 0 : 1;
  }
  return left;
}

std::int32_t CExpressionScope::ParseRelation(CZilLexer& lexer, int depth) {
  const std::int32_t left = ParseEquality(lexer, depth);
  for (std::string_view op : {"<", "<=", ">=", ">"}) {
    if (!lexer.Accept(op)) continue;
    const std::int32_t right = ParseEquality(lexer, depth);
    for (std::string_view again : {"<", "<=", ">=", ">"}) {
      if (lexer.IsPunct(again)) lexer.Fail("only one comparison may stand here");
    }
    if (left == kUndef || right == kUndef) return 0;
    if (op == "<") return left < right ? 1 : 0;
    if (op == "<=") return left <= right ? 1 : 0;
    if (op == ">=") return left >= right ? 1 : 0;
    return left > right ? 1 : 0;
  }
  return left;
}

std::int32_t CExpressionScope::ParseEquality(CZilLexer& lexer, int depth) {
  const std::int32_t left = ParseSum(lexer, depth);
  for (std::string_view op : {"==", "!="}) {
    if (!lexer.Accept(op)) continue;
    const std::int32_t right = ParseSum(lexer, depth);
    if (lexer.IsPunct("==") || lexer.IsPunct("!=")) lexer.Fail("only one equality may stand here");
    if (left == kUndef || right == kUndef) return 0;
    return (op == "==") == (left == right) ? 1 : 0;
  }
  return left;
}

std::int32_t CExpressionScope::ParseSum(CZilLexer& lexer, int depth) {
  std::int32_t left = ParseProduct(lexer, depth);
  for (;;) {
    const bool plus = lexer.IsPunct("+");
    if (!plus && !lexer.IsPunct("-")) return left;
    lexer.Next();
    const std::int32_t right = ParseProduct(lexer, depth);
    if (left == kUndef || right == kUndef) {
      left = kUndef;
    } else {
      left = Wrap(plus ? U(left) + U(right) : U(left) - U(right));
    }
  }
}

std::int32_t CExpressionScope::ParseProduct(CZilLexer& lexer, int depth) {
  std::int32_t left = ParseUnary(lexer, depth);
  for (;;) {
    const bool times = lexer.IsPunct("*");
    // '%' is read as '/': the language has no remainder.
    if (!times && !lexer.IsPunct("/") && !lexer.IsPunct("%")) return left;
    lexer.Next();
    const int line = lexer.Peek().line;
    const std::int32_t right = ParseUnary(lexer, depth);
    if (left == kUndef || right == kUndef) {
      left = kUndef;
    } else if (times) {
      left = Wrap(U(left) * U(right));
    } else {
      if (right == 0) throw CZilSyntaxError(line, "division by zero");
      left = (right == -1) ? Wrap(0u - U(left)) : left / right;
    }
  }
}

std::int32_t CExpressionScope::ParseUnary(CZilLexer& lexer, int depth) {
  if (depth > kMaxDepth) lexer.Fail("the expression is nested too deeply");
  if (lexer.Accept("+")) return ParseUnary(lexer, depth + 1);
  if (lexer.Accept("-")) {
    const std::int32_t value = ParseUnary(lexer, depth + 1);
    return value == kUndef ? kUndef : Wrap(0u - U(value));
  }
  if (lexer.IsPunct("!")) {
    if (!allowLogic_) lexer.Fail("'!' is not allowed here");
    lexer.Next();
    const std::int32_t value = ParseUnary(lexer, depth + 1);
    return value == 0 ? 1 : 0;
  }
  return ParsePrimary(lexer, depth + 1);
}

std::int32_t CExpressionScope::ParsePrimary(CZilLexer& lexer, int depth) {
  const CZilToken token = lexer.Peek();
  if (token.kind == EZilToken::kNumber) {
    lexer.Next();
    std::uint64_t value = 0;
    for (const char c : token.text) {
      value = value * 10 + static_cast<std::uint64_t>(c - '0');
      if (value > 0x7FFFFFFF) {
        throw CZilSyntaxError(
            token.line, "the number " + std::string(token.text.substr(0, 20)) + " is too large");
      }
    }
    return static_cast<std::int32_t>(value);
  }
  if (token.kind == EZilToken::kName) {
    lexer.Next();
    if (lexer.IsPunct("(")) return ParseCall(lexer, token.text, depth);
    const Symbol* symbol = Lookup(token.text);
    if (symbol == nullptr || symbol->value == kUndef) {
      undefinedName_ = std::string(token.text);
      undefinedLine_ = token.line;
      return kUndef;
    }
    return symbol->value;
  }
  if (lexer.Accept("(")) {
    std::int32_t value = 0;
    if (allowLogic_) {
      value = ParseOr(lexer, depth);
    } else {
      value = ParseSum(lexer, depth);
      if (IsLogicToken(lexer.Peek())) lexer.Fail("comparisons and logic are not allowed here");
    }
    lexer.Expect(")", "to close the parenthesis");
    return value;
  }
  lexer.Fail("expected a number, a name or '(', found " + CZilLexer::Describe(token));
}

std::vector<std::int32_t> CExpressionScope::ParseArguments(CZilLexer& lexer, std::string_view name,
                                                           int depth) {
  std::vector<std::int32_t> arguments;
  lexer.Expect("(", "after a function's name");
  if (!lexer.IsPunct(")")) {
    do {
      arguments.push_back(ParseSum(lexer, depth));
    } while (lexer.Accept(","));
  }
  lexer.Expect(")", "after the arguments of " + std::string(name));
  return arguments;
}

std::int32_t CExpressionScope::ParseCall(CZilLexer& lexer, std::string_view name, int depth) {
  const int line = lexer.Peek().line;
  const std::string function(name);
  if (function == "min" || function == "max") {
    const std::vector<std::int32_t> args = ParseArguments(lexer, name, depth);
    if (args.size() < 2) throw CZilSyntaxError(line, function + " needs two arguments or more");
    return function == "min" ? *std::min_element(args.begin(), args.end())
                             : *std::max_element(args.begin(), args.end());
  }
  if (function == "dim") {
    const std::vector<std::int32_t> args = ParseArguments(lexer, name, depth);
    if (args.size() != 2) throw CZilSyntaxError(line, "dim needs two arguments");
    if (args[0] == kUndef || args[1] == kUndef) return kUndef;
    return args[0] > args[1] ? Wrap(U(args[0]) - U(args[1])) : 0;
  }
  if (function == "in") {
    if (!allowSets_) throw CZilSyntaxError(line, "the set function 'in' is not allowed here");
    const std::vector<std::int32_t> args = ParseArguments(lexer, name, depth);
    if (args.size() < 2) throw CZilSyntaxError(line, "in needs a value and one member or more");
    std::uint32_t set = 0;
    for (std::size_t i = 1; i < args.size(); ++i) {
      if (args[i] >= 0 && args[i] < 32) set |= 1u << args[i];
    }
    const std::int32_t v = args[0];
    if (v < 0 || v >= 32) return 0;  // the undefined value is negative
    return (set >> v) & 1u ? 1 : 0;
  }
  CZilFunctions* functions = Functions();
  if (functions == nullptr || !functions->Knows(name)) {
    throw CZilSyntaxError(line, "unknown function '" + function + "'");
  }
  CExpressionScope parameters(this, allowLogic_, allowSets_);
  lexer.Expect("(", "after a function's name");
  if (!lexer.IsPunct(")")) {
    do {
      const std::string_view parameter = lexer.ExpectName("for a parameter");
      lexer.Expect(":", "after the parameter's name");
      parameters.Define(parameter, ParseSum(lexer, depth));
    } while (lexer.Accept(","));
  }
  lexer.Expect(")", "after the parameters of " + function);
  return functions->Call(name, parameters);
}

}  // namespace Tarsa
