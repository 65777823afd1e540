// Scenes of a batch: job files, working folders, memory budgets, run records.
#include "batch/batch_job.h"

#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <sstream>

#include "diag/environment.h"
#include "diag/parameter_lines.h"
#include "job/focusing_job.h"
#include "product/profile.h"

namespace batch {

namespace {

const std::set<std::string> kPlatforms = {"ENVISAT", "RADARSAT", "ERS", "PALSAR",
                                          "PALSAR_ERSDAC"};

std::string readAll(const fs::path& file) {
  std::ifstream in(file, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

// A job's parameters (line 2 on) as the focuser reads them.
bool jobParameters(const fs::path& file, std::vector<std::string>& parameters) {
  std::vector<std::string> lines;
  if (!readParameterLines(file.string(), lines) || lines.size() < 2) return false;
  parameters.assign(lines.begin() + 1, lines.end());
  return true;
}

// A name usable as a folder name: the job file's stem with anything but
// letters, digits, '.', '-' and '_' replaced.
std::string folderName(const fs::path& jobFile) {
  std::string name = jobFile.stem().string();
  for (char& c : name)
    if (!std::isalnum(static_cast<unsigned char>(c)) && c != '.' && c != '-' && c != '_') c = '_';
  return name.empty() ? std::string("job") : name;
}

}  // namespace

fs::path Job::outputRootPath() const {
  if (outputRoot.empty() || outputRoot == "NotOK") return {};
  fs::path root(outputRoot);
  return root.is_absolute() ? root : workDir / root;
}

fs::path Job::productFile() const {
  const fs::path root = outputRootPath();
  return root.empty() ? root : fs::path(root.string() + "_slc");
}

fs::path Job::parameterStore() const {
  const fs::path product = productFile();
  return product.empty() ? product : fs::path(product.string() + ".TessivorParameterExtracted");
}

std::vector<fs::path> Job::products() const {
  std::vector<fs::path> found;
  const fs::path root = outputRootPath();
  if (root.empty()) return found;
  std::error_code ec;
  const fs::path folder = root.has_parent_path() ? root.parent_path() : fs::path(".");
  const std::string stem = root.filename().string();
  for (const auto& entry : fs::directory_iterator(folder, ec)) {
    const std::string name = entry.path().filename().string();
    const bool ours = name.rfind(stem + "_slc", 0) == 0 || name.rfind(stem + "_mla", 0) == 0;
    if (ours && entry.is_regular_file(ec)) found.push_back(entry.path());
  }
  std::sort(found.begin(), found.end());
  return found;
}

bool RunRecord::read(const fs::path& file) {
  *this = RunRecord{};
  std::ifstream in(file);
  if (!in) return false;
  std::string line;
  while (std::getline(in, line)) {
    const std::size_t eq = line.find(" = ");
    if (eq == std::string::npos) continue;
    const std::string key = line.substr(0, eq), value = line.substr(eq + 3);
    if (key == "state") finished = value == "finished";
    else if (key == "started") started = std::strtod(value.c_str(), nullptr);
    else if (key == "wall_seconds") wallSeconds = std::strtod(value.c_str(), nullptr);
    else if (key == "peak_memory_kb") peakMemoryKb = std::strtol(value.c_str(), nullptr, 10);
    else if (key == "exit_status") exitStatus = std::atoi(value.c_str());
    else if (key == "signal") signal = std::atoi(value.c_str());
    else if (key == "host") host = value;
    else if (key == "runner") runner = value;
  }
  present = true;
  return true;
}

bool RunRecord::write(const fs::path& file) const {
  char text[512];
  std::snprintf(text, sizeof text,
                "state = %s\nstarted = %.3f\nwall_seconds = %.3f\npeak_memory_kb = %ld\n"
                "exit_status = %d\nsignal = %d\n",
                finished ? "finished" : "running", started, wallSeconds, peakMemoryKb, exitStatus,
                signal);
  return writeAtomically(file, std::string(text) + "host = " + host + "\nrunner = " + runner + "\n");
}

ErrorReport readErrorReport(const fs::path& file) {
  ErrorReport report;
  std::error_code ec;
  if (!fs::exists(file, ec)) return report;
  report.present = true;
  const std::string text = readAll(file);
  report.group = text.substr(0, text.find('\n'));
  std::smatch m;
  if (std::regex_search(text, m, std::regex(R"(\[EC : (-?\d+)\])"))) report.code = std::stoi(m[1]);
  return report;
}

const char* stateName(SceneState state) {
  switch (state) {
    case SceneState::Success: return "success";
    case SceneState::Failed: return "failed";
    case SceneState::Stopped: return "stopped";
    case SceneState::Running: return "running";
    case SceneState::NotRun: return "not run";
  }
  return "?";
}

SceneState sceneState(const Job& job, const RunRecord& record, const ErrorReport& error) {
  if (!record.present) return SceneState::NotRun;
  if (!record.finished) return SceneState::Running;
  // The parent sees only the low 8 bits of the code (130560 arrives as 0):
  // the _error file is the failure signal.
  if (error.present) return error.code == 326400 ? SceneState::Stopped : SceneState::Failed;
  if (record.signal != 0 || record.exitStatus != 0) return SceneState::Failed;
  std::error_code ec;
  if (!fs::exists(job.productFile(), ec) || !fs::exists(job.parameterStore(), ec))
    return SceneState::Failed;
  return SceneState::Success;
}

int memoryBudgetMb(const std::string& platform, const std::string& scene) {
  if (!kPlatforms.count(platform)) return 256;
  FocuserJobFields fields;
  fields.platform = platform;
  fields.level0Filename = scene;
  int alternating = 0;
  if (chooseParameterProfile(fields, tesvEnvOrDefault("TESSIVOR_CEOS_DES_FILES_DIR"), alternating) != 0)
    return 256;
  int memory = 256;
  if (GetMyProfileIntArray("sarfocuserConfiguration", "Memory", &memory, 1,
                           fields.processingConfFilename) != 0)
    memory = 256;
  FreeProfile(fields.processingConfFilename);
  return std::max(memory, 1);
}

bool collectJobs(const std::vector<std::string>& arguments, const fs::path& batchDir,
                 std::vector<Job>& jobs, std::string& error) {
  std::vector<fs::path> files;
  std::error_code ec;
  for (const std::string& argument : arguments) {
    const fs::path path = fs::absolute(argument, ec).lexically_normal();
    if (fs::is_directory(path, ec)) {
      std::vector<fs::path> inFolder;
      for (const auto& entry : fs::directory_iterator(path, ec)) {
        std::vector<std::string> p;
        if (entry.is_regular_file(ec) && jobParameters(entry.path(), p) && !p.empty() &&
            kPlatforms.count(p[0]))
          inFolder.push_back(entry.path());
      }
      std::sort(inFolder.begin(), inFolder.end());
      if (inFolder.empty()) {
        error = "no job file in the folder " + path.string();
        return false;
      }
      files.insert(files.end(), inFolder.begin(), inFolder.end());
    } else if (fs::is_regular_file(path, ec)) {
      files.push_back(path);
    } else {
      error = "job file not found: " + path.string();
      return false;
    }
  }
  // Names: the job file's stem; the same stem twice is told apart by the
  // position in the batch.
  std::map<std::string, int> stems;
  for (const fs::path& f : files) ++stems[folderName(f)];
  std::map<fs::path, std::string> roots;
  jobs.clear();
  for (std::size_t i = 0; i < files.size(); ++i) {
    Job job;
    job.index = static_cast<int>(i);
    job.jobFile = files[i];
    job.name = folderName(files[i]);
    if (stems[job.name] > 1) job.name = std::to_string(i + 1) + "_" + job.name;
    job.workDir = batchDir / "work" / job.name;
    std::vector<std::string> p;
    if (!jobParameters(files[i], p)) {
      error = "cannot read the job file " + files[i].string() + " (fewer than two lines)";
      return false;
    }
    job.platform = p.empty() ? std::string() : p[0];
    job.outputRoot = p.size() > 5 ? p[5] : std::string();
    job.memoryMb = memoryBudgetMb(job.platform, p.size() > 1 ? p[1] : std::string());
    // Two scenes writing the same products (and the same temporary rasters,
    // which are named after the output root) cannot run side by side.
    const fs::path root = job.outputRootPath().lexically_normal();
    if (!root.empty()) {
      auto [at, fresh] = roots.emplace(root, files[i].string());
      if (!fresh) {
        error = "the job files " + at->second + " and " + files[i].string() +
                " write the same products " + root.string() + "_slc";
        return false;
      }
    }
    jobs.push_back(std::move(job));
  }
  if (jobs.empty()) {
    error = "no job file given";
    return false;
  }
  return true;
}

bool writeManifest(const fs::path& file, const std::vector<Job>& jobs, std::string& error) {
  std::string text = "# index\tname\tmemory_mb\tjob file\n";
  for (const Job& j : jobs)
    text += std::to_string(j.index) + "\t" + j.name + "\t" + std::to_string(j.memoryMb) + "\t" +
            j.jobFile.string() + "\n";
  std::error_code ec;
  fs::create_directories(file.parent_path(), ec);
  if (!writeAtomically(file, text)) {
    error = "cannot write " + file.string();
    return false;
  }
  return true;
}

bool readManifest(const fs::path& file, std::vector<Job>& jobs, std::string& error) {
  std::ifstream in(file);
  if (!in) {
    error = "no batch list " + file.string();
    return false;
  }
  // The manifest lies in the batch folder or in its slurm/ folder.
  fs::path batchDir = fs::absolute(file).parent_path();
  if (batchDir.filename() == "slurm") batchDir = batchDir.parent_path();
  jobs.clear();
  std::string line;
  int number = 0;
  while (std::getline(in, line)) {
    ++number;
    if (line.empty() || line[0] == '#') continue;
    std::istringstream fields(line);
    Job job;
    std::string index, memory, path;
    if (!std::getline(fields, index, '\t') || !std::getline(fields, job.name, '\t') ||
        !std::getline(fields, memory, '\t') || !std::getline(fields, path)) {
      error = file.string() + ": line " + std::to_string(number) + " is not a batch entry";
      return false;
    }
    job.index = std::atoi(index.c_str());
    job.memoryMb = std::atoi(memory.c_str());
    job.jobFile = path;
    job.workDir = batchDir / "work" / job.name;
    std::vector<std::string> p;
    if (jobParameters(job.jobFile, p)) {
      job.platform = p.empty() ? std::string() : p[0];
      job.outputRoot = p.size() > 5 ? p[5] : std::string();
    }
    jobs.push_back(std::move(job));
  }
  return true;
}

bool prepareRun(const Job& job, std::string& error) {
  std::error_code ec;
  fs::create_directories(job.workDir, ec);
  if (ec) {
    error = "cannot create the working folder " + job.workDir.string() + ": " + ec.message();
    return false;
  }
  for (const fs::path& old : {job.progressFile(), job.errorFile(), job.recordFile(),
                              fs::path(job.progressFile().string() + "_batch_ok")})
    fs::remove(old, ec);
  return true;
}

bool writeStopValue(const Job& job) {
  Progress progress;
  readProgress(job.progressFile(), progress);
  return writeAtomically(job.progressFile(),
                         std::to_string(kStopValue) + "\n" + progress.stage + "\n");
}

bool writeAtomically(const fs::path& file, const std::string& text) {
  const fs::path part = file.string() + ".part";
  {
    std::ofstream out(part, std::ios::binary | std::ios::trunc);
    if (!out) return false;
    out << text;
    if (!out.flush()) return false;
  }
  std::error_code ec;
  fs::rename(part, file, ec);
  return !ec;
}

double wallClock() {
  return std::chrono::duration<double>(std::chrono::system_clock::now().time_since_epoch()).count();
}

bool readProgress(const fs::path& file, Progress& progress) {
  std::ifstream in(file);
  if (!in) return false;
  std::string first;
  if (!std::getline(in, first)) return false;
  progress.percent = std::atoi(first.c_str());
  std::getline(in, progress.stage);
  // The focuser writes its stage as " <stage>".
  const std::size_t from = progress.stage.find_first_not_of(' ');
  const std::size_t to = progress.stage.find_last_not_of(" \r");
  progress.stage = from == std::string::npos ? std::string() : progress.stage.substr(from, to - from + 1);
  return true;
}

}  // namespace batch
