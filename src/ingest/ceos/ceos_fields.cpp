#include "ingest/ceos/ceos_fields.h"

#include <cmath>

double FtoDouble(const char* text, int length) {
  int point = length;
  for (int i = 0; i < length; ++i)
    if (text[i] == '.') {
      point = i;
      break;
    }
  double value = 0.0, place = 1.0;
  for (int i = point - 1; i >= 0; --i) {
    const char ch = text[i];
    if (ch == ' ' || ch == '-') break;
    if (ch >= '0' && ch <= '9') {
      value += (ch - '0') * place;
      place *= 10.0;
    }
  }
  place = 0.1;
  for (int i = point + 1; i < length; ++i) {
    const char ch = text[i];
    if (ch == ' ') continue;
    if (ch < '0' || ch > '9') break;
    value += (ch - '0') * place;
    place *= 0.1;
  }
  for (int i = 0; i < length; ++i) {
    if (text[i] == ' ') continue;
    if (text[i] == '-') value = -value;
    break;
  }
  return value;
}

double FtoDouble2(const char* text, int length) {
  int letter = length;
  for (int i = 0; i < length; ++i)
    if (text[i] == 'E' || text[i] == 'e') {
      letter = i;
      break;
    }
  const double mantissa = FtoDouble(text, letter);
  if (letter >= length - 1) return mantissa;
  int exponent = 0;
  for (int i = letter + 2; i < length; ++i) {
    if (text[i] < '0' || text[i] > '9') break;
    // Beyond any double's range the scale is infinite anyway; stop before the
    // exponent itself overflows on a damaged field.
    if (exponent < 100000) exponent = exponent * 10 + (text[i] - '0');
  }
  const double scale = std::pow(10.0, exponent);
  return text[letter + 1] == '+' ? mantissa * scale : mantissa / scale;
}

int ch2int(const char* text, int length) {
  long value = 0, place = 1;
  for (int i = length - 1; i >= 0; --i) {
    const char ch = text[i];
    if (ch == ' ') break;
    if (ch == '-') return static_cast<int>(-value);
    if (ch >= '0' && ch <= '9') {
      if (place > 100000000000000000L) break;  // more digits than any field holds: damaged
      value += (ch - '0') * place;
      place *= 10;
    }
  }
  return static_cast<int>(value);
}

std::string ceosText(const char* text, int length) {
  std::string s(text, static_cast<std::size_t>(length));
  if (const auto nul = s.find('\0'); nul != std::string::npos) s.resize(nul);
  return s;
}
