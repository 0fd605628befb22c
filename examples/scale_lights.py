#!/usr/bin/env python3
"""Scale the intensity of every light of a level (a lighting pass asked for 'everything 20 % brighter').

    PYTHONPATH=build/python python3 examples/scale_lights.py sample_small 1.2 [--data DIR] [--kind point|spot|all]
"""

import argparse
import sys

import lumora


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("level")
    parser.add_argument("factor", type=float, help="what every colour is multiplied by (above 0)")
    parser.add_argument("--data", default=".", help="the folder holding data/")
    parser.add_argument("--kind", choices=("point", "spot", "all"), default="all")
    options = parser.parse_args()
    if options.factor <= 0.0:
        parser.error("the factor must be above 0")
    with lumora.Editor(options.data, 64, 64) as editor:
        editor.open(options.level)
        changed = 0
        if options.kind in ("point", "all"):
            for index, light in enumerate(editor.point_lights):
                light.color = tuple(channel * options.factor for channel in light.color)
                editor.set(index, light)
                changed += 1
        if options.kind in ("spot", "all"):
            for index, light in enumerate(editor.spot_lights):
                light.color = tuple(channel * options.factor for channel in light.color)
                editor.set(index, light)
                changed += 1
        editor.save()
    print(f"{options.level}: {changed} light(s) scaled by {options.factor:g}; the bake is now stale")
    return 0


if __name__ == "__main__":
    try:
        sys.exit(main())
    except lumora.LumoraError as error:
        print(f"scale_lights: {error}", file=sys.stderr)
        sys.exit(1)
