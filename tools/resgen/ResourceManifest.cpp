#include "tools/resgen/ResourceManifest.h"

#include <charconv>
#include <fstream>
#include <sstream>

#include "framework/core/CException.h"

namespace Project {
namespace {

bool IsNumber(const std::string& id) {
  const std::size_t digitsAt = id.starts_with('-') ? 1 : 0;
  return id.size() > digitsAt && id.find_first_not_of("0123456789", digitsAt) == std::string::npos;
}

}  // namespace

std::vector<ManifestEntry> ReadManifest(const std::filesystem::path& path) {
  std::ifstream in(path);
  if (!in) throw Tarsa::CError(path.string() + ": cannot be opened");
  std::vector<ManifestEntry> entries;
  std::string text;
  for (int line = 1; std::getline(in, text); ++line) {
    const auto fail = [&](const std::string& why) {
      throw Tarsa::CError(path.string() + ":" + std::to_string(line) + ": " + why);
    };
    std::istringstream fields(text);
    std::string type, id, source, extra;
    if (!(fields >> type) || type.starts_with('#')) continue;
    if (!(fields >> id >> source)) fail("expected \"<type> <number or name> <source>\"");
    if (fields >> extra) fail("unexpected \"" + extra + "\" after the source");
    if (type.size() != 4) fail("the type \"" + type + "\" is not four characters");

    ManifestEntry entry;
    for (const char c : type) entry.type = (entry.type << 8) | static_cast<unsigned char>(c);
    if (IsNumber(id)) {
      const auto [end, error] = std::from_chars(id.data(), id.data() + id.size(), entry.number);
      if (error != std::errc() || end != id.data() + id.size()) {
        fail("the number " + id + " does not fit 32 bits");
      }
    } else {
      entry.name = id;
    }
    entry.source = source;
    entry.line = line;
    entries.push_back(std::move(entry));
  }
  return entries;
}

}  // namespace Project
