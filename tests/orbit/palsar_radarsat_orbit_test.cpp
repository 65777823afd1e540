// PALSAR (CEOS leader, ALDSEF, ALEOCF) and RADARSAT orbit files written in
// their layouts from a known orbit, read back through the loaders.
#include <gtest/gtest.h>

#include "support/files.h"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "orbit/general_sar_orbit.h"
#include "orbit/orbit_files.h"
#include "orbit/palsar_orbit.h"
#include "orbit/radarsat_orbit.h"
#include "product/time_base.h"

namespace fs = std::filesystem;

namespace {

constexpr double kWe = 7.292115189334571e-5;

// Earth-fixed circular orbit, 692 km (PALSAR-like), t in seconds since 1985.
void truth(double t, double p[3], double v[3]) {
  const double a = 6378137.0 + 692000.0, n = std::sqrt(3.986004418e14 / (a * a * a));
  const double inc = 98.16 * M_PI / 180.0, raan = 1.1;
  const double u = 0.2 + n * (t - 700000000.0);
  const double xo = a * std::cos(u), yo = a * std::sin(u);
  const double vxo = -a * n * std::sin(u), vyo = a * n * std::cos(u);
  const double cO = std::cos(raan), sO = std::sin(raan), ci = std::cos(inc), si = std::sin(inc);
  double pi[3] = {cO * xo - sO * ci * yo, sO * xo + cO * ci * yo, si * yo};
  double vi[3] = {cO * vxo - sO * ci * vyo, sO * vxo + cO * ci * vyo, si * vyo};
  const double g = kWe * (t - 700000000.0), c = std::cos(g), s = std::sin(g);
  p[0] = c * pi[0] + s * pi[1];
  p[1] = -s * pi[0] + c * pi[1];
  p[2] = pi[2];
  v[0] = c * vi[0] + s * vi[1] + kWe * p[1];
  v[1] = -s * vi[0] + c * vi[1] - kWe * p[0];
  v[2] = vi[2];
}

// Inertial state at Greenwich angle g of an Earth-fixed one.
void toInertial(double g, const double p[3], const double v[3], double pi[3], double vi[3]) {
  const double c = std::cos(g), s = std::sin(g);
  const double vr[3] = {v[0] - kWe * p[1], v[1] + kWe * p[0], v[2]};
  pi[0] = c * p[0] - s * p[1];
  pi[1] = s * p[0] + c * p[1];
  pi[2] = p[2];
  vi[0] = c * vr[0] - s * vr[1];
  vi[1] = s * vr[0] + c * vr[1];
  vi[2] = vr[2];
}

std::string tempDir() { return support::scratchDir("palsar_radarsat_orbit"); }

using support::writeText;

void put(std::string& b, std::size_t off, const std::string& text) { b.replace(off, text.size(), text); }

std::string fmtd(const char* f, double v) {
  char buf[64];
  std::snprintf(buf, sizeof buf, f, v);
  return buf;
}

// First point: 15-MAR-2007 04:10:00.
const double kFirst = ascii2sec85("15-MAR-2007 04:10:00.000000");

std::string palsarOrbitFile(const char* type, const char* frame, int count) {
  std::string b(808, ' ');
  put(b, 0, type);
  put(b, 88, frame);
  put(b, 498, "2007-03-15");
  put(b, 508, "00:00:00");
  for (int i = 0; i < count; ++i) {
    const double t = kFirst + 60.0 * i;
    double p[3], v[3];
    truth(t, p, v);
    if (std::strcmp(frame, "ECI") == 0) {
      double pi[3], vi[3];
      toInertial(greenwich_angle(t), p, v, pi, vi);
      std::memcpy(p, pi, sizeof p);
      std::memcpy(v, vi, sizeof v);
    }
    const int sod = 4 * 3600 + 10 * 60 + 60 * i;
    char rec[200];
    std::snprintf(rec, sizeof rec, "20070315%02d%02d%02d000000", sod / 3600, sod / 60 % 60, sod % 60);
    std::string r(rec);
    for (int k = 0; k < 3; ++k) r += fmtd("%25.6f", p[k]);
    for (int k = 0; k < 3; ++k) r += fmtd("%25.9f", v[k]);
    EXPECT_EQ(r.size(), 170u);
    b += r;
  }
  return b;
}

void putBE(std::string& b, std::size_t off, unsigned v) {
  b[off] = char(v >> 24);
  b[off + 1] = char((v >> 16) & 0xff);
  b[off + 2] = char((v >> 8) & 0xff);
  b[off + 3] = char(v & 0xff);
}

std::string ceosRecord(unsigned seq, unsigned char type, std::size_t length) {
  std::string r(length, ' ');
  putBE(r, 0, seq);
  r[4] = char(0x12);
  r[5] = char(type);
  r[6] = char(0x12);
  r[7] = char(0x14);
  putBE(r, 8, unsigned(length));
  return r;
}

std::string palsarLeader(const char* facility, int doy, char leap) {
  std::string fd = ceosRecord(1, 192, 720);
  put(fd, 16, "CEOS-SAR-CCT");
  std::string dss = ceosRecord(2, 10, 4096);
  put(dss, 1046, facility);
  std::string pp = ceosRecord(3, 30, 4680);
  put(pp, 140, "  28");
  put(pp, 144, "2007");
  put(pp, 148, "   3");
  put(pp, 152, "  15");
  put(pp, 156, fmtd("%4.0f", doy));
  put(pp, 160, "0.150000000000000E+05");  // 04:10:00
  put(pp, 182, "0.600000000000000E+02");
  for (int i = 0; i < 28; ++i) {
    double p[3], v[3];
    truth(kFirst + 60.0 * i, p, v);
    for (int k = 0; k < 3; ++k) {
      put(pp, 386 + 132 * i + 22 * k, fmtd("%22.6f", p[k]));
      put(pp, 386 + 132 * i + 66 + 22 * k, fmtd("%22.9f", v[k]));
    }
  }
  pp[4082] = leap;
  return fd + dss + pp;
}

void expectTable(GeneralSAROrbit& o, double tol) {
  for (int k = 0; k < o.nSV; ++k) {
    double p[3], v[3];
    truth(o.t0 + k * o.dt, p, v);
    for (int a = 0; a < 3; ++a) {
      EXPECT_NEAR(o.pos[3 * k + a], p[a], tol);
      EXPECT_NEAR(o.vel[3 * k + a], v[a], tol * 1e-2);
    }
  }
}

}  // namespace

TEST(PalsarOrbit, GreenwichAngleAtJ2000) {
  const double t = ascii2sec85("01-JAN-2000 12:00:00.000000");
  EXPECT_NEAR(greenwich_angle(t) * 180.0 / M_PI, 280.46061837, 1e-6);
  // One sidereal day later the angle is back.
  EXPECT_NEAR(std::remainder(greenwich_angle(t + 86164.0905) - greenwich_angle(t), 2 * M_PI), 0.0, 1e-6);
}

TEST(PalsarOrbit, OrbitFilesInBothFrames) {
  const std::string dir = tempDir();
  const double t = kFirst + 600.0 + 7.0;
  for (const char* type : {"ALDSEF", "ALEOCF"}) {
    for (const char* frame : {"ECR", "ECI"}) {
      writeText(dir + "/orb", palsarOrbitFile(type, frame, 28));
      OrbitRecords rec;
      ASSERT_EQ(read_palsar_orbit_file(dir + "/orb", rec), 0);
      ASSERT_EQ(rec.size(), 28);
      EXPECT_DOUBLE_EQ(rec.times[0], kFirst);
      EXPECT_DOUBLE_EQ(rec.times[27], kFirst + 27 * 60.0);
      GeneralSAROrbit o;
      ASSERT_EQ(o.GetStateVectorsPAL(dir + "/orb", t, 20.0), 0) << type << frame;
      EXPECT_EQ(o.nSV, 2 * 3 + 1);  // x = (1.4 * 20 / 5 + 1) / 2 = 3.3 -> 3
      EXPECT_DOUBLE_EQ(o.t0, t - 4.0);
      expectTable(o, 2e-3);
    }
  }
  writeText(dir + "/orb", palsarOrbitFile("ALDSEF", "TOD", 28));
  GeneralSAROrbit o;
  EXPECT_EQ(o.GetStateVectorsPAL(dir + "/orb", t, 20.0), 1);  // axis reference
  writeText(dir + "/orb", palsarOrbitFile("ALXXXX", "ECR", 28));
  EXPECT_EQ(o.GetStateVectorsPAL(dir + "/orb", t, 20.0), 1);  // not supported
  writeText(dir + "/orb", palsarOrbitFile("ALDSEF", "ECR", 28).substr(0, 700));
  EXPECT_EQ(o.GetStateVectorsPAL(dir + "/orb", t, 20.0), 4);  // truncated header
  writeText(dir + "/orb", palsarOrbitFile("ALDSEF", "ECR", 6));
  EXPECT_EQ(o.GetStateVectorsPAL(dir + "/orb", t, 20.0), 4);  // too few points
  EXPECT_EQ(o.GetStateVectorsPAL(dir + "/absent", t, 20.0), 9);
}

TEST(PalsarOrbit, LeaderPlatformPositionRecord) {
  const std::string dir = tempDir();
  const double t = kFirst + 900.0;
  writeText(dir + "/LED", palsarLeader("EORC", 74, '0'));
  OrbitRecords rec;
  ASSERT_EQ(read_palsar_leader_orbit(dir + "/LED", rec), 0);
  ASSERT_EQ(rec.size(), 28);
  EXPECT_DOUBLE_EQ(rec.times[0], kFirst);
  GeneralSAROrbit o;
  ASSERT_EQ(o.GetStateVectorsPAL(dir + "/LED", t, 10.0), 0);
  EXPECT_EQ(o.nSV, 5);
  EXPECT_DOUBLE_EQ(o.t0, t + 5.0 - 10.0);
  expectTable(o, 2e-3);
  // A VEXCEL product dates the points from the day of the year.
  writeText(dir + "/LED", palsarLeader("VEXCEL", 75, '1'));
  ASSERT_EQ(read_palsar_leader_orbit(dir + "/LED", rec), 0);
  EXPECT_DOUBLE_EQ(rec.times[0], kFirst + 86400.0);
  // No platform position record.
  writeText(dir + "/LED", palsarLeader("EORC", 74, '0').substr(0, 720 + 4096));
  EXPECT_EQ(read_palsar_leader_orbit(dir + "/LED", rec), 4);
}

TEST(RadarsatOrbit, TextFileWithNamedBlocks) {
  const std::string dir = tempDir();
  const double tg = ascii2sec85("10-APR-2001 00:00:00.000000");  // day 100
  const double g0 = 197.25 * M_PI / 180.0;
  auto file = [&](bool withSecondModel) {
    std::string s = "RADARSAT ORBIT DATA\nGENERATION TIME: 2001 100 10:00:00.000000\n"
                    "ORBIT NUMBER: 28000\nGREENWICH ANGLE: 2001 100 00:00:00.000000 197.25\n"
                    "FIRST MODEL: JGM-3 70x70\n";
    if (withSecondModel) s += "SECOND MODEL: MSIS\n";
    for (int i = 0; i < 20; ++i) {
      const double t = tg + 43200.0 + 60.0 * i;
      double p[3], v[3], pi[3], vi[3];
      truth(t, p, v);
      toInertial(g0 + kWe * (t - tg), p, v, pi, vi);
      char line[300];
      const int sod = 43200 + 60 * i;
      std::snprintf(line, sizeof line, "STATE VECTOR: 2001 100 %02d:%02d:%02d.000000 %.6f %.6f %.6f %.9f %.9f %.9f\n",
                    sod / 3600, sod / 60 % 60, sod % 60, pi[0], pi[1], pi[2], vi[0], vi[1], vi[2]);
      s += line;
    }
    return s;
  };
  writeText(dir + "/rs.orb", file(true));
  OrbitRecords rec;
  ASSERT_EQ(read_radarsat_orbit(dir + "/rs.orb", rec), 0);
  ASSERT_EQ(rec.size(), 20);
  EXPECT_DOUBLE_EQ(rec.times[0], tg + 43200.0);
  {  // each record turned back to the Earth-fixed truth, to the file's rounding
    double p[3], v[3];
    truth(tg + 43200.0 + 60.0 * 7, p, v);
    for (int a = 0; a < 3; ++a) {
      EXPECT_NEAR(rec.pos[std::size_t(21 + a)], p[a], 2e-6);
      EXPECT_NEAR(rec.vel[std::size_t(21 + a)], v[a], 2e-9);
    }
  }
  const double tc = tg + 43200.0 + 500.0;
  GeneralSAROrbit o;
  // The five-vector window of a short scene is read by the RADARSAT
  // extraction of simulated scenes; a long scene gets a wider one.
  ASSERT_EQ(o.GetStateVectorsRADAR(dir + "/rs.orb", tc, 40.0), 0);
  EXPECT_EQ(o.nSV, 13);  // x = (1.4 * 40 / 5 + 1) / 2 = 6.1 -> 6
  EXPECT_DOUBLE_EQ(o.t0, tc - 30.0);
  expectTable(o, 2e-3);
  SAROrbitStateVectors_Obj sv;
  ASSERT_EQ(GetStateVectorsRADAR(dir + "/rs.orb", tc, 8.0, 5, &sv), 0);
  double p[3], v[3], pt[3], vt[3];
  sv.SVGetPos(tc, p);
  truth(tc, pt, vt);
  for (int a = 0; a < 3; ++a) EXPECT_NEAR(p[a], pt[a], 2e-3);

  // A scene beyond the file's last vector is refused, not extrapolated.
  EXPECT_EQ(o.GetStateVectorsRADAR(dir + "/rs.orb", tg + 43200.0 + 1200.0, 8.0), 1);
  writeText(dir + "/rs.orb", file(false));
  EXPECT_EQ(o.GetStateVectorsRADAR(dir + "/rs.orb", tc, 8.0), 1);  // SECOND MODEL missing
  writeText(dir + "/rs.orb", "GENERATION TIME: 2001 100 10:00:00.0\n");
  EXPECT_EQ(read_radarsat_orbit(dir + "/rs.orb", rec), 1);  // ORBIT NUMBER missing
  EXPECT_EQ(read_radarsat_orbit(dir + "/absent.orb", rec), 9);
  (void)v;
}
