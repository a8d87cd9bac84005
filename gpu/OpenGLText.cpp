#include "gpu/OpenGLText.h"

#include <climits>
#include <cstddef>

namespace Project {

namespace {

// atoi's reading without its undefined overflow: blanks, a sign, digits;
// values beyond int are clamped.
int ReadInteger(std::string_view text) {
  std::size_t i = 0;
  while (i < text.size() && (text[i] == ' ' || (text[i] >= '\t' && text[i] <= '\r'))) ++i;
  bool negative = false;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
  long long value = 0;
  for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i) {
    value = value * 10 + (text[i] - '0');
    if (value > static_cast<long long>(INT_MAX) + 1) break;
  }
  if (negative) value = -value;
  if (value > INT_MAX) return INT_MAX;
  if (value < INT_MIN) return INT_MIN;
  return static_cast<int>(value);
}

constexpr std::size_t kHostPathCapacity = 255;
constexpr std::size_t kHostNameCut = 14;
constexpr std::string_view kShaderTail = "/Required/ArchwayFragmentShader.fsh";

}  // namespace

void ParseOpenGLVersion(std::string_view text, int& major, int& minor) {
  major = 0;
  minor = 0;
  int found = 0;
  std::size_t start = 0;
  for (std::size_t i = 0; i <= text.size() && found < 2; ++i) {
    if (i < text.size() && text[i] != '.') continue;
    const int value = ReadInteger(text.substr(start, i - start));
    (found == 0 ? major : minor) = value;
    ++found;
    start = i + 1;
  }
}

std::optional<std::string> ShaderPathFromExecutable(std::string_view executablePath) {
  // The path is taken as into a buffer of 255 characters that must keep room
  // for 17 more; a longer path finds no shader.
  if (executablePath.size() + 17 > kHostPathCapacity) return std::nullopt;
  if (executablePath.size() < kHostNameCut) return std::nullopt;
  std::string path(executablePath.substr(0, executablePath.size() - kHostNameCut));
  path += kShaderTail;
  return path;
}

}  // namespace Project
