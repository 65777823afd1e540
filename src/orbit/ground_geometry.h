#pragma once
// Ground point geometry beneath the orbit model: orbit polynomial evaluation,
// the forward solution (platform state, range time, Doppler) -> ground point,
// the inverse ground point -> (azimuth time, range time), and conversions
// between Cartesian and geodetic coordinates. Positions in metres, velocities
// in metres per second, Earth-fixed unless a rotation rate is passed. Angles of
// xyz2geo / xyz2llh / geo2cart / llh2xyz are radians. Functions return 0 on
// success.
#include "orbit/vector_kernels.h"

// WGS-84 squared semi-axes as used by the ground solutions.
inline constexpr double kWgs84A2 = 40680631590769.0;
inline constexpr double kWgs84B2 = 40408299984659.16;
// Earth gravitational constant, km^3/s^2 (only for Otrulat).
inline constexpr double kEarthGM = 398600.47;

// Orbit polynomials are n coefficients, highest power first:
// c[0] u^(n-1) + ... + c[n-1].
// Value, first and second derivative by ascending powers of u (no pow()).
double POSMACRO(double u, const double* c, int n);
double VELMACRO(double u, const double* c, int n);
double ACCMACRO(double u, const double* c, int n);
// The same through a power function; 0 for n below 1, 2, 3 respectively.
double pos(double u, const double* c, int n);
double vel(double u, const double* c, int n);
double acc(double u, const double* c, int n);
// Position, velocity and acceleration of a quartic orbit (5 coefficients per axis).
void POSVELACC_5(double u, const double* cx, const double* cy, const double* cz, double p[3],
                 double v[3], double a[3]);

// Order n - 1 polynomials (highest power first) through n equally spaced
// 3-vectors pts[3 i + k] at times t0 + i dt. With t0 = 0 they run from the
// first point. Status of the fit is passed on (7 when memory is out).
int orb_interp(double t0, const double* pts, double dt, double* cx, double* cy, double* cz, int n);

// First guess of the ground point for platform position S, velocity V,
// two-way range time tau; omega is the Earth rotation rate to add to V
// (0 for Earth-fixed velocities). Status 1: singular plane system; 2: no
// intersection (range too short).
int gr_pt0(double out[3], const double S[3], const double V[3], double tau, double lambda,
           double omega, double lookSign, double a, double b);
// Ground point at range time tau and Doppler fd on the ellipsoid (a, b), by
// Newton iteration from gr_pt0. lookSign +1 right of the velocity, -1 left.
int gr_pt(double out[3], const double S[3], const double V[3], double tau, double fd, double lambda,
          double omega, double lookSign, double a, double b);

// Inverse solution: azimuth time *t (seconds from the polynomials' origin) and
// two-way range time *tau at which ground point P is seen with Doppler fd.
// Quartics cx, cy, cz span 0 .. tMax; status 12 if the iterate leaves the span.
int inv_grpt_opt(double* t, double* tau, const double* cx, const double* cy, const double* cz,
                 const double P[3], double tMax, double lambda, double fd);
// The same for polynomials of n coefficients.
int inv_grpt_opt_NSV(double* t, double* tau, const double* cx, const double* cy, const double* cz,
                     const double P[3], double tMax, double lambda, double fd, int n);
// The same from five positions pts[15] spaced dt (time 0 at the first): fits
// the quartics, then exactly 8 rounds; leaving the span writes a line to the
// standard error stream and returns 12.
int inv_grpt(double* t, double* tau, const double* pts, const double P[3], double dt, double lambda,
             double fd);
// The same from n positions pts[3 n].
int inv_grpt_NSV(double* t, double* tau, const double* pts, const double P[3], double dt,
                 double lambda, double fd, int n);

// In/out record of gr_pt_lat_lon.
struct grPtRecord {
  double pos[15];       // in: five consecutive positions
  double t0;            // in: time of the first
  double dt;            // in: spacing
  double t;             // in: azimuth time of the query
  double tau;           // in: two-way range time
  double fd;            // in: Doppler of the solution, Hz
  double lambda;        // in: wavelength
  double lookSign;      // in: +1 right, -1 left
  double height;        // in: height over the ellipsoid, m
  double x, y, z;       // out: ground point
  double lat, lon;      // out: geodetic, degrees
  double trackHeading;  // out: degrees, signed
  double incidence;     // out: degrees
  double look;          // out: degrees
  double groundSpeed;   // out: platform speed scaled to the ground
  double beamSpeed;     // out: effective speed
  double fmRate;        // out: Doppler rate, Hz/s
};

// Everything about the ground point of a record; -1 if t lies outside the
// five-vector window by more than half a spacing.
int gr_pt_lat_lon(grPtRecord* rec, double a, double b);
// The same from explicit Earth-fixed vectors S, V and acceleration A.
int gr_pt_lat_lon_s_osculated(grPtRecord* rec, const double S[3], const double V[3],
                              const double A[3], double a, double b);
// The same without acceleration (no Doppler rate).
int gr_pt_lat_lon_s(grPtRecord* rec, const double S[3], const double V[3], double a, double b);

// Cartesian to geodetic latitude and longitude (radians). Keeps the fixed
// 6378137.0 of the original formula in place of a.
void xyz2geo(const double xyz[3], double latlon[2], double a, double b);
// Cartesian to geodetic latitude, longitude (radians) and height (m).
void xyz2llh(const double xyz[3], double llh[3], double a, double b);
// Geodetic (lat, lon radians, h metres) to Cartesian on WGS-84.
void geo2cart(double xyz[3], const double llh[3]);
// Geodetic to Cartesian on the ellipsoid (a, b).
void llh2xyz(double xyz[3], const double llh[3], double a, double b);

// Argument of latitude (radians) of the osculating Kepler orbit of S, V.
int Otrulat(const double S[3], const double V[3], double* out);
// Angle of S at time t (rotated by the Earth rotation since t0) from the first
// of two node vectors nodes[0..2], nodes[3..5]; negated if above the angle to
// the second.
double compute_ulat(const double S[3], double t, const double nodes[6], double t0);
// Look angle in degrees at platform S for ground point X (side non-zero: the
// supplement form); *squint = -asin(unit(V) . unit(X - S)) in degrees.
double rr2th(const double X[3], const double V[3], const double S[3], int side, double* squint);

// Baseline between two orbits given by five positions each (time 0 at their
// first vector): t on the first orbit, range time tau. out = (horizontal,
// along the line of sight, normal). Slave time and range time optional.
// Status 12: t outside the first span; 13: inverse failed; 14: slave time
// outside the second span.
int baseline(double t, const double* pts1, const double* pts2, double dt1, double dt2, double tau,
             double lambda, double fd, double lookSign, double out[3], double* tSlave = nullptr,
             double* tauSlave = nullptr);
