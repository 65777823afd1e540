#pragma once
// What the orbit file readers share: the state-vector table of a scene, the
// nine-point Lagrange interpolation, the points of an orbit file as they
// stand, and the inertial to Earth-fixed rotation. Each file format has its
// reader beside this header: doris_orbit.h (DORIS-type products), deos_orbit.h
// (DEOS ODR arcs of ERS), palsar_orbit.h (the PALSAR forms) and
// radarsat_orbit.h. Each turns the file into Earth-fixed positions and
// velocities at the times of a uniform state-vector table.
//
// All times are seconds since 01-JAN-1985. Vectors are stored x y z per
// point, metres and metres per second.
#include <string>
#include <vector>

// Spacing of the state-vector tables built from orbit files, seconds.
inline constexpr double kOrbitTableDt = 5.0;
// Spacing of the points of DEOS and PALSAR orbit files, seconds.
inline constexpr double kOrbitFileStep = 60.0;

// Table of a scene that starts at t and lasts `duration` seconds, spacing dt:
// under 15 s five vectors centred on the scene, else the scene widened by 20 %
// on both sides with an odd count.
void orbitTableSize(double t, double duration, double dt, double* t0, int* nSV);
// RADARSAT form: t is the centre of the scene.
void orbitTableSizeCentred(double t, double duration, double dt, double* t0, int* nSV);

// Nine-point Lagrange interpolation on equally spaced nodes (barycentric
// form). pts: 9 x 3 values, times: the 9 node times; out: n x 3 values at
// outTimes. A time on a node gives that node's vector exactly.
int interp_orb_Lagrange(const double* pts, const double* times, double* out,
                        const double* outTimes, int n);

// Points of an orbit file as they stand.
struct OrbitRecords {
  std::vector<double> times;  // seconds since 1985
  std::vector<double> pos;    // 3 per point
  std::vector<double> vel;    // 3 per point
  std::vector<int> orbit;     // absolute orbit number (DORIS-type files only)
  int size() const { return static_cast<int>(times.size()); }
};

// n positions and velocities at t0 + k dt from the nine points of `rec`
// around tCentre. Status 1 with fewer than nine points.
int interp_orb_records(const OrbitRecords& rec, double tCentre, double t0, double dt, int n,
                       double* pos, double* vel);

// Greenwich mean sidereal angle (radians) at a time since 1985.
double greenwich_angle(double sec85);
// Inertial (true of date, rotation about z only) to Earth-fixed at angle g.
void inertial_to_earth_fixed(double g, const double posIn[3], const double velIn[3],
                             double posOut[3], double velOut[3]);
