"""Voices of hi-hats and cymbals, of machines and of metal, with every parameter drawn by chance."""

import itertools
from collections.abc import Callable

import numpy as np

from .drums import click
from .dsp import (
    RATE,
    Random,
    Sound,
    attack,
    band,
    chance,
    decay,
    faded,
    high_pass,
    log_uniform,
    modes,
    noise,
    peaked,
    phase,
    resonance,
    sine,
    spread,
    square,
    times,
)


def metal(random: Random, t: Sound) -> Sound:
    """Unpitched metal: squares out of tune, noise, ring or frequency modulation."""
    kind = random.integers(5)
    scale = log_uniform(random, 0.6, 2.2)
    if kind == 0:
        pitches = np.array([205.3, 304.4, 369.6, 522.7, 540.0, 800.0]) * scale
        return sum((square(phase(f, len(t), random.random()), f / RATE) for f in pitches), np.zeros_like(t))
    if kind == 1:
        return noise(random, len(t))
    if kind == 2:
        f = random.uniform(300, 1500, int(random.integers(4, 10))) * scale
        return sum((square(phase(each, len(t), random.random()), each / RATE) for each in f), np.zeros_like(t))
    if kind == 3:
        carrier, ratio = log_uniform(random, 1000, 6000), random.uniform(1.2, 3.7)
        depth = random.uniform(1, 9)
        inner = depth * sine(
            phase(carrier * ratio, len(t)) + random.uniform(0, 0.5) * sine(phase(carrier * 0.37, len(t)))
        )
        return sine(phase(carrier, len(t)) + inner / 6)
    count = int(random.integers(30, 90))
    f = np.exp(random.uniform(np.log(300), np.log(16000), count))
    wave = modes(t, f, random.uniform(0.1, 1, count), random.uniform(0.3, 3, count), random)
    return wave + random.uniform(0, 3) * noise(random, len(t))


def bright(random: Random, sound: Sound, low: float, high: float) -> Sound:
    """The high part of metal."""
    cut = log_uniform(random, low, high)
    out = high_pass(sound, cut, int(random.integers(1, 4)))
    if chance(random, 0.4):
        out = band(out, cut, min(20000.0, cut * random.uniform(1.3, 3)))
    return out / (np.std(out) + 1e-9)


def wash(random: Random, t: Sound, seconds: float) -> Sound:
    """Metal whose modes are too dense to be told apart: bands of noise, the high ones dying away sooner or later."""
    edges = 250 * 2 ** np.arange(0, 6.51, 0.8125)
    bend, tilt = random.uniform(-0.6, 0.9), random.uniform(-0.3, 1.0)
    out = np.zeros_like(t)
    for low, high in itertools.pairwise(edges):
        own = band(noise(random, len(t)), low, high, 2) * random.uniform(0.3, 1)
        out += own * (low / 250) ** tilt * decay(t, seconds * (low / 1000) ** -bend, random.uniform(0.6, 1))
    return out / (np.std(out) + 1e-9)


def ringing(random: Random, t: Sound) -> Sound:
    """Noise or metal through one or two tuned circuits, as in the first machines."""
    out = noise(random, len(t)) if chance(random, 0.6) else metal(random, t)
    f = log_uniform(random, 2800, 11000)
    for _ in range(int(random.integers(1, 3))):
        out = resonance(out, f * random.uniform(0.85, 1.2), log_uniform(random, 0.8, 8))
    if chance(random, 0.6):
        out = high_pass(out, f * random.uniform(0.3, 1.2), int(random.integers(1, 3)))
    return out / (np.std(out) + 1e-9)


def machine_attack(random: Random, t: Sound) -> Sound:
    """At once, or as slowly as a capacitor is charged."""
    return attack(t, log_uniform(random, 0.001, 0.03)) if chance(random, 0.4) else np.ones_like(t)


def hat(random: Random, t: Sound, seconds: float) -> Sound:
    if chance(random, 0.4):  # recorded: the body of the cymbals is heard, and the stick
        out = high_pass(wash(random, t, seconds), log_uniform(random, 150, 6000), int(random.integers(1, 3)))
        body = band(noise(random, len(t)), log_uniform(random, 200, 800), log_uniform(random, 1000, 4000))
        return out + log_uniform(random, 0.02, 0.6) * peaked(body * decay(t, log_uniform(random, 0.02, 0.2)))
    source = ringing(random, t) if chance(random, 0.35) else bright(random, metal(random, t), 2000, 9500)
    return source * faded(random, t, seconds) * machine_attack(random, t)


def closed_hat(random: Random) -> Sound:
    seconds = log_uniform(random, 0.02, 0.25)
    out = hat(random, t := times(max(0.05, seconds)), seconds)
    if chance(random, 0.15):  # by the pedal
        out *= attack(t, random.uniform(0.003, 0.015))
    return peaked(out) + 0.3 * random.random() * click(random, t)


def open_hat(random: Random) -> Sound:
    seconds = log_uniform(random, 0.25, 1.8)
    out = hat(random, t := times(seconds * random.uniform(0.5, 1)), seconds)
    return peaked(out) + 0.3 * random.random() * click(random, t)


def crash(random: Random) -> Sound:
    seconds = log_uniform(random, 0.9, 5)
    t = times(min(2.2, seconds * random.uniform(0.4, 1)))
    if chance(random, 0.4):
        return wash(random, t, seconds) * attack(t, log_uniform(random, 0.0005, 0.03))
    source = metal(random, t)
    out = bright(random, source, 250, 4000) * decay(t, seconds, random.uniform(0.5, 1))
    out += random.uniform(0, 1.5) * bright(random, source, 3000, 8000) * decay(t, seconds * random.uniform(0.15, 0.8))
    out += random.uniform(0, 1) * band(noise(random, len(t)), 300, 9000) * decay(t, random.uniform(0.1, 0.6))
    return out * attack(t, log_uniform(random, 0.0005, 0.02))


def ride(random: Random) -> Sound:
    seconds = log_uniform(random, 0.6, 5)
    t = times(min(2.2, seconds * random.uniform(0.4, 1)))
    f = spread(random, 350, 9000, int(random.integers(6, 40)))
    ping = modes(t, f, random.uniform(0.1, 1, len(f)), random.uniform(0.1, 1, len(f)) * seconds, random)
    if chance(random, 0.3):  # the bell
        count = int(random.integers(3, 7))
        ping += 3 * modes(t, random.uniform(500, 4500, count), random.uniform(0.3, 1, count), seconds, random)
    stick = bright(random, noise(random, len(t)), 2000, 7000) * decay(t, log_uniform(random, 0.02, 0.15))
    if chance(random, 0.5):
        long = wash(random, t, seconds)
    else:
        long = bright(random, metal(random, t), 1500, 7000) * decay(t, seconds)
    ping /= np.std(ping) + 1e-9
    return ping * random.uniform(0.1, 1.2) + stick * random.uniform(0, 1.5) + long * log_uniform(random, 0.03, 1)


def cymbal(random: Random) -> Sound:
    """Splashes, Chinese cymbals, and the thin ones of machines."""
    seconds = log_uniform(random, 0.35, 3)
    t = times(min(2.2, seconds))
    if chance(random, 0.4):
        return wash(random, t, seconds) * attack(t, log_uniform(random, 0.0005, 0.02))
    source = metal(random, t)
    if chance(random, 0.3):
        return ringing(random, t) * faded(random, t, seconds) * machine_attack(random, t)
    out = bright(random, source, 500, 5000) * decay(t, seconds, random.uniform(0.5, 1.1))
    return out + random.uniform(0, 1) * bright(random, source, 5000, 9000) * decay(t, seconds * random.uniform(0.3, 1))


VOICES: dict[str, Callable[[Random], Sound]] = {
    "closed hat": closed_hat,
    "open hat": open_hat,
    "crash": crash,
    "ride": ride,
    "cymbal": cymbal,
}
