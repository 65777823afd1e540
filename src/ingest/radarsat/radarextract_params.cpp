// Profile companions of the RADARSAT extractor.
#include "ingest/radarsat/radarextract_params.h"

#include "base/status.h"
#include "diag/report.h"
#include "product/profile.h"

namespace {

// Keys left out of the profile keep their defaults.
void readString(const char* section, const char* key, std::string& dst, const std::string& file) {
  std::string value;
  if (GetMyProfileString(section, key, value, file) == 0) dst = value;
}

void readInt(const char* section, const char* key, int& dst, const std::string& file) {
  int value = 0;
  if (GetMyProfileIntArray(section, key, &value, 1, file) == 0) dst = value;
}

int missing(const char* section, const char* key) {
  ORV_REPORT(std::string("Missing ") + key + " in section " + section, REPORT_ERROR);
  return STATUS_BAD_PARAMETER;
}

}  // namespace

int radarextract_conf::readpar(const std::string& file) {
  readString("radarextractConfiguration", "ReportFilename", ReportFilename, file);
  return 0;
}

int radarextract_conf::checkpar() const {
  return ReportFilename.empty() ? missing("radarextractConfiguration", "ReportFilename") : 0;
}

int radarextract_input::readpar(const std::string& file) {
  readInt("radarextractInput", "LinesToSkip", LinesToSkip, file);
  readInt("radarextractInput", "LinesToExtract", LinesToExtract, file);
  readString("radarextractInput", "LeaderFile", LeaderFile, file);
  readString("radarextractInput", "DataFile", DataFile, file);
  readString("radarextractInput", "OrbitFile", OrbitFile, file);
  return 0;
}

int radarextract_input::checkpar() const {
  if (LeaderFile.empty()) return missing("radarextractInput", "LeaderFile");
  if (DataFile.empty()) return missing("radarextractInput", "DataFile");
  if (LinesToSkip < 0 || LinesToExtract < 0) {
    ORV_REPORT("LinesToSkip and LinesToExtract must not be negative", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  return 0;
}

int radarextract_output::readpar(const std::string& file) {
  readString("radarextractOutput", "OutputRawFile", OutputRawFile, file);
  readString("radarextractOutput", "OutputChirpFile", OutputChirpFile, file);
  return 0;
}

int radarextract_output::checkpar() const {
  return OutputRawFile.empty() ? missing("radarextractOutput", "OutputRawFile") : 0;
}

int radarextract_output::writepar(GeneralRAWData& record) const {
  record.dataFile.filename = OutputRawFile;
  return record.writehdr();
}
