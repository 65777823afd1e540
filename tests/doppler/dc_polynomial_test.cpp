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
#include "doppler/dc_estimators_synthetic.h"
#include "product/byte_order.h"

namespace {

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

TEST(DcPolynomial, SnrMaskAndFilling) {
  const double truth[7] = {0.25, 0, 0, 0, 0, 0, 0};
  {
    // Mean noise not positive: every bin is kept with the fixed ratios.
    BinScene s(truth);
    for (DcBin& b : s.st.bins) b.noise = -0.5;
    s.st.bins[20].power = 0.1;  // would be masked with a positive noise
    s.st.bins[20].dcWrapped = 0.4;
    s.st.bins[21].valid = 0;
    s.st.bins[21].dcWrapped = -0.3;
    s.st.bins[21].contrast = 0.0;
    double poly[7];
    ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
    EXPECT_EQ(s.st.bins[0].snr, 1e10);
    EXPECT_EQ(s.st.bins[20].snr, 1e10);
    EXPECT_EQ(s.st.bins[20].dcWrapped, 0.4);
    EXPECT_EQ(s.st.bins[21].snr, 0.001);
    // The invalid bin takes phase and contrast of its nearest valid bin (the
    // left neighbour, first of the two at equal distance).
    EXPECT_EQ(s.st.bins[21].dcWrapped, 0.4);
    EXPECT_EQ(s.st.bins[21].contrast, 2.0);
  }
  {
    // Positive noise: a bin below the mean noise takes the means of its
    // neighbours within two bins (the window grows past the adjacent ones).
    BinScene s(truth);
    std::mt19937 rng(5);
    std::uniform_real_distribution<double> u(-0.1, 0.1);
    for (DcBin& b : s.st.bins) {
      b.dcWrapped = 0.25 + u(rng);
      b.power = 2.0 + 10 * u(rng);
    }
    const int i = 3 * 16 + 5;  // interior bin
    s.st.bins[i].power = 0.5;
    // Expected means over the 8 neighbours, before the fit touches anything.
    double mdc = 0.0, msnr = 0.0;
    for (int dy = -1; dy <= 1; ++dy)
      for (int dx = -1; dx <= 1; ++dx) {
        if (!dx && !dy) continue;
        const DcBin& o = s.st.bins[i + dy * 16 + dx];
        mdc += o.dcWrapped;
        msnr += (o.power - 1.0) / 1.0;
      }
    double poly[7];
    ASSERT_EQ(dcnapoly(s.input, s.st, poly), 0);
    EXPECT_NEAR(s.st.bins[i].dcWrapped, mdc / 8, 1e-12);
    EXPECT_NEAR(s.st.bins[i].snr, msnr / 8, 1e-12);
    EXPECT_NEAR(s.st.bins[0].snr, s.st.bins[0].power - 1.0, 1e-12);
  }
}

TEST(DcPolynomial, PhaseVarianceOfTheBins) {
  const double alpha = 2.0 * 7100.0 / (10.0 * kPrf);
  const double v1 = dcPhaseVariance(10.0, 1000.0, alpha);
  // Inverse of the number of looks.
  EXPECT_NEAR(dcPhaseVariance(10.0, 4000.0, alpha), v1 / 4.0, 1e-12 * v1);
  // Decreasing with SNR, towards a finite floor.
  const double v01 = dcPhaseVariance(0.1, 1000.0, alpha);
  const double v1e3 = dcPhaseVariance(1e3, 1000.0, alpha);
  const double v1e10 = dcPhaseVariance(1e10, 1000.0, alpha);
  EXPECT_GT(v01, v1);
  EXPECT_GT(v1, v1e3);
  EXPECT_GT(v1e3, v1e10);
  EXPECT_GT(v1e10, 0.0);
  EXPECT_NEAR(v1e3, v1e10, 0.01 * v1e10);
  // Against a fine midpoint sum of 1 / (n 16 pi^2 integral((S'/S)^2 / 16 pi^2)).
  const double r0 = dcBspline3(0.0), r1 = dcBspline3(alpha), r2 = dcBspline3(2 * alpha);
  const int m = 200000;
  double sum = 0.0;
  for (int i = 0; i < m; ++i) {
    const double v = (i + 0.5) / m, a = 2 * M_PI * v;
    const double s = r0 * 1.1 + 2 * r1 * std::cos(a) + 2 * r2 * std::cos(2 * a);
    const double d = 4 * M_PI * (r1 * std::sin(a) + 2 * r2 * std::sin(2 * a));
    sum += (d / s) * (d / s) / m;
  }
  EXPECT_NEAR(v1, 1.0 / (1000.0 * sum), 1e-5 * v1);
  // Low SNR, high SNR: the standard deviation of a 2048 x 256 bin at 10 dB
  // is a small fraction of the PRF.
  EXPECT_LT(std::sqrt(dcPhaseVariance(10.0, 2048.0 * 256 / 2, alpha)), 0.01);

  testing::internal::CaptureStdout();
  EXPECT_EQ(dcPhaseVariance(-1.0, 1000.0, alpha), 1e6);
  EXPECT_NE(testing::internal::GetCapturedStdout().find("function getkrstd(): anomalous FAILURE (snr=-1.000000) <=="),
            std::string::npos);
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
  void SetUp() override {
    dir_ = std::filesystem::path(testing::TempDir()) /
           ("dc_block_" + std::to_string(::getpid()) + "_" +
            testing::UnitTest::GetInstance()->current_test_info()->name());
    std::filesystem::create_directories(dir_);
  }
  void TearDown() override { std::filesystem::remove_all(dir_); }
  std::filesystem::path dir_;
};

TEST_F(DcBlockFile, ReadsBlocksFromFileAndMemory) {
  const int ns = 40, nl = 30;
  std::vector<fcomplex> raster(ns * nl);
  for (int l = 0; l < nl; ++l)
    for (int s = 0; s < ns; ++s) raster[l * ns + s] = fcomplex(s + 0.25f, -l - 0.5f);
  // Big-endian file with a 16-byte header.
  const std::string path = (dir_ / "raster.bin").string();
  {
    std::ofstream f(path, std::ios::binary);
    const char header[16] = {};
    f.write(header, 16);
    for (const fcomplex& v : raster) {
      float p[2] = {v.real(), v.imag()};
      for (float x : p) {
        unsigned char b[4];
        std::memcpy(b, &x, 4);
        if (get_endian() != kMsbFirst) std::swap(b[0], b[3]), std::swap(b[1], b[2]);
        f.write(reinterpret_cast<char*>(b), 4);
      }
    }
  }
  DcEstInput in;
  in.rasterFile = path;
  in.samples = ns;
  in.lines = nl;
  in.byteOrder = 1;
  in.headerOffset = 16;
  DcEstState st;
  st.blocks = 8;
  st.blockl = 6;
  ASSERT_EQ(read_block(st, in, 20, 30), 0);
  for (int l = 0; l < 6; ++l)
    for (int s = 0; s < 8; ++s) EXPECT_EQ(st.blockBuf[l * 8 + s], raster[(20 + l) * ns + 30 + s]);

  DcEstState mem = st;
  mem.inMemory = 1;
  mem.data = raster.data();
  mem.blockBuf.clear();
  DcEstInput nofile = in;
  nofile.rasterFile = "/nonexistent/raster.bin";
  ASSERT_EQ(read_block(mem, nofile, 24, 32), 0);
  EXPECT_EQ(mem.blockBuf[0], raster[24 * ns + 32]);
  EXPECT_EQ(mem.blockBuf[47], raster[29 * ns + 39]);

  // Outside the raster, missing file, truncated file.
  EXPECT_EQ(read_block(st, in, 25, 0), 1);
  EXPECT_EQ(read_block(st, in, 0, 33), 1);
  EXPECT_EQ(read_block(st, in, -1, 0), 1);
  EXPECT_EQ(read_block(st, nofile, 0, 0), 9);
  std::filesystem::resize_file(path, 16 + 8 * ns * 10);
  EXPECT_EQ(read_block(st, in, 8, 0), 4);
  EXPECT_EQ(read_block(st, in, 0, 0), 0);
}

TEST(DcAmbiguityEstimate, FlagsWithoutBlockProcessing) {
  DcEstInput in;
  in.samples = 1024;
  in.lines = 8192;
  in.prf = kPrf;
  in.rasterFile = "/nonexistent/raster";
  DcEstState st;
  st.nBest = 0;  // would stop mode 1; modes 0 and 2 never look at blocks
  const double poly[7] = {0.3, 0, 0, 0, 0, 0, 0};

  st.ambFlag = 0;
  st.ambiguity = 5;
  st.geomDoppler = 1.3 * kPrf;
  EXPECT_EQ(estambiguity(st, in, poly), 0);
  EXPECT_EQ(st.ambiguity, 0);
  EXPECT_EQ(st.geomAmbiguity, 1);

  st.ambFlag = 2;
  EXPECT_EQ(estambiguity(st, in, poly), 0);
  EXPECT_EQ(st.ambiguity, 1);
  st.geomDoppler = -0.7 * kPrf;
  EXPECT_EQ(estambiguity(st, in, poly), 0);
  EXPECT_EQ(st.ambiguity, -1);
  // Half away from zero.
  st.geomDoppler = 1.8 * kPrf;
  EXPECT_EQ(estambiguity(st, in, poly), 0);
  EXPECT_EQ(st.ambiguity, 2);
  st.geomDoppler = -1.2 * kPrf;
  EXPECT_EQ(estambiguity(st, in, poly), 0);
  EXPECT_EQ(st.ambiguity, -2);

  st.ambFlag = 1;
  EXPECT_EQ(estambiguity(st, in, poly), 10);
  st.ambFlag = 3;
  st.nBest = 4;
  EXPECT_EQ(estambiguity(st, in, poly), 10);
  st.ambFlag = -1;
  EXPECT_EQ(estambiguity(st, in, poly), 10);
}

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

// MLBF (with WDAR for the offset) on a raster of clutter with bright
// scatterers whose absolute centroid is dc PRF.
void resolveFromData(double dc) {
  {
    ClutterScene sc;
    sc.dcPrf = dc;
    sc.points = 60;
    sc.pointAmp = 300.0;
    const int ns = 512, nl = 4096;
    std::vector<fcomplex> raster = makeClutter(sc, ns, nl);
    DcEstState st = ersLikeState(sc);
    st.ambFlag = 1;
    st.nBest = 3;
    st.nWdar = 2;
    st.inMemory = 1;
    st.data = raster.data();
    contrastMap(raster, ns, nl, st);
    DcEstInput in;
    in.samples = ns;
    in.lines = nl;
    in.prf = sc.prf;
    in.velocity = sc.velocity;
    // Geometry deliberately wrong by two PRFs: the data decide.
    st.geomDoppler = (dc + 2.0) * sc.prf;
    const double wrapped = dc - std::round(dc);
    const double poly[7] = {wrapped, 0, 0, 0, 0, 0, 0};
    ASSERT_EQ(estambiguity(st, in, poly), 0) << dc;
    EXPECT_EQ(st.ambiguity, std::lround(dc - wrapped)) << dc;
    EXPECT_EQ(st.geomAmbiguity, std::lround(dc - wrapped) + 2);
    // Blocks of 256 x 2048 in a 512 x 4096 raster: the best one takes most
    // of the room.
    EXPECT_GE(st.nBest, 1);
    EXPECT_LE(st.nBest, 3);
    EXPECT_EQ(st.mlbfBlocks.size(), static_cast<std::size_t>(st.nBest));
    EXPECT_GE(st.nWdar, 1);
    EXPECT_LE(st.nWdar, 2);
    EXPECT_GT(st.mlbfGood, 0);
    EXPECT_LT(st.mlbfStd, st.varTh);
    EXPECT_EQ(st.wdarOffsetAvailable, 1);
    EXPECT_NEAR(st.wdarMean, st.ambiguity, 0.5);
    for (const MlbfBlock& b : st.mlbfBlocks) {
      EXPECT_GE(b.range - st.blocks / 2, 0);
      EXPECT_LE(b.range + st.blocks / 2, ns);
      EXPECT_GE(b.line - st.blockl / 2, 0);
      EXPECT_LE(b.line + st.blockl / 2, nl);
    }
  }
  EXPECT_FALSE(multimlbf_ready());
  EXPECT_FALSE(wdar_ready());
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
    DcEstState st = ersLikeState(sc);
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

TEST(DcAmbiguityEstimate, MlbfResolvesTheAmbiguityOfASquintedScene) { resolveFromData(1.3); }

TEST(HeavyDcAmbiguityEstimate, MlbfResolvesANegativeAmbiguity) { resolveFromData(-0.7); }

}  // namespace
