#include "focus/sensors/radarsat.h"

#include "base/status.h"
#include "diag/report.h"
#include "focus/sensors/level0_chain.h"
#include "focus/sensors/sensor_job.h"
#include "ingest/radarsat/radarextract.h"
#include "output/general_sar_kelmir.h"

namespace {

constexpr char kRadarsatProfile[] = "parameters_RS.hdr";

std::unique_ptr<stripmapGeneralFocuser> makeRadarsatFocuser(const FocuserJobFields&) {
  return std::make_unique<radarsatLevel0Focuser>();
}

// Scene, leader (optional) and orbit (required).
int fillRadarsat(FocuserJobFields& job, stripmapGeneralFocuser* generic) {
  auto& focuser = static_cast<radarsatLevel0Focuser&>(*generic);
  fillScene(job, focuser);
  focuser.leaderFilename = job.auxFile2;
  if (job.auxFile1.empty())
    return SENSOR_FAIL("Error in defining RADARSAT orbit file", STATUS_BAD_PARAMETER);
  focuser.orbitFilename = job.auxFile1;
  return 0;
}

int checkRadarsat(const FocuserJobFields&, const stripmapGeneralFocuser*) { return 0; }

FinishingTag radarsatFinishingTag(const FocuserJobFields&, const std::vector<std::string>&) {
  return {KT_RADARSAT, ""};
}

}  // namespace

const SensorDriver kRadarsatSensor = {.platform = "RADARSAT",
                                      .profile = fixedProfile<kRadarsatProfile>,
                                      .makeFocuser = makeRadarsatFocuser,
                                      .fill = fillRadarsat,
                                      .check = checkRadarsat,
                                      .temporaryFiles = singleSceneTemporaries,
                                      .finishingTag = radarsatFinishingTag,
                                      .family = "RADARSAT",
                                      .auxiliaryInDescriptionFiles = false,
                                      .multiFileProducts = false,
                                      .multiFileGeoTiff = false};

radarsatLevel0Focuser::radarsatLevel0Focuser()
    : level0SceneFocuser({.extractorMissing = "radarextract object not allocated!",
                          .extracted = "RADARSAT image extracted",
                          .announceMemoryDefault = false}),
      extractor_(std::make_unique<radarextract>()) {}
radarsatLevel0Focuser::~radarsatLevel0Focuser() = default;

int radarsatLevel0Focuser::nameStages() {
  if (int st = checkLeader(leaderFilename); st != 0) return st;
  nameLevel0Stages(work, focuser(), outputFilename, "", false);
  radarextract& x = *extractor_;
  x.DataFile = level0Filename;
  x.LeaderFile = leaderFilename;
  x.OrbitFile = orbitFilename;
  x.OutputRawFile = work.rawFile;
  x.OutputChirpFile = work.chirpFile;
  x.LinesToExtract = extractLines;
  x.LinesToSkip = skipLines;
  return 0;
}

void radarsatLevel0Focuser::redirectExtraction(const std::string& raw, const std::string& chirp,
                                               const std::string&) {
  extractor_->OutputRawFile = raw;
  extractor_->OutputChirpFile = chirp;
}

int radarsatLevel0Focuser::extract() {
  if (int st = extractor_->checkpar(); st != 0) return level0CalledError(st);
  if (int st = extractor_->run(); st != 0) return level0CalledError(st);
  // An SLC product is extracted as it stands and goes no further: the chain
  // focuses raw echoes.
  if (extractor_->productLevel == 1) {
    ORV_REPORT("RADARSAT SLC product extracted into " + work.rawFile +
                   ": the stripmap chain focuses raw data only",
               REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

int radarsatLevel0Focuser::preprocessing() {
  ORV_REPORT("RADARSAT focuser doesn't do anything in the preprocessor module",
             REPORT_CHECKPOINT);
  return 0;
}

int radarsatLevel0Focuser::postprocessing() {
  ORV_REPORT("RADARSAT focuser doesn't do anything in the postprocessor module",
             REPORT_CHECKPOINT);
  return 0;
}

int radarsatLevel0Focuser::finalize() {
  ORV_REPORT("finalized...", REPORT_CHECKPOINT);
  return 0;
}

int radarsatLevel0Focuser::finalize_modular() { return finalize(); }
