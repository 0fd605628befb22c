"""Fixtures for the lumora module's tests. They run from the repository root (as CTest runs them)
with PYTHONPATH naming the build's python/ folder; each test that changes files works on a copy
of data/ of its own."""

import os
import shutil
import sys

import pytest

REPO = os.path.abspath(os.path.join(os.path.dirname(__file__), "..", ".."))
# Folders of data/ the tests only read: linked, not copied. The engine writes into the levels'
# folders and data/Cubemaps/<level>/ only, which are copied.
_READ_ONLY = ("Shaders", "models", "textures", "Particles", "grading")

if not any(os.path.isfile(os.path.join(folder, "lumora", "__init__.py")) for folder in sys.path if folder):
    build_python = os.path.join(REPO, "build", "python")
    if os.path.isdir(build_python):
        sys.path.insert(0, build_python)


def make_data_copy(target: str, levels=("sample_small",)) -> str:
    """A folder holding a data/ for the tests: the repository's read-only folders linked, the
    catalogues, the fallback cubemaps and the named levels copied (without their bakes)."""
    source = os.path.join(REPO, "data")
    data = os.path.join(target, "data")
    os.makedirs(os.path.join(data, "XML", "levels"))
    for name in os.listdir(source):
        path = os.path.join(source, name)
        if name in _READ_ONLY:
            os.symlink(path, os.path.join(data, name))
    for name in os.listdir(os.path.join(source, "XML")):
        path = os.path.join(source, "XML", name)
        if os.path.isfile(path):
            shutil.copy(path, os.path.join(data, "XML", name))
    os.makedirs(os.path.join(data, "Cubemaps"))
    for name in os.listdir(os.path.join(source, "Cubemaps")):
        path = os.path.join(source, "Cubemaps", name)
        if os.path.isfile(path):
            shutil.copy(path, os.path.join(data, "Cubemaps", name))
    for level in levels:
        shutil.copytree(os.path.join(source, "XML", "levels", level), os.path.join(data, "XML", "levels", level),
                        ignore=shutil.ignore_patterns("ambient.sh", "bake.json"))
    return target


@pytest.fixture
def data_folder(tmp_path):
    """A fresh copy of data/ with sample_small, for a test that changes it."""
    if not os.path.isdir(os.path.join(REPO, "data", "models")):
        pytest.skip("data/models is made by the build (lumora-content): build first")
    return make_data_copy(str(tmp_path / "game"))


def read(path: str) -> bytes:
    with open(path, "rb") as file:
        return file.read()


def level_file(folder: str, name: str, level: str = "sample_small") -> str:
    return os.path.join(folder, "data", "XML", "levels", level, name)
