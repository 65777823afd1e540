#include <gtest/gtest.h>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/waitbar.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "support/files.h"

using namespace support;
using DiagEnvironment = WorkingFolderTest;

using Progress = DiagEnvironment;

TEST_F(Progress, PercentageIsCappedAndTheBatchFlagRemoved) {
  const std::string file = path("progress.txt");
  writeText(path("progress.txt_batch_ok"), "");
  writeText(file, "12\nreading the leader\n");
  EXPECT_TRUE(getAndSetPerc(12, 100, nullptr));
  EXPECT_EQ(readText(file), "99\nreading the leader\n");
  EXPECT_FALSE(fs::exists(path("progress.txt_batch_ok")));
  EXPECT_TRUE(getAndSetPerc(99, 5, "range focusing"));
  EXPECT_EQ(readText(file), "5\nrange focusing\n");
  // The same percentage writes nothing, whatever the message.
  writeText(path("progress.txt_batch_ok"), "");
  EXPECT_TRUE(getAndSetPerc(5, 5, "ignored"));
  EXPECT_EQ(readText(file), "5\nrange focusing\n");
  EXPECT_TRUE(fs::exists(path("progress.txt_batch_ok")));
}

TEST_F(Progress, WaitbarClampsAndSkipsRepeatedPercentages) {
  const std::string file = path("progress.txt");
  EXPECT_EQ(waitbar_open("Azimuth focusing"), 0);
  EXPECT_EQ(phaseText(), " Azimuth focusing");
  EXPECT_EQ(readText(file), "0\n Azimuth focusing\n");
  EXPECT_EQ(waitbar_update(0, 42.9f), 0);
  EXPECT_EQ(readText(file), "42\n Azimuth focusing\n");
  writeText(file, "42\nhost text\n");
  EXPECT_EQ(waitbar_update(0, 42.2f), 0);  // same percentage: untouched
  EXPECT_EQ(readText(file), "42\nhost text\n");
  EXPECT_EQ(waitbar_update(0, 250.0f), 0);
  EXPECT_EQ(readText(file), "99\nhost text\n");
  EXPECT_EQ(waitbar_close(), 0);
}
