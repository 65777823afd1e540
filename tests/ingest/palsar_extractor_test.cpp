// The PALSAR extractor on genuine CEOS bytes and on its level-1.1 side path.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "ingest/palsar/palsar_extractor.h"
#include "ingest/palsar/palsar_types.h"
#include "ingest_test_util.h"
#include "product/general_sar.h"

using namespace ingest_test;

namespace {

void putBE32(std::string& bytes, std::size_t at, std::uint32_t v) {
  for (int k = 0; k < 4; ++k) bytes[at + std::size_t(k)] = static_cast<char>((v >> (24 - 8 * k)) & 0xFFu);
}

}  // namespace

// A Canadian ERS-1 raw leader passes the level test of a PALSAR leader
// (UNPROCESSED at 1830) but its sensor field holds no PALSAR mode digits.
TEST(PalsarLeaderOnGenuineBytes, RawErsLeaderIsRecognisedAsJaxaFormAndRefused) {
  const std::string leader = std::string(realData()) + "/ers1_ccrs_1996/23390_2925.ldr";
  if (!realDataPresent()) GTEST_SKIP() << "no real data folder at " << realData();
  const PalsarTypes types(leader, leader);
  EXPECT_EQ(types.is_level0(), 1);
  EXPECT_EQ(types.is_ersdac(), 0);
  ATPalExtractor x;
  x.LeaFileName = leader;
  EXPECT_EQ(x.extract_lea10Jaxa(), 1);  // "Acquisition type not supported ..."
  EXPECT_EQ(x.extract_l11(), 1);        // "This is not a PALSAR level 1.1 dataset!"
}

// Level 1.1: the focused samples (big-endian floats closing each record)
// into an azimuth-focused raster with the window start as line prefix.
TEST(PalsarLevel11, FocusedSamplesAreCopiedWithTheirWindowStart) {
  TempFolder dir;
  writeBytes(dir / "l11.lea", blankWith(2700, {{1830, "1.1"}}));
  constexpr int kPixels = 3, kPrefix = 544, kLength = kPrefix + 8 * kPixels;
  std::string image = blankWith(720, {{236, "       2"}});
  for (int line = 0; line < 2; ++line) {
    std::string rec(kLength, '\0');
    putBE32(rec, 8, kLength);
    putBE32(rec, 12, std::uint32_t(line + 7 + 2 * line));  // 7, then 10: a number jumps
    putBE32(rec, 24, kPixels);
    putBE32(rec, 116, 850000u);
    for (int k = 0; k < 2 * kPixels; ++k) {
      const float v = static_cast<float>(line * 10 + k) - 2.5f;
      std::uint32_t bits;
      std::memcpy(&bits, &v, sizeof bits);
      putBE32(rec, std::size_t(kPrefix + 4 * k), bits);
    }
    image += rec;
  }
  writeBytes(dir / "l11.img", image);
  ATPalExtractor x;
  x.LeaFileName = dir / "l11.lea";
  x.RawDataName = dir / "l11.img";
  x.OutputFile = dir / "l11.slc";
  x.Raw_Focused = 1;
  ASSERT_EQ(x.run(), 0);
  GeneralSAR record;
  ASSERT_EQ(record.GSread(dir / "l11.slc.hdr"), 0);
  EXPECT_EQ(record.dataFile.NrOfLinesPerImage, 2);
  EXPECT_EQ(record.dataFile.NrOfPixelsPerLine, kPixels);
  const std::string raster = support::readText(dir / "l11.slc");
  ASSERT_EQ(raster.size(), 2u * (4 + 8 * kPixels));
  float row[1 + 2 * kPixels];
  std::memcpy(row, raster.data() + 4 + 8 * kPixels, sizeof row);
  EXPECT_FLOAT_EQ(row[0], static_cast<float>(2.0 * 850000.0 / 299792458.0));
  EXPECT_FLOAT_EQ(row[1], 7.5f);
  EXPECT_FLOAT_EQ(row[6], 12.5f);
  EXPECT_NEAR(record.roi.roi.FastStartTime, 2.0 * 850000.0 / 299792458.0, 1e-12);
}
