#include "product/time_base.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

#include "product/byte_order.h"

namespace {

std::string fmt(double t) {
  std::string s;
  EXPECT_EQ(sec852myascii(t, s), 0);
  return s;
}

TEST(TimeBase, EpochAndKnownDates) {
  EXPECT_EQ(fmt(0.0), "01-JAN-1985 00:00:00.000000");
  char buf[kDateTextSize];
  ASSERT_EQ(sec852ascii(0.0, buf), 0);
  EXPECT_STREQ(buf, "01-JAN-1985 00:00:00.000000");
  EXPECT_EQ(sec852myascii(-1.0, buf), -1);

  EXPECT_DOUBLE_EQ(ascii2sec85("01-JAN-1985 00:00:00.000000"), 0.0);
  EXPECT_DOUBLE_EQ(ascii2sec85("1-JAN-1985"), 0.0);
  // 1985..1999: 15 years with 1988, 1992, 1996 as leap years.
  EXPECT_DOUBLE_EQ(ascii2sec85("01-JAN-2000 00:00:00.000000"), 5478.0 * 86400.0);
  // 2000 is a leap year (divisible by 400), 1900-type years are not.
  EXPECT_DOUBLE_EQ(ascii2sec85("01-MAR-2000 00:00:00") - ascii2sec85("28-FEB-2000 00:00:00"),
                   2 * 86400.0);
  EXPECT_DOUBLE_EQ(ascii2sec85("01-MAR-1999 00:00:00") - ascii2sec85("28-FEB-1999 00:00:00"),
                   86400.0);
  EXPECT_DOUBLE_EQ(ascii2sec85("01-MAR-2100 00:00:00") - ascii2sec85("28-FEB-2100 00:00:00"),
                   86400.0);
  EXPECT_TRUE(isLeapYear(1988));
  EXPECT_TRUE(isLeapYear(2000));
  EXPECT_FALSE(isLeapYear(1900));
  EXPECT_FALSE(isLeapYear(2006));
  // Before the epoch the value is negative.
  EXPECT_DOUBLE_EQ(ascii2sec85("31-DEC-1984 23:59:59.000"), -1.0);
  // Independent reference: Unix time of 17-FEB-2000 09:57:26 is 950781446,
  // and 01-JAN-1985 is Unix 473385600.
  EXPECT_DOUBLE_EQ(ascii2sec85("17-FEB-2000 09:57:26.417"), 950781446.0 - 473385600.0 + 0.417);
}

TEST(TimeBase, ParserSkipsPrefixesAndBlanks) {
  const double ref = ascii2sec85("17-FEB-2000 09:57:26.417");
  // Leader fields with a blank instead of a leading zero.
  EXPECT_DOUBLE_EQ(ascii2sec85("17-FEB-2000  9:57:26.417"), ref);
  EXPECT_NEAR(ascii2sec85("17-FEB-2000  9:44: 3.8049"),
              ascii2sec85("17-FEB-2000 09:44:03.000") + 0.8049, 1e-6);
  // A header value with its key delimiters in front.
  EXPECT_NEAR(ascii2sec85("=\"29-MAR-2012 07:11:34.432893\""),
              ascii2sec85("29-MAR-2012 07:11:34") + 0.432893, 1e-7);
  EXPECT_DOUBLE_EQ(ascii2sec85("SENSING_START=\"17-feb-2000 09:57:26.417\""), ref);

  testing::internal::CaptureStderr();
  EXPECT_EQ(ascii2sec85("nothing here"), 0.0);
  EXPECT_EQ(ascii2sec85("30-FEB-2001 00:00:00"), 0.0);
  EXPECT_EQ(ascii2sec85("12-XYZ-2001 00:00:00"), 0.0);
  EXPECT_EQ(ascii2sec85("12-JAN-2001 25:00:00"), 0.0);
  const std::string err = testing::internal::GetCapturedStderr();
  EXPECT_NE(err.find("Error: incorrect date format, code "), std::string::npos);
}

TEST(TimeBase, RoundTripToTheMicrosecond) {
  const std::vector<std::string> dates = {
      "01-JAN-1985 00:00:00.000001", "29-FEB-1988 23:59:59.999999", "31-DEC-1999 23:59:59.999999",
      "01-JAN-2000 00:00:00.000000", "29-FEB-2000 12:00:00.500000", "01-MAR-2000 00:00:00.000001",
      "31-DEC-2004 06:07:08.123456", "28-FEB-2100 23:59:59.999999", "01-MAR-2100 00:00:00.000000",
      "29-MAR-2012 07:11:34.432893", "17-FEB-2000 09:57:26.417000", "18-JAN-2010 17:49:46.066000"};
  for (const auto& d : dates) {
    const double t = ascii2sec85(d);
    EXPECT_EQ(fmt(t), d);
    const mjd m = sec852mjd(t);
    EXPECT_NEAR(mjd2sec85(m), t, 0.5e-6) << d;
    EXPECT_EQ(fmt(mjd2sec85(m)), d);
    EXPECT_GE(m.seconds, 0);
    EXPECT_LT(m.seconds, 86400);
    EXPECT_GE(m.microseconds, 0);
    EXPECT_LT(m.microseconds, 1000000);
  }
  // MJD2000 reference values: day 0 is 01-JAN-2000, negative days before it.
  EXPECT_EQ(fmt(mjd2sec85(mjd{0, 0, 0})), "01-JAN-2000 00:00:00.000000");
  EXPECT_EQ(fmt(mjd2sec85(mjd{-1, 86399, 999999})), "31-DEC-1999 23:59:59.999999");
  // 29-MAR-2012 is MJD 56015, i.e. MJD2000 day 56015 - 51544 = 4471.
  const mjd m = sec852mjd(ascii2sec85("29-MAR-2012 07:11:34.432893"));
  EXPECT_EQ(m.days, 4471);
  EXPECT_EQ(m.seconds, 7 * 3600 + 11 * 60 + 34);
  EXPECT_EQ(m.microseconds, 432893);
  // Rounding of the last digit carries into the seconds.
  EXPECT_EQ(fmt(59.9999996), "01-JAN-1985 00:01:00.000000");
}

TEST(TimeBase, RealErsLeaderTimes) {
  const std::string path = TESSIVOR_REALDATA_DIR "/ers1_2000_orbit44928/lea_01.001";
  std::ifstream in(path, std::ios::binary);
  if (!in) GTEST_SKIP() << "real data folder absent";
  std::vector<char> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  ASSERT_GT(bytes.size(), 2606u);
  const std::string first(&bytes[2534], 24), last(&bytes[2582], 24);
  EXPECT_EQ(first, "17-FEB-2000 09:57:26.417");
  const double t0 = ascii2sec85(first), t1 = ascii2sec85(last);
  EXPECT_EQ(fmt(t0), "17-FEB-2000 09:57:26.417000");
  EXPECT_NEAR(t1 - t0, 16.667, 1e-6);
}

TEST(TimeBase, RealAsarMainHeaderTimes) {
  const std::string path = TESSIVOR_REALDATA_DIR
      "/envisat/ASA_IM__0CNPDE20120329_071134_000000163113_00121_52721_6279.N1";
  std::ifstream in(path, std::ios::binary);
  if (!in) GTEST_SKIP() << "real data folder absent";
  // SENSING_START value with its '="' in front, 27 bytes at offset 349, and
  // SENSING_STOP 16 bytes further on.
  char start[28] = {}, stop[28] = {};
  in.seekg(349);
  in.read(start, 27);
  in.seekg(349 + 27 + 16);
  in.read(stop, 27);
  ASSERT_TRUE(in);
  EXPECT_EQ(std::string(start, 2), "=\"");
  const double t0 = ascii2sec85(start);
  const double t1 = ascii2sec85(stop);
  EXPECT_NEAR(t0, ascii2sec85("29-MAR-2012 07:11:34.000000") + 0.4328, 1e-6);
  EXPECT_NEAR(t1 - t0, 16.235, 1e-6);  // 07:11:50.6678 - 07:11:34.4328
}

}  // namespace
