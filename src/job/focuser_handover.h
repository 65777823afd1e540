#pragma once
#include <memory>
#include <string>
#include <vector>

#include "focus/job_fields.h"

// The focuser as the job driver sees it: fields filled by the driver, then
// checkpar, InitProcessing, run, FinalizeProcessing in this order; each
// returns 0 on success. An implementation copies back into `job` what the
// focuser found by itself (auxiliary files), since product finishing reads
// those fields after FinalizeProcessing.
class JobFocuser {
 public:
  virtual ~JobFocuser() = default;
  virtual int checkpar() = 0;
  virtual int InitProcessing() = 0;
  virtual int run() = 0;
  virtual int FinalizeProcessing(const char* file, int channel) = 0;

  FocuserJobFields job;
};

// Builds the focuser of a job.
std::unique_ptr<JobFocuser> makeJobFocuser();

// Final names, parameter stores, headers and GeoTIFF of the products of a
// finished job. `parameters` is the job (element 0 the platform), and
// `alternatingPolarisation` the flag of the chosen profile.
void finishJobProducts(const JobFocuser& focuser, const std::vector<std::string>& parameters,
                       int alternatingPolarisation);
