#pragma once
// Export of the product record into the description headers ("_hdr",
// ".sml") and its reading back. Each class serves one object of the record:
// it derives from the object and from Service_kelmir, writes its fields into
// the sections of a header tree and reads them back from one.
#include <string>
#include <vector>

#include "orbit/general_sar_orbit.h"
#include "output/description_section.h"
#include "product/general_sar.h"

// Product-type tags of the header export and their product identifiers.
enum KelmirProductTag : int {
  KT_ENVISAT_IM = 0,
  KT_ERS1 = 1,
  KT_ERS2 = 2,
  KT_RADARSAT = 3,
  KT_ENVISAT_AP = 4,
  KT_PALSAR_SINGLE = 5,
  KT_PALSAR_DOUBLE = 6,
  KT_PALSAR_QUAD = 7,
  KT_PALSAR_ERSDAC = 8,
};
// "ENVISAT_IM0", "ERS1_IM", "ERS2_IM", "RS1_IM", "ENVISAT_AP0",
// "ALOS_PALSAR_FBS10", "ALOS_PALSAR_FBD10", "ALOS_PALSAR_PLR10",
// "ALOS_PALSAR"; "" for another tag.
const char* kelmirProductIdentifier(int tag);

// Field-level service of the export classes: typed writes into the header
// (a name "Section.Field" goes to that section, any other to the class's
// own), typed reads with the mandatory rule, and a keyed report of its own.
class Service_kelmir {
 public:
  struct ReportEntry {
    std::string key;
    std::string text;
    std::string level;  // "ERROR" or "WARNING"
  };

  Service_kelmir(std::string className, std::string sectionName);
  virtual ~Service_kelmir();
  Service_kelmir(const Service_kelmir&) = default;
  Service_kelmir& operator=(const Service_kelmir&) = default;

  // Logs the handling of a field: "report_<class>/<kind>/<field>".
  void gsmReport(const std::string& kind, const std::string& field, const std::string& text,
                 const std::string& level);
  const std::vector<ReportEntry>& serviceReport() const { return report_; }
  const std::string& sectionName() const { return section_; }

 protected:
  tesv_description_field& put(tesv_description_section& header, const std::string& field,
                              bool mandatory);
  void putInt(tesv_description_section& header, const std::string& field, long long value,
              bool mandatory = false);
  void putDouble(tesv_description_section& header, const std::string& field, double value,
                 bool mandatory = false);
  void putString(tesv_description_section& header, const std::string& field,
                 const std::string& value, bool mandatory = false);
  void putDoubles(tesv_description_section& header, const std::string& field,
                  const std::vector<double>& values, bool mandatory = false);
  void putStrings(tesv_description_section& header, const std::string& field,
                  const std::vector<std::string>& values, bool mandatory = false);

  // 0 when found; 1 when absent or of another kind (the value is kept). A
  // mandatory field that is absent throws orvaneException naming it.
  int take(const tesv_description_section& header, const std::string& field, double& value,
           bool mandatory = false);
  int take(const tesv_description_section& header, const std::string& field, int& value,
           bool mandatory = false);
  int take(const tesv_description_section& header, const std::string& field, long long& value,
           bool mandatory = false);
  int take(const tesv_description_section& header, const std::string& field, std::string& value,
           bool mandatory = false);
  int take(const tesv_description_section& header, const std::string& field,
           std::vector<double>& values, bool mandatory = false);
  int take(const tesv_description_section& header, const std::string& field,
           std::vector<std::string>& values, bool mandatory = false);

 private:
  const tesv_description_field* find(const tesv_description_section& header,
                                     const std::string& field, bool mandatory);
  template <class Getter>
  int takeWith(const tesv_description_section& header, const std::string& field, bool mandatory,
               Getter get);
  std::string class_;
  std::string section_;
  std::vector<ReportEntry> report_;
};

class DataFile_kelmir : public Service_kelmir, public DataFile {
 public:
  DataFile_kelmir();
  int writehdr_kelmir(tesv_description_section& header);
  int readhdr_kelmir(const tesv_description_section& header);
  std::string DataUnits = "NOT_AVAILABLE";
  int RowSuffix = 0;
  double NullCellValue = 0.0;
};

class ROI_Obj_kelmir : public Service_kelmir, public ROI_Obj {
 public:
  ROI_Obj_kelmir();
  int writehdr_kelmir(tesv_description_section& header);
  // Fast start and delta, slow start and length; the counts and the slow
  // delta are left to the caller (they live in other sections).
  int readhdr_kelmir(const tesv_description_section& header);
};

class SamplingConstants_Obj_kelmir : public Service_kelmir, public SamplingConstants_Obj {
 public:
  SamplingConstants_Obj_kelmir();
  int writehdr_kelmir(tesv_description_section& header);
  int readhdr_kelmir(const tesv_description_section& header);
};

class DataSetInfo_Obj_kelmir : public Service_kelmir, public DataSetInfo_Obj {
 public:
  DataSetInfo_Obj_kelmir();
  // productIdentifier, when not empty, stands in Description.
  int writehdr_kelmir(tesv_description_section& header, const std::string& productIdentifier = "");
  // The same, with the ASAR two-way elevation pattern of the swath and
  // polarisation from the external calibration file calibrationFile.
  int writehdr_kelmir(tesv_description_section& header, const std::string& productIdentifier,
                      const std::string& calibrationFile);
  int readhdr_kelmir(const tesv_description_section& header);
  int NAzimuthLooks = 1;
};

class geoCoords_Obj_kelmir : public Service_kelmir, public geoCoords_Obj {
 public:
  geoCoords_Obj_kelmir();
  int writehdr_kelmir(tesv_description_section& header);
  int readhdr_kelmir(const tesv_description_section& header);
};

class SARPulse_Obj_kelmir : public Service_kelmir, public SARPulse_Obj {
 public:
  SARPulse_Obj_kelmir();
  int writehdr_kelmir(tesv_description_section& header);
  int readhdr_kelmir(const tesv_description_section& header);
};

class SensorAttitude_Obj_kelmir : public Service_kelmir, public SensorAttitude_Obj {
 public:
  SensorAttitude_Obj_kelmir();
  // ProcessingVelocity is Eq_speed, or defaultSpeed when Eq_speed is not
  // usable; PixelSpacingAz that velocity times lineTime.
  int writehdr_kelmir(tesv_description_section& header, double lineTime, float defaultSpeed);
  int readhdr_kelmir(const tesv_description_section& header);
  double ProcessingVelocity = -999.0;
  double PixelSpacingAz = -999.0;
};

class polySAR_kelmir : public Service_kelmir, public polySAR {
 public:
  polySAR_kelmir();
  int writehdr_kelmir(tesv_description_section& header);
  int readhdr_kelmir(const tesv_description_section& header);
};

class GeneralSAROrbit_kelmir : public Service_kelmir, public GeneralSAROrbit {
 public:
  GeneralSAROrbit_kelmir();
  // bypass: logs "bypassing Satellite information" and writes no vectors.
  int writehdr_kelmir(tesv_description_section& header, bool bypass = false);
  int readhdr_kelmir(const tesv_description_section& header);
};

// Values derived from the record for the users of the header: projection,
// time directions, looks and ground pixel spacings.
class OtherInfo_kelmir : public Service_kelmir {
 public:
  OtherInfo_kelmir();
  // Geometry at mid scene from the orbit (incidence and ground speed);
  // without state vectors, the centre incidence of the corners and
  // defaultSpeed.
  int compute(GeneralSAR& record, float defaultSpeed);
  int writehdr_kelmir(tesv_description_section& header);
  int readhdr_kelmir(const tesv_description_section& header);

  std::string TimeDirectionLines = "INCREASE TIME DIRECTION";
  double AzimuthPixelShift = 0.0;
  int NAzimuthLooks = 1;
  int SuggestedAzimuthLooks = 1;
  int SuggestedRangeLooks = 1;
  double AzimuthGroundPixelSpaceFromSuggestLooks = -999.0;
  double RangeGroundPixelSpaceFromSuggestLooks = -999.0;
  int FromInImageAzimuthLooks = 1;
  int FromInImageRangeLooks = 1;
  double PixelSpacingAz = -999.0;
  double GroundPixelSpacingRg = -999.0;
};

// The record with its export: GSread/GSwrite of GeneralSAR act on the
// record's ".hdr"; the _kelmir calls write or read the description headers
// of a product: "<file>_hdr" and "<file>.sml".
class GeneralSAR_kelmir : public Service_kelmir, public GeneralSAR {
 public:
  GeneralSAR_kelmir();

  // Exports the record. second: the ENVISAT external calibration file
  // (elevation pattern), else empty; defaultSpeed: velocity used when the
  // record's equivalent speed is not usable; productTag: KelmirProductTag.
  // Sections of existing headers that are not written are kept. 0, or the
  // first failing step's status. ERSDAC products are refused (1).
  int writehdr_kelmir(const std::string& file, const std::string& second, float defaultSpeed,
                      int productTag);
  // ERSDAC products only: as writehdr_kelmir, with the state-vector start
  // and step taken from the CEOS leader `leader`.
  int writehdr_ersdac_kelmir(const std::string& file, const std::string& leader,
                             float defaultSpeed, int productTag);
  // Reads "<file>.sml" (or "<file>_hdr" when there is no ".sml") into the
  // record. 0, the reader's status, or 10 for a missing mandatory field.
  int readhdr_kelmir(const std::string& file);

  // The tree of the last write or read.
  const tesv_description_section& header() const { return header_; }
  OtherInfo_kelmir otherInfo;

 private:
  int fillHeader(const std::string& second, float defaultSpeed, int productTag, bool bypassOrbit);
  int writeFiles(const std::string& file);
  tesv_description_section header_;
};
