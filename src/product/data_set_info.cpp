#include "product/data_set_info.h"

#include "base/status.h"
#include "product/record_io.h"
#include "product/time_base.h"

#include <ctime>

namespace {

constexpr double kBig = 1e300;
constexpr int kIntMax = 2147483647;

constexpr const char* kImageTypes[] = {"NOT SET",
                                       "RANGE FOCUSED",
                                       "AZIMUTH FOCUSED",
                                       "RAW DATA",
                                       "MULTILOOK",
                                       "INTERFEROMETRY",
                                       "FLAT EARTH",
                                       "COHERENCE MAP",
                                       "DEM",
                                       "SYNTHETIC FRINGES",
                                       "DEM IMAGE TIMES MAP",
                                       "IMAGE HEIGHT MAP",
                                       "COREGISTERED SLANT RANGE COMPLEX IMAGE",
                                       "PHASE UNWRAPPED",
                                       "RAW DATA ALIGNED"};
constexpr const char* kSensorTypes[] = {"SENSOR UNKNOWN", "ASAR",  "RADARSAT",    "ERS1",
                                        "ERS2",           "PALSAR", "TERRA SAR-X", "CSKS1",
                                        "CSKS2",          "CSKS3", "CSKS4"};
constexpr const char* kAcqModes[] = {"ACQUISITION MODE UNDEFINED", "STRIPMAP",
                                     "DOUBLE POLARIZATION", "QUAD POLARIZATION", "SCANSAR"};
constexpr const char* kProjections[] = {"PROJECTION UNDEFINED", "GROUND RANGE", "SLANT RANGE",
                                        "GEOCODED"};
constexpr const char* kUnitTypes[] = {"UNIT TYPE UNDEFINED", "VOLT",   "VOLT^2", "VOLTcomplex",
                                      "meter",               "Radian", "Degree", "sec"};
constexpr const char* kRefSystems[] = {"REFERENCE SYSTEM UNDEFINED", "WGS84", "EGM84"};

template <std::size_t N>
const char* lookup(const char* const (&table)[N], int n) {
  return n >= 0 && static_cast<std::size_t>(n) < N ? table[n] : "";
}

// Text stored by Set: the default (entry 0) for a number outside the table.
template <std::size_t N>
const char* storedText(const char* const (&table)[N], int n) {
  return n >= 0 && static_cast<std::size_t>(n) < N ? table[n] : table[0];
}

}  // namespace

DataSetInfo_Obj::DataSetInfo_Obj() { createElementsVector(33); }
DataSetInfo_Obj::DataSetInfo_Obj(const DataSetInfo_Obj& o) : DataSetInfo_Obj() { o.clone(this); }
DataSetInfo_Obj& DataSetInfo_Obj::operator=(const DataSetInfo_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}
int DataSetInfo_Obj::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}

void DataSetInfo_Obj::refreshParameters() {
  addElementString("OrbitNumber", &OrbitNumber, true);
  addElementString("Track", &Track, true);
  addElementString("SenseDate", &SenseDate, true);
  addElementString("SceneID", &SceneID, true);
  addElementString("Description", &Description, true);
  addElementString("AcquisitionStation", &AcquisitionStation, true);
  addElementString("ProcessingCenter", &ProcessingCenter, true);
  addElementString("ProcessingDate", &ProcessingDate, true);
  addElementString("ProcessingSoftware", &ProcessingSoftware, true);
  addElementDouble("SceneHeading", &SceneHeading, 1, -kBig, kBig, true);
  addElementString("OrbitConfiguration", &OrbitConfiguration, true);
  addElementString("Polarization", &Polarization, true);
  addElementString("Swath", &Swath, true);
  addElementDouble("SWST_MIN", &SWST_MIN, 1, -kBig, kBig, true);
  addElementDouble("SWST_MAX", &SWST_MAX, 1, -kBig, kBig, true);
  addElementDouble("RO_REF", &RO_REF, 1, -kBig, kBig, true);
  addElementInt("RangeLooks", &RangeLooks, 1, 1, 1000, true);
  addElementDouble("RangeBandwidth", RangeBandwidth, 5, -kBig, kBig, true);
  addElementDouble("ExternalCalibrationFactor", &ExternalCalibrationFactor, 1, -kBig, kBig, true);
  addElementString("Projection", &Projection, true);
  addElementString("ImageType", &ImageType, false);
  addElementInt("RGAntenna_flag", &RGAntenna_flag, 1, 0, 1, false);
  addElementInt("AZAntenna_flag", &AZAntenna_flag, 1, 0, 1, false);
  addElementInt("SpreadLoss_flag", &SpreadLoss_flag, 1, 0, 1, false);
  addElementInt("DroopGain_flag", &DroopGain_flag, 1, 0, 1, false);
  addElementInt("RGAntenna_AltitudeCorr_flag", &RGAntenna_AltitudeCorr_flag, 1, 0, 1, false);
  addElementInt("NoiseCorr_flag", &NoiseCorr_flag, 1, 0, 1, false);
  addElementString("SensorName", &SensorName, false);
  addElementString("AcquisitionMode", &AcquisitionMode, false);
  addElementString("RefSystem", &RefSystem, false);
  addElementString("UnitType", &UnitType, false);
  addElementInt("MissingLines", &MissingLines, 1, 0, kIntMax, false);
  addElementInt("LookDirection", &LookDirection, 1, 0, kIntMax, false);
  setAllocationFlag(true);
}

int DataSetInfo_Obj::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "DataSetInfo")) return 0;
  ProfileKeyReader r(file, "DataSetInfo");
  r.required("OrbitNumber", &OrbitNumber);
  r.required("Track", &Track);
  r.required("SenseDate", &SenseDate);
  r.required("SceneID", &SceneID);
  r.required("Description", &Description);
  r.required("AcquisitionStation", &AcquisitionStation);
  r.required("ProcessingCenter", &ProcessingCenter);
  r.required("ProcessingDate", &ProcessingDate);
  r.required("ProcessingSoftware", &ProcessingSoftware);
  r.required("SceneHeading", &SceneHeading);
  r.required("OrbitConfiguration", &OrbitConfiguration);
  r.required("Polarization", &Polarization);
  r.required("Swath", &Swath);
  r.required("SWST_MIN", &SWST_MIN);
  r.required("SWST_MAX", &SWST_MAX);
  r.required("RO_REF", &RO_REF);
  r.required("RangeLooks", &RangeLooks);
  r.required("RangeBandwidth", RangeBandwidth, 5);
  r.required("ExternalCalibrationFactor", &ExternalCalibrationFactor);
  r.required("Projection", &Projection);
  if (r.failed()) return STATUS_BAD_CONDITION;
  r.optional("ImageType", &ImageType);
  r.optional("RGAntenna_flag", &RGAntenna_flag);
  r.optional("AZAntenna_flag", &AZAntenna_flag);
  r.optional("SpreadLoss_flag", &SpreadLoss_flag);
  r.optional("DroopGain_flag", &DroopGain_flag);
  r.optional("RGAntenna_AltitudeCorr_flag", &RGAntenna_AltitudeCorr_flag);
  r.optional("NoiseCorr_flag", &NoiseCorr_flag);
  r.optional("SensorName", &SensorName);
  r.optional("AcquisitionMode", &AcquisitionMode);
  r.optional("RefSystem", &RefSystem);
  r.optional("UnitType", &UnitType);
  r.optional("MissingLines", &MissingLines);
  return 0;
}

int DataSetInfo_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "DataSetInfo");
  return 0;
}

void DataSetInfo_Obj::clone(DataSetInfo_Obj* t) const {
  if (!t || t == this) return;
  t->OrbitNumber = OrbitNumber;
  t->Track = Track;
  t->SenseDate = SenseDate;
  t->SceneID = SceneID;
  t->Description = Description;
  t->AcquisitionStation = AcquisitionStation;
  t->ProcessingCenter = ProcessingCenter;
  t->ProcessingDate = ProcessingDate;
  t->ProcessingSoftware = ProcessingSoftware;
  t->SceneHeading = SceneHeading;
  t->OrbitConfiguration = OrbitConfiguration;
  t->Polarization = Polarization;
  t->Swath = Swath;
  t->SWST_MIN = SWST_MIN;
  t->SWST_MAX = SWST_MAX;
  t->RO_REF = RO_REF;
  t->RangeLooks = RangeLooks;
  for (int i = 0; i < 5; ++i) t->RangeBandwidth[i] = RangeBandwidth[i];
  t->ExternalCalibrationFactor = ExternalCalibrationFactor;
  t->Projection = Projection;
  t->ImageType = ImageType;
  t->RGAntenna_flag = RGAntenna_flag;
  t->AZAntenna_flag = AZAntenna_flag;
  t->SpreadLoss_flag = SpreadLoss_flag;
  t->DroopGain_flag = DroopGain_flag;
  t->RGAntenna_AltitudeCorr_flag = RGAntenna_AltitudeCorr_flag;
  t->NoiseCorr_flag = NoiseCorr_flag;
  t->SensorName = SensorName;
  t->AcquisitionMode = AcquisitionMode;
  t->RefSystem = RefSystem;
  t->UnitType = UnitType;
  t->MissingLines = MissingLines;
  t->LookDirection = LookDirection;
}

const char* DataSetInfo_Obj::imageTypeText(int t) { return lookup(kImageTypes, t); }
const char* DataSetInfo_Obj::sensorTypeText(int t) { return lookup(kSensorTypes, t); }
const char* DataSetInfo_Obj::acqModeText(int t) { return lookup(kAcqModes, t); }
const char* DataSetInfo_Obj::projectionText(int t) { return lookup(kProjections, t); }
const char* DataSetInfo_Obj::unitTypeText(int t) { return lookup(kUnitTypes, t); }
const char* DataSetInfo_Obj::refSysText(int t) { return lookup(kRefSystems, t); }

void DataSetInfo_Obj::SetImageType(int t) { ImageType = storedText(kImageTypes, t); }
bool DataSetInfo_Obj::IsImageType(int t) const { return ImageType == storedText(kImageTypes, t); }
void DataSetInfo_Obj::SetSensorType(int t) { SensorName = storedText(kSensorTypes, t); }
bool DataSetInfo_Obj::IsSensorType(int t) const {
  return SensorName == storedText(kSensorTypes, t);
}
void DataSetInfo_Obj::SetAcqMode(int t) { AcquisitionMode = storedText(kAcqModes, t); }
bool DataSetInfo_Obj::IsAcqMode(int t) const { return AcquisitionMode == storedText(kAcqModes, t); }
void DataSetInfo_Obj::SetProjection(int t) { Projection = storedText(kProjections, t); }
bool DataSetInfo_Obj::IsProjection(int t) const {
  return Projection == storedText(kProjections, t);
}
void DataSetInfo_Obj::SetUnitType(int t) { UnitType = storedText(kUnitTypes, t); }
bool DataSetInfo_Obj::IsUnitType(int t) const { return UnitType == storedText(kUnitTypes, t); }
void DataSetInfo_Obj::SetRefSys(int t) { RefSystem = storedText(kRefSystems, t); }
bool DataSetInfo_Obj::IsRefSys(int t) const { return RefSystem == storedText(kRefSystems, t); }

void DataSetInfo_Obj::SetType(int image, int sensor, int mode, int projection, int unit,
                              int refsys) {
  SetImageType(image);
  SetSensorType(sensor);
  SetAcqMode(mode);
  SetProjection(projection);
  SetUnitType(unit);
  if (Projection == "GEOCODED") SetRefSys(refsys);
}

bool DataSetInfo_Obj::IsType(int image, int sensor, int mode, int projection, int unit,
                             int refsys) const {
  return IsImageType(image) && IsSensorType(sensor) && IsAcqMode(mode) &&
         IsProjection(projection) && IsUnitType(unit) && IsRefSys(refsys);
}

void DataSetInfo_Obj::fillORVANE() { ProcessingCenter = "ORVANE Lumbra"; }

int DataSetInfo_Obj::getPolarizationNbr() const {
  if (Polarization == "H/H") return 0;
  if (Polarization == "H/V") return 1;
  if (Polarization == "V/H") return 2;
  if (Polarization == "V/V") return 3;
  return 666;
}

int DataSetInfo_Obj::getISNbr() const {
  static constexpr struct {
    const char* name;
    int number;
  } kSwaths[] = {{"SS1", 7}, {"SS2", 2}, {"SS3", 3}, {"SS4", 4}, {"SS5", 5}, {"IS1", 0},
                 {"IS2", 1}, {"IS3", 2}, {"IS4", 3}, {"IS5", 4}, {"IS6", 5}, {"IS7", 6}};
  for (const auto& s : kSwaths)
    if (Swath == s.name) return s.number;
  return 666;
}

void DataSetInfo_Obj::StampProcessingDate() {
  const std::time_t now = std::time(nullptr);
  char stamp[64] = {};
  ctime_r(&now, stamp);
  ProcessingDate = std::string(stamp).substr(0, 24);
}

void DataSetInfo_Obj::SetSenseDate(double sec85) {
  std::string sense;
  sec852ascii(sec85, sense);
  SenseDate = sense.substr(0, 27);
}
