#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace Tarsa {

// The icon index and its data blocks: for an image name, a resolution and a
// state, where the PNG bytes lie and how large the image is.
//
// The index, integers 32-bit little-endian:
//
//     0   34   "Quillmark Icon Resource Index 1.0\n", no terminating zero
//    34  128   name of the data block of resolution 0, zero padded
//   162  128   resolution 1
//   290  128   resolution 2
//   418  128   resolution 3
//   546  368   entries, each:
//                0   48  image name, zero padded
//               48   16  width, one word a resolution
//               64   16  height
//               80   16  hot spot x
//               96   16  hot spot y
//              112  128  offset, a row of eight states a resolution
//              240  128  size, in the same shape
//
// Offsets count from the start of the resolution's data block, which begins
// with "fdra" and holds whole PNG files. An offset or size of 0 means there is
// no image for that resolution and state.
//
// The provider owns a copy of the index (a new index replaces the old one)
// and asks LoadBlock() for a data block the first time an image of that
// resolution is wanted; the bytes it hands back must outlive the provider.
// Queries may come from several threads; ParseIndex may not run beside
// them. A damaged index is refused as a whole; an entry that points outside its
// block, or states an image larger than kMaxImageSide, answers false.
class ResourceDataProvider {
 public:
  static constexpr std::size_t kSignatureSize = 34;
  static constexpr std::size_t kBlockNameSize = 128;
  static constexpr std::size_t kEntriesStart = kSignatureSize + 4 * kBlockNameSize;  // 546
  static constexpr std::size_t kEntryNameSize = 48;
  static constexpr std::size_t kEntryBodySize = 320;
  static constexpr std::size_t kEntrySize = kEntryNameSize + kEntryBodySize;  // 368
  static constexpr std::uint32_t kResolutions = 4;
  static constexpr std::uint32_t kStates = 8;
  // Larger than any skin part or cursor; a bigger stated side is damage.
  static constexpr std::uint32_t kMaxImageSide = 1024;
  static constexpr std::string_view kSignature = "Quillmark Icon Resource Index 1.0\n";
  static constexpr std::string_view kBlockMagic = "fdra";
  static constexpr std::string_view kDigitPrefix = "Alpha_";

  ResourceDataProvider() = default;
  virtual ~ResourceDataProvider() = default;
  ResourceDataProvider(const ResourceDataProvider&) = delete;
  ResourceDataProvider& operator=(const ResourceDataProvider&) = delete;

  // Takes a copy of the index and reads it; false, with no entries left,
  // when it is damaged. Blocks loaded for the old index are forgotten.
  bool ParseIndex(const std::uint8_t* data, std::size_t size);

  // The PNG bytes of a state; false with size and data left at 0 and null
  // when the image, the state or the block is missing.
  bool GetData(std::string_view name, std::uint32_t resolution, std::uint32_t state,
               std::size_t& size, const std::uint8_t*& data) const;
  // The image's size at a resolution, when the state exists there.
  bool GetSize(std::string_view name, std::uint32_t resolution, std::uint32_t state,
               std::uint32_t& width, std::uint32_t& height) const;
  // The hot spot at resolution 0, whatever resolution is drawn; 0, 0 and
  // false for an unknown name.
  bool GetHotSpot(std::string_view name, std::int32_t& x, std::int32_t& y) const;

  // The key a name is found under: a name that starts with a digit is a
  // cursor number and is kept as "Alpha_" and the number.
  static std::string IndexKey(std::string_view name);

  // The image names of the index, in key order.
  std::vector<std::string> Names() const;
  std::size_t Count() const { return entries_.size(); }
  // The name of a resolution's data block; empty when the index names none.
  std::string BlockName(std::uint32_t resolution) const;

 protected:
  // The bytes of the data block with this name; empty when there is none.
  virtual std::span<const std::uint8_t> LoadBlock(const std::string& name) const = 0;

 private:
  const std::uint8_t* FindBody(std::string_view name) const;
  // The block of a resolution, loaded on first need; empty when it cannot
  // be had or does not start as a data block must.
  std::span<const std::uint8_t> Block(std::uint32_t resolution) const;
  // Offset and size of a pair, both non-zero, or nothing.
  static std::optional<std::pair<std::uint32_t, std::uint32_t>> Slot(const std::uint8_t* body,
                                                                     std::uint32_t resolution,
                                                                     std::uint32_t state);

  std::vector<std::uint8_t> index_;
  std::map<std::string, const std::uint8_t*, std::less<>> entries_;
  // Blocks are loaded under the lock: the module's provider is shared.
  mutable std::mutex blocksLock_;
  mutable std::array<std::optional<std::span<const std::uint8_t>>, kResolutions> blocks_;
};

}  // namespace Tarsa
