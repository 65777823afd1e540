#include "focus/sensors/ers.h"

#include <iostream>

#include "base/status.h"
#include "diag/report.h"
#include "focus/sensors/level0_chain.h"
#include "focus/sensors/sensor_job.h"
#include "ingest/ers/ers_extractor.h"
#include "ingest/ers/ers_level0.h"
#include "ingest/ers/ers_types.h"
#include "output/general_sar_kelmir.h"

namespace {

constexpr char kErsProfile[] = "parameters_ERS.hdr";

std::unique_ptr<stripmapGeneralFocuser> makeErsFocuser(const FocuserJobFields&) {
  return std::make_unique<ersLevel0Focuser>();
}

// Scene, lines and memory, the orbit (looked up in the arc list of the
// orbit folder when not given) and the leader.
int fillErs(FocuserJobFields& job, stripmapGeneralFocuser* generic) {
  auto& focuser = static_cast<ersLevel0Focuser&>(*generic);
  fillScene(job, focuser);
  if (job.auxFile1.empty()) {
    if (job.auxDirectory1.empty())
      return SENSOR_FAIL("Error in defining Ers Orbit", STATUS_BAD_PARAMETER);
    // The product is the scene directory; its leader gives the time of the
    // arc to look for in the archive.
    const std::string productDirectory = scenePathDirectory(job.level0Filename);
    Ers_level0 product;
    product.setfileName(productDirectory);
    if (product.getAuxFiles(3, job.auxDirectory1) != 0) {
      SENSOR_CALLED(STATUS_BAD_CONDITION);
      ORV_REPORT("The ERS orbit cannot be looked up: the leader LEA_01.001 of " +
                     productDirectory +
                     " gives no ERS-1 or ERS-2 acquisition time; give the orbit file as INPUT "
                     "FILE 1",
                 REPORT_ERROR);
    }
    job.auxFile1 = product.getOrbitFilename();
    if (job.auxFile1.empty())
      ORV_REPORT("No ERS orbit arc found for the scene in " + job.auxDirectory1 +
                     " (ERS1/PRECISE/arclist): give the orbit file as INPUT FILE 1 or a folder "
                     "whose arc list covers the acquisition as INPUT DIR 1",
                 REPORT_ERROR);
  }
  focuser.orbitFilename = job.auxFile1;
  if (job.auxFile2.empty())
    return SENSOR_FAIL("Error in defining Ers leader file", STATUS_BAD_PARAMETER);
  focuser.LEAFilename = job.auxFile2;
  return 0;
}

int checkErs(const FocuserJobFields&, const stripmapGeneralFocuser* generic) {
  const auto& focuser = static_cast<const ersLevel0Focuser&>(*generic);
  if (focuser.LEAFilename.empty() || focuser.level0Filename.empty() ||
      focuser.orbitFilename.empty() || focuser.configurationFilename.empty())
    return STATUS_BAD_PARAMETER;
  return 0;
}

FinishingTag ersFinishingTag(const FocuserJobFields& job, const std::vector<std::string>&) {
  return {ErsTypes(job.level0Filename).is_ers1() == 1 ? KT_ERS1 : KT_ERS2, ""};
}

}  // namespace

std::string scenePathDirectory(const std::string& path) {
  const std::size_t cut = path.find_last_of("/\\");
  return cut == std::string::npos ? std::string() : path.substr(0, cut);
}

const SensorDriver kErsSensor = {.platform = "ERS",
                                 .profile = fixedProfile<kErsProfile>,
                                 .makeFocuser = makeErsFocuser,
                                 .fill = fillErs,
                                 .check = checkErs,
                                 .temporaryFiles = singleSceneTemporaries,
                                 .finishingTag = ersFinishingTag,
                                 .family = "ERS",
                                 .auxiliaryInDescriptionFiles = false,
                                 .multiFileProducts = false,
                                 .multiFileGeoTiff = false};

ersLevel0Focuser::ersLevel0Focuser()
    : level0SceneFocuser({.extractorMissing = "ATERSExtractor object not allocated!",
                          .extracted = "ERS image extracted",
                          .announceMemoryDefault = false}),
      extractor_(std::make_unique<ATERSExtractor>()) {}
ersLevel0Focuser::~ersLevel0Focuser() = default;

int ersLevel0Focuser::nameStages() {
  if (int st = checkLeader(LEAFilename); st != 0) return st;
  nameLevel0Stages(work, focuser(), outputFilename, "", false);
  ATERSExtractor& x = *extractor_;
  x.ImgFilename = level0Filename;
  x.LeaFilename = LEAFilename;
  x.OrbitFilename = orbitFilename;
  x.OutputFile = work.rawFile;
  x.ChirpFile = work.chirpFile;
  x.extractPercent = extractLines;
  x.skipPercent = skipLines;
  return 0;
}

void ersLevel0Focuser::prepareModularExtraction() {
  extractor_->Verbose = 0;
  extractor_->Memory = Memory;
}

void ersLevel0Focuser::redirectExtraction(const std::string& raw, const std::string& chirp,
                                          const std::string&) {
  extractor_->OutputFile = raw;
  extractor_->ChirpFile = chirp;
}

int ersLevel0Focuser::extract() {
  if (int st = extractor_->checkpar(); st != 0) return level0CalledError(st);
  if (int st = extractor_->run(); st != 0) return level0CalledError(st);
  return 0;
}

int ersLevel0Focuser::preprocessing() {
  ORV_REPORT("ERS focuser doesn't do anything in the preprocessor module", REPORT_CHECKPOINT);
  return 0;
}

int ersLevel0Focuser::postprocessing() {
  ORV_REPORT("ERS focuser doesn't do anything in the postprocessor module", REPORT_CHECKPOINT);
  return 0;
}

int ersLevel0Focuser::finalize() {
  std::cout << "- finalize \n" << std::flush;
  return 0;
}

int ersLevel0Focuser::finalize_modular() { return finalize(); }
