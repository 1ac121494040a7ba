"""Places sounds so that what sounds alike lies close together, and counts how well that goes.

A place has 64 coordinates. Most are the last hidden layer of a small network that tells classes, as a direction: sounds
of one class point the same way. The others are what differs most among the sounds of one class: brightness, pitch, how
long they ring.
"""

from concurrent.futures import ProcessPoolExecutor
from dataclasses import dataclass, replace

import numpy as np
import numpy.typing as npt

from .classes import CLASSES, FAMILIES, FAMILY_INDEX, FAMILY_OF_CLASS
from .dataset import Table, joined
from .model_file import rounded
from .network import Array, Network, Settings, train
from .training import folds, weights

Places = npt.NDArray[np.int8]
SIZE, HEARD = 64, 8
SETTINGS = Settings(hidden=(SIZE - HEARD, SIZE - HEARD), dropout=0.15)
DIRECTION = 300.0  # what a direction of length 1 becomes, so that few coordinates are cut off at 127
DIFFERENCE = 30.0  # of one standard deviation within a class
CELLS = 1024
NEIGHBOURS = 10

_FAMILY = np.array(FAMILY_OF_CLASS)
_IS_DRUM = np.array([family.is_drum for family in FAMILIES])


@dataclass
class Likeness:
    """The layers that make a direction, and the one that makes the other coordinates; as they are read back."""

    direction: Network
    differences: Network

    def places(self, features: Array) -> Places:
        """A row of coordinates for each row of features."""
        pointing = self.direction.logits(features)
        pointing *= DIRECTION / np.maximum(np.linalg.norm(pointing, axis=1, keepdims=True), 1e-9)
        both = np.hstack([pointing, self.differences.logits(features)])
        return np.clip(np.round(both), -127, 127).astype(np.int8)


def _differences(network: Network, table: Table, rows: Array) -> Network:
    """The first principal components of what is left of a sound's inputs without the mean of its class."""
    inputs = network.inputs(table.features).astype(np.float64)
    share = rows / rows.sum()
    for each in np.unique(table.classes):
        mask = table.classes == each
        inputs[mask] -= np.average(inputs[mask], axis=0, weights=share[mask])
    values, vectors = np.linalg.eigh((inputs.T * share) @ inputs)
    best = np.argsort(-values)[:HEARD]
    # The sign of an eigenvector is the solver's whim.
    signs = np.sign(vectors[np.abs(vectors[:, best]).argmax(axis=0), best])
    components = (vectors[:, best] * signs * (DIFFERENCE / np.sqrt(values[best]))).astype(np.float32)
    return Network(network.mean, network.scale, [components], [np.zeros(HEARD, np.float32)])


def fitted(table: Table, settings: Settings = SETTINGS) -> Likeness:
    """Trained on all rows of a table."""
    rows = weights(table)
    network = train(table.features, table.classes, rows, len(CLASSES), settings)
    layers = replace(network, weights=network.weights[:-1], biases=network.biases[:-1])
    return Likeness(rounded(layers), rounded(_differences(network, table, rows)))


def _squared(some: npt.NDArray[np.float32], others: npt.NDArray[np.float32]) -> npt.NDArray[np.float32]:
    return np.asarray((some**2).sum(1)[:, None] - 2 * some @ others.T + (others**2).sum(1)[None, :])


def centres(places: Places, count: int = CELLS, rounds: int = 12) -> Places:
    """The middles of cells with about equally many places that are close together: k-means from a fixed seed."""
    points = np.unique(places, axis=0).astype(np.float32)
    random = np.random.default_rng(1)
    middles = points[random.permutation(len(points))[:count]]
    for _ in range(rounds):
        nearest = np.concatenate([_squared(part, middles).argmin(axis=1) for part in np.array_split(points, 32)])
        counts = np.bincount(nearest, minlength=len(middles))
        sums = np.zeros_like(middles)
        np.add.at(sums, nearest, points)
        middles = np.where(counts[:, None] > 0, sums / np.maximum(counts, 1)[:, None], middles)
    return np.asarray(np.round(middles), dtype=np.int8)


@dataclass
class Library:
    """Sounds that are searched: their places, families, and the kit that each comes from."""

    places: Places
    families: npt.NDArray[np.int64]
    kits: npt.NDArray[np.str_]

    @staticmethod
    def of(likeness: Likeness, table: Table) -> "Library":
        """The sounds of a table."""
        kits = np.char.add(np.char.add(table.sources, "/"), table.kits)
        return Library(likeness.places(table.features), _FAMILY[table.classes], kits)

    def shares(self, asked: "Library", own_kit: bool) -> Array:
        """Of the ten nearest to each sound that is asked for, how many are of its family. Copies of the sound itself
        and, unless `own_kit`, all of its kit are passed over; nan where the library has less than ten of its family."""
        points = self.places.astype(np.float32)
        out = np.full(len(asked.places), np.nan, np.float32)
        for i, place in enumerate(asked.places.astype(np.float32)):
            apart = _squared(place[None, :], points)[0]
            there = apart > 0 if own_kit else self.kits != asked.kits[i]
            if np.count_nonzero(there & (self.families == asked.families[i])) >= NEIGHBOURS:
                nearest = np.argsort(np.where(there, apart, np.inf), kind="stable")[:NEIGHBOURS]
                out[i] = np.mean(self.families[nearest] == asked.families[i])
        return out


def figures_of(asked: Library, library: Library, own_kit: bool = False) -> dict[str, float | int]:
    """The mean share of the ten nearest that are of the right family; other percussion is not asked for."""
    shares = library.shares(asked, own_kit)
    out: dict[str, float | int] = {}
    drums = _IS_DRUM[asked.families] & (asked.families != FAMILY_INDEX["Other percussion"])
    for kind, mask in (("drums", drums), ("tones", ~_IS_DRUM[asked.families])):
        counted = shares[mask & np.isfinite(shares)]
        if len(counted):
            out |= {kind: len(counted), f"{kind} alike": round(float(counted.mean()), 3)}
    return out


def _fold(task: tuple[str, Table, npt.NDArray[np.bool_]]) -> tuple[str, dict[str, float | int]]:
    name, table, left = task
    likeness = fitted(table.where(~left))
    others = Library.of(likeness, table)
    asked = Library.of(likeness, table.where(left))
    if len(set(asked.kits)) > 1:  # of a source: nothing of it is found
        kits = np.where(left, name, others.kits)
        others, asked = replace(others, kits=kits), replace(asked, kits=np.full(len(asked.kits), name))
    return name, figures_of(asked, others)


def left_out(table: Table, processes: int) -> dict[str, dict[str, float | int]]:
    """For each fold: how well its sounds are placed among the others by a model that was fitted without it."""
    tasks = [(name, table, mask) for name, mask in folds(table)]
    with ProcessPoolExecutor(processes) as pool:
        return dict(pool.map(_fold, tasks))


def test_figures(
    likeness: Likeness, known: Table, unmet: dict[str, Table]
) -> dict[str, dict[str, dict[str, float | int]]]:
    """For each source that was not met: its sounds among all sources not met, and among all that there are."""
    among = Library.of(likeness, joined(list(unmet.values())))
    whole = Library.of(likeness, joined([known, *unmet.values()]))
    out = {}
    for name, table in unmet.items():
        asked = Library.of(likeness, table)
        out[name] = {
            "unmet, other kits": figures_of(asked, among),
            "all, other kits": figures_of(asked, whole),
            "all": figures_of(asked, whole, own_kit=True),
        }
    return out
