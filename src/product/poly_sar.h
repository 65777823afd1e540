#pragma once
// Tables of two-variable polynomials of a scene: Doppler centroid, Doppler
// rate, slant/ground range conversions and incidence/look angles, one row
// per azimuth position, each row sorted by ascending taz0 by whoever fills it.
#include <string>
#include <vector>

#include "product/general_sar_base.h"

// value = c0 + c1 x + c2 y + c3 x y + c4 x^2 + c5 x^3 + c6 x^4,
// x = rg - trg0 (seconds of range time), y = az - taz0 (seconds since 1985).
class poly : public GeneralSAR_Base {
 public:
  poly();
  poly(const poly& other);
  poly& operator=(const poly& other);
  ~poly() override = default;

  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override;

  int EvaluatePoly(double rg, double az, double* out) const;
  double EvaluatePoly(double rg, double az) const;
  void clone(poly* target) const;

  // One row: "PolySAR/<section>" of the element document, or for readpar the
  // profile keys of section <section> when the document has no such row.
  int readpar(const std::string& file, const std::string& section);
  int writepar(const std::string& file, const std::string& section);

  // Names of the row family and its profile keys (empty: no profile form).
  virtual const char* tableName() const { return ""; }
  virtual const char* coefficientKey() const { return ""; }
  virtual const char* rangeReferenceKey() const { return ""; }
  virtual const char* azimuthReferenceKey() const { return ""; }

  // The coefficients as stored: c (7) here, e (14) in the extended shape.
  double* coefficientData() { return coefficients(); }
  int coefficientSize() const { return coefficientCount(); }

  double c[7] = {0, 0, 0, 0, 0, 0, 0};
  double trg0 = 0.0;
  double taz0 = 0.0;

 protected:
  virtual int coefficientCount() const { return 7; }
  virtual double* coefficients() { return c; }
  void copyPoly(const poly& other);
};

// value = e0 + e1 x + e2 y + e3 x y + e4 y^2 + e5 x y + e6 x y^2 + e7 x^2 y
//       + e8 x^3 + e9 x^4 + e10 x^5 + e11 y^3 + e12 y^4 + e13 y^5
// (x y appears twice and x^2 has no term, as the shape is defined).
class extended_poly : public poly {
 public:
  extended_poly();
  extended_poly(const extended_poly& other);
  extended_poly& operator=(const extended_poly& other);

  void refreshParameters() override;
  int EvaluatePoly(double rg, double az, double* out) const;
  double EvaluatePoly(double rg, double az) const;
  void clone(extended_poly* target) const;

  double e[14] = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};

 protected:
  int coefficientCount() const override { return 14; }
  double* coefficients() override { return e; }
};

// Row families. The extended ones exist only in the element document.
class polyDC : public poly {
 public:
  const char* tableName() const override { return "DopplerCentroid"; }
  const char* coefficientKey() const override { return "DCpoly"; }
  const char* rangeReferenceKey() const override { return "DCpoly_rgt0"; }
  const char* azimuthReferenceKey() const override { return "DCpoly_azt0"; }
  void clone(polyDC* target) const { poly::clone(target); }
  // Older key set: "DopCenPol_nCoeff", "DopCenRgRefTimes",
  // "DopCenAzRefSec85Times", "DopCenRangeCoeffs".
  int readparold(const std::string& file, const std::string& section);
};

class polyFR : public poly {
 public:
  const char* tableName() const override { return "DopplerRate"; }
  const char* coefficientKey() const override { return "FRpoly"; }
  const char* rangeReferenceKey() const override { return "FRPoly_rgt0"; }
  const char* azimuthReferenceKey() const override { return "FRpoly_azt0"; }
  void clone(polyFR* target) const { poly::clone(target); }
  // Older key sets: n = 5 or 3 from "AzimuthCoeff", n = 7 from
  // "DopRatRangeCoeff".
  int readparold(const std::string& file, const std::string& section, int n);
};

class polySL2GR : public poly {
 public:
  const char* tableName() const override { return "SlantToGround"; }
  const char* coefficientKey() const override { return "SL2GRpoly"; }
  const char* rangeReferenceKey() const override { return "SL2GRpoly_rgt0"; }
  const char* azimuthReferenceKey() const override { return "SL2GRpoly_azt0"; }
  void clone(polySL2GR* target) const { poly::clone(target); }
};

class polyGR2SL : public poly {
 public:
  const char* tableName() const override { return "GroundToSlant"; }
  const char* coefficientKey() const override { return "GR2SLpoly"; }
  const char* rangeReferenceKey() const override { return "GR2SLpoly_rgt0"; }
  const char* azimuthReferenceKey() const override { return "GR2SLpoly_azt0"; }
  void clone(polyGR2SL* target) const { poly::clone(target); }
};

class polySL2THETA : public poly {
 public:
  const char* tableName() const override { return "SlantToTheta"; }
  const char* coefficientKey() const override { return "SL2THETApoly"; }
  const char* rangeReferenceKey() const override { return "SL2THETApoly_rgt0"; }
  const char* azimuthReferenceKey() const override { return "SL2THETApoly_azt0"; }
  void clone(polySL2THETA* target) const { poly::clone(target); }
};

class polySL2PHI : public poly {
 public:
  const char* tableName() const override { return "SlantToPhi"; }
  const char* coefficientKey() const override { return "SL2PHIpoly"; }
  const char* rangeReferenceKey() const override { return "SL2PHIpoly_rgt0"; }
  const char* azimuthReferenceKey() const override { return "SL2PHIpoly_azt0"; }
  void clone(polySL2PHI* target) const { poly::clone(target); }
};

class extended_polyDC : public extended_poly {
 public:
  const char* tableName() const override { return "ExtendedDopplerCentroid"; }
  const char* coefficientKey() const override { return ""; }
  const char* rangeReferenceKey() const override { return ""; }
  const char* azimuthReferenceKey() const override { return ""; }
  void clone(extended_polyDC* target) const { extended_poly::clone(target); }
};

class extended_polyFR : public extended_poly {
 public:
  const char* tableName() const override { return "ExtendedDopplerRate"; }
  const char* coefficientKey() const override { return ""; }
  const char* rangeReferenceKey() const override { return ""; }
  const char* azimuthReferenceKey() const override { return ""; }
  void clone(extended_polyFR* target) const { extended_poly::clone(target); }
};

class polySAR : public GeneralSAR_Base {
 public:
  polySAR();
  polySAR(const polySAR&) = delete;
  polySAR& operator=(const polySAR&) = delete;
  ~polySAR() override = default;

  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override;

  int CreatePolys(int ndc, int nfr);
  int CreatePolys(int ndc, int nfr, int nsl2gr, int ngr2sl, int nsl2theta, int nsl2phi);
  int CreatePolys(int ndc, int nfr, int nsl2gr, int ngr2sl, int nsl2theta, int nsl2phi,
                  int ndcExt, int nfrExt);
  int DestroyPolys();

  // Value of the row chosen at az: the first row at or after az, the last
  // one beyond the table. 10 with a report when the table is empty.
  int EvaluateDC(double rg, double az, double* out) const;
  int EvaluateFR(double rg, double az, double* out) const;
  int EvaluateSL2GR(double rg, double az, double* out) const;
  int EvaluateGR2SL(double rg, double az, double* out) const;
  int EvaluateSL2THETA(double rg, double az, double* out) const;
  int EvaluateSL2PHI(double rg, double az, double* out) const;
  // Same, value returned (0.0 after the report when the table is empty).
  double EvaluateDC(double rg, double az) const;
  double EvaluateFR(double rg, double az) const;
  double EvaluateSL2GR(double rg, double az) const;
  double EvaluateGR2SL(double rg, double az) const;
  double EvaluateSL2THETA(double rg, double az) const;
  double EvaluateSL2PHI(double rg, double az) const;

  // Value of a polynomial interpolated between rows along azimuth. Only the
  // DC form keeps the azimuth terms; the others evaluate with y = 0.
  int EvaluateDCinterp(double rg, double az, double* out) const;
  int EvaluateFRinterp(double rg, double az, double* out) const;
  int EvaluateSL2GRinterp(double rg, double az, double* out) const;
  int EvaluateGR2SLinterp(double rg, double az, double* out) const;
  int EvaluateSL2THETAinterp(double rg, double az, double* out) const;
  int EvaluateSL2PHIinterp(double rg, double az, double* out) const;
  double EvaluateDCinterp(double rg, double az) const;
  double EvaluateFRinterp(double rg, double az) const;
  double EvaluateSL2GRinterp(double rg, double az) const;
  double EvaluateGR2SLinterp(double rg, double az) const;
  double EvaluateSL2THETAinterp(double rg, double az) const;
  double EvaluateSL2PHIinterp(double rg, double az) const;

  // Coefficients at az. DC and FR extrapolate linearly beyond the table, the
  // geometric ones copy the first or last row. Must not be called on an
  // empty table.
  int getDCpoly(double az, double coef[7]) const;
  int getFRpoly(double az, double coef[7]) const;
  int getSL2GRpoly(double az, double coef[7]) const;
  int getGR2SLpoly(double az, double coef[7]) const;
  int getSL2THETApoly(double az, double coef[7]) const;
  int getSL2PHIpoly(double az, double coef[7]) const;

  // Row number at az: 0 up to the first row, n-1 from the last row, else i
  // with t_i < az <= t_(i+1).
  int getDCnum(double az, int* num) const;
  int getFRnum(double az, int* num) const;
  int getSL2GRnum(double az, int* num) const;
  int getGR2SLnum(double az, int* num) const;
  int getSL2THETAnum(double az, int* num) const;
  int getSL2PHInum(double az, int* num) const;

  using GeneralSAR_Base::writehdr;
  // Element document first; otherwise the profile form. 1 when the file holds
  // no table at all.
  int readhdr(const std::string& file) override;
  // Element document: the "PolySAR" counts, then one element per row.
  int writehdr(const std::string& file) override;

  void clone(polySAR* target) const;

  std::vector<polyDC> DC;
  std::vector<polyFR> FR;
  std::vector<polySL2GR> SL2GR;
  std::vector<polyGR2SL> GR2SL;
  std::vector<polySL2THETA> SL2THETA;
  std::vector<polySL2PHI> SL2PHI;
  std::vector<extended_polyDC> DCExt;
  std::vector<extended_polyFR> FRExt;

  int ndc = 0;
  int nfr = 0;
  int nsl2gr = 0;
  int ngr2sl = 0;
  int nsl2theta = 0;
  int nsl2phi = 0;
  int ndcExt = 0;
  int nfrExt = 0;
};
