#!/usr/bin/env bash
# The whole test suite from a fresh machine: set-up, build, unit tests (plain
# and under AddressSanitizer and UndefinedBehaviorSanitizer), format check,
# and every fuzz target replayed over its committed corpus.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh default
scripts/check-format.sh
ctest --preset default -j "$(nproc)"
scripts/fuzz.sh --replay
