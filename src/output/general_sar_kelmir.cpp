// Export of the product record into the description headers and back.
#include "output/general_sar_kelmir.h"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <utility>
#include <variant>

#include "base/constants.h"
#include "base/status.h"
#include "diag/environment.h"
#include "diag/orvane_exception.h"
#include "diag/report.h"
#include "orbit/general_sar_orbit.h"
#include "orbit/palsar_orbit.h"
#include "output/description_text.h"
#include "output/description_xml.h"
#include "product/time_base.h"

namespace {

constexpr double kUnset = consts::kUnsetReal;
constexpr const char* kUnsetText = "NOT_AVAILABLE";

bool usable(double v) { return std::isfinite(v) && v != kUnset; }

// Date text of a slow time, "NOT_AVAILABLE" for one before 1985 or unset.
std::string timeText(double seconds) {
  std::string text;
  if (!usable(seconds) || sec852ascii(seconds, text) != 0) return kUnsetText;
  return text;
}

// Slow time of a date text; false for "NOT_AVAILABLE" or an empty text.
bool timeValue(const std::string& text, double& seconds) {
  if (text.empty() || text == kUnsetText) return false;
  seconds = ascii2sec85(text);
  return true;
}

// Ground range from slant range at incidence (degrees); unset outside (0, 90).
double groundSpacing(double slant, double incidenceDeg) {
  if (!usable(incidenceDeg) || incidenceDeg <= 0.0 || incidenceDeg >= 90.0 || !(slant > 0.0))
    return kUnset;
  return slant / std::sin(incidenceDeg * consts::kPi / 180.0);
}

}  // namespace

const char* kelmirProductIdentifier(int tag) {
  switch (tag) {
    case KT_ENVISAT_IM: return "ENVISAT_IM0";
    case KT_ERS1: return "ERS1_IM";
    case KT_ERS2: return "ERS2_IM";
    case KT_RADARSAT: return "RS1_IM";
    case KT_ENVISAT_AP: return "ENVISAT_AP0";
    case KT_PALSAR_SINGLE: return "ALOS_PALSAR_FBS10";
    case KT_PALSAR_DOUBLE: return "ALOS_PALSAR_FBD10";
    case KT_PALSAR_QUAD: return "ALOS_PALSAR_PLR10";
    case KT_PALSAR_ERSDAC: return "ALOS_PALSAR";
    default: return "";
  }
}

// ---------------------------------------------------------------- service

Service_kelmir::Service_kelmir(std::string className, std::string sectionName)
    : class_(std::move(className)), section_(std::move(sectionName)) {
  report_.push_back({"report_" + class_, "initialized", "WARNING"});
}

Service_kelmir::~Service_kelmir() = default;

void Service_kelmir::gsmReport(const std::string& kind, const std::string& field,
                               const std::string& text, const std::string& level) {
  report_.push_back({"report_" + class_ + "/" + kind + "/" + field, text, level});
}

tesv_description_field& Service_kelmir::put(tesv_description_section& header, const std::string& field,
                                            bool mandatory) {
  std::string path = field.find('.') == std::string::npos ? section_ + "." + field : field;
  auto& f = header.setField(path);
  f.mandatory = mandatory;
  gsmReport("key", field, "written", "WARNING");
  return f;
}

void Service_kelmir::putInt(tesv_description_section& header, const std::string& field,
                            long long value, bool mandatory) {
  put(header, field, mandatory).setInt(value);
}
void Service_kelmir::putDouble(tesv_description_section& header, const std::string& field,
                               double value, bool mandatory) {
  put(header, field, mandatory).setDouble(value);
}
void Service_kelmir::putString(tesv_description_section& header, const std::string& field,
                               const std::string& value, bool mandatory) {
  put(header, field, mandatory).setString(value);
}
void Service_kelmir::putDoubles(tesv_description_section& header, const std::string& field,
                                const std::vector<double>& values, bool mandatory) {
  put(header, field, mandatory).setDoubleVector(values);
}
void Service_kelmir::putStrings(tesv_description_section& header, const std::string& field,
                                const std::vector<std::string>& values, bool mandatory) {
  put(header, field, mandatory).setStringVector(values);
}

const tesv_description_field* Service_kelmir::find(const tesv_description_section& header,
                                                   const std::string& field, bool mandatory) {
  std::string path = field.find('.') == std::string::npos ? section_ + "." + field : field;
  const auto* f = header.getField(path);
  if (!f) {
    gsmReport("result", field, "not found", mandatory ? "ERROR" : "WARNING");
    if (mandatory) throw orvaneException("Mandatory field not found : " + path);
  }
  return f;
}

template <class Getter>
int Service_kelmir::takeWith(const tesv_description_section& header, const std::string& field,
                             bool mandatory, Getter get) {
  const auto* f = find(header, field, mandatory);
  if (!f) return STATUS_BAD_CONDITION;
  if (get(*f) != 0) {
    gsmReport("result", field,
              "Data Type ID : " + std::to_string(f->type) + " " + descriptionTypeText(f->type), "ERROR");
    return STATUS_BAD_CONDITION;
  }
  gsmReport("result", field, "read", "WARNING");
  return STATUS_OK;
}

int Service_kelmir::take(const tesv_description_section& header, const std::string& field,
                         double& value, bool mandatory) {
  return takeWith(header, field, mandatory, [&value](const tesv_description_field& f) { return f.getDouble(value); });
}

int Service_kelmir::take(const tesv_description_section& header, const std::string& field,
                         int& value, bool mandatory) {
  return takeWith(header, field, mandatory, [&value](const tesv_description_field& f) { return f.getInt(value); });
}

int Service_kelmir::take(const tesv_description_section& header, const std::string& field,
                         long long& value, bool mandatory) {
  return takeWith(header, field, mandatory, [&value](const tesv_description_field& f) { return f.getInt(value); });
}

int Service_kelmir::take(const tesv_description_section& header, const std::string& field,
                         std::string& value, bool mandatory) {
  return takeWith(header, field, mandatory, [&value](const tesv_description_field& f) {
    if (f.type == FT_STRING && f.strings.empty()) {  // an empty field is the empty text
      value.clear();
      return 0;
    }
    return f.getString(value);
  });
}

int Service_kelmir::take(const tesv_description_section& header, const std::string& field,
                         std::vector<double>& values, bool mandatory) {
  return takeWith(header, field, mandatory, [&values](const tesv_description_field& f) { return f.getDoubles(values); });
}

int Service_kelmir::take(const tesv_description_section& header, const std::string& field,
                         std::vector<std::string>& values, bool mandatory) {
  return takeWith(header, field, mandatory, [&values](const tesv_description_field& f) -> int {
    std::vector<std::string> out(static_cast<std::size_t>(f.numberOfElements()));
    for (std::size_t i = 0; i < out.size(); ++i)
      if (f.getString(out[i], static_cast<int>(i)) != 0) return STATUS_BAD_CONDITION;
    values = std::move(out);
    return 0;
  });
}

// ---------------------------------------------------------------- raster layout

namespace {

// The plain counts of the raster layout, in header order: written and read
// from the same table.
const std::pair<const char*, int DataFile_kelmir::*> kRasterCounts[] = {
    {"NrOfPixelsPerLine", &DataFile_kelmir::NrOfPixelsPerLine},
    {"NrOfLinesPerImage", &DataFile_kelmir::NrOfLinesPerImage},
    {"RowPrefix", &DataFile_kelmir::RowPrefix}, {"RowSuffix", &DataFile_kelmir::RowSuffix}};

}  // namespace

DataFile_kelmir::DataFile_kelmir() : Service_kelmir("DataFile_kelmir", "RasterInfo") {}

int DataFile_kelmir::writehdr_kelmir(tesv_description_section& header) {
  for (const auto& [key, count] : kRasterCounts) putInt(header, key, this->*count);
  putInt(header, "HeaderOffset", HeaderOffset);
  putDouble(header, "NullCellValue", NullCellValue);
  std::string cell(cell_type_text(CellType));
  if (cell.empty()) putInt(header, "CellType", CellType);
  else putString(header, "CellType", cell);
  putString(header, "BytesOrder", ByteOrder == 1 ? "MSBF" : "LSBF");
  putString(header, "DataUnits", DataUnits);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int DataFile_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  for (const auto& [key, count] : kRasterCounts) take(header, key, this->*count);
  long long offset = HeaderOffset;
  if (take(header, "HeaderOffset", offset) == 0) HeaderOffset = offset;
  take(header, "NullCellValue", NullCellValue);
  std::string cell;
  int number = 0;
  if (take(header, "CellType", cell) == 0) {
    int t = cell_type_from_text(cell);
    if (t >= 0) CellType = t;
    else if (take(header, "CellType", number) == 0) CellType = number;
  }
  std::string order;
  if (take(header, "BytesOrder", order) == 0) ByteOrder = order == "MSBF" ? 1 : 0;
  take(header, "DataUnits", DataUnits);
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- region

ROI_Obj_kelmir::ROI_Obj_kelmir() : Service_kelmir("ROI_Obj_kelmir", "InitialGeometry") {}

int ROI_Obj_kelmir::writehdr_kelmir(tesv_description_section& header) {
  const double halfC = consts::kSpeedOfLight / 2.0;
  putDouble(header, "SlantRange", FastStartTime * halfC, true);
  putDouble(header, "FastTime", FastStartTime, true);
  putString(header, "AzimuthStartTime", timeText(SlowStartTime));
  putString(header, "ACQUISITION_TIME", timeText(SlowStartTime));
  putString(header, "AzimuthStopTime", timeText(SlowStartTime + SlowTimeLength));
  putDouble(header, "PixelSpacingRg", FastTimeDelta * halfC);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int ROI_Obj_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  double slant = 0.0;
  take(header, "SlantRange", slant, true);
  take(header, "FastTime", FastStartTime, true);
  std::string text;
  double start = SlowStartTime, stop = SlowStartTime + SlowTimeLength;
  if (take(header, "AzimuthStartTime", text) == 0 && timeValue(text, start)) SlowStartTime = start;
  if (take(header, "AzimuthStopTime", text) == 0 && timeValue(text, stop)) SlowTimeLength = stop - start;
  double spacing = 0.0;
  if (take(header, "PixelSpacingRg", spacing) == 0) FastTimeDelta = spacing / (consts::kSpeedOfLight / 2.0);
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- sampling, pulse

SamplingConstants_Obj_kelmir::SamplingConstants_Obj_kelmir()
    : Service_kelmir("SamplingConstants_Obj_kelmir", "Sensor") {}

int SamplingConstants_Obj_kelmir::writehdr_kelmir(tesv_description_section& header) {
  putDouble(header, "CarrierFrequency", fc_hz, true);
  putDouble(header, "PRFExtracted", prf_hz, true);
  putDouble(header, "Inter_Burst_Time", bri_s);
  putDouble(header, "BandWidth", Brg_hz, true);
  putDouble(header, "SamplingRate", frg_hz, true);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int SamplingConstants_Obj_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  take(header, "CarrierFrequency", fc_hz, true);
  take(header, "PRFExtracted", prf_hz, true);
  take(header, "Inter_Burst_Time", bri_s);
  take(header, "BandWidth", Brg_hz, true);
  take(header, "SamplingRate", frg_hz, true);
  if (fc_hz > 0.0) lambda_m = consts::kSpeedOfLight / fc_hz;
  if (prf_hz > 0.0) pri_s = 1.0 / prf_hz;
  if (frg_hz > 0.0) Trg_s = 1.0 / frg_hz;
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

SARPulse_Obj_kelmir::SARPulse_Obj_kelmir() : Service_kelmir("SARPulse_Obj_kelmir", "Sensor") {}

int SARPulse_Obj_kelmir::writehdr_kelmir(tesv_description_section& header) {
  putDouble(header, "PulseDuration", PulseLength, true);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int SARPulse_Obj_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  take(header, "PulseDuration", PulseLength, true);
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- identification

DataSetInfo_Obj_kelmir::DataSetInfo_Obj_kelmir()
    : Service_kelmir("DataSetInfo_Obj_kelmir", "RasterInfo") {}

int DataSetInfo_Obj_kelmir::writehdr_kelmir(tesv_description_section& header,
                                            const std::string& productIdentifier) {
  putInt(header, "NAzimuthLooks", NAzimuthLooks);
  putInt(header, "NRangeLooks", RangeLooks);
  putString(header, "ACQUISITION_STATION", AcquisitionStation);
  putString(header, "PROC_CENTER", ProcessingCenter);
  putString(header, "PROC_TIME", ProcessingDate);
  long long orbit = 0;
  if (parseDescriptionInt(OrbitNumber, orbit)) putInt(header, "ABS_ORBIT", orbit);
  else putString(header, "ABS_ORBIT", OrbitNumber);
  putString(header, "SOFTWARE", ProcessingSoftware);
  putDouble(header, "CalConstProc", ExternalCalibrationFactor);
  putString(header, "SensorName", SensorName);
  putString(header, "Description", productIdentifier.empty() ? Description : productIdentifier);
  putDouble(header, "InitialGeometry.SceneHeading", SceneHeading);
  bool descending = !OrbitConfiguration.empty() && (OrbitConfiguration[0] == 'D' || OrbitConfiguration[0] == 'd');
  putString(header, "OrbitConfiguration", descending ? "DESCENDING" : "ASCENDING");
  putDouble(header, "SceneHeading", SceneHeading);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int DataSetInfo_Obj_kelmir::writehdr_kelmir(tesv_description_section& header,
                                            const std::string& productIdentifier,
                                            const std::string& calibrationFile) {
  int st = writehdr_kelmir(header, productIdentifier);
  if (st != 0 || calibrationFile.empty()) return st;
  AntennaPattern_Obj pattern;
  st = pattern.getPatternENVI(calibrationFile, getISNbr(), getPolarizationNbr());
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  putInt(header, "EnvisatTwoWayAntennaElevationPatternTableNbr", pattern.PatternSamples);
  double reference = pattern.StartAngle + 0.5 * (pattern.PatternSamples - 1) * pattern.DeltaAngle;
  putDouble(header, "EnvisatReferenceElevationAngle", reference);
  std::vector<double> table(pattern.Pattern.begin(), pattern.Pattern.end());
  putDoubles(header, "EnvisatTwoWayAntennaElevationPatternTable", table, true);
  return STATUS_OK;
}

int DataSetInfo_Obj_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  take(header, "NAzimuthLooks", NAzimuthLooks);
  take(header, "NRangeLooks", RangeLooks);
  take(header, "ACQUISITION_STATION", AcquisitionStation);
  take(header, "PROC_CENTER", ProcessingCenter);
  take(header, "PROC_TIME", ProcessingDate);
  take(header, "ABS_ORBIT", OrbitNumber);
  take(header, "SOFTWARE", ProcessingSoftware);
  take(header, "CalConstProc", ExternalCalibrationFactor);
  take(header, "SensorName", SensorName);
  take(header, "Description", Description);
  take(header, "SceneHeading", SceneHeading);
  take(header, "OrbitConfiguration", OrbitConfiguration);
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- corners

geoCoords_Obj_kelmir::geoCoords_Obj_kelmir()
    : Service_kelmir("geoCoords_Obj_kelmir", "CartographicSystem") {}

namespace {

// The corners and the scene centre, in header order: written and read by the
// same walk.
template <class Visit>
void cornerValues(geoCoords_Obj_kelmir& g, Visit&& visit) {
  geopoint* corners[4] = {&g.NW, &g.NE, &g.SE, &g.SW};
  for (int i = 0; i < 4; ++i) {
    std::string base = "CORNER POINT " + std::to_string(i + 1) + "  ";
    visit(base + "X", corners[i]->lon);
    visit(base + "Y", corners[i]->lat);
  }
  visit("CENTER SCENE POINT X", g.center.lon);
  visit("CENTER SCENE POINT Y", g.center.lat);
  visit("RangeLookAngle", g.center.look);
  visit("IncidenceAngle", g.center.incidence);
}

}  // namespace

int geoCoords_Obj_kelmir::writehdr_kelmir(tesv_description_section& header) {
  cornerValues(*this, [&](const std::string& key, double value) { putDouble(header, key, value); });
  putDouble(header, "LatNorthing", center.lat);
  putDouble(header, "LonEasting", center.lon);
  putString(header, "RegistrationCoordinates.Units", "DEGREES");
  putString(header, "UTM_HEMISPHERE", center.lat < 0.0 && usable(center.lat) ? "SOUTH" : "NORTH");
  int zone = 0;
  if (usable(center.lon)) {
    double lon = std::fmod(center.lon + 180.0, 360.0);
    if (lon < 0.0) lon += 360.0;
    zone = static_cast<int>(std::floor(lon / 6.0)) % 60 + 1;
  }
  putInt(header, "UTM_ZONE", zone);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int geoCoords_Obj_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  cornerValues(*this, [&](const std::string& key, double& value) { take(header, key, value); });
  for (geopoint* p : {&NW, &NE, &SE, &SW, &center}) p->syncToPoint();
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- attitude

SensorAttitude_Obj_kelmir::SensorAttitude_Obj_kelmir()
    : Service_kelmir("SensorAttitude_Obj_kelmir", "sar_processing") {}

int SensorAttitude_Obj_kelmir::writehdr_kelmir(tesv_description_section& header, double lineTime,
                                               float defaultSpeed) {
  ProcessingVelocity = Eq_speed;
  if (!usable(Eq_speed) || !(Eq_speed > 0.0)) {
    ORV_REPORT("eq_speed is not correctly estimated.", REPORT_WARNING);
    ProcessingVelocity = defaultSpeed;
  }
  PixelSpacingAz = usable(lineTime) ? ProcessingVelocity * std::fabs(lineTime) : kUnset;
  putDouble(header, "PixelSpacingAz", PixelSpacingAz);
  putDouble(header, "ProcessingVelocity", ProcessingVelocity);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int SensorAttitude_Obj_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  take(header, "PixelSpacingAz", PixelSpacingAz);
  if (take(header, "ProcessingVelocity", ProcessingVelocity) == 0) Eq_speed = ProcessingVelocity;
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- polynomials

polySAR_kelmir::polySAR_kelmir() : Service_kelmir("polySAR_kelmir", "sar_processing") {}

namespace {
template <class Row>
void rowsToFields(const std::vector<Row>& rows, std::vector<std::string>& az, std::vector<double>& rg,
                  std::vector<double>& coefficients) {
  for (const auto& r : rows) {
    az.push_back(timeText(r.taz0));
    rg.push_back(r.trg0);
    coefficients.insert(coefficients.end(), r.c, r.c + 7);
  }
}

template <class Row>
int fieldsToRows(std::vector<Row>& rows, const std::vector<std::string>& az, const std::vector<double>& rg,
                 const std::vector<double>& coefficients, int nCoeff) {
  if (az.size() != rows.size() || rg.size() != rows.size() || nCoeff < 0 || nCoeff > 7 ||
      coefficients.size() != rows.size() * static_cast<std::size_t>(nCoeff))
    return STATUS_BAD_PARAMETER;
  for (std::size_t i = 0; i < rows.size(); ++i) {
    double t = 0.0;
    if (timeValue(az[i], t)) rows[i].taz0 = t;
    rows[i].trg0 = rg[i];
    for (int k = 0; k < 7; ++k)
      rows[i].c[k] = k < nCoeff ? coefficients[i * static_cast<std::size_t>(nCoeff) + static_cast<std::size_t>(k)] : 0.0;
  }
  return STATUS_OK;
}
}  // namespace

int polySAR_kelmir::writehdr_kelmir(tesv_description_section& header) {
  std::vector<std::string> az;
  std::vector<double> rg, coefficients;
  rowsToFields(DC, az, rg, coefficients);
  putInt(header, "nDopCenDataSet", static_cast<long long>(DC.size()));
  putStrings(header, "DopCenRefTime", az);
  putDoubles(header, "DopCenRgRefTime", rg);
  putInt(header, "DopCenPol_nCoeff", 7);
  put(header, "DopCenRangeCoeff", false).setDoubleMatrix(static_cast<int>(DC.size()), 7, coefficients);
  az.clear();
  rg.clear();
  coefficients.clear();
  rowsToFields(FR, az, rg, coefficients);
  putInt(header, "nDopRateDataSet", static_cast<long long>(FR.size()));
  put(header, "DopRateRangeCoeff", false).setDoubleMatrix(static_cast<int>(FR.size()), 7, coefficients);
  putStrings(header, "DopRateRefTime", az);
  putDoubles(header, "DopRateRgRefTime", rg);
  putInt(header, "DopRatePol_nCoeff", 7);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int polySAR_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  int nDc = 0, nFr = 0, nDcCoeff = 7, nFrCoeff = 7;
  take(header, "nDopCenDataSet", nDc);
  take(header, "nDopRateDataSet", nFr);
  take(header, "DopCenPol_nCoeff", nDcCoeff);
  take(header, "DopRatePol_nCoeff", nFrCoeff);
  if (nDc < 0 || nFr < 0 || nDc > 1000000 || nFr > 1000000) return STATUS_BAD_PARAMETER;
  int st = CreatePolys(nDc, nFr);
  if (st != 0) return st;
  // One table: reference times, range reference times and coefficients.
  auto readTable = [&](const char* times, const char* rangeTimes, const char* values, auto& rows,
                       int nCoeff) {
    std::vector<std::string> az;
    std::vector<double> rg, coefficients;
    take(header, times, az);
    take(header, rangeTimes, rg);
    take(header, values, coefficients);
    return fieldsToRows(rows, az, rg, coefficients, nCoeff);
  };
  if (nDc > 0) {
    st = readTable("DopCenRefTime", "DopCenRgRefTime", "DopCenRangeCoeff", DC, nDcCoeff);
    if (st != 0) {
      ORV_REPORT("Doppler centroid table of the header is inconsistent", REPORT_ERROR);
      return st;
    }
  }
  if (nFr > 0) {
    st = readTable("DopRateRefTime", "DopRateRgRefTime", "DopRateRangeCoeff", FR, nFrCoeff);
    if (st != 0) {
      ORV_REPORT("Doppler rate table of the header is inconsistent", REPORT_ERROR);
      return st;
    }
  }
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- orbit

GeneralSAROrbit_kelmir::GeneralSAROrbit_kelmir()
    : Service_kelmir("GeneralSAROrbit_kelmir", "StateVectorData") {}

int GeneralSAROrbit_kelmir::writehdr_kelmir(tesv_description_section& header, bool bypass) {
  if (bypass) {
    if (tracingActive()) traceWrite("bypassing Satellite information\n");
    gsmReport("key", "StateVectorData", "bypassing Satellite information", "WARNING");
    return STATUS_OK;
  }
  putInt(header, "nStateVectors", nSV);
  putString(header, "StateVectorReference", "EARTH_FIXED");
  putString(header, "TimeFirst", timeText(t0));
  putDouble(header, "TimeDelta", dt);
  std::vector<double> axis[6];
  for (int i = 0; i < nSV && static_cast<std::size_t>(3 * i + 2) < pos.size(); ++i) {
    for (int k = 0; k < 3; ++k) {
      axis[k].push_back(pos[static_cast<std::size_t>(3 * i + k)]);
      axis[3 + k].push_back(vel[static_cast<std::size_t>(3 * i + k)]);
    }
  }
  const char* names[6] = {"pos_x", "pos_y", "pos_z", "vel_x", "vel_y", "vel_z"};
  for (int k = 0; k < 6; ++k) putDoubles(header, names[k], axis[k]);
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int GeneralSAROrbit_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  int n = 0;
  double first = 0.0, delta = 0.0;
  std::string text;
  if (take(header, "nStateVectors", n) != 0 || n == 0) return STATUS_BAD_CONDITION;
  if (take(header, "TimeFirst", text) != 0 || !timeValue(text, first)) return STATUS_BAD_PARAMETER;
  if (take(header, "TimeDelta", delta) != 0) return STATUS_BAD_PARAMETER;
  const char* names[6] = {"pos_x", "pos_y", "pos_z", "vel_x", "vel_y", "vel_z"};
  std::vector<double> axis[6];
  for (int k = 0; k < 6; ++k) {
    if (take(header, names[k], axis[k]) != 0 || axis[k].size() != static_cast<std::size_t>(n)) {
      ORV_REPORT(std::string("State vector component of the wrong length: ") + names[k], REPORT_ERROR);
      return STATUS_BAD_PARAMETER;
    }
  }
  int st = SVCreate(first, delta, n);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  for (int i = 0; i < n; ++i)
    for (int k = 0; k < 3; ++k) {
      pos[static_cast<std::size_t>(3 * i + k)] = axis[k][static_cast<std::size_t>(i)];
      vel[static_cast<std::size_t>(3 * i + k)] = axis[3 + k][static_cast<std::size_t>(i)];
    }
  st = computeApproximateSV();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  gsmReport("result", "section", "section closed", "WARNING");
  return st;
}

// ---------------------------------------------------------------- derived values

OtherInfo_kelmir::OtherInfo_kelmir() : Service_kelmir("OtherInfo_kelmir", "Processing") {}

int OtherInfo_kelmir::compute(GeneralSAR& record, float defaultSpeed) {
  const ROI_Obj& roi = record.roi.roi;
  TimeDirectionLines = roi.SlowTimeDelta < 0.0 ? "DECREASE TIME DIRECTION" : "INCREASE TIME DIRECTION";
  FromInImageRangeLooks = record.GSexists(GeneralSAR::GS_DATASETINFO) ? record.dataSetInfo.RangeLooks : 1;
  FromInImageAzimuthLooks = 1;
  NAzimuthLooks = 1;
  AzimuthPixelShift = 0.0;

  double incidence = kUnset;
  double speed = defaultSpeed;
  double tc = roi.SlowStartTime + roi.SlowTimeLength / 2.0;
  double tau = roi.FastStartTime + roi.FastTimeLength / 2.0;
  if (record.GSexists(GeneralSAR::GS_ORBIT) && record.orbit().nSV >= 5) {
    GeneralSAROrbit orbit;
    if (record.orbit().clone(&orbit) == 0) {
      double look = 0.0, inc = 0.0, ground = 0.0;
      if (orbit.SVGetAngles(tc, tau, &inc, &look) == 0) incidence = inc;
      if (orbit.SVGetSatSpeed(tc, tau, 0.0, &ground) == 0 && ground > 0.0) speed = ground;
    }
  }
  if (!usable(incidence) && record.GSexists(GeneralSAR::GS_GEOCOORDS))
    incidence = record.geoCoords.center.incidence;

  double lineTime = std::fabs(roi.SlowTimeDelta);
  if (!(lineTime > 0.0) && record.sampling.prf_hz > 0.0) lineTime = 1.0 / record.sampling.prf_hz;
  PixelSpacingAz = lineTime > 0.0 ? speed * lineTime : kUnset;
  GroundPixelSpacingRg = groundSpacing(std::fabs(roi.FastTimeDelta) * consts::kSpeedOfLight / 2.0, incidence);

  SuggestedAzimuthLooks = SuggestedRangeLooks = 1;
  if (usable(PixelSpacingAz) && usable(GroundPixelSpacingRg) && PixelSpacingAz > 0.0) {
    // Looks that make the ground pixel nearest to square.
    if (GroundPixelSpacingRg >= PixelSpacingAz)
      SuggestedAzimuthLooks = std::max(1, roundHalfAway(GroundPixelSpacingRg / PixelSpacingAz));
    else
      SuggestedRangeLooks = std::max(1, roundHalfAway(PixelSpacingAz / GroundPixelSpacingRg));
    AzimuthGroundPixelSpaceFromSuggestLooks = PixelSpacingAz * SuggestedAzimuthLooks;
    RangeGroundPixelSpaceFromSuggestLooks = GroundPixelSpacingRg * SuggestedRangeLooks;
  } else {
    AzimuthGroundPixelSpaceFromSuggestLooks = usable(PixelSpacingAz) ? PixelSpacingAz : kUnset;
    RangeGroundPixelSpaceFromSuggestLooks = usable(GroundPixelSpacingRg) ? GroundPixelSpacingRg : kUnset;
  }
  return STATUS_OK;
}

namespace {

// The look and spacing values of the processing section, in header order:
// written and read from the same table.
using LookValue = std::variant<int OtherInfo_kelmir::*, double OtherInfo_kelmir::*>;
const std::pair<const char*, LookValue> kLookValues[] = {
    {"AzimuthPixelShift", &OtherInfo_kelmir::AzimuthPixelShift},
    {"NAzimuthLooks", &OtherInfo_kelmir::NAzimuthLooks},
    {"SuggestedAzimuthLooks", &OtherInfo_kelmir::SuggestedAzimuthLooks},
    {"SuggestedRangeLooks", &OtherInfo_kelmir::SuggestedRangeLooks},
    {"AzimuthGroundPixelSpaceFromSuggestLooks",
     &OtherInfo_kelmir::AzimuthGroundPixelSpaceFromSuggestLooks},
    {"RangeGroundPixelSpaceFromSuggestLooks",
     &OtherInfo_kelmir::RangeGroundPixelSpaceFromSuggestLooks},
    {"FromInImageAzimuthLooks", &OtherInfo_kelmir::FromInImageAzimuthLooks},
    {"FromInImageRangeLooks", &OtherInfo_kelmir::FromInImageRangeLooks},
    {"PixelSpacingAz", &OtherInfo_kelmir::PixelSpacingAz}};

}  // namespace

int OtherInfo_kelmir::writehdr_kelmir(tesv_description_section& header) {
  putString(header, "StateVectorSource", "SLC_DATA_PRODUCT");
  putString(header, "StateVectorReference", "EARTH_FIXED");
  putString(header, "InitialGeometry.Projection", "SLANT_RANGE");
  putString(header, "InitialGeometry.TimeDirectionPixel", "INCREASE TIME DIRECTION");
  putString(header, "InitialGeometry.TimeDirectionLines", TimeDirectionLines);
  for (const auto& [key, member] : kLookValues) {
    if (const auto* count = std::get_if<int OtherInfo_kelmir::*>(&member))
      putInt(header, key, this->**count);
    else
      putDouble(header, key, this->*std::get<double OtherInfo_kelmir::*>(member));
  }
  gsmReport("key", "section", "section closed", "WARNING");
  return STATUS_OK;
}

int OtherInfo_kelmir::readhdr_kelmir(const tesv_description_section& header) {
  take(header, "InitialGeometry.TimeDirectionLines", TimeDirectionLines);
  for (const auto& [key, member] : kLookValues)
    std::visit([&, name = key](auto value) { take(header, name, this->*value); }, member);
  gsmReport("result", "section", "section closed", "WARNING");
  return STATUS_OK;
}

// ---------------------------------------------------------------- record

GeneralSAR_kelmir::GeneralSAR_kelmir() : Service_kelmir("GeneralSAR_kelmir", "RasterInfo") {}

namespace {

// Loads the existing header of a product (".sml" first, then "_hdr"), so that
// what this program does not write survives a rewrite.
tesv_description_section existingHeader(const std::string& file) {
  tesv_description_section header = makeProductHeader();
  tesv_description_section old;
  std::error_code ec;
  bool loaded = false;
  if (std::filesystem::exists(file + ".sml", ec))
    loaded = tesv_read_description_xml(file + ".sml", old) == STATUS_OK;
  if (!loaded && std::filesystem::exists(file + "_hdr", ec))
    loaded = tesv_read_description_text(file + "_hdr", old) == STATUS_OK;
  if (!loaded) return header;
  for (auto& section : old.sections) {
    if (auto* own = header.findSection(section.name)) *own = std::move(section);
    else header.sections.push_back(std::move(section));
  }
  header.fields = std::move(old.fields);
  return header;
}

}  // namespace

namespace {

// Writes one member of the record into the header through its export class.
template <class Export, class Member, class... Args>
int exportObject(Member& member, tesv_description_section& header, Args&&... args) {
  Export k;
  member.clone(&k);
  return k.writehdr_kelmir(header, std::forward<Args>(args)...);
}

}  // namespace

int GeneralSAR_kelmir::fillHeader(const std::string& second, float defaultSpeed, int productTag,
                                  bool bypassOrbit) {
  int st = STATUS_OK;
  auto step = [&st](int status) {
    if (status != 0) {
      ORV_REPORT_CALLED_ERROR();
      st = status;
    }
    return status == 0;
  };
  if (GSexists(GS_DATAFILE)) {
    DataFile_kelmir k;
    dataFile.clone(&k);
    if (GSexists(GS_DATASETINFO)) k.DataUnits = dataSetInfo.UnitType;
    if (!step(k.writehdr_kelmir(header_))) return st;
  }
  if (GSexists(GS_ROI) && !step(exportObject<ROI_Obj_kelmir>(roi.roi, header_))) return st;
  if (GSexists(GS_POLYNOMIALS) && !step(exportObject<polySAR_kelmir>(polynomials, header_)))
    return st;
  if (GSexists(GS_SAMPLING) &&
      !step(exportObject<SamplingConstants_Obj_kelmir>(sampling, header_)))
    return st;
  if (GSexists(GS_ORBIT) && orbit().nSV >= 5) {
    GeneralSAROrbit_kelmir k;
    if (!step(orbit().clone(&k))) return st;
    if (!step(k.writehdr_kelmir(header_, bypassOrbit))) return st;
  }
  if (GSexists(GS_PULSE) && !step(exportObject<SARPulse_Obj_kelmir>(pulse, header_))) return st;
  if (GSexists(GS_DATASETINFO) &&
      !step(exportObject<DataSetInfo_Obj_kelmir>(dataSetInfo, header_,
                                                 kelmirProductIdentifier(productTag), second)))
    return st;
  if (GSexists(GS_ATTITUDE)) {
    double lineTime = roi.roi.SlowTimeDelta;
    if (!(std::fabs(lineTime) > 0.0) && sampling.prf_hz > 0.0) lineTime = 1.0 / sampling.prf_hz;
    if (!step(exportObject<SensorAttitude_Obj_kelmir>(attitude, header_, lineTime, defaultSpeed)))
      return st;
  }
  if (!step(otherInfo.compute(*this, defaultSpeed))) return st;
  if (!step(otherInfo.writehdr_kelmir(header_))) return st;
  if (GSexists(GS_GEOCOORDS) && !step(exportObject<geoCoords_Obj_kelmir>(geoCoords, header_)))
    return st;
  return st;
}

int GeneralSAR_kelmir::writeFiles(const std::string& file) {
  int st = tesv_write_description_xml(header_, file + ".sml");
  if (st == 0) st = tesv_write_description_text(header_, file + "_hdr");
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

int GeneralSAR_kelmir::writehdr_kelmir(const std::string& file, const std::string& second,
                                       float defaultSpeed, int productTag) {
  if (productTag == KT_PALSAR_ERSDAC) {
    ORV_REPORT("Cannot write ERSDAC header with writehdr_kelmir function", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  header_ = existingHeader(file);
  int st = fillHeader(second, defaultSpeed, productTag, false);
  if (st != 0) return st;
  return writeFiles(file);
}

int GeneralSAR_kelmir::writehdr_ersdac_kelmir(const std::string& file, const std::string& leader,
                                              float defaultSpeed, int productTag) {
  if (productTag != KT_PALSAR_ERSDAC) {
    ORV_REPORT("ONLY ERSDAC with writehdr_ersdac_kelmir function", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  std::string stepText;
  double step = 0.0, firstTime = 0.0;
  int st = read_palsar_leader_timing(leader, firstTime, stepText, step);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  const std::string firstText = timeText(firstTime);
  header_ = existingHeader(file);
  st = fillHeader("", defaultSpeed, productTag, false);
  if (st != 0) return st;
  char line[160];
  std::snprintf(line, sizeof line, "0) ERSDAC TimeDelta is %s", stepText.c_str());
  ORV_REPORT(line, REPORT_CHECKPOINT);
  if (auto* delta = header_.getField("StateVectorData.TimeDelta")) {
    double read = 0.0;
    if (delta->getDouble(read) == 0 && read != step) {
      std::snprintf(line, sizeof line, "1) ERSDAC TimeDelta is %f (while read is %f)", step, read);
      ORV_REPORT(line, REPORT_CHECKPOINT);
    }
    delta->setDouble(step);
    header_.setField("StateVectorData.TimeFirst").setString(firstText);
  }
  return writeFiles(file);
}

int GeneralSAR_kelmir::readhdr_kelmir(const std::string& file) {
  std::error_code ec;
  tesv_description_section header;
  int st = std::filesystem::exists(file + ".sml", ec) ? tesv_read_description_xml(file + ".sml", header)
                                                      : tesv_read_description_text(file + "_hdr", header);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  header_ = header;
  try {
    DataFile_kelmir df;
    if (header.getField("RasterInfo.NrOfPixelsPerLine")) {
      df.readhdr_kelmir(header);
      df.clone(&dataFile);
      dataFile.filename = file;
      GSenable(GS_DATAFILE);
    }
    SamplingConstants_Obj_kelmir sc;
    if (header.getField("Sensor.CarrierFrequency")) {
      sc.readhdr_kelmir(header);
      sc.clone(&sampling);
      GSenable(GS_SAMPLING);
    }
    if (header.getField("InitialGeometry.FastTime")) {
      ROI_Obj_kelmir r;
      r.readhdr_kelmir(header);
      double slowDelta = sc.prf_hz > 0.0 ? 1.0 / sc.prf_hz : 0.0;
      if (df.NrOfLinesPerImage > 0 && !(slowDelta > 0.0)) slowDelta = r.SlowTimeLength / df.NrOfLinesPerImage;
      r.SetFastAxe(r.FastStartTime, r.FastTimeDelta, df.NrOfPixelsPerLine);
      r.SetSlowAxe(r.SlowStartTime, slowDelta, df.NrOfLinesPerImage);
      r.clone(&roi.roi);
      GSenable(GS_ROI);
    }
    if (header.getField("sar_processing.nDopCenDataSet")) {
      polySAR_kelmir p;
      st = p.readhdr_kelmir(header);
      if (st != 0) return st;
      p.clone(&polynomials);
      GSenable(GS_POLYNOMIALS);
    }
    if (header.getField("StateVectorData.nStateVectors")) {
      GeneralSAROrbit_kelmir o;
      if (o.readhdr_kelmir(header) == 0) {
        GSenable(GS_ORBIT);
        st = o.clone(&orbit());
        if (st != 0) return st;
        if (sc.lambda_m > 0.0) orbit().setLambda(sc.lambda_m);
      }
    }
    // A member whose key field the header holds, read through its export class.
    auto import = [&](auto&& exporter, const char* key, auto& member, GSObject object) {
      if (!header.getField(key)) return;
      exporter.readhdr_kelmir(header);
      exporter.clone(&member);
      GSenable(object);
    };
    import(SARPulse_Obj_kelmir{}, "Sensor.PulseDuration", pulse, GS_PULSE);
    import(DataSetInfo_Obj_kelmir{}, "RasterInfo.SensorName", dataSetInfo, GS_DATASETINFO);
    import(SensorAttitude_Obj_kelmir{}, "sar_processing.ProcessingVelocity", attitude, GS_ATTITUDE);
    otherInfo.readhdr_kelmir(header);
    import(geoCoords_Obj_kelmir{}, "CartographicSystem.CENTER SCENE POINT X", geoCoords,
           GS_GEOCOORDS);
  } catch (const orvaneException& e) {
    ORV_REPORT(e.getMessage() + " in " + file, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  return STATUS_OK;
}
