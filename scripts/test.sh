#!/usr/bin/env bash
# Builds and runs every test: the optimised build, the sanitizer build, a
# bounded run of each fuzz target, and the coverage build, whose table per
# folder must stay within a point of tests/coverage-baseline.txt.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/setup-deps.sh
cmake --workflow --preset default
cmake --workflow --preset asan
cmake --workflow --preset fuzz
bash scripts/coverage.sh
