// The RADARSAT orbit source and leader reader on the CEOS leader of a
// Canadian ERS-1 product (the leader form RADARSAT products share).
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "ingest/radarsat/radarextract.h"
#include "ingest/radarsat/radarsat_format.h"
#include "ingest_test_util.h"
#include "orbit/general_sar_orbit.h"
#include "support/files.h"

namespace {

const std::string kLeader = TESSIVOR_REALDATA_DIR "/ers1_ccrs_1996/23390_2925.ldr";

class RadarsatLeader : public support::WorkingFolderTest {};

}  // namespace

TEST_F(RadarsatLeader, CanadianLeaderHasTooFewVectorsInertialOneIsTurnedEarthFixed) {
  if (!std::filesystem::exists(kLeader)) GTEST_SKIP() << "no real data folder at " << kLeader;
  radarextract x;
  x.LeaderFile = kLeader;
  x.OrbitFile = kLeader;
  int source = -1;
  EXPECT_EQ(x.orbit_source(&source), 1);
  EXPECT_EQ(source, 0);
  EXPECT_TRUE(traced("There are less than 3 state vectors in the leader file!")) << trace();
  EXPECT_EQ(x.checklevel(), 0);

  DataSetInfo_Obj info;
  ASSERT_EQ(x.getOrbitConf(kLeader, &info), 0);
  EXPECT_EQ(info.OrbitConfiguration, "DESCENDING");
  EXPECT_EQ(info.OrbitNumber, "");

  // One inertial vector of 04-JAN-1996 63733.008 s: the turn to the
  // Earth-fixed frame keeps the radius and z and moves the longitude.
  double t0 = 0.0, dt = 0.0;
  std::vector<double> pos, vel;
  ASSERT_EQ(x.leaderVectors(kLeader, t0, dt, pos, vel), 0);
  ASSERT_EQ(pos.size(), 3u);
  const double xi = 2216061.65, yi = 6814235.05, zi = 1.09;
  EXPECT_NEAR(std::hypot(pos[0], pos[1]), std::hypot(xi, yi), 1e-6);
  EXPECT_DOUBLE_EQ(pos[2], zi);
  // Greenwich mean sidereal angle at 04-JAN-1996 17:42:13.008 UT: 9.175 deg
  // (GMST 0h36m42s); the Earth-fixed longitude is the inertial one less that.
  const double turn = (std::atan2(yi, xi) - std::atan2(pos[1], pos[0])) * 180.0 / M_PI;
  EXPECT_NEAR(turn, 9.175, 0.001);
  EXPECT_DOUBLE_EQ(vel[2], 7377.18326);
  // Fewer than five vectors make no orbit.
  EXPECT_NE(x.readLeaderVectors(kLeader), 0);
}

TEST(RadarsatAuxHead, FieldsAtTheirBitsAndSamples) {
  unsigned char a[50] = {0x35, 0x2E, 0xF8, 0x53};
  a[12] = 0x10;                         // waveform 1
  a[18] = 0x00, a[19] = 0x11;           // beam 17 (F2)
  a[22] = 0x20;                         // rate code 2
  a[25] = 0x12, a[26] = 0xA8;           // PRI code (0x12 << 5) + 21 = 597
  a[27] = 0xAB, a[28] = 0xC0;           // window code 0xABC
  a[29] = 0x01, a[30] = 0x20;           // reception code 18
  a[43] = 0x04, a[44] = 0x61, a[45] = 0x23, a[46] = 0x45, a[47] = 0x67, a[48] = 0x89;
  a[49] = 0x40 | 0x2A;
  const radarsat::AuxHead h = radarsat::decodeAux(a);
  EXPECT_TRUE(h.syncOk);
  EXPECT_EQ(h.waveform, 1);
  EXPECT_EQ(h.beamCode, 17);
  EXPECT_EQ(h.rateCode, 2);
  EXPECT_EQ(h.priCode, 597);
  EXPECT_EQ(h.windowCode, 0xABC);
  EXPECT_EQ(h.rxCode, 18);
  EXPECT_EQ(h.day, 35);
  EXPECT_EQ(h.seconds, 0x1234);
  EXPECT_EQ(h.milliseconds, (5 << 6) + 0x19);
  EXPECT_EQ(h.fraction, 0x389);
  EXPECT_TRUE(h.replica);
  EXPECT_EQ(h.gainCode, 42);
  // The fraction counts 1/1024 ms.
  EXPECT_DOUBLE_EQ(radarsat::auxSecondsOfDay(h), 0x1234 + ((5 << 6) + 0x19 + 0x389 / 1024.0) / 1000.0);
  EXPECT_EQ(radarsat::sampleValue(0x07), 7.5f);
  EXPECT_EQ(radarsat::sampleValue(0x08), -7.5f);
  EXPECT_EQ(radarsat::sampleValue(0x0F), -0.5f);
  a[0] = 0;
  EXPECT_FALSE(radarsat::decodeAux(a).syncOk);
  EXPECT_EQ(radarsat::beamEntry(21), nullptr);
  EXPECT_EQ(radarsat::beamEntry(20)->pulsesInFlight, 9);
}

TEST(RadarsatProfile, SectionsIntoTheExtractorAndMissingKeysRefused) {
  ingest_test::TempFolder dir;
  const std::string profile = dir / "radarextract.hdr";
  ingest_test::writeBytes(profile,
                          "[radarextractInput]\nLinesToSkip = 100\nLinesToExtract = 4096\n"
                          "LeaderFile = /d/LEA_01.001\nDataFile = /d/DAT_01.001\n"
                          "[radarextractOutput]\nOutputRawFile = /o/raw\nOutputChirpFile = /o/chirp\n");
  radarextract x;
  ASSERT_EQ(x.readpar(profile), 0);
  EXPECT_EQ(x.ReportFilename, "RadarExtract.txt");
  EXPECT_EQ(x.LinesToSkip, 100);
  EXPECT_EQ(x.LinesToExtract, 4096);
  EXPECT_EQ(x.LeaderFile, "/d/LEA_01.001");
  EXPECT_EQ(x.DataFile, "/d/DAT_01.001");
  EXPECT_EQ(x.OrbitFile, "");
  EXPECT_EQ(x.OutputRawFile, "/o/raw");
  EXPECT_EQ(x.OutputChirpFile, "/o/chirp");
  EXPECT_EQ(x.checkpar(), 0);

  const std::string partial = dir / "partial.hdr";
  ingest_test::writeBytes(partial, "[radarextractInput]\nLeaderFile = /d/LEA_01.001\n");
  radarextract y;
  EXPECT_EQ(y.readpar(partial), 10);  // no DataFile
  EXPECT_TRUE(y.LeaderFile.empty());  // nothing taken over from a refused profile
}
