#include "host/plugin/HostBuffers.h"

#include <algorithm>
#include <cstdint>
#include <memory>
#include <new>

#include "host/platform/SystemInfo.h"
#include "host/plugin/HostCodes.h"

namespace Host {

namespace {

struct Buffer {
  static constexpr uint32_t kMagic = 0x42756666;
  uint32_t magic = kMagic;
  std::unique_ptr<uint8_t[]> bytes;
};

Buffer* BufferOf(Tarsa::HostBufferID id) {
  auto* buffer = reinterpret_cast<Buffer*>(id);
  return buffer != nullptr && buffer->magic == Buffer::kMagic ? buffer : nullptr;
}

Tarsa::HostError Allocate(int32_t size, Tarsa::HostBufferID* id) {
  if (id == nullptr || size < 0) return HostCodes::kParamErr;
  *id = nullptr;
  auto buffer = std::unique_ptr<Buffer>(new (std::nothrow) Buffer);
  if (buffer == nullptr) return HostCodes::kMemFullErr;
  buffer->bytes.reset(new (std::nothrow) uint8_t[std::max<int32_t>(size, 1)]);
  if (buffer->bytes == nullptr) return HostCodes::kMemFullErr;
  *id = reinterpret_cast<Tarsa::HostBufferID>(buffer.release());
  return HostCodes::kNoError;
}

char* Lock(Tarsa::HostBufferID id, uint8_t) {
  Buffer* buffer = BufferOf(id);
  return buffer != nullptr ? reinterpret_cast<char*>(buffer->bytes.get()) : nullptr;
}

void Unlock(Tarsa::HostBufferID) {}

void Free(Tarsa::HostBufferID id) {
  Buffer* buffer = BufferOf(id);
  if (buffer == nullptr) return;
  buffer->magic = 0;
  delete buffer;
}

// What the host would still lend: half the machine, as for the memory offer.
int32_t Space() {
  return static_cast<int32_t>(std::min<uint64_t>(SystemInfo::PhysicalMemory() / 2, INT32_MAX));
}

void* SuiteAllocate(uint32_t size, uint32_t* actualSize) {
  void* block = ::operator new(std::max<uint32_t>(size, 1), std::nothrow);
  if (actualSize != nullptr) *actualSize = block != nullptr ? size : 0;
  return block;
}

void SuiteRelease(void** block) {
  if (block == nullptr) return;
  ::operator delete(*block);
  *block = nullptr;
}

constexpr Tarsa::HostBufferProcs kProcs = {{1, 5}, Allocate, Lock, Unlock, Free, Space};
constexpr Tarsa::HostBufferSuite kSuite = {SuiteAllocate, SuiteRelease};

}  // namespace

const Tarsa::HostBufferProcs* HostBuffers::Procs() { return &kProcs; }

const Tarsa::HostBufferSuite* HostBuffers::Suite() { return &kSuite; }

}  // namespace Host
