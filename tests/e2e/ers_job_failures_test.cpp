// ERS jobs that cannot be focused: each ends with the code and the report
// the host expects, with the files named, and never with a crash. Also the
// orbit arc found by itself from the archive folder.
#include <gtest/gtest.h>

#include <regex>

#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"
#include "job/focuser_handover.h"

using namespace support;

namespace {

// A small scene: the failures below stop before focusing.
SceneDescription smallScene() {
  SceneDescription s = ersScene(256, 1024, 300.0);
  s.clutterSigma = 1.0;
  s.pixelTargets.push_back({128.0, 500.0, 0.0, 4.0});
  return s;
}

// The run stopped at a stage: code 130560 in the _error file and the log,
// the failing call named, the stop reported without a crash.
void expectStageFailure(const FocuserRun& run, const std::string& call) {
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.exitStatus, EC_STAGE_FAILED & 0xFF);
  EXPECT_EQ(run.errorCode, 130560) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "[ERROR ID : 130560]")) << run.log;
  EXPECT_TRUE(contains(run.log, "  " + call + " \n")) << run.log;
  EXPECT_TRUE(contains(run.log, "FOCUSSING STAGE FAILED")) << run.log;
}

}  // namespace

TEST(ErsOrbitLookup, ArcFoundFromTheArchiveFolderWhenNoOrbitIsGiven) {
  TempFolder dir("orbit");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(smallScene(), dir.str(), files, error)) << error;

  // The arc found by the look-up comes back into the job through its hand-over.
  std::unique_ptr<JobFocuser> job = makeJobFocuser();
  job->job.platform = "ERS";
  job->job.level0Filename = files["image"];
  job->job.auxFile2 = files["leader"];
  job->job.auxDirectory1 = files["orbit_archive"];
  job->job.processingConfFilename = std::string(resourcesDir()) + "parameters_ERS.hdr";
  job->job.outputFilename = dir / "out";
  EXPECT_EQ(job->checkpar(), 0);
  EXPECT_EQ(job->InitProcessing(), 0);
  EXPECT_EQ(job->job.auxFile1, files["orbit"]);
  EXPECT_EQ(job->FinalizeProcessing("headerfile", 0), 0);
}

TEST(ErsJobFailures, MissingLeaderStopsBeforeExtraction) {
  TempFolder dir("leader");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(smallScene(), dir.str(), files, error)) << error;

  // Not named in the job.
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[7] = "NotOK";
  writeJob(dir / "job.txt", p);
  FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  expectStageFailure(run, "InitProcessing()");
  EXPECT_TRUE(contains(run.log, "Error in defining Ers leader file")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out.extracted"));

  // Named, but not there.
  fs::remove(files["leader"]);
  writeJob(dir / "job.txt", ersJob(files, dir / "out"));
  run = runFocuser(dir.str(), dir / "job.txt");
  expectStageFailure(run, "run()");
  EXPECT_TRUE(contains(run.log, "LEA file does not exist!")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out.extracted"));
}

TEST(ErsJobFailures, ArcListThatDoesNotCoverTheSceneIsReported) {
  TempFolder dir("arc");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(smallScene(), dir.str(), files, error)) << error;
  // Move every arc of the list ten years back.
  const std::string list = files["orbit_archive"] + "/ERS1/PRECISE/arclist";
  std::string text = readText(list);
  ASSERT_TRUE(contains(text, " 10")) << text;
  const std::regex year(R"( 10(\d\d\d\d))");
  writeText(list, std::regex_replace(text, year, " 00$1"));

  std::vector<std::string> p = ersJob(files, dir / "out");
  p[6] = "NotOK";
  p[11] = files["orbit_archive"];
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  expectStageFailure(run, "InitProcessing()");
  EXPECT_TRUE(contains(run.log, "No ERS orbit arc found for the scene in " + files["orbit_archive"]))
      << run.log;
  EXPECT_TRUE(contains(run.log, "INPUT FILE 1")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out.extracted"));
}
TEST(ErsJobFailures, TruncatedImageFileEndsTheExtraction) {
  TempFolder dir("truncated");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(smallScene(), dir.str(), files, error)) << error;
  // Cut in the middle of a line, about half-way through the scene.
  const std::uintmax_t size = fs::file_size(files["image"]);
  fs::resize_file(files["image"], size / 2 + 7);
  writeJob(dir / "job.txt", ersJob(files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  expectStageFailure(run, "run()");
  EXPECT_TRUE(contains(run.log, "File reading failed!")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out.rgfoc"));
}

TEST(ErsJobFailures, OrbitArcThatDoesNotCoverTheSceneEndsTheExtraction) {
  TempFolder dir("short_arc");
  SensorScene files, later;
  std::string error;
  ASSERT_TRUE(simulateErs(smallScene(), dir.str(), files, error)) << error;
  // The arc of a pass ten days later.
  SceneDescription other = smallScene();
  other.lines = 64;
  other.startTime += 10 * 86400.0;
  other.orbit.epoch = other.startTime;
  ASSERT_TRUE(simulateErs(other, dir / "later/", later, error)) << error;
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[6] = later["orbit"];
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  expectStageFailure(run, "run()");
  EXPECT_TRUE(contains(run.log, "does not cover the image orbit")) << run.log;
  EXPECT_TRUE(contains(run.log, later["orbit"])) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out.rgfoc"));
}

TEST(ErsJobFailures, OrbitLookUpNeedsTheLeaderBesideTheImage) {
  TempFolder dir("moved");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(smallScene(), dir.str(), files, error)) << error;
  // The image alone in another folder: the look-up reads the leader of the
  // image's folder for the acquisition time.
  fs::create_directories(dir / "alone");
  fs::copy_file(files["image"], dir / "alone/DAT_01.001");
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[1] = dir / "alone/DAT_01.001";
  p[6] = "NotOK";
  p[11] = files["orbit_archive"];
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  expectStageFailure(run, "InitProcessing()");
  EXPECT_TRUE(contains(run.log, "The ERS orbit cannot be looked up: the leader LEA_01.001 of " +
                                    (dir / "alone")))
      << run.log;
}
