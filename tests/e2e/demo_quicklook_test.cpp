// The demo as a user runs it: its PNG quicklook of the multi-looked scene
// shows the five simulated targets where the truth puts them, as the
// brightest pixels of their neighbourhoods, on clutter.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>

#include "product/general_sar.h"
#include "sim/raw_scene.h"
#include "support/files.h"

using namespace support;

TEST(Demo, QuicklookShowsTheFiveTargetsOnClutter) {
  if (std::system("command -v gdal_translate > /dev/null 2>&1") != 0)
    GTEST_SKIP() << "gdal_translate not installed (scripts/install-deps.sh installs gdal-bin)";
  TempFolder dir("demo");
  const std::string demo = dir / "demo";
  const std::string command = "bash '" TESSIVOR_SOURCE_DIR "/scripts/demo.sh' '" TESSIVOR_BINARY_DIR "' '" +
                              demo + "' > '" + (dir / "demo.txt") + "' 2>&1";
  ASSERT_EQ(std::system(command.c_str()), 0) << readText(dir / "demo.txt");
  const std::string output = readText(dir / "demo.txt");
  const std::string quicklook = demo + "/demo_quicklook.png";
  ASSERT_TRUE(contains(output, "PNG quicklook      " + quicklook)) << output;

  // The quicklook's bytes, through GDAL, and the grid of the multi-looked product.
  GeneralSAR record;
  ASSERT_EQ(record.GSread(demo + "/work/demo_mla.hdr"), 0);
  const ROI_Obj& roi = record.roi.roi;
  const int W = roi.Samples, H = roi.Lines;
  // The chain's looks: 4 in range; in azimuth 4 times the rounded ratio of
  // ground-range to azimuth spacing (20 for ERS).
  GeneralSAR slc;
  ASSERT_EQ(slc.GSread(demo + "/work/demo_slc.TessivorParameterExtracted"), 0);
  const ROI_Obj& single = slc.roi.roi;
  const double ground = single.FastTimeDelta * 149896229.0 / std::sin(slc.geoCoords.center.incidence * M_PI / 180.0);
  const int looks = 4 * int(std::lround(ground / (single.SlowTimeDelta * slc.attitude.Eq_speed)));
  EXPECT_EQ(looks, 20);
  EXPECT_NEAR(roi.FastTimeDelta, 4.0 * single.FastTimeDelta, 1e-15);
  EXPECT_NEAR(roi.SlowTimeDelta, looks * single.SlowTimeDelta, 1e-9);
  EXPECT_EQ(H, single.Lines / looks + 1);
  EXPECT_EQ(W, single.Samples / 4 + 1);
  slc.GSdestroy();
  const std::string raw = dir / "quicklook.raw";
  ASSERT_EQ(std::system(("gdal_translate -q -of ENVI '" + quicklook + "' '" + raw + "'").c_str()), 0);
  const std::string bytes = readText(raw);
  ASSERT_EQ(bytes.size(), std::size_t(W) * H);
  auto at = [&](int r, int c) { return static_cast<unsigned char>(bytes[std::size_t(r) * W + c]); };
  std::string sorted = bytes;
  std::nth_element(sorted.begin(), sorted.begin() + sorted.size() / 2, sorted.end(),
                   [](char a, char b) { return static_cast<unsigned char>(a) < static_cast<unsigned char>(b); });
  const int median = static_cast<unsigned char>(sorted[sorted.size() / 2]);
  EXPECT_GT(median, 10) << "clutter should be visible";

  SimIni truth;
  std::string error;
  ASSERT_TRUE(truth.load(demo + "/sim/truth.txt", error)) << error;
  const double offset = truth.getDouble("Scene", "range_peak_offset_samples", 0.0);
  const double fs = truth.getDouble("Scene", "range_sampling_rate_hz", 0.0);
  ASSERT_EQ(truth.getInt("Scene", "targets", 0), 5);
  for (int k = 1; k <= 5; ++k) {
    SCOPED_TRACE("target " + std::to_string(k));
    const std::string section = "Target" + std::to_string(k);
    const double t = truth.getDouble(section, "azimuth_time", 0.0);
    const double tau = truth.getDouble(section, "range_time_s", 0.0) + offset / fs;
    const int r = int(std::lround((t - roi.SlowStartTime) / roi.SlowTimeDelta));
    const int c = int(std::lround((tau - roi.FastStartTime) / roi.FastTimeDelta));
    ASSERT_TRUE(r >= 6 && r < H - 6 && c >= 6 && c < W - 6) << r << " " << c;
    int here = 0, around = 0;
    for (int dr = -1; dr <= 1; ++dr)
      for (int dc = -1; dc <= 1; ++dc) here = std::max(here, int(at(r + dr, c + dc)));
    for (int dr = -6; dr <= 6; ++dr)
      for (int dc = -6; dc <= 6; ++dc) around = std::max(around, int(at(r + dr, c + dc)));
    EXPECT_EQ(here, around) << "brightest pixel of the neighbourhood is not at the target";
    EXPECT_GT(here, 4 * median);
  }
}
