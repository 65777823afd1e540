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
        double xyz[3], back[3], xyz2[3];
        llh2xyz(xyz, llh, kA, kB);
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

}  // namespace
