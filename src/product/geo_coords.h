#pragma once
// Ground corners of a product: four corners and the centre, each with
// latitude, longitude (degrees), height, incidence and look angle (degrees).
#include <string>

#include "product/general_sar_base.h"

class geopoint : public GeneralSAR_Base {
 public:
  geopoint();
  geopoint(const geopoint& other);
  geopoint& operator=(const geopoint& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override;

  // Document path "GroundCornersPoints/<name>", else the profile key <name>
  // (5 values) of section "Coordinates". 0 / 1.
  int readhdr(const std::string& file, const std::string& name);
  int writehdr(const std::string& file, const std::string& name);
  using GeneralSAR_Base::readhdr;
  using GeneralSAR_Base::writehdr;

  void set(double latitude, double longitude, double h, double incidenceDeg, double lookDeg);
  // The named fields are the values; Point mirrors them for the files.
  void syncToPoint();
  void syncFromPoint();

  double Point[5] = {-999.0, -999.0, -999.0, -999.0, -999.0};
  double lat = -999.0;
  double lon = -999.0;
  double height = -999.0;
  double incidence = -999.0;  // element 3
  double look = -999.0;
};

class geoCoords_Obj : public GeneralSAR_Base {
 public:
  geoCoords_Obj();
  geoCoords_Obj(const geoCoords_Obj& other);
  geoCoords_Obj& operator=(const geoCoords_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  // Element document "GroundCornersPoints" with its five points; otherwise
  // the grid sizes of profile section "GeoGridSize" (required) and the
  // points of section "Coordinates" (absent points keep -999.0).
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(geoCoords_Obj* target) const;

  geopoint NW, NE, SW, SE, center;  // NorthWest, NorthEast, SouthWest, SouthEast, Center
  double EastingGridSize = -999.0;
  double NorthingGridSize = -999.0;
};
