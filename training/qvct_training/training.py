"""Trains on all sources, and on all but one to see how it does on what it has not met."""

from collections.abc import Iterable, Iterator
from concurrent.futures import ProcessPoolExecutor
from dataclasses import replace

import numpy as np
import numpy.typing as npt

from .classes import CLASSES, INDEX
from .dataset import Table
from .judging import Answers, likelihoods
from .network import Array, Network, Settings, train

# How much a source counts beside its number of sounds: recordings of machines are few and dear, our own pitched
# instruments are crude.
STRENGTHS = {"machines": 2.0, "toolkit": 2.0, "live coding": 1.5}
STRENGTH_OF_OUR_TONES = 0.5
CROWDING = 0.3  # how much less each sound counts where a source has many of a class
# Sources made from the same recordings are left out together.
KINDRED = {"musescore": "fonts", "fluid": "fonts"}


def weights(table: Table) -> Array:
    """How much each row counts: the more of a class a source has, the less each of them; likewise classes."""
    cells = np.char.add(np.char.add(table.sources, "/"), table.classes.astype(str))
    _, cell, counts = np.unique(cells, return_inverse=True, return_counts=True)
    strength = np.array([STRENGTHS.get(source, 1.0) for source in table.sources])
    ours = (table.sources == "synthesis") & (table.classes >= INDEX["bass"])
    strength[ours] = STRENGTH_OF_OUR_TONES
    each = strength / counts[cell] ** CROWDING
    totals = np.bincount(table.classes, each, len(CLASSES))
    return np.asarray(each / np.sqrt(totals[table.classes]), dtype=np.float32)


def trained(table: Table, settings: Settings, seeds: Iterable[int]) -> list[Network]:
    """A network for each seed."""
    rows = weights(table)
    return [train(table.features, table.classes, rows, len(CLASSES), replace(settings, seed=s)) for s in seeds]


def folds(table: Table) -> Iterator[tuple[str, npt.NDArray[np.bool_]]]:
    """What is left out together: a machine, a source, fonts made from the same recordings. Synthesis never is."""
    groups = np.array([KINDRED.get(source, source) for source in table.sources])
    groups = np.where(groups == "machines", np.char.add("machine ", table.kits), groups)
    for group in sorted(set(groups) - {"synthesis"}):
        yield str(group), groups == group


def _fold(task: tuple[str, Table, Table, Settings]) -> tuple[str, Answers]:
    name, rest, left, settings = task
    networks = trained(rest, settings, [settings.seed])
    return name, Answers.of(likelihoods(networks, left.features), left.classes)


def left_out(table: Table, settings: Settings, processes: int) -> dict[str, Answers]:
    """The answers about each fold of networks that were trained without it."""
    tasks = [(name, table.where(~mask), table.where(mask), settings) for name, mask in folds(table)]
    with ProcessPoolExecutor(processes) as pool:
        return dict(pool.map(_fold, tasks))
