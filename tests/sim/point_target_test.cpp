// Point-target analysis on synthetic ideal impulse responses with known
// windows, against closed-form values.
#include <gtest/gtest.h>

#include "support/files.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <vector>

#include <unistd.h>

#include "sim/point_target.h"

namespace {

double sinc(double x) { return x == 0.0 ? 1.0 : std::sin(M_PI * x) / (M_PI * x); }

// Closed-form response of the generalised Hamming window, x in resolution cells.
double response(double alpha, double x) {
  return alpha * sinc(x) + 0.5 * (1.0 - alpha) * (sinc(x - 1.0) + sinc(x + 1.0));
}

struct Analytic {
  double irwCells, pslrDb, islrDb;
};

// Half-power width by bisection, first null and highest sidelobe by a fine
// scan, and the integrated ratio over +-extentCells, all from the closed form.
Analytic analytic(double alpha, double extentCells) {
  const double r0 = response(alpha, 0.0);
  auto p = [alpha, r0](double x) { return response(alpha, x) * response(alpha, x) / (r0 * r0); };
  double lo = 0.0, hi = 1.5;
  for (int i = 0; i < 100; ++i) {
    const double m = 0.5 * (lo + hi);
    (p(m) > 0.5 ? lo : hi) = m;
  }
  const double dx = 1e-5;
  double x = dx;
  while (p(x + dx) < p(x)) x += dx;
  const double null = x;
  double side = 0.0;
  for (double y = null; y < extentCells; y += dx) side = std::max(side, p(y));
  double inside = 0.0, outside = 0.0;
  for (double y = dx / 2; y < extentCells; y += dx) (y < null ? inside : outside) += p(y);
  return {2.0 * lo, 10.0 * std::log10(side), 10.0 * std::log10(outside / inside)};
}

// A separable 2-D response: azimuth down the rows, range along them.
std::vector<cdouble> syntheticImage(int rows, int cols, double line, double sample, double phase, const WindowSpec& az,
                                    const WindowSpec& rg) {
  std::vector<cdouble> img(static_cast<std::size_t>(rows) * cols);
  for (int i = 0; i < rows; ++i)
    for (int j = 0; j < cols; ++j)
      img[static_cast<std::size_t>(i) * cols + j] =
          std::polar(3.0 / (response(az.alpha, 0.0) * response(rg.alpha, 0.0)) * response(az.alpha, (i - line) * az.bandFraction) *
                         response(rg.alpha, (j - sample) * rg.bandFraction),
                     phase);
  return img;
}

}  // namespace

TEST(PointTargetAnalysis, IdealResponsesGiveTheAnalyticWidthsAndSidelobes) {
  PtaOptions opt;
  opt.window = 64;
  opt.azimuth = {1.0, 0.8};    // no window, 80 % of the PRF processed
  opt.range = {0.54, 0.82};    // Hamming over 82 % of the sampling rate
  opt.azimuthSpacing = 4.0;
  opt.rangeSpacing = 7.9;
  const double line = 64.3, sample = 63.72, phase = 0.7;
  const std::vector<cdouble> img = syntheticImage(128, 128, line, sample, phase, opt.azimuth, opt.range);
  const PtaResult r = analyseWindow(img, 128, 128, 0.65, opt);
  ASSERT_TRUE(r.found);
  EXPECT_NEAR(r.peakLine, line, 0.01);
  EXPECT_NEAR(r.peakSample, sample, 0.01);
  EXPECT_NEAR(r.phase, phase, 0.01);
  EXPECT_NEAR(r.phaseError, 0.05, 0.01);
  EXPECT_NEAR(r.peakAmplitude, 3.0, 0.03);

  const Analytic az = analytic(1.0, 32 * 0.8);
  const Analytic rg = analytic(0.54, 32 * 0.82);
  EXPECT_NEAR(az.irwCells, 0.8859, 1e-3);   // textbook values of the two windows
  EXPECT_NEAR(az.pslrDb, -13.26, 0.01);
  EXPECT_NEAR(rg.irwCells, 1.30, 0.01);
  EXPECT_NEAR(rg.pslrDb, -42.7, 0.2);
  EXPECT_NEAR(r.azimuth.irwPixels, az.irwCells / 0.8, 0.01 * az.irwCells / 0.8);
  EXPECT_NEAR(r.range.irwPixels, rg.irwCells / 0.82, 0.01 * rg.irwCells / 0.82);
  EXPECT_NEAR(r.azimuth.pslrDb, az.pslrDb, 0.2);
  EXPECT_NEAR(r.range.pslrDb, rg.pslrDb, 0.2);
  EXPECT_NEAR(r.azimuth.islrDb, az.islrDb, 0.2);
  EXPECT_NEAR(r.range.islrDb, rg.islrDb, 0.2);
  EXPECT_NEAR(r.irwAzimuthM, r.azimuth.irwPixels * 4.0, 1e-12);
  EXPECT_NEAR(r.irwRangeM, r.range.irwPixels * 7.9, 1e-12);

  // The theory computed numerically from the window function.
  const IrMetrics ta = theoreticalMetrics(opt.azimuth, 64, 16);
  const IrMetrics tr = theoreticalMetrics(opt.range, 64, 16);
  EXPECT_NEAR(ta.irwPixels, az.irwCells / 0.8, 0.01 * az.irwCells / 0.8);
  EXPECT_NEAR(tr.irwPixels, rg.irwCells / 0.82, 0.01 * rg.irwCells / 0.82);
  EXPECT_NEAR(ta.pslrDb, az.pslrDb, 0.2);
  EXPECT_NEAR(tr.pslrDb, rg.pslrDb, 0.2);
  EXPECT_NEAR(ta.islrDb, az.islrDb, 0.2);
  EXPECT_NEAR(tr.islrDb, rg.islrDb, 0.2);
}

TEST(PointTargetAnalysis, SquintedSpectrumAndRasterFilesInBothByteOrders) {
  // A response whose azimuth spectrum is centred at 0.4 of the PRF: the
  // upsampling must not cut the band.
  PtaOptions opt;
  opt.azimuth = {1.0, 0.85};
  opt.range = {1.0, 0.82};
  const int rows = 200, cols = 150;
  std::vector<cdouble> img = syntheticImage(rows, cols, 120.45, 70.2, -2.0, opt.azimuth, opt.range);
  for (int i = 0; i < rows; ++i)
    for (int j = 0; j < cols; ++j) img[static_cast<std::size_t>(i) * cols + j] *= std::polar(1.0, 2.0 * M_PI * 0.4 * (i - 120.45));
  const std::string dir = support::scratchDir("sim_pta");
  std::filesystem::create_directories(dir);
  for (bool big : {false, true}) {
    const std::string path = dir + (big ? "/img_be" : "/img_le");
    {
      std::ofstream f(path, std::ios::binary);
      for (const cdouble& v : img) {
        float q[2] = {static_cast<float>(v.real()), static_cast<float>(v.imag())};
        unsigned char b[8];
        std::memcpy(b, q, 8);
        if (big) {
          std::reverse(b, b + 4);
          std::reverse(b + 4, b + 8);
        }
        f.write(reinterpret_cast<const char*>(b), 8);
      }
    }
    ComplexRasterReader reader;
    std::string err;
    ASSERT_TRUE(reader.open(path, rows, cols, big, 0, err)) << err;
    const PtaResult r = analysePointTarget(reader, 121.0, 69.0, -2.0, opt);
    ASSERT_TRUE(r.found) << r.message;
    EXPECT_NEAR(r.errorLine, -0.55, 0.01);
    EXPECT_NEAR(r.errorSample, 1.2, 0.01);
    EXPECT_NEAR(r.phaseError, 0.0, 0.02);
    EXPECT_NEAR(r.azimuth.irwPixels, 0.8859 / 0.85, 0.01 * 0.8859 / 0.85);
    EXPECT_NEAR(r.azimuth.pslrDb, -13.26, 0.2);
    // A target predicted outside the image is reported, not measured.
    EXPECT_FALSE(analysePointTarget(reader, -5.0, 10.0, 0.0, opt).found);
    // A raster shorter than its declared size is refused.
    EXPECT_FALSE(reader.open(path, rows + 1, cols, big, 0, err));
    EXPECT_NE(err.find("fewer than"), std::string::npos);
  }
  // Row prefixes and a file header are skipped.
  {
    const std::string path = dir + "/img_prefix";
    std::ofstream f(path, std::ios::binary);
    f.write("HEADER--", 8);
    for (int i = 0; i < rows; ++i) {
      const float prefix = 0.0055f;
      f.write(reinterpret_cast<const char*>(&prefix), 4);
      for (int j = 0; j < cols; ++j) {
        const cdouble v = img[static_cast<std::size_t>(i) * cols + j];
        const float q[2] = {static_cast<float>(v.real()), static_cast<float>(v.imag())};
        f.write(reinterpret_cast<const char*>(q), 8);
      }
    }
    f.close();
    ComplexRasterReader reader;
    std::string err;
    ASSERT_TRUE(reader.open(path, rows, cols, false, 8, err, 4)) << err;
    const PtaResult r = analysePointTarget(reader, 121.0, 69.0, -2.0, opt);
    ASSERT_TRUE(r.found) << r.message;
    EXPECT_NEAR(r.errorLine, -0.55, 0.01);
    EXPECT_NEAR(r.errorSample, 1.2, 0.01);
  }
}
