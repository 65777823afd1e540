// GeoTIFF export entry of the focusing job (the writer is not part of this
// build yet).
#include "output/raster_to_geotiff.h"

#include "diag/environment.h"
#include "diag/report.h"

namespace {
std::vector<GeoTiffRequest>& requests() {
  static std::vector<GeoTiffRequest> list;
  return list;
}
}  // namespace

GeoTiffRequest focusingGeoTiffRequest(const std::string& source, double real, int integer1,
                                      int integer2) {
  GeoTiffRequest request;
  request.source = source;
  request.output = source + ".tif";
  request.real = real;
  request.integer1 = integer1;
  request.integer2 = integer2;
  return request;
}

int tesv_raster_to_geotiff(const GeoTiffRequest& request) {
  requests().push_back(request);
  ORV_REPORT("GeoTIFF export not available in this build, nothing written for " + request.source,
             REPORT_WARNING);
  if (tracingActive()) traceWrite("GeoTIFF export skipped : %s\n", request.output.c_str());
  return 0;
}

const std::vector<GeoTiffRequest>& tesv_geotiff_requests() { return requests(); }
void tesv_clear_geotiff_requests() { requests().clear(); }
