#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>

#include "framework/plugin/HostFilterRecord.h"
#include "host/io/HostDocument.h"

namespace Host {

// How the filter writes into the document: it names a rectangle and a range
// of planes in the record's out request and calls advance; the host hands out
// a block (outData, outRowBytes) holding the document's current samples of
// that area, planes interleaved; the filter changes the block in place. The
// next advance, or the end of the selector, copies the block back into the
// document before anything else happens. An empty request hands out nothing
// (outData null). The out rectangle is read from the 32-bit block when the
// filter has enabled it, else from the 16-bit fields. 16-bit samples above
// full scale (32768) are clamped as they come back. Owns the block handed
// out; borrows the document and the record, which must outlive it.
class BlockExchange {
 public:
  BlockExchange(HostDocument& document, Tarsa::HostFilterRecord& record);
  ~BlockExchange();

  BlockExchange(const BlockExchange&) = delete;
  BlockExchange& operator=(const BlockExchange&) = delete;

  // One advance: commits the block out, hands out the one now asked for.
  // kParamErr for a request outside the image or its planes, kMemFullErr
  // when the block cannot be had; outData is null then.
  int16_t Advance();
  // Copies the block out, if any, back into the document.
  void Commit();
  // Called once, before the first block goes back into the document.
  void SetBeforeFirstWrite(std::function<void()> call) { beforeFirstWrite_ = std::move(call); }
  // Whether the record asks for a block (a non-empty out rectangle).
  bool HasRequest() const;
  // Bytes left unused at the end of each row of the blocks handed out, as a
  // host that aligns its rows leaves them; 0 by default.
  void SetRowPadding(size_t bytes) { rowPadding_ = bytes; }

 private:
  struct Block {
    Tarsa::HostRect32 rect{};
    int firstPlane = 0;
    int lastPlane = 0;
    size_t rowBytes = 0;
    std::unique_ptr<uint8_t[]> bytes;
  };

  Tarsa::HostRect32 RequestedRect() const;
  template <typename Sample>
  void Transfer(const Block& block, bool toDocument);

  HostDocument& document_;
  Tarsa::HostFilterRecord& record_;
  std::unique_ptr<Block> out_;
  size_t rowPadding_ = 0;
  std::function<void()> beforeFirstWrite_;
};

}  // namespace Host
