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

namespace {

std::vector<char> readAll(const std::string& path) {
  std::ifstream f(path, std::ios::binary);
  return std::vector<char>((std::istreambuf_iterator<char>(f)), std::istreambuf_iterator<char>());
}

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
double fToDouble2(const char* t, int len) {
  int e = 0;
  while (e < len && t[e] != 'E' && t[e] != 'e') ++e;
  const double m = fToDouble(t, e);
  int ex = 0;
  for (int i = e + 2; i < len && t[i] >= '0' && t[i] <= '9'; ++i) ex = ex * 10 + (t[i] - '0');
  return t[e + 1] == '+' ? m * std::pow(10.0, ex) : m / std::pow(10.0, ex);
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

// A scratch folder under the test temporary directory, removed afterwards.
struct TempTree {
  explicit TempTree(const std::string& name)
      : path(testing::TempDir() + "/sim_" + name + "_" + std::to_string(::getpid())) {
    std::filesystem::remove_all(path);
    std::filesystem::create_directories(path);
  }
  ~TempTree() { std::filesystem::remove_all(path); }
  std::string path;
};

}  // namespace

TEST(ErsLeaderLayout, MatchesTheArchiveLeaderFieldByField) {
  const std::string path = TESSIVOR_REALDATA_DIR "/ers1_2000_orbit44928/lea_01.001";
  if (!std::filesystem::exists(path)) GTEST_SKIP() << "real data folder absent";
  const std::vector<char> real = readAll(path);
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
  const std::vector<char> real = readAll(path);
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

TEST(ErsSceneFiles, ReadBackWithTheValuesPutIn) {
  SceneDescription s;
  s.mission = "ERS1";
  s.lines = 600;
  s.samples = 1200;
  s.startTime = ascii2sec85("17-FEB-2000 09:57:26.417");
  s.orbit.epoch = s.startTime;
  s.dopplerCentroidHz = 250.0;
  s.biasI = -0.258;
  s.biasQ = 0.125;
  s.noiseSigma = 2.0;
  s.pixelTargets.push_back({300.0, 600.0, 100.0, 1.0});
  s.dropLines = {100, 101, 102};
  s.corruptSwstLines = {250};
  s.arcNumber = 7;
  s.odrRecords = 200;
  RawSceneSimulator sim(s);
  const TempTree tmp("readback");
  const std::string& dir = tmp.path;
  std::string err;
  ASSERT_EQ(sim.writeErsScene(dir, err), 0) << err;

  // Leader: the extractor's fields.
  const std::vector<char> L = readAll(sim.leaderPath(dir));
  ASSERT_EQ(L.size(), 720u + 1886u + 1046u + 2u * 12288u);
  EXPECT_EQ(text(L, 1116, 4), "ERS1");
  EXPECT_EQ(text(L, 1148, 2), "VV");
  EXPECT_EQ(text(L, 1834, 3), "RAW");
  EXPECT_DOUBLE_EQ(fToDouble(L.data() + 1212, 8) * 1e9, sim.scene().carrierHz);
  EXPECT_DOUBLE_EQ(fToDouble2(L.data() + 1366, 16), sim.scene().chirpCoefficient);
  EXPECT_NEAR(fToDouble(L.data() + 1430, 16) * 1e6, sim.scene().samplingRateHz, 1e-6);
  EXPECT_NEAR(fToDouble(L.data() + 1462, 16) / 1e6, sim.scene().pulseLength, 1e-15);
  EXPECT_NEAR(fToDouble(L.data() + 1538, 16), -0.258, 1e-12);
  EXPECT_NEAR(fToDouble(L.data() + 1554, 16), 0.125, 1e-12);
  EXPECT_NEAR(fToDouble(L.data() + 1654, 16), sim.scene().prfHz, 1e-9);
  EXPECT_DOUBLE_EQ(ascii2sec85(text(L, 2534, 24)), s.startTime);
  EXPECT_NEAR(ascii2sec85(text(L, 2582, 24)) - s.startTime, 599 / sim.scene().prfHz, 0.0006);
  EXPECT_NEAR(fToDouble(L.data() + 2486, 16) / 1000.0, sim.swst(), 1e-10);
  // State vectors of the platform position record.
  ASSERT_EQ(ch2intField(L.data() + 2746, 4), 5);
  EXPECT_EQ(text(L, 2750, 4), "2000");
  EXPECT_EQ(ch2intField(L.data() + 2754, 4), 2);
  EXPECT_EQ(text(L, 2760, 2), "17");
  const double sod = fToDouble2(L.data() + 2766, 22);
  const double dt = fToDouble2(L.data() + 2788, 22);
  EXPECT_DOUBLE_EQ(sod, 9 * 3600 + 57 * 60 + 26.417);
  for (int v = 0; v < 5; ++v) {
    const StateVector sv = sim.orbit().at(s.startTime + v * dt);
    for (int k = 0; k < 3; ++k) {
      EXPECT_NEAR(fToDouble2(L.data() + 2992 + 132 * v + 22 * k, 22), sv.pos[k], 1e-6);
      EXPECT_NEAR(fToDouble2(L.data() + 2992 + 132 * v + 66 + 22 * k, 22), sv.vel[k], 1e-9);
    }
  }

  // Image file: records, line numbers, window codes, samples.
  const std::vector<char> D = readAll(sim.imagePath(dir));
  const int samples = ch2intField(D.data() + 248, 8);
  const int records = ch2intField(D.data() + 180, 6);
  ASSERT_EQ(samples, 1200);
  ASSERT_EQ(records, 597);
  const std::size_t recLen = 412 + 2 * 1200;
  ASSERT_EQ(D.size(), 11644 + recLen * 597);
  std::vector<fcomplex> echoes;
  sim.renderLines(0, 600, echoes);
  std::vector<unsigned char> iq(2400);
  int checkedLines = 0;
  for (int pos = 0; pos < records; ++pos) {
    const char* r = D.data() + 11644 + recLen * pos;
    const int line = static_cast<int>(be32(r + 12)) - 1;
    EXPECT_EQ(be32(r), static_cast<std::uint32_t>(pos + 2));
    EXPECT_EQ(be32(r + 8), recLen);
    EXPECT_EQ(line, pos < 100 ? pos : pos + 3);
    EXPECT_EQ(be16(r + 214), sim.swstCode() + (line == 250 ? 1000 : 0));
    EXPECT_EQ(be16(r + 216), 2820);
    if (pos % 97 == 0) {
      sim.quantiseLine(echoes.data() + static_cast<std::size_t>(line) * 1200, iq.data());
      EXPECT_EQ(0, std::memcmp(iq.data(), r + 412, 2400)) << "line " << line;
      // Decoding as the extractor does gives the echo within half a level.
      for (int j = 0; j < 1200; j += 37) {
        const float I = static_cast<unsigned char>(r[412 + 2 * j]) - 15.5f + 0.258f;
        if (I > -15.0f && I < 15.0f) {
          EXPECT_NEAR(I, echoes[static_cast<std::size_t>(line) * 1200 + j].real(), 0.5f + 1e-4f);
        }
      }
      ++checkedLines;
    }
  }
  EXPECT_GT(checkedLines, 5);
  EXPECT_GT(std::filesystem::file_size(dir + "/scene/VDF_DAT.001"), 0u);
  EXPECT_EQ(std::filesystem::file_size(dir + "/scene/NUL_DAT.001"), 360u);
}

TEST(ErsSceneFiles, OrbitArcAndArclistLeadToTheSceneOrbit) {
  SceneDescription s;
  s.mission = "ERS2";
  s.lines = 64;
  s.samples = 900;
  s.startTime = ascii2sec85("18-JAN-2010 17:49:28.683");
  s.orbit.epoch = s.startTime - 3600.0;
  s.arcNumber = 15;
  s.odrRecords = 7921;
  RawSceneSimulator sim(s);
  const TempTree tmp("orbit");
  const std::string& dir = tmp.path;
  std::string err;
  ASSERT_EQ(sim.writeErsScene(dir, err), 0) << err;

  // Arc list: the head of 22 lines is skipped, the arc is chosen when the
  // scene lies strictly between the column-63 and the column-20 times.
  std::ifstream list(dir + "/orbits/ERS1/PRECISE/arclist");
  std::string line;
  int count = 0, chosen = -1;
  auto toSec = [](int y, int mo, int d, int h, int mi, int se) {
    char b[64];
    std::snprintf(b, sizeof b, "%02d-%s-%d %02d:%02d:%02d", d, simMonthName(mo), y > 85 ? 1900 + y : 2000 + y, h, mi, se);
    return ascii2sec85(b);
  };
  while (std::getline(list, line)) {
    if (line.size() < 67 || ++count <= 22) continue;
    int y, mo, d, h, mi, se, y2, mo2, d2, h2, mi2, arc;
    ASSERT_EQ(std::sscanf(line.c_str() + 63, " %2d%2d%2d %2d:%2d:%2d", &y, &mo, &d, &h, &mi, &se), 6);
    ASSERT_EQ(std::sscanf(line.c_str() + 20, " %2d%2d%2d %2d:%2d", &y2, &mo2, &d2, &h2, &mi2), 5);
    ASSERT_EQ(std::sscanf(line.c_str(), " %3d", &arc), 1);
    if (s.startTime > toSec(y, mo, d, h, mi, se) && s.startTime < toSec(y2, mo2, d2, h2, mi2, 0)) chosen = arc;
  }
  EXPECT_EQ(chosen, 15);
  // The ODR arc: head, 60 s records, and positions of the scene orbit
  // through the arc's geodetic conversion.
  const std::vector<char> O = readAll(dir + "/orbits/ERS2/PRECISE/ODR.015");
  ASSERT_GE(O.size(), 32u);
  EXPECT_EQ(text(O, 0, 4), "xODR");
  EXPECT_EQ(text(O, 4, 5), "ERS-2");
  const int n = static_cast<int>(be32(O.data() + 24));
  ASSERT_EQ(n, 7921);
  ASSERT_EQ(O.size(), 32u + 16u * n);
  const double first = static_cast<std::int32_t>(be32(O.data() + 32));
  EXPECT_LT(first, s.startTime);
  EXPECT_GT(first + 60.0 * (n - 1), s.startTime);
  for (int i = 0; i < n; i += 611) {
    const char* r = O.data() + 32 + 16 * i;
    const double t = static_cast<std::int32_t>(be32(r));
    EXPECT_EQ(t, first + 60.0 * i);
    const double lat = static_cast<std::int32_t>(be32(r + 4)) * 1e-7 * M_PI / 180.0;
    const double lon = static_cast<std::int32_t>(be32(r + 8)) * 1e-7 * M_PI / 180.0;
    const double h = static_cast<std::int32_t>(be32(r + 12)) / 1000.0;
    const double b = std::atan(std::tan(lat) * 0.9933056199794559);
    const double rr = 6356752.314147896 / std::sqrt(1.0 - 0.006694380020544122 * std::cos(b) * std::cos(b));
    const double dd = lat - b;
    const double R = std::sqrt(rr * rr + 2.0 * h * rr * std::cos(dd) + h * h);
    const double g = std::asin(std::sin(dd) * h / R) + b;
    const StateVector sv = sim.orbit().at(t);
    EXPECT_NEAR(R * std::cos(g) * std::cos(lon), sv.pos[0], 0.02);
    EXPECT_NEAR(R * std::cos(g) * std::sin(lon), sv.pos[1], 0.02);
    EXPECT_NEAR(R * std::sin(g), sv.pos[2], 0.02);
  }
  // The project's DEOS reader interpolates the scene orbit from the arc.
  double pos[3 * 5];
  ASSERT_EQ(interp_orb_deos(dir + "/orbits/ERS2/PRECISE/ODR.015", s.startTime, "ERS2", s.startTime - 10.0, 5.0, 5, pos), 0);
  for (int k = 0; k < 5; ++k) {
    const StateVector sv = sim.orbit().at(s.startTime - 10.0 + 5.0 * k);
    EXPECT_NEAR(norm(Vec3{pos[3 * k], pos[3 * k + 1], pos[3 * k + 2]} - sv.pos), 0.0, 0.05) << k;
  }
  EXPECT_NE(interp_orb_deos(dir + "/orbits/ERS2/PRECISE/ODR.015", s.startTime, "ERS1", s.startTime, 5.0, 5, pos), 0);
  // The state vectors the extractor asks for: positions and velocities of
  // the fitted orbit agree with the simulated orbit.
  GeneralSAROrbit fitted;
  ASSERT_EQ(fitted.GetStateVectorsERS(dir + "/orbits/ERS2/PRECISE/ODR.015", s.startTime, 12.0, "ERS2"), 0);
  for (double dt : {0.0, 4.3, 11.9}) {
    double p[3], v[3];
    ASSERT_EQ(fitted.SVGetPos(s.startTime + dt, p), 0);
    ASSERT_EQ(fitted.SVGetVel(s.startTime + dt, v), 0);
    const StateVector sv = sim.orbit().at(s.startTime + dt);
    EXPECT_NEAR(norm(Vec3{p[0], p[1], p[2]} - sv.pos), 0.0, 0.1) << dt;
    EXPECT_NEAR(norm(Vec3{v[0], v[1], v[2]} - sv.vel), 0.0, 0.01) << dt;
  }

  // The truth file through the profile library.
  std::string value;
  ASSERT_EQ(GetMyProfileString("Scene", "prf_hz", value, dir + "/truth.txt"), 0);
  EXPECT_DOUBLE_EQ(std::stod(value), sim.scene().prfHz);
  ASSERT_EQ(GetMyProfileString("Scene", "first_line_time_text", value, dir + "/truth.txt"), 0);
  EXPECT_DOUBLE_EQ(ascii2sec85(value), s.startTime);
  ASSERT_EQ(GetMyProfileString("Scene", "targets", value, dir + "/truth.txt"), 0);
  EXPECT_EQ(value, "0");
}

TEST(ErsSceneFiles, DamageIsInjectedAsAsked) {
  SceneDescription s;
  s.lines = 40;
  s.samples = 800;
  s.truncateImageBytes = 11644 + 5 * (412 + 1600) + 100;
  s.leaderPatches.push_back({1654, "   ABC.DEF      "});
  s.odrRecords = 60;
  RawSceneSimulator sim(s);
  const TempTree tmp("damage");
  const std::string& dir = tmp.path;
  std::string err;
  ASSERT_EQ(sim.writeErsScene(dir, err), 0) << err;
  EXPECT_EQ(std::filesystem::file_size(sim.imagePath(dir)), static_cast<std::uintmax_t>(s.truncateImageBytes));
  const std::vector<char> L = readAll(sim.leaderPath(dir));
  EXPECT_EQ(text(L, 1654, 16), "   ABC.DEF      ");
  // The descriptor still announces every record.
  const std::vector<char> D = readAll(sim.imagePath(dir));
  EXPECT_EQ(ch2intField(D.data() + 180, 6), 40);
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
  s.mission = "ENVISAT";
  EXPECT_THROW(RawSceneSimulator{s}, std::runtime_error);
}
