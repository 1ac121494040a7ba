"""Simple models of pitched instruments and of voices, with every parameter drawn by chance."""

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
    peaked,
    phase,
    saw,
    sine,
    spread,
    struck,
    swept_low_pass,
    times,
)
from .oscillators import body, frequency_modulation, harmonics, held, hertz, in_a_hall, length, struck_string, vibrato


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


def bowed(random: Random, t: Sound, pitch: float, players: int) -> Sound:
    out = np.zeros_like(t)
    for _ in range(players):
        f = pitch * 2 ** random.normal(0, 0.006) * vibrato(random, t, 0.8, 0.01)
        wobble = 1 + 0.002 * low_pass(noise(random, len(t)), 12) / 0.02
        f = np.broadcast_to(f * wobble, t.shape)
        out += saw(phase(f, len(t), random.random()), f / RATE)
    return out


def plucked_strings(random: Random) -> Sound:
    t = length(random, 0.25, 1.2)
    pitch = hertz(random, 38, 84)
    out = np.zeros_like(t)
    fall, stiffness = log_uniform(random, 0.15, 1.2), log_uniform(random, 1e-6, 2e-4)
    for _ in range(int(random.integers(1, 5))):
        string = struck_string(
            random, t, pitch * 2 ** random.normal(0, 0.003), stiffness, fall, random.uniform(0.1, 0.4)
        )
        start = int(random.uniform(0, 0.015) * RATE)
        out[start:] += string[: len(out) - start]
    return body(random, out, 200, 3000) * attack(t, 0.003)


def strings(random: Random) -> Sound:
    if chance(random, 0.15):
        return plucked_strings(random)
    t = length(random, 0.4, 2.1)
    out = bowed(random, t, hertz(random, 38, 88), int(random.choice([1, 1, 2, 4, 7])))
    out = low_pass(body(random, out, 250, 4000), log_uniform(random, 1500, 10000))
    if chance(random, 0.15):  # trembling bows
        out *= 1 - random.uniform(0.2, 0.7) * (sine(random.uniform(7, 14) * t + 0.1 * noise(random, len(t))) > 0)
        out = low_pass(out, 8000)
    out += log_uniform(random, 0.003, 0.1) * np.std(out) * high_pass(noise(random, len(t)), 2000)
    return in_a_hall(random, out * held(random, t, log_uniform(random, 0.015, 0.5), log_uniform(random, 0.08, 0.4)))


def brass(random: Random) -> Sound:
    t = length(random, 0.25, 2)
    pitch = hertz(random, 34, 84)
    out = np.zeros_like(t)
    rise = log_uniform(random, 0.012, 0.15)
    for _ in range(int(random.choice([1, 1, 2, 3, 5]))):
        scoop = 1 - random.uniform(0, 0.04) * np.exp(-t / random.uniform(0.01, 0.06))
        f = np.broadcast_to(pitch * 2 ** random.normal(0, 0.004) * scoop * vibrato(random, t, 0.3, 0.007), t.shape)
        out += saw(phase(f, len(t), random.random()), f / RATE)
    level = held(random, t, rise, random.uniform(0.04, 0.2))
    burst = 1 + random.uniform(0, 0.6) * np.exp(-t / (2 * rise))
    out = swept_low_pass(out, pitch * (1 + log_uniform(random, 1.5, 14) * level * burst), random.uniform(0.6, 1.2))
    kind = random.random()
    if kind < 0.15:  # muted
        middle = log_uniform(random, 1000, 3000)
        out = 0.2 * out + band(out, middle / 1.5, middle * 1.5, 2)
    elif kind < 0.5:
        out = body(random, out, 350, 2500)
    return in_a_hall(random, low_pass(out, log_uniform(random, 2000, 12000)) * level)


def reed_levels(random: Random, pitch: float) -> Sound:
    """Levels of harmonics, with formants of the bore or with few even ones."""
    n = np.arange(1, 41)
    levels = np.exp(-n * log_uniform(random, 0.08, 1.8)) * np.exp(random.normal(0, 0.4, len(n)))
    if chance(random, 0.35):  # a cylinder closed at one end
        low = int(random.integers(2, 8))
        levels[1 : 2 * low : 2] *= random.uniform(0.01, 0.3)
    if chance(random, 0.45):  # double reeds and saxophones
        for middle in spread(random, 350, 3500, int(random.integers(1, 4))):
            levels *= 1 + random.uniform(1, 8) * np.exp(-0.5 * (np.log2(n * pitch / middle) / 0.35) ** 2)
    return np.asarray(levels)


def woodwinds(random: Random) -> Sound:
    t = length(random, 0.25, 2)
    pitch = hertz(random, 44, 94)
    level = held(random, t, log_uniform(random, 0.012, 0.2), random.uniform(0.04, 0.15))
    drift = 1 + 0.001 * low_pass(noise(random, len(t)), 10) / 0.02 - random.uniform(0, 0.03) * np.exp(-t / 0.03)
    out = harmonics(random, t, pitch * drift * vibrato(random, t, 0.5, 0.01), reed_levels(random, pitch))
    if chance(random, 0.3):  # beats of the breath
        out *= 1 + random.uniform(0.05, 0.3) * sine(random.uniform(4, 6.5) * t)
    wide = random.uniform(3, 10)
    breath = band(noise(random, len(t)), pitch * 0.8, pitch * wide) + log_uniform(random, 0.001, 0.1) * noise(
        random, len(t)
    )
    chiff = 1 + random.choice([0, 3, 10]) * random.random() * decay(t, log_uniform(random, 0.03, 0.2))
    out = out / (np.std(out) + 1e-9) + log_uniform(random, 0.001, 0.3) * breath / np.std(breath) * chiff
    out = low_pass(out, log_uniform(random, 2500, 16000))
    return in_a_hall(random, out * level)


BARS = [
    [1, 3.93, 9.54], [1, 3.98, 10.6], [1, 3.0, 6.1], [1, 2.76, 5.4, 8.93], [1, 2.0, 3.01, 4.3],
    [1, 2.0, 3.0, 4.0, 5.0], [1, 5.4, 14.0], [1, 6.27, 17.5],
]  # fmt: skip


def mallets(random: Random) -> Sound:
    pitch = hertz(random, 44, 98)
    ratios = np.array(BARS[int(random.integers(len(BARS)))]) * 2 ** random.normal(0, 0.01)
    fall = log_uniform(random, 0.12, 4) * (440 / pitch) ** 0.4
    t = times(min(2.0, fall * 1.2))
    levels = np.concatenate([[1], random.uniform(0.02, 0.6, len(ratios) - 1)])
    falls = fall * np.concatenate([[1], random.uniform(0.05, 0.8, len(ratios) - 1)])
    out = modes(t, pitch * ratios, levels, falls, random)
    if chance(random, 0.3):
        out *= 1 + random.uniform(0.1, 0.5) * sine(random.uniform(3, 7) * t)
    out += random.uniform(0, 0.25) * band(noise(random, len(t)), 400, 4000) * decay(t, log_uniform(random, 0.008, 0.05))
    out += random.uniform(0, 0.2) * struck(random, t, spread(random, 300, 6000, 5), 0.06, 4000)
    return in_a_hall(random, out)


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


# Formants of five vowels sung by five voices: frequencies in Hz and levels in dB.
VOWELS = [
    ((800, 1150, 2900, 3900, 4950), (0, -6, -32, -20, -50)), ((350, 2000, 2800, 3600, 4950), (0, -20, -15, -40, -56)),
    ((270, 2140, 2950, 3900, 4950), (0, -12, -26, -26, -44)), ((450, 800, 2830, 3800, 4950), (0, -11, -22, -22, -50)),
    ((325, 700, 2700, 3800, 4950), (0, -16, -35, -40, -60)), ((660, 1120, 2750, 3000, 3350), (0, -6, -23, -24, -38)),
    ((440, 1800, 2700, 3000, 3300), (0, -14, -18, -20, -20)), ((270, 1850, 2900, 3350, 3590), (0, -24, -24, -36, -36)),
    ((430, 820, 2700, 3000, 3300), (0, -10, -26, -22, -34)), ((370, 630, 2750, 3000, 3400), (0, -20, -23, -30, -34)),
    ((650, 1080, 2650, 2900, 3250), (0, -6, -7, -8, -22)), ((400, 1700, 2600, 3200, 3580), (0, -14, -12, -14, -20)),
    ((290, 1870, 2800, 3250, 3540), (0, -15, -18, -20, -30)), ((400, 800, 2600, 2800, 3000), (0, -10, -12, -12, -26)),
    ((350, 600, 2700, 2900, 3300), (0, -20, -17, -14, -26)), ((600, 1040, 2250, 2450, 2750), (0, -7, -9, -9, -20)),
    ((400, 1620, 2400, 2800, 3100), (0, -12, -9, -12, -18)), ((250, 1750, 2600, 3050, 3340), (0, -30, -16, -22, -28)),
    ((400, 750, 2400, 2600, 2900), (0, -11, -21, -20, -40)), ((350, 600, 2400, 2675, 2950), (0, -20, -32, -28, -36)),
]  # fmt: skip


def sung(random: Random, source: Sound) -> Sound:
    """Through the formants of a vowel."""
    size = random.uniform(0.88, 1.2)
    tones, levels = VOWELS[int(random.integers(len(VOWELS)))]
    out = np.zeros_like(source)
    for formant, level in zip(tones, levels, strict=True):
        f = formant * size
        b, a = signal.iirpeak(f, f / random.uniform(60, 180), fs=RATE)
        out += 10 ** ((level / 2 + random.normal(0, 3)) / 20) * signal.lfilter(b, a, source)
    return out


def voice(random: Random) -> Sound:
    t = length(random, 0.3, 2.1)
    pitch = hertz(random, 43, 80)
    source = np.zeros_like(t)
    singers = int(random.choice([1, 1, 3, 6, 10]))
    apart = random.uniform(0.002, 0.015)
    for _ in range(singers):
        jitter = 1 + 0.004 * low_pass(noise(random, len(t)), 8) / 0.02
        f = np.broadcast_to(pitch * 2 ** random.normal(0, apart) * jitter * vibrato(random, t, 0.8, 0.015), t.shape)
        source += saw(phase(f, len(t), random.random()), f / RATE)
    source = low_pass(source, random.uniform(500, 2500), 1) + log_uniform(random, 0.003, 0.2) * noise(random, len(t))
    out = sung(random, source)
    if chance(random, 0.3):  # from one vowel to another
        turn = np.clip((t - random.uniform(0, 0.3)) / random.uniform(0.05, 0.4), 0, 1)
        out = peaked(out) * (1 - turn) + peaked(sung(random, source)) * turn
    return in_a_hall(random, out * held(random, t, log_uniform(random, 0.02, 0.5), log_uniform(random, 0.05, 0.4)))


VOICES: dict[str, Callable[[Random], Sound]] = {
    "guitar": guitar,
    "strings": strings,
    "brass": brass,
    "woodwinds": woodwinds,
    "mallets": mallets,
    "bells": bells,
    "voice": voice,
}
