// BufferFile: typed windows of every cell type and byte order, the read
// window with its back-reach, the read-modify-write page of write and update
// mode against plain stdio, point reads, writeOffset, copy and clone.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstring>
#include <vector>

#include "base/fcomplex.h"
#include "product/buffer_file.h"
#include "raster_test_util.h"

using namespace rastertest;

namespace {

void describe(BufferFile& f, const std::string& name, const Layout& l) {
  f.setFilename(name);
  f.setType(l.type);
  f.setByteOrder(l.bigEndian ? 1 : 0);
  f.setLines(l.lines);
  f.setSamples(l.pixels);
  f.setRowPrefix(l.prefix);
  f.setOffsetSize(l.header);
}

// Reads the window through the typed form T and compares component-wise.
template <typename T>
void expectWindow(BufferFile& f, int memType, int fr, int rows, int fc, int cols, bool served) {
  const int width = cols == 0 ? f.getSamples() - fc : cols;
  const TypeInfo mi = typeInfo(memType);
  std::vector<T> buf(size_t(rows * width));
  std::memset(static_cast<void*>(buf.data()), 0x5A, buf.size() * sizeof(T));
  const int64_t moved = f.readbuffer(buf.data(), fr, rows, fc, cols);
  if (!served) {
    EXPECT_EQ(moved, 0);
    const unsigned char* p = reinterpret_cast<const unsigned char*>(buf.data());
    for (size_t i = 0; i < buf.size() * sizeof(T); ++i) ASSERT_EQ(p[i], 0x5A);
    return;
  }
  EXPECT_EQ(moved, int64_t(rows) * width * f.pixelsizeof());
  for (int r = 0; r < rows; ++r)
    for (int c = 0; c < width; ++c)
      for (int k = 0; k < mi.parts; ++k)
        ASSERT_EQ(component(buf.data(), memType, size_t(r * width + c), k), pixelValue(fr + r, fc + c, k))
            << "mem " << memType << " row " << r << " col " << c;
}

}  // namespace

TEST(RasterBufferFile, TypedWindowsOfEveryTypeAndByteOrder) {
  const std::string dir = tempDir();
  for (int type = 0; type <= 9; ++type) {
    for (bool big : {false, true}) {
      const Layout l{type, big, 12, 15, 4, 29};
      const std::string name = dir + "/b" + std::to_string(type) + (big ? "b" : "l");
      spit(name, referenceRaster(l));
      for (int64_t window : {int64_t(0), int64_t(64), int64_t(1 << 16)}) {
        SCOPED_TRACE("type " + std::to_string(type) + (big ? " big" : " little") + " window " +
                     std::to_string(window));
        BufferFile f;
        describe(f, name, l);
        ASSERT_TRUE(f.open(BufferFile::READ));
        if (window) f.initbuffer(window, 16);
        const bool cx = type % 2 == 0 && type < 8, re = type % 2 == 1 && type < 8;
        expectWindow<fcomplex>(f, FLOAT_COMPLEX, 2, 4, 3, 5, cx);
        expectWindow<dcomplex>(f, DOUBLE_COMPLEX, 7, 3, 1, 9, cx);
        expectWindow<float>(f, FLOAT32, 2, 4, 3, 5, re);
        expectWindow<double>(f, FLOAT64, 0, 12, 0, 0, re);  // whole rows
        expectWindow<int>(f, INT32, 5, 2, 14, 1, re);
        expectWindow<short>(f, INT16, 1, 5, 6, 7, re);
        std::vector<char> pre(size_t(5 * l.prefix));
        EXPECT_EQ(f.readprefix(pre.data(), 6, 5), 5 * l.prefix);
        for (int r = 0; r < 5; ++r)
          for (int i = 0; i < l.prefix; ++i)
            EXPECT_EQ((unsigned char)pre[size_t(r * l.prefix + i)], prefixByte(6 + r, i));
        // Point reads: only little-endian files of exactly the asked type.
        const bool le = !big;
        EXPECT_EQ(f.readFloat(3, 4), le && type == 1 ? float(pixelValue(3, 4, 0)) : 0.0f);
        EXPECT_EQ(f.readDouble(3, 4), le && type == 3 ? double(pixelValue(3, 4, 0)) : 0.0);
        EXPECT_EQ(f.readInt(11, 14), le && type == 5 ? int(pixelValue(11, 14, 0)) : 0);
        EXPECT_EQ(f.readShort(0, 0), le && type == 7 ? short(pixelValue(0, 0, 0)) : 0);
        EXPECT_EQ(f.readFloatComplex(3, 4),
                  le && type == 0 ? fcomplex(pixelValue(3, 4, 0), pixelValue(3, 4, 1)) : fcomplex());
        EXPECT_EQ(f.readDoubleComplex(9, 2),
                  le && type == 2 ? dcomplex(pixelValue(9, 2, 0), pixelValue(9, 2, 1)) : dcomplex());
        f.close();
        EXPECT_FALSE(f.is_open());
        EXPECT_EQ(f.readFloat(3, 4), 0.0f);  // closed
      }
    }
  }
}

TEST(RasterBufferFile, TypedWritesGiveTheReferenceBytes) {
  const std::string dir = tempDir();
  for (int type : {0, 1, 2, 3, 4, 5, 6, 7}) {
    for (bool big : {false, true}) {
      for (int64_t window : {int64_t(0), int64_t(100)}) {
        SCOPED_TRACE("type " + std::to_string(type) + (big ? " big" : " little") + " window " +
                     std::to_string(window));
        const Layout l{type, big, 6, 9, 3, 10};
        const std::vector<unsigned char> ref = referenceRaster(l);
        BufferFile f;
        describe(f, dir + "/w", l);
        ASSERT_TRUE(f.open(BufferFile::WRITE));
        if (window) f.initbuffer(window, 0);
        f.writeOffset(reinterpret_cast<const char*>(ref.data()), int(l.header));
        EXPECT_EQ(f.getOffsetSize(), l.header);
        EXPECT_EQ(f.tell(), 0);
        std::vector<char> pre(size_t(l.lines * l.prefix));
        for (int r = 0; r < l.lines; ++r)
          for (int i = 0; i < l.prefix; ++i) pre[size_t(r * l.prefix + i)] = char(prefixByte(r, i));
        // Pixels from memory of the widest form of the same kind, in three windows.
        const bool cx = type % 2 == 0;
        std::vector<dcomplex> z(size_t(l.lines * l.pixels));
        std::vector<double> d(z.size());
        for (int r = 0; r < l.lines; ++r)
          for (int c = 0; c < l.pixels; ++c) {
            z[size_t(r * l.pixels + c)] = dcomplex(pixelValue(r, c, 0), pixelValue(r, c, 1));
            d[size_t(r * l.pixels + c)] = pixelValue(r, c, 0);
          }
        for (int r = 0; r < l.lines; ++r) {
          for (auto [fc, cols] : {std::pair{4, 5}, std::pair{0, 4}}) {
            const int64_t moved = cx ? f.writebuffer(&z[size_t(r * l.pixels + fc)], r, 1, fc, cols)
                                     : f.writebuffer(&d[size_t(r * l.pixels + fc)], r, 1, fc, cols);
            EXPECT_EQ(moved, cols * f.pixelsizeof());
          }
        }
        EXPECT_EQ(f.writeprefix(pre.data(), 0, l.lines), l.lines * l.prefix);
        // A form of the other kind writes nothing.
        EXPECT_EQ(cx ? f.writebuffer(d.data(), 0, 1, 0, 0) : f.writebuffer(z.data(), 0, 1, 0, 0), 0);
        f.close();
        EXPECT_EQ(slurp(dir + "/w"), ref);
      }
    }
  }
  // Floating memory into integer files rounds half away from zero.
  BufferFile g(dir + "/round");
  g.setType(BufferFile::INT16);
  g.setSamples(4);
  g.setLines(1);
  ASSERT_TRUE(g.open(BufferFile::WRITE));
  const float v[4] = {2.5f, -2.5f, 0.49f, -7.5f};
  EXPECT_EQ(g.writebuffer(v, 0, 1, 0, 0), 8);
  g.close();
  const std::vector<unsigned char> s = slurp(dir + "/round");
  ASSERT_EQ(s.size(), 8u);
  const double want[4] = {3, -3, 0, -8};
  for (int i = 0; i < 4; ++i) EXPECT_EQ(component(s.data(), INT16, size_t(i), 0), want[i]);
}

namespace {

// The same random walk of seeks, small prefix patches, long writes and (in
// update mode) reads, applied to a BufferFile and to an unbuffered stdio file.
void patchWalk(const std::string& dir, bool update, int64_t window, uint32_t seed) {
  const std::string mine = dir + "/mine", ref = dir + "/ref";
  std::vector<unsigned char> initial;
  if (update) {
    initial.resize(30000);
    for (size_t i = 0; i < initial.size(); ++i) initial[i] = (unsigned char)(i * 7 + 3);
    spit(mine, initial);
    spit(ref, initial);
  }
  std::FILE* r = std::fopen(ref.c_str(), update ? "r+b" : "w+b");
  ASSERT_NE(r, nullptr);
  std::setvbuf(r, nullptr, _IONBF, 0);
  BufferFile f(mine);
  ASSERT_TRUE(f.open(update ? BufferFile::UPDATE : BufferFile::WRITE));
  f.initbuffer(window, 0);
  int64_t pos = 0, size = int64_t(initial.size());
  uint32_t x = seed;
  std::vector<unsigned char> buf(window * 3), back(window * 3);
  for (int i = 0; i < 3000; ++i) {
    x = x * 1664525u + 1013904223u;
    const int kind = int(x >> 28);
    if (kind < 6) {  // seek somewhere, maybe far
      pos = kind < 3 ? int64_t((x >> 4) % 40000) : std::max<int64_t>(0, pos - int64_t((x >> 4) % 2000));
      f.seek(pos, BufferFile::FROM_START);
    } else if (kind < 8) {
      const int64_t off = int64_t((x >> 4) % 400) - 200;
      if (pos + off >= 0) {
        pos += off;
        f.seek(off, BufferFile::FROM_CURRENT);
      }
    }
    ASSERT_EQ(f.tell(), pos) << "step " << i;
    std::fseek(r, long(pos), SEEK_SET);
    x = x * 1664525u + 1013904223u;
    int64_t n;
    switch (x % 5) {
      case 0: n = 4; break;                                         // a prefix patch
      case 1: n = 1 + int64_t(x >> 8) % 8; break;
      case 2: n = 1 + int64_t(x >> 8) % (window / 2); break;        // not above half a window
      case 3: n = window / 2 + 1 + int64_t(x >> 8) % window; break; // above half a window
      default: n = 1 + int64_t(x >> 8) % (3 * window); break;
    }
    if (update && (x >> 20) % 4 == 0 && pos + n <= size) {
      ASSERT_EQ(f.read(buf.data(), n), n);
      ASSERT_EQ(std::fread(back.data(), 1, size_t(n), r), size_t(n));
      ASSERT_EQ(0, std::memcmp(buf.data(), back.data(), size_t(n))) << "read at " << pos;
    } else {
      for (int64_t k = 0; k < n; ++k) buf[size_t(k)] = (unsigned char)(x >> (k % 24));
      ASSERT_EQ(f.write(buf.data(), n), n);
      ASSERT_EQ(std::fwrite(buf.data(), 1, size_t(n), r), size_t(n));
    }
    pos += n;
    size = std::max(size, pos);
    ASSERT_EQ(f.tell(), pos);
  }
  f.close();
  std::fclose(r);
  const std::vector<unsigned char> a = slurp(mine), b = slurp(ref);
  ASSERT_EQ(a.size(), b.size());
  EXPECT_TRUE(a == b);
}

}  // namespace

TEST(RasterBufferFile, WriteAndUpdatePatchesEqualPlainStdio) {
  const std::string dir = tempDir();
  for (bool update : {false, true})
    for (int64_t window : {64, 1000, 4097}) {
      SCOPED_TRACE((update ? "update, window " : "write, window ") + std::to_string(window));
      patchWalk(dir, update, window, (update ? 99u : 1u) + uint32_t(window));
    }
}
