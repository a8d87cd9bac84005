#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <variant>
#include <vector>

#include "framework/plugin/HostSuites.h"

namespace Host {

// The host's properties as the filter reads and sets them through the
// record's propertyProcs: simple values answered from the run's settings,
// complex ones (title, scratch volumes) in a new handle the filter disposes
// of. What the host does not offer answers HostCodes::kNotAvailable. Owns its
// settings and the state the filter sets (the watch cursor).
class HostProperties {
 public:
  struct Settings {
    // The host's major version; `vers` answers it in the high 16 bits.
    int32_t majorVersion = 18;
    // Whether the graphics processor is on (bit 7 of `GPUF`).
    bool graphicsProcessor = true;
    // Whether the run has a descriptor to replay (`plip`).
    bool replay = false;
    // The document's title, UTF-8.
    std::string title;
    std::vector<std::string> scratchVolumes;
  };

  // The host's tile size, told to the filter through `TSiz`.
  static constexpr intptr_t kTileSize = 1024;

  explicit HostProperties(Settings settings) : settings_(std::move(settings)) {}

  HostProperties(const HostProperties&) = delete;
  HostProperties& operator=(const HostProperties&) = delete;

  Tarsa::HostError Get(uint32_t signature, uint32_t key, int32_t index, intptr_t* simpleValue,
                       Tarsa::HostHandle* complexValue) const;
  Tarsa::HostError Set(uint32_t signature, uint32_t key, int32_t index, intptr_t simpleValue,
                       Tarsa::HostHandle complexValue);

  // Whether the filter has asked the host to hold its watch cursor.
  bool WatchSuspended() const { return watchSuspended_; }

  // The image file whose metadata `xmpd` serves as an XMP packet, read when
  // asked; with none, `xmpd` is not available.
  void SetDocumentPath(std::string path) { documentPath_ = std::move(path); }

  // A property answered with a chosen simple value or complex bytes instead
  // of the host's own, or withheld (kNotAvailable): for trying a filter
  // against other hosts.
  void Override(uint32_t key, intptr_t simpleValue) { overrides_[key] = simpleValue; }
  void Override(uint32_t key, std::string complexValue) { overrides_[key] = complexValue; }
  void Withhold(uint32_t key) { overrides_[key] = std::monostate(); }

  // UTF-8 to UTF-16 code units; a malformed byte becomes U+FFFD.
  static std::u16string Utf16(const std::string& text);

 private:
  Settings settings_;
  bool watchSuspended_ = false;
  std::string documentPath_;
  std::map<uint32_t, std::variant<std::monostate, intptr_t, std::string>> overrides_;
};

}  // namespace Host
