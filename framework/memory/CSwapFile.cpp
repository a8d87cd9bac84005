#include "framework/memory/CSwapFile.h"

#include "framework/core/CException.h"
#include "framework/files/CFilePort.h"
#include "framework/native/NativeScratch.h"

namespace Tarsa {

CSwapFile::CSwapFile(const std::string& volume)
    : volume_(volume),
      file_(CFile::FromPath(Native::CreateUniqueFile(volume, "TarsaSwap", ".tmp"))) {
  try {
    port_ = std::make_unique<CFilePort>(file_, CFilePort::kMode_ReadWrite);
  } catch (...) {
    try {
      file_.Delete();
    } catch (const CException&) {
    }
    throw;
  }
}

CSwapFile::~CSwapFile() {
  port_.reset();
  try {
    file_.Delete();
  } catch (const CException&) {
    // Already gone, or its folder with it: nothing is left to remove.
  }
}

std::uint64_t CSwapFile::TakeSlot(std::size_t size) {
  auto found = freeSlots_.find(size);
  if (found != freeSlots_.end() && !found->second.empty()) {
    const std::uint64_t offset = found->second.back();
    found->second.pop_back();
    return offset;
  }
  const std::uint64_t offset = end_;
  end_ += size;
  return offset;
}

void CSwapFile::FreeSlot(std::uint64_t offset, std::size_t size) {
  freeSlots_[size].push_back(offset);
}

void CSwapFile::Write(std::uint64_t offset, const void* bytes, std::size_t size) {
  port_->WriteAt(bytes, size, offset);
}

void CSwapFile::Read(std::uint64_t offset, void* bytes, std::size_t size) {
  if (port_->ReadAt(bytes, size, offset) != size) throw CSystemError(CSystemError::kEndOfFile);
}

}  // namespace Tarsa
