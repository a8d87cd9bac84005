#include "host/plugin/DocumentChannels.h"

#include <algorithm>
#include <cstring>

#include "host/plugin/HostCodes.h"

namespace Host {

struct DocumentChannels::Port {
  static constexpr uint32_t kMagic = 0x506f7274;
  uint32_t magic = kMagic;
  const HostDocument* document = nullptr;
  int plane = 0;
};

namespace {

using Port = DocumentChannels::Port;

const Port* PortOf(Tarsa::HostChannelPort port) {
  const auto* p = reinterpret_cast<const Port*>(port);
  return p != nullptr && p->magic == Port::kMagic ? p : nullptr;
}

// Copies the samples of `area` (document coordinates, clipped to the image)
// to memory laid out by `destination`, whose data point at the sample for
// the area's top left corner. Strides must be whole bytes and the depth the
// document's; samples are written in the machine's byte order.
Tarsa::HostError CopyOut(const Port* port, const Tarsa::HostRect32& area,
                         const Tarsa::HostPixelMemoryDesc* destination, Tarsa::HostRect32* wrote) {
  if (port == nullptr || destination == nullptr || destination->data == nullptr) {
    return HostCodes::kParamErr;
  }
  const HostDocument& document = *port->document;
  const int bytes = document.Depth() / 8;
  if (destination->depth != document.Depth() || destination->rowBits % 8 != 0 ||
      destination->colBits % 8 != 0 || destination->bitOffset % 8 != 0 ||
      destination->colBits < destination->depth) {
    return HostCodes::kParamErr;
  }
  const int32_t top = std::max(area.top, 0);
  const int32_t left = std::max(area.left, 0);
  const int32_t bottom = std::min(area.bottom, document.Height());
  const int32_t right = std::min(area.right, document.Width());
  if (wrote != nullptr) *wrote = {top, left, std::max(top, bottom), std::max(left, right)};
  if (top >= bottom || left >= right) return HostCodes::kNoError;

  const ptrdiff_t rowStep = destination->rowBits / 8;
  const ptrdiff_t colStep = destination->colBits / 8;
  auto* base = static_cast<uint8_t*>(destination->data) + destination->bitOffset / 8;
  const size_t width = static_cast<size_t>(document.Width());
  for (int32_t y = top; y < bottom; ++y) {
    uint8_t* out = base + (y - area.top) * rowStep + (left - area.left) * colStep;
    const size_t first = static_cast<size_t>(y) * width + static_cast<size_t>(left);
    if (colStep == bytes) {
      // Samples side by side: the row goes as it is.
      const uint8_t* in =
          bytes == 1
              ? document.Plane8(port->plane).data() + first
              : reinterpret_cast<const uint8_t*>(document.Plane16(port->plane).data() + first);
      std::memcpy(out, in, static_cast<size_t>(right - left) * static_cast<size_t>(bytes));
    } else if (bytes == 1) {
      const uint8_t* in = document.Plane8(port->plane).data() + first;
      for (int32_t x = left; x < right; ++x, out += colStep) *out = *in++;
    } else {
      const uint16_t* in = document.Plane16(port->plane).data() + first;
      for (int32_t x = left; x < right; ++x, out += colStep) std::memcpy(out, in++, 2);
    }
  }
  return HostCodes::kNoError;
}

Tarsa::HostError ReadPixels(Tarsa::HostChannelPort port, const Tarsa::HostScaling* scaling,
                            const Tarsa::HostRect32* writeRect,
                            const Tarsa::HostPixelMemoryDesc* destination,
                            Tarsa::HostRect32* wroteRect) {
  if (writeRect == nullptr) return HostCodes::kParamErr;
  // The host reads at full size only; a scaled read is refused, and the
  // filter then reads at full size itself.
  if (scaling != nullptr) {
    const auto& s = scaling->sourceRect;
    const auto& d = scaling->destinationRect;
    if (s.bottom - s.top != d.bottom - d.top || s.right - s.left != d.right - d.left) {
      return HostCodes::kParamErr;
    }
  }
  return CopyOut(PortOf(port), *writeRect, destination, wroteRect);
}

Tarsa::HostError ReadPixelsFromLevel(Tarsa::HostChannelPort port, int32_t level,
                                     const Tarsa::HostPixelMemoryDesc* destination,
                                     const Tarsa::HostRect32* rect) {
  // Only level 0, the full-size image, exists: the host keeps no pyramid.
  if (level != 0 || rect == nullptr) return HostCodes::kParamErr;
  return CopyOut(PortOf(port), *rect, destination, nullptr);
}

constexpr Tarsa::HostChannelProcs kProcs = {{1, 1}, ReadPixels};

Tarsa::HostChannelPortsSuite MakePortsSuite() {
  Tarsa::HostChannelPortsSuite suite = {};
  suite.readPixelsFromLevel = ReadPixelsFromLevel;
  return suite;
}

}  // namespace

void DocumentChannels::ReadFrom(const HostDocument& document) {
  for (const std::unique_ptr<Port>& port : ports_) port->document = &document;
}

DocumentChannels::DocumentChannels(const HostDocument& document)
    : info_(std::make_unique<Tarsa::HostDocumentInfo>()) {
  *info_ = {};
  info_->version = 4;
  for (int plane = 0; plane < document.PlaneCount(); ++plane) {
    auto port = std::make_unique<Port>();
    port->document = &document;
    port->plane = plane;
    auto node = std::make_unique<Tarsa::HostChannelNode>();
    *node = {};
    node->port = reinterpret_cast<Tarsa::HostChannelPort>(port.get());
    node->bounds = {0, 0, document.Height(), document.Width()};
    node->readable = 1;
    if (plane > 0 && plane < document.ColourPlanes()) nodes_.back()->next = node.get();
    ports_.push_back(std::move(port));
    nodes_.push_back(std::move(node));
  }
  info_->targetCompositeChannels = nodes_.front().get();
  info_->mergedCompositeChannels = nodes_.front().get();
  if (document.HasTransparency()) {
    info_->targetTransparency = nodes_[document.TransparencyPlane()].get();
  }
}

DocumentChannels::~DocumentChannels() = default;

const Tarsa::HostChannelProcs* DocumentChannels::Procs() { return &kProcs; }

const Tarsa::HostChannelPortsSuite* DocumentChannels::PortsSuite() {
  static const Tarsa::HostChannelPortsSuite suite = MakePortsSuite();
  return &suite;
}

}  // namespace Host
