#include "params/PreferencesDirectory.h"

#include <string>

#include "framework/core/CException.h"
#include "framework/files/FilePaths.h"
#include "framework/strings/CString.h"

namespace Project {

namespace {

// The host's version suffix is appended after the keyed part is resolved,
// so a translation of the key keeps the version.
constexpr const char kVersion[] = "VX 2099";

}  // namespace

bool GetPreferencesDirectory(const Tarsa::CDirectory& base, Tarsa::CDirectory& out) {
  const Tarsa::CString vendor = Tarsa::ResolveText("$$$/private/Prefs/Directory/Orvane=Orvane");
  const Tarsa::CString host(
      Tarsa::ResolveText("$$$/private/Prefs/Directory/SubDir=Orvane Quillmark ").Str() + kVersion);
  const Tarsa::CString settings(
      Tarsa::ResolveText("$$$/private/Prefs/Directory/Quillmark=Orvane Quillmark ").Str() +
      kVersion + " Settings");
  Tarsa::CDirectory vendorDir;
  Tarsa::CDirectory hostDir;
  return Tarsa::GetChildDirectory(base, vendor, vendorDir, true) &&
         Tarsa::GetChildDirectory(vendorDir, host, hostDir, true) &&
         Tarsa::GetChildDirectory(hostDir, settings, out, true);
}

bool GetPreferencesDirectory(Tarsa::CDirectory& out) {
  std::string configPath;
  try {
    configPath = Tarsa::GetSpecialFolderPath(Tarsa::SpecialFolder::kUserConfig);
  } catch (const Tarsa::CException&) {
    return false;  // no home directory known
  }
  Tarsa::CDirectory base;
  return Tarsa::GetDirectoryFromPath(configPath, base, true) && GetPreferencesDirectory(base, out);
}

}  // namespace Project
