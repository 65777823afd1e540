#pragma once
// ENVISAT ASAR level-0 extraction tool: reads its configuration from a
// profile file, runs the walk over the level-0 product, and writes for each
// swath (IM: one, AP: one per polarisation) the raw raster with its header,
// the elevation antenna pattern and the synthetic chirp. The per-line window
// codes, missing flags and packet counters stay for the focuser.
#include <string>

#include "ingest/envisat/asar_level0.h"
#include "ingest/envisat/asar_records.h"

class enviextractor_conf {
 public:
  int readpar(const char* file);
  int checkpar();
  int ReportLevel = 1;
  std::string ReportFilename = "enviextractor_report.txt";
  int Incore = 0;
  int Memory = 256;
  int Verbose = 0;
  int Packet_Type = 0;  // 0 echo, 1 calibration, 2 noise
};

class enviextractor_input {
 public:
  int readpar(const char* file);
  int checkpar();
  std::string ASA_Level0_File, ASA_INS_File, ASA_XCA_File, ASA_XCH_File, Orbit_File;
  int PacketsToExtract = 0;  // percent of the scene, in spite of the name
  int PacketsToSkip = 0;     // percent of the scene
};

class enviextractor_output {
 public:
  int readpar(const char* file);
  std::string OutputRawFile, OutputChirpFile, OutputAntennaPatternFile;
};

class enviextractor {
 public:
  // Reads the three configuration sections of `file` and checks them.
  int readpar(const char* file);
  // Extraction, headers, antenna pattern and chirp. 0 or the first failure.
  int run();

  // Per line of output `n` (0 or 1): window code, missing flag, packet
  // counter. Null until an extraction has finished.
  const int* getSwstVector(int n = 0) const { return ready(n) ? ext.swst[n].data() : nullptr; }
  const int* getMissingVector(int n = 0) const { return ready(n) ? ext.missing[n].data() : nullptr; }
  const int* getSequenceVector(int n = 0) const { return ready(n) ? ext.sequence[n].data() : nullptr; }
  int getVectorLength(int n = 0) const { return ready(n) ? static_cast<int>(ext.swst[n].size()) : 0; }
  // Raw raster of swath n (0-based): OutputRawFile, or in multi-file modes
  // OutputRawFile with n + 1 appended.
  std::string outputName(int n) const;
  std::string numbered(const std::string& name, int n) const;

  enviextractor_conf conf;
  enviextractor_input input;
  enviextractor_output output;
  extconf ext;
  sarpar par[5];
  int swaths = 0;

 private:
  bool ready(int n) const { return ext.done && n >= 0 && n < 2 && !ext.swst[n].empty(); }
};

// Header of a swath's raw raster: "<output>.hdr" with the raster layout, its
// region, sampling constants, state vectors (when an orbit file is given),
// identification, pulse and swath.
int write_IMhdr(const std::string& output, const sarpar* par, const std::string& level0, const std::string& orbit);
int write_APhdr(const std::string& output, const sarpar* par, const std::string& level0, const std::string& orbit);
int write_WShdr(const std::string& output, const sarpar* par, const std::string& level0, const std::string& orbit);
// ExtractionParameters and Paths sections of a WS scene's parameter file.
int write_param(const std::string& file, const sarpar* par, const extconf* conf, const std::string& level0,
                const std::string& ins, int swaths);
