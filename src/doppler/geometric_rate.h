#pragma once
// Doppler rate of a scene from its orbit, as a polyFR: the range terms at
// the scene centre and their change along the scene.
class GeneralSAROrbit;
class polyDC;
class polyFR;

// Rates of ten points across the swath (samples / frg seconds from swstMin,
// seen at the centroid of dc) at the scene centre and at its first and last
// lines, tStart and tEnd. The centre fit gives the constant, x and x^2
// terms; the ends give the y and x y terms (per second, reference the
// scene centre): an orbit's rate drifts by some 1e-5 per second, which
// matters to the phase of scenes far from zero Doppler. Range reference
// swstMin. Status 0, or the orbit's failure.
int geometricRatePoly(GeneralSAROrbit& orbit, double tStart, double tEnd, double swstMin, int samples,
                      double frg, double fc, const polyDC& dc, double lookSign, polyFR& fr);
