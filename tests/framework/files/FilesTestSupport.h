#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <functional>
#include <vector>

#include "framework/core/CException.h"
#include "tests/support/TestSupport.h"

namespace Tarsa::testing {

using Bytes = std::vector<std::uint8_t>;

constexpr const char* kEndOfData =
    "$$$/Tarsa/Container/Error/EndOfData=The end of data was reached while reading from a "
    "container.";

// Whether action fails with a CError worded exactly text.
inline bool FailsWith(const char* text, const std::function<void()>& action) {
  try {
    action();
  } catch (const CError& e) {
    return e.ErrorText() == text;
  }
  return false;
}

// The code of the CSystemError that action raises; 0 when it raises none.
inline int SystemCode(const std::function<void()>& action) {
  try {
    action();
  } catch (const CSystemError& e) {
    return e.Code();
  }
  return 0;
}

}  // namespace Tarsa::testing
