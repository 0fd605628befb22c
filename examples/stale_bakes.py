#!/usr/bin/env python3
"""List the levels whose baked lighting is missing, damaged or older than their inputs.

    PYTHONPATH=build/python python3 examples/stale_bakes.py [--data DIR]

Exit status 1 when any level needs a bake (a nightly job can bake exactly those).
"""

import argparse
import os
import sys

import lumora


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--data", default=".", help="the folder holding data/")
    options = parser.parse_args()
    levels_folder = os.path.join(options.data, "data", "XML", "levels")
    if not os.path.isdir(levels_folder):
        print(f"stale_bakes: no data/XML/levels in {os.path.abspath(options.data)}", file=sys.stderr)
        return 2
    needing = 0
    for level in sorted(os.listdir(levels_folder)):
        if not os.path.isdir(os.path.join(levels_folder, level)):
            continue
        report = lumora.check(level, options.data)
        broken = [problem for problem in report.problems if not problem.baked]
        reasons = [problem.message for problem in report.stale] + list(report.notes)
        if broken:
            print(f"{level}: {len(broken)} problem(s) in the level itself; fix them before baking")
            for problem in broken:
                print(f"  {problem.file or '-'}: {problem.message}")
            needing += 1
        elif reasons:
            print(f"{level}: needs a bake")
            for reason in reasons:
                print(f"  {reason}")
            needing += 1
        else:
            print(f"{level}: up to date")
    return 1 if needing else 0


if __name__ == "__main__":
    sys.exit(main())
