// DataFile and BufferIO: layouts of every cell type and byte order, windows,
// conversions, buffering and status codes.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <vector>

#include "base/fcomplex.h"
#include "base/status.h"
#include "product/buffer_io.h"
#include "product/data_file.h"
#include "raster_test_util.h"

using namespace rastertest;

namespace {

void describe(DataFile& f, const std::string& name, const Layout& l) {
  f.filename = name;
  f.CellType = l.type;
  f.ByteOrder = l.bigEndian ? 1 : 0;
  f.NrOfLinesPerImage = l.lines;
  f.NrOfPixelsPerLine = l.pixels;
  f.RowPrefix = l.prefix;
  f.HeaderOffset = l.header;
}

}  // namespace

TEST(RasterDataFile, EveryTypeAndByteOrderReadsBackThroughWindows) {
  const std::string dir = tempDir();
  for (int type = 0; type <= 9; ++type) {
    for (bool big : {false, true}) {
      SCOPED_TRACE("type " + std::to_string(type) + (big ? " big-endian" : " little-endian"));
      const Layout l{type, big, 11, 13, 6, 37};
      const std::string name = dir + "/r" + std::to_string(type) + (big ? "b" : "l");
      spit(name, referenceRaster(l));
      const TypeInfo ti = typeInfo(type);
      const size_t ms = size_t(ti.bytes * ti.parts);

      for (int64_t bufsize : {int64_t(0), int64_t(50), int64_t(4096)}) {
        SCOPED_TRACE("buffer " + std::to_string(bufsize));
        DataFile f;
        describe(f, name, l);
        f.buffersize = bufsize;
        BufferIO io{&f, 5, 7, 3, 5, type};
        const int stride = 9;
        std::vector<unsigned char> dst(ms * stride * io.rows, 0xAB);
        const int status = io.readbuffer(dst.data(), stride);
        if (type >= 8) {
          EXPECT_EQ(status, STATUS_BAD_CONDITION);
          continue;
        }
        ASSERT_EQ(status, STATUS_OK);
        for (int r = 0; r < io.rows; ++r) {
          for (int c = 0; c < stride; ++c) {
            const size_t i = size_t(r * stride + c);
            if (c >= io.columns) {
              EXPECT_EQ(dst[i * ms], 0xAB) << "gap between rows written";
              continue;
            }
            for (int k = 0; k < ti.parts; ++k)
              ASSERT_EQ(component(dst.data(), type, i, k), pixelValue(3 + r, 5 + c, k))
                  << "row " << r << " col " << c;
          }
        }
        // Prefixes of the same rows, never swapped.
        std::vector<unsigned char> pre(size_t(l.prefix * io.rows));
        ASSERT_EQ(io.readprefix(pre.data()), STATUS_OK);
        for (int r = 0; r < io.rows; ++r)
          for (int i = 0; i < l.prefix; ++i) EXPECT_EQ(pre[size_t(r * l.prefix + i)], prefixByte(3 + r, i));
        // A second window of the same open file, backwards.
        BufferIO again{&f, 0, l.pixels, 1, 1, type};
        std::vector<unsigned char> row(ms * l.pixels);
        ASSERT_EQ(again.readbuffer(row.data()), STATUS_OK);
        for (int c = 0; c < l.pixels; ++c)
          ASSERT_EQ(component(row.data(), type, size_t(c), 0), pixelValue(1, c, 0));
        EXPECT_EQ(f.close(), STATUS_OK);
      }
    }
  }
}

TEST(RasterDataFile, WriteBufferAndPrefixesGiveTheReferenceBytes) {
  const std::string dir = tempDir();
  for (int type = 0; type <= 9; ++type) {
    for (bool big : {false, true}) {
      SCOPED_TRACE("type " + std::to_string(type) + (big ? " big-endian" : " little-endian"));
      const Layout l{type, big, 9, 10, 5, 21};
      const std::vector<unsigned char> ref = referenceRaster(l);
      const TypeInfo ti = typeInfo(type);
      const size_t ms = size_t(ti.bytes * ti.parts);
      const int64_t rowlen = l.prefix + int64_t(l.pixels) * int64_t(ms);

      // Pixels in memory (native order) taken from the little-endian reference.
      const Layout le{type, false, l.lines, l.pixels, 0, 0};
      const std::vector<unsigned char> mem = referenceRaster(le);
      std::vector<unsigned char> pre(size_t(l.prefix * l.lines));
      for (int r = 0; r < l.lines; ++r)
        for (int i = 0; i < l.prefix; ++i) pre[size_t(r * l.prefix + i)] = prefixByte(r, i);

      const std::string name = dir + "/w" + std::to_string(type) + (big ? "b" : "l");
      DataFile f;
      describe(f, name, l);
      ASSERT_EQ(f.open(1), STATUS_OK);
      ASSERT_EQ(f.write(ref.data(), l.header), STATUS_OK);  // header block
      // Whole rows in two windows of columns, then the prefixes.
      BufferIO left{&f, 0, 4, 0, l.lines, type};
      BufferIO right{&f, 4, l.pixels - 4, 0, l.lines, type};
      ASSERT_EQ(left.writebuffer(mem.data(), l.pixels), STATUS_OK);
      ASSERT_EQ(right.writebuffer(mem.data() + 4 * ms, l.pixels), STATUS_OK);
      BufferIO all{&f, 0, l.pixels, 0, l.lines, type};
      ASSERT_EQ(all.writeprefix(pre.data()), STATUS_OK);
      ASSERT_EQ(f.close(), STATUS_OK);
      EXPECT_EQ(slurp(name), ref);

      // Update a window in place (mode 2 "r+b"): rows 2..4, columns 3..7.
      std::vector<unsigned char> expect = ref;
      std::vector<unsigned char> patch(ms * 5 * 3);
      for (size_t i = 0; i < patch.size(); ++i) patch[i] = (unsigned char)(0x40 + i);
      DataFile u;
      describe(u, name, l);
      ASSERT_EQ(u.open(2), STATUS_OK);
      BufferIO win{&u, 3, 5, 2, 3, type};
      ASSERT_EQ(win.writebuffer(patch.data()), STATUS_OK);
      ASSERT_EQ(u.close(), STATUS_OK);
      for (int r = 0; r < 3; ++r)
        for (int c = 0; c < 5; ++c)
          for (int k = 0; k < ti.parts; ++k)
            for (int b = 0; b < ti.bytes; ++b) {
              const unsigned char byte = patch[size_t(r * 5 + c) * ms + size_t(k * ti.bytes + b)];
              const int64_t at = l.header + (2 + r) * rowlen + l.prefix + (3 + c) * int64_t(ms) +
                                 k * ti.bytes + (big ? ti.bytes - 1 - b : b);
              expect[size_t(at)] = byte;
            }
      EXPECT_EQ(slurp(name), expect);
    }
  }
}

// Served pairs (file type row, memory type column), taken from the format's
// conversion table.
static const int kReadPairs[8][8] = {
    // mem: 0  1  2  3  4  5  6  7
    /*0*/ {1, 0, 1, 0, 0, 0, 0, 0},
    /*1*/ {1, 1, 0, 1, 0, 0, 0, 0},
    /*2*/ {1, 0, 1, 0, 0, 0, 0, 0},
    /*3*/ {0, 1, 1, 1, 0, 0, 0, 0},
    /*4*/ {1, 0, 1, 0, 1, 0, 1, 0},
    /*5*/ {1, 1, 0, 1, 0, 1, 0, 1},
    /*6*/ {1, 0, 1, 0, 1, 0, 1, 0},
    /*7*/ {1, 1, 0, 1, 0, 1, 0, 1},
};

TEST(RasterDataFile, ReadConversionTableIsPinned) {
  const std::string dir = tempDir();
  for (int ft = 0; ft < 8; ++ft) {
    const Layout l{ft, false, 2, 6, 0, 0};
    const std::string name = dir + "/c" + std::to_string(ft);
    spit(name, referenceRaster(l));
    for (int mt = 0; mt < 8; ++mt) {
      SCOPED_TRACE("file " + std::to_string(ft) + " memory " + std::to_string(mt));
      EXPECT_EQ(cell_read_pair(ft, mt), kReadPairs[ft][mt] == 1);
      EXPECT_EQ(cell_write_pair(mt, ft), kReadPairs[ft][mt] == 1);
      DataFile f;
      describe(f, name, l);
      BufferIO io{&f, 1, 4, 1, 1, mt};
      const TypeInfo mi = typeInfo(mt);
      std::vector<unsigned char> dst(size_t(mi.bytes * mi.parts * 4), 0xCD);
      ASSERT_EQ(io.readbuffer(dst.data()), STATUS_OK);
      if (!kReadPairs[ft][mt]) {
        for (unsigned char b : dst) ASSERT_EQ(b, 0xCD) << "destination changed";
        continue;
      }
      const bool fc = typeInfo(ft).parts == 2, mc = mi.parts == 2;
      for (int c = 0; c < 4; ++c) {
        EXPECT_EQ(component(dst.data(), mt, size_t(c), 0), pixelValue(1, 1 + c, 0));
        if (mc) {
          EXPECT_EQ(component(dst.data(), mt, size_t(c), 1), fc ? pixelValue(1, 1 + c, 1) : 0.0);
        }
      }
    }
  }
}

TEST(RasterDataFile, WriteConversionsRoundHalfAwayFromZero) {
  const std::string dir = tempDir();
  const std::vector<float> values = {2.5f, -2.5f, 1.49f, -0.5f, 0.5f, -1.5f, 3.0f, 70000.0f};
  const std::vector<long> rounded = {3, -3, 1, -1, 1, -2, 3, 70000};
  // FLOAT32 memory into INT32 and INT16 files.
  // One row of the given cells in a file of its own.
  auto oneRow = [&dir](DataFile& f, const std::string& name, int cells, int pixels) {
    f.filename = dir + "/" + name;
    f.CellType = cells;
    f.NrOfPixelsPerLine = pixels;
    f.NrOfLinesPerImage = 1;
  };
  for (int ft : {5, 7}) {
    DataFile f;
    oneRow(f, "round" + std::to_string(ft), ft, int(values.size()));
    BufferIO io{&f, 0, int(values.size()), 0, 1, FLOAT32};
    ASSERT_EQ(io.writebuffer(values.data()), STATUS_OK);
    ASSERT_EQ(f.close(), STATUS_OK);
    const std::vector<unsigned char> bytes = slurp(f.filename);
    ASSERT_EQ(bytes.size(), values.size() * size_t(typeInfo(ft).bytes));
    for (size_t i = 0; i < values.size(); ++i) {
      const long want = ft == 7 ? long(int16_t(rounded[i])) : rounded[i];  // no clipping
      EXPECT_EQ(component(bytes.data(), ft, i, 0), want) << values[i];
    }
  }
  // FLOAT_COMPLEX memory: into SHORT_COMPLEX per part, into FLOAT32 the real part.
  const std::vector<fcomplex> z = {{1.5f, -1.5f}, {-0.49f, 2.51f}, {100.5f, -7.0f}};
  DataFile sc;
  oneRow(sc, "sc", SHORT_COMPLEX, 3);
  BufferIO io{&sc, 0, 3, 0, 1, FLOAT_COMPLEX};
  ASSERT_EQ(io.writebuffer(z.data()), STATUS_OK);
  sc.close();
  const std::vector<unsigned char> s = slurp(sc.filename);
  const long want[6] = {2, -2, 0, 3, 101, -7};
  for (int i = 0; i < 6; ++i) EXPECT_EQ(component(s.data(), SHORT_COMPLEX, size_t(i / 2), i % 2), want[i]);
  DataFile re;
  oneRow(re, "re", FLOAT32, 3);
  BufferIO io2{&re, 0, 3, 0, 1, FLOAT_COMPLEX};
  ASSERT_EQ(io2.writebuffer(z.data()), STATUS_OK);
  re.close();
  const std::vector<unsigned char> r = slurp(re.filename);
  ASSERT_EQ(r.size(), 12u);
  for (int i = 0; i < 3; ++i) EXPECT_EQ(component(r.data(), FLOAT32, size_t(i), 0), z[size_t(i)].real());
  // The rounding rule itself.
  EXPECT_EQ(round_half_away(0.49999999999999994), 1.0);  // floor(x + 0.5), as written
  EXPECT_EQ(round_half_away(-0.5), -1.0);
  EXPECT_EQ(round_half_away(-0.49), 0.0);
}

TEST(RasterDataFile, EdgeCasesAndStatusCodes) {
  const std::string dir = tempDir();
  // INT32_COMPLEX into dcomplex converts per part.
  {
    const Layout l{INT32_COMPLEX, false, 1, 4, 0, 0};
    const std::string name = dir + "/ic";
    spit(name, referenceRaster(l));
    DataFile f;
    describe(f, name, l);
    std::vector<dcomplex> out(4);
    BufferIO io{&f, 0, 4, 0, 1, DOUBLE_COMPLEX};
    ASSERT_EQ(io.readbuffer(out.data()), STATUS_OK);
    for (int c = 0; c < 4; ++c) {
      EXPECT_EQ(out[size_t(c)].real(), pixelValue(0, c, 0));
      EXPECT_EQ(out[size_t(c)].imag(), pixelValue(0, c, 1));
    }
  }
  // FLOAT32 file into an INT16 buffer: untouched.
  {
    const Layout l{FLOAT32, false, 1, 4, 0, 0};
    const std::string name = dir + "/f";
    spit(name, referenceRaster(l));
    DataFile f;
    describe(f, name, l);
    std::vector<short> out(4, 1234);
    BufferIO io{&f, 0, 4, 0, 1, INT16};
    EXPECT_EQ(io.readbuffer(out.data()), STATUS_OK);
    for (short v : out) EXPECT_EQ(v, 1234);
  }
  // Zero rows: the file is opened and positioned, status 0.
  {
    const Layout l{FLOAT_COMPLEX, false, 4, 3, 2, 10};
    const std::string name = dir + "/z";
    spit(name, referenceRaster(l));
    DataFile f;
    describe(f, name, l);
    BufferIO io{&f, 0, 3, 2, 0, FLOAT_COMPLEX};
    EXPECT_EQ(io.readbuffer(nullptr), STATUS_OK);
    EXPECT_TRUE(f.is_open());
    EXPECT_EQ(f.tell(), 10 + 2 * f.rowlength());
    // SEEK_END unbuffered is refused; closing twice is fine.
    EXPECT_EQ(f.seek(0, 2), STATUS_BAD_CONDITION);
    EXPECT_EQ(f.close(), STATUS_OK);
    EXPECT_EQ(f.close(), STATUS_OK);
    EXPECT_FALSE(f.is_open());
  }
  // Open failures and short reads.
  {
    DataFile f(dir + "/missing");
    EXPECT_FALSE(f.exists());
    EXPECT_EQ(f.open(0), STATUS_NOT_OPENED);
    EXPECT_EQ(f.read(nullptr, 0), STATUS_NOT_OPENED);
    EXPECT_EQ(f.open(7), STATUS_NOT_OPENED);
    BufferIO io{&f, 0, 1, 0, 1, FLOAT_COMPLEX};
    fcomplex z;
    EXPECT_EQ(io.readbuffer(&z), STATUS_NOT_OPENED);
    spit(dir + "/short", std::vector<unsigned char>(10, 1));
    DataFile s(dir + "/short");
    ASSERT_EQ(s.open(0), STATUS_OK);
    char buf[16];
    EXPECT_EQ(s.read(buf, 16), STATUS_READ_FAILED);  // unbuffered short read
    s.close();
    s.buffersize = 8;
    ASSERT_EQ(s.open(0), STATUS_OK);
    EXPECT_TRUE(s.is_buffered());
    EXPECT_EQ(s.read(buf, 16), STATUS_OK);  // buffered: end of file tolerated
    EXPECT_EQ(s.close(), STATUS_OK);
    EXPECT_EQ(s.buffersize, 0);  // a reopen is unbuffered
  }
  // Open modes.
  {
    DataFile f(dir + "/modes");
    ASSERT_EQ(f.open(1), STATUS_OK);
    EXPECT_TRUE(f.is_writing());
    EXPECT_EQ(f.getModeFlag(), 1);
    f.close();
    ASSERT_EQ(f.open(2), STATUS_OK);
    EXPECT_EQ(f.getModeFlag(), 1);
    f.close();
    ASSERT_EQ(f.open(3), STATUS_OK);
    EXPECT_EQ(f.getModeFlag(), 2);
    EXPECT_FALSE(f.is_writing());
    f.close();
  }
}

TEST(RasterDataFile, BufferedReadsMatchTheFileAtRandomSeeks) {
  const std::string dir = tempDir();
  std::vector<unsigned char> data(100000);
  uint32_t x = 12345;
  for (auto& b : data) b = (unsigned char)((x = x * 1664525u + 1013904223u) >> 24);
  const std::string name = dir + "/rand";
  spit(name, data);
  for (int mode : {0, 3}) {
    DataFile f(name);
    f.buffersize = 4000;
    ASSERT_EQ(f.open(mode), STATUS_OK);
    int64_t pos = 0;
    std::vector<unsigned char> got(9000);
    for (int i = 0; i < 400; ++i) {
      x = x * 1664525u + 1013904223u;
      const int kind = int(x >> 30);
      const int64_t off = int64_t((x >> 8) % 20000) - 10000;
      if (kind == 0) {
        const int64_t target = int64_t((x >> 4) % 95000);
        ASSERT_EQ(f.seek(target, 0), STATUS_OK);
        pos = target;
      } else if (kind == 1 && pos + off >= 0 && pos + off < 95000) {
        ASSERT_EQ(f.seek(off, 1), STATUS_OK);
        pos += off;
      }
      ASSERT_EQ(f.tell(), pos);
      const int64_t n = std::min<int64_t>(int64_t(x % 9000), int64_t(data.size()) - pos);
      ASSERT_EQ(f.read(got.data(), n), STATUS_OK);
      ASSERT_EQ(0, std::memcmp(got.data(), data.data() + pos, size_t(n))) << "at " << pos;
      pos += n;
      ASSERT_EQ(f.tell(), pos);
    }
    ASSERT_EQ(f.seek(-100, 2), STATUS_OK);  // buffered reading may count from the end
    ASSERT_EQ(f.read(got.data(), 100), STATUS_OK);
    EXPECT_EQ(0, std::memcmp(got.data(), data.data() + data.size() - 100, 100));
    f.close();
  }
}
