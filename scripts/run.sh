#!/usr/bin/env bash
# The main job: sets up, builds and runs the lumora tool from the repository root.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
bash scripts/build.sh
./build/tools/lumora/lumora "$@"
