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
