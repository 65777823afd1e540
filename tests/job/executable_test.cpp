// The executable driven as the host drives it: TESSIVOR_* variables, a
// command string, then the exit status and the files left behind. The
// operating system keeps only the low 8 bits of the exit status, so each
// code is checked in full in the _error file and the process log.
#include <gtest/gtest.h>

#include "base/status.h"
#include "support/files.h"
#include "support/host_run.h"

using namespace support;

namespace {

// Runs the focuser on a command string, with the host's variables or none.
FocuserRun hostRun(const std::string& folder, const std::string& command, bool hostVariables = true) {
  RunOptions options;
  options.command = command;
  options.hostVariables = hostVariables;
  return runFocuser(folder, "", options);
}

}  // namespace

TEST(FocuserExecutable, TooFewParametersEndWith456962) {
  const std::string dir = scratchDir("exe");
  std::vector<std::string> p = basicJob("ERS", "/data/scene", "/tmp/out");
  p.pop_back();  // 24 lines in all
  writeJob(dir + "job.txt", p);
  const FocuserRun result = hostRun(dir, "main_focussing_stripmap#" + dir + "job.txt");
  EXPECT_EQ(result.exitStatus, EC_TOO_FEW_PARAMETERS & 0xFF);
  EXPECT_TRUE(contains(readText(dir + "progress.txt_error"), "[EC : 456962]"));
  const std::string log = readText(dir + "Process.log");
  EXPECT_TRUE(contains(log, "\nSTART : Focussing stripmap  [  ]\n"));
  EXPECT_TRUE(contains(log, " Parameter 0 (ERS)\n"));
  EXPECT_TRUE(contains(log, " Parameter 22 (NotOK)\n"));
  EXPECT_TRUE(contains(log, "[ERROR ID : 456962]"));
  EXPECT_FALSE(contains(log, "INPUT SATELLITE"));
  EXPECT_TRUE(contains(result.stderrText, "Starting initalization phase\n"));
  EXPECT_TRUE(contains(result.stderrText, "End of initalization phase\n"));
}

// Without an orbit file or an orbit folder the ERS focuser cannot be set up.
TEST(FocuserExecutable, WellFormedErsJobWithoutOrbitStopsAtInitialisation) {
  const std::string dir = scratchDir("exe");
  writeJob(dir + "job.txt", basicJob("ERS", "/data/scene", "/tmp/out"));
  const FocuserRun result = hostRun(dir, "main_focussing_stripmap#" + dir + "job.txt###Tessivor###more");
  // 130560 is 510 x 256: the parent sees 0, the files tell the code.
  EXPECT_EQ(result.exitStatus, EC_STAGE_FAILED & 0xFF);
  EXPECT_TRUE(contains(readText(dir + "progress.txt_error"), "[EC : 130560]"));
  const std::string log = readText(dir + "Process.log");
  EXPECT_TRUE(contains(log, "\nSTART : Focussing stripmap  [  ]\n"));
  EXPECT_TRUE(contains(log,
                       "\n\nINPUT SATELLITE  : [ ERS ]\nINPUT SCENE      : [ /data/scene ]\n"
                       "INPUT SCENE_2    : [ NotOK ]\nINPUT SCENE_3    : [ NotOK ]\n"
                       "INPUT SCENE_4    : [ NotOK ]\nOUTPUT ROOT NAME : [ /tmp/out ]\n"
                       "INPUT FILE 1     : [ NotOK ]\nINPUT FILE 2     : [ NotOK ]\n"
                       "INPUT FILE 3     : [ NotOK ]\nINPUT FILE 4     : [ NotOK ]\n"
                       "INPUT FILE 5     : [ NotOK ]\nINPUT DIR 1      : [ NotOK ]\n"
                       "INPUT DIR 2      : [ NotOK ]\nINPUT DIR 3      : [ NotOK ]\n"
                       "INPUT DIR 4      : [ NotOK ]\nINPUT DIR 5      : [ NotOK ]\n"
                       "SKIP LINES       : [ 0 ]\nEXTRACT LINES    : [ 0 ]\n"
                       "ERASE TEMPORARY  : [ NotOK ]\n"));
  EXPECT_TRUE(contains(log, "[ERROR ID : 130560]"));
  EXPECT_TRUE(contains(log, "  InitProcessing() \n"));
  const std::string trace = readText(dir + "Process.trace");
  EXPECT_TRUE(contains(trace, "Orvane WARNING: ERS - line"));
  EXPECT_TRUE(contains(trace, "\nERROR : "));
}

TEST(FocuserExecutable, UnknownPlatformAndUnsupportedEnvisatProductEndWith1) {
  const std::string dir = scratchDir("exe");
  writeJob(dir + "job.txt", basicJob("SEASAT", "/data/scene", "/tmp/out"));
  FocuserRun result = hostRun(dir, "main_focussing_stripmap#" + dir + "job.txt");
  EXPECT_EQ(result.exitStatus, 1);
  EXPECT_TRUE(contains(readText(dir + "progress.txt_error"), "[EC : 1]"));
  std::string log = readText(dir + "Process.log");
  EXPECT_TRUE(contains(log, "INPUT SATELLITE  : [ SEASAT ]"));
  EXPECT_TRUE(contains(log, "PROCESSING ERROR: Unknown platform - line"));
  EXPECT_TRUE(contains(log, "[ERROR ID : 1]"));

  writeText(dir + "scene.N1", std::string(200, 'x'));
  writeJob(dir + "job.txt", basicJob("ENVISAT", dir + "scene.N1", "/tmp/out"));
  result = hostRun(dir, "main_focussing_stripmap#" + dir + "job.txt");
  EXPECT_EQ(result.exitStatus, 1);
  log = readText(dir + "Process.log");
  EXPECT_TRUE(contains(log, "PROCESSING ERROR: File type not supported - line"));
}

TEST(FocuserExecutable, CommandStringNotUnderstoodEndsWith456963) {
  const std::string dir = scratchDir("exe");
  writeJob(dir + "job.txt", basicJob("ERS", "/data/scene", "/tmp/out"));
  const FocuserRun result = hostRun(dir, "main_focusing_stripmap#" + dir + "job.txt");
  EXPECT_EQ(result.exitStatus, EC_BAD_COMMAND & 0xFF);
  EXPECT_TRUE(contains(readText(dir + "progress.txt_error"), "[EC : 456963]"));
  EXPECT_TRUE(contains(readText(dir + "Process.trace"), "main_focusing_stripmap#" + dir + "job.txt\n"));
  EXPECT_TRUE(contains(readText(dir + "Process.log"), "[ERROR ID : 456963]"));
  EXPECT_TRUE(contains(result.stderrText, "ERROR 456963"));
}

TEST(FocuserExecutable, JobFileLookupInTheWorkingFolder) {
  const std::string dir = scratchDir("exe");
  // Found by its name in TESSIVOR_WORKING_DIR.
  writeJob(dir + "job.txt", basicJob("ERS", "/data/scene", "/tmp/out"));
  FocuserRun result = hostRun(dir, "main_focussing_stripmap#/elsewhere/job.txt");
  EXPECT_EQ(result.exitStatus, EC_STAGE_FAILED & 0xFF);
  EXPECT_TRUE(contains(readText(dir + "progress.txt_error"), "[EC : 130560]"));
  // Nowhere: file not found.
  result = hostRun(dir, "main_focussing_stripmap#/elsewhere/absent.txt");
  EXPECT_EQ(result.exitStatus, EC_FILE_NOT_FOUND & 0xFF);
  const std::string error = readText(dir + "progress.txt_error");
  EXPECT_TRUE(contains(error, "/elsewhere/absent.txt"));
  EXPECT_TRUE(contains(error, "[EC : 261122]"));
}

TEST(FocuserExecutable, UnsetVariablesFallBackToTheResourcesAndTheCurrentFolder) {
  const std::string dir = scratchDir("exe");
  writeJob(dir + "job.txt", basicJob("ERS", "/data/scene", "/tmp/out"));
  const FocuserRun result = hostRun(dir, "main_focussing_stripmap#job.txt", false);
  EXPECT_EQ(result.exitStatus, EC_STAGE_FAILED & 0xFF);
  // Catalogue texts found in the installed resources; logs and the _error
  // file in the current folder.
  EXPECT_TRUE(contains(readText(dir + "Process.log"), "FOCUSSING STAGE FAILED"));
  EXPECT_TRUE(contains(readText(dir + "Tessivor_progress.txt_error"), "[EC : 130560]"));
  EXPECT_FALSE(std::filesystem::exists(dir + "Process.trace"));
}
