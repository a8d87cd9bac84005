#include "framework/plugin/CQuillmarkFilter.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <exception>
#include <memory>
#include <string>

#include "framework/core/CException.h"
#include "framework/memory/CMemoryService.h"
#include "framework/memory/CVirtualAllocator.h"
#include "framework/native/NativeSystem.h"
#include "framework/pixels/SampleInterleave.h"
#include "framework/plugin/CBufferSuiteAllocator.h"
#include "framework/plugin/CDisplayConversion.h"
#include "framework/plugin/CQuillmarkError.h"
#include "framework/strings/Unicode.h"

namespace Tarsa {

namespace {

CQuillmarkFilter* gFilter = nullptr;

// The most planes a pixel takes the unrolled road back to the host with.
constexpr std::uint32_t kMaxPlanes = 8;

constexpr const char* kNotEnoughMemoryText =
    "$$$/Tarsa/QuillmarkPlugin/Error/NotEnoughMemory=This plugin requires more memory than the "
    "host can currently supply.";
constexpr const char* kDepthMismatchText =
    "$$$/Tarsa/QuillmarkPlugin/Error/Depth=The image data does not match the document's depth.";

constexpr std::uint32_t kPropUnicodeTitle = FourCC("unnm");
constexpr std::uint32_t kPropTitle = FourCC("titl");

constexpr std::uint64_t kMinMemoryLimit = 0x2000000;
constexpr std::uint64_t kMaxMemoryLimit = 0x40000000;

// A host's channel list is walked at most this far: a damaged list must not
// hang the module.
constexpr int kMaxChannelWalk = 4096;

// The host's answer codes of the advance callback that mean the user stopped.
constexpr std::int16_t kAdvanceCanceled = -128;
constexpr std::int16_t kAdvanceAborted = 1000;

// Runs a handler's work with the rules every selector shares: the host's own
// error becomes the answer, the framework's failures go on unchanged, and
// anything else is made one of them.
template <typename Work>
std::int16_t Guarded(Work&& work) {
  try {
    return work();
  } catch (const CQuillmarkError& e) {
    return e.Code();
  } catch (const CException&) {
    throw;
  } catch (const std::exception&) {
    throw CError("", "", true);
  } catch (...) {
    throw CException();
  }
}

CRect FromHost(const HostRect32& r) { return CRect{r.left, r.top, r.right, r.bottom}; }
CRect FromHost(const HostRect16& r) { return CRect{r.left, r.top, r.right, r.bottom}; }
HostRect32 ToHost32(const CRect& r) { return HostRect32{r.top, r.left, r.bottom, r.right}; }
HostRect16 ToHost16(const CRect& r) {
  auto n = [](std::int32_t v) { return std::int16_t(std::clamp<std::int32_t>(v, -32768, 32767)); };
  return HostRect16{n(r.top), n(r.left), n(r.bottom), n(r.right)};
}

const HostChannelNode* FirstReadable(const HostChannelNode* node) {
  for (int walked = 0; node != nullptr && walked < kMaxChannelWalk; ++walked, node = node->next) {
    if (node->readable != 0) return node;
  }
  return nullptr;
}

bool Readable(const HostChannelNode* node) { return node != nullptr && node->readable != 0; }

// Full scale of a sample: 16-bit hosts run to 32768, and 32-bit samples are
// floats whose full scale is 1.
std::uint32_t Opaque(std::uint32_t depth) {
  if (depth == 8) return 255;
  if (depth == 16) return 32768;
  const float one = 1.0f;
  std::uint32_t bits;
  std::memcpy(&bits, &one, sizeof bits);
  return bits;
}

std::uint32_t FillValue(std::span<const std::uint32_t> fillValues, std::uint32_t plane) {
  return plane < fillValues.size() ? fillValues[plane] : 0;
}

}  // namespace

struct CQuillmarkFilter::ChannelChoice {
  const HostChannelNode* node = nullptr;
  const HostChannelNode* transparency = nullptr;
};

CQuillmarkFilter::CQuillmarkFilter() { gFilter = this; }

CQuillmarkFilter::~CQuillmarkFilter() {
  if (gFilter == this) gFilter = nullptr;
}

CQuillmarkFilter* CQuillmarkFilter::Current() { return gFilter; }

void CQuillmarkFilter::SetInteractive(bool on) {
  flags_ = on ? (flags_ | kFlag_Interactive) : (flags_ & ~kFlag_Interactive);
}

HostFilterRecord* CQuillmarkFilter::HostRecord() const {
  if ((pluginState_ & kPlugin_HostRecordValid) != 0 && record_ != nullptr) return record_;
  return aboutRecord_;
}

HostFilterRecord* CQuillmarkFilter::FilterRecord() const {
  return (pluginState_ & kPlugin_HostRecordValid) != 0 ? record_ : nullptr;
}

void CQuillmarkFilter::Enter(HostFilterRecord* record, std::intptr_t* dataSlot,
                             std::int16_t selector) {
  record_ = record;
  dataSlot_ = dataSlot;
  selector_ = selector;
}

// ---- Memory -------------------------------------------------------------------

bool CQuillmarkFilter::SplitMemory(std::uint32_t total, std::uint32_t& first,
                                   std::uint32_t& second) {
  first = total / 2;
  second = total - first;
  return true;
}

bool CQuillmarkFilter::DoPrepare() {
  HostFilterRecord* record = FilterRecord();
  const std::uint32_t total = record != nullptr ? record->memoryOffer : 0;
  std::uint32_t first = 0;
  std::uint32_t second = 0;
  if (!SplitMemory(total, first, second)) throw CError(kNotEnoughMemoryText);
  // Neither part may fall below a floor of half the offer, at most 512 KiB,
  // and the two together never ask for more than was offered.
  const std::uint32_t floor = std::min<std::uint32_t>(total / 2, 0x80000);
  first = first < floor ? floor : std::min(total - floor, first);
  second = second < floor ? floor : std::min(second, total - first);
  if (record != nullptr) {
    record->memoryOffer = first + second;
    record->bufferShare = first;
  }
  InitMemory();
  // With the buffer suite the filter's share comes from the host's buffers,
  // so the host keeps only the rest for itself.
  if (useBufferSuite_ != 0 && record != nullptr) {
    record->memoryOffer = second;
    record->bufferShare = 0;
  }
  return true;
}

void CQuillmarkFilter::InitMemory() {
  if (memoryReady_ != 0) return;
  memoryReady_ = 1;
  CMemoryService* service = nullptr;
  try {
    service = CMemoryService::Get(true);
  } catch (...) {
    return;
  }
  const std::uint64_t physicalHalf = Native::PhysicalMemoryBytes() / 2;
  const HostFilterRecord* record = FilterRecord();
  const std::uint64_t share = record != nullptr ? record->bufferShare : 0;
  CVirtualAllocator::Install(nullptr);
  if (useBufferSuite_ != 0) {
    if (const HostBufferSuite* buffers = BufferSuite()) {
      CVirtualAllocator::Install(std::make_unique<CBufferSuiteAllocator>(buffers));
    }
  }
  service->SetMemoryLimit(std::min(std::clamp(share, kMinMemoryLimit, kMaxMemoryLimit),
                                   std::clamp(physicalHalf, kMinMemoryLimit, kMaxMemoryLimit)));
  if (!service->HasSwap()) service->StartSwap(ScratchVolumes());
}

// ---- Handlers -------------------------------------------------------------------

void CQuillmarkFilter::DoAbout() {
  BeginProcess();
  ShowAbout();
  EndProcess();
}

std::int16_t CQuillmarkFilter::HandleAbout(HostFilterRecord* record, std::intptr_t* dataSlot) {
  return Guarded([&]() -> std::int16_t {
    Enter(record, dataSlot, kSelectorAbout);
    aboutRecord_ = record;
    SetPluginState(kPlugin_HostRecordValid, false);
    SetPluginState(kPlugin_InAbout, true);
    SetInteractive(false);
    DoAbout();
    SetPluginState(kPlugin_InAbout, false);
    return 0;
  });
}

std::int16_t CQuillmarkFilter::HandleParameters(HostFilterRecord* record, std::intptr_t* dataSlot) {
  return Guarded([&]() -> std::int16_t {
    Enter(record, dataSlot, kSelectorParameters);
    SetPluginState(kPlugin_HostRecordValid, true);
    SetInteractive(true);
    return DoParameters() ? 0 : 1;
  });
}

std::int16_t CQuillmarkFilter::HandlePrepare(HostFilterRecord* record, std::intptr_t* dataSlot) {
  return Guarded([&]() -> std::int16_t {
    Enter(record, dataSlot, kSelectorPrepare);
    SetPluginState(kPlugin_HostRecordValid, true);
    if (DoPrepare() && DoPrepareFinish()) return 0;
    SetInteractive(false);
    return 1;
  });
}

std::int16_t CQuillmarkFilter::HandleStart(HostFilterRecord* record, std::intptr_t* dataSlot) {
  return Guarded([&]() -> std::int16_t {
    Enter(record, dataSlot, kSelectorStart);
    SetPluginState(kPlugin_HostRecordValid, true);
    ReadZoomWithScrollWheel();
    InitMemory();
    if (DoStart()) return 0;
    SetInteractive(false);
    return 1;
  });
}

std::int16_t CQuillmarkFilter::HandleContinue(HostFilterRecord* record, std::intptr_t* dataSlot) {
  return Guarded([&]() -> std::int16_t {
    Enter(record, dataSlot, kSelectorContinue);
    return DoContinue() ? 0 : 1;
  });
}

std::int16_t CQuillmarkFilter::HandleFinish(HostFilterRecord* record, std::intptr_t* dataSlot) {
  return Guarded([&]() -> std::int16_t {
    Enter(record, dataSlot, kSelectorFinish);
    DoFinish();
    SetInteractive(false);
    return 0;
  });
}

// ---- The record -------------------------------------------------------------------

namespace {
const HostCoordinates32* Coordinates32(const HostFilterRecord* record) {
  if (record == nullptr || record->coordinates32 == nullptr) return nullptr;
  return record->coordinates32->enabled != 0 ? record->coordinates32 : nullptr;
}
}  // namespace

CRect CQuillmarkFilter::FilterRect() const {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return CRect{};
  if (const HostCoordinates32* c = Coordinates32(record)) return FromHost(c->filterRect);
  return FromHost(record->filterRect16);
}

CPoint CQuillmarkFilter::FloatOrigin() const {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return CPoint{};
  if (const HostCoordinates32* c = Coordinates32(record)) {
    return CPoint{c->floatOrigin.h, c->floatOrigin.v};
  }
  return CPoint{record->floatOrigin16.h, record->floatOrigin16.v};
}

CSize CQuillmarkFilter::WholeSize() const {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return CSize{};
  if (const HostCoordinates32* c = Coordinates32(record)) {
    return CSize{c->wholeSize.h, c->wholeSize.v};
  }
  return CSize{record->wholeSize16.h, record->wholeSize16.v};
}

CSize CQuillmarkFilter::ImageSize() const {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return CSize{};
  if (const HostCoordinates32* c = Coordinates32(record)) {
    return CSize{c->imageWidth, c->imageHeight};
  }
  return CSize{record->imageWidth16, record->imageHeight16};
}

bool CQuillmarkFilter::FloatsOverImage() const {
  const HostFilterRecord* record = FilterRecord();
  return record != nullptr && record->floatsOverImage != 0;
}

CPoint CQuillmarkFilter::TileOffset() const {
  const CPoint origin = FloatOrigin();
  if (FloatsOverImage()) return origin;
  const CRect filter = FilterRect();
  return CPoint{CRect::Saturate(std::int64_t(origin.x) - filter.left),
                CRect::Saturate(std::int64_t(origin.y) - filter.top)};
}

CRect CQuillmarkFilter::ImageRect() const {
  if (!FloatsOverImage()) return LayerRect();
  const CPoint origin = FloatOrigin();
  const CSize whole = WholeSize();
  return CRect{0, 0, whole.width, whole.height}.Offset(-origin.x, -origin.y);
}

CRect CQuillmarkFilter::LayerRect() const {
  const CSize size = ImageSize();
  return CRect{0, 0, size.width, size.height};
}

std::uint32_t CQuillmarkFilter::DepthOfMode(std::int32_t mode) {
  if (mode == 0) return 1;
  if (mode >= 10 && mode <= 15) return 16;
  if (mode == 16 || mode == 17) return 32;
  return 8;
}

std::uint32_t CQuillmarkFilter::ColorPlanesOfMode(std::int32_t mode) {
  switch (mode) {
    case 3:
    case 5:
    case 6:
    case 9:
    case 11:
    case 12:
    case 16:
      return 3;
    case 4:
    case 13:
      return 4;
    default:
      return 1;
  }
}

std::uint32_t CQuillmarkFilter::PixelLayoutOfMode(std::int32_t mode) {
  switch (mode) {
    case 0:
    case 1:
    case 7:
    case 8:
    case 10:
    case 14:
    case 15:
    case 17:
      return 4;
    case 4:
    case 13:
      return 2;
    case 5:
      return 5;
    case 6:
      return 1;
    case 9:
    case 12:
      return 3;
    default:
      return 0;
  }
}

std::uint32_t CQuillmarkFilter::Depth() const {
  const HostFilterRecord* record = FilterRecord();
  return record != nullptr ? DepthOfMode(record->imageMode) : 0;
}

std::uint32_t CQuillmarkFilter::ColorPlanes() const {
  const HostFilterRecord* record = FilterRecord();
  return record != nullptr ? ColorPlanesOfMode(record->imageMode) : 0;
}

std::uint32_t CQuillmarkFilter::PixelLayout() const {
  const HostFilterRecord* record = FilterRecord();
  return record != nullptr ? PixelLayoutOfMode(record->imageMode) : 0;
}

bool CQuillmarkFilter::HasTransparency() const {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return false;
  return (record->planeCount == 4 || record->planeCount == 5) && record->hasAlpha262 == 1 &&
         record->hasAlpha272 == 1;
}

double CQuillmarkFilter::ResolutionX() const {
  const HostFilterRecord* record = FilterRecord();
  return record != nullptr ? record->resolutionX * 1.52587890625e-5 : 0.0;
}

double CQuillmarkFilter::ResolutionY() const {
  const HostFilterRecord* record = FilterRecord();
  return record != nullptr ? record->resolutionY * 1.52587890625e-5 : 0.0;
}

CString CQuillmarkFilter::DocumentTitle() const {
  if (FilterRecord() == nullptr) return CString();
  std::string bytes;
  if (GetPropertyBytes(kPropUnicodeTitle, bytes)) {
    std::u16string units(bytes.size() / 2, u'\0');
    std::memcpy(units.data(), bytes.data(), units.size() * 2);
    while (!units.empty() && units.back() == u'\0') units.pop_back();
    return CString(Utf16ToUtf8(units));
  }
  // The 8-bit title is in the system's encoding, which is UTF-8 here.
  if (GetPropertyBytes(kPropTitle, bytes)) {
    while (!bytes.empty() && bytes.back() == '\0') bytes.pop_back();
    return CString(bytes);
  }
  return CString();
}

void CQuillmarkFilter::Use32BitCoordinates(bool on) {
  HostFilterRecord* record = FilterRecord();
  if (record != nullptr && record->coordinates32 != nullptr) {
    record->coordinates32->enabled = on ? 1 : 0;
  }
}

void CQuillmarkFilter::ClearRequests() {
  HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return;
  record->inRect16 = HostRect16{};
  record->inPlanes[0] = record->inPlanes[1] = 0;
  record->outRect16 = HostRect16{};
  record->maskRect16 = HostRect16{};
  if (HostCoordinates32* c = record->coordinates32) {
    c->inRect = HostRect32{};
    c->outRect = HostRect32{};
    c->maskRect = HostRect32{};
  }
}

// ---- Pixels -------------------------------------------------------------------------

bool CQuillmarkFilter::HasChannelAccess() {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr || record->documentInfo == nullptr) return false;
  const HostChannelPortsSuite* ports = ChannelPortsSuite();
  if (ports != nullptr && ports->readPixelsFromLevel != nullptr) return true;
  const auto* procs = static_cast<const HostChannelProcs*>(record->channelProcs);
  return procs != nullptr && procs->header.count >= 1 && procs->readPixels != nullptr;
}

bool CQuillmarkFilter::FindChannel(std::int32_t selector, ChannelChoice& choice) const {
  const auto* info = static_cast<const HostDocumentInfo*>(FilterRecord()->documentInfo);
  choice = ChannelChoice{};
  if (selector == kReadTarget) {
    if (const HostChannelNode* target = FirstReadable(info->targetCompositeChannels)) {
      choice = ChannelChoice{target, info->targetTransparency};
    } else if (Readable(info->targetMask)) {
      choice.node = info->targetMask;
    } else if (info->version >= 4 && Readable(info->mergedMask)) {
      choice.node = info->mergedMask;
    } else {
      choice.node = FirstReadable(info->mergedCompositeChannels);
    }
  } else if (selector == kReadLayerMask) {
    if (info->layerMaskChannels != nullptr) {
      choice = ChannelChoice{info->layerMaskChannels, info->layerTransparency};
    } else {
      choice.node = FirstReadable(info->mergedCompositeChannels);
    }
  } else if (selector >= 0 && info->version >= 2) {
    const HostAlphaChannel* alpha = info->alphaChannels;
    for (std::int32_t i = 0; alpha != nullptr && i < selector && i < kMaxChannelWalk; ++i) {
      alpha = alpha->next;
    }
    if (alpha != nullptr && selector < kMaxChannelWalk) {
      choice = ChannelChoice{alpha->channel, alpha->transparency};
    }
  }
  return choice.node != nullptr;
}

void CQuillmarkFilter::ReadPlane(const HostChannelNode* node, CMemoryPixmap& pixmap,
                                 std::uint32_t plane, const CRect& channelArea,
                                 const CRect& pixmapArea) {
  HostPixelMemoryDesc desc{};
  desc.data = pixmap.Address(plane, pixmapArea.left, pixmapArea.top);
  desc.rowBits = std::int32_t(pixmap.RowBytes() * 8);
  desc.colBits = std::int32_t(pixmap.Depth());
  desc.bitOffset = 0;
  desc.depth = std::int32_t(pixmap.Depth());
  HostRect32 rect = ToHost32(channelArea);
  HostError error = 0;
  const HostChannelPortsSuite* ports = ChannelPortsSuite();
  if (ports != nullptr && ports->readPixelsFromLevel != nullptr) {
    error = ports->readPixelsFromLevel(node->port, 0, &desc, &rect);
  } else {
    const auto* procs = static_cast<const HostChannelProcs*>(FilterRecord()->channelProcs);
    const HostScaling scaling{rect, rect};
    HostRect32 wrote{};
    error = procs->readPixels(node->port, &scaling, &rect, &desc, &wrote);
  }
  if (error != 0) throw CAbort(true);
}

void CQuillmarkFilter::ReadPixmap(CMemoryPixmap& pixmap, std::int32_t selector,
                                  std::int32_t fallback, std::int32_t mode,
                                  std::span<const std::uint32_t> fillValues) {
  const std::uint32_t depth = Depth();
  const std::uint32_t colorPlanes = ColorPlanes();
  const std::uint32_t n = std::min(pixmap.Planes(), colorPlanes + 1);
  const std::uint32_t m = std::min(colorPlanes, n);
  if (n < 1) return;
  const CRect bounds = pixmap.Bounds();

  ChannelChoice choice;
  if (selector == kReadNothing || !HasChannelAccess()) {
    for (std::uint32_t k = 0; k < n; ++k) pixmap.Fill(k, bounds, FillValue(fillValues, k));
    return;
  }
  CRect channelArea;
  if (FindChannel(selector, choice)) {
    const CPoint offset = TileOffset();
    channelArea = bounds.Offset(offset.x, offset.y).Intersect(FromHost(choice.node->bounds));
  }
  if (channelArea.IsEmpty()) {
    ReadPixmap(pixmap, fallback, kReadNothing, mode, fillValues);
    return;
  }
  if (pixmap.Depth() != depth) throw CError(kDepthMismatchText);
  const CPoint offset = TileOffset();
  const CRect pixmapArea = channelArea.Offset(-offset.x, -offset.y);
  const bool partial = pixmapArea != bounds;

  // Margins from the fallback are laid down first and the read goes over them.
  const bool marginsFromFallback = partial && (fallback != kReadNothing || mode == 0);
  if (marginsFromFallback) ReadPixmap(pixmap, fallback, kReadNothing, mode, fillValues);

  std::uint32_t plane = 0;
  int walked = 0;
  for (const HostChannelNode* node = choice.node;
       node != nullptr && plane < m && walked < kMaxChannelWalk; node = node->next, ++walked) {
    if (selector == kReadTarget && node->readable == 0) continue;
    ReadPlane(node, pixmap, plane++, channelArea, pixmapArea);
  }
  if (n > m) {
    if (choice.transparency != nullptr) {
      ReadPlane(choice.transparency, pixmap, m, channelArea, pixmapArea);
    } else {
      pixmap.Fill(m, pixmapArea, Opaque(depth));
    }
  }
  if (!partial || marginsFromFallback) return;

  if (mode == kMarginsFill) {
    for (std::uint32_t k = 0; k < n; ++k) {
      const std::uint32_t value = FillValue(fillValues, k);
      pixmap.Fill(k, CRect{bounds.left, bounds.top, bounds.right, pixmapArea.top}, value);
      pixmap.Fill(k, CRect{bounds.left, pixmapArea.bottom, bounds.right, bounds.bottom}, value);
      pixmap.Fill(k, CRect{bounds.left, pixmapArea.top, pixmapArea.left, pixmapArea.bottom}, value);
      pixmap.Fill(k, CRect{pixmapArea.right, pixmapArea.top, bounds.right, pixmapArea.bottom},
                  value);
    }
  } else if (mode == 2 || mode == 3) {
    // The outermost samples that were read, repeated outwards.
    for (std::uint32_t k = 0; k < n; ++k) {
      for (std::int32_t y = bounds.top; y < bounds.bottom; ++y) {
        const std::int32_t sy = std::clamp(y, pixmapArea.top, pixmapArea.bottom - 1);
        const bool rowInside = y == sy;
        for (std::int32_t x = bounds.left; x < bounds.right; ++x) {
          if (rowInside && x == pixmapArea.left) {
            x = pixmapArea.right - 1;  // the read part of the row stays
            continue;
          }
          const std::int32_t sx = std::clamp(x, pixmapArea.left, pixmapArea.right - 1);
          pixmap.SetSample(k, x, y, pixmap.Sample(k, sx, sy));
        }
      }
    }
  }
}

std::int16_t CQuillmarkFilter::Advance() const {
  const HostFilterRecord* record = FilterRecord();
  if (record == nullptr || record->advanceCallback == nullptr) return CQuillmarkError::kParameter;
  return record->advanceCallback();
}

void CQuillmarkFilter::WritePixmap(const CMemoryPixmap& pixmap, const CRect& rect,
                                   std::int32_t planeCount) {
  HostFilterRecord* record = FilterRecord();
  if (record == nullptr) return;
  // Only what both the image and the pixmap hold can go back.
  const CRect area = rect.Intersect(LayerRect()).Intersect(pixmap.Bounds());
  if (!area.IsEmpty()) {
    if (planeCount < 1) planeCount = std::int32_t(pixmap.Planes());
    const auto planes = std::uint32_t(std::min<std::int64_t>(planeCount, pixmap.Planes()));
    const std::uint32_t bytes = BytesPerSample();
    if (pixmap.BytesPerSample() != bytes) throw CError(kDepthMismatchText);

    ClearRequests();
    record->outFirstPlane = 0;
    record->outLastPlane = std::int16_t(planeCount - 1);
    if (record->coordinates32 != nullptr && record->coordinates32->enabled != 0) {
      record->coordinates32->outRect = ToHost32(area);
    } else {
      record->outRect16 = ToHost16(area);
    }
    const std::int16_t code = Advance();
    if (code == kAdvanceCanceled || code == kAdvanceAborted) throw CAbort(true);
    if (code != 0) throw CSystemError(code);

    if (auto* out = static_cast<std::uint8_t*>(record->outData)) {
      const auto width = std::size_t(area.Width());
      const auto stride = std::size_t(planeCount);
      for (std::int32_t y = area.top; y < area.bottom; ++y) {
        std::uint8_t* to = out + std::ptrdiff_t(y - area.top) * record->outRowBytes;
        if (planes <= kMaxPlanes && (bytes == 1 || bytes == 2)) {
          std::array<const std::uint8_t*, kMaxPlanes> from{};
          for (std::uint32_t k = 0; k < planes; ++k) from[k] = pixmap.Address(k, area.left, y);
          if (bytes == 2) {
            std::array<const std::uint16_t*, kMaxPlanes> wide{};
            for (std::uint32_t k = 0; k < planes; ++k)
              wide[k] = reinterpret_cast<const std::uint16_t*>(from[k]);
            PlanesToPixels<std::uint16_t>({wide.data(), planes}, width, stride,
                                          reinterpret_cast<std::uint16_t*>(to));
          } else {
            PlanesToPixels<std::uint8_t>({from.data(), planes}, width, stride, to);
          }
          continue;
        }
        for (std::uint32_t k = 0; k < planes; ++k) {
          const std::uint8_t* from = pixmap.Address(k, area.left, y);
          for (std::size_t x = 0; x < width; ++x)
            std::memcpy(to + (x * stride + k) * bytes, from + x * bytes, bytes);
        }
      }
    }
  }
  ClearRequests();
  Advance();
}

void CQuillmarkFilter::ConvertToDisplay(std::int32_t mode, const CBasicPixmap& source,
                                        const CRect& area, CBasicPixmap& destination, CPoint to) {
  // Acquired for the one call: the suite is cheap to find, and a call made
  // while no record is at hand simply takes the module's own formulas.
  const auto* suite = static_cast<const HostDisplayColourSuite*>(
      AcquireSuite(kDisplayColourSuite, kDisplayColourSuiteVersion));
  struct Release {
    CQuillmarkFilter* filter;
    bool held;
    ~Release() {
      if (held) filter->ReleaseSuite(kDisplayColourSuite, kDisplayColourSuiteVersion);
    }
  } release{this, suite != nullptr};
  CDisplayConversion(suite).Convert(mode, source, area, destination, to);
}

}  // namespace Tarsa
