#!/usr/bin/env bash
# Builds the fuzz targets with clang and runs each for SECONDS (default 20)
# on its seed corpus, one after the other. New inputs go to a work corpus in
# the build tree; a failing input is left there as crash-* and the run fails.
#   fuzz/run.sh [SECONDS] [TARGET...]
set -euo pipefail
cd "$(dirname "$0")/.."
seconds=${1:-20}
shift || true
targets=("$@")
[ ${#targets[@]} -gt 0 ] || targets=(ini cmdline version path tokenizer string)
build=${ZK_FUZZ_BUILD:-build/fuzz}

CC=clang CXX=clang++ cmake -S . -B "$build" -DZKUTIL_FUZZ=ON -DZKUTIL_BUILD_TESTS=OFF -DZKUTIL_WERROR=ON >/dev/null
cmake --build "$build" -j2 --target $(printf '%s_fuzz ' "${targets[@]}") >/dev/null

status=0
for name in "${targets[@]}"; do
  work="$build/fuzz/work/$name"
  mkdir -p "$work"
  log="$build/fuzz/$name.log"
  if ASAN_OPTIONS=detect_leaks=1 "$build/fuzz/${name}_fuzz" -max_total_time="$seconds" -rss_limit_mb=1024 \
       -artifact_prefix="$work/" "$work" "fuzz/corpus/$name" >"$log" 2>&1; then
    echo "$name: $(grep -o 'Done [0-9]* runs in [0-9]* second(s)' "$log" | tail -1)"
  else
    echo "$name: FAILED (see $log and $work/)"
    tail -n 30 "$log"
    status=1
  fi
done
exit $status
