#pragma once

#include <cstdint>

namespace Host {

// The codes the host answers the filter with. 0 is success everywhere; the
// named system codes are the ones the filter knows by number (it turns -128
// into a silent cancel); the last three are the host's own.
struct HostCodes {
  static constexpr int16_t kNoError = 0;
  static constexpr int16_t kParamErr = -50;
  static constexpr int16_t kMemFullErr = -108;
  static constexpr int16_t kNilHandleErr = -109;
  static constexpr int16_t kMemWZErr = -111;
  static constexpr int16_t kUserCanceled = -128;
  // A property, suite or suite entry the host does not offer.
  static constexpr int16_t kNotAvailable = -1;
  // A descriptor has no such key, or holds it with another type.
  static constexpr int16_t kNoSuchKey = -2;
  static constexpr int16_t kWrongType = -3;
};

}  // namespace Host
