// GeneralSAROrbit against an orbit computed from Kepler's laws: ERS-like,
// 785 km altitude, 98.5 degrees inclination, Earth-fixed state vectors.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "orbit/general_sar_orbit.h"
#include "orbit/ground_geometry.h"
#include "orbit/doris_orbit.h"
#include "orbit/orbit_files.h"
#include "product/profile.h"
#include "product/time_base.h"

namespace fs = std::filesystem;

namespace {

constexpr double kC = 299792458.0;
constexpr double kLambda = 0.05656;
constexpr double kWe = 7.292115189334571e-5;
constexpr double kT0 = 600000000.0;  // table start, seconds since 1985

// Earth-fixed state of a Keplerian orbit (e = 0.0011) at t seconds from kT0.
void kepler(double t, double p[3], double v[3], double phase = 0.0) {
  const double mu = 3.986004418e14, a = 6378137.0 + 785000.0, e = 0.0011;
  const double inc = 98.5 * M_PI / 180.0, raan = 0.7, argp = 1.2;
  const double n = std::sqrt(mu / (a * a * a));
  const double M = 0.4 + phase + n * t;
  double E = M;
  for (int k = 0; k < 30; ++k) E -= (E - e * std::sin(E) - M) / (1.0 - e * std::cos(E));
  const double cE = std::cos(E), sE = std::sin(E), sq = std::sqrt(1.0 - e * e);
  const double xo = a * (cE - e), yo = a * sq * sE;
  const double Edot = n / (1.0 - e * cE);
  const double vxo = -a * sE * Edot, vyo = a * sq * cE * Edot;
  const double cO = std::cos(raan), sO = std::sin(raan), cw = std::cos(argp), sw = std::sin(argp);
  const double ci = std::cos(inc), si = std::sin(inc);
  const double R[3][2] = {{cO * cw - sO * sw * ci, -cO * sw - sO * cw * ci},
                          {sO * cw + cO * sw * ci, -sO * sw + cO * cw * ci},
                          {sw * si, cw * si}};
  double pi[3], vi[3];
  for (int k = 0; k < 3; ++k) {
    pi[k] = R[k][0] * xo + R[k][1] * yo;
    vi[k] = R[k][0] * vxo + R[k][1] * vyo;
  }
  const double g = kWe * t, c = std::cos(g), s = std::sin(g);
  p[0] = c * pi[0] + s * pi[1];
  p[1] = -s * pi[0] + c * pi[1];
  p[2] = pi[2];
  const double vx = c * vi[0] + s * vi[1], vy = -s * vi[0] + c * vi[1];
  v[0] = vx + kWe * p[1];
  v[1] = vy - kWe * p[0];
  v[2] = vi[2];
}

// Orbit object with n vectors dt apart from kT0.
void fillOrbit(GeneralSAROrbit& o, int n, double dt, double phase = 0.0) {
  ASSERT_EQ(o.SVCreate(kT0, dt, n), 0);
  for (int i = 0; i < n; ++i) kepler(i * dt, &o.pos[3 * i], &o.vel[3 * i], phase);
  ASSERT_EQ(o.computeApproximateSV(), 0);
}

double dist(const double* a, const double* b) {
  return std::sqrt((a[0] - b[0]) * (a[0] - b[0]) + (a[1] - b[1]) * (a[1] - b[1]) +
                   (a[2] - b[2]) * (a[2] - b[2]));
}
double len(const double* a) { return std::sqrt(a[0] * a[0] + a[1] * a[1] + a[2] * a[2]); }

}  // namespace

TEST(GeneralSAROrbit, PositionAndVelocityWithinAMillimetre) {
  GeneralSAROrbit o(kLambda);
  fillOrbit(o, 31, 10.0);  // 300 s
  double worstP = 0, worstV = 0;
  // Forward, backward and scattered queries: every window placement.
  std::vector<double> times;
  for (double u = -0.0; u <= 300.0; u += 0.73) times.push_back(u);
  for (double u = 300.0; u >= 0.0; u -= 1.37) times.push_back(u);
  for (int k = 0; k < 200; ++k) times.push_back(std::fmod(k * 97.31, 300.0));
  for (double u : times) {
    double p[3], v[3], pt[3], vt[3];
    ASSERT_EQ(o.SVGetPos(kT0 + u, p), 0);
    ASSERT_EQ(o.SVGetVel(kT0 + u, v), 0);
    kepler(u, pt, vt);
    worstP = std::max(worstP, dist(p, pt));
    worstV = std::max(worstV, dist(v, vt));
    // The pointer forms share one scratch vector.
    const double* sp = o.SVGetPos(kT0 + u);
    EXPECT_EQ(sp[0], p[0]);
  }
  EXPECT_LT(worstP, 1e-3);
  EXPECT_LT(worstV, 1e-4);
  // ERS tables are 5 s apart: far inside the millimetre.
  GeneralSAROrbit f(kLambda);
  fillOrbit(f, 41, 5.0);
  // Truth at the time as represented: a double of seconds since 1985 near
  // 6e8 resolves 1.2e-7 s, i.e. up to 0.45 mm along the track.
  for (double u = 0.0; u <= 200.0; u += 0.61) {
    double p[3], pt[3], vt[3];
    const double t = kT0 + u;
    f.SVGetPos(t, p);
    kepler(t - kT0, pt, vt);
    EXPECT_LT(dist(p, pt), 1e-5);
  }
  // The coarse model spans the whole table (75 s spacing here): a first
  // guess, good to a few metres.
  for (double u = 0.0; u <= 300.0; u += 7.0) {
    double pt[3], vt[3], pc[3];
    kepler(u, pt, vt);
    for (int k = 0; k < 3; ++k) {
      const double* c = k == 0 ? o.getCoarsePolyX() : k == 1 ? o.getCoarsePolyY() : o.getCoarsePolyZ();
      pc[k] = POSMACRO(u - (o.getCoarseT0() - kT0), c, 5);
    }
    EXPECT_LT(dist(pc, pt), 5.0);
  }
  EXPECT_DOUBLE_EQ(o.getCoarseDt(), 75.0);
  // Straight-line model: mean speed of the table.
  EXPECT_NEAR(std::fabs(o.getApproxSpeed()), 7.45e3, 0.2e3);
  // A short table of 10 s vectors over a scene also meets the millimetre
  // with its coarse model.
  GeneralSAROrbit s(kLambda);
  fillOrbit(s, 9, 10.0);
  for (double u = 0.0; u <= 80.0; u += 3.3) {
    double pt[3], vt[3], pc[3];
    kepler(u, pt, vt);
    pc[0] = POSMACRO(u, s.getCoarsePolyX(), 5);
    pc[1] = POSMACRO(u, s.getCoarsePolyY(), 5);
    pc[2] = POSMACRO(u, s.getCoarsePolyZ(), 5);
    EXPECT_LT(dist(pc, pt), 1e-3) << u;
  }
}

TEST(SAROrbitStateVectorsObj, OnePolynomialThroughAllVectors) {
  SAROrbitStateVectors_Obj sv;
  EXPECT_EQ(sv.t0, -999.0);
  EXPECT_EQ(sv.nSV, -999);
  ASSERT_EQ(sv.SVCreate(kT0, 10.0, 7), 0);
  for (int i = 0; i < 7; ++i) kepler(i * 10.0, &sv.pos[3 * i], &sv.vel[3 * i]);
  ASSERT_EQ(sv.SVPolyCompute(), 0);
  for (double u = 0.0; u <= 60.0; u += 2.5) {
    double p[3], v[3], pt[3], vt[3];
    sv.SVGetPos(kT0 + u, p);
    sv.SVGetVel(kT0 + u, v);
    kepler(u, pt, vt);
    EXPECT_LT(dist(p, pt), 1e-3);
    EXPECT_LT(dist(v, vt), 1e-4);
  }
  GeneralSAROrbit o(kLambda);
  fillOrbit(o, 7, 10.0);
  double lat, lon, lat2, lon2;
  ASSERT_EQ(sv.SVGetLatLon(kT0 + 20.0, 5.6e-3, kLambda, &lat, &lon), 0);
  ASSERT_EQ(o.SVGetLatLon(kT0 + 20.0, 5.6e-3, &lat2, &lon2), 0);
  EXPECT_NEAR(lat, lat2, 1e-6);
  EXPECT_NEAR(lon, lon2, 1e-6);
}

// ---- loaders on real orbit files ----------------------------------------------------------

TEST(GeneralSAROrbitLoaders, RealDorisAndDeosFiles) {
  const std::string dir = std::string(TESSIVOR_REALDATA_DIR) + "/orbits/";
  const std::string dor = dir + "DOR_VOR_AXVF-P20080331_075200_20080301_215527_20080303_002327";
  if (!fs::exists(dor)) GTEST_SKIP() << "real data folder absent";
  GeneralSAROrbit o;
  const double t = ascii2sec85("02-MAR-2008 10:00:00.000000");
  ASSERT_EQ(o.GetStateVectorsENVI(dor, t, 16.0), 0);
  EXPECT_EQ(o.nSV, 7);
  EXPECT_DOUBLE_EQ(o.t0, t - 3.2);
  double pos[21], vel[21];
  ASSERT_EQ(interp_orb_l(dor, o.t0 + 15.0, 7, 5.0, pos, vel), 0);
  for (int k = 0; k < 21; ++k) {
    EXPECT_EQ(o.pos[k], pos[k]);
    EXPECT_EQ(o.vel[k], vel[k]);
  }
  // The window velocity agrees with the file's velocity.
  double v[3];
  o.SVGetVel(o.t0 + 12.5, v);
  double vt[3];
  ASSERT_EQ(interp_orb_l(dor, o.t0 + 12.5, 1, 5.0, pos, vt), 0);
  EXPECT_LT(dist(v, vt), 1e-3);
  EXPECT_EQ(o.GetStateVectorsENVI(dor, t + 86400.0 * 3, 16.0), 13);
  // The older object: n vectors centred on the scene, one polynomial.
  SAROrbitStateVectors_Obj sv;
  ASSERT_EQ(GetStateVectorsENVI(dor, t, 16.0, 7, &sv), 0);
  EXPECT_DOUBLE_EQ(sv.t0, t + 8.0 - 15.0);
  double ps[3], pw[3];
  sv.SVGetPos(t + 8.0, ps);
  o.GetStateVectorsENVI(dor, t, 16.0);
  o.SVGetPos(t + 8.0, pw);
  EXPECT_LT(dist(ps, pw), 1e-3);

  const std::string ers1 = dir + "ers1_ODR.079";
  const double te = ascii2sec85("13-APR-1992 08:00:00.000000");
  GeneralSAROrbit e;
  ASSERT_EQ(e.GetStateVectorsERS(ers1, te, 15.5, "ERS1"), 0);
  EXPECT_EQ(e.nSV, 7);
  // Velocities come from the fitted polynomials: they match the slope of
  // the positions and the speed of a low orbit.
  for (int k = 1; k < 6; ++k) {
    for (int a = 0; a < 3; ++a) {
      const double slope = (e.pos[3 * (k + 1) + a] - e.pos[3 * (k - 1) + a]) / 10.0;
      EXPECT_NEAR(e.vel[3 * k + a], slope, 0.1);
    }
    EXPECT_NEAR(len(&e.vel[3 * k]), 7.4e3, 0.4e3);
  }
  GeneralSAROrbit f;
  EXPECT_EQ(f.GetStateVectorsERS(ers1, te, 15.5, "ERS2"), 1);
  EXPECT_EQ(f.GetStateVectorsERS(dir + "envisat_ODR.051", 545012632.0 + 600, 15.5, "ERS1"), 1);
}
