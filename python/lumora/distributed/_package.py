"""How a level's inputs reach the workers of a distributed bake.

A LevelPackage holds every file under data/ that the engine reads to start and to load one level
(the shaders, catalogues, models, textures, the level's own folder and the cubemaps its ambient
pass reflects; other levels' folders and cubemaps are left out), as one tar archive keyed by a hash
of the files' names and contents. Dask moves it to each worker that runs a task, once, and the
worker unpacks it once per key. A SharedFolder names a data folder every worker can read at the
same path (a network share): nothing is shipped.

Either way a worker works in a folder of its own (the engine writes its log beside data/), and
nothing a worker does writes into the data it was given.
"""

from __future__ import annotations

import hashlib
import io
import os
import shutil
import tarfile
import tempfile
from dataclasses import dataclass
from typing import List, Tuple

# Folders under data/ whose sub-folders belong to one level each.
_PER_LEVEL_FOLDERS = (("xml", "levels"), ("cubemaps",))
# Debug captures of probes: never an input.
_SKIPPED_FOLDERS = {"sh debug"}


def _level_files(data_root: str, level: str) -> List[Tuple[str, str]]:
    """(path relative to data_root, absolute path) of every file the level's bake reads, sorted."""
    files = []
    data = os.path.join(data_root, "data")
    for folder, subfolders, names in os.walk(data, followlinks=True):
        relative = os.path.relpath(folder, data_root)
        parts = tuple(part.lower() for part in relative.split(os.sep))[1:]
        kept = []
        for sub in sorted(subfolders):
            if sub.lower() in _SKIPPED_FOLDERS:
                continue
            if parts in _PER_LEVEL_FOLDERS and sub.lower() != level.lower():
                continue
            kept.append(sub)
        subfolders[:] = kept
        for name in names:
            if name.startswith(".") and name.endswith(".tmp"):
                continue  # a writer's temporary
            path = os.path.join(folder, name)
            if os.path.isfile(path):
                files.append((os.path.join(relative, name), path))
    files.sort()
    return files


@dataclass(frozen=True)
class LevelPackage:
    """The level's inputs shipped to the workers: a tar archive and the hash it is known by."""

    key: str
    level: str
    archive: bytes
    file_count: int

    @classmethod
    def collect(cls, data_root: str, level: str) -> "LevelPackage":
        digest = hashlib.blake2b(digest_size=16)
        buffer = io.BytesIO()
        files = _level_files(data_root, level)
        with tarfile.open(fileobj=buffer, mode="w") as archive:
            for relative, path in files:
                with open(path, "rb") as source:
                    content = source.read()
                digest.update(relative.encode() + b"\0" + len(content).to_bytes(8, "little"))
                digest.update(content)
                info = tarfile.TarInfo(relative)
                info.size = len(content)
                info.mode = 0o644
                archive.addfile(info, io.BytesIO(content))
        return cls(key=digest.hexdigest(), level=level, archive=buffer.getvalue(), file_count=len(files))

    def materialise(self, base: str) -> str:
        """The folder holding this package's data/ under base, unpacked on first use."""
        folder = os.path.join(base, "lumora-data-" + self.key)
        if os.path.isdir(os.path.join(folder, "data")):
            return folder
        os.makedirs(base, exist_ok=True)
        staging = tempfile.mkdtemp(prefix=".lumora-unpack-", dir=base)
        try:
            with tarfile.open(fileobj=io.BytesIO(self.archive), mode="r") as archive:
                for member in archive.getmembers():
                    # Only plain files at plain relative paths: an archive is never trusted to write
                    # outside its folder.
                    if not member.isfile() or member.name.startswith("/") or ".." in member.name.split("/"):
                        raise ValueError(f"unexpected entry {member.name!r} in a level package")
                archive.extractall(staging)
            os.replace(staging, folder)
        except OSError:
            shutil.rmtree(staging, ignore_errors=True)
            if not os.path.isdir(os.path.join(folder, "data")):
                raise
        return folder


@dataclass(frozen=True)
class SharedFolder:
    """A data folder every worker reads at the same path; the workers write nothing into it."""

    path: str

    @property
    def key(self) -> str:
        return "shared-" + hashlib.blake2b(os.path.abspath(self.path).encode(), digest_size=8).hexdigest()

    def materialise(self, base: str) -> str:
        """A folder of the worker's own whose data/ is the shared one."""
        data = os.path.join(os.path.abspath(self.path), "data")
        if not os.path.isdir(data):
            raise FileNotFoundError(f"no data/ folder in the shared folder {self.path} on this worker")
        folder = os.path.join(base, "lumora-" + self.key)
        os.makedirs(folder, exist_ok=True)
        link = os.path.join(folder, "data")
        if not os.path.islink(link):
            os.symlink(data, link)
        return folder
