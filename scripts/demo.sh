#!/usr/bin/env bash
# Demo of a whole focusing job: simulates a small ERS-2 scene with point
# targets and clutter, writes a job file, runs stripmap_focuser as the host
# does (command string, TESSIVOR_* variables, progress file), and prints
# where the products are and the point-target analysis of the product. It
# ends with a multi-looked amplitude GeoTIFF of the scene, its KML overlay
# and a PNG quicklook.
#   scripts/demo.sh [BUILD_DIR [DEMO_DIR]]   (make demo builds first, then runs it;
#                                             DEMO_DIR defaults to BUILD_DIR/demo)
# DEMO_RUNNER, when set, is put before the focuser's command (for instance
# "valgrind --error-exitcode=99" for a memory-checked run).
set -euo pipefail

BUILD=$(cd "${1:-build}" && pwd)
SOURCE=$(cd "$(dirname "$0")/.." && pwd)
BIN="$BUILD/bin"
for tool in stripmap_focuser sarsim sarpta tesv_raster_to_geotiff; do
  if [ ! -x "$BIN/$tool" ]; then
    echo "demo: $BIN/$tool is missing; run 'make demo' (it builds first)" >&2
    exit 1
  fi
done

DEMO="${2:-$BUILD/demo}"
rm -rf "$DEMO"
mkdir -p "$DEMO/work" "$DEMO/resources"
DEMO=$(cd "$DEMO" && pwd)

# The ERS profile of the demo asks the chain for a multi-looked product.
cp "$SOURCE"/resources/* "$DEMO/resources/"
sed -i 's/^Multilook = 0$/Multilook = 1/' "$DEMO/resources/parameters_ERS.hdr"

# 1. The scene: 4096 lines of 2048 samples (1.1 km of swath is enough to
#    show the chain), a Doppler centroid of 250 Hz, five targets and clutter.
cat > "$DEMO/scene.txt" <<'EOF'
[Mission]
mission = ERS2
carrier_ghz = 5.3
sampling_rate_mhz = 18.962468
prf_hz = 1679.902
pulse_length_us = 37.12
chirp_coefficient = 2.08894e11
antenna_length_m = 10.0
look_side = right

[Orbit]
semi_major_axis_m = 7159500
eccentricity = 0.0011
inclination_deg = 98.52
node_longitude_deg = 0.0
arg_perigee_deg = 90.0
mean_anomaly_deg = -50.0
epoch = 18-JAN-2010 17:49:28.683

[Scene]
start_time = 18-JAN-2010 17:49:28.683
lines = 4096
samples = 2048
near_range_time_s = 0.00555
doppler_centroid_hz = 250.0
orbit_number = 77106
frame = 2925
arc_number = 123
scene_dir = ERS2_DEMO

[Targets]
pixel_target = 1600.25 200.5 0 4
pixel_target = 1850.0 450.0 80 4
pixel_target = 2050.5 700.25 0 4
pixel_target = 2250.0 950.75 30 4
pixel_target = 2450.75 1150.5 0 4

[Clutter]
clutter_sigma = 2.0
noise_sigma = 1.0
seed = 3
EOF
echo "== Simulating the raw scene ($DEMO/scene.txt)"
"$BIN/sarsim" "$DEMO/scene.txt" "$DEMO/sim"
SIM="$DEMO/sim"

# 2. The job file: line 1 is ignored, then the 24 positional parameters.
#    The orbit file is not named (NotOK): the focuser finds the arc through
#    the arc list of the orbit folder (INPUT DIR 1).
JOB="$DEMO/work/job.txt"
{
  echo "demo focusing job"
  echo "ERS"                              # 0  platform
  echo "$SIM/ERS2_DEMO/DAT_01.001"        # 1  scene (image file)
  echo "NotOK"; echo "NotOK"; echo "NotOK" # 2-4 further polarisations
  echo "$DEMO/work/demo"                  # 5  output root
  echo "NotOK"                            # 6  orbit file: looked up
  echo "$SIM/ERS2_DEMO/LEA_01.001"        # 7  leader
  echo "NotOK"; echo "NotOK"; echo "NotOK" # 8-10
  echo "$SIM/orbits"                      # 11 orbit archive folder
  echo "NotOK"; echo "NotOK"; echo "NotOK"; echo "NotOK" # 12-15
  echo "0"                                # 16 skip lines
  echo "0"                                # 17 extract lines (all)
  echo "1"                                # 18 erase the chain's temporary files
  echo "NotOK"                            # 19
  echo "0"; echo "0"                      # 20-21
  echo "OK"                               # 22 GeoTIFF, KML and ENVI header
  echo "0"                                # 23
} > "$JOB"
echo "== Job file $JOB"

# 3. The run, as the host starts it.
echo "== Focusing (progress in $DEMO/work/progress.txt)"
status=0
(
  cd "$DEMO/work"
  TESSIVOR_WORKING_DIR="$DEMO/work/" \
  TESSIVOR_WORKING_FILE="$DEMO/work/progress.txt" \
  TESSIVOR_CEOS_DES_FILES_DIR="$DEMO/resources/" \
  TESSIVOR_TRACING=ACTIVE \
    ${DEMO_RUNNER:-} "$BIN/stripmap_focuser" "main_focussing_stripmap#$JOB" > "$DEMO/work/console.txt" 2>&1
) || status=$?
if [ "$status" -ne 0 ] || [ -e "$DEMO/work/progress.txt_error" ]; then
  echo "demo: the focuser failed (exit status $status); see $DEMO/work/Process.log:" >&2
  tail -n 20 "$DEMO/work/Process.log" >&2 || true
  exit 1
fi

PRODUCT="$DEMO/work/demo_slc"
STORE="$PRODUCT.TessivorParameterExtracted"
value() { grep -m1 "<$1>" "$STORE" | sed "s:.*<$1>\(.*\)</$1>.*:\1:"; }
LINES=$(value Lines)
SAMPLES=$(value Samples)
echo
echo "== Products"
echo "  focused image      $PRODUCT  ($LINES lines x $SAMPLES samples, complex float)"
echo "  parameter store    $STORE"
for companion in "$PRODUCT"_hdr "$PRODUCT".sml; do
  [ -e "$companion" ] && echo "  description        $companion"
done
echo "  logs               $DEMO/work/Process.log, $DEMO/work/Process.trace"
echo "  Doppler estimate   $DEMO/work/DCEST_resume.txt"
echo "  truth of targets   $SIM/truth.txt"
echo "  GeoTIFF (full)     $PRODUCT.tif  (KML overlay $PRODUCT.kml, ENVI header $PRODUCT.hdr)"

# 4. Point targets against the simulator's truth, with the product's own
#    time axes and spectral windows.
echo
echo "== Point-target analysis (sarpta)"
"$BIN/sarpta" --raster "$PRODUCT" --truth "$SIM/truth.txt" --record "$STORE" \
  --json "$DEMO/pta.json"
echo
echo "dLine, dSample: peak minus truth in pixels; irw in pixels (M: metres); pslr, islr in dB;"
echo "dPhase: peak phase minus -4 pi R0 / lambda, radians. JSON: $DEMO/pta.json"

# 5. The multi-looked amplitude image of the chain as a GeoTIFF with its KML
#    overlay, and a PNG quicklook of it.
MLA="$DEMO/work/demo_mla"
"$BIN/tesv_raster_to_geotiff" "$MLA" "$MLA.tif" > /dev/null
QUICKLOOK="$DEMO/demo_quicklook.png"
if command -v gdal_translate > /dev/null 2>&1; then
  gdal_translate -q -of PNG "$MLA.tif" "$QUICKLOOK"
  rm -f "$QUICKLOOK.aux.xml"
else
  QUICKLOOK="(gdal_translate missing: run scripts/install-deps.sh)"
fi
echo
echo "== Multi-looked amplitude"
echo "  GeoTIFF            $MLA.tif  ($(value Lines) x $(value Samples) single-look samples averaged)"
echo "  KML overlay        $MLA.kml"
echo "  PNG quicklook      $QUICKLOOK"
