#include "product/time_base.h"

#include <cctype>
#include <cmath>
#include <cstdio>
#include <cstring>

namespace {

constexpr const char* kMonths[12] = {"JAN", "FEB", "MAR", "APR", "MAY", "JUN",
                                     "JUL", "AUG", "SEP", "OCT", "NOV", "DEC"};
constexpr double kDay = 86400.0;
// 01-JAN-2000 counted from 01-JAN-1985: 15 years, three of them leap years.
constexpr long kDays1985To2000 = 15 * 365 + 3;

int daysInMonth(int year, int month) {
  static constexpr int kDays[12] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  return month == 2 && isLeapYear(year) ? 29 : kDays[month - 1];
}

// Month number 1..12 of a three-letter name, any case; 0 if unknown.
int monthNumber(const char* name) {
  for (int m = 0; m < 12; ++m) {
    bool same = true;
    for (int k = 0; k < 3 && same; ++k)
      same = std::toupper(static_cast<unsigned char>(name[k])) == kMonths[m][k];
    if (same) return m + 1;
  }
  return 0;
}

void skipBlanks(const char*& p) {
  while (*p == ' ' || *p == '\t') ++p;
}

// Reads an unsigned decimal of at most maxDigits digits.
bool readUnsigned(const char*& p, int maxDigits, long& value) {
  if (!std::isdigit(static_cast<unsigned char>(*p))) return false;
  value = 0;
  int n = 0;
  while (std::isdigit(static_cast<unsigned char>(*p)) && n < maxDigits) {
    value = value * 10 + (*p - '0');
    ++p;
    ++n;
  }
  return true;
}

int reportBadDate(int code) {
  std::fprintf(stderr, "Error: incorrect date format, code %d\n", code);
  return code;
}

int formatDate(double seconds, char* text) {
  if (seconds < 0.0) {
    std::fprintf(stderr, "Date should be later than 1-JAN-1985\n");
    return -1;
  }
  const long long total = std::llround(seconds * 1e6);
  const long long perDay = 86400LL * 1000000LL;
  const long days = static_cast<long>(total / perDay);
  long long rest = total % perDay;
  int year = 0, month = 0, day = 0;
  civilFrom1985(days, year, month, day);
  const auto micro = static_cast<unsigned>(rest % 1000000);
  rest /= 1000000;
  const auto sec = static_cast<unsigned>(rest % 60);
  rest /= 60;
  const auto min = static_cast<unsigned>(rest % 60);
  const auto hour = static_cast<unsigned>(rest / 60);
  std::snprintf(text, kDateTextSize, "%2.2u-%3s-%4.4u %2.2u:%2.2u:%2.2u.%06u",
                static_cast<unsigned>(day), kMonths[month - 1], static_cast<unsigned>(year), hour,
                min, sec, micro);
  return 0;
}

}  // namespace

bool isLeapYear(int year) { return (year % 4 == 0 && year % 100 != 0) || year % 400 == 0; }

long daysSince1985(int year, int month, int day) {
  // Days from civil, counted in eras of 400 years from 1 March of year 0.
  const long y = static_cast<long>(year) - (month <= 2 ? 1 : 0);
  const long era = (y >= 0 ? y : y - 399) / 400;
  const long yoe = y - era * 400;
  const long mp = (month + 9) % 12;
  const long doy = (153 * mp + 2) / 5 + day - 1;
  const long doe = yoe * 365 + yoe / 4 - yoe / 100 + doy;
  const long daysFrom1970 = era * 146097 + doe - 719468;
  return daysFrom1970 - 5479;  // 01-JAN-1985 is day 5479 after 01-JAN-1970
}

void civilFrom1985(long days, int& year, int& month, int& day) {
  const long z = days + 5479 + 719468;
  const long era = (z >= 0 ? z : z - 146096) / 146097;
  const long doe = z - era * 146097;
  const long yoe = (doe - doe / 1460 + doe / 36524 - doe / 146096) / 365;
  const long doy = doe - (365 * yoe + yoe / 4 - yoe / 100);
  const long mp = (5 * doy + 2) / 153;
  day = static_cast<int>(doy - (153 * mp + 2) / 5 + 1);
  month = static_cast<int>(mp < 10 ? mp + 3 : mp - 9);
  year = static_cast<int>(yoe + era * 400 + (month <= 2 ? 1 : 0));
}

double ascii2sec85(const char* text) {
  if (text == nullptr) {
    reportBadDate(1);
    return 0.0;
  }
  const char* p = text;
  for (int skipped = 0; skipped < 40 && *p != '\0' && !std::isdigit(static_cast<unsigned char>(*p));
       ++skipped)
    ++p;
  long day = 0, year = 0;
  if (!readUnsigned(p, 2, day) || *p != '-') {
    reportBadDate(1);
    return 0.0;
  }
  ++p;
  if (std::strlen(p) < 4 || p[3] != '-') {
    reportBadDate(2);
    return 0.0;
  }
  const int month = monthNumber(p);
  if (month == 0) {
    reportBadDate(2);
    return 0.0;
  }
  p += 4;
  if (!readUnsigned(p, 4, year)) {
    reportBadDate(3);
    return 0.0;
  }
  if (day < 1 || day > daysInMonth(static_cast<int>(year), month)) {
    reportBadDate(4);
    return 0.0;
  }
  long hour = 0, minute = 0, second = 0;
  double fraction = 0.0;
  skipBlanks(p);
  if (*p != '\0' && *p != '"') {
    if (!readUnsigned(p, 2, hour) || *p != ':') {
      reportBadDate(5);
      return 0.0;
    }
    ++p;
    skipBlanks(p);
    if (!readUnsigned(p, 2, minute) || *p != ':') {
      reportBadDate(5);
      return 0.0;
    }
    ++p;
    skipBlanks(p);
    if (!readUnsigned(p, 2, second)) {
      reportBadDate(5);
      return 0.0;
    }
    if (*p == '.') {
      ++p;
      double scale = 0.1;
      while (std::isdigit(static_cast<unsigned char>(*p))) {
        fraction += (*p - '0') * scale;
        scale *= 0.1;
        ++p;
      }
    }
    if (hour > 23 || minute > 59 || second > 60) {
      reportBadDate(6);
      return 0.0;
    }
  }
  const long days = daysSince1985(static_cast<int>(year), month, static_cast<int>(day));
  const double whole = static_cast<double>(days) * kDay + hour * 3600.0 + minute * 60.0 + second;
  return whole + fraction;
}

double ascii2sec85(const std::string& text) { return ascii2sec85(text.c_str()); }

int sec852myascii(double seconds, char* text) { return formatDate(seconds, text); }
int sec852myascii(double seconds, std::string& text) {
  char buffer[kDateTextSize] = {};
  const int status = formatDate(seconds, buffer);
  text = status == 0 ? buffer : "";
  return status;
}
int sec852ascii(double seconds, char* text) { return formatDate(seconds, text); }
int sec852ascii(double seconds, std::string& text) { return sec852myascii(seconds, text); }

double utc_ch2num(const char* text) {
  int day = 0, year = 0, hour = 0, minute = 0, second = 0, milli = 0;
  char name[4] = {};
  if (text == nullptr || std::sscanf(text, "%2d-%3s-%4d %2d:%2d:%2d.%3d", &day, name, &year, &hour,
                                     &minute, &second, &milli) != 7) {
    reportBadDate(7);
    return 0.0;
  }
  const int month = monthNumber(name);
  if (month == 0 || day < 1 || day > daysInMonth(year, month)) {
    reportBadDate(7);
    return 0.0;
  }
  return static_cast<double>(daysSince1985(year, month, day)) * kDay + hour * 3600.0 +
         minute * 60.0 + second + milli / 1000.0;
}

double mjd2sec85(const mjd& date) {
  return static_cast<double>(date.days + kDays1985To2000) * kDay + date.seconds +
         date.microseconds * 1e-6;
}
double mjd2sec85(const mjd* date) { return date ? mjd2sec85(*date) : 0.0; }

mjd sec852mjd(double seconds) {
  const long long total = std::llround((seconds - kDays1985To2000 * kDay) * 1e6);
  const long long perDay = 86400LL * 1000000LL;
  long long days = total / perDay;
  long long rest = total % perDay;
  if (rest < 0) {
    rest += perDay;
    --days;
  }
  mjd date;
  date.days = static_cast<std::int32_t>(days);
  date.seconds = static_cast<std::int32_t>(rest / 1000000);
  date.microseconds = static_cast<std::int32_t>(rest % 1000000);
  return date;
}
void sec852mjd(double seconds, mjd* date) {
  if (date) *date = sec852mjd(seconds);
}

std::string TimeFormat::getUTC() const {
  std::string text;
  sec852ascii(value_, text);
  return text;
}

int TimeFormat::getYEAR() const {
  int year = 0, month = 0, day = 0;
  civilFrom1985(static_cast<long>(std::floor(value_ / kDay)), year, month, day);
  return year;
}

int TimeFormat::leapSecondsOfYear(int year) {
  // Leap seconds inserted in each year from 1972 to 2006.
  static constexpr int kTable[kLastTableYear - kFirstTableYear + 1] = {
      2, 1, 1, 1, 1, 1, 1, 1, 0, 1, 1, 1, 0, 1, 0, 1, 0, 1,
      1, 0, 1, 1, 1, 1, 0, 1, 1, 0, 0, 0, 0, 0, 0, 1, 0};
  if (year < kFirstTableYear || year > kLastTableYear) return 0;
  return kTable[year - kFirstTableYear];
}

void TimeFormat::addLeapFromYear(int year) {
  const int own = getYEAR();
  int sum = 0;
  for (int y = year; y < own; ++y) sum += leapSecondsOfYear(y);
  value_ += sum;
}

void TimeFormat::add_leap_seconds(double sec85) { addLeapFromYear(TimeFormat(sec85).getYEAR()); }
void TimeFormat::add_leap_seconds(const mjd* date) {
  addLeapFromYear(TimeFormat(date).getYEAR());
}
void TimeFormat::add_leap_seconds(const char* text) {
  addLeapFromYear(TimeFormat(text).getYEAR());
}
