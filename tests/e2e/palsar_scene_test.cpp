// Simulated ALOS PALSAR level-1.0 products through the executable: JAXA
// single, dual and quad polarisation, an ERSDAC dual-polarisation product,
// lost lines within and beyond the leader's limit, and interference removal.
// L band needs long scenes: at about 500 Hz/s the processed aperture is
// about 5600 lines and the azimuth blocks overlap by 7168 lines, so every
// focused scene here has 12288 lines (5120 focused lines). The default run
// keeps one scene of 4000 samples and the ERSDAC dual-polarisation scene on
// a narrow window; the heavy cases run every mode on 4000 samples.
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

// Targets inside the lines that the azimuth overlap keeps (3584 to 8704)
// and clear of the far range, where the chirp of the last echoes runs out
// of the window and the last range sub-block ends.
std::vector<SimPixelTarget> spreadTargets(int samples) {
  if (samples < 3000) return {{5000.25, 250.5, 0.0, 4.0}, {6200.0, 500.25, 60.0, 4.0}, {7400.5, 750.0, 0.0, 4.0}};
  return {{5000.25, 1000.5, 0.0, 4.0}, {6200.0, 1900.25, 60.0, 4.0}, {7400.5, 2800.0, 0.0, 4.0}};
}

SceneDescription targetScene(const PalsarSimConfig& cfg, int lines, int samples) {
  SceneDescription s = support::palsarScene(cfg, lines, samples);
  s.pixelTargets = spreadTargets(samples);
  return s;
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

// A simulated product of `mode` and `layout` through the executable: exit 0,
// one Doppler estimation, every product within the bars.
void focusAllPolarisations(const std::string& mode, const std::string& layout, int samples) {
  TempFolder dir("palsar_" + mode + "_" + layout);
  PalsarSimConfig cfg;
  cfg.mode = mode;
  cfg.layout = layout;
  const SceneDescription scene = targetScene(cfg, kLines, samples);
  PalsarSceneFiles files;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &files, error), 0) << error;
  ASSERT_EQ(files.images.size(), std::size_t(cfg.channels()));
  writeJob(dir / "job.txt", palsarJob(layout == "ERSDAC" ? "PALSAR_ERSDAC" : "PALSAR", files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  EXPECT_TRUE(contains(run.log, "SUCCESSFUL")) << run.log;
  // Further polarisations are focused with the first one's Doppler.
  EXPECT_EQ(occurrences(run.trace, "DC Estimation"), 1) << run.trace;
  EXPECT_EQ(occurrences(run.trace, "Doppler centroid and rate taken from the first polarisation"),
            cfg.channels() - 1);
  std::vector<std::string> products;
  for (const std::string& label : files.labels) {
    std::string lower = label;
    for (char& c : lower) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    products.push_back("out_" + lower + "_slc");
  }
  expectProducts(dir, products, scene.pixelTargets.size());
}

}  // namespace

TEST(PalsarEndToEnd, SinglePolarisationSceneWithLostLinesIsRepairedAndFocused) {
  TempFolder dir("palsar_fbs");
  PalsarSimConfig cfg;
  cfg.maxMissingLines = 20;
  SceneDescription scene = targetScene(cfg, kLines, 4000);
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
  SceneDescription scene = targetScene(cfg, 600, 1200);
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
  focusAllPolarisations("FBD", "ERSDAC", 1600);
}

TEST(HeavyPalsarEndToEnd, DualPolarisationScene) { focusAllPolarisations("FBD", "JAXA", 4000); }
TEST(HeavyPalsarEndToEnd, QuadPolarisationSceneWithInterleavedTransmissions) {
  focusAllPolarisations("PLR", "JAXA", 4000);
}
TEST(HeavyPalsarEndToEnd, ErsdacDualPolarisationScene) { focusAllPolarisations("FBD", "ERSDAC", 4000); }

TEST(PalsarExtraction, PolarimetricProductHalvesTheLeaderPrfAndKeepsTheDownChirp) {
  TempFolder dir("palsar_plr");
  PalsarSimConfig cfg;
  cfg.mode = "PLR";
  const SceneDescription scene = targetScene(cfg, 64, 1200);
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
  // V-transmit lines follow the H-transmit lines by half a pulse interval.
  EXPECT_NEAR(x.record.roi.SlowStartTime - scene.startTime, 0.5 / scene.prfHz, 1e-6);
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
  // The Doppler log goes to the working folder: the scratch folder's.
  struct InFolder {
    fs::path back = fs::current_path();
    explicit InFolder(const std::string& folder) { fs::current_path(folder); }
    ~InFolder() { fs::current_path(back); }
  } in(dir.path());
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

// The largest difference of PSLR or ISLR, either axis, between the targets
// of two measurements of one scene; a target lost counts as 100 dB.
double worstDifference(const PtaReport& a, const PtaReport& b) {
  double worst = 0.0;
  for (std::size_t i = 0; i < a.targets.size() && i < b.targets.size(); ++i) {
    if (!a.targets[i].found || !b.targets[i].found) return 100.0;
    for (int axis = 0; axis < 2; ++axis) {
      auto pick = [axis](const PtaTarget& t) { return axis == 0 ? t.range : t.azimuth; };
      const IrMetrics x = pick(a.targets[i]), y = pick(b.targets[i]);
      worst = std::max({worst, std::fabs(x.pslrDb - y.pslrDb), std::fabs(x.islrDb - y.islrDb)});
    }
  }
  return worst;
}

}  // namespace

TEST(HeavyPalsarEndToEnd, InterferenceRemovalRestoresTheTargetsOfAJammedScene) {
  constexpr int kSamples = 4000;
  TempFolder dir("palsar_rfi");
  PalsarSimConfig cfg;
  cfg.mode = "FBD";
  const SceneDescription scene = targetScene(cfg, kLines, kSamples);
  PalsarSceneFiles clean, jammed;
  std::string error;
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &clean, error), 0) << error;
  const PtaReport reference = focusAndMeasure(dir, clean, "clean", 0);
  ASSERT_EQ(reference.exitStatus, 0) << reference.table;
  // The filter leaves a clean scene as it is.
  const PtaReport cleanFiltered = focusAndMeasure(dir, clean, "cleanfiltered", 1);
  ASSERT_EQ(cleanFiltered.exitStatus, 0) << cleanFiltered.table;
  EXPECT_LT(worstDifference(reference, cleanFiltered), 0.2) << reference.table << cleanFiltered.table;

  // Two tones 20 dB over the clutter in their bins of a 256-bin range
  // spectrum and two single-line bursts in different blocks. Left in, the
  // tones raise the azimuth sidelobes by about 0.8 dB (and pull the
  // estimated centroid by some 290 Hz); removed, the targets come back to
  // within a tenth of a decibel.
  cfg.tones = {{3.0e6, 20.0}, {-4.5e6, 20.0}};
  cfg.bursts = {{6000, 25.0}, {6500, 25.0}};
  ASSERT_EQ(writePalsarScene(scene, cfg, dir / "sim", &jammed, error), 0) << error;
  const PtaReport filtered = focusAndMeasure(dir, jammed, "filtered", 1);
  const PtaReport unfiltered = focusAndMeasure(dir, jammed, "unfiltered", 0);
  ASSERT_EQ(filtered.exitStatus, 0) << filtered.table;
  ASSERT_EQ(unfiltered.exitStatus, 0) << unfiltered.table;
  EXPECT_FALSE(fs::exists(dir / "unfiltered.extracted.interf"));
  ASSERT_TRUE(fs::exists(dir / "filtered.extracted.interf"));

  EXPECT_LT(worstDifference(reference, filtered), 0.5) << reference.table << filtered.table;
  EXPECT_GT(worstDifference(reference, unfiltered), 0.5) << reference.table << unfiltered.table;
  expectTruthPositions(filtered);

  // The mask marks the tone bins as persistent and the burst lines.
  const int F = genpow(kSamples, 1);
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
  EXPECT_EQ(at(6001, static_cast<int>(std::lround(0.17 * F))), 0);
}
