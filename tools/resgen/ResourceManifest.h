#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace Project {

// One line of the resource manifest: "<type> <number or name> <source>".
// The type is four characters; an id of digits (with an optional minus) is a
// number, anything else a name; the source is "@" and the name of bytes the
// generator builds itself, or a file path relative to the manifest's folder.
// Blank lines and lines starting with "#" are skipped.
struct ManifestEntry {
  std::uint32_t type = 0;
  std::int32_t number = 0;
  std::string name;  // empty for an entry that goes by number
  std::string source;
  int line = 0;
};

// The manifest's entries in order; Tarsa::CError names the line at fault.
std::vector<ManifestEntry> ReadManifest(const std::filesystem::path& path);

}  // namespace Project
