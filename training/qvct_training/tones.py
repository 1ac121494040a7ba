"""Voices of synthesizers and simple models of pitched instruments, with every parameter drawn by chance."""

from collections.abc import Callable

import numpy as np
from scipy import signal

from .dsp import (
    RATE,
    Random,
    Sound,
    attack,
    band,
    chance,
    decay,
    high_pass,
    log_uniform,
    low_pass,
    modes,
    noise,
    phase,
    saw,
    sine,
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
    t = length(random, 0.4, 2)
    pitch = hertz(random, 50, 90)
    moving = pitch * vibrato(random, t, 0.5, 0.02)
    if chance(random, 0.25):
        moving = moving * (1 + (2 ** (random.uniform(-12, 5) / 12) - 1) * np.exp(-t / log_uniform(random, 0.01, 0.1)))
    if chance(random, 0.15):
        out = frequency_modulation(random, t, moving, random.uniform(1, 6), log_uniform(random, 0.5, 4))
    else:
        out = oscillators(random, t, moving, 4, 0.15)
        if chance(random, 0.7):
            out = filtered(random, t, out, pitch, log_uniform(random, 0.1, 2), 2.0)
    if chance(random, 0.3):
        out = np.tanh(log_uniform(random, 1, 8) * out / (np.std(out) + 1e-9))
    return out * held(random, t, log_uniform(random, 0.002, 0.06), log_uniform(random, 0.02, 0.3))


def pad(random: Random) -> Sound:
    t = length(random, 1.2, 2.1)
    root = hertz(random, 40, 74)
    chord = [0]
    if chance(random, 0.5):
        chord = [[0, 4, 7], [0, 3, 7], [0, 7, 12], [0, 4, 7, 11], [0, 5, 7], [0, 12]][int(random.integers(6))]
    out = np.zeros_like(t)
    for step in chord:
        pitch = root * 2 ** (step / 12)
        if chance(random, 0.2):
            out += harmonics(
                random, t, pitch * vibrato(random, t, 0.6, 0.006), random.random(12) / np.arange(1, 13) ** 1.3
            )
        else:
            out += oscillators(random, t, pitch * vibrato(random, t, 0.3, 0.006), 5, 0.12)
    cutoff = root * log_uniform(random, 2, 12)
    sweep = cutoff * (1 + random.uniform(0, 2) * sine(random.uniform(0.1, 1) * t + random.random()) ** 2)
    out = swept_low_pass(out, sweep, log_uniform(random, 0.6, 3))
    if chance(random, 0.3):
        out += random.uniform(0, 0.2) * np.std(out) * band(noise(random, len(t)), 500, 8000)
    return out * attack(t, log_uniform(random, 0.08, 1.2)) * held(random, t, 0.05, log_uniform(random, 0.1, 0.5))


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


def organ(random: Random) -> Sound:
    t = length(random, 0.4, 2)
    pitch = hertz(random, 38, 86)
    draws = random.integers(0, 9, 9) / 8
    drawbars = np.zeros(17)
    for level, at in zip(draws, [1, 3, 2, 4, 6, 8, 10, 12, 16], strict=True):
        drawbars[at] = level
    out = harmonics(random, t, pitch / 2 * vibrato(random, t, 0.5, 0.008), drawbars[1:])
    if chance(random, 0.3):
        out += (
            random.uniform(0.2, 1)
            * sine(phase(pitch * random.choice([2, 3]), len(t)))
            * decay(t, random.uniform(0.2, 0.8))
        )
    if chance(random, 0.4):
        out *= 1 + random.uniform(0.05, 0.4) * sine(random.uniform(0.7, 7) * t)
    out += 0.3 * random.random() * band(noise(random, len(t)), 1000, 6000) * decay(t, 0.01)
    end = np.minimum(1, (t[-1] - t) / 0.02)
    return np.asarray(out * attack(t, log_uniform(random, 0.002, 0.05)) * end)


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


def struck_string(random: Random, t: Sound, pitch: float, stiffness: float, falls: float, place: float) -> Sound:
    count = int(min(40, 0.45 * RATE / pitch))
    n = np.arange(1, count + 1)
    f = pitch * n * np.sqrt(1 + stiffness * n**2)
    levels = np.abs(np.sin(np.pi * n * place)) / n ** random.uniform(0.5, 1.8)
    return modes(t, f, levels, falls / (1 + random.uniform(0.05, 0.5) * (n - 1)), random)


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


def guitar(random: Random) -> Sound:
    t = length(random, 0.4, 2)
    root = hertz(random, 40, 76)
    steps = [0.0] if chance(random, 0.75) else [[0, 7], [0, 7, 12], [0, 7, 12, 16]][int(random.integers(3))]
    muted = chance(random, 0.2)
    out = np.zeros_like(t)
    for i, step in enumerate(steps):
        fall = random.uniform(0.15, 0.5) if muted else random.uniform(1.5, 7)
        string = struck_string(
            random, t, root * 2 ** (step / 12), log_uniform(random, 1e-6, 8e-5), fall, random.uniform(0.06, 0.4)
        )
        start = int(i * random.uniform(0, 0.02) * RATE)
        out[start:] += string[: len(out) - start]
    out /= np.max(np.abs(out)) + 1e-9
    out += random.uniform(0, 0.1) * band(noise(random, len(t)), 1500, 7000) * decay(t, 0.02)
    if chance(random, 0.35):  # through an amplifier
        out = band(np.tanh(log_uniform(random, 1, 40) * out), 90, random.uniform(3000, 6000))
    return out * attack(t, random.uniform(0.0005, 0.004))


def strings(random: Random) -> Sound:
    t = length(random, 0.5, 2.1)
    pitch = hertz(random, 38, 88)
    out = np.zeros_like(t)
    for _ in range(int(random.integers(1, 7))):
        f = pitch * 2 ** random.normal(0, 0.006) * vibrato(random, t, 0.8, 0.01)
        wobble = 1 + 0.002 * low_pass(noise(random, len(t)), 12) / 0.02
        f = np.broadcast_to(f * wobble, t.shape)
        out += saw(phase(f, len(t), random.random()), f / RATE)
    for _ in range(int(random.integers(1, 5))):
        middle = log_uniform(random, 250, 4000)
        out += random.uniform(0.2, 2) * band(out, middle / 1.2, middle * 1.2)
    out = low_pass(out, log_uniform(random, 1800, 9000))
    out += random.uniform(0, 0.05) * np.std(out) * high_pass(noise(random, len(t)), 2000)
    return out * held(random, t, log_uniform(random, 0.03, 0.5), log_uniform(random, 0.08, 0.4))


def brass(random: Random) -> Sound:
    t = length(random, 0.3, 2)
    pitch = hertz(random, 38, 82)
    out = np.zeros_like(t)
    rise = log_uniform(random, 0.015, 0.15)
    for _ in range(int(random.integers(1, 5))):
        scoop = 1 - random.uniform(0, 0.04) * np.exp(-t / random.uniform(0.01, 0.06))
        f = np.broadcast_to(pitch * 2 ** random.normal(0, 0.004) * scoop * vibrato(random, t, 0.3, 0.007), t.shape)
        out += saw(phase(f, len(t), random.random()), f / RATE)
    level = held(random, t, rise, random.uniform(0.04, 0.2))
    out = swept_low_pass(out, pitch * (1 + log_uniform(random, 2, 14) * level), random.uniform(0.6, 1.2))
    return low_pass(out, log_uniform(random, 3000, 12000)) * level


def woodwinds(random: Random) -> Sound:
    t = length(random, 0.3, 2)
    pitch = hertz(random, 48, 92)
    n = np.arange(1, 25)
    kind = random.integers(3)
    levels = np.exp(-n * random.uniform(0.15, 1.6)) * np.exp(random.normal(0, 0.5, 24))
    if kind == 0:  # a cylinder closed at one end has few even harmonics
        levels[1::2] *= random.uniform(0.02, 0.3)
    level = held(random, t, log_uniform(random, 0.02, 0.15), random.uniform(0.04, 0.15))
    out = harmonics(random, t, pitch * vibrato(random, t, 0.5, 0.01), levels)
    breath = band(noise(random, len(t)), pitch * 0.8, pitch * random.uniform(3, 10)) * random.uniform(
        0.01, 0.5 if kind == 1 else 0.1
    )
    return (out / (np.std(out) + 1e-9) + breath * (1 + 3 * decay(t, 0.06))) * level


def mallets(random: Random) -> Sound:
    pitch = hertz(random, 46, 96)
    bars = [[1, 3.93, 9.54], [1, 3.98, 10.6], [1, 3.0, 6.1], [1, 2.76, 5.4, 8.93], [1, 2.0, 3.01, 4.3]]
    ratios = np.array(bars[int(random.integers(5))]) * 2 ** random.normal(0, 0.01)
    fall = log_uniform(random, 0.15, 3) * (440 / pitch) ** 0.4
    t = times(min(2.0, fall * 1.2))
    levels = np.concatenate([[1], random.uniform(0.03, 0.5, len(ratios) - 1)])
    out = modes(
        t, pitch * ratios, levels, fall * np.concatenate([[1], random.uniform(0.05, 0.6, len(ratios) - 1)]), random
    )
    if chance(random, 0.3):
        out *= 1 + random.uniform(0.1, 0.5) * sine(random.uniform(3, 7) * t)
    return out + random.uniform(0, 0.15) * band(noise(random, len(t)), 400, 4000) * decay(t, 0.02)


def bells(random: Random) -> Sound:
    pitch = hertz(random, 55, 98)
    fall = log_uniform(random, 0.8, 8)
    t = times(min(2.1, fall))
    if chance(random, 0.4):
        carrier = frequency_modulation(random, t, pitch, 0, 1)
        ratio = random.choice([1.41, 2.76, 3.5, 1.73, 5.19])
        inner = random.uniform(1, 6) * decay(t, fall * 0.7) * sine(phase(pitch * ratio, len(t)))
        return (carrier * 0.2 + sine(phase(pitch, len(t)) + inner / 6.3)) * decay(t, fall) * attack(t, 0.001)
    ratios = np.array([0.5, 1, 1.183, 1.506, 2, 2.514, 2.662, 3.011, 4.166, 5.433]) * 2 ** random.normal(0, 0.01, 10)
    return modes(t, pitch * ratios, random.uniform(0.1, 1, 10), fall * random.uniform(0.15, 1, 10), random)


VOWELS = [
    (800, 1150, 2900),
    (350, 2000, 2800),
    (270, 2300, 3000),
    (450, 800, 2830),
    (325, 700, 2700),
    (600, 1040, 2250),
    (400, 1600, 2700),
]


def voice(random: Random) -> Sound:
    t = length(random, 0.4, 2.1)
    pitch = hertz(random, 43, 78)
    out = np.zeros_like(t)
    for _ in range(int(random.choice([1, 1, 3, 6]))):
        jitter = 1 + 0.004 * low_pass(noise(random, len(t)), 8) / 0.02
        f = np.broadcast_to(pitch * 2 ** random.normal(0, 0.008) * jitter * vibrato(random, t, 0.8, 0.015), t.shape)
        out += saw(phase(f, len(t), random.random()), f / RATE)
    source = low_pass(out, random.uniform(800, 2500), 1) + random.uniform(0.005, 0.1) * noise(random, len(t))
    size = random.uniform(0.85, 1.25)
    sung = np.zeros_like(t)
    for formant, level in zip(VOWELS[int(random.integers(len(VOWELS)))], (1, 0.6, 0.3), strict=True):
        width = random.uniform(60, 180)
        b, a = signal.iirpeak(formant * size, formant * size / width, fs=RATE)
        sung += level * random.uniform(0.5, 1.5) * signal.lfilter(b, a, source)
    return sung * held(random, t, log_uniform(random, 0.02, 0.4), log_uniform(random, 0.05, 0.4))


def effects(random: Random) -> Sound:
    kind = random.integers(6)
    t = length(random, 0.25 if kind == 1 else 0.8, 2.1)
    sweep = np.exp(np.interp(t, np.linspace(0, t[-1], 4), np.log(np.exp(random.uniform(np.log(60), np.log(9000), 4)))))
    shape = np.interp(t, np.linspace(0, t[-1], 5), random.uniform(0, 1, 5))
    if kind == 0:  # noise that sweeps
        return swept_low_pass(noise(random, len(t)), sweep, log_uniform(random, 1, 10)) * shape
    if kind == 1:  # zap
        f = log_uniform(random, 1500, 9000) * np.exp(-t / log_uniform(random, 0.03, 0.3)) + log_uniform(random, 40, 400)
        return square(phase(f, len(t)), f / RATE) * decay(t, t[-1])
    if kind == 2:  # riser or siren
        turns = phase(sweep * (1 + 0.2 * random.random() * sine(log_uniform(random, 1, 30) * t)), len(t))
        return (saw(turns, sweep / RATE) if chance(random, 0.5) else sine(turns)) * shape
    if kind == 3:  # explosion
        return low_pass(noise(random, len(t)), log_uniform(random, 200, 3000)) * decay(
            t, log_uniform(random, 0.8, 4), 0.7
        )
    if kind == 4:  # random steps
        f = np.repeat(np.exp(random.uniform(np.log(80), np.log(6000), 80)), int(log_uniform(random, 500, 6000)))
        f = np.resize(f, len(t))
        return square(phase(f, len(t)), f / RATE) * shape
    grains = (random.random(len(t)) < log_uniform(random, 1e-4, 1e-2)) * noise(random, len(t))  # crackle
    return band(grains, log_uniform(random, 100, 2000), log_uniform(random, 2500, 16000)) + random.uniform(
        0, 0.02
    ) * noise(random, len(t))


VOICES: dict[str, Callable[[Random], Sound]] = {
    "bass": bass,
    "lead": lead,
    "pad": pad,
    "pluck": pluck,
    "piano": piano,
    "organ": organ,
    "electric piano": electric_piano,
    "guitar": guitar,
    "strings": strings,
    "brass": brass,
    "woodwinds": woodwinds,
    "mallets": mallets,
    "bells": bells,
    "voice": voice,
    "effects": effects,
}
