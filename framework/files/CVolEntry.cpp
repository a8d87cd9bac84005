#include "framework/files/CVolEntry.h"

#include "framework/files/CDirectory.h"
#include "framework/files/FilePaths.h"
#include "framework/native/NativeFileSystem.h"

namespace Tarsa {

namespace {

// A directory part (ending in '/') without its last component.
std::string DropLastComponent(const std::string& directory) {
  std::string trimmed = directory.substr(0, directory.size() - 1);
  const std::size_t slash = trimmed.rfind('/');
  return slash == std::string::npos ? std::string() : trimmed.substr(0, slash + 1);
}

}  // namespace

bool CVolEntry::Exists() const {
  return Native::GetEntryKind(path_) != Native::EntryKind::kMissing;
}

bool CVolEntry::IsFile() const { return Native::GetEntryKind(path_) == Native::EntryKind::kFile; }

bool CVolEntry::IsDirectory() const {
  return Native::GetEntryKind(path_) == Native::EntryKind::kDirectory;
}

std::string CVolEntry::GetName() const {
  const PathParts parts = SplitPath(path_);
  if (!parts.leaf.empty()) return parts.leaf;
  if (!parts.directory.empty()) {
    const std::string joined = parts.root + parts.directory;
    return SplitPath(std::string_view(joined).substr(0, joined.size() - 1)).leaf;
  }
  return parts.root;
}

std::string CVolEntry::GetBaseName() const { return SplitPath(GetName()).name; }

std::string CVolEntry::GetExtension() const { return SplitPath(GetName()).extension; }

std::uint32_t CVolEntry::GetTypeCode() const {
  const std::string name = GetName();
  const std::size_t dot = name.rfind('.');
  if (dot == std::string::npos) return 0;
  std::uint32_t code = 0;
  int count = 0;
  for (std::size_t i = dot + 1; i < name.size(); ++i) {
    const auto c = static_cast<unsigned char>(name[i]);
    if ((c & 0xC0) == 0x80) continue;  // a UTF-8 continuation byte: same character
    if (++count > 4) return 0;
    const std::uint32_t byte = (c >= 32 && c <= 126) ? c : 0;
    code |= byte << (8 * (4 - count));
  }
  return code;
}

void CVolEntry::Reveal() const {
  std::string folder;
  if (GetParentPath(folder) == 0) folder = path_;
  Native::LaunchDetached("xdg-open", {folder.empty() ? std::string(".") : folder});
}

int CVolEntry::GetDepth() const {
  CVolEntry walker(path_);
  int depth = 0;
  while (walker.GetParentPath(walker.path_) == 1) ++depth;
  return depth;
}

CDirectory CVolEntry::GetParent() const {
  std::string parent;
  GetParentPath(parent);
  return CDirectory::FromPath(parent);
}

int CVolEntry::GetParentPath(std::string& out, int levels) const {
  std::string current = path_;
  int climbed = 0;
  for (; climbed < levels; ++climbed) {
    const PathParts parts = SplitPath(current);
    if (parts.leaf.empty() && parts.directory.empty()) break;
    current =
        parts.root + (parts.leaf.empty() ? DropLastComponent(parts.directory) : parts.directory);
  }
  out = current;
  return climbed;
}

bool CVolEntry::GetTimes(std::uint64_t& created, std::uint64_t& accessed,
                         std::uint64_t& written) const {
  Native::EntryTimes times;
  const bool ok = Native::GetEntryTimes(path_, times);
  created = times.created;
  accessed = times.accessed;
  written = times.written;
  return ok;
}

std::uint64_t CVolEntry::GetCreationTime() const {
  std::uint64_t created, accessed, written;
  GetTimes(created, accessed, written);
  return created;
}

std::uint64_t CVolEntry::GetAccessTime() const {
  std::uint64_t created, accessed, written;
  GetTimes(created, accessed, written);
  return accessed;
}

std::uint64_t CVolEntry::GetWriteTime() const {
  std::uint64_t created, accessed, written;
  GetTimes(created, accessed, written);
  return written;
}

void CVolEntry::Delete() {
  if (Native::GetEntryKind(path_, false) == Native::EntryKind::kDirectory) {
    CDirectory::FromPath(path_).Delete();
  } else {
    Native::RemoveFile(path_);
  }
}

void CVolEntry::Rename(const std::string& path) {
  Native::RenameEntry(path_, path);
  path_ = path;
}

}  // namespace Tarsa
