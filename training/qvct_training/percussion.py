"""Voices of hand drums, blocks, bells and shaken things, with every parameter drawn by chance."""

from collections.abc import Callable

import numpy as np

from .drums import SKIN, drive
from .dsp import (
    RATE,
    Random,
    Sound,
    ambience,
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
    struck,
    times,
)


def in_a_room(random: Random, sound: Sound) -> Sound:
    """Mostly where it was recorded, too: what is struck dies away quickly, its room slowly."""
    return ambience(random, sound) if chance(random, 0.65) else sound


def knock(random: Random, t: Sound) -> Sound:
    """What there is beside the modes that are told apart: a broad noise, soon over, from hardly any to much."""
    low = log_uniform(random, 200, 2000)
    burst = band(noise(random, len(t)), low, log_uniform(random, max(2500, 2 * low), 14000))
    return log_uniform(random, 0.02, 1.2) * peaked(burst * decay(t, log_uniform(random, 0.005, 0.25)))


def slap(random: Random) -> Sound:
    """A hand that stays on the skin: the high modes alone, and soon over."""
    t = times(log_uniform(random, 0.05, 0.3))
    low = log_uniform(random, 550, 1400)
    out = struck(random, t, low * random.uniform(1, 4, 5), log_uniform(random, 0.03, 0.2), 4000)
    out += struck(random, t, [low], log_uniform(random, 0.04, 0.25), 4000)
    out += random.uniform(0, 0.4) * sine(phase(log_uniform(random, 140, 400), len(t))) * decay(t, t[-1])
    return in_a_room(random, out + knock(random, t))


def conga(random: Random, small: bool = False) -> Sound:
    if chance(random, 0.2):
        return slap(random)
    seconds = log_uniform(random, 0.05, 0.4 if small else 0.8)
    t = times(seconds)
    pitch = log_uniform(random, 250, 720) if small else log_uniform(random, 115, 480)
    f = pitch * (1 + random.choice([0, 0.05, 0.2]) * random.random() * np.exp(-t / log_uniform(random, 0.005, 0.05)))
    body = sine(phase(f, len(t), random.choice([0.0, 0.25]))) * decay(t, seconds, random.uniform(0.8, 1.2))
    if chance(random, 0.7):
        ratios = random.choice(np.stack([np.arange(3, 7) / 2, SKIN[1:5]])) * random.uniform(0.95, 1.08)
        body += modes(t, pitch * ratios, random.uniform(0.02, 0.7, 4), seconds * random.uniform(0.1, 0.8, 4), random)
    if chance(random, 0.3):  # a circuit that rings, and the pulse that makes it ring
        pulse = band(noise(random, len(t)), 600, 4000) * decay(t, log_uniform(random, 0.003, 0.02))
        return np.asarray(body + random.choice([0.0, 0.3, 1.0]) * random.random() * peaked(pulse))
    body = peaked(body) + knock(random, t)
    return in_a_room(random, body * attack(t, log_uniform(random, 0.0003, 0.003)))


def bongo(random: Random) -> Sound:
    return conga(random, small=True)


def cowbell(random: Random) -> Sound:
    seconds = log_uniform(random, 0.04, 0.7)
    t = times(max(0.05, seconds))
    low = log_uniform(random, 380, 1100)
    high = low * random.uniform(1.3, 1.75)
    second = random.uniform(0.05, 1.2)
    if chance(random, 0.45):
        out = square(phase(low, len(t)), low / RATE) + second * square(phase(high, len(t)), high / RATE)
        out = band(out, low * random.uniform(0.6, 1.1), low * log_uniform(random, 1.5, 7))
        out *= random.uniform(0, 1) * decay(t, random.uniform(0.015, 0.06)) + faded(random, t, seconds)
    else:
        seconds = max(seconds, random.uniform(0.1, 0.3))
        t = times(seconds)
        f = np.concatenate([[low, high], spread(random, low * 1.8, 14000, int(random.integers(3, 16)))])
        out = struck(random, t, f, seconds, log_uniform(random, 1000, 9000))
        out += second * sine(phase(high, len(t))) * decay(t, seconds * random.uniform(0.3, 1))
        out = peaked(out) + knock(random, t)
    return in_a_room(random, drive(random, out))


def clave(random: Random) -> Sound:
    seconds = log_uniform(random, 0.02, 0.3)
    t = times(max(0.04, seconds))
    f = log_uniform(random, 1400, 3600)
    out = sine(phase(f, len(t), random.random())) * decay(t, seconds)
    if chance(random, 0.6):
        out += log_uniform(random, 0.03, 0.6) * struck(
            random, t, f * random.uniform(0.4, 4, 4), seconds * random.uniform(0.2, 0.8), 6000
        )
    return in_a_room(random, peaked(out) + knock(random, t))


def woodblock(random: Random) -> Sound:
    seconds = log_uniform(random, 0.025, 0.35)
    t = times(max(0.05, seconds))
    f = log_uniform(random, 560, 1800)
    out = sine(phase(f * (1 + random.uniform(0, 0.2) * np.exp(-t / 0.003)), len(t))) * decay(t, seconds)
    others = f * random.uniform(1.3, 6, int(random.integers(1, 7)))
    hardness = log_uniform(random, 2000, 12000)
    out += log_uniform(random, 0.05, 1.5) * struck(random, t, others, seconds * random.uniform(0.2, 0.8), hardness)
    return in_a_room(random, peaked(out) + knock(random, t))


def shaker(random: Random) -> Sound:
    seconds = log_uniform(random, 0.03, 0.35)
    t = times(seconds * 1.3)
    rise = log_uniform(random, 0.008, 0.09)
    envelope = attack(t, rise) ** random.uniform(0.7, 2) * decay(np.maximum(t - rise, 0), seconds)
    if chance(random, 0.3):  # there and back
        later = t - rise - random.uniform(0.03, 0.12)
        envelope += random.uniform(0.3, 1) * np.where(later > 0, decay(np.maximum(later, 0), seconds), 0)
    sound = noise(random, len(t))
    if chance(random, 0.5):  # single grains
        grains = (random.random(len(t)) < log_uniform(random, 0.005, 0.1)) * noise(random, len(t))
        sound = band(grains, 3000, 12000)
    if chance(random, 0.2):
        envelope = attack(t, rise) * faded(random, np.maximum(t - rise, 0), seconds)
    low = log_uniform(random, 2500, 9000)
    out = band(sound, low, min(20000, low * random.uniform(1.5, 5)), int(random.integers(1, 4)))
    return in_a_room(random, out * envelope)


def jingles(random: Random, t: Sound, seconds: float, low: float) -> Sound:
    """Small plates that strike each other, most of them at once."""
    out = np.zeros_like(t)
    for _ in range(int(random.integers(4, 20))):
        start = random.exponential(0.03) if chance(random, 0.8) else random.uniform(0, seconds / 2)
        later = t - start
        f = spread(random, low, 14000, 5)
        ring = modes(np.maximum(later, 0), f, random.uniform(0.2, 1, 5), random.uniform(0.05, 1, 5) * seconds, random)
        out += np.where(later > 0, ring, 0) * random.uniform(0.2, 1) * np.exp(-start / (seconds / 2))
    return out / (np.std(out) + 1e-9)


def tambourine(random: Random) -> Sound:
    seconds = log_uniform(random, 0.09, 0.8)
    t = times(seconds)
    if chance(random, 0.08):  # of the first machines: a tuned circuit
        f, hiss = log_uniform(random, 4000, 6500), noise(random, len(t))
        out = resonance(hiss, f, log_uniform(random, 5, 15)) + random.uniform(0, 0.2) * high_pass(hiss, f)
        return peaked(out) * faded(random, t, seconds) * attack(t, log_uniform(random, 0.001, 0.03))
    out = high_pass(jingles(random, t, seconds, log_uniform(random, 2500, 5500)), log_uniform(random, 500, 4000), 1)
    hiss = high_pass(noise(random, len(t)), log_uniform(random, 3500, 8000))
    out += log_uniform(random, 0.03, 1) * hiss * decay(t, seconds * random.uniform(0.3, 1))
    if chance(random, 0.35):  # the skin
        skin = sine(phase(log_uniform(random, 150, 600), len(t))) * decay(t, random.uniform(0.03, 0.15))
        out += random.uniform(0.5, 2) * skin
    return in_a_room(random, out * attack(t, log_uniform(random, 0.0005, 0.02)))


def guiro(random: Random) -> Sound:
    seconds = log_uniform(random, 0.08, 0.6)
    t = times(seconds)
    teeth = (phase(random.uniform(25, 110) * (1 + random.uniform(-0.4, 0.8) * t / seconds), len(t))) % 1
    grains = noise(random, len(t)) * np.exp(-teeth * random.uniform(3, 12))
    middle = log_uniform(random, 1500, 6000)
    return band(grains, middle / 1.6, middle * 1.6) * attack(t, 0.01) * decay(t, seconds * 3)


def rung(random: Random) -> Sound:
    """Triangles and agogos."""
    high = chance(random, 0.5)
    seconds = log_uniform(random, 0.3, 3) if high else log_uniform(random, 0.1, 0.6)
    t = times(min(2, seconds))
    count = int(random.integers(3, 9))
    low = log_uniform(random, 2500, 5500) if high else log_uniform(random, 650, 1700)
    f = low * np.concatenate([[1.0], random.uniform(1.2, 5, count)])
    return modes(t, f, random.uniform(0.1, 1, count + 1), seconds * random.uniform(0.3, 1, count + 1), random)


def snap(random: Random) -> Sound:
    t = times(log_uniform(random, 0.04, 0.25))
    middle = log_uniform(random, 1400, 3200)
    out = band(noise(random, len(t)), middle / 1.3, middle * 1.3, 2) * decay(t, log_uniform(random, 0.01, 0.06))
    return out + random.uniform(0, 0.1) * band(noise(random, len(t)), 700, 5000) * decay(t, t[-1])


def timbale(random: Random) -> Sound:
    """A skin over a shell of metal."""
    seconds = log_uniform(random, 0.15, 0.9)
    t = times(seconds)
    low = log_uniform(random, 200, 520)
    out = struck(random, t, low * SKIN, seconds, log_uniform(random, 800, 5000))
    out += random.uniform(0.05, 0.6) * struck(random, t, spread(random, 900, 7000, 8), seconds, 6000)
    return in_a_room(random, peaked(out) + knock(random, t))


def sleigh_bells(random: Random) -> Sound:
    seconds = log_uniform(random, 0.2, 0.9)
    t = times(seconds)
    return jingles(random, t, seconds, 4500) * attack(t, log_uniform(random, 0.002, 0.04))


def rattle(random: Random) -> Sound:
    """Castanets and vibraslaps: clicks of wood, ever weaker."""
    t = times(log_uniform(random, 0.08, 1.2))
    out, start, gap = np.zeros_like(t), 0.0, random.uniform(0.012, 0.05)
    low = log_uniform(random, 900, 3000)
    for _ in range(int(random.integers(1, 25))):
        later = np.maximum(t - start, 0)
        out += (
            np.exp(-3 * start / t[-1]) * (t >= start) * struck(random, later, low * np.array([1, 1.7, 2.9]), 0.03, 5e3)
        )
        start += gap * random.uniform(0.9, 1.1)
    return in_a_room(random, out)


def other_percussion(random: Random) -> Sound:
    kinds = [guiro, rung, rung, snap, timbale, timbale, sleigh_bells, rattle]
    return kinds[int(random.integers(len(kinds)))](random)


VOICES: dict[str, Callable[[Random], Sound]] = {
    "cowbell": cowbell,
    "shaker": shaker,
    "tambourine": tambourine,
    "conga": conga,
    "bongo": bongo,
    "clave": clave,
    "woodblock": woodblock,
    "percussion": other_percussion,
}
