// Fourier interpolation of blocks and the multi-looker on rasters of known
// content: tones stay tones, a constant stays that constant.
#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <filesystem>
#include <fstream>
#include <vector>

#include "core/interp.h"
#include "core/stripmlook.h"
#include "product/general_sar.h"
#include "product/record_test_util.h"

namespace {

constexpr double kTwoPi = 6.283185307179586;

fcomplex tone(double cycles, int k, int n) {
  const double phase = kTwoPi * cycles * k / n;
  return fcomplex(float(std::cos(phase)), float(std::sin(phase)));
}

// A complex raster `name` of lines x samples holding `value`, with its record.
void constantProduct(const std::string& name, int lines, int samples, fcomplex value) {
  std::vector<fcomplex> data(std::size_t(lines) * samples, value);
  std::ofstream(name, std::ios::binary)
      .write(reinterpret_cast<const char*>(data.data()), std::streamsize(data.size() * sizeof(fcomplex)));
  GeneralSAR record;
  record.dataFile.filename = name;
  record.dataFile.NrOfLinesPerImage = lines;
  record.dataFile.NrOfPixelsPerLine = samples;
  record.dataFile.CellType = FLOAT_COMPLEX;
  record.roi.roi.SetFastAxe(5.5e-3, 1.0 / 18.96e6, samples);
  record.roi.roi.SetSlowAxe(700000000.0, 1.0 / 1679.9, lines);
  record.sampling.prf_hz = 1679.9;
  for (auto o : {GeneralSAR::GS_DATAFILE, GeneralSAR::GS_ROI, GeneralSAR::GS_SAMPLING}) record.GSenable(o);
  ASSERT_EQ(record.GSwrite(name + ".hdr"), 0);
}

}  // namespace

TEST(FourierInterpolation, TonesAlongRowsAndColumnsStayTones) {
  // Rows of 16 samples to 32: a tone of 3 cycles and one of -5 cycles.
  {
    interp ip;
    ASSERT_EQ(ip.setplans(16, 2, 32, 2), 0);
    std::vector<fcomplex> in(32), out(64);
    for (int k = 0; k < 16; ++k) in[k] = tone(3, k, 16), in[16 + k] = tone(-5, k, 16);
    ASSERT_EQ(ip.interpft_p(in.data(), out.data()), 0);
    for (int k = 0; k < 32; ++k) {
      EXPECT_NEAR(std::abs(out[k] - tone(3, k, 32)), 0.0, 1e-5) << k;
      EXPECT_NEAR(std::abs(out[32 + k] - tone(-5, k, 32)), 0.0, 1e-5) << k;
    }
  }
  // Columns of 5 rows (odd) to 10 and of 4 rows (even: the Nyquist bin is
  // split, so an alternating sequence becomes a cosine).
  {
    interp ip;
    ASSERT_EQ(ip.setplans(3, 5, 3, 10), 0);
    std::vector<fcomplex> in(15), out(30);
    for (int r = 0; r < 5; ++r)
      for (int c = 0; c < 3; ++c) in[r * 3 + c] = tone(c - 1, r, 5);
    ASSERT_EQ(ip.interpft_p(in.data(), out.data()), 0);
    for (int r = 0; r < 10; ++r)
      for (int c = 0; c < 3; ++c) EXPECT_NEAR(std::abs(out[r * 3 + c] - tone(c - 1, r, 10)), 0.0, 1e-5);
  }
  {
    interp ip;
    ASSERT_EQ(ip.setplans(1, 4, 1, 8), 0);
    std::vector<fcomplex> in = {{1, 0}, {-1, 0}, {1, 0}, {-1, 0}}, out(8);
    ASSERT_EQ(ip.interpft_p(in.data(), out.data()), 0);
    for (int r = 0; r < 8; ++r) EXPECT_NEAR(out[r].real(), std::cos(kTwoPi * r / 4.0), 1e-6) << r;
  }
  // Equal sizes copy; both axes changing is refused.
  interp ip;
  ASSERT_EQ(ip.setplans(3, 2, 3, 2), 0);
  std::vector<fcomplex> in = {{1, 2}, {3, 4}, {5, 6}, {7, 8}, {9, 10}, {11, 12}}, out(6);
  ASSERT_EQ(ip.interpft_p(in.data(), out.data()), 0);
  EXPECT_EQ(out, in);
  EXPECT_EQ(ip.setplans(3, 2, 6, 4), 1);
  EXPECT_EQ(ip.interpft_p(in.data(), out.data()), 1);
}

TEST(StripMultilook, ConstantImageKeepsItsValueCoherentlyAndInAmplitude) {
  const std::string dir = record_test::freshDir();
  const std::string slc = dir + "/slc";
  const fcomplex value(0.75f, -1.0f);
  constantProduct(slc, 9, 12, value);

  // Coherent: every cell of 3 x 4 samples holds the constant.
  ATstripmlook ml;
  ml.SLCInput = slc;
  ml.outputFullRootName = dir + "/coh";
  ml.AzimuthMLFactor = 3;
  ml.RangeMLFactor = 4;
  ml.CoherentFlag = 1;
  ASSERT_EQ(ml.readSLCData(), 0);
  ASSERT_EQ(ml.coherml(), 0);
  const auto coherent = support::readValues<fcomplex>(dir + "/coh");
  ASSERT_EQ(coherent.size(), 3u * 3u);
  for (const fcomplex& v : coherent) EXPECT_NEAR(std::abs(v - value), 0.0, 1e-6);
  GeneralSAR record;
  ASSERT_EQ(record.GSread(dir + "/coh.hdr"), 0);
  EXPECT_EQ(record.dataFile.CellType, FLOAT_COMPLEX);
  EXPECT_NEAR(record.roi.roi.SlowStartTime, 700000000.0 + 1.0 / 1679.9, 1e-6);  // (3/2) lines on
  EXPECT_NEAR(record.roi.roi.FastStartTime, 5.5e-3 + 2.0 / 18.96e6, 1e-15);     // (4/2) samples on
  EXPECT_NEAR(record.roi.roi.FastTimeDelta, 4.0 / 18.96e6, 1e-18);
  record.GSdestroy();

  // Amplitude: the constant's modulus; 9 lines by 3 leave a last line of
  // no rows (zero) and 12 samples by 4 a last sample of none.
  ml.CoherentFlag = 0;
  ml.outputFullRootName = dir + "/amp";
  ASSERT_EQ(ml.readSLCData(), 0);
  ASSERT_EQ(ml.runall("", 0), 0);
  const auto amplitude = support::readValues<float>(dir + "/amp");
  ASSERT_EQ(amplitude.size(), 4u * 4u);
  for (int o = 0; o < 4; ++o)
    for (int c = 0; c < 4; ++c) {
      const float expected = (o == 3 || c == 3) ? 0.0f : std::abs(value);
      EXPECT_NEAR(amplitude[o * 4 + c], expected, 1e-5) << o << " " << c;
    }

  // Factors below 1 are refused by the coherent form.
  ml.AzimuthMLFactor = 0;
  EXPECT_EQ(ml.coherml(), 1);
  ml.AzimuthMLFactor = 3;
  ml.RangeMLFactor = 0;
  EXPECT_EQ(ml.coherml(), 1);
}
