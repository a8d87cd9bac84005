#include "host/plugin/DescriptorSuite.h"

#include <cstring>
#include <memory>
#include <new>

#include "host/io/HostError.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/MemoryHandles.h"

namespace Host {

namespace {

using Type = Descriptor::Type;

Descriptor* Mutable(Tarsa::HostDescriptor descriptor) {
  return reinterpret_cast<Descriptor*>(descriptor);
}

// The item under a key with the expected type, and the code for why not.
const Descriptor::Item* Lookup(Tarsa::HostDescriptor descriptor, uint32_t key, Type type,
                               Tarsa::HostStatus* status) {
  const Descriptor* d = DescriptorSuite::Of(descriptor);
  if (d == nullptr) {
    *status = HostCodes::kParamErr;
    return nullptr;
  }
  const Descriptor::Item* item = d->Find(key);
  if (item == nullptr) {
    *status = HostCodes::kNoSuchKey;
  } else if (item->type != type) {
    *status = HostCodes::kWrongType;
    item = nullptr;
  } else {
    *status = HostCodes::kNoError;
  }
  return item;
}

Tarsa::HostStatus Make(Tarsa::HostDescriptor* descriptor) {
  if (descriptor == nullptr) return HostCodes::kParamErr;
  *descriptor = reinterpret_cast<Tarsa::HostDescriptor>(new (std::nothrow) Descriptor);
  return *descriptor != nullptr ? HostCodes::kNoError : HostCodes::kMemFullErr;
}

Tarsa::HostStatus Free(Tarsa::HostDescriptor descriptor) {
  delete Mutable(descriptor);
  return HostCodes::kNoError;
}

Tarsa::HostStatus KeyAt(Tarsa::HostDescriptor descriptor, uint32_t index, uint32_t* key) {
  const Descriptor* d = DescriptorSuite::Of(descriptor);
  if (d == nullptr || key == nullptr || index >= d->Count()) return HostCodes::kParamErr;
  *key = d->Items()[index].key;
  return HostCodes::kNoError;
}

Tarsa::HostStatus Count(Tarsa::HostDescriptor descriptor, uint32_t* count) {
  const Descriptor* d = DescriptorSuite::Of(descriptor);
  if (d == nullptr || count == nullptr) return HostCodes::kParamErr;
  *count = static_cast<uint32_t>(d->Count());
  return HostCodes::kNoError;
}

Tarsa::HostStatus PutInteger(Tarsa::HostDescriptor descriptor, uint32_t key, int32_t value) {
  if (descriptor == nullptr) return HostCodes::kParamErr;
  Mutable(descriptor)->PutInteger(key, value);
  return HostCodes::kNoError;
}

Tarsa::HostStatus PutFloat(Tarsa::HostDescriptor descriptor, uint32_t key, double value) {
  if (descriptor == nullptr) return HostCodes::kParamErr;
  Mutable(descriptor)->PutFloat(key, value);
  return HostCodes::kNoError;
}

Tarsa::HostStatus PutEnumerated(Tarsa::HostDescriptor descriptor, uint32_t key, uint32_t type,
                                uint32_t value) {
  if (descriptor == nullptr) return HostCodes::kParamErr;
  Mutable(descriptor)->PutEnumerated(key, type, value);
  return HostCodes::kNoError;
}

Tarsa::HostStatus GetInteger(Tarsa::HostDescriptor descriptor, uint32_t key, int32_t* value) {
  Tarsa::HostStatus status;
  const auto* item = Lookup(descriptor, key, Type::kInteger, &status);
  if (item != nullptr && value != nullptr) *value = item->integer;
  return value != nullptr ? status : HostCodes::kParamErr;
}

Tarsa::HostStatus GetFloat(Tarsa::HostDescriptor descriptor, uint32_t key, double* value) {
  Tarsa::HostStatus status;
  const auto* item = Lookup(descriptor, key, Type::kFloat, &status);
  if (item != nullptr && value != nullptr) *value = item->number;
  return value != nullptr ? status : HostCodes::kParamErr;
}

Tarsa::HostStatus GetEnumerated(Tarsa::HostDescriptor descriptor, uint32_t key, uint32_t* type,
                                uint32_t* value) {
  if (type == nullptr || value == nullptr) return HostCodes::kParamErr;
  Tarsa::HostStatus status;
  const auto* item = Lookup(descriptor, key, Type::kEnumerated, &status);
  if (item != nullptr) {
    *type = item->enumType;
    *value = item->enumValue;
  }
  return status;
}

Tarsa::HostStatus AsHandle(Tarsa::HostDescriptor descriptor, Tarsa::HostHandle* handle) {
  const Descriptor* d = DescriptorSuite::Of(descriptor);
  if (d == nullptr || handle == nullptr) return HostCodes::kParamErr;
  try {
    *handle = MemoryHandles::FromBytes(d->ToBytes());
  } catch (const std::bad_alloc&) {
    *handle = nullptr;
  }
  return *handle != nullptr ? HostCodes::kNoError : HostCodes::kMemFullErr;
}

Tarsa::HostStatus FromHandle(Tarsa::HostHandle handle, Tarsa::HostDescriptor* descriptor) {
  if (descriptor == nullptr) return HostCodes::kParamErr;
  *descriptor = nullptr;
  if (!MemoryHandles::IsHandle(handle)) return HostCodes::kNilHandleErr;
  try {
    auto parsed = std::make_unique<Descriptor>(Descriptor::FromBytes(MemoryHandles::Bytes(handle)));
    *descriptor = reinterpret_cast<Tarsa::HostDescriptor>(parsed.release());
  } catch (const HostError&) {
    return HostCodes::kParamErr;
  } catch (const std::bad_alloc&) {
    return HostCodes::kMemFullErr;
  }
  return HostCodes::kNoError;
}

Tarsa::HostStatus PutData(Tarsa::HostDescriptor descriptor, uint32_t key, int32_t length,
                          const void* bytes) {
  if (descriptor == nullptr || length < 0 || (length > 0 && bytes == nullptr)) {
    return HostCodes::kParamErr;
  }
  Mutable(descriptor)
      ->PutData(key, std::span(static_cast<const uint8_t*>(bytes), static_cast<size_t>(length)));
  return HostCodes::kNoError;
}

Tarsa::HostStatus GetDataLength(Tarsa::HostDescriptor descriptor, uint32_t key, int32_t* length) {
  if (length == nullptr) return HostCodes::kParamErr;
  Tarsa::HostStatus status;
  const auto* item = Lookup(descriptor, key, Type::kData, &status);
  if (item != nullptr) *length = static_cast<int32_t>(item->data.size());
  return status;
}

Tarsa::HostStatus GetData(Tarsa::HostDescriptor descriptor, uint32_t key, void* bytes) {
  Tarsa::HostStatus status;
  const auto* item = Lookup(descriptor, key, Type::kData, &status);
  if (item == nullptr) return status;
  if (bytes == nullptr && !item->data.empty()) return HostCodes::kParamErr;
  if (!item->data.empty()) std::memcpy(bytes, item->data.data(), item->data.size());
  return HostCodes::kNoError;
}

Tarsa::HostDescriptorSuite MakeTable() {
  Tarsa::HostDescriptorSuite table = {};
  table.make = Make;
  table.free = Free;
  table.keyAt = KeyAt;
  table.count = Count;
  table.putInteger = PutInteger;
  table.putFloat = PutFloat;
  table.putEnumerated = PutEnumerated;
  table.getInteger = GetInteger;
  table.getFloat = GetFloat;
  table.getEnumerated = GetEnumerated;
  table.asHandle = AsHandle;
  table.fromHandle = FromHandle;
  table.putData = PutData;
  table.getDataLength = GetDataLength;
  table.getData = GetData;
  return table;
}

}  // namespace

const Tarsa::HostDescriptorSuite* DescriptorSuite::Table() {
  static const Tarsa::HostDescriptorSuite table = MakeTable();
  return &table;
}

const Descriptor* DescriptorSuite::Of(Tarsa::HostDescriptor descriptor) {
  return reinterpret_cast<const Descriptor*>(descriptor);
}

}  // namespace Host
