// ERS-1/2 level-0 extraction from the CEOS leader and image file.
#include "ingest/ers/ers_extractor.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <fstream>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "ingest/ceos/ceos_record.h"
#include "ingest/ers/ers_ceos_layout.h"
#include "orbit/general_sar_orbit.h"
#include "product/time_base.h"

namespace {

// Sampling window start of a line from its window code, seconds.
constexpr double kSwstStep = 2.10943e-07;
constexpr double kSwstOffset = 0.005357529;
constexpr double kRangeGateBias = -6.627e-06;
constexpr int kImageDescriptor = ers_image::kDescriptorLength;
constexpr int kRecordPrefix = ers_image::kDataPrefix;
constexpr int kMaxSwstJump = 200;
constexpr double kAbsentBias = -100.0;
constexpr const char* kMonths[12] = {"JAN", "FEB", "MAR", "APR", "MAY", "JUN",
                                     "JUL", "AUG", "SEP", "OCT", "NOV", "DEC"};

int failure(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define ERS_FAIL(message, status) failure((message), (status), __LINE__, __func__)

int calledError(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function, __FILE__);
  return status;
}
#define ERS_CALLED(status) calledError((status), __LINE__, __func__)

std::string trimmed(const std::string& s) {
  const auto first = s.find_first_not_of(' ');
  if (first == std::string::npos) return {};
  return s.substr(first, s.find_last_not_of(' ') - first + 1);
}

// Text date of the first state vector: "DD-MMM-YYYY hh:mm:ss.mmm000".
std::string vectorStartText(int day, int month, const std::string& year, double secondsOfDay) {
  const long ms = std::lround(secondsOfDay * 1000.0);  // half away from zero
  const long h = ms / 3600000, m = (ms / 60000) % 60, s = (ms / 1000) % 60, f = ms % 1000;
  char text[64];
  std::snprintf(text, sizeof text, "%02d-%s-%s %02ld:%02ld:%02ld.%03ld000", day, kMonths[month - 1],
                year.c_str(), h, m, s, f);
  return text;
}

}  // namespace

ATERSExtractor::ATERSExtractor() : ProcessingTool("ATERSExtractor", "ATERSExtractor.report") {
  createElementsVector(10);
}

ATERSExtractor::~ATERSExtractor() = default;

void ATERSExtractor::refreshParameters() {
  addCommonElements();
  addElementString("ImgFilename", &ImgFilename, true);
  addElementString("LeaFilename", &LeaFilename, true);
  addElementString("OrbitFilename", &OrbitFilename, true);
  addElementString("OutputFile", &OutputFile, true);
  addElementString("ChirpFile", &ChirpFile, true);
  setAllocationFlag(true);
}

int ATERSExtractor::InitProcessing(const std::string& file, int channel) {
  init_report(0, "ATERSExtractor REPORT", ReportLevel);
  if (int st = readpar(file, channel); st != 0) return ERS_CALLED(st);
  if (int st = checkpar(); st != 0) return ERS_CALLED(st);
  return 0;
}

int ATERSExtractor::runall(const std::string& file, int channel) {
  if (namesOtherConfiguration(file, channel)) return STATUS_BAD_CONDITION;
  if (int st = InitProcessing(file, channel); st != 0) return ERS_CALLED(st);
  if (int st = run(); st != 0) return ERS_CALLED(st);
  if (int st = FinalizeProcessing(file, channel); st != 0) return ERS_CALLED(st);
  return 0;
}

int ATERSExtractor::run() {
  CheckedCall cc("ATERSExtractor::run()");
  if (int st = readLeader(); st != 0) return ERS_CALLED(st);
  GeneralSAROrbit& orbit = rawData.orbit();
  orbit.SVDestroy();
  if (int st = orbit.GetStateVectorsERS(OrbitFilename, rawData.roi.SlowStartTime,
                                        rawData.roi.SlowTimeLength, rawData.dataSetInfo.Description);
      st != 0) {
    orbit.SVDestroy();
    return ERS_CALLED(st);
  }
  int st = readImage();
  if (st == 0) st = rawData.writehdr();
  if (st == 0 && !ChirpFile.empty()) st = ExtractChirp();
  orbit.SVDestroy();
  if (st != 0) return ERS_CALLED(st);
  return 0;
}

int ATERSExtractor::readLeader() {
  CheckedCall cc("ATERSExtractor::readLeader()");
  std::vector<char> bytes;
  {
    std::ifstream in(LeaFilename, std::ios::binary);
    if (LeaFilename.empty() || !in) return ERS_FAIL("File not opened! " + LeaFilename, STATUS_NOT_OPENED);
    bytes.assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  }
  namespace dss = ers_leader::dss;
  namespace ppr = ers_leader::ppr;
  const CeosRecord summary(bytes, ers_leader::kDataSetSummary);
  const CeosRecord position(bytes, ers_leader::kPlatformPosition);
  // Data set summary, then the head of the platform position record.
  if (!summary.has(dss::kLastLineTime) || !position.has(ppr::kInterval))
    return ERS_FAIL("File reading failed! " + LeaFilename, STATUS_READ_FAILED);
  auto bad = [this](const char* what) {
    return std::string("Bad ") + what + " in the leader file " + LeaFilename;
  };

  SamplingConstants_Obj& smp = rawData.sampling;
  SARPulse_Obj& pulse = rawData.pulse;
  DataSetInfo_Obj& info = rawData.dataSetInfo;
  ROI_Obj& roi = rawData.roi;

  info.SceneID = trimmed(summary.text(dss::kSceneId));
  info.Description = summary.text(dss::kMissionTag);
  const char* polarisation = summary.at(dss::kPolarisation);
  info.Polarization = std::string(1, polarisation[0]) + "/" + std::string(1, polarisation[1]);
  info.OrbitNumber = trimmed(summary.text(dss::kOrbitNumber));

  smp.fc_hz = summary.real(dss::kRadarFrequencyGHz) * 1000000000.0;
  if (!(smp.fc_hz > 0.0)) return ERS_FAIL(bad("radar frequency"), STATUS_BAD_PARAMETER);
  smp.lambda_m = consts::kSpeedOfLight / smp.fc_hz;
  chirpCoefficient_ = summary.realExp(dss::kChirpCoefficient);
  smp.Brg_hz = chirpCoefficient_;
  const double rateMHz = summary.real(dss::kSamplingRateMHz);
  if (!(rateMHz > 0.0)) return ERS_FAIL(bad("range sampling rate"), STATUS_BAD_PARAMETER);
  smp.frg_hz = rateMHz * 1000000.0;
  pulse.PulseSamplingRate = smp.frg_hz;
  smp.Trg_s = 1.0 / smp.frg_hz;
  roi.FastTimeDelta = smp.Trg_s;
  pulse.PulseLength = summary.real(dss::kPulseLengthUs) / 1000000.0;
  if (!(pulse.PulseLength > 0.0)) return ERS_FAIL(bad("pulse length"), STATUS_BAD_PARAMETER);
  smp.Brg_hz = 2.0 * pulse.PulseLength * chirpCoefficient_;
  pulse.Bandwidth = smp.Brg_hz;
  biasI_ = summary.real(dss::kBiasI);
  biasQ_ = summary.real(dss::kBiasQ);
  if (biasI_ < kAbsentBias) biasI_ = 0.0;
  if (biasQ_ < kAbsentBias) biasQ_ = 0.0;
  const double prf = summary.real(dss::kPrf);
  if (!(prf > 0.0)) return ERS_FAIL(bad("PRF"), STATUS_BAD_PARAMETER);
  smp.prf_hz = prf;
  smp.brf_hz = prf;
  smp.pri_s = 1.0 / prf;
  roi.SlowTimeDelta = smp.pri_s;
  info.AcquisitionStation = trimmed(summary.text(dss::kFacility));
  roi.FastTimeLength = summary.real(dss::kLastRangeTimeMs);  // provisional, replaced by the image pass
  const double first = ascii2sec85(summary.text(dss::kFirstLineTime));
  const double last = ascii2sec85(summary.text(dss::kLastLineTime));
  if (!(first > 0.0)) return ERS_FAIL(bad("time of the first line"), STATUS_BAD_PARAMETER);
  roi.SlowStartTime = first;
  rawData.swath.Acquisition_Start_Time = first;
  roi.SlowTimeLength = last - first;

  // State vectors of the platform position record.
  const int count = position.integer(ppr::kVectorCount);
  const std::string year = position.text(ppr::kYear);
  const int month = position.integer(ppr::kMonth);
  const int day = std::atoi(position.text(ppr::kDayDigits).c_str());
  const double secondsOfDay = position.realExp(ppr::kSecondsOfDay);
  const double interval = position.realExp(ppr::kInterval);
  if (count < 1) return ERS_FAIL(bad("number of state vectors"), STATUS_BAD_PARAMETER);
  if (!position.has({ppr::kVectorComponent.offset, count * ppr::kVectorStride}))
    return ERS_FAIL("File reading failed! " + LeaFilename, STATUS_READ_FAILED);
  if (month < 1 || month > 12) return ERS_FAIL(bad("state vector month"), STATUS_BAD_PARAMETER);
  const double t0 = ascii2sec85(vectorStartText(day, month, year, secondsOfDay));
  GeneralSAROrbit& orbit = rawData.orbit();
  orbit.setLambda(smp.lambda_m);
  if (int st = orbit.SVCreate(t0, interval, count); st != 0) return ERS_CALLED(st);
  for (int k = 0; k < count; ++k) {
    const CeosField vector = ppr::kVectorComponent.element(k, ppr::kVectorStride);
    for (int j = 0; j < 3; ++j) {
      orbit.pos[3 * std::size_t(k) + std::size_t(j)] =
          position.realExp(vector.element(j, ppr::kComponentStride));
      orbit.vel[3 * std::size_t(k) + std::size_t(j)] = position.realExp(
          vector.element(j, ppr::kComponentStride).part(ppr::kVelocityOffset, ppr::kComponentStride));
    }
  }
  return 0;
}

int ATERSExtractor::readImage() {
  CheckedCall cc("ATERSExtractor::readImage()");
  vectorsReady_ = false;
  missingLines_ = 0;
  std::ifstream in(ImgFilename, std::ios::binary);
  if (ImgFilename.empty() || !in) return ERS_FAIL("File not opened! " + ImgFilename, STATUS_NOT_OPENED);
  std::vector<char> descriptor(kImageDescriptor);
  if (!in.read(descriptor.data(), kImageDescriptor))
    return ERS_FAIL("File reading failed! " + ImgFilename, STATUS_READ_FAILED);
  const CeosRecord head(descriptor, 0);
  const int records = head.integer(ers_image::descriptor::kRecordCount);
  const int samples = head.integer(ers_image::descriptor::kSamples);
  if (records < 1 || samples < 1)
    return ERS_FAIL("Bad record count or line length in the image file " + ImgFilename,
                    STATUS_BAD_PARAMETER);

  const int skip = static_cast<int>(static_cast<long long>(skipPercent) * records / 100);
  int lines = records - skip;
  if (extractPercent > 0 && extractPercent + skipPercent < 100)
    lines = static_cast<int>(static_cast<long long>(records) * extractPercent / 100);
  if (skip < 0 || lines < 0 || skip + lines > records)
    return ERS_FAIL("Bad part of the scene to extract", STATUS_BAD_PARAMETER);

  ROI_Obj& roi = rawData.roi;
  DataSetInfo_Obj& info = rawData.dataSetInfo;
  roi.SlowStartTime += skip * roi.SlowTimeDelta;
  roi.Samples = samples;
  roi.Lines = lines;

  DataFile& out = rawData.dataFile;
  out.filename = OutputFile;
  out.NrOfPixelsPerLine = samples;
  out.NrOfLinesPerImage = lines;
  out.RowPrefix = 4;
  out.CellType = FLOAT_COMPLEX;
  out.HeaderOffset = 0;
  out.ByteOrder = host_byte_order();
  out.buffersize = 0;
  rawData.rasterName = OutputFile;

  const std::size_t recordBytes = kRecordPrefix + 2 * std::size_t(samples);
  // A damaged descriptor can claim lines of millions of samples: the first
  // record must be in the file before its buffers are made.
  const std::streampos afterDescriptor = in.tellg();
  in.seekg(0, std::ios::end);
  const std::streamoff fileBytes = in.tellg();
  in.seekg(afterDescriptor);
  if (!in || fileBytes < std::streamoff(kImageDescriptor) + std::streamoff(recordBytes))
    return ERS_FAIL("File reading failed! " + ImgFilename + ": record 1 is missing or short",
                    STATUS_READ_FAILED);
  // The records go through in batches: read in one call, their words
  // turned into floats by the threads side by side, the rows written by the
  // threads together (one thread fills fresh page-cache pages at a fraction
  // of the speed of two on a virtual machine).
  constexpr int kBatchLines = 512;
  const std::size_t rowFloats = 1 + 2 * std::size_t(samples);
  constexpr std::size_t kBatchBytes = std::size_t(32) << 20;
  const std::size_t inFile = std::size_t(fileBytes - std::streamoff(kImageDescriptor)) / recordBytes;
  const int batchLines = static_cast<int>(std::max<std::size_t>(
      1, std::min({std::size_t(kBatchLines), std::size_t(std::max(1, skip + lines)), inFile,
                   kBatchBytes / (rowFloats * sizeof(float))})));
  std::vector<unsigned char> batch;
  std::vector<float> rows;
  try {
    batch.resize(recordBytes * std::size_t(batchLines));
    rows.resize(rowFloats * std::size_t(batchLines));
    swstVector.assign(std::size_t(lines), 0);
    missingVector.assign(std::size_t(lines), 0);
    counterVector.assign(std::size_t(lines), 0);
  } catch (const std::bad_alloc&) {
    return ERS_FAIL("Memory allocation failed for the ERS line buffers", STATUS_NO_MEMORY);
  }
  // Created empty, then open for reading and writing for the shared copies.
  if (int st = out.open(1); st != 0) return ERS_CALLED(st);
  if (int st = out.open(2); st != 0) return ERS_CALLED(st);

  const float biasI = static_cast<float>(biasI_), biasQ = static_cast<float>(biasQ_);
  double swstMin = 1.0, swstMax = 0.0;
  int previousCode = 0, lastPercent = -1;
  int status = 0;
  waitbar_open("Extracting ERS Raw Data");
  const int total = skip + lines;
  for (int pos0 = 0; pos0 < total && status == 0; pos0 += batchLines) {
    const int want = std::min(batchLines, total - pos0);
    in.read(reinterpret_cast<char*>(batch.data()), static_cast<std::streamsize>(recordBytes * want));
    const int whole = static_cast<int>(static_cast<std::size_t>(in.gcount()) / recordBytes);
    if (whole < want)
      status = ERS_FAIL("File reading failed! " + ImgFilename + ": record " + std::to_string(pos0 + whole + 1) +
                            " is missing or short",
                        STATUS_READ_FAILED);
    // Line counters and window codes in record order (a corrupted code takes
    // the one before it).
    int firstKept = -1;
    for (int b = 0; b < whole; ++b) {
      const int pos = pos0 + b;
      const int percent = static_cast<int>(100.0 * pos / total);
      if (percent != lastPercent) {
        waitbar_update(0, static_cast<float>(percent));
        lastPercent = percent;
      }
      const unsigned char* record = batch.data() + recordBytes * std::size_t(b);
      const int number = static_cast<int>(ceosBE32(record, ers_image::data::kLineNumber));
      const int missing = number != pos + 1 ? 1 : 0;
      missingLines_ += missing;
      int code = ceosBE16(record, ers_image::data::kWindowStartCode);
      if (pos > 0 && std::abs(code - previousCode) > kMaxSwstJump) code = previousCode;
      previousCode = code;
      if (pos < skip) continue;
      if (firstKept < 0) firstKept = b;
      const float swst = static_cast<float>(code * kSwstStep + kSwstOffset + kRangeGateBias);
      rows[rowFloats * std::size_t(b)] = swst;
      swstMin = std::min(swstMin, static_cast<double>(swst));
      swstMax = std::max(swstMax, static_cast<double>(swst));
      const std::size_t k = std::size_t(pos - skip);
      swstVector[k] = code;
      missingVector[k] = missing;
      counterVector[k] = number;
    }
    if (firstKept < 0) continue;
#pragma omp parallel for schedule(static)
    for (int b = firstKept; b < whole; ++b) {
      const unsigned char* iq = batch.data() + recordBytes * std::size_t(b) + kRecordPrefix;
      float* px = rows.data() + rowFloats * std::size_t(b) + 1;
      for (int s = 0; s < samples; ++s) {
        px[2 * s] = static_cast<float>(iq[2 * s]) - 15.5f - biasI;
        px[2 * s + 1] = static_cast<float>(iq[2 * s + 1]) - 15.5f - biasQ;
      }
    }
    const int64_t rowBytes = static_cast<int64_t>(rowFloats * sizeof(float));
    if (int st = out.writeRows(rows.data() + rowFloats * std::size_t(firstKept), rowBytes, rowBytes,
                               whole - firstKept);
        st != 0 && status == 0)
      status = ERS_CALLED(st);
  }
  waitbar_close();
  const int closed = out.close();
  if (status != 0) return status;
  if (closed != 0) return ERS_CALLED(closed);

  SamplingConstants_Obj& smp = rawData.sampling;
  roi.FastStartTime = swstMin;
  info.SWST_MIN = swstMin;
  info.SWST_MAX = swstMax;
  roi.FastTimeLength = samples * smp.Trg_s;
  rawData.swath.Rgate_bias = kRangeGateBias;
  info.SetImageType(DataSetInfo_Obj::IT_RAW_DATA);
  info.SetAcqMode(DataSetInfo_Obj::AM_STRIPMAP);
  info.SetUnitType(DataSetInfo_Obj::UT_VOLT);
  info.SetProjection(DataSetInfo_Obj::PR_SLANT_RANGE);
  info.MissingLines = missingLines_;
  // Description holds four characters, so this is ERS2 for both satellites;
  // the orbit reader decides on Description itself.
  info.SetSensorType(info.Description == "ERS-1" ? DataSetInfo_Obj::ST_ERS1 : DataSetInfo_Obj::ST_ERS2);
  info.StampProcessingDate();
  info.SetSenseDate(roi.SlowStartTime);
  vectorsReady_ = true;
  return 0;
}

int ATERSExtractor::ExtractChirp() {
  CheckedCall cc("ATERSExtractor::ExtractChirp()");
  if (int st = rawData.readhdr(OutputFile + ".hdr"); st != 0) return ERS_CALLED(st);
  if (int st = rawData.pulse.writeChirp(ChirpFile); st != 0) return ERS_CALLED(st);
  return 0;
}
