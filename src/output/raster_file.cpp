// Rasters with a text description header and the byte scaling of their
// amplitudes for the user-facing products.
#include "output/raster_file.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <limits>
#include <string>
#include <vector>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "output/description_text.h"
#include "product/cell_type.h"
#include "product/profile.h"

namespace {

namespace fs = std::filesystem;

void setError(std::string* error, const std::string& text) {
  if (error) *error = text;
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

// ------------------------------------------------------------------ header fields

bool headerDouble(const tesv_description_section& h, const std::string& name, double& v) {
  const auto* f = h.getField(name);
  return f && f->getDouble(v) == 0;
}

bool headerInt(const tesv_description_section& h, const std::string& name, long long& v) {
  const auto* f = h.getField(name);
  return f && f->getInt(v) == 0;
}

bool headerString(const tesv_description_section& h, const std::string& name, std::string& v) {
  const auto* f = h.getField(name);
  return f && f->getString(v) == 0;
}

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
  if (!headerInt(header_, "RasterInfo.NrOfLinesPerImage", v) || v < 1 || v > INT32_MAX) {
    setError(error, "No valid NrOfLinesPerImage in " + file);
    return STATUS_BAD_PARAMETER;
  }
  NrOfLinesPerImage = static_cast<int>(v);
  if (!headerInt(header_, "RasterInfo.NrOfPixelsPerLine", v) || v < 1 || v > INT32_MAX) {
    setError(error, "No valid NrOfPixelsPerLine in " + file);
    return STATUS_BAD_PARAMETER;
  }
  NrOfPixelsPerLine = static_cast<int>(v);
  std::string text;
  CellType = -1;
  if (headerString(header_, "RasterInfo.CellType", text)) {
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
    return headerInt(header_, key, x) ? x : fallback;
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
  headerDouble(header_, "RasterInfo.RealScaleFactor", RealScaleFactor);
  headerDouble(header_, "RasterInfo.ImaginaryScaleFactor", ImaginaryScaleFactor);
  headerDouble(header_, "RasterInfo.NullCellValue", NullCellValue);
  headerString(header_, "RasterInfo.DataUnits", DataUnits);
  MostSignificantByteFirst = headerString(header_, "RasterInfo.BytesOrder", text) && text == "MSBF";
  LinesTimeIncrease = !(headerString(header_, "Processing.TimeDirectionLines", text) &&
                        text.find("DECREASE") != std::string::npos);
  PixelsTimeIncrease = !(headerString(header_, "Processing.TimeDirectionPixels", text) &&
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

