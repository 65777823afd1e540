#include <string>

#include "focus/sensors/envisat.h"
#include "focus/sensors/ers.h"
#include "focus/sensors/radarsat.h"
#include "focus/sar_focuser.h"
#include "focus_fixture.h"
#include "ingest/ers/ers_extractor.h"
#include "product/data_set_info.h"

namespace {

class SensorFocusers : public FocusTest {
 protected:
  void SetUp() override {
    FocusTest::SetUp();
    writeText(path("scene.dat"), std::string(100, 'x'));
    writeText(path("scene.lea"), std::string(100, 'y'));
    writeText(path("orbit.txt"), "x");
    writeText(path("profile.hdr"), "[AzimuthConf]\nRangeOverlap = 40\n");
  }
  void fill(stripmapGeneralFocuser& f) {
    f.level0Filename = path("scene.dat");
    f.orbitFilename = path("orbit.txt");
    f.configurationFilename = path("profile.hdr");
    f.outputFilename = path("out");
    f.skipLines = 10;
    f.extractLines = 95;
  }
};

TEST_F(SensorFocusers, EnvisatWithoutItsFilesAndRadarsatWithoutLeaderFailCleanly) {
  envisatLevel0Focuser e;
  fill(e);
  EXPECT_EQ(e.initialize(), 1);
  EXPECT_TRUE(traced("ASA_INS filename not selected!"));
  e.ASA_INSFilename = path("ins");
  EXPECT_NE(e.run(), 0);  // the level-0 product does not exist
  EXPECT_EQ(e.preprocessing(), 0);
  EXPECT_TRUE(traced("No preprocessing has to be performed."));

  radarsatLevel0Focuser r;
  fill(r);
  r.leaderFilename = path("none.lea");
  EXPECT_EQ(r.run(), 1);
  EXPECT_TRUE(traced("LEA file does not exist!"));
  EXPECT_EQ(r.ingestion(), 10);  // the extractor was given no leader
  EXPECT_TRUE(traced("Missing LeaderFile in section radarextractInput"));
  EXPECT_EQ(r.finalize(), 0);
  EXPECT_TRUE(traced("finalized..."));
  EXPECT_EQ(r.postprocessing(), 0);
  EXPECT_TRUE(traced("RADARSAT focuser doesn't do anything in the postprocessor module"));
}

TEST_F(SensorFocusers, ChainRunFindsItsInputsOrFails) {
  SARFocuser_conf conf;
  conf.clear();
  SARFocuser chain(&conf);
  // A raw raster without its chirp: 10 and no output.
  writeText(path("raw"), "r");
  chain.RawDataFile = path("raw");
  chain.ChirpFile = path("chirp");
  chain.OutputFilename = path("out");
  EXPECT_EQ(chain.run(), 10);
  EXPECT_TRUE(traced("STRIPMAP RAW DATA DETECTED, FOCUSSING..."));
  EXPECT_FALSE(traced("Range Focusing"));

  // The raw name as given wins over the alternating-polarisation channels.
  writeText(path("raw1"), "r");
  writeText(path("chirp1"), "c");
  EXPECT_EQ(chain.run(), 10);
  EXPECT_FALSE(traced(" AP RAW DATA DETECTED"));

  // Only channel files: the alternating form, which needs both chirps.
  chain.RawDataFile = path("ap");
  chain.ChirpFile = path("apchirp");
  writeText(path("ap1"), "r");
  EXPECT_EQ(chain.run(), 10);
  EXPECT_TRUE(traced(" AP RAW DATA DETECTED, FOCUSSING..."));
  EXPECT_EQ(chain.RawDataFile, path("ap"));  // names restored

  // A raw raster and chirp that exist but hold no record.
  writeText(path("chirp"), "c");
  chain.RawDataFile = path("raw");
  chain.ChirpFile = path("chirp");
  EXPECT_NE(chain.run(), 0);
  EXPECT_FALSE(std::filesystem::exists(path("out.rgfoc")));
}

TEST_F(SensorFocusers, MissingRawDataIsFatalWhileReportsAreOn) {
  SARFocuser_conf conf;
  conf.clear();
  SARFocuser chain(&conf);
  chain.RawDataFile = path("none");
  chain.ChirpFile = path("none.chirp");
  chain.OutputFilename = path("out");
  // A forked child shares this test's scratch folder, which the parent removes;
  // a re-executed one would make a folder of its own and leave it behind.
  GTEST_FLAG_SET(death_test_style, "fast");
  EXPECT_EXIT(chain.run(), testing::ExitedWithCode(1305605 & 0xff), "");
  set_flg_report(0);
  EXPECT_EQ(chain.run(), 10);
}

}  // namespace

namespace {

TEST_F(SensorFocusers, WholeImageShiftSentinelIsExactlyOne) {
  const int lines = 10, samples = 8;
  writeRaster(path("raw"), lines, samples, std::vector<fcomplex>(lines * samples),
              DataSetInfo_Obj::IT_RAW_DATA, std::vector<float>(lines, 1.0e-4f));
  writeText(path("chirp"), "no header beside it");
  SARFocuser_conf conf;
  conf.clear();
  SARFocuser chain(&conf);
  chain.RawDataFile = path("raw");
  chain.ChirpFile = path("chirp");
  chain.OutputFilename = path("out");
  // The chain stops at the replica, after the shifts were taken.
  conf.ApplyAzShift = 1.0;
  conf.ApplyRgShift = 1.0;
  EXPECT_NE(chain.run(), 0);
  EXPECT_DOUBLE_EQ(conf.ApplyAzShift, lines);
  EXPECT_DOUBLE_EQ(conf.ApplyRgShift, samples);
  conf.ApplyAzShift = 1.000001;
  conf.ApplyRgShift = -1.0;
  EXPECT_NE(chain.run(), 0);
  EXPECT_DOUBLE_EQ(conf.ApplyAzShift, 1.000001);
  EXPECT_DOUBLE_EQ(conf.ApplyRgShift, -1.0);
  EXPECT_FALSE(std::filesystem::exists(path("out.rgfoc")));
}

}  // namespace
