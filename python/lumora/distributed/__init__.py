"""Bakes of a level spread over a Dask cluster.

    from dask.distributed import Client
    import lumora.distributed
    with Client("tcp://scheduler:8786") as client:
        result = lumora.distributed.bake("sample_large", client, bounces=2, data="/games/x")

Each bounce of the ambient bake becomes one task per range of probes; the driver (this process)
merges a bounce's parts before the next bounce starts. Each room's reflection cubemap is one task,
lit by the merged volume. The workers send back what they baked, and the driver writes ambient.sh,
the cubemaps and the bake record at the end, each through a temporary renamed into place: a bake
that fails or is cancelled (Ctrl-C) leaves every output as it was. A worker that dies has its task
run again elsewhere; the result is the same, byte for byte, as a bake on one machine.

The level's inputs reach the workers in a LevelPackage (shipped once per worker, keyed by their
hash), or, with ``shared_data``, from a folder every worker reads at the same path.
"""

from __future__ import annotations

import os
import tempfile
import time
import uuid
from dataclasses import dataclass
from typing import Callable, Dict, Iterable, List, Optional, Tuple, Union

from .._editor import Editor, LumoraError, check
from . import _worker
from ._package import LevelPackage, SharedFolder

__all__ = ["bake", "DistributedBakeResult", "LevelPackage", "SharedFolder"]

Progress = Callable[[str, int, int], None]


@dataclass(frozen=True)
class DistributedBakeResult:
    """What a distributed bake wrote (paths relative to the data folder) and what it took."""

    level: str
    ambient: Optional[str]
    cubemaps: Tuple[str, ...]
    bounces: int
    # Cells of the probe grid baked per bounce.
    cells: int
    parts: int
    workers: int
    seconds: float
    timings: Dict[str, float]


def _ranges(cells: int, parts: int) -> List[Tuple[int, int]]:
    """cells split into at most ``parts`` ranges as even as can be: (first, count)."""
    parts = max(1, min(parts, cells))
    base, extra = divmod(cells, parts)
    ranges, first = [], 0
    for index in range(parts):
        count = base + (1 if index < extra else 0)
        ranges.append((first, count))
        first += count
    return ranges


def _write_staged(target: str, content: bytes) -> str:
    """content written whole to a new temporary beside target; its path."""
    folder = os.path.dirname(target) or "."
    os.makedirs(folder, exist_ok=True)
    handle, temporary = tempfile.mkstemp(prefix="." + os.path.basename(target) + ".", suffix=".tmp", dir=folder)
    try:
        # The file keeps its permissions; a new one gets what the process's umask allows.
        try:
            mode = os.stat(target).st_mode & 0o777
        except FileNotFoundError:
            umask = os.umask(0)
            os.umask(umask)
            mode = 0o666 & ~umask
        os.fchmod(handle, mode)
        with os.fdopen(handle, "wb") as file:
            file.write(content)
            file.flush()
            os.fsync(file.fileno())
    except BaseException:
        os.unlink(temporary)
        raise
    return temporary


def _gather(client, futures, phase: str, progress: Optional[Progress]) -> list:
    """The futures' results in their order, reporting each as it comes; the first failure raises."""
    from distributed import as_completed

    results: Dict[object, object] = {}
    for future in as_completed(futures):
        results[future.key] = future.result()
        if progress is not None:
            progress(phase, len(results), len(futures))
    return [results[future.key] for future in futures]


def bake(level: str, client, bounces: int = 2, parts: Optional[int] = None, *,
         data: Union[str, os.PathLike] = ".", ambient: bool = True, reflections: bool = True,
         shared_data: Optional[Union[str, os.PathLike]] = None, force: bool = False,
         rooms: Optional[Iterable[str]] = None, retries: int = 2,
         progress: Optional[Progress] = None) -> DistributedBakeResult:
    """Bakes ``level`` of the data folder ``data`` on the Dask cluster of ``client``.

    ``bounces``: the ambient bake's bounces (0: no ambient bake). ``parts``: the probe ranges each
    bounce is split into (default: three per worker). ``shared_data``: the data folder as every
    worker sees it, when they share one; otherwise the level's inputs are shipped. ``force``: bake a
    level in which check() finds problems. ``rooms``: re-bake only the reflection cubemaps of these
    rooms (their IDs), every other cubemap left as it is; the ambient volume is then not baked
    (``ambient=False`` is required: the volume is one whole here, and ``Editor.bake(rooms=...)``
    re-bakes a room's probes on one machine). ``retries``: how often a task that raised is tried again
    (a task whose worker died is run again anyway). ``progress(phase, done, total)`` is called as
    tasks end, phase being "ambient bounce N" or "reflections".

    Needs no Editor open in this process (the driver opens its own). Raises LumoraError when the
    level has problems or a task fails; KeyboardInterrupt cancels the tasks. In every such case the
    outputs are left as they were.
    """
    start = time.monotonic()
    data = os.path.abspath(os.fspath(data))
    if bounces < 0:
        raise ValueError("bounces must not be negative")
    if not ambient and not reflections:
        raise ValueError("nothing to bake: ambient and reflections are both off")
    selected = None if rooms is None else list(dict.fromkeys(str(room) for room in rooms))
    if selected is not None:
        if not selected:
            raise ValueError("rooms is empty: name at least one room, or leave rooms out for all of them")
        if ambient or not reflections:
            raise ValueError("a distributed bake of some rooms re-bakes their reflections only: pass "
                             "ambient=False (Editor.bake(rooms=...) re-bakes their ambient probes)")
    report = check(level, data)
    level_problems = [problem.message for problem in report.problems if not problem.baked]
    if level_problems and not force:
        error = LumoraError(f"level '{level}' has {len(level_problems)} problem(s); not baked (force=True bakes "
                            "anyway):\n" + "\n".join(level_problems))
        error.problems = level_problems
        raise error
    level = report.level
    workers = len(client.scheduler_info().get("workers", {}))
    if workers == 0:
        raise LumoraError("the Dask cluster has no workers")
    package = SharedFolder(os.fspath(shared_data)) if shared_data is not None else LevelPackage.collect(data, level)
    token = uuid.uuid4().hex[:8]
    timings: Dict[str, float] = {}
    futures: list = []
    staged: List[Tuple[str, str]] = []
    with Editor(data, 320, 180) as editor, tempfile.TemporaryDirectory(prefix="lumora-driver-") as scratch:
        editor.open(level)
        if selected is not None:
            # Every ID is checked before anything is sent: a misspelt room bakes nothing.
            known = {room.id: room for room in editor.rooms}
            unknown = [room for room in selected if room not in known]
            if unknown:
                raise LumoraError(f"level '{level}' has no room with the ID " +
                                  ", ".join(f"'{room}'" for room in unknown) + "; nothing baked")
            unnamed = [room for room in selected if not known[room].cubemap]
            if unnamed:
                raise LumoraError("room ID " + ", ".join(f"'{room}'" for room in unnamed) +
                                  " cannot name a cubemap file; nothing baked")
        try:
            # The inputs every task reads are copied to every worker before the first task runs: a
            # worker that dies then takes no copy the others need with it. (With one copy, a worker
            # killed while another was still fetching the package from it lost the package, and the
            # scheduler cancelled every task waiting for it: seen once in a test run.)
            package_future = client.scatter(package, hash=False, broadcast=True)
            cells = 1
            for count in editor.grid["counts"]:
                cells *= count
            ranges = _ranges(cells, parts if parts is not None else 3 * workers)
            volume: Optional[bytes] = None
            do_ambient = ambient and bounces > 0
            if do_ambient:
                previous_future = None
                for bounce in range(1, bounces + 1):
                    bounce_start = time.monotonic()
                    futures = [client.submit(_worker.bake_ambient_part, package_future, level, bounce,
                                             previous_future, first, count, retries=retries, pure=False,
                                             key=f"lumora-ambient-{token}-b{bounce}-{first}")
                               for first, count in ranges]
                    results = _gather(client, futures, f"ambient bounce {bounce}", progress)
                    paths = []
                    for (first, _count), content in zip(ranges, results):
                        paths.append(os.path.join(scratch, f"bounce{bounce}-{first}.part"))
                        with open(paths[-1], "wb") as file:
                            file.write(content)
                    merged = os.path.join(scratch, f"bounce{bounce}.sh")
                    editor.merge_ambient_parts(paths, merged)
                    with open(merged, "rb") as file:
                        volume = file.read()
                    previous_future = client.scatter(volume, hash=False, broadcast=True)
                    timings[f"ambient bounce {bounce}"] = time.monotonic() - bounce_start
            cubemaps: Dict[str, bytes] = {}
            if selected is not None:
                baked_rooms = [known[room] for room in selected]
            else:
                baked_rooms = [room for room in editor.rooms if room.cubemap] if reflections else []
            if baked_rooms:
                reflections_start = time.monotonic()
                volume_future = client.scatter(volume, hash=False, broadcast=True) if volume is not None else None
                futures = [client.submit(_worker.bake_reflection, package_future, level, room.id, volume_future,
                                         retries=retries, pure=False, key=f"lumora-reflection-{token}-{index}")
                           for index, room in enumerate(baked_rooms)]
                results = _gather(client, futures, "reflections", progress)
                cubemaps = {room.cubemap: content for room, content in zip(baked_rooms, results)}
                timings["reflections"] = time.monotonic() - reflections_start
            futures = []
            # Every output is staged whole before the first replaces its file.
            ambient_file = os.path.join("data", "XML", "levels", level, "ambient.sh") if do_ambient else None
            if ambient_file is not None:
                staged.append((_write_staged(os.path.join(data, ambient_file), volume), ambient_file))
            for file, content in cubemaps.items():
                staged.append((_write_staged(os.path.join(data, file), content), file))
            for temporary, file in staged:
                os.replace(temporary, os.path.join(data, file))
            staged = []
            seconds = time.monotonic() - start
            if ambient_file is not None:
                editor.record_bake("ambient", [], bounces, sum(value for key, value in timings.items()
                                                               if key.startswith("ambient")))
            if cubemaps:
                editor.record_bake("reflections", selected or [], 0, timings.get("reflections", 0.0))
        except BaseException:
            # Cancelled, or a task failed: the cluster stops working for this bake, and no output
            # is touched.
            if futures:
                client.cancel(futures)
                try:
                    client.run(_worker.cancel_running)
                except Exception:  # noqa: BLE001 - a worker that cannot be reached has nothing to stop
                    pass
            for temporary, _file in staged:
                if os.path.exists(temporary):
                    os.unlink(temporary)
            raise
    return DistributedBakeResult(level=level, ambient=ambient_file, cubemaps=tuple(sorted(cubemaps)),
                                 bounces=bounces if do_ambient else 0, cells=cells if do_ambient else 0,
                                 parts=len(ranges), workers=workers, seconds=seconds, timings=timings)
