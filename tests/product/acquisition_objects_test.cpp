#include "product/acquisition_objects.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <fstream>
#include <vector>

#include "product/antenna_pattern.h"
#include "product/byte_order.h"
#include "product/data_file.h"
#include "product/data_set_info.h"
#include "product/geo_coords.h"
#include "product/time_base.h"
#include "record_test_util.h"

namespace {

using record_test::g15;

TEST(SARPulse, ChirpEnergyAndPhaseForBothSigns) {
  for (const double bw : {15.55e6, -15.55e6}) {
    SARPulse_Obj p;
    p.PulseLength = 37.12e-6;
    p.Bandwidth = bw;
    p.PulseSamplingRate = 18.96e6;
    const int n = p.chirpSamples();
    EXPECT_EQ(n, 704);  // 703.8 rounds up
    std::vector<fcomplex> c;
    ASSERT_EQ(p.generateChirp(c), 0);
    ASSERT_EQ(static_cast<int>(c.size()), n);
    double energy = 0.0;
    for (const auto& s : c) energy += std::norm(std::complex<double>(s));
    // Each sample has modulus 1/g with g^2 = n fs / |B|.
    const double g2 = n * p.PulseSamplingRate / std::fabs(bw);
    EXPECT_NEAR(energy * g2 / n, 1.0, 1e-5);
    // Quadratic phase centred on the pulse; the sign follows the bandwidth.
    const double t = (0 - (n - 1) * 0.5) / p.PulseSamplingRate;
    const double phase = bw * M_PI / p.PulseLength * t * t;
    EXPECT_NEAR(c[0].real() * std::sqrt(g2), std::cos(phase), 1e-4);
    EXPECT_NEAR(c[0].imag() * std::sqrt(g2), std::sin(phase), 1e-4);
    // Symmetric in time.
    EXPECT_NEAR(c[1].real(), c[n - 2].real(), 1e-6);
  }
  SARPulse_Obj bad;
  std::vector<fcomplex> c;
  bad.PulseLength = 0.0;
  bad.PulseSamplingRate = 1e6;
  bad.Bandwidth = 1e6;
  EXPECT_NE(bad.generateChirp(c), 0);
}

TEST(AntennaPattern, RealExternalCalibrationFile) {
  const std::string xca = TESSIVOR_REALDATA_DIR
      "/envisat/ASA_XCA_AXVIEC20070517_153558_20070204_165113_20071231_000000";
  if (!std::ifstream(xca)) GTEST_SKIP() << "real data folder absent";
  std::ifstream in(xca, std::ios::binary);
  std::vector<unsigned char> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  AntennaPattern_Obj a;
  ASSERT_EQ(a.getPatternENVI(xca, 1, 2), 0);
  EXPECT_EQ(a.PatternSamples, 201);
  ASSERT_EQ(a.Pattern.size(), 201u);
  const std::size_t entry = 1625 + 12760 + 804 * (1 + 4 * 2);
  EXPECT_FLOAT_EQ(a.Pattern[0], static_cast<float>(std::pow(10.0, ch2float4(&bytes[entry], 'm') / 20.0)));
  EXPECT_FLOAT_EQ(a.Pattern[200],
                  static_cast<float>(std::pow(10.0, ch2float4(&bytes[entry + 800], 'm') / 20.0)));
  EXPECT_NEAR(a.StartAngle, 20.138 - 5.0, 1e-3);  // boresight of swath 1
  EXPECT_EQ(a.DeltaAngle, 0.05);
  EXPECT_EQ(a.getPatternENVI(xca, 3, 4), 10);  // beyond the table
}

}  // namespace
