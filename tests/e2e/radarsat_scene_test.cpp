// Simulated RADARSAT-1 scenes (Standard and Fine beams, with a sampling
// window step and a receiver attenuation step mid-scene) through the
// executable: every target against the simulator's truth.
#include <gtest/gtest.h>

#include "product/data_file.h"
#include "product/general_sar.h"
#include "sim/radarsat_ceos_writer.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"
#include "support/scenes.h"

using namespace support;

namespace {

constexpr int kLines = 4608;

struct BeamCase {
  const char* beam;
  int rateCode, waveform, samples;
  double nearRange;  // s: the beam's pulses in flight at 1300 Hz, then 0.4 ms
};

// Targets before and after the window step (line 2300) and the attenuation
// step (line 2500), across the swath.
SceneDescription rsatScene(const BeamCase& c) {
  SceneDescription s = ersScene(kLines, c.samples, 0.0);
  s.sceneDir = "RSAT_SIM";
  s.prfHz = 1300.0;
  s.antennaLength = 15.0;
  s.nearRangeTime = c.nearRange;
  s.clutterSigma = 1.0;
  s.noiseSigma = 0.5;
  const double w = c.samples;
  s.pixelTargets = {{1700.25, 0.2 * w, 0.0, 4.0},
                    {2050.0, 0.45 * w, 80.0, 4.0},
                    {2750.75, 0.3 * w, 0.0, 4.0},
                    {2900.5, 0.55 * w, 40.0, 4.0}};
  return s;
}

// The job of a simulated product: the leader is orbit source and leader;
// temporary files erased.
Job rsatJob(const RadarsatSceneWriter& writer, const TempFolder& dir) {
  Job p(24, "NotOK");
  p[0] = "RADARSAT";
  p[1] = writer.dataPath(dir / "sim");
  p[5] = dir / "out";
  p[6] = writer.leaderPath(dir / "sim");
  p[7] = p[6];
  p[16] = p[17] = p[20] = p[21] = p[23] = "0";
  p[18] = "1";
  return p;
}

void focusAndMeasure(const BeamCase& c) {
  TempFolder dir(c.beam);
  const SceneDescription scene = rsatScene(c);
  RadarsatOptions o;
  o.beam = c.beam;
  o.rateCode = c.rateCode;
  o.waveform = c.waveform;
  o.replicaEvery = 1000;
  o.windowChangeLine = 2300;
  o.windowChangeCodes = 40;
  o.gainChangeLine = 2500;
  o.gainChangeDb = 3;
  std::string error;
  const RadarsatSceneWriter writer(scene, o);
  ASSERT_EQ(writer.write(dir / "sim", error), 0) << error;

  writeJob(dir / "job.txt", rsatJob(writer, dir));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText << run.trace.substr(0, 3000);
  EXPECT_TRUE(contains(run.log, "SUCCESSFUL")) << run.log;
  EXPECT_TRUE(contains(run.trace, "RADARSAT image extracted"));
  EXPECT_TRUE(contains(run.trace, "ADC code change"));
  EXPECT_TRUE(contains(run.trace, "Replica samples detected at line 1001"));

  const std::string product = dir / "out_slc";
  const std::string store = product + ".TessivorParameterExtracted";
  const PtaReport pta = analyseProduct(dir.str(), product, store, dir / "sim/truth.txt");
  ASSERT_EQ(pta.exitStatus, 0) << pta.table;
  expectTheoreticalResponses(pta, scene.pixelTargets.size());
  expectTruthPositions(pta);

  // Corners of the record: each within the corner bar of the zero-Doppler
  // ground point of the product's first or last line and sample.
  GeneralSAR record;
  ASSERT_EQ(record.GSread(store), 0);
  expectCornersOnTheGround(record, writer.simulator(), dir / "sim/truth.txt");
}

}  // namespace

TEST(RadarsatEndToEnd, FineBeamWithWindowAndGainSteps) {
  focusAndMeasure({"F2", 0, 0, 3000, 8.0 / 1300.0 + 0.0004});
}

TEST(RadarsatEndToEnd, StandardBeamWithWindowAndGainSteps) {
  focusAndMeasure({"S3", 1, 1, 2400, 8.0 / 1300.0 + 0.0004});
}

TEST(RadarsatEndToEnd, BeamCodeOutsideTheTableEndsTheJobWithTheStageFailure) {
  TempFolder dir("badbeam");
  SceneDescription scene = rsatScene({"S3", 1, 1, 2400, 8.0 / 1300.0 + 0.0004});
  scene.lines = 64;
  scene.pixelTargets.clear();
  RadarsatOptions o;
  o.beam = "S3";
  o.badBeamCode = 23;
  std::string error;
  const RadarsatSceneWriter writer(scene, o);
  ASSERT_EQ(writer.write(dir / "sim", error), 0) << error;
  writeJob(dir / "job.txt", rsatJob(writer, dir));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.errorCode, 130560) << run.errorFile << run.log;
  EXPECT_TRUE(contains(run.log, "Beam code 23 outside 1 to 20")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}

// SKIP LINES and EXTRACT LINES of a RADARSAT job count raw lines (not a part
// in percent as for ERS): the product starts at the skipped line's time and
// its target stays at its truth.
TEST(RadarsatEndToEnd, SkipAndExtractLinesCountRawLines) {
  TempFolder dir("skip");
  SceneDescription scene = rsatScene({"S3", 1, 1, 2400, 8.0 / 1300.0 + 0.0004});
  scene.lines = 4096;
  scene.pixelTargets = {{2100.5, 700.0, 0.0, 4.0}};
  RadarsatOptions o;
  o.beam = "S3";
  std::string error;
  const RadarsatSceneWriter writer(scene, o);
  ASSERT_EQ(writer.write(dir / "sim", error), 0) << error;
  Job job = rsatJob(writer, dir);
  job[16] = "400";
  job[17] = "3400";
  job[18] = "NotOK";  // keep the extracted raster
  writeJob(dir / "job.txt", job);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.errorCode, 0) << run.log << run.trace.substr(0, 3000);
  DataFile raw;
  ASSERT_EQ(raw.read_hdr(dir / "out.extracted"), 0);
  EXPECT_EQ(raw.NrOfLinesPerImage, 3400);
  const std::string product = dir / "out_slc";
  GeneralSAR record;
  ASSERT_EQ(record.GSread(product + ".TessivorParameterExtracted"), 0);
  EXPECT_GE(record.roi.roi.SlowStartTime, writer.simulator().lineTime(400) - 1e-6);
  EXPECT_LT(record.roi.roi.SlowStartTime, writer.simulator().lineTime(2100));
  const PtaReport pta =
      analyseProduct(dir.str(), product, product + ".TessivorParameterExtracted", dir / "sim/truth.txt");
  ASSERT_EQ(pta.exitStatus, 0) << pta.table;
  expectTruthPositions(pta);
}

// An SLC product is extracted, then the job ends with a clear message.
TEST(RadarsatEndToEnd, SlcProductEndsTheJobAfterItsExtraction) {
  TempFolder dir("slc");
  SceneDescription scene = rsatScene({"S3", 1, 1, 900, 8.0 / 1300.0 + 0.0004});
  scene.lines = 64;
  scene.pixelTargets.clear();
  std::string error;
  const RadarsatSceneWriter writer(scene, RadarsatOptions{});
  ASSERT_EQ(writer.writeSlc(dir / "sim", false, error), 0) << error;
  writeJob(dir / "job.txt", rsatJob(writer, dir));
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.errorCode, 130560) << run.errorFile << run.log;
  EXPECT_TRUE(contains(run.log + run.trace, "the stripmap chain focuses raw data only")) << run.log;
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}
