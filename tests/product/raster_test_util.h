#pragma once
// Helpers of the raster tests: a reference encoder that builds raster bytes
// component by component, independent of the classes under test.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "support/files.h"

namespace rastertest {

inline std::string tempDir() { return support::scratchDir("rasters"); }

inline std::vector<unsigned char> slurp(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::vector<unsigned char>(std::istreambuf_iterator<char>(in), {});
}

inline void spit(const std::string& path, const std::vector<unsigned char>& bytes) {
  std::FILE* f = std::fopen(path.c_str(), "wb");
  ASSERT_NE(f, nullptr);
  if (!bytes.empty()) {
    ASSERT_EQ(std::fwrite(bytes.data(), 1, bytes.size(), f), bytes.size());
  }
  std::fclose(f);
}

// Component layout of each cell type: bytes per component, components,
// floating or integer.
struct TypeInfo {
  int bytes;
  int parts;
  bool floating;
};
inline TypeInfo typeInfo(int type) {
  static const TypeInfo t[10] = {{4, 2, true},  {4, 1, true},  {8, 2, true},  {8, 1, true},
                                 {4, 2, false}, {4, 1, false}, {2, 2, false}, {2, 1, false},
                                 {1, 2, false}, {1, 1, false}};
  return t[type];
}

// Little-endian bytes of one component holding the integer value v.
inline void encodeComponent(int type, long v, bool bigEndian, unsigned char* out) {
  const TypeInfo ti = typeInfo(type);
  unsigned char le[8] = {};
  if (ti.floating && ti.bytes == 4) {
    const float f = float(v);
    std::memcpy(le, &f, 4);
  } else if (ti.floating) {
    const double d = double(v);
    std::memcpy(le, &d, 8);
  } else {
    const uint64_t u = uint64_t(int64_t(v));
    for (int i = 0; i < ti.bytes; ++i) le[i] = (u >> (8 * i)) & 0xff;
  }
  for (int i = 0; i < ti.bytes; ++i) out[i] = bigEndian ? le[ti.bytes - 1 - i] : le[i];
}

// Value of component k of pixel (r, c): small integers, exact in every type.
inline long pixelValue(int r, int c, int k) { return ((r * 31 + c * 7 + k * 5) % 201) - 100; }
inline unsigned char prefixByte(int r, int i) { return (unsigned char)(r * 17 + i * 3 + 1); }
inline unsigned char headerByte(int i) { return (unsigned char)(i * 13 + 5); }

struct Layout {
  int type;
  bool bigEndian;
  int lines;
  int pixels;
  int prefix;
  int64_t header;
};

inline std::vector<unsigned char> referenceRaster(const Layout& l) {
  const TypeInfo ti = typeInfo(l.type);
  const int64_t ps = ti.bytes * ti.parts;
  const int64_t rowlen = l.prefix + l.pixels * ps;
  std::vector<unsigned char> bytes(size_t(l.header + rowlen * l.lines));
  for (int64_t i = 0; i < l.header; ++i) bytes[size_t(i)] = headerByte(int(i));
  for (int r = 0; r < l.lines; ++r) {
    unsigned char* row = bytes.data() + l.header + r * rowlen;
    for (int i = 0; i < l.prefix; ++i) row[i] = prefixByte(r, i);
    for (int c = 0; c < l.pixels; ++c)
      for (int k = 0; k < ti.parts; ++k)
        encodeComponent(l.type, pixelValue(r, c, k), l.bigEndian,
                        row + l.prefix + c * ps + k * ti.bytes);
  }
  return bytes;
}

// Component k of element i of a memory buffer of `type`, as a double.
inline double component(const void* buf, int type, size_t i, int k) {
  const TypeInfo ti = typeInfo(type);
  const unsigned char* p =
      static_cast<const unsigned char*>(buf) + i * size_t(ti.bytes * ti.parts) + size_t(k * ti.bytes);
  switch (type) {
    case 0: case 1: { float f; std::memcpy(&f, p, 4); return f; }
    case 2: case 3: { double d; std::memcpy(&d, p, 8); return d; }
    case 4: case 5: { int32_t v; std::memcpy(&v, p, 4); return v; }
    case 6: case 7: { int16_t v; std::memcpy(&v, p, 2); return v; }
    default: { int8_t v; std::memcpy(&v, p, 1); return v; }
  }
}

}  // namespace rastertest
