#!/usr/bin/env bash
# The main job: sets up, builds and runs the lumora tool from the repository root.
# With no arguments it reports the build and the GPU, then renders a frame through
# the engine headless to out/demo-frame.png.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
bash scripts/build.sh
if [ $# -gt 0 ]; then
	exec ./build/tools/lumora/lumora "$@"
fi
./build/tools/lumora/lumora
./build/tools/lumora/lumora --demo-frame out/demo-frame.png
