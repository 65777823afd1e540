// A simulated ERS scene of full swath width through the executable and a
// job file, as the host runs it: the focused product is checked against the
// simulator's truth (positions, impulse responses, phases, Doppler centroid,
// corners), and a host stop during azimuth focusing ends the run.
#include <gtest/gtest.h>

#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"
#include "product/general_sar.h"

using namespace support;

namespace {

constexpr int kSamples = 5616;
constexpr int kLines = 4608;
constexpr double kDoppler = 300.0;

// Targets spread over the swath and along the part of the scene that the
// azimuth overlap keeps; heights up to 120 m.
SceneDescription fullSwathScene(double doppler = kDoppler) {
  SceneDescription s = ersScene(kLines, kSamples, doppler);
  s.pixelTargets = {{1700.25, 400.5, 0.0, 4.0},
                    {2900.0, 1400.0, 120.0, 4.0},
                    {2300.75, 2500.25, 0.0, 4.0},
                    {1900.5, 3600.75, 50.0, 4.0},
                    {2700.0, 4600.5, 0.0, 4.0}};
  return s;
}

}  // namespace

TEST(ErsEndToEnd, FullSwathSceneFocusedWithinTheImageQualityBounds) {
  TempFolder dir("scene");
  const SceneDescription scene = fullSwathScene();
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), files, error)) << error;
  const RawSceneSimulator sim(scene);

  // The orbit is left to the look-up in the archive; temporary files go.
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[6] = "NotOK";
  p[11] = files["orbit_archive"];
  p[18] = "1";
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  ASSERT_EQ(run.errorCode, 0) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "SUCCESSFUL")) << run.log;
  EXPECT_TRUE(contains(run.trace, "ERS2 orbit found")) << run.trace;

  // Products under their final names; the chain's files erased.
  const std::string product = dir / "out_slc";
  const std::string store = product + ".TessivorParameterExtracted";
  ASSERT_TRUE(fs::exists(product)) << run.trace;
  ASSERT_TRUE(fs::exists(store)) << run.trace;
  for (const char* temporary : {"out.extracted", "out.extracted.hdr", "out.chirp",
                                "out.chirp.hdr", "out.rgfoc", "out.rgfoc.hdr"})
    EXPECT_FALSE(fs::exists(dir / temporary)) << temporary;

  GeneralSAR record;
  ASSERT_EQ(record.GSread(store), 0);
  const ROI_Obj& roi = record.roi.roi;
  ASSERT_GT(roi.Lines, 1000);
  ASSERT_GT(roi.Samples, 4500);
  EXPECT_EQ(fs::file_size(product),
            static_cast<std::uintmax_t>(roi.Lines) * static_cast<std::uintmax_t>(roi.Samples) * 8u);

  // Point targets against the truth, with the theory of the product's
  // windows.
  const PtaReport pta = analyseProduct(dir.str(), product, store, files.truth);
  ASSERT_EQ(pta.exitStatus, 0) << pta.table;
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  expectTruthPositions(pta);

  // Doppler centroid at the scene centre: within 2 % of the PRF, so with
  // the right ambiguity.
  const double prf = truthValue(files.truth, "prf_hz");
  const double centreRange = roi.FastStartTime + 0.5 * roi.Samples * roi.FastTimeDelta;
  const double centreTime = roi.SlowStartTime + 0.5 * roi.Lines * roi.SlowTimeDelta;
  const double centroid = record.polynomials.EvaluateDC(centreRange, centreTime);
  EXPECT_NEAR(centroid, kDoppler, 0.02 * prf);
  EXPECT_EQ(std::lround((centroid - kDoppler) / prf), 0);

  // Corners and centre on the ground that their pixels show.
  expectCornersOnTheGround(record, sim, files.truth);
}

TEST(ErsEndToEnd, HostStopDuringAzimuthFocusingEndsWith326400) {
  TempFolder dir("stop");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(fullSwathScene(), dir.str(), files, error)) << error;
  writeJob(dir / "job.txt", ersJob(files, dir / "out"));
  bool written = false;
  RunOptions host;
  host.hook = [&](const RunningFocuser& running) {
    if (written || !contains(running.progress, "Azimuth Focusing")) return;
    writeText(running.folder + "progress.txt", "101\nAzimuth Focusing\n");
    written = true;
  };
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt", host);
  ASSERT_TRUE(written) << run.trace;
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.exitStatus, EC_INTERRUPTED & 0xFF);
  EXPECT_EQ(run.errorCode, 326400) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "[ERROR ID : 326400]")) << run.log;
  EXPECT_TRUE(contains(run.trace, "EXECUTION INTERRUPTED BY OPERATOR")) << run.trace;
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}

// The product does not depend on the number of threads: the chain's loops
// and transforms on one thread and on two give the same bytes.
TEST(ErsEndToEnd, ProductIdenticalOnOneAndTwoThreads) {
  TempFolder dir("threads");
  SceneDescription scene = ersScene(3072, 1536, kDoppler);
  scene.pixelTargets = {{1500.25, 700.5, 0.0, 4.0}};
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), files, error)) << error;
  std::string product[2];
  for (int threads = 1; threads <= 2; ++threads) {
    const std::string run = (dir / ("run" + std::to_string(threads))) + "/";
    fs::create_directories(run);
    writeJob(run + "job.txt", ersJob(files, run + "out"));
    RunOptions options;
    options.variables = {{"OMP_NUM_THREADS", std::to_string(threads)},
                         {"TESSIVOR_FFT_THREADS", std::to_string(threads)}};
    const FocuserRun r = runFocuser(run, run + "job.txt", options);
    ASSERT_EQ(r.exitStatus, 0) << r.log << r.stderrText;
    product[threads - 1] = readText(run + "out_slc");
    ASSERT_GT(product[threads - 1].size(), 1000000u);
  }
  EXPECT_TRUE(product[0] == product[1]);
}
