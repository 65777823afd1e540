// Job driver of stripmap focusing: command string, job parameters, choice
// of the parameter profile and hand-over to the focuser.
#include "job/focusing_job.h"

#include <climits>
#include <cstdio>
#include <cstdlib>
#include <exception>

#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/environment.h"
#include "diag/orvane_exception.h"
#include "diag/parameter_lines.h"
#include "diag/report.h"
#include "product/profile.h"
#include "focus/sensor_registry.h"
#include "job/job_file.h"

namespace {

constexpr const char* kCommandPrefix = "main_focussing_stripmap#";

constexpr const char* kLabels[] = {
    "INPUT SATELLITE", "INPUT SCENE",     "INPUT SCENE_2",    "INPUT SCENE_3",
    "INPUT SCENE_4",   "OUTPUT ROOT NAME", "INPUT FILE 1",    "INPUT FILE 2",
    "INPUT FILE 3",    "INPUT FILE 4",    "INPUT FILE 5",     "INPUT DIR 1",
    "INPUT DIR 2",     "INPUT DIR 3",     "INPUT DIR 4",      "INPUT DIR 5",
    "SKIP LINES",      "EXTRACT LINES",   "ERASE TEMPORARY"};

bool given(const std::string& value) { return value != "NotOK"; }

std::string unlessNotOk(const std::string& value) { return given(value) ? value : std::string(); }

// Decimal text to integer, as atoi reads it.
int decimal(const std::string& text) {
  long value = std::strtol(text.c_str(), nullptr, 10);
  if (value > INT_MAX) return INT_MAX;
  if (value < INT_MIN) return INT_MIN;
  return static_cast<int>(value);
}

}  // namespace

std::string jobLabelText(const std::vector<std::string>& parameters) {
  std::string text = "\n";
  for (std::size_t i = 0; i < std::size(kLabels); ++i) {
    std::string label = kLabels[i];
    label.resize(17, ' ');
    text += label + ": [ " + (i < parameters.size() ? parameters[i] : std::string()) + " ]\n";
  }
  return text;
}

void fillFocuserFields(FocuserJobFields& fields, const std::vector<std::string>& p,
                       const std::string& ceosDirectory) {
  fields.platform = p[0];
  fields.level0Filename = p[1];
  fields.level0FilenameSecondPol = unlessNotOk(p[2]);
  fields.level0FilenameThirdPol = unlessNotOk(p[3]);
  fields.level0FilenameFourthPol = unlessNotOk(p[4]);
  fields.outputFilename = p[5];
  std::string* files[] = {&fields.auxFile1, &fields.auxFile2, &fields.auxFile3, &fields.auxFile4,
                          &fields.auxFile5};
  std::string* directories[] = {&fields.auxDirectory1, &fields.auxDirectory2,
                                &fields.auxDirectory3, &fields.auxDirectory4,
                                &fields.auxDirectory5};
  for (int n = 0; n < 5; ++n) {
    *files[n] = unlessNotOk(p[6 + n]);
    *directories[n] = p[11 + n];
  }
  // Sensors whose auxiliary files 2 to 4, given by neither name nor folder,
  // are looked for among the description files (ENVISAT).
  const SensorDriver* sensor = findSensor(fields.platform);
  if (sensor && sensor->auxiliaryInDescriptionFiles)
    for (int n = 1; n <= 3; ++n)
      if (!given(p[11 + n]) && !given(p[6 + n])) *directories[n] = ceosDirectory;
  fields.skipLines = decimal(p[16]);
  fields.extractLines = decimal(p[17]);
  fields.eraseTemporaryFiles = given(p[18]) ? 1 : 0;
  fields.Incore = 0;
  fields.Verbose = 1;
}

int chooseParameterProfile(FocuserJobFields& fields, const std::string& ceosDirectory,
                           int& alternatingPolarisation) {
  alternatingPolarisation = 0;
  const SensorDriver* sensor = findSensor(fields.platform);
  if (!sensor) {
    ORV_REPORT("Unknown platform", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  std::string profile;
  if (sensor->profile(fields, profile, alternatingPolarisation) != 0) return STATUS_BAD_CONDITION;
  fields.processingConfFilename = ceosDirectory + profile;
  return 0;
}

int ftesv_main_focussing_stripmap(const std::string& jobPath) {
  const std::vector<std::string> parameters = splitJobParameters(jobPath);
  if (parameters.size() < kJobParameterCount) {
    logStart(parameters, "Focussing stripmap", "");
    TESV_FATAL(EC_TOO_FEW_PARAMETERS, jobPath);
  }
  logStart(parameters, "Focussing stripmap", jobLabelText(parameters));

  const std::string ceosDirectory = tesvEnvOrDefault("TESSIVOR_CEOS_DES_FILES_DIR");

  std::unique_ptr<JobFocuser> focuser = makeJobFocuser();
  ORV_REPORT(parameters[0], REPORT_WARNING);
  ORV_REPORT(parameters[0], REPORT_WARNING);
  fillFocuserFields(focuser->job, parameters, ceosDirectory);
  int alternatingPolarisation = 0;
  if (chooseParameterProfile(focuser->job, ceosDirectory, alternatingPolarisation) != 0) return STATUS_BAD_CONDITION;

  if (focuser->checkpar() != 0) TESV_FATAL(EC_STAGE_FAILED, "checkpar()");
  if (focuser->InitProcessing() != 0) TESV_FATAL(EC_STAGE_FAILED, "InitProcessing()");
  if (focuser->run() != 0) TESV_FATAL(EC_STAGE_FAILED, "run()");
  if (focuser->FinalizeProcessing("headerfile", 0) != 0)
    TESV_FATAL(EC_STAGE_FAILED, "FinalizeProcessing()");

  finishJobProducts(*focuser, parameters, alternatingPolarisation);
  return 0;
}


int stripmapFocuserEntry(int argc, char** argv) {
  std::fputs("Starting initalization phase\n", stderr);
  initEnvironment();
  const std::string command = cutAtTessivorMarker(argc > 1 && argv[1] ? argv[1] : "");
  std::fputs("End of initalization phase\n", stderr);
  init_ckerr_locking();
  init_report(0, "ASAR FOCUSSING", 1);

  int result = 0;
  const std::string prefix = kCommandPrefix;
  if (command.compare(0, prefix.size(), prefix) == 0) {
    // Library code that does not return statuses ends the run here.
    try {
      result = ftesv_main_focussing_stripmap(command.substr(prefix.size()));
    } catch (const ProfileMemoryError& e) {
      // A profile that does not fit in memory ends the run at once.
      std::fputs(e.what(), stderr);
      std::exit(1);
    } catch (const ProfileCheckError& e) {
      // So does a checked profile call that failed.
      std::fputs(e.what(), stderr);
      std::fflush(stderr);
      std::exit(1);
    } catch (const orvaneException& e) {
      TESV_FATAL(EC_STAGE_FAILED, e.getMessage() + " (" + e.getFile() + ", " + e.getFunction() +
                                      ", line " + std::to_string(e.getLine()) + ")");
    } catch (const std::exception& e) {
      TESV_FATAL(EC_STAGE_FAILED, e.what());
    }
  } else {
    if (tracingActive()) traceWrite("%s\n", command.c_str());
    result = EC_BAD_COMMAND;
  }

  exit_report();
  exit_ckerr();
  if (result == 0) {
    finishRun(0, true, true);
    return 0;
  }
  TESV_FATAL(result, command);
}
