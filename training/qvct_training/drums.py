"""Voices of drum machines and simple acoustic drums, with every parameter drawn by chance."""

from collections.abc import Callable

import numpy as np

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
    sine,
    square,
    times,
)

SKIN = np.array([1.0, 1.59, 2.14, 2.30, 2.65, 2.92])  # modes of an ideal membrane


def click(random: Random, t: Sound) -> Sound:
    """The contact of a stick or a trigger pulse."""
    length = log_uniform(random, 0.001, 0.015)
    if chance(random, 0.3):
        return np.where(t < length / 4, 1.0, 0.0)
    burst = noise(random, len(t)) * decay(t, length)
    return band(burst, log_uniform(random, 300, 3000), log_uniform(random, 3500, 14000))


def glide(random: Random, t: Sound, end: float, most: float) -> Sound:
    """A frequency that falls to `end`, from at most `most` times as high."""
    ratio = log_uniform(random, 1.0, most)
    tau = log_uniform(random, 0.004, 0.07)
    f = end * (1 + (ratio - 1) * np.exp(-t / tau))
    if chance(random, 0.4):
        f += end * random.uniform(0, most) * np.exp(-t / log_uniform(random, 0.001, 0.008))
    return np.minimum(f, 6000.0)


def drive(random: Random, sound: Sound) -> Sound:
    """Saturation, from none to heavy."""
    if chance(random, 0.5):
        return sound
    gain = log_uniform(random, 0.5, 8)
    return np.asarray(np.tanh(gain * sound / (np.max(np.abs(sound)) + 1e-9)))


def drum_body(random: Random, t: Sound, pitch: float, most: float, seconds: float) -> Sound:
    """A sine or triangle that glides, perhaps with further modes of a membrane."""
    f = glide(random, t, pitch, most)
    turns = phase(f, len(t), random.random() if chance(random, 0.4) else 0.0)
    body = sine(turns)
    if chance(random, 0.25):
        body = 2 * np.abs(2 * (turns % 1) - 1) - 1
    body = body * decay(t, seconds, random.uniform(0.7, 1.3))
    if chance(random, 0.5):
        for ratio in SKIN[1 : 1 + random.integers(1, 6)]:
            level = random.uniform(0.02, 0.5) / ratio
            own = decay(t, seconds * random.uniform(0.1, 0.7))
            body += level * sine(phase(f * ratio * random.uniform(0.95, 1.05), len(t), random.random())) * own
    return body * attack(t, log_uniform(random, 0.0002, 0.004))


def kick(random: Random) -> Sound:
    seconds = log_uniform(random, 0.12, 1.1)
    t = times(seconds)
    body = drum_body(random, t, log_uniform(random, 33, 82), random.choice([1.5, 4, 9]), seconds)
    body += random.choice([0, 0.05, 0.2, 0.5]) * random.random() * click(random, t)
    if chance(random, 0.3):
        dull = low_pass(noise(random, len(t)), log_uniform(random, 150, 2500))
        body += random.uniform(0, 0.5) * dull * decay(t, log_uniform(random, 0.02, 0.2))
    return drive(random, body)


def tom(random: Random) -> Sound:
    seconds = log_uniform(random, 0.15, 1.3)
    t = times(seconds)
    body = drum_body(random, t, log_uniform(random, 68, 330), random.choice([1.15, 1.6, 3]), seconds)
    body += random.choice([0, 0.1, 0.4]) * random.random() * click(random, t)
    if chance(random, 0.5):
        pink = band(noise(random, len(t)), log_uniform(random, 60, 600), log_uniform(random, 700, 9000))
        body += random.uniform(0.02, 0.5) * pink * decay(t, log_uniform(random, 0.03, 0.5))
    return drive(random, body)


def conga(random: Random, bongo: bool = False) -> Sound:
    seconds = log_uniform(random, 0.06, 0.35 if bongo else 0.6)
    t = times(seconds)
    pitch = log_uniform(random, 260, 700) if bongo else log_uniform(random, 150, 480)
    f = pitch * (1 + random.choice([0, 0.05, 0.2]) * random.random() * np.exp(-t / log_uniform(random, 0.005, 0.05)))
    body = sine(phase(f, len(t), random.choice([0.0, 0.25]))) * decay(t, seconds, random.uniform(0.8, 1.2))
    if chance(random, 0.65):
        ratios = random.choice(np.stack([np.arange(3, 7) / 2, SKIN[1:5]])) * random.uniform(0.95, 1.08)
        body += modes(t, pitch * ratios, random.uniform(0.02, 0.6, 4), seconds * random.uniform(0.1, 0.8, 4), random)
    body += random.choice([0, 0.2, 0.8]) * random.random() * click(random, t)
    if chance(random, 0.3):  # slap
        body += random.uniform(0.1, 1) * band(noise(random, len(t)), 700, 5000) * decay(t, random.uniform(0.02, 0.08))
    return body * attack(t, log_uniform(random, 0.0003, 0.003))


def bongo(random: Random) -> Sound:
    return conga(random, bongo=True)


def snare(random: Random) -> Sound:
    seconds = log_uniform(random, 0.09, 0.7)
    t = times(seconds)
    pitch = log_uniform(random, 120, 360)
    f = glide(random, t, pitch, random.choice([1.1, 2, 3]))
    ring = seconds * random.uniform(0.2, 0.9)
    body = sine(phase(f, len(t))) * decay(t, ring)
    body += (
        random.uniform(0, 0.8)
        * sine(phase(f * random.uniform(1.4, 2.1), len(t)))
        * decay(t, ring * random.uniform(0.4, 1))
    )
    if chance(random, 0.4):
        count = int(random.integers(3, 9))
        own = ring * random.uniform(0.1, 0.8, count)
        body += 0.3 * modes(t, pitch * random.uniform(1, 6, count), random.uniform(0.05, 0.6, count), own, random)
    wires = noise(random, len(t))
    if chance(random, 0.6):
        wires = high_pass(wires, log_uniform(random, 200, 4500), int(random.integers(1, 4)))
    else:
        wires = band(wires, log_uniform(random, 300, 2500), log_uniform(random, 3500, 16000))
    wires = wires * decay(t, seconds * random.uniform(0.5, 1), random.uniform(0.6, 1.2))
    if chance(random, 0.3):
        wires *= attack(t, random.uniform(0.001, 0.012))
    wires /= np.max(np.abs(wires)) + 1e-9
    body /= np.max(np.abs(body)) + 1e-9
    share = random.uniform(0.25, 0.97)
    return drive(random, share * wires + (1 - share) * body + 0.3 * random.random() * click(random, t))


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


def closed_hat(random: Random) -> Sound:
    seconds = log_uniform(random, 0.025, 0.2)
    t = times(max(0.05, seconds))
    out = bright(random, metal(random, t), 2500, 9500) * decay(t, seconds, random.uniform(0.6, 1.3))
    if chance(random, 0.15):  # by the pedal
        out *= attack(t, random.uniform(0.003, 0.015))
    return out + 0.1 * random.random() * click(random, t)


def open_hat(random: Random) -> Sound:
    seconds = log_uniform(random, 0.25, 1.6)
    t = times(seconds * random.uniform(0.5, 1))
    return bright(random, metal(random, t), 2500, 9500) * decay(t, seconds, random.uniform(0.6, 1.4))


def crash(random: Random) -> Sound:
    seconds = log_uniform(random, 0.9, 4)
    t = times(min(2.2, seconds * random.uniform(0.4, 1)))
    source = metal(random, t)
    out = bright(random, source, 250, 4000) * decay(t, seconds, random.uniform(0.5, 1))
    out += random.uniform(0, 1.5) * bright(random, source, 3000, 8000) * decay(t, seconds * random.uniform(0.15, 0.8))
    out += random.uniform(0, 1) * band(noise(random, len(t)), 300, 9000) * decay(t, random.uniform(0.1, 0.6))
    return out * attack(t, log_uniform(random, 0.0005, 0.02))


def ride(random: Random) -> Sound:
    seconds = log_uniform(random, 0.6, 4)
    t = times(min(2.2, seconds * random.uniform(0.4, 1)))
    count = int(random.integers(6, 30))
    f = np.exp(random.uniform(np.log(500), np.log(9000), count))
    ping = modes(t, f, random.uniform(0.1, 1, count), random.uniform(0.1, 1, count) * seconds, random)
    if chance(random, 0.3):  # the bell
        count = int(random.integers(3, 7))
        ping += 3 * modes(t, random.uniform(500, 4500, count), random.uniform(0.3, 1, count), seconds, random)
    stick = bright(random, noise(random, len(t)), 2000, 7000) * decay(t, log_uniform(random, 0.02, 0.15))
    wash = bright(random, metal(random, t), 1500, 7000) * decay(t, seconds)
    ping /= np.std(ping) + 1e-9
    return ping * random.uniform(0.2, 1.2) + stick * random.uniform(0, 1.5) + wash * random.uniform(0.02, 0.5)


def cymbal(random: Random) -> Sound:
    seconds = log_uniform(random, 0.35, 2.5)
    t = times(min(2.2, seconds))
    source = metal(random, t)
    out = bright(random, source, 500, 5000) * decay(t, seconds, random.uniform(0.5, 1.1))
    return out + random.uniform(0, 1) * bright(random, source, 5000, 9000) * decay(t, seconds * random.uniform(0.3, 1))


def claps(random: Random) -> Sound:
    seconds = log_uniform(random, 0.1, 0.6)
    t = times(seconds)
    middle, width = log_uniform(random, 750, 2600), random.uniform(0.25, 1.3)
    envelope = np.zeros_like(t)
    gap, start = random.uniform(0.006, 0.016), 0.0
    for _ in range(int(random.choice([1, 2, 3, 3, 4, 4, 5]))):
        later = t - start
        envelope = np.maximum(
            envelope,
            np.where(later >= 0, decay(np.maximum(later, 0), gap * random.uniform(1, 6)), 0) * random.uniform(0.5, 1),
        )
        start += gap * random.uniform(0.75, 1.25)
    tail = np.where(t >= start - gap, decay(np.maximum(t - start + gap, 0), seconds * random.uniform(0.4, 1)), 0)
    envelope = np.maximum(envelope, tail * random.uniform(0.1, 1))
    sound = noise(random, len(t))
    if chance(random, 0.3):
        sound = high_pass(sound, log_uniform(random, 300, 900)) * 0.3 + band(sound, middle * 0.8, middle * 1.25)
    return drive(random, band(sound, middle * 2**-width, middle * 2**width) * envelope)


def rim(random: Random) -> Sound:
    seconds = log_uniform(random, 0.012, 0.12)
    t = times(max(0.04, seconds * 1.2))
    count = int(random.integers(1, 6))
    low = log_uniform(random, 350, 1900)
    f = low * np.concatenate([[1.0], random.uniform(1.2, 5, count)])
    body = modes(t, f, random.uniform(0.2, 1, count + 1), seconds * random.uniform(0.3, 1, count + 1), random)
    body += random.uniform(0.1, 1.5) * click(random, t)
    if chance(random, 0.4):  # the shell
        dry = band(noise(random, len(t)), low * random.uniform(0.7, 1.5), low * random.uniform(2, 6))
        body += random.uniform(0.2, 2) * dry * decay(t, seconds * random.uniform(0.4, 1.2))
    if chance(random, 0.3):
        body += random.uniform(0, 0.5) * sine(phase(log_uniform(random, 150, 300), len(t))) * decay(t, seconds)
    if chance(random, 0.3):
        body = high_pass(body, log_uniform(random, 300, 1200))
    return drive(random, body)


def cowbell(random: Random) -> Sound:
    seconds = log_uniform(random, 0.07, 0.7)
    t = times(seconds)
    low = log_uniform(random, 380, 950)
    ratio = random.uniform(1.35, 1.6)
    if chance(random, 0.55):
        out = square(phase(low, len(t)), low / RATE) + random.uniform(0.5, 1.2) * square(
            phase(low * ratio, len(t)), low * ratio / RATE
        )
        out = band(out, low * random.uniform(0.6, 1.1), low * random.uniform(2, 7))
    else:
        count = int(random.integers(3, 9))
        f = low * np.concatenate([[1.0, ratio], random.uniform(1.8, 9, count)])
        out = modes(
            t,
            f,
            np.concatenate([[1, 0.9], random.uniform(0.05, 0.6, count)]),
            seconds * random.uniform(0.3, 1, count + 2),
            random,
        )
        out += random.uniform(0, 0.5) * click(random, t)
    quick = random.uniform(0, 1) * decay(t, random.uniform(0.015, 0.06))
    return drive(random, out * (quick + decay(t, seconds, random.uniform(0.6, 1.1))))


def clave(random: Random) -> Sound:
    seconds = log_uniform(random, 0.02, 0.15)
    t = times(max(0.04, seconds))
    f = log_uniform(random, 1500, 3400)
    out = sine(phase(f, len(t), random.random())) * decay(t, seconds)
    if chance(random, 0.5):
        out += modes(
            t,
            f * random.uniform(1.3, 4, 2),
            random.uniform(0.02, 0.5, 2),
            seconds * random.uniform(0.2, 0.8, 2),
            random,
        )
    return out + random.uniform(0, 0.3) * click(random, t)


def woodblock(random: Random) -> Sound:
    seconds = log_uniform(random, 0.025, 0.2)
    t = times(max(0.05, seconds))
    f = log_uniform(random, 420, 1700)
    count = int(random.integers(1, 4))
    out = sine(phase(f * (1 + random.uniform(0, 0.2) * np.exp(-t / 0.003)), len(t))) * decay(t, seconds)
    out += modes(
        t,
        f * random.uniform(1.4, 4, count),
        random.uniform(0.03, 0.6, count),
        seconds * random.uniform(0.2, 0.7, count),
        random,
    )
    return out + random.uniform(0, 0.5) * click(random, t)


def shaker(random: Random) -> Sound:
    seconds = log_uniform(random, 0.03, 0.35)
    t = times(seconds * 1.3)
    rise = log_uniform(random, 0.001, 0.08)
    envelope = attack(t, rise) ** random.uniform(0.7, 2) * decay(np.maximum(t - rise, 0), seconds)
    if chance(random, 0.3):  # there and back
        later = t - rise - random.uniform(0.03, 0.12)
        envelope += random.uniform(0.3, 1) * np.where(later > 0, decay(np.maximum(later, 0), seconds), 0)
    sound = noise(random, len(t))
    if chance(random, 0.5):  # single grains
        grains = (random.random(len(t)) < log_uniform(random, 0.005, 0.1)) * noise(random, len(t))
        sound = band(grains, 3000, 12000)
    low = log_uniform(random, 2500, 9000)
    return band(sound, low, min(20000, low * random.uniform(1.5, 5))) * envelope


def tambourine(random: Random) -> Sound:
    seconds = log_uniform(random, 0.09, 0.7)
    t = times(seconds)
    out = np.zeros_like(t)
    for _ in range(int(random.integers(4, 25))):
        start = random.exponential(0.03) if chance(random, 0.8) else random.uniform(0, seconds / 2)
        later = t - start
        f = np.exp(random.uniform(np.log(3500), np.log(14000), 5))
        ring = modes(np.maximum(later, 0), f, random.uniform(0.2, 1, 5), random.uniform(0.05, 1, 5) * seconds, random)
        out += np.where(later > 0, ring, 0) * random.uniform(0.2, 1) * np.exp(-start / (seconds / 2))
    out /= np.std(out) + 1e-9
    hiss = high_pass(noise(random, len(t)), log_uniform(random, 3500, 8000)) * decay(
        t, seconds * random.uniform(0.3, 1)
    )
    out += random.uniform(0.1, 1.5) * hiss
    if chance(random, 0.3):  # the skin
        out += (
            random.uniform(0.5, 2)
            * sine(phase(log_uniform(random, 150, 500), len(t)))
            * decay(t, random.uniform(0.03, 0.1))
        )
    return out * attack(t, log_uniform(random, 0.0005, 0.02))


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


def other_percussion(random: Random) -> Sound:
    return [guiro, rung, snap][int(random.integers(3))](random)


VOICES: dict[str, Callable[[Random], Sound]] = {
    "kick": kick,
    "snare": snare,
    "closed hat": closed_hat,
    "open hat": open_hat,
    "crash": crash,
    "ride": ride,
    "cymbal": cymbal,
    "tom": tom,
    "claps": claps,
    "rim": rim,
    "cowbell": cowbell,
    "shaker": shaker,
    "tambourine": tambourine,
    "conga": conga,
    "bongo": bongo,
    "clave": clave,
    "woodblock": woodblock,
    "percussion": other_percussion,
}
