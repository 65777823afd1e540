#include "core/interp.h"

#include <algorithm>
#include <cstring>

#include "base/status.h"

int interp::setplans(int in_samples, int in_rows, int out_samples, int out_rows) {
  destroyplans();
  if (in_samples < 1 || in_rows < 1 || out_samples < 1 || out_rows < 1)
    return STATUS_BAD_CONDITION;
  const bool samplesChange = in_samples != out_samples;
  const bool rowsChange = in_rows != out_rows;
  if (samplesChange && rowsChange) return STATUS_BAD_CONDITION;
  inSamples_ = in_samples;
  inRows_ = in_rows;
  outSamples_ = out_samples;
  outRows_ = out_rows;
  axis_ = NONE;
  if (samplesChange) {
    axis_ = ROWS_CHANGE_SAMPLES;
    if (fft_makep_c(backward_, out_samples, out_samples, out_rows, out_rows, FFT_BACKWARD_NORMALISED,
                    FFT_NONE, 1) != 0 ||
        fft_makep_c(forward_, in_samples, in_samples, in_rows, in_rows, FFT_FORWARD, FFT_NONE, 1) != 0) {
      destroyplans();
      return STATUS_BAD_CONDITION;
    }
  } else if (rowsChange) {
    axis_ = COLUMNS_CHANGE_ROWS;
    if (fft_makep_c(backward_, in_samples, in_samples, out_rows, out_rows, FFT_NONE,
                    FFT_BACKWARD_NORMALISED, 1) != 0 ||
        fft_makep_c(forward_, in_samples, in_samples, in_rows, in_rows, FFT_NONE, FFT_FORWARD, 1) != 0) {
      destroyplans();
      return STATUS_BAD_CONDITION;
    }
  }
  planned_ = true;
  return 0;
}

void interp::destroyplans() {
  if (forward_.row || forward_.col) fft_destp_c(forward_);
  if (backward_.row || backward_.col) fft_destp_c(backward_);
  forward_ = FFTPlan{};
  backward_ = FFTPlan{};
  planned_ = false;
}

void interp::resetplans() {
  destroyplans();
  outRows_ = inRows_ = inSamples_ = outSamples_ = 0;
  axis_ = NONE;
}

int interp::interpft_p(fcomplex* in, fcomplex* out) {
  if (!planned_) return STATUS_BAD_CONDITION;
  if (axis_ == NONE) {
    std::memcpy(static_cast<void*>(out), in, sizeof(fcomplex) * size_t(inRows_) * size_t(inSamples_));
    return 0;
  }
  const bool alongRows = axis_ == ROWS_CHANGE_SAMPLES;
  const int n = alongRows ? inSamples_ : inRows_;
  const int m = alongRows ? outSamples_ : outRows_;
  const int p = n % 2 == 0 ? n / 2 + 1 : (n + 1) / 2;
  const int lines = alongRows ? inRows_ : inSamples_;  // transforms in the block
  const float gain = static_cast<float>(m) / static_cast<float>(n);

  pfft_c(forward_, in, in);
  std::fill(out, out + size_t(outRows_) * size_t(outSamples_), fcomplex(0.0f, 0.0f));

  // Element k of transform j in the input and the output blocks.
  auto inAt = [&](int j, int k) -> fcomplex& {
    return alongRows ? in[size_t(j) * n + k] : in[size_t(k) * inSamples_ + j];
  };
  auto outAt = [&](int j, int k) -> fcomplex& {
    return alongRows ? out[size_t(j) * m + k] : out[size_t(k) * outSamples_ + j];
  };
  const int tail = n - p;  // negative-frequency bins
  for (int j = 0; j < lines; ++j) {
    for (int k = 0; k < p && k < m; ++k) outAt(j, k) = inAt(j, k);
    for (int k = 0; k < tail; ++k) {
      const int target = m - tail + k;
      if (target >= 0 && target < m) outAt(j, target) = inAt(j, p + k);
    }
    if (n % 2 == 0 && p - 1 < m) {
      // The Nyquist bin belongs to both halves: split it.
      const fcomplex half = outAt(j, p - 1) * 0.5f;
      outAt(j, p - 1) = half;
      const int mirror = p - n + m - 1;
      if (mirror >= 0 && mirror < m) outAt(j, mirror) = half;
    }
  }

  const size_t total = size_t(outRows_) * size_t(outSamples_);
  if (alongRows) {
    pfft_c(backward_, out, out);
    for (size_t i = 0; i < total; ++i) out[i] *= gain;
  } else {
    for (size_t i = 0; i < total; ++i) out[i] *= gain;
    pfft_c(backward_, out, out);
  }
  return 0;
}
