// Progress lines while the batch runs, and its summary (CSV and JSON).
#include "batch/batch_report.h"

#include <chrono>
#include <cstdio>
#include <fstream>

#include "batch/batch_run.h"

namespace batch {

namespace {

std::string jsonText(const std::string& text) {
  std::string out = "\"";
  for (char c : text) {
    switch (c) {
      case '"': out += "\\\""; break;
      case '\\': out += "\\\\"; break;
      case '\n': out += "\\n"; break;
      case '\t': out += "\\t"; break;
      default:
        if (static_cast<unsigned char>(c) < 0x20) {
          char code[8];
          std::snprintf(code, sizeof code, "\\u%04x", c);
          out += code;
        } else {
          out += c;
        }
    }
  }
  return out + "\"";
}

std::string csvText(const std::string& text) {
  if (text.find_first_of(",\"\n") == std::string::npos) return text;
  std::string out = "\"";
  for (char c : text) out += c == '"' ? std::string("\"\"") : std::string(1, c);
  return out + "\"";
}

std::string fixed(double value, int decimals) {
  char text[64];
  std::snprintf(text, sizeof text, "%.*f", decimals, value);
  return text;
}

}  // namespace

std::string elapsedText(double seconds) {
  const long s = static_cast<long>(seconds < 0 ? 0 : seconds);
  char text[32];
  std::snprintf(text, sizeof text, "%ld:%02ld:%02ld", s / 3600, s / 60 % 60, s % 60);
  return text;
}

ProgressBoard::ProgressBoard(const fs::path& batchDir, const std::vector<Job>& jobs, bool quiet)
    : file_(batchDir / "progress.txt"), quiet_(quiet) {
  for (const Job& job : jobs) {
    order_.push_back(job.name);
    lines_[job.name];
  }
}

void ProgressBoard::running(const Job& job, double started) {
  Line& line = lines_[job.name];
  Progress progress;
  if (line.state != "running") {
    line.state = "running";
    line.started = started;
  }
  if (!readProgress(job.progressFile(), progress)) return;
  const bool newStage = progress.stage != line.stage;
  const bool newTenth = progress.percent / 10 != line.percent / 10;
  if ((newStage || newTenth) && !quiet_)
    std::printf("%-24s %3d%%  %-36s %s\n", job.name.c_str(), progress.percent,
                progress.stage.c_str(), elapsedText(wallClock() - started).c_str());
  line.percent = progress.percent;
  line.stage = progress.stage;
  std::fflush(stdout);
}

void ProgressBoard::finished(const Job& job, const RunRecord& record) {
  Line& line = lines_[job.name];
  const ErrorReport error = readErrorReport(job.errorFile());
  line.state = stateName(sceneState(job, record, error));
  line.started = record.started;
  line.ended = record.started + record.wallSeconds;
  if (quiet_) return;
  std::string detail;
  if (error.present) detail = "  code " + std::to_string(error.code) + " " + error.group;
  else if (record.signal) detail = "  signal " + std::to_string(record.signal);
  else if (record.exitStatus != 0) detail = "  exit status " + std::to_string(record.exitStatus);
  std::printf("%-24s %s after %s, peak %.0f MB%s\n", job.name.c_str(), line.state.c_str(),
              elapsedText(record.wallSeconds).c_str(), record.peakMemoryKb / 1024.0, detail.c_str());
  std::fflush(stdout);
}

void ProgressBoard::note(const Job& job, const std::string& text) {
  lines_[job.name].state = "not run";
  if (!quiet_) std::printf("%-24s %s\n", job.name.c_str(), text.c_str());
  std::fflush(stdout);
}

void ProgressBoard::flush(bool force) {
  const double t = wallClock();
  // The elapsed times move on: once a second is often enough.
  if (!force && t - written_ < 1.0) return;
  std::string text = "# scene\tpercent\tstage\telapsed\tstate\n";
  for (const std::string& name : order_) {
    const Line& l = lines_[name];
    const double elapsed = l.started == 0.0 ? 0.0 : (l.ended > 0.0 ? l.ended : t) - l.started;
    text += name + "\t" + (l.percent < 0 ? std::string("-") : std::to_string(l.percent)) + "\t" +
            (l.stage.empty() ? std::string("-") : l.stage) + "\t" + elapsedText(elapsed) + "\t" +
            l.state + "\n";
  }
  writeAtomically(file_, text);
  written_ = t;
}

int writeSummary(const std::vector<Job>& jobs, const fs::path& batchDir, bool quiet) {
  std::string csv =
      "scene,state,exit_code,exit_status,error,wall_seconds,peak_memory_mb,memory_budget_mb,"
      "runner,products,job_file,working_folder\n";
  std::string json = "{\n  \"batch\": " + jsonText(batchDir.string()) + ",\n  \"scenes\": [\n";
  int failed = 0, succeeded = 0;
  for (std::size_t i = 0; i < jobs.size(); ++i) {
    const Job& job = jobs[i];
    RunRecord record;
    record.read(job.recordFile());
    const ErrorReport error = readErrorReport(job.errorFile());
    const SceneState state = sceneState(job, record, error);
    if (state == SceneState::Success) ++succeeded;
    else ++failed;
    const bool ended = record.present && record.finished;
    // The full code: from the _error file, 0 for a success; the low 8 bits
    // seen by the parent are the exit status.
    std::string code;
    if (error.present) code = std::to_string(error.code);
    else if (state == SceneState::Success) code = "0";
    const std::string status = ended && !record.signal ? std::to_string(record.exitStatus) : "";
    const std::string wall = ended ? fixed(record.wallSeconds, 1) : "";
    const std::string peak = ended && record.peakMemoryKb >= 0 ? fixed(record.peakMemoryKb / 1024.0, 1) : "";
    std::string errorText = error.group;
    if (!error.present && record.signal) errorText = "signal " + std::to_string(record.signal);
    std::string productList, productJson;
    for (const fs::path& p : job.products()) {
      if (!productList.empty()) {
        productList += ';';
        productJson += ", ";
      }
      productList += p.string();
      productJson += jsonText(p.string());
    }
    csv += csvText(job.name) + "," + stateName(state) + "," + code + "," + status + "," +
           csvText(errorText) + "," + wall + "," + peak + "," + std::to_string(job.memoryMb) + "," +
           csvText(record.runner) + "," + csvText(productList) + "," + csvText(job.jobFile.string()) +
           "," + csvText(job.workDir.string()) + "\n";
    auto orNull = [](const std::string& v) { return v.empty() ? std::string("null") : v; };
    json += "    {\"scene\": " + jsonText(job.name) + ", \"state\": " + jsonText(stateName(state)) +
            ", \"exit_code\": " + orNull(code) + ", \"exit_status\": " + orNull(status) +
            ", \"error\": " + jsonText(errorText) + ", \"wall_seconds\": " + orNull(wall) +
            ", \"peak_memory_mb\": " + orNull(peak) +
            ", \"memory_budget_mb\": " + std::to_string(job.memoryMb) +
            ", \"runner\": " + jsonText(record.runner) + ", \"products\": [" + productJson +
            "], \"job_file\": " + jsonText(job.jobFile.string()) +
            ", \"working_folder\": " + jsonText(job.workDir.string()) + "}" +
            (i + 1 < jobs.size() ? ",\n" : "\n");
    if (!quiet)
      std::printf("  %-24s %-8s %8s %10s s %9s MB  %s\n", job.name.c_str(), stateName(state),
                  code.empty() ? "-" : code.c_str(), wall.empty() ? "-" : wall.c_str(),
                  peak.empty() ? "-" : peak.c_str(), errorText.c_str());
  }
  json += "  ],\n  \"succeeded\": " + std::to_string(succeeded) +
          ",\n  \"without_product\": " + std::to_string(failed) + "\n}\n";
  for (const auto& [name, text] : {std::pair{"summary.csv", csv}, std::pair{"summary.json", json}}) {
    const fs::path file = batchDir / name;
    if (!writeAtomically(file, text)) std::fprintf(stderr, "stripmap_batch: cannot write %s\n", file.c_str());
  }
  if (!quiet)
    std::printf("%d of %zu scenes with a product; summary in %s\n", succeeded, jobs.size(),
                (batchDir / "summary.csv").c_str());
  return failed;
}

}  // namespace batch
