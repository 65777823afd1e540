// A longer ERS-1 scene over two azimuth blocks, with a negative centroid
// and targets at the seam of the blocks. Left out of the default run.
#include <gtest/gtest.h>

#include "product/general_sar.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"

using namespace support;

TEST(HeavyErsFrame, TwoAzimuthBlocksWithANegativeCentroid) {
  TempFolder dir("frame");
  SceneDescription scene = ersScene(10240, 5616, -450.0);
  scene.mission = "ERS1";
  scene.sceneDir = "ERS1_SIM";
  // The profile derives the overlap from the scene: one aperture plus the
  // centroid's spread, 1152 lines here. The first block keeps raw lines 576
  // to 7615, the second the rest: targets on both sides of the seam, across
  // the swath.
  scene.pixelTargets = {{3000.5, 300.25, 0.0, 4.0},    {7594.25, 1200.5, 0.0, 4.0},
                        {7609.0, 2300.75, 80.0, 4.0},  {7622.75, 3400.0, 0.0, 4.0},
                        {7639.5, 4500.25, 0.0, 4.0},   {8000.0, 4700.5, 150.0, 4.0},
                        {8200.25, 2000.0, 0.0, 4.0}};
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), files, error)) << error;
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[6] = "NotOK";
  p[11] = files["orbit_archive"];
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt", {.timeoutSeconds = 3000});
  ASSERT_EQ(run.exitStatus, 0) << run.log;
  ASSERT_EQ(run.errorCode, 0) << run.errorFile;
  EXPECT_TRUE(contains(run.trace, "ERS1 orbit found")) << run.trace;

  GeneralSAR record;
  ASSERT_EQ(record.GSread(dir / "out_slc.TessivorParameterExtracted"), 0);
  // Shorter than the fixed 2560 lines sized for the worst centroid, longer
  // than one aperture (about 1120 lines at the far range).
  const int overlap = 10240 - record.roi.roi.Lines;
  EXPECT_EQ(overlap % 2, 0);
  EXPECT_GT(overlap, 1120);
  EXPECT_LT(overlap, 2560);
  const PtaReport pta = analyseProduct(dir.str(), dir / "out_slc", dir / "out_slc.TessivorParameterExtracted", files.truth);
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  expectTruthPositions(pta);

  const ROI_Obj& roi = record.roi.roi;
  const double prf = scene.prfHz;
  const double centroid = record.polynomials.EvaluateDC(
      roi.FastStartTime + 0.5 * roi.Samples * roi.FastTimeDelta,
      roi.SlowStartTime + 0.5 * roi.Lines * roi.SlowTimeDelta);
  EXPECT_NEAR(centroid, -450.0, 0.02 * prf);
}
