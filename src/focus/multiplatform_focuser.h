#pragma once
// The focuser of a job: holds the job's parameters, builds the sensor
// focuser of the platform through the sensor registry, hands it the scene and
// the auxiliary files (looking up the ones that were given only as a search
// folder), runs it and afterwards erases the temporary rasters of the chain
// on request.
#include <memory>
#include <string>

#include "focus/job_fields.h"
#include "product/general_sar_base.h"

class stripmapGeneralFocuser;

class ATmultiplatformFocuser : public GeneralSAR_Base, public FocuserJobFields {
 public:
  using FocuserJobFields::Incore;
  using FocuserJobFields::Memory;
  using FocuserJobFields::ReportFilename;
  using FocuserJobFields::ReportLevel;
  using FocuserJobFields::Verbose;

  ATmultiplatformFocuser();
  ~ATmultiplatformFocuser() override;

  int createBuffers() override;
  int destroyBuffers() override;
  void refreshParameters() override;

  // 1 for negative skipLines or extractLines, else 0.
  int checkpar();
  // Element block "ATmultiplatformFocuser" of a parameter document; reading
  // keeps the present values where the document has none.
  int readpar(const std::string& file, int channel);
  int writepar(const std::string& file, int channel);
  // Builds, fills and checks the sensor focuser of `platform`. 0, 1 without a
  // report name, 10 for a missing or unknown platform, a missing auxiliary
  // file, a failed check or a platform whose focuser this build lacks.
  int InitProcessing();
  // The sensor focuser's run; its failing status is handed on.
  int run();
  // Erases the chain's temporary files when eraseTemporaryFiles is 1, then
  // destroys the sensor focuser. 10 for an unknown platform (the focuser is
  // destroyed all the same).
  int FinalizeProcessing(const std::string& file, int channel);
  // Configuration file of the document, readpar, checkpar, InitProcessing,
  // run, FinalizeProcessing; the first failure ends it.
  int runall(const std::string& file, int channel);

  // The sensor focuser between InitProcessing and FinalizeProcessing.
  stripmapGeneralFocuser* sensorFocuser() { return focuser_.get(); }

  // Copies the profile and the output root into the sensor focuser.
  void fillCommon(stripmapGeneralFocuser& focuser);

 private:
  std::unique_ptr<stripmapGeneralFocuser> focuser_;
};
