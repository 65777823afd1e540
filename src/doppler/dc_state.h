#pragma once
// Shared state of the Doppler centroid estimation: the raster description,
// the processing state filled by the caller from the configuration, the
// per-bin results of the scan and the blocks used for the ambiguity.
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "base/fcomplex.h"

// The range-compressed raster the centroid is estimated from.
struct DcEstInput {
  std::string rasterFile;   // FLOAT_COMPLEX raster, rows of `samples` samples
  std::string outDir;       // folder that receives "DCEST_resume.txt"
  int samples = 0;          // samples per line (line width)
  int lines = 0;            // lines; trimmed to whole bin rows by setprocbuf
  double prf = 0.0;         // pulse repetition frequency, Hz
  double velocity = 0.0;    // platform velocity, m/s
  int byteOrder = 0;        // byte order of the raster: 0 little-endian, 1 big-endian
  int64_t headerOffset = 0; // bytes before the first line
  double timeOrigin = 0.0;  // time origin of the polynomial, written as "DC_time_origin_s"
};

// One bin of the scan: a block of `blocks` x `blockl` samples.
struct DcBin {
  int range = 0;  // range centre, samples
  int line = 0;   // line centre
  int valid = 0;  // 1 when the lag-one estimate holds
  double dcWrapped = 0.0;  // wrapped centroid, fraction of the PRF
  double contrast = 0.0;
  double power = 0.0;
  double noise = 0.0;
  double snr = 0.0;
  double krStd = 0.0;  // variance of the phase estimate
};

// A high-contrast block processed by the multi-look beat frequency estimator.
struct MlbfBlock {
  int range = 0;  // block centre, samples
  int line = 0;   // block centre, lines
  std::vector<double> estimates;  // one per look distance (nMlbf), PRF units
  std::vector<double> quality;    // one per look distance (nMlbf)
  int flag = 0;
};

// A low-contrast block processed by the phase-slope estimator.
struct WdarBlock {
  int range = 0;
  int line = 0;
  double value = 0.0;  // PRF units
};

struct DcEstState {
  int blocks = 256;          // "Blocks": samples per bin, range
  int blockl = 2048;         // "Blockl": lines per bin, azimuth
  int64_t memory = 0;        // bytes allowed for the read buffer (job memory MB << 20)
  int nBest = 10;            // "Nbestblocks": wanted, afterwards found
  int nWdar = 5;             // "Nwdarbloks": wanted, afterwards found
  int nMlbf = 8;             // "Nummlbf": look distances per block
  double anLen = 10.0;       // "AnLen": antenna length, m
  double rgBand = 0.72;      // "RgBand": used fraction of the range band
  double fc = 0.0;           // carrier frequency, Hz
  double fs = 0.0;           // range sampling rate, Hz
  double maxAmb = 0.0;       // "Maxamb"
  double minAmb = 0.0;       // "Minamb"
  double kThr = 0.0;         // "Kthr": carried, not applied
  double sThr = 20.0;        // "Sthr": power to lag-one ratio limit of a bin
  double varTh = 0.5;        // "Varth": std limit of the ambiguity estimates
  double r0 = 0.0;           // theoretic autocorrelation, lag 0
  double r1 = 0.0;           // theoretic autocorrelation, lag 1
  std::vector<double> lookDist;  // normalised look distances (nMlbf)
  double lookBf = 0.0;       // "Lookbf"
  double lookBt = 0.0;       // "Lookbt"
  double lookRp = 0.0;       // "Lookrp"
  double lookRs = 0.0;       // "Lookrs"
  int fLength = 21;          // "Flength"
  int decFac = 3;            // "Decfac"
  double dftStep = 0.0;      // "Dftstep"
  double peakWid = 0.0;      // "Peakwid"
  double wdarOffset = 0.0;   // computed WDAR frequency offset
  int ambFlag = 0;           // "Amb_flag": 0 none, 1 estimate, 2 geometry
  std::array<int, 7> polMask{1, 1, 1, 1, 1, 1, 1};  // "Pol_weights"
  int ambiguity = 0;         // result

  // Bins of the scan.
  int nBinsX = 0;            // bins per line
  int nBinsY = 0;            // bins per column
  int nBins = 0;             // bins scanned
  std::vector<DcBin> bins;   // nBinsX * nBinsY, row by row

  // Blocks of the ambiguity estimation (sized nBest / nWdar by setprocbuf).
  std::vector<MlbfBlock> mlbfBlocks;
  std::vector<WdarBlock> wdarBlocks;

  // Two block work buffers of blocks x blockl samples.
  std::vector<fcomplex> blockBuf;
  std::vector<fcomplex> blockBuf2;

  // Contrast maps, cmWidth x cmHeight cells of patchs x patchl samples,
  // row-major. contrastPow: mean power; contrastMap: mean |x|^4, and after
  // getcontrast the smoothed contrast.
  int cmWidth = 0;
  int cmHeight = 0;
  std::vector<float> contrastPow;
  std::vector<float> contrastMap;

  // Read buffer and its size in bin rows; where the memory budget holds
  // two, the next rows are read into the second while the first is scanned.
  int rowsPerRead = 0;
  std::vector<fcomplex> readBuf;
  std::vector<fcomplex> readAhead;

  // Results of the ambiguity estimation, for the resume file.
  int mlbfGood = 0;          // good MLBF estimates
  double mlbfMean = 0.0;
  double mlbfStd = 0.0;
  int mlbfAmbiguity = 0;
  int wdarGood = 0;          // good WDAR estimates
  double wdarMean = 0.0;
  double wdarStd = 0.0;
  int wdarOffsetAvailable = 0;  // 1 once wdarOffset is computed
  int geomAmbiguity = 0;
  int mlbfGoodBlocks = 0;       // blocks with at least one good MLBF estimate
  int wdarAmbiguity = 0;
  double mlbfStdErr = 0.0;      // standard error of the MLBF mean (per block)
  double wdarStdErr = 0.0;      // standard error of the WDAR mean
  std::string ambiguitySource;  // how the ambiguity was chosen

  int patchs = 8;            // "Patchs": contrast cell width, samples
  int patchl = 32;           // "Patchl": contrast cell height, lines
  double fftRgPrc = 0.0005;  // "Fftrgprc"
  double fftAzPrc = 0.0005;  // "Fftazprc"
  double geomDoppler = 0.0;  // Doppler from geometry, Hz
  int dswst = 0;             // "Dswst": contrast map margin, samples
  int verbose = 0;
  int inMemory = 0;          // 1: the raster is at `data`, no file is read
  const fcomplex* data = nullptr;
};
