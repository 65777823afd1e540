#include "orbit/ground_geometry.h"

#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "base/constants.h"

namespace {

constexpr double kA = consts::kWgs84A;
constexpr double kB = consts::kWgs84B;
constexpr double kC = consts::kSpeedOfLight;
constexpr double kW = consts::kEarthRotation;
constexpr double kLambda = 0.05656;  // C band
constexpr double kDeg = consts::kPi / 180.0;

// Circular orbit of radius r and inclination inc, inertial frame aligned with
// the Earth-fixed frame at t = 0; state vectors returned Earth-fixed.
struct CircularOrbit {
  double radius = kA + 785e3;
  double speed = std::sqrt(3.986004418e14 / (kA + 785e3));
  double inc = 98.5 * kDeg;
  double node = 20.0 * kDeg;
  double u0 = 40.0 * kDeg;  // argument of latitude at t = 0

  void state(double t, double p[3], double v[3], double a[3]) const {
    const double n = speed / radius;
    const double u = u0 + n * t;
    const double cu = std::cos(u), su = std::sin(u), co = std::cos(node), so = std::sin(node);
    const double ci = std::cos(inc), si = std::sin(inc);
    const double pi[3] = {radius * (cu * co - su * ci * so), radius * (cu * so + su * ci * co),
                          radius * su * si};
    const double vi[3] = {speed * (-su * co - cu * ci * so), speed * (-su * so + cu * ci * co),
                          speed * cu * si};
    const double ai[3] = {-n * n * pi[0], -n * n * pi[1], -n * n * pi[2]};
    // Earth-fixed: rotate by -w t; r' = R r, v' = R (v - w x r),
    // a' = R (a - 2 w x v + w x (w x r)) (all in the inertial frame).
    const double th = -kW * t, c = std::cos(th), s = std::sin(th);
    auto rot = [&](const double x[3], double out[3]) {
      out[0] = c * x[0] - s * x[1];
      out[1] = s * x[0] + c * x[1];
      out[2] = x[2];
    };
    const double wxr[3] = {-kW * pi[1], kW * pi[0], 0.0};
    const double wxv[3] = {-kW * vi[1], kW * vi[0], 0.0};
    const double wxwxr[3] = {-kW * wxr[1], kW * wxr[0], 0.0};
    const double vr[3] = {vi[0] - wxr[0], vi[1] - wxr[1], vi[2]};
    const double ar[3] = {ai[0] - 2 * wxv[0] + wxwxr[0], ai[1] - 2 * wxv[1] + wxwxr[1],
                          ai[2] - 2 * wxv[2] + wxwxr[2]};
    if (p) rot(pi, p);
    if (v) rot(vr, v);
    if (a) rot(ar, a);
  }
  void positions(double t0, double dt, int n, double* pts) const {
    for (int i = 0; i < n; ++i) state(t0 + i * dt, pts + 3 * i, nullptr, nullptr);
  }
};

double dopplerOf(const double S[3], const double V[3], const double X[3]) {
  const double d[3] = {X[0] - S[0], X[1] - S[1], X[2] - S[2]};
  return 2.0 / kLambda * dot3(V, d) / norm3(d);
}

double rangeOf(const double S[3], const double X[3]) {
  const double d[3] = {X[0] - S[0], X[1] - S[1], X[2] - S[2]};
  return norm3(d);
}

// Two-way range time of a slant range.
double tauOf(double slant) { return 2.0 * slant / kC; }

TEST(GeodeticConversion, RoundTripsAtAllLatitudesAndHeights) {
  const double lats[] = {-90.0, -89.9999, -75.0, -45.0, -10.0, 0.0, 0.001, 30.0, 60.0, 89.99, 90.0};
  const double lons[] = {-179.5, -90.0, 0.0, 12.5, 135.0};
  // The one-step closed form is exact to nanometres over terrain heights; its
  // error grows with height (8 micrometres at 30 km, 5 mm at 800 km).
  const double heights[] = {-430.0, 0.0, 1500.0, 8848.0, 30000.0, 800e3};
  auto tolerance = [](double h) { return h < 10e3 ? 1e-6 : h < 50e3 ? 1e-5 : 6e-3; };
  for (double lat : lats)
    for (double lon : lons)
      for (double h : heights) {
        const double llh[3] = {lat * kDeg, lon * kDeg, h};
        double xyz[3], back[3], xyz2[3], g[3];
        llh2xyz(xyz, llh, kA, kB);
        geo2cart(g, llh);
        for (int k = 0; k < 3; ++k) EXPECT_NEAR(g[k], xyz[k], 1e-6);
        xyz2llh(xyz, back, kA, kB);
        llh2xyz(xyz2, back, kA, kB);
        for (int k = 0; k < 3; ++k)
          EXPECT_NEAR(xyz2[k], xyz[k], tolerance(h)) << lat << " " << lon << " " << h;
        EXPECT_NEAR(back[2], h, 1e-6) << lat << " " << lon;
        EXPECT_NEAR(back[0], lat * kDeg, tolerance(h) / kB);
        if (std::fabs(lat) < 90.0) {
          EXPECT_NEAR(std::remainder(back[1] - lon * kDeg, 2 * consts::kPi), 0.0, 1e-12);
        }
      }
  // The ellipsoid surface itself: exact axes.
  double xyz[3];
  const double pole[3] = {90.0 * kDeg, 0.0, 0.0}, eq[3] = {0.0, 0.0, 0.0};
  llh2xyz(xyz, pole, kA, kB);
  EXPECT_NEAR(xyz[2], kB, 1e-8);
  llh2xyz(xyz, eq, kA, kB);
  EXPECT_NEAR(xyz[0], kA, 1e-8);
}

TEST(GeodeticConversion, Xyz2geoKeepsTheFixedRadiusAndThePolarAxis) {
  const double llh[3] = {47.3 * kDeg, 8.5 * kDeg, 0.0};
  double xyz[3], ll[2], full[3];
  llh2xyz(xyz, llh, kA, kB);
  xyz2geo(xyz, ll, kA, kB);
  xyz2llh(xyz, full, kA, kB);
  EXPECT_EQ(ll[0], full[0]);  // on WGS-84 the two agree exactly
  EXPECT_EQ(ll[1], full[1]);
  // On an ellipsoid raised by 2 km the fixed 6378137.0 of xyz2geo shifts the
  // latitude by a small, non-zero amount.
  const double a2 = kA + 2000.0, b2 = a2 * kB / kA;
  const double raised[3] = {47.3 * kDeg, 8.5 * kDeg, 0.0};
  llh2xyz(xyz, raised, a2, b2);
  xyz2geo(xyz, ll, a2, b2);
  xyz2llh(xyz, full, a2, b2);
  EXPECT_NE(ll[0], full[0]);
  EXPECT_NEAR(ll[0], full[0], 1e-6);
  EXPECT_NEAR(full[0], 47.3 * kDeg, 1e-12);
  const double north[3] = {0.0, 0.0, kB}, south[3] = {0.0, 0.0, -kB + 10.0};
  xyz2geo(north, ll, kA, kB);
  EXPECT_EQ(ll[0], consts::kPi / 2);
  xyz2geo(south, ll, kA, kB);
  EXPECT_EQ(ll[0], -consts::kPi / 2);
}

TEST(VectorKernels, VersorCosineAndSmallMatrices) {
  const double zero[3] = {0, 0, 0};
  double out[3] = {9, 9, 9};
  make_versor(zero, out);
  EXPECT_EQ(out[0], 0.0);
  EXPECT_EQ(out[1], 0.0);
  EXPECT_EQ(out[2], 0.0);
  EXPECT_EQ(COS_PHI_V(zero, zero), 0.0);
  // Find an anti-parallel pair whose cosine rounds below -1: it becomes +1.
  bool found = false;
  for (int i = 1; i < 2000 && !found; ++i) {
    const double a[3] = {0.1 * i, 0.37 * i + 0.01, 1.3 + 0.001 * i};
    const double b[3] = {-3.0 * a[0], -3.0 * a[1], -3.0 * a[2]};
    const double raw = dot3(a, b) / (norm3(a) * norm3(b));
    if (raw < -1.0) {
      found = true;
      EXPECT_EQ(COS_PHI_V(a, b), 1.0);
    } else {
      EXPECT_NEAR(COS_PHI_V(a, b), -1.0, 1e-15);
    }
  }
  EXPECT_TRUE(found);
  const double x[3] = {1, 0, 0}, y[3] = {0, 1, 0};
  double z[3];
  v1pv2(x, y, z);
  EXPECT_EQ(z[2], 1.0);
  EXPECT_NEAR(COS_PHI_V(x, y), 0.0, 0.0);
  const double m[9] = {2, -1, 0, 1, 3, 2, 0, 1, 4};
  EXPECT_DOUBLE_EQ(determ(m), 2 * (12 - 2) + 1 * (4 - 0));
  double mi[9], p[9];
  ASSERT_EQ(inv3x3(m, mi), 0);
  mul3x3(m, mi, p);
  for (int i = 0; i < 9; ++i) EXPECT_NEAR(p[i], (i % 4 == 0) ? 1.0 : 0.0, 1e-15);
  const double sing[9] = {1, 2, 3, 2, 4, 6, 0, 1, 1};
  EXPECT_EQ(inv3x3(sing, mi), 1);
  double mt[9], v[3];
  tran(m, mt, 3, 3);
  EXPECT_EQ(mt[1], m[3]);
  mul3x1(m, x, v);
  EXPECT_EQ(v[1], 1.0);
  const double c[3] = {2.0, -1.0, 5.0};
  EXPECT_DOUBLE_EQ(fdc_interp(13.0, 10.0, c), 2.0 * 9 - 3 + 5);
}

TEST(OrbitPolynomials, InterpolationAndEvaluatorsAgree) {
  CircularOrbit orbit;
  double pts[15], cx[5], cy[5], cz[5];
  orbit.positions(0.0, 5.0, 5, pts);
  ASSERT_EQ(orb_interp(0.0, pts, 5.0, cx, cy, cz, 5), 0);
  // Exact at the nodes (highest power first, time 0 at the first vector).
  for (int i = 0; i < 5; ++i) {
    EXPECT_NEAR(POSMACRO(5.0 * i, cx, 5), pts[3 * i], 1e-6);
    EXPECT_NEAR(POSMACRO(5.0 * i, cz, 5), pts[3 * i + 2], 1e-6);
  }
  // Within a millimetre of the orbit between nodes, velocity within 1e-5 m/s.
  for (double u = 0.0; u <= 20.0; u += 0.7) {
    double p[3], v[3], a[3], tp[3], tv[3], ta[3];
    orbit.state(u, tp, tv, ta);
    POSVELACC_5(u, cx, cy, cz, p, v, a);
    for (int k = 0; k < 3; ++k) {
      const double* c = (k == 0) ? cx : (k == 1) ? cy : cz;
      EXPECT_NEAR(p[k], tp[k], 1e-3);
      EXPECT_NEAR(v[k], tv[k], 1e-4);
      EXPECT_NEAR(a[k], ta[k], 1e-3);
      EXPECT_NEAR(pos(u, c, 5), p[k], 1e-6);
      EXPECT_NEAR(vel(u, c, 5), v[k], 1e-9);
      EXPECT_NEAR(acc(u, c, 5), a[k], 1e-9);
      EXPECT_NEAR(VELMACRO(u, c, 5), v[k], 1e-9);
      EXPECT_NEAR(ACCMACRO(u, c, 5), a[k], 1e-9);
    }
  }
  const double c3[3] = {1.0, 2.0, 3.0};
  EXPECT_EQ(pos(2.0, c3, 0), 0.0);
  EXPECT_EQ(vel(2.0, c3, 1), 0.0);
  EXPECT_EQ(acc(2.0, c3, 2), 0.0);
  EXPECT_DOUBLE_EQ(pos(2.0, c3, 3), 4 + 4 + 3);
  EXPECT_DOUBLE_EQ(vel(2.0, c3, 3), 4 + 2);
  EXPECT_DOUBLE_EQ(acc(2.0, c3, 3), 2);
}

// ERS-like geometry across a swath, both look sides, zero and non-zero Doppler,
// with the Kepler speed and with 7.1 km/s.
TEST(GroundPoint, SolutionLiesAtTheRangeDopplerAndSideAsked) {
  for (double speed : {std::sqrt(3.986004418e14 / (kA + 785e3)), 7100.0}) {
    CircularOrbit orbit;
    orbit.speed = speed;
    for (double t : {0.0, 600.0, 1500.0}) {
      double S[3], V[3];
      orbit.state(t, S, V, nullptr);
      for (double slant : {830e3, 850e3, 880e3, 905e3})
        for (double fd : {0.0, 450.0, -1200.0})
          for (double side : {1.0, -1.0}) {
            double X[3];
            ASSERT_EQ(gr_pt(X, S, V, tauOf(slant), fd, kLambda, 0.0, side, kA, kB), 0);
            EXPECT_NEAR(rangeOf(S, X), slant, 1e-4);
            EXPECT_NEAR(dopplerOf(S, V, X), fd, 1e-5);
            double llh[3];
            xyz2llh(X, llh, kA, kB);
            EXPECT_NEAR(llh[2], 0.0, 1e-4);
            // Right of the velocity for +1: (X - S) . (V x S) > 0.
            double vxs[3];
            v1pv2(V, S, vxs);
            const double d[3] = {X[0] - S[0], X[1] - S[1], X[2] - S[2]};
            EXPECT_GT(dot3(d, vxs) * side, 0.0);
            // Inertial velocity with the rotation rate gives the same point.
            const double Vi[3] = {V[0] - kW * S[1], V[1] + kW * S[0], V[2]};
            double Xi[3];
            ASSERT_EQ(gr_pt(Xi, S, Vi, tauOf(slant), fd, kLambda, kW, side, kA, kB), 0);
            for (int k = 0; k < 3; ++k) EXPECT_NEAR(Xi[k], X[k], 1e-4);
          }
    }
  }
}

TEST(GroundPoint, FailuresOfTheFirstGuess) {
  CircularOrbit orbit;
  double S[3], V[3], X[3];
  orbit.state(0.0, S, V, nullptr);
  // Slant range shorter than the height: no intersection.
  EXPECT_EQ(gr_pt0(X, S, V, tauOf(700e3), kLambda, 0.0, 1.0, kA, kB), 2);
  EXPECT_EQ(gr_pt(X, S, V, tauOf(700e3), 0.0, kLambda, 0.0, 1.0, kA, kB), 2);
  // Velocity parallel to the position: singular plane system.
  const double Sp[3] = {7.0e6, 0.0, 0.0}, Vp[3] = {7000.0, 0.0, 0.0};
  EXPECT_EQ(gr_pt0(X, Sp, Vp, tauOf(850e3), kLambda, 0.0, 1.0, kA, kB), 1);
  EXPECT_EQ(gr_pt(X, Sp, Vp, tauOf(850e3), 0.0, kLambda, 0.0, 1.0, kA, kB), 1);
}

TEST(InverseSolution, ReturnsAzimuthAndRangeTimeOfAGroundPoint) {
  CircularOrbit orbit;
  const double dt = 5.0;
  double pts[21], cx[5], cy[5], cz[5];
  orbit.positions(0.0, dt, 7, pts);
  ASSERT_EQ(orb_interp(0.0, pts, dt, cx, cy, cz, 5), 0);
  double cx7[7], cy7[7], cz7[7];
  ASSERT_EQ(orb_interp(0.0, pts, dt, cx7, cy7, cz7, 7), 0);
  for (double u : {3.0, 9.3, 10.0, 16.8})
    for (double fd : {0.0, 700.0, -300.0})
      for (double side : {1.0, -1.0})
        for (double slant : {835e3, 890e3}) {
          double S[3], V[3], A[3], X[3];
          POSVELACC_5(u, cx, cy, cz, S, V, A);
          ASSERT_EQ(gr_pt(X, S, V, tauOf(slant), fd, kLambda, 0.0, side, kA, kB), 0);
          double t = -1, tau = -1;
          ASSERT_EQ(inv_grpt_opt(&t, &tau, cx, cy, cz, X, 4 * dt, kLambda, fd), 0);
          EXPECT_NEAR(t, u, 1e-7);
          EXPECT_NEAR(tau * kC / 2, slant, 1e-4);
          ASSERT_EQ(inv_grpt(&t, &tau, pts, X, dt, kLambda, fd), 0);
          EXPECT_NEAR(t, u, 1e-7);
          EXPECT_NEAR(tau * kC / 2, slant, 1e-4);
          // Seven-vector polynomials agree with the analytic orbit.
          double Se[3], Ve[3], Xe[3];
          orbit.state(u, Se, Ve, nullptr);
          ASSERT_EQ(gr_pt(Xe, Se, Ve, tauOf(slant), fd, kLambda, 0.0, side, kA, kB), 0);
          ASSERT_EQ(inv_grpt_opt_NSV(&t, &tau, cx7, cy7, cz7, Xe, 6 * dt, kLambda, fd, 7), 0);
          EXPECT_NEAR(t, u, 1e-6);
          EXPECT_NEAR(tau * kC / 2, slant, 1e-3);
          ASSERT_EQ(inv_grpt_NSV(&t, &tau, pts, Xe, dt, kLambda, fd, 7), 0);
          EXPECT_NEAR(t, u, 1e-6);
        }
  // A point seen long after the window: the iterate leaves the span.
  double S[3], V[3], X[3], t, tau;
  orbit.state(200.0, S, V, nullptr);
  ASSERT_EQ(gr_pt(X, S, V, tauOf(850e3), 0.0, kLambda, 0.0, 1.0, kA, kB), 0);
  EXPECT_EQ(inv_grpt_opt(&t, &tau, cx, cy, cz, X, 4 * dt, kLambda, 0.0), 12);
  EXPECT_EQ(inv_grpt(&t, &tau, pts, X, dt, kLambda, 0.0), 12);
  // A point that is not a number never comes back as a solution.
  const double bad[3] = {std::nan(""), 0.0, 0.0};
  EXPECT_EQ(inv_grpt_opt(&t, &tau, cx, cy, cz, bad, 4 * dt, kLambda, 0.0), 12);
}

TEST(GroundPointRecord, AnglesSpeedsAndDopplerRate) {
  CircularOrbit orbit;
  const double dt = 5.0, tw = 100.0;
  grPtRecord rec{};
  orbit.positions(tw, dt, 5, rec.pos);
  rec.t0 = tw;
  rec.dt = dt;
  rec.t = tw + 11.0;
  rec.lambda = kLambda;
  rec.lookSign = 1.0;
  rec.fd = 0.0;
  rec.height = 0.0;
  const double slant = 860e3;
  rec.tau = tauOf(slant);
  ASSERT_EQ(gr_pt_lat_lon(&rec, kA, kB), 0);
  double S[3], V[3], A[3];
  orbit.state(rec.t, S, V, A);
  const double X[3] = {rec.x, rec.y, rec.z};
  EXPECT_NEAR(rangeOf(S, X), slant, 2e-3);  // polynomial vs analytic orbit
  EXPECT_NEAR(dopplerOf(S, V, X), 0.0, 1e-3);
  double llh[3];
  xyz2llh(X, llh, kA, kB);
  EXPECT_NEAR(rec.lat, llh[0] / kDeg, 1e-10);
  EXPECT_NEAR(rec.lon, llh[1] / kDeg, 1e-10);
  // Look angle from the triangle, incidence from the geocentric radius.
  const double rs = norm3(S), rx = norm3(X);
  const double look = std::acos((rs * rs + slant * slant - rx * rx) / (2 * rs * slant)) / kDeg;
  const double inc = std::acos((rs * rs - slant * slant - rx * rx) / (2 * rx * slant)) / kDeg;
  EXPECT_NEAR(rec.look, look, 1e-6);
  EXPECT_NEAR(rec.incidence, inc, 1e-6);
  EXPECT_NEAR(rr2th(X, V, S, 0, nullptr), look, 1e-6);
  EXPECT_NEAR(rec.groundSpeed, norm3(V) * rx / rs, 1e-3);
  // Beam speed uses the curvature radius of the acceleration at the first
  // vector of the window, not at the query time.
  double S0[3], V0[3], A0[3];
  orbit.state(tw, S0, V0, A0);
  const double rc0 = dot3(V, V) / norm3(A0);
  EXPECT_NEAR(rec.beamSpeed, norm3(V) * (1.0 - slant * std::cos(look * kDeg) / rc0), 0.05);
  // Doppler rate against the second derivative of the range history.
  const double h = 0.05;
  double Sm[3], Sp[3];
  orbit.state(rec.t - h, Sm, nullptr, nullptr);
  orbit.state(rec.t + h, Sp, nullptr, nullptr);
  const double r2 = (rangeOf(Sp, X) - 2 * rangeOf(S, X) + rangeOf(Sm, X)) / (h * h);
  const double frTrue = -2.0 / kLambda * r2;
  EXPECT_NEAR(rec.fmRate / frTrue, 1.0, 1e-3);
  // Track heading: angle between the inertial velocity's horizontal
  // direction and the local meridian.
  {
    const double Vi[3] = {V[0] - kW * S[1], V[1] + kW * S[0], V[2]};
    const double north[3] = {-std::sin(llh[0]) * std::cos(llh[1]),
                             -std::sin(llh[0]) * std::sin(llh[1]), std::cos(llh[0])};
    const double east[3] = {-std::sin(llh[1]), std::cos(llh[1]), 0.0};
    const double vn = dot3(Vi, north), ve = dot3(Vi, east);
    EXPECT_NEAR(std::fabs(rec.trackHeading), std::atan(std::fabs(ve / vn)) / kDeg, 1e-6);
  }

  // A raised ellipsoid of the same axis ratio through |X| + h: the point lies
  // at that height less at most e'^2 sin^2(lat) of it (0.67 % at the pole).
  rec.height = 800.0;
  ASSERT_EQ(gr_pt_lat_lon(&rec, kA, kB), 0);
  const double Xh[3] = {rec.x, rec.y, rec.z};
  xyz2llh(Xh, llh, kA, kB);
  EXPECT_LE(llh[2], 800.0);
  EXPECT_GE(llh[2], 800.0 * (1.0 - 0.00674 * std::pow(std::sin(llh[0]), 2)) - 0.05);
  EXPECT_NEAR(rangeOf(S, Xh), slant, 2e-3);

  // Outside the window by more than half a spacing.
  rec.t = tw - 0.6 * dt;
  EXPECT_EQ(gr_pt_lat_lon(&rec, kA, kB), -1);
  rec.t = tw + 4.6 * dt;
  EXPECT_EQ(gr_pt_lat_lon(&rec, kA, kB), -1);
  rec.t = tw - 0.4 * dt;
  rec.height = 0.0;
  EXPECT_EQ(gr_pt_lat_lon(&rec, kA, kB), 0);

  // The form without acceleration gives the same point and no rate.
  grPtRecord r2rec = rec;
  orbit.state(rec.t, S, V, A);
  ASSERT_EQ(gr_pt_lat_lon_s(&r2rec, S, V, kA, kB), 0);
  EXPECT_EQ(r2rec.fmRate, rec.fmRate);  // untouched
  const double Xs[3] = {r2rec.x, r2rec.y, r2rec.z};
  EXPECT_NEAR(rangeOf(S, Xs), slant, 1e-4);
}

TEST(OrbitAngles, ArgumentOfLatitudeAndNodeAngle) {
  // Kepler orbit from its elements (km, km^3/s^2) with e = 0.01.
  const double mu = 398600.47, sma = 7150.0, e = 0.01, inc = 98.5 * kDeg, raan = 1.1;
  const double argp = 0.7;
  for (double nu : {-2.5, -0.3, 0.0, 0.4, 1.9, 3.0}) {
    const double p = sma * (1 - e * e);
    const double r = p / (1 + e * std::cos(nu));
    const double u = argp + nu;
    const double co = std::cos(raan), so = std::sin(raan), ci = std::cos(inc), si = std::sin(inc);
    const double cu = std::cos(u), su = std::sin(u);
    const double pos[3] = {r * (cu * co - su * ci * so), r * (cu * so + su * ci * co), r * su * si};
    const double vr = std::sqrt(mu / p) * e * std::sin(nu), vt = std::sqrt(mu / p) * (1 + e * std::cos(nu));
    const double ur[3] = {pos[0] / r, pos[1] / r, pos[2] / r};
    const double ut[3] = {-su * co - cu * ci * so, -su * so + cu * ci * co, cu * si};
    double S[3], V[3], out = 0;
    for (int k = 0; k < 3; ++k) {
      S[k] = pos[k] * 1000.0;
      V[k] = (vr * ur[k] + vt * ut[k]) * 1000.0;
    }
    ASSERT_EQ(Otrulat(S, V, &out), 0);
    EXPECT_NEAR(std::remainder(out - u, 2 * consts::kPi), 0.0, 1e-9) << nu;
  }
  // compute_ulat: node vectors along +x and -x, S in the x-z plane.
  const double nodes[6] = {1, 0, 0, -1, 0, 0};
  const double s30[3] = {std::cos(30 * kDeg), 0, std::sin(30 * kDeg)};
  const double s120[3] = {std::cos(120 * kDeg), 0, std::sin(120 * kDeg)};
  EXPECT_NEAR(compute_ulat(s30, 5.0, nodes, 5.0), 30 * kDeg, 1e-12);
  EXPECT_NEAR(compute_ulat(s120, 5.0, nodes, 5.0), -120 * kDeg, 1e-12);
  // Rotation by the Earth's rate over time t - t0 about z.
  const double sx[3] = {1, 0, 0};
  const double dtq = 100.0;
  EXPECT_NEAR(compute_ulat(sx, dtq, nodes, 0.0), kW * dtq, 1e-12);
}

TEST(Baseline, ComponentsOfATranslatedOrbit) {
  CircularOrbit orbit;
  const double dt = 5.0;
  double pts1[15], pts2[15];
  orbit.positions(0.0, dt, 5, pts1);
  // Geometry at t = 10 s to build the offset from its line of sight and
  // horizontal direction.
  double cx[5], cy[5], cz[5], S[3], V[3], A[3], G[3], G2[3];
  ASSERT_EQ(orb_interp(0.0, pts1, dt, cx, cy, cz, 5), 0);
  POSVELACC_5(10.0, cx, cy, cz, S, V, A);
  const double tau = tauOf(860e3);
  ASSERT_EQ(gr_pt(G, S, V, tau, 0.0, kLambda, 0.0, 1.0, kA, kB), 0);
  ASSERT_EQ(gr_pt(G2, S, V, tau + 5e-6, 0.0, kLambda, 0.0, 1.0, kA, kB), 0);
  double l[3], hdir[3];
  const double d[3] = {G[0] - S[0], G[1] - S[1], G[2] - S[2]};
  make_versor(d, l);
  const double d2[3] = {G2[0] - S[0], G2[1] - S[1], G2[2] - S[2]};
  const double ld = dot3(l, d2);
  const double hr[3] = {d2[0] - l[0] * ld, d2[1] - l[1] * ld, d2[2] - l[2] * ld};
  make_versor(hr, hdir);
  const double along = 35.0, horiz = 150.0;
  for (int i = 0; i < 5; ++i)
    for (int k = 0; k < 3; ++k) pts2[3 * i + k] = pts1[3 * i + k] + along * l[k] + horiz * hdir[k];
  double out[3], t2, tau2;
  ASSERT_EQ(baseline(10.0, pts1, pts2, dt, dt, tau, kLambda, 0.0, 1.0, out, &t2, &tau2), 0);
  EXPECT_NEAR(out[0], horiz, 1e-4);
  EXPECT_NEAR(out[1], along, 1e-4);
  EXPECT_NEAR(out[2], 0.0, 1e-4);
  EXPECT_NEAR(t2, 10.0, 1e-7);
  EXPECT_EQ(baseline(25.0, pts1, pts2, dt, dt, tau, kLambda, 0.0, 1.0, out), 12);
}

}  // namespace
