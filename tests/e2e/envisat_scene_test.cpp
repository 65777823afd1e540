// Simulated ENVISAT ASAR image-mode scenes through the executable as the
// host runs it: a full IS2 swath with lost packets, its auxiliary files
// found in folders holding several generations, measured against the
// simulator's truth; and a folder without a valid instrument file.
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>

#include "product/general_sar.h"
#include "sim/envisat_aux_writer.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"

using namespace support;

namespace {

constexpr int kLines = 4608;
constexpr int kSamples = 5600;  // a full IS2 window
constexpr double kDoppler = 300.0;

// The example orbit with the ASAR instrument in swath IS2, targets across
// the window and along the lines that the azimuth overlap keeps.
SceneDescription asarScene(const AsarSimConfig& cfg, int lines, int samples) {
  SceneDescription s = envisatScene(cfg, lines, samples, kDoppler);
  s.pixelTargets = {{1800.5, 350.25, 0.0, 4.0},   {2450.0, 1500.5, 80.0, 4.0}, {2050.25, 2700.0, 0.0, 4.0},
                    {2750.75, 3800.5, 150.0, 4.0}, {2250.0, 4700.75, 0.0, 4.0}};
  return s;
}

// A file that the type tests and the validity search take for `prefix`
// but that holds nothing beyond its main header.
void decoy(const std::string& folder, const std::string& prefix, double generation, double start, double stop) {
  const std::string name = envisatAuxName(prefix, generation, start, stop);
  writeText(folder + "/" + name, envisatMph(name, generation, start, stop));
}

}  // namespace

TEST(EnvisatEndToEnd, ImageModeSceneWithLostPacketsFocusedWithinTheImageQualityBounds) {
  TempFolder dir("asar_im");
  AsarSimConfig cfg;
  SceneDescription scene = asarScene(cfg, kLines, kSamples);
  for (int k = 0; k < 20; ++k) scene.dropLines.push_back(300 + 210 * k);  // 20 lost packets
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateEnvisat(scene, cfg, dir.str(), files, error)) << error;
  // Other generations in the same folders: an older one valid at the
  // sensing time and a later one that is not valid yet; neither may win.
  const double t = scene.startTime, day = 86400.0;
  for (const char* prefix : {"ASA_INS_AXVIEC", "ASA_XCA_AXVIEC", "ASA_XCH_AXVIEC"}) {
    decoy(files["aux_dir"], prefix, t - 90 * day, t - 400 * day, t + 400 * day);
    decoy(files["aux_dir"], prefix, t - 5 * day, t + 2 * day, t + 400 * day);
  }

  writeJob(dir / "job.txt", envisatJob(files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  ASSERT_EQ(run.errorCode, 0) << run.errorFile;
  EXPECT_TRUE(contains(run.log, "SUCCESSFUL")) << run.log;
  EXPECT_TRUE(contains(run.trace, "Data is corrupted") == false) << "lost packets are gaps, not corruption";

  const std::string product = dir / "out_slc";
  const std::string store = product + ".TessivorParameterExtracted";
  GeneralSAR record;
  ASSERT_EQ(record.GSread(store), 0) << run.trace;
  ASSERT_GT(record.roi.roi.Lines, 1000);
  ASSERT_GT(record.roi.roi.Samples, 4500);
  EXPECT_EQ(record.dataSetInfo.Swath, "IS2");

  const PtaReport pta = analyseProduct(dir.str(), product, store, files.truth);
  ASSERT_EQ(pta.exitStatus, 0) << pta.table;
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  expectTruthPositions(pta);
  expectCornersOnTheGround(record, RawSceneSimulator(scene), files.truth);
}

TEST(EnvisatEndToEnd, FolderWithoutAValidInstrumentFileEndsWithItsCode) {
  TempFolder dir("asar_noins");
  AsarSimConfig cfg;
  const SceneDescription scene = asarScene(cfg, 600, 1024);
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateEnvisat(scene, cfg, dir.str(), files, error)) << error;
  fs::remove(files["ins"]);
  decoy(files["aux_dir"], "ASA_INS_AXVIEC", scene.startTime, scene.startTime + 86400.0, scene.startTime + 9e6);
  writeJob(dir / "job.txt", envisatJob(files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_EQ(run.errorCode, EC_INS_MISSING) << run.errorFile << run.log;
  EXPECT_TRUE(contains(run.log, "INPUT FILE 2")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}

// Mean power of a channel's clutter over the range columns from
// firstColumn on, by place in the burst cycle: the lines folded modulo the
// cycle of `cycle` lines into `bins` stretches, in dB. Folding averages the
// speckle of several cycles, so that what remains is the scalloping.
std::vector<double> clutterByBurstPhaseDb(const std::string& product, int lines, int samples, int firstColumn,
                                          int cycle, int bins) {
  std::ifstream in(product, std::ios::binary);
  std::vector<fcomplex> row(static_cast<std::size_t>(samples));
  std::vector<double> sum(static_cast<std::size_t>(bins), 0.0), count(static_cast<std::size_t>(bins), 0.0);
  // Whole cycles only, so that every place in the cycle is seen equally often.
  for (int l = 0; l < lines / cycle * cycle; ++l) {
    in.read(reinterpret_cast<char*>(row.data()), std::streamsize(row.size() * sizeof(fcomplex)));
    const std::size_t b = static_cast<std::size_t>((l % cycle) * bins / cycle);
    for (int s = firstColumn; s < samples; ++s) sum[b] += std::norm(row[std::size_t(s)]);
    count[b] += samples - firstColumn;
  }
  std::vector<double> profile;
  for (int b = 0; b < bins; ++b) profile.push_back(10.0 * std::log10(sum[std::size_t(b)] / count[std::size_t(b)]));
  return profile;
}

// An alternating-polarisation mode in one swath, and the labels of its two
// channels.
struct ApCase {
  const char* mode;
  int swath;
  int priCode;             // PRF = 19.20768 MHz / code
  double nearRangeTime;    // beyond rank / PRF, where the window of the swath opens
  const char* first;
  const char* second;
};

class EnvisatAlternatingPolarisation : public ::testing::TestWithParam<ApCase> {};

// Both channels of each mode against the burst theory of their own targets:
// each channel holds bursts of its polarisation, so a target's spectrum is
// gated by the bursts, and the de-scalloping keeps four burst bandwidths.
TEST_P(EnvisatAlternatingPolarisation, BothChannelsMeetTheBurstTheoryAndAreDescalloped) {
  const ApCase& c = GetParam();
  TempFolder dir("asar_ap");
  AsarSimConfig cfg;
  cfg.mode = c.mode;
  cfg.swath = c.swath;
  cfg.priCode = c.priCode;
  SceneDescription scene = asarScene(cfg, kLines, 2048);
  scene.nearRangeTime = c.nearRangeTime;
  // Targets in the near half at several places in the burst cycle; the far
  // half holds clutter only.
  scene.pixelTargets = {{2100.25, 300.5, 0.0, 4.0}, {2300.0, 500.25, 60.0, 4.0}, {2430.5, 700.0, 0.0, 4.0}};
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateEnvisat(scene, cfg, dir.str(), files, error)) << error;
  writeJob(dir / "job.txt", envisatJob(files, dir / "out"));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  EXPECT_TRUE(contains(run.trace, "AP RAW DATA DETECTED")) << run.trace;

  for (const char* label : {c.first, c.second}) {
    SCOPED_TRACE(label);
    const std::string product = dir / ("out_" + std::string(label) + "_slc");
    const std::string store = product + ".TessivorParameterExtracted";
    GeneralSAR record;
    ASSERT_EQ(record.GSread(store), 0) << run.trace;
    EXPECT_EQ(record.dataSetInfo.Swath, "IS" + std::to_string(c.swath));
    const ROI_Obj& roi = record.roi.roi;
    const PtaReport pta = analyseProduct(dir.str(), product, store, files.truth);
    ASSERT_EQ(pta.exitStatus, 0) << pta.table;
    expectTheoreticalResponses(pta, scene.pixelTargets.size());
    expectTruthPositions(pta);
    // De-scalloped: the clutter power does not follow the bursts.
    ASSERT_GT(roi.Samples, 1100);
    const int cycle = 2 * record.swath.Echoes_per_burst;
    ASSERT_GT(cycle, 0);
    ASSERT_GE(roi.Lines, 3 * cycle);
    const std::vector<double> profile = clutterByBurstPhaseDb(product, roi.Lines, roi.Samples, 1024, cycle, 16);
    const auto [lo, hi] = std::minmax_element(profile.begin(), profile.end());
    std::string text;
    for (double v : profile) text += " " + std::to_string(v - profile.front()).substr(0, 5);
    EXPECT_LT(*hi - *lo, 0.5) << "clutter power by sixteenths of the burst cycle, dB:" << text;
  }
}

// APH: the first channel is H/V, the second H/H; APC V/V and H/H; APV V/V
// and V/H. The swaths differ in burst length (196, 218 and 297 echoes), PRF
// (1650, 1650 and 2000 Hz) and range.
INSTANTIATE_TEST_SUITE_P(Modes, EnvisatAlternatingPolarisation,
                         ::testing::Values(ApCase{"APH", 2, 11641, 0.00555, "hv", "hh"},
                                           ApCase{"APC", 4, 11641, 0.0064, "vv", "hh"},
                                           ApCase{"APV", 7, 9604, 0.0072, "vv", "vh"}),
                         [](const ::testing::TestParamInfo<ApCase>& info) { return std::string(info.param.mode); });
