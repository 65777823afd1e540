#include "focus/sar_focuser.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <new>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "core/azimuth_focus.h"
#include "core/fft.h"
#include "core/range_focus.h"
#include "core/stripmlook.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "doppler/dc_driver.h"
#include "doppler/geometric_rate.h"
#include "orbit/general_sar_orbit.h"
#include "orbit/geo_grid.h"
#include "product/buffer_io.h"
#include "product/general_sar.h"
#include "product/general_sar_configuration.h"
#include "product/product_aggregates.h"
#include "product/profile.h"
#include "product/roi.h"

namespace {

constexpr double kPi = consts::kPi;
constexpr double kEqSpeedPlaceholder = 6900.0;

int calledError(int status) {
  ORV_REPORT_CALLED_ERROR();
  return status;
}

double sincPi(double x) { return x == 0.0 ? 1.0 : std::sin(kPi * x) / (kPi * x); }

// Values taken from the raw record for the kernels.
struct ChainContext {
  std::string reportFile;
  std::string rawFile;
  std::string chirpFile;
  std::string outputFile;
  std::string rgfocFile;
  double fc_hz = 0.0;
  double frg_hz = 0.0;
  double prf_hz = 0.0;
  double swstMin = 0.0;
  double swstMax = 0.0;
  double azimuthStart = 0.0;
  double brg_hz = 0.0;
  double antennaLength = 0.0;
  int lines = 0;
  int samples = 0;
  double lookSign = 1.0;
  double lambda_m = 0.0;
};

// Reads a profile value of one of the types below; the value is left as it
// is when the key is absent.
void readInt(const std::string& file, const std::string& section, const std::string& key,
             int& value) {
  int v = value;
  if (GetMyProfileIntArray(section, key, &v, 1, file) == 0) value = v;
}
void readDouble(const std::string& file, const std::string& section, const std::string& key,
                double& value) {
  double v = value;
  if (GetProfileDoubleArray(section, key, &v, 1, file) == 0) value = v;
}
bool hasKey(const std::string& file, const std::string& section, const std::string& key) {
  return GetSetProfileChar(0, section, key, "", file) != nullptr;
}

// The Doppler estimator's values of the chain: profile key in "DCestConf",
// place in the chain's block, in the processing configuration document and
// in the estimator's state. Reading, copying and handing over all walk this
// one list.
template <class Visit>
void forEachDcEstValue(Visit&& v) {
  v("RgBand", &SARFocuser_conf::RgBand, &DCestConf::RgBand, &DcEstState::rgBand);
  v("Blocks", &SARFocuser_conf::Blocks, &DCestConf::Blocks, &DcEstState::blocks);
  v("Blockl", &SARFocuser_conf::Blockl, &DCestConf::Blockl, &DcEstState::blockl);
  v("AnLen", &SARFocuser_conf::AnLen, &DCestConf::AnLen, &DcEstState::anLen);
  v("Kthr", &SARFocuser_conf::Kthr, &DCestConf::Kthr, &DcEstState::kThr);
  v("Sthr", &SARFocuser_conf::Sthr, &DCestConf::Sthr, &DcEstState::sThr);
  v("Varthr", &SARFocuser_conf::Varthr, &DCestConf::Varth, &DcEstState::varTh);
  v("Lookbf", &SARFocuser_conf::Lookbf, &DCestConf::Lookbf, &DcEstState::lookBf);
  v("Lookbt", &SARFocuser_conf::Lookbt, &DCestConf::Lookbt, &DcEstState::lookBt);
  v("Lookrp", &SARFocuser_conf::Lookrp, &DCestConf::Lookrp, &DcEstState::lookRp);
  v("Lookrs", &SARFocuser_conf::Lookrs, &DCestConf::Lookrs, &DcEstState::lookRs);
  v("Decfac", &SARFocuser_conf::Decfac, &DCestConf::Decfac, &DcEstState::decFac);
  v("Flength", &SARFocuser_conf::Flength, &DCestConf::Flength, &DcEstState::fLength);
  v("Dftstep", &SARFocuser_conf::Dftstep, &DCestConf::Dftstep, &DcEstState::dftStep);
  v("Fftrgprc", &SARFocuser_conf::Fftrgprc, &DCestConf::Fftrgprc, &DcEstState::fftRgPrc);
  v("Fftazprc", &SARFocuser_conf::Fftazprc, &DCestConf::Fftazprc, &DcEstState::fftAzPrc);
  v("Peakwid", &SARFocuser_conf::Peakwid, &DCestConf::Peakwid, &DcEstState::peakWid);
  v("Minamb", &SARFocuser_conf::Minamb, &DCestConf::Minamb, &DcEstState::minAmb);
  v("Maxamb", &SARFocuser_conf::Maxamb, &DCestConf::Maxamb, &DcEstState::maxAmb);
  v("Nbestblocks", &SARFocuser_conf::Nbestblocks, &DCestConf::Nbestblocks, &DcEstState::nBest);
  v("Nummlbf", &SARFocuser_conf::Nummlbf, &DCestConf::Nummlbf, &DcEstState::nMlbf);
  v("Nwdarblocks", &SARFocuser_conf::Nwdarblocks, &DCestConf::Nwdarbloks, &DcEstState::nWdar);
  v("Patchs", &SARFocuser_conf::Patchs, &DCestConf::Patchs, &DcEstState::patchs);
  v("Patchl", &SARFocuser_conf::Patchl, &DCestConf::Patchl, &DcEstState::patchl);
  v("Dswst", &SARFocuser_conf::Dswst, &DCestConf::Dswst, &DcEstState::dswst);
  v("Amb_flag", &SARFocuser_conf::Amb_flag, &DCestConf::Amb_flag, &DcEstState::ambFlag);
}

// The azimuth focuser's values of the chain: profile key in "AzimuthConf",
// place in the chain's block, in the processing configuration document and
// in the kernel's configuration. The overlaps, halved at reading, and the
// bandwidths, fractions of the sampling rates, are handled beside the list.
template <class Visit>
void forEachAzimuthValue(Visit&& v) {
  v("AntennaLength", &SARFocuser_conf::AntennaLength, &AzimuthConf::AntennaLength,
    &AzimuthFocusConf::AntennaLength);
  v("WhiteningFlag", &SARFocuser_conf::WhiteningFlag, &AzimuthConf::WhiteningFlag,
    &AzimuthFocusConf::WhiteningFlag);
  v("RangeWindowHammingParameter", &SARFocuser_conf::RangeWindowHammingParameter,
    &AzimuthConf::RangeWindowHammingParameter, &AzimuthFocusConf::RangeWindowHammingParameter);
  v("AzimuthWindowHammingParameter", &SARFocuser_conf::AzimuthWindowHammingParameter,
    &AzimuthConf::AzimuthWindowHammingParameter,
    &AzimuthFocusConf::AzimuthWindowHammingParameter);
  v("RangeLookBandwidth", &SARFocuser_conf::RangeLookBandwidth, &AzimuthConf::RangeLookBandwidth,
    &AzimuthFocusConf::RangeLookBandwidth);
  v("AzimuthLookBandwidth", &SARFocuser_conf::AzimuthLookBandwidth,
    &AzimuthConf::AzimuthLookBandwidth, &AzimuthFocusConf::AzimuthLookBandwidth);
  v("RangeTransitionBandwidth", &SARFocuser_conf::RangeTransitionBandwidth,
    &AzimuthConf::RangeTransitionBandwidth, &AzimuthFocusConf::RangeTransitionBandwidth);
  v("AzimuthTransitionBandwidth", &SARFocuser_conf::AzimuthTransitionBandwidth,
    &AzimuthConf::AzimuthTransitionBandwidth, &AzimuthFocusConf::AzimuthTransitionBandwidth);
  v("LinesInBlock", &SARFocuser_conf::LinesInBlock, &AzimuthConf::LinesInBlock,
    &AzimuthFocusConf::LinesInBlock);
  v("SamplesInBlock", &SARFocuser_conf::SamplesInBlock, &AzimuthConf::SamplesInBlock,
    &AzimuthFocusConf::SamplesInBlock);
  v("PerformInterpolation", &SARFocuser_conf::PerformInterpolation,
    &AzimuthConf::PerformInterpolation, &AzimuthFocusConf::PerformInterpolation);
  v("StoltPadding", &SARFocuser_conf::StoltPadding, &AzimuthConf::StoltPadding,
    &AzimuthFocusConf::StoltPadding);
  v("ApplyAzShift", &SARFocuser_conf::ApplyAzShift, &AzimuthConf::ApplyAzShift,
    &AzimuthFocusConf::ApplyAzShift);
  v("ApplyRgShift", &SARFocuser_conf::ApplyRgShift, &AzimuthConf::ApplyRgShift,
    &AzimuthFocusConf::ApplyRgShift);
}

void readValue(const std::string& file, const std::string& section, const std::string& key,
               int& value) {
  readInt(file, section, key, value);
}
void readValue(const std::string& file, const std::string& section, const std::string& key,
               double& value) {
  readDouble(file, section, key, value);
}

// A value of the configuration document into the chain's block.
void fromDocument(int& value, int document) { value = document; }
void fromDocument(double& value, int document) { value = document; }
void fromDocument(double& value, float document) { value = documentReal(document); }

}  // namespace

// ---- files ----------------------------------------------------------------------

bool fileOpens(const std::string& name) {
  if (name.empty()) return false;
  std::FILE* f = std::fopen(name.c_str(), "rb");
  if (!f) return false;
  std::fclose(f);
  return true;
}

// Whether the chain or the job erases `file` once its stage has read it.
bool erasedByTheJob(const SARFocuser_conf& conf, const std::string& file) {
  return conf.DeleteTempFiles != 0 || std::find(conf.ErasedTemporaries.begin(), conf.ErasedTemporaries.end(),
                                                file) != conf.ErasedTemporaries.end();
}

void removeReported(const std::string& name) {
  if (std::remove(name.c_str()) != 0) ORV_REPORT("Cannot remove file", REPORT_WARNING);
}

// ---- kernels --------------------------------------------------------------------

void polyToFlat(const poly& p, double out[9]) {
  for (int i = 0; i < 7; ++i) out[i] = p.c[i];
  out[7] = p.trg0;
  out[8] = p.taz0;
}

void polyFromFlat(const double in[9], poly& p) {
  for (int i = 0; i < 7; ++i) p.c[i] = in[i];
  p.trg0 = in[7];
  p.taz0 = in[8];
}

int estimateCentroid(DcEstInput& input, DcEstState& state, double poly[7]) {
  return getnadcpoly(input, state, poly);
}

int focusAzimuth(const AzimuthFocusFiles& files, AzimuthFocusScene& scene,
                 const AzimuthFocusConf& conf) {
  return azimuthfoc(files, scene, conf);
}

int centroidStep(const SARFocuser_conf& conf, DcEstInput& input, double fc, double fs,
                 const fcomplex* inMemory, poly& dc) {
  DcEstState state;
  fillDcEstState(conf, fc, fs, state);
  if (inMemory) {
    state.inMemory = 1;
    state.data = inMemory;
  }
  double c[7] = {0, 0, 0, 0, 0, 0, 0};
  if (int st = estimateCentroid(input, state, c); st != 0) return st;
  for (int i = 0; i < 7; ++i) dc.c[i] = c[i];
  return 0;
}

int azimuthStep(const AzimuthFocusFiles& files, const AzimuthFocusConf& conf, const poly& dc,
                const poly& fr, int samples, int lines, AzimuthFocusScene& scene) {
  scene.samples = samples;
  scene.lines = lines;
  polyToFlat(dc, scene.polyDC);
  polyToFlat(fr, scene.polyFR);
  return focusAzimuth(files, scene, conf);
}

DcEstInput dcEstInput(const std::string& raster, const std::string& outDir, int samples, int lines,
                      double prf, double timeOrigin) {
  DcEstInput in;
  in.rasterFile = raster;
  in.outDir = outDir;
  in.samples = samples;
  in.lines = lines;
  in.prf = prf;
  in.velocity = kEqSpeedPlaceholder;
  in.timeOrigin = timeOrigin;
  return in;
}

AzimuthFocusFiles azimuthFocusFiles(const std::string& input, const std::string& output,
                                    const SamplingConstants_Obj& smp, double fastStart,
                                    double slowStart) {
  AzimuthFocusFiles files;
  files.input = input;
  files.output = output;
  files.frg_hz = smp.frg_hz;
  files.fc_hz = smp.fc_hz;
  files.prf_hz = smp.prf_hz;
  files.FastStartTime = fastStart;
  files.bandwidth_hz = smp.Brg_hz;
  files.SlowStartTime = slowStart;
  return files;
}

void fillDcEstState(const SARFocuser_conf& conf, double fc, double fs, DcEstState& state) {
  forEachDcEstValue([&](const char*, auto chain, auto, auto estimator) {
    state.*estimator = conf.*chain;
  });
  state.memory = static_cast<int64_t>(conf.Memory) << 20;
  state.fc = fc;
  state.fs = fs;
  for (int i = 0; i < 7; ++i) state.polMask[i] = conf.Pol_Weights[i];
  state.verbose = conf.Verbose;
}

AzimuthFocusConf azimuthFocusConf(const SARFocuser_conf& conf, double frg, double prf) {
  AzimuthFocusConf ac;
  forEachAzimuthValue([&](const char*, auto chain, auto, auto kernel) { ac.*kernel = conf.*chain; });
  ac.RangeLookBandwidth = conf.RangeLookBandwidth * frg;
  ac.AzimuthLookBandwidth = conf.AzimuthLookBandwidth * prf;
  ac.RangeTransitionBandwidth = conf.RangeTransitionBandwidth * frg;
  ac.AzimuthTransitionBandwidth = conf.AzimuthTransitionBandwidth * prf;
  ac.RangeOverlap = conf.RangeOverlap;
  ac.AzimuthOverlap = conf.AzimuthOverlap;
  ac.AzimuthOverlapFromScene = conf.AzimuthOverlapFromScene;
  ac.Memory = conf.Memory;
  return ac;
}

double documentReal(float value) {
  char text[32];
  const auto written = std::to_chars(text, text + sizeof text, value);
  double result = value;
  std::from_chars(text, written.ptr, result);
  return result;
}

SARFocuser_conf chainConfFrom(const GeneralSAR_configuration& c) {
  SARFocuser_conf conf;
  conf.clear();
  const GeneralSAR_BaseConfiguration& common = c.generalConf;
  conf.Memory = common.Memory;
  conf.Incore = common.Incore;
  conf.Verbose = common.Verbose;
  conf.ReportLevel = common.ReportLevel;
  conf.ReportFilename = common.ReportFilename;

  const DCestConf& d = c.dcestConf;
  forEachDcEstValue(
      [&](const char*, auto chain, auto document, auto) { fromDocument(conf.*chain, d.*document); });
  for (int i = 0; i < 7; ++i) conf.Pol_Weights[i] = d.Pol_weights[i];

  const AzimuthConf& a = c.azimuthConf;
  forEachAzimuthValue(
      [&](const char*, auto chain, auto document, auto) { fromDocument(conf.*chain, a.*document); });
  conf.RangeOverlap = a.RangeOverlap / 2;
  conf.AzimuthOverlap = a.AzimuthOverlap / 2;

  const generalProcessingConf& g = c.generalConf;
  conf.Flag_rangefoc = g.Flag_rangefoc;
  conf.Flag_rgpatt = g.Flag_rgpatt;
  conf.Flag_azimuthfoc = g.Flag_azimuthfoc;
  conf.Flag_dcest = g.Flag_dcest;
  conf.Flag_ortog = g.Flag_ortog;
  conf.Flag_swstal = g.Flag_swstal;
  conf.Azblk = g.Azblk;
  conf.DeleteTempFiles = g.EraseTemp;
  return conf;
}

void setHammingWindows(SpectralWindows_Obj& w, const SARFocuser_conf& conf) {
  w.AzMatchedFilterType = "HAMMING";
  w.RgMatchedFilterType = "HAMMING";
  w.RgMatchedFilterCoef = conf.RangeWindowHammingParameter;
  w.AzMatchedFilterCoef = conf.AzimuthWindowHammingParameter;
  w.RgLookBandwidth = conf.RangeLookBandwidth;
  w.AzLookBandwidth = conf.AzimuthLookBandwidth;
}

void setFocusedProduct(GeneralSAR& product, const std::string& raster,
                       const AzimuthFocusScene& scene, const ROI_Obj& deltas,
                       const SARFocuser_conf& conf, double lambda) {
  setComplexRasterLayout(product.dataFile, raster, scene.outSamples, scene.outLines);
  ROI_Obj& roi = product.roi.roi;
  roi.SetFastAxe(scene.firstSampleTime, deltas.FastTimeDelta, scene.outSamples);
  roi.SetSlowAxe(scene.firstLineTime, deltas.SlowTimeDelta, scene.outLines);
  product.dataSetInfo.SetImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED);
  product.dataSetInfo.SWST_MIN = product.dataSetInfo.SWST_MAX = scene.firstSampleTime;
  product.attitude.Eq_speed = scene.Veq;
  product.attitude.Mean_DC = scene.centroid;
  product.attitude.SquintAngle =
      scene.Veq != 0.0 ? std::asin(-(lambda * scene.centroid) / (2.0 * scene.Veq)) * 180.0 / kPi
                       : 0.0;
  setHammingWindows(product.spectralWindows, conf);
}

// ---- configuration ----------------------------------------------------------

void SARFocuser_conf::clear() {
  *this = SARFocuser_conf{};
  Flag_rangefoc = Flag_rgpatt = Flag_azimuthfoc = Flag_dcest = 0;
  Flag_ortog = 1;
  Flag_swstal = 1;
  Azblk = 1024;
}

int SARFocuser_conf::readpar(const std::string& file) {
  clear();
  if (!fileOpens(file)) {
    ORV_REPORT("File not opened! (" + file + ")", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  const std::string s = "sarfocuserConfiguration";
  readInt(file, s, "Incore", Incore);
  readInt(file, s, "Memory", Memory);
  readInt(file, s, "Verbose", Verbose);
  readInt(file, s, "ReportLevel", ReportLevel);
  GetMyProfileString(s, "ReportFilename", ReportFilename, file);
  GetMyProfileString(s, "ProcessingConfFile", ProcessingConfFile, file);
  readDouble(file, s, "DCref", DCref);
  readInt(file, s, "DeleteTempFiles", DeleteTempFiles);
  return 0;
}

int SARFocuser_conf::readconf(const std::string& file) {
  if (!fileOpens(file)) {
    ORV_REPORT("File not opened! (" + file + ")", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  const std::string d = "DCestConf";
  forEachDcEstValue([&](const char* key, auto chain, auto, auto) { readValue(file, d, key, this->*chain); });
  {
    int w[7] = {1, 1, 1, 1, 1, 1, 1};
    if (hasKey(file, d, "Pol_Weights") && GetMyProfileIntArray(d, "Pol_Weights", w, 7, file) != 0)
      for (int& x : w) x = 1;
    for (int i = 0; i < 7; ++i) Pol_Weights[i] = w[i];
  }

  const std::string a = "AzimuthConf";
  forEachAzimuthValue([&](const char* key, auto chain, auto, auto) { readValue(file, a, key, this->*chain); });
  if (hasKey(file, a, "RangeOverlap")) {
    int v = 0;
    readInt(file, a, "RangeOverlap", v);
    RangeOverlap = v / 2;
  }
  if (hasKey(file, a, "AzimuthOverlap")) {
    int v = 0;
    readInt(file, a, "AzimuthOverlap", v);
    AzimuthOverlap = v / 2;
  }
  AzimuthOverlapFromScene = 0;
  readInt(file, a, "AzimuthOverlapFromScene", AzimuthOverlapFromScene);

  const std::string g = "GeneralProcessingConf";
  Flag_rangefoc = 1;
  Flag_rgpatt = 0;
  Flag_azimuthfoc = 1;
  Flag_dcest = 1;
  Flag_ortog = 1;
  Flag_swstal = 1;
  Azblk = 1024;
  Multilook = 0;
  readInt(file, g, "Flag_rangefoc", Flag_rangefoc);
  readInt(file, g, "Flag_rgpatt", Flag_rgpatt);
  readInt(file, g, "Flag_azimuthfoc", Flag_azimuthfoc);
  readInt(file, g, "Flag_dcest", Flag_dcest);
  readInt(file, g, "Flag_ortog", Flag_ortog);
  readInt(file, g, "Flag_swstal", Flag_swstal);
  readInt(file, g, "Azblk", Azblk);
  readInt(file, g, "Multilook", Multilook);
  return 0;
}

int SARFocuser_input::readpar(const std::string& file) {
  const std::string s = "sarfocuserInput";
  if (GetMyProfileString(s, "RawDataFile", RawDataFile, file) != 0) {
    ORV_REPORT("RawDataFile not defined in " + file, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  GetMyProfileString(s, "ChirpFile", ChirpFile, file);
  GetMyProfileString(s, "AntennaFile", AntennaFile, file);
  return 0;
}

int SARFocuser_output::readpar(const std::string& file) {
  if (GetMyProfileString("sarfocuserOutput", "OutputFilename", OutputFilename, file) != 0) {
    ORV_REPORT("OutputFilename not defined in " + file, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  return 0;
}

// ---- thin parameter calls -------------------------------------------------------

int GetParString(const std::string& file, const std::string& key, int, std::string* value, int,
                 const std::string& section) {
  return GetMyProfileString(section, key, *value, file);
}
int GetParInt(const std::string& file, const std::string& key, int count, int* value, int,
              const std::string& section) {
  return GetMyProfileIntArray(section, key, value, count, file);
}
int GetParFloat(const std::string& file, const std::string& key, int count, float* value, int,
                const std::string& section) {
  return GetMyProfileFloatArray(section, key, value, count, file);
}
int GetParDouble(const std::string& file, const std::string& key, int count, double* value, int,
                 const std::string& section) {
  return GetProfileDoubleArray(section, key, value, count, file);
}
int SetParString(const std::string& file, const std::string& key, int, const std::string* value,
                 int, const std::string& section) {
  return WriteMyProfileString(section, key, *value, file);
}
int SetParInt(const std::string& file, const std::string& key, int count, const int* value, int,
              const std::string& section) {
  return WriteMyProfileIntArray(section, key, value, count, file);
}
int SetParFloat(const std::string& file, const std::string& key, int count, const float* value,
                int, const std::string& section) {
  return WriteMyProfileFloatArray(section, key, value, count, file);
}
int SetParDouble(const std::string& file, const std::string& key, int count, const double* value,
                 int, const std::string& section) {
  return WriteProfileDoubleArray(section, key, value, count, file);
}

// ---- the chain ------------------------------------------------------------------

SARFocuser::SARFocuser(SARFocuser_conf* conf) : conf_(conf) {}
SARFocuser::~SARFocuser() = default;

int SARFocuser::run() {
  if (!conf_) {
    ORV_REPORT("Focusing configuration not set", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  if (fileOpens(RawDataFile)) {
    ORV_REPORT("STRIPMAP RAW DATA DETECTED, FOCUSSING...", REPORT_CHECKPOINT);
    if (!fileOpens(ChirpFile)) {
      ORV_REPORT(" Chirp file does not exists! (" + ChirpFile + ")", 17);
      return STATUS_BAD_PARAMETER;
    }
    conf_->Flag_rgpatt = 0;
    const int status = process();
    if (status != 0) return calledError(status);
    return 0;
  }

  // Alternating polarisation: two channels "<raw>1" and "<raw>2".
  if (!fileOpens(RawDataFile + "1")) {
    ORV_REPORT("Raw Data file does not exists!", REPORT_IMAGE_MISSING);
    return STATUS_BAD_PARAMETER;
  }
  ORV_REPORT("AP RAW DATA DETECTED, FOCUSSING...", REPORT_CHECKPOINT);
  const std::string raw = RawDataFile, chirp = ChirpFile, output = OutputFilename;
  int status = 0;
  for (int k = 1; k <= 2 && status == 0; ++k) {
    const std::string n = std::to_string(k);
    if (!fileOpens(chirp + n)) {
      ORV_REPORT("Chirp file does not exists!", 17);
      status = STATUS_BAD_PARAMETER;
      break;
    }
    RawDataFile = raw + n;
    ChirpFile = chirp + n;
    OutputFilename = output + n;
    conf_->Flag_rgpatt = 0;
    status = process();
    if (status == 0) status = descallop();
    if (status != 0) ORV_REPORT_CALLED_ERROR();
  }
  RawDataFile = raw;
  ChirpFile = chirp;
  OutputFilename = output;
  return status;
}

namespace {

// One raster through the chain: the raw record and the values taken from it,
// the replica, the range focuser's work, the Doppler polynomials and the
// result of azimuth focusing, handed from one step to the next.
struct ChainRun {
  explicit ChainRun(SARFocuser_conf& c) : conf(c) {}
  SARFocuser_conf& conf;
  ChainContext ctx;
  GeneralRAWData rawRecord;
  std::vector<fcomplex> chirp;
  RangeFocParams rp;
  RangeFocWork rw;
  int rgSamples = 0;
  int rgLines = 0;
  polyDC dcPoly;
  polyFR frPoly;
  AzimuthFocusScene scene;

  int readRawRecord(const std::string& raw);
  int readReplica(const std::string& chirpName);
  int rangeStep(const std::string& raw);
  int dopplerStep();
  int writeRangeFocusedRecord();
  int azimuthStage();
  int writeFocusedRecord();
};

// The raw record, the sampling and region values of the chain, the look
// sign and the whole-image shift sentinels.
int ChainRun::readRawRecord(const std::string& raw) {
  if (int st = rawRecord.readhdr(raw + ".hdr"); st != 0) {
    ORV_REPORT("Cannot read the raw data record " + raw + ".hdr", REPORT_ERROR);
    return calledError(st);
  }

  const SamplingConstants_Obj& smp = rawRecord.sampling;
  const ROI_Obj& rawRoi = rawRecord.roi;
  ctx.fc_hz = smp.fc_hz;
  ctx.frg_hz = smp.frg_hz;
  ctx.prf_hz = smp.prf_hz;
  ctx.swstMin = rawRecord.dataSetInfo.SWST_MIN;
  ctx.swstMax = rawRecord.dataSetInfo.SWST_MAX;
  ctx.azimuthStart = rawRoi.SlowStartTime;
  ctx.brg_hz = smp.Brg_hz;
  ctx.lines = rawRoi.Lines;
  ctx.samples = rawRoi.Samples;
  const int lookSign = rawRecord.dataSetInfo.LookDirection == -1 ? -1 : 1;
  ctx.lookSign = lookSign;
  ctx.lambda_m = smp.lambda_m;
  rawRecord.orbit().setLookSign(lookSign);
  ctx.antennaLength = conf.AntennaLength;
  if (ctx.frg_hz <= 0.0 || ctx.prf_hz <= 0.0 || ctx.lines < 1 || ctx.samples < 1) {
    ORV_REPORT("Sampling values of the raw data record are wrong: " + raw + ".hdr",
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }

  // 1.0 is the sentinel of "the whole image".
  if (conf.ApplyAzShift == 1.0) conf.ApplyAzShift = ctx.lines;
  if (conf.ApplyRgShift == 1.0) conf.ApplyRgShift = ctx.samples;
  return 0;
}

// The whole replica in memory.
int ChainRun::readReplica(const std::string& chirpName) {
  DataFile chirpFile;
  if (int st = chirpFile.read_hdr(chirpName); st != 0) {
    ORV_REPORT("Cannot read the chirp header " + chirpName + ".hdr", REPORT_ERROR);
    return calledError(st);
  }
  try {
    chirp.assign(std::max(chirpFile.NrOfPixelsPerLine, 0), fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Memory allocation failed", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  if (!chirp.empty()) {
    BufferIO io{.file = &chirpFile, .first_column = 0, .columns = static_cast<int>(chirp.size()),
                 .first_row = 0, .rows = 1};
    const int st = io.readbuffer(chirp.data());
    chirpFile.close();
    if (st != 0) return calledError(st);
  }
  return 0;
}

// Range focusing of the raw raster into ".rgfoc" (or into memory with
// Incore); the raw raster, the report and the replica go when the chain
// erases its inputs.
int ChainRun::rangeStep(const std::string& raw) {
  rp.inputFile = ctx.rawFile;
  rp.outputFile = ctx.rgfocFile;
  rp.fs = ctx.frg_hz;
  rp.swstMin = ctx.swstMin;
  rp.swstMax = ctx.swstMax;
  rp.prf = ctx.prf_hz;
  rp.lines = ctx.lines;
  rp.samples = ctx.samples;
  rp.overwriteInput = erasedByTheJob(conf, ctx.rawFile);
  rw.verbose = conf.Verbose;
  rw.replica = chirp.data();
  rw.replicaLen = static_cast<int>(chirp.size());
  rw.Flag_ortog = conf.Flag_ortog;
  rw.prefix = rawRecord.dataFile.RowPrefix > 0 ? 1 : 0;
  rw.incore = conf.Incore;
  if (rawRecord.dataFile.RowPrefix != 0 && rawRecord.dataFile.RowPrefix != 4) {
    ORV_REPORT("Raw raster rows must carry a 4-byte sampling window prefix: " + raw, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  if (rawRecord.dataFile.HeaderOffset != 0) {
    ORV_REPORT("Raw raster with a header block cannot be range focused: " + raw, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }

  if (conf.Incore) {
    conf.DeleteTempFiles = 0;
    if (int st = init_buffer(rp, rw); st != 0) return calledError(st);
  }

  if (conf.Flag_rangefoc) {
    ORV_REPORT("Range Focusing", REPORT_CHECKPOINT);
    if (int st = rangefoc(rp, rw); st != 0) return calledError(st);
    if (conf.DeleteTempFiles) {
      removeReported(ctx.rawFile);
      if (!ctx.reportFile.empty()) removeReported(ctx.reportFile);
      removeReported(ctx.chirpFile);
      removeReported(ctx.chirpFile + ".hdr");
    }
  }
  rgSamples = rw.outSamples;
  rgLines = rw.outLines;
  return 0;
}

// Doppler centroid estimated from the range-focused raster and the
// geometric Doppler rate, or both taken from an earlier product.
int ChainRun::dopplerStep() {
  dcPoly.trg0 = ctx.swstMin;
  dcPoly.taz0 = ctx.azimuthStart;
  frPoly.trg0 = ctx.swstMin;
  frPoly.taz0 = ctx.azimuthStart;
  if (conf.Flag_dcest) {
    DcEstInput in = dcEstInput(ctx.rgfocFile, ".", rgSamples, rgLines, ctx.prf_hz, ctx.azimuthStart);
    ORV_REPORT("DC Estimation", REPORT_CHECKPOINT);
    if (int st = centroidStep(conf, in, ctx.fc_hz, ctx.frg_hz,
                              conf.Incore ? rw.data.data() : nullptr, dcPoly);
        st != 0)
      return calledError(st);

    ORV_REPORT("GEOMETRIC POLYNOMIALS COMPUTATION", REPORT_CHECKPOINT);
    const int replicaSamples =
        chirp.empty() ? rawRecord.pulse.chirpSamples() : static_cast<int>(chirp.size());
    const double peakDelay = compressedPeakDelay(rawRecord.pulse.PulseLength, replicaSamples, ctx.frg_hz);
    if (int st = geometricRatePoly(rawRecord.orbit(), ctx.azimuthStart,
                                   ctx.azimuthStart + ctx.lines / ctx.prf_hz, ctx.swstMin, peakDelay,
                                   rgSamples, ctx.frg_hz, ctx.fc_hz, dcPoly, ctx.lookSign, frPoly);
        st != 0)
      return calledError(st);
    if (conf.DeleteTempFiles) removeReported("./DCEST_resume.txt");
  }
  else if (conf.DopplerGiven) {
    ORV_REPORT("Doppler centroid and rate taken from the first polarisation", REPORT_CHECKPOINT);
    for (int i = 0; i < 7; ++i) {
      dcPoly.c[i] = conf.GivenDC[i];
      frPoly.c[i] = conf.GivenFR[i];
    }
    dcPoly.trg0 = conf.GivenDCref[0];
    dcPoly.taz0 = conf.GivenDCref[1];
    frPoly.trg0 = conf.GivenFRref[0];
    frPoly.taz0 = conf.GivenFRref[1];
  }
  return 0;
}

// Record of the range-focused raster.
int ChainRun::writeRangeFocusedRecord() {
  const ROI_Obj& rawRoi = rawRecord.roi;
  GeneralSLCData rg;
  rawRecord.dataSetInfo.clone(&rg.dataSetInfo);
  rg.dataSetInfo.SWST_MIN = rg.dataSetInfo.SWST_MAX = ctx.swstMin;
  rg.dataSetInfo.Description = "StripMap Range Focused Image File";
  rg.dataSetInfo.ProcessingSoftware = "SARFocuser v1.0";
  rg.dataSetInfo.ProcessingCenter = "Orvane - Lumbrao";
  rg.dataSetInfo.Swath = rawRecord.dataSetInfo.Swath;
  rg.dataSetInfo.OrbitConfiguration = rawRecord.dataSetInfo.OrbitConfiguration;
  rg.dataSetInfo.Polarization = rawRecord.dataSetInfo.Polarization;
  rg.dataSetInfo.SetImageType(DataSetInfo_Obj::IT_RANGE_FOCUSED);
  rg.rasterName = ctx.rgfocFile;
  setComplexRasterLayout(rg.dataFile, ctx.rgfocFile, rgSamples, rgLines);
  rg.roi.SetFastAxe(ctx.swstMin, rawRoi.FastTimeDelta, rgSamples);
  rg.roi.SetSlowAxe(ctx.azimuthStart, rawRoi.SlowTimeDelta, rgLines);
  rg.polynomials.CreatePolys(1, 1);
  rg.polynomials.DC[0] = dcPoly;
  rg.polynomials.FR[0] = frPoly;
  rg.attitude.Eq_speed = kEqSpeedPlaceholder;
  rg.attitude.Mean_DC = -1.0;
  rg.attitude.SquintAngle = -1.0;
  setHammingWindows(rg.spectralWindows, conf);
  rawRecord.orbit().clone(&rg.orbit());
  if (int st = rg.orbit().SVGetGeoCoords(&rg.geoCoords, &rg.roi); st != 0)
    return calledError(st);
  rawRecord.sampling.clone(&rg.sampling);
  rawRecord.pulse.clone(&rg.pulse);
  rawRecord.swath.clone(&rg.swath);
  if (int st = rg.writehdr(); st != 0) return calledError(st);
  rg.destroyAll();
  return 0;
}

// Azimuth focusing of the range-focused raster into the output; the
// range-focused raster goes when the chain erases its inputs.
int ChainRun::azimuthStage() {
  const SamplingConstants_Obj& smp = rawRecord.sampling;
  if (conf.ApplyRgShift == ctx.samples) conf.ApplyRgShift = rgSamples;
  AzimuthFocusFiles files =
      azimuthFocusFiles(ctx.rgfocFile, ctx.outputFile, smp, ctx.swstMin, ctx.azimuthStart);
  files.overwriteInput = erasedByTheJob(conf, ctx.rgfocFile);
  scene.verbose = conf.Verbose;
  scene.DCref = conf.DCref;
  scene.inCore = conf.Incore;
  scene.buffer = conf.Incore ? rw.data.data() : nullptr;
  const AzimuthFocusConf ac = azimuthFocusConf(conf, ctx.frg_hz, ctx.prf_hz);
  ORV_REPORT("Azimuth Focusing", REPORT_CHECKPOINT);
  char text[64];
  std::snprintf(text, sizeof text, "DCref: %f", conf.DCref);
  ORV_REPORT(text, REPORT_MESSAGE);
  if (int st = azimuthStep(files, ac, dcPoly, frPoly, rgSamples, rgLines, scene); st != 0)
    return calledError(st);
  if (conf.DeleteTempFiles) {
    removeReported(ctx.rgfocFile);
    removeReported(ctx.rgfocFile + ".hdr");
  }
  return 0;
}

// Record of the focused product, written beside it.
int ChainRun::writeFocusedRecord() {
  const ROI_Obj& rawRoi = rawRecord.roi;
  GeneralSAR product;
  rawRecord.dataSetInfo.clone(&product.dataSetInfo);
  DataSetInfo_Obj& info = product.dataSetInfo;
  info.ExternalCalibrationFactor = 1.0;
  info.Description = "StripMap level 1 Image File";
  info.ProcessingSoftware = "SARFocuser v1.0";
  info.ProcessingCenter = "Orvane - Lumbrao";
  info.Swath = rawRecord.dataSetInfo.Swath;
  info.OrbitConfiguration = rawRecord.dataSetInfo.OrbitConfiguration;
  info.Polarization = rawRecord.dataSetInfo.Polarization;

  ROI_Obj& roi = product.roi.roi;
  setFocusedProduct(product, ctx.outputFile, scene, rawRoi, conf, ctx.lambda_m);

  rawRecord.orbit().clone(&product.orbit());
  product.polynomials.CreatePolys(1, 1, 1, 1, 1, 1);
  polyFromFlat(scene.polyDCOut, product.polynomials.DC[0]);
  polyFromFlat(scene.polyFROut, product.polynomials.FR[0]);
  {
    int st = product.orbit().SVGetTimeToAnglesPolys(&roi, &product.polynomials.DC[0],
                                                    &product.polynomials.SL2THETA[0],
                                                    &product.polynomials.SL2PHI[0]);
    if (st == 0)
      st = product.orbit().SVGetGroundToTimePolys(&roi, &product.polynomials.DC[0],
                                                  &product.polynomials.SL2GR[0],
                                                  &product.polynomials.GR2SL[0]);
    if (st != 0) return calledError(st);
  }
  rawRecord.sampling.clone(&product.sampling);
  rawRecord.pulse.clone(&product.pulse);
  product.attitude.AntennaLength = conf.AntennaLength;
  SwathInfo& sw = product.swath;
  sw.Acquisition_Start_Time = ctx.azimuthStart;
  sw.Rank = sw.Bursts = sw.Order = sw.Swst_changes = -1;
  sw.Echoes_per_burst = rawRecord.swath.Echoes_per_burst;
  sw.Swst_changes_bursts.clear();
  if (int st = product.orbit().SVGetGeoCoords(&product.geoCoords, &roi); st != 0)
    return calledError(st);

  ORV_REPORT("Writing headers", REPORT_CHECKPOINT);
  for (GeneralSAR::GSObject o :
       {GeneralSAR::GS_DATAFILE, GeneralSAR::GS_DATASETINFO, GeneralSAR::GS_ORBIT,
        GeneralSAR::GS_GEOCOORDS, GeneralSAR::GS_POLYNOMIALS, GeneralSAR::GS_ROI,
        GeneralSAR::GS_SAMPLING, GeneralSAR::GS_PULSE, GeneralSAR::GS_ATTITUDE,
        GeneralSAR::GS_SPECTRALWINDOWS, GeneralSAR::GS_SWATH})
    product.GSenable(o);
  if (int st = product.GSwrite(ctx.outputFile + ".hdr"); st != 0) return calledError(st);
  product.GSdestroy();
  return 0;
}

}  // namespace

int SARFocuser::process() {
  ChainRun run(*conf_);
  SARFocuser_conf& conf = run.conf;
  ChainContext& ctx = run.ctx;

  ctx.reportFile = conf.ReportFilename;
  ctx.rawFile = RawDataFile;
  ctx.chirpFile = ChirpFile;
  ctx.outputFile = OutputFilename;
  if (conf.Flag_rangefoc) ctx.rgfocFile = OutputFilename + ".rgfoc";

  if (int st = run.readRawRecord(RawDataFile); st != 0) return st;
  if (int st = run.readReplica(ChirpFile); st != 0) return st;
  if (int st = run.rangeStep(RawDataFile); st != 0) return st;
  if (int st = run.dopplerStep(); st != 0) return st;
  if (conf.Flag_rangefoc) {
    if (int st = run.writeRangeFocusedRecord(); st != 0) return st;
  }
  if (conf.Flag_azimuthfoc) {
    if (int st = run.azimuthStage(); st != 0) return st;
  }

  if (conf.Incore) {
    RangeFocParams out = run.rp;
    out.outputFile = ctx.outputFile;
    run.rw.outSamples = run.scene.outSamples;
    run.rw.outLines = run.scene.outLines;
    if (int st = dest_buffer(out, run.rw); st != 0) return calledError(st);
  }

  if (int st = run.writeFocusedRecord(); st != 0) return st;
  run.rawRecord.destroyAll();

  if (conf.Multilook) {
    if (int st = stripmlookFocusedProduct(ctx.outputFile, conf.Memory, conf.Verbose,
                                          conf.ReportLevel, conf.ReportFilename);
        st != 0)
      return calledError(st);
  }
  return 0;
}

// ---- de-scalloping of burst-mode products ----------------------------------------

int SARFocuser::descallop() {
  constexpr int kBlock = 1024;
  constexpr int kOverlap = 64;
  constexpr int kStep = kBlock - kOverlap;  // 960 lines kept per block
  constexpr int kHalf = kOverlap / 2;
  constexpr int kTaps = 31;

  GeneralSAR rec;
  if (int st = rec.GSread(OutputFilename + ".hdr"); st != 0) return calledError(st);
  if (!rec.GSexists(GeneralSAR::GS_DATAFILE) || !rec.GSexists(GeneralSAR::GS_ROI) ||
      !rec.GSexists(GeneralSAR::GS_POLYNOMIALS)) {
    ORV_REPORT("Record of " + OutputFilename + " lacks raster, region or polynomials",
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  DataFile in(rec.dataFile);
  in.filename = OutputFilename;
  in.buffersize = 0;
  ROI_Obj& roi = rec.roi.roi;
  const int N = in.NrOfLinesPerImage;
  const int Nc = in.NrOfPixelsPerLine;
  const double dt = roi.SlowTimeDelta;
  if (Nc < 1 || dt <= 0.0) {
    ORV_REPORT("Raster of " + OutputFilename + " has no samples or no line spacing", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const double prf = 1.0 / dt;
  const double E = rec.swath.Echoes_per_burst;
  const double V = rec.attitude.Eq_speed;
  const int B = (N - kOverlap) / kStep;

  const std::string outName = OutputFilename + "_descallop";
  DataFile out(in);
  out.filename = outName;
  out.RowPrefix = 0;
  out.HeaderOffset = 0;
  out.CellType = FLOAT_COMPLEX;
  out.ByteOrder = 0;
  out.NrOfLinesPerImage = std::max(B, 0) * kStep;

  FFTBuffer block, filter;
  try {
    block.assign(static_cast<std::size_t>(kBlock) * Nc, fcomplex(0.0f, 0.0f));
    filter.assign(kBlock, fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Memory allocation failed", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  FFTPlan fwd, fwd1, inv;
  if (fft_makep_c(fwd, Nc, Nc, kBlock, kBlock, FFT_NONE, FFT_FORWARD, 1) != 0 ||
      fft_makep_c(fwd1, kBlock, kBlock, 1, 1, FFT_FORWARD, FFT_NONE, 1) != 0 ||
      fft_makep_c(inv, Nc, Nc, kBlock, kBlock, FFT_NONE, FFT_BACKWARD_NORMALISED, 1) != 0) {
    ORV_REPORT("Transform plans could not be made", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  if (int st = out.open(1); st != 0) return calledError(st);

  int status = 0;
  waitbar_open("De-scalloping...");
  for (int b = 0; b < B && status == 0; ++b) {
    waitbar_update(0, static_cast<float>(b) / B * 100.0f);
    std::fill(block.begin(), block.end(), fcomplex(0.0f, 0.0f));
    BufferIO rio{.file = &in, .first_column = 0, .columns = Nc, .first_row = b * kStep,
                 .rows = kBlock};
    if ((status = rio.readbuffer(block.data())) != 0) break;
    pfft_c(fwd, block.data(), block.data());
    const double tb = (b + 0.5) * kStep * dt + roi.SlowStartTime;

    for (int c = 0; c < Nc; ++c) {
      const double tr = c * roi.FastTimeDelta + roi.FastStartTime;
      const double ka = rec.polynomials.EvaluateFR(tr, tb);
      const double fdc = rec.polynomials.EvaluateDC(tr, tb);
      std::fill(filter.begin(), filter.end(), fcomplex(0.0f, 0.0f));
      for (int k = -kTaps; k <= kTaps; ++k) {
        const double x = 4.0 * ka * (-E) / (prf * prf) * k;
        const double ph = 2.0 * kPi * k * fdc / prf;
        const double s = sincPi(x);
        filter[(k + kBlock) % kBlock] =
            fcomplex(static_cast<float>(s * std::cos(ph)), static_cast<float>(s * std::sin(ph)));
      }
      pfft_c(fwd1, filter.data(), filter.data());
      const double fo = fdc - std::floor(fdc / prf) * prf;
      for (int i = 0; i < kBlock; ++i) {
        const double f = i * prf / kBlock - fo + prf / 2.0;
        const double fw = f - std::floor(f / prf) * prf - prf / 2.0;
        const double y = (fw + fdc - fdc) * 4.5 / V;
        const double s = sincPi(y);
        const double g = std::abs(filter[i]) / (s * s);
        block[static_cast<std::size_t>(i) * Nc + c] *= static_cast<float>(g);
      }
    }
    pfft_c(inv, block.data(), block.data());
    status = out.write(block.data() + static_cast<std::size_t>(kHalf) * Nc,
                       static_cast<int64_t>(kStep) * Nc * sizeof(fcomplex));
  }
  waitbar_close();
  in.close();
  const int closed = out.close();
  if (status == 0) status = closed;
  if (status != 0) return calledError(status);

  roi.SlowStartTime += kHalf * dt;
  roi.Lines = std::max(B, 0) * kStep;
  roi.SlowTimeLength = roi.Lines * dt;
  rec.dataFile.filename = outName;
  rec.dataFile.NrOfLinesPerImage = roi.Lines;
  rec.dataFile.RowPrefix = 0;
  rec.dataFile.HeaderOffset = 0;
  rec.dataFile.CellType = FLOAT_COMPLEX;
  rec.dataFile.ByteOrder = 0;
  if (int st = rec.GSwrite(outName + ".hdr"); st != 0) return calledError(st);
  rec.GSdestroy();
  return 0;
}
