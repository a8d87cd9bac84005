#!/usr/bin/env bash
# From a fresh machine: set-up, build, and the main job on the bundled sample.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh release
build/release/host/archway --help
