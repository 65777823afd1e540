#pragma once
// ERS level-0 products and the look-up of their DEOS precise orbit arcs.
#include <string>

#include "ingest/sar_product.h"

// A DEOS precise orbit arc of ERS.
class Ers_DEOS : public SAR_product {
 public:
  // An arc file carries no time the callers need: both return 0.
  int getTimeStop(double* t) override;
  int getTimeStart(double* t) override;
  int isValid() const { return fileName_.empty() ? 0 : 1; }
  // Chooses, through "<path>/ERS1/PRECISE/arclist", the arc valid at time
  // (satellite 0 ERS-1, 1 ERS-2) and sets the file name to
  // "<path>/ERS<n>/PRECISE/ODR.<arc>". 1 for bad arguments or a bad month,
  // 9 when the list cannot be opened; 0 otherwise, also when no arc matched
  // (the name then stays empty).
  int getDEOS(double time, int satellite, const std::string& path);
};

// ERS level-0 scene; its file name is the product directory.
class Ers_level0 : public SAR_product {
 public:
  // From the leader of the product directory; stop is start plus length.
  int getTimeStop(double* t) override;
  int getTimeStart(double* t) override;
  // Selector 3: the orbit arc under the archive root path. Other selectors
  // do nothing. 1 if the leader cannot be read or names no ERS satellite.
  int getAuxFiles(int selector, const std::string& path);
  // Selector 3: an orbit name is set. Any other selector gives 0.
  int isAuxValid(int selector) const;
  std::string getOrbitFilename() const { return orbit_.fileName(); }
  Ers_DEOS& orbit() { return orbit_; }

 private:
  Ers_DEOS orbit_;
};
