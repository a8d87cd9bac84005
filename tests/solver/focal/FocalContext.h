#pragma once

#include "tests/support/SolverTestContext.h"

namespace Project {

// A photo of 1200 x 800 at the default settings but for the test context's.
class FocalContext : public testing::SolverTestContext {
 public:
  FocalContext() : SolverTestContext(kWidth, kHeight) {}

  static constexpr std::int32_t kWidth = 1200;
  static constexpr std::int32_t kHeight = 800;
};

}  // namespace Project
