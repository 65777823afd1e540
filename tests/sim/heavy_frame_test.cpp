// A whole ERS frame: layout of the files and identical bytes whatever the
// number of threads. Left out of the default run.
#include <gtest/gtest.h>

#include "support/files.h"

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include <unistd.h>
#ifdef _OPENMP
#include <omp.h>
#endif

#include "sim/raw_scene.h"

namespace {

std::uint64_t fileHash(const std::string& path) {
  std::ifstream f(path, std::ios::binary);
  std::vector<char> buf(1 << 20);
  std::uint64_t h = 1469598103934665603ULL;
  while (f.read(buf.data(), static_cast<std::streamsize>(buf.size())) || f.gcount() > 0) {
    for (std::streamsize i = 0; i < f.gcount(); ++i) h = (h ^ static_cast<unsigned char>(buf[i])) * 1099511628211ULL;
  }
  return h;
}

}  // namespace

TEST(HeavySimFrame, FullErsFrameIsIdenticalSerialAndParallel) {
  SceneDescription s;
  s.lines = 28000;
  s.samples = 5616;
  s.dopplerCentroidHz = 250.0;
  s.clutterSigma = 2.0;
  s.noiseSigma = 1.0;
  for (int i = 0; i < 50; ++i) s.pixelTargets.push_back({1500.0 + 500.0 * i, 150.0 + 97.0 * i, 0.0, 4.0});
  const RawSceneSimulator sim(s);
  const std::string dir = support::scratchDir("sim_heavy");
  std::string err;
  ASSERT_EQ(sim.writeErsScene(dir + "/a", err), 0) << err;
  const std::string image = sim.imagePath(dir + "/a");
  EXPECT_EQ(std::filesystem::file_size(image), 11644u + 28000u * 11644u);
  const std::uint64_t parallel = fileHash(image);
#ifdef _OPENMP
  const int threads = omp_get_max_threads();
  omp_set_num_threads(1);
  ASSERT_EQ(sim.writeErsScene(dir + "/b", err), 0) << err;
  omp_set_num_threads(threads);
  EXPECT_EQ(fileHash(sim.imagePath(dir + "/b")), parallel);
#endif
}
