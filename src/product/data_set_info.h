#pragma once
// Identification of a product: what it is, where it comes from and which
// radiometric corrections it has had. Its texts are the product vocabulary
// that the rest of the system tests.
#include <string>

#include "product/general_sar_base.h"

class DataSetInfo_Obj : public GeneralSAR_Base {
 public:
  enum DSImageType : int {
    IT_NOT_SET = 0,
    IT_RANGE_FOCUSED = 1,
    IT_AZIMUTH_FOCUSED = 2,
    IT_RAW_DATA = 3,
    IT_MULTILOOK = 4,
    IT_INTERFEROMETRY = 5,
    IT_FLAT_EARTH = 6,
    IT_COHERENCE_MAP = 7,
    IT_DEM = 8,
    IT_SYNTHETIC_FRINGES = 9,
    IT_DEM_IMAGE_TIMES_MAP = 10,
    IT_IMAGE_HEIGHT_MAP = 11,
    IT_COREGISTERED_SLC = 12,
    IT_PHASE_UNWRAPPED = 13,
    IT_RAW_DATA_ALIGNED = 14,
  };
  enum DSSensorType : int {
    ST_UNKNOWN = 0,
    ST_ASAR = 1,
    ST_RADARSAT = 2,
    ST_ERS1 = 3,
    ST_ERS2 = 4,
    ST_PALSAR = 5,
    ST_TERRASARX = 6,
    ST_CSKS1 = 7,
    ST_CSKS2 = 8,
    ST_CSKS3 = 9,
    ST_CSKS4 = 10,
  };
  enum DSAcqMode : int {
    AM_UNDEFINED = 0,
    AM_STRIPMAP = 1,
    AM_DOUBLE_POLARIZATION = 2,
    AM_QUAD_POLARIZATION = 3,
    AM_SCANSAR = 4,
  };
  enum DSProjection : int {
    PR_UNDEFINED = 0,
    PR_GROUND_RANGE = 1,
    PR_SLANT_RANGE = 2,
    PR_GEOCODED = 3,
  };
  enum DSUnitType : int {
    UT_UNDEFINED = 0,
    UT_VOLT = 1,
    UT_VOLT2 = 2,
    UT_VOLTCOMPLEX = 3,
    UT_METER = 4,
    UT_RADIAN = 5,
    UT_DEGREE = 6,
    UT_SEC = 7,
  };
  enum DSRefSys : int {
    RS_UNDEFINED = 0,
    RS_WGS84 = 1,
    RS_EGM84 = 2,
  };

  DataSetInfo_Obj();
  DataSetInfo_Obj(const DataSetInfo_Obj& other);
  DataSetInfo_Obj& operator=(const DataSetInfo_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  // Element document "DataSetInfo"; otherwise the profile section
  // "DataSetInfo" (1 when a key of the first group is missing).
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(DataSetInfo_Obj* target) const;

  // Set stores the text of a number (the default text for a number outside
  // the table); Is compares the stored text with the text of a number.
  void SetImageType(int type);
  bool IsImageType(int type) const;
  void SetSensorType(int type);
  bool IsSensorType(int type) const;
  void SetAcqMode(int mode);
  bool IsAcqMode(int mode) const;
  void SetProjection(int projection);
  bool IsProjection(int projection) const;
  void SetUnitType(int unit);
  bool IsUnitType(int unit) const;
  void SetRefSys(int refsys);
  bool IsRefSys(int refsys) const;
  // Sets the first five; the reference system only on a geocoded product.
  void SetType(int image, int sensor, int mode, int projection, int unit, int refsys);
  bool IsType(int image, int sensor, int mode, int projection, int unit, int refsys) const;

  // Texts of the tables ("" outside them).
  static const char* imageTypeText(int type);
  static const char* sensorTypeText(int type);
  static const char* acqModeText(int mode);
  static const char* projectionText(int projection);
  static const char* unitTypeText(int unit);
  static const char* refSysText(int refsys);

  void fillORVANE();
  // "H/H" 0, "H/V" 1, "V/H" 2, "V/V" 3, else 666.
  int getPolarizationNbr() const;
  // ASAR swath number of Swath ("IS1".."IS7", "SS1".."SS5"), else 666.
  int getISNbr() const;
  // ProcessingDate: now, as ctime writes it without its line end.
  void StampProcessingDate();
  // SenseDate of a time in seconds since 1985.
  void SetSenseDate(double sec85);

  std::string OrbitNumber = "NOT_AVAILABLE";
  std::string Track = "NOT_AVAILABLE";
  std::string SenseDate = "NOT_AVAILABLE";
  std::string SceneID = "NOT_AVAILABLE";
  std::string Description = "NOT_AVAILABLE";
  std::string AcquisitionStation = "NOT_AVAILABLE";
  std::string ProcessingCenter = "NOT_AVAILABLE";
  std::string ProcessingDate = "NOT_AVAILABLE";
  std::string ProcessingSoftware = "NOT_AVAILABLE";
  double SceneHeading = -999.0;
  std::string OrbitConfiguration = "NOT_AVAILABLE";
  std::string Polarization = "NOT_AVAILABLE";  // "H/H", "V/V", "H/V", "V/H"
  std::string Swath = "NOT_AVAILABLE";
  double SWST_MIN = -999.0;
  double SWST_MAX = -999.0;
  double RO_REF = 800000.0;
  int RangeLooks = 1;
  // Five bandwidths followed directly by the calibration factor.
  double RangeBandwidth[5] = {0, 0, 0, 0, 0};
  double ExternalCalibrationFactor = 1.0;
  std::string Projection = "PROJECTION UNDEFINED";
  std::string ImageType = "NOT SET";
  int RGAntenna_flag = 0;
  int AZAntenna_flag = 0;
  int SpreadLoss_flag = 0;
  int DroopGain_flag = 0;
  int RGAntenna_AltitudeCorr_flag = 0;
  int NoiseCorr_flag = 0;
  std::string SensorName = "SENSOR UNKNOWN";
  std::string AcquisitionMode = "ACQUISITION MODE UNDEFINED";
  std::string RefSystem = "REFERENCE SYSTEM UNDEFINED";
  std::string UnitType = "UNIT TYPE UNDEFINED";
  int MissingLines = -1;
  int LookDirection = 0;
};
