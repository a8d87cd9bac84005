#include "params/PPreferences.h"

#include <algorithm>
#include <string>
#include <system_error>

#include "framework/core/CException.h"
#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"
#include "framework/files/CMemoryContainer.h"
#include "framework/strings/CString.h"
#include "params/PreferencesDirectory.h"

namespace Project {

namespace {

constexpr std::uint64_t kHeaderSize = 20;
constexpr std::uint64_t kChunkHeaderSize = 16;  // after the owner word
// The shortest length field that can hold a chunk list.
constexpr std::uint32_t kMinimumLength = 5;
// A real file is a few hundred bytes; anything far larger is not ours and is
// not worth reading into memory.
constexpr std::uint64_t kMaximumFileSize = 1 << 20;

void WriteString(Tarsa::CStream& out, const Tarsa::CString& text) {
  out.WriteU32(static_cast<std::uint32_t>(text.ByteLength()));
  if (!text.IsEmpty()) out.Write(text.c_str(), text.ByteLength());
}

Tarsa::CString ReadString(Tarsa::CContainer& in) {
  const std::uint32_t length = in.ReadU32();
  // A damaged length must fail before it allocates.
  if (length > in.Size() - in.Position()) throw Tarsa::CContainer::EndOfData();
  std::string text(length, '\0');
  if (length != 0) in.Read(text.data(), length);
  return Tarsa::CString(std::move(text));
}

// Only Fisheye, Perspective and Full Spherical are stored as they are; every
// other value stands for Auto.
std::int32_t StoredModel(std::int32_t model) {
  return model == PSettings::kModelFisheye || model == PSettings::kModelPerspective ||
                 model == PSettings::kModelFullSpherical
             ? model
             : PSettings::kModelAuto;
}

void WriteChunk(Tarsa::CStream& out, std::uint32_t id, std::uint32_t version,
                const Tarsa::CMemoryContainer& payload) {
  out.WriteU32(PPreferences::kOwner);
  out.WriteU32(id);
  out.WriteU32(0);
  out.WriteU32(version);
  out.WriteU32(static_cast<std::uint32_t>(payload.Size()));
  out.WriteAll(payload);
}

std::uint32_t ReverseBytes(std::uint32_t value) {
  return (value >> 24) | ((value >> 8) & 0xFF00) | ((value << 8) & 0xFF0000) | (value << 24);
}

}  // namespace

PPreferences::PPreferences(std::int32_t imageWidth) : settings(imageWidth) {}

void PPreferences::Load() {
  Tarsa::CDirectory directory;
  if (GetPreferencesDirectory(directory)) Load(directory);
}

void PPreferences::Save() const {
  Tarsa::CDirectory directory;
  if (GetPreferencesDirectory(directory)) Save(directory);
}

void PPreferences::Load(const Tarsa::CDirectory& directory) {
  try {
    Tarsa::CFileContainer file(Tarsa::CFile(directory, kFileName, false));
    if (file.Size() > kMaximumFileSize) return;
    Tarsa::CMemoryContainer bytes;
    file.ReadInto(bytes, static_cast<std::uint32_t>(file.Size()));
    Read(bytes);
  } catch (const Tarsa::CException&) {
    // Missing or unreadable: the fields stand.
  }
}

void PPreferences::Save(const Tarsa::CDirectory& directory) const {
  Tarsa::CMemoryContainer bytes;
  Write(bytes);
  // Written whole under a side name and then renamed over the old file, so
  // that a crash leaves either the old file or the new one, never a part.
  const std::string name = Tarsa::ResolveText(kFileName).Str();
  Tarsa::CFile temporary;
  try {
    temporary = Tarsa::CFile(directory, Tarsa::CString(name + ".tmp"), true);
    {
      Tarsa::CFileContainer out(temporary, Tarsa::CFilePort::kMode_ReadWrite);
      out.SetSize(0);
      out.WriteAll(bytes);
      out.Flush();
    }
    temporary.Rename(directory.GetPath() + name);
    return;
  } catch (const Tarsa::CException&) {
    // Not reported: the old file stays.
  }
  try {
    if (temporary.Exists()) temporary.Delete();
  } catch (const Tarsa::CException&) {
  }
}

void PPreferences::Write(Tarsa::CStream& out) const {
  Tarsa::CMemoryContainer body;
  body.SetSwapBytes(out.SwapBytes());

  Tarsa::CMemoryContainer payload;
  payload.SetSwapBytes(out.SwapBytes());
  payload.WriteU32(displayFlags);
  WriteChunk(body, kDisplayFlagsChunk, 0, payload);

  payload.SetSize(0);
  for (std::int32_t value : windowLocation) payload.WriteI32(value);
  WriteChunk(body, kLocationChunk, 0, payload);

  payload.SetSize(0);
  WriteSettings(payload);
  WriteChunk(body, kSettingsChunk, kSettingsVersion, payload);

  body.WriteU32(0);  // end of the chunk list

  out.WriteU32(kMagic);
  out.WriteU32(kOwner);
  out.WriteU32(0);
  out.WriteU32(0);  // high word of the length
  out.WriteU32(static_cast<std::uint32_t>(body.Size()));
  out.WriteAll(body);
}

bool PPreferences::Read(Tarsa::CContainer& in) {
  try {
    if (in.Size() <= kHeaderSize) return false;
    in.SetPosition(0);
    in.SetSwapBytes(false);
    const std::uint32_t magic = in.ReadU32();
    if (magic != kMagic) {
      if (ReverseBytes(magic) != kMagic) return false;
      in.SetSwapBytes(true);
    }
    if (in.ReadU32() != kOwner) return false;
    in.ReadU32();  // reserved
    if (in.ReadU32() != 0) return false;
    const std::uint32_t length = in.ReadU32();
    if (length < kMinimumLength) return false;

    const std::uint64_t end = std::min<std::uint64_t>(in.Size(), kHeaderSize + length);
    while (end - in.Position() >= 4) {
      const std::uint32_t owner = in.ReadU32();
      if (owner == 0) break;
      if (end - in.Position() < kChunkHeaderSize) break;
      const std::uint32_t id = in.ReadU32();
      in.ReadU32();  // reserved
      const std::uint32_t version = in.ReadU32();
      const std::uint32_t size = in.ReadU32();
      if (size > end - in.Position()) break;
      if (owner != kOwner) {
        in.SkipRead(size);
        continue;
      }
      Tarsa::CMemoryContainer payload;
      in.ReadInto(payload, size);
      try {
        ReadChunk(id, version, payload);
      } catch (const Tarsa::CException&) {
        break;  // a chunk shorter than its contents: the rest is suspect too
      }
    }
  } catch (const Tarsa::CException&) {
    // Cut short: the chunks read whole so far stand.
  }
  return true;
}

void PPreferences::ReadChunk(std::uint32_t id, std::uint32_t version, Tarsa::CContainer& payload) {
  if (id == kDisplayFlagsChunk && version == 0) {
    displayFlags = payload.ReadU32();
  } else if (id == kLocationChunk && version == 0) {
    WindowLocation location;
    for (std::int32_t& value : location) value = payload.ReadI32();
    windowLocation = location;
  } else if (id == kSettingsChunk && version <= kSettingsVersion) {
    ReadSettings(version, payload);
  }
}

void PPreferences::WriteSettings(Tarsa::CStream& out) const {
  const PSettings& s = settings;
  out.WriteByte(s.reservedFlagA);
  out.WriteU16(s.reservedWord);
  out.WriteByte(s.reservedFlagB);
  out.WriteByte(s.reservedFlagC);
  out.WriteByte(s.reservedFlagD);
  out.WriteI32(s.reservedValueA);
  out.WriteI32(s.reservedValueB);
  out.WriteU32(s.colorUnfixed);
  out.WriteU32(s.colorHorizontal);
  out.WriteU32(s.colorVertical);
  out.WriteU32(s.colorInvalid);
  out.WriteU32(s.colorFixed);
  out.WriteU32(s.colorMesh);
  out.WriteByte(s.reservedFlagE);
  out.WriteByte(s.meshVisible);
  out.WriteU16(s.iterationNumber);
  out.WriteFloat(s.focalLength);
  out.WriteFloat(s.physicalFocal);
  out.WriteFloat(s.cropFactor);
  out.WriteI32(StoredModel(s.projectionModel));
  out.WriteByte(s.previewResult);
  out.WriteByte(s.constraintsVisible);
  out.WriteByte(s.confirmCalibration);
  out.WriteByte(s.reservedFlagG);
  WriteString(out, s.lastLoadDirectory);
  out.WriteByte(s.loupeVisible);
  out.WriteI32(s.loupeSize);
}

void PPreferences::ReadSettings(std::uint32_t version, Tarsa::CContainer& payload) {
  // Read into a copy and taken over only when whole.
  PSettings s(settings);
  s.reservedFlagA = payload.ReadByte();
  s.reservedWord = payload.ReadU16();
  s.reservedFlagB = payload.ReadByte();
  s.reservedFlagC = payload.ReadByte();
  s.reservedFlagD = payload.ReadByte();
  s.reservedValueA = payload.ReadI32();
  s.reservedValueB = payload.ReadI32();
  s.colorUnfixed = payload.ReadU32();
  s.colorHorizontal = payload.ReadU32();
  s.colorVertical = payload.ReadU32();
  s.colorInvalid = payload.ReadU32();
  s.colorFixed = payload.ReadU32();
  s.colorMesh = payload.ReadU32();
  payload.ReadByte();  // reservedFlagE is never taken from the file
  s.reservedFlagE = 0;
  s.meshVisible = payload.ReadByte();
  const std::uint16_t iterationNumber = payload.ReadU16();
  s.focalLength = payload.ReadFloat();
  s.physicalFocal = payload.ReadFloat();
  s.cropFactor = payload.ReadFloat();
  s.projectionModel = StoredModel(payload.ReadI32());
  s.previewResult = payload.ReadByte();
  s.constraintsVisible = payload.ReadByte();
  s.confirmCalibration = payload.ReadByte();
  s.reservedFlagG = payload.ReadByte();
  s.lastLoadDirectory = ReadString(payload);
  if (version >= 1) {
    s.loupeVisible = payload.ReadByte();
    s.loupeSize = payload.ReadI32();
  }
  settings = s;
  settings.version = version;
  // Read back, though a run's settings never take it over from here.
  settings.iterationNumber = iterationNumber;
}

}  // namespace Project
