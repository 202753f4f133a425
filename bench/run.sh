#!/usr/bin/env bash
# Builds the benchmark programs in a Release tree and runs them all, then
# prints one line per pair: what is timed, this library's median, the
# peer's median, their ratio, the largest ratio allowed and whether it holds.
# Usage: bench/run.sh [build directory]   (default build/bench)
# Scratch files go to ZK_BENCH_DIR (default: a fresh directory under /tmp);
# the programs' own reports go to <build directory>/bench-report.txt.
set -euo pipefail
cd "$(dirname "$0")/.."

build=${1:-build/bench}
cmake -S . -B "$build" -DCMAKE_BUILD_TYPE=Release -DZK_BUILD_BENCH=ON -DZK_BUILD_TESTS=OFF >/dev/null
cmake --build "$build" -j2 >/dev/null

if [ -n "${ZK_BENCH_DIR:-}" ]; then
  mkdir -p "$ZK_BENCH_DIR"
  made=
else
  ZK_BENCH_DIR=$(mktemp -d /tmp/zk_bench.XXXXXX)
  made=$ZK_BENCH_DIR
fi
export ZK_BENCH_DIR
report=$build/bench-report.txt
: >"$report"

pairs=$(mktemp)
trap 'rm -f "$pairs"; [ -z "$made" ] || rm -rf "$made"' EXIT

for program in zk_strings_bench zk_cmdline_bench zk_ini_bench zk_ini_editor_bench zk_list_bench zk_log_bench zk_copy_bench; do
  if [ ! -x "$build/bench/$program" ]; then
    echo "missing: $program (peer or Google Benchmark not installed?)" >&2
    continue
  fi
  "$build/bench/$program" 2>>"$report" | grep '^pair' >>"$pairs" || echo "$program failed; see $report" >&2
done

awk -F'\t' '
  BEGIN { printf "%-40s %14s %14s %7s %7s  %s\n", "pair", "ours", "peer", "ratio", "target", "holds" }
  {
    if ($3 == "missing" || $4 <= 0) { printf "%-40s %14s %14s %7s %7s  %s\n", $2, "-", "-", "-", $6, "no (no result)"; next }
    r = $3 / $4
    printf "%-40s %11.4g %-2s %11.4g %-2s %7.3f %7.2f  %s\n", $2, $3, $5, $4, $5, r, $6, (r <= $6 ? "yes" : "NO")
  }' "$pairs"
