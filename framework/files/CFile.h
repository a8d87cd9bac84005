#pragma once

#include <string>

#include "framework/files/CVolEntry.h"
#include "framework/strings/CString.h"

namespace Tarsa {

class CDirectory;

// The name of a file. The checked constructors insist that the file exists
// (or make it), so that a CFile in hand names a file that was there.
class CFile : public CVolEntry {
 public:
  // An empty path.
  CFile() = default;
  CFile(const CFile& other) = default;
  CFile& operator=(const CFile& other) = default;
  // path may be a keyed string. CSystemError 2 unless it names a file.
  explicit CFile(const CString& path);
  // name, resolved, inside directory. A missing file is made when create is
  // set; CSystemError 2 when it stays missing or names a directory.
  CFile(const CDirectory& directory, const CString& name, bool create);

  // Names path without looking at the disk.
  static CFile FromPath(std::string path);

  bool Exists() const override { return CVolEntry::IsFile(); }
  bool IsFile() const override { return true; }
  bool IsDirectory() const override { return false; }
};

}  // namespace Tarsa
