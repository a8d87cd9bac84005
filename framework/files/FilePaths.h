#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "framework/strings/CString.h"

// Free operations on paths. Paths are UTF-8 with '/' separators, and a
// directory's path ends in '/'.
namespace Tarsa {

class CDirectory;
class CFile;

// A path cut into its parts; the parts laid end to end give the path back.
// `leaf` is `name` and `extension` joined by their dot, when there is one.
struct PathParts {
  std::string root;       // "/", "C:", "C:/" or "//server/share/"
  std::string directory;  // after the root, up to and including the last '/'
  std::string leaf;       // the rest
  std::string name;       // the leaf up to its last '.'
  std::string extension;  // what follows that '.', without it
};

// One scan. Roots: "C:" (a ':' second), "C:/" (then a '/'), "//server/share/"
// (a network root ends at its fourth '/'), and "/" for a path beginning with
// a single '/'. A leaf that begins with its only dot has no extension.
PathParts SplitPath(std::string_view path);

// Directories, each with one trailing '/'.
std::string GetCurrentDirectoryPath();
// $TMPDIR, else "/tmp".
std::string GetTemporaryDirectoryPath();

enum class SpecialFolder {
  kHome,
  kUserConfig,  // $XDG_CONFIG_HOME, else ~/.config
  kUserData,    // $XDG_DATA_HOME, else ~/.local/share
};
// The folder's path, whether or not it exists yet; CSystemError 3 when no
// home directory is known.
std::string GetSpecialFolderPath(SpecialFolder folder);

// The entry `name` in directory, made when missing and create is set. False
// when it is missing (and not made) or of the other kind; never throws.
bool GetChildDirectory(const CDirectory& directory, const CString& name, CDirectory& out,
                       bool create);
bool GetChildFile(const CDirectory& directory, const CString& name, CFile& out, bool create);

// The entry at path. When it is missing and create is set, the missing
// directories above it are made first, from the top down; an empty parent is
// the working directory. False when it cannot be had; never throws.
bool GetDirectoryFromPath(std::string_view path, CDirectory& out, bool create);
bool GetFileFromPath(std::string_view path, CFile& out, bool create);

}  // namespace Tarsa
