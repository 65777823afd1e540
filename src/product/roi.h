#pragma once
// Regions of interest: the pair of time axes of a raster. Fast time is the
// two-way range delay in seconds, slow time is seconds since 01-JAN-1985.
#include <string>

#include "product/data_file.h"
#include "product/general_sar_base.h"

// Rounds half away from zero, as every grid position of the system.
int roundHalfAway(double x);

class ROI_Obj : public GeneralSAR_Base {
 public:
  ROI_Obj();
  ROI_Obj(const ROI_Obj& other);
  ROI_Obj& operator=(const ROI_Obj& other);
  ~ROI_Obj() override = default;

  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override;

  // start, delta and count; length = delta x count.
  void SetFastAxe(double start, double delta, int count);
  void SetSlowAxe(double start, double delta, int count);
  void ResetROI() { Samples = Lines = 0; }
  bool isNULL() const { return Samples < 1 || Lines < 1; }

  int GetFastIndex(double t) const { return roundHalfAway((t - FastStartTime) / FastTimeDelta); }
  int GetSlowIndex(double t) const { return roundHalfAway((t - SlowStartTime) / SlowTimeDelta); }
  int GetFastRange(double length) const { return roundHalfAway(length / FastTimeDelta); }
  int GetSlowRange(double length) const { return roundHalfAway(length / SlowTimeDelta); }

  // Corners of the (fast, slow) rectangle.
  void GetUpLeft(double* fast, double* slow) const;
  void GetUpRight(double* fast, double* slow) const;
  void GetDownLeft(double* fast, double* slow) const;
  void GetDownRight(double* fast, double* slow) const;
  void GetCenter(double* fast, double* slow) const;

  // Element document under className; otherwise the profile keys of section
  // className. 1 if Samples could not be read, else 0.
  int read_roi(const std::string& file, const std::string& className);
  // Element document only.
  int write_roi(const std::string& file, const std::string& className);

  void clone(ROI_Obj* target) const;
  void copyAxes(const ROI_Obj& other);

  double FastStartTime = 0.0;
  double SlowStartTime = 0.0;
  double FastTimeLength = 0.0;
  double SlowTimeLength = 0.0;
  double FastTimeDelta = 0.0;
  double SlowTimeDelta = 0.0;
  int Samples = 0;
  int Lines = 0;
};

// Overlap of a and b on the deltas of a. Counts of 0 when they do not overlap.
int IntersectROI(const ROI_Obj& a, const ROI_Obj& b, ROI_Obj& result);
int IntersectROI(const ROI_Obj* a, const ROI_Obj* b, ROI_Obj* result);

// A raster with its region: the region from "<name>.hdr" (class "ROI") and
// the raster layout of the same side file.
class FileROI_Obj {
 public:
  FileROI_Obj() = default;
  explicit FileROI_Obj(const std::string& name) : filename(name) {}
  // 0 on success; 1 when the region or the raster header could not be read.
  int read_roi();

  ROI_Obj roi;
  DataFile datafile;
  std::string filename;
};

// A region whose fast axis is longitude and slow axis latitude (degrees).
class ROI_Coords : public ROI_Obj {
 public:
  using ROI_Obj::writehdr;
  // Element document "Coordinates"; otherwise the corner keys of section
  // "Coordinates". 0 on success, 1 on failure.
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
};
