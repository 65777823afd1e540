// A sparse 5 GiB raster: rows beyond 4 GiB are written and read at the right
// places through DataFile+BufferIO and BufferFile.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <vector>

#include "base/fcomplex.h"
#include "base/status.h"
#include "product/buffer_file.h"
#include "product/buffer_io.h"
#include "product/data_file.h"
#include "raster_test_util.h"

using namespace rastertest;

namespace {

constexpr int kPixels = 8192;  // 64 KiB rows of FLOAT_COMPLEX
constexpr int kLines = 81920;  // 5 GiB
constexpr int64_t kHeader = 100;

fcomplex sample(int row, int col) { return fcomplex(float(row) + col * 1e-4f, -float(col)); }

std::vector<fcomplex> rowOf(int row) {
  std::vector<fcomplex> v(kPixels);
  for (int c = 0; c < kPixels; ++c) v[size_t(c)] = sample(row, c);
  return v;
}

}  // namespace

TEST(RasterLargeFile, SparseFiveGiBRowsBeyondFourGiB) {
  const std::string dir = tempDir();
  const std::string name = dir + "/big.slc";
  const int64_t rowlen = int64_t(kPixels) * 8;
  const int64_t total = kHeader + rowlen * kLines;
  {
    std::FILE* f = std::fopen(name.c_str(), "wb");
    ASSERT_NE(f, nullptr);
    std::fclose(f);
  }
  if (::truncate(name.c_str(), off_t(total)) != 0) {
    std::filesystem::remove_all(dir);
    GTEST_SKIP() << "filesystem refuses a 5 GiB file: " << std::strerror(errno);
  }
  struct stat st {};
  ASSERT_EQ(::stat(name.c_str(), &st), 0);
  if (int64_t(st.st_blocks) * 512 > (int64_t(1) << 30)) {
    std::filesystem::remove_all(dir);
    GTEST_SKIP() << "filesystem does not keep the file sparse";
  }
  ASSERT_GT(total, int64_t(1) << 32);

  // Rows around 4 GiB and at the end, written through BufferIO in mode 2.
  const int rows[] = {0, 65534, 65535, 65536, 70001, kLines - 1};
  DataFile w(name);
  w.CellType = FLOAT_COMPLEX;
  w.NrOfPixelsPerLine = kPixels;
  w.NrOfLinesPerImage = kLines;
  w.HeaderOffset = kHeader;
  ASSERT_EQ(w.open(2), STATUS_OK);
  for (int r : rows) {
    const std::vector<fcomplex> v = rowOf(r);
    BufferIO io{&w, 0, kPixels, r, 1, FLOAT_COMPLEX};
    ASSERT_EQ(io.writebuffer(v.data()), STATUS_OK);
  }
  // One row through BufferFile's update window, far beyond 4 GiB.
  ASSERT_EQ(w.close(), STATUS_OK);
  {
    BufferFile b(name);
    b.setType(BufferFile::FLOAT_COMPLEX);
    b.setSamples(kPixels);
    b.setLines(kLines);
    b.setOffsetSize(kHeader);
    ASSERT_TRUE(b.open(BufferFile::UPDATE));
    b.initbuffer(1 << 20, 0);
    const std::vector<fcomplex> v = rowOf(80000);
    EXPECT_EQ(b.writebuffer(v.data(), 80000, 1, 0, 0), rowlen);
    b.close();
  }
  EXPECT_EQ(std::filesystem::file_size(name), uintmax_t(total));

  // Plain positioned reads see the bytes at the right offsets.
  {
    RasterStream s;
    ASSERT_TRUE(s.open(name, "rb"));
    fcomplex z;
    for (int r : {65536, 70001, 80000, kLines - 1}) {
      ASSERT_EQ(s.pread(&z, 8, kHeader + int64_t(r) * rowlen + 8 * 77), 8);
      EXPECT_EQ(z, sample(r, 77)) << r;
    }
  }
  // DataFile + BufferIO: a window across the 4 GiB boundary at odd columns.
  DataFile f(name);
  f.CellType = FLOAT_COMPLEX;
  f.NrOfPixelsPerLine = kPixels;
  f.NrOfLinesPerImage = kLines;
  f.HeaderOffset = kHeader;
  std::vector<fcomplex> got(size_t(3 * 101));
  BufferIO io{&f, 4001, 101, 65534, 3, FLOAT_COMPLEX};
  ASSERT_EQ(io.readbuffer(got.data()), STATUS_OK);
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 101; ++c) ASSERT_EQ(got[size_t(r * 101 + c)], sample(65534 + r, 4001 + c));
  for (int r : {70001, 80000, kLines - 1, 0}) {
    BufferIO one{&f, 0, kPixels, r, 1, FLOAT_COMPLEX};
    std::vector<fcomplex> v(kPixels);
    ASSERT_EQ(one.readbuffer(v.data()), STATUS_OK);
    EXPECT_EQ(v, rowOf(r)) << r;
  }
  BufferIO hole{&f, 0, kPixels, 75000, 1, FLOAT_COMPLEX};
  std::vector<fcomplex> zeros(kPixels, fcomplex(1, 1));
  ASSERT_EQ(hole.readbuffer(zeros.data()), STATUS_OK);
  EXPECT_EQ(zeros, std::vector<fcomplex>(kPixels));
  f.close();

  // BufferFile read window: a row beyond 4 GiB and a point read.
  BufferFile b(name);
  b.setType(BufferFile::FLOAT_COMPLEX);
  b.setSamples(kPixels);
  b.setLines(kLines);
  b.setOffsetSize(kHeader);
  ASSERT_TRUE(b.open(BufferFile::READ));
  b.initbuffer(1 << 20, 1 << 16);
  std::vector<fcomplex> v(kPixels);
  EXPECT_EQ(b.readbuffer(v.data(), 70001, 1, 0, 0), rowlen);
  EXPECT_EQ(v, rowOf(70001));
  EXPECT_EQ(b.readFloatComplex(kLines - 1, kPixels - 1), sample(kLines - 1, kPixels - 1));
  EXPECT_EQ(b.tell(), total);
  b.close();
  std::filesystem::remove_all(dir);
}
