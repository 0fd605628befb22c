"""The examples a pipeline starts from, run as a pipeline runs them, on copies of the sample levels;
and the package's type stubs against what the package has."""

import ast
import inspect
import os
import subprocess
import sys

import pytest

import lumora
import lumora.distributed
from conftest import REPO, level_file, make_data_copy, read

EXAMPLES = os.path.join(REPO, "examples")


def run(script, *arguments, timeout=300):
    environment = dict(os.environ, PYTHONPATH=os.pathsep.join(path for path in sys.path if path))
    return subprocess.run([sys.executable, os.path.join(EXAMPLES, script), *arguments], capture_output=True,
                          text=True, env=environment, timeout=timeout)


@pytest.fixture
def game(tmp_path):
    if not os.path.isdir(os.path.join(REPO, "data", "models")):
        pytest.skip("data/models is made by the build (lumora-content): build first")
    return make_data_copy(str(tmp_path / "game"), levels=("sample_small", "sample_large"))


def test_a_pipeline_scales_lights_finds_the_stale_bake_and_bakes_it_in_ci(game):
    with lumora.Editor(game, 64, 64) as editor:
        editor.open("sample_small")
        before = [light.color for light in editor.point_lights + editor.spot_lights]

    done = run("ci_bake.py", "sample_small", "--data", game, "--bounces", "1")
    assert done.returncode == 0, done.stdout + done.stderr
    assert "sample_small: baked" in done.stdout and "up to date" in done.stdout
    stale = run("stale_bakes.py", "--data", game)
    assert stale.returncode == 1, "sample_large has never been baked"
    assert "sample_small: up to date" in stale.stdout and "sample_large: needs a bake" in stale.stdout

    done = run("scale_lights.py", "sample_small", "1.5", "--data", game)
    assert done.returncode == 0, done.stderr
    assert "5 light(s) scaled by 1.5" in done.stdout
    with lumora.Editor(game, 64, 64) as editor:
        editor.open("sample_small")
        after = [light.color for light in editor.point_lights + editor.spot_lights]
    assert after == [tuple(pytest.approx(1.5 * channel, rel=1e-6) for channel in color) for color in before]
    stale = run("stale_bakes.py", "--data", game)
    assert "sample_small: needs a bake" in stale.stdout and "lights.xml changed" in stale.stdout

    assert run("scale_lights.py", "sample_small", "-1", "--data", game).returncode == 2
    assert run("scale_lights.py", "no_such_level", "2", "--data", game).returncode == 1


def test_ci_bake_fails_on_a_level_with_problems_and_writes_nothing(game):
    with open(level_file(game, "entities.xml"), "ab") as file:
        file.write(b"<unclosed")
    done = run("ci_bake.py", "sample_small", "--data", game, "--bounces", "1")
    assert done.returncode == 1
    assert "::error::sample_small has" in done.stdout and "entities.xml" in done.stdout
    assert not os.path.exists(level_file(game, "ambient.sh"))


def test_cluster_bake_on_local_workers(game):
    done = run("cluster_bake.py", "sample_small", "--local", "2", "--data", game, "--bounces", "1")
    assert done.returncode == 0, done.stdout + done.stderr
    assert "2 worker(s)" in done.stdout and "reflections: 1/1" in done.stdout
    assert os.path.isfile(level_file(game, "ambient.sh"))
    assert read(os.path.join(game, "data", "Cubemaps", "sample_small", "main.dds"))[:4] == b"DDS "


def _stub_names(path):
    tree = ast.parse(open(path).read())
    names, members = set(), {}
    for node in tree.body:
        if isinstance(node, (ast.ClassDef, ast.FunctionDef)):
            names.add(node.name)
            if isinstance(node, ast.ClassDef):
                members[node.name] = {item.name for item in node.body if isinstance(item, ast.FunctionDef)} | {
                    item.target.id for item in node.body if isinstance(item, ast.AnnAssign)}
        elif isinstance(node, ast.Assign):
            names.update(target.id for target in node.targets if isinstance(target, ast.Name))
    return names, members


@pytest.mark.parametrize("module", [lumora, lumora.distributed], ids=["lumora", "lumora.distributed"])
def test_the_type_stubs_cover_the_public_api(module):
    names, members = _stub_names(os.path.splitext(module.__file__)[0] + ".pyi")
    for name in module.__all__:
        assert name in names, f"{name} is missing from the stubs"
        value = getattr(module, name)
        if inspect.isclass(value):
            public = {member for member in vars(value) if not member.startswith("_")}
            assert public <= members[name], f"{name}: {sorted(public - members[name])} missing from the stubs"
            if hasattr(value, "__dataclass_fields__"):
                assert set(value.__dataclass_fields__) <= members[name]
        elif callable(value):
            assert value.__doc__, f"{name} has no docstring"
