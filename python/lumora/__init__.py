"""Lumora for Python: open a level, read and change its lights, decals and path nodes, save
them, bake its lighting, render frames, check levels and read the baked files.

    import lumora
    with lumora.Editor("/games/x") as editor:
        editor.open("sample_small")
        print(editor.point_lights)

lumora.distributed bakes a level over a Dask cluster.
"""

from ._editor import Editor, LumoraError, check
from ._files import (AmbientVolume, BakeGrid, BakePhaseRecord, BakeRecord, BakeRoomUpdate, DdsImage,
                     read_bake_record, stale_inputs)
from ._records import (BakeResult, BakeStatus, CheckReport, Decal, PathNode, PointLight, Problem, Room,
                       SpotLight)

__all__ = [
    "Editor", "LumoraError", "check",
    "PointLight", "SpotLight", "Decal", "PathNode", "Room", "Problem", "CheckReport", "BakeStatus",
    "BakeResult", "AmbientVolume", "DdsImage", "BakeRecord", "BakePhaseRecord", "BakeGrid", "BakeRoomUpdate",
    "read_bake_record", "stale_inputs",
]
