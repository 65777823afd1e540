// Orbit file readers on genuine DORIS and DEOS files and on small files
// written here in the products' own layouts.
#include <gtest/gtest.h>

#include "support/files.h"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "orbit/deos_orbit.h"
#include "orbit/doris_orbit.h"
#include "orbit/orbit_files.h"
#include "product/time_base.h"

namespace fs = std::filesystem;

namespace {

const std::string kOrbits = std::string(TESSIVOR_REALDATA_DIR) + "/orbits/";
const std::string kDorVor =
    kOrbits + "DOR_VOR_AXVF-P20080331_075200_20080301_215527_20080303_002327";


std::string tempDir(const std::string& name) { return support::scratchDir("orbit_files_" + name); }

double norm3(const double* v) { return std::sqrt(v[0] * v[0] + v[1] * v[1] + v[2] * v[2]); }

// Circular Earth-fixed orbit used for written files: radius 7.16e6 m,
// inclination 98.5 degrees, Earth rotation removed.
void circularOrbit(double t, double p[3], double v[3]) {
  const double R = 7164137.0, n = std::sqrt(3.986004418e14 / (R * R * R));
  const double inc = 98.5 * M_PI / 180.0, w = 7.292115189334571e-5;
  const double u = n * t - 1.0, lan = 0.3 - w * t;
  const double xo = R * std::cos(u), yo = R * std::sin(u);
  const double vxo = -R * n * std::sin(u), vyo = R * n * std::cos(u);
  const double ci = std::cos(inc), si = std::sin(inc), cl = std::cos(lan), sl = std::sin(lan);
  p[0] = cl * xo - sl * ci * yo;
  p[1] = sl * xo + cl * ci * yo;
  p[2] = si * yo;
  // d/dt of the rotating node adds -w about z.
  v[0] = cl * vxo - sl * ci * vyo + w * p[1];
  v[1] = sl * vxo + cl * ci * vyo - w * p[0];
  v[2] = si * vyo;
}

void putBE(std::vector<unsigned char>& b, std::size_t off, int value) {
  unsigned int u = static_cast<unsigned int>(value);
  b[off] = u >> 24;
  b[off + 1] = (u >> 16) & 0xff;
  b[off + 2] = (u >> 8) & 0xff;
  b[off + 3] = u & 0xff;
}

void writeBytes(const std::string& path, const std::vector<unsigned char>& b, std::size_t n) {
  std::ofstream f(path, std::ios::binary);
  f.write(reinterpret_cast<const char*>(b.data()), static_cast<std::streamsize>(n));
}

void writeText(const std::string& path, const std::string& s) {
  std::ofstream f(path, std::ios::binary);
  f << s;
}

// A DORIS-type product: 1247-byte main header, 378-byte specific header,
// 129-byte records 60 s apart.
std::string dorisFile(const std::string& product, double tFirst, int count) {
  std::string mph(1247, ' ');
  mph.replace(0, 9, "PRODUCT=\"");
  mph.replace(9, 10, product);
  std::string start, stop;
  sec852ascii(tFirst, start);
  sec852ascii(tFirst + (count - 1) * 60.0, stop);
  mph.replace(351 - 15, 15, "SENSING_START=\"");
  mph.replace(351, 27, start);
  mph.replace(394 - 14, 14, "SENSING_STOP=\"");
  mph.replace(394, 27, stop);
  std::string sph(378, ' ');
  sph.replace(221, 10, "DS_OFFSET=");
  char buf[64];
  std::snprintf(buf, sizeof buf, "+%020d<bytes>", 1247 + 378);
  sph.replace(231, std::strlen(buf), buf);
  sph.replace(297, 8, "NUM_DSR=");
  std::snprintf(buf, sizeof buf, "+%010d", count);
  sph.replace(305, std::strlen(buf), buf);
  std::string out = mph + sph;
  for (int i = 0; i < count; ++i) {
    double t = tFirst + 60.0 * i, p[3], v[3];
    circularOrbit(t - tFirst, p, v);
    std::string ts;
    sec852ascii(t, ts);
    char rec[200];
    std::snprintf(rec, sizeof rec, "%s -.331385 %+06d %+012.3f %+012.3f %+012.3f %+012.6f %+012.6f %+012.6f      3\n",
                  ts.c_str(), 1000 + (i >= 20 ? 1 : 0), p[0], p[1], p[2], v[0], v[1], v[2]);
    EXPECT_EQ(std::strlen(rec), 129u);
    out += rec;
  }
  return out;
}

}  // namespace

TEST(InterpOrbLagrange, ExactOnNodesAndPolynomialsOfDegreeEight) {
  double times[9], pts[27];
  auto f = [](double t, int a) { return 1.0 + a + 0.5 * t - 0.01 * t * t + 1e-9 * std::pow(t, 8); };
  for (int j = 0; j < 9; ++j) {
    times[j] = 1000.0 + 60.0 * j;
    for (int a = 0; a < 3; ++a) pts[3 * j + a] = f(times[j] - 1000.0, a);
  }
  double outT[3] = {times[3], 1000.0 + 95.0, 1000.0 + 500.0};  // node, inside, extrapolated
  double out[9];
  ASSERT_EQ(interp_orb_Lagrange(pts, times, out, outT, 3), 0);
  for (int a = 0; a < 3; ++a) {
    EXPECT_EQ(out[a], pts[9 + a]);  // bitwise on a node
    EXPECT_NEAR(out[3 + a], f(95.0, a), 1e-9 * std::fabs(f(95.0, a)));
    EXPECT_NEAR(out[6 + a], f(500.0, a), 1e-8 * std::fabs(f(500.0, a)));
  }
}

TEST(DorisReader, WrittenFilesAndFailures) {
  const std::string dir = tempDir("doris");
  const double t0 = ascii2sec85("10-JUN-2005 10:00:00.000000");
  const std::string good = dorisFile("DOR_POR_AX", t0, 40);
  writeText(dir + "/por", good);
  double pos[3 * 7], vel[3 * 7], p[3], v[3];
  int orbit = 0;
  const double tc = t0 + 1210.0;
  ASSERT_EQ(interp_orb_l(dir + "/por", tc, 7, 5.0, pos, vel, &orbit), 0);
  EXPECT_EQ(orbit, 1001);  // record 20 (at 1200 s) is nearer than record 21
  for (int i = 0; i < 7; ++i) {
    circularOrbit(tc - t0 + (i - 3) * 5.0, p, v);
    for (int a = 0; a < 3; ++a) {
      EXPECT_NEAR(pos[3 * i + a], p[a], 0.01);
      EXPECT_NEAR(vel[3 * i + a], v[a], 1e-5);
    }
  }
  // All four product names are accepted, others refused with 12.
  for (const char* name : {"DOR_VOR_AX", "AUX_FRO_AX", "AUX_FPO_AX"}) {
    writeText(dir + "/other", dorisFile(name, t0, 40));
    EXPECT_EQ(interp_orb_l(dir + "/other", tc, 1, 5.0, pos, nullptr), 0) << name;
  }
  writeText(dir + "/other", dorisFile("ASA_INS_AX", t0, 40));
  EXPECT_EQ(interp_orb_l(dir + "/other", tc, 1, 5.0, pos, nullptr), 12);
  // Missing and truncated files.
  EXPECT_EQ(interp_orb_l(dir + "/absent", tc, 1, 5.0, pos, nullptr), 9);
  writeText(dir + "/short", good.substr(0, 1000));
  EXPECT_EQ(interp_orb_l(dir + "/short", tc, 1, 5.0, pos, nullptr), 4);
  writeText(dir + "/cut", good.substr(0, 1625 + 129 * 15 + 50));
  EXPECT_EQ(interp_orb_l(dir + "/cut", tc, 1, 5.0, pos, nullptr), 4);
  // Ascending node of the written orbit: argument of latitude 0 or 2 pi.
  double node = 0.0;
  ASSERT_EQ(interp_orb_l(dir + "/por", t0 + 2300.0, 1, 5.0, pos, nullptr, nullptr, 1, &node), 0);
  const double n = std::sqrt(3.986004418e14 / std::pow(7164137.0, 3));
  EXPECT_NEAR(node - t0, 1.0 / n, 1e-4);
}

// ---- DEOS ODR ----------------------------------------------------------------

namespace {

struct OdrFile {
  std::vector<unsigned char> bytes;
};

// DEOS arc written from the circular orbit: geodetic records 60 s apart.
std::vector<unsigned char> odrFile(const char* id, const char* sat, int first, int count,
                                   double scale) {
  std::vector<unsigned char> b(32 + 16 * static_cast<std::size_t>(count), 0);
  std::memcpy(b.data(), id, 4);
  std::memset(b.data() + 4, ' ', 8);
  std::memcpy(b.data() + 4, sat, std::strlen(sat));
  putBE(b, 12, first);
  putBE(b, 16, 35000);
  putBE(b, 20, 7);
  putBE(b, 24, count);
  for (int i = 0; i < count; ++i) {
    double p[3], v[3];
    circularOrbit(60.0 * i, p, v);
    // Inverse of the DEOS conversion: Newton on (latitude, height).
    const double lon = std::atan2(p[1], p[0]) * 180.0 / M_PI;
    const double rho = std::hypot(p[0], p[1]);
    double lat = std::atan2(p[2], rho) * 180.0 / M_PI, h = norm3(p) - 6371000.0;
    for (int it = 0; it < 20; ++it) {
      double x[3], xa[3], xh[3];
      deos_to_cartesian(lat, lon, h, x);
      deos_to_cartesian(lat + 1e-6, lon, h, xa);
      deos_to_cartesian(lat, lon, h + 1.0, xh);
      const double f1 = std::hypot(x[0], x[1]) - rho, f2 = x[2] - p[2];
      const double j11 = (std::hypot(xa[0], xa[1]) - std::hypot(x[0], x[1])) / 1e-6,
                   j12 = std::hypot(xh[0], xh[1]) - std::hypot(x[0], x[1]);
      const double j21 = (xa[2] - x[2]) / 1e-6, j22 = xh[2] - x[2];
      const double det = j11 * j22 - j12 * j21;
      lat -= (f1 * j22 - f2 * j12) / det;
      h -= (j11 * f2 - j21 * f1) / det;
    }
    std::size_t o = 32 + 16 * static_cast<std::size_t>(i);
    putBE(b, o, first + 60 * i);
    putBE(b, o + 4, static_cast<int>(std::lround(lat / scale)));
    putBE(b, o + 8, static_cast<int>(std::lround(lon / scale)));
    putBE(b, o + 12, static_cast<int>(std::lround(h * 1000.0)));
  }
  return b;
}

}  // namespace

TEST(DeosReader, WrittenArcsAndFailures) {
  const std::string dir = tempDir("deos");
  const int first = 400000000, count = 30;
  for (auto [id, scale] : {std::pair{"@ODR", 1e-6}, std::pair{"xODR", 1e-7}}) {
    auto b = odrFile(id, "ERS-2", first, count, scale);
    writeBytes(dir + "/arc", b, b.size());
    const double t = first + 600.0 + 12.0;
    double pos[3 * 5], p[3], v[3];
    ASSERT_EQ(interp_orb_deos(dir + "/arc", t, "ERS2", t, 5.0, 5, pos), 0) << id;
    for (int k = 0; k < 5; ++k) {
      circularOrbit(612.0 + 5.0 * k, p, v);
      // Rounding of the angles: 1e-6 degree is 0.11 m, 1e-7 degree 0.011 m.
      for (int a = 0; a < 3; ++a) EXPECT_NEAR(pos[3 * k + a], p[a], scale * 2e6) << id;
    }
    // The last accepted time is first + count 60.
    EXPECT_EQ(interp_orb_deos(dir + "/arc", first + count * 60.0, "ERS2", t, 5.0, 5, pos), 0);
    EXPECT_EQ(interp_orb_deos(dir + "/arc", first + count * 60.0 + 0.5, "ERS2", t, 5.0, 5, pos), 1);
    EXPECT_EQ(interp_orb_deos(dir + "/arc", first - 0.5, "ERS2", t, 5.0, 5, pos), 1);
    // Truncated arc.
    writeBytes(dir + "/cut", b, b.size() - 20);
    EXPECT_EQ(interp_orb_deos(dir + "/cut", t, "ERS2", t, 5.0, 5, pos), 4);
  }
  auto b = odrFile("?ODR", "ERS-1", first, count, 1e-6);
  writeBytes(dir + "/bad", b, b.size());
  double pos[15];
  EXPECT_EQ(interp_orb_deos(dir + "/bad", first + 100.0, "ERS1", first, 5.0, 5, pos), 1);
  EXPECT_EQ(interp_orb_deos(dir + "/absent", first + 100.0, "ERS1", first, 5.0, 5, pos), 9);
}
