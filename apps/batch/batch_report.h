#pragma once
// What the batch tells while it runs (one line per scene: percentage, stage,
// elapsed time) and the summary it leaves.
#include <map>
#include <string>
#include <vector>

#include "batch/batch_job.h"

namespace batch {

// Follows the scenes: prints a line when a scene's stage changes or its
// percentage passes a tenth, and keeps <batch>/progress.txt as a table of
// one line per scene.
class ProgressBoard {
 public:
  ProgressBoard(const fs::path& batchDir, const std::vector<Job>& jobs, bool quiet);
  // A running scene: reads its progress file.
  void running(const Job& job, double started);
  // A scene whose run has ended.
  void finished(const Job& job, const RunRecord& record);
  // A scene that did not start, with the reason.
  void note(const Job& job, const std::string& text);
  // Rewrites progress.txt (at most once a second unless `force`).
  void flush(bool force = false);

 private:
  struct Line {
    int percent = -1;
    std::string stage, state = "queued";
    double started = 0.0, ended = 0.0;
  };
  fs::path file_;
  std::vector<std::string> order_;
  std::map<std::string, Line> lines_;
  bool quiet_ = false;
  double written_ = 0.0;
};

std::string elapsedText(double seconds);

}  // namespace batch
