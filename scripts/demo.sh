#!/usr/bin/env bash
# Builds the tsd tool and runs it on the demo property file: the check, then
# the constraints written back in canonical form.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/setup-deps.sh
cmake --preset default >/dev/null
cmake --build --preset default --target tsd_cli
tsd=build/default/tools/tsd

echo "\$ tsd check examples/demo.props"
"$tsd" check examples/demo.props
echo
echo "\$ tsd fmt examples/demo.props"
"$tsd" fmt examples/demo.props
