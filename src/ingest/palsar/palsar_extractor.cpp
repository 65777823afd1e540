// ALOS PALSAR level-1.0 extraction.
#include "ingest/palsar/palsar_extractor.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <fstream>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "ingest/ceos/ceos_fields.h"
#include "ingest/palsar/palsar_ceos_layout.h"
#include "orbit/general_sar_orbit.h"
#include "product/acquisition_objects.h"
#include "product/buffer_io.h"
#include "product/data_file.h"
#include "product/time_base.h"

namespace {


int failure(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define PAL_FAIL(message, status) failure((message), (status), __LINE__, __func__)
int calledError(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function, __FILE__);
  return status;
}
#define PAL_CALLED(status) calledError((status), __LINE__, __func__)

std::string trimmed(const std::string& s) {
  const auto first = s.find_first_not_of(' ');
  if (first == std::string::npos) return {};
  return s.substr(first, s.find_last_not_of(' ') - first + 1);
}

// Fixed decimal field: length - decimals - 1 characters of integer part
// (blanks and minus skipped), the point, `decimals` characters of fraction;
// a minus as the first character negates.
double readF(const char* text, int length, int decimals) {
  const int whole = length - decimals - 1;
  double v = 0.0;
  for (int i = 0; i < whole; ++i)
    if (text[i] >= '0' && text[i] <= '9') v = v * 10.0 + (text[i] - '0');
  double scale = 0.1;
  for (int i = whole + 1; i < length; ++i, scale *= 0.1)
    if (text[i] >= '0' && text[i] <= '9') v += (text[i] - '0') * scale;
  bool negative = false;
  for (int i = 0; i < whole; ++i)
    if (text[i] != ' ') {
      negative = text[i] == '-';
      break;
    }
  return negative ? -v : v;
}

// The next record of an image file into `rec`: 0, or 4 with a report when
// the file ends inside it or its length lies outside [shortest, longest].
int readRecord(std::ifstream& in, const std::string& name, int index, std::uint32_t shortest, std::uint32_t longest,
               std::vector<unsigned char>& rec) {
  const std::string which = name + ": record " + std::to_string(index + 1);
  rec.resize(12);
  if (!in.read(reinterpret_cast<char*>(rec.data()), 12))
    return PAL_FAIL("File reading failed! " + which + " is missing", STATUS_READ_FAILED);
  const std::uint32_t length = ceosBE32(rec.data(), ceos_head::kLength);
  if (length < shortest || length > longest) return PAL_FAIL("File reading failed! " + which + " has a bad length", STATUS_READ_FAILED);
  rec.resize(length);
  if (!in.read(reinterpret_cast<char*>(rec.data()) + 12, std::streamsize(length - 12)))
    return PAL_FAIL("File reading failed! " + which + " is short", STATUS_READ_FAILED);
  return 0;
}

// The output raster of a channel: complex floats, each line after its
// 4-byte window start.
void prepareRaster(GeneralRAWData& record, const std::string& name) {
  DataFile& out = record.dataFile;
  out.filename = name;
  out.RowPrefix = 4;
  out.CellType = FLOAT_COMPLEX;
  out.HeaderOffset = 0;
  out.ByteOrder = host_byte_order();
  out.buffersize = 0;
  record.rasterName = name;
}

bool readFile(const std::string& name, std::vector<char>& bytes) {
  std::ifstream in(name, std::ios::binary);
  if (name.empty() || !in) return false;
  bytes.assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  return true;
}

}  // namespace

ATPalExtractor::ATPalExtractor() : ProcessingTool("ATPalExtractor", "ATPalExtractor.report") {
  createElementsVector(14);
}
ATPalExtractor::~ATPalExtractor() = default;

void ATPalExtractor::refreshParameters() {
  addCommonElements();
  addElementString("LeaFileName", &LeaFileName, true);
  addElementString("RawDataName", &RawDataName, true);
  addElementString("Orbit_Filename", &Orbit_Filename, true);
  addElementString("OutputFile", &OutputFile, true);
  addElementString("OutputChirp", &OutputChirp, true);
  addElementString("OutputAntenna", &OutputAntenna, true);
  // Declared 0 to 1 but used as percentages: not enforced.
  addElementInt("SkipLines", &SkipLines, 1, INT_MIN, INT_MAX, true);
  addElementInt("ExtractLines", &ExtractLines, 1, INT_MIN, INT_MAX, true);
  addElementInt("Raw_Focused", &Raw_Focused, 1, 0, 1, true);
  setAllocationFlag(true);
}

int ATPalExtractor::InitProcessing(const std::string& file, int channel) {
  if (int st = readpar(file, channel); st != 0) return PAL_CALLED(st);
  init_report(0, "ATPalExtractor REPORT", ReportLevel);
  if (int st = checkpar(); st != 0) return PAL_CALLED(st);
  return 0;
}
int ATPalExtractor::runall(const std::string& file, int channel) {
  if (namesOtherConfiguration(file, channel)) return STATUS_BAD_CONDITION;
  if (int st = InitProcessing(file, channel); st != 0) return PAL_CALLED(st);
  if (int st = run(); st != 0) return PAL_CALLED(st);
  if (int st = FinalizeProcessing(file, channel); st != 0) return PAL_CALLED(st);
  return 0;
}

int ATPalExtractor::run() {
  if (Raw_Focused == 0) return extract();
  if (Raw_Focused == 1) return extract_l11();
  return 0;
}

int ATPalExtractor::extract() {
  CheckedCall cc("ATPalExtractor::extract()");
  std::vector<char> lea;
  if (!readFile(LeaFileName, lea)) return PAL_FAIL("File " + LeaFileName + " cannot be opened!", STATUS_NOT_OPENED);
  isErsdac = lea.size() >= 2612 && std::string(lea.data() + 2606, 6) == "VEXCEL";
  int st = isErsdac ? extract_lea10Ersdac() : extract_lea10Jaxa();
  if (st == 0) st = isErsdac ? extract_L10Ersdac() : extract_L10Jaxa();
  for (int ch = 0; st == 0 && ch < numberOfChannels && !OutputChirp.empty(); ++ch)
    st = write_chirp(OutputFile, OutputChirp, ch, OutputAntenna);
  if (st != 0) return PAL_CALLED(st);
  return 0;
}

int ATPalExtractor::extract_lea10Jaxa() { return readLeader(false); }
int ATPalExtractor::extract_lea10Ersdac() { return readLeader(true); }
int ATPalExtractor::extract_L10Jaxa() { return walkImage(false); }
int ATPalExtractor::extract_L10Ersdac() { return walkImage(true); }

// Level 1.1 (focused, single-look complex) products are a side path: the
// leader is checked for the level, and one pass over the image file copies
// the big-endian complex samples into an azimuth-focused raster whose lines
// carry their window start, with the line numbers checked on the way. The
// focusing chain never reads this raster.
int ATPalExtractor::extract_l11() {
  CheckedCall cc("ATPalExtractor::extract_l11()");
  namespace sig = palsar_image::signal;
  std::vector<char> L;
  if (!readFile(LeaFileName, L)) return PAL_FAIL("File " + LeaFileName + " cannot be opened!", STATUS_NOT_OPENED);
  const CeosRecord summary(L, palsar_leader::kDataSetSummary);
  if (!summary.has(palsar_leader::dss::kProcessingLevel) ||
      trimmed(summary.text(palsar_leader::dss::kProcessingLevel)).rfind("1.1", 0) != 0)
    return PAL_FAIL("This is not a PALSAR level 1.1 dataset! (" + LeaFileName + ")", 1);
  std::ifstream in(RawDataName, std::ios::binary);
  if (RawDataName.empty() || !in) return PAL_FAIL("File " + RawDataName + " not found!", STATUS_NOT_OPENED);
  std::vector<char> desc(static_cast<std::size_t>(palsar_image::kFirstSignalRecord));
  if (!in.read(desc.data(), std::streamsize(desc.size())))
    return PAL_FAIL("File reading failed! " + RawDataName + ": short file descriptor", STATUS_READ_FAILED);
  const int records = CeosRecord(desc, 0).integer(palsar_image::descriptor::kSignalRecords);
  if (records < 1) return PAL_FAIL("Bad number of records in the image file " + RawDataName, STATUS_BAD_PARAMETER);

  prepareRaster(record, OutputFile);
  DataFile& out = record.dataFile;
  std::vector<unsigned char> rec(12);
  std::vector<float> row;
  int samples = 0, base = 0, status = 0, lines = 0;
  double windowMin = 1.0;
  waitbar_open("Extracting PALSAR level 1.1 Data...");
  for (int idx = 0; idx < records && status == 0; ++idx) {
    waitbar_update(0, static_cast<float>(100.0 * idx / records));
    if ((status = readRecord(in, RawDataName, idx, sig::kNearRangeM.end(), 1u << 24, rec)) != 0) break;
    const std::uint32_t length = std::uint32_t(rec.size());
    const unsigned char* r = rec.data();
    const int number = static_cast<int>(ceosBE32(r, sig::kLineNumber) & 0xFFFFFFu);
    if (idx == 0) base = number;
    if (number != base + idx) ORV_REPORT("Invalid Line Number!", REPORT_WARNING);
    const int pixels = static_cast<int>(ceosBE32(r, sig::kPixels));
    if (idx == 0) {
      samples = pixels;
      if (samples < 1 || 8L * samples > long(length) - sig::kNearRangeM.end()) {
        status = PAL_FAIL("Bad number of data pixels in " + RawDataName, STATUS_BAD_PARAMETER);
        break;
      }
      row.assign(1 + 2 * std::size_t(samples), 0.0f);
      out.NrOfPixelsPerLine = samples;
      record.roi.Samples = samples;
      if (int st = out.open(1); st != 0) {
        status = PAL_CALLED(st);
        break;
      }
    } else if (pixels != samples) {
      status = PAL_FAIL("Records of different lengths in the level 1.1 image file " + RawDataName, STATUS_BAD_PARAMETER);
      break;
    }
    const double window = 2.0 * ceosBE32(r, sig::kNearRangeM) / consts::kSpeedOfLight;
    if (idx == 0) ORV_REPORT("SWST read from echo prefix : " + std::to_string(window), REPORT_CHECKPOINT);
    windowMin = std::min(windowMin, window);
    row[0] = static_cast<float>(window);
    // The samples close the record: big-endian 32-bit I and Q.
    const unsigned char* iq = r + (length - 8u * std::uint32_t(samples));
    for (int k = 0; k < 2 * samples; ++k) {
      const std::uint32_t bits = ceosBE32(iq + 4 * k, {0, 4});
      float v;
      std::memcpy(&v, &bits, sizeof v);
      row[1 + std::size_t(k)] = v;
    }
    if (int st = out.write(row.data(), static_cast<int64_t>(row.size() * sizeof(float))); st != 0) status = PAL_CALLED(st);
    ++lines;
  }
  waitbar_close();
  const int closed = samples > 0 ? out.close() : 0;
  if (status != 0) return status;
  if (closed != 0) return PAL_CALLED(closed);
  out.NrOfLinesPerImage = lines;
  record.roi.Lines = lines;
  record.roi.FastStartTime = windowMin;
  record.dataSetInfo.SetImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED);
  record.dataSetInfo.SetSensorType(DataSetInfo_Obj::ST_PALSAR);
  record.dataSetInfo.SetProjection(DataSetInfo_Obj::PR_SLANT_RANGE);
  if (int st = record.writehdr(); st != 0) return PAL_CALLED(st);
  return 0;
}

int ATPalExtractor::readLeader(bool ersdac) {
  CheckedCall cc("ATPalExtractor::readLeader()");
  namespace dss = palsar_leader::dss;
  std::vector<char> L;
  if (!readFile(LeaFileName, L)) return PAL_FAIL("File " + LeaFileName + " cannot be opened!", STATUS_NOT_OPENED);
  const CeosRecord summary(L, palsar_leader::kDataSetSummary);
  if (!summary.has(dss::kErsdacFacility))
    return PAL_FAIL("File reading failed! " + LeaFileName + " is too short for a PALSAR leader", STATUS_READ_FAILED);
  if (summary.text(dss::kProcessingLevel) != "UNPROCESSED")
    return PAL_FAIL("The CEOS fileset is not ALOS RAW DATA (" + LeaFileName + ")", STATUS_BAD_PARAMETER);
  auto bad = [this](const char* what) { return std::string("Bad ") + what + " in the leader file " + LeaFileName; };
  auto fixed = [&summary](CeosField field, int decimals = dss::kDecimals) {
    return readF(summary.at(field), field.width, decimals);
  };

  SamplingConstants_Obj& smp = record.sampling;
  SARPulse_Obj& pulse = record.pulse;
  DataSetInfo_Obj& info = record.dataSetInfo;
  ROI_Obj& roi = record.roi;
  info.AcquisitionStation = trimmed(summary.text(dss::kStation));
  info.SceneID = trimmed(summary.text(dss::kSceneId));
  if (ersdac) {
    std::vector<char> head;
    std::ifstream in(RawDataName, std::ios::binary);
    if (!in) return PAL_FAIL("File " + RawDataName + " not found!", STATUS_NOT_OPENED);
    head.resize(static_cast<std::size_t>(palsar_image::descriptor::kChannels.end()));
    if (!in.read(head.data(), std::streamsize(head.size())))
      return PAL_FAIL("File reading failed! " + RawDataName, STATUS_READ_FAILED);
    const int n = CeosRecord(head, 0).integer(palsar_image::descriptor::kChannels);
    npol_ = n == 6 ? 4 : n == 3 ? 2 : 1;
  } else {
    npol_ = summary.integer(dss::kChannelCount);
  }
  const char* mode = summary.at(dss::kSensorMode);
  if (mode[0] != '6') {
    return PAL_FAIL("Acquisition type not supported (Calibration, Noise, Direct Downlink)", 1);
  }
  if (mode[1] == '0' || mode[1] == '3') {
    acquisitionMode = npol_ == 1 ? 0 : 1;
    numberOfChannels = 1;
  } else if (mode[1] == '1') {
    acquisitionMode = 3;
    numberOfChannels = 5;
  } else if (mode[1] == '2') {
    acquisitionMode = 2;
    numberOfChannels = 1;
  } else {
    return PAL_FAIL("Acquisition type not supported (Calibration, Noise, Direct Downlink)", 1);
  }
  if (acquisitionMode == 3)
    return PAL_FAIL("ScanSAR extraction is not available in this build (" + LeaFileName + ")", STATUS_BAD_PARAMETER);
  const char direction = *summary.at(ersdac ? dss::kErsdacDirection : dss::kDirection);
  info.OrbitConfiguration = direction == 'A' ? "ASCENDING" : "DESCENDING";
  info.OrbitNumber = trimmed(summary.text(dss::kOrbitNumber));
  info.SceneHeading = fixed(dss::kHeading, dss::kHeadingDecimals);
  smp.lambda_m = fixed(dss::kWavelength);
  if (!(smp.lambda_m > 0.0)) return PAL_FAIL(bad("wavelength"), STATUS_BAD_PARAMETER);
  maxMissingLines = summary.integer(dss::kMaxMissingLines);
  smp.frg_hz = fixed(dss::kSamplingRateMHz) * 1000000.0;
  if (!(smp.frg_hz > 0.0)) return PAL_FAIL(bad("sampling rate"), STATUS_BAD_PARAMETER);
  smp.Trg_s = 1.0 / smp.frg_hz;
  pulse.PulseSamplingRate = smp.frg_hz;
  roi.FastStartTime = fixed(dss::kWindowStartUs) / 1000000.0;
  ORV_REPORT("SWST read from byte 727 to 731 of Leader File : " + std::to_string(roi.FastStartTime), REPORT_CHECKPOINT);
  pulse.PulseLength = fixed(dss::kPulseLengthUs) / 1000000.0;
  if (!(pulse.PulseLength > 0.0)) return PAL_FAIL(bad("pulse length"), STATUS_BAD_PARAMETER);
  double slope = summary.realExp(dss::kChirpSlope);
  if (slope == 0.0) slope = summary.realExp(dss::kChirpSlopeSecond);
  pulse.PulseKRate = std::fabs(slope);
  pulse.Bandwidth = pulse.PulseLength * pulse.PulseKRate;
  if (!(pulse.Bandwidth > 0.0)) return PAL_FAIL(bad("chirp slope"), STATUS_BAD_PARAMETER);
  gainH = std::pow(10.0, fixed(dss::kGainHDb) / 10.0);
  gainV = std::pow(10.0, fixed(dss::kGainVDb) / 10.0);
  biasI = fixed(dss::kBiasI);
  biasQ = fixed(dss::kBiasQ);
  smp.prf_hz = fixed(dss::kPrfMilliHz) / 1000.0;
  if (acquisitionMode == 2) smp.prf_hz *= 0.5;  // H and V transmissions alternate
  if (!(smp.prf_hz > 0.0)) return PAL_FAIL(bad("PRF"), STATUS_BAD_PARAMETER);
  smp.pri_s = 1.0 / smp.prf_hz;
  info.Swath = std::to_string(summary.integer(dss::kBeamNumber));
  return 0;
}

int ATPalExtractor::walkImage(bool ersdac) {
  CheckedCall cc("ATPalExtractor::walkImage()");
  ready_ = 0;
  missingLines_ = 0;
  std::ifstream in(RawDataName, std::ios::binary);
  if (RawDataName.empty() || !in) return PAL_FAIL("File " + RawDataName + " not found!", STATUS_NOT_OPENED);
  namespace sig = palsar_image::signal;
  const long start = ersdac ? palsar_image::kErsdacFirstSignalRecord : palsar_image::kFirstSignalRecord;
  const int prefix = ersdac ? palsar_image::kErsdacPrefix : palsar_image::kJaxaPrefix;
  std::vector<char> desc(static_cast<std::size_t>(start));
  if (!in.read(desc.data(), start)) return PAL_FAIL("File reading failed! " + RawDataName + ": short file descriptor", STATUS_READ_FAILED);
  const int records = CeosRecord(desc, 0).integer(palsar_image::descriptor::kSignalRecords);
  if (records < 1) return PAL_FAIL("Bad number of records in the image file " + RawDataName, STATUS_BAD_PARAMETER);
  const int skip = static_cast<int>(static_cast<long long>(SkipLines) * records / 100);
  int keep = records - skip;
  if (ExtractLines > 0 && ExtractLines + SkipLines < 100)
    keep = static_cast<int>(static_cast<long long>(records) * ExtractLines / 100);
  if (skip < 0 || keep < 1 || skip + keep > records)
    return PAL_FAIL("Bad part of the scene to extract from " + RawDataName, STATUS_BAD_PARAMETER);

  SamplingConstants_Obj& smp = record.sampling;
  SARPulse_Obj& pulse = record.pulse;
  DataSetInfo_Obj& info = record.dataSetInfo;
  ROI_Obj& roi = record.roi;
  prepareRaster(record, OutputFile);
  DataFile& out = record.dataFile;
  swst.clear();
  missing.clear();
  sequence.clear();

  std::vector<unsigned char> rec(12);
  std::vector<float> row, previous;
  int samples = 0, base = 0, status = 0, lastPercent = -1;
  bool opened = false;
  long position = 0;  // timeline position of the next record (line number - base)
  double swstMin = 1.0, swstMax = 0.0;
  const float bi = static_cast<float>(biasI), bq = static_cast<float>(biasQ);
  waitbar_open("Extracting PALSAR Raw Data...");
  for (int idx = 0; idx < records && static_cast<long>(swst.size()) < keep; ++idx) {
    const int percent = static_cast<int>(100.0 * idx / records);
    if (percent != lastPercent) waitbar_update(0, static_cast<float>(lastPercent = percent));
    if ((status = readRecord(in, RawDataName, idx, std::uint32_t(prefix), 1u << 20, rec)) != 0) break;
    const std::uint32_t length = std::uint32_t(rec.size());
    const unsigned char* r = rec.data();
    const int number = static_cast<int>(ceosBE32(r, sig::kLineNumber) & 0xFFFFFFu);
    if (idx == 0) base = number;
    const long expected = position;
    const long actual = number - base;
    if (actual < expected) {
      ORV_REPORT("Invalid Line Number! A missing line is probably detected", REPORT_WARNING);
      continue;  // a repeated or earlier record: dropped
    }
    const int pixels = static_cast<int>(ceosBE32(r, sig::kPixels));
    if (samples == 0) {
      samples = pixels;
      if (samples < 1 || 2L * samples + prefix > long(length)) {
        status = PAL_FAIL("Bad number of data pixels in " + RawDataName, STATUS_BAD_PARAMETER);
        break;
      }
      row.assign(1 + 2 * std::size_t(samples), 0.0f);
      previous = row;
    }
    if (actual > expected) {
      ORV_REPORT("Invalid Line Number! A missing line is probably detected", REPORT_WARNING);
      missingLines_ += static_cast<int>(actual - expected);
      if (missingLines_ > maxMissingLines) {
        status = PAL_FAIL("Missing lines are more than missing lines number written in the Leader File (" +
                              std::to_string(missingLines_) + " > " + std::to_string(maxMissingLines) + " in " + RawDataName + ")",
                          STATUS_BAD_CONDITION);
        break;
      }
      // Lost lines are repeats of the line before, flagged, so that the
      // timeline stays whole.
      for (long p = expected; p < actual && static_cast<long>(swst.size()) < keep; ++p) {
        if (p < skip || !opened) continue;
        if (int st = out.write(previous.data(), static_cast<int64_t>(previous.size() * sizeof(float))); st != 0) {
          status = PAL_CALLED(st);
          break;
        }
        swst.push_back(swst.back());
        missing.push_back(1);
        sequence.push_back(static_cast<int>(base + p));
      }
      if (status != 0) break;
    }
    position = actual + 1;
    if (actual < skip || static_cast<long>(swst.size()) >= keep) continue;

    const double nearM = ceosBE32(r, sig::kNearRangeM);
    // A slant range past 2^31 m is a damaged record, not a geometry.
    if (!(nearM < 2147483648.0)) {
      status = PAL_FAIL("File reading failed! the slant range of signal record " + std::to_string(actual + 1) +
                            " is damaged in " + RawDataName,
                        STATUS_READ_FAILED);
      break;
    }
    const double window = 2.0 * nearM / consts::kSpeedOfLight;
    const double t = ascii2sec85("01-JAN-" + std::to_string(ceosBE32(r, sig::kYear)) + " 00:00:00.000") +
                     (double(ceosBE32(r, sig::kDayOfYear)) - 1.0) * 86400.0 + ceosBE32(r, sig::kMillisecond) / 1000.0;
    const int tx = ceosBE16(r, sig::kTransmit), rx = ceosBE16(r, sig::kReceive);
    if (!opened) {
      // A polarimetric line pair carries the time of its H transmission; the
      // V transmission follows half a pulse interval of the channel later.
      const double start = acquisitionMode == 2 && tx == 1 ? t + 0.5 * smp.pri_s : t;
      roi.SlowStartTime = start;
      record.swath.Acquisition_Start_Time = start;
      out.NrOfPixelsPerLine = samples;
      roi.Samples = samples;
      polarization_ = std::string(tx == 0 ? "H" : tx == 1 ? "V" : "H+V") + (rx == 0 ? "/H" : "/V");
      ORV_REPORT("SWST read from echo prefix of swath 1 : " + std::to_string(window), REPORT_CHECKPOINT);
      if (!ersdac && acquisitionMode == 2)
        pulse.Bandwidth = (*(r + sig::kChirpSelect.offset) & sig::kNarrowChirpBit) ? 14000000.0 : 28000000.0;
      if (int st = out.open(1); st != 0) {
        status = PAL_CALLED(st);
        break;
      }
      opened = true;
    }
    const float gain = static_cast<float>(tx == 1 ? gainV : gainH);
    row[0] = static_cast<float>(window);
    const unsigned char* iq = r + prefix;
    for (int s = 0; s < samples; ++s) {
      row[1 + 2 * std::size_t(s)] = (static_cast<float>(iq[2 * s]) - bi) * gain;
      row[2 + 2 * std::size_t(s)] = (static_cast<float>(iq[2 * s + 1]) - bq) * gain;
    }
    if (int st = out.write(row.data(), static_cast<int64_t>(row.size() * sizeof(float))); st != 0) {
      status = PAL_CALLED(st);
      break;
    }
    previous.swap(row);
    row.resize(previous.size());
    swstMin = std::min(swstMin, window);
    swstMax = std::max(swstMax, window);
    swst.push_back(static_cast<int>(nearM));
    missing.push_back(0);
    sequence.push_back(number);
  }
  waitbar_close();
  const int closed = opened ? out.close() : 0;
  if (status != 0) return status;
  if (closed != 0) return PAL_CALLED(closed);
  if (swst.empty()) return PAL_FAIL("No line extracted from " + RawDataName, STATUS_BAD_PARAMETER);

  const int lines = static_cast<int>(swst.size());
  out.NrOfLinesPerImage = lines;
  roi.Lines = lines;
  smp.fc_hz = consts::kSpeedOfLight / smp.lambda_m;
  smp.Brg_hz = pulse.Bandwidth;
  smp.Baz_hz = smp.prf_hz;
  smp.brf_hz = smp.prf_hz;
  smp.bri_s = smp.pri_s;
  roi.FastTimeDelta = smp.Trg_s;
  roi.SlowTimeDelta = smp.pri_s;
  roi.FastTimeLength = samples * smp.Trg_s;
  roi.SlowTimeLength = lines * smp.pri_s;
  roi.FastStartTime = swstMin;
  info.SWST_MIN = swstMin;
  info.SWST_MAX = swstMax;
  info.RO_REF = 692000.0;
  info.Polarization = polarization_;
  info.MissingLines = missingLines_;
  static const int kModes[4] = {DataSetInfo_Obj::AM_STRIPMAP, DataSetInfo_Obj::AM_DOUBLE_POLARIZATION,
                                                     DataSetInfo_Obj::AM_QUAD_POLARIZATION, DataSetInfo_Obj::AM_SCANSAR};
  info.SetAcqMode(kModes[acquisitionMode]);
  info.SetImageType(DataSetInfo_Obj::IT_RAW_DATA);
  info.SetUnitType(DataSetInfo_Obj::UT_VOLT);
  info.SetSensorType(DataSetInfo_Obj::ST_PALSAR);
  info.SetProjection(DataSetInfo_Obj::PR_SLANT_RANGE);
  info.StampProcessingDate();
  info.SetSenseDate(roi.SlowStartTime);

  GeneralSAROrbit& orbit = record.orbit();
  orbit.SVDestroy();
  orbit.setLambda(smp.lambda_m);
  if (int st = orbit.GetStateVectorsPAL(Orbit_Filename.empty() ? LeaFileName : Orbit_Filename, roi.SlowStartTime,
                                        roi.SlowTimeLength);
      st != 0) {
    orbit.SVDestroy();
    return PAL_CALLED(st);
  }
  const int written = record.writehdr();
  orbit.SVDestroy();
  if (written != 0) return PAL_CALLED(written);
  ready_ = 1;
  return 0;
}

int ATPalExtractor::extract_chirp(int channel, std::vector<fcomplex>& chirp) const {
  if (channel < 0 || channel >= numberOfChannels) return STATUS_BAD_CONDITION;
  const double T = record.pulse.PulseLength, fs = record.sampling.frg_hz, B = record.pulse.Bandwidth;
  if (!(T > 0.0) || !(fs > 0.0) || !(B > 0.0)) return PAL_FAIL("Bad pulse parameters for the PALSAR chirp", STATUS_BAD_PARAMETER);
  const double x = T * fs;
  const int n = static_cast<int>(x >= 0 ? std::floor(x + 0.5) : std::ceil(x - 0.5));
  const double k = B * consts::kPi / T, g = std::sqrt(fs / B);
  try {
    chirp.assign(std::size_t(n), fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    return PAL_FAIL("Memory allocation failed for the PALSAR chirp", STATUS_NO_MEMORY);
  }
  // The conjugate of the up-chirp: PALSAR transmits a down-chirp.
  for (int i = 0; i < n; ++i) {
    const double t = (i - (n - 1) * 0.5) / fs;
    const double phase = -(k * t * t);
    chirp[std::size_t(i)] = fcomplex(static_cast<float>(std::cos(phase) / g), static_cast<float>(std::sin(phase) / g));
  }
  return 0;
}

int ATPalExtractor::write_chirp(const std::string& header, const std::string& out, int channel, const std::string&) {
  CheckedCall cc("ATPalExtractor::write_chirp()");
  if (int st = record.readhdr(header + ".hdr"); st != 0) return PAL_CALLED(st);
  std::vector<fcomplex> chirp;
  if (int st = extract_chirp(channel, chirp); st != 0) return PAL_CALLED(st);
  const std::string name = numberOfChannels > 1 ? out + std::to_string(channel + 1) : out;
  const int status = writeReplicaRaster(name, chirp.data(), static_cast<int>(chirp.size()));
  if (status != 0) return PAL_CALLED(status);
  return 0;
}

int ATPalExtractor::getOutputFilename(int channel, std::string& name) const {
  if (channel < 0 || channel >= numberOfChannels) return STATUS_BAD_CONDITION;
  name = numberOfChannels > 1 ? OutputFile + std::to_string(channel) : OutputFile;
  return 0;
}

int ATPalExtractor::getPolarization(int channel, std::string& pol) const {
  if (channel < 0 || channel >= numberOfChannels) return STATUS_BAD_CONDITION;
  pol = polarization_;
  return 0;
}
