// Fast sine and cosine of the omega-K kernels against the library functions.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>
#include <vector>

#include "core/azimuth_block.h"
#include "core/fft.h"

namespace {

constexpr double kPi = 3.14159265358979323846;

TEST(PhaseRotation, SinCosMatchLibraryOverTheRangePhases) {
  std::mt19937_64 gen(11);
  for (double span : {1.0, 40.0, 3.0e3, 4.0e5, 9.99e5}) {
    std::uniform_real_distribution<double> u(-span, span);
    double worst = 0.0;
    for (int i = 0; i < 200000; ++i) {
      const double x = u(gen);
      double s, c;
      wk_sincos(x, s, c);
      worst = std::max({worst, std::fabs(s - std::sin(x)), std::fabs(c - std::cos(x)),
                        std::fabs(wk_sin(x) - std::sin(x))});
    }
    EXPECT_LT(worst, 5e-16) << span;
  }
  // Quadrant edges and odd multiples of pi/4, both signs.
  for (int m = -40; m <= 40; ++m) {
    for (double d : {-1e-12, 0.0, 1e-12}) {
      const double x = m * kPi / 4.0 + d;
      double s, c;
      wk_sincos(x, s, c);
      EXPECT_NEAR(s, std::sin(x), 5e-16) << x;
      EXPECT_NEAR(c, std::cos(x), 5e-16) << x;
      EXPECT_NEAR(s * s + c * c, 1.0, 1e-15) << x;
    }
  }
}

TEST(PhaseRotation, LargeAndNonFiniteArgumentsFallBack) {
  for (double x : {1.0e6, -2.5e7, 1.0e12}) {
    double s, c;
    wk_sincos(x, s, c);
    EXPECT_EQ(s, std::sin(x)) << x;
    EXPECT_EQ(c, std::cos(x)) << x;
    EXPECT_EQ(wk_sin(x), std::sin(x)) << x;
  }
  double s, c;
  wk_sincos(std::numeric_limits<double>::quiet_NaN(), s, c);
  EXPECT_TRUE(std::isnan(s) && std::isnan(c));
  wk_sincos(std::numeric_limits<double>::infinity(), s, c);
  EXPECT_TRUE(std::isnan(s) && std::isnan(c));
  EXPECT_TRUE(std::isnan(wk_sin(-std::numeric_limits<double>::infinity())));
}

}  // namespace

namespace {

// Column transforms by strips against the plain strided transform.
TEST(ColumnTransform, MatchesStridedTransformAndLeavesOtherColumns) {
  const int pitch = 41, used = 37, lines = 24;  // two full strips and a rest of 5
  std::vector<fcomplex> data(static_cast<std::size_t>(pitch) * lines);
  std::mt19937 gen(5);
  std::normal_distribution<float> n(0.0f, 1.0f);
  for (auto& v : data) v = fcomplex(n(gen), n(gen));
  for (int dir : {FFT_FORWARD, FFT_BACKWARD_NORMALISED}) {
    std::vector<fcomplex> ref = data, got = data;
    ASSERT_EQ(fft_c(pitch, used, lines, lines, FFT_NONE, dir, ref.data(), ref.data()), 0);
    ASSERT_EQ(wk_column_transform(got.data(), pitch, used, lines, dir), 0);
    double worst = 0.0;
    for (int l = 0; l < lines; ++l) {
      for (int c = 0; c < pitch; ++c) {
        const std::size_t i = static_cast<std::size_t>(l) * pitch + c;
        if (c >= used) {
          EXPECT_EQ(got[i], data[i]) << l << " " << c;
        } else {
          worst = std::max(worst, static_cast<double>(std::abs(got[i] - ref[i])));
        }
      }
    }
    EXPECT_LT(worst, 2e-5) << dir;
  }
  // Forward then normalised backward gives the block back.
  std::vector<fcomplex> round = data;
  ASSERT_EQ(wk_column_transform(round.data(), pitch, used, lines, FFT_FORWARD), 0);
  ASSERT_EQ(wk_column_transform(round.data(), pitch, used, lines, FFT_BACKWARD_NORMALISED), 0);
  for (std::size_t i = 0; i < data.size(); ++i) EXPECT_LT(std::abs(round[i] - data[i]), 1e-5f);

  EXPECT_NE(wk_column_transform(data.data(), pitch, pitch + 1, lines, FFT_FORWARD), 0);
  EXPECT_NE(wk_column_transform(data.data(), pitch, 0, lines, FFT_FORWARD), 0);
  EXPECT_NE(wk_column_transform(nullptr, pitch, used, lines, FFT_FORWARD), 0);
}

}  // namespace

namespace {

// Row weighting by anchors and linear steps against the exact rule, on
// C-band rows across the whole azimuth band, window edges included.
TEST(AzimuthWeighting, RowMatchesTheExactTermsAcrossTheBand) {
  AzimuthBlockPar par;
  par.fc = 5.3e9;
  par.frg = 18.96e6;
  par.prf = 1679.9;
  par.Veq = 7100.0;
  par.dc = 300.0;
  par.AntennaLength = 9.45;
  par.azw = 0.75;
  par.rgw = 0.75;
  par.azlook = 0.8 * par.prf;  // flat middle, transitions, outside
  par.aztrans = 0.4 * par.prf;
  par.rglook = par.rgtrans = 0.8 * par.frg;
  par.whiten = 1;
  const WKWeighting wt(par);
  const double k0 = 4.0 * kPi * par.fc / 299792458.0;
  const int n = 1437;  // not a multiple of the anchor step
  std::vector<double> k(n), term(n), P(n);
  for (int i = 0; i < n; ++i) k[i] = k0 + (i - n / 2) * (wt.Bk / n);
  int pieces[3] = {0, 0, 0};
  const double kxc = 2.0 * kPi * par.dc / par.Veq;
  for (int r = -400; r <= 400; ++r) {
    const double kx = kxc + r * (wt.Bx / 800.0);
    wt.azimuthRow(k.data(), n, kx, term.data(), P.data());
    for (int i = 0; i < n; ++i) {
      double Pe;
      const double te = wt.azimuthTerm(k[i], kx, Pe);
      ++pieces[wt.azimuthPiece(k[i], kx)];
      // Within the resolution of the float weights that the kernels apply.
      ASSERT_NEAR(term[i], te, 6e-8 * std::fabs(te) + 1e-12) << r << " " << i;
      ASSERT_NEAR(P[i], Pe, 6e-8 * Pe + 1e-15) << r << " " << i;
    }
  }
  // The rows cover all three pieces of the window rule.
  EXPECT_GT(pieces[0], 0);
  EXPECT_GT(pieces[1], 0);
  EXPECT_GT(pieces[2], 0);
}

}  // namespace
