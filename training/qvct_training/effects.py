"""Sound effects, with every parameter drawn by chance."""

from collections.abc import Callable

import numpy as np
from scipy import signal

from .dsp import (
    RATE,
    Random,
    Sound,
    ambience,
    band,
    chance,
    decay,
    high_pass,
    log_uniform,
    low_pass,
    modes,
    noise,
    peaked,
    phase,
    saw,
    sine,
    spread,
    square,
    swept_low_pass,
)
from .oscillators import length


def moving(random: Random, t: Sound) -> tuple[Sound, Sound]:
    """A frequency that wanders, and a level that does."""
    points = np.log(spread(random, 60, 9000, 4))
    return (
        np.exp(np.interp(t, np.linspace(0, t[-1], 4), points)),
        np.interp(t, np.linspace(0, t[-1], 5), random.uniform(0, 1, 5)),
    )


def swept_noise(random: Random, t: Sound) -> Sound:
    sweep, level = moving(random, t)
    return swept_low_pass(noise(random, len(t)), sweep, log_uniform(random, 1, 10)) * level


def zap(random: Random, t: Sound) -> Sound:
    t = t[: int(random.uniform(0.2, 1) * len(t))]
    f = log_uniform(random, 1500, 9000) * np.exp(-t / log_uniform(random, 0.03, 0.3)) + log_uniform(random, 40, 400)
    return square(phase(f, len(t)), f / RATE) * decay(t, t[-1])


def siren(random: Random, t: Sound) -> Sound:
    sweep, level = moving(random, t)
    sweep = sweep * (1 + 0.2 * random.random() * sine(log_uniform(random, 1, 30) * t))
    turns = phase(sweep, len(t))
    return (saw(turns, sweep / RATE) if chance(random, 0.5) else sine(turns)) * level


def explosion(random: Random, t: Sound) -> Sound:
    """Also of guns, with a crack before it."""
    out = low_pass(noise(random, len(t)), log_uniform(random, 200, 5000)) * decay(t, log_uniform(random, 0.5, 4), 0.7)
    crack = high_pass(noise(random, len(t)), 500) * decay(t, log_uniform(random, 0.01, 0.1))
    return peaked(out) + random.uniform(0, 1) * peaked(crack)


def steps(random: Random, t: Sound) -> Sound:
    f = np.repeat(spread(random, 80, 6000, 80), int(log_uniform(random, 500, 6000)))
    f = np.resize(f, len(t))
    return square(phase(f, len(t)), f / RATE) * moving(random, t)[1]


def crackle(random: Random, t: Sound) -> Sound:
    grains = (random.random(len(t)) < log_uniform(random, 1e-4, 1e-2)) * noise(random, len(t))
    out = band(grains, log_uniform(random, 100, 2000), log_uniform(random, 2500, 16000))
    return out + random.uniform(0, 0.02) * noise(random, len(t))


def backwards(random: Random, t: Sound) -> Sound:
    """A cymbal, a noise or a chord, played from its end."""
    out = high_pass(noise(random, len(t)), log_uniform(random, 100, 4000))
    if chance(random, 0.5):
        out = 0.2 * out + modes(t, spread(random, 100, 9000, 20), 1, t[-1], random)
    return (out * decay(t, t[-1] * random.uniform(0.5, 2)))[::-1].copy()


def weather(random: Random, t: Sound) -> Sound:
    """Wind and waves."""
    middle = log_uniform(random, 200, 3000) * 2 ** (random.uniform(0, 1.5) * sine(random.uniform(0.1, 0.8) * t))
    out = swept_low_pass(noise(random, len(t)), middle, log_uniform(random, 0.6, 12))
    return (out + random.uniform(0, 0.2) * noise(random, len(t))) * moving(random, t)[1]


def chirps(random: Random, t: Sound) -> Sound:
    """Birds and telephones: short tones again and again, sliding or trilled."""
    turn = (random.uniform(3, 25) * t) % 1
    f = log_uniform(random, 900, 5000) * 2 ** (random.uniform(-1, 1) * turn)
    if chance(random, 0.4):
        f = f * np.where((random.uniform(10, 40) * t) % 1 < 0.5, 1, random.uniform(1.1, 1.5))
    return sine(phase(f, len(t))) * (turn < random.uniform(0.2, 1)) * np.sin(np.pi * turn) ** random.uniform(0.1, 1)


def engine(random: Random, t: Sound) -> Sound:
    """Rotors and motors: pulses of low noise."""
    turn = phase(log_uniform(random, 5, 60) * (1 + random.uniform(-0.3, 0.3) * t / t[-1]), len(t)) % 1
    out = band(noise(random, len(t)), log_uniform(random, 40, 300), log_uniform(random, 500, 5000))
    return out * (0.05 + np.exp(-turn * random.uniform(1, 10)))


def applause(random: Random, t: Sound) -> Sound:
    out = np.zeros_like(t)
    for _ in range(int(random.integers(3, 8))):
        hits = (random.random(len(t)) < log_uniform(random, 5, 150) / RATE).astype(float)
        middle = log_uniform(random, 800, 2500)
        clap = band(noise(random, RATE // 10), middle / 1.4, middle * 1.4) * decay(np.arange(RATE // 10) / RATE, 0.04)
        out += signal.fftconvolve(hits, clap)[: len(t)]
    return out + 1e-3 * noise(random, len(t))


KINDS = [swept_noise, zap, siren, explosion, steps, crackle, backwards, weather, chirps, engine, applause]


def effects(random: Random) -> Sound:
    out = KINDS[int(random.integers(len(KINDS)))](random, length(random, 0.5, 2.1))
    return ambience(random, out) if chance(random, 0.25) else out


VOICES: dict[str, Callable[[Random], Sound]] = {
    "effects": effects,
}
