#pragma once

#include <cstddef>
#include <memory>
#include <string_view>
#include <vector>

namespace Tarsa {

// Where a scope keeps the names and strings of its symbols: blocks of at
// least kBlockSize bytes, handed out in pieces and freed together with the
// pool. The views it returns stay valid for the pool's life.
class CNamePool {
 public:
  static constexpr std::size_t kBlockSize = 3900;

  std::string_view Store(std::string_view text);
  // Bytes held in blocks, for the limits a run keeps to.
  std::size_t Allocated() const { return allocated_; }

 private:
  std::vector<std::unique_ptr<char[]>> blocks_;
  std::size_t used_ = 0;  // in the last block
  std::size_t size_ = 0;  // of the last block
  std::size_t allocated_ = 0;
};

}  // namespace Tarsa
