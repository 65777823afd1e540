#include <gtest/gtest.h>

#include "base/status.h"
#include "diag/report.h"
#include "diag/ckerr.h"
#include "support/files.h"

using namespace support;
using Reports = WorkingFolderTest;

TEST_F(Reports, LevelsReachTheirLogs) {
  const long before = report_count();
  orv_add_report("bad thing", REPORT_ERROR, 12, "fun", "f.cpp");
  orv_add_report("careful", REPORT_WARNING, 13, "fun", "f.cpp");
  orv_add_report("here", REPORT_CHECKPOINT, 14, "fun", "f.cpp");
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, 15, "fun", "f.cpp");
  orv_add_report("fine", REPORT_CORRECT_FUNCTION_CALL, 16, "fun", "f.cpp");
  orv_add_report("fine too", REPORT_CORRECT_SYSTEM_CALL, 17, "fun", "f.cpp");
  orv_add_report("note", REPORT_MESSAGE, 18, "fun", "f.cpp");
  orv_add_report("odd", 15, 19, "fun", "f.cpp");
  orv_add_report("odd too", 22, 20, "fun", "f.cpp");
  EXPECT_EQ(report_count(), before + 9);

  const std::string trace = readText(path("Process.trace"));
  EXPECT_NE(trace.find("Orvane ERROR: bad thing - line : 12 - function : fun - file : f.cpp\n"),
            std::string::npos);
  EXPECT_NE(trace.find("Orvane WARNING: careful - line : 13 - function : fun - file : f.cpp\n"),
            std::string::npos);
  EXPECT_NE(trace.find("Orvane CHECKPOINT: here - line : 14"), std::string::npos);
  EXPECT_NE(trace.find("Orvane MESSAGE: note - line : 18"), std::string::npos);
  EXPECT_EQ(trace.find("Called function returned ERROR"), std::string::npos);
  EXPECT_EQ(trace.find("fine"), std::string::npos);
  EXPECT_EQ(trace.find("odd"), std::string::npos);

  const std::string log = readText(path("Process.log"));
  EXPECT_NE(log.find("PROCESSING ERROR: bad thing - line : 12 - function : fun - file : f.cpp - Orvane\n"),
            std::string::npos);
  EXPECT_EQ(log.find("careful"), std::string::npos);
  EXPECT_EQ(log.find("note"), std::string::npos);

  EXPECT_EQ(orv_check(0, 1, "fun", "f.cpp"), 0);
  EXPECT_EQ(orv_check(ENOENT, 30, "fun", "f.cpp"), 1);
  EXPECT_NE(readText(path("Process.trace")).find("Orvane ERROR: No such file or directory - line : 30"),
            std::string::npos);
}

TEST_F(Reports, FlagZeroLosesReportsAndFatalLevelsDoNotEnd) {
  set_flg_report(0);
  const long before = report_count();
  orv_add_report("lost", REPORT_ERROR, 1, "fun", "f.cpp");
  orv_add_report("no XCA", REPORT_XCA_MISSING, 2, "fun", "f.cpp");
  EXPECT_EQ(report_count(), before);
  EXPECT_EQ(readText(path("Process.trace")).find("lost"), std::string::npos);
  EXPECT_FALSE(fs::exists(path("progress.txt_error")));
  // A flag already set stays; an inactive layer switches reports off.
  set_flg_report(2);
  init_report(0, "x", 1);
  EXPECT_EQ(ckflg_report(), 2);
  set_flg_report(0);
  exit_ckerr();
  init_report(0, "x", 1);
  EXPECT_EQ(ckflg_report(), 0);
  init_ckerr_locking();
  init_report(0, "x", 4);
  EXPECT_EQ(ckflg_report(), 0);
  init_report(0, "x", 3);
  EXPECT_EQ(ckflg_report(), 3);
}

// Each fatal level ends the run with its code (the status seen by the
// parent is the code modulo 256) and leaves the code in the _error file.
TEST_F(Reports, FatalLevelsEndWithTheirCodes) {
  const struct {
    int level;
    int code;
  } cases[] = {{7, 1305601}, {8, 1305604}, {9, 1305602}, {10, 1305603}, {11, 1370882},
               {12, 1370883}, {13, 1305605}, {19, 1370881}, {20, 1370884}, {21, 1305606}};
  for (const auto& c : cases) {
    std::filesystem::remove(path("progress.txt_error"));
    EXPECT_EXIT(orv_add_report("missing", c.level, 5, "fun", "f.cpp"),
                ::testing::ExitedWithCode(c.code & 0xFF), "")
        << "level " << c.level;
    const std::string error = readText(path("progress.txt_error"));
    EXPECT_NE(error.find("[EC : " + std::to_string(c.code) + "]"), std::string::npos)
        << "level " << c.level;
  }
  const std::string log = readText(path("Process.log"));
  EXPECT_NE(log.find("PROCESSING ERROR: missing - line : 5"), std::string::npos);
  EXPECT_NE(log.find("[ERROR ID : 1305606]"), std::string::npos);
}
