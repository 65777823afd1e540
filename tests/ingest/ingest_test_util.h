#pragma once
// Temporary folders and hand-made files for the ingest tests.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

namespace ingest_test {

// A fresh folder unique to this process and test; removed by the destructor.
class TempFolder {
 public:
  TempFolder() {
    const auto* info = testing::UnitTest::GetInstance()->current_test_info();
    path_ = std::filesystem::path(testing::TempDir()) /
            ("ingest_" + std::to_string(getpid()) + "_" + info->test_suite_name() + "_" + info->name());
    std::filesystem::remove_all(path_);
    std::filesystem::create_directories(path_);
  }
  ~TempFolder() {
    std::error_code ec;
    std::filesystem::remove_all(path_, ec);
  }
  TempFolder(const TempFolder&) = delete;
  TempFolder& operator=(const TempFolder&) = delete;
  std::string str() const { return path_.string(); }
  std::string operator/(const std::string& name) const { return (path_ / name).string(); }

 private:
  std::filesystem::path path_;
};

inline void writeBytes(const std::string& path, const std::string& bytes) {
  std::filesystem::create_directories(std::filesystem::path(path).parent_path());
  std::ofstream(path, std::ios::binary) << bytes;
}

// Bytes of size n, blank, with text put at offset.
inline std::string blankWith(std::size_t n, std::initializer_list<std::pair<std::size_t, std::string>> fields) {
  std::string s(n, ' ');
  for (const auto& [offset, text] : fields) s.replace(offset, text.size(), text);
  return s;
}

// The head of an ENVISAT product main header whose PRODUCT value is name,
// with sensing start and stop as the MPH places them.
inline std::string mphHead(const std::string& name, const std::string& start = "01-JAN-2007 00:00:00.000000",
                           const std::string& stop = "01-JAN-2007 00:00:10.000000") {
  std::string s = "PRODUCT=\"" + name;
  s.resize(73, ' ');
  s += "\"\n";
  s.resize(336, ' ');
  s += "SENSING_START=\"" + start + "\"\nSENSING_STOP=\"" + stop + "\"\n";
  s.resize(1247, ' ');
  return s;
}

inline const char* realData() { return TESSIVOR_REALDATA_DIR; }
inline bool realDataPresent() { return std::filesystem::is_directory(TESSIVOR_REALDATA_DIR); }

}  // namespace ingest_test
