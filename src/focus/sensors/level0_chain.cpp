#include "focus/sensors/level0_chain.h"

#include <cstdio>

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
