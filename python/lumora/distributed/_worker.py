"""The tasks a distributed bake runs on its workers.

Each worker process keeps one Editor with the level loaded between tasks (the engine is one per
process); a task for another level or other inputs replaces it. Tasks return the bytes of what
they baked: the driver writes every output.
"""

from __future__ import annotations

import os
import shutil
import tempfile
import threading
from typing import Optional

from .._editor import Editor

# The view is never shown: the bakes render into targets of their own.
_WIDTH, _HEIGHT = 320, 180

_lock = threading.Lock()
_state = {"key": None, "editor": None, "fresh": False}


def _base_folder() -> str:
    try:
        from distributed import get_worker

        return os.path.join(get_worker().local_directory, "lumora")
    except (ImportError, ValueError):
        return os.path.join(tempfile.gettempdir(), f"lumora-worker-{os.getpid()}")


def _editor_for(package, level: str) -> Editor:
    key = (package.key, level)
    editor: Optional[Editor] = _state["editor"]
    if editor is not None and _state["key"] == key and not editor.closed:
        return editor
    if editor is not None:
        editor.close()
        _state["editor"] = None
    folder = package.materialise(_base_folder())
    # A bake draws thousands of small targets, each waiting for the last: Mesa's software
    # rasterizer is faster without its worker threads then. Only when nobody chose otherwise.
    os.environ.setdefault("LP_NUM_THREADS", "0")
    editor = Editor(folder, _WIDTH, _HEIGHT)
    try:
        editor.open(level)
    except BaseException:
        editor.close()
        raise
    _state["editor"], _state["key"], _state["fresh"] = editor, key, True
    return editor


def _run(editor: Editor, given: Optional[bytes], bake) -> bytes:
    """bake(input path or None, output path) in a scratch folder of the worker's own: ``given`` is
    written to the input first; the output's bytes are returned."""
    scratch = tempfile.mkdtemp(prefix=".lumora-task-", dir=editor.data)
    try:
        given_path = None
        if given is not None:
            given_path = os.path.join(scratch, "input")
            with open(given_path, "wb") as file:
                file.write(given)
        out = os.path.join(scratch, "output")
        bake(given_path, out)
        with open(out, "rb") as file:
            return file.read()
    finally:
        shutil.rmtree(scratch, ignore_errors=True)


def bake_ambient_part(package, level: str, bounce: int, previous: Optional[bytes], first: int,
                      count: int) -> bytes:
    """Bounce ``bounce`` of cells first .. first + count - 1, lit by the merged volume ``previous``
    of the bounce before (None for bounce 1): the part file's bytes."""
    with _lock:
        if not _state["fresh"] and _state["editor"] is not None:
            # A part is tied to the hash of the inputs the engine has loaded; a reflection bake loads
            # textures of its own, which the driver's freshly started engine does not list. The
            # engine is started again.
            _state["editor"].close()
            _state["editor"] = None
        editor = _editor_for(package, level)
        return _run(editor, previous,
                    lambda previous_path, out: editor.bake_ambient_part(bounce, previous_path, first, count, out))


def bake_reflection(package, level: str, room: str, ambient: Optional[bytes]) -> bytes:
    """The DDS bytes of one room's reflection cubemap, lit by the volume ``ambient`` (None: the
    level's own ambient.sh)."""
    with _lock:
        editor = _editor_for(package, level)
        _state["fresh"] = False
        return _run(editor, ambient,
                    lambda ambient_path, out: editor.bake_reflection_part(room, out, ambient=ambient_path))


def cancel_running() -> bool:
    """Stops the bake this worker runs now, if any (called on every worker when the driver is
    cancelled). Needs no lock: the engine's cancel only sets a flag."""
    editor = _state["editor"]
    if editor is not None and not editor.closed:
        editor.cancel_bake()
        return True
    return False


def worker_pid() -> int:
    return os.getpid()
