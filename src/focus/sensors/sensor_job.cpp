#include "focus/sensors/sensor_job.h"

#include <cstdio>

#include "diag/report.h"
#include "focus/stripmap_general_focuser.h"

void fillScene(const FocuserJobFields& job, stripmapGeneralFocuser& focuser) {
  focuser.level0Filename = job.level0Filename;
  focuser.skipLines = job.skipLines;
  focuser.extractLines = job.extractLines;
  if (auto* modular = dynamic_cast<stripmapGeneralFocuserModular*>(&focuser))
    modular->Memory = job.Memory;
}

int sensorFail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}

int sensorCalled(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function,
                 __FILE__);
  return status;
}

void appendTemporaryFiles(std::vector<TemporaryFile>& files, const std::string& root,
                          std::initializer_list<const char*> suffixes) {
  for (const char* suffix : suffixes) files.push_back({root + suffix});
}

std::vector<TemporaryFile> singleSceneTemporaries(const FocuserJobFields& job) {
  std::vector<TemporaryFile> files;
  appendTemporaryFiles(files, job.outputFilename,
                       {".chirp", ".extracted", ".chirp.hdr", ".extracted.hdr", ".rgfoc", ".rgfoc.hdr"});
  return files;
}
