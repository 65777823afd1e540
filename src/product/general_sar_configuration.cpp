#include "product/general_sar_configuration.h"

#include <cstdio>

#include "base/status.h"
#include "diag/orvane_exception.h"
#include "diag/report.h"

namespace {

constexpr int kIntMax = 2147483647;
constexpr float kFloatMax = 2147483648.0f;
constexpr double kBig = 1e300;
constexpr const char* kCommonGroup = "generalProcessingConf";

}  // namespace

// ---- common block ----------------------------------------------------------------

int ConfigurationBlock::readConf(const std::string& file, int channel, const std::string& group,
                                 const std::string& className) {
  if (GeneralSAR_BaseConfiguration::readConf(file, channel, group) != 0) return STATUS_BAD_CONDITION;
  if (setAuxiliaryFile(file, channel, className) != 0) {
    unsetAuxiliaryFile();
    return STATUS_BAD_CONDITION;
  }
  const bool present = getXml().countNodes(channel, className) > 0;
  const int status = present ? readAuxiliaryFile() : 1;
  unsetAuxiliaryFile();
  return status != 0 ? 1 : 0;
}

int ConfigurationBlock::writeConf(const std::string& file, int channel, const std::string& group,
                                  const std::string& className) {
  // The class block first: for the common group's own class it would
  // otherwise remove the common values again.
  if (writeAuxiliaryFile(file, channel, className) != 0) return STATUS_BAD_CONDITION;
  return GeneralSAR_BaseConfiguration::writeConf(file, channel, group) != 0 ? 1 : 0;
}

int ConfigurationBlock::readpar(const std::string& file, int channel) {
  if (readConf(file, channel, kCommonGroup, className_) != 0)
    throw orvaneException(__LINE__, __func__, __FILE__, "Cannot read input file");
  return 0;
}

int ConfigurationBlock::writepar(const std::string& file, int channel) {
  if (writeConf(file, channel, kCommonGroup, className_) != 0)
    throw orvaneException(__LINE__, __func__, __FILE__, "Cannot write input file");
  return 0;
}

// ---- AzimuthConf ---------------------------------------------------------------------

AzimuthConf::AzimuthConf() : ConfigurationBlock("AzimuthConf") { createElementsVector(16); }

void AzimuthConf::refreshParameters() {
  addElementInt("WhiteningFlag", &WhiteningFlag, 1, 0, 1, true);
  addElementFloat("AntennaLength", &AntennaLength, 1, 0, kFloatMax, true);
  addElementFloat("AzimuthWindowHammingParameter", &AzimuthWindowHammingParameter, 1, 0, kFloatMax,
                  false);
  addElementFloat("AzimuthLookBandwidth", &AzimuthLookBandwidth, 1, 0, kFloatMax, true);
  addElementFloat("AzimuthTransitionBandwidth", &AzimuthTransitionBandwidth, 1, 0, kFloatMax,
                  false);
  addElementFloat("RangeWindowHammingParameter", &RangeWindowHammingParameter, 1, 0, kFloatMax,
                  false);
  addElementFloat("RangeLookBandwidth", &RangeLookBandwidth, 1, 0, kFloatMax, true);
  addElementFloat("RangeTransitionBandwidth", &RangeTransitionBandwidth, 1, 0, kFloatMax, true);
  addElementInt("LinesInBlock", &LinesInBlock, 1, 0, kIntMax, true);
  addElementInt("SamplesInBlock", &SamplesInBlock, 1, 0, kIntMax, true);
  addElementInt("AzimuthOverlap", &AzimuthOverlap, 1, 0, kIntMax, true);
  addElementInt("RangeOverlap", &RangeOverlap, 1, 0, kIntMax, true);
  addElementInt("PerformInterpolation", &PerformInterpolation, 1, 0, kIntMax, true);
  addElementFloat("StoltPadding", &StoltPadding, 1, 0, kFloatMax, true);
  addElementInt("ApplyRgShift", &ApplyRgShift, 1, -kIntMax, kIntMax, true);
  addElementInt("ApplyAzShift", &ApplyAzShift, 1, -kIntMax, kIntMax, true);
  setAllocationFlag(true);
}

void AzimuthConf::clone(AzimuthConf* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  t->WhiteningFlag = WhiteningFlag;
  t->AntennaLength = AntennaLength;
  t->AzimuthWindowHammingParameter = AzimuthWindowHammingParameter;
  t->AzimuthLookBandwidth = AzimuthLookBandwidth;
  t->AzimuthTransitionBandwidth = AzimuthTransitionBandwidth;
  t->RangeWindowHammingParameter = RangeWindowHammingParameter;
  t->RangeLookBandwidth = RangeLookBandwidth;
  t->RangeTransitionBandwidth = RangeTransitionBandwidth;
  t->LinesInBlock = LinesInBlock;
  t->SamplesInBlock = SamplesInBlock;
  t->AzimuthOverlap = AzimuthOverlap;
  t->RangeOverlap = RangeOverlap;
  t->PerformInterpolation = PerformInterpolation;
  t->StoltPadding = StoltPadding;
  t->ApplyRgShift = ApplyRgShift;
  t->ApplyAzShift = ApplyAzShift;
}

// ---- DCestConf -------------------------------------------------------------------------

DCestConf::DCestConf() : ConfigurationBlock("DCestConf") { createElementsVector(27); }

void DCestConf::refreshParameters() {
  addElementInt("Nbestblocks", &Nbestblocks, 1, 0, kIntMax, true);
  addElementInt("Nummlbf", &Nummlbf, 1, 0, kIntMax, true);
  addElementInt("Nwdarbloks", &Nwdarbloks, 1, 0, kIntMax, true);
  addElementInt("Blocks", &Blocks, 1, 0, kIntMax, true);
  addElementInt("Blockl", &Blockl, 1, 0, kIntMax, true);
  addElementInt("Dswst", &Dswst, 1, 0, 1, true);
  addElementInt("Patchs", &Patchs, 1, 0, kIntMax, true);
  addElementInt("Patchl", &Patchl, 1, 0, kIntMax, true);
  addElementFloat("RgBand", &RgBand, 1, 0, 1, true);
  addElementFloat("AnLen", &AnLen, 1, 0, kFloatMax, true);
  addElementFloat("Lookbf", &Lookbf, 1, 0, 1, true);
  addElementFloat("Lookbt", &Lookbt, 1, 0, 1, true);
  addElementFloat("Lookrp", &Lookrp, 1, 0, 1, true);
  addElementFloat("Lookrs", &Lookrs, 1, 0, 1, true);
  addElementInt("Decfac", &Decfac, 1, 0, kIntMax, true);
  addElementInt("Flength", &Flength, 1, 0, kIntMax, true);
  addElementFloat("Dftstep", &Dftstep, 1, 0, kFloatMax, true);
  addElementFloat("Fftrgprc", &Fftrgprc, 1, 0, kFloatMax, true);
  addElementFloat("Fftazprc", &Fftazprc, 1, 0, kFloatMax, true);
  addElementFloat("Peakwid", &Peakwid, 1, 0, kFloatMax, true);
  addElementFloat("Minamb", &Minamb, 1, -kFloatMax, kFloatMax, true);
  addElementFloat("Maxamb", &Maxamb, 1, -kFloatMax, kFloatMax, true);
  addElementFloat("Kthr", &Kthr, 1, 0, kFloatMax, true);
  addElementFloat("Sthr", &Sthr, 1, 0, kFloatMax, true);
  addElementFloat("Varth", &Varth, 1, 0, kFloatMax, true);
  addElementInt("Amb_flag", &Amb_flag, 1, 0, kIntMax, true);
  addElementInt("Pol_weights", Pol_weights, 7, 0, 1, true);
  setAllocationFlag(true);
}

void DCestConf::clone(DCestConf* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  t->Nbestblocks = Nbestblocks;
  t->Nummlbf = Nummlbf;
  t->Nwdarbloks = Nwdarbloks;
  t->Blocks = Blocks;
  t->Blockl = Blockl;
  t->Dswst = Dswst;
  t->Patchs = Patchs;
  t->Patchl = Patchl;
  t->RgBand = RgBand;
  t->AnLen = AnLen;
  t->Lookbf = Lookbf;
  t->Lookbt = Lookbt;
  t->Lookrp = Lookrp;
  t->Lookrs = Lookrs;
  t->Decfac = Decfac;
  t->Flength = Flength;
  t->Dftstep = Dftstep;
  t->Fftrgprc = Fftrgprc;
  t->Fftazprc = Fftazprc;
  t->Peakwid = Peakwid;
  t->Minamb = Minamb;
  t->Maxamb = Maxamb;
  t->Kthr = Kthr;
  t->Sthr = Sthr;
  t->Varth = Varth;
  t->Amb_flag = Amb_flag;
  for (int i = 0; i < 7; ++i) t->Pol_weights[i] = Pol_weights[i];
}

// ---- ExtractorConf, generalProcessingConf, FinefitestConf, DemExtractorConf -----------

ExtractorConf::ExtractorConf() : ConfigurationBlock("ExtractorConf") { createElementsVector(2); }

void ExtractorConf::refreshParameters() {
  addElementInt("RawLinesSkip", &RawLinesSkip, 1, 0, kIntMax, true);
  addElementInt("RawLinesToExtract", &RawLinesToExtract, 1, 0, kIntMax, true);
  setAllocationFlag(true);
}

void ExtractorConf::clone(ExtractorConf* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  t->RawLinesSkip = RawLinesSkip;
  t->RawLinesToExtract = RawLinesToExtract;
}

generalProcessingConf::generalProcessingConf() : ConfigurationBlock("generalProcessingConf") {
  createElementsVector(11);
}

void generalProcessingConf::refreshParameters() {
  addElementInt("Flag_incore", &Flag_incore, 1, 0, 1, true);
  addElementInt("Flag_ortog", &Flag_ortog, 1, 0, 1, true);
  addElementInt("Flag_swstal", &Flag_swstal, 1, 0, 1, true);
  addElementInt("Flag_ext", &Flag_ext, 1, 0, 1, true);
  addElementInt("Flag_rangefoc", &Flag_rangefoc, 1, 0, 1, true);
  addElementInt("Flag_rgpatt", &Flag_rgpatt, 1, 0, 1, true);
  addElementInt("Flag_azimuthfoc", &Flag_azimuthfoc, 1, 0, 1, true);
  addElementInt("Flag_dcest", &Flag_dcest, 1, 0, 1, true);
  addElementInt("Remove_interferences", &Remove_interferences, 1, 0, 1, true);
  addElementInt("Azblk", &Azblk, 1, 0, 1, true);
  addElementInt("EraseTemp", &EraseTemp, 1, 0, 1, true);
  setAllocationFlag(true);
}

void generalProcessingConf::clone(generalProcessingConf* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  t->Flag_incore = Flag_incore;
  t->Flag_ortog = Flag_ortog;
  t->Flag_swstal = Flag_swstal;
  t->Flag_ext = Flag_ext;
  t->Flag_rangefoc = Flag_rangefoc;
  t->Flag_rgpatt = Flag_rgpatt;
  t->Flag_azimuthfoc = Flag_azimuthfoc;
  t->Flag_dcest = Flag_dcest;
  t->Remove_interferences = Remove_interferences;
  t->Azblk = Azblk;
  t->EraseTemp = EraseTemp;
}

FinefitestConf::FinefitestConf() : ConfigurationBlock("FinefitestConf") {
  createElementsVector(4);
}

void FinefitestConf::refreshParameters() {
  addElementInt("RangeMaxShift", &RangeMaxShift, 1, 0, kIntMax, true);
  addElementInt("AzimuthMaxShift", &AzimuthMaxShift, 1, 0, kIntMax, true);
  addElementInt("RangeBlockSize", &RangeBlockSize, 1, 0, kIntMax, true);
  addElementInt("AzimuthBlockSize", &AzimuthBlockSize, 1, 0, kIntMax, true);
  setAllocationFlag(true);
}

void FinefitestConf::clone(FinefitestConf* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  t->RangeMaxShift = RangeMaxShift;
  t->AzimuthMaxShift = AzimuthMaxShift;
  t->RangeBlockSize = RangeBlockSize;
  t->AzimuthBlockSize = AzimuthBlockSize;
}

DemExtractorConf::DemExtractorConf() : ConfigurationBlock("DemExtractorConf") {
  createElementsVector(7);
}

void DemExtractorConf::refreshParameters() {
  addElementInt("LatitudeOversampling", &LatitudeOversampling, 1, 0, kIntMax, true);
  addElementInt("LongitudeOversampling", &LongitudeOversampling, 1, 0, kIntMax, true);
  addElementInt("LatitudeMarginPerc", &LatitudeMarginPerc, 1, 0, 100, true);
  addElementInt("LongitudeMarginPerc", &LongitudeMarginPerc, 1, 0, 100, true);
  addElementInt("InterpolationFlag", &InterpolationFlag, 1, 0, 1, true);
  addElementString("GeoidCorrectionFilename", &GeoidCorrectionFilename, true);
  addElementString("SRTMDirectory", &SRTMDirectory, true);
  setAllocationFlag(true);
}

void DemExtractorConf::clone(DemExtractorConf* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  t->LatitudeOversampling = LatitudeOversampling;
  t->LongitudeOversampling = LongitudeOversampling;
  t->LatitudeMarginPerc = LatitudeMarginPerc;
  t->LongitudeMarginPerc = LongitudeMarginPerc;
  t->InterpolationFlag = InterpolationFlag;
  t->GeoidCorrectionFilename = GeoidCorrectionFilename;
  t->SRTMDirectory = SRTMDirectory;
}

// ---- EnvisatCalibrationFactors ------------------------------------------------------------

EnvisatCalibrationFactors::EnvisatCalibrationFactors()
    : ConfigurationBlock("EnvisatCalibrationFactors") {
  createElementsVector(10);
}

void EnvisatCalibrationFactors::refreshParameters() {
  addElementDouble("IM_HH", IM_HH, 7, -kBig, kBig, true);
  addElementDouble("IM_VV", IM_VV, 7, -kBig, kBig, true);
  addElementDouble("AP_HH", AP_HH, 7, -kBig, kBig, true);
  addElementDouble("AP_HV", AP_HV, 7, -kBig, kBig, true);
  addElementDouble("AP_VH", AP_VH, 7, -kBig, kBig, true);
  addElementDouble("AP_VV", AP_VV, 7, -kBig, kBig, true);
  addElementDouble("WSML_HH", &WSML_HH, 1, -kBig, kBig, true);
  addElementDouble("WSML_VV", &WSML_VV, 1, -kBig, kBig, true);
  addElementDouble("WSS_HH", &WSS_HH, 1, -kBig, kBig, true);
  addElementDouble("WSS_VV", &WSS_VV, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}

void EnvisatCalibrationFactors::clone(EnvisatCalibrationFactors* t) const {
  if (!t || t == this) return;
  cloneConf(*t);
  for (int i = 0; i < 7; ++i) {
    t->IM_HH[i] = IM_HH[i];
    t->IM_VV[i] = IM_VV[i];
    t->AP_HH[i] = AP_HH[i];
    t->AP_HV[i] = AP_HV[i];
    t->AP_VH[i] = AP_VH[i];
    t->AP_VV[i] = AP_VV[i];
  }
  t->WSML_HH = WSML_HH;
  t->WSML_VV = WSML_VV;
  t->WSS_HH = WSS_HH;
  t->WSS_VV = WSS_VV;
}

int EnvisatCalibrationFactors::readConf(const std::string& file, int channel, const std::string&,
                                        const std::string& className) {
  bool ok = setAuxiliaryFile(file, channel, className) == 0 &&
            getXml().countNodes(channel, className) > 0 && readAuxiliaryFile() == 0;
  unsetAuxiliaryFile();
  if (!ok)
    throw orvaneException(__LINE__, __func__, __FILE__, "Cannot read specific configuration file");
  return 0;
}

int EnvisatCalibrationFactors::writeConf(const std::string& file, int channel, const std::string&,
                                         const std::string& className) {
  if (writeAuxiliaryFile(file, channel, className) != 0)
    throw orvaneException(__LINE__, __func__, __FILE__, "Cannot write specific configuration file");
  return 0;
}

int EnvisatCalibrationFactors::readpar(const std::string& file, int channel) {
  return readConf(file, channel, kCommonGroup, className_);
}

int EnvisatCalibrationFactors::writepar(const std::string& file, int channel) {
  return writeConf(file, channel, kCommonGroup, className_);
}

int EnvisatCalibrationFactors::writeFactor(GeneralSAR* product) const {
  if (product == nullptr) return STATUS_BAD_CONDITION;
  DataSetInfo_Obj& info = product->dataSetInfo;
  if (!info.IsSensorType(DataSetInfo_Obj::ST_ASAR)) return STATUS_BAD_CONDITION;
  const bool stripmap = info.IsAcqMode(DataSetInfo_Obj::AM_STRIPMAP);
  const bool dual = info.IsAcqMode(DataSetInfo_Obj::AM_DOUBLE_POLARIZATION);
  const bool focused = info.IsImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED);
  const bool multilooked = info.IsImageType(DataSetInfo_Obj::IT_MULTILOOK);
  if (!((stripmap && focused) || (dual && (focused || multilooked)))) return STATUS_BAD_CONDITION;
  // Only the digit of "IS3", "SS1", ... counts.
  if (info.Swath.size() < 3) return STATUS_BAD_CONDITION;
  const int index = info.Swath[2] - '1';
  if (index < 0 || index > 6) return STATUS_BAD_CONDITION;
  const std::string& pol = info.Polarization;
  const double* table = nullptr;
  if (stripmap) {
    if (pol == "H/H") table = IM_HH;
    else if (pol == "V/V") table = IM_VV;
  } else {
    if (pol == "H/H") table = AP_HH;
    else if (pol == "H/V") table = AP_HV;
    else if (pol == "V/H") table = AP_VH;
    else if (pol == "V/V") table = AP_VV;
  }
  if (table == nullptr) return STATUS_BAD_CONDITION;
  info.ExternalCalibrationFactor = table[index];
  return 0;
}

int EnvisatCalibrationFactors::writeFactor(const std::string& file,
                                           const GeneralSAROrbitSlots& slots) const {
  GeneralSAR product(slots);
  if (product.GSread(file) != 0) {
    ORV_REPORT_CALLED_ERROR();
    return STATUS_BAD_CONDITION;
  }
  const int status = writeFactor(&product);
  if (status == 0) product.GSwrite(file);
  return status;
}

// ---- GeneralSAR_configuration -----------------------------------------------------------------

GeneralSAR_configuration::GeneralSAR_configuration()
    : objects_{&azimuthConf, &dcestConf, &extractorConf, &generalConf, &finefitestConf,
               &calibrationFactors} {}

int GeneralSAR_configuration::GSread(const std::string& file, int channel) {
  std::FILE* probe = std::fopen(file.c_str(), "r");
  if (probe == nullptr) {
    ORV_REPORT("File : " + file + " DOES NOT EXIST!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  std::fclose(probe);
  for (int i = 0; i < kObjects; ++i) {
    exists_[i] = 1;
    try {
      objects_[i]->readpar(file, channel);
    } catch (const orvaneException&) {
      exists_[i] = 0;
    }
  }
  return 0;
}

int GeneralSAR_configuration::GSwrite(const std::string& file, int channel) {
  for (int i = 0; i < kObjects; ++i)
    if (exists_[i] == 1) objects_[i]->writepar(file, channel);
  return 0;
}

void GeneralSAR_configuration::GSenable(GScObject o) {
  if (o >= 0 && o < kObjects) exists_[o] = 1;
}
void GeneralSAR_configuration::GSdisable(GScObject o) {
  if (o >= 0 && o < kObjects) exists_[o] = 0;
}
bool GeneralSAR_configuration::GSexists(GScObject o) const {
  return o >= 0 && o < kObjects && exists_[o] != 0;
}
ConfigurationBlock* GeneralSAR_configuration::GSget(GScObject o) {
  return o >= 0 && o < kObjects ? objects_[o] : nullptr;
}

void GeneralSAR_configuration::GSclone(GeneralSAR_configuration* t) const {
  if (!t || t == this) return;
  azimuthConf.clone(&t->azimuthConf);
  dcestConf.clone(&t->dcestConf);
  extractorConf.clone(&t->extractorConf);
  generalConf.clone(&t->generalConf);
  finefitestConf.clone(&t->finefitestConf);
  calibrationFactors.clone(&t->calibrationFactors);
  demExtractorConf.clone(&t->demExtractorConf);
  for (int i = 0; i < kObjects; ++i) t->exists_[i] = exists_[i];
}
