#!/usr/bin/env bash
# The main job: sets up, builds and runs the lumora tool from the repository root.
# With no arguments it reports the build and the GPU, renders a frame of the demo scene
# through the engine headless to out/demo-frame.png, bakes the larger sample level's
# lighting (the ambient volume with 2 bounces, and every room's reflection cubemap, shared
# by one process per processor) and
# renders the level to out/level-frame.png. With arguments it runs lumora with them
# (lumora --help lists the commands).
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
bash scripts/build.sh
if [ $# -gt 0 ]; then
	exec ./build/tools/lumora/lumora "$@"
fi
./build/tools/lumora/lumora
mkdir -p out
./build/tools/lumora/lumora demo --out out/demo-frame.png
./build/tools/lumora/lumora bake sample_large --bounces 2 --jobs 0
./build/tools/lumora/lumora render sample_large --out out/level-frame.png
