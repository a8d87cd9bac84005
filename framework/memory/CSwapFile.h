#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "framework/files/CFile.h"

namespace Tarsa {

class CFilePort;

// One ".tmp" file of the virtual heap on a scratch volume, cut into slots
// that each hold one swapped tile. A slot is reused for a tile of its size
// once freed; the file only grows while the heap lives. The file is made by
// the constructor (with a name unique in the folder) and removed by the
// destructor; the swap file owns its open port. Not copyable.
class CSwapFile {
 public:
  // Makes the file in volume, a folder; CSystemError when it cannot.
  explicit CSwapFile(const std::string& volume);
  ~CSwapFile();
  CSwapFile(const CSwapFile&) = delete;
  CSwapFile& operator=(const CSwapFile&) = delete;

  const std::string& Volume() const { return volume_; }
  std::string Path() const { return file_.GetPath(); }

  // A slot for size bytes: a freed one of that size, else one at the end.
  std::uint64_t TakeSlot(std::size_t size);
  void FreeSlot(std::uint64_t offset, std::size_t size);
  // The whole of size bytes, or a CSystemError (a full disk among them);
  // a failed write leaves the slot's bytes undefined.
  void Write(std::uint64_t offset, const void* bytes, std::size_t size);
  void Read(std::uint64_t offset, void* bytes, std::size_t size);

 private:
  std::string volume_;
  CFile file_;
  std::unique_ptr<CFilePort> port_;
  std::map<std::size_t, std::vector<std::uint64_t>> freeSlots_;  // by slot size
  std::uint64_t end_ = 0;
};

}  // namespace Tarsa
