#include <gtest/gtest.h>

#include <string>

#include "diag/ckerr.h"
#include "diag/report.h"
#include "support/files.h"

using namespace support;

using CheckedCalls = WorkingFolderTest;

TEST_F(CheckedCalls, DeepStackIsReportedNotCorruptedAndACleanExitIsSilent) {
  for (int i = 0; i < 100; ++i) set_ckerr_fun("deep()");
  EXPECT_EQ(ckerr_depth(), 63);
  for (int i = 0; i < 100; ++i) deccurdep();
  EXPECT_EQ(ckerr_depth(), 0);
  EXPECT_STREQ(ckerr_current_function(), "main()");
  EXPECT_NE(readText(path("Process.trace")).find("Call-name stack full"), std::string::npos);

  ::testing::internal::CaptureStderr();
  exit_ckerr();
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "");
  EXPECT_EQ(ckflg_ckerr(), 0);
}
