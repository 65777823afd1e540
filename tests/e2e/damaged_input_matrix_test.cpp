// Damaged inputs of an ERS job that no other case covers, one row each:
// empty job files, truncated, corrupted and wrong-type files of each role,
// an output folder that cannot be written. Every run ends with its report,
// its code and no crash, and leaves the inputs as they were.
#include <gtest/gtest.h>

#include <functional>

#include "support/files.h"
#include "support/host_run.h"

using namespace support;

namespace {

struct DamageCase {
  const char* name;
  // Damages the scene's files or the job; `dir` is the case's folder.
  std::function<void(const SensorScene&, Job&, const TempFolder&)> damage;
  int code;              // of the _error file
  const char* message;   // in the process log, or in the _error file
};

void cut(const std::string& file, double fraction) {
  fs::resize_file(file, std::uintmax_t(double(fs::file_size(file)) * fraction));
}

void overwrite(const std::string& file, std::uintmax_t offset, const std::string& bytes) {
  std::fstream f(file, std::ios::in | std::ios::out | std::ios::binary);
  f.seekp(std::streamoff(offset));
  f.write(bytes.data(), std::streamsize(bytes.size()));
}

const DamageCase kCases[] = {
    {"EmptyJobFile", [](const SensorScene&, Job& job, const TempFolder&) { job.clear(); },
     EC_FILE_NOT_FOUND, "job.txt"},
    {"JobOfBlankLines", [](const SensorScene&, Job& job, const TempFolder&) { job.assign(24, ""); },
     1, "Unknown platform"},
    {"TruncatedLeader", [](const SensorScene& s, Job&, const TempFolder&) { cut(s["leader"], 0.1); },
     EC_STAGE_FAILED, "File reading failed!"},
    {"CorruptedLeaderPrf", [](const SensorScene& s, Job&, const TempFolder&) { overwrite(s["leader"], 720 + 934, "               0"); },
     EC_STAGE_FAILED, "Bad PRF in the leader file"},
    {"EmptyImage", [](const SensorScene& s, Job&, const TempFolder&) { cut(s["image"], 0.0); },
     EC_STAGE_FAILED, "File reading failed!"},
    {"LeaderGivenAsImage", [](const SensorScene& s, Job& job, const TempFolder&) { job[1] = s["leader"]; },
     EC_STAGE_FAILED, "Bad record count or line length in the image file"},
    {"TruncatedOrbit", [](const SensorScene& s, Job&, const TempFolder&) { cut(s["orbit"], 0.05); },
     EC_STAGE_FAILED, "File reading failed!"},
    {"LeaderGivenAsOrbit", [](const SensorScene& s, Job& job, const TempFolder&) { job[6] = s["leader"]; },
     EC_STAGE_FAILED, "is not a DEOS orbit file"},
    {"UnwritableOutputFolder",
     [](const SensorScene&, Job& job, const TempFolder& dir) {
       writeText(dir / "plain_file", "x");
       job[5] = dir / "plain_file/out";
     },
     EC_STAGE_FAILED, "File not opened!"},
};

// The row's name in test listings (not the bytes of the case).
void PrintTo(const DamageCase& c, std::ostream* os) { *os << c.name; }

class DamagedErsInput : public testing::TestWithParam<DamageCase> {};

}  // namespace

TEST_P(DamagedErsInput, EndsWithItsReportAndLeavesTheInputs) {
  const DamageCase& c = GetParam();
  TempFolder dir("damaged");
  SceneDescription scene = ersScene(256, 1024, 300.0);
  scene.pixelTargets.push_back({128.0, 500.0, 0.0, 4.0});
  SensorScene files;
  std::string error;
  ASSERT_TRUE(simulateErs(scene, dir.str(), files, error)) << error;
  Job job = ersJob(files, dir / "out");
  c.damage(files, job, dir);
  std::map<std::string, std::string> before;
  for (const auto& [role, path] : files.files)
    if (fs::is_regular_file(path)) before[role] = readText(path);
  writeJob(dir / "job.txt", job);
  if (job.empty()) writeText(dir / "job.txt", "");

  const FocuserRun run = runFocuser(dir.str(), dir / "job.txt");
  EXPECT_FALSE(run.signalled);
  EXPECT_EQ(run.exitStatus, c.code & 0xFF);
  EXPECT_EQ(run.errorCode, c.code) << run.errorFile;
  EXPECT_TRUE(contains(run.log + run.errorFile, c.message)) << run.log << run.errorFile;
  for (const auto& [role, bytes] : before) EXPECT_EQ(readText(files[role]), bytes) << role;
  EXPECT_FALSE(fs::exists(dir / "out_slc"));
}

INSTANTIATE_TEST_SUITE_P(Rows, DamagedErsInput, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<DamageCase>& info) { return std::string(info.param.name); });
