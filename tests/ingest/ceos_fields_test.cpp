#include "ingest/ceos/ceos_fields.h"

#include <gtest/gtest.h>

#include <cstring>

namespace {

double f1(const char* s) { return FtoDouble(s, static_cast<int>(std::strlen(s))); }
double f2(const char* s) { return FtoDouble2(s, static_cast<int>(std::strlen(s))); }
int i1(const char* s) { return ch2int(s, static_cast<int>(std::strlen(s))); }

}  // namespace

TEST(CeosFields, FixedPointDecimals) {
  EXPECT_DOUBLE_EQ(f1("      18.9624680"), 18.962468);
  EXPECT_DOUBLE_EQ(f1("    1679.9020000"), 1679.902);
  EXPECT_DOUBLE_EQ(f1("      -0.2580000"), -0.258);
  EXPECT_DOUBLE_EQ(f1("-9999999.9999999"), -9999999.9999999);
  EXPECT_DOUBLE_EQ(f1("   5.300"), 5.3);
  // Blanks right of the point are skipped; a field without a point is read whole.
  EXPECT_DOUBLE_EQ(f1("  12.3 4"), 12.34);
  EXPECT_DOUBLE_EQ(f1("    4711"), 4711.0);
  EXPECT_DOUBLE_EQ(f1("                "), 0.0);
  // Digits left of the point stop at a blank: only the last group counts.
  EXPECT_DOUBLE_EQ(f1("1 23.5"), 23.5);
}

TEST(CeosFields, ExponentForms) {
  EXPECT_DOUBLE_EQ(f2("   2.0889400e+11"), 2.08894e11);
  EXPECT_DOUBLE_EQ(f2(" 3.584641700000000E+04"), 35846.417);
  EXPECT_DOUBLE_EQ(f2("-4.821344100000000E+02"), -482.13441);
  EXPECT_DOUBLE_EQ(f2(" 4.167000000000000E+00"), 4.167);
  EXPECT_DOUBLE_EQ(f2("   1.5000000E-03"), 1.5e-3);
  // Any sign other than '+' divides.
  EXPECT_DOUBLE_EQ(f2("2.5E 2"), 0.025);
  EXPECT_DOUBLE_EQ(f2("  7.25"), 7.25);
}

TEST(CeosFields, RightAlignedIntegers) {
  EXPECT_EQ(i1("028000"), 28000);
  EXPECT_EQ(i1("00005616"), 5616);
  EXPECT_EQ(i1("  17"), 17);
  EXPECT_EQ(i1("12 34"), 34);  // read back to the first blank
  EXPECT_EQ(i1("   -5"), -5);
  EXPECT_EQ(i1("    "), 0);
  EXPECT_EQ(ceosText("ab\0cd", 5), "ab");
}
