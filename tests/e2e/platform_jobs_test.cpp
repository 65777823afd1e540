// Jobs of the other platforms through the executable: what this build
// refuses, and how the refusal reaches the host.
#include <gtest/gtest.h>

#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"

using namespace support;

TEST(PlatformJobs, PalsarSinglePolarisationWithASecondSceneIsRefusedBeforeExtraction) {
  TempFolder dir("palsar");
  std::string leader(2700, ' ');
  leader.replace(1108, 4, "   1");
  writeText(dir / "LED-ALPSRP", leader);
  writeText(dir / "IMG-HH-ALPSRP", std::string(800, '\0'));
  writeText(dir / "IMG-HV-ALPSRP", std::string(800, '\0'));
  Job p = basicJob("PALSAR", dir / "IMG-HH-ALPSRP", dir / "out");
  p[2] = dir / "IMG-HV-ALPSRP";
  p[6] = dir / "LED-ALPSRP";  // the PALSAR orbit is the leader's
  p[7] = dir / "LED-ALPSRP";
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.errorCode, 130560) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "  InitProcessing() \n")) << run.log;
  EXPECT_TRUE(contains(run.log,
                       "detected a single polarization on this scene, trying to focus more than "
                       "one  - line"))
      << run.log;

  // One scene only: the orbit and the leader are required, then the
  // extraction refuses a leader that is not of raw data.
  p = basicJob("PALSAR", dir / "IMG-HH-ALPSRP", dir / "out");
  writeJob(dir / "job.txt", p);
  FocuserRun refused = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_EQ(refused.errorCode, 130560) << refused.errorFile;
  EXPECT_TRUE(contains(refused.log, "Error in defining PALSAR Orbit")) << refused.log;
  p[6] = p[7] = dir / "LED-ALPSRP";
  writeJob(dir / "job.txt", p);
  refused = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_EQ(refused.errorCode, 130560) << refused.errorFile;
  EXPECT_TRUE(contains(refused.log, "The CEOS fileset is not ALOS RAW DATA")) << refused.log;
}

TEST(PlatformJobs, RadarsatWithoutOrbitIsRefusedAndEnvisatTellsWhichFileIsMissing) {
  TempFolder dir("others");
  writeText(dir / "dat_01.001", std::string(1000, '\0'));
  writeJob(dir / "job.txt", basicJob("RADARSAT", dir / "dat_01.001", dir / "out"));
  FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_EQ(run.errorCode, 130560) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "Error in defining RADARSAT orbit file")) << run.log;

  // An image-mode ASAR product without orbit file or folder.
  writeText(dir / "ASA_IM__0P.N1", "PRODUCT=\"ASA_IM__0PNPDE20040101" + std::string(100, ' '));
  writeJob(dir / "job.txt", basicJob("ENVISAT", dir / "ASA_IM__0P.N1", dir / "out"));
  run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_EQ(run.errorCode, EC_DORVOR_MISSING) << run.errorFile;
  // The folders are "NotOK" as the job gives them: nothing is found there.
  EXPECT_TRUE(contains(run.log,
                       "No ENVISAT DORIS orbit (DOR_VOR) valid for the scene found in NotOK: give "
                       "the file as INPUT FILE 1 or a folder holding it as INPUT DIR 1"))
      << run.log;
}
