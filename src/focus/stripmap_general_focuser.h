#pragma once
// Stage template of every sensor focuser: the order of the stages, the
// focusing chain it owns, and a modular way of working in which range
// focusing, Doppler estimation and azimuth focusing are separate steps over
// product records.
#include <memory>
#include <string>
#include <vector>

#include "focus/sar_focuser.h"
#include "product/general_sar.h"
#include "product/general_sar_configuration.h"

class ROI_Obj;

class stripmapGeneralFocuser {
 public:
  stripmapGeneralFocuser();
  virtual ~stripmapGeneralFocuser();
  stripmapGeneralFocuser(const stripmapGeneralFocuser&) = delete;
  stripmapGeneralFocuser& operator=(const stripmapGeneralFocuser&) = delete;

  // Stages, in slot order.
  virtual int initialize();
  virtual int finalize() { return 0; }
  virtual int ingestion(const std::string& raw, const std::string& chirp,
                        const std::string& antenna) = 0;
  virtual int ingestion() = 0;
  virtual int preprocessing() { return 0; }
  virtual int postprocessing() { return 0; }
  virtual int initialize_modular() { return initialize(); }
  virtual int finalize_modular() { return finalize(); }

  // initialize, ingestion, preprocessing, sarfocuser, postprocessing,
  // finalize; the first non-zero status ends it.
  virtual int run();
  // The same with the names of the raw, chirp and antenna rasters and the
  // output given by the caller.
  virtual int run(const std::string& raw, const std::string& chirp, const std::string& antenna,
                  const std::string& output);

  // Runs the chain on the names already in it; 1 unless the configuration
  // block is marked as set.
  int sarfocuser();
  // Runs the chain on these names; 1 when an output name was selected (the
  // names would collide). An empty antenna name keeps the chain's.
  int sarfocuser(const std::string& raw, const std::string& chirp, const std::string& antenna,
                 const std::string& output);

  // Fields, filled by the multi-platform focuser.
  std::string level0Filename;         // scene file or directory
  std::string orbitFilename;
  std::string configurationFilename;  // parameter profile
  std::string outputFilename;         // root of every output
  int skipLines = 0;
  int extractLines = 0;
  std::vector<std::string> erasedTemporaries;  // files the job erases at its end

  SARFocuser& focuser() { return *sarFocuser_; }
  SARFocuser_conf& conf() { return *conf_; }
  bool outputSelected() const { return outputSelected_; }

 protected:
  // The tests of initialize without touching the configuration block.
  int checkNamesAndFiles();

  std::unique_ptr<SARFocuser_conf> conf_;
  std::unique_ptr<SARFocuser> sarFocuser_;
  bool outputSelected_ = false;
};

// Names and records the modular steps work on.
struct FocuserWork {
  std::string rawFile;      // extracted raw raster
  std::string chirpFile;
  std::string antennaFile;
  std::string rgfocFile;    // range-focused raster
  std::string outputFile;   // focused raster
  GeneralSAR raw;           // record of the raw raster
  GeneralSAR chirp;         // record of the chirp
  GeneralSAR antenna;       // record of the antenna pattern
};

class stripmapGeneralFocuserModular : public stripmapGeneralFocuser {
 public:
  stripmapGeneralFocuserModular();
  ~stripmapGeneralFocuserModular() override;

  int initialize_modular() override;

  // initialize_modular, ingestion, preprocessing, align_rawdata, rangefoc,
  // dcEst, frEst, azfoc, postprocessing, finalize_modular on the default
  // names "<out>.extracted", "<out>.chirp", "<out>.rgfoc".
  int run_modular();

  // Reads the processing configuration of file; copies its Memory and
  // Incore and takes the chain's block from it, once: the steps below read
  // their flags and values from that block, as the whole-run chain does.
  int setConfFile(const std::string& file, int channel);

  int rangefoc(const std::string& raw, const std::string& chirp, const std::string& output);
  int dcEst(const std::string& file);
  int frEst(const std::string& file);
  int azfoc(const std::string& input, const std::string& output, double azimuthShift);
  // The same on the names of the work object; 1 unless an output was selected.
  int rangefoc();
  int dcEst();
  int frEst();
  int azfoc(double azimuthShift);

  // Moves every line of a raw raster with SWST prefixes to the common range
  // start, writing file + "_align" and renaming it over file.
  int align_rawdata(const std::string& file);
  int align_rawdata();

  // Azimuth shift in seconds that the Doppler centroid fdc implies for a
  // block at Doppler rate fr (negative rate): the beam-centre to
  // zero-Doppler time.
  static double getDCshift(double fdc, double fr);
  // Directory part of path (up to, without, the last separator); "." when
  // path has none.
  static void findDir(const std::string& path, std::string& result);
  // Raw region needed to focus the requested region `foc` of the scene whose
  // raw region is `raw`, given the synthetic aperture `apertureLines` and
  // the replica length `chirpSamples`: result is the raw block. 1 (with the
  // report) when the raw data cannot give the focused block.
  static int getFOCroi(const ROI_Obj& raw, const ROI_Obj& foc, int apertureLines,
                       int chirpSamples, ROI_Obj& result);
  // Raw window, in lines and samples of the raw raster, of the raw region
  // `rawBlock` within the raster whose region is `raw`: first line, lines,
  // first sample, samples, clipped to the raster.
  static int getRAWroi(const ROI_Obj& raw, const ROI_Obj& rawBlock, int* firstLine, int* lines,
                       int* firstSample, int* samples);
  // Copies region `region` of an aligned raw raster to output with its
  // record. 1 for data that are not range aligned.
  int cutRAW(const std::string& input, const std::string& output, const ROI_Obj& region);

  int Memory = 256;
  int Incore = 0;
  FocuserWork work;
  // The document as setConfFile read it; the steps work on the chain's block
  // taken from it there.
  GeneralSAR_configuration configuration;
};
