#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <vector>

#include "diag/ckerr.h"
#include "diag/report.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "support/files.h"

using namespace support;
using DiagEnvironment = WorkingFolderTest;

using CheckedCalls = DiagEnvironment;

TEST_F(CheckedCalls, FreeallReleasesOnlyWhatWasAllocatedBelowTheCurrentCall) {
  void* top = malloc_ckerr(16);  // allocated by main()
  set_ckerr_fun("first()");
  malloc_ckerr(16);
  set_ckerr_fun("child()");
  malloc_ckerr(16);
  void* c = malloc_ckerr(16);
  deccurdep();
  malloc_ckerr(16);
  set_ckerr_fun("second()");
  malloc_ckerr(16);
  EXPECT_EQ(ckerr_live_allocations(), 6);
  free_ckerr(c);
  EXPECT_EQ(ckerr_live_allocations(), 5);
  int unknown = 0;
  free_ckerr(&unknown);  // unknown address: nothing happens
  EXPECT_EQ(ckerr_live_allocations(), 5);
  freeall_ckerr();  // in second(): its own block only
  EXPECT_EQ(ckerr_live_allocations(), 4);
  deccurdep();
  freeall_ckerr();  // in first(): its own two blocks and its child's
  EXPECT_EQ(ckerr_live_allocations(), 1);
  deccurdep();
  free_ckerr(top);
  EXPECT_EQ(ckerr_live_allocations(), 0);
}

TEST_F(CheckedCalls, FreeallAfterSwapWithLastFindsAllEntriesOfTheCall) {
  void* keep = malloc_ckerr(8);
  set_ckerr_fun("worker()");
  std::vector<void*> mine;
  for (int i = 0; i < 6; ++i) mine.push_back(malloc_ckerr(32));
  free_ckerr(mine[1]);  // the last entry moves into slot 2
  free_ckerr(mine[3]);
  EXPECT_EQ(ckerr_live_allocations(), 5);
  freeall_ckerr();
  EXPECT_EQ(ckerr_live_allocations(), 1);
  deccurdep();
  free_ckerr(keep);
  EXPECT_EQ(ckerr_live_allocations(), 0);
}

TEST_F(CheckedCalls, FullTableAndDeepStackAreReportedNotCorrupted) {
  std::vector<void*> blocks;
  for (int i = 0; i < 1024; ++i) blocks.push_back(malloc_ckerr(1));
  EXPECT_EQ(ckerr_live_allocations(), 1024);
  const long before = report_count();
  EXPECT_EQ(malloc_ckerr(1), nullptr);
  EXPECT_EQ(calloc_ckerr(1, 1), nullptr);
  EXPECT_EQ(report_count(), before + 2);
  EXPECT_EQ(ckerr_live_allocations(), 1024);
  freeall_ckerr();
  EXPECT_EQ(ckerr_live_allocations(), 0);

  for (int i = 0; i < 100; ++i) set_ckerr_fun("deep()");
  EXPECT_EQ(ckerr_depth(), 63);
  for (int i = 0; i < 100; ++i) deccurdep();
  EXPECT_EQ(ckerr_depth(), 0);
  EXPECT_STREQ(ckerr_current_function(), "main()");
  const std::string trace = readText(path("Process.trace"));
  EXPECT_NE(trace.find("Allocation table full"), std::string::npos);
  EXPECT_NE(trace.find("Call-name stack full"), std::string::npos);
}

TEST_F(CheckedCalls, ExitReportsLeaksWithTheirCallCoordinates) {
  set_ckerr_fun("a()");
  set_ckerr_fun("b()");
  malloc_ckerr(10);
  deccurdep();
  set_ckerr_fun("c()");
  malloc_ckerr(10);
  deccurdep();
  deccurdep();
  ::testing::internal::CaptureStderr();
  exit_ckerr();
  const std::string err = ::testing::internal::GetCapturedStderr();
  EXPECT_EQ(err,
            "\nPotential memory leaks detected!\n"
            "\n2 buffers left to be de-allocated.!\n"
            "--------------------------------\n"
            "ML call graph coordinates: \n"
            "b() : 0\t1\t1\t\n"
            "c() : 0\t1\t2\t\n");
  EXPECT_EQ(ckflg_ckerr(), 0);
  ::testing::internal::CaptureStderr();
  exit_ckerr();
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "");
}
