#pragma once
// Fourier interpolation of a complex block along one axis: the spectrum of
// each row (or column) is zero-padded from n to m bins and transformed back,
// so that a band-limited signal is resampled m/n times more densely with its
// amplitude kept.
#include "base/fcomplex.h"
#include "core/fft.h"

class interp {
 public:
  interp() = default;
  ~interp() { destroyplans(); }
  interp(const interp&) = delete;
  interp& operator=(const interp&) = delete;

  // Blocks of in_rows rows of in_samples become out_rows rows of
  // out_samples. Exactly one axis may change (or none: a copy). 0, or 1
  // when both change (no plans are made) or a transform cannot be planned.
  int setplans(int in_samples, int in_rows, int out_samples, int out_rows);
  // Interpolates `in` (overwritten by its spectrum) into `out`, which holds
  // out_rows x out_samples samples. 0, or 1 without plans.
  int interpft_p(fcomplex* in, fcomplex* out);
  void destroyplans();
  // Forgets the sizes and releases the plans.
  void resetplans();

 private:
  enum Axis { NONE, ROWS_CHANGE_SAMPLES, COLUMNS_CHANGE_ROWS };

  FFTPlan forward_{};   // in place over the input block
  FFTPlan backward_{};  // in place over the output block
  int outRows_ = 0;
  int inRows_ = 0;
  int inSamples_ = 0;
  int outSamples_ = 0;
  Axis axis_ = NONE;
  bool planned_ = false;
};
