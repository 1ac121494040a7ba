"""A small feed-forward network, trained by AdamW on one core so that a seed gives the same weights each time."""

import itertools
from dataclasses import dataclass, field

import numpy as np
import numpy.typing as npt

Array = npt.NDArray[np.float32]
CLIP = 4.0  # standard deviations that an input may stray


@dataclass(frozen=True)
class Settings:
    """How a network is trained."""

    hidden: tuple[int, ...] = (192, 96)
    epochs: int = 15
    batch: int = 256
    rate: float = 2e-3
    weight_decay: float = 0.02
    input_dropout: float = 0.15
    dropout: float = 0.3
    smoothing: float = 0.05
    mixing: float = 0.2
    seed: int = 1


@dataclass
class Network:
    """Inputs are standardised and clipped; layers have rectifiers between them; outputs are logits."""

    mean: Array
    scale: Array
    weights: list[Array] = field(default_factory=list)
    biases: list[Array] = field(default_factory=list)

    def inputs(self, features: Array) -> Array:
        """What the first layer is given."""
        return np.asarray(np.clip((features - self.mean) * self.scale, -CLIP, CLIP), dtype=np.float32)

    def logits(self, features: Array) -> Array:
        """A row of logits for each row of features."""
        x = self.inputs(features)
        for i, (w, b) in enumerate(zip(self.weights, self.biases, strict=True)):
            x = x @ w + b
            if i + 1 < len(self.weights):
                x = np.maximum(x, 0)
        return x


def softmax(logits: Array) -> Array:
    """Probabilities by row."""
    e = np.exp(logits - logits.max(axis=1, keepdims=True))
    return np.asarray(e / e.sum(axis=1, keepdims=True))


def _dropped(random: np.random.Generator, x: Array, share: float) -> Array:
    """Which values are kept, and how much louder."""
    return ((random.random(x.shape, dtype=np.float32) >= share) / np.float32(1 - share)).astype(np.float32)


class _Adam:
    def __init__(self, values: list[Array], weight_decay: float) -> None:
        self.values, self.decay, self.step = values, weight_decay, 0
        self.first = [np.zeros_like(v) for v in values]
        self.second = [np.zeros_like(v) for v in values]

    def update(self, gradients: list[Array], rate: float) -> None:
        self.step += 1
        b1, b2 = 1 - 0.9**self.step, 1 - 0.999**self.step
        for v, g, m, s in zip(self.values, gradients, self.first, self.second, strict=True):
            m += np.float32(0.1) * (g - m)
            s += np.float32(0.001) * (g * g - s)
            if v.ndim == 2:
                v *= np.float32(1 - rate * self.decay)
            v -= np.float32(rate) * (m / np.float32(b1)) / (np.sqrt(s / np.float32(b2)) + np.float32(1e-7))


def train(features: Array, targets: npt.NDArray[np.int64], weights: Array, count: int, settings: Settings) -> Network:
    """A network for `count` classes; `weights` say how much each row counts."""
    random = np.random.default_rng(settings.seed)
    scale = 1 / np.maximum(features.std(axis=0), 0.05)
    network = Network(features.mean(axis=0), scale.astype(np.float32))
    sizes = [features.shape[1], *settings.hidden, count]
    for a, b in itertools.pairwise(sizes):
        network.weights.append((random.standard_normal((a, b)) * np.sqrt(2 / a)).astype(np.float32))
        network.biases.append(np.zeros(b, np.float32))
    network.weights[-1] *= np.float32(0.1)
    adam = _Adam(network.weights + network.biases, settings.weight_decay)
    inputs = network.inputs(features)
    wanted = np.eye(count, dtype=np.float32)[targets] * (1 - settings.smoothing) + np.float32(
        settings.smoothing / count
    )
    steps = settings.epochs * (len(inputs) // settings.batch)
    share = weights / weights.sum()
    draws = np.cumsum(share)
    for step in range(steps):
        picked = np.minimum(np.searchsorted(draws, random.random(settings.batch)), len(inputs) - 1)
        mate = picked[random.permutation(settings.batch)]
        part = random.beta(settings.mixing, settings.mixing, (settings.batch, 1)).astype(np.float32)
        part = np.maximum(part, 1 - part)
        x = part * inputs[picked] + (1 - part) * inputs[mate]
        y = part * wanted[picked] + (1 - part) * wanted[mate]
        rate = settings.rate * min(1.0, (step + 1) / 200) * 0.5 * (1 + np.cos(np.pi * step / steps))
        adam.update(_gradients(network, x, y, settings, random), float(rate))
    return network


def _gradients(network: Network, x: Array, y: Array, settings: Settings, random: np.random.Generator) -> list[Array]:
    kept = _dropped(random, x, settings.input_dropout)
    values, masks = [x * kept], [kept]
    for i, (w, b) in enumerate(zip(network.weights, network.biases, strict=True)):
        out = np.asarray(values[-1] @ w + b, dtype=np.float32)
        if i + 1 < len(network.weights):
            mask = _dropped(random, out, settings.dropout) * (out > 0)
            masks.append(mask)
            values.append(out * mask)
        else:
            values.append(out)
    slope = (softmax(values[-1]) - y) / np.float32(len(x))
    weights: list[Array] = []
    biases: list[Array] = []
    for i in reversed(range(len(network.weights))):
        weights.insert(0, values[i].T @ slope)
        biases.insert(0, slope.sum(axis=0))
        if i > 0:
            slope = (slope @ network.weights[i].T) * masks[i]
    return weights + biases
