// Geolocation corners and polynomials of a region against direct queries of
// the orbit model.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "orbit/general_sar_orbit.h"
#include "orbit/geo_grid.h"
#include "orbit/ground_geometry.h"
#include "product/general_sar.h"
#include "product/geo_coords.h"
#include "product/poly_sar.h"
#include "product/roi.h"

namespace {

constexpr double kLambda = 0.05656;
constexpr double kT0 = 600000000.0;
constexpr double kWe = 7.292115189334571e-5;

// Earth-fixed circular orbit, 785 km, 98.5 degrees; phase picks the place
// on the orbit (ascending near 0, descending near pi).
void circular(double t, double phase, double p[3], double v[3]) {
  const double a = 6378137.0 + 785000.0, n = std::sqrt(3.986004418e14 / (a * a * a));
  const double inc = 98.5 * M_PI / 180.0, raan = 0.4;
  const double u = phase + n * t;
  const double xo = a * std::cos(u), yo = a * std::sin(u);
  const double vxo = -a * n * std::sin(u), vyo = a * n * std::cos(u);
  const double cO = std::cos(raan), sO = std::sin(raan), ci = std::cos(inc), si = std::sin(inc);
  double pi[3] = {cO * xo - sO * ci * yo, sO * xo + cO * ci * yo, si * yo};
  double vi[3] = {cO * vxo - sO * ci * vyo, sO * vxo + cO * ci * vyo, si * vyo};
  const double g = kWe * t, c = std::cos(g), s = std::sin(g);
  p[0] = c * pi[0] + s * pi[1];
  p[1] = -s * pi[0] + c * pi[1];
  p[2] = pi[2];
  v[0] = c * vi[0] + s * vi[1] + kWe * p[1];
  v[1] = -s * vi[0] + c * vi[1] - kWe * p[0];
  v[2] = vi[2];
}

void makeOrbit(GeneralSAROrbit& o, double phase) {
  o.setLambda(kLambda);
  ASSERT_EQ(o.SVCreate(kT0, 5.0, 25), 0);
  for (int i = 0; i < 25; ++i) circular(i * 5.0, phase, &o.pos[3 * i], &o.vel[3 * i]);
  ASSERT_EQ(o.computeApproximateSV(), 0);
}

ROI_Obj sceneRoi() {
  ROI_Obj r;
  r.SetFastAxe(5.5e-3, 1.0 / 18.96e6, 5000);   // ~264 us of range
  r.SetSlowAxe(kT0 + 30.0, 1.0 / 1680.0, 100000);  // ~60 s
  return r;
}

polyDC doppler() {
  polyDC dc;
  dc.c[0] = 250.0;
  dc.c[1] = 2.0e5;  // Hz per second of range time
  dc.trg0 = 5.5e-3;
  dc.taz0 = 0.0;
  return dc;
}

}  // namespace

TEST(GeoCoords, CornerSlotsFollowTheFlightDirection) {
  for (double phase : {0.3, M_PI + 0.3}) {
    GeneralSAROrbit o;
    makeOrbit(o, phase);
    const bool asc = o.isAscending();
    EXPECT_EQ(asc, phase < 1.0);
    GSRoi_Obj roi;
    roi.roi = sceneRoi();
    geoCoords_Obj geo;
    ASSERT_EQ(o.SVGetGeoCoords(&geo, &roi), 0);
    const ROI_Obj& r = roi.roi;
    const double a0 = r.SlowStartTime, A = r.SlowTimeLength, r0 = r.FastStartTime, R = r.FastTimeLength;
    auto check = [&](const geopoint& p, double t, double tau) {
      double lat, lon, inc, look;
      ASSERT_EQ(o.SVGetLatLon(t, tau, &lat, &lon), 0);
      ASSERT_EQ(o.SVGetAngles(t, tau, &inc, &look), 0);
      EXPECT_DOUBLE_EQ(p.lat, lat);
      EXPECT_DOUBLE_EQ(p.lon, lon);
      EXPECT_DOUBLE_EQ(p.incidence, inc);
      EXPECT_DOUBLE_EQ(p.look, look);
      EXPECT_EQ(p.height, 0.0);
    };
    if (asc) {
      check(geo.NW, a0 + A, r0);
      check(geo.NE, a0 + A, r0 + R);
      check(geo.SW, a0, r0);
      check(geo.SE, a0, r0 + R);
    } else {
      check(geo.NW, a0, r0 + R);
      check(geo.NE, a0, r0);
      check(geo.SW, a0 + A, r0 + R);
      check(geo.SE, a0 + A, r0);
    }
    check(geo.center, a0 + A / 2, r0 + R / 2);
    // The names hold: north above south, west of east (right-looking).
    EXPECT_GT(geo.NW.lat, geo.SW.lat);
    EXPECT_GT(geo.NE.lat, geo.SE.lat);
    EXPECT_LT(geo.NW.lon, geo.NE.lon);
    EXPECT_LT(geo.SW.lon, geo.SE.lon);
    // A region far past the table fails with the status of the first corner.
    roi.roi.SetSlowAxe(kT0 + 1000.0, 1.0 / 1680.0, 1000);
    EXPECT_NE(o.SVGetGeoCoords(&geo, &roi), 0);
  }
}

TEST(GeoPolys, DopplerRatePolynomialAtMidAzimuth) {
  GeneralSAROrbit o;
  makeOrbit(o, 0.3);
  const ROI_Obj r = sceneRoi();
  const polyDC dc = doppler();
  const double tm = r.SlowStartTime + r.SlowTimeLength / 2;

  // Doppler rate polynomial against direct queries (0.1 %).
  polyFR fr;
  ASSERT_EQ(o.SVGetFRpoly(&r, &dc, &fr), 0);
  for (double f : {0.0, 0.5, 1.0}) {
    const double tau = r.FastStartTime + f * r.FastTimeLength;
    double rate;
    ASSERT_EQ(o.SVGetFR(tm, tau, dc.EvaluatePoly(tau, tm), &rate), 0);
    EXPECT_NEAR(fr.EvaluatePoly(tau, 0.0), rate, 1e-3 * std::fabs(rate));
    EXPECT_LT(rate, -1500.0);
    EXPECT_GT(rate, -2600.0);
  }
}
