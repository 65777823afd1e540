#include "product/general_sar.h"

#include <cstdio>

#include "base/status.h"
#include "diag/report.h"

int GSDataFile_Obj::readhdr(const std::string& file) {
  if (file.size() < 4) return STATUS_BAD_CONDITION;
  return read_hdr(file.substr(0, file.size() - 4));
}

int GSDataFile_Obj::writehdr(const std::string& file) {
  if (file.size() < 4) return STATUS_BAD_CONDITION;
  const std::string kept = filename;
  filename = file.substr(0, file.size() - 4);
  const int status = write_hdr();
  filename = kept;
  return status;
}

GeneralSAR::GeneralSAR(const GeneralSAROrbitSlots& slots)
    : slots_(&slots), stateVectors_(slots.makeStateVectors()), orbit_(slots.makeOrbit()) {
  objects_[GS_DATAFILE] = &dataFile;
  objects_[GS_ROI] = &roi;
  objects_[GS_POLYNOMIALS] = &polynomials;
  objects_[GS_SAMPLING] = &sampling;
  objects_[GS_STATEVECTORS] = stateVectors_.get();
  objects_[GS_ORBIT] = orbit_.get();
  objects_[GS_PULSE] = &pulse;
  objects_[GS_ANTENNA] = &antenna;
  objects_[GS_DATASETINFO] = &dataSetInfo;
  objects_[GS_ATTITUDE] = &attitude;
  objects_[GS_SPECTRALWINDOWS] = &spectralWindows;
  objects_[GS_GEOCOORDS] = &geoCoords;
  objects_[GS_SWATH] = &swath;
  objects_[GS_BUFFERFILE] = &bufferFile;
}

GeneralSAR::~GeneralSAR() = default;

int GeneralSAR::GSread(const std::string& file) {
  std::FILE* probe = std::fopen(file.c_str(), "r");
  if (probe == nullptr) {
    ORV_REPORT("File : " + file + " DOES NOT EXIST!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  std::fclose(probe);
  GSdestroy();
  for (int i = 0; i < kObjects; ++i) {
    exists_[i] = 1;
    if (objects_[i]->readhdr(file) != 0) exists_[i] = 0;
  }
  if (exists_[GS_SAMPLING] && exists_[GS_ORBIT]) slots_->setLambda(*orbit_, sampling.lambda_m);
  if (exists_[GS_DATASETINFO] && exists_[GS_ORBIT])
    slots_->setOrbitLookSign(*orbit_, dataSetInfo.LookDirection);
  if (exists_[GS_DATASETINFO] && exists_[GS_STATEVECTORS])
    slots_->setStateVectorsLookSign(*stateVectors_, dataSetInfo.LookDirection);
  return 0;
}

int GeneralSAR::GSwrite(const std::string& file) {
  for (int i = kObjects - 1; i >= 0; --i)
    if (exists_[i] == 1) objects_[i]->writehdr(file);
  return 0;
}

GeneralSAR_Base* GeneralSAR::GSget(GSObject object) {
  return object >= 0 && object < kObjects ? objects_[object] : nullptr;
}

bool GeneralSAR::GSexists(GSObject object) const {
  return object >= 0 && object < kObjects && exists_[object] != 0;
}

void GeneralSAR::GSenable(GSObject object) {
  if (object >= 0 && object < kObjects) exists_[object] = 1;
}

void GeneralSAR::GSdisable(GSObject object) {
  if (object >= 0 && object < kObjects) exists_[object] = 0;
}

int GeneralSAR::GSdestroy() {
  polynomials.DestroyPolys();
  slots_->destroyStateVectors(*stateVectors_);
  slots_->destroyOrbit(*orbit_);
  swath.destroyBuffers();
  antenna.destroyBuffers();
  return 0;
}
