#pragma once
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <cstring>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "diag/ckerr.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "product/general_sar.h"

// A scratch folder per test with reports traced into its Process.trace.
class FocusTest : public ::testing::Test {
 protected:
  void SetUp() override {
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    dir_ = std::filesystem::path(::testing::TempDir()) /
           (std::string("tessivor_focus_") + std::to_string(getpid()) + "_" +
            info->test_suite_name() + "_" + info->name());
    std::filesystem::remove_all(dir_);
    std::filesystem::create_directories(dir_);
    working_ = dir_.string() + "/";
    setenv("TESSIVOR_WORKING_DIR", working_.c_str(), 1);
    setenv("TESSIVOR_WORKING_FILE", "progress.txt", 1);
    setenv("TESSIVOR_CEOS_DES_FILES_DIR", TESSIVOR_SOURCE_DIR "/resources/", 1);
    setenv("TESSIVOR_TRACING", "ACTIVE", 1);
    resetEnvironment();
    exit_ckerr();
    set_flg_report(0);
    if (reports_) {
      initEnvironment();
      init_ckerr_locking();
      init_report(0, "TEST", 1);
    }
  }
  void TearDown() override {
    resetEnvironment();
    exit_ckerr();
    set_flg_report(0);
    std::filesystem::remove_all(dir_);
  }

  std::string path(const std::string& name) const { return working_ + name; }
  std::string trace() const { return readText(working_ + "Process.trace"); }
  bool traced(const std::string& text) const { return trace().find(text) != std::string::npos; }

  static std::string readText(const std::string& file) {
    std::ifstream in(file, std::ios::binary);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
  }
  static void writeText(const std::string& file, const std::string& text) {
    std::ofstream(file, std::ios::binary) << text;
  }
  static std::vector<fcomplex> readComplex(const std::string& file) {
    std::ifstream in(file, std::ios::binary);
    std::vector<char> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    std::vector<fcomplex> out(bytes.size() / sizeof(fcomplex));
    std::memcpy(out.data(), bytes.data(), out.size() * sizeof(fcomplex));
    return out;
  }

  // A FLOAT_COMPLEX raster with its record: `prefix` 4 gives each row the
  // float sampling window start of swst[row].
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

  std::filesystem::path dir_;
  std::string working_;
  bool reports_ = true;
};
