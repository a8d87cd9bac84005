#include "framework/files/CFileContainer.h"

#include "framework/files/CFile.h"

namespace Tarsa {

CFileContainer::CFileContainer(const CFile& file, int mode, std::uint32_t reserved,
                               std::uint32_t flags)
    : port_(std::make_unique<CFilePort>(file, mode, reserved, flags)) {
  AdoptStoreSize(port_->GetSize());
  port_->SetReadPosition(0);
}

void CFileContainer::DoRead(void* buffer, std::size_t count) {
  // The size was checked, so a short read means the file was cut under us;
  // half a buffer of stale bytes must not pass for data.
  if (port_->ReadAt(buffer, count, Position()) != count) {
    throw CSystemError(CSystemError::kEndOfFile);
  }
}

}  // namespace Tarsa
