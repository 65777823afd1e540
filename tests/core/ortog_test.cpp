#include "core/ortog.h"
#include "product/general_sar.h"

#include <gtest/gtest.h>

#include "support/files.h"

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <numbers>
#include <random>
#include <vector>

namespace {

constexpr double kDeg = std::numbers::pi / 180.0;

// Clean complex noise and the same after a receiver with I/Q offsets, a Q
// gain g and a quadrature skew e: I = re + oI, Q = g (im cos e + re sin e) + oQ.
struct Channels {
  std::vector<fcomplex> clean, distorted;
};

Channels makeChannels(std::size_t n, double oI, double oQ, double g, double e, unsigned seed) {
  std::mt19937 gen(seed);
  std::normal_distribution<float> nd(0.0f, 8.0f);
  Channels c;
  c.clean.resize(n);
  c.distorted.resize(n);
  for (std::size_t k = 0; k < n; ++k) {
    const float re = nd(gen), im = nd(gen);
    c.clean[k] = fcomplex(re, im);
    c.distorted[k] = fcomplex(static_cast<float>(re + oI),
                              static_cast<float>(g * (im * std::cos(e) + re * std::sin(e)) + oQ));
  }
  return c;
}

struct Stats {
  double meanI, meanQ, levelI, levelQ, skewDeg;
};

Stats statsOf(const fcomplex* x, std::size_t n) {
  double si = 0, sq = 0;
  for (std::size_t k = 0; k < n; ++k) {
    si += x[k].real();
    sq += x[k].imag();
  }
  Stats s{si / n, sq / n, 0, 0, 0};
  double ii = 0, qq = 0, iq = 0;
  for (std::size_t k = 0; k < n; ++k) {
    const double a = x[k].real() - s.meanI, b = x[k].imag() - s.meanQ;
    ii += a * a;
    qq += b * b;
    iq += a * b;
  }
  s.levelI = std::sqrt(ii / n);
  s.levelQ = std::sqrt(qq / n);
  s.skewDeg = std::asin(2 * iq / (ii + qq)) / kDeg;
  return s;
}

void expectCorrected(const fcomplex* got, const fcomplex* clean, std::size_t n) {
  const Stats s = statsOf(got, n);
  const Stats ref = statsOf(clean, n);
  EXPECT_LT(std::abs(s.meanI - ref.meanI), 0.01 * ref.levelI);
  EXPECT_LT(std::abs(s.meanQ - ref.meanQ), 0.01 * ref.levelI);
  EXPECT_NEAR(s.levelQ / s.levelI, ref.levelQ / ref.levelI, 0.01);
  EXPECT_NEAR(s.skewDeg, ref.skewDeg, 0.5);
  double err = 0, pow = 0;
  for (std::size_t k = 0; k < n; ++k) {
    err += std::norm(got[k] - clean[k]);
    pow += std::norm(clean[k]);
  }
  EXPECT_LT(std::sqrt(err / pow), 0.02);
}

class OrtogTest : public ::testing::Test {
 protected:
  support::TempFolder dir_{"ortog"};
};

TEST_F(OrtogTest, EstimateAndApplyRemoveOffsetGainAndSkew) {
  OrtogRaster r;
  r.lines = 400;
  r.samples = 1024;
  r.prefixBytes = 4;
  r.slowStartTime = 1000.0;
  r.slowTimeDelta = 1.0 / 1680.0;
  const auto ch = makeChannels(static_cast<std::size_t>(r.lines) * r.samples, 3.5, -2.0, 1.25,
                               6.0 * kDeg, 1);
  const std::string path = (dir_ / "raw");
  {
    std::FILE* f = std::fopen(path.c_str(), "wb");
    ASSERT_NE(f, nullptr);
    for (int l = 0; l < r.lines; ++l) {
      const float swst = 5.5e-3f;
      std::fwrite(&swst, 4, 1, f);
      std::fwrite(&ch.distorted[static_cast<std::size_t>(l) * r.samples], sizeof(fcomplex),
                  r.samples, f);
    }
    std::fclose(f);
  }
  Ortog o(path, 25, 50);
  ASSERT_EQ(o.estimate(r), 0);
  EXPECT_DOUBLE_EQ(o.timeOrigin, 1000.0);
  EXPECT_NEAR(o.iMean[0], 3.5, 0.2);
  EXPECT_NEAR(o.qMean[0], -2.0, 0.3);
  EXPECT_NEAR(o.qLevel[0] / o.iLevel[0], 1.25, 0.02);
  EXPECT_NEAR(o.phase[0] / kDeg, 6.0, 0.5);

  // The record form reads the same geometry from the side file.
  {
    GeneralSAR rec;
    rec.dataFile.filename = path;
    rec.dataFile.NrOfPixelsPerLine = r.samples;
    rec.dataFile.NrOfLinesPerImage = r.lines;
    rec.dataFile.RowPrefix = 4;
    rec.roi.roi.SetFastAxe(5.5e-3, 1.0 / 18.96e6, r.samples);
    rec.roi.roi.SetSlowAxe(r.slowStartTime, r.slowTimeDelta, r.lines);
    rec.GSenable(GeneralSAR::GS_DATAFILE);
    rec.GSenable(GeneralSAR::GS_ROI);
    ASSERT_EQ(rec.GSwrite(path + ".hdr"), 0);
    Ortog fromRecord(path, 25, 50);
    ASSERT_EQ(fromRecord.estimate(), 0);
    for (int i = 0; i < 3; ++i) {
      EXPECT_NEAR(fromRecord.iMean[i], o.iMean[i], 1e-9 * (1 + std::abs(o.iMean[i])));
      EXPECT_NEAR(fromRecord.phase[i], o.phase[i], 1e-9 * (1 + std::abs(o.phase[i])));
    }
    EXPECT_EQ(Ortog((dir_ / "none"), 1, 50).estimate(), 9);
  }

  std::vector<fcomplex> line(ch.distorted.begin() + 100 * r.samples,
                             ch.distorted.begin() + 110 * r.samples);
  for (int l = 0; l < 10; ++l)
    o.apply_ortog(&line[l * r.samples], r.slowStartTime + (100 + l) * r.slowTimeDelta, r.samples);
  expectCorrected(line.data(), &ch.clean[100 * r.samples], line.size());

  // The whole-file form rewrites the pixels and keeps the prefixes.
  ASSERT_EQ(o.apply_ortog(), 0);
  std::FILE* f = std::fopen(path.c_str(), "rb");
  ASSERT_NE(f, nullptr);
  std::vector<fcomplex> all(static_cast<std::size_t>(r.lines) * r.samples);
  for (int l = 0; l < r.lines; ++l) {
    float swst = 0;
    ASSERT_EQ(std::fread(&swst, 4, 1, f), 1u);
    EXPECT_EQ(swst, 5.5e-3f);
    ASSERT_EQ(std::fread(&all[static_cast<std::size_t>(l) * r.samples], sizeof(fcomplex),
                         r.samples, f),
              static_cast<std::size_t>(r.samples));
  }
  std::fclose(f);
  expectCorrected(all.data(), ch.clean.data(), all.size());
}

TEST_F(OrtogTest, EstimateFailuresAndDeadQChannel) {
  Ortog o((dir_ / "missing"), 1, 50);
  OrtogRaster r;
  r.lines = 0;
  r.samples = 10;
  EXPECT_EQ(o.estimate(r), 1);
  r.lines = 10;
  EXPECT_EQ(o.estimate(r), 9);
  // More lines per block than the pitch: nothing to do.
  Ortog skip((dir_ / "missing"), 60, 50);
  EXPECT_EQ(skip.estimate(r), 0);

  // Dead Q channel: zero skew, Q stays zero.
  r.lines = 100;
  r.samples = 64;
  const std::string path = (dir_ / "deadq");
  std::vector<fcomplex> data(r.lines * r.samples);
  for (std::size_t k = 0; k < data.size(); ++k) data[k] = fcomplex(std::sin(0.7f * k) + 2.0f, 0);
  std::FILE* f = std::fopen(path.c_str(), "wb");
  std::fwrite(data.data(), sizeof(fcomplex), data.size(), f);
  std::fclose(f);
  Ortog d(path, 1, 50);
  ASSERT_EQ(d.estimate(r), 0);
  EXPECT_EQ(d.phase[0], 0.0);
  std::vector<fcomplex> line(data.begin(), data.begin() + 64);
  d.apply_ortog(line.data(), 0.0, 64);
  for (auto& x : line) {
    EXPECT_TRUE(std::isfinite(x.real()));
    EXPECT_EQ(x.imag(), 0.0f);
  }
}

}  // namespace
