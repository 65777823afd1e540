// Simulated ALOS PALSAR level-1.0 products through the executable: JAXA
// single and dual polarisation, an ERSDAC dual-polarisation product, lost
// lines within and beyond the leader's limit, and the extraction of a
// polarimetric product. L band needs long scenes: at about 500 Hz/s the
// processed aperture is about 6500 lines, so every focused scene here has
// 12288 lines (5120 focused lines) and a narrow range window.
#include <gtest/gtest.h>

#include <cmath>

#include "core/palsar_rfi.h"
#include "focus/sensors/palsar_focusers.h"
#include "ingest/palsar/palsar_extractor.h"
#include "product/general_sar.h"
#include "sim/palsar_writer.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"
#include "support/scenes.h"

using namespace support;

namespace {

constexpr int kLines = 12288;

SceneDescription palsarScene(const PalsarSimConfig& cfg, int lines, int samples) {
  SceneDescription s = ersScene(lines, samples, 0.0);
  s.nearRangeTime = 0.00567;
  s.clutterSigma = 1.0;
  s.noiseSigma = 0.5;
  s.orbitNumber = 12345;
  applyPalsarInstrument(cfg, s);
  // Inside the lines that the azimuth overlap keeps (3584 to 8704) and
  // clear of the far range, where the last range sub-block ends.
  s.pixelTargets = {{5000.25, 250.5, 0.0, 4.0}, {6200.0, 500.25, 60.0, 4.0}, {7400.5, 750.0, 0.0, 4.0}};
  return s;
}

// The 24 parameters of a PALSAR job: scenes, output, orbit and leader (the
// leader's platform position record is the orbit).
Job palsarJob(const std::string& platform, const PalsarSceneFiles& f, const std::string& out) {
  Job p(24, "NotOK");
  p[0] = platform;
  for (std::size_t k = 0; k < f.images.size() && k < 4; ++k) p[1 + k] = f.images[k];
  p[5] = out;
  p[6] = p[7] = f.leader;
  p[16] = p[17] = p[20] = p[21] = p[23] = "0";
  return p;
}

int occurrences(const std::string& text, const std::string& part) {
  int n = 0;
  for (auto at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) ++n;
  return n;
}

// Products of a run meet the bars, each against the same truth.
void expectProducts(const TempFolder& dir, const std::vector<std::string>& products, std::size_t targets) {
  for (const std::string& name : products) {
    SCOPED_TRACE(name);
    const std::string product = dir / name;
    const std::string store = product + ".TessivorParameterExtracted";
    GeneralSAR record;
    ASSERT_EQ(record.GSread(store), 0);
    EXPECT_EQ(record.dataSetInfo.SensorName, "PALSAR");
    const PtaReport pta = analyseProduct(dir.str(), product, store, dir / "sim/truth.txt");
    ASSERT_EQ(pta.exitStatus, 0) << pta.table;
    expectTheoreticalResponses(pta, targets);
    expectTruthPositions(pta);
  }
}

}  // namespace

TEST(PalsarEndToEnd, DualPolarisationSceneGivesBothProductsWithOneDopplerEstimation) {
  TempFolder dir("palsar_fbd");
  PalsarSimConfig cfg;
  cfg.mode = "FBD";
  const SceneDescription scene = palsarScene(cfg, kLines, 1600);
  PalsarSceneFiles files;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &files, error), 0) << error;
  ASSERT_EQ(files.images.size(), 2u);
  writeJob(dir / "job.txt", palsarJob("PALSAR", files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  EXPECT_TRUE(contains(run.log, "SUCCESSFUL")) << run.log;
  // The second polarisation is focused with the first one's Doppler.
  EXPECT_EQ(occurrences(run.trace, "DC Estimation"), 1) << run.trace;
  EXPECT_EQ(occurrences(run.trace, "Doppler centroid and rate taken from the first polarisation"), 1);
  expectProducts(dir, {"out_hh_slc", "out_hv_slc"}, scene.pixelTargets.size());
  GeneralSAR hv;
  ASSERT_EQ(hv.GSread(dir / "out_hv_slc.TessivorParameterExtracted"), 0);
  EXPECT_EQ(hv.dataSetInfo.Polarization, "H/V");
}

TEST(PalsarEndToEnd, SinglePolarisationSceneWithLostLinesIsRepairedAndFocused) {
  TempFolder dir("palsar_fbs");
  PalsarSimConfig cfg;
  cfg.maxMissingLines = 20;
  SceneDescription scene = palsarScene(cfg, kLines, 2000);
  scene.pixelTargets = {{5000.25, 300.5, 0.0, 4.0}, {6200.0, 550.25, 60.0, 4.0}, {7400.5, 800.0, 0.0, 4.0}};
  // 12 lines lost, limit 20, before the apertures of the targets: a
  // timeline without the repeats would move every target by 12 lines.
  for (int line = 1000; line < 1012; ++line) scene.dropLines.push_back(line);
  PalsarSceneFiles files;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &files, error), 0) << error;
  writeJob(dir / "job.txt", palsarJob("PALSAR", files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  EXPECT_TRUE(contains(run.trace, "Invalid Line Number! A missing line is probably detected")) << run.trace;
  expectProducts(dir, {"out_slc"}, scene.pixelTargets.size());
}

TEST(PalsarEndToEnd, LostLinesBeyondTheLeaderLimitEndTheRun) {
  TempFolder dir("palsar_gap");
  PalsarSimConfig cfg;
  cfg.maxMissingLines = 10;
  SceneDescription scene = palsarScene(cfg, 600, 1200);
  for (int line = 200; line < 230; ++line) scene.dropLines.push_back(line);
  PalsarSceneFiles files;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &files, error), 0) << error;
  writeJob(dir / "job.txt", palsarJob("PALSAR", files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_NE(run.errorCode, 0) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "FOCUSSING STAGE FAILED")) << run.log;
  EXPECT_TRUE(contains(run.trace, "Missing lines are more than missing lines number written in the Leader File"))
      << run.trace;
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}

TEST(PalsarEndToEnd, ErsdacDualPolarisationProductWithItsShorterLinePrefixes) {
  TempFolder dir("palsar_ersdac");
  PalsarSimConfig cfg;
  cfg.mode = "FBD";
  cfg.layout = "ERSDAC";
  const SceneDescription scene = palsarScene(cfg, kLines, 1600);
  PalsarSceneFiles files;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &files, error), 0) << error;
  writeJob(dir / "job.txt", palsarJob("PALSAR_ERSDAC", files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  EXPECT_EQ(occurrences(run.trace, "DC Estimation"), 1) << run.trace;
  expectProducts(dir, {"out_hh_slc", "out_hv_slc"}, scene.pixelTargets.size());
}

TEST(PalsarExtraction, PolarimetricProductHalvesTheLeaderPrfAndKeepsTheDownChirp) {
  TempFolder dir("palsar_plr");
  PalsarSimConfig cfg;
  cfg.mode = "PLR";
  const SceneDescription scene = palsarScene(cfg, 64, 1200);
  PalsarSceneFiles files;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &files, error), 0) << error;
  ASSERT_EQ(files.images.size(), 4u);
  ATPalExtractor x;
  x.LeaFileName = files.leader;
  x.RawDataName = files.images[2];  // V/H
  x.Orbit_Filename = files.leader;
  x.OutputFile = dir / "vh.extracted";
  x.OutputChirp = dir / "vh.chirp";
  ASSERT_EQ(x.run(), 0);
  EXPECT_EQ(x.acquisitionMode, 2);
  EXPECT_NEAR(x.record.sampling.prf_hz, scene.prfHz, 1e-6);
  EXPECT_DOUBLE_EQ(x.record.pulse.Bandwidth, 14000000.0);
  std::string pol;
  ASSERT_EQ(x.getPolarization(0, pol), 0);
  EXPECT_EQ(pol, "V/H");
  EXPECT_EQ(x.getPolarization(1, pol), 1);
  EXPECT_EQ(x.getVectorLength(), 64);
  // 27 us at 16 MHz: 432 samples whose frequency falls over the pulse.
  std::vector<fcomplex> chirp;
  ASSERT_EQ(x.extract_chirp(0, chirp), 0);
  ASSERT_EQ(chirp.size(), 432u);
  const double early = std::arg(chirp[11] * std::conj(chirp[10]));
  const double late = std::arg(chirp[421] * std::conj(chirp[420]));
  EXPECT_GT(early, 0.5);
  EXPECT_LT(late, -0.5);
  EXPECT_NEAR(std::abs(chirp[0]), 1.0 / std::sqrt(16.0 / 14.0), 1e-6);
  EXPECT_TRUE(fs::exists(dir / "vh.chirp.hdr"));
}

namespace {

// The profile with interference removal switched on or off.
std::string profileWith(const TempFolder& dir, int removeInterferences) {
  std::string text = readText(std::string(resourcesDir()) + "parameters_PALSAR.hdr");
  const std::string key = "Remove_interferences = 0";
  text.replace(text.find(key), key.size(), "Remove_interferences = " + std::to_string(removeInterferences));
  const std::string name = dir / ("profile" + std::to_string(removeInterferences) + ".hdr");
  writeText(name, text);
  return name;
}

// Focuses the HH image of a simulation in-process; the product's record is
// "<root>.hdr".
PtaReport focusAndMeasure(const TempFolder& dir, const PalsarSceneFiles& f, const std::string& root, int remove) {
  rfiGaussianReset();
  palsarLevel0Focuser focuser;
  focuser.level0Filename = f.images[0];
  focuser.leaderFilename = f.leader;
  focuser.orbitFilename = f.leader;
  focuser.configurationFilename = profileWith(dir, remove);
  focuser.outputFilename = dir / root;
  EXPECT_EQ(focuser.run(), 0);
  return analyseProduct(dir.str(), dir / root, dir / (root + ".hdr"), dir / "sim/truth.txt");
}

}  // namespace

TEST(HeavyPalsarEndToEnd, InterferenceRemovalRestoresTheTargetsOfAJammedScene) {
  TempFolder dir("palsar_rfi");
  PalsarSimConfig cfg;
  cfg.mode = "FBD";
  const SceneDescription scene = palsarScene(cfg, kLines, 1600);
  PalsarSceneFiles clean, jammed;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &clean, error), 0) << error;
  const PtaReport reference = focusAndMeasure(dir, clean, "clean", 0);
  ASSERT_EQ(reference.exitStatus, 0) << reference.table;

  // Two tones 20 dB over the clutter in their range bins and two
  // single-line bursts in different blocks.
  cfg.tones = {{3.0e6, 20.0}, {-4.5e6, 20.0}};
  cfg.bursts = {{6000, 25.0}, {6500, 25.0}};
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &jammed, error), 0) << error;
  const PtaReport filtered = focusAndMeasure(dir, jammed, "filtered", 1);
  const PtaReport unfiltered = focusAndMeasure(dir, jammed, "unfiltered", 0);
  ASSERT_EQ(filtered.exitStatus, 0) << filtered.table;
  ASSERT_EQ(unfiltered.exitStatus, 0) << unfiltered.table;
  EXPECT_FALSE(fs::exists(dir / "unfiltered.extracted.interf"));
  ASSERT_TRUE(fs::exists(dir / "filtered.extracted.interf"));

  // Impulse responses of the filtered scene against the clean one: tones of
  // 20 dB in their bins hardly touch targets of this strength unfiltered
  // (0.45 dB), and the notches of the filter cost up to 0.7 dB of range ISLR.
  double worstFiltered = 0.0;
  for (std::size_t i = 0; i < reference.targets.size(); ++i)
    for (int axis = 0; axis < 2; ++axis) {
      auto pick = [axis](const PtaTarget& t) { return axis == 0 ? t.range : t.azimuth; };
      const IrMetrics r = pick(reference.targets[i]), a = pick(filtered.targets[i]);
      worstFiltered = std::max({worstFiltered, std::fabs(a.pslrDb - r.pslrDb), std::fabs(a.islrDb - r.islrDb)});
    }
  EXPECT_LT(worstFiltered, 1.0) << reference.table << filtered.table;
  expectTruthPositions(filtered);

  // The mask marks the tone bins as persistent and the burst lines.
  const int F = genpow(1600, 1);
  const std::string mask = readText(dir / "filtered.extracted.interf_rfimask");
  ASSERT_EQ(mask.size(), std::size_t(F) * kLines);
  auto at = [&](int line, int bin) { return int(mask[std::size_t(line) * F + std::size_t((bin + F) % F)]); };
  for (double freq : {3.0e6, -4.5e6}) {
    const int bin = static_cast<int>(std::lround(freq / 16e6 * F));
    EXPECT_EQ(at(3000, bin), 1) << freq;
    EXPECT_EQ(at(9000, bin), 1) << freq;
  }
  EXPECT_EQ(at(3000, static_cast<int>(std::lround(1.0e6 / 16e6 * F))), 0);
  EXPECT_EQ(at(6000, static_cast<int>(std::lround(0.17 * F))), 2);
}
