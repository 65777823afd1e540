// sarsim: simulates a raw scene from a scene description and writes the
// mission's files, the orbit archive and the truth of the targets. An
// ENVISAT scene gives an ASAR level-0 product with its auxiliary files and
// DORIS orbit, as its [ASAR] section says; a PALSAR scene gives the CEOS
// leader and one image file per polarisation, as its [PALSAR] section says.
//   sarsim SCENE_FILE OUTPUT_DIR
#include <cstdio>
#include <exception>
#include <string>

#include "sim/envisat_level0_writer.h"
#include "sim/radarsat_ceos_writer.h"
#include "sim/palsar_writer.h"
#include "sim/raw_scene.h"

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: sarsim SCENE_FILE OUTPUT_DIR\n");
    return 10;
  }
  SceneDescription scene;
  std::string error;
  if (!SceneDescription::load(argv[1], scene, error)) {
    std::fprintf(stderr, "sarsim: %s\n", error.c_str());
    return 10;
  }
  AsarSimConfig asar;
  const bool envisat = scene.mission == "ENVISAT";
  if (envisat) {
    SimIni ini;
    if (!ini.load(argv[1], error) || !AsarSimConfig::fromIni(ini, asar, error)) {
      std::fprintf(stderr, "sarsim: %s: %s\n", argv[1], error.c_str());
      return 10;
    }
    applyAsarInstrument(asar, scene);
  }
  PalsarSimConfig palsar;
  const bool alos = scene.mission == "PALSAR";
  if (alos) {
    SimIni ini;
    if (!ini.load(argv[1], error) || !PalsarSimConfig::fromIni(ini, palsar, error)) {
      std::fprintf(stderr, "sarsim: %s: %s\n", argv[1], error.c_str());
      return 10;
    }
    applyPalsarInstrument(palsar, scene);
  }
  try {
    if (scene.mission == "RSAT1") {
      // RADARSAT-1: the [Radarsat] section chooses beam, rates and codes.
      SimIni ini;
      RadarsatOptions options;
      if (!ini.load(argv[1], error) || !RadarsatOptions::fromIni(ini, options, error)) {
        std::fprintf(stderr, "sarsim: %s\n", error.c_str());
        return 10;
      }
      const RadarsatSceneWriter writer(scene, options);
      const RawSceneSimulator& sim = writer.simulator();
      std::fprintf(stderr, "sarsim: RSAT1 %s, %d lines x %d samples, window code %d, %zu targets\n",
                   writer.options().beam.c_str(), sim.scene().lines, sim.scene().samples, writer.windowCodeOf(0),
                   sim.truth().size());
      if (const int status = writer.write(argv[2], error); status != 0) {
        std::fprintf(stderr, "sarsim: %s\n", error.c_str());
        return status;
      }
      std::printf("leader %s\ndata   %s\ntruth  %s/truth.txt\n", writer.leaderPath(argv[2]).c_str(),
                  writer.dataPath(argv[2]).c_str(), argv[2]);
      return 0;
    }
    const RawSceneSimulator sim(scene);
    std::fprintf(stderr, "sarsim: %s, %d lines x %d samples, window code %d, %zu targets\n", sim.scene().mission.c_str(),
                 sim.scene().lines, sim.scene().samples, sim.swstCode(), sim.truth().size());
    AsarSceneFiles asarFiles;
    PalsarSceneFiles palsarFiles;
    const int status = envisat ? writeEnvisatScene(sim, asar, argv[2], &asarFiles, error)
                       : alos  ? writePalsarScene(scene, palsar, argv[2], &palsarFiles, error)
                               : sim.writeErsScene(argv[2], error);
    if (status != 0) {
      std::fprintf(stderr, "sarsim: %s\n", error.c_str());
      return status;
    }
    std::printf("%-4s %14s %14s %12s %12s %10s\n", "#", "line", "sample", "lat", "lon", "height");
    for (std::size_t i = 0; i < sim.truth().size(); ++i) {
      const TargetTruth& t = sim.truth()[i];
      std::printf("%-4zu %14.4f %14.4f %12.6f %12.6f %10.2f\n", i + 1, t.line, t.sample, t.latDeg, t.lonDeg, t.height);
    }
    if (envisat)
      std::printf("level0 %s\nins    %s\nxca    %s\nxch    %s\norbit  %s\ntruth  %s/truth.txt\n",
                  asarFiles.level0.c_str(), asarFiles.ins.c_str(), asarFiles.xca.c_str(), asarFiles.xch.c_str(),
                  asarFiles.orbit.c_str(), argv[2]);
    else if (alos) {
      std::printf("leader %s\n", palsarFiles.leader.c_str());
      for (std::size_t k = 0; k < palsarFiles.images.size(); ++k)
        std::printf("image  %s %s\n", palsarFiles.labels[k].c_str(), palsarFiles.images[k].c_str());
      std::printf("truth  %s/truth.txt\n", argv[2]);
    } else
      std::printf("leader %s\nimage  %s\norbit  %s\ntruth  %s/truth.txt\n", sim.leaderPath(argv[2]).c_str(),
                  sim.imagePath(argv[2]).c_str(), sim.odrPath(argv[2]).c_str(), argv[2]);
  } catch (const std::exception& ex) {
    std::fprintf(stderr, "sarsim: %s: %s\n", argv[1], ex.what());
    return 10;
  }
  return 0;
}
