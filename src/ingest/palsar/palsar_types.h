#pragma once
// Type tests of ALOS PALSAR products.
#include <string>

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
