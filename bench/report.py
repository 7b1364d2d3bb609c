"""The table of results, in Markdown, and facts about the machine."""

import os
import platform
import re
import subprocess


class Table:
    """A table that prints each row immediately. `columns` maps titles to widths."""

    def __init__(self, columns):
        self._widths = columns.values()
        self.row(*columns)
        print("|" + "|".join("-" * (width + 2) for width in self._widths) + "|", flush=True)

    def row(self, *cells):
        padded = (f"{cell:<{width}}" if number == 0 else f"{cell:>{width}}"
                  for number, (cell, width) in enumerate(zip(cells, self._widths)))
        print("| " + " | ".join(padded) + " |", flush=True)


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
    """Returns the facts about the machine that influence the results."""
    flags = _field("/proc/cpuinfo", "flags").split()
    return {
        "processor": _field("/proc/cpuinfo", "model name"),
        "family, model": f"{_field('/proc/cpuinfo', 'cpu family')}, {_field('/proc/cpuinfo', 'model')}",
        "vectors": ", ".join(flag for flag in ("sse2", "avx2", "avx512f") if flag in flags),
        "virtual": "yes" if "hypervisor" in flags else "no",
        "cores": os.cpu_count(),
        "memory": f"{int(_field('/proc/meminfo', 'MemTotal').split()[0]) / 2**20:.0f} GiB",
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
