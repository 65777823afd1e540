#pragma once
// Reader of DORIS-type precise orbit products (DOR_VOR_AX, DOR_POR_AX,
// AUX_FRO_AX, AUX_FPO_AX).
#include <string>

#include "orbit/orbit_files.h"

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
