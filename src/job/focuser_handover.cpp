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

  void toFocuser() {
    ATmultiplatformFocuser& f = focuser_;
    f.Memory = job.Memory;
    f.ReportFilename = job.ReportFilename;
    f.ReportLevel = job.ReportLevel;
    f.Incore = job.Incore;
    f.Verbose = job.Verbose;
    f.processingConfFilename = job.processingConfFilename;
    f.platform = job.platform;
    f.level0Filename = job.level0Filename;
    f.level0FilenameSecondPol = job.level0FilenameSecondPol;
    f.level0FilenameThirdPol = job.level0FilenameThirdPol;
    f.level0FilenameFourthPol = job.level0FilenameFourthPol;
    f.outputFilename = job.outputFilename;
    f.auxFile1 = job.auxFile1;
    f.auxFile2 = job.auxFile2;
    f.auxFile3 = job.auxFile3;
    f.auxFile4 = job.auxFile4;
    f.auxFile5 = job.auxFile5;
    f.auxDirectory1 = job.auxDirectory1;
    f.auxDirectory2 = job.auxDirectory2;
    f.auxDirectory3 = job.auxDirectory3;
    f.auxDirectory4 = job.auxDirectory4;
    f.auxDirectory5 = job.auxDirectory5;
    f.skipLines = job.skipLines;
    f.extractLines = job.extractLines;
    f.eraseTemporaryFiles = job.eraseTemporaryFiles;
  }

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
