#pragma once
// Scratch folders that disappear with the test that made them, file helpers,
// and a working-folder fixture with the run-time environment of the focuser.
#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>
#include <string>
#include <vector>

#include "base/fcomplex.h"

namespace support {

namespace fs = std::filesystem;

// A fresh folder (path ending in '/') under the test temporary folder, named
// after the tag and the running test. It is removed when the running test
// ends, or when the program ends if no test is running. Setting
// TESSIVOR_KEEP_TEST_FILES keeps it, to look at the files of a failed run.
std::string scratchDir(const std::string& tag);

// The same as an object: removed with the object (or at the end of the test).
class TempFolder {
 public:
  explicit TempFolder(const std::string& tag = "tmp");
  ~TempFolder();
  TempFolder(const TempFolder&) = delete;
  TempFolder& operator=(const TempFolder&) = delete;
  // Path of a name inside the folder; str() ends with '/', path() does not.
  std::string operator/(const std::string& name) const { return dir_ + name; }
  const std::string& str() const { return dir_; }
  std::string path() const { return dir_.substr(0, dir_.size() - 1); }

 private:
  std::string dir_;
};

std::string readText(const std::string& file);
void writeText(const std::string& file, const std::string& text);  // makes the parent folders
std::vector<unsigned char> readBytes(const std::string& file);
// The whole file as cells of T (a trailing part cell is dropped).
template <class T>
std::vector<T> readValues(const std::string& file) {
  const std::vector<unsigned char> bytes = readBytes(file);
  std::vector<T> out(bytes.size() / sizeof(T));
  std::memcpy(out.data(), bytes.data(), out.size() * sizeof(T));
  return out;
}
inline std::vector<fcomplex> readComplex(const std::string& file) { return readValues<fcomplex>(file); }
inline bool contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

inline const char* sourceDir() { return TESSIVOR_SOURCE_DIR; }
inline const char* resourcesDir() { return TESSIVOR_SOURCE_DIR "/resources/"; }
inline const char* binDir() { return TESSIVOR_BINARY_DIR "/bin/"; }
// Genuine mission files (absent on machines without the data set).
inline const char* realData() { return TESSIVOR_REALDATA_DIR; }
inline bool realDataPresent() { return fs::is_directory(TESSIVOR_REALDATA_DIR); }

// A test with a scratch folder of its own: path() names a file in it, make()
// writes one and returns its path, slurp() reads a file back.
class ScratchFolderTest : public ::testing::Test {
 protected:
  std::string path(const std::string& name) const { return dir / name; }
  std::string make(const std::string& name, const std::string& text) const {
    writeText(path(name), text);
    return path(name);
  }
  static std::string slurp(const std::string& file) { return readText(file); }
  TempFolder dir{"params"};
};

// A working folder per test with the focuser's environment variables (working
// folder, progress file, catalogues of the source tree, tracing on); the
// report, error and environment state starts and ends empty. With
// startReports_ false, SetUp leaves the reports closed.
class WorkingFolderTest : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  std::string path(const std::string& name) const { return working_ + name; }
  std::string trace() const { return readText(working_ + "Process.trace"); }
  bool traced(const std::string& text) const { return contains(trace(), text); }

  bool startReports_ = true;
  std::string working_;
};

}  // namespace support
