#pragma once
// The whole record of a product: fourteen objects, each present or absent,
// read from and written to one side file.
#include <memory>
#include <string>

#include "product/acquisition_objects.h"
#include "product/antenna_pattern.h"
#include "product/buffer_file.h"
#include "product/data_file.h"
#include "product/data_set_info.h"
#include "product/geo_coords.h"
#include "product/poly_sar.h"
#include "product/roi.h"

// The region of a raster as a member of the record (class "ROI").
class GSRoi_Obj : public GeneralSAR_Base {
 public:
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override { return roi.read_roi(file, "ROI"); }
  int writehdr(const std::string& file) override { return roi.write_roi(file, "ROI"); }

  ROI_Obj roi;
};

// The raster layout as a member of the record: the side file "<raster>.hdr"
// names the raster.
class GSDataFile_Obj : public DataFile {
 public:
  using DataFile::DataFile;
  using DataFile::writehdr;
  // The raster named by file less its last 4 characters (".hdr").
  int readhdr(const std::string& file) override;
  // Writes the raster header of that raster name; filename is kept.
  int writehdr(const std::string& file) override;
};

// The state-vector and orbit members are classes of the orbit library, which
// is built on top of this one. The record reaches them only through this
// seam; the orbit library makes the real ones (orbit/record_orbit_slots.h)
// and defines the record's default constructors and typed orbit views, so
// this library never includes an orbit header.
class GeneralSAROrbitSlots {
 public:
  virtual ~GeneralSAROrbitSlots() = default;
  virtual std::unique_ptr<GeneralSAR_Base> makeStateVectors() const = 0;
  virtual std::unique_ptr<GeneralSAR_Base> makeOrbit() const = 0;
  virtual void setLambda(GeneralSAR_Base& orbit, double lambda) const = 0;
  virtual void setOrbitLookSign(GeneralSAR_Base& orbit, int sign) const = 0;
  virtual void setStateVectorsLookSign(GeneralSAR_Base& stateVectors, int sign) const = 0;
  virtual void destroyOrbit(GeneralSAR_Base& orbit) const = 0;
  virtual void destroyStateVectors(GeneralSAR_Base& stateVectors) const = 0;
};

class GeneralSAROrbit;
class SAROrbitStateVectors_Obj;

class GeneralSAR {
 public:
  enum GSObject : int {
    GS_DATAFILE = 0,         // GSDataFile_Obj
    GS_ROI = 1,              // GSRoi_Obj
    GS_POLYNOMIALS = 2,      // polySAR
    GS_SAMPLING = 3,         // SamplingConstants_Obj
    GS_STATEVECTORS = 4,     // SAROrbitStateVectors_Obj
    GS_ORBIT = 5,            // GeneralSAROrbit
    GS_PULSE = 6,            // SARPulse_Obj
    GS_ANTENNA = 7,          // AntennaPattern_Obj
    GS_DATASETINFO = 8,      // DataSetInfo_Obj
    GS_ATTITUDE = 9,         // SensorAttitude_Obj
    GS_SPECTRALWINDOWS = 10, // SpectralWindows_Obj
    GS_GEOCOORDS = 11,       // geoCoords_Obj
    GS_SWATH = 12,           // SwathInfo
    GS_BUFFERFILE = 13,      // BufferFile
  };
  static constexpr int kObjects = 14;

  // With the real orbit members (defined in the orbit library).
  GeneralSAR();
  explicit GeneralSAR(const GeneralSAROrbitSlots& slots);
  ~GeneralSAR();
  GeneralSAR(const GeneralSAR&) = delete;
  GeneralSAR& operator=(const GeneralSAR&) = delete;

  // Reads every member from file; a member missing from it is marked absent.
  // A file that does not exist is reported and leaves the record as it was
  // (status 9).
  int GSread(const std::string& file);
  // Writes the present members, from the last to the first. 0.
  int GSwrite(const std::string& file);
  GeneralSAR_Base* GSget(GSObject object);
  bool GSexists(GSObject object) const;
  void GSenable(GSObject object);
  void GSdisable(GSObject object);
  // Frees the arrays of the polynomials, state vectors, orbit, swath and
  // antenna members.
  int GSdestroy();

  // Typed views of the orbit members (record made with the real orbit
  // members; defined in the orbit library).
  GeneralSAROrbit& orbit();
  SAROrbitStateVectors_Obj& stateVectors();

  GSDataFile_Obj dataFile;
  GSRoi_Obj roi;
  polySAR polynomials;
  SamplingConstants_Obj sampling;
  SARPulse_Obj pulse;
  AntennaPattern_Obj antenna;
  DataSetInfo_Obj dataSetInfo;
  SensorAttitude_Obj attitude;
  SpectralWindows_Obj spectralWindows;
  geoCoords_Obj geoCoords;
  SwathInfo swath;
  BufferFile bufferFile;

 private:
  const GeneralSAROrbitSlots* slots_;
  std::unique_ptr<GeneralSAR_Base> stateVectors_;
  std::unique_ptr<GeneralSAR_Base> orbit_;
  GeneralSAR_Base* objects_[kObjects] = {};
  unsigned char exists_[kObjects] = {};
};
