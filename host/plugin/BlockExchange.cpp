#include "host/plugin/BlockExchange.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <new>
#include <utility>
#include <vector>

#include "framework/pixels/SampleInterleave.h"
#include "host/plugin/HostCodes.h"

namespace Host {

BlockExchange::BlockExchange(HostDocument& document, Tarsa::HostFilterRecord& record)
    : document_(document), record_(record) {}

BlockExchange::~BlockExchange() = default;

Tarsa::HostRect32 BlockExchange::RequestedRect() const {
  if (record_.coordinates32 != nullptr && record_.coordinates32->enabled != 0) {
    return record_.coordinates32->outRect;
  }
  const Tarsa::HostRect16& r = record_.outRect16;
  return {r.top, r.left, r.bottom, r.right};
}

bool BlockExchange::HasRequest() const {
  const Tarsa::HostRect32 r = RequestedRect();
  return r.top < r.bottom && r.left < r.right;
}

template <typename Sample>
void BlockExchange::Transfer(const Block& block, bool toDocument) {
  const auto planes = static_cast<size_t>(block.lastPlane - block.firstPlane + 1);
  const size_t width = static_cast<size_t>(document_.Width());
  const auto columns = static_cast<size_t>(block.rect.right - block.rect.left);
  const Sample max = static_cast<Sample>(document_.MaxSample());
  std::vector<Sample*> planeStarts(planes);
  for (size_t p = 0; p < planes; ++p) {
    if constexpr (sizeof(Sample) == 1) {
      planeStarts[p] = document_.Plane8(block.firstPlane + static_cast<int>(p)).data();
    } else {
      planeStarts[p] = document_.Plane16(block.firstPlane + static_cast<int>(p)).data();
    }
  }
  std::vector<Sample*> rows(planes);
  std::vector<const Sample*> reads(planes);
  for (int32_t y = block.rect.top; y < block.rect.bottom; ++y) {
    const size_t first = static_cast<size_t>(y) * width + static_cast<size_t>(block.rect.left);
    for (size_t p = 0; p < planes; ++p) reads[p] = rows[p] = planeStarts[p] + first;
    // Each row lies on a page of its own, where the processor does not
    // fetch ahead by itself: rows a few ahead are asked for now.
    constexpr int32_t kAhead = 4;
    if (y + kAhead < block.rect.bottom) {
      const size_t ahead = first + static_cast<size_t>(kAhead) * width;
      const size_t bytes = columns * sizeof(Sample);
      for (size_t p = 0; p < planes; ++p) {
        const auto* row = reinterpret_cast<const char*>(planeStarts[p] + ahead);
        for (size_t at = 0; at < bytes; at += 64) __builtin_prefetch(row + at);
      }
    }
    auto* cells = reinterpret_cast<Sample*>(
        block.bytes.get() + static_cast<size_t>(y - block.rect.top) * block.rowBytes);
    if (toDocument) {
      Tarsa::PixelsToPlanes<Sample>(cells, planes, columns, rows, max);
    } else {
      Tarsa::PlanesToPixels<Sample>(reads, columns, planes, cells);
    }
  }
}

void BlockExchange::Commit() {
  if (out_ == nullptr) return;
  const std::unique_ptr<Block> block = std::move(out_);
  if (beforeFirstWrite_) std::exchange(beforeFirstWrite_, nullptr)();
  if (document_.Depth() == 16) {
    Transfer<uint16_t>(*block, true);
  } else {
    Transfer<uint8_t>(*block, true);
  }
}

int16_t BlockExchange::Advance() {
  Commit();
  record_.outData = nullptr;
  record_.outRowBytes = 0;
  if (!HasRequest()) return HostCodes::kNoError;

  auto block = std::make_unique<Block>();
  block->rect = RequestedRect();
  block->firstPlane = record_.outFirstPlane;
  block->lastPlane = record_.outLastPlane;
  const Tarsa::HostRect32& r = block->rect;
  if (r.top < 0 || r.left < 0 || r.bottom > document_.Height() || r.right > document_.Width() ||
      block->firstPlane < 0 || block->lastPlane < block->firstPlane ||
      block->lastPlane >= document_.PlaneCount()) {
    return HostCodes::kParamErr;
  }
  const size_t planes = static_cast<size_t>(block->lastPlane - block->firstPlane + 1);
  block->rowBytes =
      static_cast<size_t>(r.right - r.left) * planes * (document_.Depth() / 8) + rowPadding_;
  const size_t rows = static_cast<size_t>(r.bottom - r.top);
  if (block->rowBytes > static_cast<size_t>(std::numeric_limits<int32_t>::max())) {
    return HostCodes::kMemFullErr;
  }
  block->bytes.reset(new (std::nothrow) uint8_t[block->rowBytes * rows]);
  if (block->bytes == nullptr) return HostCodes::kMemFullErr;
  if (document_.Depth() == 16) {
    Transfer<uint16_t>(*block, false);
  } else {
    Transfer<uint8_t>(*block, false);
  }
  record_.outData = block->bytes.get();
  record_.outRowBytes = static_cast<int32_t>(block->rowBytes);
  out_ = std::move(block);
  return HostCodes::kNoError;
}

}  // namespace Host
