"""Measures other ways to a thumbnail of the same frame, side by side with this project's."""

import contextlib
import pathlib
import statistics
import sys

import goals
from measuring import interleaved, peak_memory, ratio, small_frame
from others import WAYS
from processes import Worker, run_command
from report import Table, mebibytes, milliseconds

EDGE = 256
VIPS_FORMATS = {"uint16": "ushort", "int16": "short", "float32": "float"}


def question(frame, factor):
    """What others.py is asked."""
    return ("thumbnail", factor, frame.pixel_format, frame.width, frame.height, frame.block_position, frame.file)


def new_worker(way, folder):
    return Worker([sys.executable, pathlib.Path(__file__).with_name("others.py"), way], folder)


def commands(frame, folder):
    """Ways that are commands: name, what has to be run for one thumbnail, and the files that it writes."""
    factor = frame.factor(EDGE)
    small = f"{frame.width // factor}x{frame.height // factor}"
    # libvips cannot read such a file by itself, so its commands get the pixels in its own format.
    run_command(["vips", "rawload", frame.file, "frame.v", str(frame.width), str(frame.height), "1", "--offset",
                 str(frame.block_position), "--format", VIPS_FORMATS[frame.pixel_format]], folder)
    depth = str(8 * frame.pixel_stride)
    floats = ["-define", "quantum:format=floating-point", "-define", "quantum:minimum=0", "-define",
              "quantum:maximum=200"] if frame.pixel_format.startswith("float") else []
    return {
        "vips shrink, a command": ["vips", "shrink", "frame.v", "other.v", str(factor), str(factor)],
        "convert -scale, a command":
            ["/usr/bin/convert", "-size", f"{frame.width}x{frame.height}+{frame.block_position}", "-depth", depth,
             *floats, "-endian", "LSB", f"gray:{frame.file}", "-scale", small, "-auto-level", "other.png"],
    }


def measure_others(frame, system, rounds):
    table = Table(f"Other ways: {frame.name} at {EDGE}", way=27, ms=8, times_ours=10, goal=5, time=7, MiB=8)
    folder = system.folder
    results = []
    peaks = {}
    with contextlib.ExitStack() as stack:
        stack.enter_context(frame.in_folder(folder))
        small = stack.enter_context(small_frame(frame).in_folder(folder))
        for file in ("frame.v", "other.v", "other.png"):
            stack.callback((folder / file).unlink, missing_ok=True)

        contenders = {"this project": system.asking("thumbnail", EDGE, frame.file)}
        peaks["this project"] = peak_memory(system.new_worker, ("thumbnail", 16, small.file),
                                            ("thumbnail", EDGE, frame.file))
        for way in WAYS:
            worker = stack.enter_context(new_worker(way, folder))
            contenders[way] = lambda worker=worker: worker.nanoseconds(*question(frame, frame.factor(EDGE)))
            peaks[way] = peak_memory(lambda way=way: new_worker(way, folder), question(small, 4),
                                     question(frame, frame.factor(EDGE)))

        def run(name, command):
            time, peaks[name] = run_command(command, folder)
            return time

        for name, command in commands(frame, folder).items():
            contenders[name] = lambda name=name, command=command: run(name, command)

        times = interleaved(contenders, rounds)
        for name in contenders:
            results.append({
                "workload": frame.name,
                "way": name,
                "ns": statistics.median(times[name]),
                "times_ours": ratio(times[name], times["this project"]),
                "memory_bytes": peaks[name],
                "goal": goals.OTHERS if name in WAYS else None,
            })
            result = results[-1]
            result["verdict"] = goals.times_faster_verdict(result["times_ours"], result["goal"])
            table.row(name, milliseconds(result["ns"]), f"{result['times_ours']:.1f}", result["goal"] or "",
                      result["verdict"], mebibytes(peaks[name]))
    return results
