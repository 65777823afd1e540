// sarpta: point-target analysis of a focused FLOAT_COMPLEX raster against
// the simulator's truth file. Prints a table and optionally writes JSON.
//   sarpta --raster FILE --truth FILE [--record FILE] [options]
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "product/data_file.h"
#include "product/general_sar.h"
#include "sim/point_target.h"
#include "sim/raw_scene.h"

namespace {

void usage() {
  std::fprintf(stderr,
               "usage: sarpta --raster FILE --truth FILE [--lines N --samples M] [options]\n"
               "  (without --lines and --samples the layout comes from FILE.hdr)\n"
               "  --record FILE              product record (e.g. out_slc.TessivorParameterExtracted):\n"
               "                             layout, time axes, windows and look bands from it\n"
               "  --big-endian               samples stored most significant byte first\n"
               "  --header-bytes B           bytes before the first line (0)\n"
               "  --first-line-time T        azimuth time of line 0, s since 1985 (truth: first line)\n"
               "  --line-time-step DT        azimuth time step, s (truth: 1 / PRF)\n"
               "  --first-range-time T       two-way time of sample 0, s (truth: window start)\n"
               "  --range-time-step DT       s (truth: 1 / sampling rate)\n"
               "  --no-range-offset          the raster does not carry the correlation offset\n"
               "  --azimuth-window A, --range-window A     generalised Hamming coefficient (1: none)\n"
               "  --azimuth-band F, --range-band F         processed band / sampling rate\n"
               "  --azimuth-spacing M, --range-spacing M   metres per pixel (truth values)\n"
               "  --window N                 analysed window, power of two (32)\n"
               "  --burst-channel K          burst-mode channel K (0 or 1) of the truth's [Bursts]\n"
               "                             (with --record: the channel of the record's polarisation)\n"
               "  --json FILE                write the results as JSON\n");
}

double need(const SimIni& ini, const std::string& sec, const std::string& key, bool& ok) {
  const std::string* v = ini.find(sec, key);
  if (!v) {
    ok = false;
    return 0.0;
  }
  return std::strtod(v->c_str(), nullptr);
}

}  // namespace

int main(int argc, char** argv) {
  std::map<std::string, std::string> a;
  for (int i = 1; i < argc; ++i) {
    const std::string k = argv[i];
    if (k == "--big-endian" || k == "--no-range-offset") {
      a.insert_or_assign(k, std::string(1, '1'));
    } else if (k.rfind("--", 0) == 0 && i + 1 < argc) {
      a[k] = argv[++i];
    } else {
      std::fprintf(stderr, "sarpta: unexpected argument '%s'\n", k.c_str());
      usage();
      return 10;
    }
  }
  for (const char* k : {"--raster", "--truth"})
    if (!a.count(k)) {
      std::fprintf(stderr, "sarpta: %s is required\n", k);
      usage();
      return 10;
    }
  auto num = [&a](const char* k, double fallback) { return a.count(k) ? std::strtod(a[k].c_str(), nullptr) : fallback; };

  SimIni truth;
  std::string err;
  if (!truth.load(a["--truth"], err)) {
    std::fprintf(stderr, "sarpta: %s\n", err.c_str());
    return 9;
  }
  bool ok = true;
  const double prf = need(truth, "Scene", "prf_hz", ok);
  const double fs = need(truth, "Scene", "range_sampling_rate_hz", ok);
  const double firstLine = need(truth, "Scene", "first_line_time", ok);
  const double swst = need(truth, "Scene", "window_start_s", ok);
  const double offset = need(truth, "Scene", "range_peak_offset_samples", ok);
  const double chirpBand = need(truth, "Scene", "chirp_rate_hz_per_s", ok) * need(truth, "Scene", "pulse_length_s", ok);
  const double azSpacing = need(truth, "Scene", "azimuth_pixel_spacing_m", ok);
  const double rgSpacing = need(truth, "Scene", "range_pixel_spacing_m", ok);
  const int targets = static_cast<int>(need(truth, "Scene", "targets", ok));
  if (!ok || prf <= 0 || fs <= 0) {
    std::fprintf(stderr, "sarpta: %s: [Scene] lacks a needed key\n", a["--truth"].c_str());
    return 10;
  }

  PtaOptions opt;
  opt.window = static_cast<int>(num("--window", 32));
  if (!isPowerOfTwo(opt.window) || opt.window < 8) {
    std::fprintf(stderr, "sarpta: --window must be a power of two of at least 8\n");
    return 10;
  }
  // Defaults from the truth, replaced by the product record when one is
  // given, and by explicit options above both.
  double azWindow = 1.0, azBand = 1.0, rgWindow = 1.0, rgBand = std::fabs(chirpBand) / fs;
  double t0 = firstLine, dt = 1.0 / prf, r0 = swst, dr = 1.0 / fs;
  long lines = 0, samples = 0;
  bool big = false;
  GeneralSAR record;
  const bool haveRecord = a.count("--record") > 0;
  if (haveRecord) {
    if (record.GSread(a["--record"]) != 0) {
      std::fprintf(stderr, "sarpta: %s: not a readable product record\n", a["--record"].c_str());
      return 9;
    }
    const ROI_Obj& roi = record.roi.roi;
    const SpectralWindows_Obj& w = record.spectralWindows;
    lines = roi.Lines;
    samples = roi.Samples;
    t0 = roi.SlowStartTime;
    dt = roi.SlowTimeDelta;
    r0 = roi.FastStartTime;
    dr = roi.FastTimeDelta;
    azWindow = w.AzMatchedFilterCoef;
    azBand = w.AzLookBandwidth;
    rgWindow = w.RgMatchedFilterCoef;
    rgBand = w.RgLookBandwidth;
    big = record.dataFile.ByteOrder == 1;
    if (lines <= 0 || samples <= 0 || dt <= 0 || dr <= 0 || azBand <= 0 || rgBand <= 0) {
      std::fprintf(stderr, "sarpta: %s: record lacks the image layout, time axes or look bands\n",
                   a["--record"].c_str());
      return 10;
    }
  }
  opt.azimuth = {num("--azimuth-window", azWindow), num("--azimuth-band", azBand)};
  opt.range = {num("--range-window", rgWindow), num("--range-band", rgBand)};
  opt.azimuthSpacing = num("--azimuth-spacing", azSpacing);
  opt.rangeSpacing = num("--range-spacing", rgSpacing);
  t0 = num("--first-line-time", t0);
  dt = num("--line-time-step", dt);
  r0 = num("--first-range-time", r0);
  dr = num("--range-time-step", dr);
  const double rangeOffset = a.count("--no-range-offset") ? 0.0 : offset;

  if (a.count("--big-endian")) big = true;
  long long headerBytes = static_cast<long long>(num("--header-bytes", 0));
  int prefix = 0;
  if (a.count("--lines") && a.count("--samples")) {
    lines = std::atol(a["--lines"].c_str());
    samples = std::atol(a["--samples"].c_str());
  } else if (haveRecord) {
    // Layout and byte order from the record.
  } else {
    DataFile raster;
    raster.filename = a["--raster"];
    if (raster.read_hdr(a["--raster"]) != 0 || raster.CellType != 0) {
      std::fprintf(stderr, "sarpta: %s.hdr: no FLOAT_COMPLEX raster layout; give --lines and --samples\n",
                   a["--raster"].c_str());
      return 10;
    }
    lines = raster.NrOfLinesPerImage;
    samples = raster.NrOfPixelsPerLine;
    big = raster.ByteOrder == 1;
    headerBytes = raster.HeaderOffset;
    prefix = raster.RowPrefix;
  }
  ComplexRasterReader image;
  if (!image.open(a["--raster"], lines, samples, big, headerBytes, err, prefix)) {
    std::fprintf(stderr, "sarpta: %s\n", err.c_str());
    return 9;
  }
  const IrMetrics ta = theoreticalMetrics(opt.azimuth, opt.window, opt.upsample);
  // Burst-mode channel: the azimuth theory is that of each target's gated
  // spectrum, from the burst timing of the truth.
  int channel = -1;
  BurstSpec burst;
  if (truth.find("Bursts", "echoes")) {
    if (a.count("--burst-channel")) {
      channel = std::atoi(a["--burst-channel"].c_str());
    } else if (haveRecord) {
      for (int k = 0; k < 2; ++k) {
        const std::string* label = truth.find("Bursts", "polarisation_" + std::to_string(k));
        if (label && *label == record.dataSetInfo.Polarization) channel = k;
      }
    }
    if (channel == 0 || channel == 1) {
      bool bok = true;
      burst.echoes = need(truth, "Bursts", "echoes", bok);
      burst.cycle = need(truth, "Bursts", "cycle_lines", bok);
      burst.firstLine = need(truth, "Bursts", "first_burst_line_" + std::to_string(channel), bok);
      burst.prf = prf;
      if (haveRecord) burst.speed = record.attitude.Eq_speed;
      if (!bok || !haveRecord) {
        std::fprintf(stderr, "sarpta: burst theory needs the truth's [Bursts] keys and --record\n");
        return 10;
      }
    } else {
      channel = -1;
    }
  }
  std::vector<IrMetrics> azimuthTheory;
  const IrMetrics tr = theoreticalMetrics(opt.range, opt.window, opt.upsample);

  std::vector<PtaResult> results;
  int missing = 0;
  std::printf("%-3s %10s %10s %8s %8s %7s %7s %7s %7s %7s %7s %7s %7s %8s\n", "#", "line", "sample", "dLine", "dSample",
              "irwAz", "irwRg", "irwAzM", "irwRgM", "pslrAz", "pslrRg", "islrAz", "islrRg", "dPhase");
  for (int i = 1; i <= targets; ++i) {
    std::string sec("Target");
    sec += std::to_string(i);
    bool tok = true;
    const double ta_ = need(truth, sec, "azimuth_time", tok);
    const double tau = need(truth, sec, "range_time_s", tok);
    const double ph = need(truth, sec, "expected_phase_rad", tok);
    PtaResult r;
    if (!tok) {
      r.message = "truth section " + sec + " incomplete";
    } else {
      // The record's centroid (absolute, Hz) at the target places its azimuth
      // spectrum for the phase at the sub-pixel peak.
      PtaOptions at = opt;
      if (haveRecord) at.azimuthCentroidPrf = record.polynomials.EvaluateDC(tau, ta_) * dt;
      r = analysePointTarget(image, (ta_ - t0) / dt, (tau - r0) / dr + rangeOffset, ph, at);
    }
    IrMetrics own = ta;
    if (channel >= 0 && tok) {
      BurstSpec b = burst;
      b.zeroDopplerLine = (ta_ - firstLine) * prf;
      b.rateHz = -std::fabs(record.polynomials.EvaluateFR(tau, ta_));
      b.centroidHz = record.polynomials.EvaluateDC(tau, ta_);
      if (b.active()) own = burstTheoreticalMetrics(opt.azimuth, b, opt.window, opt.upsample);
    }
    azimuthTheory.push_back(own);
    if (!r.found) {
      ++missing;
      std::printf("%-3d %10.3f %10.3f  not measured: %s\n", i, r.predictedLine, r.predictedSample, r.message.c_str());
    } else {
      std::printf("%-3d %10.3f %10.3f %8.4f %8.4f %7.4f %7.4f %7.3f %7.3f %7.2f %7.2f %7.2f %7.2f %8.4f\n", i,
                  r.peakLine, r.peakSample, r.errorLine, r.errorSample, r.azimuth.irwPixels, r.range.irwPixels,
                  r.irwAzimuthM, r.irwRangeM, r.azimuth.pslrDb, r.range.pslrDb, r.azimuth.islrDb, r.range.islrDb,
                  r.phaseError);
      if (channel >= 0)
        std::printf("    burst theory of channel %d: irwAz %.4f pixels, pslrAz %.2f, islrAz %.2f dB\n", channel,
                    own.irwPixels, own.pslrDb, own.islrDb);
    }
    results.push_back(r);
  }
  std::printf("theory  irwAz %.4f irwRg %.4f pixels, pslrAz %.2f pslrRg %.2f, islrAz %.2f islrRg %.2f dB\n",
              ta.irwPixels, tr.irwPixels, ta.pslrDb, tr.pslrDb, ta.islrDb, tr.islrDb);

  if (a.count("--json")) {
    std::FILE* f = std::fopen(a["--json"].c_str(), "w");
    if (!f) {
      std::fprintf(stderr, "sarpta: cannot write %s\n", a["--json"].c_str());
      return 5;
    }
    auto metrics = [f](const char* name, const IrMetrics& m, const char* tail) {
      std::fprintf(f, "\"%s\": {\"irw_pixels\": %.6f, \"pslr_db\": %.4f, \"islr_db\": %.4f}%s", name, m.irwPixels,
                   m.pslrDb, m.islrDb, tail);
    };
    std::fprintf(f, "{\n  \"theory\": {");
    metrics("azimuth", ta, ", ");
    metrics("range", tr, "},\n  \"targets\": [\n");
    for (std::size_t i = 0; i < results.size(); ++i) {
      const PtaResult& r = results[i];
      std::fprintf(f, "    {\"index\": %zu, \"found\": %s, \"predicted_line\": %.6f, \"predicted_sample\": %.6f", i + 1,
                   r.found ? "true" : "false", r.predictedLine, r.predictedSample);
      if (r.found) {
        std::fprintf(f,
                     ", \"peak_line\": %.6f, \"peak_sample\": %.6f, \"error_line\": %.6f, \"error_sample\": %.6f, "
                     "\"peak_amplitude\": %.6g, \"phase_rad\": %.6f, \"expected_phase_rad\": %.6f, "
                     "\"phase_error_rad\": %.6f, \"irw_azimuth_m\": %.4f, \"irw_range_m\": %.4f, ",
                     r.peakLine, r.peakSample, r.errorLine, r.errorSample, r.peakAmplitude, r.phase, r.expectedPhase,
                     r.phaseError, r.irwAzimuthM, r.irwRangeM);
        metrics("azimuth", r.azimuth, ", ");
        metrics("range", r.range, ", ");
        metrics("azimuth_theory", azimuthTheory[i], "");
      } else {
        std::string m;
        for (char c : r.message) m += (c == '"' || c == '\\') ? '\'' : c;
        std::fprintf(f, ", \"message\": \"%s\"", m.c_str());
      }
      std::fprintf(f, "}%s\n", i + 1 < results.size() ? "," : "");
    }
    std::fprintf(f, "  ]\n}\n");
    std::fclose(f);
  }
  return missing ? 1 : 0;
}
