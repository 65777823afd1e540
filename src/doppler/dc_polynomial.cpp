#include "doppler/dc_polynomial.h"

#include "base/status.h"
#include "diag/report.h"

int dcnapoly(DcEstInput&, DcEstState&, double poly[7]) {
  for (int i = 0; i < 7; ++i) poly[i] = 0.0;
  ORV_REPORT("Doppler polynomial fit not available", REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}
