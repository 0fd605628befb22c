"""python3 -m lumora.distributed LEVEL (--scheduler tcp://HOST:PORT | --local N) [--bounces N] [--rooms ID,ID]

Bakes a level over a Dask cluster: an existing one (--scheduler), or N local worker processes
(--local). Exit status: 0 baked, 1 the bake failed or the level has problems, 2 bad arguments or no
cluster, 130 cancelled (Ctrl-C; every output as it was).
"""

from __future__ import annotations

import argparse
import os
import sys
import time

from .._editor import LumoraError
from . import bake


def _arguments(argv):
    parser = argparse.ArgumentParser(prog="python3 -m lumora.distributed",
                                     description="Bake a level's lighting over a Dask cluster.")
    parser.add_argument("level", metavar="LEVEL", help="level folder name under data/XML/levels/")
    where = parser.add_mutually_exclusive_group(required=True)
    where.add_argument("--scheduler", metavar="tcp://HOST:PORT", help="the Dask scheduler to use")
    where.add_argument("--local", metavar="N", type=int, help="start N local worker processes")
    parser.add_argument("--bounces", type=int, default=2, help="ambient light bounces (default 2; 0: none)")
    parser.add_argument("--parts", type=int, default=None, help="probe ranges per bounce (default 3 per worker)")
    parser.add_argument("--data", default=".", help="the folder that holds data/ (default: here)")
    parser.add_argument("--shared-data", metavar="DIR", default=None,
                        help="the data folder as every worker sees it (a share); otherwise the inputs are shipped")
    parser.add_argument("--ambient-only", action="store_true", help="bake the ambient volume only")
    parser.add_argument("--reflections-only", action="store_true", help="bake the room reflections only")
    parser.add_argument("--rooms", metavar="ID,ID", default=None,
                        help="re-bake only these rooms' reflection cubemaps (comma-separated IDs; no ambient bake)")
    parser.add_argument("--force", action="store_true", help="bake a level in which check finds problems")
    parser.add_argument("--connect-timeout", type=float, default=10.0, metavar="SECONDS",
                        help="how long to try to reach the scheduler (default 10)")
    options = parser.parse_args(argv)
    if options.local is not None and options.local < 1:
        parser.error("--local needs at least 1 worker")
    if options.ambient_only and options.reflections_only:
        parser.error("--ambient-only and --reflections-only exclude each other")
    if options.rooms is not None:
        options.rooms = [room.strip() for room in options.rooms.split(",") if room.strip()]
        if not options.rooms:
            parser.error("--rooms needs at least one room ID")
        if options.ambient_only:
            parser.error("--rooms re-bakes reflections only; it excludes --ambient-only")
        options.reflections_only = True
    return options


def _progress(phase: str, done: int, total: int) -> None:
    end = "\n" if done == total else ""
    print(f"\r{phase}: {done}/{total} tasks", end=end, file=sys.stderr, flush=True)


def _client(options):
    from distributed import Client, LocalCluster

    if options.local is not None:
        cluster = LocalCluster(n_workers=options.local, threads_per_worker=1, processes=True,
                               dashboard_address=None)
        return Client(cluster), cluster
    return Client(options.scheduler, timeout=options.connect_timeout), None


def main(argv=None) -> int:
    options = _arguments(argv)
    if not os.path.isdir(os.path.join(options.data, "data")):
        print(f"lumora.distributed: no data/ folder in {os.path.abspath(options.data)}", file=sys.stderr)
        return 2
    try:
        client, cluster = _client(options)
    except (OSError, TimeoutError) as error:
        where = options.scheduler or "the local cluster"
        print(f"lumora.distributed: cannot reach the Dask scheduler at {where}: {error}", file=sys.stderr)
        return 2
    start = time.monotonic()
    try:
        result = bake(options.level, client, bounces=0 if options.reflections_only else options.bounces,
                      parts=options.parts, data=options.data, ambient=not options.reflections_only,
                      reflections=not options.ambient_only, shared_data=options.shared_data, force=options.force,
                      rooms=options.rooms, progress=_progress)
    except KeyboardInterrupt:
        print("\nlumora.distributed: bake cancelled: every output is as it was", file=sys.stderr)
        return 130
    except LumoraError as error:
        print(f"lumora.distributed: {error}", file=sys.stderr)
        return 1
    finally:
        client.close()
        if cluster is not None:
            cluster.close()
    if result.ambient:
        print(f"ambient: {result.ambient}: {result.cells} cells x {result.bounces} bounce(s) in "
              f"{result.parts} parts per bounce")
    for cubemap in result.cubemaps:
        print(f"reflections: {cubemap}")
    print(f"baked {result.level} on {result.workers} worker(s) in {time.monotonic() - start:.1f} s")
    return 0


if __name__ == "__main__":
    sys.exit(main())
