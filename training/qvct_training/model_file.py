"""Writes the model as docs/formats/instrument-model.md says."""

import struct
from collections.abc import Sequence

import numpy as np

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


def model_bytes(version: int, networks: Sequence[Network], calibration: Sequence[tuple[float, float]]) -> bytes:
    """The file; the networks share the mean and scale of the first."""
    out = b"QVIM" + struct.pack("<III", FORMAT, version, len(networks[0].mean))
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
        for weights, biases in zip(network.weights, network.biases, strict=True):
            scales, whole = quantised(weights)
            out += struct.pack("<I", len(biases)) + _reals(scales) + _reals(biases) + whole.tobytes()
    return out
