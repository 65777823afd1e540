#pragma once
// Readers of the PALSAR orbit forms.
#include <string>

#include "orbit/orbit_files.h"

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
// Start of the state vectors of the platform position record of a PALSAR
// CEOS leader (the record after the 4096-byte data set summary): the first
// time in seconds since 1985 from the date at 144..152 (I4 each) and the
// seconds of day at 160 (22 characters), and the spacing at 182 as written
// (22 characters) and as a value. 9 when the leader does not open, 4 when it
// is short or the date is not a date from 1985 on (both reported).
int read_palsar_leader_timing(const std::string& leader, double& firstTime,
                              std::string& stepText, double& step);
