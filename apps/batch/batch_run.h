#pragma once
// Running the scenes of a batch: the focuser started as a host starts it,
// several side by side on this machine or as the tasks of a Slurm job array,
// followed through the progress files, stopped through them, summed up.
#include <csignal>
#include <string>
#include <vector>

#include "batch/batch_job.h"

namespace batch {

struct Options {
  fs::path batchDir;
  fs::path focuser;          // the stripmap_focuser executable
  fs::path self;             // this executable (for the Slurm tasks)
  int parallel = 0;          // --local N; 0: from the cores and the memory budgets
  int memoryMarginMb = 256;  // added to a job's budget for what lies outside it
  bool all = false;          // rerun scenes that already have a product
  bool quiet = false;
  // Threads of one focuser run (FFT and parallel loops), unless the
  // environment says otherwise; 0 leaves the focuser's own choice.
  int threadsPerRun = 0;
  // Slurm.
  int cpusPerTask = 1;
  int retries = 0;           // chained reruns of the failed tasks
  bool wait = true;
  std::vector<std::string> sbatchArguments;
};

// Set by SIGINT/SIGTERM: the number of stop requests received.
extern volatile std::sig_atomic_t stopRequests;
void installStopHandlers();
// A stop asked for by `--stop` (the STOP file of the batch folder) or a signal.
bool stopAsked(const fs::path& batchDir);
fs::path stopFile(const fs::path& batchDir);

// The scenes to run: all of them with `all`, else those without a
// successful product.
std::vector<Job> scenesToRun(const std::vector<Job>& jobs, bool all);

// Parallel runs that the machine affords: its cores, and its available
// memory divided by the largest request (budget + margin) of the jobs.
int automaticParallelRuns(const std::vector<Job>& jobs, int marginMb);

// Cores this process may use.
int usableCores();

// Runs the jobs on this machine, `parallel` at a time; a failed scene does
// not stop the others. Returns after every started run has ended.
void runLocal(const std::vector<Job>& jobs, const Options& options, int parallel);

// One scene in this process's care (a Slurm array task): runs the focuser,
// follows it, writes the run record. With `onlyIfFailed`, a scene that
// already has its product is left alone. Returns 0, or 1 when the scene failed.
int runTask(const Job& job, const Options& options, bool onlyIfFailed);

// Writes the stop value into the progress file of every running scene.
int stopRunningScenes(const std::vector<Job>& jobs);

// Writes <batch>/summary.csv and <batch>/summary.json; returns the number of
// scenes without a successful product.
int writeSummary(const std::vector<Job>& jobs, const fs::path& batchDir, bool quiet);

// Slurm: submits the jobs as one array (and the chained reruns) and, unless
// told not to wait, follows them to their end. Returns 0, or 2 with a message
// when Slurm cannot be used.
int runSlurm(const std::vector<Job>& all, const std::vector<Job>& jobs, const Options& options,
             std::string& error);
// Cancels the tasks of the batch that have not started yet.
void cancelPendingSlurmTasks(const fs::path& batchDir);
// Fills in unknown peak memory and wall time of Slurm tasks from sacct,
// where accounting is available.
void completeFromAccounting(const std::vector<Job>& jobs);

}  // namespace batch
