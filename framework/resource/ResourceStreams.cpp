#include "framework/resource/ResourceStreams.h"

namespace Tarsa {

void WriteFourChar(CStream& out, std::uint32_t code) { out.WriteU32(code); }

void WriteZeroEndedText(CStream& out, std::string_view text) {
  out.Write(text.data(), text.size());
  out.WriteByte(0);
}

void PadTo(CContainer& out, std::size_t multiple, std::uint64_t from) {
  if (multiple == 0 || from > out.Position()) {
    throw CError(
        "$$$/Tarsa/Resource/Error/BadPadding=Padding was asked for outside the bytes "
        "written.");
  }
  while ((out.Position() - from) % multiple != 0) out.WriteByte(0);
}

void PatchU32(CContainer& out, std::uint64_t offset, std::uint32_t value) {
  if (offset > out.Size() || out.Size() - offset < sizeof value) {
    throw CError(
        "$$$/Tarsa/Resource/Error/PatchOutside=A value was patched outside the bytes "
        "written.");
  }
  const std::uint64_t resume = out.Position();
  out.SetPosition(offset);
  out.WriteU32(value);
  out.SetPosition(resume);
}

std::vector<std::uint8_t> ContentsOf(const CMemoryContainer& container) {
  const std::uint8_t* data = container.Data();
  return std::vector<std::uint8_t>(data, data + container.Block().Size());
}

}  // namespace Tarsa
