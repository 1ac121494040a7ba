"""Grooves that repeat and lie within their loops; weights that prefer what is right."""

import numpy as np
import pytest

from qvct_training.dsp import RATE
from qvct_training.grooves import STYLES, Bar, groove, heard, tempo_between
from qvct_training.tempo import Candidates, fitted


@pytest.mark.parametrize(("quarters", "style"), [(style[1], style[4]) for style in STYLES])
def test_strokes_of_a_style_lie_within_its_bar(quarters: float, style: Bar) -> None:
    random = np.random.default_rng(3)
    for _ in range(20):
        positions = [position for position, _, _ in style(random, quarters)]
        assert positions and min(positions) >= 0 and max(positions) < quarters


def test_a_groove_repeats_with_its_seed_and_lies_within_its_frames() -> None:
    same = [groove(np.random.default_rng(5)) for _ in range(2)]
    assert np.array_equal(same[0].onsets, same[1].onsets) and same[0].bpm == same[1].bpm
    random = np.random.default_rng(6)
    for _ in range(50):
        loop = groove(random)
        assert np.all(np.diff(loop.onsets.astype(int)) > 0) and loop.onsets.max() < loop.frames < 60 * RATE


def test_many_tempos_are_round() -> None:
    random = np.random.default_rng(7)
    tempos = np.array([tempo_between(random, 80, 160) for _ in range(1000)])
    assert np.mean(tempos % 1 == 0) == pytest.approx(0.88, abs=0.04)
    assert np.mean(tempos % 10 == 0) == pytest.approx(0.3 + 0.2 / 2 + 0.38 / 10, abs=0.05)


def test_strokes_at_once_are_heard_as_one() -> None:
    strokes = [(-0.1, 0.4), (0.0, 0.3), (0.01, 0.4), (0.5, 0.4), (0.999, 0.4)]
    times = [time for time, _ in heard(np.random.default_rng(8), strokes, 1.0)]
    assert times == [0.0, 0.5]


def test_the_weight_of_what_is_right_is_larger() -> None:
    random = np.random.default_rng(9)
    loops = []
    for _ in range(100):
        features = random.uniform(0, 1, (20, 3))
        right = np.zeros(20, bool)
        right[np.argmax(features[:, 0] - features[:, 1])] = True
        loops.append(Candidates(np.arange(20.0), features, right))
    nothing_right = Candidates(np.arange(2.0), np.eye(2, 3), np.zeros(2, bool))
    loops += [nothing_right] * 300
    weights = fitted(loops)
    assert weights[0] > 3 and weights[1] < -3 and abs(weights[2]) < 0.5
