"""Fits what speaks for a tempo: python -m qvct_training.tempo PROGRAM, where that is qvct-features.

Prints the weights that LoopTempo.cpp has: those of a multinomial logistic regression over all candidates of each
groove.
"""

import os

os.environ["OPENBLAS_NUM_THREADS"] = "1"  # so that sums are made in the same order each time

import struct
import subprocess
import sys
from dataclasses import dataclass
from pathlib import Path

import numpy as np
import numpy.typing as npt
from scipy.optimize import minimize

from .dsp import RATE
from .grooves import Loop, groove

GROOVES = 2000
SAME = 0.01  # share of a tempo
DECAY = 0.02

Floats = npt.NDArray[np.float64]


@dataclass
class Candidates:
    """The tempos that a loop may have: a row of features each, and which are right."""

    bpm: Floats
    features: Floats
    right: npt.NDArray[np.bool_]


def candidates_of(program: Path, loops: list[Loop]) -> list[Candidates]:
    """As the library itself finds them."""
    question = b"".join(
        struct.pack("=III", RATE, loop.frames, len(loop.onsets))
        + b"".join(struct.pack("=If", *onset) for onset in zip(loop.onsets, loop.loudness, strict=True))
        for loop in loops
    )
    answer = subprocess.run([program.resolve(), "--tempos"], input=question, capture_output=True, check=True).stdout
    (count,) = struct.unpack_from("=I", answer)
    found, at = [], 4
    for loop in loops:
        (rows,) = struct.unpack_from("=I", answer, at)
        table = np.frombuffer(answer, np.float32, rows * count, at + 4).reshape(rows, count).astype(np.float64)
        at += 4 + 4 * rows * count
        bpm = table[:, 0]
        found.append(Candidates(bpm, table[:, 1:], np.abs(bpm / loop.bpm - 1) <= SAME))
    return found


def fitted(loops: list[Candidates]) -> Floats:
    """The weights of the features, which count by their spread while fitting. Loops without a right candidate do not."""
    used = [loop for loop in loops if loop.right.any()]
    rows = np.concatenate([loop.features for loop in used])
    right = np.concatenate([loop.right for loop in used])
    lengths = np.array([len(loop.bpm) for loop in used])
    starts = np.cumsum(lengths) - lengths
    spread = rows.std(0)
    spread[spread == 0] = 1
    rows = rows / spread

    def loss(weights: Floats) -> tuple[float, Floats]:
        scores = rows @ weights
        scores -= np.repeat(np.maximum.reduceat(scores, starts), lengths)
        share = np.exp(scores)
        share /= np.repeat(np.add.reduceat(share, starts), lengths)
        mass = np.add.reduceat(share * right, starts) + 1e-30
        slope = rows.T @ (share - share * right / np.repeat(mass, lengths)) / len(used)
        return float(-np.log(mass).mean() + DECAY / 2 * weights @ weights), slope + DECAY * weights

    result = minimize(loss, np.zeros(rows.shape[1]), jac=True, method="L-BFGS-B", options={"maxiter": 300})
    weights: Floats = result.x / spread
    return weights


def main() -> None:
    """Makes the grooves, has them measured, fits and prints."""
    random = np.random.default_rng(1)
    grooves = [groove(random) for _ in range(GROOVES)]
    weights = fitted(candidates_of(Path(sys.argv[1]), grooves))
    print(", ".join(f"{weight:.2f}" for weight in weights))


if __name__ == "__main__":
    main()
