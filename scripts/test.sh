#!/usr/bin/env bash
# The whole test suite from a fresh machine: set-up, build, unit tests (plain
# and under AddressSanitizer and UndefinedBehaviorSanitizer), format check.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
scripts/build.sh default
scripts/check-format.sh
ctest --preset default -j "$(nproc)"
