#include "params/BehaviorFile.h"

#include <charconv>
#include <string>
#include <string_view>
#include <system_error>

#include "framework/core/CException.h"
#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"

namespace Project {

namespace {

// A line is dropped once it holds this many characters.
constexpr std::size_t kLineLimit = 255;

bool IsSpace(char c) {
  return c == ' ' || c == '\t' || c == '\n' || c == '\v' || c == '\f' || c == '\r';
}

std::string_view SkipSpace(std::string_view text) {
  std::size_t i = 0;
  while (i < text.size() && IsSpace(text[i])) ++i;
  return text.substr(i);
}

// The scanners read like the C library's: leading blanks skipped, an
// optional sign, and whatever trails the number ignored.
bool ScanInt(std::string_view text, std::int32_t& value) {
  text = SkipSpace(text);
  if (!text.empty() && text.front() == '+') text.remove_prefix(1);
  const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
  return result.ec == std::errc();
}

bool ScanFloat(std::string_view text, float& value) {
  text = SkipSpace(text);
  if (!text.empty() && text.front() == '+') text.remove_prefix(1);
  const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
  return result.ec == std::errc();
}

// The first blank-delimited word.
std::string_view ScanWord(std::string_view text) {
  text = SkipSpace(text);
  std::size_t n = 0;
  while (n < text.size() && !IsSpace(text[n])) ++n;
  return text.substr(0, n);
}

// A "true"/"false" switch. The whole line's length is bounded, which caps
// the value at ten characters.
void ApplySwitch(std::string_view line, std::size_t keyLength, std::uint8_t& field) {
  if (line.size() < keyLength || line.size() > keyLength + 10) return;
  const std::string_view word = ScanWord(line.substr(keyLength));
  if (word == "true") {
    field = 1;
  } else if (word == "false") {
    field = 0;
  }
}

void ApplyLine(PSettings& settings, std::string_view line) {
  const auto value = [&line](std::string_view key) { return line.substr(key.size()); };
  constexpr std::string_view kIterations = "iterative.num=";
  constexpr std::string_view kCacheOrder = "iterative.cache_order=";
  constexpr std::string_view kDebugSolve = "iterative.debug_solve=";
  constexpr std::string_view kResolution = "mesh.resolution=";
  constexpr std::string_view kRegularWeight = "mesh.regular_weight=";
  constexpr std::string_view kUseTriangle = "mesh.use_triangle=";
  constexpr std::string_view kShowBehavioral = "ui.show_behavioral=";
  constexpr std::string_view kLineWeight = "mesh.line_weight=";
  constexpr std::string_view kConverged = "iterative.converged=";

  if (line.starts_with(kIterations)) {
    std::int32_t n = 0;
    if (ScanInt(value(kIterations), n) && n >= 1 && n <= 19) {
      settings.iterationNumber = static_cast<std::uint16_t>(n);
    }
  } else if (line.starts_with(kCacheOrder)) {
    ApplySwitch(line, kCacheOrder.size(), settings.cacheDssPermutation);
  } else if (line.starts_with(kDebugSolve)) {
    ApplySwitch(line, kDebugSolve.size(), settings.useDebugSolve);
  } else if (line.starts_with(kResolution)) {
    std::int32_t n = 0;
    if (ScanInt(value(kResolution), n) && n >= 1 && n <= 19) settings.meshResolution = n;
  } else if (line.starts_with(kRegularWeight)) {
    float w = 0;
    if (ScanFloat(value(kRegularWeight), w) && w > 0.0f && w < 0.1f) settings.regularWeight = w;
  } else if (line.starts_with(kUseTriangle)) {
    ApplySwitch(line, kUseTriangle.size(), settings.meshUseTriangle);
  } else if (line.starts_with(kShowBehavioral)) {
    ApplySwitch(line, kShowBehavioral.size(), settings.showBehavioral);
  } else if (line.starts_with(kLineWeight)) {
    float w = 0;
    if (ScanFloat(value(kLineWeight), w) && w > 0.0f && w <= 1000.0f) settings.lineWeight = w;
  } else if (line.starts_with(kConverged)) {
    float m = 0;
    if (ScanFloat(value(kConverged), m) && m > 0.0f && m <= 1.0f) settings.convergedMeasure = m;
  }
}

// Collects the bytes of one line at a time and hands each finished line on.
class LineSplitter {
 public:
  explicit LineSplitter(PSettings& settings) : settings_(settings) {}

  void Feed(const std::uint8_t* bytes, std::size_t size) {
    for (std::size_t i = 0; i < size; ++i) {
      const char c = static_cast<char>(bytes[i]);
      if (c == '\r' || c == '\n') {
        Finish();
        continue;
      }
      line_.push_back(c);
      if (line_.size() >= kLineLimit) line_.clear();
    }
  }

  // The last line needs no line end.
  void Finish() {
    // A zero byte ends the text of a line, as it would in a C buffer.
    std::string_view text(line_);
    text = text.substr(0, text.find('\0'));
    if (!text.empty()) ApplyLine(settings_, text);
    line_.clear();
  }

 private:
  PSettings& settings_;
  std::string line_;
};

}  // namespace

void ApplyBehaviorText(PSettings& settings, const std::uint8_t* bytes, std::size_t size) {
  LineSplitter splitter(settings);
  if (bytes != nullptr) splitter.Feed(bytes, size);
  splitter.Finish();
}

void LoadBehaviorFile(PSettings& settings, const Tarsa::CDirectory& directory) {
  LineSplitter splitter(settings);
  try {
    Tarsa::CFileContainer file(Tarsa::CFile(directory, kBehaviorFileName, false));
    std::uint8_t buffer[4096];
    while (file.Position() < file.Size()) {
      const std::uint64_t left = file.Size() - file.Position();
      const std::size_t count =
          left < sizeof buffer ? static_cast<std::size_t>(left) : sizeof buffer;
      file.Read(buffer, count);
      splitter.Feed(buffer, count);
    }
    splitter.Finish();
  } catch (const Tarsa::CException&) {
    // Missing, or cut short under us: the lines read whole so far stand.
  }
}

}  // namespace Project
