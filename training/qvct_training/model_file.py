"""Writes the models as docs/formats/instrument-model.md and likeness-model.md say."""

import struct
from collections.abc import Sequence

import numpy as np
import numpy.typing as npt

from .classes import CLASSES, FAMILIES, FAMILY_OF_CLASS
from .network import Array, Network

FORMAT = 1


def _text(words: str) -> bytes:
    data = words.encode()
    return bytes([len(data)]) + data


def _reals(values: Array) -> bytes:
    return np.asarray(values, dtype="<f4").tobytes()


def quantised(weights: Array) -> tuple[Array, np.ndarray]:
    """A scale for each output, and whole numbers from -127 to 127."""
    scales = np.maximum(np.abs(weights).max(axis=0), 1e-9).astype(np.float32) / np.float32(127)
    return scales, np.clip(np.round(weights / scales), -127, 127).astype(np.int8)


def rounded(network: Network) -> Network:
    """The network as it will be read back."""
    weights = [scales * whole.astype(np.float32) for scales, whole in map(quantised, network.weights)]
    return Network(network.mean, network.scale, weights, network.biases)


def _head(magic: bytes, version: int, network: Network) -> bytes:
    return magic + struct.pack("<III", FORMAT, version, len(network.mean))


def _layer(weights: Array, biases: Array) -> bytes:
    scales, whole = quantised(weights)
    return struct.pack("<I", len(biases)) + _reals(scales) + _reals(biases) + whole.tobytes()


def model_bytes(version: int, networks: Sequence[Network], calibration: Sequence[tuple[float, float]]) -> bytes:
    """The file; the networks share the mean and scale of the first."""
    out = _head(b"QVIM", version, networks[0])
    out += struct.pack("<I", len(FAMILIES)) + b"".join(_text(family.label) for family in FAMILIES)
    out += struct.pack("<I", len(CLASSES))
    for each, family in zip(CLASSES, FAMILY_OF_CLASS, strict=True):
        out += _text(each.label) + _text(each.detail) + bytes([family])
    out += struct.pack("<I", len(calibration))
    out += b"".join(struct.pack("<ff", *point) for point in calibration)
    out += _reals(networks[0].mean) + _reals(networks[0].scale)
    out += struct.pack("<I", len(networks))
    for network in networks:
        out += struct.pack("<I", len(network.weights))
        out += b"".join(map(_layer, network.weights, network.biases))
    return out


def likeness_bytes(
    version: int, direction: Network, reach: float, differences: Network, centres: npt.NDArray[np.int8]
) -> bytes:
    """The file; the last layer's weights and biases are as they make coordinates."""
    out = _head(b"QVLM", version, direction) + _reals(direction.mean) + _reals(direction.scale)
    out += b"".join(map(_layer, direction.weights, direction.biases)) + struct.pack("<f", reach)
    out += _layer(differences.weights[0], differences.biases[0])
    return out + struct.pack("<I", len(centres)) + centres.tobytes()
