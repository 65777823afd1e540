#pragma once
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include <algorithm>
#include <fstream>

#include "base/fcomplex.h"
#include "product/general_sar.h"
#include "diag/report.h"
#include "support/files.h"

using namespace support;

// A working folder per test, and rasters with their records written into it.
class FocusTest : public WorkingFolderTest {
 protected:
  // A FLOAT_COMPLEX raster with its record; a non-empty `swst` gives each row
  // the 4-byte float prefix of its sampling window start.
  void writeRaster(const std::string& name, int lines, int samples,
                   const std::vector<fcomplex>& pixels, int imageType,
                   const std::vector<float>& swst = {}, double fastStart = 1.0e-4,
                   double fastDelta = 1.0e-6, double slowStart = 1000.0,
                   double slowDelta = 1.0e-3) {
    {
      std::ofstream out(name, std::ios::binary);
      for (int l = 0; l < lines; ++l) {
        if (!swst.empty()) out.write(reinterpret_cast<const char*>(&swst[l]), 4);
        out.write(reinterpret_cast<const char*>(pixels.data() + static_cast<size_t>(l) * samples),
                  static_cast<std::streamsize>(sizeof(fcomplex)) * samples);
      }
    }
    GeneralSAR rec;
    rec.dataFile.filename = name;
    rec.dataFile.NrOfPixelsPerLine = samples;
    rec.dataFile.NrOfLinesPerImage = lines;
    rec.dataFile.RowPrefix = swst.empty() ? 0 : 4;
    rec.dataFile.HeaderOffset = 0;
    rec.dataFile.CellType = 0;
    rec.roi.roi.SetFastAxe(fastStart, fastDelta, samples);
    rec.roi.roi.SetSlowAxe(slowStart, slowDelta, lines);
    rec.dataSetInfo.SetImageType(imageType);
    rec.dataSetInfo.SWST_MIN = fastStart;
    rec.dataSetInfo.SWST_MAX = fastStart;
    if (!swst.empty()) {
      float lo = swst[0], hi = swst[0];
      for (float v : swst) {
        lo = std::min(lo, v);
        hi = std::max(hi, v);
      }
      rec.dataSetInfo.SWST_MIN = lo;
      rec.dataSetInfo.SWST_MAX = hi;
    }
    rec.sampling.frg_hz = 1.0 / fastDelta;
    rec.sampling.Trg_s = fastDelta;
    rec.sampling.prf_hz = 1.0 / slowDelta;
    rec.sampling.pri_s = slowDelta;
    for (auto o : {GeneralSAR::GS_DATAFILE, GeneralSAR::GS_ROI, GeneralSAR::GS_DATASETINFO,
                   GeneralSAR::GS_SAMPLING})
      rec.GSenable(o);
    ASSERT_EQ(rec.GSwrite(name + ".hdr"), 0);
  }
};
