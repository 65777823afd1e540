#include "focus/sensors/envisat.h"

#include "base/status.h"
#include "diag/report.h"
#include "focus/sensors/level0_chain.h"
#include "focus/sensors/sensor_job.h"
#include "ingest/envisat/enviextractor.h"
#include "ingest/product_types.h"
#include "ingest/sar_product.h"
#include "output/general_sar_kelmir.h"

namespace {

constexpr std::size_t kNameBuffer = 512;

bool isAlternating(const EnvisatTypes& types) {
  return types.is_aph() || types.is_apv() || types.is_apc();
}

// Image mode level 0 or alternating polarisation; any other product has no
// profile.
int envisatProfile(const FocuserJobFields& job, std::string& profile, int& alternating) {
  alternating = 0;
  const EnvisatTypes scene(job.level0Filename.substr(0, kNameBuffer - 1));
  if (scene.is_im0()) {
    profile = "parameters_ENVISAT.hdr";
  } else if (isAlternating(scene)) {
    profile = "parameters_AP.hdr";
    alternating = 1;
  } else {
    ORV_REPORT("File type not supported", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

std::unique_ptr<stripmapGeneralFocuser> makeEnvisatFocuser(const FocuserJobFields&) {
  return std::make_unique<envisatLevel0Focuser>();
}

// Scene, then the DORIS orbit, ASA_INS, ASA_XCA and ASA_XCH, each looked up
// in its folder when not given.
int fillEnvisat(FocuserJobFields& job, stripmapGeneralFocuser* generic) {
  auto& focuser = static_cast<envisatLevel0Focuser&>(*generic);
  fillScene(job, focuser);
  Envisat_level0 product;
  product.setfileName(job.level0Filename);
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
      {&job.auxFile1, &job.auxDirectory1, 5, &Envisat_level0::getOrbitFilename,
       "Error in defining Envisat Orbit", "DORIS orbit (DOR_VOR)", 1, REPORT_DORVOR_MISSING},
      {&job.auxFile2, &job.auxDirectory2, 2, &Envisat_level0::getASAINSFilename,
       "Error in defining Envisat ASA_INS file", "ASA_INS", 2, REPORT_INS_MISSING},
      {&job.auxFile3, &job.auxDirectory3, 3, &Envisat_level0::getASAXCAFilename,
       "Error in defining Envisat ASA_XCA file", "ASA_XCA", 3, REPORT_XCA_MISSING},
      {&job.auxFile4, &job.auxDirectory4, 4, &Envisat_level0::getASAXCHFilename,
       "Error in defining Envisat ASA_XCH file", "ASA_XCH", 4, REPORT_XCH_MISSING},
  };
  for (const AuxSearch& s : searches) {
    if (!s.file->empty()) continue;
    if (s.directory->empty()) return SENSOR_FAIL(s.message, STATUS_BAD_PARAMETER);
    if (product.getAuxFiles(s.selector, *s.directory) != 0) SENSOR_CALLED(STATUS_BAD_CONDITION);
    *s.file = (product.*s.getter)();
    if (s.file->empty()) {
      const std::string n = std::to_string(s.input);
      ORV_REPORT("No ENVISAT " + std::string(s.what) + " valid for the scene found in " +
                     *s.directory + ": give the file as INPUT FILE " + n +
                     " or a folder holding it as INPUT DIR " + n,
                 s.missingLevel);  // the run ends here with the code of the missing file
    }
  }
  focuser.orbitFilename = job.auxFile1;
  focuser.ASA_INSFilename = job.auxFile2;
  focuser.ASA_XCAFilename = job.auxFile3;
  focuser.ASA_XCHFilename = job.auxFile4;
  return 0;
}

int checkEnvisat(const FocuserJobFields&, const stripmapGeneralFocuser* generic) {
  const auto& focuser = static_cast<const envisatLevel0Focuser&>(*generic);
  if (focuser.level0Filename.empty() || focuser.orbitFilename.empty() ||
      focuser.ASA_INSFilename.empty() || focuser.ASA_XCAFilename.empty() ||
      focuser.ASA_XCHFilename.empty() || focuser.configurationFilename.empty())
    return STATUS_BAD_PARAMETER;
  return 0;
}

// The single-scene temporaries with the antenna pattern, and those of both
// channels of an alternating-polarisation product.
std::vector<TemporaryFile> envisatTemporaries(const FocuserJobFields& job) {
  const std::string& out = job.outputFilename;
  std::vector<TemporaryFile> files;
  appendTemporaryFiles(files, out, {".chirp", ".extracted", ".chirp.hdr", ".extracted.hdr", ".rgfoc",
                                    ".rgfoc.hdr", ".antenna", ".antenna.hdr"});
  if (!isAlternating(EnvisatTypes(job.level0Filename.substr(0, kNameBuffer - 1)))) return files;
  for (const char* suffix :
       {".chirp1.hdr", ".chirp1", ".extracted1", ".extracted1.hdr", ".antenna1", ".antenna1.hdr",
        "1.rgfoc", "1.rgfoc.hdr", ".chirp2", ".chirp2.hdr", ".extracted2", ".extracted2.hdr",
        ".antenna2", ".antenna2.hdr", "2.rgfoc", "2.rgfoc.hdr"})
    files.push_back({out + suffix, std::string(suffix) + " removed"});
  return files;
}

FinishingTag envisatFinishingTag(const FocuserJobFields& job, const std::vector<std::string>&) {
  return {KT_ENVISAT_IM, job.auxFile3};
}

}  // namespace

const SensorDriver kEnvisatSensor = {.platform = "ENVISAT",
                                     .profile = envisatProfile,
                                     .makeFocuser = makeEnvisatFocuser,
                                     .fill = fillEnvisat,
                                     .check = checkEnvisat,
                                     .temporaryFiles = envisatTemporaries,
                                     .finishingTag = envisatFinishingTag,
                                     .family = "ENVISAT",
                                     .auxiliaryInDescriptionFiles = true,
                                     .multiFileProducts = false,
                                     .multiFileGeoTiff = false};

envisatLevel0Focuser::envisatLevel0Focuser()
    : level0SceneFocuser({.extractorMissing = "enviextractor object not allocated!",
                          .extracted = "Extraction completed",
                          .announceMemoryDefault = true}),
      extractor_(std::make_unique<enviextractor>()) {}
envisatLevel0Focuser::~envisatLevel0Focuser() = default;

int envisatLevel0Focuser::nameStages() {
  if (ASA_INSFilename.empty()) {
    ORV_REPORT("ASA_INS filename not selected!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (!extractor_) {
    ORV_REPORT("enviextractor object not allocated!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  nameLevel0Stages(work, focuser(), outputFilename, ".antenna", true);
  enviextractor& x = *extractor_;
  x.input.ASA_Level0_File = level0Filename;
  x.input.ASA_INS_File = ASA_INSFilename;
  x.input.ASA_XCA_File = ASA_XCAFilename;
  x.input.ASA_XCH_File = ASA_XCHFilename;
  x.input.Orbit_File = orbitFilename;
  x.input.PacketsToExtract = extractLines;
  x.input.PacketsToSkip = skipLines;
  x.output.OutputRawFile = work.rawFile;
  x.output.OutputChirpFile = work.chirpFile;
  x.output.OutputAntennaPatternFile = work.antennaFile;
  return 0;
}

void envisatLevel0Focuser::prepareModularExtraction() {
  extractor_->conf.Verbose = 0;
  extractor_->conf.Memory = Memory;
}

void envisatLevel0Focuser::redirectExtraction(const std::string& raw, const std::string& chirp,
                                              const std::string& antenna) {
  work.antennaFile = antenna;
  extractor_->output.OutputRawFile = raw;
  extractor_->output.OutputChirpFile = chirp;
  extractor_->output.OutputAntennaPatternFile = antenna;
}

int envisatLevel0Focuser::extract() {
  if (int st = extractor_->conf.checkpar(); st != 0) return level0CalledError(st);
  if (int st = extractor_->input.checkpar(); st != 0) return level0CalledError(st);
  if (int st = extractor_->run(); st != 0) return level0CalledError(st);
  return 0;
}

int envisatLevel0Focuser::readRecords() {
  // Alternating polarisation gives one raster set per channel ("<name>1",
  // "<name>2"): the records of the first channel describe the scene.
  const std::string names[3] = {work.rawFile, work.chirpFile, work.antennaFile};
  if (extractor_->swaths > 1) {
    work.rawFile = extractor_->numbered(names[0], 0);
    work.chirpFile = extractor_->numbered(names[1], 0);
    work.antennaFile = extractor_->numbered(names[2], 0);
  }
  const int read = readWorkRecords(work, true);
  work.rawFile = names[0], work.chirpFile = names[1], work.antennaFile = names[2];
  return read;
}

int envisatLevel0Focuser::preprocessing() {
  ORV_REPORT("No preprocessing has to be performed.", REPORT_CHECKPOINT);
  return 0;
}

int envisatLevel0Focuser::postprocessing() {
  ORV_REPORT("No post processing has to be performed.", REPORT_CHECKPOINT);
  // Alternating polarisation: the record of the first channel's product.
  const std::string output = extractor_ && extractor_->swaths > 1 ? extractor_->numbered(outputFilename, 0) : outputFilename;
  GeneralSAR product;
  if (int st = product.GSread(output + ".hdr"); st != 0) return level0CalledError(st);
  product.GSdestroy();
  return 0;
}
