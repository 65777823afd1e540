// A simulated ERS scene of full swath width through the executable and a
// job file, as the host runs it: the focused product is checked against the
// simulator's truth (positions, impulse responses, phases, Doppler centroid,
// corners), and a host stop during azimuth focusing ends the run.
#include <gtest/gtest.h>

#include <set>

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

// Value of a key of the truth file's [Scene] section.
double truthValue(const std::string& truthFile, const std::string& key) {
  SimIni ini;
  std::string error;
  if (!ini.load(truthFile, error)) return std::nan("");
  return ini.getDouble("Scene", key, std::nan(""));
}

// Distance between two points on the ellipsoid, metres.
double groundDistance(double lat1, double lon1, double lat2, double lon2) {
  return norm(geodeticToEcef(lat1, lon1, 0.0) - geodeticToEcef(lat2, lon2, 0.0));
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

  // Corners: each within 30 m of the ground point that the corner pixel
  // shows (zero Doppler, on the ellipsoid).
  const double offset = truthValue(files.truth, "range_peak_offset_samples");
  const double c = 299792458.0;
  const double t0 = roi.SlowStartTime, t1 = t0 + roi.SlowTimeDelta * roi.Lines;
  const double r0 = roi.FastStartTime - offset * roi.FastTimeDelta;
  const double r1 = r0 + roi.FastTimeDelta * roi.Samples;
  struct Corner {
    double lat, lon;
  };
  std::vector<Corner> truth;
  for (double t : {t0, t1})
    for (double r : {r0, r1}) {
      Corner k{};
      ASSERT_TRUE(zeroDopplerPoint(sim.orbit(), t, r * c / 2.0, 0.0, scene.lookSign, k.lat, k.lon));
      truth.push_back(k);
    }
  const geoCoords_Obj& corners = record.geoCoords;
  std::set<int> matched;
  for (const geopoint* g : {&corners.NW, &corners.NE, &corners.SW, &corners.SE}) {
    int best = -1;
    double bestDistance = 1e30;
    for (int k = 0; k < 4; ++k) {
      const double d = groundDistance(g->lat, g->lon, truth[k].lat, truth[k].lon);
      if (d < bestDistance) bestDistance = d, best = k;
    }
    EXPECT_LT(bestDistance, 30.0) << g->lat << " " << g->lon;
    matched.insert(best);
  }
  EXPECT_EQ(matched.size(), 4u);
  Corner centre{};
  ASSERT_TRUE(zeroDopplerPoint(sim.orbit(), 0.5 * (t0 + t1), 0.5 * (r0 + r1) * c / 2.0, 0.0,
                               scene.lookSign, centre.lat, centre.lon));
  EXPECT_LT(groundDistance(corners.center.lat, corners.center.lon, centre.lat, centre.lon), 30.0);
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
