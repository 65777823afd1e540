#pragma once
// Point-target analysis of a focused complex image: sub-pixel peak by 16x
// FFT upsampling, 3 dB impulse response width, peak and integrated sidelobe
// ratios along both axes, peak phase; and the theoretical values of a
// spectral window, computed numerically from the window function.
#include <cstdio>
#include <functional>
#include <limits>
#include <string>
#include <vector>

#include "sim/sim_fft.h"

// Impulse-response measures of one axis.
struct IrMetrics {
  double irwPixels = 0.0;
  double pslrDb = 0.0;
  double islrDb = 0.0;
};

// Measures of a power profile sampled every `step` pixels with its peak at
// `peak`: half-power width (linear interpolation), the main lobe between the
// first minima on both sides, PSLR = highest sample outside it, ISLR =
// energy outside over energy inside, both in dB.
IrMetrics profileMetrics(const std::vector<double>& power, double step, int peak);

// Spectral window over the processed band: generalised Hamming
// alpha + (1 - alpha) cos(2 pi u), u in [-1/2, 1/2] (alpha 1: none), with
// the processed band as a fraction of the sampling rate.
struct WindowSpec {
  double alpha = 1.0;
  double bandFraction = 1.0;
  double weight(double u) const;
};
// Theoretical measures of the window: the impulse response is integrated
// numerically from the window and sampled every 1 / upsample pixel over
// +-extent/2 pixels.
IrMetrics theoreticalMetrics(const WindowSpec& w, int extentPixels, int upsample);

// One channel of burst-mode azimuth data (alternating polarisation): the
// channel holds echoes in bursts of `echoes` lines that repeat every
// `cycle` lines, a burst beginning at line `firstLine` of the line axis of
// the truth. A target at zero Doppler on line `zeroDopplerLine` of that axis
// is seen at the Doppler `rateHz` x (t - t0) (rate negative), so the bursts
// gate its azimuth spectrum: the spectrum holds the bursts' stretches of
// the Doppler history, each |rate| x echoes / PRF wide. After focusing,
// the de-scalloping keeps four burst bandwidths about the centroid (the
// band of a `taps`-tap sinc filter) and divides by the two-way pattern of
// an antenna of `patternLength` metres seen at the speed `speed`.
struct BurstSpec {
  double echoes = 0.0, cycle = 0.0, firstLine = 0.0;
  double zeroDopplerLine = 0.0;
  double rateHz = 0.0, centroidHz = 0.0, prf = 0.0;
  double speed = 0.0, patternLength = 9.0;
  int taps = 31;  // on each side of the centre
  bool active() const { return echoes > 0.0 && cycle >= echoes && prf > 0.0 && rateHz != 0.0; }
  // Whether line n (continuous) lies in a burst of the channel.
  bool inBurst(double n) const;
  // Spectral weight at v = (f - centroid) / PRF, v in [-1/2, 1/2], with the
  // azimuth window of the product over its look band.
  double weight(double v, const WindowSpec& window) const;
};
// Theoretical measures of the azimuth response of a burst-mode channel at
// one target: the response integrated from BurstSpec::weight, sampled as
// theoreticalMetrics does. The burst gate, not the window, sets its
// sidelobes; its width follows the burst bandwidths that the gate lets pass.
IrMetrics burstTheoreticalMetrics(const WindowSpec& window, const BurstSpec& burst, int extentPixels, int upsample);

// Complex float raster read by windows; cells outside read as zero.
class ComplexRasterReader {
 public:
  ComplexRasterReader() = default;
  ~ComplexRasterReader();
  ComplexRasterReader(const ComplexRasterReader&) = delete;
  ComplexRasterReader& operator=(const ComplexRasterReader&) = delete;
  // false with a message when the file is missing or shorter than its size.
  bool open(const std::string& path, long lines, long samples, bool bigEndian, long long headerBytes,
            std::string& error, int rowPrefix = 0);
  // rows x cols values starting at (line0, sample0).
  bool read(long line0, long sample0, int rows, int cols, std::vector<cdouble>& out, std::string& error) const;
  long lines() const { return lines_; }
  long samples() const { return samples_; }

 private:
  std::FILE* f_ = nullptr;
  long lines_ = 0, samples_ = 0;
  bool big_ = false;
  long long header_ = 0;
  int prefix_ = 0;
};

struct PtaOptions {
  int window = 32;    // analysed window, pixels (power of two)
  int upsample = 16;  // power of two
  int search = 8;     // peak search radius around the prediction, pixels
  WindowSpec azimuth, range;
  double azimuthSpacing = 1.0, rangeSpacing = 1.0;  // metres per pixel
  // Absolute Doppler centroid at the target, in PRF units (NaN: unknown).
  // A sampled response only knows its spectrum modulo the PRF; between
  // samples, and so at the sub-pixel peak, its phase depends on which PRF
  // interval the spectrum is taken from. Given the centroid, the azimuth
  // spectrum is upsampled in the band centre +- PRF/2 where the echoes
  // really lie; without it, in the band cut at the quietest frequency.
  double azimuthCentroidPrf = std::numeric_limits<double>::quiet_NaN();
};

struct PtaResult {
  bool found = false;
  std::string message;
  double predictedLine = 0.0, predictedSample = 0.0;
  double peakLine = 0.0, peakSample = 0.0;
  double errorLine = 0.0, errorSample = 0.0;
  double peakAmplitude = 0.0;
  double phase = 0.0, expectedPhase = 0.0, phaseError = 0.0;
  IrMetrics azimuth, range;
  double irwAzimuthM = 0.0, irwRangeM = 0.0;
};

// Analyses the target predicted at (line, sample).
PtaResult analysePointTarget(const ComplexRasterReader& image, double line, double sample, double expectedPhase,
                             const PtaOptions& opt);
// The same on an in-memory window (rows x cols, row-major) whose integer
// peak is searched in the whole window; positions are relative to it.
PtaResult analyseWindow(const std::vector<cdouble>& win, int rows, int cols, double expectedPhase,
                        const PtaOptions& opt);
