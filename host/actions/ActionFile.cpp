#include "host/actions/ActionFile.h"

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <limits>
#include <sstream>
#include <vector>

#include "host/actions/Base64.h"
#include "host/io/HostError.h"
#include "host/io/TemporaryFile.h"

namespace Host {

namespace {

using Type = Descriptor::Type;

// Larger files are not actions; refusing them early keeps a wrong argument
// from being read into memory.
constexpr size_t kLargestFile = 64u << 20;

bool Printable(char c) { return c >= '!' && c <= '~'; }

std::string CodeText(uint32_t code, bool isKey) {
  const char chars[4] = {static_cast<char>(code >> 24), static_cast<char>(code >> 16),
                         static_cast<char>(code >> 8), static_cast<char>(code)};
  bool plain = !(isKey && chars[0] == '#');
  for (char c : chars) plain = plain && Printable(c);
  if (plain) return std::string(chars, 4);
  char hex[11];
  std::snprintf(hex, sizeof hex, "0x%08x", code);
  return hex;
}

std::string FloatText(double value) {
  char text[64];
  const auto result = std::to_chars(text, text + sizeof text, value);
  return std::string(text, result.ptr);
}

std::vector<std::string_view> Words(std::string_view line) {
  std::vector<std::string_view> words;
  size_t i = 0;
  while (i < line.size()) {
    while (i < line.size() && (line[i] == ' ' || line[i] == '\t')) ++i;
    const size_t start = i;
    while (i < line.size() && line[i] != ' ' && line[i] != '\t') ++i;
    if (i > start) words.push_back(line.substr(start, i - start));
  }
  return words;
}

// One line being read; every fault is reported with its number.
class Line {
 public:
  Line(size_t number, std::vector<std::string_view> words)
      : number_(number), words_(std::move(words)) {}

  [[noreturn]] void Fail(const std::string& problem) const {
    throw HostError("line " + std::to_string(number_) + ": " + problem);
  }

  void Expect(size_t count, const char* form) const {
    if (words_.size() != count) Fail(std::string("expected '") + form + "'");
  }

  std::string_view operator[](size_t i) const { return words_[i]; }
  size_t Size() const { return words_.size(); }

  uint32_t Code(size_t i, const char* what) const {
    const std::string_view word = words_[i];
    if (word.size() == 4 && std::ranges::all_of(word, Printable)) {
      uint32_t code = 0;
      for (char c : word) code = code << 8 | static_cast<uint8_t>(c);
      return code;
    }
    if (word.size() == 10 && word.starts_with("0x")) {
      uint32_t code = 0;
      const auto result = std::from_chars(word.data() + 2, word.data() + 10, code, 16);
      if (result.ec == std::errc() && result.ptr == word.data() + 10) return code;
    }
    Fail(std::string(what) + " '" + std::string(word) +
         "' is not a four-character code (four characters, or 0x and eight hex digits)");
  }

  int64_t Integer(size_t i, int64_t low, int64_t high, const char* what) const {
    const std::string_view word = words_[i];
    int64_t value = 0;
    const auto result = std::from_chars(word.data(), word.data() + word.size(), value);
    if (result.ec != std::errc() || result.ptr != word.data() + word.size() || value < low ||
        value > high) {
      Fail(std::string(what) + " '" + std::string(word) + "' is not a whole number from " +
           std::to_string(low) + " to " + std::to_string(high));
    }
    return value;
  }

  double Float(size_t i) const {
    const std::string_view word = words_[i];
    double value = 0;
    const auto result = std::from_chars(word.data(), word.data() + word.size(), value);
    if (result.ec != std::errc() || result.ptr != word.data() + word.size()) {
      Fail("'" + std::string(word) + "' is not a number");
    }
    return value;
  }

 private:
  size_t number_;
  std::vector<std::string_view> words_;
};

}  // namespace

std::string ActionFile::Format(const Descriptor& descriptor) {
  std::string text = std::string(kHeader) + "\n";
  // Words are appended one at a time: g++ 12 at -O3 warns of overlapping
  // copies (falsely) when a space is put in front of a temporary string.
  const auto word = [&text](const std::string& value) { text.append(1, ' ').append(value); };
  for (const Descriptor::Item& item : descriptor.Items()) {
    text += CodeText(item.key, true);
    word(Descriptor::TypeName(item.type));
    switch (item.type) {
      case Type::kInteger:
        word(std::to_string(item.integer));
        break;
      case Type::kFloat:
        word(FloatText(item.number));
        break;
      case Type::kEnumerated:
        word(CodeText(item.enumType, false));
        word(CodeText(item.enumValue, false));
        break;
      case Type::kData:
        word(std::to_string(item.data.size()));
        if (!item.data.empty()) word(Base64::Encode(item.data));
        break;
    }
    text += "\n";
  }
  return text;
}

Descriptor ActionFile::Parse(std::string_view text, const ActionTerms* terms) {
  Descriptor descriptor;
  size_t number = 0;
  bool header = false;
  while (!text.empty()) {
    const size_t end = text.find('\n');
    std::string_view raw = text.substr(0, end);
    text = end == std::string_view::npos ? std::string_view() : text.substr(end + 1);
    ++number;
    if (raw.ends_with('\r')) raw.remove_suffix(1);
    const Line line(number, Words(raw));
    if (!header) {
      if (raw != kHeader) {
        line.Fail(std::string("expected the header '") + kHeader + "'; this is not an action file");
      }
      header = true;
      continue;
    }
    if (line.Size() == 0 || line[0].starts_with('#')) continue;
    if (line.Size() < 2) line.Fail("expected a key, a type and a value");
    const uint32_t key = line.Code(0, "the key");
    if (descriptor.Find(key) != nullptr)
      line.Fail("the key '" + std::string(line[0]) + "' occurs twice");
    const std::string_view type = line[1];
    if (type == "integer") {
      line.Expect(3, "<key> integer <value>");
      descriptor.PutInteger(key, static_cast<int32_t>(line.Integer(
                                     2, std::numeric_limits<int32_t>::min(),
                                     std::numeric_limits<int32_t>::max(), "the value")));
    } else if (type == "float") {
      line.Expect(3, "<key> float <value>");
      descriptor.PutFloat(key, line.Float(2));
    } else if (type == "enumerated") {
      line.Expect(4, "<key> enumerated <type> <value>");
      descriptor.PutEnumerated(key, line.Code(2, "the type"), line.Code(3, "the value"));
    } else if (type == "data") {
      if (line.Size() < 3) line.Fail("expected '<key> data <length> <base64>'");
      const auto length = static_cast<size_t>(
          line.Integer(2, 0, std::numeric_limits<int32_t>::max(), "the length"));
      line.Expect(length == 0 ? 3 : 4,
                  length == 0 ? "<key> data 0" : "<key> data <length> <base64>");
      const auto bytes = length == 0 ? std::vector<uint8_t>() : Base64::Decode(line[3]);
      if (!bytes) line.Fail("the data are not valid Base64");
      if (bytes->size() != length) {
        line.Fail("the data hold " + std::to_string(bytes->size()) + " bytes, not " +
                  std::to_string(length));
      }
      descriptor.PutData(key, *bytes);
    } else {
      line.Fail("unknown type '" + std::string(type) +
                "' (expected integer, float, enumerated or data)");
    }
    if (terms != nullptr) {
      const std::string refusal = terms->Refusal(*descriptor.Find(key));
      if (!refusal.empty()) line.Fail(refusal);
    }
  }
  if (!header)
    throw HostError("the file is empty; an action file starts with '" + std::string(kHeader) + "'");
  return descriptor;
}

Descriptor ActionFile::Read(const std::string& path, const ActionTerms* terms) {
  std::error_code ignored;
  if (std::filesystem::is_directory(path, ignored)) {
    throw HostError(path, "is a folder, not an action file");
  }
  std::ifstream in(path, std::ios::binary);
  if (!in)
    throw HostError(path, std::string("cannot open the action file: ") + std::strerror(errno));
  std::ostringstream text;
  text << in.rdbuf();
  if (in.bad()) throw HostError(path, "cannot read the action file");
  const std::string contents = text.str();
  if (contents.size() > kLargestFile)
    throw HostError(path, "the file is too large to be an action");
  try {
    return Parse(contents, terms);
  } catch (const HostError& error) {
    throw HostError(path, error.Problem());
  }
}

void ActionFile::Write(const Descriptor& descriptor, const std::string& path) {
  TemporaryFile file(path);
  {
    std::ofstream out(file.Path(), std::ios::binary | std::ios::trunc);
    out << Format(descriptor);
    out.flush();
    if (!out) throw HostError(path, "cannot write the action file");
  }
  file.Commit();
}

}  // namespace Host
