#!/usr/bin/env bash
# Runs the libFuzzer targets of build-fuzz/ for a bounded time each and prints,
# per target, the executions, the coverage (cov: edges, ft: features) and
# the time. A crash, a sanitizer report, a hang (timeout) or an exhausted
# memory fails the run; libFuzzer leaves the input in the work folder, which
# is then kept in FUZZ_KEEP (default build-fuzz/findings) for a regression case.
#   scripts/fuzz.sh SECONDS [TARGET...]     (no target: all of them)
set -euo pipefail
cd "$(dirname "$0")/.."
BUILD=${FUZZ_BUILD:-build-fuzz}
SECONDS_EACH=${1:?seconds per target}
shift
KEEP=${FUZZ_KEEP:-$BUILD/findings}
targets=("$@")
if [ ${#targets[@]} -eq 0 ]; then
  for exe in "$BUILD"/fuzz/fuzz_*; do targets+=("$(basename "$exe" | sed 's/^fuzz_//')"); done
fi
failed=0
for t in "${targets[@]}"; do
  work=$(mktemp -d "${TMPDIR:-/tmp}/tessivor_fuzz_run.XXXXXX")
  mkdir -p "$work/corpus" "$work/tmp"
  dirs=("$work/corpus")
  for d in fuzz/corpus/"$t" "$BUILD"/seeds/"$t"; do [ -d "$d" ] && dirs+=("$d"); done
  # A fixed seed: the same mutations on every run, so a bounded run finds
  # what an earlier one of the same length found, not a new input each time.
  opts=(-seed="${FUZZ_SEED:-1}" -max_total_time="$SECONDS_EACH" -timeout=20 -rss_limit_mb=2048 -malloc_limit_mb=1024
        -max_len=65536 -print_final_stats=1 -artifact_prefix="$work/")
  [ -f fuzz/dict/"$t".dict ] && opts+=(-dict=fuzz/dict/"$t".dict)
  status=0
  TMPDIR="$work/tmp" "$BUILD/fuzz/fuzz_$t" "${opts[@]}" "${dirs[@]}" > "$work/log" 2>&1 || status=$?
  execs=$(grep -o 'stat::number_of_executed_units: *[0-9]*' "$work/log" | grep -o '[0-9]*$' || echo "?")
  last=$(grep -E '^#[0-9]+' "$work/log" | tail -1 | grep -oE 'cov: [0-9]+ ft: [0-9]+' || echo "cov: ? ft: ?")
  time=$(grep -o 'Done [0-9]* runs in [0-9]* second' "$work/log" | grep -oE '[0-9]+ second' || echo "$SECONDS_EACH second")
  if [ $status -ne 0 ]; then
    failed=1
    mkdir -p "$KEEP/$t"
    cp "$work"/crash-* "$work"/timeout-* "$work"/oom-* "$work"/leak-* "$KEEP/$t/" 2>/dev/null || true
    cp "$work/log" "$KEEP/$t/log"
    echo "FAIL $t: status $status, execs $execs, $last (log and input in $KEEP/$t)"
    grep -m3 -E 'ERROR|runtime error|SUMMARY' "$work/log" || true
  else
    echo "ok   $t: execs $execs, $last, $time(s)"
  fi
  rm -rf "$work"
done
exit $failed
