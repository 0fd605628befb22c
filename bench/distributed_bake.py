#!/usr/bin/env python3
"""Benchmark: a level's whole bake (ambient bounces and every room's reflection) on one machine
through the Editor, against the same bake spread over 1, 2 and 4 local Dask worker processes.

    PYTHONPATH=build/python /usr/bin/python3 bench/distributed_bake.py [LEVEL] [--bounces 2] [--workers 1,2,4]

Each run bakes a fresh copy of the level (without its bakes) made from the repository's data/. The
engine's software rasterizer is told to use no threads of its own (LP_NUM_THREADS=0) in every
process, as the command line's bake does: a bake draws many small targets, and on two cores a
worker process per core is the parallelism. Prints seconds per run and checks that each distributed
bake wrote the local bake's files byte for byte. (A bake over files baked before is not the same: the
ambient pass of the probes reflects the rooms' cubemaps of the bake before.)
"""

import argparse
import os
import sys
import tempfile
import time

os.environ.setdefault("LP_NUM_THREADS", "0")
sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "python", "tests"))

import lumora  # noqa: E402
import lumora.distributed  # noqa: E402
from conftest import make_data_copy  # noqa: E402


def outputs(folder, level):
    found = {}
    for root, _dirs, names in os.walk(os.path.join(folder, "data")):
        for name in names:
            if name == "ambient.sh" and level in root or os.path.basename(root) == level and name.endswith(".dds"):
                with open(os.path.join(root, name), "rb") as file:
                    found[os.path.relpath(os.path.join(root, name), folder)] = file.read()
    return found


def main() -> int:
    parser = argparse.ArgumentParser()
    parser.add_argument("level", nargs="?", default="sample_large")
    parser.add_argument("--bounces", type=int, default=2)
    parser.add_argument("--workers", default="1,2,4")
    options = parser.parse_args()
    from distributed import Client, LocalCluster

    with tempfile.TemporaryDirectory() as scratch:
        local = make_data_copy(os.path.join(scratch, "local"), levels=(options.level,))
        start = time.monotonic()
        with lumora.Editor(local, 320, 180) as editor:
            editor.open(options.level)
            probes = editor.grid["counts"]
            result = editor.bake(bounces=options.bounces)
            rooms = len(editor.rooms)
        local_seconds = time.monotonic() - start
        assert result.finished, result
        reference = outputs(local, options.level)
        print(f"{options.level}: {probes[0]} x {probes[1]} x {probes[2]} cells, {result.probes} probe renders over "
              f"{options.bounces} bounces, {rooms} rooms")
        print(f"local bake (Editor, one process): {local_seconds:.1f} s")
        for workers in (int(count) for count in options.workers.split(",")):
            folder = make_data_copy(os.path.join(scratch, f"w{workers}"), levels=(options.level,))
            cluster = LocalCluster(n_workers=workers, threads_per_worker=1, processes=True, dashboard_address=None)
            with Client(cluster) as client:
                start = time.monotonic()
                baked = lumora.distributed.bake(options.level, client, bounces=options.bounces, data=folder)
                seconds = time.monotonic() - start
                same = outputs(folder, options.level) == reference
                # The same bake again on a fresh copy: the workers have the level's inputs (the same
                # key) unpacked and loaded already.
                again = make_data_copy(os.path.join(scratch, f"w{workers}-again"), levels=(options.level,))
                start = time.monotonic()
                baked = lumora.distributed.bake(options.level, client, bounces=options.bounces, data=again)
                warm = time.monotonic() - start
                same = same and outputs(again, options.level) == reference
            cluster.close()
            phases = ", ".join(f"{phase} {value:.1f} s" for phase, value in baked.timings.items())
            print(f"{workers} worker(s), {baked.parts} parts per bounce: {seconds:.1f} s first "
                  f"(shipping and loading included), {warm:.1f} s again ({phases}); "
                  f"{'byte-identical to the local bake' if same else 'DIFFERENT from the local bake'}")
            if not same:
                return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
