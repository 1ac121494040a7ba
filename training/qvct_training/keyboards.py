"""Voices of pianos, organs and other keyboards, with every parameter drawn by chance."""

from collections.abc import Callable

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
    high_pass,
    log_uniform,
    low_pass,
    noise,
    peaked,
    phase,
    sine,
    square,
)
from .oscillators import body, frequency_modulation, harmonics, held, hertz, in_a_hall, length, struck_string, vibrato


def piano(random: Random) -> Sound:
    t = length(random, 0.5, 2)
    pitch = hertz(random, 30, 96)
    fall = random.uniform(2, 12) * (220 / pitch) ** 0.5
    out = np.zeros_like(t)
    for _ in range(int(random.integers(1, 4))):
        out += struck_string(
            random,
            t,
            pitch * 2 ** random.normal(0, 0.001),
            log_uniform(random, 5e-5, 1e-3),
            fall,
            random.uniform(0.08, 0.15),
        )
    thud = low_pass(noise(random, len(t)), random.uniform(300, 2000)) * decay(t, random.uniform(0.03, 0.15))
    out = out / (np.max(np.abs(out)) + 1e-9) + random.uniform(0, 0.15) * thud
    return np.asarray(out * attack(t, random.uniform(0.0005, 0.004)))


def keyboard(random: Random) -> Sound:
    return [harpsichord, clavinet, accordion][int(random.integers(3))](random)


def harpsichord(random: Random) -> Sound:
    """Strings plucked near their end, one or two sets."""
    t = length(random, 0.4, 2)
    pitch = hertz(random, 36, 88)
    out = np.zeros_like(t)
    fall = random.uniform(1, 6) * (220 / pitch) ** 0.4
    for octave in [1, 1, 2][: int(random.integers(1, 4))]:
        tuned = octave * pitch * 2 ** random.normal(0, 0.001)
        out += struck_string(random, t, tuned, log_uniform(random, 1e-6, 1e-4), fall, random.uniform(0.03, 0.15))
    out = high_pass(out, log_uniform(random, 60, 400), 1)
    quill = band(noise(random, len(t)), 2000, 12000) * decay(t, log_uniform(random, 0.005, 0.03))
    return released(random, t, peaked(out) + random.uniform(0, 0.2) * quill, 0.05)


def clavinet(random: Random) -> Sound:
    """Short strings under pickups that cancel some harmonics."""
    t = length(random, 0.25, 1.8)
    pitch = hertz(random, 36, 84)
    fall = random.uniform(0.6, 4) * (220 / pitch) ** 0.4
    out = struck_string(random, t, pitch, log_uniform(random, 1e-6, 2e-4), fall, random.uniform(0.05, 0.3))
    shift = int(RATE / pitch * random.uniform(0.05, 0.4))
    out[shift:] -= random.uniform(0.3, 1) * out[: len(out) - shift]
    if chance(random, 0.3):
        out = np.tanh(random.uniform(1, 4) * peaked(out))
    return released(random, t, out, 0.03)


def accordion(random: Random) -> Sound:
    """Free reeds, two or three of them a little out of tune."""
    t = length(random, 0.3, 2)
    pitch = hertz(random, 44, 86)
    out = np.zeros_like(t)
    apart = log_uniform(random, 0.0003, 0.012)
    for octave in random.choice([0.5, 1, 1, 1, 2], int(random.integers(1, 4))):
        f = octave * pitch * (1 + apart * random.normal())
        out += square(phase(f, len(t), random.random()), f / RATE, random.uniform(0.08, 0.5))
    out = low_pass(body(random, out, 400, 4000), log_uniform(random, 2500, 10000))
    return in_a_hall(random, out * held(random, t, log_uniform(random, 0.01, 0.12), random.uniform(0.03, 0.1)))


def organ(random: Random) -> Sound:
    return pipe_organ(random) if chance(random, 0.3) else drawbar_organ(random)


def drawbar_organ(random: Random) -> Sound:
    t = length(random, 0.3, 2)
    pitch = hertz(random, 36, 90)
    drawbars = np.zeros(17)
    for level, at in zip(random.integers(0, 9, 9) / 8, [1, 3, 2, 4, 6, 8, 10, 12, 16], strict=True):
        drawbars[at] = level
    out = harmonics(random, t, pitch / 2 * vibrato(random, t, 0.5, 0.008), drawbars[1:])
    if chance(random, 0.35):  # percussion
        high = sine(phase(pitch * random.choice([2, 3]), len(t))) * decay(t, random.uniform(0.2, 0.8))
        out += random.uniform(0.2, 1.5) * high
    if chance(random, 0.4):
        out *= 1 + random.uniform(0.05, 0.4) * sine(random.uniform(0.7, 7) * t)
    if chance(random, 0.3):
        out = np.tanh(log_uniform(random, 0.7, 5) * peaked(out))
    out += 0.3 * random.random() * band(noise(random, len(t)), 1000, 6000) * decay(t, 0.01)
    end = np.minimum(1, (t[-1] - t) / 0.02)
    return np.asarray(out * attack(t, log_uniform(random, 0.002, 0.05)) * end)


def pipe_organ(random: Random) -> Sound:
    """Ranks of pipes at several octaves, each speaking in its own time; or free reeds."""
    t = length(random, 0.5, 2)
    pitch = hertz(random, 36, 88)
    out = np.zeros_like(t)
    for foot in random.choice([0.5, 1, 1, 2, 3, 4, 6, 8], int(random.integers(1, 8))):
        levels = np.exp(-np.arange(12) * log_uniform(random, 0.2, 2.5)) * random.uniform(0.3, 1, 12)
        rank = harmonics(random, t, foot * pitch * (1 + random.normal(0, 0.001)), levels)
        out += rank * attack(t, log_uniform(random, 0.01, 0.2)) * random.uniform(0.2, 1) / foot**0.5
    breath = band(noise(random, len(t)), pitch, pitch * 8)
    out += random.uniform(0, 0.05) * np.std(out) * breath * (1 + 10 * decay(t, 0.1))
    out *= np.minimum(1, (t[-1] - t) / 0.05)
    return ambience(random, out) if chance(random, 0.6) else out


def electric_piano(random: Random) -> Sound:
    t = length(random, 0.5, 2)
    pitch = hertz(random, 36, 88)
    fall = log_uniform(random, 1.5, 7) * (440 / pitch) ** 0.3
    out = frequency_modulation(random, t, pitch, random.uniform(0.2, 2.5), fall * random.uniform(0.2, 0.8)) * decay(
        t, fall
    )
    out += (
        random.uniform(0.02, 0.4)
        * sine(phase(min(pitch * random.choice([7, 10, 14]), 15000), len(t)))
        * decay(t, log_uniform(random, 0.08, 0.8))
    )
    if chance(random, 0.3):
        out = np.tanh(random.uniform(1, 4) * (out + random.uniform(0, 0.3)))
    if chance(random, 0.3):
        out *= 1 + random.uniform(0.1, 0.5) * sine(random.uniform(3, 7) * t)
    return out * attack(t, 0.002)


def released(random: Random, t: Sound, sound: Sound, seconds: float) -> Sound:
    """Damped before the end now and then."""
    end = t[-1] * random.uniform(0.4, 2)
    damping = np.where(t > end, decay(np.maximum(t - end, 0), seconds * random.uniform(1, 5)), 1)
    return np.asarray(damping * sound * attack(t, 5e-4))


VOICES: dict[str, Callable[[Random], Sound]] = {
    "piano": piano,
    "organ": organ,
    "electric piano": electric_piano,
    "keyboard": keyboard,
}
