// A simulated ERS scene focused through the executable with the GeoTIFF
// step on: the TIFF, KML overlay and ENVI header as GDAL and an XML parser
// see them, the multi-looked amplitude of the focused product (times,
// clutter level, point-target energy), and a host stop during the step.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <memory>

#include "core/stripmlook.h"
#include "product/general_sar.h"
#include "support/files.h"
#include "support/host_run.h"

using namespace support;

namespace {

constexpr int kLook = 5;  // azimuth looks; one in range

SceneDescription pointScene() {
  SceneDescription s = ersScene(4096, 2048, 250.0);
  s.pixelTargets = {{1600.25, 300.5, 0.0, 4.0}, {2300.0, 900.0, 60.0, 4.0}, {2500.75, 1500.25, 0.0, 4.0}};
  return s;
}

// Standard output of a shell command.
std::string commandOutput(const std::string& command) {
  std::string text;
  std::unique_ptr<FILE, int (*)(FILE*)> pipe(popen((command + " 2>&1").c_str(), "r"), pclose);
  if (!pipe) return text;
  char buffer[4096];
  while (std::size_t n = std::fread(buffer, 1, sizeof buffer, pipe.get())) text.append(buffer, n);
  return text;
}

bool haveGdal() { return std::system("command -v gdalinfo > /dev/null 2>&1") == 0; }

double dB(double ratio) { return 10.0 * std::log10(ratio); }

}  // namespace

TEST(ErsProducts, GeoTiffKmlEnviAndMultilookOfAFocusedScene) {
  if (!haveGdal()) GTEST_SKIP() << "gdalinfo not installed (scripts/install-deps.sh installs gdal-bin)";
  TempFolder dir("mlgeo");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(pointScene(), dir.str(), files, error)) << error;
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[18] = "1";
  p[22] = "OK";
  writeJob(dir / "job.txt", p);
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  ASSERT_EQ(run.exitStatus, 0) << run.log << run.stderrText;
  const std::string product = dir / "out_slc";
  const std::string store = product + ".TessivorParameterExtracted";
  GeneralSAR record;
  ASSERT_EQ(record.GSread(store), 0);
  const int L = record.roi.roi.Lines, S = record.roi.roi.Samples;
  ASSERT_GT(L, 1000);
  ASSERT_GT(S, 1000);

  // The TIFF: one grey byte band of the product's size, no map keys for a
  // slant-range image; the header copy beside it.
  const std::string tiff = commandOutput("gdalinfo '" + product + ".tif'");
  EXPECT_TRUE(contains(tiff, "Size is " + std::to_string(S) + ", " + std::to_string(L))) << tiff;
  EXPECT_TRUE(contains(tiff, "Type=Byte, ColorInterp=Gray")) << tiff;
  EXPECT_FALSE(contains(tiff, "Coordinate System is:")) << tiff;
  EXPECT_TRUE(contains(tiff, "Image generated with : ")) << tiff;
  EXPECT_EQ(readText(product + ".tif_hdr"), readText(product + "_hdr"));

  // The KML overlay: its box holds the product's corners.
  const std::string box = commandOutput(
      "python3 -c \"import sys, xml.etree.ElementTree as E; ns = {'k': 'http://earth.google.com/kml/2.0'}; "
      "b = E.parse(sys.argv[1]).getroot().find('k:GroundOverlay/k:LatLonBox', ns); "
      "print(*[b.find('k:' + t, ns).text for t in ('north', 'south', 'east', 'west')])\" '" +
      product + ".kml'");
  double north = 0, south = 0, east = 0, west = 0;
  ASSERT_EQ(std::sscanf(box.c_str(), "%lf %lf %lf %lf", &north, &south, &east, &west), 4) << box;
  for (const geopoint* g : {&record.geoCoords.NW, &record.geoCoords.NE, &record.geoCoords.SW,
                            &record.geoCoords.SE}) {
    EXPECT_LE(g->lat, north + 1e-7);
    EXPECT_GE(g->lat, south - 1e-7);
    EXPECT_LE(g->lon, east + 1e-7);
    EXPECT_GE(g->lon, west - 1e-7);
  }
  EXPECT_LT(north - south, 1.0);

  // The ENVI header: GDAL reads the complex raster with its size, type and
  // byte order (a pixel's value as the file holds it).
  const std::string envi = commandOutput("gdalinfo '" + product + "'");
  EXPECT_TRUE(contains(envi, "Driver: ENVI/")) << envi;
  EXPECT_TRUE(contains(envi, "Size is " + std::to_string(S) + ", " + std::to_string(L))) << envi;
  EXPECT_TRUE(contains(envi, "Type=CFloat32")) << envi;
  const std::vector<fcomplex> slc = readValues<fcomplex>(product);
  ASSERT_EQ(slc.size(), std::size_t(L) * S);
  const fcomplex probe = slc[std::size_t(L / 2) * S + S / 3];
  const std::string value = commandOutput("gdallocationinfo -valonly '" + product + "' " +
                                          std::to_string(S / 3) + " " + std::to_string(L / 2));
  double re = 0, im = 0;
  ASSERT_EQ(std::sscanf(value.c_str(), "%lf%lfi", &re, &im), 2) << value;
  EXPECT_NEAR(re, probe.real(), 1e-3 * std::abs(probe));
  EXPECT_NEAR(im, probe.imag(), 1e-3 * std::abs(probe));

  // Multi-looking by 5 in azimuth and 1 in range.
  const std::string input = dir / "look";
  fs::create_symlink(product, input);
  fs::copy_file(store, input + ".hdr");
  ATstripmlook ml;
  ml.SLCInput = input;
  ml.outputFullRootName = dir / "look_mla";
  ml.AzimuthMLFactor = kLook;
  ml.RangeMLFactor = 1;
  ASSERT_EQ(ml.readSLCData(), 0);
  ASSERT_EQ(ml.run(), 0);
  GeneralSAR looked;
  ASSERT_EQ(looked.GSread(dir / "look_mla.hdr"), 0);
  const ROI_Obj& in = record.roi.roi;
  const ROI_Obj& out = looked.roi.roi;
  const int OL = L / kLook + 1, OS = S + 1;
  EXPECT_EQ(looked.dataFile.NrOfLinesPerImage, OL);
  EXPECT_EQ(looked.dataFile.NrOfPixelsPerLine, OS);
  EXPECT_EQ(looked.dataFile.CellType, FLOAT32);
  EXPECT_NEAR(out.SlowStartTime, in.SlowStartTime + 2 * in.SlowTimeDelta, 1e-6);
  EXPECT_NEAR(out.SlowTimeDelta, kLook * in.SlowTimeDelta, 1e-15);
  EXPECT_DOUBLE_EQ(out.FastStartTime, in.FastStartTime);
  EXPECT_DOUBLE_EQ(out.FastTimeDelta, in.FastTimeDelta);
  EXPECT_NEAR(out.SlowTimeLength, OL * out.SlowTimeDelta, 1e-9);
  ASSERT_EQ(fs::file_size(dir / "look_mla"), std::uintmax_t(OL) * OS * 4u);
  const std::vector<float> amp = readValues<float>(dir / "look_mla");

  auto slcPower = [&](int l0, int l1, int s0, int s1) {
    double e = 0.0;
    for (int l = l0; l < l1; ++l)
      for (int s = s0; s < s1; ++s) e += std::norm(slc[std::size_t(l) * S + s]);
    return e;
  };
  // Energy of the multi-looked cells over the same SLC lines and samples.
  auto lookedPower = [&](int l0, int l1, int s0, int s1) {
    double e = 0.0;
    for (int o = l0 / kLook; o < l1 / kLook; ++o)
      for (int s = s0; s < s1; ++s) e += double(amp[std::size_t(o) * OS + s]) * amp[std::size_t(o) * OS + s];
    return e * kLook;
  };

  // Brightest pixel of the product: the strongest target.
  std::size_t peak = 0;
  for (std::size_t k = 0; k < slc.size(); ++k)
    if (std::norm(slc[k]) > std::norm(slc[peak])) peak = k;
  const int pl = int(peak / S), ps = int(peak % S);

  // Clutter: blocks of 200 lines x 128 samples away from the targets. The
  // simulated clutter itself varies by about 0.4 dB between such blocks, so
  // flatness is measured against the single-look image: the look level of
  // every block follows the single-look level within 0.2 dB.
  std::vector<double> levels;
  for (int l0 = 0; l0 + 200 <= L; l0 += 200)
    for (int s0 = 64; s0 + 160 <= S; s0 += 128) {
      double strongest = 0.0;
      for (int l = l0; l < l0 + 200; ++l)
        for (int s = s0 - 32; s < s0 + 160; ++s)  // with a margin: interpolation reaches across
          strongest = std::max(strongest, double(std::norm(slc[std::size_t(l) * S + s])));
      const double single = slcPower(l0, l0 + 200, s0, s0 + 128);
      if (strongest > 50.0 * single / (200 * 128)) continue;  // a target's response
      const double ratio = dB(lookedPower(l0, l0 + 200, s0, s0 + 128) / single);
      EXPECT_NEAR(ratio, 0.0, 0.2) << "block at line " << l0 << ", sample " << s0;
      levels.push_back(lookedPower(l0, l0 + 200, s0, s0 + 128) / (200 * 128));
    }
  ASSERT_GT(levels.size(), 20u);
  std::sort(levels.begin(), levels.end());
  const double clutter = levels[levels.size() / 2];

  // The strongest target's energy, clutter removed, is kept within 0.1 dB.
  const int l0 = (pl - 60) / kLook * kLook, l1 = l0 + 120, s0 = ps - 24, s1 = ps + 25;
  ASSERT_GE(l0, 0);
  ASSERT_LE(l1, L);
  const double cells = double(l1 - l0) * (s1 - s0);
  const double single = slcPower(l0, l1, s0, s1) - clutter * cells;
  const double multi = lookedPower(l0, l1, s0, s1) - clutter * cells;
  EXPECT_GT(single, clutter * cells) << "the target should dominate its window";
  EXPECT_NEAR(dB(multi / single), 0.0, 0.1);
}

TEST(ErsProducts, HostStopDuringGeoTiffStepEndsWith326400) {
  TempFolder dir("tiffstop");
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(pointScene(), dir.str(), files, error)) << error;
  std::vector<std::string> p = ersJob(files, dir / "out");
  p[22] = "OK";
  writeJob(dir / "job.txt", p);
  bool written = false;
  // The description header is exported just before the GeoTIFF step; the
  // host stops the run as soon as it is there.
  RunOptions host;
  host.hook = [&](const RunningFocuser& running) {
    if (written || !fs::exists(dir / "out_slc_hdr")) return;
    writeText(running.folder + "progress.txt", "101\nstop\n");
    written = true;
  };
  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt", host);
  ASSERT_TRUE(written) << run.trace;
  EXPECT_EQ(run.exitStatus, EC_INTERRUPTED & 0xFF);
  EXPECT_EQ(run.errorCode, 326400) << run.errorFile;
  EXPECT_TRUE(contains(run.trace, "\n EXECUTION INTERRUPTED BY OPERATOR\n")) << run.trace;
  EXPECT_TRUE(fs::exists(dir / "out_slc"));
  EXPECT_FALSE(fs::exists(dir / "out_slc.kml"));
}
