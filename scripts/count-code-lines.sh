#!/usr/bin/env bash
# Counts C++ code lines (no blank lines, no comment-only lines) of the tests
# against the product code (src/, sim/, apps/), and prints the ratio.
# Usage: scripts/count-code-lines.sh [--files DIR...]   (run from the tree root)
set -euo pipefail
cd "$(dirname "$0")/.."

count() {
  find "$@" -type f \( -name '*.cpp' -o -name '*.h' -o -name '*.hpp' -o -name '*.cc' \) -print0 |
    xargs -0 -r cat |
    awk '
      BEGIN { n = 0; in_block = 0 }
      {
        line = $0
        if (in_block) {
          end = index(line, "*/")
          if (end == 0) next
          line = substr(line, end + 2); in_block = 0
        }
        # drop block comments that open (and maybe close) on this line
        while ((start = index(line, "/*")) > 0) {
          rest = substr(line, start + 2); end = index(rest, "*/")
          if (end == 0) { line = substr(line, 1, start - 1); in_block = 1; break }
          line = substr(line, 1, start - 1) substr(rest, end + 2)
        }
        sub(/^[ \t]*\/\/.*$/, "", line)
        if (line ~ /[^ \t\r]/) n++
      }
      END { print n }'
}

if [[ "${1:-}" == "--files" ]]; then
  shift
  for d in "$@"; do printf '%7d %s\n' "$(count "$d")" "$d"; done
  exit 0
fi

tests=$(count tests)
code=$(count src sim apps)
awk -v t="$tests" -v c="$code" 'BEGIN { printf "tests %d  code %d  ratio %.1f%%\n", t, c, 100 * t / c }'
