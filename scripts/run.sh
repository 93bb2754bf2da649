#!/usr/bin/env bash
# Sets up, builds and runs the main job. Where a display exists: the front panel program on the
# built-in simulator "SampleFGen" with the example configuration. Otherwise the command-line
# demo: qzfgen configures "SampleFGen" from the example, prints the driver calls and what the
# outputs do, and renders an excerpt of channel 1. With arguments, runs qzfgen with them.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh build/release -DQZIVI_BUILD_TESTS=OFF -DQZIVI_BUILD_BENCH=OFF >/dev/null
qzfgen=build/release/apps/qzfgen/qzfgen
if [ $# -gt 0 ]; then exec "$qzfgen" "$@"; fi
if [ -n "${DISPLAY:-}${WAYLAND_DISPLAY:-}" ]; then
  exec build/release/apps/qzfgen-panel/qzfgen-panel examples/two-channels.qzc
fi
"$qzfgen" configure examples/two-channels.qzc --trace /dev/stdout
echo
"$qzfgen" render examples/two-channels.qzc --channel Channel1 --points 10 --rate 10k
