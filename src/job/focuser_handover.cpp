// Hand-over to the focusing chain. This build has no multi-platform focuser
// yet: the job stops at its parameter check, the stage failure the host
// expects from a focuser that cannot run.
#include "job/focuser_handover.h"

#include "diag/report.h"

namespace {

class UnavailableFocuser : public JobFocuser {
 public:
  int checkpar() override {
    ORV_REPORT("Multi-platform focuser not available in this build, platform " + job.platform,
               REPORT_ERROR);
    return 1;
  }
  int InitProcessing() override { return 1; }
  int run() override { return 1; }
  int FinalizeProcessing(const char*, int) override { return 1; }
};

}  // namespace

std::unique_ptr<JobFocuser> makeJobFocuser() { return std::make_unique<UnavailableFocuser>(); }
