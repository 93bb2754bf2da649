#!/usr/bin/env bash
# Builds the libFuzzer targets with clang and runs each from its seed corpus.
#   fuzz.sh [runs] [target...]   (default 10000000 runs of every target; CI gives a small number)
# A short run (CI's) is the same every time: a fixed seed, new finds to a scratch folder, one
# target after another. A long run keeps what it finds in build/fuzz/corpus-<target>, so that
# nights add up, takes a new seed each time, and runs as many targets at once as there are
# cores, each logging to build/fuzz/<target>.log.
# A crash leaves its input as fuzz/crash-* and stops with the target's report.
set -euo pipefail
cd "$(dirname "$0")/.."
runs=${1:-10000000}
shift || true
targets=("$@")
[ ${#targets[@]} -gt 0 ] || targets=(bag qzc store numbers data_file scpi)
long=$((runs > 100000))

CC=clang CXX=clang++ cmake -S . -B build/fuzz -G Ninja -DQZIVI_FUZZ=ON -DQZIVI_BUILD_QT=OFF \
  -DQZIVI_BUILD_TESTS=OFF -DQZIVI_BUILD_BENCH=OFF -DQZIVI_BUILD_PYTHON=OFF \
  -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
# Quiet when it builds; the compiler's words when it does not.
if ! cmake --build build/fuzz -j 2 >build/fuzz-build.log 2>&1; then
  tail -40 build/fuzz-build.log
  exit 1
fi
export QZIVI_SESSION_MANAGER=none
# A long run spares ASan the stack it records at every allocation (a seventh of fuzz_qzc's
# time); to see where a crash's memory came from, run its target on the crash file alone.
[ "$long" = 1 ] && export ASAN_OPTIONS=${ASAN_OPTIONS:-malloc_context_size=0}

fuzz() {
  local target=$1 work seed=1 max_len=65536
  # A .qzc beyond 8 kB only repeats what a smaller one holds, at its size in every run.
  [ "$target" = qzc ] && max_len=8192
  if [ "$long" = 1 ]; then
    work=build/fuzz/corpus-$target
    seed=0 # libFuzzer picks one and prints it
    mkdir -p "$work"
  else
    work=$(mktemp -d) # the seeds are read, not written to
  fi
  local status=0
  build/fuzz/fuzz/fuzz_$target -seed=$seed -runs="$runs" -max_len=$max_len \
    -artifact_prefix=fuzz/crash-$target- -print_final_stats=1 "$work" fuzz/corpus/$target 2>&1 ||
    status=$?
  [ "$long" = 1 ] || rm -rf "$work"
  return $status
}

summary() { grep -E "Seed:|stat::number_of_executed_units|ERROR|SUMMARY|Done" || true; }
crashed() {
  if ls fuzz/crash-$1-* >/dev/null 2>&1; then echo "fuzz_$1 crashed"; else return 1; fi
}

if [ "$long" = 1 ]; then
  for target in "${targets[@]}"; do
    while [ "$(jobs -rp | wc -l)" -ge "$(nproc)" ]; do wait -n || true; done
    echo "== fuzz_$target: $runs runs, log in build/fuzz/$target.log"
    fuzz "$target" >"build/fuzz/$target.log" 2>&1 &
  done
  wait
  status=0
  for target in "${targets[@]}"; do
    echo "== fuzz_$target"
    summary <"build/fuzz/$target.log"
    if crashed "$target"; then status=1; fi
  done
  exit $status
fi
for target in "${targets[@]}"; do
  echo "== fuzz_$target: $runs runs"
  fuzz "$target" | summary || true
  if crashed "$target"; then exit 1; fi
done
