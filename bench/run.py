"""Measures thumbnails and metadata; see scripts/bench, which builds what this needs and passes its options."""

import argparse
import itertools
import json
import pathlib
import statistics
import subprocess
import sys

import goals
from frames import Frame
from processes import Failure, Worker

ROOT = pathlib.Path(__file__).resolve().parent.parent
BUILD = ROOT / "build"
DATA = BUILD / "bench"
EDGES = (96, 256, 1024)
MIB = 2**20

FRAMES = [
    Frame("int16", "int16", 4096, 4096),
    Frame("uint16", "uint16", 4096, 4096),
    Frame("float32", "float32", 4096, 4096),
    Frame("complex64", "complex64", 4096, 4096),
    Frame("uint8", "uint8", 8192, 8192),
    Frame("uint16 5760x4092", "uint16", 5760, 4092),
    Frame("rgb", "rgb", 4096, 4096),
]


def interleaved(contenders, rounds):
    """Runs every contender once a round, in an order that turns, after one round that does not count.
    Returns the times of each, by name."""
    times = {name: [] for name in contenders}
    names = list(contenders)
    for number in range(-1, rounds):
        turn = number % len(names)
        for name in names[turn:] + names[:turn]:
            time = contenders[name]()
            if number >= 0:
                times[name].append(time)
    return times


def ratio(times, bases):
    """The median over the rounds, so that what slows a whole round down does not count."""
    return statistics.median(time / base for time, base in zip(times, bases))


def median_ms(times):
    return statistics.median(times) / 1e6


def is_exact(worker, frame, edge):
    """Whether the bitmap is the naive reference's, bit for bit."""
    worker.ask("bitmap", edge, frame.file, "ours.bitmap")
    worker.ask("naive", edge, frame.pixel_format, frame.width, frame.height, frame.first_pixel,
               frame.pixel_stride, frame.row_stride, frame.file, "naive.bitmap")
    return (DATA / "ours.bitmap").read_bytes() == (DATA / "naive.bitmap").read_bytes()


def peak_memory(command, frame, edge):
    """Bytes above what a process has in use that has made a small thumbnail of the same kind."""
    small = Frame("small", frame.pixel_format, 64, 64, frame.kind)
    small.write(DATA)
    with Worker(command, DATA) as worker:
        worker.ask("thumbnail", 16, small.file)
        idle = worker.reset_peak_memory()
        worker.ask("thumbnail", edge, frame.file)
        return worker.peak_memory() - idle


def measure_frame(frame, systems, rounds):
    frame.write(DATA)
    results = []
    try:
        for edge in EDGES:
            contenders = {}
            for system, (worker, _) in systems.items():
                contenders[system, "read"] = lambda worker=worker: worker.nanoseconds(
                    "read", frame.block_position, frame.block_bytes, frame.file)
                contenders[system, "thumbnail"] = lambda worker=worker: worker.nanoseconds(
                    "thumbnail", edge, frame.file)
            times = interleaved(contenders, rounds)
            for system, (worker, command) in systems.items():
                reads, thumbnails = times[system, "read"], times[system, "thumbnail"]
                results.append({
                    "workload": frame.name, "asked": edge, "factor": frame.factor(edge), "system": system,
                    "read_ms": median_ms(reads), "thumbnail_ms": median_ms(thumbnails),
                    "ratio": ratio(thumbnails, reads),
                    "goal": goals.ratio_goal(frame.pixel_format, frame.factor(edge)),
                    "memory": peak_memory(command, frame, edge), "output": frame.output_bytes(edge),
                    "exact": is_exact(worker, frame, edge),
                })
                print_frame(results[-1])
    finally:
        (DATA / frame.file).unlink()
    return results


def print_frame(result):
    goal = result["goal"]
    memory = max(0, result["memory"] - result["output"])
    print(f"{result['workload']:<20} {result['asked']:>5} {result['factor']:>4} {result['system']:<8}"
          f" {result['read_ms']:>8.2f} {result['thumbnail_ms']:>9.2f} {result['ratio']:>6.2f}"
          f" {'-' if goal is None else f'{goal[0]:g} / {goal[1]:g}':>10}"
          f" {goals.verdict(result['ratio'], goal):<8}"
          f" {memory / MIB:>7.2f} {goals.verdict(memory, goals.MEMORY_GOAL):<8}"
          f" {'yes' if result['exact'] else 'NO'}", flush=True)


def measure_kernels(chosen, quick):
    output = subprocess.run(
        [BUILD / "linux/bench/bench_kernels", "--benchmark_format=json",
         f"--benchmark_repetitions={3 if quick else 15}", f"--benchmark_min_time={0.02 if quick else 0.1}",
         "--benchmark_enable_random_interleaving=true", "--benchmark_report_aggregates_only=true"],
        check=True, capture_output=True, text=True).stdout
    results = []
    for run in json.loads(output)["benchmarks"]:
        name, edge = run["run_name"].split("/")
        frame = next((frame for frame in FRAMES if frame.name == name), None)
        if run["aggregate_name"] != "median" or frame not in chosen:
            continue
        factor = frame.factor(int(edge))
        results.append({"workload": name, "asked": int(edge), "factor": factor,
                        "ns_per_pixel": 1e9 / run["items_per_second"],
                        "goal": goals.kernel_goal(frame.pixel_format, factor)})
    print(f"\n{'kernel alone':<20} {'asked':>5} {'f':>4} {'ns/pixel':>9} {'goal':>12}")
    for result in results:
        goal = result["goal"]
        print(f"{result['workload']:<20} {result['asked']:>5} {result['factor']:>4}"
              f" {result['ns_per_pixel']:>9.3f}"
              f" {'-' if goal is None else f'{goal[0]:g} / {goal[1]:g}':>12}"
              f" {goals.verdict(result['ns_per_pixel'], goal)}", flush=True)
    return results


def main():
    parser = argparse.ArgumentParser(prog="scripts/bench", description=__doc__)
    parser.add_argument("--quick", action="store_true", help="few rounds, for a first look")
    parser.add_argument("workloads", nargs="*", metavar="WORKLOAD", help="part of a name; all without one")
    options = parser.parse_args()
    chosen = [frame for frame in FRAMES
              if not options.workloads or any(word in frame.name for word in options.workloads)]
    if not chosen:
        sys.exit(f"scripts/bench: no workload is called that, only: "
                 f"{', '.join(frame.name for frame in FRAMES)}")
    DATA.mkdir(parents=True, exist_ok=True)
    commands = {"native": [BUILD / "linux/bench/bench_worker"]}
    systems = {name: (Worker(command, DATA), command) for name, command in commands.items()}
    print(f"{'workload':<20} {'asked':>5} {'f':>4} {'system':<8} {'read ms':>8} {'bitmap ms':>9} {'ratio':>6}"
          f" {'goal':>10} {'':<8} {'MiB':>7} {'':<8} exact")
    rounds = 5 if options.quick else 15
    results = {
        "frames": list(itertools.chain(*(measure_frame(frame, systems, rounds) for frame in chosen))),
        "kernels": measure_kernels(chosen, options.quick),
    }
    (DATA / "results.json").write_text(json.dumps(results, indent=1) + "\n")


if __name__ == "__main__":
    try:
        main()
    except Failure as failure:
        sys.exit(f"scripts/bench: {failure}")
