#include <gtest/gtest.h>

#include "framework/strings/CString.h"

namespace Tarsa {
namespace {

TEST(NumberToText, HalvesGoAwayFromZero) {
  EXPECT_EQ(NumberToText(2.5, 0, true).Str(), "3");
  EXPECT_EQ(NumberToText(-2.5, 0, true).Str(), "-3");
  EXPECT_EQ(NumberToText(-2.4, 0, true).Str(), "-2");
  // 0.125 is exact in binary, so its half is a true half.
  EXPECT_EQ(NumberToText(0.125, 2, true).Str(), "0.13");
  EXPECT_EQ(NumberToText(-0.125, 2, true).Str(), "-0.13");
  EXPECT_EQ(NumberToText(-0.4, 0, true).Str(), "0");  // never "-0"
}

TEST(NumberToText, FixedKeepsTheDigitsFreeFormDropsZeros) {
  EXPECT_EQ(NumberToText(1.0, 3, true).Str(), "1.000");
  EXPECT_EQ(NumberToText(1.0, 3, false).Str(), "1");
  EXPECT_EQ(NumberToText(2.0 / 3.0, 4, false).Str(), "0.6667");
  EXPECT_EQ(NumberToText(1234567.0, -2, true).Str(), "1234600");  // rounds to hundreds
  EXPECT_EQ(NumberToText(1e20, 0, false).Str(), "1e+20");         // 13 significant digits
  EXPECT_EQ(NumberToText(0.25, 6000, false).Str(), "0.25");       // 10^6000 overflows
}

}  // namespace
}  // namespace Tarsa
