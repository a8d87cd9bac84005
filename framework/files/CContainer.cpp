#include "framework/files/CContainer.h"

#include <limits>

namespace Tarsa {

namespace {

// position + count, or the end-of-data error when the sum would not fit.
std::uint64_t Target(std::uint64_t position, std::uint64_t count) {
  if (count > std::numeric_limits<std::uint64_t>::max() - position) throw CContainer::EndOfData();
  return position + count;
}

}  // namespace

void CContainer::Read(void* buffer, std::size_t count) {
  if (count == 0) return;
  if (count > size_ - position_) throw EndOfData();
  DoRead(buffer, count);
  position_ += count;
}

void CContainer::Write(const void* buffer, std::size_t count) {
  if (count == 0) return;
  const std::uint64_t end = Target(position_, count);
  DoWrite(buffer, count);
  position_ = end;
  if (position_ > size_) size_ = position_;
}

void CContainer::SkipRead(std::uint64_t count) { MoveChecked(Target(position_, count)); }

void CContainer::SkipWrite(std::uint64_t count) { MoveExtending(Target(position_, count)); }

void CContainer::ReadAt(void* buffer, std::size_t count, std::uint64_t position) {
  MoveChecked(position);
  Read(buffer, count);
}

void CContainer::WriteAt(const void* buffer, std::size_t count, std::uint64_t position) {
  MoveExtending(position);
  Write(buffer, count);
}

void CContainer::SetSize(std::uint64_t size) {
  if (size == size_) return;
  DoSetSize(size);
  size_ = size;
  if (position_ > size_) position_ = size_;
}

void CContainer::SetPosition(std::uint64_t position) { MoveChecked(position); }

void CContainer::MoveChecked(std::uint64_t target) {
  if (target == position_) return;
  if (target > size_) throw EndOfData();
  DoSetPosition(target);
  position_ = target;
}

void CContainer::MoveExtending(std::uint64_t target) {
  if (target == position_) return;
  if (target > size_) {
    DoSetSize(target);
    size_ = target;
  }
  DoSetPosition(target);
  position_ = target;
}

}  // namespace Tarsa
