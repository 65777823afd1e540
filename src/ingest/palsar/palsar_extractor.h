#pragma once
// ALOS PALSAR level-1.0 extraction, JAXA and ERSDAC layouts: reads the CEOS
// leader and one image file (one polarisation), fills the raw data record,
// writes the raw raster (each line prefixed with its sampling window start as
// a 32-bit float) with its ".hdr", repairs lost lines up to the leader's
// limit with flagged repeats, and writes the PALSAR down-chirp replica.
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "product/general_sar_base.h"
#include "product/product_aggregates.h"

class ATPalExtractor : public ProcessingTool {
 public:
  ATPalExtractor();
  ~ATPalExtractor() override;

  void refreshParameters() override;
  int InitProcessing(const std::string& file, int channel);
  int runall(const std::string& file, int channel);
  // Raw_Focused 0: extract(); 1: extract_l11(); anything else: nothing.
  int run();

  // check_producer, leader, image file, then the chirp of each channel.
  int extract();
  int extract_lea10Jaxa();
  int extract_L10Jaxa();
  int extract_lea10Ersdac();
  int extract_L10Ersdac();
  // Level 1.1 side path: the focused samples of the image file into an
  // azimuth-focused raster "<OutputFile>" with its ".hdr"; 1 with a report
  // when the leader is not of level 1.1.
  int extract_l11();
  // Chirp of a channel: N = T fs samples of exp(-j pi B/T t^2) / sqrt(fs/B).
  int extract_chirp(int channel, std::vector<fcomplex>& chirp) const;
  // Reads the record "<header>.hdr" and writes the chirp raster `out` of the
  // channel (numbered "<out><channel + 1>" only with several channels).
  int write_chirp(const std::string& header, const std::string& out, int channel, const std::string& antenna);

  const int* getSwstVector() const { return ready_ ? swst.data() : nullptr; }
  const int* getMissingVector() const { return ready_ ? missing.data() : nullptr; }
  const int* getSequenceVector() const { return ready_ ? sequence.data() : nullptr; }
  int getVectorLength() const { return ready_ ? static_cast<int>(swst.size()) : 0; }
  // Raster name and polarisation text ("H/V") of a channel; 1 outside the mode.
  int getOutputFilename(int channel, std::string& name) const;
  int getPolarization(int channel, std::string& pol) const;
  int getNpol() const { return npol_; }
  int getMissingLines() const { return missingLines_; }

  // Element table, in order, after the common values of the tool.
  std::string LeaFileName;
  std::string RawDataName;
  std::string Orbit_Filename;
  std::string OutputFile;
  std::string OutputChirp;
  std::string OutputAntenna;
  int SkipLines = 0;
  int ExtractLines = 0;
  int Raw_Focused = 0;

  // 0 single, 1 double, 2 quad polarisation, 3 ScanSAR.
  int acquisitionMode = 0;
  bool isErsdac = false;
  int numberOfChannels = 1;
  int maxMissingLines = 0;
  double biasI = 0.0, biasQ = 0.0, gainH = 1.0, gainV = 1.0;
  GeneralRAWData record;  // the channel's record (strip modes: one)
  std::vector<int> swst, missing, sequence;

 private:
  int readLeader(bool ersdac);
  int walkImage(bool ersdac);
  int ready_ = 0;
  int npol_ = 1;
  int missingLines_ = 0;
  std::string polarization_ = "H/H";
};
