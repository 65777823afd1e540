#pragma once
// Data-driven refinement of the Doppler-related constant of an azimuth block:
// the energy of the block's lines follows a periodic pattern along azimuth,
// and the phase of its first harmonic places that pattern against the
// current value.

// `data` holds complex samples (interleaved real and imaginary floats) as
// `nRange` rows of `nInner` samples; the first `nAzimuth` rows are the block's
// lines (nAzimuth <= nRange). The line energies are taken every g-th line,
// g being the largest of 8, 4, 2 that still leaves at least 512 of them
// (else 1). With L = 2 pi step / scale, `value` moves to the pattern position
// -phase L / (2 pi) by the wrapped difference d, |d| <= L / 2 (exactly L / 2
// is not wrapped).
//
// Status 0; 1 when fewer than two energies are taken (no first harmonic),
// for non-positive sizes, a null pointer, or a zero or non-finite L;
// 7 when memory runs out; a transform failure is handed up.
int EnPhaseAzCntrlWNestimate(double& value, int nRange, int nAzimuth, int nInner,
                             const float* data, double step, double scale);
