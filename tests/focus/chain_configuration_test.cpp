#include <string>

#include "focus/sensors/level0_chain.h"
#include "focus/sar_focuser.h"
#include "product/general_sar_configuration.h"
#include "focus_fixture.h"

namespace {

using ChainConfiguration = FocusTest;

TEST_F(ChainConfiguration, ReadconfAppliesTheDefaultsOfAbsentKeys) {
  writeText(path("p.hdr"),
            "[AzimuthConf]\n"
            "AntennaLength = 10.0\n"
            "RangeOverlap = 41\n"
            "AzimuthOverlap = 1600\n"
            "AzimuthLookBandwidth = 0.8\n"
            "ApplyAzShift = 1.0\n"
            "LinesInBlock = 4096\n"
            "[DCestConf]\n"
            "Blocks = 128\n"
            "Kthr = 2.5\n"
            "[GeneralProcessingConf]\n"
            "Flag_dcest = 0\n");
  SARFocuser_conf c;
  c.clear();
  EXPECT_EQ(c.Flag_ortog, 1);
  EXPECT_EQ(c.Flag_swstal, 1);
  EXPECT_EQ(c.Azblk, 1024);
  EXPECT_EQ(c.Flag_rangefoc, 0);
  ASSERT_EQ(c.readconf(path("p.hdr")), 0);
  EXPECT_EQ(c.RangeOverlap, 20);  // halved, integer division
  EXPECT_EQ(c.AzimuthOverlap, 800);
  EXPECT_DOUBLE_EQ(c.AzimuthLookBandwidth, 0.8);
  EXPECT_DOUBLE_EQ(c.ApplyAzShift, 1.0);
  EXPECT_EQ(c.LinesInBlock, 4096);
  EXPECT_EQ(c.SamplesInBlock, 0);  // absent: stays 0
  EXPECT_EQ(c.Blocks, 128);
  EXPECT_DOUBLE_EQ(c.Kthr, 2.5);
  EXPECT_EQ(c.Flag_rangefoc, 1);
  EXPECT_EQ(c.Flag_azimuthfoc, 1);
  EXPECT_EQ(c.Flag_dcest, 0);
  EXPECT_EQ(c.Flag_rgpatt, 0);
  EXPECT_EQ(c.Multilook, 0);
  for (int w : c.Pol_Weights) EXPECT_EQ(w, 1);

  writeText(path("q.hdr"), "[DCestConf]\nPol_Weights = {1 0 1 0 1 1 0}\n");
  ASSERT_EQ(c.readconf(path("q.hdr")), 0);
  const int want[7] = {1, 0, 1, 0, 1, 1, 0};
  for (int i = 0; i < 7; ++i) EXPECT_EQ(c.Pol_Weights[i], want[i]);

  EXPECT_EQ(c.readconf(path("absent.hdr")), 9);
}

TEST_F(ChainConfiguration, SensorChainsGetMemoryAndTheFixedValues) {
  writeText(path("p.hdr"), "[GeneralProcessingConf]\nAzblk = 2048\n[sarfocuserConfiguration]\n"
                           "Incore = 1\n");
  SARFocuser_conf c;
  c.clear();
  c.DCref = 40.0;
  ASSERT_EQ(configureLevel0Chain(c, path("p.hdr"), false), 0);
  EXPECT_EQ(c.Memory, 256);
  EXPECT_EQ(c.Incore, 0);
  EXPECT_EQ(c.Azblk, 1024);
  EXPECT_DOUBLE_EQ(c.DCref, 0.0);
  EXPECT_EQ(c.Flag_ortog, 1);
  EXPECT_EQ(c.Flag_swstal, 1);
  EXPECT_FALSE(traced("Memory set to default value: 256Mb"));
  ASSERT_EQ(configureLevel0Chain(c, path("p.hdr"), true), 0);
  EXPECT_TRUE(traced("Memory set to default value: 256Mb"));

  writeText(path("m.hdr"), "[sarfocuserConfiguration]\nMemory = 900\n");
  ASSERT_EQ(configureLevel0Chain(c, path("m.hdr"), true), 0);
  EXPECT_EQ(c.Memory, 900);
}

TEST_F(ChainConfiguration, DocumentRealsReachTheChainAsWritten) {
  // The document holds single-precision reals; the chain gets the decimals a
  // profile with the same text would give.
  GeneralSAR_configuration doc;
  doc.dcestConf.Dftstep = 0.00004f;
  doc.azimuthConf.AzimuthLookBandwidth = 0.8f;
  doc.azimuthConf.AzimuthOverlap = 2561;
  doc.generalConf.EraseTemp = 1;
  const SARFocuser_conf c = chainConfFrom(doc);
  EXPECT_EQ(c.Dftstep, 4e-05);
  EXPECT_EQ(c.AzimuthLookBandwidth, 0.8);
  EXPECT_EQ(c.RgBand, 0.72);
  EXPECT_EQ(c.AzimuthOverlap, 1280);
  EXPECT_EQ(c.DeleteTempFiles, 1);
  EXPECT_EQ(documentReal(-20.0f), -20.0);
}

}  // namespace
