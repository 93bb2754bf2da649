#!/usr/bin/env bash
# Builds the libFuzzer targets with clang and runs each from its seed corpus.
#   fuzz.sh [runs]        (default 10000000 runs a target; CI gives a small number)
# A crash leaves its input as fuzz/crash-* and stops with the target's report.
set -euo pipefail
cd "$(dirname "$0")/.."
runs=${1:-10000000}
CC=clang CXX=clang++ cmake -S . -B build/fuzz -G Ninja -DQZIVI_FUZZ=ON -DQZIVI_BUILD_QT=OFF \
  -DQZIVI_BUILD_TESTS=OFF -DQZIVI_BUILD_BENCH=OFF -DQZIVI_BUILD_PYTHON=OFF \
  -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
# Quiet when it builds; the compiler's words when it does not.
if ! cmake --build build/fuzz -j 2 >build/fuzz-build.log 2>&1; then
  tail -40 build/fuzz-build.log
  exit 1
fi
export QZIVI_SESSION_MANAGER=none
for target in bag qzc store numbers data_file scpi; do
  work=$(mktemp -d)
  echo "== fuzz_$target: $runs runs"
  # The seeds are read, not written to: new finds go to a scratch folder.
  # A fixed seed: the short CI runs are the same every time.
  build/fuzz/fuzz/fuzz_$target -seed=1 -runs="$runs" -max_len=65536 -artifact_prefix=fuzz/crash-$target- \
    -print_final_stats=1 "$work" fuzz/corpus/$target 2>&1 |
    grep -E "stat::number_of_executed_units|ERROR|SUMMARY|Done" || true
  rm -rf "$work"
  if ls fuzz/crash-$target-* >/dev/null 2>&1; then echo "fuzz_$target crashed"; exit 1; fi
done
