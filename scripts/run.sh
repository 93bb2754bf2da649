#!/usr/bin/env bash
# Sets up, builds and runs the main job: qzfgen on the built-in simulator "SampleFGen".
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh build/release -DQZIVI_BUILD_TESTS=OFF -DQZIVI_BUILD_BENCH=OFF >/dev/null
exec build/release/apps/qzfgen/qzfgen "$@"
