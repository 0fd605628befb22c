"""The Editor: Lumora's engine in a data folder, for tools and pipelines."""

from __future__ import annotations

import json
import os
import subprocess
import sys
from typing import Callable, Iterable, List, Optional, Sequence, Tuple, Union

from . import _lumora
from ._records import (BakeResult, BakeStatus, CheckReport, Decal, PathNode, PointLight, Problem, Room,
                       SpotLight)

LumoraError = _lumora.LumoraError

Record = Union[PointLight, SpotLight, Decal, PathNode]
_KINDS = {0: PointLight, 1: SpotLight, 2: Decal, 3: PathNode}
Camera = Tuple[Tuple[float, float, float], float, float]


def _error(message: str, problems: Sequence[str]) -> LumoraError:
    error = LumoraError(message)
    error.problems = list(problems)
    return error


class Editor:
    """Lumora's engine started headless in a data folder (the folder that holds the game's data/),
    with one level open at a time. One Editor per process; a second one raises LumoraError (a
    RuntimeError). Use it as a context manager, so the engine is shut down when the block ends::

        with lumora.Editor("/games/x") as editor:
            editor.open("sample_small")
            for index, light in enumerate(editor.point_lights):
                light.color = tuple(channel * 2.0 for channel in light.color)
                editor.set(index, light)
            editor.save()
            result = editor.bake(bounces=2, progress=lambda status: print(status.percent))

    The engine reads and writes its files relative to the data folder: while a call runs, the
    process's working directory is that folder (and is given back afterwards). Paths given to
    the Editor are taken relative to the caller's working directory.
    """

    def __init__(self, data: Union[str, os.PathLike] = ".", width: int = 1280, height: int = 720):
        self._session = _lumora.EngineSession(os.fspath(data), int(width), int(height))

    # Lifecycle -----------------------------------------------------------------------------
    def close(self) -> None:
        """Shuts the engine down; unsaved edits are dropped. Closing twice does nothing."""
        self._session.close()

    def __enter__(self) -> "Editor":
        return self

    def __exit__(self, *_exc) -> None:
        self.close()

    @property
    def closed(self) -> bool:
        return not self._session.is_open

    @property
    def data(self) -> str:
        """The folder that holds data/, as an absolute path."""
        return self._session.data

    @property
    def level(self) -> Optional[str]:
        """The open level's name (as its folder spells it), or None."""
        return self._session.level or None

    def open(self, level: str) -> None:
        """Loads a level (a folder under data/XML/levels/). A level that loads with problems raises
        LumoraError, whose ``problems`` lists them, and stays closed for editing."""
        problems = self._session.open(level)
        if problems:
            self._session_level_failed = True
            raise _error(f"level '{level}' has {len(problems)} problem(s):\n" + "\n".join(problems), problems)
        self._session_level_failed = False

    # Objects -------------------------------------------------------------------------------
    def _objects(self, kind: int) -> List[Record]:
        self._check_editable()
        return [_KINDS[kind]._from_values(values) for values in self._session.objects(kind)]

    @property
    def point_lights(self) -> List[PointLight]:
        """The level's point lights, in the order lights.xml lists them (copies: change one, then
        give it back with set())."""
        return self._objects(0)  # type: ignore[return-value]

    @property
    def spot_lights(self) -> List[SpotLight]:
        return self._objects(1)  # type: ignore[return-value]

    @property
    def decals(self) -> List[Decal]:
        return self._objects(2)  # type: ignore[return-value]

    @property
    def path_nodes(self) -> List[PathNode]:
        return self._objects(3)  # type: ignore[return-value]

    @property
    def decal_types(self) -> List[str]:
        """The decal types the catalogue defines."""
        return self._session.decal_types()

    @property
    def rooms(self) -> List[Room]:
        self._check_editable()
        return [Room._from_values(room) for room in self._session.rooms()]

    def add(self, record: Record) -> int:
        """Adds an object (its kind is the record's type) and returns its index in its list."""
        self._check_editable()
        return self._session.add(record.kind, record._values())

    def set(self, index: int, record: Record) -> None:
        """Gives the object at index of the record's kind the record's values."""
        self._check_editable()
        self._session.set(record.kind, int(index), record._values())

    def remove(self, kind: type, index: int) -> None:
        """Removes the object at index of a kind (PointLight, SpotLight, Decal or PathNode). The
        last object of the kind's list takes the removed one's index. Only the last path node can be
        removed (the others hold the graph's edges)."""
        self._check_editable()
        self._session.remove(self._kind_number(kind), int(index))

    def save(self) -> None:
        """Writes the level's lights.xml, nodegraph.xml and decals.xml (each through a temporary
        renamed over the old file). LumoraError, with the problems, when a file was not written."""
        self._check_editable()
        self._session.save()

    # Bakes ---------------------------------------------------------------------------------
    def bake(self, bounces: int = 2, ambient: bool = True, reflections: bool = True,
             rooms: Optional[Iterable[str]] = None,
             progress: Optional[Callable[[BakeStatus], None]] = None,
             poll_seconds: float = 0.25) -> BakeResult:
        """Bakes the open level: the ambient volume (ambient.sh) over ``bounces`` bounces and/or every
        room's reflection cubemap; with ``rooms``, those rooms only. ``progress`` is called with a
        BakeStatus every ``poll_seconds`` while it runs. The library works without Python's lock,
        so another thread may call cancel_bake(). Ctrl-C, or an exception raised by ``progress``,
        cancels the bake (every file stays as it was) and is raised once it has stopped."""
        self._check_editable()
        callback = None
        if progress is not None:
            def callback(status: dict) -> None:
                progress(BakeStatus(**status))
        outcome = self._session.bake(int(bounces), bool(ambient), bool(reflections), list(rooms or []),
                                     callback, float(poll_seconds))
        outcome["problems"] = tuple(outcome["problems"])
        return BakeResult(**outcome)

    def cancel_bake(self) -> None:
        """Stops a running bake within a probe or a cube face; it writes nothing. Any thread."""
        self._session.cancel_bake()

    @property
    def bake_status(self) -> BakeStatus:
        """Where the running bake is, or how the last one ended. Any thread."""
        return BakeStatus(**self._session.bake_status())

    # Frames --------------------------------------------------------------------------------
    def render(self, path: Union[str, os.PathLike, None] = None, *, width: int = 1280, height: int = 720,
               camera: Optional[Camera] = None, frames: int = 20, mode: str = "light",
               markers: bool = False):
        """Renders a frame of the open level and returns it as a NumPy array (height x width x 3,
        uint8 RGB); with ``path``, also writes it as a PNG. ``camera`` is ((x, y, z), yaw, pitch) in
        radians (yaw about the world's up, pitch positive looking down); None keeps the camera where
        it is. ``frames`` frames are drawn first so the eye adaptation settles. ``markers`` draws
        the editor's marker boxes and light volumes; ``mode`` ("light", "node", "decal") chooses
        which."""
        self._check_editable()
        png = os.path.abspath(os.fspath(path)) if path is not None else ""
        return self._session.render(int(width), int(height), camera, int(frames), mode, bool(markers), png)

    @property
    def camera(self) -> Camera:
        """The camera as ((x, y, z), yaw, pitch), as render() takes it."""
        return self._session.camera()

    # Pieces of a bake spread over machines (lumora.distributed) ----------------------------
    def bake_ambient_part(self, bounce: int, previous: Optional[str], first: int, count: int, out: str) -> None:
        """Bounce ``bounce`` (from 1) of the cells first .. first + count - 1 of the level's grid, lit
        by the merged volume ``previous`` of the bounce before (None for bounce 1), into the part
        file ``out``."""
        self._check_editable()
        self._session.bake_ambient_part(int(bounce), os.path.abspath(previous) if previous else "", int(first),
                                        int(count), os.path.abspath(out))

    def merge_ambient_parts(self, parts: Sequence[str], out: str) -> None:
        """One bounce's part files assembled into ``out`` (ambient.sh's format); refuses parts of
        other inputs, grids or bounces, overlaps and gaps."""
        self._check_editable()
        self._session.merge_ambient_parts([os.path.abspath(part) for part in parts], os.path.abspath(out))

    def bake_reflection_part(self, room: str, out: str, ambient: Optional[str] = None) -> None:
        """The reflection cubemap of one room into the DDS file ``out``, lit by the volume ``ambient``
        (None: the level's own ambient.sh); the level's files are untouched."""
        self._check_editable()
        self._session.bake_reflection_part(room, os.path.abspath(ambient) if ambient else "", os.path.abspath(out))

    def record_bake(self, phase: str, rooms: Sequence[str] = (), bounces: int = 0, seconds: float = 0.0) -> str:
        """Writes the level's bake record for outputs put in place by hand ("ambient" or
        "reflections"); returns a note when it replaced a damaged record."""
        self._check_editable()
        return self._session.record_bake(phase, list(rooms), int(bounces), float(seconds))

    @property
    def grid(self) -> dict:
        """The ambient volume's probe grid: counts (nx, ny, nz), world_min and world_size."""
        self._check_editable()
        return self._session.grid()

    # ---------------------------------------------------------------------------------------
    @staticmethod
    def _kind_number(kind) -> int:
        if isinstance(kind, type) and kind in (PointLight, SpotLight, Decal, PathNode):
            return kind.kind
        raise TypeError(f"kind must be PointLight, SpotLight, Decal or PathNode, not {kind!r}")

    def _check_editable(self) -> None:
        if getattr(self, "_session_level_failed", False):
            raise LumoraError(f"level '{self.level}' did not load cleanly; open a level without problems")


# The check in a child process, for a process whose one engine an Editor holds: it prints the
# report as JSON, or {"error": message} for what would have been a LumoraError.
_CHILD_CHECK = """
import json, sys
from lumora import _lumora
try:
    report = _lumora.check(sys.argv[1], sys.argv[2])
except _lumora.LumoraError as error:
    report = {"error": str(error)}
sys.stdout.write(json.dumps(report))
"""


def _check_in_child(data: str, level: str) -> dict:
    package_parent = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
    environment = dict(os.environ)
    environment["PYTHONPATH"] = os.pathsep.join(
        [package_parent] + ([environment["PYTHONPATH"]] if environment.get("PYTHONPATH") else []))
    # A KeyboardInterrupt here kills the child (subprocess.run does) and goes on up.
    done = subprocess.run([sys.executable, "-c", _CHILD_CHECK, data, level], env=environment,
                          stdout=subprocess.PIPE, stderr=subprocess.PIPE, check=False)
    try:
        report = json.loads(done.stdout.decode("utf-8"))
    except ValueError:
        raise LumoraError(f"the check of '{level}' in a process of its own ended with status {done.returncode}: "
                          + done.stderr.decode("utf-8", "replace").strip()[-2000:]) from None
    if "error" in report:
        raise LumoraError(report["error"])
    return report


def check(level: str, data: Union[str, os.PathLike] = ".") -> CheckReport:
    """Checks a level as `lumora check` does: it is loaded in an engine of its own with every report
    listed, and what loading passes over in silence (unknown entity types, rooms without extent,
    stale or damaged bakes) is looked for. While an Editor holds this process's engine, the check
    runs in a child process (a second or so longer): the Editor's level and edits are not touched."""
    if _lumora.engine_running():
        report = _check_in_child(os.path.abspath(os.fspath(data)), level)
    else:
        report = _lumora.check(os.fspath(data), level)
    return CheckReport(level=report["level"],
                       problems=tuple(Problem(**problem) for problem in report["problems"]),
                       notes=tuple(report["notes"]))
