#pragma once
// The focuser of a job: holds the job's parameters, builds the sensor
// focuser of the platform, hands it the scene and the auxiliary files
// (looking up the ones that were given only as a search folder), runs it and
// afterwards erases the temporary rasters of the chain on request.
#include <memory>
#include <string>

#include "product/general_sar_base.h"

class stripmapGeneralFocuser;
class ersLevel0Focuser;
class envisatLevel0Focuser;
class radarsatLevel0Focuser;

class ATmultiplatformFocuser : public GeneralSAR_Base {
 public:
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
  // Scene, lines and memory, then the auxiliary files of each platform; 10
  // with the report when a needed file is neither given nor found.
  int fillErs(ersLevel0Focuser& focuser);
  int fillEnvisat(envisatLevel0Focuser& focuser);
  int fillRadarsat(radarsatLevel0Focuser& focuser);
  // The parameter tests of the PALSAR fills (orbit and leader required).
  int fillPalsarFiles();
  // Scenes of a PALSAR job: 1, or 2, 3, 4 for the last further scene given.
  int palsarSceneCount() const;
  // The PALSAR focuser of the job: one scene, several polarisations or ERSDAC.
  std::unique_ptr<stripmapGeneralFocuser> makePalsarFocuser();
  // Leader, scene and orbit must be given; a single-polarisation product
  // takes one scene, a double-polarisation one at most two (10 with the
  // report otherwise).
  int checkMultiPolPalsar(int sceneCount) const;
  // 10 (no text) when a field the sensor needs is empty.
  int checkErs(const ersLevel0Focuser& focuser) const;
  int checkEnvisat(const envisatLevel0Focuser& focuser) const;
  int checkRadarsat(const radarsatLevel0Focuser& focuser) const;

  // Removal of the temporary files of each platform; a file that cannot be
  // removed costs a level 1 report and the list goes on.
  void eraseTemporaryErs() const;
  void eraseTemporaryEnvisat() const;
  void eraseTemporaryRadarsat() const;
  void eraseTemporaryPalsar() const;

  // Element table, in order.
  int Memory = 256;
  std::string ReportFilename = "ATmultiplatformFocuser.report";
  int ReportLevel = 1;
  int Incore = 0;
  int Verbose = 1;
  std::string processingConfFilename;
  std::string platform;
  std::string level0Filename;
  std::string level0FilenameSecondPol;
  std::string level0FilenameThirdPol;
  std::string level0FilenameFourthPol;
  std::string outputFilename;
  std::string auxFile1, auxFile2, auxFile3, auxFile4, auxFile5;
  std::string auxDirectory1, auxDirectory2, auxDirectory3, auxDirectory4, auxDirectory5;
  int skipLines = 0;
  int extractLines = 0;
  int eraseTemporaryFiles = 0;

 private:
  void fillScene(stripmapGeneralFocuser& focuser) const;

  std::unique_ptr<stripmapGeneralFocuser> focuser_;
};

// Directory part of a path: everything before the last '/' or '\\'; empty
// for a path without separator.
std::string scenePathDirectory(const std::string& path);
