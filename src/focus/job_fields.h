#pragma once
// The 24 parameters of a focusing job as the multi-platform focuser holds
// them, with its defaults. The job driver fills them and the sensor fills
// read them; the auxiliary files a fill looks up are written back here.
#include <string>

struct FocuserJobFields {
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
};
