#!/usr/bin/env bash
# Runs a command under an X server of its own (Xvfb), for the windowed tests.
# Xvfb picks a free display number itself (-displayfd), so any number of
# these can start at once.
set -euo pipefail
fifo=$(mktemp -u)
mkfifo "$fifo"
Xvfb -displayfd 3 -screen 0 1280x1024x24 -nolisten tcp 3>"$fifo" 2>/dev/null &
server=$!
read -r number <"$fifo"
rm -f "$fifo"
trap 'kill "$server" 2>/dev/null; wait "$server" 2>/dev/null || true' EXIT
DISPLAY=":$number" "$@"
