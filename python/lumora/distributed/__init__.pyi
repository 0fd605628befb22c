# Type stubs of lumora.distributed.
import os
from dataclasses import dataclass
from typing import Any, Callable, Dict, Iterable, Optional, Tuple, Union

_PathLike = Union[str, os.PathLike[str]]

@dataclass(frozen=True)
class LevelPackage:
    key: str
    level: str
    archive: bytes
    file_count: int
    @classmethod
    def collect(cls, data_root: str, level: str) -> LevelPackage: ...
    def materialise(self, base: str) -> str: ...

@dataclass(frozen=True)
class SharedFolder:
    path: str
    @property
    def key(self) -> str: ...
    def materialise(self, base: str) -> str: ...

@dataclass(frozen=True)
class DistributedBakeResult:
    level: str
    ambient: Optional[str]
    cubemaps: Tuple[str, ...]
    bounces: int
    cells: int
    parts: int
    workers: int
    seconds: float
    timings: Dict[str, float]

def bake(level: str, client: Any, bounces: int = ..., parts: Optional[int] = ..., *, data: _PathLike = ...,
         ambient: bool = ..., reflections: bool = ..., shared_data: Optional[_PathLike] = ..., force: bool = ...,
         rooms: Optional[Iterable[str]] = ..., retries: int = ...,
         progress: Optional[Callable[[str, int, int], None]] = ...) -> DistributedBakeResult: ...
