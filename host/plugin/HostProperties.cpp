#include "host/plugin/HostProperties.h"

#include <cstring>

#include "host/io/MetadataPacket.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/MemoryHandles.h"

namespace Host {

namespace {

using Tarsa::FourCC;

Tarsa::HostError Complex(Tarsa::HostHandle* out, const void* bytes, size_t size) {
  if (out == nullptr) return HostCodes::kParamErr;
  *out = MemoryHandles::FromBytes(std::span(static_cast<const uint8_t*>(bytes), size));
  return *out != nullptr ? HostCodes::kNoError : HostCodes::kMemFullErr;
}

}  // namespace

Tarsa::HostError HostProperties::Get(uint32_t signature, uint32_t key, int32_t,
                                     intptr_t* simpleValue, Tarsa::HostHandle* complexValue) const {
  if (signature != Tarsa::kHostSignature) return HostCodes::kNotAvailable;
  auto simple = [&](intptr_t value) {
    if (simpleValue == nullptr) return HostCodes::kParamErr;
    *simpleValue = value;
    return HostCodes::kNoError;
  };
  if (const auto found = overrides_.find(key); found != overrides_.end()) {
    if (const auto* value = std::get_if<intptr_t>(&found->second)) return simple(*value);
    if (const auto* bytes = std::get_if<std::string>(&found->second)) {
      return Complex(complexValue, bytes->data(), bytes->size());
    }
    return HostCodes::kNotAvailable;
  }
  switch (key) {
    case FourCC("vers"):
      return simple(static_cast<intptr_t>(static_cast<uint32_t>(settings_.majorVersion) << 16));
    case FourCC("GPUF"):
      return simple(settings_.graphicsProcessor ? 0x80 : 0);
    case FourCC("plip"):
      return simple(settings_.replay ? 1 : 0);
    case FourCC("TSiz"):
      return simple(kTileSize);
    case FourCC("zScW"):
      return simple(0);
    case FourCC("tltp"):
      return simple(1);
    // No display scaling, default interface brightness, no high contrast,
    // no light toolbar: the plain look.
    case FourCC("HDPI"):
      return simple(0);
    case FourCC("UIBR"):
      return simple(2);
    case FourCC("HLCR"):
    case FourCC("LGTB"):
      return simple(0);
    case FourCC("wtch"):
      return simple(watchSuspended_ ? 1 : 0);
    case FourCC("unnm"): {
      const std::u16string title = Utf16(settings_.title);
      return Complex(complexValue, title.data(), title.size() * sizeof(char16_t));
    }
    case FourCC("titl"):
      return Complex(complexValue, settings_.title.data(), settings_.title.size());
    case FourCC("svls"): {
      std::string list;
      for (const std::string& volume : settings_.scratchVolumes) {
        list += volume;
        list += '\0';
      }
      return Complex(complexValue, list.data(), list.size());
    }
    case FourCC("xmpd"): {
      if (documentPath_.empty()) return HostCodes::kNotAvailable;
      const std::string packet = MetadataPacket::FromFile(documentPath_);
      return Complex(complexValue, packet.data(), packet.size());
    }
    default:
      return HostCodes::kNotAvailable;
  }
}

Tarsa::HostError HostProperties::Set(uint32_t signature, uint32_t key, int32_t,
                                     intptr_t simpleValue, Tarsa::HostHandle) {
  if (signature != Tarsa::kHostSignature) return HostCodes::kNotAvailable;
  if (key == FourCC("wtch")) {
    watchSuspended_ = simpleValue != 0;
    return HostCodes::kNoError;
  }
  return HostCodes::kNotAvailable;
}

std::u16string HostProperties::Utf16(const std::string& text) {
  std::u16string out;
  const auto* bytes = reinterpret_cast<const unsigned char*>(text.data());
  const size_t size = text.size();
  for (size_t i = 0; i < size;) {
    const unsigned char lead = bytes[i];
    int extra = lead < 0x80         ? 0
                : (lead >> 5) == 6  ? 1
                : (lead >> 4) == 14 ? 2
                : (lead >> 3) == 30 ? 3
                                    : -1;
    char32_t code = extra == 0   ? lead
                    : extra == 1 ? lead & 0x1f
                    : extra == 2 ? lead & 0x0f
                                 : lead & 0x07;
    bool valid = extra >= 0 && i + extra < size;
    for (int k = 1; valid && k <= extra; ++k) {
      valid = (bytes[i + k] & 0xc0) == 0x80;
      code = (code << 6) | (bytes[i + k] & 0x3f);
    }
    // Overlong forms, surrogates and values beyond Unicode are malformed too.
    static constexpr char32_t kSmallest[] = {0, 0x80, 0x800, 0x10000};
    if (valid &&
        (code < kSmallest[extra] || (code >= 0xd800 && code < 0xe000) || code > 0x10ffff)) {
      valid = false;
    }
    if (!valid) {
      out += u'\xfffd';
      ++i;
      continue;
    }
    if (code >= 0x10000) {
      code -= 0x10000;
      out += static_cast<char16_t>(0xd800 + (code >> 10));
      out += static_cast<char16_t>(0xdc00 + (code & 0x3ff));
    } else {
      out += static_cast<char16_t>(code);
    }
    i += static_cast<size_t>(extra) + 1;
  }
  return out;
}

}  // namespace Host
