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

TEST(PhaseRotation, RotateTurnsTheSampleByThePhase) {
  const fcomplex x(3.0f, -4.0f);
  const double phase = 123456.789;
  const fcomplex y = wk_rotate(x, phase);
  const std::complex<double> e = std::complex<double>(3.0, -4.0) * std::polar(1.0, phase);
  EXPECT_NEAR(y.real(), e.real(), 2e-6);
  EXPECT_NEAR(y.imag(), e.imag(), 2e-6);
  EXPECT_NEAR(std::abs(y), 5.0f, 2e-6);
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
