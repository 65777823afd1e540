// Runs short of resources: an output disk that fills up during the run, and
// a small memory budget on a full-swath scene.
#include <gtest/gtest.h>

#include <map>

#include "product/general_sar.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"

using namespace support;

namespace {

std::map<std::string, std::string> contents(const SensorScene& scene) {
  std::map<std::string, std::string> bytes;
  for (const char* role : {"image", "leader", "orbit"}) bytes[role] = readText(scene[role]);
  return bytes;
}

}  // namespace

TEST(ErsExhaustion, FullOutputDiskEndsWithAWriteFailureAndLeavesTheInputs) {
  TempFolder dir("full_disk");
  SceneDescription scene = ersScene(256, 1024, 300.0);
  scene.pixelTargets.push_back({128.0, 500.0, 0.0, 4.0});
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), files, error)) << error;
  const auto before = contents(files);
  writeJob(dir / "job.txt", ersJob(files, dir / "out"));

  // 1 MiB for any file: the raw raster of the extraction (2 MiB) does not fit.
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt", {.fileSizeLimit = 1 << 20});
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.exitStatus, EC_STAGE_FAILED & 0xFF);
  EXPECT_EQ(run.errorCode, EC_STAGE_FAILED) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "File writing failed!")) << run.log;
  // Status 5 of the raster writer, with the raster named in the trace.
  EXPECT_TRUE(contains(run.trace, "Raster file: " + (dir / "out.extracted"))) << run.trace;
  EXPECT_EQ(contents(files), before);
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}

// The focuser's memory budget of the profile at 64 MB instead of 512 MB:
// more, smaller blocks, the same product.
TEST(HeavyErsExhaustion, SixtyFourMegabyteBudgetFocusesAFullSwathScene) {
  TempFolder dir("memory");
  SceneDescription scene = ersScene(4096, 5616, 200.0);
  scene.pixelTargets = {{1700.5, 400.25, 0.0, 4.0}, {2000.0, 2800.5, 60.0, 4.0}, {2300.25, 4500.0, 0.0, 4.0}};
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), files, error)) << error;
  const std::string resources = dir / "resources/";
  fs::create_directories(resources);
  fs::copy(resourcesDir(), resources, fs::copy_options::recursive);
  std::string profile = readText(resources + "parameters_ERS.hdr");
  ASSERT_TRUE(contains(profile, "\nMemory = 512\n"));
  profile.replace(profile.find("\nMemory = 512\n"), 14, "\nMemory = 64\n");
  writeText(resources + "parameters_ERS.hdr", profile);

  writeJob(dir / "job.txt", ersJob(files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt",
                                    {.timeoutSeconds = 3000, .variables = {{"TESSIVOR_CEOS_DES_FILES_DIR", resources}}});
  ASSERT_EQ(run.exitStatus, 0) << run.log;
  ASSERT_EQ(run.errorCode, 0) << run.errorFile;
  const PtaReport pta = analyseProduct(dir.str(), dir / "out_slc", dir / "out_slc.TessivorParameterExtracted", files.truth);
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  expectTruthPositions(pta);
}
