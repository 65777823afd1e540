#include "doppler/dc_driver.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <functional>
#include <future>
#include <memory>
#include <new>
#include <utility>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "doppler/dc_polynomial.h"
#include "product/byte_order.h"
#include "product/data_file.h"
#include "product/profile.h"

namespace {

int fail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define DC_FAIL(message, status) fail((message), (status), __LINE__, __func__)

int calledError(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function,
                 __FILE__);
  return status;
}
#define DC_CALLED(status) calledError((status), __LINE__, __func__)

struct FileCloser {
  void operator()(std::FILE* f) const { std::fclose(f); }
};
using FilePtr = std::unique_ptr<std::FILE, FileCloser>;

// Puts the samples of a raster read from disk into host order.
void toHostOrder(fcomplex* samples, size_t n, int fileOrder) {
  if (fileOrder == host_byte_order()) return;
  float* f = reinterpret_cast<float*>(samples);
  for (size_t i = 0; i < 2 * n; ++i) swp4(&f[i]);
}

// Moving mean over `w` cells along a strided line of n cells; the window is
// cut at the ends, the divisor stays w.
void movingMean(float* line, int n, int stride, int w, std::vector<double>& work) {
  work.assign(static_cast<size_t>(n), 0.0);
  const int half = w / 2;
  for (int i = 0; i < n; ++i) {
    double s = 0.0;
    const int lo = std::max(0, i - half);
    const int hi = std::min(n - 1, i - half + w - 1);
    for (int j = lo; j <= hi; ++j) s += line[static_cast<size_t>(j) * stride];
    work[static_cast<size_t>(i)] = s / w;
  }
  for (int i = 0; i < n; ++i)
    line[static_cast<size_t>(i) * stride] = static_cast<float>(work[static_cast<size_t>(i)]);
}

// Lag-zero and lag-one sums of a bin along azimuth.
struct BinSums {
  double p = 0.0, q = 0.0, re = 0.0, im = 0.0;
};

// Estimate of a bin from its sums.
void finishBin(const BinSums& sums, const DcEstState& st, DcBin& bin) {
  const double p = sums.p, q = sums.q;
  const int ns = st.blocks;
  const dcomplex r(sums.re, sums.im);
  bin.valid = 0;
  bin.dcWrapped = 0.0;
  bin.contrast = 0.0;
  bin.power = 0.0;
  bin.noise = 0.0;
  if (q == 0.0) return;
  const double mean = p / ns;
  const double a = std::abs(r) / ns;
  if (!(mean / a < st.sThr)) return;  // too little azimuth correlation (or a = 0)
  bin.valid = 1;
  bin.dcWrapped = std::arg(r) / (2.0 * consts::kPi);
  bin.contrast = double(st.blocks) * st.blockl * q / (p * p);
  bin.power = mean;
  bin.noise = mean - (st.r0 / st.r1) * a;
}

// One pass over the bin at (x0, y0), read in place from rows of `pitch`
// samples: the sums of dcBinEstimate and the power and fourth-power means
// of the bin's contrast cells. Row-major order visits the samples of every
// cell in the cell's own order, so each sum is the one of the separate
// loops, bit for bit. `cells` is scratch.
void scanBin(const fcomplex* rows, int pitch, int x0, int y0, DcEstState& st, DcBin& bin,
             std::vector<double>& cells) {
  const int ns = st.blocks, nl = st.blockl, ps = st.patchs, pl = st.patchl;
  const int cellsX = ns / ps;
  const double norm = 1.0 / (static_cast<double>(ps) * pl);
  cells.assign(2 * static_cast<size_t>(cellsX), 0.0);
  double* c2 = cells.data();
  double* c4 = c2 + cellsX;
  BinSums sums;
  for (int l = 0; l < nl; ++l) {
    const fcomplex* x = rows + static_cast<size_t>(l) * pitch + x0;
    double p = sums.p, q = sums.q;
    for (int cx = 0; cx < cellsX; ++cx) {
      double s2 = c2[cx], s4 = c4[cx];
      for (int s = cx * ps; s < (cx + 1) * ps; ++s) {
        const double a = std::norm(x[s]);
        p += a;
        q += a * a;
        s2 += a;
        s4 += a * a;
      }
      c2[cx] = s2;
      c4[cx] = s4;
    }
    sums.p = p;
    sums.q = q;
    if (l + 1 < nl) {
      const fcomplex* y = x + pitch;
      double re = sums.re, im = sums.im;
      for (int s = 0; s < ns; ++s) {
        // conj(x) y
        re += double(x[s].real()) * y[s].real() + double(x[s].imag()) * y[s].imag();
        im += double(x[s].real()) * y[s].imag() - double(x[s].imag()) * y[s].real();
      }
      sums.re = re;
      sums.im = im;
    }
    if ((l + 1) % pl == 0) {
      const size_t row = static_cast<size_t>(y0 / pl + l / pl) * st.cmWidth + x0 / ps;
      for (int cx = 0; cx < cellsX; ++cx) {
        st.contrastPow[row + cx] += static_cast<float>(c2[cx] * norm);
        st.contrastMap[row + cx] += static_cast<float>(c4[cx] * norm);
        c2[cx] = 0.0;
        c4[cx] = 0.0;
      }
    }
  }
  finishBin(sums, st, bin);
}

// Scans one row of bins starting at line y0; `rows` points at its first line.
// `done` counts the bins scanned so far for the wait bar. Bins are
// independent (each owns its estimate and its own contrast cells), so they
// are shared among threads.
void scanBinRow(const fcomplex* rows, int samples, int y0, int binRow, DcEstState& st, int& done) {
  const int total = st.nBinsX * st.nBinsY;
  int count = 0;
  while (count < st.nBinsX && (count + 1) * st.blocks <= samples) ++count;
#pragma omp parallel if (count > 1)
  {
    std::vector<double> cells;
#pragma omp for schedule(dynamic, 1)
    for (int ix = 0; ix < count; ++ix) {
      const int x0 = ix * st.blocks;
      DcBin& bin = st.bins[static_cast<size_t>(binRow) * st.nBinsX + ix];
      bin.range = x0 + st.blocks / 2;
      bin.line = y0 + st.blockl / 2;
      scanBin(rows, samples, x0, y0, st, bin, cells);
    }
  }
  for (int ix = 0; ix < count; ++ix) {
    ++done;
    if (st.verbose) waitbar_update(0, 100.0f * float(done) / float(total));
  }
}

}  // namespace

// ---- set-up --------------------------------------------------------------------------

int setprocbuf(DcEstInput& input, DcEstState& st) {
  if (st.blocks <= 0 || st.blockl <= 0 || st.patchs <= 0 || st.patchl <= 0)
    return DC_FAIL("Bin and cell sizes must be positive!", STATUS_BAD_PARAMETER);
  if (st.blockl % st.patchl != 0)
    return DC_FAIL("Blockl must be a multiple of patchl!", STATUS_BAD_PARAMETER);
  if (st.blocks % st.patchs != 0)
    return DC_FAIL("Blocks must be a multiple of patchs!", STATUS_BAD_PARAMETER);
  if (input.samples < 0 || input.lines < 0)
    return DC_FAIL("Negative raster size for DC estimation: " + input.rasterFile,
                   STATUS_BAD_PARAMETER);
  if (st.nMlbf < 0 || st.nBest < 0 || st.nWdar < 0)
    return DC_FAIL("Negative block count for DC estimation", STATUS_BAD_PARAMETER);

  st.nBinsX = input.samples / st.blocks;
  st.nBinsY = input.lines / st.blockl;
  st.nBins = 0;
  st.cmWidth = st.blocks * st.nBinsX / st.patchs;
  st.cmHeight = st.blockl * st.nBinsY / st.patchl;

  const int64_t rowBytes = int64_t(st.blockl) * input.samples * int64_t(sizeof(fcomplex));
  const int64_t m = rowBytes > 0 ? st.memory / rowBytes : 0;
  if (m < 1) {
    std::printf(
        "\nNot enough memory to perform DC estimation process.\nCheck Memory parameter in "
        "processing.conf file\n");
    return STATUS_BAD_CONDITION;
  }
  // No more bin rows than the raster has, and reads of about 64 MiB at
  // most: the scan goes through the raster once, so a larger buffer only
  // costs its filling.
  const int64_t byChunk = std::max<int64_t>(1, (int64_t(64) << 20) / rowBytes);
  st.rowsPerRead = static_cast<int>(std::min<int64_t>(std::min(m, byChunk), std::max(st.nBinsY, 1)));

  const size_t blockSamples = size_t(st.blocks) * size_t(st.blockl);
  try {
    if (!st.inMemory) {
      const size_t n = size_t(st.rowsPerRead) * size_t(st.blockl) * size_t(input.samples);
      st.readBuf.assign(n, fcomplex{});
      if (m >= 2 * int64_t(st.rowsPerRead) && st.rowsPerRead < st.nBinsY) st.readAhead.assign(n, fcomplex{});
    }
    st.bins.assign(size_t(st.nBinsX) * size_t(st.nBinsY), DcBin{});
    st.mlbfBlocks.assign(size_t(st.nBest), MlbfBlock{});
    for (MlbfBlock& b : st.mlbfBlocks) {
      b.estimates.assign(size_t(st.nMlbf), 0.0);
      b.quality.assign(size_t(st.nMlbf), 0.0);
    }
    st.wdarBlocks.assign(size_t(st.nWdar), WdarBlock{});
    st.blockBuf.assign(blockSamples, fcomplex{});
    st.blockBuf2.assign(blockSamples, fcomplex{});
    st.lookDist.assign(size_t(st.nMlbf), 0.0);
  } catch (const std::bad_alloc&) {
    return DC_FAIL("Not enough memory for the DC estimation buffers", STATUS_NO_MEMORY);
  }
  try {
    st.contrastPow.assign(size_t(st.cmWidth) * size_t(st.cmHeight), 0.0f);
    st.contrastMap.assign(size_t(st.cmWidth) * size_t(st.cmHeight), 0.0f);
  } catch (const std::bad_alloc&) {
    return DC_FAIL("Not enough memory for the contrast maps", STATUS_NO_MEMORY_ALT);
  }
  input.lines = st.blockl * st.nBinsY;
  return STATUS_OK;
}

double dcBspline3(double x) {
  const double a = std::fabs(x);
  if (a <= 1.0) return 2.0 / 3.0 - a * a + a * a * a / 2.0;
  if (a < 2.0) return 4.0 / 3.0 - 2.0 * a + a * a - a * a * a / 6.0;
  return 0.0;
}

int dcTheoreticAutocorrelation(const DcEstInput& input, DcEstState& st) {
  if (st.anLen <= 0.0 || input.prf <= 0.0)
    return DC_FAIL("Antenna length and PRF must be positive for DC estimation",
                   STATUS_BAD_PARAMETER);
  st.r0 = dcBspline3(0.0);
  st.r1 = dcBspline3(2.0 * input.velocity / (st.anLen * input.prf));
  if (st.r1 <= 0.0)
    return DC_FAIL("Azimuth spectrum wider than twice the PRF: no lag-one correlation",
                   STATUS_BAD_PARAMETER);
  return STATUS_OK;
}

// ---- scan ------------------------------------------------------------------------------

void dcBinEstimate(const fcomplex* block, const DcEstState& st, DcBin& bin) {
  // Sums along azimuth (down the columns), taken line by line for locality.
  BinSums sums;
  const int ns = st.blocks;
  for (int l = 0; l < st.blockl; ++l) {
    const fcomplex* x = block + size_t(l) * ns;
    for (int s = 0; s < ns; ++s) {
      const double a = std::norm(x[s]);
      sums.p += a;
      sums.q += a * a;
    }
    if (l + 1 == st.blockl) break;
    const fcomplex* y = x + ns;
    for (int s = 0; s < ns; ++s) {
      // conj(x) y
      sums.re += double(x[s].real()) * y[s].real() + double(x[s].imag()) * y[s].imag();
      sums.im += double(x[s].real()) * y[s].imag() - double(x[s].imag()) * y[s].real();
    }
  }
  finishBin(sums, st, bin);
}

int getnadcbins(DcEstInput& input, DcEstState& st) {
  FilePtr file;
  if (!st.inMemory) {
    file.reset(std::fopen(input.rasterFile.c_str(), "rb"));
    if (!file) return DC_FAIL("File not opened! " + input.rasterFile, STATUS_NOT_OPENED);
    if (input.headerOffset > 0 && fseeko(file.get(), input.headerOffset, SEEK_SET) != 0)
      return DC_FAIL("File reading failed! " + input.rasterFile, STATUS_READ_FAILED);
  } else if (!st.data && st.nBinsY > 0 && st.nBinsX > 0) {
    return DC_FAIL("No raster in memory for DC estimation", STATUS_BAD_PARAMETER);
  }
  if (st.verbose) waitbar_open("Doppler Centroid Estimation");

  const size_t lineSamples = size_t(input.samples);
  const size_t binRowSamples = size_t(st.blockl) * lineSamples;
  const int total = st.nBinsX * st.nBinsY;
  int done = 0;
  // Reads the bin rows from row0 on into buf, in host byte order.
  auto readRows = [&](int row0, std::vector<fcomplex>& buf) {
    const size_t n = size_t(std::min(st.rowsPerRead, st.nBinsY - row0)) * binRowSamples;
    if (std::fread(buf.data(), sizeof(fcomplex), n, file.get()) != n) return false;
    toHostOrder(buf.data(), n, input.byteOrder);
    return true;
  };
  std::future<bool> ahead;
  for (int row0 = 0; row0 < st.nBinsY; row0 += st.rowsPerRead) {
    const int rows = std::min(st.rowsPerRead, st.nBinsY - row0);
    const fcomplex* base = nullptr;
    if (st.inMemory) {
      base = st.data + size_t(row0) * binRowSamples;
    } else {
      bool ok;
      if (ahead.valid()) {
        ok = ahead.get();
        std::swap(st.readBuf, st.readAhead);
      } else {
        ok = readRows(row0, st.readBuf);
      }
      if (!ok) return DC_FAIL("File reading failed! " + input.rasterFile, STATUS_READ_FAILED);
      base = st.readBuf.data();
      const int next = row0 + st.rowsPerRead;
      if (!st.readAhead.empty() && next < st.nBinsY) {
        ahead = std::async(std::launch::async, readRows, next, std::ref(st.readAhead));
      }
    }
    for (int r = 0; r < rows; ++r) {
      scanBinRow(base + size_t(r) * binRowSamples, input.samples, (row0 + r) * st.blockl,
                 row0 + r, st, done);
    }
  }
  if (st.verbose) waitbar_close();
  st.nBins = total;
  return getcontrast(st);
}

int getcontrast(DcEstState& st) {
  const int w = st.cmWidth;
  const int h = st.cmHeight;
  if (w <= 0 || h <= 0) return STATUS_OK;
  const int winRow = st.blocks / 4 / st.patchs + 1;
  const int winCol = st.blockl / 4 / st.patchl + 1;
  std::vector<double> work;
  for (std::vector<float>* map : {&st.contrastPow, &st.contrastMap}) {
    for (int y = 0; y < h; ++y) movingMean(map->data() + size_t(y) * w, w, 1, winRow, work);
    for (int x = 0; x < w; ++x) movingMean(map->data() + x, h, w, winCol, work);
  }
  const int margin = st.dswst / st.patchs;
  for (int y = 0; y < h; ++y) {
    for (int x = 0; x < w; ++x) {
      const size_t i = size_t(y) * w + x;
      const float p = st.contrastPow[i];
      if (p > 0.0f && x > margin && x < w - margin)
        st.contrastMap[i] = st.contrastMap[i] / (p * p);
      else
        st.contrastMap[i] = 0.0f;
    }
  }
  return STATUS_OK;
}

// ---- driver --------------------------------------------------------------------------

int getnadcpoly(DcEstInput& input, DcEstState& st, double poly[7]) {
  if (st.verbose) std::printf("* Setting Processable Buffer\n");
  if (int s = setprocbuf(input, st); s != 0) return DC_CALLED(s);

  if (st.verbose) std::printf("* Calculating first two samples of theoretic autocorrelation\n");
  if (int s = dcTheoreticAutocorrelation(input, st); s != 0) return DC_CALLED(s);

  if (st.verbose) std::printf("* Getting bins for polynomial estimation\n");
  if (int s = getnadcbins(input, st); s != 0) return DC_CALLED(s);

  if (st.verbose) std::printf("* Polynomial estimation\n");
  if (int s = dcnapoly(input, st, poly); s != 0) return DC_CALLED(s);

  if (st.verbose) {
    std::printf("Constant term [Hz]: ............. %e\n", poly[0]);
    std::printf("I range [Hz/s]: ................. %e\n", poly[1]);
    std::printf("I azimuth [Hz/s]: ............... %e\n", poly[2]);
    std::printf("I range * I azimuth [Hz/s^2]: ... %e\n", poly[3]);
    std::printf("II range [Hz/s^2]: .............. %e\n", poly[4]);
    std::printf("III range [Hz/s^3]: ............. %e\n", poly[5]);
    std::printf("IV range [Hz/s^4]: .............. %e\n", poly[6]);
  }
  if (int s = infodump(input, st, poly); s != 0) return DC_CALLED(s);

  if (!st.inMemory) {
    std::vector<fcomplex>().swap(st.readBuf);
    std::vector<fcomplex>().swap(st.readAhead);
  }
  std::vector<fcomplex>().swap(st.blockBuf);
  std::vector<fcomplex>().swap(st.blockBuf2);
  return STATUS_OK;
}

// ---- resume file ---------------------------------------------------------------------

int infodump(const DcEstInput& input, const DcEstState& st, const double poly[7]) {
  const std::string path = input.outDir + "/" + "DCEST_resume.txt";
  {
    FilePtr f(std::fopen(path.c_str(), "w"));
    if (!f) return DC_FAIL("File not opened! " + path, STATUS_NOT_OPENED);
  }
  if (int s = resumefile(path, input, st, poly); s != 0) return DC_CALLED(s);
  return STATUS_OK;
}

int resumefile(const std::string& path, const DcEstInput& input, const DcEstState& st,
               const double poly[7]) {
  // Start from an empty tree: stale cached content must not leak in.
  FreeProfile(path);
  int err = 0;
  auto str = [&](const char* sec, const std::string& key, const std::string& v) {
    err |= WriteMyProfileString(sec, key, v, path);
  };
  auto i32 = [&](const char* sec, const std::string& key, int v) {
    err |= WriteMyProfileInt(sec, key, v, path);
  };
  auto dbl = [&](const char* sec, const std::string& key, double v) {
    err |= WriteMyProfileDouble(sec, key, v, path);
  };
  auto row = [&](const char* sec, const std::string& key, const std::vector<double>& v) {
    err |= WriteMyProfileDoubleArray(sec, key, v, path);
  };
  auto key = [](const char* fmt, int i) {
    char buf[64];
    std::snprintf(buf, sizeof buf, fmt, i);
    return std::string(buf);
  };

  str("Input_image_file", "File", input.rasterFile);
  str("Result_directory", "Directory", input.outDir);

  const char* pp = "Processing_parameters";
  i32(pp, "Record_used", input.lines);
  i32(pp, "Samples_in_record", input.samples);
  i32(pp, "Total_bins_scanned", st.nBins);
  i32(pp, "Record_in_bins", st.blockl);
  i32(pp, "Samples_in_bins", st.blocks);
  dbl(pp, "PRF", input.prf);
  dbl(pp, "Sampling_rate", st.fs);
  dbl(pp, "Platform_velocity", input.velocity);

  if (st.ambFlag == 1) {
    const char* ms = "MLBF_ambiguity_estimation";
    i32(ms, "MLBF_bins_processed", st.nBest);
    i32(ms, "MLBF_estimates_per_bin", st.nMlbf);
    dbl(ms, "Normalized_look_bandwidth", st.lookBf * st.rgBand);
    row(ms, "Normalized_look_distance", st.lookDist);
    i32(ms, "Good_MLBF_estimates", st.mlbfGood);
    dbl(ms, "Mean_of_good_MLBF_estimates", st.mlbfMean);
    dbl(ms, "Std_of_good_MLBF_estimates", st.mlbfStd);
    i32(ms, "MLBF_estimated_ambiguity", st.mlbfAmbiguity);
    i32(ms, "MLBF_bins_with_good_estimates", st.mlbfGoodBlocks);
    dbl(ms, "MLBF_quality_threshold", st.kThr);

    const char* ws = "WDAR_ambiguity_estimation";
    i32(ws, "WDAR_bins_processed", st.nWdar);
    i32(ws, "Good_WDAR_estimates", st.wdarGood);
    dbl(ws, "Mean_of_good_WDAR_estimates", st.wdarMean);
    dbl(ws, "Std_of_good_WDAR_estimates", st.wdarStd);
    if (st.wdarOffsetAvailable)
      dbl(ws, "WDAR_offset_frequency", st.wdarOffset);
    else
      str(ws, "WDAR_offset_frequency", "NOT_AVAILABLE");
    i32(ws, "Geometry_estimated_ambiguity", st.geomAmbiguity);
    i32(ws, "WDAR_estimated_ambiguity", st.wdarAmbiguity);
  }
  if (st.ambFlag == 2)
    i32("GEOM_ambiguity_estimation", "Geometry_estimated_ambiguity", st.geomAmbiguity);

  const char* ep = "Estimated_polynomial";
  dbl(ep, "Constant_term_Hz", poly[0]);
  dbl(ep, "Rg_Hz/s", poly[1]);
  dbl(ep, "Az_Hz/s", poly[2]);
  dbl(ep, "RgAz_Hz/s", poly[3]);
  dbl(ep, "RgRgz_Hz/s", poly[4]);
  dbl(ep, "RgRgRg_Hz/s", poly[5]);
  dbl(ep, "RgRgRgRg_Hz/s", poly[6]);
  i32(ep, "Estimated_ambiguity", st.ambiguity);
  str(ep, "Ambiguity_source", st.ambiguitySource.empty() ? "NOT_AVAILABLE" : st.ambiguitySource);
  dbl(ep, "DC_time_origin_s", input.timeOrigin);

  const char* ap = "Ambiguous_polynomial_estimation";
  str(ap, "Legend", "Bin Range Line DC_wrapped Residual SNR Contrast");
  for (size_t i = 0; i < st.bins.size() && int(i) < st.nBins; ++i) {
    const DcBin& b = st.bins[i];
    row(ap, key("Bin_%1d", int(i)),
        {double(i), double(b.range), double(b.line), b.dcWrapped, b.krStd, b.snr, b.contrast});
  }

  // Block rows exist only where the ambiguity was estimated from the data.
  const bool blocksDone = st.ambFlag == 1;
  const char* mb = "MBLF_Ambiguity_estimation";
  str(mb, "Legend", "Range Line Mean Std");
  const int nm = blocksDone ? std::min<int>(st.nBest, int(st.mlbfBlocks.size())) : 0;
  for (int i = 0; i < nm; ++i) {
    const MlbfBlock& b = st.mlbfBlocks[size_t(i)];
    double mean = 0.0;
    double var = 0.0;
    const size_t n = b.estimates.size();
    for (double e : b.estimates) mean += e;
    if (n > 0) mean /= double(n);
    for (double e : b.estimates) var += (e - mean) * (e - mean);
    if (n > 1) var /= double(n - 1);
    row(mb, key("MLBF_bin_%1d", i), {double(b.range), double(b.line), mean, std::sqrt(var)});
  }
  const char* me = "MBLF_estimates_in_each_block";
  str(me, "Legend", "Range Line Value");
  for (int i = 0; i < nm; ++i) {
    const MlbfBlock& b = st.mlbfBlocks[size_t(i)];
    std::vector<double> v{double(b.range), double(b.line)};
    v.insert(v.end(), b.estimates.begin(), b.estimates.end());
    row(me, key("MLBF_estimates_in_bin_%1d", i), v);
  }
  const char* wb = "WDAR_Ambiguity_estimation";
  str(wb, "Legend", "Range Line Value");
  const int nw = blocksDone ? std::min<int>(st.nWdar, int(st.wdarBlocks.size())) : 0;
  for (int i = 0; i < nw; ++i) {
    const WdarBlock& b = st.wdarBlocks[size_t(i)];
    row(wb, key("WDAR_bin_%1d", i), {double(b.range), double(b.line), b.value});
  }

  if (err != 0) {
    FreeProfile(path);
    return DC_FAIL("File writing failed! " + path, STATUS_WRITE_FAILED);
  }
  const int sync = SyncProfile(path);
  FreeProfile(path);
  if (sync != 0) return DC_FAIL("File writing failed! " + path, STATUS_WRITE_FAILED);
  return STATUS_OK;
}
