// Rasters described by "_hdr" headers: layouts with prefixes, suffixes and
// footers in big-endian order, the scaling statistics with null and dummy
// cells, and TIFF products as GDAL reads them (grey, palette, GeoTIFF keys
// of the two global map states).
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <filesystem>
#include <memory>

#include "output/description_text.h"
#include "output/output_test_util.h"
#include "output/raster_file.h"
#include "output/raster_side_files.h"
#include "output/raster_tiff.h"
#include "output/raster_to_geotiff.h"

using output_test::readText;

namespace {

// Header of a raster of lines x samples cells of `cellType`.
tesv_description_section rasterHeader(int lines, int samples, const std::string& cellType) {
  tesv_description_section h = makeProductHeader();
  h.setField("RasterInfo.NrOfLinesPerImage").setInt(lines);
  h.setField("RasterInfo.NrOfPixelsPerLine").setInt(samples);
  h.setField("RasterInfo.CellType").setString(cellType);
  h.setField("RasterInfo.NullCellValue").setDouble(0.0);
  return h;
}

void writeFloatRaster(const std::string& name, int lines, int samples,
                      const std::function<float(int, int)>& value, bool bigEndian = false) {
  std::string bytes;
  for (int l = 0; l < lines; ++l)
    for (int s = 0; s < samples; ++s) {
      const float v = value(l, s);
      char b[4];
      std::memcpy(b, &v, 4);
      if (bigEndian) std::reverse(b, b + 4);
      bytes.append(b, 4);
    }
  std::ofstream(name, std::ios::binary) << bytes;
}

std::string commandOutput(const std::string& command) {
  std::string text;
  std::unique_ptr<FILE, int (*)(FILE*)> pipe(popen((command + " 2>&1").c_str(), "r"), pclose);
  char buffer[4096];
  while (pipe && std::fgets(buffer, sizeof buffer, pipe.get())) text += buffer;
  return text;
}

bool contains(const std::string& text, const std::string& part) { return text.find(part) != std::string::npos; }

}  // namespace

TEST(RasterFile, BigEndianLayoutAndStatisticsWithoutNullAndDummyCells) {
  const std::string dir = support::scratchDir("output");
  const std::string name = dir + "cplx";
  // 3 lines of 4 short-complex cells, big-endian, 10 header bytes, rows with
  // 3 prefix and 5 suffix bytes, a 7-byte footer.
  const int16_t cells[3][4][2] = {{{3, 4}, {0, 0}, {6, 8}, {77, 77}},
                                  {{-5, 12}, {8, -15}, {0, 0}, {0, 9}},
                                  {{0, 0}, {0, 0}, {0, 0}, {77, 77}}};
  std::string bytes(10, 'H');
  for (const auto& row : cells) {
    bytes += "ppp";
    for (const auto& cell : row)
      for (int16_t v : cell) bytes += char((v >> 8) & 0xff), bytes += char(v & 0xff);
    bytes += "sssss";
  }
  bytes += "FFFFFFF";
  std::ofstream(name, std::ios::binary) << bytes;
  auto h = rasterHeader(3, 4, "SHORT_COMPLEX");
  h.setField("RasterInfo.BytesOrder").setString("MSBF");
  h.setField("RasterInfo.HeaderOffset").setInt(10);
  h.setField("RasterInfo.RowPrefix").setInt(3);
  h.setField("RasterInfo.RowSuffix").setInt(5);
  h.setField("RasterInfo.FooterLen").setInt(7);
  h.setField("Processing.TimeDirectionLines").setString("DECREASE TIME DIRECTION");
  ASSERT_EQ(tesv_write_description_text(h, name + "_hdr"), 0);

  setenv("TESSIVOR_DUMMY_VALUE", "77", 1);
  CRasterFile raster(name);
  std::string error;
  ASSERT_EQ(raster.ReadHeader(&error), 0) << error;
  EXPECT_EQ(raster.LinesTimeDirectionText(), "Lines time direction : DECREASE");
  EXPECT_EQ(raster.PixelsTimeDirectionText(), "Pixels time direction : INCREASE");
  ASSERT_EQ(raster.OpenRead(&error), 0) << error;
  std::vector<float> row;
  ASSERT_EQ(raster.ReadAmplitudeRow(1, row), 0);
  EXPECT_FLOAT_EQ(row[0], 13.0f);
  EXPECT_FLOAT_EQ(row[1], 17.0f);
  EXPECT_TRUE(std::isnan(row[2]));
  EXPECT_FLOAT_EQ(row[3], 9.0f);

  // Valid amplitudes 5, 10, 13, 17, 9: mean 10.8.
  TiffControl control;
  RasterStatistics st;
  ASSERT_EQ(ComputeScaling(raster, SampleGrid{}, control, st), 0);
  EXPECT_EQ(st.points, 5);
  EXPECT_NEAR(st.mean, 10.8, 1e-12);
  EXPECT_NEAR(st.deviation, std::sqrt((25 + 100 + 169 + 289 + 81) / 5.0 - 10.8 * 10.8), 1e-9);
  EXPECT_NEAR(st.scale, 253.0 / (st.mean + 3.0 * st.deviation), 1e-12);
  EXPECT_EQ(ScaleToByte(0.0f, false, control, st), 1);
  EXPECT_EQ(ScaleToByte(1e6f, false, control, st), 254);
  EXPECT_EQ(ScaleToByte(5.0f, true, control, st), 0);
  // A grid of every second row and column sees (0,0) 5, (0,2) 10, (2,*) null.
  SampleGrid grid;
  grid.aSampleInc = 2;
  ASSERT_EQ(ComputeScaling(raster, grid, control, st), 0);
  EXPECT_EQ(st.points, 2);
  EXPECT_NEAR(st.mean, 7.5, 1e-12);
  raster.Close();
  unsetenv("TESSIVOR_DUMMY_VALUE");

  // A file shorter than its layout is refused, naming it.
  std::filesystem::resize_file(name, bytes.size() - 1);
  ASSERT_EQ(raster.OpenRead(&error), 4);
  EXPECT_TRUE(contains(error, name)) << error;
}

TEST(RasterFile, OnlyNullCellsFailWithTheStatisticsMessage) {
  const std::string dir = support::scratchDir("output");
  const std::string name = dir + "empty";
  writeFloatRaster(name, 6, 5, [](int, int) { return 0.0f; });
  auto h = rasterHeader(6, 5, "FLOAT32");
  ASSERT_EQ(tesv_write_description_text(h, name + "_hdr"), 0);
  testing::internal::CaptureStderr();
  const int st = tesv_raster_to_geotiff(focusingGeoTiffRequest(name, 0.0, 0, 0));
  const std::string err = testing::internal::GetCapturedStderr();
  EXPECT_NE(st, 0);
  EXPECT_TRUE(contains(err, "Error: 0 non null points in the input file \n")) << err;
  EXPECT_FALSE(std::filesystem::exists(name + ".tif"));
}

TEST(RasterFile, TiffProductsAsGdalReadsThem) {
  if (std::system("command -v gdalinfo > /dev/null 2>&1") != 0)
    GTEST_SKIP() << "gdalinfo not installed (scripts/install-deps.sh installs gdal-bin)";
  const std::string dir = support::scratchDir("output");
  const std::string name = dir + "geo";
  writeFloatRaster(name, 20, 30, [](int l, int s) { return 1.0f + l + 0.5f * s; }, true);
  auto h = rasterHeader(20, 30, "FLOAT32");
  h.setField("RasterInfo.BytesOrder").setString("MSBF");
  h.setField("RasterInfo.GeocodedImage").setString("YES");
  h.setField("CartographicSystem.State").setString("UTM-GLOBAL");
  h.setField("CartographicSystem.Zone").setInt(33);
  h.setField("CartographicSystem.Hemisphere").setString("NORTH");
  h.setField("RegistrationCoordinates.LonEasting").setDouble(400000.0);
  h.setField("RegistrationCoordinates.LatNorthing").setDouble(5000000.0);
  h.setField("RegistrationCoordinates.PixelSpacingLonEast").setDouble(12.5);
  h.setField("RegistrationCoordinates.PixelSpacingLatNorth").setDouble(12.5);
  for (int i = 1; i <= 4; ++i) {
    h.setField("CartographicSystem.CORNER POINT " + std::to_string(i) + "  X").setDouble(13.0 + 0.01 * (i % 2));
    h.setField("CartographicSystem.CORNER POINT " + std::to_string(i) + "  Y").setDouble(45.0 + 0.01 * (i / 3));
  }
  ASSERT_EQ(tesv_write_description_text(h, name + "_hdr"), 0);

  GeoTiffRequest request = focusingGeoTiffRequest(name, 0.0, 0, 0);
  ASSERT_EQ(tesv_raster_to_geotiff(request), 0);
  std::string info = commandOutput("gdalinfo '" + name + ".tif'");
  EXPECT_TRUE(contains(info, "Size is 30, 20")) << info;
  EXPECT_TRUE(contains(info, "Type=Byte, ColorInterp=Gray")) << info;
  EXPECT_TRUE(contains(info, "UTM zone 33N")) << info;
  EXPECT_TRUE(contains(info, "WGS 84")) << info;
  EXPECT_TRUE(contains(info, "Pixel Size = (12.500000000000000,-12.500000000000000)")) << info;
  EXPECT_EQ(readText(name + ".tif_hdr"), readText(name + "_hdr"));
  const std::string kml = readText(name + ".kml");
  EXPECT_EQ(kml.rfind("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<kml xmlns=\"http://earth.google.com/kml/2.0\">", 0), 0u);
  EXPECT_TRUE(contains(kml, "<north>45.01000000</north>")) << kml;
  EXPECT_TRUE(contains(kml, "<west>13.00000000</west>")) << kml;
  EXPECT_TRUE(contains(kml, "<href>geo.tif</href>")) << kml;
  // ENVI header of the float raster.
  info = commandOutput("gdalinfo '" + name + "'");
  EXPECT_TRUE(contains(info, "Driver: ENVI/")) << info;
  EXPECT_TRUE(contains(info, "Type=Float32")) << info;
  EXPECT_EQ(commandOutput("gdallocationinfo -valonly '" + name + "' 4 3"), "6\n");
  // Brightness grows with the line and the sample.
  auto pixel = [&](int x, int y) { return std::stoi(commandOutput("gdallocationinfo -valonly '" + name + ".tif' " + std::to_string(x) + " " + std::to_string(y))); };
  EXPECT_LT(pixel(0, 0), 20);
  EXPECT_GT(pixel(29, 19), 200);

  // Geographic WGS 84, half the rows, and a palette from a parameter file.
  h.getField("CartographicSystem.State")->setString("GEO-GLOBAL");
  h.getField("RegistrationCoordinates.PixelSpacingLonEast")->setDouble(0.001);
  h.getField("RegistrationCoordinates.PixelSpacingLatNorth")->setDouble(0.001);
  h.getField("RegistrationCoordinates.LonEasting")->setDouble(13.0);
  h.getField("RegistrationCoordinates.LatNorthing")->setDouble(45.0);
  ASSERT_EQ(tesv_write_description_text(h, name + "_hdr"), 0);
  std::string lut;
  for (int i = 0; i < 256; ++i) lut += std::to_string(i) + (i < 255 ? " " : "");
  std::ofstream(dir + "tiff.par") << "[TiffParameters]\nTiffRowScale = 2\nTiffRowsInvert = 1\nTiffColsInvert = 1\nTiffLUTRed = {" << lut
                                  << "}\nTiffLUTGreen = {" << lut << "}\nTiffLUTBlue = {" << lut << "}\n";
  request.parameterFile = dir + "tiff.par";
  ASSERT_EQ(tesv_raster_to_geotiff(request), 0);
  info = commandOutput("gdalinfo '" + name + ".tif'");
  EXPECT_TRUE(contains(info, "Size is 30, 10")) << info;
  EXPECT_GT(pixel(0, 0), 200);  // rows and columns reversed, every second row
  EXPECT_LT(pixel(29, 9), 20);
  EXPECT_TRUE(contains(info, "ColorInterp=Palette")) << info;
  EXPECT_TRUE(contains(info, "GEOGCRS[\"WGS 84\"")) << info;
  EXPECT_FALSE(contains(info, "UTM")) << info;

  // A state that is not a map name fails cleanly with its message.
  h.getField("CartographicSystem.State")->setString("MOON");
  ASSERT_EQ(tesv_write_description_text(h, name + "_hdr"), 0);
  std::filesystem::remove(name + ".tif");
  testing::internal::CaptureStderr();
  EXPECT_NE(tesv_raster_to_geotiff(request), 0);
  const std::string err = testing::internal::GetCapturedStderr();
  EXPECT_TRUE(contains(err, "State specified in the Image header or GCP File is invalid.")) << err;
  EXPECT_FALSE(std::filesystem::exists(name + ".tif"));
}

TEST(RasterFile, MapKeyFailuresNameTheField) {
  auto h = rasterHeader(2, 2, "FLOAT32");
  h.setField("RasterInfo.GeocodedImage").setString("YES");
  h.setField("CartographicSystem.State").setString("UTM-GLOBAL");
  h.setField("CartographicSystem.Zone").setInt(61);
  for (const char* key : {"LonEasting", "LatNorthing", "PixelSpacingLonEast", "PixelSpacingLatNorth"})
    h.setField(std::string("RegistrationCoordinates.") + key).setDouble(1.0);
  MapKeys keys;
  std::string error;
  EXPECT_EQ(ReadMapKeys(h, keys, error), 1);
  EXPECT_EQ(error, "Zone not found [61]");
  h.getField("CartographicSystem.Zone")->setInt(31);
  h.setField("CartographicSystem.Hemisphere").setString("EAST");
  EXPECT_EQ(ReadMapKeys(h, keys, error), 1);
  EXPECT_EQ(error, "Hemisphere not found [EAST]");
  h.getField("CartographicSystem.Hemisphere")->setString("SOUTH");
  ASSERT_EQ(ReadMapKeys(h, keys, error), 0);
  EXPECT_EQ(keys.Zone, 31);
  // A projected state needs the map list of the map folder.
  const std::string dir = support::scratchDir("output");
  setenv("TESSIVOR_MAP_FILES_DIR", dir.c_str(), 1);
  h.getField("CartographicSystem.State")->setString("LAMBERT72");
  EXPECT_EQ(ReadMapKeys(h, keys, error), 9);
  EXPECT_EQ(error, "Error: missing map file " + dir + "map_list");
  std::ofstream(dir + "map_list") << "[map_list]\nprojection_LCC = lcc.map\nhemisphere_NORTH = n\n";
  h.setField("CartographicSystem.Projection").setString("LCC");
  EXPECT_EQ(ReadMapKeys(h, keys, error), 1);
  EXPECT_EQ(error, "Hemisphere not found [SOUTH]");
  h.getField("CartographicSystem.Projection")->setString("TM");
  EXPECT_EQ(ReadMapKeys(h, keys, error), 1);
  EXPECT_EQ(error, "Projrction not found [TM]");
  unsetenv("TESSIVOR_MAP_FILES_DIR");
  h.getField("RegistrationCoordinates.LonEasting")->setString("east");
  EXPECT_EQ(ReadMapKeys(h, keys, error), 1);
  EXPECT_EQ(error, "Wrong map field. Please check.");
}
