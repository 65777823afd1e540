// Entry of the focusing job: takes the host's command string,
// "main_focussing_stripmap#<job file>".
#include <unistd.h>

#include <cstdlib>

#include "job/focusing_job.h"

int main(int argc, char** argv) {
  // An OpenMP thread without work spins for some ten milliseconds before it
  // sleeps. The chain's parallel regions are coarse, and between them the
  // cores belong to the main thread's reads and checks and to the background
  // raster writer: spinning threads only take the cores from them (on an ERS
  // frame about 2 s of CPU and half a second of the run). The wait policy is
  // read when the OpenMP library loads, so the program starts itself again
  // with threads that sleep, unless the host chose a policy or a spin count;
  // where it cannot, it runs as it is.
  if (std::getenv("OMP_WAIT_POLICY") == nullptr && std::getenv("GOMP_SPINCOUNT") == nullptr &&
      setenv("OMP_WAIT_POLICY", "passive", 0) == 0) {
    execv("/proc/self/exe", argv);
  }
  return stripmapFocuserEntry(argc, argv);
}
