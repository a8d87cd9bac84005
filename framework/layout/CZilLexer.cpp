#include "framework/layout/CZilLexer.h"

#include <cctype>

#include "framework/layout/CZilSyntaxError.h"

namespace Tarsa {
namespace {

bool IsNameStart(char c) { return std::isalpha(static_cast<unsigned char>(c)) != 0 || c == '_'; }
bool IsNameChar(char c) { return IsNameStart(c) || std::isdigit(static_cast<unsigned char>(c)); }

constexpr std::string_view kPairs[] = {"||", "&&", "<=", ">=", "==", "!="};
constexpr std::string_view kSingles = "(),;{}:=+-*/%<>!&";

}  // namespace

CZilLexer::CZilLexer(std::string_view text) : text_(text) {}

CZilToken CZilLexer::LexAt(std::size_t at, int line) const {
  while (at < text_.size() && std::isspace(static_cast<unsigned char>(text_[at])) != 0) {
    if (text_[at] == '\n') ++line;
    ++at;
  }
  CZilToken token;
  token.start = at;
  token.line = line;
  if (at >= text_.size()) {
    token.end = at;
    return token;
  }
  const char c = text_[at];
  std::size_t end = at + 1;
  if (IsNameStart(c)) {
    while (end < text_.size() && IsNameChar(text_[end])) ++end;
    token.kind = EZilToken::kName;
    token.text = text_.substr(at, end - at);
  } else if (std::isdigit(static_cast<unsigned char>(c)) != 0) {
    while (end < text_.size() && std::isdigit(static_cast<unsigned char>(text_[end])) != 0) ++end;
    token.kind = EZilToken::kNumber;
    token.text = text_.substr(at, end - at);
  } else if (c == '\'') {
    const std::size_t close = text_.find('\'', at + 1);
    if (close == std::string_view::npos) {
      throw CZilSyntaxError(line, "a string that opens here is never closed with a single quote");
    }
    end = close + 1;
    token.kind = EZilToken::kString;
    token.text = text_.substr(at + 1, close - at - 1);
  } else {
    token.kind = EZilToken::kPunct;
    for (std::string_view pair : kPairs) {
      if (text_.substr(at, 2) == pair) end = at + 2;
    }
    if (end == at + 1 && kSingles.find(c) == std::string_view::npos) {
      const bool printable = std::isprint(static_cast<unsigned char>(c)) != 0;
      throw CZilSyntaxError(
          line, printable ? std::string("unexpected character '") + c + "'"
                          : "unexpected byte " + std::to_string(static_cast<unsigned char>(c)));
    }
    token.text = text_.substr(at, end - at);
  }
  token.end = end;
  return token;
}

CZilToken CZilLexer::Peek(int ahead) const {
  std::size_t at = pos_;
  int line = line_;
  CZilToken token = LexAt(at, line);
  for (int i = 0; i < ahead && token.kind != EZilToken::kEnd; ++i) {
    for (std::size_t k = at; k < token.end; ++k) {
      if (text_[k] == '\n') ++line;
    }
    at = token.end;
    token = LexAt(at, line);
  }
  return token;
}

CZilToken CZilLexer::Next() {
  const CZilToken token = Peek();
  for (std::size_t k = pos_; k < token.end; ++k) {
    if (text_[k] == '\n') ++line_;
  }
  pos_ = token.end;
  if (pos_ > furthest_) furthest_ = pos_;
  if (listener_ && token.kind != EZilToken::kEnd) listener_(token.kind, token.start, token.end);
  return token;
}

bool CZilLexer::IsPunct(std::string_view punct, int ahead) const {
  const CZilToken token = Peek(ahead);
  return token.kind == EZilToken::kPunct && token.text == punct;
}

bool CZilLexer::Accept(std::string_view punct) {
  if (!IsPunct(punct)) return false;
  Next();
  return true;
}

void CZilLexer::Expect(std::string_view punct, std::string_view context) {
  if (Accept(punct)) return;
  Fail("expected '" + std::string(punct) + "' " + std::string(context) + ", found " +
       Describe(Peek()));
}

std::string_view CZilLexer::ExpectName(std::string_view context) {
  const CZilToken token = Peek();
  if (token.kind != EZilToken::kName) {
    Fail("expected a name " + std::string(context) + ", found " + Describe(token));
  }
  return Next().text;
}

void CZilLexer::Fail(const std::string& what) const { throw CZilSyntaxError(Peek().line, what); }

std::string CZilLexer::Describe(const CZilToken& token) {
  switch (token.kind) {
    case EZilToken::kEnd:
      return "the end of the file";
    case EZilToken::kString:
      return "a string";
    case EZilToken::kNumber:
      return std::string("the number ").append(token.text.substr(0, 20));
    default: {
      // Appended in place: g++ 12 at -O3 warns of overlapping copies
      // (falsely) when a quote is put in front of a temporary string.
      std::string quoted(1, '\'');
      quoted.append(token.text.substr(0, 40)).append(1, '\'');
      return quoted;
    }
  }
}

}  // namespace Tarsa
