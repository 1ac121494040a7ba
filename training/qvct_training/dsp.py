"""Small parts that synthesis and augmentation are made of; everything is mono at RATE."""

import numpy as np
import numpy.typing as npt
from scipy import signal

RATE = 44100
Sound = npt.NDArray[np.float64]
Random = np.random.Generator


def times(seconds: float) -> Sound:
    """The time of each sample."""
    return np.arange(max(32, int(seconds * RATE))) / RATE


def log_uniform(random: Random, low: float, high: float) -> float:
    """A number whose logarithm is evenly spread."""
    return float(np.exp(random.uniform(np.log(low), np.log(high))))


def chance(random: Random, share: float) -> bool:
    """True in that share of calls."""
    return bool(random.random() < share)


def decay(t: Sound, seconds: float, bend: float = 1.0) -> Sound:
    """Falls by 60 dB in `seconds`; a bend below 1 falls quickly first, above 1 slowly."""
    return np.exp(-6.9 * (t / seconds) ** bend)


def faded(random: Random, t: Sound, seconds: float) -> Sound:
    """As amplifiers of machines fade: by transistors that close below a threshold, or quickly or slowly first."""
    if chance(random, 0.5):
        return decay(t, seconds, random.uniform(0.6, 1.4))
    least = log_uniform(random, 0.02, 0.5)
    level = np.exp(np.log(least) * t / (seconds * random.uniform(0.7, 1)))
    return np.asarray(np.maximum(0.0, level - least) / (1 - least))


def attack(t: Sound, seconds: float) -> Sound:
    """Rises from 0 to 1."""
    return np.minimum(1.0, t / max(seconds, 1e-5))


def noise(random: Random, size: int) -> Sound:
    """White noise."""
    return random.standard_normal(size)


def phase(frequency: Sound | float, size: int, start: float = 0.0) -> Sound:
    """The running phase, in turns, of an oscillator whose frequency may move."""
    return start + np.cumsum(np.broadcast_to(frequency, (size,))) / RATE


def sine(turns: Sound) -> Sound:
    """A sine of that phase."""
    return np.sin(2 * np.pi * turns)


def saw(turns: Sound, step: Sound | float) -> Sound:
    """A sawtooth with its step rounded so that it folds little; `step` is the frequency over the rate."""
    p = turns % 1.0
    step = np.broadcast_to(step, p.shape)
    wave = 2 * p - 1
    low = p < step
    x = p[low] / step[low]
    wave[low] -= x + x - x * x - 1
    high = p > 1 - step
    x = (p[high] - 1) / step[high]
    wave[high] -= x * x + x + x + 1
    return np.asarray(wave)


def square(turns: Sound, step: Sound | float, width: float = 0.5) -> Sound:
    """A pulse of that width."""
    return saw(turns, step) - saw(turns + width, step)


def band(sound: Sound, low: float, high: float, order: int = 1) -> Sound:
    """What lies between two frequencies, in Hz."""
    top = min(high, 0.48 * RATE)
    sections = signal.butter(order, [min(low, 0.8 * top), top], "bandpass", fs=RATE, output="sos")
    return np.asarray(signal.sosfilt(sections, sound))


def high_pass(sound: Sound, frequency: float, order: int = 2) -> Sound:
    """What lies above a frequency."""
    sections = signal.butter(order, min(frequency, 0.45 * RATE), "highpass", fs=RATE, output="sos")
    return np.asarray(signal.sosfilt(sections, sound))


def low_pass(sound: Sound, frequency: float, order: int = 2) -> Sound:
    """What lies below a frequency."""
    sections = signal.butter(order, min(frequency, 0.48 * RATE), "lowpass", fs=RATE, output="sos")
    return np.asarray(signal.sosfilt(sections, sound))


def resonance(sound: Sound, frequency: float, q: float) -> Sound:
    """A resonant band."""
    b, a = signal.iirpeak(min(frequency, 0.45 * RATE), q, fs=RATE)
    return np.asarray(signal.lfilter(b, a, sound))


def swept_low_pass(sound: Sound, cutoff: Sound, q: float) -> Sound:
    """A low-pass whose cutoff moves, in blocks of 2 ms."""
    out = np.empty_like(sound)
    block = RATE // 500
    state = np.zeros((1, 2))
    for at in range(0, len(sound), block):
        w = 2 * np.pi * min(float(cutoff[min(at, len(cutoff) - 1)]), 0.45 * RATE) / RATE
        alpha, c = np.sin(w) / (2 * q), np.cos(w)
        section = np.array([[(1 - c) / 2, 1 - c, (1 - c) / 2, 1 + alpha, -2 * c, 1 - alpha]]) / (1 + alpha)
        out[at : at + block], state = signal.sosfilt(section, sound[at : at + block], zi=state)
    return out


def modes(t: Sound, frequencies: npt.ArrayLike, levels: npt.ArrayLike, seconds: npt.ArrayLike, random: Random) -> Sound:
    """Decaying sines: what a struck body rings with."""
    out = np.zeros_like(t)
    for f, level, length in np.broadcast(frequencies, levels, seconds):
        if f < 0.45 * RATE:
            out += level * np.sin(2 * np.pi * (f * t + random.random())) * decay(t, float(length))
    return out


def struck(random: Random, t: Sound, frequencies: npt.ArrayLike, seconds: float, hardness: float) -> Sound:
    """A body struck by something that excites little above `hardness`; high modes die away sooner."""
    f = np.asarray(frequencies, dtype=np.float64)
    levels = random.uniform(0.15, 1, len(f)) / (1 + (f / hardness) ** 2)
    falls = seconds * (f / f.min()) ** -random.uniform(0, 1.1) * random.uniform(0.5, 1, len(f))
    return peaked(modes(t, f, levels, falls, random))


def spread(random: Random, low: float, high: float, count: int) -> Sound:
    """Frequencies evenly spread by octaves."""
    return np.asarray(np.exp(random.uniform(np.log(low), np.log(high), count)))


def ambience(random: Random, sound: Sound) -> Sound:
    """Early reflections and a tail."""
    t = times(log_uniform(random, 0.05, 1.8))
    tail = noise(random, len(t)) * decay(t, t[-1]) * (t > random.uniform(0.001, 0.03))
    tail = low_pass(tail, log_uniform(random, 1500, 16000), 1)
    wet = signal.fftconvolve(np.concatenate([sound, np.zeros(len(t) // 2)]), tail / (np.sqrt(np.sum(tail**2)) + 1e-9))
    wet = wet[: len(sound) + len(t) // 2]
    dry = np.concatenate([sound, np.zeros(len(wet) - len(sound))])
    return np.asarray(dry + log_uniform(random, 0.03, 0.7) * wet)


def peaked(sound: Sound) -> Sound:
    """The sound with a peak of 1."""
    return np.asarray(sound / (np.max(np.abs(sound), initial=0.0) + 1e-9))


def normalised(sound: Sound) -> npt.NDArray[np.float32]:
    """The sound with a peak of 0.9."""
    peak = float(np.max(np.abs(sound))) if len(sound) else 0.0
    return (sound * (0.9 / peak) if peak > 0 else sound).astype(np.float32)
