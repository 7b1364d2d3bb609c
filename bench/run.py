"""The main program of scripts/bench, which builds what is measured and hands its arguments on."""

import argparse
import contextlib
import json
import pathlib
import sys

from comparison import measure_others
from files import Frame
from headers import measure_folder, measure_series
from measuring import System
from processes import Failure
from report import machine, print_machine, print_summary
from thumbnails import measure_kernels, measure_stack, measure_thumbnails

BUILD = pathlib.Path(__file__).resolve().parent.parent / "build"
FOLDER = BUILD / "bench"

FRAMES = [
    Frame("int16", "int16", 4096, 4096),
    Frame("uint16", "uint16", 4096, 4096),
    Frame("uint16 5760x4092", "uint16", 5760, 4092),
    Frame("uint8", "uint8", 8192, 8192),
    Frame("rgb", "rgb", 4096, 4096),
    Frame("int32", "int32", 4096, 4096, "raw"),
    Frame("float32", "float32", 4096, 4096),
    Frame("float64", "float64", 4096, 4096, "raw"),
    Frame("complex64", "complex64", 4096, 4096),
    Frame("complex128", "complex128", 2048, 2048, "raw"),
    Frame("raw padded", "uint16", 4096, 4096, "raw", padding=96),
    Frame("raw interleaved", "uint16", 4096, 4096, "raw", spread=2),
    Frame("raw bottom-up", "uint16", 4096, 4096, "raw", bottom_up=True),
]
STACK = Frame("stack of 1000", "uint16", 1024, 1024, sections=1000)
COMPARED = ("int16", "uint16", "float32")


def main():
    parser = argparse.ArgumentParser(prog="scripts/bench")
    parser.add_argument("--quick", action="store_true", help="few rounds, for a first look")
    parser.add_argument("workloads", nargs="*", metavar="WORKLOAD", help="a part of a name; all without one")
    options = parser.parse_args()
    known = [*(frame.name for frame in FRAMES), STACK.name, "series", "folder", "others"]
    chosen = [name for name in known
              if not options.workloads or any(word in name for word in options.workloads)]
    if not chosen:
        parser.error(f"no workload is called that, only: {', '.join(known)}")
    rounds = 5 if options.quick else 15
    frames = [frame for frame in FRAMES if frame.name in chosen]

    FOLDER.mkdir(parents=True, exist_ok=True)
    results = {"machine": machine(), "rounds": rounds}
    print_machine(results["machine"])
    with contextlib.ExitStack() as stack:
        native = stack.enter_context(
            System("native", [BUILD / "linux/bench/bench_worker"], {"reader": 1}, FOLDER))
        dll = stack.enter_context(
            System("DLL", [BUILD.parent / "scripts/wine", BUILD / "windows/bench/bench_worker.exe"],
                   {"tip": 1, "columns": 6, "sets": 1, "store": 1}, FOLDER))
        systems = [native, dll]
        if frames:
            results["thumbnails"] = measure_thumbnails(frames, systems, rounds)
            results["kernels"] = measure_kernels(frames, BUILD / "linux/bench/bench_kernels", rounds)
        if STACK.name in chosen:
            results["stack"] = measure_stack(STACK, systems, rounds)
        if "series" in chosen:
            results["series"] = measure_series((10_000, 100_000), systems, rounds)
        if "folder" in chosen:
            results["folder"] = measure_folder("mrc", 1000, systems, rounds)
        if "others" in chosen:
            results["others"] = [result for frame in FRAMES if frame.name in COMPARED
                                 for result in measure_others(frame, native, rounds)]
    file = FOLDER / "results.json"
    file.write_text(json.dumps(results, indent=1) + "\n")
    print_summary(results)


if __name__ == "__main__":
    try:
        main()
    except Failure as failure:
        sys.exit(f"scripts/bench: {failure}")
