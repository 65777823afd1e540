// GeoTIFF export of a focused raster with its side products.
#include "output/raster_to_geotiff.h"

#include <cstdio>
#include <filesystem>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "output/general_sar_kelmir.h"
#include "output/raster_file.h"
#include "output/raster_side_files.h"
#include "output/raster_tiff.h"

namespace {

namespace fs = std::filesystem;

std::vector<GeoTiffRequest>& requests() {
  static std::vector<GeoTiffRequest> list;
  return list;
}

int failure(const std::string& message, int status) {
  ORV_REPORT(message, REPORT_ERROR);
  if (tracingActive()) traceWrite("%s\n", message.c_str());
  return status;
}

// "<source>_hdr" from the product record "<source>.hdr" when only the
// record exists (a product of the chain that the job does not finish).
int exportRecordHeader(const std::string& source) {
  std::error_code ec;
  if (fs::exists(source + "_hdr", ec) || !fs::exists(source + ".hdr", ec)) return 0;
  GeneralSAR_kelmir record;
  if (int st = record.GSread(source + ".hdr"); st != 0) return st;
  const int st = record.writehdr_kelmir(source, "", 6900.0f, -1);
  record.GSdestroy();
  return st;
}

TiffControl controlOf(const GeoTiffRequest& r) {
  TiffControl c;
  c.TiffExponent = r.real > 0.0 ? r.real : -1.0;
  c.TiffColsInvert = r.integer1;
  c.TiffRowsInvert = r.integer2;
  c.TiffRowScale = r.reals[0];
  c.TiffColScale = r.reals[1];
  c.TiffMaxValue = r.maxByte > 0 && r.maxByte <= 255 ? r.maxByte : 254;
  c.TiffMinValue = r.zeros2[0] > 0 && r.zeros2[0] < c.TiffMaxValue ? r.zeros2[0] : 1;
  c.TiffScale = r.zeros2[1] > 0 ? r.zeros2[1] : -1.0;
  return c;
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
  const std::string& source = request.source;
  if (int st = exportRecordHeader(source); st != 0)
    return failure("Description header of " + source + " could not be exported", st);

  CRasterFile raster(source);
  std::string error;
  if (int st = raster.ReadHeader(&error); st != 0) return failure(error, st);
  if (int st = raster.OpenRead(&error); st != 0) return failure(error, st);
  if (tracingActive()) {
    traceWrite("%s\n", raster.LinesTimeDirectionText().c_str());
    traceWrite("%s\n", raster.PixelsTimeDirectionText().c_str());
  }

  TiffControl control = controlOf(request);
  if (!request.parameterFile.empty())
    if (int st = ReadTiffControl(request.parameterFile, control); st != 0) return st;

  SampleGrid grid;
  grid.aSampleRowStart = request.zeros1[0];
  grid.aSampleRowEnd = request.zeros1[1];
  grid.aSampleColStart = request.zeros1[2];
  grid.aSampleColEnd = request.zeros1[3];
  grid.aSampleInc = SampleStepFor(raster.NrOfLinesPerImage, raster.NrOfPixelsPerLine, request.sampleLimit);
  RasterStatistics statistics;
  if (int st = ComputeScaling(raster, grid, control, statistics); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }

  MapKeys map;
  if (int st = ReadMapKeys(raster.Header(), map, error); st != 0) {
    std::fprintf(stderr, "%s\n", error.c_str());
    return failure(error + " (" + source + "_hdr)", st);
  }
  if (int st = WriteRasterTiff(raster, request.output, control, statistics, map); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  raster.Close();

  std::error_code ec;
  fs::copy_file(source + "_hdr", request.output + "_hdr", fs::copy_options::overwrite_existing, ec);
  if (ec) return failure("Cannot copy " + source + "_hdr to " + request.output + "_hdr", STATUS_WRITE_FAILED);

  const std::string href = fs::path(request.output).filename().string();
  if (WriteKmlOverlay(raster.Header(), source + ".kml", href, fs::path(source).filename().string()) != 0)
    ORV_REPORT("No KML overlay for " + source, REPORT_WARNING);

  if (request.last != 1) {
    if (int st = WriteEnviHeader(raster, error); st != 0) ORV_REPORT(error, REPORT_WARNING);
  }
  if (tracingActive()) traceWrite("GeoTIFF written : %s\n", request.output.c_str());
  return 0;
}

const std::vector<GeoTiffRequest>& tesv_geotiff_requests() { return requests(); }
void tesv_clear_geotiff_requests() { requests().clear(); }
