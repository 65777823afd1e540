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

std::string tempPath(const std::string& name) {
  fs::path p = fs::path(testing::TempDir()) / "general_sar_orbit";
  fs::create_directories(p);
  return (p / name).string();
}

}  // namespace

TEST(GeneralSAROrbit, TableLifeAndWindowCount) {
  GeneralSAROrbit o;
  EXPECT_DOUBLE_EQ(o.lambda, 0.05623564240544047);
  EXPECT_EQ(o.getLookSign(), 1);
  EXPECT_EQ(o.SVCreate(kT0, 5.0, 4), 1);
  EXPECT_FALSE(o.hasVectors());
  double p[3];
  EXPECT_EQ(o.SVGetPos(kT0, p), 1);
  double t = 0, tau = 0;
  EXPECT_EQ(o.earth2sat(p, &t, &tau), 1);
  EXPECT_EQ(t, -1.0);
  EXPECT_EQ(tau, -1.0);
  fillOrbit(o, 5, 5.0);
  EXPECT_EQ(o.getNumberOfWindows(), 1);
  EXPECT_EQ(o.SVGetPos(kT0 + 1.0, p), 0);
  GeneralSAROrbit w(0.24);
  EXPECT_DOUBLE_EQ(w.lambda, 0.24);
}

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

TEST(GeneralSAROrbit, WindowSelection) {
  GeneralSAROrbit o(kLambda);
  fillOrbit(o, 20, 5.0);
  double p[3];
  // Before the table: window 0; after it: the last window, extrapolating.
  o.SVGetPos(kT0 - 20.0, p);
  EXPECT_EQ(o.getCurrentWindow(), 0);
  o.SVGetPos(kT0 + 200.0, p);
  EXPECT_EQ(o.getCurrentWindow(), 15);
  EXPECT_DOUBLE_EQ(o.getCurT0(), kT0 + 75.0);
  // Moving forward places t between 0.6 and 1.6 intervals into the window.
  o.SVGetPos(kT0 + 42.0, p);  // d = 42, i = floor((42 - 3) / 5) = 7
  EXPECT_EQ(o.getCurrentWindow(), 7);
  // Creeping back under the 0.6 dt limit puts t near the far end...
  o.SVGetPos(kT0 + 37.5, p);  // 2.5 s after curT0 = 35: i = ceil(40.5 / 5) - 4 = 5
  EXPECT_EQ(o.getCurrentWindow(), 5);
  EXPECT_NEAR(kT0 + 37.5 - o.getCurT0(), 12.5, 1e-9);
  // ... so alternating around that limit does not move it again.
  for (int k = 0; k < 10; ++k) {
    o.SVGetPos(kT0 + 37.9 + (k % 2 ? 0.4 : -0.4), p);
    EXPECT_EQ(o.getCurrentWindow(), 5);
  }
  EXPECT_EQ(o.updatePolys(kT0 + 41.9), 0);
  EXPECT_EQ(o.getCurrentWindow(), 5);
  EXPECT_EQ(o.updatePolys(kT0 + 42.1), 0);  // beyond 3.4 dt: floor((42.1 - 3) / 5)
  EXPECT_EQ(o.getCurrentWindow(), 7);
}

TEST(GeneralSAROrbit, GroundPointsAndInverseAcrossTheSwath) {
  for (int side : {1, -1}) {
    GeneralSAROrbit o(kLambda);
    o.setLookSign(side);
    fillOrbit(o, 21, 5.0);
    for (double fd : {0.0, 420.0, -1500.0}) {
      for (double tau = 5.5e-3; tau <= 5.9e-3; tau += 0.1e-3) {
        for (double u : {22.3, 50.0, 77.1}) {
          const double t = kT0 + u;
          double g[3], S[3], V[3];
          ASSERT_EQ(o.sat2earth(t, tau, fd, g), 0);
          o.SVGetPos(t, S);
          o.SVGetVel(t, V);
          // On the ellipsoid, at the range and on the Doppler cone.
          const double q = (g[0] * g[0] + g[1] * g[1]) / 40680631590769.0 + g[2] * g[2] / 40408299984659.16;
          EXPECT_NEAR(q, 1.0, 1e-12);
          double d[3] = {S[0] - g[0], S[1] - g[1], S[2] - g[2]};
          EXPECT_NEAR(len(d), kC * tau / 2.0, 1e-4);
          const double dop = -(2.0 / kLambda) * (V[0] * d[0] + V[1] * d[1] + V[2] * d[2]) / len(d);
          EXPECT_NEAR(dop, fd, 1e-3);
          // Look side: the point is right of the velocity for +1.
          double n[3] = {V[1] * S[2] - V[2] * S[1], V[2] * S[0] - V[0] * S[2], V[0] * S[1] - V[1] * S[0]};
          EXPECT_GT(side * (n[0] * g[0] + n[1] * g[1] + n[2] * g[2]), 0.0);
          // Back to the times.
          double tb, taub;
          ASSERT_EQ(o.earth2sat(g, &tb, &taub, fd), 0);
          EXPECT_NEAR(tb, t, 1e-6);
          EXPECT_NEAR(taub, tau, 1e-11);
          ASSERT_EQ(o.earth2satPrecise(g, &tb, &taub, fd), 0);
          EXPECT_NEAR(tb, t, 1e-6);
          EXPECT_NEAR(taub, tau, 1e-11);
          // The straight-line first guess is close.
          ASSERT_EQ(o.earth2satLinear(g, &tb, &taub, fd), 0);
          // (the mean-velocity frame only picks the window)
          EXPECT_NEAR(tb, t, 2.0);
          EXPECT_NEAR(taub, tau, 1e-5);
          if (fd == 0.0) {
            EXPECT_NEAR(o.earth2satAzimuth(g), t, 1e-6);
            EXPECT_NEAR(o.earth2satRange(g), tau, 1e-11);
          }
        }
      }
    }
  }
}

TEST(GeneralSAROrbit, RecordQueriesAgreeWithTheGeometry) {
  GeneralSAROrbit o(kLambda);
  fillOrbit(o, 21, 5.0);
  const double t = kT0 + 48.0, tau = 5.6e-3;
  double g[3];
  o.sat2earth(t, tau, g);
  double llh[3];
  xyz2llh(g, llh, 6378137.0, 6356752.314245);
  double lat, lon;
  ASSERT_EQ(o.SVGetLatLon(t, tau, &lat, &lon), 0);
  EXPECT_NEAR(lat, llh[0] * 180 / M_PI, 1e-6);
  EXPECT_NEAR(lon, llh[1] * 180 / M_PI, 1e-7);
  EXPECT_NEAR(o.SVGetLat(t, tau), lat, 1e-12);
  EXPECT_NEAR(o.SVGetLon(t, tau), lon, 1e-12);
  EXPECT_NEAR(o.sat2earthX(t, tau), g[0], 1e-3);
  EXPECT_NEAR(o.sat2earthY(t, tau), g[1], 1e-3);
  EXPECT_NEAR(o.sat2earthZ(t, tau), g[2], 1e-3);
  GeneralSAROrbit empty;
  EXPECT_EQ(empty.sat2earthX(t, tau), 0.0);
  // On an ellipsoid raised by 500 m the point moves but stays at the range.
  double gh[3] = {o.sat2earthX(t, tau, 500.0), o.sat2earthY(t, tau, 500.0), o.sat2earthZ(t, tau, 500.0)};
  double S[3];
  o.SVGetPos(t, S);
  double d[3] = {S[0] - gh[0], S[1] - gh[1], S[2] - gh[2]};
  EXPECT_NEAR(len(d), kC * tau / 2, 1e-3);
  EXPECT_GT(len(gh) - len(g), 400.0);
  // Angles: incidence above look, ERS-like values.
  double inc, look;
  ASSERT_EQ(o.SVGetAngles(t, tau, &inc, &look), 0);
  EXPECT_GT(inc, look);
  EXPECT_NEAR(look, 20.0, 5.0);
  EXPECT_EQ(o.SVGetAnglesIncidence(t, tau), inc);
  EXPECT_EQ(o.SVGetAnglesLook(t, tau), look);
  // Doppler rate against the second derivative of the range history of
  // the zero-Doppler ground point: fr = -(2 / lambda) R''.
  double fr;
  ASSERT_EQ(o.SVGetFR(t, tau, 0.0, &fr), 0);
  auto range = [&](double u) {
    double p[3], v[3];
    kepler(u - kT0, p, v);
    double e[3] = {p[0] - g[0], p[1] - g[1], p[2] - g[2]};
    return len(e);
  };
  const double h = 0.5;
  const double r2 = (range(t + h) - 2 * range(t) + range(t - h)) / (h * h);
  EXPECT_NEAR(fr, -2.0 / kLambda * r2, 1e-3 * std::fabs(fr));
  double speed;
  ASSERT_EQ(o.SVGetSatSpeed(t, tau, 0.0, &speed), 0);
  EXPECT_NEAR(speed, 6.7e3, 0.3e3);
  // Squinted closed form agrees with the Newton solution at its range.
  double sq[3], tauOut;
  ASSERT_EQ(o.sat2earthSquinted(t, tau, 800.0, sq, &tauOut), 0);
  double gn[3];
  o.sat2earth(t, tauOut, 800.0, gn);
  EXPECT_LT(dist(sq, gn), 0.5);
}

TEST(GeneralSAROrbit, RotationMatrixAndCloneAndDirection) {
  const double v[3] = {-3000.0, 1000.0, 6500.0};
  double m[9], s;
  GeneralSAROrbit::computeRotationMatrix(v, m, &s);
  EXPECT_NEAR(s, -len(v), 1e-9);
  // Rows are orthonormal and the first column is the unit velocity.
  for (int i = 0; i < 3; ++i)
    for (int j = 0; j < 3; ++j) {
      double dd = m[3 * i] * m[3 * j] + m[3 * i + 1] * m[3 * j + 1] + m[3 * i + 2] * m[3 * j + 2];
      EXPECT_NEAR(dd, i == j ? 1.0 : 0.0, 1e-12);
    }
  for (int k = 0; k < 3; ++k) EXPECT_NEAR(m[3 * k] * s, v[k], 1e-9);

  GeneralSAROrbit o(kLambda), c;
  o.setLookSign(-1);
  fillOrbit(o, 12, 5.0);
  ASSERT_EQ(o.clone(&c), 0);
  EXPECT_EQ(c.nSV, 12);
  EXPECT_EQ(c.lambda, kLambda);
  EXPECT_EQ(c.getLookSign(), -1);
  EXPECT_EQ(c.pos, o.pos);
  double p1[3], p2[3];
  o.SVGetPos(kT0 + 13.0, p1);
  c.SVGetPos(kT0 + 13.0, p2);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(p1[k], p2[k]);
  EXPECT_EQ(o.isAscending(), o.vel[2] > 0.0);
  o.vel[2] = 0.0;
  EXPECT_FALSE(o.isAscending());
  o.vel[2] = 1.0;
  EXPECT_TRUE(o.isAscending());
}

TEST(GeneralSAROrbit, BothFileFormsRoundTrip) {
  GeneralSAROrbit o(kLambda);
  fillOrbit(o, 9, 10.0);
  const std::string xml = tempPath("orbit.xml");
  fs::remove(xml);
  ASSERT_EQ(o.writehdr(xml), 0);
  GeneralSAROrbit r;
  ASSERT_EQ(r.readhdr(xml), 0);
  EXPECT_EQ(r.nSV, 9);
  EXPECT_EQ(r.t0, o.t0);
  EXPECT_EQ(r.dt, o.dt);
  // Numbers are stored with 15 significant digits.
  ASSERT_EQ(r.pos.size(), o.pos.size());
  for (std::size_t k = 0; k < o.pos.size(); ++k) {
    EXPECT_NEAR(r.pos[k], o.pos[k], 1e-14 * std::fabs(o.pos[k]));
    EXPECT_NEAR(r.vel[k], o.vel[k], 1e-14 * std::fabs(o.vel[k]));
  }

  // Profile form.
  const std::string hdr = tempPath("orbit.hdr");
  fs::remove(hdr);
  FreeProfile(hdr);
  ASSERT_EQ(WriteProfileDoubleArray("StateVectorData", "TimeFirst", &o.t0, 1, hdr), 0);
  ASSERT_EQ(WriteProfileDoubleArray("StateVectorData", "TimeDelta", &o.dt, 1, hdr), 0);
  ASSERT_EQ(WriteMyProfileIntArray("StateVectorData", "nStateVectors", &o.nSV, 1, hdr), 0);
  ASSERT_EQ(WriteProfileDoubleArray("StateVectorData", "pos", o.pos.data(), 27, hdr), 0);
  ASSERT_EQ(WriteProfileDoubleArray("StateVectorData", "vel", o.vel.data(), 27, hdr), 0);
  SyncProfile(hdr);
  FreeProfile(hdr);
  GeneralSAROrbit q;
  ASSERT_EQ(q.readhdr(hdr), 0);
  EXPECT_EQ(q.nSV, 9);
  EXPECT_EQ(q.t0, o.t0);
  ASSERT_EQ(q.pos.size(), o.pos.size());
  for (std::size_t k = 0; k < o.pos.size(); ++k) {
    EXPECT_NEAR(q.pos[k], o.pos[k], 1e-14 * std::fabs(o.pos[k]));
    EXPECT_NEAR(q.vel[k], o.vel[k], 1e-14 * std::fabs(o.vel[k]));
  }
  double p1[3], p2[3];
  o.SVGetPos(kT0 + 33.0, p1);
  q.SVGetPos(kT0 + 33.0, p2);
  EXPECT_LT(dist(p1, p2), 1e-6);
  // A profile without the vectors.
  const std::string bad = tempPath("bad.hdr");
  fs::remove(bad);
  FreeProfile(bad);
  WriteProfileDoubleArray("StateVectorData", "TimeFirst", &o.t0, 1, bad);
  SyncProfile(bad);
  FreeProfile(bad);
  GeneralSAROrbit b;
  EXPECT_EQ(b.readhdr(bad), 4);

  // The older object reads the same block, from either form.
  SAROrbitStateVectors_Obj sv;
  ASSERT_EQ(sv.readhdr(xml), 0);
  EXPECT_EQ(sv.nSV, 9);
  ASSERT_EQ(sv.readhdr(hdr), 0);
  double ps[3];
  sv.SVGetPos(kT0 + 33.0, ps);
  EXPECT_LT(dist(ps, p1), 1e-3);
  EXPECT_EQ(sv.readhdr(bad), 1);
}

TEST(GeneralSAROrbit, BaselineOfTwoOrbits) {
  GeneralSARInterf m(kLambda);
  fillOrbit(m, 21, 5.0);
  // Slave: the same orbit displaced by a fixed Earth-fixed offset.
  ASSERT_EQ(m.slave.SVCreate(kT0, 5.0, 21), 0);
  const double off[3] = {120.0, -80.0, 45.0};
  for (int i = 0; i < 21; ++i) {
    kepler(i * 5.0, &m.slave.pos[3 * i], &m.slave.vel[3 * i]);
    for (int k = 0; k < 3; ++k) m.slave.pos[3 * i + k] += off[k];
  }
  m.slave.setLambda(kLambda);
  ASSERT_EQ(m.slave.computeApproximateSV(), 0);
  ASSERT_EQ(m.getBaseline(kT0 + 50.0, 5.6e-3), 0);
  const double B = std::sqrt(m.Bl * m.Bl + m.Bh * m.Bh + m.Bn * m.Bn);
  // The slave is seen at its own zero-Doppler time, so the along-track part
  // of the offset drops out; the rest is the cross-track baseline.
  EXPECT_LT(B, len(off) + 1e-6);
  EXPECT_GT(B, 50.0);
  double S1[3];
  m.SVGetPos(kT0 + 50.0, S1);
  double d[3] = {m.slavePos[0] - S1[0], m.slavePos[1] - S1[1], m.slavePos[2] - S1[2]};
  EXPECT_NEAR(B, len(d), 1e-6);
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
