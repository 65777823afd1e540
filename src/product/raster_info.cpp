#include "product/raster_info.h"

#include "product/cell_type.h"
#include "product/profile.h"

int read_raster_info_profile(const std::string& hdrFile, RasterInfoLayout& layout) {
  const std::string section = "RasterInfo";
  int status = 0;
  int64_t offset = 0;
  if (GetMyProfileInt64Array(section, "HeaderOffset", &offset, 1, hdrFile) == 0)
    layout.HeaderOffset = offset;
  else
    status = 1;
  if (GetMyProfileIntArray(section, "RowPrefix", &layout.RowPrefix, 1, hdrFile) != 0) status = 1;
  if (GetMyProfileIntArray(section, "NrOfPixelsPerLine", &layout.NrOfPixelsPerLine, 1, hdrFile) != 0)
    status = 1;
  if (GetMyProfileIntArray(section, "NrOfLinesPerImage", &layout.NrOfLinesPerImage, 1, hdrFile) != 0)
    status = 1;
  std::string text;
  if (GetMyProfileString(section, "CellType", text, hdrFile) == 0) {
    layout.CellType = cell_type_from_text(text);
    if (layout.CellType < 0) status = 1;
  } else {
    status = 1;
  }
  if (GetMyProfileString(section, "ByteOrder", text, hdrFile) == 0)
    layout.ByteOrder = (text == "MSBFirst") ? 1 : 0;
  else
    status = 1;
  return status;
}
