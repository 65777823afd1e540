#include "product/geo_coords.h"

#include "product/record_io.h"

namespace {
constexpr double kBig = 1e300;
constexpr const char* kClass = "GroundCornersPoints";
}  // namespace

geopoint::geopoint() { createElementsVector(1); }
geopoint::geopoint(const geopoint& o) : geopoint() { *this = o; }
geopoint& geopoint::operator=(const geopoint& o) {
  if (this != &o) {
    for (int i = 0; i < 5; ++i) Point[i] = o.Point[i];
    lat = o.lat;
    lon = o.lon;
    height = o.height;
    incidence = o.incidence;
    look = o.look;
  }
  return *this;
}

void geopoint::refreshParameters() {
  addElementDouble("Point", Point, 5, -kBig, kBig, true);
  setAllocationFlag(true);
}

void geopoint::set(double latitude, double longitude, double h, double incidenceDeg,
                   double lookDeg) {
  lat = latitude;
  lon = longitude;
  height = h;
  incidence = incidenceDeg;
  look = lookDeg;
  syncToPoint();
}

void geopoint::syncToPoint() {
  Point[0] = lat;
  Point[1] = lon;
  Point[2] = height;
  Point[3] = incidence;
  Point[4] = look;
}

void geopoint::syncFromPoint() {
  lat = Point[0];
  lon = Point[1];
  height = Point[2];
  incidence = Point[3];
  look = Point[4];
}

int geopoint::readhdr(const std::string& file, const std::string& name) {
  int status = 0;
  if (!readAuxiliaryFile(file, 1, std::string(kClass) + "/" + name))
    status = GetProfileDoubleArray("Coordinates", name, Point, 5, file) == 0 ? 0 : 1;
  if (status == 0) syncFromPoint();
  return status;
}

int geopoint::writehdr(const std::string& file, const std::string& name) {
  syncToPoint();
  return writeAuxiliaryFile(file, 1, std::string(kClass) + "/" + name);
}

geoCoords_Obj::geoCoords_Obj() { createElementsVector(2); }
geoCoords_Obj::geoCoords_Obj(const geoCoords_Obj& o) : geoCoords_Obj() { o.clone(this); }
geoCoords_Obj& geoCoords_Obj::operator=(const geoCoords_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}

void geoCoords_Obj::refreshParameters() {
  addElementDouble("EastingGridSize", &EastingGridSize, 1, -kBig, kBig, true);
  addElementDouble("NorthingGridSize", &NorthingGridSize, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}

int geoCoords_Obj::readhdr(const std::string& file) {
  const bool document = readAuxiliaryFile(file, 1, kClass);
  NW.readhdr(file, "NorthWest");
  NE.readhdr(file, "NorthEast");
  SW.readhdr(file, "SouthWest");
  SE.readhdr(file, "SouthEast");
  center.readhdr(file, "Center");
  if (document) return 0;
  ProfileKeyReader r(file, "GeoGridSize");
  r.required("EastingGridSize", &EastingGridSize);
  r.required("NorthingGridSize", &NorthingGridSize);
  return r.status();
}

int geoCoords_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, kClass);
  NW.writehdr(file, "NorthWest");
  NE.writehdr(file, "NorthEast");
  SW.writehdr(file, "SouthWest");
  SE.writehdr(file, "SouthEast");
  center.writehdr(file, "Center");
  return 0;
}

void geoCoords_Obj::clone(geoCoords_Obj* t) const {
  if (!t || t == this) return;
  t->NW = NW;
  t->NE = NE;
  t->SW = SW;
  t->SE = SE;
  t->center = center;
  t->EastingGridSize = EastingGridSize;
  t->NorthingGridSize = NorthingGridSize;
}
