// Error and warning catalogues: texts of the codes of the fatal path.
#include "diag/error_catalog.h"

#include <cstdlib>

#include "diag/parameter_lines.h"

namespace {

// First word of a key line; separators blank, newline, tab, comma.
std::string firstWord(const std::string& line) {
  std::size_t start = line.find_first_not_of(" \n\t,");
  if (start == std::string::npos) return {};
  std::size_t end = line.find_first_of(" \n\t,", start);
  return line.substr(start, end == std::string::npos ? std::string::npos : end - start);
}

bool parseCount(const std::string& text, int& count) {
  char* end = nullptr;
  long value = std::strtol(text.c_str(), &end, 10);
  if (end == text.c_str() || *end != '\0' || value < 0 || value > 100000) return false;
  count = static_cast<int>(value);
  return true;
}

}  // namespace

bool ErrorCatalogue::load(const std::string& path, std::string& problem) {
  clear();
  std::vector<std::string> lines;
  if (!readParameterLines(path, lines)) {
    problem = "cannot open " + path;
    return false;
  }
  std::size_t at = 0;
  auto next = [&](std::string& line) {
    if (at >= lines.size()) return false;
    line = lines[at++];
    return true;
  };
  std::string line;
  int groupCount = 0;
  if (!next(line) || !parseCount(line, groupCount) || groupCount == 0) {
    problem = path + ": line 1 must hold the number of groups";
    return false;
  }
  std::vector<CatalogueGroup> groups(static_cast<std::size_t>(groupCount));
  for (auto& group : groups) {
    if (!next(line) || (group.key = firstWord(line)).empty()) {
      problem = path + ": missing group key at line " + std::to_string(at);
      return false;
    }
  }
  for (auto& group : groups) {
    if (!next(group.title)) {
      problem = path + ": missing group title at line " + std::to_string(at + 1);
      return false;
    }
  }
  for (auto& group : groups) {
    const std::string header = "ErrorCodeInfo_" + group.key;
    if (!next(line) || line != header) {
      problem = path + ": expected \"" + header + "\" at line " + std::to_string(at);
      return false;
    }
    int messageCount = 0;
    if (!next(line) || !parseCount(line, messageCount)) {
      problem = path + ": missing message count of group " + group.key + " at line " +
                std::to_string(at);
      return false;
    }
    group.messages.resize(static_cast<std::size_t>(messageCount));
    for (auto& message : group.messages) {
      if (!next(message)) {
        problem = path + ": group " + group.key + " has fewer messages than its count";
        return false;
      }
    }
  }
  groups_ = std::move(groups);
  loaded_ = true;
  return true;
}

void ErrorCatalogue::clear() {
  groups_.clear();
  loaded_ = false;
}

void ErrorCatalogue::lookup(int code, std::string& title, std::string& message) const {
  if (!loaded_) {
    title = "AN ERROR OCCUR DURING Tessivor INIT";
    message = title + "  : [" + std::to_string(code) + "]";
    return;
  }
  const int primary = code / kErrorCodeBase;
  const int secondary = code % kErrorCodeBase;
  const std::string key = std::to_string(primary);
  for (const auto& group : groups_) {
    if (group.key != key) continue;
    if (secondary >= 0 && static_cast<std::size_t>(secondary) < group.messages.size()) {
      title = group.title;
      message = group.messages[static_cast<std::size_t>(secondary)];
      return;
    }
    title = "GENERIC ERROR WRONG CODE";
    message = group.title + "  :  " + std::to_string(code) + " [" + std::to_string(primary) +
              " : " + std::to_string(secondary) + "]";
    return;
  }
  title = "GENERIC ERROR WRONG CODE";
  message = title + "  :  " + std::to_string(code) + " [PEC " + std::to_string(primary) + "]";
}
