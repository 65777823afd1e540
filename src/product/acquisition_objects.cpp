#include "product/acquisition_objects.h"

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "product/buffer_io.h"
#include "product/byte_order.h"
#include "product/data_file.h"
#include "product/record_io.h"
#include "product/time_base.h"

namespace {

constexpr double kBig = 1e300;
constexpr int kIntMax = 2147483647;

// Data record layout of the droop model in ASA_INS: one 68-byte table per
// swath 0..4 (temperature float, then 8 doubles); the table of swath 4 is the
// one at 171368 that the echo decoder uses.
constexpr std::size_t kInsRecordSize = 171648;
constexpr std::size_t kDroopTableOfSwath4 = 171368;
constexpr std::size_t kDroopTableSize = 68;

}  // namespace

int readAsarAuxRecord(const std::string& file, std::size_t length,
                      std::vector<unsigned char>& record) {
  std::ifstream in(file, std::ios::binary);
  if (!in) {
    ORV_REPORT("File not opened! " + file, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  char sph[379] = {};
  in.seekg(1247);
  if (!in.read(sph, 378)) {
    ORV_REPORT("File reading failed! " + file, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  long offset = -1;
  if (std::sscanf(sph + 231, "%ld", &offset) != 1 || offset < 0) {
    // The field is written as DS_OFFSET=+000...; skip to the digits.
    const char* p = sph + 231;
    while (*p && (*p < '0' || *p > '9') && *p != '+' && *p != '-') ++p;
    if (std::sscanf(p, "%ld", &offset) != 1 || offset < 0) {
      ORV_REPORT("File reading failed! no data offset in " + file, REPORT_ERROR);
      return STATUS_READ_FAILED;
    }
  }
  record.assign(length, 0);
  in.seekg(offset);
  if (!in.read(reinterpret_cast<char*>(record.data()), static_cast<std::streamsize>(length))) {
    ORV_REPORT("File reading failed! " + file, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  return 0;
}

// ---- SamplingConstants_Obj ----------------------------------------------------

SamplingConstants_Obj::SamplingConstants_Obj() { createElementsVector(10); }
SamplingConstants_Obj::SamplingConstants_Obj(const SamplingConstants_Obj& o)
    : SamplingConstants_Obj() {
  o.clone(this);
}
SamplingConstants_Obj& SamplingConstants_Obj::operator=(const SamplingConstants_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}
int SamplingConstants_Obj::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}
void SamplingConstants_Obj::refreshParameters() {
  addElementDouble("fc_hz", &fc_hz, 1, -kBig, kBig, true);
  addElementDouble("frg_hz", &frg_hz, 1, -kBig, kBig, true);
  addElementDouble("Brg_hz", &Brg_hz, 1, -kBig, kBig, true);
  addElementDouble("Trg_s", &Trg_s, 1, -kBig, kBig, true);
  addElementDouble("prf_hz", &prf_hz, 1, -kBig, kBig, true);
  addElementDouble("pri_s", &pri_s, 1, -kBig, kBig, true);
  addElementDouble("Baz_hz", &Baz_hz, 1, -kBig, kBig, true);
  addElementDouble("brf_hz", &brf_hz, 1, -kBig, kBig, true);
  addElementDouble("bri_s", &bri_s, 1, -kBig, kBig, true);
  addElementDouble("lambda_m", &lambda_m, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}
int SamplingConstants_Obj::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "SamplingConstants")) return 0;
  ProfileKeyReader r(file, "SamplingConstants");
  r.required("CarrierFrequency", &fc_hz);
  r.required("SamplingRate", &frg_hz);
  r.required("RangeBandWidth", &Brg_hz);
  r.required("RangeTSamplingStep", &Trg_s);
  r.required("PRF", &prf_hz);
  r.required("PRI", &pri_s);
  r.required("AzimuthBandwidth", &Baz_hz);
  r.required("BRF", &brf_hz);
  r.required("BRI", &bri_s);
  r.required("WaveLength", &lambda_m);
  return r.status();
}
int SamplingConstants_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "SamplingConstants");
  return 0;
}
void SamplingConstants_Obj::clone(SamplingConstants_Obj* t) const {
  if (!t) return;
  t->fc_hz = fc_hz;
  t->frg_hz = frg_hz;
  t->Brg_hz = Brg_hz;
  t->Trg_s = Trg_s;
  t->prf_hz = prf_hz;
  t->pri_s = pri_s;
  t->Baz_hz = Baz_hz;
  t->brf_hz = brf_hz;
  t->bri_s = bri_s;
  t->lambda_m = lambda_m;
}

// ---- SARPulse_Obj -------------------------------------------------------------

SARPulse_Obj::SARPulse_Obj() { createElementsVector(5); }
SARPulse_Obj::SARPulse_Obj(const SARPulse_Obj& o) : SARPulse_Obj() { o.clone(this); }
SARPulse_Obj& SARPulse_Obj::operator=(const SARPulse_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}
int SARPulse_Obj::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}
void SARPulse_Obj::refreshParameters() {
  addElementDouble("PulseLength", &PulseLength, 1, -kBig, kBig, true);
  addElementDouble("Bandwidth", &Bandwidth, 1, -kBig, kBig, true);
  addElementDouble("PulseKRate", &PulseKRate, 1, -kBig, kBig, true);
  addElementDouble("PulseEnergy", &PulseEnergy, 1, -kBig, kBig, true);
  addElementDouble("PulseSamplingRate", &PulseSamplingRate, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}
int SARPulse_Obj::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "Pulse")) return 0;
  ProfileKeyReader r(file, "Pulse");
  r.required("PulseLength", &PulseLength);
  r.required("Bandwidth", &Bandwidth);
  r.required("PulseKRate", &PulseKRate);
  r.required("PulseEnergy", &PulseEnergy);
  r.required("PulseSamplingRate", &PulseSamplingRate);
  return r.status();
}
int SARPulse_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "Pulse");
  return 0;
}
void SARPulse_Obj::clone(SARPulse_Obj* t) const {
  if (!t) return;
  t->PulseLength = PulseLength;
  t->Bandwidth = Bandwidth;
  t->PulseKRate = PulseKRate;
  t->PulseEnergy = PulseEnergy;
  t->PulseSamplingRate = PulseSamplingRate;
}

int SARPulse_Obj::chirpSamples() const {
  const double x = PulseSamplingRate * PulseLength;
  return static_cast<int>(x > 0.0 ? std::floor(x + 0.5) : std::ceil(x - 0.5));
}

int SARPulse_Obj::generateChirp(fcomplex* buffer) const {
  const int n = chirpSamples();
  if (n <= 0 || buffer == nullptr) return STATUS_BAD_CONDITION;
  const double fs = PulseSamplingRate;
  const double B = Bandwidth;
  const double T = PulseLength;
  for (int i = 0; i < n; ++i) buffer[i] = fcomplex(0.0f, 0.0f);
  double arg = n / B * fs;
  if (!(arg > 0.0)) arg = -n / B * fs;
  const double g = std::sqrt(arg);
  const double a = B * consts::kPi / T;
  for (int i = 0; i < n; ++i) {
    const double t = (i - (n - 1) * 0.5) / fs;
    const double phase = a * t * t;
    buffer[i] = fcomplex(static_cast<float>(std::cos(phase) / g),
                         static_cast<float>(std::sin(phase) / g));
  }
  return 0;
}

int SARPulse_Obj::generateChirp(std::vector<fcomplex>& buffer) const {
  const int n = chirpSamples();
  if (n <= 0) return STATUS_BAD_CONDITION;
  try {
    buffer.assign(static_cast<std::size_t>(n), fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Memory allocation failed for the replica", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return generateChirp(buffer.data());
}

int writeReplicaRaster(const std::string& file, const fcomplex* samples, int count) {
  DataFile raster(file);
  raster.NrOfPixelsPerLine = count;
  raster.NrOfLinesPerImage = 1;
  raster.RowPrefix = 0;
  raster.HeaderOffset = 0;
  raster.CellType = FLOAT_COMPLEX;
  BufferIO io{.file = &raster, .first_column = 0, .columns = count, .first_row = 0, .rows = 1};
  int status = io.writebuffer(samples);
  const int closeStatus = raster.close();
  if (status == 0) status = closeStatus;
  if (status == 0) status = raster.write_hdr();
  return status;
}

int SARPulse_Obj::writeChirp(const std::string& file) const {
  std::vector<fcomplex> chirp;
  const int made = generateChirp(chirp);
  if (made == 7) return STATUS_NO_MEMORY;
  if (made != 0) {
    ORV_REPORT("Bad pulse parameters for the replica of " + file, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const int status = writeReplicaRaster(file, chirp.data(), static_cast<int>(chirp.size()));
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}

// ---- SensorAttitude_Obj ----------------------------------------------------------

SensorAttitude_Obj::SensorAttitude_Obj() { createElementsVector(7); }
SensorAttitude_Obj::SensorAttitude_Obj(const SensorAttitude_Obj& o) : SensorAttitude_Obj() {
  o.clone(this);
}
SensorAttitude_Obj& SensorAttitude_Obj::operator=(const SensorAttitude_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}
int SensorAttitude_Obj::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}
void SensorAttitude_Obj::refreshParameters() {
  addElementDouble("Eq_speed", &Eq_speed, 1, -kBig, kBig, true);
  addElementDouble("Eq_distance", &Eq_distance, 1, -kBig, kBig, true);
  addElementDouble("Mean_DC", &Mean_DC, 1, -kBig, kBig, true);
  addElementDouble("SquintAngle", &SquintAngle, 1, -kBig, kBig, true);
  addElementDouble("AntennaLength", &AntennaLength, 1, -kBig, kBig, true);
  addElementDouble("DroopGain", DroopGain, 8, -kBig, kBig, true);
  addElementDouble("Temperature", &Temperature, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}
int SensorAttitude_Obj::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "SensorAttitude")) return 0;
  ProfileKeyReader r(file, "SensorAttitude");
  r.required("Eq_speed", &Eq_speed);
  r.required("Eq_distance", &Eq_distance);
  r.required("Mean_DC", &Mean_DC);
  r.required("SquintAngle", &SquintAngle);
  r.required("AntennaLength", &AntennaLength);
  r.required("DroopGain", DroopGain, 8);
  r.required("Temperature", &Temperature);
  return r.status();
}
int SensorAttitude_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "SensorAttitude");
  return 0;
}
void SensorAttitude_Obj::clone(SensorAttitude_Obj* t) const {
  if (!t) return;
  t->Eq_speed = Eq_speed;
  t->Eq_distance = Eq_distance;
  t->Mean_DC = Mean_DC;
  t->SquintAngle = SquintAngle;
  t->AntennaLength = AntennaLength;
  for (int i = 0; i < 8; ++i) t->DroopGain[i] = DroopGain[i];
  t->Temperature = Temperature;
}

int SensorAttitude_Obj::getDroopGain(const std::string& insFile, int swath) {
  std::vector<unsigned char> record;
  const int status = readAsarAuxRecord(insFile, kInsRecordSize, record);
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  if (swath < 0 || swath > 4) return 0;
  const std::size_t table =
      kDroopTableOfSwath4 - kDroopTableSize * static_cast<std::size_t>(4 - swath);
  Temperature = ch2float4(&record[table], 'm');
  for (int i = 0; i < 8; ++i)
    DroopGain[i] = ch2double8(&record[table + 4 + 8 * static_cast<std::size_t>(i)], 'm');
  return 0;
}

// ---- SpectralWindows_Obj ------------------------------------------------------------

SpectralWindows_Obj::SpectralWindows_Obj() { createElementsVector(6); }
SpectralWindows_Obj::SpectralWindows_Obj(const SpectralWindows_Obj& o) : SpectralWindows_Obj() {
  o.clone(this);
}
SpectralWindows_Obj& SpectralWindows_Obj::operator=(const SpectralWindows_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}
int SpectralWindows_Obj::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}
void SpectralWindows_Obj::refreshParameters() {
  addElementString("AzMatchedFilterType", &AzMatchedFilterType, true);
  addElementString("RgMatchedFilterType", &RgMatchedFilterType, true);
  addElementDouble("RgMatchedFilterCoef", &RgMatchedFilterCoef, 1, -kBig, kBig, true);
  addElementDouble("AzMatchedFilterCoef", &AzMatchedFilterCoef, 1, -kBig, kBig, true);
  addElementDouble("RgLookBandwidth", &RgLookBandwidth, 1, -kBig, kBig, true);
  addElementDouble("AzLookBandwidth", &AzLookBandwidth, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}
int SpectralWindows_Obj::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "SpectralWindows")) return 0;
  ProfileKeyReader r(file, "SpectralWindows");
  r.required("AzMatchedFilterType", &AzMatchedFilterType);
  r.required("RgMatchedFilterType", &RgMatchedFilterType);
  r.required("RgMatchedFilterCoef", &RgMatchedFilterCoef);
  r.required("AzMatchedFilterCoef", &AzMatchedFilterCoef);
  r.required("RgLookBandwidth", &RgLookBandwidth);
  r.required("AzLookBandwidth", &AzLookBandwidth);
  return r.status();
}
int SpectralWindows_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "SpectralWindows");
  return 0;
}
void SpectralWindows_Obj::clone(SpectralWindows_Obj* t) const {
  if (!t) return;
  t->AzMatchedFilterType = AzMatchedFilterType;
  t->RgMatchedFilterType = RgMatchedFilterType;
  t->RgMatchedFilterCoef = RgMatchedFilterCoef;
  t->AzMatchedFilterCoef = AzMatchedFilterCoef;
  t->RgLookBandwidth = RgLookBandwidth;
  t->AzLookBandwidth = AzLookBandwidth;
}

// ---- SwathInfo ------------------------------------------------------------------------

SwathInfo::SwathInfo() { createElementsVector(12); }
SwathInfo::SwathInfo(const SwathInfo& o) : SwathInfo() { o.clone(this); }
SwathInfo& SwathInfo::operator=(const SwathInfo& o) {
  if (this != &o) o.clone(this);
  return *this;
}

int SwathInfo::createBuffers() {
  if (isBufferAllocated()) destroyBuffers();
  if (Swst_changes > 0) {
    try {
      Swst_changes_bursts.assign(static_cast<std::size_t>(Swst_changes), 0);
    } catch (const std::bad_alloc&) {
      ORV_REPORT("Memory allocation failed for the window change list", REPORT_ERROR);
      return STATUS_NO_MEMORY;
    }
  }
  refreshParameters();
  setAllocationFlag(true);
  return 0;
}

int SwathInfo::destroyBuffers() {
  Swst_changes_bursts.clear();
  setAllocationFlag(false);
  return 0;
}

void SwathInfo::refreshParameters() {
  addElementInt("Rank", &Rank, 1, -kIntMax, kIntMax, true);
  addElementDouble("Rgate_bias", &Rgate_bias, 1, -kBig, kBig, true);
  addElementInt("Echoes_per_burst", &Echoes_per_burst, 1, -kIntMax, kIntMax, true);
  addElementInt("Lines_per_burst", &Lines_per_burst, 1, -kIntMax, kIntMax, true);
  addElementInt("Bursts", &Bursts, 1, -kIntMax, kIntMax, true);
  addElementInt("Order", &Order, 1, -kIntMax, kIntMax, true);
  addElementDouble("Acquisition_Start_Time", &Acquisition_Start_Time, 1, -kBig, kBig, true);
  addElementInt("Swst_changes", &Swst_changes, 1, -kIntMax, kIntMax, true);
  addElementDouble("ProcessorGain", &ProcessorGain, 1, -kBig, kBig, false);
  addElementDouble("NoisePower", &NoisePower, 1, -kBig, kBig, false);
  addElementDouble("ChirpPower", &ChirpPower, 1, -kBig, kBig, false);
  // The list exists only when there are window changes.
  const int n = static_cast<int>(Swst_changes_bursts.size());
  addElementInt("Swst_changes_bursts", n > 0 ? Swst_changes_bursts.data() : nullptr, n, 0,
                kIntMax, false);
  setAllocationFlag(true);
}

int SwathInfo::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "SwathInfo")) return 0;
  ProfileKeyReader r(file, "SwathInfo");
  r.required("Rank", &Rank);
  r.required("Rgate_bias", &Rgate_bias);
  r.required("Echoes_per_burst", &Echoes_per_burst);
  r.required("Lines_per_burst", &Lines_per_burst);
  r.required("Bursts", &Bursts);
  r.required("Order", &Order);
  r.required("Acquisition_Start_Time", &Acquisition_Start_Time);
  r.required("Swst_changes", &Swst_changes);
  r.optional("ProcessorGain", &ProcessorGain);
  r.optional("NoisePower", &NoisePower);
  r.optional("ChirpPower", &ChirpPower);
  if (r.failed()) return STATUS_BAD_CONDITION;
  const int status = createBuffers();
  if (status != 0) return status;
  if (Swst_changes > 0 &&
      GetMyProfileIntArray("SwathInfo", "Swst_changes_bursts", Swst_changes_bursts.data(),
                           Swst_changes, file) != 0)
    return STATUS_BAD_CONDITION;
  return 0;
}

int SwathInfo::writehdr(const std::string& file) {
  refreshParameters();
  writeAuxiliaryFile(file, 1, "SwathInfo");
  return 0;
}

int SwathInfo::clone(SwathInfo* t) const {
  if (!t || t == this) return 0;
  t->Rank = Rank;
  t->Rgate_bias = Rgate_bias;
  t->Echoes_per_burst = Echoes_per_burst;
  t->Lines_per_burst = Lines_per_burst;
  t->Bursts = Bursts;
  t->Order = Order;
  t->Acquisition_Start_Time = Acquisition_Start_Time;
  t->Swst_changes = Swst_changes;
  t->ProcessorGain = ProcessorGain;
  t->NoisePower = NoisePower;
  t->ChirpPower = ChirpPower;
  try {
    t->Swst_changes_bursts = Swst_changes_bursts;
    t->BurstTimes = BurstTimes;
  } catch (const std::bad_alloc&) {
    return STATUS_NO_MEMORY;
  }
  t->refreshParameters();
  return 0;
}

int SwathInfo::readBurstTimes(const std::string& raster) {
  DataFile layout;
  if (layout.read_hdr(raster) != 0) {
    ORV_REPORT_CALLED_ERROR();
    return STATUS_READ_FAILED;
  }
  std::ifstream in(raster, std::ios::binary);
  if (!in) {
    ORV_REPORT("File not opened! " + raster, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  if (Bursts <= 0 || Lines_per_burst <= 0) {
    ORV_REPORT("No bursts to read in " + raster, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  try {
    BurstTimes.assign(static_cast<std::size_t>(Bursts), 0.0);
  } catch (const std::bad_alloc&) {
    return STATUS_NO_MEMORY;
  }
  const long long rowLength =
      static_cast<long long>(layout.element_sizeof()) * layout.NrOfPixelsPerLine + 17;
  for (int b = 0; b < Bursts; ++b) {
    const long long position =
        layout.HeaderOffset + static_cast<long long>(b) * Lines_per_burst * rowLength;
    unsigned char prefix[17];
    in.seekg(position);
    if (!in.read(reinterpret_cast<char*>(prefix), 17)) {
      ORV_REPORT("File reading failed! " + raster, REPORT_ERROR);
      return STATUS_READ_FAILED;
    }
    mjd date;
    std::memcpy(&date.days, prefix, 4);
    std::memcpy(&date.seconds, prefix + 4, 4);
    std::memcpy(&date.microseconds, prefix + 8, 4);
    BurstTimes[static_cast<std::size_t>(b)] = mjd2sec85(date);
  }
  return 0;
}

// ---- QuickLook_Obj --------------------------------------------------------------------

QuickLook_Obj::QuickLook_Obj() { createElementsVector(6); }
QuickLook_Obj::QuickLook_Obj(const QuickLook_Obj& o) : QuickLook_Obj() { o.clone(this); }
QuickLook_Obj& QuickLook_Obj::operator=(const QuickLook_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}
int QuickLook_Obj::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}
void QuickLook_Obj::refreshParameters() {
  addElementInt("QL_FirstSample", &QL_FirstSample, 1, 0, kIntMax, true);
  addElementInt("QL_Samples", &QL_Samples, 1, 0, kIntMax, true);
  addElementInt("QL_FirstLine", &QL_FirstLine, 1, 0, kIntMax, true);
  addElementInt("QL_Lines", &QL_Lines, 1, 0, kIntMax, true);
  addElementInt("QL_AzimuthML", &QL_AzimuthML, 1, 0, kIntMax, true);
  addElementInt("QL_RangeML", &QL_RangeML, 1, 0, kIntMax, true);
  setAllocationFlag(true);
}
int QuickLook_Obj::readhdr(const std::string& file) {
  return readAuxiliaryFile(file, 1, "QuickLook") ? 0 : 1;
}
int QuickLook_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "QuickLook");
  return 0;
}
void QuickLook_Obj::clone(QuickLook_Obj* t) const {
  if (!t) return;
  t->QL_FirstSample = QL_FirstSample;
  t->QL_Samples = QL_Samples;
  t->QL_FirstLine = QL_FirstLine;
  t->QL_Lines = QL_Lines;
  t->QL_AzimuthML = QL_AzimuthML;
  t->QL_RangeML = QL_RangeML;
}
