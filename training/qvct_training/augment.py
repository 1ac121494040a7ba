"""What happens to a sound between its making and a library: tuned, filtered, sampled coarsely, cut, overdriven."""

from collections.abc import Callable

import numpy as np
from scipy import signal

from .dsp import RATE, Random, Sound, ambience, chance, faded, high_pass, log_uniform, low_pass, noise


def resampled(sound: Sound, factor: float) -> Sound:
    """Played `factor` times as fast, by straight lines between samples."""
    count = max(32, int(len(sound) / factor))
    return np.asarray(np.interp(np.arange(count) * factor, np.arange(len(sound)), sound))


def coarse(random: Random, sound: Sound) -> Sound:
    """As a sampler of few bits and a low rate keeps it: linear or companded, its steps held or smoothed."""
    step = log_uniform(random, 1.0, 3.5)
    held = chance(random, 0.4)
    out = low_pass(sound, 0.45 * RATE / step, 6) if chance(random, 0.8) and step > 1.05 else sound
    kept = resampled(out, step)
    kept = kept / (np.max(np.abs(kept)) + 1e-9)
    if chance(random, 0.8):
        steps = 2 ** (random.choice([6, 7, 8, 8, 10, 12]) - 1)
        if chance(random, 0.4):
            mu = 255.0
            folded = np.sign(kept) * np.log1p(mu * np.abs(kept)) / np.log1p(mu)
            folded = np.round(folded * steps) / steps
            kept = np.sign(folded) * np.expm1(np.abs(folded) * np.log1p(mu)) / mu
        else:
            kept = np.round(kept * steps) / steps
    at = np.arange(int(len(kept) * step)) / step
    out = kept[np.minimum(at.astype(int), len(kept) - 1)] if held else np.interp(at, np.arange(len(kept)), kept)
    return low_pass(out, log_uniform(random, 6000, 20000), 4) if chance(random, 0.5) else out


def dying_away(random: Random, sound: Sound) -> Sound:
    """Under an envelope that falls."""
    return sound * faded(random, np.arange(len(sound)) / RATE, log_uniform(random, 0.3, 3))


def overdriven(random: Random, sound: Sound) -> Sound:
    """Through an amplifier at its limit."""
    return np.asarray(np.tanh(log_uniform(random, 0.7, 8) * sound / (np.max(np.abs(sound)) + 1e-9)))


def tilted(random: Random, sound: Sound) -> Sound:
    """A broad emphasis somewhere, or the ends of the spectrum taken off."""
    if chance(random, 0.5):
        f = log_uniform(random, 100, 9000)
        b, a = signal.iirpeak(f, random.uniform(0.5, 2), fs=RATE)
        sound = sound + random.uniform(-0.7, 2) * np.asarray(signal.lfilter(b, a, sound))
    if chance(random, 0.25):
        sound = low_pass(sound, log_uniform(random, 3500, 18000), int(random.integers(1, 3)))
    if chance(random, 0.25):
        sound = high_pass(sound, log_uniform(random, 20, 150), 1)
    return sound


def cut(random: Random, sound: Sound) -> Sound:
    """Ends early: gated, faded or simply cut."""
    end = int(len(sound) * random.uniform(0.35, 0.95))
    out = sound[: max(end, 1200)].copy()
    fade = int(min(len(out), log_uniform(random, 0.0005, 0.1) * RATE))
    out[len(out) - fade :] *= np.linspace(1, 0, fade)
    return out


def ended(random: Random, sound: Sound) -> Sound:
    """As files end: where the sound has died away, or after some silence."""
    if chance(random, 0.6):
        heard = np.flatnonzero(np.abs(sound) > log_uniform(random, 3e-4, 1e-2) * np.max(np.abs(sound)))
        sound = sound[: max(1200, heard[-1] + 1)] if len(heard) else sound
    if chance(random, 0.3):
        sound = np.concatenate([sound, np.zeros(int(random.uniform(0, 1.5) * RATE))])
    return sound


def shifted(random: Random, sound: Sound) -> Sound:
    """Off the middle, as converters of early samplers are."""
    return np.asarray(sound + random.choice([-1, 1]) * log_uniform(random, 0.002, 0.1) * np.max(np.abs(sound)))


def floor(random: Random, sound: Sound) -> Sound:
    """Hiss, hum and rumble under the sound."""
    under = noise(random, len(sound)) * log_uniform(random, 1e-5, 5e-3)
    if chance(random, 0.6):
        rumble = low_pass(noise(random, len(sound)), log_uniform(random, 30, 400), 1)
        under += rumble / np.std(rumble) * log_uniform(random, 1e-4, 2e-2)
    return np.asarray(sound + np.max(np.abs(sound)) * under)


def augmented(random: Random, sound: Sound, most_octaves: float, strength: float = 1.0) -> Sound:
    """The sound as it might be met, tuned by at most that many octaves; each step by chance."""
    out = np.asarray(sound, dtype=np.float64)
    steps: list[tuple[float, Callable[[Random, Sound], Sound]]] = [
        (0.4, dying_away),
        (0.55, tilted),
        (0.25, overdriven),
        (0.35, coarse),
        (0.4, ambience),
        (0.25, cut),
        (0.85, ended),
        (0.4, floor),
        (0.2, shifted),
    ]
    if chance(random, 0.85):
        out = resampled(out, 2 ** random.uniform(-most_octaves, most_octaves))
    for share, step in steps:
        if chance(random, share * strength):
            out = step(random, out)
    return out
