// Hand-over to the focusing chain: the job's fields go into the
// multi-platform focuser before each call, and what it found by itself
// (auxiliary files looked up in their folders) comes back after it.
#include "job/focuser_handover.h"

#include "focus/multiplatform_focuser.h"

namespace {

class MultiplatformJobFocuser : public JobFocuser {
 public:
  int checkpar() override { return call([this] { return focuser_.checkpar(); }); }
  int InitProcessing() override { return call([this] { return focuser_.InitProcessing(); }); }
  int run() override { return call([this] { return focuser_.run(); }); }
  int FinalizeProcessing(const char* file, int channel) override {
    return call([&] { return focuser_.FinalizeProcessing(file ? file : "", channel); });
  }

 private:
  template <class Call>
  int call(Call&& operation) {
    toFocuser();
    const int status = operation();
    fromFocuser();
    return status;
  }

  void toFocuser() { static_cast<FocuserJobFields&>(focuser_) = job; }

  // The fills write the files they found into the auxiliary parameters.
  void fromFocuser() {
    job.auxFile1 = focuser_.auxFile1;
    job.auxFile2 = focuser_.auxFile2;
    job.auxFile3 = focuser_.auxFile3;
    job.auxFile4 = focuser_.auxFile4;
    job.auxFile5 = focuser_.auxFile5;
  }

  ATmultiplatformFocuser focuser_;
};

}  // namespace

std::unique_ptr<JobFocuser> makeJobFocuser() {
  return std::make_unique<MultiplatformJobFocuser>();
}
