#!/usr/bin/env bash
# The main job: sets up, builds and runs the lumora tool from the repository root.
# With no arguments it reports the build and the GPU, renders a frame of the demo scene
# through the engine headless to out/demo-frame.png, and loads the larger sample level
# through the editor facade, bakes its ambient light (2 bounces) and renders it to
# out/level-frame.png.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
bash scripts/build.sh
if [ $# -gt 0 ]; then
	exec ./build/tools/lumora/lumora "$@"
fi
./build/tools/lumora/lumora
./build/tools/lumora/lumora --demo-frame out/demo-frame.png
./build/tools/lumora/lumora --level-frame sample_large out/level-frame.png --bake-bounces 2
