"""Gathers the sounds of every source, alters them by chance, and has their features measured."""

import zlib
from collections.abc import Callable, Iterable, Iterator
from concurrent.futures import ProcessPoolExecutor
from dataclasses import dataclass
from pathlib import Path

import numpy as np
import numpy.typing as npt

from . import cymbals, drums, effects, fonts, instruments, keyboards, percussion, recordings, synthesizers
from .augment import augmented
from .classes import INDEX
from .dsp import RATE, Random, chance, normalised
from .features import features_of

DRUMS = drums.VOICES | cymbals.VOICES | percussion.VOICES
TONES = synthesizers.VOICES | keyboards.VOICES | instruments.VOICES | effects.VOICES
BATCH = 150  # sounds that one process makes and has measured


@dataclass(frozen=True)
class Recipe:
    """How one sound is made; everything chosen by chance follows from `seed`."""

    name: str
    source: str
    kit: str
    seed: int
    sound: Callable[[Random], npt.NDArray[np.floating]]
    octaves: float
    altered: bool


@dataclass
class Table:
    """A row of features for each sound, its class, its source and its kit."""

    version: int
    features: npt.NDArray[np.float32]
    classes: npt.NDArray[np.int64]
    sources: npt.NDArray[np.str_]
    kits: npt.NDArray[np.str_]

    def where(self, mask: npt.NDArray[np.bool_]) -> "Table":
        """Some of the rows."""
        return Table(self.version, self.features[mask], self.classes[mask], self.sources[mask], self.kits[mask])

    def save(self, path: Path) -> None:
        """Keeps the table, so that training alone need not measure again."""
        np.savez(
            path,
            version=self.version,
            features=self.features,
            classes=self.classes,
            sources=self.sources,
            kits=self.kits,
        )

    @staticmethod
    def load(path: Path) -> "Table":
        """Reads what `save` has kept."""
        file = np.load(path)
        return Table(int(file["version"]), file["features"], file["classes"], file["sources"], file["kits"])


@dataclass(frozen=True)
class Kept:
    """A sound that was made before."""

    samples: npt.NDArray[np.float16]

    def __call__(self, random: Random) -> npt.NDArray[np.floating]:
        return self.samples.astype(np.float64)


@dataclass(frozen=True)
class Loaded:
    """A sound in a file."""

    path: Path

    def __call__(self, random: Random) -> npt.NDArray[np.floating]:
        return recordings.load(self.path)


def _seed(*parts: object) -> int:
    return zlib.crc32("/".join(str(part) for part in parts).encode())


def synthesis(drum_count: int, tone_count: int) -> Iterator[Recipe]:
    """Our own voices; most are altered."""
    for voices, count, octaves in ((DRUMS, drum_count, 0.15), (TONES, tone_count, 0.0)):
        for name, voice in voices.items():
            for i in range(count):
                seed = _seed("synthesis", name, i)
                yield Recipe(name, "synthesis", "synthesis", seed, voice, octaves, i % 10 < 8)


def of_recordings(found: Iterable[recordings.Recording], source: str, copies: int) -> Iterator[Recipe]:
    """Each file as it is, and altered copies of it."""
    for each in found:
        for i in range(copies):
            drum = INDEX[each.name] < INDEX["bass"]
            seed = _seed(source, each.path.parent.name, each.path.name, i)
            yield Recipe(each.name, source, each.kit, seed, Loaded(each.path), 0.3 if drum else 0.1, i > 0)


def of_font(
    font: Path, source: str, kits: Iterable[int], each: int, banks: Iterable[int], copies: int
) -> Iterator[Recipe]:
    """The notes of a sound font as they are, and altered copies of them."""
    random = np.random.default_rng(_seed(source))
    notes = fonts.drum_notes(kits, random) + fonts.tonal_notes(each, banks, random)
    for number, (note, sound) in enumerate(zip(notes, fonts.render(font, notes), strict=True)):
        kept = Kept((sound / (np.max(np.abs(sound)) + 1e-9)).astype(np.float16))
        for i in range(copies):
            seed, kit = _seed(source, number, i), f"{source} {'drums' if note.drum else 'notes'}"
            yield Recipe(note.name, source, kit, seed, kept, 0.3 if note.drum else 0.05, i > 0)


def made(recipe: Recipe) -> npt.NDArray[np.float32]:
    """The sound of a recipe, with a little silence before it now and then."""
    random = np.random.default_rng(recipe.seed)
    sound = np.asarray(recipe.sound(random), dtype=np.float64)
    if recipe.altered:
        sound = augmented(random, sound, recipe.octaves)
    if chance(random, 0.2):
        sound = np.concatenate([np.zeros(int(random.integers(1, RATE // 30))), sound])
    return normalised(sound)


def _measured(task: tuple[Path, list[Recipe]]) -> tuple[int, npt.NDArray[np.float32]]:
    program, recipes = task
    return features_of(program, map(made, recipes))


def measured(program: Path, recipes: list[Recipe], processes: int) -> Table:
    """The features of all recipes' sounds, in order; silent sounds are left out."""
    tasks = [(program, recipes[i : i + BATCH]) for i in range(0, len(recipes), BATCH)]
    with ProcessPoolExecutor(processes) as pool:
        parts = list(pool.map(_measured, tasks))
    table = Table(
        parts[0][0],
        np.concatenate([part for _, part in parts]),
        np.array([INDEX[each.name] for each in recipes]),
        np.array([each.source for each in recipes]),
        np.array([each.kit for each in recipes]),
    )
    return table.where(np.any(table.features != 0, axis=1))


def joined(tables: list[Table]) -> Table:
    """The rows of all of them."""
    first = tables[0]
    return Table(
        first.version,
        np.concatenate([each.features for each in tables]),
        np.concatenate([each.classes for each in tables]),
        np.concatenate([each.sources for each in tables]),
        np.concatenate([each.kits for each in tables]),
    )
