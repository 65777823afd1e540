#pragma once
// The scenes of a batch: one job file each, its own working folder under the
// batch folder, its memory budget, its run record and its products.
#include <filesystem>
#include <string>
#include <vector>

namespace batch {

namespace fs = std::filesystem;

// Name of the progress file inside a scene's working folder.
inline constexpr const char* kProgressName = "Tessivor_progress.txt";
// Stop value a host writes into line 1 of a progress file.
inline constexpr int kStopValue = 101;

struct Job {
  int index = 0;          // position in the batch; the Slurm array task id
  std::string name;       // working folder name, unique in the batch
  fs::path jobFile;       // absolute
  fs::path workDir;       // <batch>/work/<name>
  std::string platform;   // parameter 0
  std::string outputRoot; // parameter 5 as written in the job file
  int memoryMb = 256;     // `Memory` budget of the job's parameter profile

  fs::path progressFile() const { return workDir / kProgressName; }
  fs::path errorFile() const { return workDir / (std::string(kProgressName) + "_error"); }
  fs::path recordFile() const { return workDir / "batch_run.txt"; }
  fs::path outputFile() const { return workDir / "focuser_output.txt"; }
  // The output root as the focuser resolves it (its current folder is the
  // working folder); empty when the job names none.
  fs::path outputRootPath() const;
  // <root>_slc and its parameter store: the two files a successful run leaves.
  fs::path productFile() const;
  fs::path parameterStore() const;
  // Every file of the scene's products that exists (raster, store,
  // description headers, further exports).
  std::vector<fs::path> products() const;
};

// What one run of the focuser left: written by the process that waited for
// it, beside the scene's logs.
struct RunRecord {
  bool present = false;
  bool finished = false;       // false while the focuser runs
  double started = 0.0;        // seconds since the epoch
  double wallSeconds = 0.0;
  long peakMemoryKb = -1;      // resident set maximum of the focuser, -1 unknown
  int exitStatus = -1;         // as the parent saw it (low 8 bits)
  int signal = 0;              // terminating signal, 0 for a normal exit
  std::string host, runner;

  bool read(const fs::path& file);
  bool write(const fs::path& file) const;  // through a temporary beside it
};

// The error a failed run wrote into its _error file: the full code of its
// " [EC : <code>]" line (0 if none) and the first line, the error group.
struct ErrorReport {
  bool present = false;
  int code = 0;
  std::string group;
};
ErrorReport readErrorReport(const fs::path& file);

enum class SceneState { Success, Failed, Stopped, Running, NotRun };
const char* stateName(SceneState state);

// State of a scene from its record, _error file and products.
SceneState sceneState(const Job& job, const RunRecord& record, const ErrorReport& error);

// Expands the arguments (job files, or folders holding job files) into the
// batch's jobs with their working folders under batchDir. A folder
// contributes, in name order, each regular file whose first parameter names
// a platform. False with a message naming the file for a job file that
// cannot be read or two jobs that would write the same products.
bool collectJobs(const std::vector<std::string>& arguments, const fs::path& batchDir,
                 std::vector<Job>& jobs, std::string& error);

// The list of a batch, kept in the batch folder so that later calls (stop,
// summary, Slurm tasks) find the same jobs: one line per job.
bool writeManifest(const fs::path& file, const std::vector<Job>& jobs, std::string& error);
bool readManifest(const fs::path& file, std::vector<Job>& jobs, std::string& error);

// Reads the `Memory` budget (megabytes) of the job's parameter profile, 256
// where the profile gives none, as the focuser does.
int memoryBudgetMb(const std::string& platform, const std::string& scene);

// Prepares a scene for a new run: creates the working folder, removes the
// previous progress file, _error file and run record (the logs are kept and
// appended to).
bool prepareRun(const Job& job, std::string& error);

// Writes the stop value into the scene's progress file, as a host stops a run.
bool writeStopValue(const Job& job);

// Writes a file through "<file>.part" and a rename, so that a reader never
// sees half of it.
bool writeAtomically(const fs::path& file, const std::string& text);
// Seconds since the epoch.
double wallClock();

// Line 1 (percentage) and line 2 (stage) of a progress file.
struct Progress {
  int percent = 0;
  std::string stage;
};
bool readProgress(const fs::path& file, Progress& progress);

}  // namespace batch
