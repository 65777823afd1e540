#pragma once
// Geolocation grids and polynomials without a GeneralSAROrbit: the orbit is
// given as five positions (time 0 at the first), the Doppler centroid as a
// polyDC. The GeneralSAROrbit members SVGetGeoCoords, SVGetSlantToAnglesPolys,
// SVGetTimeToAnglesPolys, SVGetGroundToSlantPolys and SVGetGroundToTimePolys
// are in geo_grid.cpp as well.
class polyDC;

// Doppler centroid of the polynomial at range time tau and azimuth time t.
double DCeval(const polyDC* dc, double tau, double t);

// ny x nx grid from (t0, tau0) with steps dt, dtau (row j = azimuth): Doppler
// rate (Hz/s), incidence and look (degrees) of each point, row-major; any
// output may be null. pos: five positions spaced svDt from svT0; fc carrier
// frequency (wavelength c / fc). The first failing point's status is returned.
int get_geo_grid(double t0, double tau0, int ny, int nx, double dt, double dtau, double* outFr,
                 double* outInc, double* outLook, const double pos[15], double svT0, double svDt,
                 double fc, const polyDC* dc, double lookSign);

// Fits of the middle row of such a grid against the range offset i dtau:
// nTerms coefficients (1 to 4, lowest power first) per quantity; null
// outputs are skipped.
int get_poly(const double* fr, const double* inc, const double* look, int ny, int nx, double dtau,
             int nTerms, double* frPoly, double* incPoly, double* lookPoly);

// Ten points across the swath at azimuth t: nSamples / fs seconds from tau0,
// then get_poly.
int getgeopoly(double t, double tau0, int nSamples, double fs, const double pos[15], double svT0,
               double svDt, double fc, const polyDC* dc, double lookSign, int nTerms,
               double* frPoly, double* incPoly, double* lookPoly);
