"""Writes the chart and the table of docs/performance.md from the results of the last full run of scripts/bench.

Usage: /usr/bin/python3 bench/publish.py
"""

import json
import pathlib
import re

import matplotlib
import matplotlib.pyplot

from run import COMMANDS, FOLDER, PEER_EDGE, SYSTEMS

DOCS = pathlib.Path(__file__).resolve().parent.parent / "docs"
ALL_EDGES = ("uint16", "float32")  # the page shows these workloads at every size
COLOURS = dict(zip(COMMANDS, ("#0b5fa5", "#6baed6", "#e6550d", "#fdae6b", "#31a354", "#756bb1")))


def chart(rows, file):
    """Draws bars of ratios, grouped by pixel type."""
    matplotlib.rcParams.update({"svg.fonttype": "none", "svg.hashsalt": "", "font.family": "sans-serif"})
    figure, axes = matplotlib.pyplot.subplots(figsize=(10, 4.5), layout="constrained")
    width = 0.9 / len(COMMANDS)
    for number, (method, colour) in enumerate(COLOURS.items()):
        places = [(place + (number - (len(COMMANDS) - 1) / 2) * width, row["ratios"][method])
                  for place, row in enumerate(rows) if method in row["ratios"]]
        axes.bar([x for x, _ in places], [ratio for _, ratio in places], width, color=colour,
                 label=f"this project, {method}" if method in SYSTEMS else method)
    axes.set_yscale("log")
    axes.set_ylim(bottom=1)
    axes.set_yticks([1, 2, 5, 10, 20, 50, 100], ["1", "2", "5", "10", "20", "50", "100"])
    axes.minorticks_off()
    axes.set_xticks(range(len(rows)), [row["workload"] for row in rows])
    axes.set_ylabel("time / time of the bare read")
    axes.grid(axis="y", alpha=0.4)
    axes.set_axisbelow(True)
    axes.legend(ncols=len(COMMANDS), loc="upper center", bbox_to_anchor=(0.5, 1.1), frameon=False)
    figure.savefig(file, metadata={"Date": None, "Creator": None})


def table(rows):
    lines = ["| workload | read ms | " + " | ".join(COMMANDS) + " |", "|---|" + "--:|" * (len(COMMANDS) + 1)]
    for row in rows:
        read = row["read_ns"].get("native") or row["read_ns"]["DLL"]
        size = f" at {row['request']}" if row["request"] not in (None, PEER_EDGE) else ""
        ratios = (f"{row['ratios'][method]:.2f}" if method in row["ratios"] else "" for method in COMMANDS)
        lines.append(f"| {row['workload']}{size} | {read / 1e6:.2f} | " + " | ".join(ratios) + " |")
    return "\n".join(lines)


def main():
    results = json.loads((FOLDER / "results.json").read_text())
    rows = [row for row in results["rows"] if row["request"] in (None, PEER_EDGE) or row["workload"] in ALL_EDGES]
    # Only the main workload of a pixel type has a name without a space.
    chart([row for row in rows if row["request"] == PEER_EDGE and " " not in row["workload"]], DOCS / "performance.svg")
    page = DOCS / "performance.md"
    parts = re.split("(<!-- (?:table|end of table) -->\n)", page.read_text())
    parts[2] = f"\n{table(rows)}\n\n"
    page.write_text("".join(parts))


if __name__ == "__main__":
    main()
