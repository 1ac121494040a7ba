"""What the model depends on: sounds that repeat, networks that learn, files that are read back."""

import itertools
import struct
from dataclasses import replace
from pathlib import Path

import numpy as np
import pytest

from qvct_training import drums, general_midi
from qvct_training.augment import augmented, ended
from qvct_training.classes import CLASSES, FAMILIES, FAMILY_OF_CLASS, INDEX
from qvct_training.dataset import DRUMS, TONES, Table, made, synthesis
from qvct_training.dsp import RATE
from qvct_training.fonts import Note, midi_file
from qvct_training.judging import Answers, by_family, calibrated, calibration, reliability
from qvct_training.likeness import HEARD, SIZE, Library, centres, figures_of, fitted
from qvct_training.model_file import likeness_bytes, model_bytes, quantised, rounded
from qvct_training.network import Settings, train
from qvct_training.recordings import class_by_name, load, toolkit_drums
from qvct_training.training import folds, weights


@pytest.mark.parametrize("name", [*DRUMS, *TONES])
def test_voices_sound_and_are_finite(name: str) -> None:
    voice = (DRUMS | TONES)[name]
    assert name in INDEX
    for seed in range(6):
        sound = voice(np.random.default_rng(seed))
        assert np.all(np.isfinite(sound)) and np.max(np.abs(sound)) > 1e-3, seed
        assert 0.01 * RATE < len(sound) < 2.4 * RATE, seed


def test_a_recipe_makes_the_same_sound_each_time_and_others_another() -> None:
    first, second = list(synthesis(2, 0))[:2]
    assert np.array_equal(made(first), made(first))
    assert not np.array_equal(np.trim_zeros(made(first))[:300], np.trim_zeros(made(second))[:300])
    assert np.max(np.abs(made(first))) == pytest.approx(0.9)


def test_augmentation_keeps_a_sound_finite() -> None:
    sound = drums.snare(np.random.default_rng(1))
    for seed in range(40):
        out = augmented(np.random.default_rng(seed), sound, 0.3)
        assert np.all(np.isfinite(out)) and np.max(np.abs(out)) > 1e-4, seed


def test_silence_after_a_sound_goes_or_grows_and_the_sound_stays() -> None:
    tone = np.sin(np.arange(RATE // 2) / 10) + 2
    sound = np.concatenate([tone, np.zeros(RATE)])
    ends = [ended(np.random.default_rng(seed), sound) for seed in range(60)]
    assert all(np.array_equal(end[: len(tone)], tone) and not np.any(end[len(tone) :]) for end in ends)
    lengths = [len(end) for end in ends]
    assert lengths.count(len(tone)) > 15 and max(lengths) > len(sound) + RATE


@pytest.mark.parametrize(
    ("stem", "name"),
    [
        ("tr505-hihat-closed", "closed hat"), ("hihat-open", "open hat"), ("OHH_1", None), ("tamb-short", "tambourine"),
        ("conga-hh", "conga"), ("tom-hh", "tom"), ("stick-m", "rim"), ("Kick 01", "kick"), ("cowb-l", "cowbell"), ("cymball-long", "cymbal"),
        ("loop_amen", None), ("bd_808", "kick"), ("Ride Bell", "ride"), ("cabasa", "shaker"), ("melody", None),
    ],
)  # fmt: skip
def test_names_tell_classes(stem: str, name: str | None) -> None:
    assert class_by_name(stem) == name


def test_waves_of_the_toolkit_are_read_as_they_are_kept(tmp_path: Path) -> None:
    wave = (20000 * np.sin(2 * np.pi * 441 * np.arange(2205) / 22050)).astype(">i2")
    first = next(toolkit_drums(tmp_path))
    first.path.write_bytes(wave.tobytes())
    sound = load(first.path)
    assert len(sound) == 4410 and np.max(np.abs(sound)) == pytest.approx(20000 / 32768, rel=0.05)
    assert np.abs(np.fft.rfft(sound)).argmax() == 44  # 441 Hz at 44.1 kHz


def test_programs_and_keys_have_classes_that_there_are() -> None:
    assert set(general_midi.PROGRAMS.values()) | set(general_midi.DRUM_KEYS.values()) <= set(INDEX)
    assert set(general_midi.PROGRAMS.values()) <= set(general_midi.KEYS)
    assert general_midi.drum_class(general_midi.ORCHESTRA_KIT, 45) is None
    assert general_midi.drum_class(0, 45) == "tom"


def test_a_midi_file_holds_its_notes_in_time() -> None:
    data = midi_file([Note("tom", True, 0, 8, 45, 100, 1.0), Note("bass", False, 8, 33, 40, 90, 0.5)])
    assert data[:4] == b"MThd" and struct.unpack(">I", data[18:22])[0] == len(data) - 22
    assert bytes([0xC9, 8]) in data and bytes([0x99, 45, 100]) in data
    assert bytes([0xB0, 0, 8]) in data and bytes([0xC0, 33]) in data


def test_classes_lie_in_families() -> None:
    likelihoods = np.eye(len(CLASSES), dtype=np.float32)
    assert by_family(likelihoods).argmax(axis=1).tolist() == FAMILY_OF_CLASS
    hats = likelihoods[INDEX["open hat"]] + likelihoods[INDEX["closed hat"]]
    assert by_family(hats[None, :]).max() == 2
    assert len({family.name for family in FAMILIES}) == len(FAMILIES)


def _table() -> Table:
    random = np.random.default_rng(5)
    classes = np.arange(400) % 4
    features = random.standard_normal((400, 6)).astype(np.float32)
    features[:, 0] += 3 * (classes % 2)
    features[:, 1] += 3 * (classes // 2)
    sources = np.array(["synthesis", "machines", "fluid", "musescore"])[(np.arange(400) // 4) % 4]
    return Table(1, features, classes, sources, np.array([f"kit {i % 3}" for i in range(400)]))


def test_networks_learn_and_repeat() -> None:
    table = _table()
    settings = Settings(hidden=(16,), epochs=60, batch=32, input_dropout=0, dropout=0)
    first, again = (train(table.features, table.classes, weights(table), 4, settings) for _ in range(2))
    right = first.logits(table.features).argmax(axis=1) == table.classes
    assert right.mean() > 0.75
    assert all(np.array_equal(a, b) for a, b in zip(first.weights, again.weights, strict=True))
    other = train(table.features, table.classes, weights(table), 4, replace(settings, seed=2))
    assert not np.array_equal(first.weights[0], other.weights[0])


def test_rare_sounds_of_a_source_weigh_more() -> None:
    table = _table()
    table.classes[:] = 0
    table.classes[table.sources == "fluid"] = 1
    table.classes[np.flatnonzero(table.sources == "fluid")[0]] = 0
    rows = weights(table)
    rare = rows[(table.sources == "fluid") & (table.classes == 0)]
    assert rare[0] > 3 * rows[(table.sources == "synthesis") & (table.classes == 0)][0]


def test_kindred_sources_are_left_out_together_and_synthesis_never() -> None:
    table = _table()
    found = dict(folds(table))
    assert set(found) == {"fonts", "machine kit 0", "machine kit 1", "machine kit 2"}
    assert set(table.sources[found["fonts"]]) == {"fluid", "musescore"}
    assert set(table.kits[found["machine kit 1"]]) == {"kit 1"}


def test_calibration_says_how_often_answers_are_right() -> None:
    random = np.random.default_rng(1)
    sure = random.uniform(0.2, 1, 20000).astype(np.float32)
    right = random.random(20000) < sure**2
    answers = Answers(right.astype(np.int64), sure, np.ones(20000, np.int64))
    points = calibration(answers)
    assert all(a[0] < b[0] and a[1] < b[1] for a, b in itertools.pairwise(points))
    assert calibrated(np.array([0.7], np.float32), points)[0] == pytest.approx(0.49, abs=0.04)
    answers.sure = calibrated(sure, points)
    assert all(abs(said - true) < 0.06 for said, true, count in reliability(answers) if count > 500)


def test_the_file_has_what_the_format_says(tmp_path: Path) -> None:
    table = _table()
    network = train(table.features, table.classes, weights(table), len(CLASSES), Settings(hidden=(8,), epochs=1))
    scales, whole = quantised(network.weights[0])
    assert whole.dtype == np.int8 and np.abs(whole).max() == 127
    assert np.allclose(rounded(network).weights[0], network.weights[0], atol=float(scales.max()) / 2 + 1e-6)
    data = model_bytes(7, [network, network], [(0.0, 0.0), (1.0, 1.0)])
    assert data[:4] == b"QVIM" and struct.unpack("<III", data[4:16]) == (1, 7, 6)
    layers = sum(4 + 8 * b + a * b for a, b in ((6, 8), (8, len(CLASSES))))
    names = sum(1 + len(f.label) for f in FAMILIES) + sum(3 + len(c.label) + len(c.detail) for c in CLASSES)
    assert len(data) == 16 + 4 + 4 + names + 4 + 16 + 2 * 6 * 4 + 4 + 2 * (4 + layers)


def _many() -> Table:
    """Four classes that a direction tells apart, and as much again that differs within them."""
    random = np.random.default_rng(5)
    classes = np.arange(800) % 4
    features = random.standard_normal((800, 12)).astype(np.float32)
    features[np.arange(800), classes] += 6
    features[:, 8] *= 3
    kits = np.array([f"kit {i % 5}" for i in range(800)])
    return Table(1, features, np.array([0, 4, 7, 20])[classes], np.full(800, "machines"), kits)


def test_places_of_one_class_lie_together_and_repeat() -> None:
    table = _many()
    settings = Settings(hidden=(16, SIZE - HEARD), epochs=40, batch=32, input_dropout=0, dropout=0)
    likeness = fitted(table, settings)
    places = likeness.places(table.features)
    assert places.shape == (800, SIZE) and places.dtype == np.int8
    assert np.array_equal(places, fitted(table, settings).places(table.features))
    assert np.abs(places[:, -HEARD:].astype(int)).mean(axis=0).min() > 10
    library = Library.of(likeness, table)
    figures = figures_of(library, library)
    assert figures["drums"] == 600 and figures["drums alike"] > 0.9 and figures["tones alike"] > 0.9


def test_neighbours_are_counted_in_other_kits_and_where_there_are_ten() -> None:
    places = np.zeros((24, SIZE), np.int8)
    places[:, 0] = np.arange(24)
    families = np.array([0] * 12 + [1] * 12)
    library = Library(places, families, np.array(["a"] * 2 + ["b"] * 20 + ["c"] * 2))
    shares = library.shares(library, own_kit=False)
    assert shares[0] == 1 and shares[23] == 1  # ten of its family are in another kit
    assert np.all(np.isnan(shares[2:22]))  # two of its family are not ten
    assert library.shares(library, own_kit=True)[11] == pytest.approx(0.5, abs=0.11)


def test_cells_have_their_middles_where_sounds_are() -> None:
    random = np.random.default_rng(2)
    spots = random.integers(-100, 100, (8, SIZE))
    places = (np.repeat(spots, 40, axis=0) + random.integers(-3, 4, (320, SIZE))).astype(np.int8)
    middles = centres(places, 24)
    apart = np.abs(middles[None, :, :].astype(int) - spots[:, None, :]).max(axis=2).min(axis=1)
    assert middles.shape == (24, SIZE) and np.count_nonzero(apart <= 4) >= 7
    assert np.array_equal(middles, centres(places, 24))


def test_the_file_of_likeness_has_what_the_format_says() -> None:
    likeness = fitted(_many(), Settings(hidden=(16, SIZE - HEARD), epochs=1))
    middles = np.zeros((5, SIZE), np.int8)
    data = likeness_bytes(7, likeness.direction, 300.0, likeness.differences, middles)
    assert data[:4] == b"QVLM" and struct.unpack("<III", data[4:16]) == (1, 7, 12)
    layers = sum(4 + 8 * b + a * b for a, b in ((12, 16), (16, SIZE - HEARD), (12, HEARD)))
    assert len(data) == 16 + 2 * 12 * 4 + layers + 4 + 4 + 5 * SIZE
