#!/usr/bin/env bash
# From a fresh machine: set-up, build, and the main job on the sample: a
# generated fisheye photograph of a room and the action that straightens its
# edges, replayed by the host program; then the photograph and its correction
# side by side in one picture.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh release
out=build/sample
mkdir -p "$out"
build/release/tools/synth/archway-synth --scene room --projection fisheye-equisolid \
  --focal-mm 10 --size 1800x1200 -o "$out/room.tif" --action "$out/room.action"
build/release/host/archway apply --action "$out/room.action" -o "$out/room-archway.tif" \
  "$out/room.tif"
build/release/tools/measure/archway-measure --side-by-side "$out/room.tif" \
  "$out/room-archway.tif" -o "$out/room-before-after.png"
echo "sample: $out/room.tif corrected into $out/room-archway.tif"
echo "        both side by side in $out/room-before-after.png"
