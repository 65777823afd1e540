#include "files.h"

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <sstream>

#include "diag/ckerr.h"
#include "diag/environment.h"
#include "diag/report.h"

namespace support {

namespace {

bool keepFiles() { return std::getenv("TESSIVOR_KEEP_TEST_FILES") != nullptr; }

void removeAll(std::vector<std::string>& dirs) {
  std::error_code ec;
  if (!keepFiles())
    for (const auto& d : dirs) fs::remove_all(d, ec);
  dirs.clear();
}

// Folders made during the running test (or outside any test), removed when
// it ends (or at exit), by the process that made them only: a child that
// exits inside a death test leaves them to its parent.
struct Made {
  std::vector<std::string> inTest, outside;
  pid_t owner = ::getpid();
  ~Made() {
    if (::getpid() != owner) return;
    removeAll(inTest);
    removeAll(outside);
  }
};
Made& made() {
  static Made m;
  return m;
}

class Cleaner : public ::testing::EmptyTestEventListener {
  void OnTestEnd(const ::testing::TestInfo&) override {
    if (::getpid() == made().owner) removeAll(made().inTest);
  }
};

const bool kCleanerInstalled = [] {
  ::testing::UnitTest::GetInstance()->listeners().Append(new Cleaner);
  return true;
}();

}  // namespace

std::string scratchDir(const std::string& tag) {
  (void)kCleanerInstalled;
  const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
  std::string name = "tessivor_" + tag + "_" + std::to_string(::getpid());
  if (info) name += std::string("_") + info->test_suite_name() + "_" + info->name();
  // Parametrised tests name themselves "Prefix/Suite" and "Test/Param": one folder, not a tree.
  std::replace(name.begin(), name.end(), '/', '_');
  fs::path dir = fs::path(::testing::TempDir()) / name;
  for (int n = 2; fs::exists(dir); ++n) dir = fs::path(::testing::TempDir()) / (name + "_" + std::to_string(n));
  fs::create_directories(dir);
  (info ? made().inTest : made().outside).push_back(dir.string());
  return dir.string() + "/";
}

TempFolder::TempFolder(const std::string& tag) : dir_(scratchDir(tag)) {}

TempFolder::~TempFolder() {
  std::error_code ec;
  if (!keepFiles() && ::getpid() == made().owner) fs::remove_all(dir_, ec);
}

std::string readText(const std::string& file) {
  std::ifstream in(file, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

void writeText(const std::string& file, const std::string& text) {
  const fs::path parent = fs::path(file).parent_path();
  if (!parent.empty()) fs::create_directories(parent);
  std::ofstream(file, std::ios::binary) << text;
}

std::vector<unsigned char> readBytes(const std::string& file) {
  std::ifstream in(file, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

void WorkingFolderTest::SetUp() {
  working_ = scratchDir("work");
  setenv("TESSIVOR_WORKING_DIR", working_.c_str(), 1);
  setenv("TESSIVOR_WORKING_FILE", "progress.txt", 1);
  setenv("TESSIVOR_CEOS_DES_FILES_DIR", resourcesDir(), 1);
  setenv("TESSIVOR_TRACING", "ACTIVE", 1);
  resetEnvironment();
  exit_ckerr();
  set_flg_report(0);
  if (startReports_) {
    initEnvironment();
    init_ckerr_locking();
    init_report(0, "TEST", 1);
  }
}

void WorkingFolderTest::TearDown() {
  resetEnvironment();
  exit_ckerr();
  set_flg_report(0);
}

}  // namespace support
