"""Plain records of a level's placed objects, as the Editor reads and writes them.

Positions and directions are world-space (x, y, z) tuples; colours are linear RGB intensities
that may exceed 1. A spot light's cone is given as the half-angles of its inner (full light) and
outer (no light) cones in degrees; the engine keeps their cosines.
"""

from __future__ import annotations

import math
import struct
from dataclasses import dataclass, field
from typing import Tuple

Vector = Tuple[float, float, float]


def _single(value: float) -> float:
    """The engine's single-precision value as the shortest decimal that reads back as it (2.6, not
    2.5999999046325684), so records print as they were typed and write back unchanged."""
    single = struct.unpack("f", struct.pack("f", value))[0]
    for digits in range(1, 10):
        short = float(f"{single:.{digits}g}")
        if struct.unpack("f", struct.pack("f", short))[0] == single:
            return short
    return single


def _singles(values) -> Vector:
    return tuple(_single(value) for value in values)  # type: ignore[return-value]


def _cone_angle(cosine: float) -> float:
    """A cone half-angle in degrees from the engine's cosine, with the fewest decimals whose cosine
    is the same single-precision value."""
    single = struct.unpack("f", struct.pack("f", cosine))[0]
    exact = math.degrees(math.acos(max(-1.0, min(1.0, single))))
    for decimals in range(0, 12):
        angle = round(exact, decimals)
        if struct.unpack("f", struct.pack("f", math.cos(math.radians(angle))))[0] == single:
            return angle
    return exact


def _vector(value, name: str) -> Vector:
    items = tuple(float(item) for item in value)
    if len(items) != 3:
        raise ValueError(f"{name} must have three components, not {len(items)}")
    return items  # type: ignore[return-value]


@dataclass
class PointLight:
    """A point light: where it is, its colour (linear, may exceed 1) and its reach in metres."""

    position: Vector = (0.0, 0.0, 0.0)
    color: Vector = (1.0, 1.0, 1.0)
    falloff: float = 5.0

    kind = 0

    def _values(self) -> dict:
        return {"position": _vector(self.position, "position"), "color": _vector(self.color, "color"),
                "falloff": float(self.falloff)}

    @classmethod
    def _from_values(cls, values: dict) -> "PointLight":
        return cls(position=_singles(values["position"]), color=_singles(values["color"]),
                   falloff=_single(values["falloff"]))


@dataclass
class SpotLight:
    """A spot light: position, colour, reach, the direction it points along, and its cone's inner
    and outer half-angles in degrees (full light inside the inner cone, none outside the outer)."""

    position: Vector = (0.0, 0.0, 0.0)
    color: Vector = (1.0, 1.0, 1.0)
    falloff: float = 8.0
    direction: Vector = (0.0, -1.0, 0.0)
    inner_angle: float = 20.0
    outer_angle: float = 30.0

    kind = 1

    def _values(self) -> dict:
        inner, outer = float(self.inner_angle), float(self.outer_angle)
        if not (0.0 <= inner <= outer <= 180.0):
            raise ValueError(f"the cone's half-angles must satisfy 0 <= inner <= outer <= 180 degrees, "
                             f"not inner {inner}, outer {outer}")
        return {"position": _vector(self.position, "position"), "color": _vector(self.color, "color"),
                "falloff": float(self.falloff), "direction": _vector(self.direction, "direction"),
                "inner_cos": math.cos(math.radians(inner)), "outer_cos": math.cos(math.radians(outer))}

    @classmethod
    def _from_values(cls, values: dict) -> "SpotLight":
        return cls(position=_singles(values["position"]), color=_singles(values["color"]),
                   falloff=_single(values["falloff"]), direction=_singles(values["direction"]),
                   inner_angle=_cone_angle(values["inner_cos"]), outer_angle=_cone_angle(values["outer_cos"]))


@dataclass
class Decal:
    """A decal: where it is projected from, its tint, the surface normal it projects along, its type
    (a name from the level's decal type catalogue), its size and its projection depth."""

    position: Vector = (0.0, 0.0, 0.0)
    color: Vector = (1.0, 1.0, 1.0)
    direction: Vector = (0.0, 0.0, 1.0)
    type: str = ""
    size: float = 1.0
    depth: float = 1.0

    kind = 2

    def _values(self) -> dict:
        values = {"position": _vector(self.position, "position"), "color": _vector(self.color, "color"),
                  "direction": _vector(self.direction, "direction"), "size": float(self.size),
                  "depth": float(self.depth)}
        if self.type:
            values["type"] = str(self.type)
        return values

    @classmethod
    def _from_values(cls, values: dict) -> "Decal":
        return cls(position=_singles(values["position"]), color=_singles(values["color"]),
                   direction=_singles(values["direction"]), type=values["type"], size=_single(values["size"]),
                   depth=_single(values["depth"]))


@dataclass
class PathNode:
    """A node of the AI path graph: its position, its ID in nodegraph.xml (read only) and the IDs of
    the nodes it is joined to (read only: a new node is joined to the node added before it)."""

    position: Vector = (0.0, 0.0, 0.0)
    id: int = field(default=0, compare=False)
    links: Tuple[int, ...] = field(default=(), compare=False)

    kind = 3

    def _values(self) -> dict:
        return {"position": _vector(self.position, "position")}

    @classmethod
    def _from_values(cls, values: dict) -> "PathNode":
        return cls(position=_singles(values["position"]), id=values["id"], links=tuple(values["links"]))


@dataclass(frozen=True)
class Room:
    """A room of the level: its ID, its bounds, and the file its reflection cubemap is baked into
    (relative to the data folder; empty when the ID cannot name a file)."""

    id: str
    min: Vector
    max: Vector
    center: Vector
    cubemap: str = ""

    @classmethod
    def _from_values(cls, values: dict) -> "Room":
        return cls(id=values["id"], min=tuple(values["min"]), max=tuple(values["max"]),
                   center=tuple(values["center"]), cubemap=values["cubemap"])


@dataclass(frozen=True)
class Problem:
    """One problem that check() found: the message, the file and the element or attribute it names
    (empty when it names none), and whether it is about a baked output (which a bake replaces)."""

    message: str
    file: str = ""
    element: str = ""
    baked: bool = False


@dataclass(frozen=True)
class CheckReport:
    """What check() found in a level: its problems, and notes on what is not baked yet."""

    level: str
    problems: Tuple[Problem, ...]
    notes: Tuple[str, ...]

    @property
    def ok(self) -> bool:
        """True when the level has no problem at all."""
        return not self.problems

    @property
    def stale(self) -> Tuple[Problem, ...]:
        """The problems with the baked outputs: damaged, or older than an input."""
        return tuple(problem for problem in self.problems if problem.baked)


@dataclass(frozen=True)
class BakeStatus:
    """Where a running bake is, or how the last one ended."""

    phase: str  # "idle", "ambient" or "reflections"
    bounce: int
    bounces: int
    probes_done: int
    probes_total: int
    rooms_done: int
    rooms_total: int
    elapsed: float
    seconds_left: "float | None"
    last_result: str  # "none", "finished", "cancelled" or "failed"
    last_message: str
    percent: int


@dataclass(frozen=True)
class BakeResult:
    """How a bake ended: "finished", "cancelled" or "failed", the library's message, whether
    ambient.sh was written, the probes rendered, the seconds taken and the problems reported."""

    result: str
    message: str
    ambient_written: bool
    probes: int
    seconds: float
    problems: Tuple[str, ...]

    @property
    def finished(self) -> bool:
        return self.result == "finished" and not self.problems
