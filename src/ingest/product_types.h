#pragma once
#include <string>

// Type tests of ENVISAT products: each opens the product file and compares
// the beginning of the MPH PRODUCT value (62 bytes at offset 9). A file that
// cannot be opened or read passes none of them. Results are 0 or 1.
class EnvisatTypes {
 public:
  EnvisatTypes() = default;
  explicit EnvisatTypes(const std::string& fileName) : fileName_(fileName) {}

  void setFileName(const std::string& fileName) { fileName_ = fileName; }
  const std::string& fileName() const { return fileName_; }

  int is_apc() const;
  int is_aph() const;
  int is_apv() const;
  int is_im0() const;

 private:
  int productStartsWith(const char* prefix) const;
  std::string fileName_;
};

// Type tests of ERS products, read from the CEOS leader of the product
// directory: "LEA_01.001", or "lea_01.001" when that cannot be opened.
class ErsTypes {
 public:
  ErsTypes() = default;
  explicit ErsTypes(const std::string& productDirectory) : directory_(productDirectory) {}

  void setDirectory(const std::string& productDirectory) { directory_ = productDirectory; }
  const std::string& directory() const { return directory_; }
  // Path of the leader that opens, or empty when neither name does.
  std::string leaderPath() const;

  int is_ers1() const;

 private:
  int leaderFieldIs(long offset, const char* expected, std::size_t count) const;
  std::string directory_;
};
