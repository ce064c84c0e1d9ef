#!/usr/bin/env bash
# Builds the coverage preset, runs every test, and prints line and branch
# coverage per source folder of src/ and tools/. The HTML report goes to
# build/coverage/report/index.html. A folder that falls more than one point
# below tests/coverage-baseline.txt fails the run; --update-baseline writes
# the figures of this run as the new baseline instead.
set -euo pipefail
cd "$(dirname "$0")/.."

update=""
[ "${1:-}" = "--update-baseline" ] && update="--update"

bash scripts/setup-deps.sh
cmake --preset coverage >/dev/null
cmake --build --preset coverage
# Counters from an earlier run would add up with this one.
find build/coverage -name '*.gcda' -delete
ctest --preset coverage

report=build/coverage/report
mkdir -p "$report"
gcovr --root . --object-directory build/coverage \
      --filter 'src/' --filter 'tools/' \
      --exclude-directories '.*/consumer/.*' --exclude-directories '.*/CMakeFiles/[0-9].*' \
      --exclude-throw-branches --exclude-unreachable-branches \
      --json-summary "$report/summary.json" \
      --html-details "$report/index.html"
python3 scripts/coverage_table.py "$report/summary.json" tests/coverage-baseline.txt $update
echo "HTML report: $report/index.html"
