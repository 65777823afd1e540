#pragma once
// Multi-looking of a focused stripmap image by integer factors: an
// amplitude image by incoherent averaging over a twice-oversampled,
// Doppler-deramped image (run), or a complex image by coherent averaging
// (coherml).
#include <string>

#include "base/fcomplex.h"
#include "product/general_sar.h"
#include "product/general_sar_base.h"

class ATstripmlook : public ProcessingTool {
 public:
  ATstripmlook();
  ~ATstripmlook() override;

  // Opens the report "ATstripmlook REPORT", reads and checks the parameters.
  int InitProcessing(const std::string& file, int channel);
  // Records of SLCInput + ".hdr" (input and output copies). Status of GSread.
  int readSLCData();
  int run();
  int coherml();
  // InitProcessing, readSLCData, coherml or run by CoherentFlag, FinalizeProcessing.
  int runall(const std::string& file, int channel);
  void refreshParameters() override;

  // Mean of each az x rg cell of a block of `lines` x `samples` samples
  // into `out` (lines/az x samples/rg samples; cells past the block's end are
  // left out).
  static void Presum_data(const fcomplex* in, int lines, int samples, int az, int rg, fcomplex* out);

  // Element table, in order, after the common values of the tool.
  std::string SLCInput;
  int RangeMLFactor = 1;
  int AzimuthMLFactor = 1;
  std::string outputFullRootName;
  int CoherentFlag = 0;

  GeneralSAR input;
  GeneralSAR output;

 private:
  // Output record: raster name and layout, times of the averaged grid.
  void describeOutput(int lines, int samples, int cellType);
  bool recordRead_ = false;
};

// The chain's multi-look step on a focused product `slc` (record
// slc + ".hdr"): 4 looks in range and, in azimuth, 4 times the rounded ratio
// of ground-range to azimuth spacing, into slc + "_mla". Status of the run.
int stripmlookFocusedProduct(const std::string& slc, int memory, int verbose, int reportLevel,
                             const std::string& reportFile);
