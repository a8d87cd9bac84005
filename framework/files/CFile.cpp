#include "framework/files/CFile.h"

#include <utility>

#include "framework/core/CException.h"
#include "framework/files/CDirectory.h"
#include "framework/native/NativeFileSystem.h"

namespace Tarsa {

CFile::CFile(const CString& path) {
  CString resolved = path;
  resolved.Resolve();
  path_ = resolved.Str();
  if (Native::GetEntryKind(path_) != Native::EntryKind::kFile) {
    throw CSystemError(CSystemError::kNoSuchFile);
  }
}

CFile::CFile(const CDirectory& directory, const CString& name, bool create) {
  CString resolved = name;
  resolved.Resolve();
  path_ = directory.GetPath();
  // An empty directory path leaves the name relative to the working directory.
  if (!path_.empty() && path_.back() != '/') path_ += '/';
  path_ += resolved.Str();
  Native::EntryKind kind = Native::GetEntryKind(path_);
  if (kind == Native::EntryKind::kMissing && create) {
    Native::CreateFile(path_);
    kind = Native::GetEntryKind(path_);
  }
  if (kind != Native::EntryKind::kFile) throw CSystemError(CSystemError::kNoSuchFile);
}

CFile CFile::FromPath(std::string path) {
  CFile file;
  file.path_ = std::move(path);
  return file;
}

}  // namespace Tarsa
