#include "framework/files/FilePaths.h"

#include <cstdlib>

#include "framework/core/CException.h"
#include "framework/files/CDirectory.h"
#include "framework/files/CFile.h"
#include "framework/native/NativeFileSystem.h"

namespace Tarsa {

namespace {

std::string WithSlash(std::string path) {
  if (path.empty() || path.back() != '/') path += '/';
  return path;
}

// An XDG variable counts only when it holds an absolute path.
std::string XdgFolder(const char* variable, const char* homeRelative) {
  if (const char* value = std::getenv(variable); value != nullptr && value[0] == '/') {
    return WithSlash(value);
  }
  const std::string home = Native::GetHomeDirectory();
  if (home.empty()) throw CSystemError(CSystemError::kNoSuchFolder);
  return WithSlash(home) + homeRelative;
}

std::string ParentOf(std::string_view path) {
  std::string parent;
  CVolEntry(std::string(path)).GetParentPath(parent);
  return parent;
}

}  // namespace

PathParts SplitPath(std::string_view path) {
  std::size_t rootEnd = 0;
  std::size_t directoryEnd = 0;
  std::size_t separators = 0;
  std::size_t lastDot = std::string_view::npos;
  bool network = false;
  bool networkRootDone = false;
  for (std::size_t i = 0; i < path.size(); ++i) {
    const char c = path[i];
    if (c == ':' && i == 1) {
      rootEnd = directoryEnd = 2;
    } else if (c == '/') {
      ++separators;
      if (i == 0) {
        rootEnd = directoryEnd = 1;
      } else if (i == 1 && path[0] == '/') {
        network = true;
        directoryEnd = 2;
      } else if (i == 2 && path[1] == ':') {
        rootEnd = directoryEnd = 3;
      } else {
        directoryEnd = i + 1;
        if (network && separators == 4) {
          rootEnd = i + 1;
          networkRootDone = true;
        }
      }
    } else if (c == '.') {
      lastDot = i;
    }
  }
  // A network path cut short is all root up to its last separator.
  if (network && !networkRootDone) rootEnd = directoryEnd;

  PathParts parts;
  parts.root = path.substr(0, rootEnd);
  parts.directory = path.substr(rootEnd, directoryEnd - rootEnd);
  parts.leaf = path.substr(directoryEnd);
  if (lastDot != std::string_view::npos && lastDot > directoryEnd) {
    parts.name = path.substr(directoryEnd, lastDot - directoryEnd);
    parts.extension = path.substr(lastDot + 1);
  } else {
    parts.name = parts.leaf;
  }
  return parts;
}

std::string GetCurrentDirectoryPath() { return WithSlash(Native::GetWorkingDirectory()); }

std::string GetTemporaryDirectoryPath() {
  const char* value = std::getenv("TMPDIR");
  return WithSlash(value != nullptr && value[0] != '\0' ? value : "/tmp");
}

std::string GetSpecialFolderPath(SpecialFolder folder) {
  switch (folder) {
    case SpecialFolder::kUserConfig:
      return XdgFolder("XDG_CONFIG_HOME", ".config/");
    case SpecialFolder::kUserData:
      return XdgFolder("XDG_DATA_HOME", ".local/share/");
    case SpecialFolder::kHome:
      break;
  }
  const std::string home = Native::GetHomeDirectory();
  if (home.empty()) throw CSystemError(CSystemError::kNoSuchFolder);
  return WithSlash(home);
}

bool GetChildDirectory(const CDirectory& directory, const CString& name, CDirectory& out,
                       bool create) {
  CString resolved = name;
  resolved.Resolve();
  try {
    out = CDirectory(CString(directory.GetPath() + resolved.Str()), create);
    return true;
  } catch (const CException&) {
    return false;
  }
}

bool GetChildFile(const CDirectory& directory, const CString& name, CFile& out, bool create) {
  try {
    out = CFile(directory, name, create);
    return true;
  } catch (const CException&) {
    return false;
  }
}

bool GetDirectoryFromPath(std::string_view path, CDirectory& out, bool create) {
  const std::string full(path);
  switch (Native::GetEntryKind(full)) {
    case Native::EntryKind::kDirectory:
      out = CDirectory::FromPath(full);
      return true;
    case Native::EntryKind::kFile:
      return false;
    case Native::EntryKind::kMissing:
      break;
  }
  if (!create || full.empty()) return false;
  const std::string parent = ParentOf(full);
  if (parent == full) return false;  // a missing root
  CDirectory parentDirectory;
  if (!parent.empty() && !GetDirectoryFromPath(parent, parentDirectory, true)) return false;
  try {
    out = CDirectory(CString(full), true);
    return true;
  } catch (const CException&) {
    return false;
  }
}

bool GetFileFromPath(std::string_view path, CFile& out, bool create) {
  const std::string full(path);
  switch (Native::GetEntryKind(full)) {
    case Native::EntryKind::kFile:
      out = CFile::FromPath(full);
      return true;
    case Native::EntryKind::kDirectory:
      return false;
    case Native::EntryKind::kMissing:
      break;
  }
  if (!create || full.empty() || full.back() == '/') return false;
  const std::string parent = ParentOf(full);
  CDirectory parentDirectory;
  if (!parent.empty() && !GetDirectoryFromPath(parent, parentDirectory, true)) return false;
  try {
    Native::CreateFile(full);
  } catch (const CException&) {
    return false;
  }
  out = CFile::FromPath(full);
  return true;
}

}  // namespace Tarsa
