#include "host/plugin/EnableExpression.h"

#include <cctype>

#include "host/io/HostError.h"

namespace Host {

namespace {

constexpr const char* kSubject = "QMARK_ImageMode";

struct Named {
  const char* name;
  ImageMode mode;
};

constexpr Named kNames[] = {
    {"GrayScaleMode", ImageMode::kGray}, {"RGBMode", ImageMode::kRgb},
    {"CMYKMode", ImageMode::kCmyk},      {"LabMode", ImageMode::kLab},
    {"Gray16Mode", ImageMode::kGray16},  {"RGB48Mode", ImageMode::kRgb48},
    {"Lab48Mode", ImageMode::kLab48},    {"CMYK64Mode", ImageMode::kCmyk64},
};

// Splits the text into words (letters, digits, '_') and single punctuation.
class Scanner {
 public:
  explicit Scanner(const std::string& text) : text_(text) {}

  // The next token; empty at the end.
  std::string Next() {
    while (position_ < text_.size() && std::isspace(static_cast<unsigned char>(text_[position_]))) {
      ++position_;
    }
    start_ = position_;
    if (position_ == text_.size()) return {};
    auto word = [](char c) { return std::isalnum(static_cast<unsigned char>(c)) || c == '_'; };
    if (!word(text_[position_])) return std::string(1, text_[position_++]);
    while (position_ < text_.size() && word(text_[position_])) ++position_;
    return text_.substr(start_, position_ - start_);
  }

  [[noreturn]] void Fail(const std::string& expected) const {
    std::string found = "the end";
    if (start_ < text_.size()) {
      found.assign(1, '\'').append(text_, start_, position_ - start_).append(1, '\'');
    }
    throw HostError("the enable expression \"" + text_ + "\" has " + found + " at character " +
                    std::to_string(start_ + 1) + " where " + expected + " should be");
  }

 private:
  const std::string& text_;
  size_t position_ = 0;
  size_t start_ = 0;
};

}  // namespace

EnableExpression EnableExpression::Parse(const std::string& text) {
  Scanner in(text);
  if (in.Next() != "in") in.Fail("'in'");
  if (in.Next() != "(") in.Fail("'('");
  if (in.Next() != kSubject) in.Fail(std::string("'") + kSubject + "'");
  EnableExpression expression;
  for (;;) {
    const std::string separator = in.Next();
    if (separator == ")") break;
    if (separator != ",") in.Fail("',' or ')'");
    const std::string name = in.Next();
    const bool isName = name.size() > 4 && name.ends_with("Mode") &&
                        std::isalpha(static_cast<unsigned char>(name[0]));
    if (!isName) in.Fail("a mode name");
    const int mode = ModeNamed(name);
    if (mode != 0) expression.modes_.set(static_cast<size_t>(mode));
  }
  if (!in.Next().empty()) in.Fail("the end");
  return expression;
}

bool EnableExpression::Allows(ImageMode mode) const {
  const int number = static_cast<int>(mode);
  return number >= 0 && number < 32 && modes_.test(static_cast<size_t>(number));
}

std::vector<ImageMode> EnableExpression::AllowedModes() const {
  std::vector<ImageMode> modes;
  for (int number = 0; number < 32; ++number) {
    if (modes_.test(static_cast<size_t>(number))) modes.push_back(static_cast<ImageMode>(number));
  }
  return modes;
}

int EnableExpression::ModeNamed(const std::string& name) {
  for (const Named& named : kNames) {
    if (name == named.name) return static_cast<int>(named.mode);
  }
  return 0;
}

}  // namespace Host
