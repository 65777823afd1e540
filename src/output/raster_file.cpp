// Rasters with a text description header, their byte scaling, and the
// user-facing side products: TIFF with GeoTIFF keys, KML overlay, ENVI header.
#include "output/raster_file.h"

#include <geotiff.h>
#include <geovalues.h>
#include <tiffio.h>
#include <xtiffio.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <limits>
#include <memory>
#include <sstream>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "output/description_text.h"
#include "output/description_xml.h"
#include "product/cell_type.h"
#include "product/profile.h"

namespace {

namespace fs = std::filesystem;

void setError(std::string* error, const std::string& text) {
  if (error) *error = text;
}

const tesv_description_field* field(const tesv_description_section& h, const std::string& name) {
  return h.getField(name);
}

bool getDouble(const tesv_description_section& h, const std::string& name, double& v) {
  const auto* f = field(h, name);
  return f && f->getDouble(v) == 0;
}

bool getInt(const tesv_description_section& h, const std::string& name, long long& v) {
  const auto* f = field(h, name);
  return f && f->getInt(v) == 0;
}

bool getString(const tesv_description_section& h, const std::string& name, std::string& v) {
  const auto* f = field(h, name);
  return f && f->getString(v) == 0;
}

// Value of a component of `size` bytes of a cell of type `type`.
double component(const char* p, int type, bool swap) {
  char b[8];
  const int size = cell_type_component_size(type);
  std::memcpy(b, p, size);
  if (swap) std::reverse(b, b + size);
  switch (type) {
    case FLOAT_COMPLEX:
    case FLOAT32: {
      float v;
      std::memcpy(&v, b, 4);
      return v;
    }
    case DOUBLE_COMPLEX:
    case FLOAT64: {
      double v;
      std::memcpy(&v, b, 8);
      return v;
    }
    case INT32_COMPLEX:
    case INT32: {
      int32_t v;
      std::memcpy(&v, b, 4);
      return v;
    }
    case SHORT_COMPLEX:
    case INT16: {
      int16_t v;
      std::memcpy(&v, b, 2);
      return v;
    }
    default: {
      int8_t v;
      std::memcpy(&v, b, 1);
      return v;
    }
  }
}

bool dummyValue(double& value) {
  std::string text;
  if (tesvGetEnv("TESSIVOR_DUMMY_VALUE", text) != 0 || text.empty()) return false;
  return parseDescriptionDouble(text, value);
}

}  // namespace

// ------------------------------------------------------------------ raster

int CRasterFile::ReadHeader(std::string* error) {
  const std::string file = name_ + "_hdr";
  header_ = tesv_description_section("HEADER_INFO");
  std::string why;
  const int st = tesv_read_description_text(file, header_, &why);
  if (st == STATUS_NOT_OPENED) {
    setError(error, "Header file not found: " + file);
    return st;
  }
  if (st != 0) {
    setError(error, "Header file cannot be read: " + file + (why.empty() ? "" : " (" + why + ")"));
    return STATUS_READ_FAILED;
  }
  long long v = 0;
  if (!getInt(header_, "RasterInfo.NrOfLinesPerImage", v) || v < 1 || v > INT32_MAX) {
    setError(error, "No valid NrOfLinesPerImage in " + file);
    return STATUS_BAD_PARAMETER;
  }
  NrOfLinesPerImage = static_cast<int>(v);
  if (!getInt(header_, "RasterInfo.NrOfPixelsPerLine", v) || v < 1 || v > INT32_MAX) {
    setError(error, "No valid NrOfPixelsPerLine in " + file);
    return STATUS_BAD_PARAMETER;
  }
  NrOfPixelsPerLine = static_cast<int>(v);
  std::string text;
  CellType = -1;
  if (getString(header_, "RasterInfo.CellType", text)) {
    CellType = cell_type_from_text(text);
    long long number = 0;
    if (CellType < 0 && parseDescriptionInt(text, number) && cell_type_valid(int(number)))
      CellType = int(number);
  }
  if (!cell_type_valid(CellType)) {
    setError(error, "No valid CellType in " + file);
    return STATUS_BAD_PARAMETER;
  }
  auto intOr = [&](const char* key, long long fallback) {
    long long x = fallback;
    return getInt(header_, key, x) ? x : fallback;
  };
  HeaderOffset = intOr("RasterInfo.HeaderOffset", 0);
  RowPrefix = int(intOr("RasterInfo.RowPrefix", 0));
  RowSuffix = int(intOr("RasterInfo.RowSuffix", 0));
  FooterLen = intOr("RasterInfo.FooterLen", 0);
  NrOfChannels = int(intOr("RasterInfo.NrOfChannels", 1));
  if (HeaderOffset < 0 || RowPrefix < 0 || RowSuffix < 0 || FooterLen < 0 || NrOfChannels < 1) {
    setError(error, "Negative layout value in " + file);
    return STATUS_BAD_PARAMETER;
  }
  getDouble(header_, "RasterInfo.RealScaleFactor", RealScaleFactor);
  getDouble(header_, "RasterInfo.ImaginaryScaleFactor", ImaginaryScaleFactor);
  getDouble(header_, "RasterInfo.NullCellValue", NullCellValue);
  getString(header_, "RasterInfo.DataUnits", DataUnits);
  MostSignificantByteFirst = getString(header_, "RasterInfo.BytesOrder", text) && text == "MSBF";
  LinesTimeIncrease = !(getString(header_, "Processing.TimeDirectionLines", text) &&
                        text.find("DECREASE") != std::string::npos);
  PixelsTimeIncrease = !(getString(header_, "Processing.TimeDirectionPixels", text) &&
                         text.find("DECREASE") != std::string::npos);
  return 0;
}

int64_t CRasterFile::RowBytes() const {
  return RowPrefix + int64_t(NrOfPixelsPerLine) * cell_type_size(CellType) + RowSuffix;
}

std::string CRasterFile::LinesTimeDirectionText() const {
  return std::string("Lines time direction : ") + (LinesTimeIncrease ? "INCREASE" : "DECREASE");
}

std::string CRasterFile::PixelsTimeDirectionText() const {
  return std::string("Pixels time direction : ") + (PixelsTimeIncrease ? "INCREASE" : "DECREASE");
}

int CRasterFile::OpenRead(std::string* error) {
  Close();
  std::error_code ec;
  const auto size = fs::file_size(name_, ec);
  stream_.open(name_, std::ios::binary);
  if (ec || !stream_) {
    setError(error, "File not opened! " + name_);
    return STATUS_NOT_OPENED;
  }
  if (static_cast<int64_t>(size) < LayoutBytes()) {
    setError(error, "File " + name_ + " holds " + std::to_string(size) + " bytes, its header describes " +
                        std::to_string(LayoutBytes()));
    stream_.close();
    return STATUS_READ_FAILED;
  }
  rowBuffer_.assign(static_cast<size_t>(RowBytes()), 0);
  state_ = READ;
  return 0;
}

void CRasterFile::Close() {
  if (stream_.is_open()) stream_.close();
  state_ = CLOSED;
}

int CRasterFile::ReadAmplitudeRow(int row, std::vector<float>& values) {
  if (state_ != READ || row < 0 || row >= NrOfLinesPerImage) return STATUS_READ_FAILED;
  stream_.seekg(RowStart(row));
  stream_.read(rowBuffer_.data(), RowBytes());
  if (!stream_) return STATUS_READ_FAILED;
  double dummy = 0.0;
  const bool haveDummy = dummyValue(dummy);
  const bool complex = cell_type_complex(CellType);
  const int size = cell_type_size(CellType), half = cell_type_component_size(CellType);
  const bool swap = MostSignificantByteFirst;
  values.resize(static_cast<size_t>(NrOfPixelsPerLine));
  const char* p = rowBuffer_.data() + RowPrefix;
  constexpr float kNull = std::numeric_limits<float>::quiet_NaN();
  for (int s = 0; s < NrOfPixelsPerLine; ++s, p += size) {
    const double re = component(p, CellType, swap);
    if (complex) {
      const double im = component(p + half, CellType, swap);
      const bool skip = (re == NullCellValue && im == NullCellValue) ||
                        (haveDummy && re == dummy && im == dummy);
      values[s] = skip ? kNull : float(std::hypot(re * RealScaleFactor, im * ImaginaryScaleFactor));
    } else {
      const bool skip = re == NullCellValue || (haveDummy && re == dummy);
      values[s] = skip ? kNull : float(std::fabs(re * RealScaleFactor));
    }
  }
  return 0;
}

// ------------------------------------------------------------------ scaling

int ReadTiffControl(const std::string& file, TiffControl& c) {
  std::error_code ec;
  if (!fs::exists(file, ec)) {
    std::fprintf(stderr, "Error: missing parameter file %s\n", file.c_str());
    ORV_REPORT("Error: missing parameter file " + file, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  const char* section = "TiffParameters";
  auto real = [&](const char* key, double& v) {
    std::string text;
    double x = 0.0;
    if (GetMyProfileString(section, key, text, file) == 0 && parseDescriptionDouble(text, x)) v = x;
  };
  auto integer = [&](const char* key, int& v) {
    std::string text;
    long long x = 0;
    if (GetMyProfileString(section, key, text, file) == 0 && parseDescriptionInt(text, x)) v = int(x);
  };
  real("TiffMinValue", c.TiffMinValue);
  real("TiffMaxValue", c.TiffMaxValue);
  std::string text;
  if (GetMyProfileString(section, "NullCellValue", text, file) == 0 &&
      parseDescriptionDouble(text, c.NullCellValue))
    c.haveNullCellValue = true;
  real("TiffScale", c.TiffScale);
  real("TiffExponent", c.TiffExponent);
  real("TiffRowScale", c.TiffRowScale);
  real("TiffColScale", c.TiffColScale);
  integer("TiffColsInvert", c.TiffColsInvert);
  integer("TiffRowsInvert", c.TiffRowsInvert);
  for (auto [key, lut] : {std::pair{"TiffLUTRed", &c.TiffLUTRed}, std::pair{"TiffLUTGreen", &c.TiffLUTGreen},
                          std::pair{"TiffLUTBlue", &c.TiffLUTBlue}}) {
    std::vector<int> table;
    if (GetMyProfileString(section, key, text, file) == 0 &&
        GetMyProfileIntArray(section, key, table, 256, file) == 0)
      *lut = table;
  }
  FreeProfile(file);
  return 0;
}

int SampleStepFor(int lines, int samples, long long maxPoints) {
  if (maxPoints < 1) return 1;
  const double all = double(lines) * double(samples);
  int step = static_cast<int>(std::ceil(std::sqrt(all / double(maxPoints))));
  return std::max(step, 1);
}

int ComputeScaling(CRasterFile& raster, const SampleGrid& grid, const TiffControl& control,
                   RasterStatistics& st) {
  const int L = raster.NrOfLinesPerImage, S = raster.NrOfPixelsPerLine;
  const int r0 = std::clamp(grid.aSampleRowStart, 0, L - 1);
  const int r1 = grid.aSampleRowEnd > 0 ? std::clamp(grid.aSampleRowEnd, r0, L - 1) : L - 1;
  const int c0 = std::clamp(grid.aSampleColStart, 0, S - 1);
  const int c1 = grid.aSampleColEnd > 0 ? std::clamp(grid.aSampleColEnd, c0, S - 1) : S - 1;
  const int inc = std::max(grid.aSampleInc, 1);
  std::vector<float> row;
  double sum = 0.0, sum2 = 0.0;
  long long n = 0;
  for (int r = r0; r <= r1; r += inc) {
    if (int status = raster.ReadAmplitudeRow(r, row); status != 0) return status;
    for (int c = c0; c <= c1; c += inc) {
      const float v = row[size_t(c)];
      if (!std::isfinite(v)) continue;
      if (control.haveNullCellValue && v == float(std::fabs(control.NullCellValue))) continue;
      sum += v;
      sum2 += double(v) * v;
      ++n;
    }
  }
  st.points = n;
  if (n == 0) {
    std::fprintf(stderr, "Error: 0 non null points in the input file \n");
    ORV_REPORT("Error: 0 non null points in the input file " + raster.Name(), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  st.mean = sum / double(n);
  st.deviation = std::sqrt(std::max(sum2 / double(n) - st.mean * st.mean, 0.0));
  st.exponent = control.TiffExponent > 0.0 ? control.TiffExponent : 1.0;
  if (control.TiffScale > 0.0) {
    st.scale = control.TiffScale;
  } else {
    const double top = std::pow(st.mean + 3.0 * st.deviation, st.exponent);
    st.scale = top > 0.0 ? (control.TiffMaxValue - control.TiffMinValue) / top : 1.0;
  }
  char line[160];
  std::snprintf(line, sizeof line, "\t\tSTATISTICS   Scale : %lf  ;  Exponent : %lf", st.scale,
                st.exponent);
  if (tracingActive()) traceWrite("%s\n", line);
  ORV_REPORT(line, REPORT_MESSAGE);
  return 0;
}

unsigned char ScaleToByte(float amplitude, bool null, const TiffControl& c, const RasterStatistics& st) {
  if (null || !std::isfinite(amplitude)) return 0;
  const double v = c.TiffMinValue + st.scale * std::pow(double(amplitude), st.exponent);
  const double byte = std::clamp(std::round(v), c.TiffMinValue, c.TiffMaxValue);
  return static_cast<unsigned char>(std::clamp(byte, 0.0, 255.0));
}

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
  if (!field(h, "RasterInfo.GeocodedImage")) return 0;
  k.geocoded = true;
  const std::string cs = "CartographicSystem.";
  if (!getString(h, cs + "State", k.State) || !known(mapStates(), k.State)) {
    error = "State specified in the Image header or GCP File is invalid.";
    return 1;
  }
  getString(h, cs + "Hemisphere", k.Hemisphere);
  getString(h, cs + "Projection", k.Projection);
  getString(h, cs + "Ellipsoid", k.Ellipsoid);
  getString(h, cs + "DatumShift", k.DatumShift);
  getDouble(h, cs + "ReferenceHeight", k.ReferenceHeight);
  long long zone = 0;
  if (field(h, cs + "Zone") && !getInt(h, cs + "Zone", zone)) {
    error = "Wrong map field. Please check.";
    return 1;
  }
  k.Zone = int(zone);
  const std::string rc = "RegistrationCoordinates.";
  if (!getDouble(h, rc + "LonEasting", k.LonEasting) || !getDouble(h, rc + "LatNorthing", k.LatNorthing) ||
      !getDouble(h, rc + "PixelSpacingLonEast", k.PixelSpacingLonEast) ||
      !getDouble(h, rc + "PixelSpacingLatNorth", k.PixelSpacingLatNorth)) {
    error = "Wrong map field. Please check.";
    return 1;
  }
  if (k.State == "GEO-GLOBAL" || k.State == "NONE") return 0;
  if (k.State == "UTM-GLOBAL") {
    if (!k.Hemisphere.empty() && k.Hemisphere != "NORTH" && k.Hemisphere != "SOUTH") {
      error = "Hemisphere not found [" + k.Hemisphere + "]";
      return 1;
    }
    if (k.Zone < 1 || k.Zone > 60) {
      error = "Zone not found [" + std::to_string(k.Zone) + "]";
      return 1;
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
      return 1;
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

// ------------------------------------------------------------------ KML

int WriteKmlOverlay(const tesv_description_section& h, const std::string& kmlName,
                    const std::string& imageHref, const std::string& title) {
  double north = -1e9, south = 1e9, east = -1e9, west = 1e9;
  int corners = 0;
  for (int i = 1; i <= 4; ++i) {
    const std::string base = "CartographicSystem.CORNER POINT " + std::to_string(i) + "  ";
    double lon = 0.0, lat = 0.0;
    if (!getDouble(h, base + "X", lon) || !getDouble(h, base + "Y", lat)) continue;
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
                                   (east - west) * metresPerDegree * std::cos(lat * M_PI / 180.0));
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
  getString(raster.Header(), "RasterInfo.ENVI_HeaderDescriptionType", type);
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
  getString(raster.Header(), "InitialGeometry.ACQUISITION_TIME", acquisition);
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
