#include "numerics/fitting.h"

#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "numerics/root_finding.h"

namespace {

TEST(PolynomialFits, PolfitRecoversAnExactCubic) {
  // Cubic 3 - 2x + 0.5x^2 + 0.25x^3 at 12 points.
  const double c[4] = {3.0, -2.0, 0.5, 0.25};
  std::vector<double> x(12), y(12);
  for (int i = 0; i < 12; ++i) {
    x[i] = -2.0 + 0.4 * i;
    y[i] = c[0] + c[1] * x[i] + c[2] * x[i] * x[i] + c[3] * x[i] * x[i] * x[i];
  }
  double out[4];
  ASSERT_EQ(polfit(x.data(), y.data(), 12, out, 3), 0);
  for (int k = 0; k < 4; ++k) EXPECT_NEAR(out[k], c[k], 1e-13);
}

TEST(PolynomialFits, OrbffitInterpolatesOrbitTimesExactly) {
  // Window polynomials of an orbit (time 0 at the first vector, 5 s apart):
  // the fit interpolates to a micrometre everywhere in the window.
  const double t0 = 0.0, dt = 5.0;
  double pts[15];
  auto f = [&](double t, int k) {
    const double u = (t - 10.0) / 10.0;
    return 7.0e6 * (k + 1) * 0.3 + 7000.0 * (k - 1) * u * 10.0 - 3.5 * u * u * 100.0 +
           0.002 * u * u * u * 1000.0 + 1e-5 * u * u * u * u * 1e4;
  };
  for (int i = 0; i < 5; ++i)
    for (int k = 0; k < 3; ++k) pts[3 * i + k] = f(t0 + i * dt, k);
  double cx[5], cy[5], cz[5];
  ASSERT_EQ(orbffit(t0, dt, pts, 5, cx, cy, cz), 0);
  const double* c[3] = {cx, cy, cz};
  for (double t = t0; t <= t0 + 20.0; t += 1.25)
    for (int k = 0; k < 3; ++k) {
      double v = 0;
      for (int j = 4; j >= 0; --j) v = v * t + c[k][j];
      EXPECT_NEAR(v, f(t, k), 2e-6) << t << " " << k;
    }
}

TEST(RootFinding, RtbisFindsBracketedRootsAndRefusesOthers) {
  int status = -1;
  const double r = rtbis([](double x) { return x * x - 2.0; }, 0.0, 3.0, 1e-10, &status);
  EXPECT_EQ(status, 0);
  EXPECT_NEAR(r, std::sqrt(2.0), 1e-10);
  // Decreasing function.
  const double r2 = rtbis([](double x) { return std::cos(x); }, 1.0, 2.0, 1e-12, &status);
  EXPECT_NEAR(r2, M_PI / 2, 1e-11);
  rtbis([](double x) { return x * x + 1.0; }, -1.0, 1.0, 1e-10, &status);
  EXPECT_EQ(status, 1);
  // A tolerance below what 40 halvings reach ends with a report, not a hang.
  const double r3 = rtbis([](double x) { return x - 0.3; }, 0.0, 1e6, 1e-12, &status);
  EXPECT_EQ(status, 1);
  EXPECT_NEAR(r3, 0.3, 1e-5);
}

}  // namespace
