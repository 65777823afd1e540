#pragma once
#include <cstdint>
#include <string>

// Time base of the system: slow times are seconds since 01-JAN-1985 00:00:00
// UTC, days of 86400 seconds (leap seconds are handled only by TimeFormat).

// Modified Julian date of the ASAR products, counted from 01-JAN-2000.
struct mjd {
  std::int32_t days = 0;
  std::int32_t seconds = 0;
  std::int32_t microseconds = 0;
};

// Length of a date text "DD-MMM-YYYY HH:MM:SS.uuuuuu" with its terminator.
inline constexpr int kDateTextSize = 28;

// Seconds since 1985 of a text "DD-MMM-YYYY HH:MM:SS.ffffff". Up to 40
// leading characters that are not digits are skipped; the hour, minute and
// second fields may carry leading blanks and the time part may be missing.
// A bad text writes "Error: incorrect date format, code %d" on the error
// stream and gives 0.0.
double ascii2sec85(const char* text);
double ascii2sec85(const std::string& text);

// "DD-MMM-YYYY HH:MM:SS.uuuuuu" (microseconds rounded); text holds at least
// kDateTextSize bytes. A negative time is refused with -1.
int sec852myascii(double seconds, char* text);
int sec852myascii(double seconds, std::string& text);
int sec852ascii(double seconds, char* text);
int sec852ascii(double seconds, std::string& text);

// Parses "%2d-%3s-%4d %2d:%2d:%2d.%3d" (milliseconds) to seconds since 1985.
double utc_ch2num(const char* text);

double mjd2sec85(const mjd& date);
double mjd2sec85(const mjd* date);
mjd sec852mjd(double seconds);
void sec852mjd(double seconds, mjd* date);

// Calendar helpers of the time base.
bool isLeapYear(int year);
// Days since 01-JAN-1985 of a civil date (month 1..12).
long daysSince1985(int year, int month, int day);
// Civil date of a day count since 01-JAN-1985.
void civilFrom1985(long days, int& year, int& month, int& day);

// A time value with its calendar views and the leap-second correction.
class TimeFormat {
 public:
  TimeFormat() = default;
  explicit TimeFormat(double sec85) : value_(sec85) {}
  explicit TimeFormat(const char* text) : value_(ascii2sec85(text)) {}
  explicit TimeFormat(const mjd& date) : value_(mjd2sec85(date)) {}
  explicit TimeFormat(const mjd* date) : value_(mjd2sec85(date)) {}

  // Text form; -1 for a time before 1985.
  int getUTC(char* text) const { return sec852ascii(value_, text); }
  std::string getUTC() const;
  mjd getMJD() const { return sec852mjd(value_); }
  void getMJD(mjd* date) const { sec852mjd(value_, date); }
  double getSEC85() const { return value_; }
  int getYEAR() const;

  // Adds the leap seconds of the years from the year of the given time up to,
  // and not including, the year of this value; nothing when the given year
  // is not below this one.
  void add_leap_seconds(double sec85);
  void add_leap_seconds(const mjd* date);
  void add_leap_seconds(const char* text);

  // Leap seconds inserted during a year; 0 outside the table (1972-2006).
  static int leapSecondsOfYear(int year);
  static constexpr int kFirstTableYear = 1972;
  static constexpr int kLastTableYear = 2006;

 private:
  void addLeapFromYear(int year);
  double value_ = 0.0;
};
