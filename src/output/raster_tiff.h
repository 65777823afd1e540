#pragma once
// 8-bit TIFF products of rasters with their GeoTIFF keys, and the map keys of
// description headers that decide them.
#include <string>

#include "output/raster_file.h"

// Geographic state of a header's map keys.
struct MapKeys {
  bool geocoded = false;  // RasterInfo.GeocodedImage present
  std::string State, Hemisphere, Projection, Ellipsoid, DatumShift;
  int Zone = 0;
  double ReferenceHeight = 0.0;
  double LonEasting = 0.0, LatNorthing = 0.0;
  double PixelSpacingLonEast = 0.0, PixelSpacingLatNorth = 0.0;
};

// Reads the map keys of the CartographicSystem and RegistrationCoordinates
// sections. 0 (not geocoded included); 1 with "State specified in the Image
// header or GCP File is invalid.", "Wrong map field. Please check." or
// "<field> not found [<value>]" in error; 9 with "Error: missing map file "
// when a projected state's map list is absent from TESSIVOR_MAP_FILES_DIR.
int ReadMapKeys(const tesv_description_section& header, MapKeys& keys, std::string& error);

// Writes an 8-bit TIFF of the raster (grey, or palette with the LUT
// tables), subsampled and inverted as the control says, with the GeoTIFF
// keys of the two global map states. The description tag reads
// "Image generated with : <program>". 0, or the status of the failing step.
int WriteRasterTiff(CRasterFile& raster, const std::string& tiffName, const TiffControl& control,
                    const RasterStatistics& statistics, const MapKeys& map);
