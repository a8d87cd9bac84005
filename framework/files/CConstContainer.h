#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "framework/core/CException.h"
#include "framework/files/CContainer.h"

namespace Tarsa {

// A read-only container over bytes that somebody else owns and keeps alive
// longer: a section of the loaded module, or a file already read into
// memory. Reads stop at the end of the bytes like any container's; every
// write, write skip and resize is refused with the read-only error and
// changes nothing, since the bytes may lie in read-only memory. ReadView
// hands out the next bytes without copying them, for parsers whose results
// point into the bytes.
class CConstContainer : public CContainer {
 public:
  static constexpr const char* kReadOnlyText =
      "$$$/Tarsa/Container/Error/ReadOnly=The container cannot be written to.";
  static CError ReadOnly() { return CError(kReadOnlyText); }

  explicit CConstContainer(std::span<const std::uint8_t> bytes);

  std::span<const std::uint8_t> Bytes() const { return bytes_; }
  // The next count bytes, as a view into the borrowed bytes; the end-of-data
  // error, with the position left alone, when they are not all there.
  std::span<const std::uint8_t> ReadView(std::size_t count);

  void SkipWrite(std::uint64_t count) override;
  void WriteAt(const void* buffer, std::size_t count, std::uint64_t position) override;

 protected:
  void DoSetSize(std::uint64_t size) override;
  void DoSetPosition(std::uint64_t /*position*/) override {}
  void DoRead(void* buffer, std::size_t count) override;
  void DoWrite(const void* buffer, std::size_t count) override;

 private:
  std::span<const std::uint8_t> bytes_;
};

}  // namespace Tarsa
