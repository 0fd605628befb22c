"""The baked files, read as the engine reads them: a level's irradiance volume (ambient.sh),
DDS textures (the rooms' reflection cubemaps, the models' textures) and its bake record
(bake.json).

    volume = lumora.AmbientVolume.read("data/XML/levels/x/ambient.sh")
    light = volume.irradiance([[0.0, 1.5, 0.0]], [[0.0, 1.0, 0.0]])   # (1, 3) float32
    cube = lumora.DdsImage.read("data/Cubemaps/x/1.dds")
    top = cube.face(2)                                                 # +Y, mip 0
    record = lumora.read_bake_record("data/XML/levels/x/bake.json")

A file that is not there raises FileNotFoundError; one the library refuses raises LumoraError
with its message, which names the file.
"""

from __future__ import annotations

import os
from dataclasses import dataclass, field
from typing import Dict, List, Optional, Tuple, Union

import numpy as np

from . import _lumora

PathLike = Union[str, "os.PathLike[str]"]
Vector = Tuple[float, float, float]


# --- ambient.sh ---------------------------------------------------------------------------------

class AmbientVolume:
    """A level's baked ambient light: second-order spherical-harmonics coefficients of irradiance
    over a grid of probes, as seven blocks of packed RGBA8 texels (cAr, cAg, cAb, cBr, cBg, cBb,
    cC), each one 3D texture of counts = (nx, ny, nz) cells spanning the box from world_min to
    world_min + world_size. Cell (i, j, k) is blocks[:, k, j, i]: x varies fastest in the file.

    The volume is a snapshot of the file: blocks is read-only.
    """

    #: The blocks in file order.
    BLOCK_NAMES = ("cAr", "cAg", "cAb", "cBr", "cBg", "cBb", "cC")

    def __init__(self, world_min, world_size, blocks):
        """A volume from its bounds and a uint8 array of shape (7, nz, ny, nx, 4) (the layout
        read() gives). Raises ValueError for any other shape."""
        blocks = np.array(blocks, dtype=np.uint8)  # a copy of its own, made read-only
        if blocks.ndim != 5 or blocks.shape[0] != 7 or blocks.shape[4] != 4 or 0 in blocks.shape:
            raise ValueError(f"blocks must have shape (7, nz, ny, nx, 4) with nx, ny, nz >= 1, "
                             f"not {blocks.shape}")
        blocks.setflags(write=False)
        self._world_min = _vector(world_min, "world_min")
        self._world_size = _vector(world_size, "world_size")
        self._blocks = blocks
        self._coefficients: Optional[np.ndarray] = None

    @classmethod
    def read(cls, path: PathLike) -> "AmbientVolume":
        """Reads an ambient.sh. FileNotFoundError when there is none; LumoraError when it is
        damaged (shorter than its header, counts out of range, a size that does not match them)."""
        data = _lumora.read_ambient(os.fspath(path))
        return cls(data["world_min"], data["world_size"], data["blocks"])

    @property
    def world_min(self) -> Vector:
        """The volume's lowest corner in world space."""
        return self._world_min

    @property
    def world_size(self) -> Vector:
        """The volume's extent along x, y and z; a component <= 0 means no volume (the engine
        then adds no ambient light)."""
        return self._world_size

    @property
    def counts(self) -> Tuple[int, int, int]:
        """Probe cells along x, y and z: (nx, ny, nz)."""
        _, nz, ny, nx, _ = self._blocks.shape
        return (nx, ny, nz)

    @property
    def cell_count(self) -> int:
        """nx * ny * nz."""
        nx, ny, nz = self.counts
        return nx * ny * nz

    @property
    def blocks(self) -> np.ndarray:
        """The packed texels as uint8, shape (7, nz, ny, nx, 4); the last axis holds bytes r, g, b, a."""
        return self._blocks

    def cell_center(self, i: int, j: int, k: int) -> Vector:
        """The world position of cell (i, j, k)'s centre, where sampling gives that cell's value
        alone: world_min + world_size * ((i, j, k) + 0.5) / counts."""
        return tuple(float(low + size * (index + 0.5) / count)  # type: ignore[return-value]
                     for low, size, index, count in zip(self._world_min, self._world_size, (i, j, k),
                                                        self.counts))

    def coefficients(self) -> np.ndarray:
        """The coefficients decoded as the ambient pass decodes them, byte / 255 * 2 - 1: float32,
        shape (7, nz, ny, nx, 4), values in -1..1. Read-only."""
        if self._coefficients is None:
            decoded = self._blocks.astype(np.float32) / np.float32(255.0) * np.float32(2.0) - np.float32(1.0)
            decoded.setflags(write=False)
            self._coefficients = decoded
        return self._coefficients

    def irradiance(self, points, normals) -> np.ndarray:
        """Irradiance over pi at world positions for world-space normals, as the ambient pass
        computes it (VolumeIrradianceOverPi in SceneLighting.fxh): each block sampled at
        (point - world_min) / world_size with trilinear filtering and clamp-to-edge (texel centres
        at (i + 0.5) / n), combined with the normal as second-order SH, clamped at 0.

        points and normals are array-like of shape (..., 3) and broadcast against each other (one
        normal for many points, say); the result is float32 of their broadcast shape, one RGB per
        point. All zero when a component of world_size is <= 0. Normals are used as given, not
        normalised. ValueError for shapes that are not (..., 3) or do not broadcast, or for
        points that are not finite."""
        p = np.asarray(points, dtype=np.float64)
        n = np.asarray(normals, dtype=np.float64)
        if p.ndim == 0 or p.shape[-1] != 3 or n.ndim == 0 or n.shape[-1] != 3:
            raise ValueError(f"points and normals must have shape (..., 3), not {p.shape} and {n.shape}")
        shape = np.broadcast_shapes(p.shape, n.shape)
        p = np.broadcast_to(p, shape).reshape(-1, 3)
        n = np.broadcast_to(n, shape).reshape(-1, 3)
        if not np.isfinite(p).all():
            raise ValueError("points must be finite")
        # The shader's constants are single precision; the file's floats exactly.
        world_min = np.asarray(self._world_min, dtype=np.float32).astype(np.float64)
        world_size = np.asarray(self._world_size, dtype=np.float32).astype(np.float64)
        if (world_size <= 0.0).any():
            return np.zeros(shape, dtype=np.float32)

        c = self._sample((p - world_min) / world_size)
        x, y, z = n[:, 0], n[:, 1], n[:, 2]
        linear = np.stack([x, y, z, np.ones_like(x)], axis=1)
        quadratic = np.stack([x * y, y * z, z * z, z * x], axis=1)
        last = x * x - y * y
        result = np.empty((p.shape[0], 3))
        for channel in range(3):
            result[:, channel] = ((c[channel] * linear).sum(axis=1) + (c[3 + channel] * quadratic).sum(axis=1)
                                  + c[6][:, channel] * last)
        return np.maximum(result, 0.0).astype(np.float32).reshape(shape)

    def _sample(self, uvw: np.ndarray) -> np.ndarray:
        """Every block at the (N, 3) texture coordinates as a linear-filtered, clamp-to-edge 3D
        texture lookup: (7, N, 4) float64."""
        coefficients = self.coefficients()
        lows, highs, weights = [], [], []
        for axis, count in enumerate(self.counts):
            # Texel i's centre is at (i + 0.5) / count. Clipping first keeps far-off points from
            # overflowing the integer conversion; it changes nothing after the index clamp.
            position = np.clip(uvw[:, axis] * count - 0.5, -1.0, float(count))
            low = np.floor(position)
            weights.append(position - low)
            low = low.astype(np.int64)
            lows.append(np.clip(low, 0, count - 1))
            highs.append(np.clip(low + 1, 0, count - 1))
        result = np.zeros((7, uvw.shape[0], 4))
        for corner in range(8):
            picks = [highs[axis] if corner >> axis & 1 else lows[axis] for axis in range(3)]
            weight = np.ones(uvw.shape[0])
            for axis in range(3):
                weight = weight * (weights[axis] if corner >> axis & 1 else 1.0 - weights[axis])
            # (7, nz, ny, nx, 4) indexed by z, y, x.
            result += coefficients[:, picks[2], picks[1], picks[0]] * weight[None, :, None]
        return result

    def __repr__(self) -> str:
        return (f"AmbientVolume(counts={self.counts}, world_min={self._world_min}, "
                f"world_size={self._world_size})")


def _vector(value, name: str) -> Vector:
    values = tuple(float(component) for component in value)
    if len(values) != 3:
        raise ValueError(f"{name} must have 3 components, not {len(values)}")
    return values  # type: ignore[return-value]


# --- DDS ----------------------------------------------------------------------------------------

@dataclass(frozen=True, eq=False)
class DdsImage:
    """A DDS texture as the engine loads it. images[slice][mip] is a NumPy array per array slice
    (each cube face counts as one: a cube's six faces in the order FACE_NAMES, a cube array cube
    by cube) and mip level, shaped (height, width, channels), or (depth, height, width, channels)
    for a volume, row 0 at the top. Its dtype is the format's: uint8 for 8-bit UNORM and sRGB,
    int8 for SNORM/SINT, uint16 for 16-bit UNORM, float16 and float32 for float formats. Pixels
    whose components share bits (R10G10B10A2, R11G11B10, depth-stencil) are one uint32 each, with
    packed True. Block-compressed formats (compressed True) give each mip's 4x4 blocks as they
    are stored: uint8 of shape (block rows, block columns, block_bytes).

    channels names the components in the order they are stored: "RGBA", "BGRA" for the BGRA
    formats (the array keeps that order), "R", "RG", and so on.
    """

    #: The cube faces in the order they are stored.
    FACE_NAMES = ("+X", "-X", "+Y", "-Y", "+Z", "-Z")

    format: str
    dimension: str
    width: int
    height: int
    depth: int
    mips: int
    array_size: int
    is_cube: bool
    cube_count: int
    compressed: bool
    block_bytes: int
    srgb: bool
    packed: bool
    channels: str
    images: List[List[np.ndarray]] = field(repr=False)

    @classmethod
    def read(cls, path: PathLike) -> "DdsImage":
        """Reads a DDS file. FileNotFoundError when there is none; LumoraError, with the loader's
        message naming the file, when it is damaged or of a format the engine does not read."""
        return cls(**_lumora.read_dds(os.fspath(path)))

    @property
    def face_count(self) -> int:
        """Cube faces (6 per cube), 0 for a texture that is not a cube."""
        return self.array_size if self.is_cube else 0

    def face(self, index: int, mip: int = 0) -> np.ndarray:
        """Cube face index (0 to 5: +X, -X, +Y, -Y, +Z, -Z; in a cube array, 6 * cube + face) at
        mip level mip. ValueError when the texture is no cube; IndexError when out of range."""
        if not self.is_cube:
            raise ValueError(f"a {self.dimension} {self.format} texture that is not a cube has no faces")
        return self.mip(mip, index)

    def mip(self, level: int, slice: int = 0) -> np.ndarray:
        """Mip level of array slice slice (of the volume, for a 3D texture). IndexError when out
        of range."""
        if not 0 <= slice < self.array_size:
            raise IndexError(f"slice {slice} is outside 0..{self.array_size - 1}")
        if not 0 <= level < self.mips:
            raise IndexError(f"mip {level} is outside 0..{self.mips - 1}")
        return self.images[slice][level]


# --- bake.json ----------------------------------------------------------------------------------

@dataclass
class BakeGrid:
    """The ambient bake's probe grid: counts (nx, ny, nz) over the box from world_min, world_size
    wide."""

    counts: Tuple[int, int, int]
    world_min: Vector
    world_size: Vector


@dataclass
class BakeRoomUpdate:
    """A bake of some rooms made after the bake a section describes."""

    date: str
    rooms: List[str]


@dataclass
class BakePhaseRecord:
    """One phase's section of a bake record: when (UTC, "2026-11-24T10:31:02Z") and by which
    version it was baked, the rooms baked (empty: all), each file written with its size in bytes,
    the seconds per step, each input's content hash ("missing" for an input that was not there)
    and the rooms baked again since, oldest first. bounces and grid are the ambient phase's;
    None for the reflections."""

    date: str
    tool_version: str
    bounces: Optional[int]
    grid: Optional[BakeGrid]
    rooms: List[str]
    files: Dict[str, int]
    timings: Dict[str, float]
    inputs: Dict[str, str]
    room_updates: List[BakeRoomUpdate]

    @classmethod
    def _from_dict(cls, data: Optional[dict]) -> Optional["BakePhaseRecord"]:
        if data is None:
            return None
        grid = data["grid"]
        return cls(date=data["date"], tool_version=data["tool_version"], bounces=data["bounces"],
                   grid=None if grid is None else BakeGrid(**grid), rooms=list(data["rooms"]),
                   files=dict(data["files"]), timings=dict(data["timings"]), inputs=dict(data["inputs"]),
                   room_updates=[BakeRoomUpdate(update["date"], list(update["rooms"]))
                                 for update in data["room_updates"]])


@dataclass
class BakeRecord:
    """A level's bake record (data/XML/levels/<level>/bake.json): a section per phase, None for a
    phase not baked since records are kept."""

    ambient: Optional[BakePhaseRecord]
    reflections: Optional[BakePhaseRecord]


def read_bake_record(path: PathLike) -> Optional[BakeRecord]:
    """Reads a bake.json; None when there is none (the level was not baked since records are
    kept). LumoraError, naming the file and what is wrong, when it is damaged."""
    data = _lumora.read_bake_record(os.fspath(path))
    if data is None:
        return None
    return BakeRecord(ambient=BakePhaseRecord._from_dict(data["ambient"]),
                      reflections=BakePhaseRecord._from_dict(data["reflections"]))


def stale_inputs(path: PathLike, data: PathLike = ".") -> List[str]:
    """One line per input of the bake record at path whose content differs now from its bake
    ("lights.xml changed since the ambient bake of 2026-11-24 10:31"), the inputs hashed from the
    data folder (the folder that holds the game's data/). An empty list: the bake is up to date.
    FileNotFoundError when there is no record; LumoraError when it is damaged or data holds no
    data/."""
    return list(_lumora.stale_inputs(os.fspath(data), os.fspath(path)))
