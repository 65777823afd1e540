// Azimuth focusing driver: overlapping azimuth blocks through multirg,
// stitched into the focused raster, with its start times and spacings.
#include "core/azimuth_focus.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "core/azimuth_block.h"
#include "core/fft.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "product/data_file.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;

int fail(const char* message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define AF_FAIL(message, status) fail((message), (status), __LINE__, __func__)

// Columns of a block held at a time: all of them, unless the block and the
// sub-block work area (`LinesInBlock` rows each) need more than `Memory` less
// kReserveMiB, left to the kernels' row buffers, the transform plans and the
// rest of the process; then as many as fit, at least one sub-block. In core
// the block is held whole: its focused rows overwrite the input raster
// that a later strip would still read.
int blockColumns(const AzimuthFocusConf& conf, int samples, bool inCore) {
  constexpr double kReserveMiB = 64.0;
  if (inCore || conf.Memory <= 0) return samples;
  const double columnBytes = static_cast<double>(sizeof(fcomplex)) * conf.LinesInBlock;
  const double room = (conf.Memory - kReserveMiB) * 1048576.0 - columnBytes * conf.SamplesInBlock;
  const double fit = std::floor(room / columnBytes);
  if (fit >= samples) return samples;
  return std::min(samples, std::max(conf.SamplesInBlock, static_cast<int>(std::max(0.0, fit))));
}

}  // namespace

int azimuth_block_plan(int lines, int linesInBlock, int halfOverlap, AzimuthBlockPlan& plan) {
  plan.overlap = 2 * halfOverlap;
  plan.step = linesInBlock - plan.overlap;
  if (plan.step <= 0) {
    ORV_REPORT("Azimuth block not longer than the azimuth overlap", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  plan.last = (lines - plan.overlap) / plan.step;
  plan.progressTotal = plan.last + (((lines - plan.overlap) % plan.step) != 0 ? 1 : 0);
  return STATUS_OK;
}

int azimuth_overlap_from_scene(const AzimuthFocusFiles& files, const AzimuthFocusScene& scene,
                               const AzimuthFocusConf& conf, double veq, double dcref) {
  const double prf = files.prf_hz, frg = files.frg_hz;
  const double lambda = kC / files.fc_hz;
  // Doppler rate 2 V^2 / (lambda R): slowest, so the aperture longest, at
  // the far range.
  const auto rate = [&](double fastTime) { return 2.0 * veq * veq / (lambda * kC / 2.0 * fastTime); };
  const double farTime = files.FastStartTime + (scene.samples - 1) / frg;
  // The processed band: the look band, or the beam's own Doppler band where
  // that is narrower, never more than the sampled one.
  double band = conf.AzimuthLookBandwidth > 0.0 ? conf.AzimuthLookBandwidth : prf;
  if (conf.AntennaLength > 0.0) band = std::min(band, 2.0 * veq / conf.AntennaLength);
  band = std::min(band, prf);
  const double aperture = band / rate(farTime) * prf;

  // The centroid is linear in azimuth time at each range: its extremes lie on
  // the first and last lines. Range is sampled finely enough for the
  // polynomial's low degree.
  const double* pdc = scene.polyDC;
  double walk = 0.0;
  constexpr int kRanges = 32;
  for (int i = 0; i <= kRanges; ++i) {
    const double fastTime = files.FastStartTime + (scene.samples - 1) / frg * i / kRanges;
    const double x = fastTime - pdc[7];
    for (const double slowTime : {files.SlowStartTime, files.SlowStartTime + (scene.lines - 1) / prf}) {
      const double y = slowTime - pdc[8];
      const double dc = pdc[0] + pdc[1] * x + pdc[2] * y + pdc[3] * x * y + pdc[4] * x * x +
                        pdc[5] * x * x * x + pdc[6] * x * x * x * x;
      walk = std::max(walk, std::fabs(dc - dcref) / rate(fastTime) * prf);
    }
  }
  // A wild centroid polynomial gives an overlap that no block holds: it is
  // bounded here so that the block plan reports it.
  const double lines = aperture + 2.0 * walk;
  const int full = lines < 1e9 ? static_cast<int>(std::ceil(lines)) : 1000000000;
  return full + (full % 2);
}

void azimuth_focus_shifts(const AzimuthFocusConf& conf, int lines, int samples, double squint,
                          double Req, double Veq, double prf_hz, double frg_hz, double& azShift,
                          double& rgShift) {
  const double spacing = 149896229.0 / frg_hz;
  if (std::fabs(conf.ApplyAzShift) < lines) {
    azShift = conf.ApplyAzShift;
  } else {
    const double rest =
        conf.ApplyAzShift > 0 ? conf.ApplyAzShift - lines : conf.ApplyAzShift + lines;
    const double automatic =
        conf.PerformInterpolation != 0
            ? std::tan(squint) * (Req + std::cos(squint) * (samples / 2) * spacing) / Veq
            : std::tan(squint) * Req / Veq;
    azShift = automatic + rest / prf_hz;
  }
  if (std::fabs(conf.ApplyRgShift) < samples) {
    rgShift = conf.ApplyRgShift;
  } else {
    const double rest =
        conf.ApplyRgShift > 0 ? conf.ApplyRgShift - samples : conf.ApplyRgShift + samples;
    rgShift = 2.0 * (1.0 / std::cos(squint) - 1.0) * Req / kC + rest / frg_hz;
  }
}

int azimuthfoc(const AzimuthFocusFiles& files, AzimuthFocusScene& scene,
               const AzimuthFocusConf& conf) {
  const int samples = scene.samples, lines = scene.lines;
  const double frg = files.frg_hz, prf = files.prf_hz;
  if (samples < 1 || lines < 1 || frg <= 0.0 || prf <= 0.0 || files.fc_hz <= 0.0)
    return AF_FAIL("Bad raster sizes or sampling rates for azimuth focusing",
                   STATUS_BAD_PARAMETER);
  if (conf.SamplesInBlock <= 2 * conf.RangeOverlap)
    return AF_FAIL("Range sub-block not longer than the range overlap", STATUS_BAD_PARAMETER);
  if (2 * conf.RangeOverlap >= samples)
    return AF_FAIL("Range overlap not shorter than the raster lines", STATUS_BAD_PARAMETER);
  if (scene.inCore && !scene.buffer)
    return AF_FAIL("No in-core buffer for azimuth focusing", STATUS_BAD_PARAMETER);

  // Centroid at the scene centre.
  const double* pdc = scene.polyDC;
  const double x = (samples / 2) / frg + files.FastStartTime - pdc[7];
  const double y = (lines / 2) / prf + files.SlowStartTime - pdc[8];
  const double centroid = pdc[0] + pdc[1] * x + pdc[2] * y + pdc[3] * x * y + pdc[4] * x * x +
                          pdc[5] * x * x * x + pdc[6] * x * x * x * x;

  AzimuthBlockPar par;
  par.verbose = scene.verbose;
  par.lines = conf.LinesInBlock;
  par.samples = samples;
  par.fc = files.fc_hz;
  par.frg = frg;
  par.dc = centroid;
  par.scale = 1.0;
  par.reestimate = 0;
  par.prf = prf;
  // Doppler rate at the scene centre, up to its cubic term in range (a
  // quadratic misses the rate across a full swath by some 5e-6, a tenth of
  // a radian of phase three PRFs from zero Doppler); its azimuth terms (y,
  // x y) follow the blocks and, within a block, the rows (see multirg).
  const double* pfr = scene.polyFR;
  const double yfr = (lines / 2) / prf + files.SlowStartTime - pfr[8];
  par.fr0y = pfr[2];
  par.fr1y = pfr[3];
  par.fr0 = pfr[0] + pfr[2] * yfr;
  par.fr1 = pfr[1] + pfr[3] * yfr;
  par.fr2 = pfr[4];
  par.fr3 = pfr[5];
  par.t0 = files.FastStartTime;
  par.trg0 = scene.polyFR[7];
  par.AntennaLength = conf.AntennaLength;
  par.azw = conf.AzimuthWindowHammingParameter;
  par.rgw = conf.RangeWindowHammingParameter;
  par.azlook = conf.AzimuthLookBandwidth;
  par.rglook = conf.RangeLookBandwidth;
  par.aztrans = conf.AzimuthTransitionBandwidth;
  par.rgtrans = conf.RangeTransitionBandwidth;
  par.whiten = conf.WhiteningFlag;
  par.conj = 0;
  par.interp = conf.PerformInterpolation;
  par.pad = conf.StoltPadding;
  par.dcref = scene.DCref != 0.0 ? scene.DCref : centroid;
  par.bw = files.bandwidth_hz;
  par.final = 0;

  int st = MyComputeEqPar(par);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  scene.Veq = par.Veq;
  scene.azSpacing = par.Veq / prf;
  scene.rgSpacing = 149896229.0 / frg;
  scene.centroid = centroid;
  const double squint = std::asin(centroid * (kC / files.fc_hz) / 2.0 / par.Veq);

  double azShift = 0.0, rgShift = 0.0;
  azimuth_focus_shifts(conf, lines, samples, squint, par.Req, par.Veq, prf, frg, azShift,
                       rgShift);
  par.azshift = azShift;
  par.rgshift = rgShift;
  // Slant range of the first product sample, for the phase reference of the
  // kernels' residual wavenumber offset.
  par.range0 = kC / 2.0 * (conf.RangeOverlap / frg + files.FastStartTime - rgShift);

  const int halfOverlap = conf.AzimuthOverlapFromScene != 0
                              ? azimuth_overlap_from_scene(files, scene, conf, par.Veq, par.dcref) / 2
                              : conf.AzimuthOverlap;
  AzimuthBlockPlan plan;
  st = azimuth_block_plan(lines, conf.LinesInBlock, halfOverlap, plan);
  if (st != 0) return st;
  const int A = plan.overlap;
  const int fullRg = 2 * conf.RangeOverlap;
  const int outSamples = samples - fullRg;

  const int columns = blockColumns(conf, samples, scene.inCore != 0);
  RasterStream in, out;
  // A block held whole is read before any of its rows is written; output
  // rows are never longer than input rows and block b writes only the rows
  // before the first line block b + 1 reads, so the output may then be
  // written over the input's file. A strip writes rows of its own block
  // while other columns of it are still to be read.
  const bool overwrite = !scene.inCore && columns == samples && files.overwriteInput &&
                         handOverFile(files.input, files.output);
  if (!scene.inCore) {
    if (!in.open(overwrite ? files.output : files.input, "rb")) {
      ORV_REPORT("File not opened!", REPORT_ERROR);
      ORV_REPORT(files.input, REPORT_ERROR);
      return STATUS_NOT_OPENED;
    }
    if (!out.open(files.output, overwrite ? "r+b" : "w+b")) {
      ORV_REPORT("File not opened!", REPORT_ERROR);
      ORV_REPORT(files.output, REPORT_ERROR);
      return STATUS_NOT_OPENED;
    }
  }
  FFTBuffer blockBuf;
  try {
    blockBuf.resize(static_cast<std::size_t>(columns) * conf.LinesInBlock);
  } catch (const std::bad_alloc&) {
    return AF_FAIL("Out of memory for the azimuth block", STATUS_NO_MEMORY);
  }
  FFTBuffer subBlockWork;  // range sub-block work area, kept from block to block
  if (scene.verbose) waitbar_open("Azimuth Focusing");

  long long readPos = 0;  // first input row of the block
  long long outRow = 0;
  const std::size_t rowBytes = sizeof(fcomplex) * samples;
  const long long outRowBytes = static_cast<long long>(sizeof(fcomplex)) * outSamples;
  for (int b = 0; b <= plan.last; ++b) {
    const int blockLines = b < plan.last ? conf.LinesInBlock : lines - plan.step * plan.last;
    if (blockLines <= A) break;
    const int rows = blockLines - A;
    if (columns < samples) {
      // Nothing read yet: the strip is filled as the sub-blocks ask for it.
    } else if (scene.inCore) {
      std::memcpy(blockBuf.data(), scene.buffer + readPos * samples, rowBytes * blockLines);
    } else {
      const long long blockBytes = static_cast<long long>(rowBytes) * blockLines;
      if (in.preadShared(blockBuf.data(), blockBytes, readPos * static_cast<long long>(rowBytes)) != blockBytes) {
        if (scene.verbose) waitbar_close();
        ORV_REPORT("File reading failed!", REPORT_ERROR);
        ORV_REPORT(files.input, REPORT_ERROR);
        return STATUS_READ_FAILED;
      }
    }
    const long long firstLine = readPos;
    readPos += blockLines - A;

    // Doppler centroid of the block as a polynomial in fast time.
    const double yb = (blockLines / 2 + firstLine) / prf + files.SlowStartTime - pdc[8];
    const double poly[5] = {pdc[0] + pdc[2] * yb, pdc[1] + pdc[3] * yb, pdc[4], pdc[5], pdc[6]};
    const double ybr = (blockLines / 2 + firstLine) / prf + files.SlowStartTime - pfr[8];
    par.fr0 = pfr[0] + pfr[2] * ybr;
    par.fr1 = pfr[1] + pfr[3] * ybr;
    par.lines = blockLines;
    par.samples = samples;
    par.data = blockBuf.data();
    AzimuthBlockOut bo;
    // A block wider than the budget allows is held as a strip of its
    // columns [first, first + columns), of which [first, loaded) are read.
    // When the next sub-block runs past it, the focused columns left of
    // that sub-block are written out, the unfocused ones move to the front
    // and the rest is read.
    int first = 0, loaded = 0, failed = 0;
    auto putFocused = [&](int end) {
      const int n = std::min(end, outSamples) - first;
      bool whole = true;
      if (n <= 0) return whole;
      const long long bytes = static_cast<long long>(sizeof(fcomplex)) * n;
#pragma omp parallel for schedule(static) reduction(&& : whole)
      for (int r = 0; r < rows; ++r)
        whole = out.pwrite(blockBuf.data() + static_cast<std::size_t>(A / 2 + r) * columns, bytes,
                           (outRow + r) * outRowBytes + first * static_cast<long long>(sizeof(fcomplex))) ==
                    bytes &&
                whole;
      return whole;
    };
    BlockStrip strip;
    strip.pitch = columns;
    strip.columns = [&](int from, int count, fcomplex*& at) {
      if (from + count > loaded) {
        if (!putFocused(from)) return failed = STATUS_WRITE_FAILED;
        const int keep = std::max(0, loaded - from), end = std::min(samples, from + columns);
        const long long bytes = static_cast<long long>(sizeof(fcomplex)) * (end - from - keep);
        bool whole = true;
#pragma omp parallel for schedule(static) reduction(&& : whole)
        for (int j = 0; j < blockLines; ++j) {
          fcomplex* row = blockBuf.data() + static_cast<std::size_t>(j) * columns;
          if (keep > 0) std::memmove(row, row + (from - first), sizeof(fcomplex) * keep);
          whole = in.pread(row + keep, bytes,
                           (firstLine + j) * static_cast<long long>(rowBytes) +
                               (from + keep) * static_cast<long long>(sizeof(fcomplex))) == bytes &&
                  whole;
        }
        first = from;
        loaded = end;
        if (!whole) return failed = STATUS_READ_FAILED;
      }
      at = blockBuf.data() + (from - first);
      return 0;
    };
    st = multirg(par, bo, conf.SamplesInBlock, fullRg, poly, pdc[7], b, std::max(1, plan.progressTotal),
                 &subBlockWork, columns < samples ? &strip : nullptr);
    if (st == 0 && columns < samples && !putFocused(samples)) failed = st = STATUS_WRITE_FAILED;
    if (failed != 0) {
      if (scene.verbose) waitbar_close();
      ORV_REPORT(failed == STATUS_READ_FAILED ? "File reading failed!" : "File writing failed!", REPORT_ERROR);
      ORV_REPORT(failed == STATUS_READ_FAILED ? files.input : files.output, REPORT_ERROR);
      return failed;
    }
    if (st != 0) {
      if (scene.verbose) waitbar_close();
      ORV_REPORT_CALLED_ERROR();
      return st;
    }

    if (columns < samples) {
      // Written out column by column above.
    } else if (scene.inCore) {
      for (int r = 0; r < rows; ++r)
        std::memmove(scene.buffer + (outRow + r) * outSamples,
                     blockBuf.data() + static_cast<std::size_t>(A / 2 + r) * samples,
                     sizeof(fcomplex) * outSamples);
    } else if (!out.putRowsShared(blockBuf.data() + static_cast<std::size_t>(A / 2) * samples,
                                  static_cast<long long>(rowBytes), outRowBytes, rows, outRow * outRowBytes)) {
      if (scene.verbose) waitbar_close();
      ORV_REPORT("File writing failed!", REPORT_ERROR);
      ORV_REPORT(files.output, REPORT_ERROR);
      return STATUS_WRITE_FAILED;
    }
    outRow += rows;
  }
  if (scene.verbose) waitbar_close();
  const long long outBytes = static_cast<long long>(sizeof(fcomplex)) * outSamples * outRow;
  if (overwrite && !out.truncate(outBytes)) {
    ORV_REPORT("File writing failed!", REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }
  if (out.is_open() && out.close() != 0) {
    ORV_REPORT("File writing failed!", REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }

  scene.outSamples = outSamples;
  scene.outLines = std::max(0, lines - A);
  scene.firstSampleTime = conf.RangeOverlap / frg + files.FastStartTime - rgShift;
  scene.firstLineTime = halfOverlap / prf + files.SlowStartTime + azShift;
  std::copy(scene.polyDC, scene.polyDC + 9, scene.polyDCOut);
  std::copy(scene.polyFR, scene.polyFR + 9, scene.polyFROut);
  return STATUS_OK;
}
