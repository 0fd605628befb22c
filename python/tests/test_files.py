"""The baked files' readers (lumora._files): ambient.sh, DDS and bake.json, on files written here
byte by byte with known contents, and on what the real tools write."""

import json
import os
import re
import struct
import subprocess
from pathlib import Path

import numpy as np
import pytest

from lumora import _files as files
from lumora._lumora import LumoraError

ROOT = Path(__file__).resolve().parents[2]


# --- ambient.sh -----------------------------------------------------------------------------------

def write_ambient(path, world_min, world_size, texels):
    """texels: uint8 (7, nz, ny, nx, 4), written block by block, x fastest."""
    texels = np.asarray(texels, dtype=np.uint8)
    nz, ny, nx = texels.shape[1:4]
    path.write_bytes(struct.pack("<6f3i", *world_size, *world_min, nx, ny, nz) + texels.tobytes())
    return path


def constant_terms(values):
    """A volume whose cA*.w bytes are values (nz, ny, nx) and whose other bytes decode to 1/255
    or less: with a zero normal only the constant terms count."""
    values = np.asarray(values, dtype=np.uint8)
    texels = np.full((7,) + values.shape + (4,), 127, dtype=np.uint8)
    texels[0:3, ..., 3] = values
    return texels


def decode(byte):
    return byte / 255.0 * 2.0 - 1.0


def test_ambient_header_and_cell_layout(tmp_path):
    # Each texel names its block and cell; the shape (7, nz, ny, nx, 4) must put every one back.
    nx, ny, nz = 3, 2, 4
    raw = struct.pack("<6f3i", 6.0, 3.0, 8.0, -3.0, 0.5, -4.0, nx, ny, nz)
    raw += b"".join(bytes((b, i, j, k))
                    for b in range(7) for k in range(nz) for j in range(ny) for i in range(nx))
    (tmp_path / "ambient.sh").write_bytes(raw)

    volume = files.AmbientVolume.read(tmp_path / "ambient.sh")
    assert volume.counts == (3, 2, 4) and volume.cell_count == 24
    assert volume.world_min == (-3.0, 0.5, -4.0) and volume.world_size == (6.0, 3.0, 8.0)
    assert volume.blocks.dtype == np.uint8 and volume.blocks.shape == (7, nz, ny, nx, 4)
    assert all(tuple(volume.blocks[b, k, j, i]) == (b, i, j, k) for b, k, j, i in np.ndindex(7, nz, ny, nx))
    assert volume.cell_center(2, 0, 3) == (2.0, 1.25, 3.0)
    coefficients = volume.coefficients()
    assert coefficients.dtype == np.float32 and coefficients.shape == (7, 4, 2, 3, 4)
    assert coefficients[6, 3, 1, 2, 1] == pytest.approx(decode(2))


def test_irradiance_at_cell_centres_is_the_sh_formula(tmp_path):
    rng = np.random.default_rng(7)
    texels = rng.integers(0, 256, size=(7, 2, 3, 2, 4), dtype=np.uint8)
    path = write_ambient(tmp_path / "a.sh", (1.0, -2.0, 0.0), (2.0, 3.0, 4.0), texels)
    volume = files.AmbientVolume.read(path)
    normals = np.array([[0.0, 0.0, 1.0], [0.6, -0.8, 0.0], [0.48, 0.6, -0.64]])
    for k, j, i in np.ndindex(2, 3, 2):
        c = decode(texels[:, k, j, i].astype(np.float64))
        for x, y, z in normals:
            expected = [max(0.0, c[ch] @ (x, y, z, 1.0) + c[3 + ch] @ (x * y, y * z, z * z, z * x)
                            + c[6][ch] * (x * x - y * y)) for ch in range(3)]
            got = volume.irradiance(volume.cell_center(i, j, k), (x, y, z))
            assert got.shape == (3,) and got.dtype == np.float32
            np.testing.assert_allclose(got, expected, atol=1e-5)


def test_irradiance_filters_trilinearly_clamps_at_edges(tmp_path):
    values = np.array([[[130, 200], [140, 220]], [[180, 240], [160, 250]]])  # (z, y, x)
    path = write_ambient(tmp_path / "a.sh", (0.0, 0.0, 0.0), (2.0, 2.0, 2.0), constant_terms(values))
    volume = files.AmbientVolume.read(path)
    red = lambda points: volume.irradiance(points, (0.0, 0.0, 0.0))[..., 0]  # noqa: E731
    level = decode(values.astype(np.float64))
    # Halfway between two centres along each axis, then the very middle of all eight.
    np.testing.assert_allclose(red([[1.0, 0.5, 0.5], [0.5, 1.0, 0.5], [0.5, 0.5, 1.0]]),
                               [(level[0, 0, 0] + level[0, 0, 1]) / 2, (level[0, 0, 0] + level[0, 1, 0]) / 2,
                                (level[0, 0, 0] + level[1, 0, 0]) / 2], atol=1e-6)
    assert red([1.0, 1.0, 1.0]) == pytest.approx(level.mean(), abs=1e-6)
    # A quarter of the way from cell 0 to cell 1 along x.
    assert red([0.75, 0.5, 0.5]) == pytest.approx(0.75 * level[0, 0, 0] + 0.25 * level[0, 0, 1], abs=1e-6)
    # Past the outer centres, and far outside the box, the edge cells hold.
    np.testing.assert_allclose(red([[0.1, 0.2, 0.0], [-50.0, -1e30, -3.0], [9.0, 9.0, 9.0]]),
                               [level[0, 0, 0], level[0, 0, 0], level[1, 1, 1]], atol=1e-6)
    # Broadcasting: four points, one normal.
    assert volume.irradiance(np.zeros((4, 3)), (0.0, 1.0, 0.0)).shape == (4, 3)


def test_irradiance_zero_when_negative_or_no_volume(tmp_path):
    dark = constant_terms(np.zeros((1, 1, 2)))  # constant terms decode to -1
    volume = files.AmbientVolume.read(write_ambient(tmp_path / "a.sh", (0, 0, 0), (1, 1, 1), dark))
    assert not volume.irradiance([[0.2, 0.5, 0.5], [0.9, 0.5, 0.5]], (0.0, 0.0, 0.0)).any()
    bright = constant_terms(np.full((1, 1, 2), 255))
    for size in [(0.0, 1.0, 1.0), (1.0, -1.0, 1.0)]:
        flat = files.AmbientVolume.read(write_ambient(tmp_path / "b.sh", (0, 0, 0), size, bright))
        assert not flat.irradiance([[0.5, 0.5, 0.5]], (0.0, 1.0, 0.0)).any()


def test_damaged_or_missing_ambient(tmp_path):
    path = write_ambient(tmp_path / "ambient.sh", (0, 0, 0), (1, 1, 1), np.zeros((7, 2, 2, 2, 4)))
    good = path.read_bytes()
    for damaged, words in [(good[:-1], "holds 259 bytes; its counts need 260"), (good[:20], "36-byte header"),
                           (struct.pack("<6f3i", 1, 1, 1, 0, 0, 0, 2, 0, 2), "probe counts 2 x 0 x 2")]:
        path.write_bytes(damaged)
        with pytest.raises(LumoraError, match=re.escape(str(path))) as error:
            files.AmbientVolume.read(path)
        assert words in str(error.value)
    with pytest.raises(FileNotFoundError):
        files.AmbientVolume.read(tmp_path / "none.sh")


# --- DDS ------------------------------------------------------------------------------------------

def fourcc(text):
    return struct.unpack("<I", text.encode())[0]


def dds_header(width, height, mips, pixel_format, caps2=0, depth=0):
    """The 128 bytes of "DDS " and the legacy header; pixel_format: (flags, fourcc, bits, 4 masks)."""
    flags = 0x1 | 0x2 | 0x4 | 0x1000 | 0x20000 | (0x800000 if depth else 0)
    return struct.pack("<4s7I44x8I5I", b"DDS ", 124, flags, height, width, 0, depth, mips, 32, *pixel_format,
                       0x1000, caps2, 0, 0, 0)


RGBA8 = (0x41, 0, 32, 0xFF, 0xFF00, 0xFF0000, 0xFF000000)
BGRA8 = (0x41, 0, 32, 0xFF0000, 0xFF00, 0xFF, 0xFF000000)


def dx10_header(width, height, dxgi_format, dimension=3, array_size=1, cube=False, depth=0, mips=1):
    return dds_header(width, height, mips, (0x4, fourcc("DX10"), 0, 0, 0, 0, 0), depth=depth) + struct.pack(
        "<5I", dxgi_format, dimension, 0x4 if cube else 0, array_size, 0)


def test_dds_rgba8_with_mips_and_bgra(tmp_path):
    rng = np.random.default_rng(3)
    levels = [rng.integers(0, 256, size=shape, dtype=np.uint8) for shape in [(2, 4, 4), (1, 2, 4), (1, 1, 4)]]
    path = tmp_path / "rgba.dds"
    path.write_bytes(dds_header(4, 2, 3, RGBA8) + b"".join(level.tobytes() for level in levels))
    image = files.DdsImage.read(path)
    assert (image.format, image.width, image.height) == ("R8G8B8A8_UNORM", 4, 2)
    assert (image.mips, image.array_size) == (3, 1)
    assert not image.is_cube and not image.compressed and image.channels == "RGBA"
    for level, expected in enumerate(levels):
        assert image.mip(level).dtype == np.uint8 and np.array_equal(image.mip(level), expected)

    # BGRA keeps the stored byte order and says so.
    path.write_bytes(dds_header(4, 2, 1, BGRA8) + levels[0].tobytes())
    image = files.DdsImage.read(path)
    assert (image.format, image.channels) == ("B8G8R8A8_UNORM", "BGRA")
    assert np.array_equal(image.mip(0), levels[0])


def test_dds_cube_faces_in_order(tmp_path):
    faces = [np.full((2, 2, 4), 10 * face, dtype=np.uint8) for face in range(6)]
    for face in faces:
        face[1, 0] = (1, 2, 3, 4)  # row 1 is the bottom row
    path = tmp_path / "cube.dds"
    all_faces = 0x200 | 0xFC00
    path.write_bytes(dds_header(2, 2, 1, RGBA8, caps2=all_faces) + b"".join(face.tobytes() for face in faces))
    cube = files.DdsImage.read(path)
    assert cube.is_cube and (cube.cube_count, cube.array_size, len(cube.images)) == (1, 6, 6)
    for index, face in enumerate(faces):
        assert np.array_equal(cube.face(index), face)
    with pytest.raises(IndexError):
        cube.face(6)
    # A cube that lacks faces is refused.
    path.write_bytes(dds_header(2, 2, 1, RGBA8, caps2=0x200 | 0x0C00) + bytes(96))
    with pytest.raises(LumoraError, match="missing faces"):
        files.DdsImage.read(path)


def test_dds_dx10_float_volume_and_compressed(tmp_path):
    half = np.array([[[0.5, -2.0, 1e-3, 65504.0], [1.0, 0.0, -0.25, 3.0]]], dtype=np.float16)
    (tmp_path / "half.dds").write_bytes(dx10_header(2, 1, 10) + half.tobytes())
    image = files.DdsImage.read(tmp_path / "half.dds")
    assert (image.format, image.dimension) == ("R16G16B16A16_FLOAT", "2D")
    assert image.mip(0).dtype == np.float16 and np.array_equal(image.mip(0), half)

    volume = np.arange(12, dtype=np.float32).reshape(3, 2, 2, 1)  # depth, height, width, R
    (tmp_path / "volume.dds").write_bytes(dx10_header(2, 2, 41, dimension=4, depth=3) + volume.tobytes())
    image = files.DdsImage.read(tmp_path / "volume.dds")
    assert (image.dimension, image.depth) == ("3D", 3)
    assert image.mip(0).dtype == np.float32 and np.array_equal(image.mip(0), volume)

    # 8 x 4 pixels of DXT1: one row of two 8-byte blocks, given as stored.
    blocks = bytes(range(16))
    (tmp_path / "bc1.dds").write_bytes(dds_header(8, 4, 1, (0x4, fourcc("DXT1"), 0, 0, 0, 0, 0)) + blocks)
    image = files.DdsImage.read(tmp_path / "bc1.dds")
    assert image.compressed and image.format == "BC1_UNORM" and image.block_bytes == 8
    assert image.mip(0).shape == (1, 2, 8) and image.mip(0).tobytes() == blocks
    # Two-channel normal maps as other tools write them (ATI2, 16-byte blocks), and BC7 (DX10 header).
    blocks = bytes(range(32))
    (tmp_path / "bc5.dds").write_bytes(dds_header(8, 4, 1, (0x4, fourcc("ATI2"), 0, 0, 0, 0, 0)) + blocks)
    (tmp_path / "bc7.dds").write_bytes(dx10_header(8, 4, 98) + blocks)
    for name, format in [("bc5.dds", "BC5_UNORM"), ("bc7.dds", "BC7_UNORM")]:
        image = files.DdsImage.read(tmp_path / name)
        assert image.compressed and image.format == format and image.block_bytes == 16
        assert image.mip(0).shape == (1, 2, 16) and image.mip(0).tobytes() == blocks


def test_damaged_or_missing_dds(tmp_path):
    path = tmp_path / "broken.dds"
    for raw, words in [(dds_header(4, 4, 1, RGBA8) + bytes(63), "truncated"),
                       (b"PNG " + bytes(200), "bad magic"),
                       (dx10_header(2, 2, 999) + bytes(64), "unsupported DXGI format 999")]:
        path.write_bytes(raw)
        with pytest.raises(LumoraError, match=re.escape(str(path))) as error:
            files.DdsImage.read(path)
        assert words in str(error.value)
    with pytest.raises(FileNotFoundError):
        files.DdsImage.read(tmp_path / "none.dds")


def test_repository_cubemap():
    cube = files.DdsImage.read(ROOT / "data/Cubemaps/cubemap.dds")
    assert cube.is_cube and len(cube.images) == 6 and cube.mips > 1
    assert [cube.face(5, level).shape[:2] for level in range(cube.mips)] == [
        (max(1, cube.width >> level),) * 2 for level in range(cube.mips)]


# --- bake.json ------------------------------------------------------------------------------------

HASH = "0123456789abcdef0123456789abcdef"


def section(**extra):
    base = {"date": "2026-11-24T10:31:02Z", "tool_version": "0.1.0", "rooms": [], "files": {}, "timings": {},
            "inputs": {}, "room_bakes": []}
    return {**base, **extra}


def test_bake_record_round_trip(tmp_path):
    record = {"format": 1,
              "ambient": section(bounces=2, grid={"counts": [3, 2, 4], "world_min": [-3.0, 0.1, -4.0],
                                                  "world_size": [6.0, 3.0, 8.0]},
                                 files={"data/XML/levels/x/ambient.sh": 708}, timings={"total": 1.25},
                                 inputs={"data/XML/levels/x/lights.xml": HASH}),
              "reflections": section(rooms=["hall"],
                                     room_bakes=[{"date": "2026-11-25T08:00:00Z", "rooms": ["lab"]}],
                                     inputs={"data/textures/a.dds": "missing"})}
    (tmp_path / "bake.json").write_text(json.dumps(record))
    read = files.read_bake_record(tmp_path / "bake.json")
    ambient, reflections = read.ambient, read.reflections
    assert (ambient.date, ambient.tool_version, ambient.bounces) == ("2026-11-24T10:31:02Z", "0.1.0", 2)
    assert ambient.grid == files.BakeGrid((3, 2, 4), (-3.0, 0.1, -4.0), (6.0, 3.0, 8.0))
    assert ambient.files == {"data/XML/levels/x/ambient.sh": 708} and ambient.timings == {"total": 1.25}
    assert ambient.inputs == {"data/XML/levels/x/lights.xml": HASH}
    assert reflections.bounces is None and reflections.grid is None and reflections.rooms == ["hall"]
    assert reflections.room_updates == [files.BakeRoomUpdate("2026-11-25T08:00:00Z", ["lab"])]

    del record["ambient"]
    (tmp_path / "bake.json").write_text(json.dumps(record))
    assert files.read_bake_record(tmp_path / "bake.json").ambient is None
    assert files.read_bake_record(tmp_path / "none.json") is None


def test_damaged_bake_record(tmp_path):
    path = tmp_path / "bake.json"
    for text, words in [("{", "not JSON"), ('{"format": 2}', "format 2"),
                        (json.dumps({"format": 1, "reflections": section(date="yesterday")}),
                         "/reflections/date")]:
        path.write_text(text)
        with pytest.raises(LumoraError, match=re.escape(str(path))) as error:
            files.read_bake_record(path)
        assert words in str(error.value)


def test_stale_inputs_compares_with_the_data_folder(tmp_path):
    level = tmp_path / "data/XML/levels/x"
    level.mkdir(parents=True)
    (level / "lights.xml").write_text("<lights/>")
    (level / "rooms.xml").write_text("<rooms/>")
    inputs = {"data/XML/levels/x/lights.xml": HASH, "data/XML/levels/x/rooms.xml": "missing",
              "data/textures/gone.dds": HASH}
    record = tmp_path / "elsewhere/bake.json"
    record.parent.mkdir()
    record.write_text(json.dumps({"format": 1, "reflections": section(inputs=inputs)}))
    assert sorted(files.stale_inputs(record, data=tmp_path)) == [
        "data/textures/gone.dds is gone since the reflection bake of 2026-11-24 10:31",
        "lights.xml changed since the reflection bake of 2026-11-24 10:31",
        "rooms.xml appeared since the reflection bake of 2026-11-24 10:31"]
    with pytest.raises(FileNotFoundError):
        files.stale_inputs(tmp_path / "none.json", data=tmp_path)
    with pytest.raises(LumoraError, match="no data/ folder"):
        files.stale_inputs(record, data=level)


# --- what the tools write -------------------------------------------------------------------------

def test_baked_sample_level(data_folder):
    # data_folder (conftest.py): a copy of data/ with sample_small unbaked.
    cli = Path(os.environ.get("LUMORA_CLI", ROOT / "build/tools/lumora/lumora"))
    if not cli.exists():
        pytest.skip(f"no lumora command line at {cli}")
    subprocess.run([str(cli), "bake", "sample_small", "--bounces", "1", "--ambient-only"], cwd=data_folder,
                   check=True, capture_output=True, timeout=300)
    level = Path(data_folder, "data/XML/levels/sample_small")
    volume = files.AmbientVolume.read(level / "ambient.sh")
    record = files.read_bake_record(level / "bake.json")
    grid = record.ambient.grid
    assert volume.counts == grid.counts
    assert (volume.world_min, volume.world_size) == (grid.world_min, grid.world_size)

    assert files.stale_inputs(level / "bake.json", data=data_folder) == []
    with open(level / "lights.xml", "a") as lights:
        lights.write("\n")
    assert [line.split(" of ")[0] for line in files.stale_inputs(level / "bake.json", data=data_folder)] == [
        "lights.xml changed since the ambient bake"]
