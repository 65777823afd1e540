// The ASAR extractor on level-0 products written by the simulator: the FBAQ
// codec through the decoder, a clean image-mode scene, injected damage, a
// truncated product and the burst alternation of an AP scene.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "ingest/envisat/asar_aux.h"
#include "orbit/general_sar_orbit.h"
#include "ingest/envisat/enviextractor.h"
#include "ingest/product_types.h"
#include "product/product_aggregates.h"
#include "product/profile.h"
#include "sim/envisat_aux_writer.h"
#include "sim/envisat_level0_writer.h"
#include "support/files.h"

namespace {

namespace fs = std::filesystem;

constexpr int kLines = 700;
constexpr int kSamples = 600;
// Line 0 sits at cycle position 700, so line 323 is the calibration slot.
constexpr int kCalibrationLine = 323;

class AsarSceneTest : public testing::Test {
 protected:
  void SetUp() override {
    SimIni ini;
    std::string error;
    ASSERT_TRUE(ini.load(TESSIVOR_SOURCE_DIR "/tests/sim/data/asar_im_small_scene.txt", error)) << error;
    ASSERT_TRUE(SceneDescription::fromIni(ini, scene_, error)) << error;
    ASSERT_TRUE(AsarSimConfig::fromIni(ini, cfg_, error)) << error;
    scene_.lines = kLines;
    scene_.samples = kSamples;
    scene_.pixelTargets = {{350.0, 300.0, 0.0, 4.0}};
  }

  // Simulates and extracts; the extraction status.
  int extract() {
    applyAsarInstrument(cfg_, scene_);
    sim_ = std::make_unique<RawSceneSimulator>(scene_);
    std::string error;
    EXPECT_EQ(writeEnvisatScene(*sim_, cfg_, dir_.path(), &files_, error), 0) << error;
    ex_.input.ASA_Level0_File = files_.level0;
    ex_.input.ASA_INS_File = files_.ins;
    ex_.input.ASA_XCA_File = files_.xca;
    ex_.input.Orbit_File = files_.orbit;
    ex_.output.OutputRawFile = dir_ / "raw";
    ex_.output.OutputChirpFile = dir_ / "raw.chirp";
    ex_.output.OutputAntennaPatternFile = dir_ / "raw.pattern";
    return ex_.run();
  }

  // Samples of line k of a raw raster (after its time prefix) and the prefix.
  std::vector<float> line(const std::string& raster, int k, float* prefix = nullptr) const {
    std::ifstream in(raster, std::ios::binary);
    const std::size_t bytes = 4 + 8 * std::size_t(kSamples);
    in.seekg(std::streamoff(bytes * std::size_t(k)));
    std::vector<float> v(1 + 2 * std::size_t(kSamples));
    in.read(reinterpret_cast<char*>(v.data()), std::streamsize(bytes));
    EXPECT_TRUE(in) << raster << " line " << k;
    if (prefix) *prefix = v[0];
    return {v.begin() + 1, v.end()};
  }

  // Relative rms difference of an extracted line and the simulated echo.
  double mismatch(const std::vector<float>& got, int simLine) const {
    std::vector<fcomplex> echo;
    sim_->renderLines(simLine, 1, echo);
    double e = 0.0, p = 0.0;
    for (int k = 0; k < kSamples; ++k) {
      e += std::norm(fcomplex(got[2 * std::size_t(k)], got[2 * std::size_t(k) + 1]) - echo[std::size_t(k)]);
      p += std::norm(echo[std::size_t(k)]);
    }
    return std::sqrt(e / p);
  }

  support::TempFolder dir_{"asar_sim"};
  SceneDescription scene_;
  AsarSimConfig cfg_;
  std::unique_ptr<RawSceneSimulator> sim_;
  AsarSceneFiles files_;
  enviextractor ex_;
};

TEST_F(AsarSceneTest, CleanImageModeScene) {
  ASSERT_EQ(extract(), 0);
  const sarpar& p = ex_.par[0];
  const int c0 = cfg_.firstLineCounter();
  ASSERT_EQ(ex_.getVectorLength(), kLines);
  EXPECT_EQ(p.lines, kLines);
  EXPECT_EQ(p.samples, kSamples);
  EXPECT_EQ(p.swathNumber, 2);
  EXPECT_EQ(p.Swath_rank, 9);
  EXPECT_EQ(p.polarization_type, 1);
  EXPECT_DOUBLE_EQ(p.prf, 19207680.0 / 11641);
  EXPECT_NEAR(p.Azimuth_time_reference, scene_.startTime, 1e-6);
  EXPECT_NEAR(p.nearRangeTime, sim_->swst(), 1e-12);
  for (int k = 0; k < kLines; ++k) {
    ASSERT_EQ(ex_.getMissingVector()[k], k == kCalibrationLine ? 1 : 0) << k;
    ASSERT_EQ(ex_.getSequenceVector()[k], k == kCalibrationLine ? 0 : c0 + k) << k;
    ASSERT_EQ(ex_.getSwstVector()[k], sim_->swstCode()) << k;
  }
  float prefix = 0.0f;
  const std::vector<float> l100 = line(ex_.outputName(0), 100, &prefix);
  EXPECT_EQ(prefix, static_cast<float>(sim_->swst()));
  // 4-bit FBAQ keeps the echo within about 10 % rms after the droop is undone.
  EXPECT_LT(mismatch(l100, 100), 0.15);
  // The calibration packet's line repeats the echo before it.
  EXPECT_EQ(line(ex_.outputName(0), kCalibrationLine), line(ex_.outputName(0), kCalibrationLine - 1));

  GeneralRAWData raw;
  ASSERT_EQ(raw.readhdr(ex_.outputName(0) + ".hdr"), 0);
  EXPECT_EQ(raw.dataSetInfo.Swath, "IS2");
  EXPECT_EQ(raw.dataSetInfo.Polarization, "V/V");
  EXPECT_EQ(raw.dataFile.NrOfLinesPerImage, kLines);
  EXPECT_NEAR(raw.sampling.prf_hz, p.prf, 1e-9);
  EXPECT_NEAR(raw.pulse.PulseLength, 519 / 19207680.0, 1e-15);
  EXPECT_EQ(raw.orbit().pos.size(), 15u);  // five vectors from the DORIS file
  EXPECT_TRUE(fs::exists(ex_.output.OutputChirpFile));
  EXPECT_TRUE(fs::exists(ex_.output.OutputAntennaPatternFile));

  // The extraction parameter record of the scene carries the same values.
  const std::string record = dir_ / "extraction.par";
  ASSERT_EQ(write_param(record, ex_.par, &ex_.ext, files_.level0, files_.ins, 1), 0);
  const char* s = "ExtractionParameters";
  std::vector<int> ints;
  ASSERT_EQ(GetMyProfileIntArray(s, "SWST_code", ints, 1, record), 0);
  EXPECT_EQ(ints.at(0), sim_->swstCode());
  ASSERT_EQ(GetMyProfileIntArray(s, "PRI_code", ints, 1, record), 0);
  EXPECT_EQ(ints.at(0), 11641);
  ASSERT_EQ(GetMyProfileIntArray(s, "Swath_rank(R)", ints, 1, record), 0);
  EXPECT_EQ(ints.at(0), 9);
  ASSERT_EQ(GetMyProfileIntArray(s, "Pulse_length", ints, 1, record), 0);
  EXPECT_EQ(ints.at(0), 519);
  std::vector<double> v;
  ASSERT_EQ(GetMyProfileDoubleArray(s, "Sampling_frequency", v, 1, record), 0);
  EXPECT_DOUBLE_EQ(v.at(0), 19207680.0);
  ASSERT_EQ(GetMyProfileDoubleArray(s, "Azimuth_time_reference", v, 1, record), 0);
  EXPECT_NEAR(v.at(0), scene_.startTime, 1e-5);
  std::string text;
  ASSERT_EQ(GetMyProfileString("Paths", "ASA_INS_Full_Name", text, record), 0);
  EXPECT_EQ(text, files_.ins);
  FreeProfile(record);
}

TEST_F(AsarSceneTest, PartOfTheSceneByPercentages) {
  ex_.input.PacketsToSkip = 10;
  ex_.input.PacketsToExtract = 50;
  ASSERT_EQ(extract(), 0);
  ASSERT_EQ(ex_.getVectorLength(), 350);
  EXPECT_EQ(ex_.getSequenceVector()[0], cfg_.firstLineCounter() + 70);
  EXPECT_NEAR(ex_.par[0].Azimuth_time_reference, sim_->lineTime(70), 1e-6);
}

TEST_F(AsarSceneTest, DamagedPacketsAreRepairedAndReported) {
  scene_.dropLines = {50, 51, 52};          // lost packets
  cfg_.garbage = {{200, 3000}};             // garbage between two packets
  cfg_.counterJumpLines = {400};            // a counter far ahead
  scene_.corruptSwstLines = {600};          // a window jump of 150 samples
  scene_.corruptSwstDelta = 150;
  ASSERT_EQ(extract(), 0);
  ASSERT_EQ(ex_.getVectorLength(), kLines);
  const int c0 = cfg_.firstLineCounter();
  for (int k = 0; k < kLines; ++k) {
    const bool repaired = k == 50 || k == 51 || k == 52 || k == 400 || k == kCalibrationLine;
    ASSERT_EQ(ex_.getMissingVector()[k], repaired ? 1 : 0) << k;
    ASSERT_EQ(ex_.getSequenceVector()[k], repaired ? 0 : c0 + k) << k;
    ASSERT_EQ(ex_.getSwstVector()[k], sim_->swstCode()) << k;  // the jump is ignored
  }
  EXPECT_TRUE(ex_.ext.corrupted);
  EXPECT_EQ(ex_.ext.windowJumps, 1);
  EXPECT_EQ(ex_.ext.missingLines, 4);
  EXPECT_EQ(line(ex_.outputName(0), 52), line(ex_.outputName(0), 49));
  EXPECT_LT(mismatch(line(ex_.outputName(0), 201), 201), 0.15);  // right behind the garbage
  EXPECT_EQ(ex_.par[0].SWST_max_code, sim_->swstCode());
}

TEST_F(AsarSceneTest, TruncatedProductEndsCleanly) {
  applyAsarInstrument(cfg_, scene_);
  const long packet = 68 + FbaqCodec::lineBytes(kSamples);
  scene_.truncateImageBytes = 3203 + 300 * packet + packet / 2;  // inside the packet of line 300
  ASSERT_EQ(extract(), 0);
  EXPECT_EQ(ex_.getVectorLength(), 300);
  scene_.truncateImageBytes = 2000;  // inside the product headers
  ASSERT_EQ(extract(), 4);
}

TEST_F(AsarSceneTest, AlternatingPolarisationBursts) {
  cfg_.mode = "APH";
  cfg_.apBurst = 40;
  scene_.dropLines = {5};  // lost before the second channel's first echo
  ASSERT_EQ(extract(), 0);
  EXPECT_EQ(ex_.swaths, 2);
  EXPECT_EQ(ex_.par[0].polarization_type, 2);  // H/V
  EXPECT_EQ(ex_.par[1].polarization_type, 0);  // H/H
  ASSERT_EQ(ex_.getVectorLength(0), kLines);
  ASSERT_EQ(ex_.getVectorLength(1), kLines);
  for (int k = 0; k < kLines; ++k)
    for (int c = 0; c < 2; ++c) {
      ASSERT_EQ(ex_.getSwstVector(c)[k], sim_->swstCode()) << "channel " << c << " line " << k;
      ASSERT_EQ(ex_.getMissingVector(c)[k], k == 5 ? 1 : 0) << "channel " << c << " line " << k;
    }
  const std::string files[2] = {ex_.outputName(0), ex_.outputName(1)};
  for (int k : {0, 19, 20, 21, 59, 60, 100, 399}) {
    const int pol = asarLinePolarisation(cfg_, k);
    const std::vector<float> echo = line(files[pol], k), zero = line(files[1 - pol], k);
    EXPECT_LT(mismatch(echo, k), 0.15) << "line " << k;
    EXPECT_EQ(zero, std::vector<float>(2 * std::size_t(kSamples), 0.0f)) << "line " << k;
  }
  RawSARData_Obj raw;
  ASSERT_EQ(raw.readhdr(files[0] + ".hdr"), 0);
  EXPECT_EQ(raw.dataSetInfo.Polarization, "H/V");
  EXPECT_EQ(raw.dataSetInfo.Swath, "IS2");
  EXPECT_EQ(raw.swath.Echoes_per_burst, 40);  // read from the packets, for the de-scalloping
  EXPECT_EQ(files[1], ex_.output.OutputRawFile + "2");
}

}  // namespace
