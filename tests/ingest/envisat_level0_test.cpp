// The genuine ASAR image-mode level-0 head: product headers, the first
// packet head, its first time, the first pass, a decoded echo and the clean
// end of a product truncated inside its first packet.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>

#include "ingest/envisat/asar_aux.h"
#include "ingest/envisat/asar_level0.h"
#include "ingest/envisat/enviextractor.h"
#include "ingest_test_util.h"
#include "product/data_set_info.h"

namespace {

using ingest_test::realData;
using ingest_test::realDataPresent;

class GenuineImHead : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!realDataPresent()) GTEST_SKIP() << "no genuine mission files at " << realData();
    ASSERT_EQ(file.open(level0), 0);
  }
  const std::string level0 = std::string(realData()) +
                             "/envisat/ASA_IM__0CNPDE20120329_071134_000000163113_00121_52721_6279.N1";
  const std::string ins =
      std::string(realData()) + "/envisat_aux/ASA_INS_AXVIEC20091217_114637_20090428_100000_20101231_235959";
  Level0File file;
};

TEST_F(GenuineImHead, ProductHeaders) {
  Level0Header h;
  ASSERT_EQ(read_level0_header(file, &h), 0);
  EXPECT_EQ(h.productName, "ASA_IM__0CNPDE20120329_071134_000000163113_00121_52721_6279.N1");
  EXPECT_EQ(h.orbitNumber, "52721");
  EXPECT_EQ(h.mode, ASAR_IM);
  EXPECT_EQ(h.track, "+1.94011724E+02");
  EXPECT_EQ(h.polarisation, "H/H  ");
  EXPECT_EQ(h.swathName, "IS6");
  EXPECT_EQ(h.records, 28277);
  EXPECT_DOUBLE_EQ(h.startLat, 39729593.0);
  EXPECT_DOUBLE_EQ(h.stopLat, 28548148.0);
  EXPECT_EQ(h.sensingStart, "29-MAR-2012 07:11:34.432893");
  EXPECT_EQ(h.sensingStop, "29-MAR-2012 07:11:50.667893");
  DataSetInfo_Obj info;
  ASSERT_EQ(fill_enviinfo(level0, &info), 0);
  EXPECT_EQ(info.SceneID, h.productName);
  EXPECT_EQ(info.Track, "+1.94011724E+02");
  EXPECT_EQ(info.OrbitConfiguration, "DESCENDING");
}

TEST_F(GenuineImHead, FirstPacketHeadAndTime) {
  const PacketHead h = parse_packet_head(file.data() + kFirstPacketOffset);
  EXPECT_EQ(h.time.days, 4471);
  EXPECT_EQ(h.time.seconds, 25894);
  EXPECT_EQ(h.time.microseconds, 432858);
  EXPECT_EQ(h.applicationId, 1556);
  EXPECT_EQ(h.modeId, 84);
  EXPECT_EQ(h.sequenceCount, 426);
  EXPECT_EQ(h.modeCounter, 16810);
  EXPECT_EQ(h.packetLength, 6791);
  EXPECT_EQ(h.dataBytes(), 6762);
  EXPECT_EQ(h.swathCode, 6);
  EXPECT_TRUE(h.isEcho());
  EXPECT_EQ(h.cyclePacket, 321);  // (16810 - 105) mod 1024
  EXPECT_EQ(h.priCode, 11028);
  EXPECT_EQ(h.swstCode, 1232);
  EXPECT_EQ(h.swlCode, 6656);
  EXPECT_EQ(h.pulseLengthCode, 496);
  EXPECT_EQ(h.chirpBandCode, 255);
  EXPECT_EQ(checkheader(h, ASAR_IM), 0);
  EXPECT_GE(checkheader(h, ASAR_APH), 8);
  double t0 = 0.0;
  ASSERT_EQ(extract_t0(level0, &t0), 0);
  std::string text;
  sec852ascii(t0, text);
  EXPECT_EQ(text.substr(0, 27), "29-MAR-2012 07:11:34.432858");
  // Two bytes into the packet the next perfect head is the end of the window.
  EXPECT_EQ(synchromdsr(file, kFirstPacketOffset, ASAR_IM), kFirstPacketOffset);
  EXPECT_EQ(synchromdsr(file, kFirstPacketOffset + 2, ASAR_IM), kFirstPacketOffset + 2 + kSyncWindow);
}

TEST_F(GenuineImHead, FirstPassAndDecodedEcho) {
  sarpar par[5];
  int swaths = 0;
  ASSERT_EQ(loadparam(file, ins.c_str(), ASAR_IM, par, &swaths), 0);
  EXPECT_EQ(swaths, 1);
  EXPECT_EQ(par[0].samples, 6656);
  EXPECT_EQ(par[0].swathNumber, 6);
  EXPECT_EQ(par[0].Swath_rank, 11);
  EXPECT_EQ(par[0].SWST_code, 1232);
  EXPECT_DOUBLE_EQ(par[0].prf, 19207680.0 / 11028);
  EXPECT_DOUBLE_EQ(par[0].pulseLength, 496 / 19207680.0);
  EXPECT_NEAR(par[0].chirpBandwidth, 16.0e6, 1.0);
  EXPECT_NEAR(par[0].meanLatitude, 34.1389, 1e-4);
  // The head ends inside the echo: its 98 whole blocks decode into the
  // 8-bit range of the instrument.
  ASSERT_EQ(LUTfbaq_f(ins.c_str(), nullptr, nullptr), 0);
  const int blocks = 98;
  ASSERT_TRUE(file.has(kFirstPacketOffset + kPacketHeadBytes, 64 * blocks));
  std::vector<float> out(2 * 63 * blocks);
  int floats = 0, lines = 0;
  ASSERT_EQ(fbaq_decode84_f(file.data() + kFirstPacketOffset + kPacketHeadBytes, out.data(), 64 * blocks,
                            63 * blocks, 1, &floats, &lines),
            0);
  // The block codes of this echo rise from 11 to 51 and fall back: the
  // decoded power follows them.
  const unsigned char* data = file.data() + kFirstPacketOffset + kPacketHeadBytes;
  double strong = 0.0, weak = 0.0;
  int nStrong = 0, nWeak = 0;
  for (int b = 0; b < blocks; ++b) {
    double power = 0.0;
    for (int k = 0; k < 126; ++k) {
      const float v = out[std::size_t(126 * b + k)];
      ASSERT_TRUE(std::isfinite(v));
      ASSERT_LE(std::fabs(v), 128.0f);
      power += double(v) * v;
    }
    if (data[64 * b] >= 40) strong += power, ++nStrong;
    if (data[64 * b] <= 12) weak += power, ++nWeak;
  }
  ASSERT_GT(nStrong, 0);
  ASSERT_GT(nWeak, 0);
  EXPECT_GT(strong / nStrong, 4.0 * weak / nWeak);
}

TEST_F(GenuineImHead, TruncatedProductEndsWithTheReadFailure) {
  ingest_test::TempFolder tmp;
  ExtractionFiles files{level0, ins, "", {tmp / "raw"}};
  sarpar par[5];
  extconf conf;
  int swaths = 0;
  EXPECT_EQ(envi_extract(files, par, &conf, &swaths), 4);
  EXPECT_FALSE(conf.done);
  enviextractor ex;
  ex.input.ASA_Level0_File = level0;
  ex.input.ASA_INS_File = ins;
  ex.output.OutputRawFile = tmp / "raw";
  EXPECT_EQ(ex.run(), 4);
  EXPECT_EQ(ex.getSwstVector(), nullptr);
}

}  // namespace
