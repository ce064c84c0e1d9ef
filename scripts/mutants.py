#!/usr/bin/env python3
"""Breaks the code on purpose, one fault at a time, and tells whether the
test suite notices each one.

usage: mutants.py [--list FILE] [--build DIR] [--all] [NAME ...]

The faults are listed in tests/mutants.txt, one block each:

    == name: what the fault does
    file: src/base/Tsd_Lists.cpp
    - text as it stands in the file (must occur exactly once)
    + the text that replaces it

Every fault is applied to a clean copy of its file, the tests are rebuilt in
their own build folder and run until the first failure; the file is then put
back. A fault is "caught" when a test fails or the build breaks (reported as
such). With --all every test runs, and the tests that fail are listed: that
shows which tests guard a piece of code before one of them is dropped.
"""
import argparse
import os
import re
import subprocess
import sys

ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
# Tests that prove nothing about a fault, and the golden runs of the whole tool.
SLOW = "install-consumer|bench_smoke"
WHOLE_TOOL = r"^(cli|regress)\."


def parse(path):
    faults, cur = [], None
    with open(path) as f:
        for raw in f:
            line = raw.rstrip("\n")
            if line.startswith("=="):
                name, _, what = line[2:].strip().partition(":")
                cur = {"name": name.strip(), "what": what.strip(), "old": [], "new": []}
                faults.append(cur)
            elif cur is None or line.startswith("#") or not line.strip():
                continue
            elif line.startswith("file:"):
                cur["file"] = line[5:].strip()
            elif line.startswith("- "):
                cur["old"].append(line[2:])
            elif line.startswith("+ ") or line == "+":
                cur["new"].append(line[2:])
    for fault in faults:
        fault["old"] = "\n".join(fault["old"])
        fault["new"] = "\n".join(fault["new"])
    return faults


def run(cmd, **kw):
    return subprocess.run(cmd, cwd=ROOT, stdout=subprocess.PIPE, stderr=subprocess.STDOUT,
                          text=True, **kw)


def main():
    ap = argparse.ArgumentParser()
    ap.add_argument("--list", default=os.path.join(ROOT, "tests", "mutants.txt"))
    ap.add_argument("--build", default="build/mutants")
    ap.add_argument("--all", action="store_true",
                    help="run every test and list those that fail")
    ap.add_argument("names", nargs="*")
    args = ap.parse_args()

    faults = parse(args.list)
    if args.names:
        faults = [f for f in faults if f["name"] in args.names]
    if not os.path.exists(os.path.join(ROOT, args.build, "build.ninja")):
        r = run(["cmake", "-S", ".", "-B", args.build, "-G", "Ninja",
                 "-DCMAKE_BUILD_TYPE=Release", "-DTSD_BUILD_EXAMPLES=OFF",
                 "-DTSD_WARNINGS_AS_ERRORS=OFF"])
        if r.returncode != 0:
            print(r.stdout)
            return 2
    r = run(["cmake", "--build", args.build])
    if r.returncode != 0:
        print(r.stdout)
        print("the unchanged code does not build")
        return 2

    caught = 0
    for fault in faults:
        path = os.path.join(ROOT, fault["file"])
        with open(path) as f:
            original = f.read()
        if original.count(fault["old"]) != 1:
            print(f"{fault['name']:<28} NOT APPLIED: the text occurs "
                  f"{original.count(fault['old'])} times in {fault['file']}")
            continue
        try:
            with open(path, "w") as f:
                f.write(original.replace(fault["old"], fault["new"]))
            b = run(["cmake", "--build", args.build])
            if b.returncode != 0:
                verdict = "caught (build)"
            else:
                # A fault may make a test loop: the timeout ends it as a failure.
                cmd = ["ctest", "--test-dir", args.build, "-j2", "--timeout", "120"]
                if args.all:
                    t = run(cmd + ["-E", SLOW])
                else:
                    # The library's own tests first: they fail fastest; the
                    # runs of the whole tool only when those all pass.
                    cmd.append("--stop-on-failure")
                    t = run(cmd + ["-E", SLOW + "|" + WHOLE_TOOL])
                    if t.returncode == 0:
                        t = run(cmd + ["-R", WHOLE_TOOL, "-E", SLOW])
                verdict = "caught" if t.returncode != 0 else "MISSED"
                if args.all and t.returncode != 0:
                    failed = re.findall(r"^\s*\d+ - (\S+) \(", t.stdout, re.M)
                    verdict += " by " + str(len(failed))
                    fault["failed"] = failed
        finally:
            with open(path, "w") as f:
                f.write(original)
        if verdict.startswith("caught"):
            caught += 1
        print(f"{fault['name']:<28} {verdict:<15} {fault['what']}", flush=True)
        if fault.get("failed"):
            print("    " + " ".join(fault["failed"]), flush=True)
    run(["cmake", "--build", args.build])
    print(f"{caught} of {len(faults)} faults caught")
    return 0


if __name__ == "__main__":
    sys.exit(main())
