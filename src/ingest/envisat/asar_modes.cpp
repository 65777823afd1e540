// Acquisition modes of ASAR level-0 products and the report switch of the
// packet-head checks.
#include "ingest/envisat/asar_records.h"

namespace {
constexpr AsarModeInfo kModes[6] = {
    {"IM", 1, 84, 1556, 1, 7},    {"WS", 5, 91, 1563, 15, 5},   {"APC", 2, 103, 1543, 1, 7},
    {"APH", 2, 104, 1544, 1, 7},  {"APV", 2, 164, 1549, 1, 7},  {"GM", 5, 171, 1387, 15, 5},
};
bool reportsOn = true;
}  // namespace

const AsarModeInfo& asarModeInfo(int mode) { return kModes[mode >= 0 && mode < 6 ? mode : 0]; }

bool asar_reports_on() { return reportsOn; }
void set_asar_reports(bool on) { reportsOn = on; }
