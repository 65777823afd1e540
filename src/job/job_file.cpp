// Job file loader: the host's positional parameters.
#include "job/job_file.h"

#include <filesystem>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/parameter_lines.h"

namespace {

bool fileExists(const std::string& path) {
  std::error_code ec;
  return std::filesystem::is_regular_file(path, ec);
}

std::string fileNameOf(const std::string& path) {
  std::size_t cut = path.find_last_of("/\\");
  return cut == std::string::npos ? path : path.substr(cut + 1);
}

}  // namespace

std::vector<std::string> loadParameterList(const std::string& path) {
  std::string found = path;
  if (!fileExists(found)) {
    found = tesvEnvOrDefault("TESSIVOR_WORKING_DIR") + fileNameOf(path);
    if (!fileExists(found)) TESV_FATAL(EC_FILE_NOT_FOUND, path);
  }
  std::vector<std::string> lines;
  if (!readParameterLines(found, lines)) TESV_FATAL(EC_FILE_NOT_FOUND, found);
  return lines;
}

std::vector<std::string> splitJobParameters(const std::string& path) {
  const std::string jobPath = cutAtTessivorMarker(path);
  std::vector<std::string> lines = loadParameterList(jobPath);
  if (lines.size() <= 1) TESV_FATAL(EC_FILE_NOT_FOUND, jobPath);
  lines.erase(lines.begin());
  return lines;
}
