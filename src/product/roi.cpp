#include "product/roi.h"

#include <algorithm>
#include <cmath>

#include "base/status.h"
#include "product/profile.h"

int roundHalfAway(double x) {
  // Saturates outside the int range (NaN gives 0): times and deltas of a
  // damaged header must not make the conversion undefined.
  const double r = x > 0.0 ? std::floor(x + 0.5) : std::ceil(x - 0.5);
  if (!(r == r)) return 0;
  return static_cast<int>(std::clamp(r, -2147483648.0, 2147483647.0));
}

ROI_Obj::ROI_Obj() { createElementsVector(8); }

ROI_Obj::ROI_Obj(const ROI_Obj& other) : GeneralSAR_Base() {
  createElementsVector(8);
  copyAxes(other);
}

ROI_Obj& ROI_Obj::operator=(const ROI_Obj& other) {
  if (this != &other) copyAxes(other);
  return *this;
}

void ROI_Obj::copyAxes(const ROI_Obj& other) {
  FastStartTime = other.FastStartTime;
  SlowStartTime = other.SlowStartTime;
  FastTimeLength = other.FastTimeLength;
  SlowTimeLength = other.SlowTimeLength;
  FastTimeDelta = other.FastTimeDelta;
  SlowTimeDelta = other.SlowTimeDelta;
  Samples = other.Samples;
  Lines = other.Lines;
}

void ROI_Obj::clone(ROI_Obj* target) const {
  if (target) target->copyAxes(*this);
}

void ROI_Obj::refreshParameters() {
  constexpr double kBig = 1e300;
  addElementDouble("SlowStartTime", &SlowStartTime, 1, -kBig, kBig, true);
  addElementDouble("SlowTimeLength", &SlowTimeLength, 1, -kBig, kBig, true);
  addElementDouble("SlowTimeDelta", &SlowTimeDelta, 1, -kBig, kBig, true);
  addElementDouble("FastStartTime", &FastStartTime, 1, -kBig, kBig, true);
  addElementDouble("FastTimeLength", &FastTimeLength, 1, -kBig, kBig, true);
  addElementDouble("FastTimeDelta", &FastTimeDelta, 1, -kBig, kBig, true);
  addElementInt("Lines", &Lines, 1, 0, 2147483647, true);
  addElementInt("Samples", &Samples, 1, 0, 2147483647, true);
  setAllocationFlag(true);
}

void ROI_Obj::SetFastAxe(double start, double delta, int count) {
  FastStartTime = start;
  FastTimeDelta = delta;
  Samples = count;
  FastTimeLength = delta * count;
}

void ROI_Obj::SetSlowAxe(double start, double delta, int count) {
  SlowStartTime = start;
  SlowTimeDelta = delta;
  Lines = count;
  SlowTimeLength = delta * count;
}

void ROI_Obj::GetUpLeft(double* fast, double* slow) const {
  *fast = FastStartTime;
  *slow = SlowStartTime;
}
void ROI_Obj::GetUpRight(double* fast, double* slow) const {
  *fast = FastStartTime + FastTimeLength;
  *slow = SlowStartTime;
}
void ROI_Obj::GetDownLeft(double* fast, double* slow) const {
  *fast = FastStartTime;
  *slow = SlowStartTime + SlowTimeLength;
}
void ROI_Obj::GetDownRight(double* fast, double* slow) const {
  *fast = FastStartTime + FastTimeLength;
  *slow = SlowStartTime + SlowTimeLength;
}
void ROI_Obj::GetCenter(double* fast, double* slow) const {
  *fast = FastStartTime + FastTimeLength / 2.0;
  *slow = SlowStartTime + SlowTimeLength / 2.0;
}

int ROI_Obj::read_roi(const std::string& file, const std::string& className) {
  if (readAuxiliaryFile(file, 1, className)) return 0;
  GetProfileDoubleArray(className, "SlowStartTime", &SlowStartTime, 1, file);
  GetProfileDoubleArray(className, "FastStartTime", &FastStartTime, 1, file);
  GetProfileDoubleArray(className, "SlowTimeDelta", &SlowTimeDelta, 1, file);
  GetProfileDoubleArray(className, "FastTimeDelta", &FastTimeDelta, 1, file);
  GetProfileDoubleArray(className, "SlowTimeLength", &SlowTimeLength, 1, file);
  GetProfileDoubleArray(className, "FastTimeLength", &FastTimeLength, 1, file);
  GetMyProfileIntArray(className, "Lines", &Lines, 1, file);
  return GetMyProfileIntArray(className, "Samples", &Samples, 1, file) != 0 ? 1 : 0;
}

int ROI_Obj::write_roi(const std::string& file, const std::string& className) {
  writeAuxiliaryFile(file, 1, className);
  return 0;
}

int IntersectROI(const ROI_Obj& a, const ROI_Obj& b, ROI_Obj& result) {
  const double fastStart = std::max(a.FastStartTime, b.FastStartTime);
  const double fastEnd =
      std::min(a.FastStartTime + a.FastTimeLength, b.FastStartTime + b.FastTimeLength);
  const double slowStart = std::max(a.SlowStartTime, b.SlowStartTime);
  const double slowEnd =
      std::min(a.SlowStartTime + a.SlowTimeLength, b.SlowStartTime + b.SlowTimeLength);
  result.FastTimeDelta = a.FastTimeDelta;
  result.SlowTimeDelta = a.SlowTimeDelta;
  result.FastStartTime = fastStart;
  result.SlowStartTime = slowStart;
  result.Samples = static_cast<int>((fastEnd - fastStart) / a.FastTimeDelta);
  result.Lines = static_cast<int>((slowEnd - slowStart) / a.SlowTimeDelta);
  result.FastTimeLength = result.Samples * a.FastTimeDelta;
  result.SlowTimeLength = result.Lines * a.SlowTimeDelta;
  if (result.Samples <= 0 || result.Lines <= 0) {
    result.Samples = 0;
    result.Lines = 0;
  }
  return 0;
}

int IntersectROI(const ROI_Obj* a, const ROI_Obj* b, ROI_Obj* result) {
  return IntersectROI(*a, *b, *result);
}

int FileROI_Obj::read_roi() {
  const int status = roi.read_roi(filename + ".hdr", "ROI");
  const int fileStatus = datafile.read_hdr(filename);
  return status != 0 || fileStatus != 0 ? 1 : 0;
}

int ROI_Coords::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "Coordinates")) return 0;
  const char* section = "Coordinates";
  double upLeft[2], upRight[2], downRight[2];
  if (GetProfileDoubleArray(section, "UpLeft", upLeft, 2, file) != 0 ||
      GetProfileDoubleArray(section, "UpRight", upRight, 2, file) != 0 ||
      GetProfileDoubleArray(section, "DownRight", downRight, 2, file) != 0 ||
      GetProfileDoubleArray(section, "Latitude_SamplingStep", &SlowTimeDelta, 1, file) != 0 ||
      GetProfileDoubleArray(section, "Longitude_SamplingStep", &FastTimeDelta, 1, file) != 0)
    return STATUS_BAD_CONDITION;
  SlowStartTime = upLeft[0];
  FastStartTime = upLeft[1];
  SlowTimeLength = upRight[0] - SlowStartTime;
  FastTimeLength = downRight[1] - FastStartTime;
  Lines = static_cast<int>(SlowTimeLength / SlowTimeDelta);
  Samples = static_cast<int>(FastTimeLength / FastTimeDelta);
  return 0;
}

int ROI_Coords::writehdr(const std::string& file) { return write_roi(file, "Coordinates"); }
