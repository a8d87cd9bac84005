#pragma once

#include <cstdint>
#include <string>

#include "framework/core/CException.h"

namespace Tarsa {

// A failure the host reported by one of its error codes (handles, buffers,
// suites). A selector answers the host with the code itself and shows
// nothing, since the host reports its own errors; the text is for when the
// framework has to show it anyway.
class CQuillmarkError : public CException {
 public:
  static constexpr std::int16_t kUserCanceled = -128;
  static constexpr std::int16_t kFreeBlock = -111;
  static constexpr std::int16_t kNilHandle = -109;
  static constexpr std::int16_t kMemoryFull = -108;
  static constexpr std::int16_t kParameter = -50;

  explicit CQuillmarkError(std::int16_t code);

  std::int16_t Code() const { return code_; }
  // The keyed text of the code; unknown codes share one text.
  std::string ErrorText() const override;
  static std::string TextFor(std::int16_t code);

 private:
  std::int16_t code_;
};

}  // namespace Tarsa
