#pragma once

#include <array>
#include <cstdint>

#include "framework/files/CContainer.h"
#include "framework/files/CDirectory.h"
#include "framework/files/CStream.h"
#include "framework/resource/FourCharCode.h"
#include "params/PSettings.h"

namespace Project {

// What the filter remembers between runs: display flags, where the dialog
// window stood, and the user settings of the last run. It owns its fields and
// lives on disk as "Archway Prefs.qmp" in the preferences directory.
//
// The file is a header (magic 'Trsa', kind 'AXCo', reserved, 64-bit length
// of what follows) and a list of chunks (owner, id, reserved, version,
// payload size, payload) ended by a zero owner, every value in the writing
// machine's byte order. A reader that finds the magic reversed reads the
// rest reversed. Chunks of other owners and versions this reader does not
// know are stepped over. Strings are a u32 byte length and the UTF-8 bytes.
class PPreferences {
 public:
  using WindowLocation = std::array<std::int32_t, 4>;

  static constexpr const char kFileName[] = "$$$/Archway/Prefs/FileName=Archway Prefs.qmp";
  static constexpr std::uint32_t kMagic = Tarsa::FourCharCode("Trsa");
  static constexpr std::uint32_t kOwner = Tarsa::FourCharCode("AXCo");
  static constexpr std::uint32_t kDisplayFlagsChunk = Tarsa::FourCharCode("DFlg");
  static constexpr std::uint32_t kLocationChunk = Tarsa::FourCharCode("DLoc");
  static constexpr std::uint32_t kSettingsChunk = Tarsa::FourCharCode("BSet");
  static constexpr std::uint32_t kSettingsVersion = 1;
  static constexpr std::uint32_t kDefaultDisplayFlags = 3;
  // Two corner pairs that mean "not placed yet".
  static constexpr WindowLocation kUnplacedWindow = {-100, -100, -50, -33};

  explicit PPreferences(std::int32_t imageWidth);
  PPreferences(const PPreferences&) = delete;
  PPreferences& operator=(const PPreferences&) = delete;

  // From and to the preferences directory. Nothing is reported: a missing,
  // short or foreign file leaves the fields as they are, and a failed save
  // leaves the old file in place.
  void Load();
  void Save() const;
  // The same in a given directory.
  void Load(const Tarsa::CDirectory& directory);
  void Save(const Tarsa::CDirectory& directory) const;

  // The whole file into out, at its position, in out's byte order.
  void Write(Tarsa::CStream& out) const;
  // The whole file from in, starting at position 0. Answers false when the
  // header is refused; a damaged chunk is dropped and the walk ends there.
  bool Read(Tarsa::CContainer& in);

  std::uint32_t displayFlags = kDefaultDisplayFlags;  // bit 0 preview, bit 1 variant
  WindowLocation windowLocation = kUnplacedWindow;
  PSettings settings;

 private:
  void ReadChunk(std::uint32_t id, std::uint32_t version, Tarsa::CContainer& payload);
  void WriteSettings(Tarsa::CStream& out) const;
  void ReadSettings(std::uint32_t version, Tarsa::CContainer& payload);
};

}  // namespace Project
