#pragma once
// Products and their auxiliary files: a level-0 scene knows its acquisition
// times and finds, in a directory of auxiliary products, the files valid at
// its start. The base class, and the ENVISAT products (instrument
// characterisation, external calibration and characterisation, DORIS
// orbits); each other sensor has its own in its folder (ERS: ers_level0.h).
// Times are seconds since 1985.
#include <string>

class AntennaPattern_Obj;

class SAR_product {
 public:
  SAR_product() = default;
  virtual ~SAR_product() = default;
  SAR_product(const SAR_product&) = default;
  SAR_product& operator=(const SAR_product&) = default;

  // 0 on success; the base knows no time and returns 1.
  virtual int getTimeStop(double* t);
  virtual int getTimeStart(double* t);

  // 1 for an empty name (nothing changed), else 0.
  int setfileName(const std::string& name);
  // Copies the name into out only if one is set (out is left alone
  // otherwise); returns 0.
  int getFileName(std::string& out) const;
  const std::string& fileName() const { return fileName_; }
  // The base is never valid.
  int isValid() const { return 0; }

 protected:
  std::string fileName_;
};

// ENVISAT auxiliary product named
// "<14 chars><generation>_<validity start>_<validity stop>" with each
// date-time as "YYYYMMDD_hhmmss".
class Envisat_AuxProduct : public SAR_product {
 public:
  // Validity start / stop from the name; "File not set, cannot find ...
  // time" at level 0 and 1 without a name.
  int getTimeStop(double* t) override;
  int getTimeStart(double* t) override;
  int isValid() const { return fileName_.empty() ? 0 : 1; }
  // Parses this object's base name; 1 when it does not parse.
  int parseASAfilename(double* generation, double* start, double* stop) const;
};

class Envisat_ASA_INS : public Envisat_AuxProduct {
 public:
  // The newest ASA_INS product in path valid at time. Found or not, 0; 1
  // when the directory cannot be opened.
  int getASA_INS(double time, const std::string& path);
};

class Envisat_ASA_XCH : public Envisat_AuxProduct {
 public:
  int getASA_XCH(double time, const std::string& path);
};

class Envisat_ASA_XCA : public Envisat_AuxProduct {
 public:
  int getASA_XCA(double time, const std::string& path);
  // Range (elevation) pattern of a swath and polarisation from the set file
  // into pattern; 0 and nothing read when no file is set.
  int readRgPattern(int swath, int polarisation, AntennaPattern_Obj* pattern) const;
};

// DORIS orbit "<12 chars>-P<date>_<time>_<start>_<stop>".
class Envisat_DorVor : public SAR_product {
 public:
  int getTimeStop(double* t) override;
  int getTimeStart(double* t) override;
  int isValid() const { return fileName_.empty() ? 0 : 1; }
  int parseOrbitName(double* start, double* stop) const;
  // The first orbit in directory order valid at time. 0 found or not; 1
  // for a negative time or a path that is empty or cannot be opened.
  int getDorVor(double time, const std::string& path);
};

// ENVISAT level-0 product; its file name is the product file.
class Envisat_level0 : public SAR_product {
 public:
  // From the sensing start and stop of the MPH; 1 without a file name.
  int getTimeStop(double* t) override;
  int getTimeStart(double* t) override;
  // Selector 0: XCA, INS, XCH, DOR_VOR; 1: XCA, INS, XCH; 2: INS; 3: XCA;
  // 4: XCH; 5: DOR_VOR; all from the same directory, stopping at the first
  // failure.
  int getAuxFiles(int selector, const std::string& path);
  int isAuxValid(int selector) const;
  std::string getASAINSFilename() const { return ins_.fileName(); }
  std::string getASAXCAFilename() const { return xca_.fileName(); }
  std::string getASAXCHFilename() const { return xch_.fileName(); }
  std::string getOrbitFilename() const { return dorvor_.fileName(); }

  Envisat_DorVor& dorvor() { return dorvor_; }
  Envisat_ASA_XCA& xca() { return xca_; }
  Envisat_ASA_INS& ins() { return ins_; }
  Envisat_ASA_XCH& xch() { return xch_; }

 private:
  Envisat_DorVor dorvor_;
  Envisat_ASA_XCA xca_;
  Envisat_ASA_INS ins_;
  Envisat_ASA_XCH xch_;
};
