"""Grooves as people play them, as lists of strokes: patterns of common styles and metres, every choice by chance."""

from collections.abc import Callable
from dataclasses import dataclass

import numpy as np
import numpy.typing as npt

from .dsp import RATE, Random, chance, log_uniform

Event = tuple[float, str, float]  # quarters from the beginning, k(ick), s(nare) or h(at), velocity
Bar = Callable[[Random, float], list[Event]]

LOUDEST = {"k": 0.48, "s": 0.44, "h": 0.32}  # as the detector of onsets says of machines
ONE_STROKE = 0.03  # seconds
BEFORE = 0.02


@dataclass
class Loop:
    """What is known of a loop's strokes, and its tempo in quarters a minute."""

    frames: int
    onsets: npt.NDArray[np.uint32]
    loudness: npt.NDArray[np.float32]
    bpm: float


def grid(quarters: float, step: float, first: float = 0.0) -> list[float]:
    """Positions in a bar."""
    return [float(x) for x in np.arange(first, quarters - 1e-9, step)]


def backbeat(random: Random, quarters: float) -> list[float]:
    """Where the snare is, by the length of the bar."""
    if quarters == 3:
        choices = [[1.0, 2.0], [2.0], [1.0]]
    elif quarters == 3.5:
        choices = [[1.0, 3.0], [1.0, 2.5], [1.0, 2.0, 3.0]]
    elif quarters == 5:
        choices = [[1.0, 3.0], [1.0, 3.0, 4.0], [2.0, 4.0], [1.5, 3.0]]
    else:
        choices = [[1.0, 3.0]] * 13 + [grid(quarters, 1), grid(quarters, 1, 0.5)]
    return choices[int(random.integers(len(choices)))]


def kick_chance(position: float, is_snare: bool) -> float:
    """How likely a kick is there in rock."""
    if position == 0:
        return 0.95
    by_level = 0.45 if position % 1 == 0 and not is_snare else 0.25 if position % 0.5 == 0 else 0.07
    return by_level * (0.1 if is_snare else 1)


def rock(random: Random, quarters: float, halftime: bool = False) -> list[Event]:
    """Hats, a backbeat, kicks and perhaps ghost notes."""
    snares = [2.0] if halftime else backbeat(random, quarters)
    loud, soft = random.uniform(0.15, 0.5), random.uniform(0.4, 1)
    if chance(random, 0.08):
        events: list[Event] = [(x, "h", loud) for x in grid(quarters, 1, 0.5)]
    else:
        step = float(random.choice([0.5, 0.25] if halftime else [0.5, 0.5, 0.5, 0.25, 0.25, 1.0]))
        events = [(x, "h", loud * (1 if x % 1 == 0 else soft)) for x in grid(quarters, step)]
    events += [(x, "s", 1.0) for x in snares]
    slower = 0.7 if halftime else 1
    for x in grid(quarters, 0.25):
        if chance(random, kick_chance(x, x in snares) * (slower if x else 1)):
            events.append((x, "k", 1.0))
    ghosts = random.uniform(0, 0.35) if chance(random, 0.5) else 0
    return events + [
        (x, "s", random.uniform(0.08, 0.3)) for x in grid(quarters, 0.25) if x not in snares and chance(random, ghosts)
    ]


def halftime_rock(random: Random, quarters: float) -> list[Event]:
    """The snare on the third beat only."""
    return rock(random, quarters, halftime=True)


def house(random: Random, quarters: float) -> list[Event]:
    """A kick on each beat."""
    events: list[Event] = [(x, "k", 1.0) for x in grid(quarters, 1)]
    if chance(random, 0.8):
        events += [(x, "h", 0.5) for x in grid(quarters, 1, 0.5)]
    if chance(random, 0.8):
        events += [(1.0, "s", 0.8), (3.0, "s", 0.8)]
    if chance(random, 0.4):
        events += [(x, "h", 0.2) for x in grid(quarters, 0.25)]
    return events


def breakbeat(random: Random, quarters: float) -> list[Event]:
    """Syncopated kicks between snares on 2 and 4."""
    events: list[Event] = [(0.0, "k", 1.0), (1.0, "s", 1.0), (3.0, "s", 1.0)]
    events += [(x, "k", 0.9) for x in (0.5, 1.75, 2.25, 2.5) if chance(random, 0.45)]
    events += [(x, "h", 0.3) for x in grid(quarters, 0.5)]
    return events + [(x, "s", 0.2) for x in grid(quarters, 0.25) if chance(random, 0.15)]


def shuffle(random: Random, quarters: float) -> list[Event]:
    """Hats in triplets, the snare on 2 and 4 or on 3."""
    late, halftime = 2 / 3, chance(random, 0.4)
    events: list[Event] = [(x, "s", 1.0) for x in ([2.0] if halftime else [1.0, 3.0])]
    for x in grid(quarters, 1):
        events += [(x, "h", 0.45), (x + late, "h", random.uniform(0.2, 0.4))]
        for at, kind, velocity, likely in (
            (x, "k", 1.0, 0.95 if x == 0 else 0.4),
            (x + late, "k", 0.8, 0.3),
            (x + late / 2, "s", 0.15, 0.6 if halftime else 0.08),
        ):
            if chance(random, likely):
                events.append((at, kind, velocity))
    return events


def jazz(random: Random, quarters: float) -> list[Event]:
    """A swinging ride, the hi-hat's pedal, and comments."""
    late = 2 / 3
    swung = [1.0] if quarters == 3 else [1.0, 3.0]
    events: list[Event] = [(x, "h", 0.55 if x in swung else 0.4) for x in grid(quarters, 1)]
    events += [(x + late, "h", 0.35) for x in swung if chance(random, 0.9)]
    events += [(x, "h", 0.25) for x in ([1.0, 2.0] if quarters == 3 else swung)]
    for x in grid(quarters, 1):
        for at in (x, x + late):
            if chance(random, 0.18):
                events.append((at, "s", random.uniform(0.1, 0.5)))
            if chance(random, 0.15):
                events.append((at, "k", random.uniform(0.15, 0.7)))
    return events


def samba(random: Random, quarters: float) -> list[Event]:
    """Sixteenths over a surdo."""
    events: list[Event] = [(x, "h", float(random.choice([0.25, 0.3, 0.45]))) for x in grid(quarters, 0.25)]
    for x in grid(quarters, 1):
        events += [(x, "k", 0.6)] * chance(random, 0.7) + [(x + 0.75, "k", 0.8)] * chance(random, 0.8)
    return events + [(x, "s", random.uniform(0.2, 0.9)) for x in grid(quarters, 0.25) if chance(random, 0.3)]


def clave(random: Random, quarters: float) -> list[Event]:
    """One side of a clave, or of a bossa nova's, over kicks."""
    pattern = [[0, 1.5, 3], [0, 0.75, 1.5, 2.5, 3]][int(random.integers(2))]
    events: list[Event] = [(float(x), "s", 0.8) for x in pattern]
    events += [(x, "h", 0.35) for x in grid(quarters, 0.5)]
    events += [(x, "k", 0.8) for x in (0.0, 1.5, 2.0, 3.0, 3.5) if chance(random, 0.6)]
    return events + [(x, "h", 0.25) for x in grid(quarters, 0.25) if chance(random, 0.3)]


def reggae(random: Random, quarters: float) -> list[Event]:
    """Kick and snare on the third beat."""
    events: list[Event] = [(x, "h", 0.4) for x in grid(quarters, 0.5)]
    events += [(2.0, "k", 1.0), (2.0, "s", 1.0)]
    if chance(random, 0.4):
        events += [(x, "k", 0.8) for x in grid(quarters, 1)]
    return events + [(x, "s", 0.3) for x in grid(quarters, 0.25) if chance(random, 0.08)]


def compound(random: Random, quarters: float) -> list[Event]:
    """6/8 and 12/8: eighths in threes."""
    events: list[Event] = [(x, "h", 0.45 if x % 1.5 == 0 else 0.28) for x in grid(quarters, 0.5)]
    if chance(random, 0.2):
        events = [(x, "h", 0.4) for x in grid(quarters, 1.5)]
    if chance(random, 0.25):
        events += [(x, "h", 0.2) for x in grid(quarters, 0.25)]
    for x in grid(quarters, 3):
        events += [(x, "k", 1.0), (x + 1.5, "s", 1.0)]
    for x in grid(quarters, 0.5):
        events += [(x, "k", 0.8)] * chance(random, 0.22) + [(x, "s", 0.25)] * chance(random, 0.12)
    return events


def fill(random: Random, quarters: float) -> list[Event]:
    """Drums all over."""
    step, likely = float(random.choice([0.25, 0.25, 0.5, 1 / 3, 1 / 6])), random.uniform(0.5, 0.95)
    return [
        (x, str(random.choice(["s", "s", "k"])), random.uniform(0.3, 1))
        for x in grid(quarters, step)
        if chance(random, likely)
    ]


# How common, quarters to a bar, from what tempo to what, and what is played.
STYLES: list[tuple[float, float, float, float, Bar]] = [
    (26, 4, 72, 165, rock),
    (7, 4, 120, 175, halftime_rock),
    (5, 4, 55, 78, rock),
    (12, 4, 82, 125, breakbeat),
    (6, 4, 115, 136, house),
    (4, 4, 160, 178, breakbeat),
    (8, 4, 75, 150, shuffle),
    (8, 4, 105, 260, jazz),
    (3, 3, 95, 200, jazz),
    (4, 4, 78, 150, samba),
    (5, 4, 78, 150, clave),
    (2, 4, 65, 150, reggae),
    (3, 4, 140, 200, rock),
    (4, 3, 75, 165, rock),
    (5, 3, 70, 170, compound),
    (2, 6, 70, 170, compound),
    (4, 5, 80, 170, rock),
    (2, 3.5, 80, 150, rock),
]


def tempo_between(random: Random, slowest: float, fastest: float) -> float:
    """Most are whole numbers, and many of those tens or fives."""
    bpm = log_uniform(random, slowest, fastest)
    steps = [10.0] * 30 + [5.0] * 20 + [1.0] * 38 + [0.0] * 12
    step = steps[int(random.integers(len(steps)))]
    return round(bpm / step) * step if step else bpm


def performed(random: Random, events: list[Event], quarter: float) -> list[tuple[float, float]]:
    """Times in seconds and loudness, with swing, drift, habits and jitter."""
    jitter = log_uniform(random, 0.002, 0.02) if chance(random, 0.85) else 0.0005
    wander, habit, snare_habit = (
        random.uniform(0, 1) * jitter,
        random.normal(0, jitter / 2 + 0.003),
        random.normal(0, 0.006),
    )
    swing = random.uniform(0, 0.3) if chance(random, 0.25) else 0.0
    level = float(random.choice([0.5, 0.25]))
    strokes = []
    drift, last = 0.0, 0.0
    for x, kind, velocity in sorted(events):
        drift = drift * 0.9 ** (x - last) + random.normal(0, wander * np.sqrt(x - last))
        last = x
        late = swing * level if (x / level) % 2 == 1 else 0.0
        time = (x + late) * quarter + drift + habit + random.normal(0, jitter) + (snare_habit if kind == "s" else 0)
        strokes.append((time, LOUDEST[kind] * velocity**0.3))
    return sorted(strokes)


def heard(random: Random, strokes: list[tuple[float, float]], seconds: float) -> list[tuple[float, float]]:
    """What a detector of onsets makes of strokes: those at once are one, and some soft ones after loud ones are missed."""
    merged: list[tuple[float, float]] = []
    for time, loudness in strokes:
        if merged and time - merged[-1][0] < ONE_STROKE:
            merged[-1] = (merged[-1][0], max(merged[-1][1], loudness))
        elif -BEFORE <= time < seconds - 0.01:
            merged.append((max(time, 0.0), loudness))
    deafness = random.uniform(0.2, 0.9)
    out: list[tuple[float, float]] = []
    for time, loudness in merged:
        masked = bool(out) and loudness < 0.62 * out[-1][1] and time - out[-1][0] < 0.12
        if not chance(random, deafness if masked else 0.02):
            out.append((time, loudness * np.exp(random.normal(0, 0.06))))
    return out


def groove(random: Random) -> Loop:
    """1 to 8 bars, half of them with a tail of 0.15 to 1 s."""
    shares = np.array([style[0] for style in STYLES])
    _, quarters, slowest, fastest, style = STYLES[int(random.choice(len(STYLES), p=shares / shares.sum()))]
    bpm = tempo_between(random, slowest, fastest)
    bars = int(random.choice([1, 2, 4, 8]))
    pair = [style(random, quarters)] * 2
    if chance(random, 0.25):
        pair[1] = style(random, quarters)
    events = [
        (x + bar * quarters, kind, velocity)
        for bar in range(bars)
        for x, kind, velocity in pair[bar % 2]
        if chance(random, 0.94)
    ]
    if bars > 1 and chance(random, 0.2):
        last = (bars - 1) * quarters
        begin = quarters * float(random.choice([0.5, 0.75]))
        events = [event for event in events if event[0] < last + begin]
        events += [(x + last, kind, v) for x, kind, v in fill(random, quarters) if x >= begin]
    seconds = bars * quarters * 60 / bpm
    strokes = heard(random, performed(random, events, 60 / bpm), seconds)
    tail = random.uniform(0.15, 1) if chance(random, 0.5) else 0
    return Loop(
        round((seconds + tail) * RATE),
        np.array([round(time * RATE) for time, _ in strokes], np.uint32),
        np.array([loudness for _, loudness in strokes], np.float32),
        bpm,
    )
