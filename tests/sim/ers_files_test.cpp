// The ERS files of the simulator against the archive layout (real leader and
// image file heads) and read back with small independent readers.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <unistd.h>

#include "orbit/general_sar_orbit.h"
#include "orbit/deos_orbit.h"
#include "orbit/orbit_files.h"
#include "product/profile.h"
#include "product/time_base.h"
#include "sim/ers_ceos_writer.h"
#include "sim/raw_scene.h"
#include "support/files.h"

namespace {

std::uint32_t be32(const char* p) {
  const auto* u = reinterpret_cast<const unsigned char*>(p);
  return (std::uint32_t(u[0]) << 24) | (std::uint32_t(u[1]) << 16) | (std::uint32_t(u[2]) << 8) | u[3];
}
int be16(const char* p) {
  const auto* u = reinterpret_cast<const unsigned char*>(p);
  return (u[0] << 8) | u[1];
}

// Fixed-field readers with the semantics the extractor documents.
double fToDouble(const char* t, int len) {
  int point = -1;
  for (int i = 0; i < len; ++i)
    if (t[i] == '.') point = i;
  if (point < 0) return 0.0;
  double v = 0.0, scale = 1.0;
  for (int i = point - 1; i >= 0 && t[i] != ' ' && t[i] != '-'; --i, scale *= 10.0) v += (t[i] - '0') * scale;
  scale = 0.1;
  for (int i = point + 1; i < len; ++i) {
    if (t[i] == ' ') continue;
    if (t[i] < '0' || t[i] > '9') break;
    v += (t[i] - '0') * scale;
    scale /= 10.0;
  }
  int k = 0;
  while (k < len && t[k] == ' ') ++k;
  return (k < len && t[k] == '-') ? -v : v;
}
int ch2intField(const char* t, int len) {
  int v = 0, scale = 1;
  for (int i = len - 1; i >= 0 && t[i] != ' '; --i, scale *= 10) v += (t[i] - '0') * scale;
  return v;
}
std::string text(const std::vector<char>& f, int off, int len) { return std::string(f.data() + off, len); }

// Values of the genuine ERS-1 leader of orbit 44928.
ErsLeaderInfo realErs1Values() {
  ErsLeaderInfo in;
  in.mission = "ERS1";
  in.software = "ERS1-RAW-6.8";
  in.sceneDesignator = "ORBIT=44928-FRAME=2763";
  in.sceneCentreTime = ascii2sec85("17-FEB-2000 09:57:34.751");
  in.sceneCentreLat = 41.851;
  in.sceneCentreLon = 12.03;
  in.ellipsoid = "GEM6";
  in.semiMajorKm = 6378.144;
  in.semiMinorKm = 6356.759;
  in.centreLine = 14000;
  in.centrePixel = 2808;
  in.sceneLengthKm = 111.356;
  in.sceneWidthKm = 44.388864;
  in.orbitNumber = 44928;
  in.platformLat = 41.091;
  in.platformLon = 15.614;
  in.platformHeading = 194.302;
  in.incidenceDeg = 23.799;
  in.radarFreqGHz = 5.3;
  in.wavelength = 0.056666;
  in.chirpCoefficient = 2.08894e11;
  in.samplingRateMHz = 18.962468;
  in.pulseLengthUs = 37.12;
  in.biasI = -0.258;
  in.biasQ = -0.095;
  in.prf = 1679.902;
  in.facility = "I-PAF";
  in.lineSpacing = 3.977;
  in.pixelSpacing = 7.904;
  in.firstRangeTimeMs = 5.550316;
  in.centreRangeTimeMs = 5.698398;
  in.lastRangeTimeMs = 5.84648;
  in.firstLineTime = ascii2sec85("17-FEB-2000 09:57:26.417");
  in.centreLineTime = ascii2sec85("17-FEB-2000 09:57:34.751");
  in.lastLineTime = ascii2sec85("17-FEB-2000 09:57:43.084");
  in.firstVectorTime = in.firstLineTime;
  in.vectorInterval = 4.167;
  const double v[5][6] = {
      {5.15683622e+06, 1.45727856e+06, 4.7462032e+06, 5.1831375e+03, -4.821344100000000e+02, -5.46921494e+03},
      {5.17838485e+06, 1.45524934e+06, 4.72336876e+06, 5.15959351e+03, -4.9182856e+02, -5.49067605e+03},
      {5.19983515e+06, 1.45317978e+06, 4.7004451e+06, 5.13594668e+03, -5.0149923e+02, -5.51203368e+03},
      {5.22118671e+06, 1.45106996e+06, 4.67743266e+06, 5.11219744e+03, -5.1114616e+02, -5.53328743e+03},
      {5.2424391e+06, 1.44892e+06, 4.65433188e+06, 5.08834626e+03, -5.2076912e+02, -5.55443689e+03}};
  for (const auto& r : v) in.vectors.push_back({0.0, {r[0], r[1], r[2]}, {r[3], r[4], r[5]}});
  return in;
}

// Byte ranges [a, b) that hold values this writer does not model
// (facility clock words, processor name, a stray terminator).
bool masked(int off) {
  const int ranges[][2] = {{778, 779}, {1702, 1766}, {1782, 1798}};
  for (const auto& r : ranges)
    if (off >= r[0] && off < r[1]) return true;
  return false;
}

}  // namespace

TEST(ErsLeaderLayout, MatchesTheArchiveLeaderFieldByField) {
  const std::string path = TESSIVOR_REALDATA_DIR "/ers1_2000_orbit44928/lea_01.001";
  if (!std::filesystem::exists(path)) GTEST_SKIP() << "real data folder absent";
  const std::vector<char> real = support::readValues<char>(path);
  const std::vector<char> mine = buildErsLeader(realErs1Values());
  ASSERT_EQ(mine.size(), real.size());
  // Record heads: sequence, type bytes and length of all five records.
  for (int off = 0, rec = 0; rec < 5; ++rec) {
    EXPECT_EQ(0, std::memcmp(mine.data() + off, real.data() + off, 12)) << "record " << rec + 1;
    off += static_cast<int>(be32(real.data() + off + 8));
  }
  // Descriptor, data set summary and platform position records byte by byte.
  std::string diffs;
  for (int i = 0; i < kErsPprOffset + 1046; ++i)
    if (!masked(i) && mine[i] != real[i] && diffs.size() < 400)
      diffs += std::to_string(i) + ":'" + mine[i] + "'/'" + real[i] + "' ";
  EXPECT_TRUE(diffs.empty()) << diffs;
  EXPECT_EQ(text(mine, 3652 + 12, 47), text(real, 3652 + 12, 47));
}

TEST(ErsImageLayout, DescriptorAndRecordHeadMatchTheArchive) {
  const std::string path = TESSIVOR_REALDATA_DIR "/ers1_2000_orbit44928/dat_01.001";
  if (!std::filesystem::exists(path)) GTEST_SKIP() << "real data folder absent";
  const std::vector<char> real = support::readValues<char>(path);
  const std::vector<char> d = buildErsImageDescriptor("ERS1", "ERS1-RAW-6.8", 28000, 5616);
  ASSERT_EQ(d.size(), 11644u);
  EXPECT_EQ(0, std::memcmp(d.data(), real.data(), 11644));
  EXPECT_EQ(ch2intField(d.data() + 180, 6), 28000);
  EXPECT_EQ(ch2intField(d.data() + 248, 8), 5616);

  std::vector<unsigned char> iq(2 * 5616, 15);
  std::vector<char> rec(11644);
  buildErsDataRecord(rec.data(), 2, 1, 5616, 944, 2820, 163847, iq.data());
  const char* r = real.data() + 11644;
  EXPECT_EQ(0, std::memcmp(rec.data(), r, 20));   // head, line number, channel
  EXPECT_EQ(be16(rec.data() + 214), be16(r + 214));  // window code 944
  EXPECT_EQ(be16(rec.data() + 216), be16(r + 216));  // PRI code
  EXPECT_EQ(rec[202], r[202]);
  EXPECT_EQ(rec[208], r[208]);
}

TEST(ErsFieldWriters, RefuseValuesWiderThanTheirField) {
  std::vector<char> r(64, ' ');
  EXPECT_THROW(putFormat(r.data(), 0, 8, "%8.3f", 123456.0), std::length_error);
  EXPECT_THROW(putText(r.data(), 0, 4, "ERS-1"), std::length_error);
  putFormat(r.data(), 0, 16, "%16.7f", -0.258);
  EXPECT_EQ(std::string(r.data(), 16), "      -0.2580000");
  EXPECT_DOUBLE_EQ(fToDouble(r.data(), 16), -0.258);
}

TEST(SceneDescriptionFile, ParsesSectionsTargetsAndDamage) {
  SimIni ini;
  std::string err;
  ASSERT_TRUE(ini.loadText("[Mission]\nmission = ERS1\nlook_side = left\n[Scene]\nstart_time = 17-FEB-2000 09:57:26.417\n"
                           "lines = 100\nsamples = 900 # comment\ndoppler_centroid_hz = -120.5\n[Targets]\n"
                           "target1 = 41.5 12.25 30 2.5\npixel_target = 50 400 0\n[Clutter]\nnoise_sigma = 1.5\n"
                           "[Damage]\ndrop_lines = 3 7-9\nleader_patch = 1654 XXXX\n",
                           err))
      << err;
  SceneDescription s;
  ASSERT_TRUE(SceneDescription::fromIni(ini, s, err)) << err;
  EXPECT_EQ(s.mission, "ERS1");
  EXPECT_EQ(s.lookSign, -1);
  EXPECT_EQ(s.lines, 100);
  EXPECT_EQ(s.samples, 900);
  EXPECT_DOUBLE_EQ(s.dopplerCentroidHz, -120.5);
  EXPECT_DOUBLE_EQ(s.startTime, ascii2sec85("17-FEB-2000 09:57:26.417"));
  ASSERT_EQ(s.targets.size(), 1u);
  EXPECT_DOUBLE_EQ(s.targets[0].amplitude, 2.5);
  ASSERT_EQ(s.pixelTargets.size(), 1u);
  EXPECT_DOUBLE_EQ(s.pixelTargets[0].amplitude, 1.0);
  EXPECT_EQ(s.dropLines, (std::vector<int>{3, 7, 8, 9}));
  ASSERT_EQ(s.leaderPatches.size(), 1u);
  EXPECT_EQ(s.leaderPatches[0].second, "XXXX");
  EXPECT_DOUBLE_EQ(s.noiseSigma, 1.5);

  ASSERT_TRUE(ini.loadText("[Scene]\nlines = many\n", err));
  EXPECT_FALSE(SceneDescription::fromIni(ini, s, err));
  EXPECT_NE(err.find("lines"), std::string::npos);
  EXPECT_FALSE(ini.loadText("[Scene\n", err));
  s = SceneDescription{};
  s.mission = "RADARSAT";
  EXPECT_THROW(RawSceneSimulator{s}, std::runtime_error);
}
