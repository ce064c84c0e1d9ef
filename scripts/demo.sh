#!/usr/bin/env bash
# Builds the project and runs the example program.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/setup-deps.sh
cmake --preset default >/dev/null
cmake --build --preset default
./build/default/examples/tsd_foundation_demo
