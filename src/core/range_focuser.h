#pragma once
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "product/general_sar_base.h"

class GeneralSAR;

// Range focusing tool of the modular chain: reads the raw raster named
// RawData (record RawData + ".hdr"), correlates each line with the replica,
// aligns the lines to SWST_MIN and writes OutputFile with its record.
class ATRangeFocuser : public GeneralSAR_Base {
 public:
  ATRangeFocuser();
  ~ATRangeFocuser() override;

  int readpar(const std::string& file, int channel);
  int writepar(const std::string& file, int channel);
  // Opens the report "ATRangeFocuser REPORT", reads and checks the parameters.
  int InitProcessing(const std::string& file, int channel);
  int run();
  int FinalizeProcessing(const std::string& file, int channel);
  // InitProcessing, run, FinalizeProcessing.
  int runall(const std::string& file, int channel);
  int createBuffers() override;
  int destroyBuffers() override;
  void refreshParameters() override;
  // Lines to skip and to process from DataToSkip / DataToProcess and the
  // record (bursts for a SCANSAR scene). 1 for a record that is not raw data.
  int computeLines(GeneralSAR& record);
  int checkpar();

  // Element table, in order.
  int Memory = 256;  // MiB
  std::string ReportFilename = "ATRangeFocuser.report";
  int ReportLevel = 1;
  int Incore = 0;
  int Verbose = 1;
  std::string RawData;
  std::string ChirpFile;
  std::string OutputFile;
  int DataToSkip = 0;     // percent of the scene skipped at its start
  int DataToProcess = 0;  // percent processed; 0: the rest
  std::vector<fcomplex> ChirpBuf;  // replica already in memory (not persisted)
  int ChirpLen = 0;
  double ChirpBand = 0.0;
  double ChirpFs = 0.0;

  // Channel orthogonalisation before compression (from the configuration).
  int Flag_ortog = 1;

  int getLinesToProcess() const { return linesToProcess_; }
  int getLinesToSkip() const { return linesToSkip_; }

 private:
  int linesToProcess_ = 0;
  int linesToSkip_ = 0;
};
