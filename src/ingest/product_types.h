#pragma once
#include <string>

class ROI_Obj;

// Type tests of ENVISAT products: each opens the product file and compares
// the beginning of the MPH PRODUCT value (62 bytes at offset 9). A file that
// cannot be opened or read passes none of them. Results are 0 or 1.
class EnvisatTypes {
 public:
  EnvisatTypes() = default;
  explicit EnvisatTypes(const std::string& fileName) : fileName_(fileName) {}

  void setFileName(const std::string& fileName) { fileName_ = fileName; }
  const std::string& fileName() const { return fileName_; }

  int is_aps() const;
  int is_app() const;
  int is_apm() const;
  int is_apc() const;
  int is_aph() const;
  int is_apv() const;
  int is_ims() const;
  int is_im0() const;
  int is_wss() const;
  int is_wsm() const;
  int is_ws0() const;
  int is_dorvor() const;
  int is_dorpor() const;
  int is_xca() const;
  int is_xch() const;
  int is_ins() const;
  // 1 to 16 in the order above, 0 when none fits.
  int find_type() const;

  // Slow-time extent from SENSING_START / SENSING_STOP; every other field
  // of the region becomes -1. 1 on success, 0 when the file cannot be read.
  int read_roi(ROI_Obj* roi) const;
  // 1 when the orbit file's validity strictly contains the product's
  // sensing start (the product must be of types 1 to 11).
  int check_dorvor(const std::string& orbit) const;

 private:
  int productStartsWith(const char* prefix) const;
  std::string fileName_;
};
