#include "core/stripmlook.h"

#include <cmath>
#include <complex>
#include <new>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "core/fft.h"
#include "core/interp.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "product/buffer_file.h"
#include "product/buffer_io.h"

namespace {

constexpr int64_t kWindowBytes = 33554432;

int failed(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define ML_FAIL(message, status) failed((message), (status), __LINE__, __func__)

int calledError(int status, int line, const char* function) {
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, line, function, __FILE__);
  return status;
}
#define ML_CALLED(status) calledError((status), __LINE__, __func__)

// Input raster opened for reading with the record's layout.
bool openInput(BufferFile& file, const GeneralSAR& record, const std::string& name) {
  file.setFilename(name);
  file.setType(record.dataFile.CellType);
  file.setSamples(record.dataFile.NrOfPixelsPerLine);
  file.setLines(record.dataFile.NrOfLinesPerImage);
  file.setRowPrefix(record.dataFile.RowPrefix);
  file.setOffsetSize(record.dataFile.HeaderOffset);
  file.setByteOrder(record.dataFile.ByteOrder);
  if (!file.open(BufferFile::READ)) return false;
  file.initbuffer(kWindowBytes, 0);
  return true;
}

}  // namespace

ATstripmlook::ATstripmlook() : ProcessingTool("ATstripmlook", "ATstripmlook.report") {
  createElementsVector(10);
}
ATstripmlook::~ATstripmlook() {
  if (recordRead_) {
    input.GSdestroy();
    output.GSdestroy();
  }
}

void ATstripmlook::refreshParameters() {
  addCommonElements();
  addElementString("SLCInput", &SLCInput, true);
  addElementInt("RangeMLFactor", &RangeMLFactor, 1, 0, 100, true);
  addElementInt("AzimuthMLFactor", &AzimuthMLFactor, 1, 0, 100, true);
  addElementString("outputFullRootName", &outputFullRootName, true);
  addElementInt("CoherentFlag", &CoherentFlag, 1, 0, 1, false);
  setAllocationFlag(true);
}

int ATstripmlook::InitProcessing(const std::string& file, int channel) {
  init_report(0, "ATstripmlook REPORT", ReportLevel);
  if (int st = readpar(file, channel); st != 0) return ML_CALLED(st);
  if (int st = checkpar(); st != 0) return ML_CALLED(st);
  return 0;
}

int ATstripmlook::runall(const std::string& file, int channel) {
  if (int st = InitProcessing(file, channel); st != 0) return ML_CALLED(st);
  if (int st = readSLCData(); st != 0) return ML_CALLED(st);
  const int st = CoherentFlag ? coherml() : run();
  if (st != 0) return ML_CALLED(st);
  if (int f = FinalizeProcessing(file, channel); f != 0) return ML_CALLED(f);
  return 0;
}

int ATstripmlook::readSLCData() {
  if (recordRead_) {
    input.GSdestroy();
    output.GSdestroy();
  }
  if (int st = input.GSread(SLCInput + ".hdr"); st != 0) return ML_CALLED(st);
  if (int st = output.GSread(SLCInput + ".hdr"); st != 0) return ML_CALLED(st);
  recordRead_ = true;
  if (!input.GSexists(GeneralSAR::GS_DATAFILE) || !input.GSexists(GeneralSAR::GS_ROI))
    return ML_FAIL("Record of " + SLCInput + " lacks the raster or the region", STATUS_BAD_PARAMETER);
  return 0;
}

void ATstripmlook::describeOutput(int lines, int samples, int cellType) {
  const int a = AzimuthMLFactor, r = RangeMLFactor;
  GSDataFile_Obj& raster = output.dataFile;
  raster.filename = outputFullRootName;
  raster.CellType = cellType;
  raster.NrOfLinesPerImage = lines;
  raster.NrOfPixelsPerLine = samples;
  raster.RowPrefix = 0;
  raster.HeaderOffset = 0;
  raster.ByteOrder = 0;
  ROI_Obj& roi = output.roi.roi;
  roi.SlowStartTime += (a / 2) * roi.SlowTimeDelta;
  roi.FastStartTime += (r / 2) * roi.FastTimeDelta;
  roi.SlowTimeDelta *= a;
  roi.FastTimeDelta *= r;
  roi.Lines = lines;
  roi.Samples = samples;
  roi.SlowTimeLength = lines * roi.SlowTimeDelta;
  roi.FastTimeLength = samples * roi.FastTimeDelta;
}

int ATstripmlook::run() {
  const int a = AzimuthMLFactor, r = RangeMLFactor;
  if (!recordRead_) return ML_FAIL("No input record read for " + SLCInput, STATUS_BAD_CONDITION);
  if (r < 1 || a < 1)
    return ML_FAIL("Multi-look factors must be >= 1 for " + SLCInput, STATUS_BAD_PARAMETER);
  const int L = input.dataFile.NrOfLinesPerImage, S = input.dataFile.NrOfPixelsPerLine;
  if (L < 1 || S < 1 || input.dataFile.CellType != FLOAT_COMPLEX)
    return ML_FAIL("Input is not a complex float raster: " + SLCInput, STATUS_BAD_PARAMETER);
  const int outLines = L / a + 1, outSamples = S / r + 1;

  BufferFile in;
  if (!openInput(in, input, SLCInput)) return ML_FAIL("File not opened! " + SLCInput, STATUS_NOT_OPENED);
  BufferFile out(outputFullRootName);
  out.setType(BufferFile::FLOAT32);
  out.setRowPrefix(0);
  out.setLines(outLines);
  out.setSamples(outSamples);
  if (!out.open(BufferFile::WRITE))
    return ML_FAIL("File not opened! " + outputFullRootName, STATUS_NOT_OPENED);
  out.initbuffer(kWindowBytes, 0);

  // Record of the averaged grid.
  describeOutput(outLines, outSamples, FLOAT32);
  if (output.GSexists(GeneralSAR::GS_DATASETINFO))
    output.dataSetInfo.SetImageType(DataSetInfo_Obj::IT_MULTILOOK);
  if (int st = output.GSwrite(outputFullRootName + ".hdr"); st != 0) return ML_CALLED(st);

  // Deramp of the Doppler centroid, one row of phases per line of a look
  // block. The fast time steps by the index over the sampling interval.
  const ROI_Obj& roi = input.roi.roi;
  double prf = input.sampling.prf_hz;
  if (!(prf > 0.0) && roi.SlowTimeDelta > 0.0) prf = 1.0 / roi.SlowTimeDelta;
  if (!(prf > 0.0)) return ML_FAIL("No PRF in the record of " + SLCInput, STATUS_BAD_PARAMETER);
  std::vector<fcomplex> deramp;
  FFTBuffer block, range2, az2;
  try {
    deramp.assign(size_t(a) * S, fcomplex(1.0f, 0.0f));
    block.assign(size_t(a) * S, fcomplex(0.0f, 0.0f));
    range2.assign(size_t(a) * 2 * S, fcomplex(0.0f, 0.0f));
    az2.assign(size_t(2 * a) * 2 * S, fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    return ML_FAIL("Out of memory for the multi-look buffers", STATUS_NO_MEMORY);
  }
  const double midTime = roi.SlowStartTime + roi.SlowTimeLength / 2.0;
  const bool haveDC = input.GSexists(GeneralSAR::GS_POLYNOMIALS);
  for (int s = 0; s < S && haveDC; ++s) {
    double dc = 0.0;
    if (input.polynomials.EvaluateDC(roi.FastStartTime + s / roi.FastTimeDelta, midTime, &dc) != 0)
      break;
    const double step = -2.0 * consts::kPi * dc / prf;
    for (int i = 0; i < a; ++i) {
      const double phase = std::fmod(i * step, 2.0 * consts::kPi);
      deramp[size_t(i) * S + s] = fcomplex(float(std::cos(phase)), float(std::sin(phase)));
    }
  }

  interp rangeInterp, azimuthInterp;
  if (rangeInterp.setplans(S, a, 2 * S, a) != 0 || azimuthInterp.setplans(2 * S, a, 2 * S, 2 * a) != 0)
    return ML_FAIL("Interpolation plans could not be made", STATUS_NO_MEMORY);

  std::vector<float> line(size_t(outSamples), 0.0f);
  waitbar_open("STRIP MultiLooking");
  for (int o = 0; o < outLines; ++o) {
    if (o % 50 == 0) waitbar_update(0, 100.0f * float(o) / float(outLines));
    std::fill(block.begin(), block.end(), fcomplex(0.0f, 0.0f));
    const int rows = o == outLines - 1 ? L - a * o : a;
    if (rows > 0) {
      if (in.readbuffer(block.data(), a * o, rows, 0, 0) <= 0) {
        waitbar_close();
        return ML_FAIL("File reading failed! " + SLCInput, STATUS_READ_FAILED);
      }
    }
    for (size_t k = 0; k < block.size(); ++k) block[k] *= deramp[k];
    rangeInterp.interpft_p(block.data(), range2.data());
    azimuthInterp.interpft_p(range2.data(), az2.data());
    for (int c = 0; c < outSamples; ++c) {
      const int columns = c == outSamples - 1 ? S - r * c : r;
      double sum = 0.0;
      for (int i = 0; i < 2 * a; ++i) {
        const fcomplex* row = az2.data() + size_t(i) * 2 * S + size_t(2 * r * c);
        for (int k = 0; k < 2 * columns; ++k) sum += double(std::norm(row[k]));
      }
      line[size_t(c)] = float(std::sqrt(sum / r / a / 2.0 / 2.0));
    }
    if (out.writebuffer(line.data(), o, 1, 0, 0) <= 0) {
      waitbar_close();
      return ML_FAIL("File writing failed! " + outputFullRootName, STATUS_WRITE_FAILED);
    }
  }
  waitbar_close();
  out.close();
  in.close();
  return 0;
}

void ATstripmlook::Presum_data(const fcomplex* in, int lines, int samples, int az, int rg,
                               fcomplex* out) {
  const int outLines = lines / az, outSamples = samples / rg;
  const float n = float(az) * float(rg);
  for (int o = 0; o < outLines; ++o)
    for (int c = 0; c < outSamples; ++c) {
      std::complex<double> sum = 0.0;
      for (int i = 0; i < az; ++i)
        for (int k = 0; k < rg; ++k) {
          const fcomplex v = in[size_t(o * az + i) * samples + size_t(c * rg + k)];
          sum += std::complex<double>(v.real(), v.imag());
        }
      out[size_t(o) * outSamples + c] = fcomplex(float(sum.real() / n), float(sum.imag() / n));
    }
}

int ATstripmlook::coherml() {
  const int a = AzimuthMLFactor, r = RangeMLFactor;
  if (r < 1) {
    ORV_REPORT("Fast Undersampling factor must be >=1", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (a < 1) {
    ORV_REPORT("Slow Undersampling factor must be >=1", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (!recordRead_) return ML_FAIL("No input record read for " + SLCInput, STATUS_BAD_CONDITION);
  const int L = input.dataFile.NrOfLinesPerImage, S = input.dataFile.NrOfPixelsPerLine;
  if (L < 1 || S < 1 || input.dataFile.CellType != FLOAT_COMPLEX)
    return ML_FAIL("Input is not a complex float raster: " + SLCInput, STATUS_BAD_PARAMETER);
  const int outLines = L / a, outSamples = S / r;

  BufferFile in;
  if (!openInput(in, input, SLCInput)) return ML_FAIL("File not opened! " + SLCInput, STATUS_NOT_OPENED);
  DataFile out;
  out.filename = outputFullRootName;
  out.CellType = FLOAT_COMPLEX;
  out.NrOfLinesPerImage = outLines;
  out.NrOfPixelsPerLine = outSamples;
  out.RowPrefix = 0;
  out.HeaderOffset = 0;
  out.ByteOrder = 0;
  describeOutput(outLines, outSamples, FLOAT_COMPLEX);

  std::vector<fcomplex> rows(size_t(a) * S), averaged(size_t(std::max(outSamples, 1)));
  waitbar_open("Refine shifts started...");
  for (int o = 0; o < outLines; ++o) {
    if (o % 50 == 0) waitbar_update(0, 100.0f * float(o) / float(outLines));
    if (in.readbuffer(rows.data(), a * o, a, 0, 0) <= 0) {
      waitbar_close();
      return ML_FAIL("File reading failed! " + SLCInput, STATUS_READ_FAILED);
    }
    Presum_data(rows.data(), a, S, a, r, averaged.data());
    BufferIO io;
    io.file = &out;
    io.first_row = o;
    io.rows = 1;
    io.first_column = 0;
    io.columns = outSamples;
    io.memory_type = FLOAT_COMPLEX;
    if (int st = io.writebuffer(averaged.data()); st != 0) {
      waitbar_close();
      return ML_CALLED(st);
    }
  }
  waitbar_close();
  out.close();
  in.close();
  if (int st = output.GSwrite(outputFullRootName + ".hdr"); st != 0) return ML_CALLED(st);
  return 0;
}

int stripmlookFocusedProduct(const std::string& slc, int memory, int verbose, int reportLevel,
                             const std::string& reportFile) {
  ATstripmlook ml;
  ml.Memory = memory;
  ml.Verbose = verbose;
  ml.ReportLevel = reportLevel;
  if (!reportFile.empty()) ml.ReportFilename = reportFile;
  ml.SLCInput = slc;
  ml.outputFullRootName = slc + "_mla";
  ml.RangeMLFactor = 4;
  if (int st = ml.readSLCData(); st != 0) return ML_CALLED(st);
  const ROI_Obj& roi = ml.input.roi.roi;
  const double incidence = ml.input.geoCoords.center.Point[3] * consts::kPi / 180.0;
  const double slant = roi.FastTimeDelta * 149896229.0;
  const double azimuth = roi.SlowTimeDelta * ml.input.attitude.Eq_speed;
  const double ratio = slant / std::sin(incidence) / azimuth;
  if (!std::isfinite(ratio) || ratio <= 0.0 || ratio > 25.0)
    return ML_FAIL("No ground spacing for the multi-look factors of " + slc, STATUS_BAD_PARAMETER);
  ml.AzimuthMLFactor = 4 * static_cast<int>(std::lround(ratio));
  if (int st = ml.run(); st != 0) return ML_CALLED(st);
  return 0;
}
