#pragma once
// Scalar blocks of a product: sampling, transmitted pulse, platform attitude,
// processing windows, swath description and quick-look window. Each is stored
// as an element document block; the profile section of the same name is read
// when the side file has no such block. Unset reals are -999.0.
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "product/general_sar_base.h"

class SamplingConstants_Obj : public GeneralSAR_Base {
 public:
  SamplingConstants_Obj();
  SamplingConstants_Obj(const SamplingConstants_Obj& other);
  SamplingConstants_Obj& operator=(const SamplingConstants_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(SamplingConstants_Obj* target) const;

  double fc_hz = -999.0;     // carrier frequency
  double frg_hz = -999.0;    // range sampling rate
  double Brg_hz = -999.0;    // range bandwidth
  double Trg_s = -999.0;     // range sampling step
  double prf_hz = -999.0;
  double pri_s = -999.0;
  double Baz_hz = -999.0;    // azimuth bandwidth
  double brf_hz = -999.0;    // burst repetition frequency
  double bri_s = -999.0;
  double lambda_m = -999.0;  // wavelength
};

// Writes a replica as a one-line complex float raster with its header;
// 0 or the raster's status.
int writeReplicaRaster(const std::string& file, const fcomplex* samples, int count);

class SARPulse_Obj : public GeneralSAR_Base {
 public:
  SARPulse_Obj();
  SARPulse_Obj(const SARPulse_Obj& other);
  SARPulse_Obj& operator=(const SARPulse_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(SARPulse_Obj* target) const;

  // Samples of the replica: PulseSamplingRate x PulseLength rounded half
  // away from zero.
  int chirpSamples() const;
  // Linear FM replica centred on the pulse, scaled so that its energy times
  // n / |Bandwidth| / PulseSamplingRate is 1. buffer holds chirpSamples().
  int generateChirp(fcomplex* buffer) const;
  int generateChirp(std::vector<fcomplex>& buffer) const;
  // One-line FLOAT_COMPLEX raster of the replica with its side file.
  int writeChirp(const std::string& file) const;

  double PulseLength = -999.0;        // s
  double Bandwidth = -999.0;          // Hz
  double PulseKRate = -999.0;         // Hz/s
  double PulseEnergy = -999.0;
  double PulseSamplingRate = -999.0;  // Hz
};

class SensorAttitude_Obj : public GeneralSAR_Base {
 public:
  SensorAttitude_Obj();
  SensorAttitude_Obj(const SensorAttitude_Obj& other);
  SensorAttitude_Obj& operator=(const SensorAttitude_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(SensorAttitude_Obj* target) const;

  // Droop model of swath 0..4 from an ASA_INS product: the 8 coefficients
  // and the temperature. Another swath changes nothing. 9 when the file
  // does not open, 4 when it is short.
  int getDroopGain(const std::string& insFile, int swath);

  double Eq_speed = -999.0;     // m/s
  double Eq_distance = -999.0;  // m
  double Mean_DC = -999.0;      // Hz
  double SquintAngle = -999.0;  // degrees
  double AntennaLength = -999.0;
  double DroopGain[8] = {0, 0, 0, 0, 0, 0, 0, 0};
  double Temperature = -999.0;
};

class SpectralWindows_Obj : public GeneralSAR_Base {
 public:
  SpectralWindows_Obj();
  SpectralWindows_Obj(const SpectralWindows_Obj& other);
  SpectralWindows_Obj& operator=(const SpectralWindows_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(SpectralWindows_Obj* target) const;

  std::string AzMatchedFilterType = "NOT_AVAILABLE";  // "HAMMING" in products
  std::string RgMatchedFilterType = "NOT_AVAILABLE";
  double RgMatchedFilterCoef = -999.0;
  double AzMatchedFilterCoef = -999.0;
  double RgLookBandwidth = -999.0;
  double AzLookBandwidth = -999.0;
};

class SwathInfo : public GeneralSAR_Base {
 public:
  SwathInfo();
  SwathInfo(const SwathInfo& other);
  SwathInfo& operator=(const SwathInfo& other);
  // After changing Swst_changes call createBuffers() and then fill the list.
  // Sizes the list of window changes from Swst_changes (nothing when it is
  // not above 0) and re-aims the table. 7 when memory is out.
  int createBuffers() override;
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  // 7 when the copy of the list cannot be allocated.
  int clone(SwathInfo* target) const;

  // Start time of each burst of a raw ASAR raster, from the MJD2000 time at
  // the head of the 17-byte prefix of its first row. 9 / 4 / 7 on failure.
  int readBurstTimes(const std::string& raster);

  int Rank = -999;
  double Rgate_bias = -999.0;
  int Echoes_per_burst = -999;
  int Lines_per_burst = -999;
  int Bursts = -999;
  int Order = -999;
  double Acquisition_Start_Time = -999.0;
  int Swst_changes = -999;
  double ProcessorGain = 1.0;
  double NoisePower = -999.0;
  double ChirpPower = -999.0;
  std::vector<int> Swst_changes_bursts;
  std::vector<double> BurstTimes;
};

class QuickLook_Obj : public GeneralSAR_Base {
 public:
  QuickLook_Obj();
  QuickLook_Obj(const QuickLook_Obj& other);
  QuickLook_Obj& operator=(const QuickLook_Obj& other);
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override;
  void refreshParameters() override;
  using GeneralSAR_Base::writehdr;
  // Element document only: 1 when the block is missing.
  int readhdr(const std::string& file) override;
  int writehdr(const std::string& file) override;
  void clone(QuickLook_Obj* target) const;

  int QL_FirstSample = 0;
  int QL_Samples = 0;
  int QL_FirstLine = 0;
  int QL_Lines = 0;
  int QL_AzimuthML = 1;
  int QL_RangeML = 1;
};

// Reads the data record of an ASAR auxiliary product: 1247-byte main header,
// 378-byte specific header whose DS_OFFSET stands at position 231, then
// `length` bytes from that offset. 0, 9 (not opened) or 4 (short/garbled).
int readAsarAuxRecord(const std::string& file, std::size_t length, std::vector<unsigned char>& record);
