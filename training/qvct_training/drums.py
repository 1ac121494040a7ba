"""Voices of drum machines and simple acoustic drums, with every parameter drawn by chance."""

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
    faded,
    high_pass,
    log_uniform,
    low_pass,
    modes,
    noise,
    peaked,
    phase,
    resonance,
    sine,
    spread,
    struck,
    swept_low_pass,
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
    seconds = log_uniform(random, 0.1, 1.8)
    t = times(seconds)
    body = drum_body(random, t, log_uniform(random, 31, 95), random.choice([1.5, 4, 9]), seconds)
    body += random.choice([0, 0.05, 0.2, 0.5]) * random.random() * click(random, t)
    if chance(random, 0.3):
        dull = low_pass(noise(random, len(t)), log_uniform(random, 150, 2500))
        body += random.uniform(0, 0.5) * dull * decay(t, log_uniform(random, 0.02, 0.2))
    return drive(random, body)


def tom(random: Random) -> Sound:
    seconds = log_uniform(random, 0.1, 1.3)
    t = times(seconds)
    body = drum_body(random, t, log_uniform(random, 68, 330), random.choice([1.15, 1.6, 3]), seconds)
    body += random.choice([0, 0.1, 0.4]) * random.random() * click(random, t)
    if chance(random, 0.5):
        pink = band(noise(random, len(t)), log_uniform(random, 60, 600), log_uniform(random, 700, 9000))
        body += random.uniform(0.02, 0.5) * pink * decay(t, log_uniform(random, 0.03, 0.5))
    return drive(random, body)


def snare(random: Random) -> Sound:
    seconds = log_uniform(random, 0.09, 0.7)
    t = times(seconds)
    pitch = log_uniform(random, 95, 380)
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
    kind = random.random()
    if kind < 0.55:
        wires = high_pass(wires, log_uniform(random, 200, 4500), int(random.integers(1, 4)))
    elif kind < 0.85:
        wires = band(wires, log_uniform(random, 300, 2500), log_uniform(random, 3500, 16000))
    else:  # a filter that closes, as of electronic drums; or dull from the start
        top = log_uniform(random, 2000, 12000)
        wires = swept_low_pass(wires, top * random.uniform(0.05, 1) + top * decay(t, seconds), random.uniform(0.6, 2))
    wires = wires * faded(random, t, seconds * random.uniform(0.5, 1))
    if chance(random, 0.3):
        wires *= attack(t, random.uniform(0.001, 0.012))
    wires /= np.max(np.abs(wires)) + 1e-9
    body /= np.max(np.abs(body)) + 1e-9
    share = random.uniform(0.25, 0.97)
    return drive(random, share * wires + (1 - share) * body + 0.3 * random.random() * click(random, t))


def electronic_claps(random: Random) -> Sound:
    """One noise, let through several times."""
    seconds = log_uniform(random, 0.08, 0.8)
    t = times(seconds)
    middle, width = log_uniform(random, 650, 2800), random.uniform(0.25, 1.4)
    envelope = np.zeros_like(t)
    gap, start = random.uniform(0.006, 0.018), 0.0
    for _ in range(int(random.choice([3, 3, 4, 4, 5]))):
        later = np.maximum(t - start, 0)
        stroke = (t >= start) * decay(later, gap * random.uniform(1, 6)) * random.uniform(0.5, 1)
        envelope = np.maximum(envelope, stroke)
        start += gap * random.uniform(0.75, 1.25)
    tail = np.where(
        t >= start - gap, faded(random, np.maximum(t - start + gap, 0), seconds * random.uniform(0.4, 1)), 0
    )
    envelope = np.maximum(envelope, tail * random.uniform(0.1, 1))
    sound = noise(random, len(t))
    if chance(random, 0.3):
        sound = high_pass(sound, log_uniform(random, 300, 900)) * 0.3 + band(sound, middle * 0.8, middle * 1.25)
    return drive(random, band(sound, middle * 2**-width, middle * 2**width) * envelope)


def hand_claps(random: Random) -> Sound:
    """Some people in a room, not quite together; each pair of hands has a hollow of its own."""
    t = times(log_uniform(random, 0.15, 0.5))
    out, apart = np.zeros_like(t), log_uniform(random, 0.004, 0.02)
    for _ in range(int(random.choice([3, 4, 5, 8, 12]))):
        later = t - abs(random.normal(0, apart))
        middle = log_uniform(random, 700, 3200)
        one = band(noise(random, len(t)), middle / 1.5, middle * 1.5) + 0.3 * band(noise(random, len(t)), 400, 10000)
        out += (later >= 0) * one * decay(np.maximum(later, 0), log_uniform(random, 0.015, 0.09))
    return ambience(random, out) if chance(random, 0.8) else out


def claps(random: Random) -> Sound:
    return electronic_claps(random) if chance(random, 0.6) else hand_claps(random)


def electronic_rim(random: Random) -> Sound:
    """Two or three ringing circuits, distorted."""
    seconds = log_uniform(random, 0.01, 0.12)
    t = times(max(0.04, seconds * 1.2))
    f = log_uniform(random, 220, 1900) * np.concatenate([[1.0], random.uniform(1.2, 5, int(random.integers(1, 4)))])
    body = modes(t, f, random.uniform(0.2, 1, len(f)), seconds * random.uniform(0.3, 1, len(f)), random)
    body += random.uniform(0, 1) * click(random, t)
    if chance(random, 0.5):
        body = high_pass(body, log_uniform(random, 200, 1500))
    return drive(random, body)


def side_stick(random: Random) -> Sound:
    """A stick laid across the drum: wood on the hoop, the shell, and a rattle of the wires."""
    t = times(log_uniform(random, 0.06, 0.4))
    low = log_uniform(random, 250, 1300)
    f = np.concatenate([[low], spread(random, low * 1.1, min(14000, low * 14), int(random.integers(3, 14)))])
    out = struck(random, t, f, log_uniform(random, 0.03, 0.25), log_uniform(random, 1500, 9000))
    dry = band(noise(random, len(t)), log_uniform(random, 400, 2500), log_uniform(random, 4000, 14000))
    out += log_uniform(random, 0.1, 3) * peaked(dry * decay(t, log_uniform(random, 0.01, 0.3)))
    if chance(random, 0.5):
        rattle = high_pass(noise(random, len(t)), log_uniform(random, 1500, 6000)) * decay(t, t[-1])
        out += log_uniform(random, 0.01, 0.3) * peaked(rattle)
    if chance(random, 0.5):
        head = sine(phase(log_uniform(random, 140, 520), len(t))) * decay(t, log_uniform(random, 0.03, 0.2))
        out += random.uniform(0, 1.0) * head
    if chance(random, 0.5):  # the tip lands before the shaft
        late = int(random.uniform(0.001, 0.009) * RATE)
        out = np.concatenate([np.zeros(late), out[:-late]]) + random.uniform(0.05, 0.6) * click(random, t)
    return ambience(random, out) if chance(random, 0.8) else out


def short_stick(random: Random) -> Sound:
    """As early samplers kept it: a burst about one tone, at any speed of the tape or clock, and cut short."""
    seconds = log_uniform(random, 0.03, 0.2)
    t = times(seconds * random.uniform(0.7, 1.2))
    low = log_uniform(random, 350, 2400)
    out = peaked(resonance(noise(random, len(t)), low, log_uniform(random, 0.7, 6)) * decay(t, seconds))
    rung = low * np.concatenate([[1.0], random.uniform(0.5, 4, int(random.integers(1, 6)))])
    out += log_uniform(random, 0.1, 3) * struck(random, t, rung, seconds, log_uniform(random, 1500, 9000))
    return drive(random, out * attack(t, log_uniform(random, 0.0003, 0.008)))


def rim_shot(random: Random) -> Sound:
    """The hoop and the head of a snare at once."""
    drum = peaked(snare(random))
    t = np.arange(len(drum)) / RATE
    ring = struck(random, t, spread(random, 350, 3500, 6), log_uniform(random, 0.05, 0.4), 4000)
    return drive(random, random.uniform(0.1, 0.7) * drum + ring)


def rim(random: Random) -> Sound:
    voices = [electronic_rim, side_stick, short_stick, rim_shot]
    return voices[int(random.choice(4, p=[0.3, 0.4, 0.2, 0.1]))](random)


VOICES: dict[str, Callable[[Random], Sound]] = {
    "kick": kick,
    "snare": snare,
    "tom": tom,
    "claps": claps,
    "rim": rim,
}
