#include "host/plugin/MemoryHandles.h"

#include <cstring>
#include <new>
#include <vector>

#include "host/plugin/HostCodes.h"

namespace Host {

namespace {

struct Block {
  // Catches a pointer that is not a handle, or one already disposed whose
  // memory has not been reused yet.
  static constexpr uint32_t kMagic = 0x48646c65;
  uint32_t magic = kMagic;
  int32_t locks = 0;
  std::vector<uint8_t> bytes;
};

Block* BlockOf(Tarsa::HostHandle handle) {
  auto* block = reinterpret_cast<Block*>(handle);
  return block != nullptr && block->magic == Block::kMagic ? block : nullptr;
}

Tarsa::HostHandle NewHandle(int32_t size) { return MemoryHandles::New(size); }

void DisposeHandle(Tarsa::HostHandle handle) { MemoryHandles::Dispose(handle); }

int32_t HandleSize(Tarsa::HostHandle handle) {
  const Block* block = BlockOf(handle);
  return block != nullptr ? static_cast<int32_t>(block->bytes.size()) : 0;
}

Tarsa::HostError SetHandleSize(Tarsa::HostHandle handle, int32_t size) {
  Block* block = BlockOf(handle);
  if (block == nullptr) return HostCodes::kNilHandleErr;
  if (size < 0) return HostCodes::kParamErr;
  if (block->locks > 0 && static_cast<size_t>(size) > block->bytes.size()) {
    return HostCodes::kMemFullErr;
  }
  try {
    block->bytes.resize(static_cast<size_t>(size));
  } catch (const std::bad_alloc&) {
    return HostCodes::kMemFullErr;
  }
  return HostCodes::kNoError;
}

char* LockHandle(Tarsa::HostHandle handle, uint8_t) {
  Block* block = BlockOf(handle);
  if (block == nullptr) return nullptr;
  ++block->locks;
  return reinterpret_cast<char*>(block->bytes.data());
}

void UnlockHandle(Tarsa::HostHandle handle) {
  Block* block = BlockOf(handle);
  if (block != nullptr && block->locks > 0) --block->locks;
}

void RecoverSpace(int32_t) {}

constexpr Tarsa::HostHandleProcs kProcs = {
    {1, 8},     NewHandle,    DisposeHandle, HandleSize,    SetHandleSize,
    LockHandle, UnlockHandle, RecoverSpace,  DisposeHandle,
};

}  // namespace

const Tarsa::HostHandleProcs* MemoryHandles::Procs() { return &kProcs; }

Tarsa::HostHandle MemoryHandles::New(int32_t size) {
  if (size < 0) return nullptr;
  auto* block = new (std::nothrow) Block;
  if (block == nullptr) return nullptr;
  try {
    block->bytes.resize(static_cast<size_t>(size));
  } catch (const std::bad_alloc&) {
    delete block;
    return nullptr;
  }
  return reinterpret_cast<Tarsa::HostHandle>(block);
}

Tarsa::HostHandle MemoryHandles::FromBytes(std::span<const uint8_t> bytes) {
  if (bytes.size() > INT32_MAX) return nullptr;
  Tarsa::HostHandle handle = New(static_cast<int32_t>(bytes.size()));
  if (handle != nullptr && !bytes.empty()) {
    std::memcpy(BlockOf(handle)->bytes.data(), bytes.data(), bytes.size());
  }
  return handle;
}

std::span<uint8_t> MemoryHandles::Bytes(Tarsa::HostHandle handle) {
  Block* block = BlockOf(handle);
  if (block == nullptr) return {};
  return block->bytes;
}

bool MemoryHandles::IsHandle(Tarsa::HostHandle handle) { return BlockOf(handle) != nullptr; }

void MemoryHandles::Dispose(Tarsa::HostHandle handle) {
  Block* block = BlockOf(handle);
  if (block == nullptr) return;
  block->magic = 0;
  delete block;
}

}  // namespace Host
