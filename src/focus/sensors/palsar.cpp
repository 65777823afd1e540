#include "focus/sensors/palsar.h"

#include <string>

#include "base/status.h"
#include "focus/sensors/palsar_focusers.h"
#include "focus/sensors/sensor_job.h"
#include "ingest/palsar/palsar_types.h"
#include "output/general_sar_kelmir.h"

namespace {

constexpr char kPalsarProfile[] = "parameters_PALSAR.hdr";

// Label of a polarisation code in the names of temporary files; an unknown
// code pair keeps its number.
std::string polarisationLabel(int code) {
  static const char* const labels[] = {"hh", "hv", "vh", "vv"};
  return code >= 0 && code < 4 ? labels[code] : std::to_string(code);
}

// One scene, or several polarisations of one JAXA product.
std::unique_ptr<stripmapGeneralFocuser> makePalsarFocuser(const FocuserJobFields& job) {
  if (!job.level0FilenameSecondPol.empty()) return std::make_unique<palsarMultiPolLevel0Focuser>();
  return std::make_unique<palsarLevel0Focuser>();
}

std::unique_ptr<stripmapGeneralFocuser> makePalsarErsdacFocuser(const FocuserJobFields&) {
  return std::make_unique<palsarErsDacLevel0Focuser>();
}

// Orbit and leader must be given; the focuser takes every scene of the job.
int fillPalsar(FocuserJobFields& job, stripmapGeneralFocuser* generic) {
  if (job.auxFile1.empty())
    return SENSOR_FAIL("Error in defining PALSAR Orbit", STATUS_BAD_PARAMETER);
  if (job.auxFile2.empty())
    return SENSOR_FAIL("Error in defining PALSAR leader file", STATUS_BAD_PARAMETER);
  if (auto* focuser = dynamic_cast<palsarLevel0Focuser*>(generic)) {
    fillScene(job, *focuser);
    focuser->orbitFilename = job.auxFile1;
    focuser->leaderFilename = job.auxFile2;
    focuser->secondScene = job.level0FilenameSecondPol;
    focuser->thirdScene = job.level0FilenameThirdPol;
    focuser->fourthScene = job.level0FilenameFourthPol;
    focuser->sceneCount = palsarSceneCount(job);
  }
  return 0;
}

// JAXA products with further scenes: the polarisations must fit the product.
int checkPalsar(const FocuserJobFields& job, const stripmapGeneralFocuser*) {
  if (job.level0FilenameSecondPol.empty()) return 0;
  return checkMultiPolPalsar(job, palsarSceneCount(job));
}

int checkPalsarErsdac(const FocuserJobFields&, const stripmapGeneralFocuser*) { return 0; }

// The temporaries of each scene of a multi-polarisation job, or those of the
// single scene.
std::vector<TemporaryFile> palsarTemporaries(const FocuserJobFields& job) {
  const std::string& out = job.outputFilename;
  std::vector<TemporaryFile> files;
  if (!job.level0FilenameSecondPol.empty()) {
    for (const std::string* scene : {&job.level0Filename, &job.level0FilenameSecondPol,
                                     &job.level0FilenameThirdPol, &job.level0FilenameFourthPol}) {
      if (scene->empty()) continue;
      const std::string root =
          out + "_" + polarisationLabel(PalsarTypes(job.auxFile2, *scene).getPol());
      appendTemporaryFiles(files, root, {".chirp", ".extracted", ".extracted.interf", ".chirp.hdr",
                                         ".extracted.hdr", ".extracted.interf.hdr", ".rgfoc",
                                         ".rgfoc.hdr"});
    }
    return files;
  }
  const std::string label = polarisationLabel(PalsarTypes(job.auxFile2, job.level0Filename).getPol());
  const std::string extracted = ".extracted_" + label;
  for (const std::string& suffix : {std::string(".chirp"), extracted, extracted + ".interf", std::string(".chirp.hdr"),
                                    extracted + ".hdr", extracted + ".interf.hdr", std::string(".rgfoc"),
                                    std::string(".rgfoc.hdr")})
    files.push_back({out + suffix});
  return files;
}

FinishingTag palsarFinishingTag(const FocuserJobFields& job, const std::vector<std::string>&) {
  return {palsarExportTag(PalsarTypes(job.auxFile2, job.level0Filename)), ""};
}

// The ERSDAC export takes the orbit parameter as the job gives it.
FinishingTag palsarErsdacFinishingTag(const FocuserJobFields&,
                                      const std::vector<std::string>& parameters) {
  return {KT_PALSAR_ERSDAC, parameters.size() > 6 ? parameters[6] : std::string()};
}

}  // namespace

int palsarSceneCount(const FocuserJobFields& job) {
  int count = 1;
  if (!job.level0FilenameSecondPol.empty()) count = 2;
  if (!job.level0FilenameThirdPol.empty()) count = 3;
  if (!job.level0FilenameFourthPol.empty()) count = 4;
  return count;
}

int checkMultiPolPalsar(const FocuserJobFields& job, int sceneCount) {
  if (job.auxFile2.empty() || job.level0Filename.empty() || job.auxFile1.empty())
    return STATUS_BAD_PARAMETER;
  const PalsarTypes types(job.auxFile2, job.level0Filename);
  if (types.is_singlepol() && sceneCount >= 2)
    return SENSOR_FAIL(
        "detected a single polarization on this scene, trying to focus more than one ",
        STATUS_BAD_PARAMETER);
  if (types.is_doublepol() && sceneCount > 2)
    return SENSOR_FAIL(
        "detected a double polarization on this scene, trying to focus more than two ",
        STATUS_BAD_PARAMETER);
  return 0;
}

int palsarExportTag(const PalsarTypes& types) {
  if (types.is_quadpol() == 1) return KT_PALSAR_QUAD;
  if (types.is_doublepol() == 1) return KT_PALSAR_DOUBLE;
  return KT_PALSAR_SINGLE;
}

const SensorDriver kPalsarSensor = {.platform = "PALSAR",
                                    .profile = fixedProfile<kPalsarProfile>,
                                    .makeFocuser = makePalsarFocuser,
                                    .fill = fillPalsar,
                                    .check = checkPalsar,
                                    .temporaryFiles = palsarTemporaries,
                                    .finishingTag = palsarFinishingTag,
                                    .family = "PALSAR",
                                    .auxiliaryInDescriptionFiles = false,
                                    .multiFileProducts = true,
                                    .multiFileGeoTiff = true};

const SensorDriver kPalsarErsdacSensor = {.platform = "PALSAR_ERSDAC",
                                          .profile = fixedProfile<kPalsarProfile>,
                                          .makeFocuser = makePalsarErsdacFocuser,
                                          .fill = fillPalsar,
                                          .check = checkPalsarErsdac,
                                          .temporaryFiles = palsarTemporaries,
                                          .finishingTag = palsarErsdacFinishingTag,
                                          .family = "PALSAR",
                                          .auxiliaryInDescriptionFiles = false,
                                          .multiFileProducts = true,
                                          .multiFileGeoTiff = false};
