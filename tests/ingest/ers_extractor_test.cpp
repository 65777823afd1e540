#include "ingest/ers/ers_extractor.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>

#include "ingest_test_util.h"
#include "orbit/general_sar_orbit.h"
#include "product/time_base.h"

using ingest_test::blankWith;
using ingest_test::TempFolder;
using ingest_test::writeBytes;

namespace {

struct Line {
  std::uint32_t number;
  int code;
  unsigned char i, q;  // every sample of the line
};

void be32(std::string& s, std::size_t at, std::uint32_t v) {
  for (int k = 0; k < 4; ++k) s[at + k] = static_cast<char>((v >> (24 - 8 * k)) & 0xff);
}

// An image file: descriptor of 11644 bytes, then one 412 + 2 * samples
// record per line; the sample bytes vary along the line (i + s, q + 2s).
std::string imageFile(int samples, const std::vector<Line>& lines, int records = -1) {
  std::string s = blankWith(11644, {{180, [&] {
                                      char b[8];
                                      std::snprintf(b, sizeof b, "%06d", records < 0 ? int(lines.size()) : records);
                                      return std::string(b);
                                    }()},
                                    {248, [&] {
                                      char b[12];
                                      std::snprintf(b, sizeof b, "%08d", samples);
                                      return std::string(b);
                                    }()}});
  for (const Line& l : lines) {
    std::string r(412 + 2 * std::size_t(samples), '\0');
    be32(r, 12, l.number);
    r[214] = static_cast<char>(l.code >> 8);
    r[215] = static_cast<char>(l.code & 0xff);
    for (int k = 0; k < samples; ++k) {
      r[412 + 2 * k] = static_cast<char>(l.i + k);
      r[413 + 2 * k] = static_cast<char>(l.q + 2 * k);
    }
    s += r;
  }
  return s;
}

// Leader with the fields of the extractor; ERS-2, biases absent unless
// given, five state vectors 10 s apart.
std::string leader(const char* biasI = "-9999999.9999999", const char* biasQ = "-9999999.9999999") {
  std::string s = blankWith(2992 + 5 * 132 + 100,
                            {{740, "ORBIT=12345-FRAME=2925"},
                             {1116, "ERS2            "},
                             {1148, "VV"},
                             {1164, "   12345"},
                             {1212, "   5.300"},
                             {1366, "   2.0889400e+11"},
                             {1430, "      18.9624680"},
                             {1462, "      37.1200000"},
                             {1538, biasI},
                             {1554, biasQ},
                             {1654, "    1679.9020000"},
                             {1766, "SIM-PAF"},
                             {2534, "06-MAR-2005 10:00:00.500"},
                             {2582, "06-MAR-2005 10:00:16.500"},
                             {2746, "0005"},
                             {2750, "2005"},
                             {2754, "0003"},
                             {2758, "  06"},
                             {2766, " 3.599950000000000E+04"},
                             {2788, " 1.000000000000000E+01"}});
  for (int k = 0; k < 5; ++k) {
    const double v[6] = {1.0e6 + 7000.0 * 10 * k, -2.0e6 - 1000.0 * k, 6.5e6 - 2500.0 * 10 * k,
                         7000.0, -100.0, -2500.0};
    for (int j = 0; j < 6; ++j) {
      char b[32];
      std::snprintf(b, sizeof b, "%22.15E", v[j]);
      s.replace(2992 + 132 * std::size_t(k) + 22 * std::size_t(j), 22, b);
    }
  }
  return s;
}

struct Row {
  float swst;
  std::vector<float> iq;
};

std::vector<Row> readRaster(const std::string& path, int samples) {
  std::ifstream in(path, std::ios::binary);
  std::vector<Row> rows;
  std::vector<char> buf(4 + 8 * std::size_t(samples));
  while (in.read(buf.data(), std::streamsize(buf.size()))) {
    Row r;
    std::memcpy(&r.swst, buf.data(), 4);
    r.iq.resize(2 * std::size_t(samples));
    std::memcpy(r.iq.data(), buf.data() + 4, 8 * std::size_t(samples));
    rows.push_back(std::move(r));
  }
  return rows;
}

float swstOf(int code) { return static_cast<float>(code * 2.10943e-07 + 0.005357529 - 6.627e-06); }

}  // namespace

TEST(ERSExtractorTest, RealLeaderFields) {
  if (!ingest_test::realDataPresent()) GTEST_SKIP() << "real data folder absent";
  ATERSExtractor x;
  x.LeaFilename = std::string(ingest_test::realData()) + "/ers1_2000_orbit44928/lea_01.001";
  ASSERT_EQ(x.readLeader(), 0);
  const GeneralRAWData& r = x.rawData;
  EXPECT_EQ(r.dataSetInfo.Description, "ERS1");
  EXPECT_EQ(r.dataSetInfo.SceneID, "ORBIT=44928-FRAM");
  EXPECT_EQ(r.dataSetInfo.Polarization, "V/V");
  EXPECT_EQ(r.dataSetInfo.OrbitNumber, "44928");
  EXPECT_EQ(r.dataSetInfo.AcquisitionStation, "I-PAF");
  EXPECT_DOUBLE_EQ(r.sampling.fc_hz, 5.3e9);
  EXPECT_DOUBLE_EQ(r.sampling.lambda_m, 299792458.0 / 5.3e9);
  EXPECT_DOUBLE_EQ(r.sampling.frg_hz, 18.962468e6);
  EXPECT_DOUBLE_EQ(r.sampling.Trg_s, 1.0 / 18.962468e6);
  EXPECT_DOUBLE_EQ(r.roi.FastTimeDelta, 1.0 / 18.962468e6);
  EXPECT_DOUBLE_EQ(r.pulse.PulseSamplingRate, 18.962468e6);
  EXPECT_DOUBLE_EQ(r.pulse.PulseLength, 37.12e-6);
  EXPECT_DOUBLE_EQ(r.sampling.Brg_hz, 2.0 * 37.12e-6 * 2.08894e11);
  EXPECT_DOUBLE_EQ(r.pulse.Bandwidth, r.sampling.Brg_hz);
  EXPECT_DOUBLE_EQ(r.sampling.prf_hz, 1679.902);
  EXPECT_DOUBLE_EQ(r.sampling.brf_hz, 1679.902);
  EXPECT_DOUBLE_EQ(r.sampling.pri_s, 1.0 / 1679.902);
  EXPECT_DOUBLE_EQ(r.roi.SlowTimeDelta, 1.0 / 1679.902);
  const double first = ascii2sec85("17-FEB-2000 09:57:26.417");
  EXPECT_DOUBLE_EQ(r.roi.SlowStartTime, first);
  EXPECT_DOUBLE_EQ(r.swath.Acquisition_Start_Time, first);
  EXPECT_DOUBLE_EQ(r.roi.SlowTimeLength, ascii2sec85("17-FEB-2000 09:57:43.084") - first);
  GeneralSAROrbit& orbit = x.rawData.orbit();
  ASSERT_EQ(orbit.nSV, 5);
  EXPECT_DOUBLE_EQ(orbit.t0, ascii2sec85("17-FEB-2000 09:57:26.417000"));
  EXPECT_DOUBLE_EQ(orbit.dt, 4.167);
  EXPECT_DOUBLE_EQ(orbit.pos[0], 5156836.22);
  EXPECT_DOUBLE_EQ(orbit.pos[1], 1457278.56);
  EXPECT_DOUBLE_EQ(orbit.pos[2], 4746203.2);
  EXPECT_DOUBLE_EQ(orbit.vel[0], 5183.1375);
  EXPECT_DOUBLE_EQ(orbit.vel[1], -482.13441);
  EXPECT_DOUBLE_EQ(orbit.vel[2], -5469.21494);

  ATERSExtractor y;
  y.LeaFilename = std::string(ingest_test::realData()) + "/ers2_2010_orbit77106/LEA_01.001";
  ASSERT_EQ(y.readLeader(), 0);
  EXPECT_EQ(y.rawData.dataSetInfo.Description, "ERS2");
  EXPECT_EQ(y.rawData.dataSetInfo.AcquisitionStation, "D-PAF");
  EXPECT_DOUBLE_EQ(y.rawData.sampling.prf_hz, 1679.9023438);
  EXPECT_DOUBLE_EQ(y.rawData.orbit().t0, ascii2sec85("18-JAN-2010 17:49:28.684000"));
  EXPECT_DOUBLE_EQ(y.rawData.orbit().pos[0], -1425570.155210402);
}

TEST(ERSExtractorTest, RealLeaderBiasesAndTruncatedImageHead) {
  if (!ingest_test::realDataPresent()) GTEST_SKIP() << "real data folder absent";
  TempFolder dir;
  // The real leader's biases (-0.258, -0.095) on a small image file.
  writeBytes(dir / "DAT_01.001", imageFile(4, {{1, 944, 16, 15}, {2, 944, 20, 10}}));
  ATERSExtractor x;
  x.LeaFilename = std::string(ingest_test::realData()) + "/ers1_2000_orbit44928/lea_01.001";
  x.ImgFilename = dir / "DAT_01.001";
  x.OutputFile = dir / "out.extracted";
  ASSERT_EQ(x.readLeader(), 0);
  ASSERT_EQ(x.readImage(), 0);
  const auto rows = readRaster(dir / "out.extracted", 4);
  ASSERT_EQ(rows.size(), 2u);
  EXPECT_EQ(rows[0].iq[0], 16.0f - 15.5f - static_cast<float>(-0.258));
  EXPECT_EQ(rows[0].iq[1], 15.0f - 15.5f - static_cast<float>(-0.095));
  EXPECT_EQ(rows[1].iq[6], 23.0f - 15.5f - static_cast<float>(-0.258));
  EXPECT_EQ(rows[1].iq[7], 16.0f - 15.5f - static_cast<float>(-0.095));

  // The genuine image file ends inside record 1: a read failure, no vectors.
  ATERSExtractor y;
  y.LeaFilename = x.LeaFilename;
  y.ImgFilename = std::string(ingest_test::realData()) + "/ers1_2000_orbit44928/dat_01.001";
  y.OutputFile = dir / "real.extracted";
  ASSERT_EQ(y.readLeader(), 0);
  EXPECT_EQ(y.readImage(), 4);
  EXPECT_EQ(y.getSwstVector(), nullptr);
  EXPECT_EQ(y.getMissingVector(), nullptr);
  EXPECT_EQ(y.getCounterVector(), nullptr);
  // Its descriptor was read: 28000 records of 5616 samples.
  EXPECT_EQ(y.rawData.roi.Lines, 28000);
  EXPECT_EQ(y.rawData.roi.Samples, 5616);
}

TEST(ERSExtractorTest, PartOfTheSceneAndFirstRecordOffset) {
  TempFolder dir;
  writeBytes(dir / "LEA_01.001", leader("       1.0000000", "      -1.0000000"));
  std::vector<Line> lines;
  for (int k = 0; k < 10; ++k) lines.push_back({std::uint32_t(k + 2), 1000 + k, std::uint8_t(k), 0});
  writeBytes(dir / "DAT_01.001", imageFile(2, lines));
  auto extract = [&](int skip, int extract, ATERSExtractor& x) {
    x.LeaFilename = dir / "LEA_01.001";
    x.ImgFilename = dir / "DAT_01.001";
    x.OutputFile = dir / "out.extracted";
    x.skipPercent = skip;
    x.extractPercent = extract;
    EXPECT_EQ(x.readLeader(), 0);
    const double t0 = x.rawData.roi.SlowStartTime;
    EXPECT_EQ(x.readImage(), 0);
    return x.rawData.roi.SlowStartTime - t0;
  };
  {
    ATERSExtractor x;
    const double shift = extract(30, 50, x);
    EXPECT_NEAR(shift, 3.0 / 1679.902, 1e-6);  // times near 6e8 s keep about 1e-7 s
    ASSERT_EQ(x.getVectorLength(), 5);
    EXPECT_EQ(x.getCounterVector()[0], 5);
    EXPECT_EQ(x.getSwstVector()[4], 1007);
    // A first record numbered 2 flags every line, skipped ones counted too.
    EXPECT_EQ(x.getMissingLines(), 8);
    for (int k = 0; k < 5; ++k) EXPECT_EQ(x.getMissingVector()[k], 1);
    const auto rows = readRaster(dir / "out.extracted", 2);
    ASSERT_EQ(rows.size(), 5u);
    EXPECT_EQ(rows[0].iq[0], 3.0f - 15.5f - 1.0f);
    EXPECT_EQ(rows[0].iq[1], 0.0f - 15.5f + 1.0f);
    EXPECT_DOUBLE_EQ(x.rawData.dataSetInfo.SWST_MIN, double(swstOf(1003)));
  }
  {
    // Together beyond 100 percent: the rest of the scene after the skip.
    ATERSExtractor x;
    extract(10, 95, x);
    EXPECT_EQ(x.getVectorLength(), 9);
    EXPECT_EQ(x.rawData.roi.Lines, 9);
  }
}
