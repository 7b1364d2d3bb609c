"""The main program of scripts/bench, which builds the measured programs and passes its arguments on."""

import argparse
import contextlib
import json
import pathlib
import statistics
import sys

from files import MRC_HEADER_BYTES, SER_ELEMENT_HEADER_BYTES, Folder, Frame, Series
from measuring import Failure, Worker, interleaved, ratio
from peers import PEERS
from report import Table, machine

BUILD = pathlib.Path(__file__).resolve().parent.parent / "build"
FOLDER = BUILD / "bench"

EDGES = (96, 256, 1024)  # in pixels, of the requested squares
PEER_EDGE = 256
FRAMES = [
    Frame("uint8", "uint8", 8192, 8192),
    Frame("int16", "int16", 4096, 4096),
    Frame("uint16", "uint16", 4096, 4096),
    Frame("int32", "int32", 4096, 4096, "raw"),
    Frame("float32", "float32", 4096, 4096),
    Frame("float64", "float64", 4096, 4096, "raw"),
    Frame("complex64", "complex64", 4096, 4096),
    Frame("complex128", "complex128", 2048, 2048, "raw"),
    Frame("rgb", "rgb", 4096, 4096),
    Frame("uint16 5760x4092", "uint16", 5760, 4092),
    Frame("uint16 padded", "uint16", 4096, 4096, "raw", padding=96),
    Frame("uint16 interleaved", "uint16", 4096, 4096, "raw", spread=2),
    Frame("uint16 bottom-up", "uint16", 4096, 4096, "raw", bottom_up=True),
]
SERIES = [Series(10_000), Series(100_000)]
FILES = Folder(1000)
MEMORY_FRAME = Frame("memory", "float32", 4096, 4096)
SMALL_FRAME = Frame("small", "float32", 64, 64)

# The commands that start the worker of each method of making thumbnails.
COMMANDS = {
    "native": [BUILD / "linux/bench/bench_worker"],
    "DLL": [BUILD.parent / "scripts/wine", BUILD / "windows/bench/bench_worker.exe"],
    **{peer: [sys.executable, pathlib.Path(__file__).with_name("peers.py"), peer] for peer in PEERS},
}
SYSTEMS = ("native", "DLL")  # each has its own bare read; peers are compared with the native one


def request_for(method, frame, edge):
    """Returns the words of a worker's request for a thumbnail."""
    if method in SYSTEMS:
        return ("thumbnail", edge, frame.file)
    return ("thumbnail", frame.factor(edge), frame.pixel_format, frame.width, frame.height, frame.position,
            frame.file)


def methods_for(frame, edge):
    peers = [name for name, peer in PEERS.items() if edge == PEER_EDGE and peer.accepts(frame)]
    return [*SYSTEMS, *peers]


class Bench:
    """Measures workloads, prints a row for each, and collects the rows as data."""

    def __init__(self, rounds):
        self.rows = []
        self._rounds = rounds
        self._workers = {}
        self._table = Table({"workload": 22, "request": 7, "read ms": 8, "in Wine": 8, "native": 6, "DLL": 6,
                             **{peer: len(peer) for peer in PEERS}})

    @contextlib.contextmanager
    def new_workers(self):
        """Starts new processes for the next rows, so that earlier measurements do not influence them."""
        with contextlib.ExitStack() as stack:
            self._workers = {method: stack.enter_context(Worker(command, FOLDER))
                             for method, command in COMMANDS.items()}
            yield

    def measure(self, workload, edge, read, requests):
        """Compares the time of each request with that of the bare `read` on the same system."""
        bases = {method: "DLL" if method == "DLL" else "native" for method in requests}
        systems = [system for system in SYSTEMS if system in bases.values()]
        contenders = {("read", system): self._requesting(system, read) for system in systems}
        contenders.update({method: self._requesting(method, words) for method, words in requests.items()})
        times = interleaved(contenders, self._rounds)
        read_ns = {system: statistics.median(times["read", system]) for system in systems}
        ratios = {method: ratio(times[method], times["read", base]) for method, base in bases.items()}
        self.rows.append({"workload": workload, "request": edge, "read_ns": read_ns, "ratios": ratios})
        self._table.row(workload, edge or "",
                        *(f"{read_ns[system] / 1e6:.2f}" if system in read_ns else "" for system in SYSTEMS),
                        *(f"{ratios[method]:.2f}" if method in ratios else "" for method in COMMANDS))

    def _requesting(self, method, words):
        return lambda: self._workers[method].nanoseconds(*words)


def measure_frame(bench, frame):
    read = ("read", frame.position, frame.block_bytes, frame.file)
    for edge in EDGES:
        requests = {method: request_for(method, frame, edge) for method in methods_for(frame, edge)}
        bench.measure(frame.name, edge, read, requests)


def measure_series(bench, series):
    """Compares opening a series, which reads the header of each element, with reading only these headers."""
    read = ("blocks", series.first_element, series.element_bytes, series.count, SER_ELEMENT_HEADER_BYTES, series.file)
    bench.measure(f"series of {series.count}", None, read,
                  {"native": ("metadata", "reader", series.file), "DLL": ("metadata", "tip", series.file)})


def measure_folder(bench, folder):
    """Compares reading all properties of every file in a folder, but no pictures, with reading only the headers."""
    read = ("starts", MRC_HEADER_BYTES, *folder.files)
    for method, view in (("native", "reader"), ("DLL", "tip"), ("DLL", "columns"), ("DLL", "sets"), ("DLL", "store")):
        bench.measure(f"folder: {view}", None, read, {method: ("metadata", view, *folder.files)})


def measure_memory():
    """Returns the bytes that a thumbnail takes in a new process of each method, by its name."""
    print(f"\nPeak memory for a thumbnail of {MEMORY_FRAME.pixel_format}, {MEMORY_FRAME.width} x"
          f" {MEMORY_FRAME.height}, at {PEER_EDGE}:")
    peaks = {}
    with MEMORY_FRAME.in_folder(FOLDER), SMALL_FRAME.in_folder(FOLDER):
        for method in methods_for(MEMORY_FRAME, PEER_EDGE):
            with Worker(COMMANDS[method], FOLDER) as worker:
                peaks[method] = worker.peak_memory(request_for(method, SMALL_FRAME, 16),
                                                   request_for(method, MEMORY_FRAME, PEER_EDGE))
            print(f"- {method}: {peaks[method] / 2**20:.1f} MiB", flush=True)
    return peaks


def main():
    parser = argparse.ArgumentParser(prog="scripts/bench")
    parser.add_argument("--quick", action="store_true", help="run fewer rounds, for a first impression")
    parser.add_argument("workloads", nargs="*", metavar="WORKLOAD",
                        help="measure only workloads whose names contain this (default: all)")
    options = parser.parse_args()
    tasks = [(measure_frame, frame.name, frame) for frame in FRAMES]
    tasks += [(measure_series, "series", series) for series in SERIES]
    tasks += [(measure_folder, "folder", FILES)]
    known = [*dict.fromkeys(name for _, name, _ in tasks), "memory"]
    chosen = [name for name in known
              if not options.workloads or any(word in name for word in options.workloads)]
    if not chosen:
        parser.error(f"no workload has such a name; the workloads are {', '.join(known)}")
    rounds = 5 if options.quick else 15

    FOLDER.mkdir(parents=True, exist_ok=True)
    results = {"machine": machine(), "rounds": rounds}
    for name, fact in results["machine"].items():
        print(f"- {name}: {fact}")
    print()
    bench = Bench(rounds)
    for measure, name, subject in tasks:
        if name in chosen:
            with subject.in_folder(FOLDER), bench.new_workers():
                measure(bench, subject)
    results["rows"] = bench.rows
    if "memory" in chosen:
        results["memory_bytes"] = measure_memory()
    (FOLDER / "results.json").write_text(json.dumps(results, indent=1) + "\n")


if __name__ == "__main__":
    try:
        main()
    except Failure as failure:
        sys.exit(f"scripts/bench: {failure}")
