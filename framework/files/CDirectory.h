#pragma once

#include <string>
#include <vector>

#include "framework/files/CVolEntry.h"
#include "framework/strings/CString.h"

namespace Tarsa {

// The name of a directory; its path ends in '/'. The checked constructor
// insists that the directory exists (or makes it).
class CDirectory : public CVolEntry {
 public:
  CDirectory() = default;
  CDirectory(const CDirectory& other) = default;
  CDirectory& operator=(const CDirectory& other) = default;
  // path may be a keyed string. A missing directory is made when create is
  // set (its parent must exist); CSystemError 267 when it stays missing or
  // names something else.
  explicit CDirectory(const CString& path, bool create = false);

  // Names path, given its trailing '/', without looking at the disk.
  static CDirectory FromPath(std::string path);

  bool Exists() const override { return CVolEntry::IsDirectory(); }
  bool IsFile() const override { return false; }
  bool IsDirectory() const override { return true; }
  // Removes everything inside, depth first, then the directory itself.
  void Delete() override;
  // The path is a root alone: no directory part and no name.
  virtual bool IsRoot() const;

  // The names of the entries inside, without "." and "..".
  std::vector<std::string> GetEntryNames() const;
};

}  // namespace Tarsa
