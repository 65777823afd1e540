// Side files of a user-facing raster: the KML 2.0 ground overlay and the
// ENVI header.
#include "output/raster_side_files.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "output/description_xml.h"
#include "product/profile.h"

namespace {
namespace fs = std::filesystem;
}  // namespace

// ------------------------------------------------------------------ KML

int WriteKmlOverlay(const tesv_description_section& h, const std::string& kmlName,
                    const std::string& imageHref, const std::string& title) {
  double north = -1e9, south = 1e9, east = -1e9, west = 1e9;
  int corners = 0;
  for (int i = 1; i <= 4; ++i) {
    const std::string base = "CartographicSystem.CORNER POINT " + std::to_string(i) + "  ";
    double lon = 0.0, lat = 0.0;
    if (!headerDouble(h, base + "X", lon) || !headerDouble(h, base + "Y", lat)) continue;
    if (!std::isfinite(lat) || !std::isfinite(lon) || std::fabs(lat) > 90.0 || std::fabs(lon) > 360.0)
      continue;
    north = std::max(north, lat), south = std::min(south, lat);
    east = std::max(east, lon), west = std::min(west, lon);
    ++corners;
  }
  if (corners < 2) {
    ORV_REPORT("No corner points for the KML overlay " + kmlName, REPORT_WARNING);
    return STATUS_BAD_CONDITION;
  }
  const double lat = 0.5 * (north + south), lon = 0.5 * (east + west);
  const double metresPerDegree = 111320.0;
  const double extent = std::hypot((north - south) * metresPerDegree,
                                   (east - west) * metresPerDegree * std::cos(lat * consts::kPi / 180.0));
  std::FILE* f = std::fopen(kmlName.c_str(), "w");
  if (!f) {
    ORV_REPORT("File not opened! " + kmlName, REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }
  std::fprintf(f, "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n");
  std::fprintf(f, "<kml xmlns=\"http://earth.google.com/kml/2.0\">\n");
  std::fprintf(f, "<GroundOverlay>\n");
  std::fprintf(f, "  <description>%s</description>\n", tesv_xml_escape(title).c_str());
  std::fprintf(f, "  <name>%s</name>\n", tesv_xml_escape(title).c_str());
  std::fprintf(f, "  <LookAt>\n    <longitude>%.8f</longitude>\n    <latitude>%.8f</latitude>\n", lon, lat);
  std::fprintf(f, "    <range>%.1f</range>\n    <tilt>0</tilt>\n    <heading>0</heading>\n  </LookAt>\n",
               std::max(2.0 * extent, 1000.0));
  std::fprintf(f, "  <visibility>1</visibility>\n  <color>ffffffff</color>\n");
  std::fprintf(f, "  <Icon>\n    <href>%s</href>\n  </Icon>\n", tesv_xml_escape(imageHref).c_str());
  std::fprintf(f, "  <LatLonBox>\n    <north>%.8f</north>\n    <south>%.8f</south>\n", north, south);
  std::fprintf(f, "    <east>%.8f</east>\n    <west>%.8f</west>\n    <rotation>0</rotation>\n", east, west);
  std::fprintf(f, "  </LatLonBox>\n</GroundOverlay>\n</kml>\n");
  const bool ok = std::ferror(f) == 0;
  if (std::fclose(f) != 0 || !ok) return STATUS_WRITE_FAILED;
  return 0;
}

// ------------------------------------------------------------------ ENVI

int WriteEnviHeader(const CRasterFile& raster, std::string& error) {
  const std::string target = raster.Name() + ".hdr";
  std::error_code ec;
  if (fs::exists(target, ec)) {
    std::ifstream in(target);
    std::string first;
    std::getline(in, first);
    if (first != "ENVI") {
      error = target + " is a product record, not an ENVI header: left as it is";
      return STATUS_BAD_CONDITION;
    }
  }
  std::string type = "default";
  headerString(raster.Header(), "RasterInfo.ENVI_HeaderDescriptionType", type);
  const std::string des =
      tesvEnvOrDefault("TESSIVOR_CEOS_DES_FILES_DIR") + "ENVI_descriptions_" + type + ".des";
  if (!fs::exists(des, ec)) {
    error = "ENVI description file not found: " + des;
    return STATUS_NOT_OPENED;
  }
  const char* section = "ENVI";
  auto text = [&](const char* key) {
    std::string v;
    GetMyProfileString(section, key, v, des);
    return v;
  };
  std::vector<int> types, orders;
  std::vector<std::string> layouts(3);
  int width = 0;
  GetMyProfileIntArray(section, "WIDTH_CHAR", &width, 1, des);
  const bool tables = GetMyProfileIntArray(section, "DATATYPE_VALS", types, 10, des) == 0 &&
                      GetMyProfileIntArray(section, "BYTEORDER_VALS", orders, 2, des) == 0 &&
                      GetMyProfileStringArray(section, "LAYOUT_VALS", layouts, 3, 16, des) == 0;
  const std::string names[] = {text("NCOLS_NAME"),   text("NROWS_NAME"),    text("NBANDS_NAME"),
                               text("HEADERBYTES_NAME"), text("DATATYPE_NAME"), text("SENSOR_TYPE"),
                               text("LAYOUT_NAME"),  text("BYTEORDER_NAME")};
  FreeProfile(des);
  if (!tables || std::any_of(std::begin(names), std::end(names), [](const std::string& s) { return s.empty(); })) {
    error = "ENVI description file incomplete: " + des;
    return STATUS_BAD_PARAMETER;
  }
  const int enviType = types[size_t(raster.CellType)];
  if (enviType <= 0 || raster.RowPrefix != 0 || raster.RowSuffix != 0) {
    error = "ENVI cannot describe the layout of " + raster.Name();
    return STATUS_BAD_PARAMETER;
  }
  std::string acquisition = "NOT_AVAILABLE";
  headerString(raster.Header(), "InitialGeometry.ACQUISITION_TIME", acquisition);
  std::ostringstream o;
  o << "ENVI\ndescription = {\n";
  o << "ACQUISITION TIME = " << acquisition << "\n";
  o << "MASTER ACQUISITION TIME = " << acquisition << "\n";
  o << "SLAVE ACQUISITION TIME = NOT_AVAILABLE\n";
  o << "   File generated with Tessivor 4.2.000 }\n";
  auto line = [&](const std::string& key, const std::string& value) {
    std::string k = key;
    if (int(k.size()) < width) k.resize(size_t(width), ' ');
    o << k << " = " << value << "\n";
  };
  line(names[0], std::to_string(raster.NrOfPixelsPerLine));
  line(names[1], std::to_string(raster.NrOfLinesPerImage));
  line(names[2], std::to_string(raster.NrOfChannels));
  line(names[3], std::to_string(raster.HeaderOffset));
  line("file type", "ENVI Standard");
  line(names[4], std::to_string(enviType));
  line(names[6], layouts[0]);
  line(names[5], "Unknown");
  line(names[7], std::to_string(orders[raster.MostSignificantByteFirst ? 1 : 0]));
  std::ofstream out(target, std::ios::binary | std::ios::trunc);
  out << o.str();
  if (!out) {
    error = "File writing failed! " + target;
    return STATUS_WRITE_FAILED;
  }
  return 0;
}
