#include "focus/stripmap_general_focuser.h"

#include <dirent.h>

#include <cstdio>

#include "diag/report.h"

namespace {

bool fileOpens(const std::string& name) {
  std::FILE* f = std::fopen(name.c_str(), "rb");
  if (!f) return false;
  std::fclose(f);
  return true;
}

bool directoryOpens(const std::string& name) {
  DIR* d = opendir(name.c_str());
  if (!d) return false;
  closedir(d);
  return true;
}

}  // namespace

stripmapGeneralFocuser::stripmapGeneralFocuser()
    : conf_(std::make_unique<SARFocuser_conf>()),
      sarFocuser_(std::make_unique<SARFocuser>(conf_.get())) {
  conf_->clear();
}

stripmapGeneralFocuser::~stripmapGeneralFocuser() = default;

int stripmapGeneralFocuser::checkNamesAndFiles() {
  if (level0Filename.empty()) {
    ORV_REPORT("Data filename not selected!", REPORT_ERROR);
    return 1;
  }
  if (orbitFilename.empty()) {
    ORV_REPORT("Orbit filename not selected!", REPORT_ERROR);
    return 1;
  }
  if (configurationFilename.empty()) {
    ORV_REPORT("Processing conf not selected!", REPORT_ERROR);
    return 1;
  }
  outputSelected_ = !outputFilename.empty();
  if (!fileOpens(orbitFilename)) {
    ORV_REPORT("orbit file does not exist!", REPORT_ERROR);
    return 1;
  }
  // An ERS scene may be a directory.
  if (!fileOpens(level0Filename) && !directoryOpens(level0Filename)) {
    ORV_REPORT("data file does not exist!", REPORT_ERROR);
    return 1;
  }
  if (!fileOpens(configurationFilename)) {
    ORV_REPORT("processing configuration file does not exist!", REPORT_ERROR);
    return 1;
  }
  if (skipLines < 0) {
    ORV_REPORT("skip lines <0!", REPORT_ERROR);
    return 1;
  }
  if (extractLines < 0) {
    ORV_REPORT("extract lines <0!", REPORT_ERROR);
    return 1;
  }
  return 0;
}

int stripmapGeneralFocuser::initialize() {
  int status = checkNamesAndFiles();
  if (status != 0) return status;
  conf_->Flag_set = 0;
  return 0;
}

int stripmapGeneralFocuser::run() {
  int status = initialize();
  if (status == 0) status = ingestion();
  if (status == 0) status = preprocessing();
  if (status == 0) {
    conf_->Flag_set = 1;
    status = sarfocuser();
  }
  if (status == 0) status = postprocessing();
  if (status == 0) status = finalize();
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}

int stripmapGeneralFocuser::run(const std::string& raw, const std::string& chirp,
                                const std::string& antenna, const std::string& output) {
  int status = initialize();
  if (status == 0) status = ingestion(raw, chirp, antenna);
  if (status == 0) status = preprocessing();
  if (status == 0) status = sarfocuser(raw, chirp, antenna, output);
  if (status == 0) status = postprocessing();
  if (status == 0) status = finalize();
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}

int stripmapGeneralFocuser::sarfocuser() {
  if (!conf_->Flag_set) return 1;
  conf_->Verbose = 1;
  int status = sarFocuser_->run();
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  ORV_REPORT("sar focuser ended successfully ", REPORT_CHECKPOINT);
  return 0;
}

int stripmapGeneralFocuser::sarfocuser(const std::string& raw, const std::string& chirp,
                                       const std::string& antenna, const std::string& output) {
  if (outputSelected_) return 1;
  sarFocuser_->RawDataFile = raw;
  sarFocuser_->ChirpFile = chirp;
  if (!antenna.empty()) sarFocuser_->AntennaFile = antenna;
  sarFocuser_->OutputFilename = output;
  int status = sarFocuser_->run();
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  ORV_REPORT("sar focuser ended successfully ", REPORT_CHECKPOINT);
  return 0;
}

// ---- modular working -----------------------------------------------------

stripmapGeneralFocuserModular::stripmapGeneralFocuserModular() = default;
stripmapGeneralFocuserModular::~stripmapGeneralFocuserModular() = default;

int stripmapGeneralFocuserModular::initialize_modular() {
  int status = checkNamesAndFiles();
  if (status != 0) return status;
  if (outputFilename.empty() && outputSelected_) {
    ORV_REPORT("Output filename not selected!", REPORT_ERROR);
    return 1;
  }
  conf_->Flag_set = 0;
  return 0;
}

int stripmapGeneralFocuserModular::run_modular() { return 1; }
int stripmapGeneralFocuserModular::setConfFile(const std::string&, int) { return 1; }
int stripmapGeneralFocuserModular::rangefoc(const std::string&, const std::string&,
                                            const std::string&) { return 1; }
int stripmapGeneralFocuserModular::dcEst(const std::string&) { return 1; }
int stripmapGeneralFocuserModular::frEst(const std::string&) { return 1; }
int stripmapGeneralFocuserModular::azfoc(const std::string&, const std::string&, double) {
  return 1;
}
int stripmapGeneralFocuserModular::rangefoc() { return 1; }
int stripmapGeneralFocuserModular::dcEst() { return 1; }
int stripmapGeneralFocuserModular::frEst() { return 1; }
int stripmapGeneralFocuserModular::azfoc(double) { return 1; }
int stripmapGeneralFocuserModular::align_rawdata(const std::string&) { return 1; }
int stripmapGeneralFocuserModular::align_rawdata() { return 1; }
double stripmapGeneralFocuserModular::getDCshift(double, double) { return 0.0; }
void stripmapGeneralFocuserModular::findDir(const std::string& path, std::string& result) {
  size_t pos = path.find_last_of('/');
  result = pos == std::string::npos ? std::string(".") : path.substr(0, pos);
}
int stripmapGeneralFocuserModular::getFOCroi(const ROI_Obj&, const ROI_Obj&, int, int, ROI_Obj&) {
  return 1;
}
int stripmapGeneralFocuserModular::getRAWroi(const ROI_Obj&, const ROI_Obj&, int*, int*, int*,
                                             int*) {
  return 1;
}
int stripmapGeneralFocuserModular::cutRAW(const std::string&, const std::string&,
                                          const ROI_Obj&) {
  return 1;
}
