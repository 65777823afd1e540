// Raster side files: the element document RasterInfo written by both
// classes, and the older profile form with cell type texts and "MSBFirst".
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "base/status.h"
#include "product/buffer_file.h"
#include "product/data_file.h"
#include "raster_test_util.h"

using namespace rastertest;

namespace {

std::string readText(const std::string& path) {
  std::ifstream in(path);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

void writeText(const std::string& path, const std::string& text) {
  std::ofstream out(path);
  out << text;
}

std::string profileHeader(const std::string& cellType, const std::string& order,
                          const std::string& skipKey = "") {
  std::string t = "\n[RasterInfo]\n";
  const std::pair<const char*, std::string> keys[] = {
      {"NrOfLinesPerImage", "50"}, {"NrOfPixelsPerLine", "100"}, {"HeaderOffset", "12"},
      {"RowPrefix", "4"},          {"CellType", cellType},       {"ByteOrder", order}};
  for (const auto& [k, v] : keys)
    if (skipKey != k) t += std::string(k) + " = " + v + "\n";
  return t;
}

}  // namespace

TEST(RasterHdr, ElementDocumentRoundTripsThroughBothClasses) {
  const std::string dir = tempDir();
  DataFile f(dir + "/image.raw");
  f.NrOfLinesPerImage = 1234;
  f.NrOfPixelsPerLine = 5678;
  f.HeaderOffset = 720;
  f.RowPrefix = 4;
  f.ByteOrder = 1;
  f.CellType = SHORT_COMPLEX;
  ASSERT_EQ(f.write_hdr(), STATUS_OK);
  EXPECT_EQ(f.hdrname, dir + "/image.raw.hdr");
  const std::string text = readText(dir + "/image.raw.hdr");
  ASSERT_NE(text.find("<OrvaneXmlDoc"), std::string::npos);
  ASSERT_NE(text.find("<RasterInfo>"), std::string::npos);
  // Elements in their fixed order.
  size_t at = 0;
  for (const char* e : {"<NrOfLinesPerImage>1234<", "<NrOfPixelsPerLine>5678<", "<HeaderOffset>720<",
                        "<RowPrefix>4<", "<ByteOrder>1<", "<CellType>6<"}) {
    const size_t p = text.find(e);
    ASSERT_NE(p, std::string::npos) << e;
    EXPECT_GT(p, at) << e;
    at = p;
  }
  DataFile g;
  ASSERT_EQ(g.read_hdr(dir + "/image.raw"), STATUS_OK);
  EXPECT_EQ(g.filename, dir + "/image.raw");
  EXPECT_EQ(g.hdrname, dir + "/image.raw.hdr");
  EXPECT_EQ(g.NrOfLinesPerImage, 1234);
  EXPECT_EQ(g.NrOfPixelsPerLine, 5678);
  EXPECT_EQ(g.HeaderOffset, 720);
  EXPECT_EQ(g.RowPrefix, 4);
  EXPECT_EQ(g.ByteOrder, 1);
  EXPECT_EQ(g.CellType, SHORT_COMPLEX);
  EXPECT_FALSE(g.is_buffered());

  BufferFile b(dir + "/image.raw");
  ASSERT_EQ(b.readhdr(), 0);
  EXPECT_EQ(b.getLines(), 1234);
  EXPECT_EQ(b.getSamples(), 5678);
  EXPECT_EQ(b.getOffsetSize(), 720);
  EXPECT_EQ(b.getRowPrefix(), 4);
  EXPECT_EQ(b.getFileEndian(), 1);
  EXPECT_EQ(b.getType(), BufferFile::SHORT_COMPLEX);
  // BufferFile writes the same document; DataFile reads it.
  b.setType(BufferFile::INT16);
  b.setLines(7);
  ASSERT_EQ(b.writehdr(dir + "/other.hdr"), 0);
  DataFile h;
  ASSERT_EQ(h.read_hdr(dir + "/other"), STATUS_OK);
  EXPECT_EQ(h.CellType, INT16);
  EXPECT_EQ(h.NrOfLinesPerImage, 7);
  EXPECT_EQ(h.HeaderOffset, 720);
  // copy gives the new raster a side file.
  const Layout l{FLOAT32, false, 3, 4, 0, 0};
  spit(dir + "/small", referenceRaster(l));
  DataFile s(dir + "/small");
  s.CellType = FLOAT32;
  s.NrOfLinesPerImage = 3;
  s.NrOfPixelsPerLine = 4;
  ASSERT_EQ(s.copy(dir + "/small2", 5), STATUS_OK);
  DataFile t;
  ASSERT_EQ(t.read_hdr(dir + "/small2"), STATUS_OK);
  EXPECT_EQ(t.NrOfPixelsPerLine, 4);
  EXPECT_EQ(t.CellType, FLOAT32);
}

TEST(RasterHdr, ProfileFormWithCellTypeTextsAndByteOrder) {
  const std::string dir = tempDir();
  const char* texts[] = {"FLOAT_COMPLEX", "FLOAT32", "DOUBLE_COMPLEX", "FLOAT64", nullptr,
                         "INT32",         "SHORT_COMPLEX", "INT16",     "INT8_COMPLEX", "INT8"};
  for (int type = 0; type <= 9; ++type) {
    if (!texts[type]) continue;
    const std::string name = dir + "/p" + std::to_string(type);
    writeText(name + ".hdr", profileHeader(texts[type], "MSBFirst"));
    DataFile f;
    f.buffersize = 4096;
    ASSERT_EQ(f.read_hdr(name), STATUS_OK) << texts[type];
    EXPECT_EQ(f.CellType, type);
    EXPECT_EQ(f.ByteOrder, 1);
    EXPECT_EQ(f.NrOfLinesPerImage, 50);
    EXPECT_EQ(f.NrOfPixelsPerLine, 100);
    EXPECT_EQ(f.HeaderOffset, 12);
    EXPECT_EQ(f.RowPrefix, 4);
    EXPECT_EQ(f.buffersize, 0);
    // BufferFile reads only the element document.
    BufferFile b(name);
    EXPECT_NE(b.readhdr(), 0);
  }
  // Any order text other than "MSBFirst" is little-endian.
  for (const char* order : {"LSBFirst", "msbfirst", "MSBF", "1"}) {
    const std::string name = dir + "/o" + std::string(order);
    writeText(name + ".hdr", profileHeader("INT16", order));
    DataFile f;
    f.ByteOrder = 1;
    ASSERT_EQ(f.read_hdr(name), STATUS_OK) << order;
    EXPECT_EQ(f.ByteOrder, 0) << order;
  }
  // Unknown cell type text: 1 with CellType -1.
  {
    const std::string name = dir + "/unknown";
    writeText(name + ".hdr", profileHeader("COMPLEX_FLOAT", "MSBFirst"));
    DataFile f;
    EXPECT_EQ(f.read_hdr(name), STATUS_BAD_CONDITION);
    EXPECT_EQ(f.CellType, -1);
  }
  // A missing key: 1.
  for (const char* key : {"HeaderOffset", "RowPrefix", "NrOfPixelsPerLine", "NrOfLinesPerImage",
                          "CellType", "ByteOrder"}) {
    const std::string name = dir + "/miss" + std::string(key);
    writeText(name + ".hdr", profileHeader("FLOAT32", "MSBFirst", key));
    DataFile f;
    EXPECT_EQ(f.read_hdr(name), STATUS_BAD_CONDITION) << key;
  }
  // No side file at all.
  DataFile none;
  EXPECT_EQ(none.read_hdr(dir + "/absent"), STATUS_BAD_CONDITION);
}
