// The focuser of a job: dispatch to the sensor focuser of the platform
// through the sensor registry, run, and clean-up of the chain's temporary
// files.
#include "focus/multiplatform_focuser.h"

#include <climits>
#include <cstdio>

#include "base/status.h"
#include "diag/report.h"
#include "focus/sensor_registry.h"
#include "focus/stripmap_general_focuser.h"

namespace {

constexpr const char* kClassName = "ATmultiplatformFocuser";

int fail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define MP_FAIL(message, status) fail((message), (status), __LINE__, __func__)

int calledError(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function,
                 __FILE__);
  return status;
}
#define MP_CALLED(status) calledError((status), __LINE__, __func__)

}  // namespace

ATmultiplatformFocuser::ATmultiplatformFocuser() { createElementsVector(25); }

ATmultiplatformFocuser::~ATmultiplatformFocuser() = default;

int ATmultiplatformFocuser::createBuffers() { return createBuffersDefault(); }

int ATmultiplatformFocuser::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}

void ATmultiplatformFocuser::refreshParameters() {
  addElementInt("Memory", &Memory, 1, 0, INT_MAX, true);
  addElementString("ReportFilename", &ReportFilename, true);
  addElementInt("ReportLevel", &ReportLevel, 1, 0, 3, true);
  addElementInt("Incore", &Incore, 1, 0, 1, true);
  addElementInt("Verbose", &Verbose, 1, 0, 1, true);
  addElementString("processingConfFilename", &processingConfFilename, true);
  addElementString("platform", &platform, true);
  addElementString("level0Filename", &level0Filename, true);
  addElementString("level0FilenameSecondPol", &level0FilenameSecondPol, true);
  addElementString("level0FilenameThirdPol", &level0FilenameThirdPol, true);
  addElementString("level0FilenameFourthPol", &level0FilenameFourthPol, true);
  addElementString("outputFilename", &outputFilename, true);
  addElementString("auxFile1", &auxFile1, true);
  addElementString("auxFile2", &auxFile2, true);
  addElementString("auxFile3", &auxFile3, true);
  addElementString("auxFile4", &auxFile4, true);
  addElementString("auxFile5", &auxFile5, true);
  addElementString("auxDirectory1", &auxDirectory1, true);
  addElementString("auxDirectory2", &auxDirectory2, true);
  addElementString("auxDirectory3", &auxDirectory3, true);
  addElementString("auxDirectory4", &auxDirectory4, true);
  addElementString("auxDirectory5", &auxDirectory5, true);
  addElementInt("skipLines", &skipLines, 1, 0, INT_MAX, true);
  addElementInt("extractLines", &extractLines, 1, 0, INT_MAX, true);
  addElementInt("eraseTemporaryFiles", &eraseTemporaryFiles, 1, 0, 1, true);
  setAllocationFlag(true);
}

int ATmultiplatformFocuser::checkpar() {
  if (skipLines < 0 || extractLines < 0) return STATUS_BAD_CONDITION;
  checkAuxiliaryFile();
  return 0;
}

int ATmultiplatformFocuser::readpar(const std::string& file, int channel) {
  readAuxiliaryFile(file, channel, kClassName);
  return 0;
}

int ATmultiplatformFocuser::writepar(const std::string& file, int channel) {
  return writeAuxiliaryFile(file, channel, kClassName);
}

void ATmultiplatformFocuser::fillCommon(stripmapGeneralFocuser& focuser) {
  focuser.configurationFilename = processingConfFilename;
  focuser.outputFilename = outputFilename;
}

int ATmultiplatformFocuser::InitProcessing() {
  if (ReportFilename.empty()) return STATUS_BAD_CONDITION;
  init_report(0, "ATmultiplatformFocuser REPORT", 1);
  ORV_REPORT(platform, REPORT_WARNING);
  if (platform.empty())
    return MP_FAIL("Platform not defined, exiting with error", STATUS_BAD_PARAMETER);

  focuser_.reset();
  const SensorDriver* sensor = findSensor(platform);
  if (!sensor) return MP_FAIL("Invalid name for platform", STATUS_BAD_PARAMETER);
  std::unique_ptr<stripmapGeneralFocuser> focuser;
  if (sensor->makeFocuser) focuser = sensor->makeFocuser(*this);
  int status = sensor->fill(*this, focuser.get());
  if (status == 0) {
    if (focuser) fillCommon(*focuser);
    status = sensor->check(*this, focuser.get());
  }
  if (status == 0 && focuser && eraseTemporaryFiles == 1) {
    for (const TemporaryFile& file : sensor->temporaryFiles(*this))
      focuser->erasedTemporaries.push_back(file.name);
  }
  focuser_ = std::move(focuser);
  if (status == 0 && !focuser_)
    status = MP_FAIL("No " + std::string(sensor->family) + " focuser in this build: the " +
                         platform + " scene cannot be focused",
                     STATUS_BAD_PARAMETER);
  if (status != 0) return MP_CALLED(status);
  return 0;
}

int ATmultiplatformFocuser::run() {
  if (!focuser_) return MP_FAIL("Focuser not initialised: InitProcessing must come first",
                                STATUS_BAD_CONDITION);
  if (const int status = focuser_->run(); status != 0) return MP_CALLED(status);
  return 0;
}

int ATmultiplatformFocuser::FinalizeProcessing(const std::string&, int) {
  int status = 0;
  if (eraseTemporaryFiles == 1) {
    if (const SensorDriver* sensor = findSensor(platform)) {
      // A failed removal is a level 1 report, not an error.
      for (const TemporaryFile& file : sensor->temporaryFiles(*this)) {
        if (std::remove(file.name.c_str()) != 0) ORV_REPORT("Cannot remove file", REPORT_WARNING);
        if (!file.announce.empty()) ORV_REPORT(file.announce, REPORT_CHECKPOINT);
      }
    } else
      status = MP_FAIL("Invalid name for platform", STATUS_BAD_PARAMETER);
  }
  focuser_.reset();
  return status;
}

int ATmultiplatformFocuser::runall(const std::string& file, int channel) {
  getConfigurationFile(file, channel, kClassName, ReportFilename);
  if (int st = readpar(file, channel); st != 0) return MP_CALLED(st);
  if (int st = checkpar(); st != 0) return MP_CALLED(st);
  if (int st = InitProcessing(); st != 0) return MP_CALLED(st);
  if (int st = run(); st != 0) return MP_CALLED(st);
  if (int st = FinalizeProcessing(file, channel); st != 0) return MP_CALLED(st);
  return 0;
}
