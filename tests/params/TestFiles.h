#pragma once

#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "framework/files/CDirectory.h"
#include "tests/support/TestSupport.h"

namespace Project::testing {

// Expected bytes laid down by hand in a chosen byte order, independently of
// the framework's streams.
class ByteBuilder {
 public:
  explicit ByteBuilder(bool bigEndian = false) : bigEndian_(bigEndian) {}
  ByteBuilder& U8(std::uint8_t v) { return Int(v, 1); }
  ByteBuilder& U16(std::uint16_t v) { return Int(v, 2); }
  ByteBuilder& U32(std::uint32_t v) { return Int(v, 4); }
  ByteBuilder& F32(float v) {
    std::uint32_t bits;
    std::memcpy(&bits, &v, 4);
    return Int(bits, 4);
  }
  // Four characters as a 32-bit code, first character highest.
  ByteBuilder& Code(std::string_view c) {
    return U32(std::uint32_t(std::uint8_t(c[0])) << 24 | std::uint32_t(std::uint8_t(c[1])) << 16 |
               std::uint32_t(std::uint8_t(c[2])) << 8 | std::uint8_t(c[3]));
  }
  ByteBuilder& Bytes(std::string_view more) {
    bytes_.insert(bytes_.end(), more.begin(), more.end());
    return *this;
  }
  ByteBuilder& Bytes(const std::vector<std::uint8_t>& more) {
    bytes_.insert(bytes_.end(), more.begin(), more.end());
    return *this;
  }
  std::uint32_t Size() const { return static_cast<std::uint32_t>(bytes_.size()); }
  const std::vector<std::uint8_t>& Get() const { return bytes_; }

 private:
  ByteBuilder& Int(std::uint32_t v, int width) {
    for (int i = 0; i < width; ++i) {
      bytes_.push_back(static_cast<std::uint8_t>(v >> (bigEndian_ ? 8 * (width - 1 - i) : 8 * i)));
    }
    return *this;
  }
  bool bigEndian_;
  std::vector<std::uint8_t> bytes_;
};

// A scratch folder, as the framework names directories.
class ScratchDirectory : public Tarsa::testing::ScratchFolder {
 public:
  Tarsa::CDirectory Get() const { return Tarsa::CDirectory(Dir()); }
};

}  // namespace Project::testing
