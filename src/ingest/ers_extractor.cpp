#include "ingest/ers_extractor.h"

#include <climits>

#include "diag/report.h"

ATERSExtractor::ATERSExtractor() { createElementsVector(10); }
ATERSExtractor::~ATERSExtractor() = default;

void ATERSExtractor::refreshParameters() {
  addElementInt("Memory", &Memory, 1, 0, INT_MAX, true);
  addElementString("ReportFilename", &ReportFilename, true);
  addElementInt("ReportLevel", &ReportLevel, 1, 0, 3, true);
  addElementInt("Incore", &Incore, 1, 0, 1, true);
  addElementInt("Verbose", &Verbose, 1, 0, 1, true);
  addElementString("ImgFilename", &ImgFilename, true);
  addElementString("LeaFilename", &LeaFilename, true);
  addElementString("OrbitFilename", &OrbitFilename, true);
  addElementString("OutputFile", &OutputFile, true);
  addElementString("ChirpFile", &ChirpFile, true);
  setAllocationFlag(true);
}

int ATERSExtractor::createBuffers() { return createBuffersDefault(); }
int ATERSExtractor::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}
int ATERSExtractor::checkpar() {
  checkAuxiliaryFile();
  return 0;
}
int ATERSExtractor::readpar(const std::string& file, int channel) {
  readAuxiliaryFile(file, channel, "ATERSExtractor");
  return 0;
}
int ATERSExtractor::writepar(const std::string& file, int channel) {
  return writeAuxiliaryFile(file, channel, "ATERSExtractor");
}
int ATERSExtractor::InitProcessing(const std::string&, int) { return 1; }
int ATERSExtractor::run() { return 1; }
int ATERSExtractor::FinalizeProcessing(const std::string&, int) { return 0; }
int ATERSExtractor::runall(const std::string&, int) { return 1; }
int ATERSExtractor::ExtractChirp() { return 1; }
int ATERSExtractor::readLeader() { return 1; }
int ATERSExtractor::readImage() { return 1; }
