#pragma once
// Side files of rasters. A raster's ".hdr" is an element document with the
// block "RasterInfo" in channel 1 (written and read through the element
// tables of DataFile and BufferFile). Older side files are profile files
// with the section "RasterInfo"; this is their reader.
#include <cstdint>
#include <string>

// Layout fields of a raster side file.
struct RasterInfoLayout {
  int NrOfLinesPerImage = 0;
  int NrOfPixelsPerLine = 0;
  int64_t HeaderOffset = 0;
  int RowPrefix = 0;
  int ByteOrder = 0;  // 0 little-endian, 1 big-endian
  int CellType = 0;
};

// Reads HeaderOffset, RowPrefix, NrOfPixelsPerLine, NrOfLinesPerImage and
// the texts CellType and ByteOrder from section "RasterInfo" of a profile
// file. A missing key leaves its field as it was; a CellType text not in the
// table sets CellType to -1; ByteOrder is 1 only for "MSBFirst". Returns 0,
// or 1 when a key was missing or the cell type text unknown.
int read_raster_info_profile(const std::string& hdrFile, RasterInfoLayout& layout);
