#pragma once
// Geometry of the raw-scene simulator: its own calendar, its own Keplerian
// orbit in the Earth-fixed frame, WGS-84 geodesy, the exact closest approach
// of a point, and the geodetic form of the DEOS orbit arcs. Nothing here
// depends on the focuser's orbit or geometry code.
#include <array>
#include <string>

using Vec3 = std::array<double, 3>;

inline Vec3 operator+(const Vec3& a, const Vec3& b) { return {a[0] + b[0], a[1] + b[1], a[2] + b[2]}; }
inline Vec3 operator-(const Vec3& a, const Vec3& b) { return {a[0] - b[0], a[1] - b[1], a[2] - b[2]}; }
inline Vec3 operator*(double s, const Vec3& a) { return {s * a[0], s * a[1], s * a[2]}; }
inline double dot(const Vec3& a, const Vec3& b) { return a[0] * b[0] + a[1] * b[1] + a[2] * b[2]; }
inline Vec3 cross(const Vec3& a, const Vec3& b) {
  return {a[1] * b[2] - a[2] * b[1], a[2] * b[0] - a[0] * b[2], a[0] * b[1] - a[1] * b[0]};
}
double norm(const Vec3& a);

// ---- calendar (seconds since 01-JAN-1985 00:00:00, days of 86400 s) ----
struct CivilTime {
  int year = 1985, month = 1, day = 1, hour = 0, minute = 0;
  double second = 0.0;
};
double simSec85(const CivilTime& c);
CivilTime simCivil(double sec85);
// Day of the year, 1 for 1 January.
int simDayOfYear(int year, int month, int day);
// "DD-MMM-YYYY HH:MM:SS.mmm" (24 characters), milliseconds rounded.
std::string simDateText(double sec85);
// "YYYYMMDDhhmmssttt" (17 characters), milliseconds rounded.
std::string simCompactDateText(double sec85);
// Parses "DD-MMM-YYYY HH:MM:SS[.fff...]"; returns false on a bad text.
bool simParseDate(const std::string& text, double& sec85);
// English upper-case month abbreviation of month 1..12.
const char* simMonthName(int month);

// ---- orbit ----
struct KeplerElements {
  double semiMajorAxis = 7159500.0;  // m
  double eccentricity = 0.0011;
  double inclinationDeg = 98.52;
  double nodeLongitudeDeg = 0.0;  // Earth-fixed longitude of the ascending node at the epoch
  double argPerigeeDeg = 90.0;
  double meanAnomalyDeg = -50.0;  // at the epoch (argument of latitude 40 deg)
  double epoch = 0.0;             // seconds since 1985
};

struct StateVector {
  double t = 0.0;
  Vec3 pos{};
  Vec3 vel{};
};

// Two-body orbit in an inertial frame whose x axis points at Greenwich at the
// epoch; positions and velocities are returned in the Earth-fixed frame.
class SimOrbit {
 public:
  SimOrbit() = default;
  explicit SimOrbit(const KeplerElements& k);
  StateVector at(double t) const;
  const KeplerElements& elements() const { return k_; }
  double meanMotion() const { return n_; }

 private:
  KeplerElements k_{};
  double n_ = 0.0;
};

// ---- geodesy (WGS-84) ----
Vec3 geodeticToEcef(double latDeg, double lonDeg, double height);
void ecefToGeodetic(const Vec3& p, double& latDeg, double& lonDeg, double& height);

// DEOS arcs: geodetic to Cartesian as the arc convention defines it, and its
// exact inverse (Newton on the forward form).
Vec3 deosToEcef(double latDeg, double lonDeg, double height);
void ecefToDeos(const Vec3& p, double& latDeg, double& lonDeg, double& height);

// ---- acquisition geometry ----
// Time of closest approach of a fixed Earth point, searched around tGuess:
// solves (S(t) - P) . V(t) = 0 by safeguarded Newton iterations.
double closestApproachTime(const SimOrbit& orbit, const Vec3& target, double tGuess);
// Instantaneous Doppler of a fixed point, Hz: -2 / lambda dR/dt.
double pointDoppler(const StateVector& sv, const Vec3& target, double lambda);
// The point at height h, on the look side (+1 right of the velocity, -1
// left), at zero Doppler of time t and slant range R. Returns false when no
// solution converges.
bool zeroDopplerPoint(const SimOrbit& orbit, double t, double range, double height, int lookSign,
                      double& latDeg, double& lonDeg);
