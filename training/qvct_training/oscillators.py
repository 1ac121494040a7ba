"""What pitched voices are made of."""

import numpy as np

from .dsp import (
    RATE,
    Random,
    Sound,
    ambience,
    attack,
    band,
    chance,
    decay,
    log_uniform,
    modes,
    phase,
    saw,
    sine,
    spread,
    square,
    swept_low_pass,
    times,
)


def hertz(random: Random, low: float, high: float) -> float:
    """The pitch of a key between two numbers of keys."""
    return float(440 * 2 ** ((np.round(random.uniform(low, high)) - 69) / 12))


def length(random: Random, low: float, high: float) -> Sound:
    return times(log_uniform(random, low, high))


def held(random: Random, t: Sound, rise: float, release: float) -> Sound:
    """Rises, is held with or without a fall, and is released before the end."""
    end = t[-1] - release if chance(random, 0.7) else t[-1] * 2
    level = random.uniform(0.4, 1) + (1 - random.uniform(0.4, 1)) * decay(t, log_uniform(random, 0.1, 1.5))
    fall = np.where(t > end, decay(np.maximum(t - end, 0), max(release, 0.01)), 1)
    return np.asarray(attack(t, rise) * level * fall)


def vibrato(random: Random, t: Sound, share: float, depth: float) -> Sound | float:
    if not chance(random, share):
        return 1.0
    later = np.minimum(1, t / random.uniform(0.1, 0.5))
    return 1 + random.uniform(0.2, 1) * depth * later * sine(random.uniform(4, 7) * t)


def oscillators(random: Random, t: Sound, pitch: Sound | float, most: int, detune: float) -> Sound:
    """Saws, pulses or triangles, one or several out of tune."""
    out = np.zeros_like(t)
    kind = random.choice(["saw", "square", "pulse", "triangle", "both"], p=[0.4, 0.2, 0.15, 0.1, 0.15])
    for _ in range(int(random.integers(1, most + 1))):
        f = np.broadcast_to(pitch * 2 ** random.normal(0, detune / 12), t.shape)
        turns = phase(f, len(t), random.random())
        if kind == "triangle":
            out += 2 * np.abs(2 * (turns % 1) - 1) - 1
        elif kind in ("square", "pulse"):
            out += square(turns, f / RATE, 0.5 if kind == "square" else random.uniform(0.1, 0.4))
        else:
            out += saw(turns, f / RATE)
        if kind == "both":
            out += square(phase(f / 2, len(t)), f / 2 / RATE)
    return out


def harmonics(random: Random, t: Sound, pitch: Sound | float, levels: Sound, falls: Sound | None = None) -> Sound:
    """A sum of harmonics with their levels and, perhaps, the seconds in which each dies away."""
    out = np.zeros_like(t)
    turns = phase(pitch, len(t))
    top = float(np.max(pitch))
    for h, level in enumerate(levels, start=1):
        if h * top > 0.45 * RATE:
            break
        wave = level * sine(h * turns + random.random())
        out += wave if falls is None else wave * decay(t, float(falls[h - 1]))
    return out


def filtered(random: Random, t: Sound, sound: Sound, pitch: float, seconds: float, least: float) -> Sound:
    """Through a low-pass that closes in `seconds`."""
    low = pitch * log_uniform(random, least, least * 6)
    top = low * log_uniform(random, 1, 20)
    return swept_low_pass(sound, low + (top - low) * decay(t, seconds), log_uniform(random, 0.6, 6))


def frequency_modulation(random: Random, t: Sound, pitch: Sound | float, depth: float, seconds: float) -> Sound:
    ratio = random.choice([0.5, 1, 1, 1, 2, 2, 3, 4, 5, 7])
    inner = depth * (0.1 + decay(t, seconds)) * sine(phase(pitch * ratio, len(t)))
    return sine(phase(pitch, len(t)) + inner / (2 * np.pi))


def struck_string(random: Random, t: Sound, pitch: float, stiffness: float, falls: float, place: float) -> Sound:
    count = int(min(40, 0.45 * RATE / pitch))
    n = np.arange(1, count + 1)
    f = pitch * n * np.sqrt(1 + stiffness * n**2)
    levels = np.abs(np.sin(np.pi * n * place)) / n ** random.uniform(0.5, 1.8)
    return modes(t, f, levels, falls / (1 + random.uniform(0.05, 0.5) * (n - 1)), random)


def body(random: Random, sound: Sound, low: float, high: float) -> Sound:
    """A box that resonates here and there."""
    out = sound
    for middle in spread(random, low, high, int(random.integers(1, 7))):
        out = out + random.uniform(0.2, 2) * band(sound, middle / 1.2, middle * 1.2)
    return out


def in_a_hall(random: Random, sound: Sound) -> Sound:
    """As players of these instruments are often recorded."""
    return ambience(random, sound) if chance(random, 0.3) else sound
