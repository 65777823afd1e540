#pragma once
// Readers of the fixed-width text fields of CEOS records.
#include <string>

// Decimal with a point: the digits left of the point back to a blank or a
// minus, the digits right of it (blanks skipped), negative when the first
// non-blank character is '-'. A field without a point is read whole.
double FtoDouble(const char* text, int length);
// Mantissa with a point and an exponent introduced by 'E' or 'e'; the sign
// after the letter is required: '+' multiplies, anything else divides.
double FtoDouble2(const char* text, int length);
// Right-aligned decimal, read from the last character back to the first
// blank (a '-' there makes it negative).
int ch2int(const char* text, int length);

// The field as text, cut at its first NUL.
std::string ceosText(const char* text, int length);
