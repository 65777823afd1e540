#include "core/azimuth_centre_estimate.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <numbers>
#include <vector>

namespace {

constexpr double kPi = std::numbers::pi;

// Block of `lines` rows of `samples` complex samples whose row energy follows
// energyOf(line), spread evenly over the row.
template <class F>
std::vector<float> patternBlock(int lines, int samples, F energyOf) {
  std::vector<float> v(2 * static_cast<std::size_t>(lines) * samples);
  for (int l = 0; l < lines; ++l) {
    const double amp = std::sqrt(energyOf(l) / samples);
    for (int i = 0; i < samples; ++i) {
      // Phase of the samples varies: only the energy may matter.
      const double ph = 0.37 * i + 1.1 * l;
      v[2 * (static_cast<std::size_t>(l) * samples + i)] = static_cast<float>(amp * std::cos(ph));
      v[2 * (static_cast<std::size_t>(l) * samples + i) + 1] =
          static_cast<float>(amp * std::sin(ph));
    }
  }
  return v;
}


TEST(AzimuthCentreEstimate, RecoversPhaseOfPeriodicEnergyPattern) {
  // One cycle of energy across the block; with L = 2 pi step / scale the
  // value moves to -phase L / (2 pi), modulo L, by at most L / 2.
  const int lines = 600, samples = 16;  // g = 1
  const double step = 3.0, scale = 2.0;
  const double L = 2 * kPi * step / scale;
  for (double phi : {-2.5, -0.4, 0.0, 0.9, 2.2}) {
    const auto block = patternBlock(lines, samples, [&](int l) {
      return 10.0 + 4.0 * std::cos(2 * kPi * l / lines + phi);
    });
    for (double start : {0.0, 1.0, -2.0, 7.5}) {
      double value = start;
      ASSERT_EQ(EnPhaseAzCntrlWNestimate(value, lines, lines, samples, block.data(), step, scale),
                0);
      const double target = -phi * L / (2 * kPi);
      // Same position modulo L, reached by the shortest move.
      const double moved = value - start;
      EXPECT_LE(std::abs(moved), L / 2 + 1e-12) << phi << " " << start;
      const double cycles = (value - target) / L;
      EXPECT_NEAR(cycles, std::round(cycles), 0.01 / (2 * kPi)) << phi << " " << start;
    }
  }
}

TEST(AzimuthCentreEstimate, WrapKeepsHalfPeriodAndFoldsBeyond) {
  // A block without energy has no harmonic: phase 0, the target position is
  // 0 modulo L and only the wrap of d decides the move. L = 2 pi here.
  const std::vector<float> zeros(2 * 700 * 3, 0.0f);
  const double L = 2 * kPi;
  struct Case {
    double start, end;
  };
  for (const Case c : {Case{-L / 2, 0.0},      // d = L / 2 exactly: kept
                       Case{L / 2, 0.0},       // d = -L / 2 exactly: kept
                       Case{0.75 * L, L},      // d = -0.75 L: folded to +0.25 L
                       Case{-0.75 * L, -L},    // d = 0.75 L: folded to -0.25 L
                       Case{0.3, 0.0}, Case{2.5 * L + 0.1, 3 * L}}) {
    double value = c.start;
    ASSERT_EQ(EnPhaseAzCntrlWNestimate(value, 700, 700, 3, zeros.data(), 1.0, 1.0), 0);
    EXPECT_DOUBLE_EQ(value, c.end) << c.start;
  }
}

TEST(AzimuthCentreEstimate, RefusesBlocksWithoutAFirstHarmonic) {
  const std::vector<float> data(2 * 64 * 2, 1.0f);
  double value = 5.0;
  // One line: a single energy sample.
  EXPECT_EQ(EnPhaseAzCntrlWNestimate(value, 64, 1, 2, data.data(), 1.0, 1.0), 1);
  // More lines than rows.
  EXPECT_EQ(EnPhaseAzCntrlWNestimate(value, 64, 65, 2, data.data(), 1.0, 1.0), 1);
  EXPECT_EQ(EnPhaseAzCntrlWNestimate(value, 64, 64, 2, nullptr, 1.0, 1.0), 1);
  EXPECT_EQ(EnPhaseAzCntrlWNestimate(value, 64, 64, 2, data.data(), 1.0, 0.0), 1);
  EXPECT_EQ(value, 5.0);
  // Two lines are the shortest usable block.
  EXPECT_EQ(EnPhaseAzCntrlWNestimate(value, 64, 2, 2, data.data(), 1.0, 1.0), 0);
}

}  // namespace
