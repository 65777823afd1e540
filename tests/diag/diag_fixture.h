#pragma once
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include "diag/ckerr.h"
#include "diag/environment.h"
#include "diag/report.h"

// A working folder of its own for each test, with tracing on and the
// catalogues of the source tree; the environment is reset afterwards.
class DiagEnvironment : public ::testing::Test {
 protected:
  void SetUp() override {
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    dir_ = std::filesystem::path(::testing::TempDir()) /
           (std::string("tessivor_diag_") + std::to_string(getpid()) + "_" + info->test_suite_name() +
            "_" + info->name());
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
    if (startEnvironment_) {
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

  static std::string readText(const std::string& file) {
    std::ifstream in(file, std::ios::binary);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
  }
  static void writeText(const std::string& file, const std::string& text) {
    std::ofstream(file, std::ios::binary) << text;
  }
  static bool exists(const std::string& file) { return std::filesystem::exists(file); }

  bool startEnvironment_ = true;
  std::filesystem::path dir_;
  std::string working_;
};
