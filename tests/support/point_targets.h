#pragma once
// Point-target measurements and their bars. Products on disk are measured by
// the sarpta executable (its JSON read back); rasters in memory by the same
// analysis of sim/point_target. The bars are one set for every test.
#include <functional>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "sim/point_target.h"

class GeneralSAR;
class RawSceneSimulator;

namespace support {

// Bars of a focused point target against the theory of the product's windows.
namespace bars {
constexpr double kIrwRatio = 0.05;        // |IRW / theory - 1|
constexpr double kPslrDb = 1.0;           // |PSLR - theory|
constexpr double kIslrDb = 1.0;           // |ISLR - theory|
constexpr double kPositionPixels = 0.05;  // peak against the zero-Doppler truth
constexpr double kPhaseDeg = 5.0;         // peak phases about their common value
constexpr double kProductPixels = 0.1;    // product peak against the simulator's truth
constexpr double kCornerMetres = 30.0;    // product corners against the ground they show
}  // namespace bars

struct PtaTarget {
  bool found = false;
  double errorLine = 0.0, errorSample = 0.0, phaseError = 0.0;
  IrMetrics azimuth, range;
  IrMetrics azimuthTheory;  // the target's own azimuth theory (burst-mode channels)
};
struct PtaReport {
  int exitStatus = -1;
  IrMetrics theoryAzimuth, theoryRange;
  std::vector<PtaTarget> targets;
  std::string table;  // sarpta's printed table, for failure messages
};

// Runs sarpta with the arguments (its JSON and table go into folder).
PtaReport runSarpta(const std::string& folder, const std::vector<std::string>& args);
// sarpta on a focused product with the time axes and windows of its record,
// against the truth file of the simulation.
PtaReport analyseProduct(const std::string& folder, const std::string& product, const std::string& record,
                         const std::string& truth);

// Every target found, IRW and PSLR of both axes within the bars of the theory
// (in azimuth the target's own theory where sarpta gives one).
void expectTheoreticalResponses(const PtaReport& pta, std::size_t targets);

// Every target within kProductPixels of its truth position (moved by
// `lineShift` lines); with `phases`, the peak phase errors within kPhaseDeg
// of their common value.
void expectTruthPositions(const PtaReport& pta, double lineShift = 0.0, bool phases = true);

// Corners and centre of a focused product's record: each within kCornerMetres
// of the ground point that its pixel shows (zero Doppler, on the ellipsoid,
// seen from the simulator's orbit), the four corners matched one to one.
void expectCornersOnTheGround(const GeneralSAR& record, const RawSceneSimulator& sim, const std::string& truthFile);

// Distance between two points on the ellipsoid, metres.
double groundDistance(double lat1, double lon1, double lat2, double lon2);

// Spread of angles around their circular mean, radians.
double phaseSpread(const std::vector<double>& phases);

// The target nearest to (row, col) of a rows x cols image in memory: the
// strongest sample within `search` pixels, then a 64-pixel window analysed
// with 16x upsampling. Positions in image pixels.
PtaResult measureTarget(const fcomplex* image, int rows, int cols, double row, double col, int search = 4);

// Theoretical measures of the impulse response of a spectral weight w(u),
// u in cycles per sample (-1/2 .. 1/2), over the same 64-pixel window.
IrMetrics theoryOfWeight(const std::function<double(double)>& w);

// Position within the bar, IRW, PSLR and ISLR of both axes against the
// theory of the windows.
void expectTarget(const PtaResult& m, double row, double col, const IrMetrics& azimuth, const IrMetrics& range);

}  // namespace support
