// A stack of four small simulated ERS scenes, one of them damaged, through
// stripmap_batch: side by side on this machine, again for the failed scene
// only, stopped by a signal and by a stop request, and as a Slurm job array
// on a one-node cluster started on this machine. Products are measured with
// sarpta.
#include <fcntl.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <map>
#include <regex>
#include <sstream>
#include <thread>

#include "support/files.h"
#include "support/host_run.h"
#include "support/point_targets.h"

using namespace support;

namespace {

constexpr int kScenes = 4;
constexpr int kDamaged = 3;  // index of the scene whose image file is cut short

std::string batchPath() { return std::string(binDir()) + "stripmap_batch"; }
const char* clusterScript() { return TESSIVOR_SOURCE_DIR "/scripts/slurm/local_cluster.sh"; }

// Scene i of the stack: the same track, its own clutter and centroid.
SceneDescription stackScene(int i) {
  SceneDescription s = ersScene(4096, 1536, 150.0 + 20.0 * i);
  s.pixelTargets = {{1500.25, 300.5, 0.0, 4.0}, {2048.0, 500.0, 120.0, 4.0},
                    {2600.75, 700.25, 0.0, 4.0}};
  s.clutterSigma = 1.0;
  s.seed = 100 + i;
  return s;
}

struct Stack {
  std::vector<SensorScene> scenes;
};

// Simulates the stack under dir/scene_<i>/; the damaged scene's image file is
// cut in the middle of a line, which ends its extraction with 130560.
void simulateStack(const TempFolder& dir, Stack& stack) {
  stack.scenes.resize(kScenes);
  for (int i = 0; i < kScenes; ++i) {
    std::string error;
    const std::string folder = dir / ("scene_" + std::to_string(i)) + "/";
    fs::create_directories(folder);
    ASSERT_TRUE(simulateErs(stackScene(i), folder, stack.scenes[i], error)) << error;
  }
  const std::string image = stack.scenes[kDamaged]["image"];
  fs::resize_file(image, fs::file_size(image) / 2 + 7);
}

// One job file per scene in dir/<jobs>/, products under dir/<products>/.
std::string writeJobs(const TempFolder& dir, const Stack& stack, const std::string& jobs,
                      const std::string& products) {
  fs::create_directories(dir / jobs);
  fs::create_directories(dir / products);
  for (int i = 0; i < kScenes; ++i)
    writeJob(dir / (jobs + "/scene_" + std::to_string(i) + ".txt"),
             ersJob(stack.scenes[i], dir / (products + "/scene_" + std::to_string(i))));
  return dir / jobs;
}

struct BatchRun {
  int exitStatus = -1;
  std::string output;
};

// Runs stripmap_batch with the arguments and the given extra variables; the
// hook is called every 100 ms with the batch's process id while it runs.
BatchRun runBatch(const std::vector<std::string>& args, const std::string& logFile,
                  const std::map<std::string, std::string>& variables = {},
                  const std::function<void(pid_t)>& hook = nullptr) {
  const pid_t pid = fork();
  if (pid == 0) {
    setenv("TESSIVOR_CEOS_DES_FILES_DIR", resourcesDir(), 1);
    for (const auto& [name, value] : variables) setenv(name.c_str(), value.c_str(), 1);
    const int fd = open(logFile.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    if (fd >= 0) {
      dup2(fd, STDOUT_FILENO);
      dup2(fd, STDERR_FILENO);
    }
    std::vector<char*> argv = {const_cast<char*>("stripmap_batch")};
    for (const std::string& a : args) argv.push_back(const_cast<char*>(a.c_str()));
    argv.push_back(nullptr);
    execv(batchPath().c_str(), argv.data());
    _exit(127);
  }
  BatchRun run;
  int status = 0;
  const auto started = std::chrono::steady_clock::now();
  while (waitpid(pid, &status, WNOHANG) == 0) {
    if (hook) hook(pid);
    if (std::chrono::steady_clock::now() - started > std::chrono::minutes(10)) {
      kill(pid, SIGKILL);
      waitpid(pid, &status, 0);
      ADD_FAILURE() << "stripmap_batch still running after 10 minutes";
      break;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
  }
  run.exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  run.output = readText(logFile);
  return run;
}

// The summary's CSV line of a scene, split at its commas (no field of these
// scenes holds a comma).
std::map<std::string, std::string> summaryRow(const std::string& batch, const std::string& scene) {
  std::istringstream csv(readText(batch + "/summary.csv"));
  std::string header, line;
  std::getline(csv, header);
  auto split = [](const std::string& text) {
    std::vector<std::string> fields;
    std::stringstream s(text);
    std::string f;
    while (std::getline(s, f, ',')) fields.push_back(f);
    if (!text.empty() && text.back() == ',') fields.push_back("");
    return fields;
  };
  const std::vector<std::string> keys = split(header);
  while (std::getline(csv, line)) {
    const std::vector<std::string> values = split(line);
    if (values.empty() || values[0] != scene) continue;
    std::map<std::string, std::string> row;
    for (std::size_t k = 0; k < keys.size() && k < values.size(); ++k) row[keys[k]] = values[k];
    return row;
  }
  return {};
}

std::string sceneName(int i) { return "scene_" + std::to_string(i); }

// The three sound scenes have their products, every target within a tenth of
// a pixel of the truth; the damaged one is reported with its full code
// (130560, of which the parent sees only 0) and has no product.
void expectStackOutcome(const TempFolder& dir, const Stack& stack, const std::string& batch,
                        const std::string& products, const std::string& runnerPrefix) {
  for (int i = 0; i < kScenes; ++i) {
    SCOPED_TRACE(sceneName(i));
    const auto row = summaryRow(batch, sceneName(i));
    ASSERT_FALSE(row.empty()) << readText(batch + "/summary.csv");
    EXPECT_EQ(row.at("runner").rfind(runnerPrefix, 0), 0u) << row.at("runner");
    EXPECT_GT(std::stod(row.at("wall_seconds")), 0.0);
    // The focuser's own peak (its blocks take some 100 MB here), not the batch's.
    EXPECT_GT(std::stod(row.at("peak_memory_mb")), i == kDamaged ? 1.0 : 50.0);
    const std::string product = dir / (products + "/" + sceneName(i) + "_slc");
    if (i == kDamaged) {
      EXPECT_EQ(row.at("state"), "failed");
      EXPECT_EQ(row.at("exit_code"), "130560");
      EXPECT_EQ(row.at("exit_status"), "0");
      EXPECT_EQ(row.at("error"), "FOCUSSING STAGE FAILED");
      EXPECT_EQ(row.at("products"), "");
      EXPECT_FALSE(fs::exists(product));
      continue;
    }
    EXPECT_EQ(row.at("state"), "success");
    EXPECT_EQ(row.at("exit_code"), "0");
    EXPECT_TRUE(contains(row.at("products"), product + ".TessivorParameterExtracted"));
    const PtaReport pta = analyseProduct(dir.str(), product, product + ".TessivorParameterExtracted",
                                         stack.scenes[i].truth);
    ASSERT_EQ(pta.exitStatus, 0) << pta.table;
    ASSERT_EQ(pta.targets.size(), 3u) << pta.table;
    for (const PtaTarget& t : pta.targets) EXPECT_TRUE(t.found) << pta.table;
    expectTruthPositions(pta, 0.0, false);
  }
  const std::string json = readText(batch + "/summary.json");
  EXPECT_TRUE(contains(json, "\"succeeded\": 3")) << json;
  EXPECT_TRUE(contains(json, "\"exit_code\": 130560")) << json;
}

// A one-node Slurm cluster for the length of a test, stopped by the
// destructor whatever the test's outcome.
class LocalCluster {
 public:
  explicit LocalCluster(const std::string& dir) : dir_(dir) {
    // A port of this process's own, so that clusters of runs side by side do not meet.
    const std::string port = std::to_string(17000 + 2 * (getpid() % 4000));
    const std::string command = std::string("SLURM_LOCAL_INSTALL=1 SLURM_LOCAL_PORT=") + port + " " +
                                clusterScript() + " start '" + dir + "' > '" + dir + ".log' 2>&1";
    const int status = std::system(command.c_str());
    up_ = WIFEXITED(status) && WEXITSTATUS(status) == 0;
    message_ = readText(dir + ".log");
    std::error_code ec;
    fs::remove(dir + ".log", ec);
  }
  ~LocalCluster() {
    const std::string command = std::string(clusterScript()) + " stop '" + dir_ + "' > /dev/null 2>&1";
    if (std::system(command.c_str()) != 0) ADD_FAILURE() << "the cluster in " << dir_ << " did not stop";
  }
  LocalCluster(const LocalCluster&) = delete;
  LocalCluster& operator=(const LocalCluster&) = delete;
  bool up() const { return up_; }
  const std::string& message() const { return message_; }
  std::string conf() const { return dir_ + "/slurm.conf"; }

 private:
  std::string dir_;
  bool up_ = false;
  std::string message_;
};

}  // namespace

TEST(BatchRun, StackOnThisMachineThenOnlyTheRepairedSceneThenStops) {
  TempFolder dir("batch");
  Stack stack;
  simulateStack(dir, stack);
  if (HasFatalFailure()) return;
  const std::string jobs = writeJobs(dir, stack, "jobs", "products");
  const std::string batch = dir / "batch";

  // Two at a time; the damaged scene fails alone and the batch says so.
  const BatchRun first = runBatch({"--local", "2", "--out", batch, jobs}, dir / "first.log");
  EXPECT_EQ(first.exitStatus, 1) << first.output;
  expectStackOutcome(dir, stack, batch, "products", "local");
  // Each scene ran in a working folder of its own, with its own logs.
  for (int i = 0; i < kScenes; ++i) {
    const std::string work = batch + "/work/" + sceneName(i) + "/";
    EXPECT_TRUE(contains(readText(work + "Process.log"), i == kDamaged ? "[ERROR ID : 130560]" : "SUCCESSFUL"));
    EXPECT_EQ(fs::exists(work + "Tessivor_progress.txt_error"), i == kDamaged);
    // The Doppler log goes to the run's current folder: one per scene.
    EXPECT_EQ(fs::exists(work + "DCEST_resume.txt"), i != kDamaged);
  }
  // The runs were followed stage by stage, and the table of the last state
  // has one line per scene.
  EXPECT_TRUE(std::regex_search(first.output, std::regex("scene_0 +[0-9]+%  Azimuth Focusing")))
      << first.output;
  const std::string table = readText(batch + "/progress.txt");
  for (int i = 0; i < kScenes; ++i)
    EXPECT_TRUE(std::regex_search(table, std::regex(sceneName(i) + "\t[^\n]*\t" +
                                                    (i == kDamaged ? "failed" : "success") + "\n")))
        << table;

  // The damaged scene repaired: a rerun runs it alone.
  std::map<int, std::string> records;
  for (int i = 0; i < kScenes; ++i) records[i] = readText(batch + "/work/" + sceneName(i) + "/batch_run.txt");
  {
    std::string error;
    SensorScene repaired;
    ASSERT_TRUE(simulateErs(stackScene(kDamaged), dir / sceneName(kDamaged) + "/", repaired, error)) << error;
  }
  const BatchRun rerun = runBatch({"--out", batch, "--quiet"}, dir / "rerun.log");
  EXPECT_EQ(rerun.exitStatus, 0) << rerun.output << readText(batch + "/summary.csv");
  for (int i = 0; i < kScenes; ++i) {
    const std::string record = readText(batch + "/work/" + sceneName(i) + "/batch_run.txt");
    if (i == kDamaged) EXPECT_NE(record, records[i]);
    else EXPECT_EQ(record, records[i]) << sceneName(i) << " ran again";
    EXPECT_EQ(summaryRow(batch, sceneName(i)).at("state"), "success") << sceneName(i);
  }

  // Everything again, one at a time, stopped by SIGTERM once the first scene
  // runs and reports progress: it ends with the operator's code, the others
  // do not start and keep their products.
  bool signalled = false;
  const BatchRun stopped = runBatch(
      {"--local", "1", "--all", "--out", batch, jobs}, dir / "stop.log", {}, [&](pid_t pid) {
        if (signalled) return;
        const std::string work = batch + "/work/" + sceneName(0) + "/";
        if (!contains(readText(work + "batch_run.txt"), "state = running") ||
            !fs::exists(work + "Tessivor_progress.txt"))
          return;
        kill(pid, SIGTERM);
        signalled = true;
      });
  ASSERT_TRUE(signalled) << stopped.output;
  EXPECT_EQ(stopped.exitStatus, 1) << stopped.output;
  const auto row = summaryRow(batch, sceneName(0));
  EXPECT_EQ(row.at("state"), "stopped") << stopped.output;
  EXPECT_EQ(row.at("exit_code"), "326400");
  EXPECT_TRUE(contains(stopped.output, sceneName(1) + " ")) << stopped.output;
  EXPECT_TRUE(contains(stopped.output, "not started")) << stopped.output;
  for (int i = 1; i < kScenes; ++i)
    EXPECT_EQ(summaryRow(batch, sceneName(i)).at("state"), "success") << sceneName(i);

  // Two at a time, stopped from another process once both run.
  auto runs = [&](int i) {
    const std::string work = batch + "/work/" + sceneName(i) + "/";
    return contains(readText(work + "batch_run.txt"), "state = running") &&
           fs::exists(work + "Tessivor_progress.txt");
  };
  bool asked = false;
  const BatchRun second = runBatch(
      {"--local", "2", "--all", "--out", batch, jobs}, dir / "stop2.log", {}, [&](pid_t) {
        if (asked || !runs(0) || !runs(1)) return;
        const BatchRun stop = runBatch({"--out", batch, "--stop"}, dir / "stop_command.log");
        EXPECT_EQ(stop.exitStatus, 0) << stop.output;
        EXPECT_TRUE(contains(stop.output, "stop value written for 2 running scenes")) << stop.output;
        asked = true;
      });
  ASSERT_TRUE(asked) << second.output;
  EXPECT_EQ(second.exitStatus, 1) << second.output;
  for (int i = 0; i < kScenes; ++i)
    EXPECT_EQ(summaryRow(batch, sceneName(i)).at("state"), i < 2 ? "stopped" : "success") << sceneName(i);
}

TEST(BatchRun, JobsThatWouldShareProductsOrDoNotExistAreRefusedBeforeAnyRun) {
  TempFolder dir("refused");
  SensorScene files;
  files.files = {{"image", dir / "scene.dat"}, {"orbit", ""}, {"leader", ""}};
  writeJob(dir / "a.txt", ersJob(files, dir / "out"));
  writeJob(dir / "b.txt", ersJob(files, dir / "sub/../out"));
  const BatchRun shared = runBatch({"--out", dir / "batch", dir / "a.txt", dir / "b.txt"}, dir / "shared.log");
  EXPECT_EQ(shared.exitStatus, 2);
  EXPECT_TRUE(contains(shared.output, dir / "a.txt") && contains(shared.output, dir / "b.txt") &&
              contains(shared.output, "write the same products"))
      << shared.output;
  const BatchRun missing = runBatch({"--out", dir / "batch", dir / "c.txt"}, dir / "missing.log");
  EXPECT_EQ(missing.exitStatus, 2);
  EXPECT_TRUE(contains(missing.output, "job file not found: " + dir / "c.txt")) << missing.output;
  EXPECT_FALSE(fs::exists(dir / "batch/work/a"));
}

TEST(BatchRun, SlurmArrayGivesTheProductsOfTheLocalRun) {
  TempFolder dir("slurm");
  // A folder of its own, near the top: munge's socket path inside it must
  // stay under 100 characters.
  const TempFolder clusterDir("cluster");
  LocalCluster cluster(clusterDir.path());
  if (!cluster.up()) GTEST_SKIP() << "no one-node Slurm cluster can start here: " << cluster.message();
  Stack stack;
  simulateStack(dir, stack);
  if (HasFatalFailure()) return;
  const std::string localJobs = writeJobs(dir, stack, "jobs_local", "local");
  const std::string slurmJobs = writeJobs(dir, stack, "jobs_slurm", "slurm");

  const BatchRun local = runBatch({"--local", "2", "--quiet", "--out", dir / "batch_local", localJobs},
                                  dir / "local.log");
  EXPECT_EQ(local.exitStatus, 1) << local.output;
  // One array, and one chained after it that reruns the failed task.
  const BatchRun slurm = runBatch({"--slurm", "--retries", "1", "--out", dir / "batch_slurm", slurmJobs},
                                  dir / "slurm.log", {{"SLURM_CONF", cluster.conf()}});
  EXPECT_EQ(slurm.exitStatus, 1) << slurm.output;
  expectStackOutcome(dir, stack, dir / "batch_slurm", "slurm", "slurm ");

  std::smatch ids;
  ASSERT_TRUE(std::regex_search(slurm.output, ids,
                                std::regex(R"(job array (\d+) [^\n]*\n[^\n]*job array (\d+) )")))
      << slurm.output;
  for (int i = 0; i < kScenes; ++i) {
    SCOPED_TRACE(sceneName(i));
    // The sound scenes ran once, in the first array; the damaged one was run
    // again by the chained array.
    const std::string runner = summaryRow(dir / "batch_slurm", sceneName(i)).at("runner");
    EXPECT_EQ(runner, "slurm " + (i == kDamaged ? ids[2].str() : ids[1].str()) + "_" + std::to_string(i));
    if (i == kDamaged) continue;
    const std::string a = readText(dir / ("local/" + sceneName(i) + "_slc"));
    const std::string b = readText(dir / ("slurm/" + sceneName(i) + "_slc"));
    EXPECT_FALSE(a.empty());
    EXPECT_TRUE(a == b) << "the Slurm product differs from the local one";
  }
}
