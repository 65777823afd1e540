#pragma once
// Doppler rate of a scene from its orbit, as a polyFR: the range terms at
// the scene centre and their change along the scene.
class GeneralSAROrbit;
class polyDC;
class polyFR;

// Rates of ten points across the swath (samples / frg seconds from swstMin,
// seen at the centroid of dc) at the scene centre and at its first and last
// lines, tStart and tEnd. A point's rate is that of the hyperbola through
// its range and Doppler at the beam centre and its closest range, scaled so
// that the hyperbola the focusing kernel builds from the polynomial (a speed
// and a range from the rate's change across the swath) has the depth of
// the point's range migration; below 1 Hz of centroid the orbit's local
// rate. The centre fit, a cubic, gives the constant, x, x^2 and x^3 terms;
// the ends give the y and x y terms (per second, reference the scene
// centre): an orbit's rate drifts by some 1e-5 per second, which matters to
// the phase of scenes far from zero Doppler. Range reference swstMin, the
// time of the range-focused samples; the compressed peak of an echo lies
// peakDelay seconds after its two-way delay (see compressedPeakDelay), and
// the points are taken at the delays of the samples' peaks. Status 0, or
// the orbit's failure.
int geometricRatePoly(GeneralSAROrbit& orbit, double tStart, double tEnd, double swstMin, double peakDelay,
                      int samples, double frg, double fc, const polyDC& dc, double lookSign, polyFR& fr);

// Delay of the compressed peak of an echo after its two-way delay, s: the
// range compressor correlates with a replica of `replicaSamples` samples
// centred on the pulse centre, so the peak of a pulse of `pulseLength`
// seconds sampled at frg falls (frg T - (n - 1)) / 2 samples after the
// echo's start (0.4 of a sample for ERS, 3 m of slant range: the rate of
// the wrong range, 4e-6, is 8 degrees of peak phase three PRFs from zero
// Doppler). 0 where the replica does not span the pulse (more than two
// samples apart).
double compressedPeakDelay(double pulseLength, int replicaSamples, double frg);
