#include "focus/level0_focusers.h"

#include <cstdio>
#include <iostream>

#include "base/status.h"
#include "diag/report.h"
#include "ingest/ers_extractor.h"
#include "ingest/radarsat/radarextract.h"
#include "product/profile.h"

namespace {

bool opens(const std::string& name) {
  if (name.empty()) return false;
  std::FILE* f = std::fopen(name.c_str(), "rb");
  if (!f) return false;
  std::fclose(f);
  return true;
}

int calledError(int status) {
  ORV_REPORT_CALLED_ERROR();
  return status;
}

// Records of the extracted rasters into the work object.
int readWorkRecords(FocuserWork& work, bool withAntenna) {
  if (int st = work.raw.GSread(work.rawFile + ".hdr"); st != 0) return calledError(st);
  if (!work.chirpFile.empty()) {
    if (int st = work.chirp.GSread(work.chirpFile + ".hdr"); st != 0) return calledError(st);
  }
  if (withAntenna && !work.antennaFile.empty()) {
    if (int st = work.antenna.GSread(work.antennaFile + ".hdr"); st != 0) return calledError(st);
  }
  return 0;
}

}  // namespace

int configureLevel0Chain(SARFocuser_conf& conf, const std::string& profile, bool announceDefault) {
  int memory = 256;
  if (GetMyProfileIntArray("sarfocuserConfiguration", "Memory", &memory, 1, profile) != 0) {
    memory = 256;
    if (announceDefault) ORV_REPORT("Memory set to default value: 256Mb", REPORT_WARNING);
  }
  conf.Memory = memory;
  conf.Incore = 0;
  if (int st = conf.readconf(profile); st != 0) return calledError(st);
  conf.Azblk = 1024;
  conf.DCref = 0.0;
  conf.Flag_swstal = 1;
  conf.Flag_ortog = 1;
  conf.Incore = 0;
  return 0;
}

// ---- ERS -------------------------------------------------------------------------

ersLevel0Focuser::ersLevel0Focuser() : extractor_(std::make_unique<ATERSExtractor>()) {}
ersLevel0Focuser::~ersLevel0Focuser() = default;

int ersLevel0Focuser::nameStages() {
  if (LEAFilename.empty()) {
    ORV_REPORT("LEA filename not selected!", REPORT_ERROR);
    return 1;
  }
  if (!extractor_) {
    ORV_REPORT("ATERSExtractor object not allocated!", REPORT_ERROR);
    return 1;
  }
  if (!opens(LEAFilename)) {
    ORV_REPORT("LEA file does not exist!", REPORT_ERROR);
    return 1;
  }
  work.rawFile = outputFilename + "." + "extracted";
  work.chirpFile = outputFilename + "." + "chirp";
  work.antennaFile.clear();
  work.rgfocFile = outputFilename + ".rgfoc";
  work.outputFile = outputFilename;
  ATERSExtractor& x = *extractor_;
  x.ImgFilename = level0Filename;
  x.LeaFilename = LEAFilename;
  x.OrbitFilename = orbitFilename;
  x.OutputFile = work.rawFile;
  x.ChirpFile = work.chirpFile;
  x.extractPercent = extractLines;
  x.skipPercent = skipLines;
  SARFocuser& f = focuser();
  f.RawDataFile = work.rawFile;
  f.ChirpFile = work.chirpFile;
  f.AntennaFile = "antenna not exist";
  f.OutputFilename = outputFilename;
  return 0;
}

int ersLevel0Focuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  if (int st = configureLevel0Chain(conf(), configurationFilename, false); st != 0) return st;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int ersLevel0Focuser::initialize_modular() {
  if (int st = stripmapGeneralFocuserModular::initialize_modular(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  extractor_->Verbose = 0;
  extractor_->Memory = Memory;
  if (int st = setConfFile(configurationFilename, 0); st != 0) return calledError(st);
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int ersLevel0Focuser::ingestion(const std::string& raw, const std::string& chirp,
                                const std::string&) {
  if (outputSelected_) return 1;
  work.rawFile = raw;
  work.chirpFile = chirp;
  extractor_->OutputFile = raw;
  extractor_->ChirpFile = chirp;
  return ingestion();
}

int ersLevel0Focuser::ingestion() {
  ORV_REPORT("Starting ingestion", REPORT_CHECKPOINT);
  if (!extractor_) {
    ORV_REPORT("ATERSExtractor object not allocated!", REPORT_ERROR);
    return 1;
  }
  if (int st = extractor_->checkpar(); st != 0) return calledError(st);
  if (int st = extractor_->run(); st != 0) return calledError(st);
  if (int st = readWorkRecords(work, false); st != 0) return st;
  ORV_REPORT("ERS image extracted", REPORT_CHECKPOINT);
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

// ---- ENVISAT ---------------------------------------------------------------------

envisatLevel0Focuser::envisatLevel0Focuser() = default;
envisatLevel0Focuser::~envisatLevel0Focuser() = default;

int envisatLevel0Focuser::nameStages() {
  if (ASA_INSFilename.empty()) {
    ORV_REPORT("ASA_INS filename not selected!", REPORT_ERROR);
    return 1;
  }
  // The ASAR extractor is not part of this build.
  ORV_REPORT("enviextractor object not allocated!", REPORT_ERROR);
  return 1;
}

int envisatLevel0Focuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  if (int st = configureLevel0Chain(conf(), configurationFilename, true); st != 0) return st;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int envisatLevel0Focuser::initialize_modular() {
  if (int st = stripmapGeneralFocuserModular::initialize_modular(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  if (int st = setConfFile(configurationFilename, 0); st != 0) return calledError(st);
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int envisatLevel0Focuser::ingestion(const std::string&, const std::string&,
                                    const std::string&) {
  if (outputSelected_) return 1;
  return ingestion();
}

int envisatLevel0Focuser::ingestion() {
  ORV_REPORT("Starting ingestion", REPORT_CHECKPOINT);
  ORV_REPORT("ASAR extraction not available in this build", REPORT_ERROR);
  return 1;
}

int envisatLevel0Focuser::preprocessing() {
  ORV_REPORT("No preprocessing has to be performed.", REPORT_CHECKPOINT);
  return 0;
}

int envisatLevel0Focuser::postprocessing() {
  ORV_REPORT("No post processing has to be performed.", REPORT_CHECKPOINT);
  GeneralSAR product;
  if (int st = product.GSread(outputFilename + ".hdr"); st != 0) return calledError(st);
  product.GSdestroy();
  return 0;
}

// ---- RADARSAT --------------------------------------------------------------------

radarsatLevel0Focuser::radarsatLevel0Focuser() : extractor_(std::make_unique<radarextract>()) {}
radarsatLevel0Focuser::~radarsatLevel0Focuser() = default;

int radarsatLevel0Focuser::nameStages() {
  if (leaderFilename.empty()) {
    ORV_REPORT("LEA filename not selected!", REPORT_ERROR);
    return 1;
  }
  if (!extractor_) {
    ORV_REPORT("radarextract object not allocated!", REPORT_ERROR);
    return 1;
  }
  if (!opens(leaderFilename)) {
    ORV_REPORT("LEA file does not exist!", REPORT_ERROR);
    return 1;
  }
  work.rawFile = outputFilename + ".extracted";
  work.chirpFile = outputFilename + ".chirp";
  work.antennaFile.clear();
  work.rgfocFile = outputFilename + ".rgfoc";
  work.outputFile = outputFilename;
  radarextract& x = *extractor_;
  x.DataFile = level0Filename;
  x.LeaderFile = leaderFilename;
  x.OrbitFile = orbitFilename;
  x.OutputRawFile = work.rawFile;
  x.OutputChirpFile = work.chirpFile;
  x.LinesToExtract = extractLines;
  x.LinesToSkip = skipLines;
  SARFocuser& f = focuser();
  f.RawDataFile = work.rawFile;
  f.ChirpFile = work.chirpFile;
  f.AntennaFile = "antenna not exist";
  f.OutputFilename = outputFilename;
  return 0;
}

int radarsatLevel0Focuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  if (int st = configureLevel0Chain(conf(), configurationFilename, false); st != 0) return st;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int radarsatLevel0Focuser::initialize_modular() {
  if (int st = stripmapGeneralFocuserModular::initialize_modular(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  if (int st = setConfFile(configurationFilename, 0); st != 0) return calledError(st);
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int radarsatLevel0Focuser::ingestion(const std::string& raw, const std::string& chirp,
                                     const std::string&) {
  if (outputSelected_) return 1;
  work.rawFile = raw;
  work.chirpFile = chirp;
  extractor_->OutputRawFile = raw;
  extractor_->OutputChirpFile = chirp;
  return ingestion();
}

int radarsatLevel0Focuser::ingestion() {
  ORV_REPORT("Starting ingestion", REPORT_CHECKPOINT);
  if (!extractor_) {
    ORV_REPORT("radarextract object not allocated!", REPORT_ERROR);
    return 1;
  }
  if (int st = extractor_->checkpar(); st != 0) return calledError(st);
  if (int st = extractor_->run(); st != 0) return calledError(st);
  if (int st = readWorkRecords(work, false); st != 0) return st;
  ORV_REPORT("RADARSAT image extracted", REPORT_CHECKPOINT);
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
