"""What networks say together, how right it is, and how sure they may be."""

from collections.abc import Sequence
from dataclasses import dataclass

import numpy as np
import numpy.typing as npt

from .classes import FAMILIES, FAMILY_INDEX, FAMILY_OF_CLASS
from .network import Array, Network, softmax

_FAMILY = np.array(FAMILY_OF_CLASS)
_IS_DRUM = np.array([family.is_drum for family in FAMILIES])
SUREST = 0.8


def likelihoods(networks: Sequence[Network], features: Array) -> Array:
    """The mean of the networks' answers."""
    return np.asarray(np.mean([softmax(network.logits(features)) for network in networks], axis=0))


def by_family(classes: Array) -> Array:
    """Likelihoods of classes, summed by family."""
    out = np.zeros((len(classes), len(FAMILIES)), np.float32)
    np.add.at(out.T, _FAMILY, classes.T)
    return out


@dataclass
class Answers:
    """For each sound: the family said, how likely it is, and the family that is right."""

    said: npt.NDArray[np.int64]
    sure: Array
    wanted: npt.NDArray[np.int64]

    @staticmethod
    def of(classes: Array, targets: npt.NDArray[np.int64]) -> "Answers":
        """What likelihoods of classes say, beside the right classes."""
        families = by_family(classes)
        return Answers(families.argmax(axis=1), families.max(axis=1), _FAMILY[targets])

    @property
    def right(self) -> npt.NDArray[np.bool_]:
        """Which answers are right."""
        return np.asarray(self.said == self.wanted)

    def where(self, mask: npt.NDArray[np.bool_]) -> "Answers":
        """Some of the answers."""
        return Answers(self.said[mask], self.sure[mask], self.wanted[mask])

    def drums(self) -> "Answers":
        """Those about the drums that have a family of their own."""
        return self.where(_IS_DRUM[self.wanted] & (self.wanted != FAMILY_INDEX["Other percussion"]))

    def tones(self) -> "Answers":
        """Those about pitched sounds and effects."""
        return self.where(~_IS_DRUM[self.wanted])

    def joined(self, other: "Answers") -> "Answers":
        """These and those."""
        return Answers(
            np.concatenate([self.said, other.said]),
            np.concatenate([self.sure, other.sure]),
            np.concatenate([self.wanted, other.wanted]),
        )

    def share_right(self) -> float:
        """Of all of them."""
        return float(self.right.mean()) if len(self.said) else float("nan")

    def share_right_of_surest(self) -> float:
        """Of the surest four fifths."""
        order = np.argsort(-self.sure, kind="stable")[: round(SUREST * len(self.sure))]
        return float(self.right[order].mean()) if len(order) else float("nan")


def calibration(answers: Answers, most: int = 12) -> list[tuple[float, float]]:
    """How often answers of each likelihood are right: ascending points, by pooling neighbours that fall."""
    order = np.argsort(answers.sure, kind="stable")
    sure, right = answers.sure[order].astype(float), answers.right[order].astype(float)
    groups = [
        (s.mean(), r.mean(), len(r))
        for s, r in zip(np.array_split(sure, most), np.array_split(right, most), strict=True)
    ]
    pooled: list[tuple[float, float, int]] = []
    for group in groups:
        pooled.append(group)
        while len(pooled) > 1 and pooled[-2][1] >= pooled[-1][1]:
            (s1, r1, n1), (s2, r2, n2) = pooled[-2:]
            n = n1 + n2
            pooled[-2:] = [((s1 * n1 + s2 * n2) / n, (r1 * n1 + r2 * n2) / n, n)]
    return [(float(s), float(r)) for s, r, _ in pooled]


def calibrated(sure: Array, points: Sequence[tuple[float, float]]) -> Array:
    """Straight lines between the points, level beyond them."""
    raw, true = zip(*points, strict=True)
    return np.asarray(np.interp(sure, raw, true), dtype=np.float32)


def reliability(answers: Answers, bins: int = 10) -> list[tuple[float, float, int]]:
    """For each tenth of confidence: the mean confidence, the share that is right, and how many there are."""
    at = np.minimum((answers.sure * bins).astype(int), bins - 1)
    rows = [(answers.sure[at == b], answers.right[at == b]) for b in range(bins)]
    return [(float(s.mean()), float(r.mean()), len(s)) for s, r in rows if len(s)]
