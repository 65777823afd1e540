// ALOS PALSAR level-1.0 focusers.
#include "focus/sensors/palsar_focusers.h"

#include <cstdio>

#include "base/status.h"
#include "core/palsar_rfi.h"
#include "diag/report.h"
#include "focus/sensors/level0_chain.h"
#include "ingest/palsar/palsar_extractor.h"
#include "ingest/palsar/palsar_types.h"
#include "ingest/product_types.h"
#include "product/profile.h"

std::string palsarPolarisationLabel(int code) {
  static const char* kLabels[5] = {"hh", "hv", "vh", "vv", "1"};
  return code >= 0 && code <= 4 ? kLabels[code] : "1";
}

// ---- one scene -------------------------------------------------------------------

palsarLevel0Focuser::palsarLevel0Focuser() : extractor_(std::make_unique<ATPalExtractor>()) {}
palsarLevel0Focuser::~palsarLevel0Focuser() = default;

std::string palsarLevel0Focuser::sceneName(int index) const {
  switch (index) {
    case 0: return level0Filename;
    case 1: return secondScene;
    case 2: return thirdScene;
    case 3: return fourthScene;
    default: return {};
  }
}

int palsarLevel0Focuser::nameStages(const std::string& scene, const std::string& root) {
  if (leaderFilename.empty()) {
    ORV_REPORT("LEA filename not selected!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (!extractor_) {
    ORV_REPORT("ATPalExtractor object not allocated!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (!fileOpens(leaderFilename)) {
    ORV_REPORT("LEA file does not exist!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  // No range antenna pattern is extracted: the chain applies none.
  nameLevel0Stages(work, focuser(), root, ".rgpatt", false);
  ATPalExtractor& x = *extractor_;
  x.LeaFileName = leaderFilename;
  x.RawDataName = scene;
  x.Orbit_Filename = orbitFilename;
  x.OutputFile = work.rawFile;
  x.OutputChirp = work.chirpFile;
  x.OutputAntenna = work.antennaFile;
  x.SkipLines = skipLines;
  x.ExtractLines = extractLines;
  x.Raw_Focused = 0;
  x.Verbose = 0;
  x.Memory = Memory;
  return 0;
}

int palsarLevel0Focuser::readConfiguration() {
  if (int st = configureLevel0Chain(conf(), configurationFilename, true); st != 0) return st;
  int remove = 1;
  if (GetMyProfileIntArray("GeneralProcessingConf", "Remove_interferences", &remove, 1, configurationFilename) != 0) {
    remove = 1;
    ORV_REPORT("Remove_interferences in [GeneralProcessingConf] section not found. Setting to default = 1",
               REPORT_WARNING);
  }
  Remove_interferences = remove;
  return 0;
}

int palsarLevel0Focuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  currentScene = 0;
  if (int st = nameStages(level0Filename, outputFilename); st != 0) return st;
  if (int st = readConfiguration(); st != 0) return st;
  initialized_ = true;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int palsarLevel0Focuser::ingestion(const std::string& raw, const std::string& chirp, const std::string&) {
  if (outputSelected_) return STATUS_BAD_CONDITION;
  work.rawFile = raw;
  work.chirpFile = chirp;
  extractor_->OutputFile = raw;
  extractor_->OutputChirp = chirp;
  return ingestion();
}

int palsarLevel0Focuser::ingestion() {
  ORV_REPORT("Starting ingestion", REPORT_CHECKPOINT);
  if (!extractor_) {
    ORV_REPORT("ATPalExtractor object not allocated!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (int st = extractor_->checkpar(); st != 0) return level0CalledError(st);
  if (int st = extractor_->run(); st != 0) return level0CalledError(st);
  if (int st = work.raw.GSread(work.rawFile + ".hdr"); st != 0) return level0CalledError(st);
  if (int st = work.chirp.GSread(work.chirpFile + ".hdr"); st != 0) return level0CalledError(st);
  ORV_REPORT("Extraction completed", REPORT_CHECKPOINT);
  return 0;
}

int palsarLevel0Focuser::preprocessing() {
  if (Remove_interferences == 1) {
    ORV_REPORT("Palsar preprocessing has to be performed.", REPORT_CHECKPOINT);
    ATPalsarRFIRemoval rfi;
    rfi.RawData = work.rawFile;
    rfi.OutputFile = work.rawFile + ".interf";
    rfi.Memory = Memory;
    focuser().RawDataFile = rfi.OutputFile;
    if (int st = rfi.checkpar(); st != 0) return level0CalledError(st);
    if (int st = rfi.run(); st != 0) return level0CalledError(st);
    ORV_REPORT("Palsar preprocessing finished.", REPORT_CHECKPOINT);
    return 0;
  }
  ORV_REPORT("Palsar preprocessing skipped.", REPORT_CHECKPOINT);
  return 0;
}

int palsarLevel0Focuser::postprocessing() {
  ORV_REPORT("No post processing has to be performed.", REPORT_CHECKPOINT);
  return 0;
}

// ---- several polarisations ---------------------------------------------------------

int palsarMultiPolLevel0Focuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  currentScene = 0;
  const std::string label = palsarPolarisationLabel(PalsarTypes(leaderFilename, level0Filename).getPol());
  if (int st = nameStages(level0Filename, outputFilename + "_" + label); st != 0) return st;
  if (int st = readConfiguration(); st != 0) return st;
  initialized_ = true;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int palsarMultiPolLevel0Focuser::initializeUsingDoppler(const std::string& header) {
  if (!initialized_) {
    ORV_REPORT("function initialize() hasn't been called before calling initializeUsingDoppler()", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  ++currentScene;
  const std::string scene = sceneName(currentScene);
  const PalsarTypes types(leaderFilename, scene);
  const int code = types.is_ersdac() == 1 ? types.get_ersdac_Pol(currentScene) : types.getPol();
  if (int st = nameStages(scene, outputFilename + "_" + palsarPolarisationLabel(code)); st != 0) return st;
  if (int st = configureLevel0Chain(conf(), configurationFilename, false); st != 0) return st;
  GeneralSAR first;
  if (int st = first.GSread(header); st != 0) return level0CalledError(st);
  SARFocuser_conf& c = conf();
  for (int i = 0; i < 7; ++i) {
    c.GivenDC[i] = first.polynomials.DC[0].c[i];
    c.GivenFR[i] = first.polynomials.FR[0].c[i];
  }
  c.GivenDCref[0] = first.polynomials.DC[0].trg0;
  c.GivenDCref[1] = first.polynomials.DC[0].taz0;
  c.GivenFRref[0] = first.polynomials.FR[0].trg0;
  c.GivenFRref[1] = first.polynomials.FR[0].taz0;
  c.DopplerGiven = 1;
  c.Flag_dcest = 0;
  first.GSdestroy();
  return 0;
}

int palsarMultiPolLevel0Focuser::run() {
  auto focus = [this]() {
    int st = ingestion();
    if (st == 0) st = preprocessing();
    if (st == 0) {
      conf().Flag_set = 1;
      st = sarfocuser();
    }
    if (st == 0) st = postprocessing();
    return st;
  };
  int status = initialize();
  if (status == 0) status = focus();
  if (status != 0) return level0CalledError(status);
  const std::string firstHeader = work.outputFile + ".hdr";
  ORV_REPORT("First run completed", REPORT_CHECKPOINT);
  for (int k = 1; k < sceneCount && status == 0; ++k) {
    status = initializeUsingDoppler(firstHeader);
    if (status == 0) status = focus();
  }
  if (status == 0) status = finalize();
  if (status != 0) return level0CalledError(status);
  return 0;
}

int palsarErsDacLevel0Focuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  currentScene = 0;
  if (sceneCount > 2) sceneCount = 2;
  const PalsarTypes types(leaderFilename, level0Filename);
  // One scene keeps the single-scene names; two are named by polarisation.
  const std::string root =
      sceneCount > 1 ? outputFilename + "_" + palsarPolarisationLabel(types.get_ersdac_Pol(0)) : outputFilename;
  if (int st = nameStages(level0Filename, root); st != 0) return st;
  if (int st = readConfiguration(); st != 0) return st;
  initialized_ = true;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}
