#pragma once
// Radio-frequency interference removal for L-band raw data. Each line's
// spectrum is compared with the spectrum a clean line of its block shows:
// bins that stand out in the whole block (persistent interferers) or in one
// line (isolated bursts) are emptied and the power they held is given back
// to the line; a line hit all over is replaced by noise of the block's
// spectrum. The raster is rewritten block by block with its line prefixes.
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "core/fft.h"
#include "product/general_sar_base.h"

class SARPulse_Obj;

// Welch power spectral density of n samples with segments of L (parabolic
// window, half overlap): out[0..L-1].
int PSD(const fcomplex* x, int n, double* out, int L);

// Zero-mean unit-variance Gaussian samples of the polar method on a fixed-seed
// uniform generator; the second value of each pair is kept for the next call.
double rfiGaussian();
// Back to the state of program start (for reproducible runs in one process).
void rfiGaussianReset();

class RFIblock {
 public:
  RFIblock(const SARPulse_Obj& pulse, int lines, int samples, int periodogram);
  ~RFIblock();
  RFIblock(const RFIblock&) = delete;
  RFIblock& operator=(const RFIblock&) = delete;

  // Buffers and plans; 1 with a report when the pulse is unknown, 7
  // without memory.
  int CreateBuffers(int report);
  int DestroyBuffers();
  // Cleans `in` (lines x samples) into `out`.
  int correct();
  // Mask (lines x F: 0 clean, 1 persistent, 2 isolated, 3 invalid line),
  // measured power, trend power and deviation per line.
  int WriteReport(char* mask, double* power, double* trend, double* deviation) const;
  int getFreqSampleNumber(int* f) const {
    *f = F_;
    return 0;
  }

  const fcomplex* in = nullptr;
  fcomplex* out = nullptr;
  double thresholdIsolate = 4.0, thresholdPersistent = 2.0, thresholdStd = 7.0, thresholdPowerLoss = 0.25;
  float percentileLow = 0.25f, percentileHigh = 0.25f;

 private:
  double trend(double line) const { return a0_ + a1_ * line; }
  const SARPulse_Obj& pulse_;
  int lines_, samples_, P_, F_ = 0, report_ = 0;
  double a0_ = 0.0, a1_ = 0.0;
  // Clean spectrum of the block (running median over frequency of the
  // median over lines), line powers, mean level and deviation of each line,
  // and the lines' Welch spectra (lines x periodogram bins).
  std::vector<double> reference_, power_, meanDb_, deviation_, linePsd_;
  std::vector<fcomplex> freq_;
  std::vector<char> mask_;
  FFTPlan forward_{}, backward_{};
};

class ATPalsarRFIRemoval : public GeneralSAR_Base {
 public:
  ATPalsarRFIRemoval();
  ~ATPalsarRFIRemoval() override;
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override;
  int checkpar();
  int readpar(const std::string& file, int channel);
  int writepar(const std::string& file, int channel);
  int InitProcessing(const std::string& file, int channel);
  int FinalizeProcessing(const std::string& file, int channel);
  int runall(const std::string& file, int channel);
  // Cleans RawData into OutputFile (record and line prefixes kept); with
  // Verbose the side rasters "<OutputFile>_rfimask", "_corrstd", "_idlpwr",
  // "_realpwr".
  int run();

  int Memory = 256;
  std::string ReportFilename = "ATPalsarRFIRemoval.report";
  int ReportLevel = 1;
  int Incore = 0;
  int Verbose = 1;
  std::string RawData;
  std::string OutputFile;
  int BlockSize = 256;
  int PeriodogramSize = 256;
  double ThresholdPersistent = 2.0;
  double ThresholdIsolate = 4.0;
  double ThresholdPowerLoss = 0.25;
  double ThresholdStd = 7.0;
  float PercentileLow = 0.25f;
  float PercentileHigh = 0.25f;
};
