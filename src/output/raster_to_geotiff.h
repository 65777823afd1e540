#pragma once
// User-facing copy of a raster: an 8-bit TIFF of its amplitude (GeoTIFF
// keys when the image is geocoded), the copy of its description header, a
// KML overlay and an ENVI header.
#include <string>
#include <vector>

struct GeoTiffRequest {
  std::string source;  // raster with its "_hdr"
  std::string output;  // TIFF name, source + ".tif" in the focusing job
  double real = 0.0;   // TiffExponent of the byte mapping (0: from the statistics)
  int integer1 = 0;    // TiffColsInvert
  int integer2 = 0;    // TiffRowsInvert
  double reals[2] = {1.0, 1.0};        // TiffRowScale, TiffColScale (keep 1 row / column in n)
  int zeros1[4] = {0, 0, 0, 0};        // statistics window: first row, last row, first column,
                                       // last column (0 as a last: the raster's end)
  int maxByte = 254;                   // TiffMaxValue
  int sampleLimit = 1000000;           // most points of the statistics grid
  int zeros2[2] = {0, 0};              // TiffMinValue (0: 1, so that 0 stays for null cells),
                                       // TiffScale (0: from the statistics)
  int unset[4] = {-1, -1, -1, -1};     // reserved, -1: unset (a palette comes from the LUT keys
                                       // of the parameter file)
  int last = 0;                        // 1: no ENVI header
  std::string parameterFile;           // optional profile with the Tiff* keys (section
                                       // "TiffParameters"); its keys win over the values above
};

// The request of the focusing job for one product: the job's real and two
// integers with the fixed values of the focusing path.
GeoTiffRequest focusingGeoTiffRequest(const std::string& source, double real, int integer1,
                                      int integer2);

// Converts one raster: <output>, <output>_hdr (copy of the source's
// "_hdr"), <source>.kml and the ENVI header <source>.hdr (unless that name
// holds a product record). A raster with only a product record
// "<source>.hdr" gets its "_hdr" exported first. 0, or the status of the
// failing step (reported, naming the file and the fault).
int tesv_raster_to_geotiff(const GeoTiffRequest& request);

// Requests received since the start (or the last clear).
const std::vector<GeoTiffRequest>& tesv_geotiff_requests();
void tesv_clear_geotiff_requests();
