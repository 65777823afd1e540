#include "core/im_cutter.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numbers>

namespace {

ImCutGeometry ersGeometry() {
  ImCutGeometry g;
  g.slowStart = 6.0e8;
  g.slowDelta = 1.0 / 1679.9;
  g.lines = 10000;
  g.fastStart = 5.5e-3;
  g.fastDelta = 1.0 / 18.96e6;
  g.samples = 5616;
  g.replicaLen = 704;
  g.apertureLines = 1200;
  g.azShift = 0.1;
  g.rgShift = 1.0e-7;  // 1.896 samples: two more raw samples
  return g;
}

TEST(ImCutter, DopplerShifts) {
  double az = -1, rg = -1;
  const double sq = 2.0 * std::numbers::pi / 180.0, R = 850e3, v = 7100.0;
  ASSERT_EQ(getDCshift(sq, R, v, 0, 1, az, rg), 0);
  EXPECT_DOUBLE_EQ(az, std::tan(sq) * R / v);
  EXPECT_DOUBLE_EQ(rg, 2.0 * (1.0 / std::cos(sq) - 1.0) * R / 299792458.0);
  getDCshift(sq, R, v, 1, 1, az, rg);
  EXPECT_DOUBLE_EQ(az, std::tan(sq) * R / v);
  EXPECT_EQ(rg, 0.0);
  getDCshift(sq, R, v, 0, 0, az, rg);
  EXPECT_EQ(az, 0.0);
  EXPECT_EQ(rg, 0.0);
}

TEST(ImCutter, FocusedBlockToRawBlockAndBack) {
  const ImCutGeometry g = ersGeometry();
  ImBlock want;
  want.slowStart = g.slowStart + 2000 * g.slowDelta;
  want.fastStart = g.fastStart + 100 * g.fastDelta;
  want.lines = 1024;
  want.samples = 2000;
  ImBlock raw;
  ASSERT_EQ(imcutter(g, want, raw), 0);
  EXPECT_EQ(raw.firstLine, 2000 + static_cast<int>(std::lround(0.1 / g.slowDelta)) - 600);
  EXPECT_EQ(raw.lines, 1024 + 1200);
  EXPECT_EQ(raw.firstSample, 100);
  EXPECT_EQ(raw.samples, 2000 + 703 + 2);
  EXPECT_NEAR(raw.slowStart, g.slowStart + raw.firstLine * g.slowDelta, 1e-9);

  ImBlock back;
  ASSERT_EQ(imcutter_inv(g, raw, back), 0);
  EXPECT_EQ(back.lines, want.lines);
  EXPECT_EQ(back.samples, want.samples);
  EXPECT_NEAR(back.fastStart, want.fastStart, 1e-15);
  EXPECT_NEAR(back.slowStart, want.slowStart, 0.5 * g.slowDelta);

  // Blocks that would leave the extracted matrix.
  ImBlock early = want;
  early.slowStart = g.slowStart;
  EXPECT_EQ(imcutter(g, early, raw), 10);
  ImBlock wide = want;
  wide.samples = 5616 - 100 - 703 - 2 + 1;
  EXPECT_EQ(imcutter(g, wide, raw), 10);
  wide.samples -= 1;
  EXPECT_EQ(imcutter(g, wide, raw), 0);
  EXPECT_EQ(raw.firstSample + raw.samples, 5616);

  // A raw block too small for the aperture feeds nothing.
  ImBlock tiny = raw;
  tiny.lines = 1200;
  EXPECT_EQ(imcutter_inv(g, tiny, back), 1);
}

}  // namespace
