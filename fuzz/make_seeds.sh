#!/usr/bin/env bash
# Seed inputs of the fuzz targets that are too big to keep in the tree: small
# simulated scenes of every sensor (sarsim) and heads of the genuine mission
# files of ../shared/realdata when that folder is at hand, written to
# BUILD/seeds/<target>/. Inputs of two files (leader and image) are a 4-byte
# little-endian length of the leader, the leader, then the head of the image.
#   fuzz/make_seeds.sh BUILD_DIR
set -euo pipefail
cd "$(dirname "$0")/.."
BUILD=$(cd "${1:?build folder}" && pwd)
SEEDS="$BUILD/seeds"
REAL=../shared/realdata
SIM=$(mktemp -d "${TMPDIR:-/tmp}/tessivor_seeds.XXXXXX")
trap 'rm -rf "$SIM"' EXIT
rm -rf "$SEEDS"
for t in job_file profile parameter_store xml_document description_text description_xml ers_leader \
         ers_image asar_level0 asar_aux deos_orbit doris_orbit palsar_ceos radarsat_ceos radarsat_orbit; do
  mkdir -p "$SEEDS/$t"
done

# pair OUT LEADER IMAGE IMAGE_BYTES
pair() {
  python3 - "$@" <<'PY'
import struct, sys
out, leader, image, n = sys.argv[1], sys.argv[2], sys.argv[3], int(sys.argv[4])
lea = open(leader, 'rb').read()
img = open(image, 'rb').read(n)
open(out, 'wb').write(struct.pack('<I', len(lea)) + lea + img)
PY
}
# prefix OUT BYTE FILE [BYTES]: one selector byte, then the file (or its head)
prefix() {
  { printf "\\x$(printf %02x "$2")"; head -c "${4:-100000000}" "$3"; } > "$1"
}

# Small simulated scenes: 256 lines of 1024 samples of each sensor.
scene() {  # scene NAME MISSION EXTRA_SECTION [SED_EXPRESSIONS...]
  local name=$1 mission=$2 extra=$3
  shift 3
  sed -e "s/^mission = .*/mission = $mission/" -e 's/^lines = .*/lines = 256/' -e 's/^samples = .*/samples = 1024/' \
    "$@" tests/sim/data/ers2_small_scene.txt > "$SIM/$name.txt"
  printf '\n%s\n' "$extra" >> "$SIM/$name.txt"
  "$BUILD/bin/sarsim" "$SIM/$name.txt" "$SIM/$name" > /dev/null 2>&1 || echo "make_seeds: no simulated $mission scene" >&2
}
scene ers ERS2 ""
scene palsar PALSAR "[PALSAR]"
scene rsat RSAT1 "[Radarsat]" -e 's/^prf_hz = .*/prf_hz = 1300.0/' -e 's/^near_range_time_s = .*/near_range_time_s = 0.006554/'
sed -e 's/^lines = .*/lines = 256/' -e 's/^samples = .*/samples = 1024/' tests/sim/data/asar_im_small_scene.txt > "$SIM/asar.txt"
"$BUILD/bin/sarsim" "$SIM/asar.txt" "$SIM/asar" > /dev/null 2>&1 || echo "make_seeds: no simulated ASAR scene" >&2

find "$SIM" -type f | sort > "$SIM/files.txt"
pick() { grep -E "$1" "$SIM/files.txt" | head -1 || true; }

lea=$(pick '/ers/.*LEA_01')
img=$(pick '/ers/.*DAT_01')
[ -n "$lea" ] && cp "$lea" "$SEEDS/ers_leader/sim_leader"
[ -n "$lea" ] && [ -n "$img" ] && pair "$SEEDS/ers_image/sim" "$lea" "$img" 40000
odr=$(pick '/ers/.*ODR')
[ -n "$odr" ] && head -c 20000 "$odr" > "$SEEDS/deos_orbit/sim_odr"

lea=$(pick '/palsar/.*LED-')
img=$(pick '/palsar/.*IMG-')
[ -n "$lea" ] && [ -n "$img" ] && pair "$SEEDS/palsar_ceos/sim" "$lea" "$img" 40000

lea=$(pick '/rsat/.*LEA_01')
img=$(pick '/rsat/.*DAT_01')
[ -n "$lea" ] && [ -n "$img" ] && pair "$SEEDS/radarsat_ceos/sim" "$lea" "$img" 40000

l0=$(pick '/asar/.*ASA_IM__0')
[ -n "$l0" ] && head -c 60000 "$l0" > "$SEEDS/asar_level0/sim_head"
n=0
for f in $(grep -E '/asar/.*(ASA_INS|ASA_XCA|ASA_XCH|DOR_VOR)' "$SIM/files.txt" || true); do
  case "$f" in *ASA_INS*) s=0 ;; *ASA_XCA*) s=1 ;; *ASA_XCH*) s=2 ;; *) s=3 ;; esac
  prefix "$SEEDS/asar_aux/sim_$n" "$s" "$f" 200000; n=$((n + 1))
done
orb=$(pick '/asar/.*DOR_VOR')
[ -n "$orb" ] && head -c 20000 "$orb" > "$SEEDS/doris_orbit/sim_head"

# Parameter profiles of the chain.
for f in resources/parameters_*.hdr; do
  cp "$f" "$SEEDS/profile/"; cp "$f" "$SEEDS/parameter_store/"
done
cp resources/ENVI_descriptions_default.des "$SEEDS/description_text/"

# Heads of the genuine mission files.
if [ -d "$REAL" ]; then
  cp "$REAL"/ers1_2000_orbit44928/lea_01.001 "$SEEDS/ers_leader/ers1_lea"
  cp "$REAL"/ers2_2010_orbit77106/LEA_01.001 "$SEEDS/ers_leader/ers2_lea"
  cp "$REAL"/ers1_ccrs_1996/23390_2925.ldr "$SEEDS/ers_leader/ccrs_ldr"
  pair "$SEEDS/ers_image/ers1" "$REAL"/ers1_2000_orbit44928/lea_01.001 "$REAL"/ers1_2000_orbit44928/dat_01.001 20000
  pair "$SEEDS/ers_image/ers2" "$REAL"/ers2_2010_orbit77106/LEA_01.001 "$REAL"/ers2_2010_orbit77106/DAT_01.001 20000
  pair "$SEEDS/radarsat_ceos/ccrs" "$REAL"/ers1_ccrs_1996/23390_2925.ldr "$REAL"/ers1_2000_orbit44928/dat_01.001 20000
  cp "$REAL"/envisat/ASA_IM__0C*.N1 "$SEEDS/asar_level0/real_head"
  for f in "$REAL"/orbits/*ODR*; do head -c 16000 "$f" > "$SEEDS/deos_orbit/$(basename "$f")"; done
  for f in "$REAL"/orbits/DOR_*; do head -c 20000 "$f" > "$SEEDS/doris_orbit/$(basename "$f" | cut -c1-30)"; done
  prefix "$SEEDS/asar_aux/ins" 0 "$REAL"/envisat_aux/ASA_INS_AXVIEC20091217_114637_20090428_100000_20101231_235959
  prefix "$SEEDS/asar_aux/xca" 1 "$REAL"/envisat_aux/ASA_XCA_AXVIEC20091217_114112_20080801_000000_20101231_235959
  prefix "$SEEDS/asar_aux/xch" 2 "$REAL"/envisat_aux/ASA_XCH_AXVIEC20091217_113006_20020301_000000_20101231_000000
  prefix "$SEEDS/asar_aux/vor" 3 "$REAL"/orbits/DOR_VOR_AXVF-P20100423_084900_20100327_215526_20100329_002326 30000
fi
for t in "$SEEDS"/*; do echo "seeds $(basename "$t"): $(ls "$t" | wc -l)"; done
