#!/usr/bin/env python3
"""Bake a level on a Dask cluster and show how far it is.

    PYTHONPATH=build/python python3 examples/cluster_bake.py sample_large --scheduler tcp://farm:8786
    PYTHONPATH=build/python python3 examples/cluster_bake.py sample_small --local 2 [--data DIR]

With --shared-data the workers read the data from that path (a share every worker mounts) instead
of being sent the level's inputs.
"""

import argparse
import sys

import lumora
import lumora.distributed


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("level")
    where = parser.add_mutually_exclusive_group(required=True)
    where.add_argument("--scheduler")
    where.add_argument("--local", type=int)
    parser.add_argument("--data", default=".")
    parser.add_argument("--shared-data")
    parser.add_argument("--bounces", type=int, default=2)
    options = parser.parse_args()

    from distributed import Client, LocalCluster

    cluster = None
    if options.local:
        cluster = LocalCluster(n_workers=options.local, threads_per_worker=1, dashboard_address=None)
        client = Client(cluster)
    else:
        try:
            client = Client(options.scheduler, timeout=10)
        except OSError as error:
            print(f"cluster_bake: cannot reach {options.scheduler}: {error}", file=sys.stderr)
            return 2
    try:
        print(f"{len(client.scheduler_info()['workers'])} worker(s)")
        result = lumora.distributed.bake(
            options.level, client, bounces=options.bounces, data=options.data, shared_data=options.shared_data,
            progress=lambda phase, done, total: print(f"  {phase}: {done}/{total}", flush=True))
    except lumora.LumoraError as error:
        print(f"cluster_bake: {error}", file=sys.stderr)
        return 1
    finally:
        client.close()
        if cluster is not None:
            cluster.close()
    for phase, seconds in result.timings.items():
        print(f"  {phase}: {seconds:.1f} s")
    print(f"{result.level}: {result.cells} cells x {result.bounces} bounce(s) and {len(result.cubemaps)} cubemap(s) "
          f"on {result.workers} worker(s) in {result.seconds:.1f} s")
    return 0


if __name__ == "__main__":
    sys.exit(main())
