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

// Type tests of ALOS PALSAR products from the leader and the image file.
class PalsarTypes {
 public:
  PalsarTypes() = default;
  PalsarTypes(const std::string& leader, const std::string& image) : leader_(leader), image_(image) {}

  void setFiles(const std::string& leader, const std::string& image) {
    leader_ = leader;
    image_ = image;
  }

  int is_level0() const;
  // 1 ERSDAC layout, 0 JAXA; 9 when the leader cannot be opened, 4 when
  // it is short (both reported).
  int is_ersdac() const;
  int is_scansar_wide1() const;
  int is_singlepol() const;
  int is_doublepol() const;
  int is_quadpol() const;
  // 1 single, 2 double, 3 quad polarisation, 4 ScanSAR wide, else 0.
  int find_type() const;
  // JAXA polarisation of the image file: 0 HH, 1 HV, 2 VH, 3 VV, 4 unknown.
  int getPol() const;
  // Polarisation of a channel of an ERSDAC product (JAXA: getPol()).
  int get_ersdac_Pol(int channel) const;

 private:
  int polCount(int jaxaCode, int ersdacCount) const;
  std::string leader_;
  std::string image_;
};
