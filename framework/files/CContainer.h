#pragma once

#include <cstddef>
#include <cstdint>

#include "framework/core/CException.h"
#include "framework/files/CStream.h"

namespace Tarsa {

// A stream with a 64-bit size and position over some store. The position
// lives here, not in the store: every transfer tells the store where, so the
// store keeps no cursor of its own. Reads never pass the size (the end-of-data
// error, which leaves the position alone); writes and write skips grow it.
// Subclasses say how the store is resized, read and written.
class CContainer : public CStream {
 public:
  static constexpr const char* kEndOfDataText =
      "$$$/Tarsa/Container/Error/EndOfData=The end of data was reached while reading from a "
      "container.";
  static CError EndOfData() { return CError(kEndOfDataText); }

  std::uint64_t Size() const { return size_; }
  std::uint64_t Position() const { return position_; }

  void Read(void* buffer, std::size_t count) override;
  void Write(const void* buffer, std::size_t count) override;
  void SkipRead(std::uint64_t count) override;
  void SkipWrite(std::uint64_t count) override;
  virtual void ReadAt(void* buffer, std::size_t count, std::uint64_t position);
  virtual void WriteAt(const void* buffer, std::size_t count, std::uint64_t position);
  virtual void Flush() {}

  // A smaller size pulls the position back with it, without a store call.
  void SetSize(std::uint64_t size);
  // A position beyond the size is the end-of-data error.
  void SetPosition(std::uint64_t position);

 protected:
  // Takes the store's present size as the container's, at position 0, with
  // no store call; for constructors.
  void AdoptStoreSize(std::uint64_t size) {
    size_ = size;
    position_ = 0;
  }

  virtual void DoSetSize(std::uint64_t size) = 0;
  virtual void DoSetPosition(std::uint64_t position) = 0;
  // Transfers count bytes at Position(); the caller has checked the bounds.
  virtual void DoRead(void* buffer, std::size_t count) = 0;
  virtual void DoWrite(const void* buffer, std::size_t count) = 0;

 private:
  // Moves to target, which must not pass the size.
  void MoveChecked(std::uint64_t target);
  // Moves to target, growing the store first when target passes the size.
  void MoveExtending(std::uint64_t target);

  std::uint64_t size_ = 0;
  std::uint64_t position_ = 0;
};

}  // namespace Tarsa
