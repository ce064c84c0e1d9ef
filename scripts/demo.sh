#!/usr/bin/env bash
# Builds the tsd tool and runs it on the demo property file: the check, then
# the constraints written back in canonical form; then the same for a
# board's statement file, fmt shown as what it changes.
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
echo
# A board's constraint file of statements; the groups it only names are the
# netlist's.
echo "\$ tsd check --assume-netlist examples/board.stmts"
"$tsd" check --assume-netlist examples/board.stmts || echo "(exit status $?)"
echo
echo "\$ tsd fmt --assume-netlist examples/board.stmts | diff examples/board.stmts -"
"$tsd" fmt --assume-netlist examples/board.stmts | diff examples/board.stmts - || true
