// Product recognition by fixed fields of the product files.
#include "ingest/product_types.h"

#include <cstring>
#include <fstream>

namespace {

constexpr long kMphProductOffset = 9;        // value of PRODUCT=" in the MPH
constexpr std::size_t kMphProductBytes = 62;
constexpr long kLeaderMissionOffset = 1116;  // mission id in the data set summary
constexpr std::size_t kLeaderMissionBytes = 16;

std::string joined(const std::string& directory, const char* name) {
  if (directory.empty()) return name;
  const char last = directory.back();
  return directory + (last == '/' || last == '\\' ? "" : "/") + name;
}

// Reads count bytes at offset; false when the file cannot be opened or is shorter.
bool readFileBytes(const std::string& path, long offset, std::size_t count, std::string& bytes) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return false;
  in.seekg(offset);
  bytes.assign(count, '\0');
  in.read(bytes.data(), static_cast<std::streamsize>(count));
  return in.gcount() == static_cast<std::streamsize>(count);
}

}  // namespace

int EnvisatTypes::productStartsWith(const char* prefix) const {
  std::string value;
  if (!readFileBytes(fileName_, kMphProductOffset, kMphProductBytes, value)) return 0;
  return value.compare(0, std::strlen(prefix), prefix) == 0 ? 1 : 0;
}

int EnvisatTypes::is_apc() const { return productStartsWith("ASA_APC"); }
int EnvisatTypes::is_aph() const { return productStartsWith("ASA_APH"); }
int EnvisatTypes::is_apv() const { return productStartsWith("ASA_APV"); }
int EnvisatTypes::is_im0() const { return productStartsWith("ASA_IM__0"); }

std::string ErsTypes::leaderPath() const {
  for (const char* name : {"LEA_01.001", "lea_01.001"}) {
    std::string path = joined(directory_, name);
    if (std::ifstream(path, std::ios::binary)) return path;
  }
  return {};
}

int ErsTypes::leaderFieldIs(long offset, const char* expected, std::size_t count) const {
  const std::string leader = leaderPath();
  std::string value;
  if (leader.empty() || !readFileBytes(leader, offset, kLeaderMissionBytes, value)) return 0;
  return value.compare(0, count, expected, count) == 0 ? 1 : 0;
}

int ErsTypes::is_ers1() const { return leaderFieldIs(kLeaderMissionOffset, "ERS1", 4); }
