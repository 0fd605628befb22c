#!/usr/bin/env bash
# Sets up, builds and opens the desktop editor on a level (sample_large unless named), working in
# this repository's data/. Extra arguments go to lumora-editor (lumora-editor --help).
#   scripts/editor.sh                  the larger sample level
#   scripts/editor.sh sample_small
# Without a display (a server, CI) it runs under a private Xvfb, which only makes sense with
# --screenshot (scripts/editor-screenshot.sh).
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
bash scripts/build.sh
level="${1:-sample_large}"
shift || true
if [ -z "${DISPLAY:-}" ] && [ -z "${WAYLAND_DISPLAY:-}" ]; then
	exec bash app/tests/run-under-xvfb.sh ./build/app/lumora-editor --data . "$level" "$@"
fi
exec ./build/app/lumora-editor --data . "$level" "$@"
