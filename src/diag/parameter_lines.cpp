// Line reader shared by the job file loader and the error catalogues.
#include "diag/parameter_lines.h"

#include <fstream>

namespace {

std::string trimmed(const std::string& line) {
  constexpr const char* kBlanks = " \t\n\v\f";
  std::size_t first = line.find_first_not_of(kBlanks);
  if (first == std::string::npos) return {};
  std::size_t last = line.find_last_not_of(kBlanks);
  return line.substr(first, last - first + 1);
}

}  // namespace

bool readParameterLines(const std::string& path, std::vector<std::string>& lines) {
  lines.clear();
  std::ifstream in(path, std::ios::binary);
  if (!in) return false;
  std::string line;
  while (std::getline(in, line)) {
    std::size_t cr = line.find('\r');
    if (cr != std::string::npos) line.resize(cr);
    std::string value = trimmed(line);
    if (!value.empty() && value.front() == '#') break;
    lines.push_back(std::move(value));
  }
  return !in.bad();
}

std::string cutAtTessivorMarker(const std::string& text) {
  std::size_t marker = text.find("###Tessivor###");
  return marker == std::string::npos ? text : text.substr(0, marker);
}
