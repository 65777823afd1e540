#pragma once
// Reader of RADARSAT text orbit files.
#include <string>

#include "orbit/orbit_files.h"

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
