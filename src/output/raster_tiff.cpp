// 8-bit TIFF products of rasters, with the GeoTIFF keys of the two global
// map states, and the map keys of description headers.
#include "output/raster_tiff.h"

#include <geotiff.h>
#include <geovalues.h>
#include <tiffio.h>
#include <xtiffio.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "output/description_xml.h"
#include "product/profile.h"

namespace {
namespace fs = std::filesystem;
}  // namespace

// ------------------------------------------------------------------ map keys

namespace {

const std::vector<std::string>& mapStates() {
  static const std::vector<std::string> states = {
      "GEO-GLOBAL", "UTM-GLOBAL", "ALBERS",  "UTM",    "MERCATOR",           "LAMBERTFRANCE", "LAMBERT72",
      "LAMBERTWGS84", "LAMBERT2008", "UPS", "GNOMONIC", "MILLER", "POLAR_STEREOGRAPHIC", "NONE"};
  return states;
}

bool known(const std::vector<std::string>& list, const std::string& v) {
  return std::find(list.begin(), list.end(), v) != list.end();
}

}  // namespace

int ReadMapKeys(const tesv_description_section& h, MapKeys& k, std::string& error) {
  k = MapKeys{};
  if (!h.getField("RasterInfo.GeocodedImage")) return 0;
  k.geocoded = true;
  const std::string cs = "CartographicSystem.";
  if (!headerString(h, cs + "State", k.State) || !known(mapStates(), k.State)) {
    error = "State specified in the Image header or GCP File is invalid.";
    return STATUS_BAD_CONDITION;
  }
  headerString(h, cs + "Hemisphere", k.Hemisphere);
  headerString(h, cs + "Projection", k.Projection);
  headerString(h, cs + "Ellipsoid", k.Ellipsoid);
  headerString(h, cs + "DatumShift", k.DatumShift);
  headerDouble(h, cs + "ReferenceHeight", k.ReferenceHeight);
  long long zone = 0;
  if (h.getField(cs + "Zone") && !headerInt(h, cs + "Zone", zone)) {
    error = "Wrong map field. Please check.";
    return STATUS_BAD_CONDITION;
  }
  k.Zone = int(zone);
  const std::string rc = "RegistrationCoordinates.";
  if (!headerDouble(h, rc + "LonEasting", k.LonEasting) || !headerDouble(h, rc + "LatNorthing", k.LatNorthing) ||
      !headerDouble(h, rc + "PixelSpacingLonEast", k.PixelSpacingLonEast) ||
      !headerDouble(h, rc + "PixelSpacingLatNorth", k.PixelSpacingLatNorth)) {
    error = "Wrong map field. Please check.";
    return STATUS_BAD_CONDITION;
  }
  if (k.State == "GEO-GLOBAL" || k.State == "NONE") return 0;
  if (k.State == "UTM-GLOBAL") {
    if (!k.Hemisphere.empty() && k.Hemisphere != "NORTH" && k.Hemisphere != "SOUTH") {
      error = "Hemisphere not found [" + k.Hemisphere + "]";
      return STATUS_BAD_CONDITION;
    }
    if (k.Zone < 1 || k.Zone > 60) {
      error = "Zone not found [" + std::to_string(k.Zone) + "]";
      return STATUS_BAD_CONDITION;
    }
    return 0;
  }
  // A projected state names its parameters in the map folder.
  const std::string list = tesvEnvOrDefault("TESSIVOR_MAP_FILES_DIR") + "map_list";
  std::error_code ec;
  if (!fs::exists(list, ec)) {
    error = "Error: missing map file " + list;
    return STATUS_NOT_OPENED;
  }
  const std::string section = "map_list";
  std::string value;
  struct Check {
    const char* prefix;
    const std::string* value;
    const char* message;
  };
  const std::string zoneText = std::to_string(k.Zone);
  for (const Check& c : {Check{"projection_", &k.Projection, "Projrction not found ["},
                         Check{"hemisphere_", &k.Hemisphere, "Hemisphere not found ["},
                         Check{"zone_", &zoneText, "Zone not found ["},
                         Check{"ellipsoid_", &k.Ellipsoid, "Ellipsoid not found ["},
                         Check{"datumshift_", &k.DatumShift, "Datum shift not found ["}}) {
    if (GetMyProfileString(section, c.prefix + *c.value, value, list) != 0) {
      error = std::string(c.message) + *c.value + "]";
      FreeProfile(list);
      return STATUS_BAD_CONDITION;
    }
  }
  FreeProfile(list);
  return 0;
}

// ------------------------------------------------------------------ TIFF

namespace {

// An operator who writes a percentage above 100 into the progress file stops
// the run here as anywhere else.
void checkOperatorStop() {
  if (getAndSetPerc(0, 0, nullptr)) return;
  traceWrite("\n EXECUTION INTERRUPTED BY OPERATOR\n");
  TESV_FATAL(EC_INTERRUPTED, "EXECUTION INTERRUPTED BY OPERATOR");
}

struct TiffCloser {
  void operator()(TIFF* t) const { XTIFFClose(t); }
};

void setGeoKeys(TIFF* tif, const MapKeys& map, double rowStep, double colStep) {
  if (!map.geocoded) {
    ORV_REPORT("No Geocoded Image", REPORT_MESSAGE);
    return;
  }
  if (map.State != "GEO-GLOBAL" && map.State != "UTM-GLOBAL") {
    ORV_REPORT("Map " + map.State + " : Projection " + map.Projection + " Zone " + std::to_string(map.Zone) +
                   " Ellipsoid " + map.Ellipsoid + " DatumShift " + map.DatumShift + " (no GeoTIFF keys)",
               REPORT_MESSAGE);
    return;
  }
  double tie[6] = {0.0, 0.0, 0.0, map.LonEasting, map.LatNorthing, 0.0};
  double scale[3] = {std::fabs(map.PixelSpacingLonEast) * colStep,
                     std::fabs(map.PixelSpacingLatNorth) * rowStep, 0.0};
  TIFFSetField(tif, TIFFTAG_GEOTIEPOINTS, 6, tie);
  TIFFSetField(tif, TIFFTAG_GEOPIXELSCALE, 3, scale);
  GTIF* gtif = GTIFNew(tif);
  if (!gtif) return;
  GTIFKeySet(gtif, GTRasterTypeGeoKey, TYPE_SHORT, 1, RasterPixelIsArea);
  if (map.State == "GEO-GLOBAL") {
    GTIFKeySet(gtif, GTModelTypeGeoKey, TYPE_SHORT, 1, ModelGeographic);
    GTIFKeySet(gtif, GTCitationGeoKey, TYPE_ASCII, 0, "Geographic Model WGS 84");
    GTIFKeySet(gtif, GeographicTypeGeoKey, TYPE_SHORT, 1, GCS_WGS_84);
    GTIFKeySet(gtif, GeogAngularUnitsGeoKey, TYPE_SHORT, 1, Angular_Degree);
    GTIFKeySet(gtif, GeogCitationGeoKey, TYPE_ASCII, 0, "WGS 84 Ellipsoid Used");
  } else {
    const bool north = map.Hemisphere == "NORTH";
    const char* h = north ? "N" : "S";
    char citation[80], pcs[80];
    std::snprintf(citation, sizeof citation, "UTM Zone %d%s WGS84", map.Zone, h);
    std::snprintf(pcs, sizeof pcs, "UTM Zone %d%s  with WGS84", map.Zone, h);
    GTIFKeySet(gtif, GTModelTypeGeoKey, TYPE_SHORT, 1, ModelProjected);
    GTIFKeySet(gtif, GTCitationGeoKey, TYPE_ASCII, 0, citation);
    GTIFKeySet(gtif, ProjectedCSTypeGeoKey, TYPE_SHORT, 1, (north ? 32600 : 32700) + map.Zone);
    GTIFKeySet(gtif, PCSCitationGeoKey, TYPE_ASCII, 0, pcs);
    GTIFKeySet(gtif, ProjLinearUnitsGeoKey, TYPE_SHORT, 1, Linear_Meter);
  }
  GTIFWriteKeys(gtif);
  GTIFFree(gtif);
}

}  // namespace

int WriteRasterTiff(CRasterFile& raster, const std::string& tiffName, const TiffControl& c,
                    const RasterStatistics& st, const MapKeys& map) {
  const int L = raster.NrOfLinesPerImage, S = raster.NrOfPixelsPerLine;
  const double rowStep = std::max(c.TiffRowScale, 1.0), colStep = std::max(c.TiffColScale, 1.0);
  const int outRows = std::max(1, int(std::floor((L - 1) / rowStep)) + 1);
  const int outCols = std::max(1, int(std::floor((S - 1) / colStep)) + 1);
  const bool palette = !c.TiffLUTRed.empty() || !c.TiffLUTGreen.empty() || !c.TiffLUTBlue.empty();

  std::unique_ptr<TIFF, TiffCloser> tif(XTIFFOpen(tiffName.c_str(), "w"));
  if (!tif) {
    ORV_REPORT("File not opened! " + tiffName, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  TIFF* t = tif.get();
  TIFFSetField(t, TIFFTAG_IMAGEWIDTH, uint32_t(outCols));
  TIFFSetField(t, TIFFTAG_IMAGELENGTH, uint32_t(outRows));
  TIFFSetField(t, TIFFTAG_BITSPERSAMPLE, 8);
  TIFFSetField(t, TIFFTAG_SAMPLESPERPIXEL, 1);
  TIFFSetField(t, TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG);
  TIFFSetField(t, TIFFTAG_COMPRESSION, COMPRESSION_NONE);
  TIFFSetField(t, TIFFTAG_ROWSPERSTRIP, 1);
  const std::string description = "Image generated with : " + tesv_program_name();
  TIFFSetField(t, TIFFTAG_IMAGEDESCRIPTION, description.c_str());
  if (palette) {
    std::vector<uint16_t> red, green, blue;
    try {
      if (c.TiffLUTRed.size() != 256 || c.TiffLUTGreen.size() != 256 || c.TiffLUTBlue.size() != 256)
        throw std::bad_alloc();
      red.resize(256), green.resize(256), blue.resize(256);
    } catch (const std::bad_alloc&) {
      std::fprintf(stderr, "No space for colormap.\n");
      ORV_REPORT("No space for colormap.", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    // 8-bit table entries widened to the 16-bit colour map.
    for (int i = 0; i < 256; ++i) {
      red[i] = uint16_t(std::clamp(c.TiffLUTRed[i], 0, 255) * 257);
      green[i] = uint16_t(std::clamp(c.TiffLUTGreen[i], 0, 255) * 257);
      blue[i] = uint16_t(std::clamp(c.TiffLUTBlue[i], 0, 255) * 257);
    }
    TIFFSetField(t, TIFFTAG_PHOTOMETRIC, PHOTOMETRIC_PALETTE);
    TIFFSetField(t, TIFFTAG_COLORMAP, red.data(), green.data(), blue.data());
  } else {
    TIFFSetField(t, TIFFTAG_PHOTOMETRIC, PHOTOMETRIC_MINISBLACK);
  }
  setGeoKeys(t, map, rowStep, colStep);

  std::vector<float> amplitude;
  std::vector<unsigned char> bytes(size_t(outCols), 0);
  for (int o = 0; o < outRows; ++o) {
    if (o % 8 == 0) checkOperatorStop();
    int row = std::min(L - 1, int(std::lround(o * rowStep)));
    if (c.TiffRowsInvert) row = L - 1 - row;
    if (int status = raster.ReadAmplitudeRow(row, amplitude); status != 0) {
      ORV_REPORT("File reading failed! " + raster.Name(), REPORT_ERROR);
      return status;
    }
    for (int k = 0; k < outCols; ++k) {
      int col = std::min(S - 1, int(std::lround(k * colStep)));
      if (c.TiffColsInvert) col = S - 1 - col;
      const float v = amplitude[size_t(col)];
      const bool null = !std::isfinite(v) ||
                        (c.haveNullCellValue && v == float(std::fabs(c.NullCellValue)));
      bytes[size_t(k)] = ScaleToByte(v, null, c, st);
    }
    if (TIFFWriteScanline(t, bytes.data(), uint32_t(o), 0) < 0) {
      ORV_REPORT("File writing failed! " + tiffName, REPORT_ERROR);
      return STATUS_WRITE_FAILED;
    }
  }
  return 0;
}

