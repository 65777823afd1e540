// Radio-frequency interference removal for L-band raw data.
#include "core/palsar_rfi.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <new>
#include <numeric>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "numerics/fitting.h"
#include "product/data_file.h"
#include "product/general_sar.h"

namespace {


int calledError(int status) {
  ORV_REPORT_CALLED_ERROR();
  return status;
}

// Uniform deviates in (0, 1) of a 64-bit linear congruential generator whose
// state starts from the seed -1.
struct Uniform {
  std::uint64_t state = static_cast<std::uint64_t>(-1);
  double next() {
    state = state * 6364136223846793005ULL + 1442695040888963407ULL;
    return ((state >> 11) + 0.5) / 9007199254740992.0;
  }
};
Uniform g_uniform;
bool g_haveSpare = false;
double g_spare = 0.0;

}  // namespace

double rfiGaussian() {
  if (g_haveSpare) {
    g_haveSpare = false;
    return g_spare;
  }
  double v1, v2, s;
  do {
    v1 = 2.0 * g_uniform.next() - 1.0;
    v2 = 2.0 * g_uniform.next() - 1.0;
    s = v1 * v1 + v2 * v2;
  } while (s >= 1.0 || s == 0.0);
  const double f = std::sqrt(-2.0 * std::log(s) / s);
  g_spare = v1 * f;
  g_haveSpare = true;
  return v2 * f;
}

void rfiGaussianReset() {
  g_uniform = Uniform{};
  g_haveSpare = false;
}

int PSD(const fcomplex* x, int n, double* out, int L) {
  if (L < 2 || n < L) return STATUS_BAD_CONDITION;
  std::vector<double> w(static_cast<std::size_t>(L));
  double U = 0.0;
  for (int i = 0; i < L; ++i) {
    const double a = (i - L / 2.0) / (L / 2.0);
    w[std::size_t(i)] = 1.0 - a * a;
    U += w[std::size_t(i)] * w[std::size_t(i)];
  }
  const int segments = 2 * n / L - 1;
  std::fill(out, out + L, 0.0);
  if (segments < 1) return STATUS_BAD_CONDITION;
  std::vector<fcomplex> seg(static_cast<std::size_t>(L));
  FFTPlan plan{};
  if (int st = fft_makep_c(plan, L, L, 1, 1, FFT_FORWARD, FFT_NONE, 1); st != 0) return st;
  for (int k = 0; k < segments; ++k) {
    const fcomplex* s = x + std::size_t(k) * std::size_t(L / 2);
    for (int i = 0; i < L; ++i) seg[std::size_t(i)] = s[i] * static_cast<float>(w[std::size_t(i)]);
    pfft_c(plan, seg.data(), seg.data());
    for (int f = 0; f < L; ++f) out[f] += std::norm(seg[std::size_t(f)]) / U;
  }
  fft_destp_c(plan);
  for (int f = 0; f < L; ++f) out[f] /= segments;
  return 0;
}

// ---- RFIblock --------------------------------------------------------------------

RFIblock::RFIblock(const SARPulse_Obj& pulse, int lines, int samples, int periodogram)
    : pulse_(pulse), lines_(lines), samples_(samples), P_(periodogram) {}

RFIblock::~RFIblock() { DestroyBuffers(); }

int RFIblock::CreateBuffers(int report) {
  const double T = pulse_.PulseLength, fs = pulse_.PulseSamplingRate;
  if (T == 0.0 || fs == 0.0) {
    ORV_REPORT("Can't find chirp parameters on the raw header file", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  report_ = report;
  F_ = genpow(samples_, 1);
  if (P_ < 4 || P_ > F_) {
    ORV_REPORT("Periodogram of " + std::to_string(P_) + " bins does not fit lines of " + std::to_string(samples_) +
                   " samples",
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  try {
    reference_.assign(std::size_t(F_), 0.0);
    power_.assign(std::size_t(lines_), 0.0);
    meanDb_.assign(std::size_t(lines_), 0.0);
    deviation_.assign(std::size_t(lines_), 0.0);
    linePsd_.assign(std::size_t(lines_) * std::size_t(P_), 0.0);
    freq_.assign(std::size_t(lines_) * std::size_t(F_), fcomplex(0.0f, 0.0f));
    mask_.assign(report ? std::size_t(lines_) * std::size_t(F_) : 0, 0);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Memory allocation failed for the interference filter", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  if (fft_makep_c(forward_, F_, F_, 1, 1, FFT_FORWARD, FFT_NONE, 1) != 0 ||
      fft_makep_c(backward_, F_, F_, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 1) != 0) {
    ORV_REPORT("FFT plans of the interference filter could not be made", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

int RFIblock::DestroyBuffers() {
  if (forward_.row) fft_destp_c(forward_);
  if (backward_.row) fft_destp_c(backward_);
  forward_ = FFTPlan{};
  backward_ = FFTPlan{};
  return 0;
}

namespace {

// Running median of `in` over `width` neighbouring bins (odd), the spectrum
// taken as circular: follows the smooth shape of a spectrum (chirp band,
// filter roll-off, antenna) and passes over interferers narrower than half
// the width.
void runningMedian(const std::vector<double>& in, int width, std::vector<double>& out) {
  const int n = static_cast<int>(in.size()), half = width / 2;
  std::vector<double> window(static_cast<std::size_t>(2 * half + 1));
  out.resize(in.size());
  for (int i = 0; i < n; ++i) {
    for (int k = -half; k <= half; ++k) window[std::size_t(k + half)] = in[std::size_t(((i + k) % n + n) % n)];
    std::nth_element(window.begin(), window.begin() + half, window.end());
    out[std::size_t(i)] = window[std::size_t(half)];
  }
}

double medianOf(std::vector<double>& values) {
  if (values.empty()) return 0.0;
  const auto mid = values.begin() + std::ptrdiff_t(values.size() / 2);
  std::nth_element(values.begin(), mid, values.end());
  return *mid;
}

}  // namespace

// The clean spectrum is measured on the block itself rather than taken from
// the ideal chirp, which the echoes follow only roughly (receiver roll-off,
// Fresnel ripples near the band edges). Persistent interferers are taken
// out of each line before the line's own search: left in, a strong tone is
// found again in every line together with the main lobe of its periodogram
// bins, and the notches, tens of bins wide at fixed frequencies in every
// line, raise the range sidelobes of every target. The median over lines
// keeps a burst of one line out of the persistent search.
int RFIblock::correct() {
  const std::size_t F = std::size_t(F_), P = std::size_t(P_);
  // 1. Spectra of the lines.
  for (int l = 0; l < lines_; ++l) {
    fcomplex* X = freq_.data() + std::size_t(l) * F;
    std::copy(in + std::size_t(l) * std::size_t(samples_), in + std::size_t(l + 1) * std::size_t(samples_), X);
    std::fill(X + samples_, X + F, fcomplex(0.0f, 0.0f));
    pfft_c(forward_, X, X);
  }
  // 2. Line powers and the power trend through the middle percentiles of
  // the powers.
  for (int l = 0; l < lines_; ++l) {
    const fcomplex* X = freq_.data() + std::size_t(l) * F;
    double sum = 0.0;
    for (std::size_t f = 0; f < F; ++f) sum += std::norm(X[f]) / F_;
    power_[std::size_t(l)] = sum / F_;
  }
  std::vector<int> order(static_cast<std::size_t>(lines_));
  std::iota(order.begin(), order.end(), 0);
  std::sort(order.begin(), order.end(), [this](int a, int b) { return power_[std::size_t(a)] < power_[std::size_t(b)]; });
  const int count = static_cast<int>(std::lround((1.0 - percentileLow - percentileHigh) * lines_));
  const int first = static_cast<int>(std::floor(lines_ * double(percentileLow)));
  std::vector<double> xs, ys;
  for (int k = first; k < first + count && k < lines_; ++k) {
    xs.push_back(order[std::size_t(k)]);
    ys.push_back(power_[std::size_t(order[std::size_t(k)])]);
  }
  double coeff[2] = {0.0, 0.0};
  if (xs.empty() || polfit(xs.data(), ys.data(), static_cast<int>(xs.size()), coeff, 1) != 0) {
    ORV_REPORT("Power trend of the interference filter could not be fitted", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  a0_ = coeff[0];
  a1_ = coeff[1];

  // 3. Persistent interferers: bins of the block's median spectrum (the
  // median over the lines, which a burst on a few lines does not move)
  // above its running median over frequency. Over a block of lines the
  // median is steady to a fraction of a decibel, so the threshold finds
  // tones without false alarms. The reference is kept at the mean level of
  // a clean bin (the median of an exponential power is ln 2 of its mean).
  std::vector<double> median(F), column(static_cast<std::size_t>(lines_));
  for (std::size_t f = 0; f < F; ++f) {
    for (int l = 0; l < lines_; ++l) column[std::size_t(l)] = std::norm(freq_[std::size_t(l) * F + f]) / F_;
    median[f] = medianOf(column);
  }
  runningMedian(median, std::max(9, (F_ / 64) | 1), reference_);
  std::vector<char> persistent(F, 0);
  double referenceSum = 0.0;
  for (std::size_t f = 0; f < F; ++f) {
    persistent[f] = reference_[f] > 0.0 && 10.0 * std::log10(median[f] / reference_[f]) > thresholdPersistent;
    reference_[f] /= std::log(2.0);
    referenceSum += reference_[f];
  }

  // 4. Welch spectra of the lines without their persistent bins, each
  // normalised by its in-band power; their median over the block is the
  // shape a clean line follows.
  const double B = pulse_.Bandwidth, fs = pulse_.PulseSamplingRate;
  const int m = std::clamp(static_cast<int>(std::lround(P_ * B / fs)), 2, P_), h = m / 2;
  auto inBand = [&](std::size_t i) { return int(i) < h || int(i) >= P_ - h; };
  std::vector<fcomplex> time(F);
  std::vector<double> linePower(static_cast<std::size_t>(lines_), 0.0);
  for (int l = 0; l < lines_; ++l) {
    if (power_[std::size_t(l)] == 0.0) continue;
    const fcomplex* X = freq_.data() + std::size_t(l) * F;
    for (std::size_t f = 0; f < F; ++f) time[f] = persistent[f] ? fcomplex(0.0f, 0.0f) : X[f];
    pfft_c(backward_, time.data(), time.data());
    double* psd = linePsd_.data() + std::size_t(l) * P;
    PSD(time.data(), F_, psd, P_);
    double sum = 0.0;
    for (std::size_t i = 0; i < P; ++i)
      if (inBand(i)) sum += psd[i];
    linePower[std::size_t(l)] = sum;
  }
  std::vector<double> shape(P, 0.0);
  for (std::size_t i = 0; i < P; ++i) {
    column.clear();
    for (int l = 0; l < lines_; ++l)
      if (linePower[std::size_t(l)] > 0.0) column.push_back(linePsd_[std::size_t(l) * P + i] / linePower[std::size_t(l)]);
    shape[i] = medianOf(column);
  }

  const double q = double(F_) / P_;
  std::vector<char> isolated(F);
  for (int l = 0; l < lines_; ++l) {
    fcomplex* X = freq_.data() + std::size_t(l) * F;
    char* rep = report_ ? mask_.data() + std::size_t(l) * F : nullptr;
    if (power_[std::size_t(l)] == 0.0) {
      std::fill(X, X + F, fcomplex(0.0f, 0.0f));
      if (rep) std::fill(rep, rep + F, char(3));
      continue;
    }
    // a. The line's spectrum against the shape, in band: mean and spread
    // of the level in dB.
    const double* psd = linePsd_.data() + std::size_t(l) * P;
    const double Pl = linePower[std::size_t(l)];
    auto levelDb = [&](std::size_t i) {
      return shape[i] > 0.0 && psd[i] > 0.0 ? 10.0 * std::log10(psd[i] / (shape[i] * Pl)) : 0.0;
    };
    double sum = 0.0, sum2 = 0.0;
    for (std::size_t i = 0; i < P; ++i) {
      if (!inBand(i)) continue;
      const double db = levelDb(i);
      sum += db;
      sum2 += db * db;
    }
    const double mean = sum / m;
    const double dev = std::sqrt(std::max(0.0, (sum2 - m * mean * mean) / m));
    meanDb_[std::size_t(l)] = mean;
    deviation_[std::size_t(l)] = dev;
    // b. Isolated interferers: periodogram bins above the shape, each
    // masking the transform bins of its main lobe.
    const bool badLine = dev > thresholdStd;
    std::fill(isolated.begin(), isolated.end(), char(badLine ? 1 : 0));
    if (!badLine)
      for (std::size_t i = 0; i < P; ++i) {
        if (levelDb(i) - mean <= thresholdIsolate) continue;
        const long centre = std::lround(q * double(i));
        const long reach = static_cast<long>(std::ceil(q));
        for (long f = centre - reach; f <= centre + reach; ++f) isolated[std::size_t(((f % F_) + F_) % F_)] = 1;
      }
    // c. A line hit all over is replaced by noise of the block's clean
    // spectrum; otherwise the masked bins are emptied.
    if (badLine) {
      for (std::size_t f = 0; f < F; ++f) {
        const double sigma = std::sqrt(reference_[f] * F_ / 2.0);
        const double re = rfiGaussian() * sigma, im = rfiGaussian() * sigma;
        X[f] = fcomplex(static_cast<float>(re), static_cast<float>(im));
      }
    } else {
      // d. The power of the emptied bins is given back to the line when the
      // loss passes the threshold: by the share of the block's spectrum
      // they hold, not by the line's measured power, which the
      // interference itself has raised.
      double kept = 0.0;
      for (std::size_t f = 0; f < F; ++f)
        if (persistent[f] || isolated[f]) {
          X[f] = fcomplex(0.0f, 0.0f);
        } else {
          kept += reference_[f];
        }
      const double loss = kept > 0.0 ? 10.0 * std::log10(referenceSum / kept) : 0.0;
      if (loss >= thresholdPowerLoss) {
        const float k = static_cast<float>(std::sqrt(referenceSum / kept));
        for (std::size_t f = 0; f < F; ++f) X[f] *= k;
      }
    }
    if (rep) {
      for (std::size_t f = 0; f < F; ++f) rep[f] = isolated[f] ? 2 : 0;
      for (std::size_t f = 0; f < F; ++f)
        if (persistent[f]) rep[f] = 1;
    }
  }
  // 5. Back to time, the first samples of each line.
  for (int l = 0; l < lines_; ++l) {
    fcomplex* X = freq_.data() + std::size_t(l) * F;
    pfft_c(backward_, X, X);
    std::copy(X, X + samples_, out + std::size_t(l) * std::size_t(samples_));
  }
  return 0;
}

int RFIblock::WriteReport(char* mask, double* power, double* trendOut, double* deviation) const {
  if (mask && report_) std::copy(mask_.begin(), mask_.end(), mask);
  for (int l = 0; l < lines_; ++l) {
    if (power) power[l] = power_[std::size_t(l)];
    if (trendOut) trendOut[l] = trend(l);
    if (deviation) deviation[l] = deviation_[std::size_t(l)];
  }
  return 0;
}

// ---- ATPalsarRFIRemoval ------------------------------------------------------------

ATPalsarRFIRemoval::ATPalsarRFIRemoval() { createElementsVector(15); }
ATPalsarRFIRemoval::~ATPalsarRFIRemoval() = default;

void ATPalsarRFIRemoval::refreshParameters() {
  addElementInt("Memory", &Memory, 1, 0, INT_MAX, true);
  addElementString("ReportFilename", &ReportFilename, true);
  addElementInt("ReportLevel", &ReportLevel, 1, 0, 3, true);
  addElementInt("Incore", &Incore, 1, 0, 1, true);
  addElementInt("Verbose", &Verbose, 1, 0, 1, true);
  addElementString("RawData", &RawData, true);
  addElementString("OutputFile", &OutputFile, true);
  addElementInt("BlockSize", &BlockSize, 1, 1, 2048, true);
  addElementInt("PeriodogramSize", &PeriodogramSize, 1, 1, 1024, true);
  addElementDouble("ThresholdPersistent", &ThresholdPersistent, 1, 1.0, 20.0, true);
  addElementDouble("ThresholdIsolate", &ThresholdIsolate, 1, 1.0, 20.0, true);
  addElementDouble("ThresholdPowerLoss", &ThresholdPowerLoss, 1, 0.0, 1.0, true);
  addElementDouble("ThresholdStd", &ThresholdStd, 1, 1.0, 50.0, true);
  addElementFloat("PercentileLow", &PercentileLow, 1, 0.0f, 1.0f, true);
  addElementFloat("PercentileHigh", &PercentileHigh, 1, 0.0f, 1.0f, true);
  setAllocationFlag(true);
}

int ATPalsarRFIRemoval::checkpar() {
  checkAuxiliaryFile();
  return 0;
}
int ATPalsarRFIRemoval::readpar(const std::string& file, int channel) {
  readAuxiliaryFile(file, channel, "ATPalsarRFIRemoval");
  return 0;
}
int ATPalsarRFIRemoval::writepar(const std::string& file, int channel) {
  return writeAuxiliaryFile(file, channel, "ATPalsarRFIRemoval");
}
int ATPalsarRFIRemoval::InitProcessing(const std::string& file, int channel) {
  if (int st = readpar(file, channel); st != 0) return calledError(st);
  init_report(0, "ATPalsarRFIRemoval REPORT", ReportLevel);
  if (int st = checkpar(); st != 0) return calledError(st);
  return 0;
}
int ATPalsarRFIRemoval::FinalizeProcessing(const std::string&, int) {
  exit_report();
  return 0;
}
int ATPalsarRFIRemoval::runall(const std::string& file, int channel) {
  if (int st = InitProcessing(file, channel); st != 0) return calledError(st);
  if (int st = run(); st != 0) return calledError(st);
  return FinalizeProcessing(file, channel);
}

int ATPalsarRFIRemoval::run() {
  GeneralSAR record;
  if (int st = record.GSread(RawData + ".hdr"); st != 0) return calledError(st);
  const int lines = record.dataFile.NrOfLinesPerImage, samples = record.dataFile.NrOfPixelsPerLine;
  const int prefix = record.dataFile.RowPrefix;
  if (lines < 1 || samples < 1 || record.dataFile.CellType != FLOAT_COMPLEX) {
    ORV_REPORT("Bad raster layout in " + RawData + ".hdr for interference removal", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  std::ifstream in(RawData, std::ios::binary);
  std::ofstream out(OutputFile, std::ios::binary | std::ios::trunc);
  if (!in || !out) {
    ORV_REPORT("File not opened! (" + (!in ? RawData : OutputFile) + ")", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  in.seekg(record.dataFile.HeaderOffset);
  const int F = genpow(samples, 1);
  std::ofstream side[4];
  const char* sideNames[4] = {"_rfimask", "_corrstd", "_idlpwr", "_realpwr"};
  if (Verbose)
    for (int k = 0; k < 4; ++k) side[k].open(OutputFile + sideNames[k], std::ios::binary | std::ios::trunc);

  const int blocks = (lines + BlockSize - 1) / BlockSize;
  const std::size_t rowBytes = std::size_t(prefix) + std::size_t(samples) * sizeof(fcomplex);
  std::vector<char> raw;
  std::vector<fcomplex> data, cleaned;
  int status = 0;
  waitbar_open("Removing interferences...");
  for (int b = 0; b < blocks && status == 0; ++b) {
    waitbar_update(0, static_cast<float>(100.0 * b / blocks));
    const int first = b * BlockSize, n = std::min(BlockSize, lines - first);
    try {
      raw.resize(rowBytes * std::size_t(n));
      data.resize(std::size_t(n) * std::size_t(samples));
      cleaned.resize(data.size());
    } catch (const std::bad_alloc&) {
      ORV_REPORT("Memory allocation failed for a block of " + RawData, REPORT_ERROR);
      status = STATUS_NO_MEMORY;
      break;
    }
    if (!in.read(raw.data(), std::streamsize(raw.size()))) {
      ORV_REPORT("File reading failed! (" + RawData + ")", REPORT_ERROR);
      status = STATUS_READ_FAILED;
      break;
    }
    for (int l = 0; l < n; ++l)
      std::memcpy(&data[std::size_t(l) * std::size_t(samples)], raw.data() + rowBytes * std::size_t(l) + prefix,
                  std::size_t(samples) * sizeof(fcomplex));
    std::vector<char> mask(std::size_t(n) * std::size_t(F), 0);
    std::vector<double> power(std::size_t(n), 0.0), trend(std::size_t(n), 0.0), deviation(std::size_t(n), 0.0);
    if (n > BlockSize / 2) {
      RFIblock block(record.pulse, n, samples, PeriodogramSize);
      block.thresholdIsolate = ThresholdIsolate;
      block.thresholdPersistent = ThresholdPersistent;
      block.thresholdStd = ThresholdStd;
      block.thresholdPowerLoss = ThresholdPowerLoss;
      block.percentileLow = PercentileLow;
      block.percentileHigh = PercentileHigh;
      block.in = data.data();
      block.out = cleaned.data();
      if (int st = block.CreateBuffers(Verbose); st != 0) {
        status = calledError(st);
        break;
      }
      if (int st = block.correct(); st != 0) {
        status = calledError(st);
        break;
      }
      block.WriteReport(mask.data(), power.data(), trend.data(), deviation.data());
    } else {
      cleaned = data;  // too short a block for statistics: copied
    }
    for (int l = 0; l < n; ++l)
      std::memcpy(raw.data() + rowBytes * std::size_t(l) + prefix, &cleaned[std::size_t(l) * std::size_t(samples)],
                  std::size_t(samples) * sizeof(fcomplex));
    out.write(raw.data(), std::streamsize(raw.size()));
    if (Verbose) {
      side[0].write(mask.data(), std::streamsize(mask.size()));
      side[1].write(reinterpret_cast<const char*>(deviation.data()), std::streamsize(n * sizeof(double)));
      side[2].write(reinterpret_cast<const char*>(trend.data()), std::streamsize(n * sizeof(double)));
      side[3].write(reinterpret_cast<const char*>(power.data()), std::streamsize(n * sizeof(double)));
    }
  }
  waitbar_close();
  if (status != 0) return status;
  out.close();
  if (!out) {
    ORV_REPORT("File writing failed! (" + OutputFile + ")", REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }
  if (Verbose) {
    const int types[4] = {INT8, FLOAT64, FLOAT64, FLOAT64};
    for (int k = 0; k < 4; ++k) {
      side[k].close();
      DataFile raster(OutputFile + sideNames[k]);
      raster.NrOfPixelsPerLine = k == 0 ? F : 1;
      raster.NrOfLinesPerImage = lines;
      raster.CellType = types[k];
      raster.RowPrefix = 0;
      raster.HeaderOffset = 0;
      if (int st = raster.write_hdr(); st != 0) return calledError(st);
    }
  }
  record.dataFile.filename = OutputFile;
  record.dataFile.HeaderOffset = 0;
  if (int st = record.GSwrite(OutputFile + ".hdr"); st != 0) return calledError(st);
  record.GSdestroy();
  return 0;
}
