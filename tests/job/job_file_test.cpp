#include <gtest/gtest.h>

#include "job/job_file.h"
#include "support/files.h"
#include "support/host_run.h"

using namespace support;

TEST(JobFile, LinesTrimmedCutAndCounted) {
  const std::string dir = scratchDir("file");
  writeText(dir + "job.txt", "head\r\n  ERS  \r\n\n\t/data/scene\tx \r\nNotOK\rjunk\n#end\nafter\n");
  EXPECT_EQ(loadParameterList(dir + "job.txt"),
            (std::vector<std::string>{"head", "ERS", "", "/data/scene\tx", "NotOK"}));
  EXPECT_EQ(splitJobParameters(dir + "job.txt###Tessivor###ignored text"),
            (std::vector<std::string>{"ERS", "", "/data/scene\tx", "NotOK"}));

  // 24 lines give 23 parameters, 25 lines give 24; a '#' line cuts the count.
  std::vector<std::string> p = basicJob("ERS", "/s", "/tmp/out");
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
