#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>

namespace Tarsa {

// The system's PNG reader over one PNG file held in memory: the header is
// read on construction, the pixels by Decode(), as 8-bit RGBA with straight
// (not premultiplied) alpha, whatever the file's own depth and colour type.
// The decoder borrows the bytes, which must outlive it. Every failure,
// damaged or truncated data included, is a CError; nothing is allocated for
// the pixels here, so the caller can bound the stated size first.
class CPNGDecoder {
 public:
  explicit CPNGDecoder(std::span<const std::uint8_t> bytes);
  ~CPNGDecoder();
  CPNGDecoder(const CPNGDecoder&) = delete;
  CPNGDecoder& operator=(const CPNGDecoder&) = delete;

  std::uint32_t Width() const { return width_; }
  std::uint32_t Height() const { return height_; }

  // Writes Height() rows of Width() * 4 bytes, rowBytes apart. Once only.
  void Decode(std::uint8_t* pixels, std::size_t rowBytes);

 private:
  struct Reader;
  std::unique_ptr<Reader> reader_;
  std::uint32_t width_ = 0;
  std::uint32_t height_ = 0;
};

}  // namespace Tarsa
