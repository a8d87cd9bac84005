#include "framework/core/CException.h"

#include <cerrno>

#include <gtest/gtest.h>

namespace Tarsa {
namespace {

TEST(CException, AbortIsSilentAndCarriesItsTexts) {
  CAbort abort;
  EXPECT_TRUE(abort.IsSilent());
  EXPECT_FALSE(abort.IsAlertable());
  EXPECT_EQ(abort.ErrorText(), "$$$/Tarsa/Abort/Error=The operation has been canceled.");
  EXPECT_EQ(abort.TaskText(), "$$$/Tarsa/Abort/Task=The operation was not completed.");

  CAbort loud(false, true);
  EXPECT_FALSE(loud.IsSilent());
  EXPECT_TRUE(loud.IsAlertable());
}

TEST(CException, SystemErrorWordsFixedCodesAndSystemCodes) {
  EXPECT_NE(CSystemError(CSystemError::kNotADirectory).ErrorText().find("$$$/"), std::string::npos);
  // A system code is worded by the system and carries the number for support.
  const std::string text = CSystemError(EACCES).ErrorText();
  EXPECT_NE(text.find(std::to_string(EACCES)), std::string::npos);
  EXPECT_EQ(text.find("$$$"), std::string::npos);

  errno = ENOSPC;
  EXPECT_EQ(CSystemError::FromLastError().Code(), ENOSPC);
}

TEST(CException, CatchesAsTheBaseWithItsOverride) {
  try {
    throw CSystemError(CSystemError::kNoSuchFile);
  } catch (const CException& e) {
    EXPECT_NE(e.ErrorText().find("NoSuchFile"), std::string::npos);
  }
}

}  // namespace
}  // namespace Tarsa
