#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

#include "framework/core/CException.h"
#include "framework/files/CContainer.h"
#include "framework/files/CMemoryContainer.h"
#include "framework/files/CStream.h"

namespace Tarsa {

// The resource formats (the resource table, the property list, the scripting
// terminology) are little-endian throughout. They are written into a
// CMemoryContainer and read from a CConstContainer with the stream's typed
// readers and writers in machine order, SwapBytes off; a big-endian machine
// would have to set it on every such stream.
static_assert(std::endian::native == std::endian::little,
              "resource streams rely on machine order being little-endian");

// The layout conventions those formats share, over the framework's streams.

// A four-character code as a little-endian 32-bit value: "QMRK" lies on disk
// as the bytes K R M Q.
void WriteFourChar(CStream& out, std::uint32_t code);
// The text's bytes, then one zero byte.
void WriteZeroEndedText(CStream& out, std::string_view text);
// Zero bytes until the bytes written since offset `from` are a multiple of
// `multiple`. A zero multiple, or a `from` past the position, is CError.
void PadTo(CContainer& out, std::size_t multiple, std::uint64_t from = 0);
// Overwrites a 32-bit value written earlier at `offset`, for a length or count
// known only later, and returns to where writing was. CError when those four
// bytes were never written.
void PatchU32(CContainer& out, std::uint64_t offset, std::uint32_t value);
// The bytes built in a memory container, as the generator and the tests take
// them.
std::vector<std::uint8_t> ContentsOf(const CMemoryContainer& container);

// Runs read, turning the container's end-of-data error into damagedText: a
// blob that ends too early is damaged, and its reader says so in the format's
// own words. Every other error passes unchanged.
template <class Read>
void ReadOrDamaged(const char* damagedText, Read&& read) {
  try {
    read();
  } catch (const CError& error) {
    if (error.ErrorText() == CContainer::kEndOfDataText) throw CError(damagedText);
    throw;
  }
}

}  // namespace Tarsa
