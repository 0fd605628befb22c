"""The Editor against the real engine (headless, llvmpipe) on copies of sample_small."""

import math
import re
import os
import signal
import struct
import threading
import _thread

import numpy as np
import pytest

import lumora
from conftest import level_file, read

# Inside sample_small's one room (rooms.xml: -3..3 x 0..3 x -4..4), by its +z wall looking along it
# toward -z (forward = (-sin yaw cos pitch, -sin pitch, cos yaw cos pitch)), a little down.
ROOM_VIEW = ((0.0, 1.6, 3.5), math.pi, 0.15)


def assert_close(actual, expected):
    """Records equal to six significant digits (what the level files hold); angles to 1e-3 degrees."""
    if isinstance(expected, list):
        assert len(actual) == len(expected)
        for one, other in zip(actual, expected):
            assert_close(one, other)
        return
    assert type(actual) is type(expected)
    for name, value in vars(expected).items():
        got = getattr(actual, name)
        if isinstance(value, str):
            assert got == value, name
        elif name.endswith("angle"):
            assert got == pytest.approx(value, abs=1e-3), name
        else:
            assert got == pytest.approx(value, rel=1e-5, abs=1e-6), name


def test_records_round_trip_through_edits_save_and_reopen(data_folder):
    with lumora.Editor(data_folder, 320, 180) as editor:
        editor.open("sample_small")
        points, spots = editor.point_lights, editor.spot_lights
        assert len(points) == 3 and len(spots) == 2
        # Written back unchanged, a record reads back identical: nothing is lost in the
        # degrees <-> cosine and double <-> single conversions.
        for index, spot in enumerate(spots):
            editor.set(index, spot)
        assert editor.spot_lights == spots
        # lights.xml holds the cosines to four decimals: 20 and 30 degrees within that.
        assert abs(spots[0].inner_angle - 20.0) < 1e-3 and abs(spots[0].outer_angle - 30.0) < 1e-3

        brighter = lumora.PointLight(points[1].position, tuple(2.5 * c for c in points[1].color), 6.5)
        editor.set(1, brighter)
        spot = lumora.SpotLight((1.0, 2.5, 1.0), (3.0, 2.0, 1.0), 5.0, (0.0, -1.0, 0.0), 12.5, 40.0)
        spot_index = editor.add(spot)
        decal_type = editor.decal_types[0]
        decal = lumora.Decal((0.0, 0.01, 0.0), (1.0, 0.5, 0.5), (0.0, 1.0, 0.0), decal_type, 0.75, 0.3)
        decal_index = editor.add(decal)
        nodes_before = editor.path_nodes
        node_index = editor.add(lumora.PathNode((1.0, 0.25, -1.0)))
        # A removal moves the last light into the removed one's place, as the engine's lists do.
        editor.remove(lumora.PointLight, 0)
        expected_points = [points[2], brighter]
        assert editor.point_lights == expected_points
        assert editor.spot_lights[spot_index] == spot
        assert editor.decals[decal_index] == decal
        new_node = editor.path_nodes[node_index]
        assert new_node.position == (1.0, 0.25, -1.0)
        assert nodes_before[-1].id in new_node.links, "a new node joins the node added before it"
        editor.save()

    with lumora.Editor(data_folder, 320, 180) as editor:
        editor.open("sample_small")
        # The level files keep six significant digits: a 40 degree cone's cosine 0.76604444 is
        # saved as 0.766044, which reads back as 40.00004 degrees.
        assert_close(editor.point_lights, expected_points)
        assert_close(editor.spot_lights[spot_index], spot)
        assert_close(editor.decals[decal_index], decal)
        assert [node.position for node in editor.path_nodes] == [n.position for n in nodes_before] + [
            (1.0, 0.25, -1.0)]


def test_bad_values_are_refused_and_change_nothing(data_folder):
    with lumora.Editor(data_folder, 320, 180) as editor:
        editor.open("sample_small")
        points, spots, decals = editor.point_lights, editor.spot_lights, editor.decals
        bad = [
            (ValueError, lambda: editor.set(0, lumora.PointLight((0, 1, 0), (1, 1, 1), -2.0))),
            (ValueError, lambda: editor.set(0, lumora.PointLight((math.nan, 1, 0), (1, 1, 1), 2.0))),
            (ValueError, lambda: editor.set(0, lumora.PointLight((0, 1, 0), (-1, 1, 1), 2.0))),
            (ValueError, lambda: editor.set(0, lumora.SpotLight(direction=(0, 0, 0)))),
            (ValueError, lambda: editor.set(0, lumora.SpotLight(inner_angle=40.0, outer_angle=30.0))),
            (ValueError, lambda: editor.set(0, lumora.Decal(type="no such decal"))),
            (ValueError, lambda: editor.set(0, lumora.PointLight((0, 1), (1, 1, 1), 2.0))),
            (IndexError, lambda: editor.set(3, points[0])),
            (IndexError, lambda: editor.set(-1, points[0])),
            (IndexError, lambda: editor.remove(lumora.Decal, len(decals))),
            (TypeError, lambda: editor.remove(str, 0)),
        ]
        for error, call in bad:
            with pytest.raises(error):
                call()
        # Only the last path node can go: the others hold the graph's edges.
        with pytest.raises(lumora.LumoraError, match="only the last path node"):
            editor.remove(lumora.PathNode, 0)
        assert (editor.point_lights, editor.spot_lights, editor.decals) == (points, spots, decals)


def test_one_editor_per_process_and_clear_errors_around_it(data_folder, tmp_path):
    with pytest.raises(lumora.LumoraError, match="no data/ folder"):
        lumora.Editor(str(tmp_path / "nowhere"))
    alone = lumora.check("sample_small", data_folder)
    with pytest.raises(lumora.LumoraError, match="no level 'missing'"):
        lumora.check("missing", data_folder)
    with lumora.Editor(data_folder, 64, 64) as first:
        first.open("sample_small")
        lights = len(first.point_lights)
    editor = lumora.Editor(data_folder, 320, 180)
    try:
        with pytest.raises(RuntimeError, match="already open"):
            lumora.Editor(data_folder)
        with pytest.raises(lumora.LumoraError, match="no level is open"):
            editor.point_lights
        with pytest.raises(lumora.LumoraError, match="no level 'missing'"):
            editor.open("missing")
        # The engine is the Editor's: check runs in a child process, with the same answers, and
        # leaves the Editor's level as it was.
        editor.open("sample_small")
        editor.add(lumora.PointLight(position=(1.0, 2.0, 3.0)))
        report = lumora.check("sample_small", data_folder)
        assert report == alone
        with pytest.raises(lumora.LumoraError, match="no level 'missing'"):
            lumora.check("missing", data_folder)
        assert len(editor.point_lights) == lights + 1
    finally:
        editor.close()
    editor.close()
    with pytest.raises(lumora.LumoraError, match="closed"):
        editor.open("sample_small")
    # The engine is free again.
    with lumora.Editor(data_folder, 64, 64) as again:
        again.open("sample_small")
        assert again.level == "sample_small"


def test_a_damaged_level_raises_its_problems_and_check_names_file_and_element(data_folder):
    lights = level_file(data_folder, "lights.xml")
    original = read(lights)
    with open(lights, "wb") as file:
        file.write(re.sub(rb'<falloff value="[^"]*" />', b'<falloff value="oops" />', original, count=1))
    report = lumora.check("sample_small", data_folder)
    assert not report.ok
    assert any(problem.file.endswith("lights.xml") and problem.element for problem in report.problems), report
    with lumora.Editor(data_folder, 64, 64) as editor:
        with pytest.raises(lumora.LumoraError) as raised:
            editor.open("sample_small")
        assert raised.value.problems and "lights.xml" in str(raised.value)
        with pytest.raises(lumora.LumoraError, match="did not load cleanly"):
            editor.point_lights
    with open(lights, "wb") as file:
        file.write(original)
    report = lumora.check("sample_small", data_folder)
    assert report.ok and any("not baked" in note or "ambient" in note for note in report.notes), report


def _png_size(path):
    with open(path, "rb") as file:
        header = file.read(24)
    assert header[:8] == b"\x89PNG\r\n\x1a\n"
    return struct.unpack(">II", header[16:24])


def test_render_shows_the_level_and_follows_edits(data_folder, tmp_path):
    with lumora.Editor(data_folder, 320, 180) as editor:
        editor.open("sample_small")
        png = tmp_path / "frame.png"
        before = editor.render(png, width=160, height=90, camera=ROOM_VIEW, frames=4)
        assert before.shape == (90, 160, 3) and before.dtype == np.uint8
        assert _png_size(png) == (160, 90)
        # A lit room, not a blank target: parts bright, parts dark.
        assert before.std() > 10.0 and before.max() > 100
        position, yaw, pitch = editor.camera
        assert np.allclose(position, ROOM_VIEW[0], atol=1e-4)
        assert abs(math.cos(yaw) + 1.0) < 1e-4 and abs(pitch - ROOM_VIEW[2]) < 1e-4
        # Every light turned off darkens the frame (the eye adaptation is held the same: few frames).
        for index, light in enumerate(editor.point_lights):
            editor.set(index, lumora.PointLight(light.position, (0.0, 0.0, 0.0), light.falloff))
        for index, light in enumerate(editor.spot_lights):
            light.color = (0.0, 0.0, 0.0)
            editor.set(index, light)
        after = editor.render(width=160, height=90, camera=ROOM_VIEW, frames=4)
        assert after.mean() < 0.8 * before.mean()
        with pytest.raises(ValueError, match="mode"):
            editor.render(width=16, height=16, mode="wire")
        with pytest.raises(lumora.LumoraError, match="cannot render"):
            editor.render(width=100000, height=16)


def test_bake_reports_progress_and_cancels_from_another_thread_writing_nothing(data_folder):
    ambient = level_file(data_folder, "ambient.sh")
    with lumora.Editor(data_folder, 320, 180) as editor:
        editor.open("sample_small")
        statuses = []
        result = editor.bake(bounces=1, reflections=False, progress=statuses.append, poll_seconds=0.01)
        assert result.finished and result.ambient_written and result.probes > 0, result
        assert os.path.isfile(ambient)
        last = statuses[-1]
        assert last.last_result == "finished" and last.probes_done == last.probes_total == result.probes
        baked = read(ambient)

        cancelled_statuses = []

        def cancel_once_started(status):
            cancelled_statuses.append(status)
            if status.phase == "ambient" and status.probes_done > 0:
                threading.Thread(target=editor.cancel_bake).start()

        result = editor.bake(bounces=8, reflections=True, progress=cancel_once_started, poll_seconds=0.01)
        assert result.result == "cancelled", result
        assert not result.ambient_written
        assert read(ambient) == baked, "a cancelled bake left ambient.sh as it was"
        assert editor.bake_status.last_result == "cancelled"
        assert not [name for name in os.listdir(os.path.dirname(ambient)) if name.endswith(".tmp")]


def test_an_exception_in_progress_or_ctrl_c_stops_the_bake_and_is_raised(data_folder):
    ambient = level_file(data_folder, "ambient.sh")
    with lumora.Editor(data_folder, 320, 180) as editor:
        editor.open("sample_small")

        def fail(status):
            if status.probes_done > 0:
                raise ValueError("stop here")

        with pytest.raises(ValueError, match="stop here"):
            editor.bake(bounces=8, progress=fail, poll_seconds=0.01)
        assert not os.path.exists(ambient)
        assert editor.bake_status.last_result == "cancelled"

        def interrupt(status):
            if status.probes_done > 0:
                _thread.interrupt_main()

        previous = signal.signal(signal.SIGINT, signal.default_int_handler)
        try:
            with pytest.raises(KeyboardInterrupt):
                editor.bake(bounces=8, progress=interrupt, poll_seconds=0.01)
        finally:
            signal.signal(signal.SIGINT, previous)
        assert not os.path.exists(ambient)
        # The engine is fine afterwards.
        assert editor.bake(bounces=1, reflections=False).finished
        assert os.path.isfile(ambient)
