#include "framework/icons/ResourceDataProvider.h"

#include <cctype>
#include <cstring>

namespace Tarsa {
namespace {

// Where the fields of an entry lie, counted from the end of its name.
constexpr std::size_t kWidthAt = 0;
constexpr std::size_t kHeightAt = 16;
constexpr std::size_t kHotXAt = 32;
constexpr std::size_t kHotYAt = 48;
constexpr std::size_t kOffsetAt = 64;
constexpr std::size_t kSizeAt = 192;

std::uint32_t ReadU32(const std::uint8_t* at) {
  return static_cast<std::uint32_t>(at[0]) | (static_cast<std::uint32_t>(at[1]) << 8) |
         (static_cast<std::uint32_t>(at[2]) << 16) | (static_cast<std::uint32_t>(at[3]) << 24);
}

std::string_view ZeroPadded(const std::uint8_t* at, std::size_t size) {
  const char* text = reinterpret_cast<const char*>(at);
  return {text, strnlen(text, size)};
}

}  // namespace

bool ResourceDataProvider::ParseIndex(const std::uint8_t* data, std::size_t size) {
  index_.assign(data, data + size);
  entries_.clear();
  const std::lock_guard<std::mutex> hold(blocksLock_);
  blocks_ = {};
  // The signature and the four block names must be whole, and what follows
  // them whole entries.
  const bool good = size >= kEntriesStart &&
                    std::memcmp(index_.data(), kSignature.data(), kSignatureSize) == 0 &&
                    (size - kEntriesStart) % kEntrySize == 0;
  if (!good) {
    index_.clear();
    return false;
  }
  for (std::size_t at = kEntriesStart; at < size; at += kEntrySize) {
    const std::uint8_t* entry = index_.data() + at;
    // A later entry of the same name replaces the former.
    entries_.insert_or_assign(std::string(ZeroPadded(entry, kEntryNameSize)),
                              entry + kEntryNameSize);
  }
  return true;
}

std::string ResourceDataProvider::IndexKey(std::string_view name) {
  // The current locale's digits, as the numbered cursors were named by.
  if (!name.empty() && std::isdigit(static_cast<unsigned char>(name.front())) != 0) {
    std::string key(kDigitPrefix);
    key.append(name);
    return key;
  }
  return std::string(name);
}

const std::uint8_t* ResourceDataProvider::FindBody(std::string_view name) const {
  const auto found = entries_.find(IndexKey(name));
  return found == entries_.end() ? nullptr : found->second;
}

std::optional<std::pair<std::uint32_t, std::uint32_t>> ResourceDataProvider::Slot(
    const std::uint8_t* body, std::uint32_t resolution, std::uint32_t state) {
  if (body == nullptr || resolution >= kResolutions || state >= kStates) return std::nullopt;
  const std::size_t cell = 32 * resolution + 4 * state;
  const std::uint32_t offset = ReadU32(body + kOffsetAt + cell);
  const std::uint32_t size = ReadU32(body + kSizeAt + cell);
  if (offset == 0 || size == 0) return std::nullopt;
  return std::pair{offset, size};
}

std::string ResourceDataProvider::BlockName(std::uint32_t resolution) const {
  if (resolution >= kResolutions || index_.empty()) return {};
  return std::string(
      ZeroPadded(index_.data() + kSignatureSize + resolution * kBlockNameSize, kBlockNameSize));
}

std::span<const std::uint8_t> ResourceDataProvider::Block(std::uint32_t resolution) const {
  const std::lock_guard<std::mutex> hold(blocksLock_);
  auto& block = blocks_[resolution];
  if (!block) {
    const std::string name = BlockName(resolution);
    std::span<const std::uint8_t> bytes;
    if (!name.empty()) bytes = LoadBlock(name);
    const bool good = bytes.size() >= kBlockMagic.size() &&
                      std::memcmp(bytes.data(), kBlockMagic.data(), kBlockMagic.size()) == 0;
    block = good ? bytes : std::span<const std::uint8_t>();
  }
  return *block;
}

bool ResourceDataProvider::GetData(std::string_view name, std::uint32_t resolution,
                                   std::uint32_t state, std::size_t& size,
                                   const std::uint8_t*& data) const {
  size = 0;
  data = nullptr;
  const auto slot = Slot(FindBody(name), resolution, state);
  if (!slot) return false;
  const std::span<const std::uint8_t> block = Block(resolution);
  // Sums in 64 bits: a damaged offset near 4 GiB must not wrap round.
  if (std::uint64_t{slot->first} + slot->second > block.size()) return false;
  size = slot->second;
  data = block.data() + slot->first;
  return true;
}

bool ResourceDataProvider::GetSize(std::string_view name, std::uint32_t resolution,
                                   std::uint32_t state, std::uint32_t& width,
                                   std::uint32_t& height) const {
  width = 0;
  height = 0;
  const std::uint8_t* body = FindBody(name);
  if (!Slot(body, resolution, state)) return false;
  const std::uint32_t w = ReadU32(body + kWidthAt + 4 * resolution);
  const std::uint32_t h = ReadU32(body + kHeightAt + 4 * resolution);
  if (w == 0 || h == 0 || w > kMaxImageSide || h > kMaxImageSide) return false;
  width = w;
  height = h;
  return true;
}

bool ResourceDataProvider::GetHotSpot(std::string_view name, std::int32_t& x,
                                      std::int32_t& y) const {
  x = 0;
  y = 0;
  const std::uint8_t* body = FindBody(name);
  if (body == nullptr) return false;
  x = static_cast<std::int32_t>(ReadU32(body + kHotXAt));
  y = static_cast<std::int32_t>(ReadU32(body + kHotYAt));
  return true;
}

std::vector<std::string> ResourceDataProvider::Names() const {
  std::vector<std::string> names;
  names.reserve(entries_.size());
  for (const auto& [name, body] : entries_) names.push_back(name);
  return names;
}

}  // namespace Tarsa
