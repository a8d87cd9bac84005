#pragma once

#include <cstddef>
#include <cstdint>

namespace Tarsa {

// The base of growable byte blocks. A block owns `size` bytes at `data`, held
// in a capacity that is the size rounded up to the granularity, so that small
// growth steps seldom reach the allocator. How the capacity is obtained and
// given back is the subclass's business; a subclass's destructor frees what
// it holds. Not copyable: the bytes have one owner.
class CBlock {
 public:
  explicit CBlock(std::uint32_t granularity) : granularity_(granularity) {}
  virtual ~CBlock() = default;

  CBlock(const CBlock&) = delete;
  CBlock& operator=(const CBlock&) = delete;

  std::uint8_t* Data() { return data_; }
  const std::uint8_t* Data() const { return data_; }
  std::uint32_t Size() const { return size_; }
  std::uint32_t Granularity() const { return granularity_; }
  // What a block of `size` bytes holds: size rounded up to the granularity.
  std::size_t CapacityFor(std::uint32_t size) const;

  // Changes the size; the capacity changes only when the rounded size does.
  void Resize(std::uint32_t newSize, bool keepContents);

 protected:
  // Moves data_ to a store of newCapacity bytes (never 0).
  virtual void Reallocate(std::size_t newCapacity, std::size_t oldCapacity, bool keepContents) = 0;
  // Gives the store back and sets data_ to null.
  virtual void Release(std::size_t capacity) = 0;

  std::uint8_t* data_ = nullptr;
  std::uint32_t size_ = 0;
  std::uint32_t granularity_;
};

}  // namespace Tarsa
