#include "core/azimuth_block.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include <unistd.h>

#include "support/files.h"
#include "support/scenes.h"
#include "core/azimuth_focus.h"
#include "core/fft.h"

#ifdef _OPENMP
#include <omp.h>
#endif

namespace {

using support::compressed::Geometry;
using support::compressed::kC;
using support::compressed::kPi;

// A small two-target scene: 2400 lines in blocks of 2048 (the last block
// 1752 lines), 256 samples in sub-blocks of 128.
struct SmallScene {
  Geometry g;
  AzimuthFocusFiles files;
  AzimuthFocusScene scene;
  AzimuthFocusConf conf;
  std::vector<fcomplex> raw;
  SmallScene() {
    g.samples = 256;
    g.lines = 2400;
    g.dc = 250.0;
    files.frg_hz = g.frg;
    files.fc_hz = g.fc;
    files.prf_hz = g.prf;
    files.FastStartTime = g.fastStart();
    files.bandwidth_hz = g.B;
    scene.samples = g.samples;
    scene.lines = g.lines;
    const double tref = g.fastStart() + 128 / g.frg;
    scene.polyDC[0] = g.dc;
    scene.polyDC[7] = tref;
    g.ratePoly(tref, scene.polyFR[0], scene.polyFR[1], scene.polyFR[4]);
    scene.polyFR[7] = tref;
    conf.AntennaLength = g.La;
    conf.WhiteningFlag = 1;
    conf.AzimuthWindowHammingParameter = 0.54;
    conf.AzimuthLookBandwidth = 0.8 * g.prf;
    conf.AzimuthTransitionBandwidth = 0.8 * g.prf;
    conf.SamplesInBlock = 128;
    conf.LinesInBlock = 2048;
    conf.RangeOverlap = 16;
    conf.AzimuthOverlap = 700;
    conf.ApplyAzShift = g.lines;
    const double slant = g.nearRange + 100 * kC / (2.0 * g.frg);
    raw = support::compressed::simulate(g, {{0.9, slant, 1.0}, {1.2, slant + 700.0, 0.5}});
  }
};

TEST(AzimuthFoc, FileAndInCoreFormsAgreeAndThreadsDoNotChangeBits) {
  SmallScene s;
  // A budget below what a block needs: the file form holds each block as a
  // strip of one sub-block's columns, the in-core form holds it whole.
  s.conf.Memory = 1;
  const std::string dir = support::scratchDir("forms");
  s.files.input = dir + "/in.rgfoc";
  s.files.output = dir + "/out";
  {
    std::ofstream f(s.files.input, std::ios::binary);
    f.write(reinterpret_cast<const char*>(s.raw.data()),
            static_cast<std::streamsize>(s.raw.size() * sizeof(fcomplex)));
  }
#ifdef _OPENMP
  const int threads = omp_get_max_threads();
  omp_set_num_threads(1);
#endif
  AzimuthFocusScene fileScene = s.scene;
  // A strip writes rows of its block while other columns of it are still
  // to be read: it never writes over its input, even where it may.
  s.files.overwriteInput = true;
  ASSERT_EQ(azimuthfoc(s.files, fileScene, s.conf), 0);
  EXPECT_EQ(std::filesystem::file_size(s.files.input), s.raw.size() * sizeof(fcomplex));
#ifdef _OPENMP
  omp_set_num_threads(std::max(2, threads));
#endif
  AzimuthFocusScene coreScene = s.scene;
  std::vector<fcomplex> buf = s.raw;
  coreScene.inCore = 1;
  coreScene.buffer = buf.data();
  ASSERT_EQ(azimuthfoc(s.files, coreScene, s.conf), 0);
#ifdef _OPENMP
  omp_set_num_threads(threads);
#endif
  EXPECT_EQ(fileScene.outLines, 1000);
  EXPECT_EQ(fileScene.outSamples, 224);
  EXPECT_EQ(coreScene.outLines, 1000);
  EXPECT_DOUBLE_EQ(fileScene.firstLineTime, coreScene.firstLineTime);
  // ApplyRgShift 0: no range shift.
  EXPECT_DOUBLE_EQ(fileScene.firstSampleTime, 16 / s.g.frg + s.g.fastStart());
  EXPECT_EQ(fileScene.polyDCOut[0], 250.0);
  EXPECT_EQ(fileScene.polyFROut[7], s.scene.polyFR[7]);
  const std::size_t n = static_cast<std::size_t>(1000) * 224;
  const std::vector<fcomplex> fromFile = support::readComplex(s.files.output);
  ASSERT_EQ(fromFile.size(), n);
  EXPECT_EQ(std::memcmp(fromFile.data(), buf.data(), n * sizeof(fcomplex)), 0);
  // Both targets are focused: their peaks stand far above the clutter-free
  // background.
  float peak = 0.0f;
  for (std::size_t i = 0; i < n; ++i) peak = std::max(peak, std::norm(fromFile[i]));
  EXPECT_GT(peak, 1.0f);

  // A truncated input file fails reading; a missing one is not opened.
  std::filesystem::resize_file(s.files.input, s.raw.size() * sizeof(fcomplex) / 2);
  AzimuthFocusScene bad = s.scene;
  EXPECT_EQ(azimuthfoc(s.files, bad, s.conf), 4);
  s.files.input = dir + "/absent";
  EXPECT_EQ(azimuthfoc(s.files, bad, s.conf), 9);
}

TEST(AzimuthFoc, SceneShorterThanTheOverlapGivesNoRows) {
  SmallScene s;
  s.scene.lines = 1000;
  s.conf.ApplyAzShift = 0.0;
  s.scene.inCore = 1;
  s.scene.buffer = s.raw.data();
  ASSERT_EQ(azimuthfoc(s.files, s.scene, s.conf), 0);
  EXPECT_EQ(s.scene.outLines, 0);
  EXPECT_DOUBLE_EQ(s.scene.firstLineTime, 700 / s.g.prf);
  s.conf.SamplesInBlock = 32;  // sub-block equal to the range overlap
  EXPECT_EQ(azimuthfoc(s.files, s.scene, s.conf), 10);
}

}  // namespace
