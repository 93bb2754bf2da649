#!/usr/bin/env bash
# Sets up, builds and runs the main job: qzfgen configures the built-in simulator "SampleFGen"
# from the example configuration, prints the driver calls and what the outputs do, and renders an
# excerpt of channel 1. With arguments, runs qzfgen with them instead.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh build/release -DQZIVI_BUILD_TESTS=OFF -DQZIVI_BUILD_BENCH=OFF >/dev/null
qzfgen=build/release/apps/qzfgen/qzfgen
if [ $# -gt 0 ]; then exec "$qzfgen" "$@"; fi
"$qzfgen" configure examples/two-channels.qzc --trace /dev/stdout
echo
"$qzfgen" render examples/two-channels.qzc --channel Channel1 --points 10 --rate 10k
