#include "doppler/dc_polynomial.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <random>

#include "doppler/dc_driver.h"
#include "doppler/dc_estimators.h"
#include "doppler/geometric_rate.h"
#include "support/files.h"
#include "support/scenes.h"
#include "product/byte_order.h"

namespace {

using namespace support::clutter;

constexpr double kPrf = 1680.0;
constexpr double kFs = 18.96e6;

double wrap(double v) {
  double w = v - std::floor(v);
  if (w > 0.5) w -= 1.0;
  return w;
}

// Physical polynomial (Hz; range and azimuth times in s) at time (tr, ta).
double physValue(const double p[7], double tr, double ta) {
  return p[0] + p[1] * tr + p[2] * ta + p[3] * tr * ta + p[4] * tr * tr + p[5] * tr * tr * tr +
         p[6] * tr * tr * tr * tr;
}

// 16 x 8 bins of 256 x 2048 samples over a 4096 x 16384 raster, with the
// wrapped phases of `truth` (PRF units, samples and lines).
struct BinScene {
  DcEstInput input;
  DcEstState st;
  explicit BinScene(const double truth[7]) {
    input.samples = 4096;
    input.lines = 16384;
    input.prf = kPrf;
    input.velocity = 7100.0;
    input.rasterFile = "/nonexistent/raster";
    st.blocks = 256;
    st.blockl = 2048;
    st.fs = kFs;
    st.fc = 5.3e9;
    st.anLen = 10.0;
    st.ambFlag = 0;
    st.nBinsX = 16;
    st.nBinsY = 8;
    st.nBins = 128;
    for (int iy = 0; iy < 8; ++iy)
      for (int ix = 0; ix < 16; ++ix) {
        DcBin b;
        b.range = ix * 256 + 128;
        b.line = iy * 2048 + 1024;
        b.valid = 1;
        b.dcWrapped = wrap(dcPolyValue(truth, b.range, b.line));
        b.contrast = 2.0;
        b.power = 2.0;
        b.noise = 1.0;
        st.bins.push_back(b);
      }
  }
};

TEST(DcPolynomial, RecoversKnownPolynomialAndMask) {
  const double truth[7] = {0.3, 2e-5, -1e-5, 1e-9, 1e-8, -2e-12, 1e-16};
  {
    BinScene s(truth);
    double poly[7];
    ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
    // The fit holds the centroid up to a whole number of PRFs.
    const double k = std::round(physValue(poly, 0.0, 0.0) / kPrf - truth[0]);
    for (int r = 0; r <= 4096; r += 512)
      for (int l = 0; l <= 16384; l += 2048) {
        const double hz = physValue(poly, r / kFs, l / kPrf);
        EXPECT_NEAR(hz, kPrf * (dcPolyValue(truth, r, l) + k), 1e-3 * kPrf) << r << " " << l;
      }
    EXPECT_NEAR(poly[1], truth[1] * kPrf * kFs, 1e-3 * std::fabs(truth[1] * kPrf * kFs));
    EXPECT_NEAR(poly[2], truth[2] * kPrf * kPrf, 1e-3 * std::fabs(truth[2] * kPrf * kPrf));
    EXPECT_NEAR(poly[4], truth[4] * kPrf * kFs * kFs, 0.02 * std::fabs(truth[4] * kPrf * kFs * kFs));
    for (const DcBin& b : s.st.bins) {
      EXPECT_GT(b.krStd, 0.0);
      EXPECT_LT(b.krStd, 1e-3);
    }
  }
  {
    // Cubic and quartic range terms left out of the fit.
    const double t5[7] = {-0.45, -3e-5, 2e-5, -2e-9, 1.5e-8, 0.0, 0.0};
    BinScene s(t5);
    s.st.polMask = {1, 1, 1, 1, 1, 0, 0};
    double poly[7];
    ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
    EXPECT_EQ(poly[5], 0.0);
    EXPECT_EQ(poly[6], 0.0);
    const double k = std::round(physValue(poly, 0.0, 0.0) / kPrf - t5[0]);
    for (int r = 0; r <= 4096; r += 1024)
      for (int l = 0; l <= 16384; l += 4096)
        EXPECT_NEAR(physValue(poly, r / kFs, l / kPrf), kPrf * (dcPolyValue(t5, r, l) + k), 1e-4 * kPrf);
  }
  {
    // Azimuth slope masked: the linear model's slope is dropped with it.
    const double t2[7] = {0.1, 1e-5, 0.0, 0.0, 0.0, 0.0, 0.0};
    BinScene s(t2);
    s.st.polMask = {1, 1, 0, 0, 0, 0, 0};
    double poly[7];
    ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
    EXPECT_EQ(poly[2], 0.0);
    EXPECT_NEAR(poly[1], 1e-5 * kPrf * kFs, 1e-3 * 1e-5 * kPrf * kFs);
  }
}

TEST(DcPolynomial, TermsTheBinsCannotDetermineAreLeftOut) {
  // Four bin columns cannot fix a quartic in range: without care the fit
  // passes through the bins and swings between them.
  const double truth[7] = {0.2, 3e-5, -1e-5, 0.0, 1e-8, -1e-12, 0.0};
  BinScene s(truth);
  for (DcBin& b : s.st.bins) {
    const int ix = (b.range - 128) / 256;
    b.valid = (ix % 5 == 0) ? 1 : 0;
  }
  double poly[7];
  ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
  EXPECT_EQ(poly[6], 0.0);
  const double k = std::round(physValue(poly, 0.0, 0.0) / kPrf - truth[0]);
  for (int r = 128; r <= 3968; r += 160)
    EXPECT_NEAR(physValue(poly, r / kFs, 5000 / kPrf), kPrf * (dcPolyValue(truth, r, 5000) + k),
                1e-4 * kPrf)
        << r;

  // A single bin row: no azimuth terms.
  const double flat[7] = {0.1, 2e-5, 0, 0, 0, 0, 0};
  BinScene row(flat);
  for (DcBin& b : row.st.bins) b.valid = b.line == 1024 ? 1 : 0;
  ASSERT_EQ(dcnapoly(row.input, row.st, poly), 0);
  EXPECT_EQ(poly[3], 0.0);
  EXPECT_NEAR(physValue(poly, 1000 / kFs, 0.0), kPrf * (dcPolyValue(flat, 1000, 0) +
                                                        std::round(poly[0] / kPrf - 0.1)),
              1e-4 * kPrf);
}

TEST(DcPolynomial, GeometricAmbiguityIsAddedToTheConstant) {
  const double truth[7] = {0.3, 2e-5, -1e-5, 0, 0, 0, 0};
  BinScene s(truth);
  s.st.ambFlag = 2;
  // Orbit Doppler two PRFs above the centroid at the image centre.
  s.st.geomDoppler = kPrf * (dcPolyValue(truth, 2048, 8192) + 2.0);
  double poly[7];
  ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
  EXPECT_NEAR(physValue(poly, 2048 / kFs, 8192 / kPrf), s.st.geomDoppler, 1e-3 * kPrf);
  EXPECT_NEAR(physValue(poly, 0.0, 0.0), kPrf * (truth[0] + 2.0), 1e-3 * kPrf);
}

TEST(DcPolynomial, TooFewValidBinsStopTheFit) {
  const double truth[7] = {0.2, 1e-5, 0, 0, 0, 0, 0};
  BinScene s(truth);
  for (std::size_t i = 7; i < s.st.bins.size(); ++i) s.st.bins[i].valid = 0;
  double poly[7] = {1, 1, 1, 1, 1, 1, 1};
  EXPECT_EQ(dcnapoly(s.input, s.st, poly), 1);
  for (double c : poly) EXPECT_EQ(c, 0.0);

  // Eight are enough.
  // Eight are enough when they span the terms: six along the first bin row,
  // two on the last.
  BinScene s8(truth);
  for (std::size_t i = 0; i < s8.st.bins.size(); ++i) s8.st.bins[i].valid = 0;
  for (int i : {0, 3, 6, 9, 12, 15, 7 * 16 + 2, 7 * 16 + 13}) s8.st.bins[i].valid = 1;
  EXPECT_EQ(dcnapoly(s8.input, s8.st, poly), 0);

  // No bin at all (raster narrower than a block).
  BinScene none(truth);
  none.st.bins.clear();
  none.st.nBinsX = none.st.nBinsY = none.st.nBins = 0;
  EXPECT_EQ(dcnapoly(none.input, none.st, poly), 1);
}

TEST(DcRobustMean, PercentilesAndTrimming) {
  std::vector<double> v(101);
  for (int i = 0; i <= 100; ++i) v[i] = i;
  double lo = 0, hi = 0;
  ASSERT_EQ(getpercentile(v.data(), 101, 0.1, &lo, &hi), 0);
  EXPECT_NEAR(lo, 10.0, 0.15);
  EXPECT_NEAR(hi, 90.0, 0.15);

  double mean = -1, sd = -1;
  int count = -1;
  const std::vector<double> same(12, 1.75);
  ASSERT_EQ(dcnastd(same.data(), 12, 0.5, &mean, &sd, &count), 0);
  EXPECT_EQ(sd, 0.0);
  EXPECT_EQ(mean, 1.75);
  EXPECT_EQ(count, 12);

  // Estimates around 1 with a few wild ones: trimming brings the standard
  // deviation under the limit and the mean back to 1.
  std::mt19937 rng(9);
  std::normal_distribution<double> g(1.0, 0.15);
  std::vector<double> est;
  for (int i = 0; i < 60; ++i) est.push_back(g(rng));
  for (double w : {9.0, -7.0, 12.0, 6.5}) est.push_back(w);
  ASSERT_EQ(dcnastd(est.data(), static_cast<int>(est.size()), 0.5, &mean, &sd, &count), 0);
  EXPECT_LE(sd, 0.5);
  EXPECT_NEAR(mean, 1.0, 0.1);
  EXPECT_LT(count, 64);
  EXPECT_GT(count, 30);

  ASSERT_EQ(dcnastd(est.data(), 0, 0.5, &mean, &sd, &count), 0);
  EXPECT_EQ(count, 0);
  EXPECT_GT(sd, 0.5);
}

class DcBlockFile : public testing::Test {
 protected:
  support::TempFolder dir_{"dc_block"};
};

// Contrast map of the raster: cell mean of |x|^4 over the squared cell mean
// of |x|^2.
void contrastMap(const std::vector<fcomplex>& r, int ns, int nl, DcEstState& st) {
  st.cmWidth = ns / st.patchs;
  st.cmHeight = nl / st.patchl;
  st.contrastMap.assign(st.cmWidth * st.cmHeight, 0.0f);
  for (int cy = 0; cy < st.cmHeight; ++cy)
    for (int cx = 0; cx < st.cmWidth; ++cx) {
      double p2 = 0.0, p4 = 0.0;
      for (int l = 0; l < st.patchl; ++l)
        for (int s = 0; s < st.patchs; ++s) {
          const double a = std::norm(r[(cy * st.patchl + l) * ns + cx * st.patchs + s]);
          p2 += a;
          p4 += a * a;
        }
      const double n = st.patchs * st.patchl;
      st.contrastMap[cy * st.cmWidth + cx] = static_cast<float>((p4 / n) / ((p2 / n) * (p2 / n)));
    }
}

TEST(DcAmbiguityEstimate, DecisionBetweenMlbfAndWdar) {
  // A raster of exactly one block: the only admissible block is the whole.
  ClutterScene sc;
  sc.points = 20;
  sc.pointAmp = 300.0;
  const int ns = 256, nl = 2048;
  const std::vector<fcomplex> raster = makeClutter(sc, ns, nl);
  DcEstInput in;
  in.samples = ns;
  in.lines = nl;
  in.prf = sc.prf;
  in.velocity = sc.velocity;
  const double poly[7] = {0.3, 0, 0, 0, 0, 0, 0};
  auto run = [&](double varTh, int nWdar, std::string& out) {
    DcEstState st = ersState(sc, 256, 2048);
    st.ambFlag = 1;
    st.nBest = 2;
    st.nWdar = nWdar;
    st.varTh = varTh;
    st.inMemory = 1;
    st.data = raster.data();
    contrastMap(raster, ns, nl, st);
    testing::internal::CaptureStdout();
    const int status = estambiguity(st, in, poly);
    out = testing::internal::GetCapturedStdout();
    st.blockBuf.clear();
    EXPECT_EQ(st.nBest, 1);
    EXPECT_EQ(st.mlbfBlocks.at(0).range, 128);
    EXPECT_EQ(st.mlbfBlocks.at(0).line, 1024);
    return std::make_pair(status, st);
  };
  std::string out;
  // MLBF spread above the limit and a single WDAR block: neither estimator
  // is conclusive, the geometric ambiguity stands and the status says so.
  auto [s1, st1] = run(1e-9, 1, out);
  EXPECT_EQ(s1, 1);
  EXPECT_EQ(st1.ambiguity, st1.geomAmbiguity);
  EXPECT_EQ(st1.ambiguitySource, "GEOMETRY (data estimates not conclusive)");
  EXPECT_NE(out.find("\nWDAR results: mean "), std::string::npos) << out;
  EXPECT_NE(out.find("Doppler ambiguity 0 from GEOMETRY"), std::string::npos) << out;
  EXPECT_EQ(st1.wdarOffsetAvailable, 0);
  // ... and without WDAR blocks.
  auto [s2, st2] = run(1e-9, 0, out);
  EXPECT_EQ(s2, 1);
  EXPECT_NE(out.find("No WDAR blocks available. \n"), std::string::npos) << out;
  // MLBF good, no WDAR block: resolved, no offset.
  auto [s3, st3] = run(0.5, 0, out);
  EXPECT_EQ(s3, 0);
  EXPECT_EQ(st3.ambiguity, 1);
  EXPECT_EQ(st3.ambiguitySource, "MLBF");
  EXPECT_EQ(st3.wdarOffsetAvailable, 0);
  EXPECT_NE(out.find("\nNo WDAR blocks available. Offset frequency estimation unavailable. \n"),
            std::string::npos);
  EXPECT_NE(out.find("\nMLBF results: mean "), std::string::npos);
  // MLBF good with one WDAR block (too few to decide): MLBF decides and the
  // WDAR offset against its ambiguity is recorded.
  auto [s4, st4] = run(0.5, 1, out);
  EXPECT_EQ(s4, 0);
  EXPECT_EQ(st4.ambiguity, 1);
  EXPECT_EQ(st4.ambiguitySource, "MLBF");
  EXPECT_EQ(st4.wdarOffsetAvailable, 1);
  EXPECT_NEAR(st4.wdarOffset, st4.wdarMean - 1.0, 1e-12);
}

}  // namespace

// The geometric rate is taken at the delay of each range-focused sample's
// compressed peak: an ERS echo (a 704-sample replica of a 37.12 us pulse at
// 18.96 MHz, centred on the pulse) peaks 0.3976 of a sample after its
// two-way delay. A replica that does not span the pulse gives no delay.
TEST(GeometricRate, CompressedPeakTrailsTheEchoDelay) {
  EXPECT_NEAR(compressedPeakDelay(37.12e-6, 704, 18.96e6) * 18.96e6, 0.3976, 1e-9);
  EXPECT_EQ(compressedPeakDelay(37.12e-6, 1024, 18.96e6), 0.0);
  EXPECT_EQ(compressedPeakDelay(-999.0, 704, 18.96e6), 0.0);
}
