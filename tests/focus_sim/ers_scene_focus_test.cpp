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
#include "support/point_targets.h"

namespace {

using support::measureTarget;
using support::readComplex;

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

  GeneralSAR slc;
  ASSERT_EQ(slc.GSread(working_ + "mod.hdr"), 0);
  EXPECT_TRUE(slc.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED));
  const ROI_Obj& roi = slc.roi.roi;
  const int samples = slc.dataFile.NrOfPixelsPerLine, lines = slc.dataFile.NrOfLinesPerImage;
  ASSERT_GT(samples, 0);
  ASSERT_GT(lines, 0);
  const std::vector<fcomplex> image = readComplex(working_ + "mod");
  ASSERT_EQ(image.size(), static_cast<std::size_t>(samples) * lines);
  for (const TargetTruth& t : sim.truth()) {
    const double line = (t.azimuthTime - roi.SlowStartTime) / roi.SlowTimeDelta;
    const double sample =
        (t.rangeTime - roi.FastStartTime) / roi.FastTimeDelta + sim.rangePeakOffset();
    const PtaResult m = measureTarget(image.data(), lines, samples, line, sample, 16);
    ASSERT_TRUE(m.found) << m.message << " target at raw line " << t.line;
    EXPECT_NEAR(m.peakLine, line, 1.0) << "target at raw line " << t.line;
    EXPECT_NEAR(m.peakSample, sample, 1.0) << "target at raw line " << t.line;
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
  conf.AzimuthOverlapFromScene = 0;  // the fixed overlap of the profile
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
  EXPECT_EQ(slc.dataFile.NrOfLinesPerImage, 3072 - 2 * conf.AzimuthOverlap);
  EXPECT_EQ(slc.dataFile.NrOfPixelsPerLine, 1536 - sim.replicaLength() + 1 - 2 * conf.RangeOverlap);
}

}  // namespace
