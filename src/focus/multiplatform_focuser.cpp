// The focuser of a job: dispatch to the sensor focuser of the platform,
// auxiliary file look-up, run, and clean-up of the chain's temporary files.
#include "focus/multiplatform_focuser.h"

#include <climits>
#include <cstdio>
#include <initializer_list>

#include "base/status.h"
#include "diag/report.h"
#include "focus/level0_focusers.h"
#include "focus/palsar_focusers.h"
#include "focus/stripmap_general_focuser.h"
#include "ingest/product_types.h"
#include "ingest/sar_product.h"

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

// Removes one file; a failure is a level 1 report, not an error.
bool removeFile(const std::string& name) {
  if (std::remove(name.c_str()) == 0) return true;
  ORV_REPORT("Cannot remove file", REPORT_WARNING);
  return false;
}

// "<out><suffix>" for each suffix, in order.
void removeAll(const std::string& out, std::initializer_list<const char*> suffixes) {
  for (const char* suffix : suffixes) removeFile(out + suffix);
}

std::string palsarLabel(int code) {
  static const char* const labels[] = {"hh", "hv", "vh", "vv"};
  return code >= 0 && code < 4 ? labels[code] : std::to_string(code);
}

bool isAlternatingEnvisat(const std::string& scene) {
  const EnvisatTypes types(scene.substr(0, 511));
  return types.is_aph() || types.is_apv() || types.is_apc();
}

}  // namespace

std::string scenePathDirectory(const std::string& path) {
  const std::size_t cut = path.find_last_of("/\\");
  return cut == std::string::npos ? std::string() : path.substr(0, cut);
}

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

void ATmultiplatformFocuser::fillScene(stripmapGeneralFocuser& focuser) const {
  focuser.level0Filename = level0Filename;
  focuser.skipLines = skipLines;
  focuser.extractLines = extractLines;
  if (auto* modular = dynamic_cast<stripmapGeneralFocuserModular*>(&focuser))
    modular->Memory = Memory;
}

int ATmultiplatformFocuser::fillErs(ersLevel0Focuser& focuser) {
  fillScene(focuser);
  if (auxFile1.empty()) {
    if (auxDirectory1.empty()) return MP_FAIL("Error in defining Ers Orbit", STATUS_BAD_PARAMETER);
    // The product is the scene directory; its leader gives the time of the
    // arc to look for in the archive.
    const std::string productDirectory = scenePathDirectory(level0Filename);
    Ers_level0 product;
    product.setfileName(productDirectory);
    if (product.getAuxFiles(3, auxDirectory1) != 0) {
      MP_CALLED(STATUS_BAD_CONDITION);
      ORV_REPORT("The ERS orbit cannot be looked up: the leader LEA_01.001 of " +
                     productDirectory +
                     " gives no ERS-1 or ERS-2 acquisition time; give the orbit file as INPUT "
                     "FILE 1",
                 REPORT_ERROR);
    }
    auxFile1 = product.getOrbitFilename();
    if (auxFile1.empty())
      ORV_REPORT("No ERS orbit arc found for the scene in " + auxDirectory1 +
                     " (ERS1/PRECISE/arclist): give the orbit file as INPUT FILE 1 or a folder "
                     "whose arc list covers the acquisition as INPUT DIR 1",
                 REPORT_ERROR);
  }
  focuser.orbitFilename = auxFile1;
  if (auxFile2.empty())
    return MP_FAIL("Error in defining Ers leader file", STATUS_BAD_PARAMETER);
  focuser.LEAFilename = auxFile2;
  return 0;
}

int ATmultiplatformFocuser::fillEnvisat(envisatLevel0Focuser& focuser) {
  fillScene(focuser);
  Envisat_level0 product;
  product.setfileName(level0Filename);
  struct AuxSearch {
    std::string* file;
    const std::string* directory;
    int selector;
    std::string (Envisat_level0::*getter)() const;
    const char* message;
    const char* what;  // the file in the user's words
    int input;         // its number in the job (INPUT FILE n, INPUT DIR n)
    int missingLevel;  // fatal report level when the folder holds no valid file
  };
  const AuxSearch searches[] = {
      {&auxFile1, &auxDirectory1, 5, &Envisat_level0::getOrbitFilename,
       "Error in defining Envisat Orbit", "DORIS orbit (DOR_VOR)", 1, REPORT_DORVOR_MISSING},
      {&auxFile2, &auxDirectory2, 2, &Envisat_level0::getASAINSFilename,
       "Error in defining Envisat ASA_INS file", "ASA_INS", 2, REPORT_INS_MISSING},
      {&auxFile3, &auxDirectory3, 3, &Envisat_level0::getASAXCAFilename,
       "Error in defining Envisat ASA_XCA file", "ASA_XCA", 3, REPORT_XCA_MISSING},
      {&auxFile4, &auxDirectory4, 4, &Envisat_level0::getASAXCHFilename,
       "Error in defining Envisat ASA_XCH file", "ASA_XCH", 4, REPORT_XCH_MISSING},
  };
  for (const AuxSearch& s : searches) {
    if (!s.file->empty()) continue;
    if (s.directory->empty()) return MP_FAIL(s.message, STATUS_BAD_PARAMETER);
    if (product.getAuxFiles(s.selector, *s.directory) != 0) MP_CALLED(STATUS_BAD_CONDITION);
    *s.file = (product.*s.getter)();
    if (s.file->empty()) {
      const std::string n = std::to_string(s.input);
      // The run ends here with the code of the missing file.
      ORV_REPORT("No ENVISAT " + std::string(s.what) + " valid for the scene found in " +
                     *s.directory + ": give the file as INPUT FILE " + n +
                     " or a folder holding it as INPUT DIR " + n,
                 s.missingLevel);
    }
  }
  focuser.orbitFilename = auxFile1;
  focuser.ASA_INSFilename = auxFile2;
  focuser.ASA_XCAFilename = auxFile3;
  focuser.ASA_XCHFilename = auxFile4;
  return 0;
}

int ATmultiplatformFocuser::fillRadarsat(radarsatLevel0Focuser& focuser) {
  fillScene(focuser);
  focuser.leaderFilename = auxFile2;
  if (auxFile1.empty())
    return MP_FAIL("Error in defining RADARSAT orbit file", STATUS_BAD_PARAMETER);
  focuser.orbitFilename = auxFile1;
  return 0;
}

int ATmultiplatformFocuser::fillPalsarFiles() {
  if (auxFile1.empty()) return MP_FAIL("Error in defining PALSAR Orbit", STATUS_BAD_PARAMETER);
  if (auxFile2.empty())
    return MP_FAIL("Error in defining PALSAR leader file", STATUS_BAD_PARAMETER);
  return 0;
}

std::unique_ptr<stripmapGeneralFocuser> ATmultiplatformFocuser::makePalsarFocuser() {
  std::unique_ptr<palsarLevel0Focuser> f;
  if (platform == "PALSAR_ERSDAC")
    f = std::make_unique<palsarErsDacLevel0Focuser>();
  else if (!level0FilenameSecondPol.empty())
    f = std::make_unique<palsarMultiPolLevel0Focuser>();
  else
    f = std::make_unique<palsarLevel0Focuser>();
  fillScene(*f);
  fillCommon(*f);
  f->orbitFilename = auxFile1;
  f->leaderFilename = auxFile2;
  f->secondScene = level0FilenameSecondPol;
  f->thirdScene = level0FilenameThirdPol;
  f->fourthScene = level0FilenameFourthPol;
  f->sceneCount = palsarSceneCount();
  return f;
}

int ATmultiplatformFocuser::palsarSceneCount() const {
  int count = 1;
  if (!level0FilenameSecondPol.empty()) count = 2;
  if (!level0FilenameThirdPol.empty()) count = 3;
  if (!level0FilenameFourthPol.empty()) count = 4;
  return count;
}

int ATmultiplatformFocuser::checkMultiPolPalsar(int sceneCount) const {
  if (auxFile2.empty() || level0Filename.empty() || auxFile1.empty())
    return STATUS_BAD_PARAMETER;
  const PalsarTypes types(auxFile2, level0Filename);
  if (types.is_singlepol() && sceneCount >= 2)
    return MP_FAIL("detected a single polarization on this scene, trying to focus more than one ",
                   STATUS_BAD_PARAMETER);
  if (types.is_doublepol() && sceneCount > 2)
    return MP_FAIL("detected a double polarization on this scene, trying to focus more than two ",
                   STATUS_BAD_PARAMETER);
  return 0;
}

int ATmultiplatformFocuser::checkErs(const ersLevel0Focuser& focuser) const {
  if (focuser.LEAFilename.empty() || focuser.level0Filename.empty() ||
      focuser.orbitFilename.empty() || focuser.configurationFilename.empty())
    return STATUS_BAD_PARAMETER;
  return 0;
}

int ATmultiplatformFocuser::checkEnvisat(const envisatLevel0Focuser& focuser) const {
  if (focuser.level0Filename.empty() || focuser.orbitFilename.empty() ||
      focuser.ASA_INSFilename.empty() || focuser.ASA_XCAFilename.empty() ||
      focuser.ASA_XCHFilename.empty() || focuser.configurationFilename.empty())
    return STATUS_BAD_PARAMETER;
  return 0;
}

int ATmultiplatformFocuser::checkRadarsat(const radarsatLevel0Focuser&) const { return 0; }

int ATmultiplatformFocuser::InitProcessing() {
  if (ReportFilename.empty()) return STATUS_BAD_CONDITION;
  init_report(0, "ATmultiplatformFocuser REPORT", 1);
  ORV_REPORT(platform, REPORT_WARNING);
  if (platform.empty())
    return MP_FAIL("Platform not defined, exiting with error", STATUS_BAD_PARAMETER);

  focuser_.reset();
  int status = 0;
  if (platform == "ERS") {
    auto ers = std::make_unique<ersLevel0Focuser>();
    status = fillErs(*ers);
    if (status == 0) {
      fillCommon(*ers);
      status = checkErs(*ers);
    }
    focuser_ = std::move(ers);
  } else if (platform == "ENVISAT") {
    auto envisat = std::make_unique<envisatLevel0Focuser>();
    status = fillEnvisat(*envisat);
    if (status == 0) {
      fillCommon(*envisat);
      status = checkEnvisat(*envisat);
    }
    focuser_ = std::move(envisat);
  } else if (platform == "RADARSAT") {
    auto radarsat = std::make_unique<radarsatLevel0Focuser>();
    status = fillRadarsat(*radarsat);
    if (status == 0) {
      fillCommon(*radarsat);
      status = checkRadarsat(*radarsat);
    }
    focuser_ = std::move(radarsat);
  } else if (platform == "PALSAR" || platform == "PALSAR_ERSDAC") {
    status = fillPalsarFiles();
    if (status == 0 && platform == "PALSAR" && !level0FilenameSecondPol.empty())
      status = checkMultiPolPalsar(palsarSceneCount());
    if (status == 0) focuser_ = makePalsarFocuser();
  } else {
    return MP_FAIL("Invalid name for platform", STATUS_BAD_PARAMETER);
  }
  if (status != 0) return MP_CALLED(status);
  return 0;
}

int ATmultiplatformFocuser::run() {
  if (!focuser_) return MP_FAIL("Focuser not initialised: InitProcessing must come first",
                                STATUS_BAD_CONDITION);
  if (const int status = focuser_->run(); status != 0) return MP_CALLED(status);
  return 0;
}

void ATmultiplatformFocuser::eraseTemporaryErs() const {
  removeAll(outputFilename, {".chirp", ".extracted", ".chirp.hdr", ".extracted.hdr", ".rgfoc",
                             ".rgfoc.hdr"});
}

void ATmultiplatformFocuser::eraseTemporaryRadarsat() const { eraseTemporaryErs(); }

void ATmultiplatformFocuser::eraseTemporaryEnvisat() const {
  removeAll(outputFilename, {".chirp", ".extracted", ".chirp.hdr", ".extracted.hdr", ".rgfoc",
                             ".rgfoc.hdr", ".antenna", ".antenna.hdr"});
  if (!isAlternatingEnvisat(level0Filename)) return;
  for (const char* suffix :
       {".chirp1.hdr", ".chirp1", ".extracted1", ".extracted1.hdr", ".antenna1", ".antenna1.hdr",
        "1.rgfoc", "1.rgfoc.hdr", ".chirp2", ".chirp2.hdr", ".extracted2", ".extracted2.hdr",
        ".antenna2", ".antenna2.hdr", "2.rgfoc", "2.rgfoc.hdr"}) {
    removeFile(outputFilename + suffix);
    ORV_REPORT(std::string(suffix) + " removed", REPORT_CHECKPOINT);
  }
}

void ATmultiplatformFocuser::eraseTemporaryPalsar() const {
  const std::string& out = outputFilename;
  if (!level0FilenameSecondPol.empty()) {
    for (const std::string* scene : {&level0Filename, &level0FilenameSecondPol,
                                     &level0FilenameThirdPol, &level0FilenameFourthPol}) {
      if (scene->empty()) continue;
      const std::string root = out + "_" + palsarLabel(PalsarTypes(auxFile2, *scene).getPol());
      removeAll(root, {".chirp", ".extracted", ".extracted.interf", ".chirp.hdr",
                       ".extracted.hdr", ".extracted.interf.hdr", ".rgfoc", ".rgfoc.hdr"});
    }
    return;
  }
  const std::string label = palsarLabel(PalsarTypes(auxFile2, level0Filename).getPol());
  removeFile(out + ".chirp");
  removeFile(out + ".extracted_" + label);
  removeFile(out + ".extracted_" + label + ".interf");
  removeFile(out + ".chirp.hdr");
  removeFile(out + ".extracted_" + label + ".hdr");
  removeFile(out + ".extracted_" + label + ".interf.hdr");
  removeFile(out + ".rgfoc");
  removeFile(out + ".rgfoc.hdr");
}

int ATmultiplatformFocuser::FinalizeProcessing(const std::string&, int) {
  int status = 0;
  if (eraseTemporaryFiles == 1) {
    if (platform == "ERS")
      eraseTemporaryErs();
    else if (platform == "ENVISAT")
      eraseTemporaryEnvisat();
    else if (platform == "PALSAR" || platform == "PALSAR_ERSDAC")
      eraseTemporaryPalsar();
    else if (platform == "RADARSAT")
      eraseTemporaryRadarsat();
    else
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
