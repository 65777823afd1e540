#pragma once
// Older aggregate records that read and write a product's objects in one go
// from the side file of a raster, and the two derived computations of a
// product: equivalent speed and processed bandwidth.
#include <memory>
#include <string>

#include "product/acquisition_objects.h"
#include "product/antenna_pattern.h"
#include "product/data_file.h"
#include "product/data_set_info.h"
#include "product/general_sar.h"
#include "product/geo_coords.h"
#include "product/poly_sar.h"
#include "product/roi.h"

// Focused image record; the orbit member is the state-vector object.
class ImageSARData_Obj {
 public:
  ImageSARData_Obj();  // real orbit member
  explicit ImageSARData_Obj(const GeneralSAROrbitSlots& slots);
  virtual ~ImageSARData_Obj();
  ImageSARData_Obj(const ImageSARData_Obj&) = delete;
  ImageSARData_Obj& operator=(const ImageSARData_Obj&) = delete;

  // The raster is file less its extension: its layout, the region "ROI",
  // then sampling, state vectors, identification, attitude, polynomials,
  // spectral windows, corners, pulse and swath. The first failure ends it.
  virtual int readhdr(const std::string& file);
  // "<raster>.hdr": layout, region, then the members in the same order.
  virtual int writehdr();
  // Frees the orbit arrays and the polynomial tables.
  int destroyAll();
  // Equivalent speed and distance of a range-focused product from its FM
  // rate and Doppler centroid polynomials, into attitude. 10 without them.
  int compute_eqspeed();

  GeneralSAR_Base& orbitMember() { return *orbit_; }

  SamplingConstants_Obj sampling;
  DataSetInfo_Obj dataSetInfo;
  SensorAttitude_Obj attitude;
  polySAR polynomials;
  AntennaPattern_Obj antenna;
  SpectralWindows_Obj spectralWindows;
  geoCoords_Obj geoCoords;
  SwathInfo swath;
  SARPulse_Obj pulse;
  ROI_Obj roi;
  DataFile dataFile;
  std::string rasterName;

 protected:
  ImageSARData_Obj(const GeneralSAROrbitSlots& slots, bool fullOrbit);
  int readMembers(const std::string& file, bool stopAtFailure);
  const GeneralSAROrbitSlots* slots_;
  bool fullOrbit_;
  std::unique_ptr<GeneralSAR_Base> orbit_;
};

// Focused image record with the full orbit object and a second region.
class GeneralSLCData : public ImageSARData_Obj {
 public:
  GeneralSLCData();
  explicit GeneralSLCData(const GeneralSAROrbitSlots& slots);
  // As the older record, but the members that may be missing do not fail it:
  // only the raster layout and the region are required.
  int readhdr(const std::string& file) override;
  GeneralSAROrbit& orbit();

  ROI_Obj secondRoi;
};

// Raw data record; the orbit member is the state-vector object.
class RawSARData_Obj {
 public:
  RawSARData_Obj();
  explicit RawSARData_Obj(const GeneralSAROrbitSlots& slots);
  virtual ~RawSARData_Obj();
  RawSARData_Obj(const RawSARData_Obj&) = delete;
  RawSARData_Obj& operator=(const RawSARData_Obj&) = delete;

  // Layout, region, then sampling, state vectors, identification, pulse,
  // swath, attitude. The first failure ends it.
  virtual int readhdr(const std::string& file);
  virtual int writehdr();
  int destroyAll();

  GeneralSAR_Base& orbitMember() { return *orbit_; }

  SamplingConstants_Obj sampling;
  DataSetInfo_Obj dataSetInfo;
  SARPulse_Obj pulse;
  SwathInfo swath;
  SensorAttitude_Obj attitude;
  ROI_Obj roi;
  DataFile dataFile;
  std::string rasterName;

 protected:
  RawSARData_Obj(const GeneralSAROrbitSlots& slots, bool fullOrbit);
  int readMembers(const std::string& file, bool stopAtFailure);
  const GeneralSAROrbitSlots* slots_;
  bool fullOrbit_;
  std::unique_ptr<GeneralSAR_Base> orbit_;
};

// Raw data record with the full orbit object and a second region.
class GeneralRAWData : public RawSARData_Obj {
 public:
  GeneralRAWData();
  explicit GeneralRAWData(const GeneralSAROrbitSlots& slots);
  int readhdr(const std::string& file) override;
  GeneralSAROrbit& orbit();

  ROI_Obj secondRoi;
};

// Bandwidths kept by the processing windows: the sampled bandwidth when the
// window coefficient is 0, else the smaller of look and sampled bandwidth.
int GetProcessedBandwidth(const SamplingConstants_Obj& sampling, const SpectralWindows_Obj& windows,
                          double* range, double* azimuth);
int GetProcessedBandwidth(const SamplingConstants_Obj* sampling,
                          const SpectralWindows_Obj* windows, double* range, double* azimuth);
