#pragma once
// Platform trajectory of one scene: a uniform table of Earth-fixed state
// vectors turned into quartic polynomials over sliding five-vector windows,
// with a straight-line model and a coarse five-vector model over the whole
// span as first guesses of the inverse solution. Every geometric query of the
// focuser goes through it. Not safe to share between threads: each query may
// move the selected window (use clone()).
#include <string>
#include <vector>

#include "product/general_sar_base.h"

class ROI_Obj;
struct grPtRecord;
struct OrbitRecords;
class polyDC;
class polyFR;
class polySL2THETA;
class polySL2PHI;
class polySL2GR;
class polyGR2SL;
class geoCoords_Obj;
class GSRoi_Obj;

class GeneralSAROrbit : public GeneralSAR_Base {
 public:
  // Wavelength 0.05623564240544047 m (C band).
  GeneralSAROrbit();
  explicit GeneralSAROrbit(double lambda);
  ~GeneralSAROrbit() override;

  // With nSV 0 does nothing; otherwise (re)allocates pos, vel and the window
  // polynomials and re-aims the parameter table. 7 when memory is out.
  int createBuffers() override;
  int destroyBuffers() override;
  // "pSV_m", "vSV_mOs", "t0SV_s", "dtSV_s", "nSV_n".
  void refreshParameters() override;

  using GeneralSAR_Base::writehdr;
  // XML element document, channel 1, class "StateVectorData"; returns 0.
  int writehdr(const std::string& file) override;
  // XML element document; if absent, profile keys of section
  // "StateVectorData" (4 when one is missing). Ends in computeApproximateSV.
  int readhdr(const std::string& file) override;

  // Table life.
  int SVCreate(double t0, double dt, int n);
  int SVDestroy();
  // All window polynomials and both cheap models; call after filling pos, vel.
  int computeApproximateSV();
  // Window selection.
  int updatePolys(double t);
  int getCurrentSV(double t);

  // Position and velocity from the selected window's polynomials; 1 without
  // vectors. The pointer forms return scratch storage of this object.
  int SVGetPos(double t, double out[3]);
  int SVGetVel(double t, double out[3]);
  double* SVGetPos(double t);
  double* SVGetVel(double t);

  // Ground point (Earth rotation 0, WGS-84); always 0.
  int sat2earth(const double pos[3], const double vel[3], double tau, double out[3]);
  int sat2earth(double t, double tau, double out[3]);
  int sat2earth(double t, double tau, double fd, double out[3]);
  double* sat2earth(double t, double tau);
  double* sat2earth(double t, double tau, double fd);
  // Closed-form ground point for a squinted line of sight.
  int sat2earthSquinted(double t, double tau, double fd, double out[3], double* tauOut);
  // One coordinate of the ground point; with h on the ellipsoid raised by h.
  double sat2earthX(double t, double tau);
  double sat2earthY(double t, double tau);
  double sat2earthZ(double t, double tau);
  double sat2earthX(double t, double tau, double h);
  double sat2earthY(double t, double tau, double h);
  double sat2earthZ(double t, double tau, double h);

  // Inverse solutions: azimuth time *t (seconds since 1985) and two-way range
  // time *tau of a ground point. earth2sat: 1 without vectors (outputs -1.0),
  // 12 when the solution fails.
  int earth2satLinear(const double xyz[3], double* t, double* tau, double fd);
  int earth2satLinear(const double xyz[3], double* t, double* tau);
  int earth2sat(const double xyz[3], double* t, double* tau, double fd);
  int earth2sat(const double xyz[3], double* t, double* tau);
  int earth2satPrecise(const double xyz[3], double* t, double* tau, double fd);
  int earth2satPrecise(const double xyz[3], double* t, double* tau);
  double earth2satRange(const double xyz[3]);
  double earth2satAzimuth(const double xyz[3]);
  // Geodetic forms, degrees and metres.
  double earth2satRange(double lat, double lon, double h);
  double earth2satAzimuth(double lat, double lon, double h);

  // Queries through the ground-point record; angles in degrees.
  int SVGetLatLon(double t, double tau, double fd, double* lat, double* lon);
  int SVGetLatLon(double t, double tau, double* lat, double* lon);
  int SVGetAngles(double t, double tau, double fd, double* inc, double* look);
  int SVGetAngles(double t, double tau, double* inc, double* look);
  int SVGetFR(double t, double tau, double fd, double* fr);
  int SVGetSatSpeed(double t, double tau, double fd, double* speed);
  double SVGetLat(double t, double tau);
  double SVGetLon(double t, double tau);
  double SVGetAnglesIncidence(double t, double tau);
  double SVGetAnglesLook(double t, double tau);

  // Doppler rate polynomial across a region (order 2 in range).
  int SVGetFRpoly(const ROI_Obj* roi, const polyDC* dc, polyFR* fr);
  int SVGetFRpoly_v2(const ROI_Obj* roi, const polyDC* dc, polyFR* fr);

  // Corners and centre of a region (fd 0, height 0), slots by flight
  // direction; the first failure is passed on.
  int SVGetGeoCoords(geoCoords_Obj* geo, GSRoi_Obj* roi);
  int SVGetGeoCoords(geoCoords_Obj* geo, const ROI_Obj* roi);
  // Geolocation polynomials of a region (angle polynomials in radians of look
  // and sine of incidence; ground range in metres).
  int SVGetSlantToAnglesPolys(const ROI_Obj* roi, const polyDC* dc, polySL2THETA* theta,
                              polySL2PHI* phi);
  int SVGetTimeToAnglesPolys(const ROI_Obj* roi, const polyDC* dc, polySL2THETA* theta,
                             polySL2PHI* phi);
  int SVGetGroundToSlantPolys(const ROI_Obj* roi, const polyDC* dc, polySL2GR* sl2gr,
                              polyGR2SL* gr2sl);
  int SVGetGroundToTimePolys(const ROI_Obj* roi, const polyDC* dc, polySL2GR* sl2gr,
                             polyGR2SL* gr2sl);

  // Straight-line frame of a velocity: rotation m (row by row) and signed speed.
  static int computeRotationMatrix(const double v[3], double m[9], double* speed);
  int clone(GeneralSAROrbit* dst) const;
  bool isAscending() const;
  void setLambda(double value) { lambda = value; }
  void setLookSign(int value) { lookSign = value; }
  double getLambda() const { return lambda; }
  int getLookSign() const { return lookSign; }

  // Loaders from precise orbit files (5 s tables).
  int GetStateVectorsENVI(const std::string& path, double t, double duration);
  int GetStateVectorsRADAR(const std::string& path, double t, double duration);
  int GetStateVectorsPAL(const std::string& path, double t, double duration);
  int GetStateVectorsERS(const std::string& path, double t, double duration,
                         const std::string& satellite);
  int extract_palsar_POD(const std::string& path, double t, double duration);
  int extract_palsar_COD(const std::string& path, double t, double duration);
  int extract_palsar_lea(const std::string& path, double t, double duration);

  // Inspection of the models.
  double getCurT0() const { return curT0; }
  int getCurrentWindow() const { return curWindow; }
  int getNumberOfWindows() const { return nWindows; }
  const double* getCurPolyX() const { return curWindow >= 0 ? &polyX[5 * curWindow] : nullptr; }
  const double* getCurPolyY() const { return curWindow >= 0 ? &polyY[5 * curWindow] : nullptr; }
  const double* getCurPolyZ() const { return curWindow >= 0 ? &polyZ[5 * curWindow] : nullptr; }
  const double* getCurPos() const { return curWindow >= 0 ? &pos[3 * curWindow] : nullptr; }
  const double* getCurVel() const { return curWindow >= 0 ? &vel[3 * curWindow] : nullptr; }
  const double* getCoarsePolyX() const { return coarsePolyX; }
  const double* getCoarsePolyY() const { return coarsePolyY; }
  const double* getCoarsePolyZ() const { return coarsePolyZ; }
  double getCoarseT0() const { return coarseT0; }
  double getCoarseDt() const { return coarseDt; }
  const double* getApproxRotation() const { return approxRotation; }
  double getApproxSpeed() const { return approxSpeed; }
  bool hasVectors() const { return !pos.empty(); }

  // The table: x y z per vector, Earth-fixed, metres and metres per second.
  std::vector<double> pos;
  std::vector<double> vel;
  double t0 = 0.0;
  double dt = 0.0;
  int nSV = 0;
  double lambda = 0.05623564240544047;

 protected:
  // Record query of the selected window: fd Doppler, h height.
  int recordQuery(double t, double tau, double fd, double h, grPtRecord* rec);
  int loadFromPoints(const OrbitRecords& rec, double t, double duration);
  void clearModels();

  int curWindow = -1;
  double curT0 = 0.0;
  double coarsePos[15] = {};
  double coarseVel[15] = {};
  double coarseT0 = 0.0;
  double coarseDt = 0.0;
  double coarsePolyX[5] = {};
  double coarsePolyY[5] = {};
  double coarsePolyZ[5] = {};
  double approxRotation[9] = {};
  double approxSpeed = 0.0;
  std::vector<double> polyX, polyY, polyZ;  // 5 per window
  int nWindows = 0;
  double scratchXYZ[3] = {};
  int lookSign = 1;
};

// Interferometric pair: this orbit is the master, `slave` the second orbit.
class GeneralSARInterf : public GeneralSAROrbit {
 public:
  GeneralSARInterf() = default;
  explicit GeneralSARInterf(double lambda) : GeneralSAROrbit(lambda) {}
  // Baseline at master time t and range time tau: components along the
  // horizontal, the line of sight and the normal. 1 if the slave inverse fails.
  int getBaseline(double t, double tau);

  GeneralSAROrbit slave;
  double Bh = 0.0, Bl = 0.0, Bn = 0.0;  // horizontal, line of sight, normal
  double slaveT = 0.0, slaveTau = 0.0;
  double masterPos[3] = {}, slavePos[3] = {}, groundPoint[3] = {};
};

// Older, smaller state-vector object: one polynomial of order nSV - 1
// through all vectors.
class SAROrbitStateVectors_Obj : public GeneralSAR_Base {
 public:
  SAROrbitStateVectors_Obj();
  ~SAROrbitStateVectors_Obj() override = default;

  int createBuffers() override;
  int destroyBuffers() override;
  void refreshParameters() override;
  // Reads the "StateVectorData" block (element document, else profile
  // keys) and fits the polynomials; 1 when there is none. Writing is left to
  // GeneralSAROrbit, which owns that block in a product record, so writehdr
  // is the base's (nothing written).
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override;

  int SVCreate(double t0, double dt, int n);
  int SVPolyCompute();
  int SVGetPos(double t, double out[3]) const;
  int SVGetVel(double t, double out[3]) const;
  // Fd 0, height 0, vectors 0 to 4 of the table.
  int SVGetLatLon(double t, double tau, double lambda, double* lat, double* lon) const;
  int SVGetAngles(double t, double tau, double lambda, double* inc, double* look) const;

  std::vector<double> pos, vel;
  double t0 = -999.0;
  double dt = -999.0;
  int nSV = -999;
  std::vector<double> polyPX, polyPY, polyPZ, polyVX, polyVY, polyVZ;
  int lookSign = 1;
};

// Free-function loaders of the older object.
int GetStateVectorsENVI(const std::string& path, double t, double duration, int n,
                        SAROrbitStateVectors_Obj* sv);
int GetStateVectorsRADAR(const std::string& path, double t, double duration, int n,
                         SAROrbitStateVectors_Obj* sv);
