#!/usr/bin/env bash
# The random-operation test at length: 100,000 steps for each seed (CI runs 1,500).
#   random-ops.sh [steps] [seed]      (a failing seed and step are printed; QZIVI_RANDOM_SEED=N
#                                      repeats one seed alone)
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/build.sh build/release -DQZIVI_BUILD_TESTS=ON >/dev/null
QZIVI_RANDOM_OPS=${1:-100000} QZIVI_RANDOM_SEED=${2:-0} QZIVI_SESSION_MANAGER=none \
  build/release/tests/control/control_tests --gtest_filter='RandomOperations*'
