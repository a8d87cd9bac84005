#include "framework/core/CException.h"

#include <cerrno>

#include <gtest/gtest.h>

namespace Tarsa {
namespace {

TEST(CException, AbortIsSilentUnlessAskedAndSystemErrorsAreWorded) {
  EXPECT_TRUE(CAbort().IsSilent());
  EXPECT_FALSE(CAbort().IsAlertable());
  CAbort loud(false, true);
  EXPECT_FALSE(loud.IsSilent());
  EXPECT_TRUE(loud.IsAlertable());

  // A fixed code is a keyed text; a system code is worded by the system and
  // carries the number for support.
  const CException& fixed = CSystemError(CSystemError::kNoSuchFile);
  EXPECT_NE(fixed.ErrorText().find("$$$/"), std::string::npos);
  EXPECT_NE(fixed.ErrorText().find("NoSuchFile"), std::string::npos);
  const std::string text = CSystemError(EACCES).ErrorText();
  EXPECT_NE(text.find(std::to_string(EACCES)), std::string::npos);
  EXPECT_EQ(text.find("$$$"), std::string::npos);
  errno = ENOSPC;
  EXPECT_EQ(CSystemError::FromLastError().Code(), ENOSPC);
}

}  // namespace
}  // namespace Tarsa
