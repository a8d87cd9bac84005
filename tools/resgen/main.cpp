// resgen: builds the module's resource table from the manifest in
// resources/. Usage: resgen <manifest> <output blob> [<depfile>]
// The blob is written under a temporary name and renamed when complete; the
// depfile lists the manifest and every file it pulled in, for the build.

#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "framework/resource/CResourceWriter.h"
#include "tools/resgen/PropertyListResource.h"
#include "tools/resgen/ResourceManifest.h"
#include "tools/resgen/TerminologyResource.h"
#include "tools/resgen/icons/IconResources.h"

namespace {

namespace fs = std::filesystem;
using Bytes = std::vector<std::uint8_t>;

// The keyed texts of the framework's errors, shown by their default wording.
std::string Wording(const std::string& text) {
  if (!text.starts_with("$$$")) return text;
  const auto equals = text.find('=');
  return equals == std::string::npos ? text : text.substr(equals + 1);
}

Bytes ReadFile(const fs::path& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) throw Tarsa::CError(path.string() + ": cannot be opened");
  Bytes bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  if (in.bad()) throw Tarsa::CError(path.string() + ": cannot be read");
  return bytes;
}

void WriteFile(const fs::path& path, const std::string& text) {
  const fs::path temporary = path.string() + ".tmp";
  {
    std::ofstream out(temporary, std::ios::binary | std::ios::trunc);
    out.write(text.data(), static_cast<std::streamsize>(text.size()));
    if (!out) throw Tarsa::CError(temporary.string() + ": cannot be written");
  }
  fs::rename(temporary, path);
}

// Make's quoting of a path in a depfile.
std::string DepfilePath(const fs::path& path) {
  std::string quoted;
  for (const char c : path.string()) {
    if (c == ' ' || c == '#') quoted += '\\';
    if (c == '$') quoted += '$';
    quoted += c;
  }
  return quoted;
}

int Run(const fs::path& manifest, const fs::path& output, const fs::path& depfile) {
  const std::map<std::string, std::function<Bytes()>> builders = {
      {"@property-list", Project::BuildPropertyList},
      {"@terminology", Project::BuildTerminology},
      // The skin images and cursors, drawn here: the index and its blocks.
      {"@icon-index", [] { return Project::BuildIconResources().index; }},
      {"@icon-data-low", [] { return Project::BuildIconResources().lowResolution; }},
      {"@icon-data-high", [] { return Project::BuildIconResources().highResolution; }},
      // A string file holding only its UTF-16 little-endian byte-order mark.
      {"@utf16-bom",
       [] {
         return Bytes{0xFF, 0xFE};
       }},
  };

  Tarsa::CResourceWriter writer;
  std::string depends = DepfilePath(fs::absolute(output)) + ":";
  depends.append(1, ' ').append(DepfilePath(fs::absolute(manifest)));
  for (const auto& entry : Project::ReadManifest(manifest)) {
    const std::string where = manifest.string() + ":" + std::to_string(entry.line) + ": ";
    Bytes data;
    if (entry.source.starts_with('@')) {
      const auto builder = builders.find(entry.source);
      if (builder == builders.end()) throw Tarsa::CError(where + "no builder " + entry.source);
      data = builder->second();
    } else {
      const fs::path file = fs::absolute(manifest.parent_path() / entry.source);
      data = ReadFile(file);
      depends.append(1, ' ').append(DepfilePath(file));
    }
    try {
      if (entry.name.empty()) {
        writer.Add(entry.type, entry.number, data);
      } else {
        writer.Add(entry.type, entry.name, data);
      }
    } catch (const Tarsa::CException& error) {
      throw Tarsa::CError(where + Wording(error.ErrorText()));
    }
  }
  const Bytes blob = writer.Write();
  WriteFile(output, std::string(blob.begin(), blob.end()));
  if (!depfile.empty()) WriteFile(depfile, depends + "\n");
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3 && argc != 4) {
    std::fputs("usage: resgen <manifest> <output blob> [<depfile>]\n", stderr);
    return 2;
  }
  try {
    return Run(argv[1], argv[2], argc == 4 ? fs::path(argv[3]) : fs::path());
  } catch (const Tarsa::CException& error) {
    std::fprintf(stderr, "resgen: %s\n", Wording(error.ErrorText()).c_str());
  } catch (const std::exception& error) {
    std::fprintf(stderr, "resgen: %s\n", error.what());
  }
  return 1;
}
