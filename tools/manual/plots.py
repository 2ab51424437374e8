"""The manual's curve plots, from the response curves that the render tool
writes (sombrel-render --curves: bin,hz,profile,eq,bass,subbass,treble,total).

    /usr/bin/python3 plots.py CURVES-DIR OUT-DIR

CURVES-DIR holds one CSV per case, written by scripts/manual: the eight
profiles (white.csv ... dogs.csv, all other controls in the middle), the
example equaliser setting (equaliser.csv, with docs/manual/example-eq.txt)
and the tone controls at both ends (bass-1.csv ... treble-255.csv).
Writes into OUT-DIR: profile-NAME.png for each profile, profiles.png (all
eight; the README shows a copy, docs/profiles.png), equaliser.png and
tone.png. The same curves give the same PNG bytes (no software or date
stamp in the files).
"""
import os
import sys

import matplotlib

matplotlib.use("Agg")
import matplotlib.pyplot as plt  # noqa: E402
import numpy as np  # noqa: E402

COLOURS = ["white", "pink", "red", "brown"]
MASKING = ["talking", "music", "traffic", "dogs"]
TITLES = {"white": "White", "pink": "Pink", "red": "Red", "brown": "Brown",
          "talking": "Talking / TV", "music": "Music", "traffic": "Traffic", "dogs": "Dogs"}
LINE = {"white": "#7a7a7a", "pink": "#d6589a", "red": "#c62828", "brown": "#795548",
        "talking": "#1565c0", "music": "#6a1b9a", "traffic": "#ef6c00", "dogs": "#2e7d32"}
FIRST_BIN, LAST_BIN = 6, 6825       # the band that reaches the sound, 17.6 Hz .. 20 kHz
TICKS = [20, 50, 100, 200, 500, 1000, 2000, 5000, 10000, 20000]
TICK_TEXT = ["20", "50", "100", "200", "500", "1k", "2k", "5k", "10k", "20k"]
DPI = 160
STAMP = {"Software": None}          # no version stamp: the same curves give the same bytes


def curves(directory, name):
    data = np.genfromtxt(os.path.join(directory, name + ".csv"), delimiter=",", names=True)
    band = (data["bin"] >= FIRST_BIN) & (data["bin"] <= LAST_BIN)
    return data[band]


def db(values):
    return 20.0 * np.log10(values)


def frequency_axis(axes, low, high, step):
    axes.set_xscale("log")
    axes.set_xlim(17.5, 20000)
    axes.set_xticks(TICKS)
    axes.set_xticklabels(TICK_TEXT)
    axes.minorticks_off()
    axes.set_ylim(low, high)
    axes.set_yticks(np.arange(low, high + 1, step))
    axes.grid(True, color="#d0d0d0", linewidth=0.6)
    axes.axhline(0, color="#909090", linewidth=0.8)
    axes.tick_params(labelsize=8)
    for side in ("top", "right"):
        axes.spines[side].set_visible(False)


def save(figure, out, name):
    figure.savefig(os.path.join(out, name), dpi=DPI, metadata=STAMP)
    plt.close(figure)


def main(source, out):
    os.makedirs(out, exist_ok=True)
    profile = {name: curves(source, name) for name in COLOURS + MASKING}

    # One small plot per profile, all on the same scale, as heard with every
    # other control in the middle (the total response, whose mean power is 1).
    for name, data in profile.items():
        figure, axes = plt.subplots(figsize=(3.4, 2.0), layout="constrained")
        frequency_axis(axes, -60, 40, 20)
        axes.plot(data["hz"], db(data["total"]), color=LINE[name], linewidth=1.6)
        axes.set_title(TITLES[name], fontsize=10, loc="left")
        axes.set_xlabel("frequency (Hz)", fontsize=8)
        axes.set_ylabel("gain (dB)", fontsize=8)
        save(figure, out, "profile-" + name + ".png")

    # All eight on two panels, for the README.
    figure, panels = plt.subplots(1, 2, figsize=(9.0, 3.2), layout="constrained", sharey=True)
    for axes, group, title in ((panels[0], COLOURS, "Noise colours"),
                               (panels[1], MASKING, "Masking profiles")):
        frequency_axis(axes, -60, 40, 20)
        for name in group:
            axes.plot(profile[name]["hz"], db(profile[name]["total"]), color=LINE[name],
                      linewidth=1.6, label=TITLES[name])
        axes.set_title(title, fontsize=10, loc="left")
        axes.set_xlabel("frequency (Hz)", fontsize=8)
        axes.legend(fontsize=8, frameon=False, loc="lower left")
    panels[0].set_ylabel("gain (dB)", fontsize=8)
    save(figure, out, "profiles.png")

    # The example equaliser setting: its curve, and each band's level at its
    # centre frequency as the slider sets it.
    root = os.path.dirname(os.path.dirname(os.path.dirname(os.path.abspath(__file__))))
    with open(os.path.join(root, "docs", "manual", "example-eq.txt")) as f:
        sliders = np.array([int(v) for v in f.read().strip().split(",")], dtype=float)
    centres = 20.0 * 2.0 ** (np.arange(31) * 0.332195)
    levels = -(sliders * 0.15748031 - 20.15748)
    data = curves(source, "equaliser")
    figure, axes = plt.subplots(figsize=(6.4, 2.6), layout="constrained")
    frequency_axis(axes, -20, 20, 5)
    axes.plot(data["hz"], db(data["eq"]), color="#1565c0", linewidth=1.6, label="equaliser curve")
    axes.plot(centres, levels, "o", color="#c62828", markersize=3.5, label="band sliders")
    axes.set_xlabel("frequency (Hz)", fontsize=8)
    axes.set_ylabel("gain (dB)", fontsize=8)
    axes.legend(fontsize=8, frameon=False, loc="lower left")
    save(figure, out, "equaliser.png")

    # The tone controls at both ends of their sliders.
    figure, axes = plt.subplots(figsize=(6.4, 2.6), layout="constrained")
    frequency_axis(axes, -20, 20, 5)
    for column, control, colour in (("bass", "bass", "#2e7d32"), ("subbass", "sub-bass", "#6a1b9a"),
                                    ("treble", "treble", "#ef6c00")):
        for value, style in ((255, "-"), (1, "--")):
            data = curves(source, "%s-%d" % (control, value))
            label = "%s %s" % (control.replace("-", " ").title(), "right" if value == 255 else "left")
            # Only the range the control shapes: elsewhere it leaves 1.0.
            shaped = np.where(data[column] == 1.0, np.nan, db(data[column]))
            axes.plot(data["hz"], shaped, style, color=colour, linewidth=1.6, label=label)
    axes.set_xlabel("frequency (Hz)", fontsize=8)
    axes.set_ylabel("gain (dB)", fontsize=8)
    axes.legend(fontsize=7, frameon=False, ncol=3, loc="upper center")
    save(figure, out, "tone.png")


if __name__ == "__main__":
    if len(sys.argv) != 3:
        sys.exit("usage: plots.py CURVES-DIR OUT-DIR")
    main(sys.argv[1], sys.argv[2])
