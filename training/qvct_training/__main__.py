"""Makes the model: see training/README.md."""

import os

os.environ["OPENBLAS_NUM_THREADS"] = "1"  # so that sums are made in the same order each time

import argparse
import json
from collections.abc import Callable, Iterable
from dataclasses import dataclass, field
from functools import partial
from pathlib import Path

from . import dataset, likeness, recordings
from .classes import FAMILIES
from .judging import Answers, calibrated, calibration, likelihoods, reliability
from .model_file import likeness_bytes, model_bytes, rounded
from .network import Settings
from .training import left_out, trained

FLUID_KITS = [0, 1, 2, 3, 4, 8, 9, 16, 17, 24, 25, 32, 33, 40, 48]
GENERAL_KITS = [0, 8, 16, 24, 25, 32, 40, 48]


@dataclass
class Options:
    """Where everything is; sources and models that are not given are left out."""

    features: Path
    tables: Path
    figures: Path
    model: Path | None = None
    likeness: Path | None = None
    recordings: Path | None = None
    machines: Path | None = None
    live_coding: Path | None = None
    toolkit: Path | None = None
    fluid: Path | None = None
    musescore: Path | None = None
    test: list[str] = field(default_factory=list)
    test_font: list[str] = field(default_factory=list)
    processes: int = 2


def options() -> Options:
    """What the command line says."""
    parser = argparse.ArgumentParser("qvct_training", description=__doc__)
    for name, text in [
        ("features", "the program qvct-features"),
        ("tables", "folder where measured features are kept"),
        ("figures", "JSON file of the models' figures"),
    ]:
        parser.add_argument(f"--{name}", type=Path, required=True, help=text)
    for name, text in [
        ("model", "the model of instruments to write"),
        ("likeness", "the model of likeness to write"),
        ("recordings", "folder of labelled recordings (labels.tsv)"),
        ("machines", "folder of drum machines' sounds"),
        ("live-coding", "samples of supersonic-scsynth-samples"),
        ("toolkit", "waves of Debian's stk"),
        ("fluid", "FluidR3_GM.sf2"),
        ("musescore", "MuseScore_General_Full.sf3"),
    ]:
        parser.add_argument(f"--{name}", type=Path, help=text)
    parser.add_argument("--test", action="append", default=[], metavar="NAME=FOLDER", help="sounds for figures only")
    parser.add_argument("--test-font", action="append", default=[], metavar="NAME=FONT", help="a font for figures only")
    parser.add_argument("--processes", type=int, default=2)
    return Options(**vars(parser.parse_args()))


Recipes = Callable[[], Iterable[dataset.Recipe]]


def _of_recordings(
    of: Callable[[Path], Iterable[recordings.Recording]], folder: Path, source: str, copies: int
) -> Iterable[dataset.Recipe]:
    return dataset.of_recordings(of(folder), source, copies)


def training_recipes(given: Options) -> dict[str, Recipes]:
    """What the model is trained on, by source."""
    found: dict[str, Recipes] = {"synthesis": partial(dataset.synthesis, DRUM_SOUNDS, TONE_SOUNDS)}
    for source, folder, of, copies in (
        ("recordings", given.recordings, recordings.labelled, 2),
        ("machines", given.machines, recordings.by_name, 12),
        ("live coding", given.live_coding, recordings.live_coding, 8),
        ("toolkit", given.toolkit, recordings.toolkit_drums, 12),
    ):
        if folder is not None:
            found[source] = partial(_of_recordings, of, folder, source, copies)
    if given.fluid:
        found["fluid"] = partial(dataset.of_font, given.fluid, "fluid", FLUID_KITS, 14, [0, 8], 2)
    if given.musescore:
        found["musescore"] = partial(dataset.of_font, given.musescore, "musescore", GENERAL_KITS, 14, [0], 2)
    return found


def test_recipes(given: Options) -> dict[str, Recipes]:
    """What it is measured on and never trained on, by name."""
    found: dict[str, Recipes] = {}
    for name, folder in (each.split("=", 1) for each in given.test):
        found[name] = partial(_of_recordings, recordings.by_name, Path(folder), name, 1)
    for name, font in (each.split("=", 1) for each in given.test_font):
        found[name] = partial(dataset.of_font, Path(font), name, GENERAL_KITS, 6, [0], 1)
    return found


def table_of(given: Options, name: str, recipes: Recipes) -> dataset.Table:
    """The features of a source, measured now or kept from before."""
    path = given.tables / f"{name}.npz"
    if not path.exists():
        given.tables.mkdir(parents=True, exist_ok=True)
        dataset.measured(given.features, list(recipes()), given.processes).save(path)
    return dataset.Table.load(path)


def figures_of(answers: Answers) -> dict[str, float | int]:
    """How many, and how many of them are right."""
    out: dict[str, float | int] = {}
    for kind, part in (("drums", answers.drums()), ("tones", answers.tones())):
        if len(part.said):
            out |= {kind: len(part.said), f"{kind} right": round(part.share_right(), 3)}
            out[f"{kind} surest right"] = round(part.share_right_of_surest(), 3)
    return out


def by_family(answers: Answers) -> dict[str, tuple[int, float]]:
    """Of each family: how many sounds, and the share that is right."""
    parts = [(family.name, answers.where(answers.wanted == i)) for i, family in enumerate(FAMILIES)]
    return {name: (len(part.said), round(part.share_right(), 3)) for name, part in parts if len(part.said)}


Figures = dict[str, object]


def make_instruments(path: Path, processes: int, table: dataset.Table, unmet: dict[str, dataset.Table]) -> Figures:
    """Trains, calibrates and writes the model that tells instruments."""
    settings = Settings()
    answers_left_out = left_out(table, settings, processes)
    points = calibration(dataset_answers(answers_left_out))
    networks = [rounded(network) for network in trained(table, settings, SEEDS)]
    path.write_bytes(model_bytes(table.version, networks, points))
    figures: Figures = {"left out": {name: figures_of(answers) for name, answers in answers_left_out.items()}}
    for name, part in unmet.items():
        answers = Answers.of(likelihoods(networks, part.features), part.classes)
        answers.sure = calibrated(answers.sure, points)
        figures[name] = figures_of(answers) | {"reliability": reliability(answers), "families": by_family(answers)}
    return figures


def make_likeness(path: Path, processes: int, table: dataset.Table, unmet: dict[str, dataset.Table]) -> Figures:
    """Fits and writes the model that tells where a sound lies among others."""
    its = likeness.fitted(table)
    middles = likeness.centres(its.places(table.features))
    path.write_bytes(likeness_bytes(table.version, its.direction, likeness.DIRECTION, its.differences, middles))
    figures: Figures = {"left out": likeness.left_out(table, processes)}
    return figures | likeness.test_figures(its, table, unmet) if unmet else figures


def main() -> None:
    """Measures what was not measured before, and makes the models and their figures."""
    given = options()
    sources = {name: table_of(given, name, recipes) for name, recipes in training_recipes(given).items()}
    unmet = {name: table_of(given, name, recipes) for name, recipes in test_recipes(given).items()}
    table = dataset.joined(list(sources.values()))
    figures: Figures = {"sounds": {name: len(part.classes) for name, part in sources.items()}}
    if given.model:
        figures["instruments"] = make_instruments(given.model, given.processes, table, unmet)
    if given.likeness:
        figures["likeness"] = make_likeness(given.likeness, given.processes, table, unmet)
    given.figures.write_text(json.dumps(figures, indent=1) + "\n")


def dataset_answers(parts: dict[str, Answers]) -> Answers:
    """All answers as one."""
    first, *rest = parts.values()
    for each in rest:
        first = first.joined(each)
    return first


DRUM_SOUNDS, TONE_SOUNDS = 600, 250  # of each class
SEEDS = (1, 2)

if __name__ == "__main__":
    main()
