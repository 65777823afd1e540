#include "focus/sensors/level0_chain.h"

#include <cstdio>

#include "base/status.h"
#include "diag/report.h"
#include "focus/sar_focuser.h"
#include "focus/stripmap_general_focuser.h"
#include "product/profile.h"

int level0CalledError(int status) {
  ORV_REPORT_CALLED_ERROR();
  return status;
}

void nameLevel0Stages(FocuserWork& work, SARFocuser& chain, const std::string& root,
                      const std::string& antennaSuffix, bool chainUsesAntenna) {
  work.rawFile = root + ".extracted";
  work.chirpFile = root + ".chirp";
  work.antennaFile = antennaSuffix.empty() ? std::string() : root + antennaSuffix;
  work.rgfocFile = root + ".rgfoc";
  work.outputFile = root;
  chain.RawDataFile = work.rawFile;
  chain.ChirpFile = work.chirpFile;
  chain.AntennaFile = chainUsesAntenna ? work.antennaFile : "antenna not exist";
  chain.OutputFilename = root;
}

int readWorkRecords(FocuserWork& work, bool withAntenna) {
  if (int st = work.raw.GSread(work.rawFile + ".hdr"); st != 0) return level0CalledError(st);
  if (!work.chirpFile.empty()) {
    if (int st = work.chirp.GSread(work.chirpFile + ".hdr"); st != 0)
      return level0CalledError(st);
  }
  if (withAntenna && !work.antennaFile.empty()) {
    if (int st = work.antenna.GSread(work.antennaFile + ".hdr"); st != 0)
      return level0CalledError(st);
  }
  return 0;
}

int configureLevel0Chain(SARFocuser_conf& conf, const std::string& profile, bool announceDefault) {
  int memory = 256;
  if (GetMyProfileIntArray("sarfocuserConfiguration", "Memory", &memory, 1, profile) != 0) {
    memory = 256;
    if (announceDefault) ORV_REPORT("Memory set to default value: 256Mb", REPORT_WARNING);
  }
  conf.Memory = memory;
  conf.Incore = 0;
  if (int st = conf.readconf(profile); st != 0) return level0CalledError(st);
  conf.Azblk = 1024;
  conf.DCref = 0.0;
  conf.Flag_swstal = 1;
  conf.Flag_ortog = 1;
  conf.Incore = 0;
  return 0;
}

int level0SceneFocuser::checkLeader(const std::string& leader) const {
  const char* failure = leader.empty()       ? "LEA filename not selected!"
                        : !hasExtractor()    ? texts_.extractorMissing
                        : !fileOpens(leader) ? "LEA file does not exist!"
                                             : nullptr;
  if (!failure) return 0;
  ORV_REPORT(failure, REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}

int level0SceneFocuser::initialize() {
  if (int st = stripmapGeneralFocuser::initialize(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  if (int st = configureLevel0Chain(conf(), configurationFilename, texts_.announceMemoryDefault);
      st != 0)
    return st;
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int level0SceneFocuser::initialize_modular() {
  if (int st = stripmapGeneralFocuserModular::initialize_modular(); st != 0) return st;
  if (int st = nameStages(); st != 0) return st;
  prepareModularExtraction();
  if (int st = setConfFile(configurationFilename, 0); st != 0) return level0CalledError(st);
  ORV_REPORT("Initialization completed", REPORT_CHECKPOINT);
  return 0;
}

int level0SceneFocuser::ingestion(const std::string& raw, const std::string& chirp,
                                  const std::string& antenna) {
  if (outputSelected_) return STATUS_BAD_CONDITION;
  work.rawFile = raw;
  work.chirpFile = chirp;
  redirectExtraction(raw, chirp, antenna);
  return ingestion();
}

int level0SceneFocuser::ingestion() {
  ORV_REPORT("Starting ingestion", REPORT_CHECKPOINT);
  if (!hasExtractor()) {
    ORV_REPORT(texts_.extractorMissing, REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (int st = extract(); st != 0) return st;
  if (int st = readRecords(); st != 0) return st;
  ORV_REPORT(texts_.extracted, REPORT_CHECKPOINT);
  return 0;
}
