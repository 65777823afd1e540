#include "focus/stripmap_general_focuser.h"

#include <dirent.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <new>
#include <vector>

#include "base/status.h"
#include "core/azimuth_focus.h"
#include "core/range_focuser.h"
#include "diag/report.h"
#include "doppler/geometric_rate.h"
#include "orbit/general_sar_orbit.h"
#include "product/buffer_io.h"
#include "product/roi.h"

namespace {

int calledError(int status) {
  ORV_REPORT_CALLED_ERROR();
  return status;
}

// What the rate estimation and azimuth focusing need of a range-focused
// record; the rate only for azimuth focusing. 1 with the report.
int checkFocusInputs(GeneralSAR& record, bool needRate) {
  const char* missing = nullptr;
  if (!record.GSexists(GeneralSAR::GS_DATAFILE))
    missing = "Range focused image does not exist!";
  else if (!record.GSexists(GeneralSAR::GS_POLYNOMIALS) || record.polynomials.ndc < 1)
    missing = "Doppler Centroid Estimation does not exist!";
  else if (needRate && record.polynomials.nfr < 1)
    missing = "Doppler Rate Estimation does not exist!";
  else if (!record.GSexists(GeneralSAR::GS_DATASETINFO))
    missing = "DataSetInfo does not exist!";
  if (!missing) return 0;
  ORV_REPORT(missing, REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}

bool directoryOpens(const std::string& name) {
  DIR* d = opendir(name.c_str());
  if (!d) return false;
  closedir(d);
  return true;
}

}  // namespace

stripmapGeneralFocuser::stripmapGeneralFocuser()
    : conf_(std::make_unique<SARFocuser_conf>()),
      sarFocuser_(std::make_unique<SARFocuser>(conf_.get())) {
  conf_->clear();
}

stripmapGeneralFocuser::~stripmapGeneralFocuser() = default;

int stripmapGeneralFocuser::checkNamesAndFiles() {
  if (level0Filename.empty()) {
    ORV_REPORT("Data filename not selected!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (orbitFilename.empty()) {
    ORV_REPORT("Orbit filename not selected!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (configurationFilename.empty()) {
    ORV_REPORT("Processing conf not selected!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  outputSelected_ = !outputFilename.empty();
  if (!fileOpens(orbitFilename)) {
    ORV_REPORT("orbit file does not exist!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  // An ERS scene may be a directory.
  if (!fileOpens(level0Filename) && !directoryOpens(level0Filename)) {
    ORV_REPORT("data file does not exist!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (!fileOpens(configurationFilename)) {
    ORV_REPORT("processing configuration file does not exist!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (skipLines < 0) {
    ORV_REPORT("skip lines <0!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (extractLines < 0) {
    ORV_REPORT("extract lines <0!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

int stripmapGeneralFocuser::initialize() {
  int status = checkNamesAndFiles();
  if (status != 0) return status;
  conf_->Flag_set = 0;
  return 0;
}

int stripmapGeneralFocuser::run() {
  int status = initialize();
  if (status == 0) status = ingestion();
  if (status == 0) status = preprocessing();
  if (status == 0) {
    conf_->Flag_set = 1;
    status = sarfocuser();
  }
  if (status == 0) status = postprocessing();
  if (status == 0) status = finalize();
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}

int stripmapGeneralFocuser::run(const std::string& raw, const std::string& chirp,
                                const std::string& antenna, const std::string& output) {
  int status = initialize();
  if (status == 0) status = ingestion(raw, chirp, antenna);
  if (status == 0) status = preprocessing();
  if (status == 0) status = sarfocuser(raw, chirp, antenna, output);
  if (status == 0) status = postprocessing();
  if (status == 0) status = finalize();
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}

int stripmapGeneralFocuser::sarfocuser() {
  if (!conf_->Flag_set) return STATUS_BAD_CONDITION;
  conf_->Verbose = 1;
  // Only the chain's own temporaries may be overwritten, never rasters a
  // caller names.
  conf_->ErasedTemporaries = erasedTemporaries;
  int status = sarFocuser_->run();
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  ORV_REPORT("sar focuser ended successfully ", REPORT_CHECKPOINT);
  return 0;
}

int stripmapGeneralFocuser::sarfocuser(const std::string& raw, const std::string& chirp,
                                       const std::string& antenna, const std::string& output) {
  if (outputSelected_) return STATUS_BAD_CONDITION;
  sarFocuser_->RawDataFile = raw;
  sarFocuser_->ChirpFile = chirp;
  if (!antenna.empty()) sarFocuser_->AntennaFile = antenna;
  sarFocuser_->OutputFilename = output;
  conf_->ErasedTemporaries.clear();
  int status = sarFocuser_->run();
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  ORV_REPORT("sar focuser ended successfully ", REPORT_CHECKPOINT);
  return 0;
}

// ---- modular working -----------------------------------------------------

stripmapGeneralFocuserModular::stripmapGeneralFocuserModular() = default;
stripmapGeneralFocuserModular::~stripmapGeneralFocuserModular() = default;

int stripmapGeneralFocuserModular::initialize_modular() {
  int status = checkNamesAndFiles();
  if (status != 0) return status;
  if (outputFilename.empty() && outputSelected_) {
    ORV_REPORT("Output filename not selected!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  conf_->Flag_set = 0;
  return 0;
}

int stripmapGeneralFocuserModular::run_modular() {
  int status = initialize_modular();
  if (status == 0) status = ingestion();
  const std::string extracted = outputFilename + ".extracted";
  const std::string chirp = outputFilename + ".chirp";
  const std::string rgfoc = outputFilename + ".rgfoc";
  if (status == 0) {
    work.rawFile = extracted;
    status = preprocessing();
  }
  if (status == 0) status = align_rawdata(work.rawFile);
  if (status == 0) status = rangefoc(extracted, chirp, rgfoc);
  if (status == 0) status = dcEst(rgfoc);
  if (status == 0) status = frEst(rgfoc);
  if (status == 0) status = azfoc(rgfoc, outputFilename, 0.0);
  if (status == 0) status = postprocessing();
  if (status == 0) status = finalize_modular();
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}

int stripmapGeneralFocuserModular::setConfFile(const std::string& file, int channel) {
  if (int st = configuration.GSread(file, channel); st != 0) return calledError(st);
  Memory = configuration.generalConf.Memory;
  Incore = configuration.generalConf.Incore;
  *conf_ = chainConfFrom(configuration);
  return 0;
}

int stripmapGeneralFocuserModular::rangefoc(const std::string& raw, const std::string& chirp,
                                            const std::string& output) {
  const SARFocuser_conf& c = *conf_;
  if (!c.Flag_rangefoc) return 0;
  GeneralSAR record;
  record.GSread(raw + ".hdr");
  if (!record.GSexists(GeneralSAR::GS_DATAFILE)) {
    ORV_REPORT("Raw data image does not exist!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  ATRangeFocuser rf;
  rf.RawData = raw;
  rf.ChirpFile = chirp;
  rf.OutputFile = output;
  rf.Memory = Memory;
  rf.DataToSkip = 0;
  rf.DataToProcess = 0;
  rf.Flag_ortog = c.Flag_ortog;
  if (int st = rf.run(); st != 0) return calledError(st);
  if (c.DeleteTempFiles) {
    for (const std::string& f : {raw, raw + ".hdr", chirp, chirp + ".hdr"}) removeReported(f);
  }
  return 0;
}

int stripmapGeneralFocuserModular::dcEst(const std::string& file) {
  if (!conf_->Flag_dcest) return 0;
  std::string dir;
  findDir(file, dir);
  GeneralSAR record;
  if (int st = record.GSread(file + ".hdr"); st != 0) return calledError(st);
  if (!record.GSexists(GeneralSAR::GS_DATAFILE)) {
    ORV_REPORT("Range focused image does not exist!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  record.polynomials.CreatePolys(1, 1);
  conf_->Memory = Memory;
  DcEstInput in = dcEstInput(file, dir, record.dataFile.NrOfPixelsPerLine,
                             record.dataFile.NrOfLinesPerImage, record.sampling.prf_hz,
                             record.roi.roi.SlowStartTime);
  in.byteOrder = record.dataFile.ByteOrder;
  in.headerOffset = record.dataFile.HeaderOffset;
  polyDC& dc = record.polynomials.DC[0];
  if (int st = centroidStep(*conf_, in, record.sampling.fc_hz, record.sampling.frg_hz, nullptr, dc);
      st != 0)
    return calledError(st);
  dc.trg0 = record.roi.roi.FastStartTime;
  dc.taz0 = record.roi.roi.SlowStartTime;
  record.GSenable(GeneralSAR::GS_POLYNOMIALS);
  if (int st = record.GSwrite(file + ".hdr"); st != 0) return calledError(st);
  record.GSdestroy();
  return 0;
}

int stripmapGeneralFocuserModular::frEst(const std::string& file) {
  if (!conf_->Flag_dcest) return 0;
  GeneralSAR record;
  record.GSread(file + ".hdr");
  if (int st = checkFocusInputs(record, false); st != 0) return st;
  const int lookSign = record.dataSetInfo.LookDirection != -1 ? 1 : -1;
  record.orbit().setLookSign(lookSign);
  const polyDC dc = record.polynomials.DC[0];
  record.polynomials.CreatePolys(1, 1);
  record.polynomials.DC[0] = dc;
  // The rate the focusing kernel needs, as the one-pass chain computes it.
  const ROI_Obj& roi = record.roi.roi;
  const SamplingConstants_Obj& smp = record.sampling;
  const double peakDelay =
      compressedPeakDelay(record.pulse.PulseLength, record.pulse.chirpSamples(), smp.frg_hz);
  if (int st = geometricRatePoly(record.orbit(), roi.SlowStartTime,
                                 roi.SlowStartTime + roi.Lines * roi.SlowTimeDelta, roi.FastStartTime,
                                 peakDelay, record.dataFile.NrOfPixelsPerLine, smp.frg_hz, smp.fc_hz,
                                 record.polynomials.DC[0], lookSign, record.polynomials.FR[0]);
      st != 0)
    return calledError(st);
  record.GSenable(GeneralSAR::GS_POLYNOMIALS);
  if (int st = record.GSwrite(file + ".hdr"); st != 0) return calledError(st);
  record.GSdestroy();
  return 0;
}

int stripmapGeneralFocuserModular::azfoc(const std::string& input, const std::string& output,
                                         double azimuthShift) {
  if (!conf_->Flag_azimuthfoc) return 0;
  GeneralSAR record;
  record.GSread(input + ".hdr");
  if (int st = checkFocusInputs(record, true); st != 0) return st;
  const SARFocuser_conf& conf = *conf_;
  const SamplingConstants_Obj& smp = record.sampling;
  const ROI_Obj& roi = record.roi.roi;
  const int lines = record.dataFile.NrOfLinesPerImage;
  const int samples = record.dataFile.NrOfPixelsPerLine;

  const AzimuthFocusFiles files =
      azimuthFocusFiles(input, output, smp, roi.FastStartTime, roi.SlowStartTime);
  AzimuthFocusScene scene;
  AzimuthFocusConf ac = azimuthFocusConf(conf, smp.frg_hz, smp.prf_hz);
  ac.ApplyAzShift = conf.ApplyAzShift * lines;
  ac.ApplyRgShift = conf.ApplyRgShift * samples;
  // The extra shift enlarges the magnitude on the side of the shift's sign.
  ac.ApplyAzShift =
      ac.ApplyAzShift < 0.0 ? ac.ApplyAzShift - azimuthShift : ac.ApplyAzShift + azimuthShift;
  if (int st = azimuthStep(files, ac, record.polynomials.DC[0], record.polynomials.FR[0], samples,
                          lines, scene);
      st != 0)
    return calledError(st);

  GeneralSAR product;
  if (int st = product.GSread(input + ".hdr"); st != 0) return calledError(st);
  setFocusedProduct(product, output, scene, roi, conf, smp.lambda_m);
  ROI_Obj& out = product.roi.roi;
  product.polynomials.CreatePolys(1, 1);
  polyFromFlat(scene.polyDCOut, product.polynomials.DC[0]);
  polyFromFlat(scene.polyFROut, product.polynomials.FR[0]);
  if (int st = product.orbit().SVGetGeoCoords(&product.geoCoords, &out); st != 0)
    return calledError(st);
  for (GeneralSAR::GSObject o :
       {GeneralSAR::GS_POLYNOMIALS, GeneralSAR::GS_DATASETINFO, GeneralSAR::GS_ATTITUDE,
        GeneralSAR::GS_SPECTRALWINDOWS, GeneralSAR::GS_GEOCOORDS})
    product.GSenable(o);
  if (int st = product.GSwrite(output + ".hdr"); st != 0) return calledError(st);
  product.GSdestroy();
  if (conf.DeleteTempFiles) {
    removeReported(input);
    removeReported(input + ".hdr");
  }
  return 0;
}

int stripmapGeneralFocuserModular::rangefoc() {
  if (!outputSelected_) return STATUS_BAD_CONDITION;
  return rangefoc(work.rawFile, work.chirpFile, work.rgfocFile);
}
int stripmapGeneralFocuserModular::dcEst() {
  if (!outputSelected_) return STATUS_BAD_CONDITION;
  return dcEst(work.rgfocFile);
}
int stripmapGeneralFocuserModular::frEst() {
  if (!outputSelected_) return STATUS_BAD_CONDITION;
  return frEst(work.rgfocFile);
}
int stripmapGeneralFocuserModular::azfoc(double azimuthShift) {
  if (!outputSelected_) return STATUS_BAD_CONDITION;
  return azfoc(work.rgfocFile, work.outputFile, azimuthShift);
}

int stripmapGeneralFocuserModular::align_rawdata() { return align_rawdata(work.rawFile); }

int stripmapGeneralFocuserModular::align_rawdata(const std::string& file) {
  GeneralSAR record;
  record.GSread(file + ".hdr");
  if (!record.GSexists(GeneralSAR::GS_DATAFILE) || !record.GSexists(GeneralSAR::GS_DATASETINFO) ||
      !record.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA)) {
    ORV_REPORT("Input File is not a not aligned raw data file", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  DataFile in(record.dataFile);
  in.filename = file;
  in.buffersize = 0;
  const int lines = in.NrOfLinesPerImage;
  const int S = in.NrOfPixelsPerLine;
  const double fs = record.sampling.frg_hz > 0.0 ? record.sampling.frg_hz
                                                 : 1.0 / record.roi.roi.FastTimeDelta;
  if (in.RowPrefix < 4 || lines < 1 || S < 1 || !(fs > 0.0) || !std::isfinite(fs)) {
    ORV_REPORT("Raster info of the raw data file is wrong: " + file, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }

  // Window starts of all lines from the row prefixes.
  std::vector<float> swst(lines);
  {
    std::vector<char> prefixes(static_cast<std::size_t>(in.RowPrefix) * lines);
    BufferIO io{.file = &in, .first_column = 0, .columns = S, .first_row = 0, .rows = lines,
                 .memory_type = in.CellType};
    if (int st = io.readprefix(prefixes.data()); st != 0) return calledError(st);
    in.close();
    for (int l = 0; l < lines; ++l)
      std::memcpy(&swst[l], prefixes.data() + static_cast<std::size_t>(l) * in.RowPrefix, 4);
  }
  const DataSetInfo_Obj& info = record.dataSetInfo;
  const bool bounded = info.SWST_MIN > 0.0 && info.SWST_MAX >= info.SWST_MIN;
  const double tolerance = 0.5 / fs;
  double lo = 0.0;
  for (int l = 0; l < lines; ++l) {
    const double t = swst[l];
    const bool wrong = !std::isfinite(t) || t <= 0.0 ||
                       (bounded && (t < info.SWST_MIN - tolerance || t > info.SWST_MAX + tolerance));
    if (wrong) {
      char text[64];
      std::snprintf(text, sizeof text, "SWST of LINE %d IS WRONG!", l);
      ORV_REPORT(text, REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    if (l == 0 || t < lo) lo = t;
  }
  std::vector<int> shift(lines);
  int D = 0;
  for (int l = 0; l < lines; ++l) {
    shift[l] = roundHalfAway((static_cast<double>(swst[l]) - lo) * fs);
    D = std::max(D, shift[l]);
  }

  const std::string aligned = file + "_align";
  DataFile out;
  out.filename = aligned;
  out.NrOfPixelsPerLine = S + D;
  out.NrOfLinesPerImage = lines;
  out.RowPrefix = 0;
  out.HeaderOffset = 0;
  out.CellType = FLOAT_COMPLEX;
  out.ByteOrder = 0;
  in.buffersize = 0;
  std::vector<fcomplex> row(S), line(static_cast<std::size_t>(S) + D);
  if (int st = out.open(1); st != 0) return calledError(st);
  for (int l = 0; l < lines; ++l) {
    BufferIO io{.file = &in, .first_column = 0, .columns = S, .first_row = l, .rows = 1};
    if (int st = io.readbuffer(row.data()); st != 0) return calledError(st);
    std::fill(line.begin(), line.end(), fcomplex(0.0f, 0.0f));
    std::copy(row.begin(), row.end(), line.begin() + shift[l]);
    if (int st = out.write(line.data(), static_cast<int64_t>(line.size()) * sizeof(fcomplex));
        st != 0)
      return calledError(st);
  }
  in.close();
  if (int st = out.close(); st != 0) return calledError(st);

  if (std::rename(aligned.c_str(), file.c_str()) != 0) {
    ORV_REPORT("Cannot rename " + aligned + " over " + file, REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }
  record.dataFile.filename = file;
  record.dataFile.NrOfPixelsPerLine = S + D;
  record.dataFile.RowPrefix = 0;
  record.dataFile.HeaderOffset = 0;
  record.dataFile.CellType = FLOAT_COMPLEX;
  record.dataFile.ByteOrder = 0;
  ROI_Obj& roi = record.roi.roi;
  roi.SetFastAxe(lo, roi.FastTimeDelta > 0.0 ? roi.FastTimeDelta : 1.0 / fs, S + D);
  record.dataSetInfo.SWST_MIN = record.dataSetInfo.SWST_MAX = lo;
  record.dataSetInfo.SetImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED);
  std::remove((file + ".hdr").c_str());
  if (int st = record.GSwrite(file + ".hdr"); st != 0) return calledError(st);
  record.GSdestroy();
  return 0;
}

double stripmapGeneralFocuserModular::getDCshift(double fdc, double fr) {
  return fr != 0.0 ? -fdc / fr : 0.0;
}

void stripmapGeneralFocuserModular::findDir(const std::string& path, std::string& result) {
  const std::size_t pos = path.find_last_of("/\\");
  std::string dir = pos == std::string::npos ? std::string(".")
                    : pos == 0               ? path.substr(0, 1)
                                             : path.substr(0, pos);
  result.swap(dir);
}

int stripmapGeneralFocuserModular::getFOCroi(const ROI_Obj& raw, const ROI_Obj& foc,
                                             int apertureLines, int chirpSamples,
                                             ROI_Obj& result) {
  const int half = std::max(apertureLines, 0) / 2;
  const int focFirstLine = raw.GetSlowIndex(foc.SlowStartTime);
  const int focLines = raw.GetSlowRange(foc.SlowTimeLength);
  const int focFirstSample = raw.GetFastIndex(foc.FastStartTime);
  const int focSamples = raw.GetFastRange(foc.FastTimeLength);
  const int firstLine = focFirstLine - half;
  const int endLine = focFirstLine + focLines + half;
  const int firstSample = focFirstSample;
  const int endSample = focFirstSample + focSamples + std::max(chirpSamples - 1, 0);
  if (focLines < 1 || focSamples < 1 || firstLine < 0 || endLine > raw.Lines || firstSample < 0 ||
      endSample > raw.Samples) {
    ORV_REPORT("Requested focused block cannot be obtained from the given extracted data",
               REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  result = raw;
  result.SetFastAxe(raw.FastStartTime + firstSample * raw.FastTimeDelta, raw.FastTimeDelta,
                    endSample - firstSample);
  result.SetSlowAxe(raw.SlowStartTime + firstLine * raw.SlowTimeDelta, raw.SlowTimeDelta,
                    endLine - firstLine);
  return 0;
}

int stripmapGeneralFocuserModular::getRAWroi(const ROI_Obj& raw, const ROI_Obj& rawBlock,
                                             int* firstLine, int* lines, int* firstSample,
                                             int* samples) {
  const int l0 = raw.GetSlowIndex(rawBlock.SlowStartTime);
  const int l1 = l0 + raw.GetSlowRange(rawBlock.SlowTimeLength);
  const int s0 = raw.GetFastIndex(rawBlock.FastStartTime);
  const int s1 = s0 + raw.GetFastRange(rawBlock.FastTimeLength);
  *firstLine = std::max(l0, 0);
  *lines = std::min(l1, raw.Lines) - *firstLine;
  *firstSample = std::max(s0, 0);
  *samples = std::min(s1, raw.Samples) - *firstSample;
  if (*lines < 1 || *samples < 1) {
    ORV_REPORT("Requested raw block lies outside the raw data", REPORT_ERROR);
    *lines = std::max(*lines, 0);
    *samples = std::max(*samples, 0);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

int stripmapGeneralFocuserModular::cutRAW(const std::string& input, const std::string& output,
                                          const ROI_Obj& region) {
  GeneralSAR record;
  record.GSread(input + ".hdr");
  if (!record.GSexists(GeneralSAR::GS_DATAFILE) || !record.GSexists(GeneralSAR::GS_DATASETINFO) ||
      !record.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED)) {
    ORV_REPORT("Raw Data must be range aligned!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  ROI_Obj& roi = record.roi.roi;
  int l0 = 0, nl = 0, s0 = 0, ns = 0;
  if (int st = getRAWroi(roi, region, &l0, &nl, &s0, &ns); st != 0) return calledError(st);

  DataFile in(record.dataFile);
  in.filename = input;
  in.buffersize = 0;
  DataFile out;
  out.filename = output;
  out.NrOfPixelsPerLine = ns;
  out.NrOfLinesPerImage = nl;
  out.RowPrefix = 0;
  out.HeaderOffset = 0;
  out.CellType = FLOAT_COMPLEX;
  out.ByteOrder = 0;
  std::vector<fcomplex> block;
  try {
    block.resize(static_cast<std::size_t>(ns) * nl);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Memory allocation failed", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  BufferIO io{.file = &in, .first_column = s0, .columns = ns, .first_row = l0, .rows = nl};
  if (int st = io.readbuffer(block.data()); st != 0) return calledError(st);
  in.close();
  BufferIO wo{.file = &out, .first_column = 0, .columns = ns, .first_row = 0, .rows = nl};
  if (int st = wo.writebuffer(block.data()); st != 0) return calledError(st);
  if (int st = out.close(); st != 0) return calledError(st);

  const double fast0 = roi.FastStartTime + s0 * roi.FastTimeDelta;
  roi.SetFastAxe(fast0, roi.FastTimeDelta, ns);
  roi.SetSlowAxe(roi.SlowStartTime + l0 * roi.SlowTimeDelta, roi.SlowTimeDelta, nl);
  record.dataSetInfo.SWST_MIN = record.dataSetInfo.SWST_MAX = fast0;
  setComplexRasterLayout(record.dataFile, output, ns, nl);
  if (int st = record.GSwrite(output + ".hdr"); st != 0) return calledError(st);
  record.GSdestroy();
  return 0;
}
