#!/usr/bin/env bash
# Sets up, builds and runs the main job: qzfgen configures the built-in simulator "SampleFGen"
# from the example configuration and prints the driver calls and what its outputs carry.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh build/release -DQZIVI_BUILD_TESTS=OFF -DQZIVI_BUILD_BENCH=OFF >/dev/null
if [ $# -eq 0 ]; then set -- --load examples/two-channels.qzc; fi
exec build/release/apps/qzfgen/qzfgen "$@"
