#include "focus/sar_focuser.h"

#include "diag/report.h"

void SARFocuser_conf::clear() {
  *this = SARFocuser_conf{};
  Flag_rangefoc = Flag_rgpatt = Flag_azimuthfoc = Flag_dcest = 0;
  Flag_ortog = 1;
  Flag_swstal = 1;
  Azblk = 1024;
}

int SARFocuser_conf::readpar(const std::string&) { return 10; }
int SARFocuser_conf::readconf(const std::string&) { return 10; }
int SARFocuser_input::readpar(const std::string&) { return 10; }
int SARFocuser_output::readpar(const std::string&) { return 10; }

SARFocuser::SARFocuser(SARFocuser_conf* conf) : conf_(conf) {}
SARFocuser::~SARFocuser() = default;

int SARFocuser::run() { return 10; }
int SARFocuser::process() { return 1; }
int SARFocuser::descallop() { return 1; }
