#!/usr/bin/env bash
# Runs a window test under an X server: the one in $DISPLAY, else a private Xvfb started here
# (the first free display number, no TCP) and stopped afterwards. Without either, the test runs
# on Qt's offscreen platform, where it skips what needs a real window.
set -uo pipefail
if [ -n "${DISPLAY:-}" ]; then
	QT_QPA_PLATFORM=xcb exec "$@"
fi
if ! command -v Xvfb >/dev/null 2>&1; then
	QT_QPA_PLATFORM=offscreen exec "$@"
fi
fifo=$(mktemp -u)
mkfifo "$fifo"
Xvfb -displayfd 3 -screen 0 1600x1000x24 -nolisten tcp 3>"$fifo" >/dev/null 2>&1 &
server=$!
read -r -t 20 number <"$fifo"
rm -f "$fifo"
if [ -z "${number:-}" ]; then
	echo "run-under-xvfb: Xvfb did not start" >&2
	kill "$server" 2>/dev/null
	exit 1
fi
DISPLAY=":$number" QT_QPA_PLATFORM=xcb "$@"
status=$?
kill "$server" 2>/dev/null
wait "$server" 2>/dev/null
exit $status
