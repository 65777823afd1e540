#pragma once
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

// Folders made by the tests, removed when the test program ends.
struct TestFolders {
  std::vector<std::filesystem::path> made;
  ~TestFolders() {
    std::error_code ec;
    for (const auto& dir : made) std::filesystem::remove_all(dir, ec);
  }
};
inline TestFolders& testFolders() {
  static TestFolders folders;
  return folders;
}

// A fresh folder under the test temp folder for each test.
inline std::string freshFolder(const std::string& name) {
  const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
  std::filesystem::path dir = std::filesystem::path(::testing::TempDir()) /
                              ("tessivor_job_" + std::to_string(getpid()) + "_" + name + "_" + info->name());
  std::filesystem::remove_all(dir);
  std::filesystem::create_directories(dir);
  testFolders().made.push_back(dir);
  return dir.string() + "/";
}

inline std::string readText(const std::string& file) {
  std::ifstream in(file, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

inline void writeText(const std::string& file, const std::string& text) {
  std::ofstream(file, std::ios::binary) << text;
}

// A job file: an ignored first line, then one parameter a line.
inline void writeJob(const std::string& file, const std::vector<std::string>& parameters) {
  std::string text = "focusing job\n";
  for (const auto& p : parameters) text += p + "\n";
  writeText(file, text);
}

// The 24 parameters of a job on a platform, with nothing optional given.
inline std::vector<std::string> jobParameters(const std::string& platform, const std::string& scene) {
  std::vector<std::string> p;
  for (int i = 0; i < 24; ++i) {
    if (i == 0) p.push_back(platform);
    else if (i == 1) p.push_back(scene);
    else if (i == 5) p.emplace_back("/tmp/out");
    else if (i == 16 || i == 17) p.emplace_back("0");
    else p.emplace_back("NotOK");
  }
  return p;
}
