#pragma once
// The focuser executable run as a host runs it: a job file of positional
// parameters, the TESSIVOR_* variables, one command string, the progress
// file followed while the process runs, then the exit status, the error
// file and the process logs.
#include <sys/types.h>

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "base/status.h"
#include "scenes.h"

namespace support {

// The 24 positional parameters of a job ("NotOK" where nothing is given).
using Job = std::vector<std::string>;

// A job with nothing optional given: platform, scene, output root.
Job basicJob(const std::string& platform, const std::string& scene, const std::string& outputRoot);
// The job of a simulated ERS scene with its orbit arc and leader given.
Job ersJob(const SensorScene& scene, const std::string& outputRoot);
// The job of a simulated ENVISAT scene whose orbit and auxiliary files
// (ASA_INS, ASA_XCA, ASA_XCH) are searched in their folders.
Job envisatJob(const SensorScene& scene, const std::string& outputRoot);
// The job of a simulated PALSAR product: one image file per polarisation,
// the leader (its platform position record is the orbit); platform
// "PALSAR" or "PALSAR_ERSDAC".
Job palsarJob(const std::string& platform, const PalsarSceneFiles& files, const std::string& outputRoot);
// A job file: an ignored first line, then one parameter a line.
void writeJob(const std::string& file, const Job& job);

struct FocuserRun {
  int exitStatus = -1;  // as the parent sees it (low 8 bits)
  int errorCode = 0;    // full code of the _error file, 0 when there is none
  bool signalled = false;
  std::string log, trace, errorFile, stderrText;
  double seconds = 0.0, cpuSeconds = 0.0, peakMiB = 0.0;
};

// What a host sees while the run goes on.
struct RunningFocuser {
  pid_t pid;
  const std::string& folder;    // working folder, ending with '/'
  const std::string& progress;  // text of the progress file
};
using ProgressHook = std::function<void(const RunningFocuser&)>;

struct RunOptions {
  ProgressHook hook{};           // called at every poll
  int pollMilliseconds = 50;
  int timeoutSeconds = 1200;
  std::string executable{};      // the focuser of the build tree when empty
  std::string command{};         // "main_focussing_stripmap#" + job file when empty
  bool hostVariables = true;     // set the TESSIVOR_* variables of a host
  std::map<std::string, std::string> variables{};  // then these (an empty value unsets)
  long long fileSizeLimit = 0;   // > 0: no file of the run grows past it (a full disk)
};

// Runs the focuser on `jobFile` with `folder` (ending with '/') as working
// folder; stdout and stderr go to folder/stderr.txt.
FocuserRun runFocuser(const std::string& folder, const std::string& jobFile, const RunOptions& options = {});

}  // namespace support
