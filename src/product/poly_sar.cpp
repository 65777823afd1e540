#include "product/poly_sar.h"

#include <cstdio>
#include <string>

#include "base/status.h"
#include "diag/report.h"
#include "product/profile.h"

namespace {

constexpr double kBig = 1e300;
constexpr const char* kPolySAR = "PolySAR";

std::string rowSection(const char* name, int k) {
  char buffer[128];
  std::snprintf(buffer, sizeof buffer, "%s-%d", name, k);
  return buffer;
}

std::string rowClass(const std::string& section) {
  return std::string(kPolySAR) + "/" + section;
}

// Row of the table whose polynomial EvaluateXX uses: the first row at or
// after az, the last row beyond the table.
template <typename T>
int selectRow(const std::vector<T>& rows, double az) {
  const int n = static_cast<int>(rows.size());
  if (az <= rows[0].taz0) return 0;
  int i = 0;
  while (i < n - 1 && !(az <= rows[static_cast<size_t>(i)].taz0)) ++i;
  return i;
}

template <typename T>
int rowNumber(const std::vector<T>& rows, double az) {
  const int n = static_cast<int>(rows.size());
  if (n <= 1 || az <= rows[0].taz0) return 0;
  if (az >= rows[static_cast<size_t>(n - 1)].taz0) return n - 1;
  int i = 0;
  while (i < n - 2 && !(az <= rows[static_cast<size_t>(i + 1)].taz0)) ++i;
  return i;
}

void blend(const double* a, double wa, const double* b, double wb, double* out) {
  for (int k = 0; k < 7; ++k) out[k] = a[k] * wa + b[k] * wb;
}

// Coefficients at az, linear in azimuth between the two rows around az.
// Beyond the ends: extrapolated from the two end rows, or the end row copied.
template <typename T>
void interpolateRows(const std::vector<T>& rows, double az, bool extrapolate, double* out) {
  const int n = static_cast<int>(rows.size());
  if (n == 1) {
    for (int k = 0; k < 7; ++k) out[k] = rows[0].c[k];
    return;
  }
  const auto& first = rows[0];
  const auto& last = rows[static_cast<size_t>(n - 1)];
  if (az <= first.taz0) {
    if (!extrapolate) {
      for (int k = 0; k < 7; ++k) out[k] = first.c[k];
      return;
    }
    const double w = (az - first.taz0) / (rows[1].taz0 - first.taz0);
    blend(first.c, 1.0 - w, rows[1].c, w, out);
    return;
  }
  if (az >= last.taz0) {
    if (!extrapolate) {
      for (int k = 0; k < 7; ++k) out[k] = last.c[k];
      return;
    }
    const auto& before = rows[static_cast<size_t>(n - 2)];
    const double w = (az - last.taz0) / (last.taz0 - before.taz0);
    blend(last.c, 1.0 + w, before.c, -w, out);
    return;
  }
  const int i = rowNumber(rows, az);
  const auto& a = rows[static_cast<size_t>(i)];
  const auto& b = rows[static_cast<size_t>(i + 1)];
  const double w = (az - a.taz0) / (b.taz0 - a.taz0);
  blend(a.c, 1.0 - w, b.c, w, out);
}

template <typename T>
int evaluateRow(const std::vector<T>& rows, double rg, double az, double* out, const char* missing,
                int line, const char* function) {
  if (rows.empty()) {
    orv_add_report(missing, REPORT_ERROR, line, function, __FILE__);
    return STATUS_BAD_PARAMETER;
  }
  return rows[static_cast<size_t>(selectRow(rows, az))].EvaluatePoly(rg, az, out);
}

// Interpolated evaluation. keepAzimuth: the azimuth reference of the row is
// kept (DC); otherwise it is az itself and the azimuth terms vanish.
template <typename T>
int evaluateInterp(const std::vector<T>& rows, double rg, double az, double* out, bool extrapolate,
                   bool keepAzimuth, const char* missing, int line, const char* function) {
  if (rows.empty()) {
    orv_add_report(missing, REPORT_ERROR, line, function, __FILE__);
    return STATUS_BAD_PARAMETER;
  }
  poly p;
  interpolateRows(rows, az, extrapolate, p.c);
  const auto& row = rows[static_cast<size_t>(rowNumber(rows, az))];
  p.trg0 = row.trg0;
  p.taz0 = keepAzimuth ? row.taz0 : az;
  return p.EvaluatePoly(rg, az, out);
}

template <typename T>
void createTable(std::vector<T>& table, int& count, int n) {
  if (n <= 0) return;
  table = std::vector<T>(static_cast<size_t>(n));
  count = n;
}

template <typename T>
void destroyTable(std::vector<T>& table, int& count) {
  if (count > 0) {
    table.clear();
    table.shrink_to_fit();
    count = 0;
  }
}

template <typename T>
int readRows(std::vector<T>& rows, const std::string& file) {
  int status = 0;
  for (size_t k = 0; k < rows.size(); ++k) {
    if (rows[k].readpar(file, rowSection(rows[k].tableName(), static_cast<int>(k))) != 0)
      status = 1;
  }
  return status;
}

}  // namespace

// ---- poly -------------------------------------------------------------------

poly::poly() { createElementsVector(3); }

poly::poly(const poly& other) : GeneralSAR_Base() {
  createElementsVector(3);
  copyPoly(other);
}

poly& poly::operator=(const poly& other) {
  if (this != &other) copyPoly(other);
  return *this;
}

void poly::copyPoly(const poly& other) {
  for (int k = 0; k < 7; ++k) c[k] = other.c[k];
  trg0 = other.trg0;
  taz0 = other.taz0;
}

void poly::refreshParameters() {
  addElementDouble("pol", coefficients(), coefficientCount(), -kBig, kBig, true);
  addElementDouble("trg0_s", &trg0, 1, -kBig, kBig, true);
  addElementDouble("taz0_s", &taz0, 1, -kBig, kBig, true);
  setAllocationFlag(true);
}

int poly::EvaluatePoly(double rg, double az, double* out) const {
  *out = EvaluatePoly(rg, az);
  return 0;
}

double poly::EvaluatePoly(double rg, double az) const {
  const double x = rg - trg0;
  const double y = az - taz0;
  const double x2 = x * x;
  return c[0] + c[1] * x + c[2] * y + c[3] * x * y + c[4] * x2 + c[5] * x2 * x + c[6] * x2 * x2;
}

void poly::clone(poly* target) const {
  if (target) target->copyPoly(*this);
}

int poly::readpar(const std::string& file, const std::string& section) {
  if (readAuxiliaryFile(file, 1, rowClass(section))) return 0;
  if (*coefficientKey() == '\0') return STATUS_BAD_CONDITION;
  if (GetProfileDoubleArray(section, coefficientKey(), c, 7, file) != 0 ||
      GetProfileDoubleArray(section, rangeReferenceKey(), &trg0, 1, file) != 0 ||
      GetProfileDoubleArray(section, azimuthReferenceKey(), &taz0, 1, file) != 0)
    return STATUS_BAD_CONDITION;
  return 0;
}

int poly::writepar(const std::string& file, const std::string& section) {
  return writeAuxiliaryFile(file, 1, rowClass(section));
}

// ---- extended_poly ------------------------------------------------------------

extended_poly::extended_poly() { refreshParameters(); }

extended_poly::extended_poly(const extended_poly& other) : poly(other) {
  refreshParameters();
  for (int k = 0; k < 14; ++k) e[k] = other.e[k];
}

extended_poly& extended_poly::operator=(const extended_poly& other) {
  if (this != &other) {
    poly::operator=(other);
    for (int k = 0; k < 14; ++k) e[k] = other.e[k];
  }
  return *this;
}

void extended_poly::refreshParameters() { poly::refreshParameters(); }

int extended_poly::EvaluatePoly(double rg, double az, double* out) const {
  *out = EvaluatePoly(rg, az);
  return 0;
}

double extended_poly::EvaluatePoly(double rg, double az) const {
  const double x = rg - trg0;
  const double y = az - taz0;
  const double x2 = x * x, y2 = y * y;
  return e[0] + e[1] * x + e[2] * y + e[3] * x * y + e[4] * y2 + e[5] * x * y + e[6] * x * y2 +
         e[7] * x2 * y + e[8] * x2 * x + e[9] * x2 * x2 + e[10] * x2 * x2 * x + e[11] * y2 * y +
         e[12] * y2 * y2 + e[13] * y2 * y2 * y;
}

void extended_poly::clone(extended_poly* target) const {
  if (!target) return;
  poly::clone(target);
  for (int k = 0; k < 14; ++k) target->e[k] = e[k];
}

// ---- older key sets -------------------------------------------------------------

int polyDC::readparold(const std::string& file, const std::string& section) {
  int n = 0;
  if (GetMyProfileIntArray(section, "DopCenPol_nCoeff", &n, 1, file) != 0) return STATUS_BAD_CONDITION;
  int status = 0;
  if (GetProfileDoubleArray(section, "DopCenRgRefTimes", &trg0, 1, file) != 0) status = 1;
  if (GetProfileDoubleArray(section, "DopCenAzRefSec85Times", &taz0, 1, file) != 0) status = 1;
  if (n == 5) {
    double v[5];
    if (GetProfileDoubleArray(section, "DopCenRangeCoeffs", v, 5, file) != 0) return STATUS_BAD_CONDITION;
    c[0] = v[0];
    c[1] = v[1];
    c[2] = c[3] = 0.0;
    c[4] = v[2];
    c[5] = v[3];
    c[6] = v[4];
  } else if (n == 7) {
    if (GetProfileDoubleArray(section, "DopCenRangeCoeffs", c, 7, file) != 0) return STATUS_BAD_CONDITION;
  }
  return status;
}

int polyFR::readparold(const std::string& file, const std::string& section, int n) {
  if (n == 5) {
    double v[5];
    if (GetProfileDoubleArray(section, "AzimuthCoeff", v, 5, file) != 0) return STATUS_BAD_CONDITION;
    c[0] = v[0];
    c[1] = v[1];
    c[2] = c[3] = 0.0;
    c[4] = v[2];
    c[5] = v[3];
    c[6] = v[4];
  } else if (n == 3) {
    double v[3];
    if (GetProfileDoubleArray(section, "AzimuthCoeff", v, 3, file) != 0) return STATUS_BAD_CONDITION;
    c[0] = v[0];
    c[1] = v[1];
    c[3] = v[2];
  } else if (n == 7) {
    if (GetProfileDoubleArray(section, "DopRatRangeCoeff", c, 7, file) != 0) return STATUS_BAD_CONDITION;
  }
  return 0;
}

// ---- polySAR ----------------------------------------------------------------------

polySAR::polySAR() { createElementsVector(8); }

void polySAR::refreshParameters() {
  addElementInt("ndc", &ndc, 1, 0, 2147483647, true);
  addElementInt("nfr", &nfr, 1, 0, 2147483647, true);
  addElementInt("nsl2gr", &nsl2gr, 1, 0, 2147483647, true);
  addElementInt("ngr2sl", &ngr2sl, 1, 0, 2147483647, true);
  addElementInt("nsl2theta", &nsl2theta, 1, 0, 2147483647, true);
  addElementInt("nsl2phi", &nsl2phi, 1, 0, 2147483647, true);
  addElementInt("ndcExt", &ndcExt, 1, 0, 2147483647, false);
  addElementInt("nfrExt", &nfrExt, 1, 0, 2147483647, false);
  setAllocationFlag(true);
}

int polySAR::CreatePolys(int ndc_, int nfr_) {
  createTable(DC, ndc, ndc_);
  createTable(FR, nfr, nfr_);
  nsl2gr = ngr2sl = nsl2theta = nsl2phi = ndcExt = nfrExt = 0;
  return 0;
}

int polySAR::CreatePolys(int ndc_, int nfr_, int nsl2gr_, int ngr2sl_, int nsl2theta_,
                         int nsl2phi_) {
  createTable(DC, ndc, ndc_);
  createTable(FR, nfr, nfr_);
  createTable(SL2GR, nsl2gr, nsl2gr_);
  createTable(GR2SL, ngr2sl, ngr2sl_);
  createTable(SL2THETA, nsl2theta, nsl2theta_);
  createTable(SL2PHI, nsl2phi, nsl2phi_);
  return 0;
}

int polySAR::CreatePolys(int ndc_, int nfr_, int nsl2gr_, int ngr2sl_, int nsl2theta_,
                         int nsl2phi_, int ndcExt_, int nfrExt_) {
  CreatePolys(ndc_, nfr_, nsl2gr_, ngr2sl_, nsl2theta_, nsl2phi_);
  createTable(DCExt, ndcExt, ndcExt_);
  createTable(FRExt, nfrExt, nfrExt_);
  return 0;
}

int polySAR::DestroyPolys() {
  destroyTable(DC, ndc);
  destroyTable(FR, nfr);
  destroyTable(SL2GR, nsl2gr);
  destroyTable(GR2SL, ngr2sl);
  destroyTable(SL2THETA, nsl2theta);
  destroyTable(SL2PHI, nsl2phi);
  destroyTable(DCExt, ndcExt);
  destroyTable(FRExt, nfrExt);
  return 0;
}

#define ORV_EVAL(Name, Table, Missing)                                                     \
  int polySAR::Evaluate##Name(double rg, double az, double* out) const {                   \
    return evaluateRow(Table, rg, az, out, Missing, __LINE__, __func__);                   \
  }                                                                                        \
  double polySAR::Evaluate##Name(double rg, double az) const {                             \
    double v = 0.0;                                                                        \
    return Evaluate##Name(rg, az, &v) == 0 ? v : 0.0;                                      \
  }
ORV_EVAL(DC, DC, "NO DC poly available")
ORV_EVAL(FR, FR, "NO FR poly available")
ORV_EVAL(SL2GR, SL2GR, "NO SL2GR poly available")
ORV_EVAL(GR2SL, GR2SL, "NO GR2SL poly available")
ORV_EVAL(SL2THETA, SL2THETA, "NO SL2THETA poly available")
ORV_EVAL(SL2PHI, SL2PHI, "NO SL2PHI poly available")
#undef ORV_EVAL

#define ORV_INTERP(Name, Table, Missing, Extrapolate, KeepAz)                                \
  int polySAR::Evaluate##Name##interp(double rg, double az, double* out) const {             \
    return evaluateInterp(Table, rg, az, out, Extrapolate, KeepAz, Missing, __LINE__,        \
                          __func__);                                                         \
  }                                                                                          \
  double polySAR::Evaluate##Name##interp(double rg, double az) const {                       \
    double v = 0.0;                                                                          \
    return Evaluate##Name##interp(rg, az, &v) == 0 ? v : 0.0;                                \
  }                                                                                          \
  int polySAR::get##Name##poly(double az, double coef[7]) const {                            \
    interpolateRows(Table, az, Extrapolate, coef);                                           \
    return 0;                                                                                \
  }                                                                                          \
  int polySAR::get##Name##num(double az, int* num) const {                                   \
    *num = rowNumber(Table, az);                                                             \
    return 0;                                                                                \
  }
ORV_INTERP(DC, DC, "NO DC poly available", true, true)
ORV_INTERP(FR, FR, "NO FR poly available", true, false)
ORV_INTERP(SL2GR, SL2GR, "NO SL2GR poly available", false, false)
ORV_INTERP(GR2SL, GR2SL, "NO GR2SL poly available", false, false)
ORV_INTERP(SL2THETA, SL2THETA, "NO SL2THETA poly available", false, false)
ORV_INTERP(SL2PHI, SL2PHI, "NO SL2PHI poly available", false, false)
#undef ORV_INTERP

int polySAR::writehdr(const std::string& file) {
  // One document for the counts and every row: the rows are written at the
  // paths their own element tables use ("PolySAR/<name>-<k>/pol", ...), and
  // the file is saved once for all of them.
  if (setAuxiliaryFile(file, 1, kPolySAR) != 0 || writeAuxiliaryFile() != 0) {
    unsetAuxiliaryFile();
    return STATUS_BAD_CONDITION;
  }
  orvanexml& doc = getXml();
  int status = 0;
  const auto rows = [&](auto& table) {
    for (size_t k = 0; k < table.size(); ++k) {
      auto& row = table[k];
      const std::string base = rowClass(rowSection(row.tableName(), static_cast<int>(k)));
      status |= doc.writeDouble(1, base + "/pol", row.coefficientData(), row.coefficientSize());
      status |= doc.writeDouble(1, base + "/trg0_s", &row.trg0, 1);
      status |= doc.writeDouble(1, base + "/taz0_s", &row.taz0, 1);
    }
  };
  rows(DC);
  rows(FR);
  rows(SL2GR);
  rows(GR2SL);
  rows(SL2THETA);
  rows(SL2PHI);
  rows(DCExt);
  rows(FRExt);
  status |= doc.write();
  unsetAuxiliaryFile();
  return status != 0 ? 1 : 0;
}

int polySAR::readhdr(const std::string& file) {
  DestroyPolys();
  int counts[8] = {0, 0, 0, 0, 0, 0, 0, 0};
  const bool document = setAuxiliaryFile(file, 1, kPolySAR) == 0 && readAuxiliaryFile() == 0;
  if (document) {
    const int read[8] = {ndc, nfr, nsl2gr, ngr2sl, nsl2theta, nsl2phi, ndcExt, nfrExt};
    for (int k = 0; k < 8; ++k) counts[k] = read[k] > 0 ? read[k] : 0;
  } else {
    unsetAuxiliaryFile();
    const char* keys[6] = {"nDopCenDataSet", "nFMRateDataSet", "nSlant2Ground",
                           "nGround2Slant",  "nSlant2Theta",   "nSlant2Phi"};
    bool any = false;
    for (int k = 0; k < 6; ++k) {
      int n = 0;
      if (GetMyProfileIntArray(kPolySAR, keys[k], &n, 1, file) != 0) n = 0;
      counts[k] = n > 0 ? n : 0;
      any = any || counts[k] > 0;
    }
    if (!any) return STATUS_BAD_CONDITION;
  }
  ndc = nfr = nsl2gr = ngr2sl = nsl2theta = nsl2phi = ndcExt = nfrExt = 0;
  CreatePolys(counts[0], counts[1], counts[2], counts[3], counts[4], counts[5], counts[6],
              counts[7]);
  int status = 0;
  if (document) {
    // Every row from the one open document.
    orvanexml& doc = getXml();
    const auto rows = [&](auto& table) {
      for (size_t k = 0; k < table.size(); ++k) {
        auto& row = table[k];
        const std::string base = rowClass(rowSection(row.tableName(), static_cast<int>(k)));
        status |= doc.readDouble(1, base + "/pol", row.coefficientData(), row.coefficientSize());
        status |= doc.readDouble(1, base + "/trg0_s", &row.trg0, 1);
        status |= doc.readDouble(1, base + "/taz0_s", &row.taz0, 1);
      }
    };
    rows(DC);
    rows(FR);
    rows(SL2GR);
    rows(GR2SL);
    rows(SL2THETA);
    rows(SL2PHI);
    rows(DCExt);
    rows(FRExt);
    unsetAuxiliaryFile();
  } else {
    status |= readRows(DC, file);
    status |= readRows(FR, file);
    status |= readRows(SL2GR, file);
    status |= readRows(GR2SL, file);
    status |= readRows(SL2THETA, file);
    status |= readRows(SL2PHI, file);
  }
  if (status != 0) {
    ORV_REPORT("Polynomial rows missing in file : " + file, REPORT_WARNING);
    DestroyPolys();
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

void polySAR::clone(polySAR* target) const {
  if (!target || target == this) return;
  target->DestroyPolys();
  target->DC = DC;
  target->FR = FR;
  target->SL2GR = SL2GR;
  target->GR2SL = GR2SL;
  target->SL2THETA = SL2THETA;
  target->SL2PHI = SL2PHI;
  target->DCExt = DCExt;
  target->FRExt = FRExt;
  target->ndc = ndc;
  target->nfr = nfr;
  target->nsl2gr = nsl2gr;
  target->ngr2sl = ngr2sl;
  target->nsl2theta = nsl2theta;
  target->nsl2phi = nsl2phi;
  target->ndcExt = ndcExt;
  target->nfrExt = nfrExt;
}
