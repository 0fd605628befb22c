#!/usr/bin/env python3
"""Bake a level in continuous integration: refuse a level with problems, bake it, and fail unless the
bake finished cleanly and left the level up to date.

    PYTHONPATH=build/python python3 examples/ci_bake.py sample_small [--data DIR] [--bounces 2]

Exit status: 0 baked, 1 problems in the level or the bake, 130 cancelled (Ctrl-C; files as they were).
"""

import argparse
import sys

import lumora


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("level")
    parser.add_argument("--data", default=".", help="the folder holding data/")
    parser.add_argument("--bounces", type=int, default=2)
    options = parser.parse_args()

    report = lumora.check(options.level, options.data)
    broken = [problem for problem in report.problems if not problem.baked]
    if broken:
        print(f"::error::{options.level} has {len(broken)} problem(s); not baked")
        for problem in broken:
            print(f"::error file={problem.file}::{problem.message}")
        return 1

    def show(status: lumora.BakeStatus) -> None:
        if status.phase == "ambient":
            print(f"  ambient bounce {status.bounce}/{status.bounces}: {status.probes_done}/{status.probes_total} probes",
                  flush=True)
        elif status.phase == "reflections":
            print(f"  reflections: {status.rooms_done}/{status.rooms_total} rooms", flush=True)

    with lumora.Editor(options.data, 64, 64) as editor:
        editor.open(options.level)
        try:
            result = editor.bake(bounces=options.bounces, progress=show, poll_seconds=1.0)
        except KeyboardInterrupt:
            print("cancelled: every baked file is as it was")
            return 130
    if not result.finished:
        print(f"::error::the bake of {options.level} {result.result}: {result.message}")
        for problem in result.problems:
            print(f"::error::{problem}")
        return 1
    after = lumora.check(options.level, options.data)
    if not after.ok or after.notes:
        print(f"::error::{options.level} is not up to date after its bake: "
              + "; ".join([problem.message for problem in after.problems] + list(after.notes)))
        return 1
    print(f"{options.level}: baked ({result.probes} probe renders) in {result.seconds:.1f} s, up to date")
    return 0


if __name__ == "__main__":
    sys.exit(main())
