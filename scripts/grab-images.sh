#!/usr/bin/env bash
# Renders the widgets offscreen into docs/images, at one and two device pixels a pixel.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh build/release >/dev/null
QT_QPA_PLATFORM=offscreen build/release/tools/grab-widgets/grab_widgets docs/images
