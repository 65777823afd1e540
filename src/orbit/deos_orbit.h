#pragma once
// Reader of the DEOS ODR precise orbit arcs of ERS.
#include <string>

#include "orbit/orbit_files.h"

// DEOS ODR arc: checks the satellite ("ERS1" or "ERS2") and the coverage of t,
// converts the records to Cartesian and interpolates n positions at
// t0 + k dt from the nine records around t. Status 9, 4 or 1.
int interp_orb_deos(const std::string& path, double t, const std::string& satellite, double t0,
                    double dt, int n, double* pos);
// All records of a DEOS ODR arc in Cartesian form (no velocities).
int read_deos_odr(const std::string& path, OrbitRecords& out, std::string* satelliteName = nullptr);
// Geodetic (degrees, metres) to Cartesian as the DEOS arcs need it.
void deos_to_cartesian(double latDeg, double lonDeg, double height, double xyz[3]);
