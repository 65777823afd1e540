// Doppler centroid driver: the whole estimate on synthetic clutter, the bin
// scan, the contrast map, the resume file and the failure statuses.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "doppler/dc_driver.h"
#include "support/files.h"
#include "support/scenes.h"
#include "product/profile.h"

using namespace support::clutter;
using support::scratchDir;

namespace {

double readDouble(const std::string& sec, const std::string& key, const std::string& file) {
  std::vector<double> v;
  EXPECT_EQ(GetMyProfileDoubleArray(sec, key, v, 1, file), 0) << sec << "/" << key;
  return v.empty() ? std::nan("") : v[0];
}

bool hasKey(const std::string& sec, const std::string& key, const std::string& file) {
  std::string s;
  return GetMyProfileString(sec, key, s, file) == 0;
}

// Largest wrapped difference between the estimated and the true centroid
// over a grid of the image, PRF units.
double worstFractionalError(const double poly[7], const Radar& rd, const Centroid& dc, int samples,
                            int lines) {
  double worst = 0.0;
  for (int i = 0; i <= 16; ++i)
    for (int j = 0; j <= 16; ++j) {
      const double r = samples * i / 16.0, l = lines * j / 16.0;
      worst = std::max(worst, std::fabs(wrapHalf(polyPrf(poly, rd, r, l) - dc.at(r, l))));
    }
  return worst;
}

}  // namespace

TEST(DcDriver, FractionalCentroidVaryingInRangeAndAzimuth) {
  const Radar rd;
  const int ns = 512, nl = 4096;
  const std::string dir = scratchDir("frac");
  // Second case crosses the wrap at 1/2 and comes from a big-endian file.
  const Centroid cases[] = {{0.18, 0.15 / ns, 0.10 / nl}, {0.62, -0.2 / ns, 0.08 / nl}};
  for (int c = 0; c < 2; ++c) {
    SCOPED_TRACE(c);
    const Centroid& dc = cases[c];
    const std::string path = dir + "/scene" + std::to_string(c) + ".rgfoc";
    ASSERT_TRUE(writeRaster(path, makeVaryingClutter(rd, dc, ns, nl, 10.0, 11 + c), c));
    DcEstState st = ersState(rd);
    DcEstInput in = inputFor(rd, path, dir, ns, nl);
    in.byteOrder = c;
    in.timeOrigin = 5.5e-3;
    double poly[7] = {};
    ASSERT_EQ(getnadcpoly(in, st, poly), 0);
    EXPECT_EQ(st.ambiguity, 0);
    EXPECT_EQ(st.nBins, (ns / 64) * (nl / 256));
    EXPECT_LT(worstFractionalError(poly, rd, dc, ns, nl), 0.02);

    // The resume file reads back with the same numbers.
    const std::string resume = dir + "/DCEST_resume.txt";
    ASSERT_TRUE(std::filesystem::exists(resume));
    const char* keys[7] = {"Constant_term_Hz", "Rg_Hz/s",       "Az_Hz/s",       "RgAz_Hz/s",
                           "RgRgz_Hz/s",       "RgRgRg_Hz/s",   "RgRgRgRg_Hz/s"};
    for (int i = 0; i < 7; ++i)
      EXPECT_NEAR(readDouble("Estimated_polynomial", keys[i], resume), poly[i],
                  1e-12 * std::fabs(poly[i]) + 1e-300)
          << keys[i];
    EXPECT_EQ(readDouble("Estimated_polynomial", "Estimated_ambiguity", resume), 0.0);
    EXPECT_DOUBLE_EQ(readDouble("Estimated_polynomial", "DC_time_origin_s", resume), 5.5e-3);
    EXPECT_EQ(readDouble("Processing_parameters", "Record_used", resume), nl);
    EXPECT_EQ(readDouble("Processing_parameters", "Samples_in_record", resume), ns);
    EXPECT_EQ(readDouble("Processing_parameters", "Total_bins_scanned", resume), 128);
    EXPECT_EQ(readDouble("Processing_parameters", "Record_in_bins", resume), 256);
    EXPECT_EQ(readDouble("Processing_parameters", "Samples_in_bins", resume), 64);
    EXPECT_EQ(readDouble("Processing_parameters", "PRF", resume), 1680.0);
    EXPECT_EQ(readDouble("Processing_parameters", "Sampling_rate", resume), 18.96e6);
    EXPECT_EQ(readDouble("Processing_parameters", "Platform_velocity", resume), 7100.0);
    std::string s;
    ASSERT_EQ(GetMyProfileString("Input_image_file", "File", s, resume), 0);
    EXPECT_EQ(s, path);
    ASSERT_EQ(GetMyProfileString("Ambiguous_polynomial_estimation", "Legend", s, resume), 0);
    EXPECT_EQ(s, "Bin Range Line DC_wrapped Residual SNR Contrast");
    std::vector<double> row;
    ASSERT_EQ(GetMyProfileDoubleArray("Ambiguous_polynomial_estimation", "Bin_9", row, 7, resume), 0);
    EXPECT_EQ(row[0], 9.0);
    EXPECT_EQ(row[1], 64 + 32);   // second bin of the second row
    EXPECT_EQ(row[2], 256 + 128);
    EXPECT_NEAR(row[3], st.bins[9].dcWrapped, 1e-12);
    EXPECT_TRUE(hasKey("Ambiguous_polynomial_estimation", "Bin_127", resume));
    EXPECT_FALSE(hasKey("Ambiguous_polynomial_estimation", "Bin_128", resume));
    // No data-driven ambiguity: no estimator sections, empty block lists.
    EXPECT_FALSE(hasKey("MLBF_ambiguity_estimation", "MLBF_bins_processed", resume));
    EXPECT_FALSE(hasKey("GEOM_ambiguity_estimation", "Geometry_estimated_ambiguity", resume));
    EXPECT_TRUE(hasKey("MBLF_Ambiguity_estimation", "Legend", resume));
    EXPECT_FALSE(hasKey("MBLF_Ambiguity_estimation", "MLBF_bin_0", resume));
    EXPECT_TRUE(hasKey("WDAR_Ambiguity_estimation", "Legend", resume));
    FreeProfile(resume);
  }
}

TEST(DcDriver, BinRejectsUncorrelatedAndEmptyBlocks) {
  DcEstState st = ersState(Radar{});
  st.blocks = 4;
  st.blockl = 8;
  st.r0 = 2.0 / 3.0;
  st.r1 = 0.25;
  // A pure tone along azimuth: |R| / blocks = 7, power 8, ratio < sThr.
  std::vector<fcomplex> block(32);
  for (int l = 0; l < 8; ++l)
    for (int s = 0; s < 4; ++s)
      block[size_t(l) * 4 + s] = std::polar(1.0f, float(2.0 * std::numbers::pi * 0.125 * l));
  DcBin b;
  dcBinEstimate(block.data(), st, b);
  EXPECT_EQ(b.valid, 1);
  EXPECT_NEAR(b.dcWrapped, 0.125, 1e-6);
  EXPECT_NEAR(b.power, 8.0, 1e-6);
  EXPECT_NEAR(b.contrast, 1.0, 1e-6);  // constant modulus
  EXPECT_NEAR(b.noise, 8.0 - (2.0 / 3.0) / 0.25 * 7.0, 1e-5);
  // Alternating signs of equal weight cancel the lag-one sum: rejected.
  for (int l = 0; l < 8; ++l)
    for (int s = 0; s < 4; ++s) block[size_t(l) * 4 + s] = float(((l / 2) % 2) ? 1 : -1) * (s < 2 ? 1.0f : 0.0f);
  st.sThr = 1.5;  // power 4 over |R| / blocks = 0.5: rejected
  dcBinEstimate(block.data(), st, b);
  EXPECT_EQ(b.valid, 0);
  std::fill(block.begin(), block.end(), fcomplex{});
  dcBinEstimate(block.data(), st, b);
  EXPECT_EQ(b.valid, 0);
}

TEST(DcDriver, FailuresEndWithTheirStatuses) {
  const Radar rd;
  const std::string dir = scratchDir("fail");
  double poly[7];
  auto run = [&](const std::vector<fcomplex>& data, int ns, int nl, DcEstState st) {
    const std::string path = dir + "/r";
    EXPECT_TRUE(writeRaster(path, data));
    DcEstInput in = inputFor(rd, path, dir, ns, nl);
    return getnadcpoly(in, st, poly);
  };
  const Centroid dc{0.2, 0.0, 0.0};
  // Six bins: too few for the fit.
  EXPECT_EQ(run(makeVaryingClutter(rd, dc, 128, 768, 10.0, 5), 128, 768, ersState(rd)), 1);
  // Narrower than a block: no bin.
  EXPECT_EQ(run(makeVaryingClutter(rd, dc, 32, 1024, 10.0, 5), 32, 1024, ersState(rd)), 1);
  // Shorter than a block: no bin.
  EXPECT_EQ(run(makeVaryingClutter(rd, dc, 512, 200, 10.0, 5), 512, 200, ersState(rd)), 1);
  // All zero: every bin invalid.
  EXPECT_EQ(run(std::vector<fcomplex>(512 * 1024), 512, 1024, ersState(rd)), 1);
  // Blockl not a multiple of Patchl, Blocks not a multiple of Patchs.
  DcEstState bad = ersState(rd);
  bad.patchl = 30;
  EXPECT_EQ(run(std::vector<fcomplex>(512 * 1024), 512, 1024, bad), 10);
  bad = ersState(rd);
  bad.patchs = 5;
  EXPECT_EQ(run(std::vector<fcomplex>(512 * 1024), 512, 1024, bad), 10);
  // Memory below one bin row.
  bad = ersState(rd);
  bad.memory = 512 * 256 * 8 - 1;
  EXPECT_EQ(run(std::vector<fcomplex>(512 * 1024), 512, 1024, bad), 1);
  // Raster shorter than its stated size: the read fails.
  EXPECT_EQ(run(std::vector<fcomplex>(512 * 1000), 512, 1024, ersState(rd)), 4);
  // Missing raster.
  {
    DcEstState st = ersState(rd);
    DcEstInput in = inputFor(rd, dir + "/absent", dir, 512, 1024);
    EXPECT_EQ(getnadcpoly(in, st, poly), 9);
  }
  // Resume folder missing.
  {
    const std::string path = dir + "/ok";
    ASSERT_TRUE(writeRaster(path, makeVaryingClutter(rd, dc, 512, 1024, 10.0, 6)));
    DcEstState st = ersState(rd);
    DcEstInput in = inputFor(rd, path, dir + "/no/such/dir", 512, 1024);
    EXPECT_EQ(getnadcpoly(in, st, poly), 9);
  }
}
