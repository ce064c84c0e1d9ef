#!/usr/bin/env bash
# Builds and runs every test: the optimised build, the sanitizer build and
# a bounded run of each fuzz target.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/setup-deps.sh
cmake --workflow --preset default
cmake --workflow --preset asan
cmake --workflow --preset fuzz
