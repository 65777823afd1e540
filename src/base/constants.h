#pragma once

// Physical and geodetic constants used throughout without being passed.
namespace consts {
inline constexpr double kSpeedOfLight = 299792458.0;          // m/s
inline constexpr double kWgs84A = 6378137.0;                  // semi-major axis, m
inline constexpr double kWgs84B = 6356752.314245;             // semi-minor axis, m
inline constexpr double kEarthRotation = 7.292115189334571e-5; // rad/s
inline constexpr double kPi = 3.14159265358979323846;
inline constexpr double kUnsetReal = -999.0;                  // value of an unset real
inline constexpr const char* kUnsetString = "NOT_AVAILABLE";  // value of an unset string
}  // namespace consts
