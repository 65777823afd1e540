#include <cmath>
#include <complex>
#include <string>
#include <vector>

#include "focus/sar_focuser.h"
#include "focus_fixture.h"
#include "product/data_set_info.h"

namespace {

constexpr double kPi = 3.14159265358979323846;

double sinc(double x) { return x == 0.0 ? 1.0 : std::sin(kPi * x) / (kPi * x); }

// Burst-mode product: each column a sum of on-grid azimuth tones whose
// amplitudes carry the two-way azimuth pattern around the column's centroid.
class Descallop : public FocusTest {
 protected:
  static constexpr double prf = 1600.0;
  static constexpr int E = 64;
  static constexpr double V = 7000.0;
  static constexpr int Nc = 3;

  double centroid(int c) const { return 250.0 + 100.0 * c; }  // Hz

  // Wrapped Doppler of bin i relative to the centroid.
  static double offset(int i, double fdc) {
    const double fo = fdc - std::floor(fdc / prf) * prf;
    const double f = i * prf / 1024 - fo + prf / 2;
    return f - std::floor(f / prf) * prf - prf / 2;
  }
  static double pattern(int i, double fdc) {
    const double s = sinc(offset(i, fdc) * 4.5 / V);
    return s * s;
  }

  void writeProduct(int lines, double rate, const std::vector<int>& bins) {
    std::vector<fcomplex> px(static_cast<size_t>(lines) * Nc);
    for (int n = 0; n < lines; ++n)
      for (int c = 0; c < Nc; ++c) {
        std::complex<double> v = 0.0;
        for (int i : bins)
          v += pattern(i, centroid(c)) * std::polar(1.0, 2.0 * kPi * i * n / 1024.0);
        px[static_cast<size_t>(n) * Nc + c] = fcomplex(float(v.real()), float(v.imag()));
      }
    writeRaster(path("out"), lines, Nc, px, DataSetInfo_Obj::IT_AZIMUTH_FOCUSED, {}, 5.0e-3,
                1.0e-7, 2000.0, 1.0 / prf);
    GeneralSAR rec;
    ASSERT_EQ(rec.GSread(path("out.hdr")), 0);
    rec.polynomials.CreatePolys(1, 1);
    rec.polynomials.DC[0].c[0] = centroid(0);
    rec.polynomials.DC[0].c[1] = 100.0 / 1.0e-7;  // +100 Hz per sample
    rec.polynomials.DC[0].trg0 = 5.0e-3;
    rec.polynomials.DC[0].taz0 = 2000.0;
    rec.polynomials.FR[0].c[0] = rate;
    rec.polynomials.FR[0].trg0 = 5.0e-3;
    rec.polynomials.FR[0].taz0 = 2000.0;
    rec.swath.Echoes_per_burst = E;
    rec.attitude.Eq_speed = V;
    for (auto o : {GeneralSAR::GS_POLYNOMIALS, GeneralSAR::GS_SWATH, GeneralSAR::GS_ATTITUDE})
      rec.GSenable(o);
    ASSERT_EQ(rec.GSwrite(path("out.hdr")), 0);
  }

  // Amplitude of bin i in output column c (one 1024-line window).
  std::complex<double> tone(const std::vector<fcomplex>& out, int c, int i, int first) const {
    std::complex<double> acc = 0.0;
    for (int n = 0; n < 1024; ++n)
      acc += std::complex<double>(out[static_cast<size_t>(first + n) * Nc + c]) *
             std::polar(1.0, -2.0 * kPi * i * (first + n + 32) / 1024.0);
    return acc / 1024.0;
  }
};

TEST_F(Descallop, RemovesTheAzimuthPatternGainAndRegistersTheLines) {
  // A rate that makes the burst filter a single tap: |H| = 1 everywhere.
  const double rate = -prf * prf / (4.0 * E);
  const std::vector<int> bins = {0, 100, 300, 512, 700, 1000};
  const int lines = 64 + 2 * 960 + 10;
  writeProduct(lines, rate, bins);

  SARFocuser f;
  f.OutputFilename = path("out");
  ASSERT_EQ(f.descallop(), 0);

  const std::vector<fcomplex> out = readComplex(path("out_descallop"));
  ASSERT_EQ(out.size(), static_cast<size_t>(2 * 960 * Nc));
  // Every line holds the flat-gain tones, delayed by the 32 dropped lines.
  double worst = 0.0;
  for (int m = 0; m < 2 * 960; m += 7)
    for (int c = 0; c < Nc; ++c) {
      std::complex<double> want = 0.0;
      for (int i : bins) want += std::polar(1.0, 2.0 * kPi * i * (m + 32) / 1024.0);
      const std::complex<double> got(out[static_cast<size_t>(m) * Nc + c]);
      worst = std::max(worst, std::abs(got - want) / std::abs(double(bins.size())));
    }
  EXPECT_LT(worst, 0.01);
  // Each tone separately at unit amplitude, in every column.
  for (int c = 0; c < Nc; ++c)
    for (int i : bins) EXPECT_NEAR(std::abs(tone(out, c, i, 400)), 1.0, 0.01) << c << " " << i;

  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("out_descallop.hdr")), 0);
  EXPECT_EQ(rec.dataFile.NrOfLinesPerImage, 1920);
  EXPECT_EQ(rec.roi.roi.Lines, 1920);
  EXPECT_NEAR(rec.roi.roi.SlowStartTime, 2000.0 + 32.0 / prf, 1e-9);
  EXPECT_NEAR(rec.roi.roi.SlowTimeLength, 1920.0 / prf, 1e-9);
  EXPECT_EQ(rec.dataFile.NrOfPixelsPerLine, Nc);
}

TEST_F(Descallop, BurstFilterKeepsTheBandAroundTheCentroid) {
  // Half the rate: a pass band of prf / 2 centred on each column's centroid
  // with a gain of 2.
  const double rate = -prf * prf / (8.0 * E);
  // Bins at the centroid of column 0 (250 Hz = bin 160) and half a PRF away.
  const std::vector<int> bins = {160, 672};
  writeProduct(64 + 960 + 1024, rate, bins);
  SARFocuser f;
  f.OutputFilename = path("out");
  ASSERT_EQ(f.descallop(), 0);
  const std::vector<fcomplex> out = readComplex(path("out_descallop"));
  ASSERT_EQ(out.size(), static_cast<size_t>(2 * 960 * Nc));
  EXPECT_NEAR(std::abs(tone(out, 0, 160, 300)), 2.0, 0.1);
  EXPECT_LT(std::abs(tone(out, 0, 672, 300)), 0.05);
}

TEST_F(Descallop, ShortProductGivesNoBlocks) {
  writeProduct(1000, -prf * prf / (4.0 * E), {0});
  SARFocuser f;
  f.OutputFilename = path("out");
  ASSERT_EQ(f.descallop(), 0);
  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("out_descallop.hdr")), 0);
  EXPECT_EQ(rec.roi.roi.Lines, 0);
  EXPECT_EQ(std::filesystem::file_size(path("out_descallop")), 0u);

  f.OutputFilename = path("absent");
  EXPECT_NE(f.descallop(), 0);
}

}  // namespace
