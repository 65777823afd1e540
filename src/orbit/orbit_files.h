#pragma once
// Readers of precise orbit files: DORIS-type ASCII products (DOR_VOR_AX,
// DOR_POR_AX, AUX_FRO_AX, AUX_FPO_AX), DEOS ODR arcs of ERS, the three PALSAR
// forms (CEOS leader, ALEOCF, ALDSEF) and RADARSAT text orbit files. Each
// turns the file into Earth-fixed positions and velocities at the times of a
// uniform state-vector table, by nine-point Lagrange interpolation.
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

// DORIS-type reader. n vectors at t + (i - (n - 1) / 2) dt into pos (and vel
// when not null). orbitOut (if not null) gets the absolute orbit of the record
// nearest to t. With wantNode 1, nodeOut gets the time of the first ascending
// node crossing found before t.
// Status: 9 not opened, 12 not a DORIS-type product, 13 time outside the
// sensing interval, 4 read failure, 1 no ascending node.
int interp_orb_l(const std::string& path, double t, int n, double dt, double* pos, double* vel,
                 int* orbitOut = nullptr, int wantNode = 0, double* nodeOut = nullptr);

// The records of a DORIS-type file with tStart <= time <= tStop, unchanged.
int get_state_vectors(const std::string& path, double tStart, double tStop, OrbitRecords& out);

// DEOS ODR arc: checks the satellite ("ERS1" or "ERS2") and the coverage of t,
// converts the records to Cartesian and interpolates n positions at
// t0 + k dt from the nine records around t. Status 9, 4 or 1.
int interp_orb_deos(const std::string& path, double t, const std::string& satellite, double t0,
                    double dt, int n, double* pos);
// All records of a DEOS ODR arc in Cartesian form (no velocities).
int read_deos_odr(const std::string& path, OrbitRecords& out, std::string* satelliteName = nullptr);
// Geodetic (degrees, metres) to Cartesian as the DEOS arcs need it.
void deos_to_cartesian(double latDeg, double lonDeg, double height, double xyz[3]);

// PALSAR forms: the points of the file, 60 s apart, Earth-fixed.
// CEOS leader: the platform position record (record type 30): point count at
// 140 (I4), year, month, day, day of year at 144..156 (I4 each), seconds of
// day at 160 (D22.15), points from 386 as six D22.15 fields (x y z vx vy vz),
// leap-second flag at 4082. The processing facility of the data set summary
// (record type 10, 16 characters at 1046) "VEXCEL" dates the points from the
// day of year instead of month and day.
int read_palsar_leader_orbit(const std::string& path, OrbitRecords& out);
// ALEOCF / ALDSEF files: frame "ECR" or "ECI" at 88, file date at 498 (10
// characters, digits YYYYMMDD with any separators) and 508 (8, time of day), 170-byte
// records from 808: YYYYMMDDhhmmss (14 digits), microseconds (6 digits), then
// x y z vx vy vz in six fields of 25 characters (m, m/s).
int read_palsar_orbit_file(const std::string& path, OrbitRecords& out);

// RADARSAT text orbit file, rotated to Earth-fixed. Blocks, each on a line
// of its own and found by name in this order:
//   GENERATION TIME: YYYY DDD HH:MM:SS.ffffff
//   ORBIT NUMBER: n
//   GREENWICH ANGLE: YYYY DDD HH:MM:SS.ffffff angle-in-degrees
//   FIRST MODEL: text           SECOND MODEL: text
// then one line per vector, inertial (true of date), metres and m/s:
//   STATE VECTOR: YYYY DDD HH:MM:SS.ffffff x y z vx vy vz
// Times are day of year of the given year. Status 9, 1 (block missing, with
// its message) or 4 (no vectors).
int read_radarsat_orbit(const std::string& path, OrbitRecords& out);
// RADARSAT reader: n vectors at t + (i - (n - 1) / 2) dt.
int interp_orb_l_v2(const std::string& path, double t, int n, double dt, double* pos, double* vel);

// n positions and velocities at t0 + k dt from the nine points of `rec`
// around tCentre. Status 1 with fewer than nine points.
int interp_orb_records(const OrbitRecords& rec, double tCentre, double t0, double dt, int n,
                       double* pos, double* vel);

// Greenwich mean sidereal angle (radians) at a time since 1985.
double greenwich_angle(double sec85);
// Inertial (true of date, rotation about z only) to Earth-fixed at angle g.
void inertial_to_earth_fixed(double g, const double posIn[3], const double velIn[3],
                             double posOut[3], double velOut[3]);
