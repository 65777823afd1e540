#include "core/range_focuser.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <new>

#include "base/status.h"
#include "core/fft.h"
#include "core/ortog.h"
#include "core/range_focus.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "product/buffer_io.h"
#include "product/general_sar.h"

namespace {

int fail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define RF_FAIL(message, status) fail((message), (status), __LINE__, __func__)

int calledError(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function,
                 __FILE__);
  return status;
}
#define RF_CALLED(status) calledError((status), __LINE__, __func__)

long roundAway(double x) { return std::lround(x); }

bool isRawType(const DataSetInfo_Obj& info) {
  return info.IsImageType(DataSetInfo_Obj::IT_RAW_DATA) ||
         info.IsImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED);
}

}  // namespace

ATRangeFocuser::ATRangeFocuser() { createElementsVector(14); }

ATRangeFocuser::~ATRangeFocuser() = default;

void ATRangeFocuser::refreshParameters() {
  addElementInt("Memory", &Memory, 1, 0, INT_MAX, true);
  addElementString("ReportFilename", &ReportFilename, true);
  addElementInt("ReportLevel", &ReportLevel, 1, 0, 3, true);
  addElementInt("Incore", &Incore, 1, 0, 1, true);
  addElementInt("Verbose", &Verbose, 1, 0, 1, true);
  addElementString("RawData", &RawData, true);
  addElementString("ChirpFile", &ChirpFile, true);
  addElementString("OutputFile", &OutputFile, true);
  addElementInt("DataToSkip", &DataToSkip, 1, INT_MIN, INT_MAX, false);
  addElementInt("DataToProcess", &DataToProcess, 1, INT_MIN, INT_MAX, false);
  // The replica in memory is handed over by the caller, never persisted.
  addElementDouble("ChirpBuf", reinterpret_cast<double*>(ChirpBuf.data()), 0, -1e300, 1e300,
                   false);
  addElementInt("ChirpLen", &ChirpLen, 1, INT_MIN, INT_MAX, false);
  addElementDouble("ChirpBand", &ChirpBand, 1, -1e300, 1e300, false);
  addElementDouble("ChirpFs", &ChirpFs, 1, -1e300, 1e300, false);
  setAllocationFlag(true);
}

int ATRangeFocuser::createBuffers() { return createBuffersDefault(); }

int ATRangeFocuser::destroyBuffers() {
  setAllocationFlag(false);
  return 0;
}

int ATRangeFocuser::readpar(const std::string& file, int channel) {
  readAuxiliaryFile(file, channel, "ATRangeFocuser");
  return 0;
}

int ATRangeFocuser::writepar(const std::string& file, int channel) {
  return writeAuxiliaryFile(file, channel, "ATRangeFocuser");
}

int ATRangeFocuser::checkpar() {
  checkAuxiliaryFile();
  return 0;
}

int ATRangeFocuser::InitProcessing(const std::string& file, int channel) {
  init_report(0, "ATRangeFocuser REPORT", ReportLevel);
  if (int st = readpar(file, channel); st != 0) return RF_CALLED(st);
  if (int st = checkpar(); st != 0) return RF_CALLED(st);
  return 0;
}

int ATRangeFocuser::FinalizeProcessing(const std::string&, int) {
  exit_report();
  return 0;
}

int ATRangeFocuser::runall(const std::string& file, int channel) {
  if (int st = InitProcessing(file, channel); st != 0) return RF_CALLED(st);
  if (int st = run(); st != 0) return RF_CALLED(st);
  if (int st = FinalizeProcessing(file, channel); st != 0) return RF_CALLED(st);
  return 0;
}

int ATRangeFocuser::computeLines(GeneralSAR& record) {
  const DataSetInfo_Obj& info = record.dataSetInfo;
  if (!isRawType(info)) return RF_FAIL("Input file is not a raw data file!", STATUS_BAD_CONDITION);
  const int L = record.roi.roi.Lines;
  if (info.IsAcqMode(DataSetInfo_Obj::AM_SCANSAR)) {
    const int B = record.swath.Bursts, E = record.swath.Echoes_per_burst;
    const int s = DataToSkip == 0 ? 0 : static_cast<int>(B * (DataToSkip / 100.0));
    int c = B - s;
    if (DataToProcess != 0 && DataToSkip + DataToProcess < 100)
      c = static_cast<int>(roundAway(DataToProcess / 100.0 * B));
    linesToSkip_ = E * s;
    linesToProcess_ = E * c;
  } else {
    linesToSkip_ = static_cast<int>(DataToSkip / 100.0 * L);
    linesToProcess_ = L - linesToSkip_;
    if (DataToProcess != 0 && DataToSkip + DataToProcess < 100)
      linesToProcess_ = static_cast<int>(roundAway(DataToProcess / 100.0 * L));
  }
  return 0;
}

int ATRangeFocuser::run() {
  GeneralSAR gs;
  if (int st = gs.GSread(RawData + ".hdr"); st != 0) return RF_CALLED(st);
  if (int st = computeLines(gs); st != 0) return RF_CALLED(st);

  DataSetInfo_Obj& info = gs.dataSetInfo;
  ROI_Obj& roi = gs.roi.roi;
  const SamplingConstants_Obj& smp = gs.sampling;
  const bool aligned = info.IsImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED);
  const int lines = linesToProcess_, skip = linesToSkip_;
  const int S = roi.Samples;
  if (S < 1 || lines < 0 || skip < 0 || skip + lines > std::max(roi.Lines, 0) ||
      smp.frg_hz <= 0.0)
    return RF_FAIL("Raster info of the raw data file is wrong: " + RawData, STATUS_BAD_PARAMETER);

  // Output raster.
  DataFile out;
  out.filename = OutputFile;
  out.CellType = FLOAT_COMPLEX;
  out.ByteOrder = 0;
  out.RowPrefix = 0;
  out.HeaderOffset = 0;
  out.NrOfLinesPerImage = lines;

  const int D = static_cast<int>(roundAway((info.SWST_MAX - info.SWST_MIN) * smp.frg_hz));
  if (D < 0) return RF_FAIL("SWST_MAX is below SWST_MIN in " + RawData, STATUS_BAD_PARAMETER);
  const int N = genpow(S + D, 1);

  // Lines per block from the memory budget.
  const double budget = static_cast<double>(Memory) * 1048576.0 - 16.0 * N;
  const int P = static_cast<int>(budget / (16.0 * S));
  if (P < 1) return RF_FAIL("Memory too small to range focus one line", STATUS_NO_MEMORY);
  const int Q = lines / P + 1;

  // Input raster layout (the raw record's raster member).
  DataFile in(gs.dataFile);
  in.filename = RawData;
  in.buffersize = 0;
  const int64_t rowBytes = in.rowlength();
  const int prefixBytes = in.RowPrefix;
  if (rowBytes < static_cast<int64_t>(prefixBytes) + 8LL * S)
    return RF_FAIL("Raster info of the raw data file is wrong: " + RawData, STATUS_BAD_PARAMETER);

  // Replica, in priority: buffer in memory, replica raster, synthetic pulse.
  std::vector<fcomplex> replica;
  try {
    if (!ChirpBuf.empty()) {
      if (ChirpLen <= 0 || ChirpLen > static_cast<int>(ChirpBuf.size())) ChirpLen = static_cast<int>(ChirpBuf.size());
      replica.assign(ChirpBuf.begin(), ChirpBuf.begin() + ChirpLen);
    } else if (std::FILE* probe = ChirpFile.empty() ? nullptr : std::fopen(ChirpFile.c_str(), "rb")) {
      std::fclose(probe);
      DataFile chirp;
      if (int st = chirp.read_hdr(ChirpFile); st != 0) return RF_CALLED(st);
      ChirpLen = chirp.NrOfPixelsPerLine;
      if (ChirpLen < 1) return RF_FAIL("Replica raster is empty: " + ChirpFile, STATUS_BAD_PARAMETER);
      replica.assign(ChirpLen, fcomplex(0.0f, 0.0f));
      BufferIO io{.file = &chirp, .first_column = 0, .columns = ChirpLen, .first_row = 0,
                   .rows = 1};
      const int st = io.readbuffer(replica.data());
      chirp.close();
      if (st != 0) return RF_CALLED(st);
    } else {
      if (smp.Trg_s <= 0.0) return RF_FAIL("No replica and no range sampling step", STATUS_BAD_PARAMETER);
      ChirpLen = static_cast<int>(roundAway(gs.pulse.PulseLength / smp.Trg_s));
      if (ChirpLen < 1) return RF_FAIL("No replica and no pulse length", STATUS_BAD_PARAMETER);
      replica.assign(std::max(ChirpLen, gs.pulse.chirpSamples()), fcomplex(0.0f, 0.0f));
      if (int st = gs.pulse.generateChirp(replica.data()); st != 0) return RF_CALLED(st);
      replica.resize(ChirpLen);
    }
  } catch (const std::bad_alloc&) {
    return RF_FAIL("Memory allocation failed", STATUS_NO_MEMORY);
  }

  const int V = S - ChirpLen + 1;
  if (V <= 0)
    return RF_FAIL("Unable to range focus. Image too small with respet of chirp length",
                   STATUS_BAD_CONDITION);
  const int O = V + D;
  out.NrOfPixelsPerLine = O;

  RangeCompressor rc;
  if (int st = rc.init(replica.data(), ChirpLen, N); st != 0) return RF_CALLED(st);

  Ortog ortog(RawData, 1, 50);
  if (Flag_ortog) {
    OrtogRaster r;
    r.lines = roi.Lines;
    r.samples = S;
    r.prefixBytes = prefixBytes;
    r.headerOffset = in.HeaderOffset;
    r.slowStartTime = roi.SlowStartTime;
    r.slowTimeDelta = roi.SlowTimeDelta;
    if (int st = ortog.estimate(r); st != 0) return RF_CALLED(st);
  }

  std::vector<char> raw;
  FFTBuffer work;
  std::vector<fcomplex> outBlock;
  std::vector<int> shift;
  const int chunk = rc.chunkRows();
  try {
    raw.resize(static_cast<std::size_t>(rowBytes) * std::min(P, std::max(lines, 1)));
    outBlock.resize(static_cast<std::size_t>(O) * std::min(P, std::max(lines, 1)));
    work.resize(static_cast<std::size_t>(N) * chunk);
    shift.resize(chunk);
  } catch (const std::bad_alloc&) {
    return RF_FAIL("Memory allocation failed", STATUS_NO_MEMORY);
  }

  if (int st = in.open(0); st != 0) return RF_CALLED(st);
  if (int st = out.open(1); st != 0) return RF_CALLED(st);
  waitbar_open("Range Focusing");
  if (int st = in.seek(static_cast<int64_t>(skip) * rowBytes, SEEK_SET); st != 0)
    return RF_CALLED(st);

  int lastPercent = -1;
  int n = 0;  // running line index in the processed range
  for (int b = 0; b < Q; ++b) {
    const int count = b == Q - 1 ? lines - b * P : P;
    if (count <= 0) continue;
    if (int st = in.read(raw.data(), static_cast<int64_t>(count) * rowBytes); st != 0)
      return RF_CALLED(st);
    for (int l0 = 0; l0 < count; l0 += chunk) {
      const int nr = std::min(chunk, count - l0);
      for (int r = 0; r < nr; ++r, ++n) {
        const int percent = static_cast<int>(100.0 * n / lines);
        if (percent != lastPercent) {
          waitbar_update(0, static_cast<float>(percent));
          lastPercent = percent;
        }
        const char* src = raw.data() + static_cast<std::size_t>(l0 + r) * rowBytes;
        fcomplex* row = work.data() + static_cast<std::size_t>(r) * N;
        std::memcpy(static_cast<void*>(row), src + prefixBytes, sizeof(fcomplex) * S);
        std::fill(row + S, row + N, fcomplex(0.0f, 0.0f));
        if (Flag_ortog) ortog.apply_ortog(row, roi.SlowStartTime + n * roi.SlowTimeDelta, S);
        shift[r] = 0;
        if (!aligned && prefixBytes >= 4) {
          float swst;
          std::memcpy(&swst, src, sizeof swst);
          const double s = (static_cast<double>(swst) - info.SWST_MIN) * smp.frg_hz;
          if (!std::isfinite(s) || roundAway(s) > D || roundAway(s) < 0) {
            char text[64];
            std::snprintf(text, sizeof text, "SWST of LINE %d IS WRONG!", n);
            return RF_FAIL(text, STATUS_BAD_CONDITION);
          }
          shift[r] = static_cast<int>(roundAway(s));
        }
      }
      rc.compress(work.data(), nr);
      for (int r = 0; r < nr; ++r) {
        const fcomplex* row = work.data() + static_cast<std::size_t>(r) * N;
        fcomplex* dst = outBlock.data() + static_cast<std::size_t>(l0 + r) * O;
        std::fill(dst, dst + shift[r], fcomplex(0.0f, 0.0f));
        std::copy(row, row + V, dst + shift[r]);
        std::fill(dst + shift[r] + V, dst + O, fcomplex(0.0f, 0.0f));
      }
    }
    BufferIO io{.file = &out, .first_column = 0, .columns = O, .first_row = b * P, .rows = count};
    if (int st = io.writebuffer(outBlock.data()); st != 0) return RF_CALLED(st);
  }
  waitbar_close();
  in.close();
  if (int st = out.close(); st != 0) return RF_CALLED(st);

  // Record of the range-focused raster.
  roi.FastStartTime = info.SWST_MIN;
  roi.Samples = O;
  roi.FastTimeLength = O * roi.FastTimeDelta;
  if (info.IsAcqMode(DataSetInfo_Obj::AM_SCANSAR)) {
    const int E = gs.swath.Echoes_per_burst;
    const int bursts = static_cast<int>(roundAway(static_cast<double>(lines) / E));
    const int skipped = static_cast<int>(roundAway(static_cast<double>(skip) / E));
    roi.SlowStartTime += skipped * smp.bri_s;
    roi.SlowTimeLength = E * roi.SlowTimeDelta + (bursts - 1) * smp.bri_s;
    gs.swath.Acquisition_Start_Time += skipped * smp.bri_s;
    gs.swath.Bursts = bursts;
  } else {
    roi.SlowStartTime += skip * roi.SlowTimeDelta;
    roi.SlowTimeLength = lines * roi.SlowTimeDelta;
    gs.swath.Acquisition_Start_Time += skip * roi.SlowTimeDelta;
  }
  roi.Lines = lines;
  info.SetImageType(DataSetInfo_Obj::IT_RANGE_FOCUSED);
  setComplexRasterLayout(gs.dataFile, OutputFile, O, lines);
  if (int st = gs.GSwrite(OutputFile + ".hdr"); st != 0) return RF_CALLED(st);
  if (int st = out.write_hdr(); st != 0) return RF_CALLED(st);
  return 0;
}
