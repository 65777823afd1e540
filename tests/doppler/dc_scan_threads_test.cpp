// Bin scan of the centroid estimator on several threads: the same bins and
// contrast maps, bit for bit, as on one thread; reads in bounded chunks
// whatever the memory budget.
#include <gtest/gtest.h>

#ifdef _OPENMP
#include <omp.h>
#endif

#include <complex>
#include <cstring>
#include <string>
#include <vector>

#include "doppler/dc_driver.h"
#include "support/files.h"
#include "support/scenes.h"

using namespace support::clutter;
using support::scratchDir;

namespace {

DcEstState scan(const Radar& rd, const std::string& path, const std::string& dir, int ns, int nl,
                int threads) {
#ifdef _OPENMP
  const int before = omp_get_max_threads();
  omp_set_num_threads(threads);
#else
  (void)threads;
#endif
  DcEstState st = ersState(rd);
  st.memory = int64_t(ns) * 256 * 8 * 2;  // two bin rows per read
  DcEstInput in = inputFor(rd, path, dir, ns, nl);
  EXPECT_EQ(setprocbuf(in, st), 0);
  EXPECT_EQ(dcTheoreticAutocorrelation(in, st), 0);
  EXPECT_EQ(getnadcbins(in, st), 0);
#ifdef _OPENMP
  omp_set_num_threads(before);
#endif
  return st;
}

bool sameBits(double a, double b) { return std::memcmp(&a, &b, sizeof a) == 0; }

}  // namespace

TEST(DcBinScan, ThreadsGiveTheSameBinsAndContrastAsOneThread) {
  const Radar rd;
  // 7 bins across (the last 40 samples belong to no bin), 5 bin rows.
  const int ns = 7 * 64 + 40, nl = 5 * 256 + 17;
  const std::string dir = scratchDir("scan_threads");
  const std::string path = dir + "/scene.rgfoc";
  ASSERT_TRUE(writeRaster(path, makeVaryingClutter(rd, {0.3, 0.1 / ns, 0.05 / nl}, ns, nl, 10.0, 5)));
  const DcEstState one = scan(rd, path, dir, ns, nl, 1);
  const DcEstState two = scan(rd, path, dir, ns, nl, 2);
  const DcEstState three = scan(rd, path, dir, ns, nl, 3);
  ASSERT_EQ(one.nBins, 35);
  ASSERT_EQ(one.bins.size(), 35u);
  int valid = 0;
  for (const DcEstState* other : {&two, &three}) {
    ASSERT_EQ(other->bins.size(), one.bins.size());
    for (size_t i = 0; i < one.bins.size(); ++i) {
      const DcBin& a = one.bins[i];
      const DcBin& b = other->bins[i];
      EXPECT_EQ(a.range, b.range) << i;
      EXPECT_EQ(a.line, b.line) << i;
      EXPECT_EQ(a.valid, b.valid) << i;
      EXPECT_TRUE(sameBits(a.dcWrapped, b.dcWrapped)) << i;
      EXPECT_TRUE(sameBits(a.contrast, b.contrast)) << i;
      EXPECT_TRUE(sameBits(a.power, b.power)) << i;
      EXPECT_TRUE(sameBits(a.noise, b.noise)) << i;
      valid += a.valid;
    }
    ASSERT_EQ(other->contrastMap.size(), one.contrastMap.size());
    EXPECT_EQ(std::memcmp(other->contrastMap.data(), one.contrastMap.data(),
                          one.contrastMap.size() * sizeof(float)),
              0);
    EXPECT_EQ(std::memcmp(other->contrastPow.data(), one.contrastPow.data(),
                          one.contrastPow.size() * sizeof(float)),
              0);
  }
  EXPECT_GT(valid, 0);
  // Bin centres in scan order: range fastest, then line.
  EXPECT_EQ(one.bins[8].range, 64 + 32);
  EXPECT_EQ(one.bins[8].line, 256 + 128);
}

TEST(DcBinScan, ReadsInBoundedChunksWhateverTheMemory) {
  const Radar rd;
  DcEstState st = ersState(rd);
  st.memory = int64_t(1) << 40;
  // 11.5 MB per bin row: 5 bin rows fit in 64 MiB, the raster has 40.
  DcEstInput in = inputFor(rd, "unused", "unused", 5616, 40 * 256 + 100);
  st.blocks = 64 * 87;
  st.patchs = 8;
  ASSERT_EQ(setprocbuf(in, st), 0);
  EXPECT_EQ(st.rowsPerRead, 5);
  EXPECT_EQ(st.readBuf.size(), size_t(5) * 256 * 5616);
  EXPECT_EQ(in.lines, 40 * 256);
  // A budget below the chunk still rules.
  DcEstState small = ersState(rd);
  small.memory = int64_t(256) * 5616 * 8 * 2 + 1;
  small.blocks = 64 * 87;
  DcEstInput in2 = inputFor(rd, "unused", "unused", 5616, 40 * 256);
  ASSERT_EQ(setprocbuf(in2, small), 0);
  EXPECT_EQ(small.rowsPerRead, 2);
}
