"""The features of sounds, as the program `qvct-features` measures them: the same code that judging uses."""

import struct
import subprocess
import threading
from collections.abc import Iterable
from pathlib import Path

import numpy as np
import numpy.typing as npt

from .dsp import RATE


def features_of(
    program: Path, sounds: Iterable[npt.NDArray[np.float32]], *options: str
) -> tuple[int, npt.NDArray[np.float32]]:
    """The version of the features, and a row for each sound."""
    made = list(sounds)  # so that whatever fails does so before the program waits for more
    process = subprocess.Popen([program.resolve(), *options], stdin=subprocess.PIPE, stdout=subprocess.PIPE)
    assert process.stdin is not None and process.stdout is not None
    feed = process.stdin

    def write() -> None:
        for sound in made:
            feed.write(struct.pack("=II", RATE, len(sound)))
            feed.write(np.ascontiguousarray(sound, dtype=np.float32).tobytes())
        feed.close()

    writer = threading.Thread(target=write)
    writer.start()
    answer = process.stdout.read()
    writer.join()
    if process.wait() != 0 or len(answer) < 8:
        raise RuntimeError("qvct-features has failed")
    version, count = struct.unpack("=II", answer[:8])
    return version, np.frombuffer(answer, np.float32, offset=8).reshape(-1, count)
