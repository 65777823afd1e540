#include "product/acquisition_objects.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <fstream>
#include <vector>

#include "product/antenna_pattern.h"
#include "product/byte_order.h"
#include "product/buffer_io.h"
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

// A fake ASA_INS / ASA_XCA product: main header, specific header with the
// data offset at position 231, then the record.
std::string fakeAsarAux(const std::string& path, const std::vector<unsigned char>& record) {
  std::string header(1247 + 378, ' ');
  const std::string offset = "+00000000000000001625<bytes>";
  header.replace(1247 + 231, offset.size(), offset);
  std::ofstream out(path, std::ios::binary);
  out.write(header.data(), static_cast<std::streamsize>(header.size()));
  out.write(reinterpret_cast<const char*>(record.data()), static_cast<std::streamsize>(record.size()));
  return path;
}

TEST(SensorAttitude, DroopGainFromInstrumentFile) {
  const std::string dir = record_test::freshDir();
  std::vector<unsigned char> rec(171648, 0);
  for (int s = 0; s < 5; ++s) {
    const std::size_t table = 171368 - 68 * static_cast<std::size_t>(4 - s);
    float2ch(20.0f + s, &rec[table], 'm');
    for (int i = 0; i < 8; ++i) {
      const double v = 100.0 * s + i + 0.5;
      unsigned char b[8];
      std::memcpy(b, &v, 8);
      if (get_endian() == 'l') swp8(b);
      std::memcpy(&rec[table + 4 + 8 * i], b, 8);
    }
  }
  const std::string ins = fakeAsarAux(dir + "/ASA_INS_AX", rec);
  SensorAttitude_Obj a;
  ASSERT_EQ(a.getDroopGain(ins, 4), 0);
  EXPECT_EQ(a.Temperature, 24.0);
  EXPECT_EQ(a.DroopGain[0], 400.5);
  EXPECT_EQ(a.DroopGain[7], 407.5);
  ASSERT_EQ(a.getDroopGain(ins, 1), 0);
  EXPECT_EQ(a.DroopGain[3], 103.5);
  EXPECT_EQ(a.Temperature, 21.0);
  // Swath 5 and above: nothing changes.
  ASSERT_EQ(a.getDroopGain(ins, 5), 0);
  EXPECT_EQ(a.DroopGain[3], 103.5);
  EXPECT_EQ(a.Temperature, 21.0);
  EXPECT_EQ(a.getDroopGain(dir + "/missing", 1), 9);
  std::ofstream(dir + "/short", std::ios::binary) << std::string(2000, ' ');
  EXPECT_EQ(a.getDroopGain(dir + "/short", 1), 4);
}

TEST(SwathInfo, BurstTimesFromRowPrefixes) {
  const std::string dir = record_test::freshDir();
  const std::string raster = dir + "/raw";
  DataFile layout(raster);
  layout.NrOfPixelsPerLine = 4;
  layout.NrOfLinesPerImage = 6;
  layout.RowPrefix = 17;
  layout.CellType = INT8_COMPLEX;
  ASSERT_EQ(layout.write_hdr(), 0);
  std::ofstream out(raster, std::ios::binary);
  const double t0 = ascii2sec85("29-MAR-2012 07:11:34.432893");
  for (int row = 0; row < 6; ++row) {
    unsigned char prefix[17] = {};
    const mjd m = sec852mjd(t0 + row * 0.5);
    std::memcpy(prefix, &m.days, 4);
    std::memcpy(prefix + 4, &m.seconds, 4);
    std::memcpy(prefix + 8, &m.microseconds, 4);
    out.write(reinterpret_cast<const char*>(prefix), 17);
    out.write("abcdefgh", 8);
  }
  out.close();
  SwathInfo s;
  s.Bursts = 3;
  s.Lines_per_burst = 2;
  ASSERT_EQ(s.readBurstTimes(raster), 0);
  ASSERT_EQ(s.BurstTimes.size(), 3u);
  EXPECT_NEAR(s.BurstTimes[0], t0, 1e-6);
  EXPECT_NEAR(s.BurstTimes[1], t0 + 1.0, 1e-6);
  EXPECT_NEAR(s.BurstTimes[2], t0 + 2.0, 1e-6);
  s.Bursts = 4;  // runs past the end
  EXPECT_EQ(s.readBurstTimes(raster), 4);
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
