#pragma once
// GeoTIFF export of a focused raster. This build has no TIFF writer yet: a
// request is reported and remembered, and nothing is written.
#include <string>
#include <vector>

struct GeoTiffRequest {
  std::string source;  // raster with its "_hdr"
  std::string output;  // source + ".tif"
  double real = 0.0;
  int integer1 = 0;
  int integer2 = 0;
  double reals[2] = {1.0, 1.0};
  int zeros1[4] = {0, 0, 0, 0};
  int maxByte = 254;
  int sampleLimit = 1000000;
  int zeros2[2] = {0, 0};
  int unset[4] = {-1, -1, -1, -1};
  int last = 0;
};

// The request of the focusing job for one product: the job's real and two
// integers with the fixed values of the focusing path.
GeoTiffRequest focusingGeoTiffRequest(const std::string& source, double real, int integer1,
                                      int integer2);

// Exports one raster. Now: reports that the export is not available, keeps
// the request, returns 0.
int tesv_raster_to_geotiff(const GeoTiffRequest& request);

// Requests received since the start (or the last clear).
const std::vector<GeoTiffRequest>& tesv_geotiff_requests();
void tesv_clear_geotiff_requests();
