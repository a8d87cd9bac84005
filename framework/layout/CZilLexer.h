#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

namespace Tarsa {

// The tokens of a layout file: names, decimal numbers, strings in single
// quotes (no escapes), and punctuation of one or two characters.
enum class EZilToken { kEnd, kName, kNumber, kString, kPunct };

struct CZilToken {
  EZilToken kind = EZilToken::kEnd;
  std::string_view text;  // a string's text is without its quotes
  std::size_t start = 0;  // offsets into the file, the quotes included
  std::size_t end = 0;
  int line = 1;
};

// Cuts a layout file into tokens on demand, with any amount of look-ahead
// (the grammar needs two tokens to tell a name alone from an expression).
// Keeps the furthest offset it reached, for the message of a syntax error,
// and tells an optional listener of each token taken (an editor's syntax
// colouring). Borrows the text, which must outlive it.
class CZilLexer {
 public:
  using Listener = std::function<void(EZilToken kind, std::size_t start, std::size_t end)>;

  explicit CZilLexer(std::string_view text);

  // The token `ahead` places on (0: the next one), not taken.
  CZilToken Peek(int ahead = 0) const;
  CZilToken Next();
  bool IsPunct(std::string_view punct, int ahead = 0) const;
  // Takes the punctuation when it is next.
  bool Accept(std::string_view punct);
  // Takes the punctuation, or fails with "expected <punct> <context>".
  void Expect(std::string_view punct, std::string_view context);
  std::string_view ExpectName(std::string_view context);

  // Throws CZilSyntaxError at the line of the next token.
  [[noreturn]] void Fail(const std::string& what) const;
  static std::string Describe(const CZilToken& token);

  bool AtEnd() const { return Peek().kind == EZilToken::kEnd; }
  std::string_view Text() const { return text_; }
  std::size_t Furthest() const { return furthest_; }
  void SetListener(Listener listener) { listener_ = std::move(listener); }

 private:
  // Lexes the token at `from`; `line` is the line `from` stands on.
  CZilToken LexAt(std::size_t from, int line) const;

  std::string_view text_;
  std::size_t pos_ = 0;
  int line_ = 1;
  std::size_t furthest_ = 0;
  Listener listener_;
};

}  // namespace Tarsa
