"""The tables that are printed, which are Markdown, and the machine that they are about."""

import os
import platform
import re
import subprocess

from goals import MISSED, REACHED

MIB = 2**20


class Table:
    """Prints a row as soon as it is there. Columns are given as title and width."""

    def __init__(self, title, **columns):
        self._widths = columns.values()
        print(f"\n### {title}\n")
        self.row(*(name.replace("_", " ") for name in columns))
        print("|" + "|".join("-" * (width + 2) for width in self._widths) + "|", flush=True)

    def row(self, *cells):
        padded = (f"{cell:<{width}}" if number == 0 else f"{cell:>{width}}"
                  for number, (cell, width) in enumerate(zip(cells, self._widths)))
        print("| " + " | ".join(padded) + " |", flush=True)


def milliseconds(nanoseconds):
    return f"{nanoseconds / 1e6:.2f}"


def mebibytes(count):
    return f"{max(0, count) / MIB:.2f}"


def goal(pair):
    return "" if pair is None else " / ".join(dict.fromkeys(f"{number:g}" for number in pair))


def _first_line(*command):
    try:
        return subprocess.run(command, capture_output=True, text=True, check=True).stdout.splitlines()[0]
    except (OSError, subprocess.CalledProcessError, IndexError):
        return "none"


def _field(path, name):
    with open(path, encoding="ascii") as file:
        for line in file:
            if line.startswith(name):
                return line.split(":", 1)[1].strip()
    return "unknown"


def _package(name):
    return _first_line("dpkg-query", "-W", "-f", "${Version}", name)


def machine():
    """What the numbers depend on."""
    flags = _field("/proc/cpuinfo", "flags").split()
    return {
        "processor": _field("/proc/cpuinfo", "model name"),
        "family, model": f"{_field('/proc/cpuinfo', 'cpu family')}, {_field('/proc/cpuinfo', 'model')}",
        "vectors": ", ".join(flag for flag in ("sse2", "avx2", "avx512f") if flag in flags),
        "virtual": "yes" if "hypervisor" in flags else "no",
        "cores": os.cpu_count(),
        "memory": f"{int(_field('/proc/meminfo', 'MemTotal').split()[0]) / MIB:.0f} GiB",
        "kernel": re.match(r"[\d.]+", platform.release()).group(),
        "native compiler": _first_line("g++", "--version"),
        "Windows compiler": _first_line("x86_64-w64-mingw32-g++-posix", "--version"),
        "Wine": _first_line("wine", "--version"),
        "numpy": _package("python3-numpy"),
        "mrcfile": _package("python3-mrcfile"),
        "libvips": _package("libvips-tools"),
        "ImageMagick": _package("imagemagick"),
        "load at the start": f"{os.getloadavg()[0]:.1f}",
    }


def print_machine(facts):
    for name, fact in facts.items():
        print(f"- {name}: {fact}")


def _verdicts(results):
    """Every verdict in the results with what it is about."""
    for measurement, rows in results.items():
        for row in rows if isinstance(rows, list) else ():
            about = " ".join(str(row[key]) for key in ("workload", "way", "asked", "system") if key in row)
            for key, verdict in row.items():
                if key.endswith("verdict") and verdict:
                    yield f"{measurement}: {about}{', memory' if key == 'memory_verdict' else ''}", verdict
            if row.get("exact") is False:
                yield f"{measurement}: {about}, exactness", MISSED


def print_summary(results):
    verdicts = list(_verdicts(results))
    missed = [about for about, verdict in verdicts if verdict == MISSED]
    print(f"\n{len(verdicts)} goals: {len(verdicts) - len(missed)} met,"
          f" of these {sum(verdict == REACHED for _, verdict in verdicts)} all that is reached for;"
          f" {len(missed)} missed")
    for about in missed:
        print(f"- missed: {about}")
