#!/usr/bin/env bash
# How much CPU the desktop editor takes while nobody touches it: opens a level (sample_large unless
# named) under a private Xvfb, lets the eye adaptation settle, then reads the process's CPU time
# (user + system, every thread) over a quiet spell.
#   bench/editor_idle_cpu.sh [LEVEL] [SECONDS]
set -euo pipefail
cd "$(dirname "$0")/.."
level="${1:-sample_large}"
seconds="${2:-10}"
editor=./build/app/lumora-editor
[ -x "$editor" ] || { echo "build the editor first (scripts/build.sh)" >&2; exit 1; }
scratch=$(mktemp -d)
trap 'kill "$pid" 2>/dev/null; rm -rf "$scratch"' EXIT
export XDG_CONFIG_HOME="$scratch/config" LUMORA_CLI="$PWD/build/tools/lumora/lumora"
DISPLAY= bash app/tests/run-under-xvfb.sh "$editor" --data . --size 1600x900 "$level" >"$scratch/log" 2>&1 &
sleep 12
pid=$(pgrep -n -f "lumora-editor --data . --size 1600x900 $level")
ticks() { awk '{print $14 + $15}' "/proc/$pid/stat"; }
hz=$(getconf CLK_TCK)
before=$(ticks)
sleep "$seconds"
after=$(ticks)
awk -v t=$((after - before)) -v hz="$hz" -v s="$seconds" \
	'BEGIN { printf "idle editor on %s: %.2f s of CPU in %d s (%.1f %% of one core)\n", "'"$level"'", t / hz, s, 100 * t / hz / s }'
