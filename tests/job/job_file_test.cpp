#include <gtest/gtest.h>
#include <stdlib.h>

#include "diag/orvane_exception.h"
#include "job/job_file.h"
#include "job_test_support.h"

TEST(JobFile, LinesTrimmedCutAndCounted) {
  const std::string dir = freshFolder("file");
  writeText(dir + "job.txt", "head\r\n  ERS  \r\n\n\t/data/scene\tx \r\nNotOK\rjunk\n#end\nafter\n");
  EXPECT_EQ(loadParameterList(dir + "job.txt"),
            (std::vector<std::string>{"head", "ERS", "", "/data/scene\tx", "NotOK"}));
  EXPECT_EQ(splitJobParameters(dir + "job.txt###Tessivor###ignored text"),
            (std::vector<std::string>{"ERS", "", "/data/scene\tx", "NotOK"}));

  // 24 lines give 23 parameters, 25 lines give 24; a '#' line cuts the count.
  std::vector<std::string> p = jobParameters("ERS", "/s");
  p.pop_back();
  writeJob(dir + "short.txt", p);
  EXPECT_EQ(splitJobParameters(dir + "short.txt").size(), 23u);
  p.push_back("NotOK");
  writeJob(dir + "full.txt", p);
  EXPECT_EQ(splitJobParameters(dir + "full.txt").size(), 24u);
  p[10] = "# commented out";
  writeJob(dir + "cut.txt", p);
  EXPECT_EQ(splitJobParameters(dir + "cut.txt").size(), 10u);
}

TEST(JobFile, WorkingFolderFallbackAndMissingFiles) {
  const std::string dir = freshFolder("fallback");
  writeText(dir + "only_here.txt", "head\nERS\n");
  setenv("TESSIVOR_WORKING_DIR", dir.c_str(), 1);
  EXPECT_EQ(splitJobParameters("/no/such/folder/only_here.txt"), (std::vector<std::string>{"ERS"}));
  // Before the environment is ready the fatal path throws with the code.
  try {
    loadParameterList("/no/such/folder/absent.txt");
    FAIL() << "no exception";
  } catch (const orvaneException& e) {
    EXPECT_NE(e.getMessage().find("/no/such/folder/absent.txt"), std::string::npos);
    EXPECT_NE(e.getMessage().find("[EC : 261122]"), std::string::npos);
  }
  writeText(dir + "one_line.txt", "head only\n");
  EXPECT_THROW(splitJobParameters(dir + "one_line.txt"), orvaneException);
  unsetenv("TESSIVOR_WORKING_DIR");
}
