"""Fits the rule that tells loops from one-shots: python -m qvct_training.loops PROGRAM [FOLDER OF LOOPS, OF ONE-SHOTS].

Loops are patterns of our own voices on a grid, one-shots are the voices themselves. Prints the weights and the bias that
LoopMeasures.cpp has, and how often the rule is right on the folders, which it is not fitted to.
"""

import sys
from pathlib import Path

import numpy as np
import numpy.typing as npt
import soundfile

from .dataset import DRUMS, TONES
from .dsp import RATE, Random, Sound, chance, normalised
from .features import features_of

EXAMPLES = 400
MOST_SECONDS = 30


def one_shot(random: Random) -> Sound:
    """Any voice, perhaps with silence after it."""
    voices = list((DRUMS | TONES).values())
    sound = voices[int(random.integers(len(voices)))](random)
    silence = int(random.choice([0, 0, 0, 1]) * random.uniform(0, 2) * RATE)
    return np.concatenate([sound, np.zeros(silence)])


def loop(random: Random) -> Sound:
    """One to four bars of up to five voices, each struck on a random pattern that is repeated."""
    step = 60 / random.uniform(70, 175) / 4
    steps = 16 * int(random.choice([1, 2, 2, 4]))
    out = np.zeros(int(steps * step * RATE))
    kit = list((DRUMS if chance(random, 0.6) else TONES).values())
    for _ in range(int(random.integers(1, 6))):
        sound = normalised(kit[int(random.integers(len(kit)))](random)) * random.uniform(0.3, 1)
        pattern = random.random(16) < random.uniform(0.1, 0.6)
        pattern[int(random.integers(16))] = True
        for i in np.flatnonzero(np.resize(pattern, steps)):
            at = int((i + random.normal(0, 0.02)) * step * RATE) if i else 0
            part = sound[: max(0, len(out) - at)]
            out[at : at + len(part)] += part * random.uniform(0.6, 1)
    return out


def fitted(measures: npt.NDArray[np.float32], is_loop: npt.NDArray[np.floating]) -> npt.NDArray[np.float64]:
    """Weights and bias of a logistic regression, by Newton's method with a little decay."""
    x = np.hstack([measures, np.ones((len(measures), 1))])
    w = np.zeros(x.shape[1])
    for _ in range(30):
        p = 1 / (1 + np.exp(-x @ w))
        hessian = (x.T * (p * (1 - p))) @ x + 0.5 * np.eye(len(w))
        w -= np.linalg.solve(hessian, x.T @ (p - is_loop) + 0.5 * w)
    return w


def loaded(folder: Path) -> list[npt.NDArray[np.float32]]:
    """The files below a folder, mono; those at other rates are left out."""
    out = []
    for path in sorted(folder.rglob("*")):
        try:
            sound, rate = soundfile.read(path, frames=MOST_SECONDS * RATE, dtype="float32", always_2d=True)
        except (soundfile.LibsndfileError, IsADirectoryError):
            continue
        if rate == RATE and len(sound):
            out.append(sound.mean(axis=1))
    return out


def main() -> None:
    """Fits, prints, and tries."""
    program = Path(sys.argv[1])
    random = np.random.default_rng(1)
    sounds = [normalised((loop if i % 2 else one_shot)(random)) for i in range(2 * EXAMPLES)]
    _, measures = features_of(program, sounds, "--loops")
    w = fitted(measures, np.arange(2 * EXAMPLES) % 2.0)
    print("weights", np.round(w[:-1], 2).tolist(), "bias", round(float(w[-1]), 2))
    for name, folder in zip(("loops", "one-shots"), sys.argv[2:4], strict=False):
        _, found = features_of(program, loaded(Path(folder)), "--loops")
        p = 1 / (1 + np.exp(-(found @ w[:-1] + w[-1])))
        print(
            f"{name}: {len(p)}, above 0.5: {np.mean(p > 0.5):.2f}, above 0.9: {np.mean(p > 0.9):.2f}, below 0.1: {np.mean(p < 0.1):.2f}"
        )


if __name__ == "__main__":
    main()
