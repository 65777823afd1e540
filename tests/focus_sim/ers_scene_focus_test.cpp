// A simulated ERS scene through the ERS focuser: extraction, range
// focusing, Doppler estimation, geometry and azimuth focusing to an SLC
// with its record.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <cmath>
#include <complex>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "diag/report.h"
#include "focus/sensors/ers.h"
#include "focus/sar_focuser.h"
#include "product/data_set_info.h"
#include "product/general_sar.h"
#include "product/general_sar_configuration.h"
#include "sim/raw_scene.h"
#include "support/files.h"

namespace {

// A working folder that is also the current folder: the Doppler log lands in ".".
class ErsSceneFocus : public support::WorkingFolderTest {
 protected:
  void SetUp() override {
    WorkingFolderTest::SetUp();
    cwd_ = std::filesystem::current_path();
    std::filesystem::current_path(working_);
  }
  void TearDown() override {
    std::filesystem::current_path(cwd_);
    WorkingFolderTest::TearDown();
  }

  static SceneDescription scene() {
    std::string error;
    SceneDescription s;
    EXPECT_TRUE(SceneDescription::load(TESSIVOR_SOURCE_DIR "/tests/sim/data/ers2_small_scene.txt",
                                       s, error))
        << error;
    s.samples = 2048;
    s.pixelTargets = {{1500.25, 300.5, 0.0, 4.0},
                      {2048.0, 1000.0, 120.0, 4.0},
                      {2600.75, 1250.25, 0.0, 4.0}};
    return s;
  }

  // Names of a simulated scene, a processing configuration and an output
  // root handed to the ERS focuser.
  void nameInputs(ersLevel0Focuser& f, const RawSceneSimulator& sim, const std::string& conf,
                  const std::string& out) const {
    f.level0Filename = sim.imagePath(working_);
    f.LEAFilename = sim.leaderPath(working_);
    f.orbitFilename = sim.odrPath(working_);
    f.configurationFilename = conf;
    f.outputFilename = working_ + out;
  }

  std::filesystem::path cwd_;
};

// Peak of |x| in a window of the SLC around (line, sample).
void findPeak(const std::string& raster, int samples, int lines, double line, double sample,
              int* peakLine, int* peakSample) {
  std::ifstream in(raster, std::ios::binary);
  const int l0 = std::max(0, static_cast<int>(line) - 16);
  const int l1 = std::min(lines, static_cast<int>(line) + 17);
  const int s0 = std::max(0, static_cast<int>(sample) - 16);
  const int s1 = std::min(samples, static_cast<int>(sample) + 17);
  double best = -1.0;
  std::vector<std::complex<float>> row(samples);
  for (int l = l0; l < l1; ++l) {
    in.seekg(static_cast<std::streamoff>(l) * samples * 8);
    in.read(reinterpret_cast<char*>(row.data()), static_cast<std::streamsize>(samples) * 8);
    for (int s = s0; s < s1; ++s)
      if (std::abs(row[s]) > best) {
        best = std::abs(row[s]);
        *peakLine = l;
        *peakSample = s;
      }
  }
}

TEST_F(ErsSceneFocus, ModularStepsFocusTheSceneFromAConfigurationDocument) {
  RawSceneSimulator sim(scene());
  std::string error;
  ASSERT_EQ(sim.writeErsScene(working_, error), 0) << error;

  // The processing configuration as a parameter document.
  GeneralSAR_configuration c;
  AzimuthConf& a = c.azimuthConf;
  a.AntennaLength = 9.45f;
  a.WhiteningFlag = 1;
  a.RangeWindowHammingParameter = a.AzimuthWindowHammingParameter = 0.75f;
  a.RangeLookBandwidth = a.AzimuthLookBandwidth = 0.8f;
  a.RangeTransitionBandwidth = a.AzimuthTransitionBandwidth = 0.8f;
  a.LinesInBlock = 8192;
  a.SamplesInBlock = 1024;
  a.AzimuthOverlap = 2560;
  a.RangeOverlap = 64;
  a.PerformInterpolation = 7;
  a.ApplyAzShift = 1;  // whole image: automatic azimuth registration
  a.ApplyRgShift = 0;
  DCestConf& d = c.dcestConf;
  d.Blocks = 256;
  d.Blockl = 1024;
  d.Dswst = 0;
  d.RgBand = 0.82f;
  d.Minamb = -3.0f;
  d.Maxamb = 3.0f;
  const int weights[7] = {1, 1, 1, 0, 0, 0, 0};
  for (int i = 0; i < 7; ++i) d.Pol_weights[i] = weights[i];
  generalProcessingConf& g = c.generalConf;
  g.Flag_rangefoc = g.Flag_dcest = g.Flag_azimuthfoc = g.Flag_ortog = 1;
  g.Memory = 300;
  for (auto o : {GeneralSAR_configuration::GSC_AZIMUTH, GeneralSAR_configuration::GSC_DCEST,
                 GeneralSAR_configuration::GSC_GENERAL})
    c.GSenable(o);
  const std::string doc = working_ + "processing.xml";
  ASSERT_EQ(c.GSwrite(doc, 0), 0);

  ersLevel0Focuser f;
  nameInputs(f, sim, doc, "mod");
  testing::internal::CaptureStdout();
  const int status = f.run_modular();
  testing::internal::GetCapturedStdout();
  ASSERT_EQ(status, 0) << trace();
  EXPECT_EQ(f.Memory, 300);

  // The extracted raster was aligned in place.
  GeneralSAR raw;
  ASSERT_EQ(raw.GSread(working_ + "mod.extracted.hdr"), 0);
  EXPECT_TRUE(raw.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED));
  EXPECT_EQ(raw.dataFile.RowPrefix, 0);
  EXPECT_TRUE(std::filesystem::exists(working_ + "DCEST_resume.txt"));

  GeneralSAR rg;
  ASSERT_EQ(rg.GSread(working_ + "mod.rgfoc.hdr"), 0);
  EXPECT_NEAR(rg.polynomials.EvaluateDC(rg.roi.roi.FastStartTime, rg.roi.roi.SlowStartTime),
              180.0, 0.02 * sim.scene().prfHz);
  const double fr = rg.polynomials.EvaluateFR(rg.roi.roi.FastStartTime, rg.roi.roi.SlowStartTime);
  EXPECT_LT(fr, -1900.0);
  EXPECT_GT(fr, -2300.0);

  GeneralSAR slc;
  ASSERT_EQ(slc.GSread(working_ + "mod.hdr"), 0);
  EXPECT_TRUE(slc.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED));
  const ROI_Obj& roi = slc.roi.roi;
  const int samples = slc.dataFile.NrOfPixelsPerLine, lines = slc.dataFile.NrOfLinesPerImage;
  ASSERT_GT(samples, 0);
  ASSERT_GT(lines, 0);
  for (const TargetTruth& t : sim.truth()) {
    const double line = (t.azimuthTime - roi.SlowStartTime) / roi.SlowTimeDelta;
    const double sample =
        (t.rangeTime - roi.FastStartTime) / roi.FastTimeDelta + sim.rangePeakOffset();
    int pl = -1, ps = -1;
    findPeak(working_ + "mod", samples, lines, line, sample, &pl, &ps);
    EXPECT_NEAR(pl, line, 1.0) << "target at raw line " << t.line;
    EXPECT_NEAR(ps, sample, 1.0) << "target at raw line " << t.line;
  }
}

TEST_F(ErsSceneFocus, ChainErasesEachInputOnceItsStageHasUsedIt) {
  SceneDescription s = scene();
  s.lines = 3072;
  s.samples = 1536;
  s.pixelTargets = {{1536.0, 500.0, 0.0, 4.0}};
  RawSceneSimulator sim(s);
  std::string error;
  ASSERT_EQ(sim.writeErsScene(working_, error), 0) << error;

  // Extraction by the ERS focuser, then the chain on its own.
  ersLevel0Focuser f;
  nameInputs(f, sim, TESSIVOR_SOURCE_DIR "/resources/parameters_ERS.hdr", "out");
  ASSERT_EQ(f.initialize(), 0);
  ASSERT_EQ(f.ingestion(), 0);

  std::ofstream(working_ + "chain.hdr") << "[sarfocuserConfiguration]\nMemory = 128\n"
                                           "DeleteTempFiles = 1\n";
  SARFocuser_conf conf;
  ASSERT_EQ(conf.readpar(working_ + "chain.hdr"), 0);
  ASSERT_EQ(conf.readconf(TESSIVOR_SOURCE_DIR "/resources/parameters_ERS.hdr"), 0);
  conf.SamplesInBlock = 512;
  conf.RangeOverlap = 16;
  SARFocuser chain(&conf);
  chain.RawDataFile = working_ + "out.extracted";
  chain.ChirpFile = working_ + "out.chirp";
  chain.OutputFilename = working_ + "out";
  ASSERT_EQ(chain.run(), 0) << trace();
  for (const char* gone : {"out.extracted", "out.chirp", "out.chirp.hdr", "out.rgfoc",
                           "out.rgfoc.hdr", "DCEST_resume.txt"})
    EXPECT_FALSE(std::filesystem::exists(working_ + gone)) << gone;
  EXPECT_TRUE(std::filesystem::exists(working_ + "out"));
  GeneralSAR slc;
  ASSERT_EQ(slc.GSread(working_ + "out.hdr"), 0);
  EXPECT_EQ(slc.dataFile.NrOfLinesPerImage, 3072 - 2560);
  EXPECT_EQ(slc.dataFile.NrOfPixelsPerLine, 1536 - sim.replicaLength() + 1 - 2 * conf.RangeOverlap);
}

// Alternating-polarisation form of the chain: two channels "<raw>1" and
// "<raw>2", each focused and de-scalloped. Made here from one extracted ERS
// scene given a burst length.
class HeavyErsSceneFocus : public ErsSceneFocus {};

TEST_F(HeavyErsSceneFocus, TwoChannelsAreFocusedAndDescalloped) {
  SceneDescription s = scene();
  s.samples = 1536;
  RawSceneSimulator sim(s);
  std::string error;
  ASSERT_EQ(sim.writeErsScene(working_, error), 0) << error;
  ersLevel0Focuser f;
  nameInputs(f, sim, TESSIVOR_SOURCE_DIR "/resources/parameters_ERS.hdr", "ers");
  ASSERT_EQ(f.initialize(), 0);
  ASSERT_EQ(f.ingestion(), 0);
  for (const char* k : {"1", "2"}) {
    GeneralSAR raw;
    ASSERT_EQ(raw.GSread(working_ + "ers.extracted.hdr"), 0);
    raw.swath.Echoes_per_burst = 64;
    raw.GSenable(GeneralSAR::GS_SWATH);
    std::filesystem::copy_file(working_ + "ers.extracted", working_ + "ap" + k);
    ASSERT_EQ(raw.GSwrite(working_ + "ap" + k + ".hdr"), 0);
    std::filesystem::copy_file(working_ + "ers.chirp", working_ + "apchirp" + k);
    std::filesystem::copy_file(working_ + "ers.chirp.hdr", working_ + "apchirp" + k + ".hdr");
  }
  SARFocuser_conf& conf = f.conf();
  conf.SamplesInBlock = 512;
  conf.RangeOverlap = 16;
  SARFocuser chain(&conf);
  chain.RawDataFile = working_ + "ap";
  chain.ChirpFile = working_ + "apchirp";
  chain.OutputFilename = working_ + "out";
  ASSERT_EQ(chain.run(), 0) << trace();
  EXPECT_NE(trace().find(" AP RAW DATA DETECTED, FOCUSSING..."), std::string::npos);
  for (const char* k : {"1", "2"}) {
    GeneralSAR slc, ds;
    ASSERT_EQ(slc.GSread(working_ + "out" + k + ".hdr"), 0);
    ASSERT_EQ(ds.GSread(working_ + "out" + k + "_descallop.hdr"), 0);
    const int n = slc.dataFile.NrOfLinesPerImage;
    EXPECT_EQ(ds.dataFile.NrOfLinesPerImage, (n - 64) / 960 * 960);
    EXPECT_EQ(ds.swath.Echoes_per_burst, 64);
    EXPECT_NEAR(ds.roi.roi.SlowStartTime, slc.roi.roi.SlowStartTime + 32 * slc.roi.roi.SlowTimeDelta,
                1e-6);  // times are stored to the microsecond
    EXPECT_EQ(std::filesystem::file_size(working_ + "out" + k + "_descallop"),
              static_cast<std::uintmax_t>(ds.dataFile.NrOfLinesPerImage) *
                  ds.dataFile.NrOfPixelsPerLine * 8);
  }
}

}  // namespace
