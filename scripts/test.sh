#!/usr/bin/env bash
# Builds and runs every test: the optimised build and the sanitizer build.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/setup-deps.sh
cmake --workflow --preset default
cmake --workflow --preset asan
