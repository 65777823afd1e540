#pragma once
// The focusing chain of one stripmap scene: range focusing, Doppler centroid
// estimation, geometric polynomials, azimuth focusing, the product record and
// optionally a multi-looked product. Alternating-polarisation data run twice
// and each channel is de-scalloped.
#include <memory>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "core/azimuth_focus.h"
#include "doppler/dc_state.h"

class GeneralSAR;
class GeneralSAR_configuration;
class ROI_Obj;
class SamplingConstants_Obj;
class SpectralWindows_Obj;
class poly;

// Flat configuration of the chain, read from the parameter profile.
struct SARFocuser_conf {
  // "sarfocuserConfiguration"
  int Incore = 0;
  int Memory = 0;  // MiB
  int Verbose = 0;
  int ReportLevel = 0;
  std::string ReportFilename;
  std::string ProcessingConfFile;
  double DCref = 0.0;
  int DeleteTempFiles = 0;
  // Set by the job, not the profile: the files the job erases at its end.
  // A stage may write its output over an input named here.
  std::vector<std::string> ErasedTemporaries;

  // "DCestConf"
  double RgBand = 0.0;
  int Blocks = 0;
  int Blockl = 0;
  double AnLen = 0.0;
  double Kthr = 0.0;
  double Sthr = 0.0;
  double Varthr = 0.0;
  double Lookbf = 0.0;
  double Lookbt = 0.0;
  double Lookrp = 0.0;
  double Lookrs = 0.0;
  int Decfac = 0;
  int Flength = 0;
  double Dftstep = 0.0;
  double Fftrgprc = 0.0;
  double Fftazprc = 0.0;
  double Peakwid = 0.0;
  double Minamb = 0.0;
  double Maxamb = 0.0;
  int Nbestblocks = 0;
  int Nummlbf = 0;
  int Nwdarblocks = 0;
  int Patchs = 0;
  int Patchl = 0;
  int Dswst = 0;
  int Amb_flag = 0;
  int Pol_Weights[7] = {1, 1, 1, 1, 1, 1, 1};

  // "AzimuthConf"
  double AntennaLength = 0.0;
  int WhiteningFlag = 0;
  double RangeWindowHammingParameter = 0.0;
  double AzimuthWindowHammingParameter = 0.0;
  double RangeLookBandwidth = 0.0;       // fraction of frg_hz
  double AzimuthLookBandwidth = 0.0;     // fraction of prf_hz
  double RangeTransitionBandwidth = 0.0;
  double AzimuthTransitionBandwidth = 0.0;
  int LinesInBlock = 0;
  int SamplesInBlock = 0;
  int RangeOverlap = 0;    // halved at reading
  int AzimuthOverlap = 0;  // halved at reading
  // 1: the azimuth overlap is derived from the scene's aperture and
  // centroid walk, and AzimuthOverlap is not used.
  int AzimuthOverlapFromScene = 0;
  int PerformInterpolation = 0;
  double StoltPadding = 0.0;
  double ApplyAzShift = 0.0;  // 1.0: the whole image
  double ApplyRgShift = 0.0;  // 1.0: the whole image

  // "GeneralProcessingConf"
  int Flag_rangefoc = 1;
  int Flag_rgpatt = 0;
  int Flag_azimuthfoc = 1;
  int Flag_dcest = 1;
  int Flag_ortog = 1;
  int Flag_swstal = 1;
  int Azblk = 1024;
  int Multilook = 0;

  // Set by the stage template once the block is filled for a run.
  int Flag_set = 0;

  // Doppler centroid and rate taken from an earlier product of the same
  // acquisition (further polarisations): used when Flag_dcest is 0 and
  // DopplerGiven is 1. Coefficients and range/azimuth reference times.
  int DopplerGiven = 0;
  double GivenDC[7] = {0, 0, 0, 0, 0, 0, 0};
  double GivenFR[7] = {0, 0, 0, 0, 0, 0, 0};
  double GivenDCref[2] = {0, 0};
  double GivenFRref[2] = {0, 0};

  // Clears the block to its reading defaults, then reads the section
  // "sarfocuserConfiguration" of file. 0, or 9 when file does not open.
  int readpar(const std::string& file);
  // Reads "DCestConf", "AzimuthConf" and "GeneralProcessingConf" of file
  // (ProcessingConfFile in a chain set up by readpar); overlaps are halved.
  // 0, or 9 when file does not open.
  int readconf(const std::string& file);
  // Back to the state readpar starts from: zeros, with Flag_ortog = 1,
  // Flag_swstal = 1, Azblk = 1024, all Pol_Weights 1.
  void clear();
};

struct SARFocuser_input {
  std::string RawDataFile;
  std::string ChirpFile;
  std::string AntennaFile;
  // Section "sarfocuserInput"; 10 without RawDataFile.
  int readpar(const std::string& file);
};

struct SARFocuser_output {
  std::string OutputFilename;
  // Section "sarfocuserOutput"; 10 without OutputFilename.
  int readpar(const std::string& file);
};

class SARFocuser {
 public:
  explicit SARFocuser(SARFocuser_conf* conf = nullptr);
  ~SARFocuser();
  SARFocuser(const SARFocuser&) = delete;
  SARFocuser& operator=(const SARFocuser&) = delete;

  // Focuses RawDataFile (or, when it does not exist, the two channels
  // RawDataFile "1" and "2" of an alternating-polarisation scene). 0, 10 for
  // a missing raw or chirp file, or the status of the failing stage.
  int run();

  // One raster through the chain (input names and OutputFilename set).
  int process();
  // Removes the periodic azimuth gain of burst-mode data from OutputFilename
  // and writes OutputFilename + "_descallop" with its record.
  int descallop();

  void setConf(SARFocuser_conf* conf) { conf_ = conf; }
  SARFocuser_conf* getConf() const { return conf_; }

  std::string RawDataFile;
  std::string AntennaFile;
  std::string ChirpFile;
  std::string OutputFilename;

 private:
  SARFocuser_conf* conf_ = nullptr;  // not owned
};

// Thin parameter calls on the profile library: (file, key, count, value,
// 1, section). 0 when found.
int GetParString(const std::string& file, const std::string& key, int count, std::string* value,
                 int flag, const std::string& section);
int GetParInt(const std::string& file, const std::string& key, int count, int* value, int flag,
              const std::string& section);
int GetParFloat(const std::string& file, const std::string& key, int count, float* value, int flag,
                const std::string& section);
int GetParDouble(const std::string& file, const std::string& key, int count, double* value,
                 int flag, const std::string& section);
int SetParString(const std::string& file, const std::string& key, int count,
                 const std::string* value, int flag, const std::string& section);
int SetParInt(const std::string& file, const std::string& key, int count, const int* value,
              int flag, const std::string& section);
int SetParFloat(const std::string& file, const std::string& key, int count, const float* value,
                int flag, const std::string& section);
int SetParDouble(const std::string& file, const std::string& key, int count, const double* value,
                 int flag, const std::string& section);

// True when the file opens for reading.
bool fileOpens(const std::string& name);
// Removes a file; a failure is reported ("Cannot remove file") and passed over.
void removeReported(const std::string& name);

// Polynomial in the flat layout of the azimuth focuser: c0..c6, trg0, taz0.
void polyToFlat(const poly& p, double out[9]);
void polyFromFlat(const double in[9], poly& p);

// The kernels of the chain as the stages call them: Doppler centroid
// polynomial of a range-focused raster and azimuth focusing.
int estimateCentroid(DcEstInput& input, DcEstState& state, double poly[7]);
int focusAzimuth(const AzimuthFocusFiles& files, AzimuthFocusScene& scene,
                 const AzimuthFocusConf& conf);

// Steps and set-up shared by the whole-run chain and the modular steps.
// Input of the centroid estimation of a range-focused raster.
DcEstInput dcEstInput(const std::string& raster, const std::string& outDir, int samples, int lines,
                      double prf, double timeOrigin);
// Names and sampling of the azimuth focusing of a range-focused raster whose
// first sample and line are at fastStart and slowStart.
AzimuthFocusFiles azimuthFocusFiles(const std::string& input, const std::string& output,
                                    const SamplingConstants_Obj& smp, double fastStart,
                                    double slowStart);
// Estimator values of the block, with carrier fc and range rate fs.
void fillDcEstState(const SARFocuser_conf& conf, double fc, double fs, DcEstState& state);
// Azimuth focusing values of the block; bandwidth fractions become hertz.
AzimuthFocusConf azimuthFocusConf(const SARFocuser_conf& conf, double frg, double prf);
// The block of a processing configuration document (overlaps halved, as at
// reading a profile). The document keeps its reals in single precision; each
// comes back as the decimal it was written with (see documentReal), so that
// both ways of working hand the kernels the same values.
SARFocuser_conf chainConfFrom(const GeneralSAR_configuration& configuration);
// A single-precision real of a configuration document as the shortest
// decimal that reads back to it, in double precision: 4e-05f gives 4e-05,
// not 3.9999998989515007e-05.
double documentReal(float value);
// Doppler centroid of a range-focused raster: the estimator set up from the
// block with carrier fc and range rate fs, run on the raster of `input` or,
// when inMemory is given, on those samples; the coefficients go to dc.
int centroidStep(const SARFocuser_conf& conf, DcEstInput& input, double fc, double fs,
                 const fcomplex* inMemory, poly& dc);
// Azimuth focusing of a range-focused raster of samples x lines with the
// centroid and rate polynomials dc and fr; the scene's other inputs (report,
// reference Doppler, raster in memory) are the caller's, its results are
// returned in it.
int azimuthStep(const AzimuthFocusFiles& files, const AzimuthFocusConf& conf, const poly& dc,
                const poly& fr, int samples, int lines, AzimuthFocusScene& scene);
// "HAMMING" windows with the coefficients and look bandwidths of the block.
void setHammingWindows(SpectralWindows_Obj& windows, const SARFocuser_conf& conf);
// Raster layout, region (deltas of `deltas`), type, range start, attitude and
// windows of a focused product from the result of azimuth focusing.
void setFocusedProduct(GeneralSAR& product, const std::string& raster,
                       const AzimuthFocusScene& scene, const ROI_Obj& deltas,
                       const SARFocuser_conf& conf, double lambda);
