// Converts a raster with its description header (or product record) into
// the user-facing TIFF with its KML overlay and ENVI header.
//   tesv_raster_to_geotiff RASTER [TIFF] [PARAMETER_FILE]
#include <cstdio>
#include <string>

#include "diag/environment.h"
#include "diag/orvane_exception.h"
#include "output/raster_to_geotiff.h"

int main(int argc, char** argv) {
  if (argc < 2 || argc > 4) {
    std::fprintf(stderr, "usage: %s RASTER [TIFF] [PARAMETER_FILE]\n", argv[0]);
    return 2;
  }
  GeoTiffRequest request = focusingGeoTiffRequest(argv[1], 0.0, 0, 0);
  if (argc > 2) request.output = argv[2];
  if (argc > 3) request.parameterFile = argv[3];
  try {
    const int st = tesv_raster_to_geotiff(request);
    if (st != 0) {
      std::fprintf(stderr, "%s: conversion of %s failed (status %d)\n", argv[0], argv[1], st);
      return 1;
    }
  } catch (const orvaneException& e) {
    std::fprintf(stderr, "%s: %s\n", argv[0], e.getMessage().c_str());
    return 1;
  }
  std::printf("%s\n", request.output.c_str());
  return 0;
}
