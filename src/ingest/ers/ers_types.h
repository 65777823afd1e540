#pragma once
// Type tests of ERS products and of DEOS orbit arcs.
#include <cstddef>
#include <string>

class ROI_Obj;

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
  int is_ers2() const;
  int is_level0() const;
  // Tests of a DEOS orbit arc file: "@ODR" / "xODR" head, satellite tag.
  int is_deos(const std::string& orbit) const;
  int is_deos_ers1(const std::string& orbit) const;
  int is_deos_ers2(const std::string& orbit) const;
  // The held path itself taken as an orbit file.
  int is_deos() const { return is_deos(directory_); }
  // 1 when the arc's satellite is the leader's mission.
  int check_deos(const std::string& orbit) const;
  // 1 ERS-1, 2 ERS-2, 3 a DEOS arc, 0 otherwise.
  int find_type() const;

  // Scene extent from the leader's data set summary. 1 on success, 0 when
  // the leader is absent or short.
  int read_roi(ROI_Obj* roi) const;

 private:
  // The first count of `bytes` bytes at offset of the leader equal expected.
  int leaderFieldIs(long offset, std::size_t bytes, const char* expected, std::size_t count) const;
  std::string directory_;
};
