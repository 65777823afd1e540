#pragma once
// Processing configuration: one block per class in a parameter document, each
// with the five common values of the "generalProcessingConf" group.
#include <string>

#include "product/general_sar.h"
#include "product/general_sar_base.h"

// Common part of the configuration classes: the class block named after the
// class and the common values of a group.
class ConfigurationBlock : public GeneralSAR_Base, public GeneralSAR_BaseConfiguration {
 public:
  explicit ConfigurationBlock(std::string className) : className_(std::move(className)) {}
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }

  // Common values of `group`, then the block `className` (which must be
  // present). 0 / 1.
  virtual int readConf(const std::string& file, int channel, const std::string& group,
                       const std::string& className);
  virtual int writeConf(const std::string& file, int channel, const std::string& group,
                        const std::string& className);
  // readConf / writeConf with the group "generalProcessingConf" and the class
  // name; throw orvaneException "Cannot read input file" / "Cannot write
  // input file" on failure.
  virtual int readpar(const std::string& file, int channel);
  virtual int writepar(const std::string& file, int channel);
  const std::string& getClassName() const { return className_; }

 protected:
  std::string className_;
};

class AzimuthConf : public ConfigurationBlock {
 public:
  AzimuthConf();
  void refreshParameters() override;
  void clone(AzimuthConf* target) const;

  int WhiteningFlag = 0;
  float AntennaLength = 10.0f;
  float AzimuthWindowHammingParameter = 0.0f;
  float AzimuthLookBandwidth = 0.0f;
  float AzimuthTransitionBandwidth = 0.0f;
  float RangeWindowHammingParameter = 0.0f;
  float RangeLookBandwidth = 0.0f;
  float RangeTransitionBandwidth = 0.0f;
  int LinesInBlock = 5000;
  int SamplesInBlock = 256;
  int AzimuthOverlap = 2500;
  int RangeOverlap = 20;
  int PerformInterpolation = 7;
  float StoltPadding = 0.4f;
  int ApplyRgShift = 0;
  int ApplyAzShift = 0;
};

class DCestConf : public ConfigurationBlock {
 public:
  DCestConf();
  void refreshParameters() override;
  void clone(DCestConf* target) const;

  int Nbestblocks = 10;
  int Nummlbf = 8;
  int Nwdarbloks = 5;
  int Blocks = 256;
  int Blockl = 2048;
  int Dswst = 150;  // default outside its declared bounds 0..1, kept
  int Patchs = 8;
  int Patchl = 32;
  float RgBand = 0.72f;
  float AnLen = 10.0f;
  float Lookbf = 0.25f;
  float Lookbt = 0.1f;
  float Lookrp = 0.05f;
  float Lookrs = 0.05f;
  int Decfac = 3;
  int Flength = 21;
  float Dftstep = 0.00004f;
  float Fftrgprc = 0.0005f;
  float Fftazprc = 0.0005f;
  float Peakwid = 0.0056f;
  float Minamb = -20.0f;
  float Maxamb = -20.0f;
  float Kthr = 2.15f;
  float Sthr = 20.0f;
  float Varth = 0.5f;
  int Amb_flag = 2;
  int Pol_weights[7] = {1, 1, 1, 1, 1, 1, 1};
};

class ExtractorConf : public ConfigurationBlock {
 public:
  ExtractorConf();
  void refreshParameters() override;
  void clone(ExtractorConf* target) const;

  int RawLinesSkip = 0;
  int RawLinesToExtract = 0;
};

class generalProcessingConf : public ConfigurationBlock {
 public:
  generalProcessingConf();
  void refreshParameters() override;
  void clone(generalProcessingConf* target) const;

  int Flag_incore = 0;
  int Flag_ortog = 0;
  int Flag_swstal = 0;
  int Flag_ext = 0;
  int Flag_rangefoc = 0;
  int Flag_rgpatt = 0;
  int Flag_azimuthfoc = 0;
  int Flag_dcest = 0;
  int Remove_interferences = 0;
  int Azblk = 0;
  int EraseTemp = 0;
};

class FinefitestConf : public ConfigurationBlock {
 public:
  FinefitestConf();
  void refreshParameters() override;
  void clone(FinefitestConf* target) const;

  int RangeMaxShift = 8;
  int AzimuthMaxShift = 128;
  int RangeBlockSize = 128;
  int AzimuthBlockSize = 128;
};

class DemExtractorConf : public ConfigurationBlock {
 public:
  DemExtractorConf();
  void refreshParameters() override;
  void clone(DemExtractorConf* target) const;

  int LatitudeOversampling = 1;
  int LongitudeOversampling = 1;
  int LatitudeMarginPerc = 20;
  int LongitudeMarginPerc = 20;
  int InterpolationFlag = 1;
  std::string GeoidCorrectionFilename;
  std::string SRTMDirectory;
};

// External calibration factors of ASAR products, one per swath for image
// mode and alternating polarisation.
class EnvisatCalibrationFactors : public ConfigurationBlock {
 public:
  EnvisatCalibrationFactors();
  void refreshParameters() override;
  void clone(EnvisatCalibrationFactors* target) const;
  // The class block only; throw orvaneException "Cannot read specific
  // configuration file" / "Cannot write specific configuration file".
  int readConf(const std::string& file, int channel, const std::string& group,
               const std::string& className) override;
  int writeConf(const std::string& file, int channel, const std::string& group,
                const std::string& className) override;
  int readpar(const std::string& file, int channel) override;
  int writepar(const std::string& file, int channel) override;

  // Sets ExternalCalibrationFactor of a focused ASAR image-mode or
  // alternating-polarisation product from its swath and polarisation.
  // 0 if it did, 1 if not.
  int writeFactor(GeneralSAR* product) const;
  // Reads the record of file, sets the factor, writes the record back.
  int writeFactor(const std::string& file) const;
  int writeFactor(const std::string& file, const GeneralSAROrbitSlots& slots) const;

  double IM_HH[7] = {0, 0, 0, 0, 0, 0, 0};
  double IM_VV[7] = {0, 0, 0, 0, 0, 0, 0};
  double AP_HH[7] = {0, 0, 0, 0, 0, 0, 0};
  double AP_HV[7] = {0, 0, 0, 0, 0, 0, 0};
  double AP_VH[7] = {0, 0, 0, 0, 0, 0, 0};
  double AP_VV[7] = {0, 0, 0, 0, 0, 0, 0};
  double WSML_HH = 0.0;
  double WSML_VV = 0.0;
  double WSS_HH = 0.0;
  double WSS_VV = 0.0;
};

class GeneralSAR_configuration {
 public:
  enum GScObject : int {
    GSC_AZIMUTH = 0,
    GSC_DCEST = 1,
    GSC_EXTRACTOR = 2,
    GSC_GENERAL = 3,
    GSC_FINEFITEST = 4,
    GSC_CALIBRATION = 5,
  };
  static constexpr int kObjects = 6;

  GeneralSAR_configuration();
  GeneralSAR_configuration(const GeneralSAR_configuration&) = delete;
  GeneralSAR_configuration& operator=(const GeneralSAR_configuration&) = delete;

  // Reads each of the six classes; one that cannot be read is marked absent.
  // A file that does not exist is reported (status 9).
  int GSread(const std::string& file, int channel);
  // Writes the present classes, first to last.
  int GSwrite(const std::string& file, int channel);
  void GSenable(GScObject object);
  void GSdisable(GScObject object);
  bool GSexists(GScObject object) const;
  ConfigurationBlock* GSget(GScObject object);
  // Copies every class and flag into target.
  void GSclone(GeneralSAR_configuration* target) const;
  // Nothing to free.
  void GSdestroy() {}

  AzimuthConf azimuthConf;
  DCestConf dcestConf;
  ExtractorConf extractorConf;
  generalProcessingConf generalConf;
  FinefitestConf finefitestConf;
  EnvisatCalibrationFactors calibrationFactors;
  DemExtractorConf demExtractorConf;

 private:
  ConfigurationBlock* objects_[kObjects];
  unsigned char exists_[kObjects] = {};
};
