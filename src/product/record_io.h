#pragma once
// Reading of the profile form of a record object: keys of one section, a
// first group that must all be present and a second group that may be absent.
#include <string>

#include "product/profile.h"

class ProfileKeyReader {
 public:
  ProfileKeyReader(const std::string& file, const std::string& section)
      : file_(file), section_(section) {}

  // Required keys: a missing one makes failed() true.
  void required(const char* key, double* dst, int n = 1) {
    note(GetProfileDoubleArray(section_, key, dst, n, file_));
  }
  void required(const char* key, int* dst, int n = 1) {
    note(GetMyProfileIntArray(section_, key, dst, n, file_));
  }
  void required(const char* key, std::string* dst) {
    note(GetMyProfileString(section_, key, *dst, file_));
  }
  // Optional keys: the target keeps its value when the key is absent.
  void optional(const char* key, double* dst, int n = 1) {
    GetProfileDoubleArray(section_, key, dst, n, file_);
  }
  void optional(const char* key, int* dst, int n = 1) {
    GetMyProfileIntArray(section_, key, dst, n, file_);
  }
  void optional(const char* key, std::string* dst) {
    std::string value;
    if (GetMyProfileString(section_, key, value, file_) == 0) *dst = value;
  }

  bool failed() const { return failed_; }
  // 1 when a required key was missing, else 0.
  int status() const { return failed_ ? 1 : 0; }

 private:
  void note(int status) {
    if (status != 0) failed_ = true;
  }
  std::string file_;
  std::string section_;
  bool failed_ = false;
};
