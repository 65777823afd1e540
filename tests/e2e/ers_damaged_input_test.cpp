// Damaged ERS input that the extraction lets through: a line missing from
// the image file and corrupted sampling-window codes. The run succeeds; the
// product record flags the missing lines and the focusing stays sound.
#include <gtest/gtest.h>

#include <filesystem>

#include "product/general_sar.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"

using namespace support;

namespace {

// 4096 lines of 2048 samples: enough swath for three targets and enough
// lines for the azimuth overlap of the ERS profile.
SceneDescription narrowScene() {
  SceneDescription s = ersScene(4096, 2048, 250.0);
  s.pixelTargets = {{1600.25, 200.5, 0.0, 4.0}, {2050.5, 700.25, 40.0, 4.0},
                    {2450.75, 1150.5, 0.0, 4.0}};
  return s;
}

struct FocusedScene {
  SensorScene files;
  FocuserRun run;
};

// Simulates and focuses, keeping the chain's files.
void focus(const TempFolder& dir, const SceneDescription& scene, FocusedScene& out) {
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), out.files, error)) << error;
  writeJob(dir / "job.txt", ersJob(out.files, dir / "out"));
  out.run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(out.run.exitStatus, 0) << out.run.log;
  ASSERT_EQ(out.run.errorCode, 0) << out.run.errorFile;
  EXPECT_TRUE(contains(out.run.log, "SUCCESSFUL")) << out.run.log;
}

}  // namespace

TEST(ErsDamagedInput, DroppedLineIsFlaggedInTheRecordAndTheSceneStillFocuses) {
  TempFolder dir("dropped");
  SceneDescription scene = narrowScene();
  scene.dropLines = {400};
  FocusedScene focused;
  focus(dir, scene, focused);
  if (HasFatalFailure()) return;

  GeneralSAR raw, product;
  ASSERT_EQ(raw.GSread(dir / "out.extracted.hdr"), 0);
  ASSERT_EQ(product.GSread(dir / "out_slc.TessivorParameterExtracted"), 0);
  // One record fewer; the count of the lines is not resynchronised, so every
  // record after the gap is flagged, and the flag travels to the product.
  EXPECT_EQ(raw.roi.roi.Lines, 4095);
  EXPECT_EQ(raw.dataSetInfo.MissingLines, 4095 - 400);
  EXPECT_EQ(product.dataSetInfo.MissingLines, 4095 - 400);
  // A job that keeps its temporaries keeps them whole: no stage writes over
  // the raster it reads unless the job erases it.
  EXPECT_EQ(std::filesystem::file_size(dir / "out.extracted"),
            4095u * (4u + 8u * static_cast<unsigned>(raw.roi.roi.Samples)));

  const PtaReport pta =
      analyseProduct(dir.str(), dir / "out_slc", dir / "out_slc.TessivorParameterExtracted", focused.files.truth);
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  // The lines after the gap moved up by one: the echoes of every target lie
  // behind it, so each appears one line early, exactly.
  expectTruthPositions(pta, -1.0, false);
}

TEST(ErsDamagedInput, CorruptedWindowCodesAreReplacedByThePreviousOne) {
  TempFolder dir("swst");
  SceneDescription scene = narrowScene();
  scene.corruptSwstLines = {1000, 1001, 2100};
  scene.corruptSwstDelta = 1000;
  FocusedScene focused;
  focus(dir, scene, focused);
  if (HasFatalFailure()) return;

  GeneralSAR raw, product;
  ASSERT_EQ(raw.GSread(dir / "out.extracted.hdr"), 0);
  ASSERT_EQ(product.GSread(dir / "out_slc.TessivorParameterExtracted"), 0);
  // No line is missing, and no corrupted start entered the window range.
  EXPECT_EQ(raw.roi.roi.Lines, 4096);
  EXPECT_EQ(raw.dataSetInfo.MissingLines, 0);
  EXPECT_DOUBLE_EQ(raw.dataSetInfo.SWST_MIN, raw.dataSetInfo.SWST_MAX);
  EXPECT_NEAR(raw.dataSetInfo.SWST_MIN, ersSwstSeconds(RawSceneSimulator(scene).swstCode()), 1e-9);

  const PtaReport pta =
      analyseProduct(dir.str(), dir / "out_slc", dir / "out_slc.TessivorParameterExtracted", focused.files.truth);
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  expectTruthPositions(pta, 0.0, false);
}
