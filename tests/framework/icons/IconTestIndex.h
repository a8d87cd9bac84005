#pragma once

#include <cstdint>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "framework/icons/ResourceDataProvider.h"

namespace Tarsa::testing {

using Bytes = std::vector<std::uint8_t>;
using Provider = ResourceDataProvider;

// Builds icon indexes byte by byte, independently of the generator, so that
// tests can state exactly what a damaged one holds.
class IndexBuilder {
 public:
  IndexBuilder() : bytes_(Provider::kEntriesStart, 0) {
    std::memcpy(bytes_.data(), Provider::kSignature.data(), Provider::kSignatureSize);
  }

  IndexBuilder& Block(std::uint32_t resolution, const std::string& name) {
    std::memcpy(bytes_.data() + Provider::kSignatureSize + resolution * Provider::kBlockNameSize,
                name.data(), name.size());
    return *this;
  }

  // A new entry; the setters below fill its fields.
  IndexBuilder& Entry(const std::string& name) {
    entry_ = bytes_.size();
    bytes_.resize(bytes_.size() + Provider::kEntrySize, 0);
    std::memcpy(bytes_.data() + entry_, name.data(), name.size());
    return *this;
  }
  IndexBuilder& Size(std::uint32_t resolution, std::uint32_t width, std::uint32_t height) {
    Put(48 + 4 * resolution, width);
    Put(64 + 4 * resolution, height);
    return *this;
  }
  IndexBuilder& HotSpot(std::uint32_t resolution, std::uint32_t x, std::uint32_t y) {
    Put(80 + 4 * resolution, x);
    Put(96 + 4 * resolution, y);
    return *this;
  }
  IndexBuilder& State(std::uint32_t resolution, std::uint32_t state, std::uint32_t offset,
                      std::uint32_t size) {
    Put(112 + 32 * resolution + 4 * state, offset);
    Put(240 + 32 * resolution + 4 * state, size);
    return *this;
  }

  Bytes& bytes() { return bytes_; }

 private:
  void Put(std::size_t at, std::uint32_t value) {
    for (int i = 0; i < 4; ++i)
      bytes_[entry_ + at + i] = static_cast<std::uint8_t>(value >> (8 * i));
  }

  Bytes bytes_;
  std::size_t entry_ = 0;
};

// A provider whose data blocks are held in a map, counting the loads.
class MapProvider : public ResourceDataProvider {
 public:
  bool Parse(const Bytes& index) { return ParseIndex(index.data(), index.size()); }

  std::map<std::string, Bytes> blocks;
  mutable int loads = 0;

 protected:
  std::span<const std::uint8_t> LoadBlock(const std::string& name) const override {
    ++loads;
    const auto found = blocks.find(name);
    if (found == blocks.end()) return {};
    return found->second;
  }
};

// A data block: the magic, then the given bytes.
inline Bytes DataBlock(const Bytes& payload) {
  Bytes block(Provider::kBlockMagic.begin(), Provider::kBlockMagic.end());
  block.insert(block.end(), payload.begin(), payload.end());
  return block;
}

}  // namespace Tarsa::testing
