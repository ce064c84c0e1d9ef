#!/usr/bin/env python3
"""Line and branch coverage per source folder, from a gcovr JSON summary.

usage: coverage_table.py SUMMARY.json BASELINE [--update]

Prints one row per folder and a total. Without --update, a folder whose line
or branch coverage is more than one point below the baseline fails (exit 1);
with --update, the baseline is rewritten with this run's figures.
"""
import json
import os
import sys

TOLERANCE = 1.0  # points; rounding differences must not fail a run


def percent(covered, total):
    return 100.0 * covered / total if total else 100.0


def folders(summary):
    rows = {}
    for f in summary["files"]:
        folder = os.path.dirname(f["filename"])
        row = rows.setdefault(folder, [0, 0, 0, 0])
        row[0] += f["line_covered"]
        row[1] += f["line_total"]
        row[2] += f["branch_covered"]
        row[3] += f["branch_total"]
    return rows


def read_baseline(path):
    base = {}
    if not os.path.exists(path):
        return base
    with open(path) as f:
        for line in f:
            if line.startswith("#") or not line.strip():
                continue
            folder, lines, branches = line.split()
            base[folder] = (float(lines), float(branches))
    return base


def main():
    summary_path, baseline_path = sys.argv[1], sys.argv[2]
    update = "--update" in sys.argv[3:]
    with open(summary_path) as f:
        rows = folders(json.load(f))
    base = read_baseline(baseline_path)

    print(f"{'folder':<18} {'lines':>16} {'line %':>7} {'branches':>16} {'branch %':>8}")
    total = [0, 0, 0, 0]
    failures = []
    figures = {}
    for folder in sorted(rows):
        lc, lt, bc, bt = rows[folder]
        total = [a + b for a, b in zip(total, rows[folder])]
        lp, bp = percent(lc, lt), percent(bc, bt)
        figures[folder] = (lp, bp)
        note = ""
        if folder in base:
            bl, bb = base[folder]
            if lp < bl - TOLERANCE or bp < bb - TOLERANCE:
                failures.append(folder)
                note = f"  below baseline {bl:.1f} / {bb:.1f}"
        print(f"{folder:<18} {lc:>7} of {lt:<6} {lp:>6.1f}% {bc:>7} of {bt:<6} {bp:>7.1f}%{note}")
    lc, lt, bc, bt = total
    print(f"{'total':<18} {lc:>7} of {lt:<6} {percent(lc, lt):>6.1f}% "
          f"{bc:>7} of {bt:<6} {percent(bc, bt):>7.1f}%")

    if update:
        with open(baseline_path, "w") as f:
            f.write("# folder  line%  branch%  (scripts/coverage.sh --update-baseline)\n")
            for folder, (lp, bp) in sorted(figures.items()):
                f.write(f"{folder} {lp:.1f} {bp:.1f}\n")
        print(f"baseline written to {baseline_path}")
        return 0
    if failures:
        print("coverage fell more than %.0f point below the baseline in: %s"
              % (TOLERANCE, ", ".join(failures)))
        return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
