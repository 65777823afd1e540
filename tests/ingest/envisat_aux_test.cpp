// ASAR auxiliary readers and FBAQ decoders on the genuine INS, XCA, XCH and
// DORIS files, and the decoder's block arithmetic on hand-made packets.
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>
#include <iterator>
#include <vector>

#include "ingest/envisat/asar_aux.h"
#include "ingest_test_util.h"
#include "product/time_base.h"

namespace {

using ingest_test::realData;
using ingest_test::realDataPresent;

std::string aux(const std::string& name) { return std::string(realData()) + "/envisat_aux/" + name; }
const std::string kIns2006 = "ASA_INS_AXVIEC20061220_105425_20030211_000000_20071231_000000";
const std::string kIns2007 = "ASA_INS_AXVIEC20070306_164819_20070307_060000_20071231_000000";
const std::string kXca2009 = "ASA_XCA_AXVIEC20091217_114112_20080801_000000_20101231_235959";
const std::string kXch2009 = "ASA_XCH_AXVIEC20091217_113006_20020301_000000_20101231_000000";

#define REQUIRE_REALDATA() \
  if (!realDataPresent()) GTEST_SKIP() << "no genuine mission files at " << realData()

class AsarInsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    REQUIRE_REALDATA();
    ASSERT_EQ(LUTfbaq_f(aux(kIns2006).c_str(), Q.data(), I.data()), 0);
  }
  float at(const std::vector<float>& t, int level, int code) { return t[std::size_t(256 * level + code)]; }
  std::vector<float> I = std::vector<float>(4096), Q = std::vector<float>(4096);
};

TEST_F(AsarInsTest, ReconstructionTablesAreReadLevelFirst) {
  const float expected[16] = {-1.3221f, -0.9978f, -0.9978f, -0.8864f, -0.6745f, -0.4674f, -0.2734f, -0.0889f,
                              0.0921f,  0.2755f,  0.4702f,  0.6781f,  0.8897f,  1.0024f,  1.0024f,  1.3260f};
  for (int l = 0; l < 16; ++l) EXPECT_NEAR(at(I, l, 128), expected[l], 5e-5) << "level " << l;
  EXPECT_NEAR(at(I, 8, 0), 0.0017735f, 1e-7);
  EXPECT_NEAR(at(Q, 15, 255), 151.578f, 1e-3);
}

TEST_F(AsarInsTest, DecoderMapsSignMagnitudeNibblesThroughTheBlockCode) {
  // One block of code 128: data 0x0F is level 8 for I and level 0 for Q;
  // 0x70 is level 15 for I and 8 for Q; 0x88 is level 7 for both.
  std::vector<unsigned char> line(64, 0x88);
  line[0] = 128;
  line[1] = 0x0F;
  line[2] = 0x70;
  std::vector<float> out(2 * 63);
  int floats = 0, lines = 0;
  ASSERT_EQ(fbaq_decode84_f(line.data(), out.data(), 64, 63, 1, &floats, &lines), 0);
  EXPECT_EQ(floats, 126);
  EXPECT_EQ(lines, 1);
  EXPECT_EQ(out[0], at(I, 8, 128));
  EXPECT_EQ(out[1], at(Q, 0, 128));
  EXPECT_EQ(out[2], at(I, 15, 128));
  EXPECT_EQ(out[3], at(Q, 8, 128));
  EXPECT_EQ(out[124], at(I, 7, 128));
  EXPECT_EQ(out[125], at(Q, 7, 128));
}

TEST_F(AsarInsTest, DecoderLineSizesTailsAndPadding) {
  // 63 n samples: no tail. 63 n + 1: a 2-byte tail. 63 n + 2: a 3-byte tail
  // padded to 4, whose padding sample is dropped.
  EXPECT_EQ(fbaq_line_bytes(126), 128);
  EXPECT_EQ(fbaq_line_bytes(127), 130);
  EXPECT_EQ(fbaq_line_bytes(128), 132);
  EXPECT_EQ(fbaq_line_bytes(6656), 6762);  // the genuine IS6 window
  std::vector<unsigned char> data(2 * 132);
  for (std::size_t k = 0; k < data.size(); ++k) data[k] = static_cast<unsigned char>(k * 37);
  std::vector<float> out(2 * 2 * 128 + 8, -7.0f);
  int floats = 0, lines = 0;
  ASSERT_EQ(fbaq_decode84_f(data.data(), out.data(), 264, 128, 1, &floats, &lines), 0);
  EXPECT_EQ(lines, 2);
  EXPECT_EQ(floats, 512);
  EXPECT_EQ(out[512], -7.0f);  // nothing written behind the two lines
  // Sample 127 of line 2 comes from byte 2 of its tail block (line offset 132 + 128 + 2).
  EXPECT_EQ(out[2 * (128 + 127)], at(I, ((data[262] >> 4) < 8 ? (data[262] >> 4) + 8 : 15 - (data[262] >> 4)),
                                        data[260]));
  // A window that does not fit the packet decodes nothing.
  EXPECT_EQ(fbaq_decode84_f(data.data(), out.data(), 263, 128, 1, &floats, &lines), 1);
}

TEST(AsarNoiseDecoder, FixedLevelsOneByteASample) {
  const unsigned char data[4] = {0x0F, 0x70, 0x88, 0x00};  // 3 samples and a padding byte
  float out[8] = {};
  int floats = 0, lines = 0;
  ASSERT_EQ(fbaq_decode84fe(data, out, 4, 3, 1, &floats, &lines), 0);
  EXPECT_EQ(floats, 6);
  EXPECT_FLOAT_EQ(out[0], 0.004f);
  EXPECT_FLOAT_EQ(out[1], -0.05906f);
  EXPECT_FLOAT_EQ(out[2], 0.05906f);
  EXPECT_FLOAT_EQ(out[5], -0.004f);
  EXPECT_EQ(fbaq_decode84fe(data, out, 3, 3, 1, &floats, &lines), 1);
}

TEST_F(AsarInsTest, DroopGainFollowsTheTemperatureModel) {
  std::vector<float> gain(kDroopSamples);
  ASSERT_EQ(getDROOPgain(aux(kIns2006).c_str(), gain.data(), kDroopSamples), 0);
  EXPECT_NEAR(20.0 * std::log10(gain[0]), 0.769, 1e-3);
  EXPECT_NEAR(gain[0], 1.0926, 1e-4);
  EXPECT_NEAR(gain[8191], 0.9978, 1e-4);
  for (int k = 1; k < kDroopSamples; ++k) ASSERT_LE(gain[k], gain[k - 1]) << k;
}

TEST_F(AsarInsTest, ConstantsAndRanksOfEachModeBySwathCode) {
  sarpar im[7], ap[7], ap2007[7];
  const int codes[7] = {1, 2, 3, 4, 5, 6, 7};
  ASSERT_EQ(asainspar(aux(kIns2006).c_str(), im, ASAR_IM, codes, 7), 0);
  ASSERT_EQ(asainspar(aux(kIns2006).c_str(), ap, ASAR_APH, codes, 7), 0);
  ASSERT_EQ(asainspar(aux(kIns2007).c_str(), ap2007, ASAR_APV, codes, 7), 0);
  const int rank[7] = {9, 9, 12, 10, 13, 11, 14}, apSecond[7] = {194, 196, 257, 218, 277, 238, 297};
  for (int s = 0; s < 7; ++s) {
    EXPECT_EQ(im[s].Swath_rank, rank[s]);
    EXPECT_EQ(im[s].secondRank, 1023);
    EXPECT_EQ(ap[s].Swath_rank, rank[s]);
    EXPECT_EQ(ap[s].secondRank, apSecond[s]);
    EXPECT_EQ(ap2007[s].secondRank, s == 4 ? 194 : apSecond[s]);
  }
  EXPECT_DOUBLE_EQ(im[0].Carrier_frequency, 5331004416.0);
  EXPECT_DOUBLE_EQ(im[0].Sampling_frequency, 19207680.0);
  EXPECT_NEAR(im[0].Range_gate_bias, 5.0995e-7, 1e-12);
  const int bad[1] = {9};
  EXPECT_NE(asainspar(aux(kIns2006).c_str(), im, ASAR_IM, bad, 1), 0);
}

TEST_F(AsarInsTest, ElevationPatternsOfTwoXcaGenerations) {
  const std::string xca2007 = std::string(realData()) +
                              "/envisat/ASA_XCA_AXVIEC20070517_153558_20070204_165113_20071231_000000";
  struct Case {
    std::string file;
    int pol, swath, point;
    float db;
  } cases[] = {{aux(kXca2009), 0, 6, 0, -30.705f},  {aux(kXca2009), 0, 6, 100, 0.0f},
               {aux(kXca2009), 0, 6, 81, 1.186f},   {aux(kXca2009), 0, 2, 0, -14.050f},
               {aux(kXca2009), 1, 6, 0, -30.737f},  {xca2007, 0, 6, 0, -30.447f},
               {xca2007, 0, 6, 81, 1.244f},         {xca2007, 0, 2, 0, -14.101f},
               {xca2007, 1, 6, 0, -30.663f}};
  for (const Case& c : cases) {
    float v = 0.0f;
    ASSERT_EQ(xca_pattern_db(c.file.c_str(), c.pol, c.swath, c.point, &v), 0);
    EXPECT_NEAR(v, c.db, 1e-3) << c.file << " pol " << c.pol << " swath " << c.swath << " point " << c.point;
  }
  sarpar par;
  par.swathNumber = 6;
  RangePattern pattern;
  ASSERT_EQ(envi_rgpattern(aux(kXca2009).c_str(), aux(kIns2006).c_str(), &par, &pattern), 0);
  ASSERT_EQ(pattern.gain.size(), 201u);
  EXPECT_NEAR(pattern.firstAngle, 35.633f, 1e-3);
  EXPECT_NEAR(pattern.gain[100], 1.0f, 1e-6);
  EXPECT_NEAR(pattern.gain[81], std::pow(10.0f, 1.1855f / 20.0f), 1e-4);
  const float angles[7] = {16.628f, 20.138f, 25.243f, 29.533f, 32.818f, 35.633f, 38.058f};
  for (int n = 1; n <= 7; ++n) {
    par.swathNumber = n;
    ASSERT_EQ(envi_rgpattern(aux(kXca2009).c_str(), aux(kIns2006).c_str(), &par, &pattern), 0);
    EXPECT_NEAR(pattern.firstAngle, angles[n - 1], 1e-3) << "IS" << n;
  }
}

TEST_F(AsarInsTest, CalibrationPulseTablesOfXchAndXca) {
  std::vector<float> fn(7 * 64), gn(64);
  ASSERT_EQ(gen_fn_v2(aux(kIns2006).c_str(), aux(kXch2009).c_str(), fn.data(), gn.data(), 0), 0);
  EXPECT_NEAR(gn[0], 0.0266f, 1e-4);
  EXPECT_NEAR(gn[2], 0.0351f, 1e-4);
  EXPECT_NEAR(gn[3], -0.0026f, 1e-4);
  ASSERT_EQ(gen_fn_v2(aux(kIns2006).c_str(), aux(kXca2009).c_str(), fn.data(), gn.data(), 0), 0);
  EXPECT_NEAR(gn[0], 31695.67f, 0.01f);
  EXPECT_NEAR(gn[1], 26915.35f, 0.01f);
  EXPECT_EQ(gen_fn_v2("/nonexistent/ASA_INS", aux(kXch2009).c_str(), fn.data(), gn.data(), 0), 9);
}

TEST(AsarOrbit, FiveVectorsAroundTheSwathCentreFromDoris) {
  REQUIRE_REALDATA();
  const std::string orbit =
      std::string(realData()) + "/orbits/DOR_VOR_AXVF-P20100423_084900_20100327_215526_20100329_002326";
  sarpar par;
  par.Azimuth_time_reference = ascii2sec85("28-MAR-2010 10:00:00.000000");
  par.prf = 1650.0;
  par.lines = 4950;
  AsarOrbit o;
  ASSERT_EQ(envi_orbit(orbit.c_str(), &par, &o), 0);
  EXPECT_DOUBLE_EQ(o.dt, 1.0);
  EXPECT_DOUBLE_EQ(o.t0, par.Azimuth_time_reference - 0.5);
  for (int k = 0; k < 5; ++k) {
    const double r = std::hypot(o.pos[3 * k], o.pos[3 * k + 1], o.pos[3 * k + 2]);
    const double v = std::hypot(o.vel[3 * k], o.vel[3 * k + 1], o.vel[3 * k + 2]);
    EXPECT_NEAR(r, 7.16e6, 3e4);
    EXPECT_NEAR(v, 7.5e3, 100.0);
  }
  // One second apart: the position difference is the mean velocity.
  EXPECT_NEAR(o.pos[6] - o.pos[3], 0.5 * (o.vel[3] + o.vel[6]), 0.05);
  par.Azimuth_time_reference = ascii2sec85("28-MAR-2012 10:00:00.000000");
  EXPECT_NE(envi_orbit(orbit.c_str(), &par, &o), 0);
}

TEST(AsarChirp, SyntheticChirpLengthScaleAndSymmetry) {
  sarpar par;
  par.Sampling_frequency = 19207680.0;
  par.pulseLength = 496 / par.Sampling_frequency;
  par.chirpBandwidth = 255 * 62745.098039215685;
  std::vector<fcomplex> c;
  ASSERT_EQ(envi_syntchirp(&par, &c), 0);
  ASSERT_EQ(c.size(), 496u);
  const float scale = static_cast<float>(par.chirpBandwidth / 496);
  for (std::size_t i = 0; i < c.size(); ++i) {
    EXPECT_NEAR(std::abs(c[i]), scale, scale * 1e-5);
    EXPECT_NEAR(c[i].real(), c[c.size() - 1 - i].real(), scale * 1e-4);  // phase even about the centre
  }
}

}  // namespace
