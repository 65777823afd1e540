#pragma once
// Rasters described by a text description header ("<name>_hdr"): layout
// with row prefixes and suffixes, a file header and a footer, any cell type
// in either byte order; rows delivered as real amplitudes for the
// user-facing products (TIFF, KML overlay, ENVI header), and the byte
// scaling of those amplitudes.
#include <cstdint>
#include <fstream>
#include <string>
#include <vector>

#include "output/description_section.h"

class CRasterFile {
 public:
  enum State : int { CLOSED = 0, READ = 1, READ_WRITE = 2, TIFF_READ = 3, TIFF_WRITE = 4, WRITE = 5 };

  CRasterFile() = default;
  explicit CRasterFile(std::string rasterName) : name_(std::move(rasterName)) {}

  // Reads "<name>_hdr". 0; 9 when the header does not open; 4 when it cannot
  // be parsed; 10 when sizes or the cell type are missing or wrong. The
  // message names the file and the fault.
  int ReadHeader(std::string* error = nullptr);
  // Opens the raster for reading and checks that the file holds the whole
  // layout. 0, 9, or 4 for a file shorter than the layout.
  int OpenRead(std::string* error = nullptr);
  void Close();

  // Amplitude of row `row` (modulus of complex cells, value of real cells,
  // scale factors applied). 0, or 4 on a short read.
  int ReadAmplitudeRow(int row, std::vector<float>& values);

  // "Lines time direction : INCREASE" / "DECREASE", likewise for pixels.
  std::string LinesTimeDirectionText() const;
  std::string PixelsTimeDirectionText() const;

  // Bytes of one row with prefix and suffix; start of row r.
  int64_t RowBytes() const;
  int64_t RowStart(int64_t r) const { return HeaderOffset + r * RowBytes(); }
  // Bytes the layout needs: header, rows, footer.
  int64_t LayoutBytes() const { return RowStart(NrOfLinesPerImage) + FooterLen; }

  const std::string& Name() const { return name_; }
  State GetState() const { return state_; }
  const tesv_description_section& Header() const { return header_; }

  double RealScaleFactor = 1.0;
  double ImaginaryScaleFactor = 1.0;
  int NrOfLinesPerImage = 0;
  int NrOfPixelsPerLine = 0;
  int CellType = -1;
  std::string DataUnits;
  int64_t HeaderOffset = 0;
  int RowPrefix = 0;
  int RowSuffix = 0;
  int64_t FooterLen = 0;
  int NrOfChannels = 1;
  double NullCellValue = 0.0;
  bool MostSignificantByteFirst = false;  // BytesOrder "MSBF"
  bool LinesTimeIncrease = true;
  bool PixelsTimeIncrease = true;

 private:
  std::string name_;
  State state_ = CLOSED;
  std::ifstream stream_;
  std::vector<char> rowBuffer_;
  tesv_description_section header_;
};

// Control of the byte scaling of a TIFF product. Unset values are below 0
// (and empty tables); the statistics then decide.
struct TiffControl {
  double TiffMinValue = 1.0;    // lowest byte of a valid cell (0 is kept for null cells)
  double TiffMaxValue = 254.0;  // highest byte
  double NullCellValue = 0.0;
  bool haveNullCellValue = false;  // else the raster's own
  double TiffScale = -1.0;
  double TiffExponent = -1.0;
  double TiffRowScale = 1.0;  // keep one row out of this many
  double TiffColScale = 1.0;
  int TiffColsInvert = 0;
  int TiffRowsInvert = 0;
  std::vector<int> TiffLUTRed, TiffLUTGreen, TiffLUTBlue;  // 256 entries each: palette image
};

// Reads the TIFF control keys of section "TiffParameters" of a profile file
// into control (absent keys keep their values). 0, or 9 with
// "Error: missing parameter file " when the file does not exist.
int ReadTiffControl(const std::string& file, TiffControl& control);

// Window and step of the statistics grid; an end of 0 means the last row
// or column.
struct SampleGrid {
  int aSampleRowStart = 0, aSampleRowEnd = 0;
  int aSampleColStart = 0, aSampleColEnd = 0;
  int aSampleInc = 1;
};

struct RasterStatistics {
  long long points = 0;
  double mean = 0.0;
  double deviation = 0.0;
  double scale = 1.0;     // byte = TiffMinValue + scale * amplitude ^ exponent
  double exponent = 1.0;
};

// The step that keeps the grid within `maxPoints` points over the raster.
int SampleStepFor(int lines, int samples, long long maxPoints);

// Mean and deviation of the amplitudes on the grid, ignoring null cells,
// the dummy value (TESSIVOR_DUMMY_VALUE when set) and non-finite values,
// and the scale and exponent of the byte mapping: given ones are kept,
// otherwise exponent 1 and mean + 3 deviations on the highest byte.
// 0; 1 with "Error: 0 non null points in the input file \n" when no cell
// counts; the read status on a failed read.
int ComputeScaling(CRasterFile& raster, const SampleGrid& grid, const TiffControl& control,
                   RasterStatistics& statistics);

// Byte of an amplitude: 0 for null cells, else within TiffMinValue..TiffMaxValue.
unsigned char ScaleToByte(float amplitude, bool null, const TiffControl& control,
                          const RasterStatistics& statistics);

// Typed values of "Section.Field" of a header; false when absent or not
// convertible.
bool headerDouble(const tesv_description_section& h, const std::string& name, double& v);
bool headerInt(const tesv_description_section& h, const std::string& name, long long& v);
bool headerString(const tesv_description_section& h, const std::string& name, std::string& v);

