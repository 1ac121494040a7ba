"""Voices of synthesizers, with every parameter drawn by chance."""

from collections.abc import Callable

import numpy as np

from .dsp import (
    Random,
    Sound,
    ambience,
    attack,
    band,
    chance,
    decay,
    log_uniform,
    low_pass,
    modes,
    noise,
    phase,
    sine,
    swept_low_pass,
    times,
)
from .oscillators import filtered, frequency_modulation, harmonics, held, hertz, length, oscillators, vibrato


def bass(random: Random) -> Sound:
    t = length(random, 0.2, 2)
    pitch = hertz(random, 24, 50)
    kind = random.integers(5)
    if kind == 0:
        out = frequency_modulation(random, t, pitch, random.uniform(0.5, 6), log_uniform(random, 0.1, 1.5))
    elif kind == 1:  # a long kick with a pitch
        f = pitch * (1 + random.uniform(0, 2) * np.exp(-t / log_uniform(random, 0.005, 0.03)))
        out = np.tanh(log_uniform(random, 0.5, 6) * sine(phase(f, len(t))))
    elif kind == 2:  # a plucked string
        count = 24
        falls = np.float64(log_uniform(random, 0.8, 4)) / np.arange(1.0, count + 1) ** random.uniform(0.2, 0.9)
        levels = np.abs(np.sin(np.pi * np.arange(1, count + 1) * random.uniform(0.08, 0.4))) / np.arange(1, count + 1)
        out = harmonics(random, t, pitch, levels, falls)
        out += random.uniform(0, 0.1) * band(noise(random, len(t)), 500, 4000) * decay(t, 0.03)
    else:
        out = filtered(random, t, oscillators(random, t, pitch, 3, 0.1), pitch, log_uniform(random, 0.05, 1), 1.0)
    if chance(random, 0.4):
        out = out / (np.std(out) + 1e-9) + random.uniform(0.3, 1.5) * sine(phase(pitch, len(t)))
    envelope = held(random, t, log_uniform(random, 0.001, 0.03), 0.06)
    return out * (envelope if chance(random, 0.6) else decay(t, log_uniform(random, 0.4, 3)) * attack(t, 0.002))


def lead(random: Random) -> Sound:
    t = length(random, 0.25, 2)
    pitch = hertz(random, 48, 92)
    moving = pitch * vibrato(random, t, 0.5, 0.02)
    if chance(random, 0.25):
        moving = moving * (1 + (2 ** (random.uniform(-12, 5) / 12) - 1) * np.exp(-t / log_uniform(random, 0.01, 0.1)))
    kind = random.random()
    if kind < 0.15:
        out = frequency_modulation(random, t, moving, random.uniform(1, 6), log_uniform(random, 0.5, 4))
    elif kind < 0.3:  # nearly a sine, with breath
        out = harmonics(random, t, moving, np.exp(-np.arange(10) * random.uniform(0.5, 2.5)))
        breath = band(noise(random, len(t)), pitch, pitch * 6)
        out += log_uniform(random, 0.005, 0.3) * breath * (1 + random.uniform(0, 6) * decay(t, 0.1))
    else:
        out = oscillators(random, t, moving, 4, 0.15)
        if chance(random, 0.25):  # in fifths
            out += random.uniform(0.5, 1) * oscillators(random, t, moving * random.choice([1.5, 0.75]), 2, 0.1)
        if chance(random, 0.7):
            out = filtered(random, t, out, pitch, log_uniform(random, 0.1, 2), 2.0)
    if chance(random, 0.3):
        out = np.tanh(log_uniform(random, 1, 8) * out / (np.std(out) + 1e-9))
    out = low_pass(out, log_uniform(random, 3000, 20000))
    out *= held(random, t, log_uniform(random, 0.001, 0.06), log_uniform(random, 0.02, 0.3))
    return ambience(random, out) if chance(random, 0.2) else out


CHORDS = [[0, 4, 7], [0, 3, 7], [0, 7, 12], [0, 4, 7, 11], [0, 5, 7], [0, 12]]


def pad(random: Random) -> Sound:
    t = length(random, 0.8, 2.1)
    root = hertz(random, 40, 79)
    out = np.zeros_like(t)
    for step in CHORDS[int(random.integers(len(CHORDS)))] if chance(random, 0.35) else [0]:
        out += pad_note(random, t, root * 2 ** (step / 12))
    cutoff = root * log_uniform(random, 2, 16)
    sweep = cutoff * (1 + random.uniform(0, 2) * sine(random.uniform(0.1, 1) * t + random.random()) ** 2)
    out = swept_low_pass(out, sweep, log_uniform(random, 0.6, 3))
    if chance(random, 0.4):
        out += log_uniform(random, 0.01, 0.4) * np.std(out) * band(noise(random, len(t)), 500, 8000)
    if chance(random, 0.3):  # a bell at its beginning
        partials = root * random.choice([2, 3.5, 4, 5.2], 2)
        out += random.uniform(0.2, 1) * np.std(out) * modes(t, partials, 1, log_uniform(random, 0.4, 3), random)
    out *= attack(t, log_uniform(random, 0.01, 1.2)) * held(random, t, 0.05, log_uniform(random, 0.1, 0.5))
    return ambience(random, out) if chance(random, 0.4) else out


def pad_note(random: Random, t: Sound, pitch: float) -> Sound:
    kind = random.random()
    if kind < 0.2:
        levels = random.random(12) / np.arange(1, 13) ** random.uniform(0.5, 2)
        parts = [harmonics(random, t, pitch * 2 ** random.normal(0, 0.005), levels) for _ in range(3)]
        return np.asarray(sum(parts))
    if kind < 0.35:
        return frequency_modulation(random, t, pitch * vibrato(random, t, 0.5, 0.006), random.uniform(0.5, 5), 3)
    return oscillators(random, t, pitch * vibrato(random, t, 0.3, 0.006), 6, log_uniform(random, 0.02, 0.25))


def pluck(random: Random) -> Sound:
    seconds = log_uniform(random, 0.12, 1.2)
    t = times(seconds)
    pitch = hertz(random, 45, 92)
    if chance(random, 0.25):
        out = frequency_modulation(random, t, pitch, random.uniform(1, 6), seconds * random.uniform(0.1, 0.6))
    else:
        out = oscillators(random, t, pitch, 3, 0.12)
        out = filtered(random, t, out, pitch, seconds * random.uniform(0.2, 0.9), 1.2)
    return out * decay(t, seconds, random.uniform(0.7, 1.1)) * attack(t, log_uniform(random, 0.0005, 0.005))


VOICES: dict[str, Callable[[Random], Sound]] = {
    "bass": bass,
    "lead": lead,
    "pad": pad,
    "pluck": pluck,
}
