"""Bakes spread over a Dask LocalCluster of two worker processes, against the bake on one machine."""

import os
import signal
import subprocess
import sys
import time

import pytest

distributed = pytest.importorskip("distributed")

import lumora
import lumora.distributed
from lumora.distributed import LevelPackage, SharedFolder
from conftest import REPO, level_file, make_data_copy, read


def outputs(folder, level="sample_small"):
    """The bake's outputs in a data folder: {relative path: bytes}."""
    found = {}
    for relative in (os.path.join("data", "XML", "levels", level, "ambient.sh"),
                     os.path.join("data", "Cubemaps", level, "main.dds")):
        path = os.path.join(folder, relative)
        if os.path.exists(path):
            found[relative] = read(path)
    return found


@pytest.fixture(scope="module")
def reference(tmp_path_factory):
    """sample_small baked on one machine through the Editor: 2 bounces and the reflections."""
    if not os.path.isdir(os.path.join(REPO, "data", "models")):
        pytest.skip("data/models is made by the build (lumora-content): build first")
    folder = make_data_copy(str(tmp_path_factory.mktemp("local") / "game"))
    with lumora.Editor(folder) as editor:
        editor.open("sample_small")
        assert editor.bake(bounces=2).finished
    baked = outputs(folder)
    assert len(baked) == 2
    return baked


@pytest.fixture(scope="module")
def client():
    cluster = distributed.LocalCluster(n_workers=2, threads_per_worker=1, processes=True, dashboard_address=None)
    with distributed.Client(cluster) as connected:
        yield connected
    cluster.close()


def test_a_distributed_bake_gives_the_local_bake_byte_for_byte_and_a_current_record(reference, client, tmp_path):
    folder = make_data_copy(str(tmp_path / "game"))
    seen = []
    result = lumora.distributed.bake("sample_small", client, bounces=2, parts=5, data=folder,
                                     progress=lambda phase, done, total: seen.append((phase, done, total)))
    assert outputs(folder) == reference
    assert result.parts == 5 and result.workers == 2 and result.cells == 24
    assert ("ambient bounce 2", 5, 5) in seen and ("reflections", 1, 1) in seen
    # The record makes the bake current for check, as a local bake's does.
    record = lumora.check("sample_small", folder)
    assert record.ok and not record.notes, record
    assert not [name for name in os.listdir(os.path.dirname(level_file(folder, "ambient.sh")))
                if name.endswith(".tmp")]
    # The same inputs again, on workers that have the level loaded and one that baked a reflection
    # (which loads textures the driver's engine does not list among the inputs): still the same.
    again = make_data_copy(str(tmp_path / "again"))
    lumora.distributed.bake("sample_small", client, bounces=2, parts=6, data=again)
    assert outputs(again) == reference


def test_a_bake_of_some_rooms_writes_their_cubemaps_as_a_local_room_bake_and_nothing_else(client, tmp_path):
    def cubemaps(folder):
        directory = os.path.join(folder, "data", "Cubemaps", "sample_large")
        return sorted(os.listdir(directory)) if os.path.isdir(directory) else []

    local = make_data_copy(str(tmp_path / "local"), levels=("sample_large",))
    with lumora.Editor(local) as editor:
        editor.open("sample_large")
        ids = [room.id for room in editor.rooms]
        assert len(ids) > 2
        chosen = [ids[1], ids[-1]]
        assert editor.bake(ambient=False, rooms=chosen).finished
    expected = {name: read(os.path.join(local, "data", "Cubemaps", "sample_large", name)) for name in cubemaps(local)}
    assert len(expected) == 2

    folder = make_data_copy(str(tmp_path / "game"), levels=("sample_large",))
    before = cubemaps(folder)
    # A misspelt room, a room with the ambient volume, or no room at all: refused, nothing written.
    with pytest.raises(lumora.LumoraError, match="no room with the ID 'nowhere'"):
        lumora.distributed.bake("sample_large", client, data=folder, ambient=False, rooms=[chosen[0], "nowhere"])
    for wrong in ([chosen[0]], []):
        with pytest.raises(ValueError):
            lumora.distributed.bake("sample_large", client, data=folder, ambient=bool(wrong), rooms=wrong)
    assert cubemaps(folder) == before and not os.path.exists(level_file(folder, "bake.json", "sample_large"))

    result = lumora.distributed.bake("sample_large", client, data=folder, ambient=False, rooms=chosen)
    assert result.ambient is None and len(result.cubemaps) == 2
    baked = {name: read(os.path.join(folder, "data", "Cubemaps", "sample_large", name))
             for name in cubemaps(folder) if name not in before}
    assert baked == expected
    record = lumora.read_bake_record(level_file(folder, "bake.json", "sample_large"))
    assert record.ambient is None and sorted(record.reflections.rooms) == sorted(chosen)


def test_a_worker_killed_mid_bake_changes_nothing_in_the_result(reference, client, tmp_path):
    folder = make_data_copy(str(tmp_path / "game"))
    pids = client.run(lumora.distributed._worker.worker_pid)
    killed = []

    def kill_one(phase, done, total):
        # After the first part of the first bounce, while the other worker is still busy: a worker
        # that holds the inputs the driver sent (the level's package), so that the bake depends on
        # other copies of them.
        if not killed:
            holders = {address for key, addresses in client.who_has().items()
                       if not str(key).startswith("lumora-") for address in addresses}
            address = next((address for address in pids if address in holders), next(iter(pids)))
            os.kill(pids[address], signal.SIGKILL)
            killed.append(address)

    lumora.distributed.bake("sample_small", client, bounces=2, parts=12, data=folder, progress=kill_one)
    assert killed
    assert outputs(folder) == reference
    # The nanny starts a new worker in the killed one's place.
    client.wait_for_workers(2, timeout=60)


def test_a_shared_data_folder_bakes_the_same_and_is_not_written_to(reference, client, tmp_path):
    folder = make_data_copy(str(tmp_path / "game"))
    # The workers read a share holding the same data; the driver writes into its own folder.
    share = make_data_copy(str(tmp_path / "share"))

    def listing():
        return {os.path.join(root, name): os.path.getmtime(os.path.join(root, name))
                for root, _dirs, names in os.walk(share) for name in names}

    before = listing()
    lumora.distributed.bake("sample_small", client, bounces=2, data=folder, shared_data=share)
    assert outputs(folder) == reference
    assert listing() == before, "a worker wrote into the shared folder"


def test_a_cancelled_or_failed_bake_leaves_every_output_as_it_was(reference, client, tmp_path):
    folder = make_data_copy(str(tmp_path / "game"))
    lumora.distributed.bake("sample_small", client, bounces=1, data=folder)
    baked = outputs(folder)
    assert len(baked) == 2 and baked != reference

    def interrupt(phase, done, total):
        if phase == "ambient bounce 2":
            raise KeyboardInterrupt

    with pytest.raises(KeyboardInterrupt):
        lumora.distributed.bake("sample_small", client, bounces=3, data=folder, progress=interrupt)
    assert outputs(folder) == baked

    def interrupt_reflections(phase, done, total):
        if phase == "reflections":
            raise KeyboardInterrupt

    with pytest.raises(KeyboardInterrupt):
        lumora.distributed.bake("sample_small", client, bounces=2, data=folder, progress=interrupt_reflections)
    assert outputs(folder) == baked
    for directory in (os.path.dirname(level_file(folder, "ambient.sh")),
                      os.path.join(folder, "data", "Cubemaps", "sample_small")):
        assert not [name for name in os.listdir(directory) if name.endswith(".tmp")]

    # A level with problems is refused before anything is sent.
    lights = level_file(folder, "lights.xml")
    with open(lights, "ab") as file:
        file.write(b"<broken")
    with pytest.raises(lumora.LumoraError, match="problem") as refused:
        lumora.distributed.bake("sample_small", client, bounces=1, data=folder)
    assert refused.value.problems
    assert outputs(folder) == baked


def test_the_package_holds_the_level_and_what_the_engine_reads_and_nothing_else(tmp_path):
    folder = make_data_copy(str(tmp_path / "game"), levels=("sample_small", "sample_large"))
    cubemaps = os.path.join(folder, "data", "Cubemaps")
    for level in ("sample_small", "sample_large"):
        os.makedirs(os.path.join(cubemaps, level))
        with open(os.path.join(cubemaps, level, "room.dds"), "wb") as file:
            file.write(level.encode())
    os.makedirs(os.path.join(cubemaps, "sh debug"))
    open(os.path.join(cubemaps, "sh debug", "probe.dds"), "wb").close()
    open(os.path.join(folder, "data", "XML", "levels", "sample_small", ".lights.xml.1.abc.tmp"), "wb").close()

    package = LevelPackage.collect(folder, "sample_small")
    unpacked = package.materialise(str(tmp_path / "worker"))
    files = {os.path.relpath(os.path.join(root, name), unpacked)
             for root, _dirs, names in os.walk(unpacked) for name in names}
    assert os.path.join("data", "XML", "levels", "sample_small", "lights.xml") in files
    assert os.path.join("data", "Cubemaps", "sample_small", "room.dds") in files
    assert os.path.join("data", "Cubemaps", "cubemap.dds") in files
    assert any(name.startswith(os.path.join("data", "Shaders")) for name in files)
    assert not [name for name in files if "sample_large" in name or "sh debug" in name or name.endswith(".tmp")]
    # Unpacked once per key; the same inputs give the same key, a changed input another.
    assert package.materialise(str(tmp_path / "worker")) == unpacked
    assert LevelPackage.collect(folder, "sample_small").key == package.key
    with open(os.path.join(cubemaps, "sample_small", "room.dds"), "ab") as file:
        file.write(b"!")
    assert LevelPackage.collect(folder, "sample_small").key != package.key
    with pytest.raises(FileNotFoundError):
        SharedFolder(str(tmp_path / "none")).materialise(str(tmp_path / "worker"))


def test_the_command_line_bakes_locally_and_fails_fast_on_a_bad_scheduler(reference, tmp_path):
    folder = make_data_copy(str(tmp_path / "game"))
    environment = dict(os.environ, PYTHONPATH=os.pathsep.join(sys.path))
    command = [sys.executable, "-m", "lumora.distributed", "sample_small", "--data", folder]
    done = subprocess.run(command + ["--local", "2", "--bounces", "2"], capture_output=True, text=True,
                          env=environment, timeout=240)
    assert done.returncode == 0, done.stderr
    assert "baked sample_small on 2 worker(s)" in done.stdout
    assert outputs(folder) == reference

    start = time.monotonic()
    failed = subprocess.run(command + ["--scheduler", "tcp://127.0.0.1:9", "--connect-timeout", "3"],
                            capture_output=True, text=True, env=environment, timeout=60)
    assert failed.returncode == 2
    assert "cannot reach the Dask scheduler at tcp://127.0.0.1:9" in failed.stderr
    assert time.monotonic() - start < 20
