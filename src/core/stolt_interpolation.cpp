#include "core/stolt_interpolation.h"

#include "base/status.h"
#include "diag/report.h"

int ChirpInterpWK(AzimuthBlockPar&, int, int, int, const double*, const double*, const double*,
                  double, double, double) {
  ORV_REPORT("ChirpInterpWK: not available in this build", REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}

int LSInterpWK(AzimuthBlockPar&, int, int, int, const double*, const double*, const double*,
               double, double, double) {
  ORV_REPORT("LSInterpWK: not available in this build", REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}
