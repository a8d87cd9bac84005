#include "framework/files/CFilePort.h"

#include <cerrno>

#include "framework/core/CException.h"
#include "framework/files/CFile.h"
#include "framework/native/NativeFileSystem.h"

namespace Tarsa {

CFilePort::CFilePort(const CFile& file, int mode, std::uint32_t reserved, std::uint32_t flags)
    : flags_(flags) {
  try {
    Open(file, mode, reserved);
  } catch (...) {
    Close();
    throw;
  }
}

CFilePort::~CFilePort() { Close(); }

bool CFilePort::IsOpen() const { return handle_ != Native::kInvalidHandle; }

void CFilePort::Open(const CFile& file, int mode, std::uint32_t /*reserved*/) {
  Close();
  handle_ = Native::OpenFile(file.GetPath(), mode == kMode_ReadWrite);
  position_ = 0;
}

void CFilePort::Close() {
  Native::CloseFile(handle_);
  handle_ = Native::kInvalidHandle;
}

std::uint64_t CFilePort::GetSize() const { return Native::GetFileSize(handle_); }

void CFilePort::SetSize(std::uint64_t size) {
  Native::SetFileSize(handle_, size);
  position_ = size;
}

std::uint64_t CFilePort::GetPosition() const { return position_; }

void CFilePort::SetReadPosition(std::uint64_t position) { position_ = position; }

void CFilePort::MoveReadPosition(std::int64_t delta) {
  const std::uint64_t step =
      delta < 0 ? 0 - static_cast<std::uint64_t>(delta) : static_cast<std::uint64_t>(delta);
  if (delta < 0 && step > position_) throw CSystemError(EINVAL);
  position_ = delta < 0 ? position_ - step : position_ + step;
}

void CFilePort::Write(const void* buffer, std::size_t count) {
  Native::WriteFileAt(handle_, buffer, count, position_);
  position_ += count;
}

void CFilePort::WriteAt(const void* buffer, std::size_t count, std::uint64_t position) {
  SetWritePosition(position);
  Write(buffer, count);
}

void CFilePort::WriteBy(const void* buffer, std::size_t count, std::int64_t delta) {
  MoveWritePosition(delta);
  Write(buffer, count);
}

std::size_t CFilePort::Read(void* buffer, std::size_t count) {
  if (count == 0) return 0;
  const std::size_t done = Native::ReadFileAt(handle_, buffer, count, position_);
  if (done == 0) throw CSystemError(CSystemError::kEndOfFile);
  position_ += done;
  return done;
}

std::size_t CFilePort::ReadAt(void* buffer, std::size_t count, std::uint64_t position) {
  SetReadPosition(position);
  return Read(buffer, count);
}

std::size_t CFilePort::ReadBy(void* buffer, std::size_t count, std::int64_t delta) {
  MoveReadPosition(delta);
  return Read(buffer, count);
}

void CFilePort::Flush() { Native::FlushFile(handle_); }

}  // namespace Tarsa
