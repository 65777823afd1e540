#pragma once
// ERS-1/2 level-0 extraction: reads the CEOS leader and image file of a scene,
// fills the raw data record, writes the raw raster (each line prefixed with
// its sampling window start as a 32-bit float) with its ".hdr", optionally
// the generated chirp, and keeps three per-line vectors for the focuser.
#include <string>
#include <vector>

#include "product/general_sar_base.h"
#include "product/product_aggregates.h"

class ATERSExtractor : public ProcessingTool {
 public:
  ATERSExtractor();
  ~ATERSExtractor() override;

  void refreshParameters() override;
  // Opens the report "ATERSExtractor REPORT", reads and checks the parameters.
  int InitProcessing(const std::string& file, int channel);
  // Leader, orbit, image pass and raster, record header, chirp. 0 or the
  // status of the first failure (9 not opened, 4 short read, 7 memory).
  int run();
  // 1 and nothing done when the document names a ConfigurationFile;
  // otherwise InitProcessing, run, FinalizeProcessing.
  int runall(const std::string& file, int channel);
  // Reads OutputFile's header back and writes the chirp generated from the
  // pulse parameters into ChirpFile.
  int ExtractChirp();

  // Steps of run(), public for the focuser's tests.
  int readLeader();
  int readImage();

  // Per output line: accepted window code, missing flag (1 when the record
  // number is not its position + 1), record number. Null until an
  // extraction has finished.
  const int* getSwstVector() const { return vectorsReady_ ? swstVector.data() : nullptr; }
  const int* getMissingVector() const { return vectorsReady_ ? missingVector.data() : nullptr; }
  const int* getCounterVector() const { return vectorsReady_ ? counterVector.data() : nullptr; }
  // Entries of each vector (the lines written).
  int getVectorLength() const { return vectorsReady_ ? static_cast<int>(swstVector.size()) : 0; }
  int getMissingLines() const { return missingLines_; }

  // Element table, in order, after the common values of the tool.
  std::string ImgFilename;
  std::string LeaFilename;
  std::string OrbitFilename;
  std::string OutputFile;
  std::string ChirpFile;  // empty: no chirp written

  // Part of the scene to keep, in percent; set by the caller.
  int extractPercent = 0;
  int skipPercent = 0;

  // The record filled by the extraction (raster OutputFile).
  GeneralRAWData rawData;

  std::vector<int> swstVector;
  std::vector<int> missingVector;
  std::vector<int> counterVector;

 private:
  bool vectorsReady_ = false;
  int missingLines_ = 0;
  double biasI_ = 0.0, biasQ_ = 0.0;
  double chirpCoefficient_ = 0.0;
};
