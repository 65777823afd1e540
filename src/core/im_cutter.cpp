#include "core/im_cutter.h"

#include <cmath>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"

namespace {

// Extra raw samples that the range walk adds to a focused row.
int walkSamples(const ImCutGeometry& g) {
  if (g.fastDelta <= 0.0) return 0;
  return static_cast<int>(std::ceil(std::fabs(g.rgShift) / g.fastDelta - 1e-9));
}

}  // namespace

int getDCshift(double squintRad, double midRange, double veq, int interpolation, int shiftStep,
               double& azShift, double& rgShift) {
  azShift = 0.0;
  rgShift = 0.0;
  if (!shiftStep) return 0;
  if (veq != 0.0) azShift = std::tan(squintRad) * midRange / veq;
  if (!interpolation)
    rgShift = 2.0 * (1.0 / std::cos(squintRad) - 1.0) * midRange / consts::kSpeedOfLight;
  return 0;
}

int imcutter(const ImCutGeometry& g, const ImBlock& focused, ImBlock& raw) {
  raw = ImBlock{};
  if (g.slowDelta <= 0.0 || g.fastDelta <= 0.0 || focused.lines < 1 || focused.samples < 1) {
    ORV_REPORT("Bad block geometry", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const int halfAperture = g.apertureLines / 2;
  raw.slowStart = focused.slowStart + g.azShift - halfAperture * g.slowDelta;
  raw.lines = focused.lines + g.apertureLines;
  raw.fastStart = focused.fastStart;
  raw.samples = focused.samples + g.replicaLen - 1 + walkSamples(g);
  // Grid positions round half away from zero.
  raw.firstLine = static_cast<int>(std::lround((raw.slowStart - g.slowStart) / g.slowDelta));
  raw.firstSample = static_cast<int>(std::lround((raw.fastStart - g.fastStart) / g.fastDelta));
  raw.slowStart = g.slowStart + raw.firstLine * g.slowDelta;
  raw.fastStart = g.fastStart + raw.firstSample * g.fastDelta;
  if (raw.firstLine < 0 || raw.firstSample < 0 ||
      static_cast<long long>(raw.firstLine) + raw.lines > g.lines ||
      static_cast<long long>(raw.firstSample) + raw.samples > g.samples) {
    ORV_REPORT("Requested focused block cannot be obtained from the given extracted data matrix.",
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  return 0;
}

int imcutter_inv(const ImCutGeometry& g, const ImBlock& raw, ImBlock& focused) {
  focused = ImBlock{};
  const int halfAperture = g.apertureLines / 2;
  focused.lines = raw.lines - g.apertureLines;
  focused.samples = raw.samples - g.replicaLen + 1 - walkSamples(g);
  if (focused.lines < 1 || focused.samples < 1) return STATUS_BAD_CONDITION;
  focused.slowStart = g.slowStart + raw.firstLine * g.slowDelta - g.azShift +
                      halfAperture * g.slowDelta;
  focused.fastStart = g.fastStart + raw.firstSample * g.fastDelta;
  return 0;
}
