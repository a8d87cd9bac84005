#pragma once

#include <cstdint>
#include <cstring>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "framework/plugin/HostFilterRecord.h"
#include "framework/plugin/HostSuites.h"

namespace Tarsa::testing {

// A host in a test: a record with its callback tables, properties, handles,
// named suites, and a tiny document of planes that the channel callbacks
// read and the advance callback writes. The C callbacks reach the one live
// host through a pointer of the test's own.
class TestHost {
 public:
  TestHost() {
    Live() = this;
    record.coordinates32 = &coords;
    record.propertyProcs = &propertyProcs;
    record.handleProcs = &handleProcs;
    record.suiteAccess = &suiteAccess;
    record.channelProcs = &channelProcs;
    record.scriptBlock = &scriptBlock;
    record.advanceCallback = &Advance;
    propertyProcs = {{0, 2}, &GetProperty, &SetProperty};
    handleProcs = {{0, 8}, &NewHandle, &DisposeHandle, &HandleSize,   nullptr,
                   &Lock,  &Unlock,    nullptr,        &DisposeHandle};
    suiteAccess = {{0, 2}, &Acquire, &Release};
    channelProcs = {{0, 1}, &ReadPixels};
  }
  ~TestHost() {
    for (auto* h : liveHandles) delete h;
    Live() = nullptr;
  }
  TestHost(const TestHost&) = delete;
  TestHost& operator=(const TestHost&) = delete;

  static TestHost*& Live() {
    static TestHost* live = nullptr;
    return live;
  }

  // --- Document ------------------------------------------------------------------
  // A document of mode with random samples (fixed seed): the colour planes,
  // then a transparency plane when asked. The filter's record gets the sizes
  // in the 32-bit block when use32 (the 16-bit fields then hold nonsense),
  // else in the 16-bit fields.
  void MakeDocument(std::int16_t mode, std::int32_t width, std::int32_t height, bool transparency,
                    bool use32 = false, std::uint32_t seed = 7) {
    depth = (mode >= 10 && mode <= 15) ? 16 : 8;
    colorPlanes = (mode == 3 || mode == 9 || mode == 11 || mode == 12) ? 3
                  : (mode == 4 || mode == 13)                          ? 4
                                                                       : 1;
    docWidth = width;
    docHeight = height;
    const int count = colorPlanes + (transparency ? 1 : 0);
    std::mt19937 random(seed);
    const std::uint32_t full = depth == 16 ? 32768 : 255;
    planes.assign(count, std::vector<std::uint32_t>(std::size_t(width) * height));
    for (auto& plane : planes) {
      for (auto& v : plane) v = random() % (full + 1);
    }
    nodes.assign(count, HostChannelNode{});
    for (int k = 0; k < count; ++k) {
      nodes[k].port = reinterpret_cast<HostChannelPort>(std::intptr_t(k + 1));
      nodes[k].bounds = HostRect32{0, 0, height, width};
      nodes[k].readable = 1;
      nodes[k].next = (k + 1 < colorPlanes) ? &nodes[k + 1] : nullptr;
    }
    info = HostDocumentInfo{};
    info.version = 4;
    info.targetCompositeChannels = &nodes[0];
    info.targetTransparency = transparency ? &nodes[colorPlanes] : nullptr;
    info.mergedCompositeChannels = &nodes[0];
    record.documentInfo = &info;
    record.imageMode = mode;
    record.planeCount = std::int16_t(count);
    record.hasAlpha262 = record.hasAlpha272 = transparency ? 1 : 0;
    if (use32) {
      record.imageWidth16 = record.imageHeight16 = -7;
      record.filterRect16 = HostRect16{-7, -7, -7, -7};
      coords.enabled = 1;
      coords.imageWidth = width;
      coords.imageHeight = height;
      coords.filterRect = HostRect32{0, 0, height, width};
      coords.wholeSize = HostPoint32{height, width};
    } else {
      record.imageWidth16 = std::int16_t(width);
      record.imageHeight16 = std::int16_t(height);
      record.filterRect16 = HostRect16{0, 0, std::int16_t(height), std::int16_t(width)};
      record.wholeSize16 = HostPoint16{std::int16_t(height), std::int16_t(width)};
    }
  }
  std::uint32_t& At(int plane, std::int32_t x, std::int32_t y) {
    return planes[plane][std::size_t(y) * docWidth + x];
  }

  // --- Properties ------------------------------------------------------------------
  std::map<std::uint32_t, std::intptr_t> properties;
  std::map<std::uint32_t, std::string> complexProperties;
  std::vector<std::pair<std::uint32_t, std::intptr_t>> propertyWrites;

  // --- Suites ------------------------------------------------------------------------
  void AddSuite(const std::string& name, std::int32_t version, const void* table) {
    suites[name + "#" + std::to_string(version)] = table;
  }
  std::map<std::string, const void*> suites;
  std::vector<std::string> acquired;
  std::vector<std::string> released;

  // --- Handles ---------------------------------------------------------------------
  struct Handle {
    std::vector<char> bytes;
  };
  std::vector<Handle*> liveHandles;
  int disposed = 0;

  HostFilterRecord record{};
  HostCoordinates32 coords{};
  HostPropertyProcs propertyProcs{};
  HostHandleProcs handleProcs{};
  HostSuiteAccess suiteAccess{};
  HostChannelProcs channelProcs{};
  HostScriptBlock scriptBlock{};
  HostDocumentInfo info{};
  std::vector<HostChannelNode> nodes;
  std::vector<std::vector<std::uint32_t>> planes;
  int depth = 8;
  int colorPlanes = 1;
  std::int32_t docWidth = 0;
  std::int32_t docHeight = 0;
  int readCalls = 0;
  HostError readAnswer = 0;
  int advanceCalls = 0;
  std::int16_t advanceAnswer = 0;
  std::int32_t outPadding = 6;  // extra row bytes, so the filter must use the stride

 private:
  static std::uint32_t Load(const std::uint8_t* at, int bytes) {
    if (bytes == 1) return *at;
    std::uint16_t v;
    std::memcpy(&v, at, 2);
    return v;
  }
  static void Store(std::uint8_t* at, int bytes, std::uint32_t value) {
    if (bytes == 1) {
      *at = std::uint8_t(value);
      return;
    }
    const auto v = std::uint16_t(value);
    std::memcpy(at, &v, 2);
  }

  static HostError GetProperty(std::uint32_t signature, std::uint32_t key, std::int32_t,
                               std::intptr_t* simple, HostHandle* complex) {
    TestHost* h = Live();
    if (signature != kHostSignature) return -1;
    if (complex != nullptr) {
      auto it = h->complexProperties.find(key);
      if (it == h->complexProperties.end()) return -1;
      auto* handle = new Handle{std::vector<char>(it->second.begin(), it->second.end())};
      h->liveHandles.push_back(handle);
      *complex = reinterpret_cast<HostHandle>(handle);
      return 0;
    }
    auto it = h->properties.find(key);
    if (it == h->properties.end()) return -1;
    *simple = it->second;
    return 0;
  }
  static HostError SetProperty(std::uint32_t, std::uint32_t key, std::int32_t, std::intptr_t value,
                               HostHandle) {
    Live()->propertyWrites.emplace_back(key, value);
    return 0;
  }
  static HostHandle NewHandle(std::int32_t size) {
    auto* handle = new Handle{std::vector<char>(std::size_t(size))};
    Live()->liveHandles.push_back(handle);
    return reinterpret_cast<HostHandle>(handle);
  }
  static void DisposeHandle(HostHandle h) {
    auto& live = Live()->liveHandles;
    auto* handle = reinterpret_cast<Handle*>(h);
    std::erase(live, handle);
    delete handle;
    ++Live()->disposed;
  }
  static std::int32_t HandleSize(HostHandle h) {
    return std::int32_t(reinterpret_cast<Handle*>(h)->bytes.size());
  }
  static char* Lock(HostHandle h, std::uint8_t) {
    return reinterpret_cast<Handle*>(h)->bytes.data();
  }
  static void Unlock(HostHandle) {}

  static HostStatus Acquire(const char* name, std::int32_t version, const void** suite) {
    TestHost* h = Live();
    const std::string key = std::string(name) + "#" + std::to_string(version);
    auto it = h->suites.find(key);
    if (it == h->suites.end()) return -1;
    h->acquired.push_back(key);
    *suite = it->second;
    return 0;
  }
  static HostStatus Release(const char* name, std::int32_t version) {
    Live()->released.push_back(std::string(name) + "#" + std::to_string(version));
    return 0;
  }

 public:
  // Copies rect of a channel's plane into the described memory.
  static HostError CopyOut(HostChannelPort port, const HostPixelMemoryDesc* desc,
                           const HostRect32* rect) {
    TestHost* h = Live();
    ++h->readCalls;
    if (h->readAnswer != 0) return h->readAnswer;
    const int plane = int(reinterpret_cast<std::intptr_t>(port)) - 1;
    const int bytes = desc->depth / 8;
    auto* base = static_cast<std::uint8_t*>(desc->data);
    for (std::int32_t y = rect->top; y < rect->bottom; ++y) {
      for (std::int32_t x = rect->left; x < rect->right; ++x) {
        std::uint8_t* at = base + std::ptrdiff_t(y - rect->top) * desc->rowBits / 8 +
                           std::ptrdiff_t(x - rect->left) * desc->colBits / 8;
        Store(at, bytes, h->At(plane, x, y));
      }
    }
    return 0;
  }
  static HostError ReadPixels(HostChannelPort port, const HostScaling*, const HostRect32* rect,
                              const HostPixelMemoryDesc* desc, HostRect32* wrote) {
    *wrote = *rect;
    return CopyOut(port, desc, rect);
  }
  static HostError ReadPixelsFromLevel(HostChannelPort port, std::int32_t,
                                       const HostPixelMemoryDesc* desc, const HostRect32* rect) {
    return CopyOut(port, desc, rect);
  }

 private:
  // The host's side of the output: what the filter wrote into the last
  // buffer goes into the document, then the new request gets a buffer
  // holding the document's samples.
  static std::int16_t Advance() {
    TestHost* h = Live();
    ++h->advanceCalls;
    h->Commit();
    const bool use32 = h->record.coordinates32 != nullptr && h->coords.enabled != 0;
    const HostRect32 r = use32 ? h->coords.outRect
                               : HostRect32{h->record.outRect16.top, h->record.outRect16.left,
                                            h->record.outRect16.bottom, h->record.outRect16.right};
    h->record.outData = nullptr;
    if (r.right <= r.left || r.bottom <= r.top) return h->advanceAnswer;
    const int first = h->record.outFirstPlane;
    const int count = h->record.outLastPlane - first + 1;
    const int bytes = h->depth / 8;
    h->pendingRect = r;
    h->pendingFirst = first;
    h->pendingCount = count;
    h->outRowBytes = (r.right - r.left) * count * bytes + h->outPadding;
    h->outBuffer.assign(std::size_t(h->outRowBytes) * (r.bottom - r.top), 0xEE);
    for (std::int32_t y = r.top; y < r.bottom; ++y) {
      for (std::int32_t x = r.left; x < r.right; ++x) {
        for (int k = 0; k < count; ++k) {
          Store(h->OutAt(x, y, k), bytes, h->At(first + k, x, y));
        }
      }
    }
    h->record.outData = h->outBuffer.data();
    h->record.outRowBytes = h->outRowBytes;
    return h->advanceAnswer;
  }
  std::uint8_t* OutAt(std::int32_t x, std::int32_t y, int k) {
    const int bytes = depth / 8;
    return outBuffer.data() + std::ptrdiff_t(y - pendingRect.top) * outRowBytes +
           std::ptrdiff_t((x - pendingRect.left) * pendingCount + k) * bytes;
  }
  void Commit() {
    if (outBuffer.empty()) return;
    const int bytes = depth / 8;
    for (std::int32_t y = pendingRect.top; y < pendingRect.bottom; ++y) {
      for (std::int32_t x = pendingRect.left; x < pendingRect.right; ++x) {
        for (int k = 0; k < pendingCount; ++k) {
          At(pendingFirst + k, x, y) = Load(OutAt(x, y, k), bytes);
        }
      }
    }
    outBuffer.clear();
  }

  std::vector<std::uint8_t> outBuffer;
  HostRect32 pendingRect{};
  int pendingFirst = 0;
  int pendingCount = 0;
  std::int32_t outRowBytes = 0;
};

}  // namespace Tarsa::testing
