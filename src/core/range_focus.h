#pragma once
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "core/fft.h"

// Range compression: each raw line is cross-correlated with the transmitted
// replica (multiplication by the conjugate of the replica's spectrum), and
// lines whose sampling window started late are moved right so that every
// output row starts at the common fast time SWST_MIN. The correlation output
// starts at the replica's first sample; its last replicaLen - 1 samples are
// dropped, so a line of S samples gives V = S - replicaLen + 1 valid ones and
// an output row holds O = V + D samples, D being the largest shift.

// Batched correlator shared by rangefoc, ATRangeFocuser and the benchmarks:
// rows of `fftLength` samples (pitch fftLength), the first samples of each
// holding the data and the rest zero, are correlated in place in chunks that
// stay in cache. Plans are made once.
class RangeCompressor {
 public:
  // Replica of replicaLen samples; fftLength >= replicaLen. Status 0, 1 for
  // bad lengths, or the plan status.
  int init(const fcomplex* replica, int replicaLen, int fftLength);
  // Correlates `rows` rows at pitch fftLength() in place. The result equals
  // forward transform, product with the conjugate replica spectrum, backward
  // transform with 1/N.
  void compress(fcomplex* rows, int nrows);
  int fftLength() const { return n_; }
  int chunkRows() const { return chunk_; }
  // Conjugate replica spectrum, already divided by N.
  const FFTBuffer& spectrum() const { return conjSpectrum_; }

 private:
  int n_ = 0;
  int chunk_ = 0;
  FFTBuffer conjSpectrum_;
  FFTPlan forward_, backward_;
};

// Maximum shift D = round((swstMax - swstMin) fs) and FFT length
// genpow(samples + D).
int range_max_shift(double swstMin, double swstMax, double fs);

// Flat parameter record of rangefoc.
struct RangeFocParams {
  std::string inputFile;   // raw raster (per line: optional SWST float, then samples)
  std::string outputFile;  // range-focused raster (FLOAT_COMPLEX, no prefix)
  double fs = 0.0;         // range sampling frequency, Hz
  double swstMin = 0.0;    // s
  double swstMax = 0.0;    // s
  int delay = 0;           // integer delay d in pulse repetition intervals (in-core prefix rule)
  double prf = 0.0;        // Hz, for the in-core prefix rule
  int lines = 0;
  int samples = 0;
  // The input is a temporary the job erases: the output may take over its
  // file and be written over the lines already read (see handOverFile).
  bool overwriteInput = false;
};

// Work record of rangefoc.
struct RangeFocWork {
  int verbose = 0;
  int outSamples = 0;  // O, set by rangefoc / init_buffer
  int outLines = 0;
  const fcomplex* replica = nullptr;
  int replicaLen = 0;
  int Flag_ortog = 0;  // stream orthogonalisation with ortogN
  int prefix = 1;      // lines carry the SWST float
  int incore = 0;
  FFTBuffer data;           // in core: N * lines samples, then O * lines after rangefoc
  std::vector<int> shift;   // in core: per-line shift in samples
  int linesPerBlock = 0;    // file path: lines per pass (0: 1024)
  bool inputOverwritten = false;  // set when the output took over the input's file
};

// Range-focuses params.inputFile into params.outputFile, or work.data in
// place when work.incore is set (after init_buffer). Status 0; 1 replica
// longer than the line or a wrong SWST; 4, 5, 7, 9 as usual.
int rangefoc(const RangeFocParams& params, RangeFocWork& work);
// Prepares the in-core case: sizes, shift array, and the whole raw file read
// into work.data at pitch N.
int init_buffer(const RangeFocParams& params, RangeFocWork& work);
// Writes outSamples * outLines samples of work.data to params.outputFile and
// frees the buffers.
int dest_buffer(const RangeFocParams& params, RangeFocWork& work);
