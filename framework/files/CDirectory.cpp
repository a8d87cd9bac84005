#include "framework/files/CDirectory.h"

#include <utility>

#include "framework/core/CException.h"
#include "framework/files/FilePaths.h"
#include "framework/native/NativeFileSystem.h"

namespace Tarsa {

namespace {

std::string WithSlash(std::string path) {
  if (!path.empty() && path.back() != '/') path += '/';
  return path;
}

}  // namespace

CDirectory::CDirectory(const CString& path, bool create) {
  CString resolved = path;
  resolved.Resolve();
  path_ = WithSlash(resolved.Str());
  Native::EntryKind kind = Native::GetEntryKind(path_);
  // A file named with a trailing '/' reads as missing; the bare name tells
  // that it is there and no directory (267), rather than a failed mkdir.
  if (kind == Native::EntryKind::kMissing && path_.size() > 1) {
    const std::string bare = path_.substr(0, path_.size() - 1);
    if (Native::GetEntryKind(bare) != Native::EntryKind::kMissing) {
      throw CSystemError(CSystemError::kNotADirectory);
    }
  }
  if (kind == Native::EntryKind::kMissing && create) {
    Native::MakeDirectory(path_);
    kind = Native::GetEntryKind(path_);
  }
  if (kind != Native::EntryKind::kDirectory) throw CSystemError(CSystemError::kNotADirectory);
}

CDirectory CDirectory::FromPath(std::string path) {
  CDirectory directory;
  directory.path_ = WithSlash(std::move(path));
  return directory;
}

void CDirectory::Delete() {
  // A link to a directory goes alone; what it points to stays.
  if (path_.size() > 1) {
    const std::string bare = path_.substr(0, path_.size() - 1);
    if (Native::GetEntryKind(bare, false) == Native::EntryKind::kFile &&
        Native::GetEntryKind(bare, true) == Native::EntryKind::kDirectory) {
      Native::RemoveFile(bare);
      return;
    }
  }
  for (const std::string& name : GetEntryNames()) {
    CVolEntry(path_ + name).Delete();
  }
  Native::RemoveDirectory(path_);
}

bool CDirectory::IsRoot() const {
  const PathParts parts = SplitPath(path_);
  return !parts.root.empty() && parts.directory.empty() && parts.leaf.empty();
}

std::vector<std::string> CDirectory::GetEntryNames() const {
  return Native::ListDirectory(path_.empty() ? std::string(".") : path_);
}

}  // namespace Tarsa
