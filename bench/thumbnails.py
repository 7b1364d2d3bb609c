"""Measures the way from a file to its thumbnail."""

import json
import statistics
import subprocess

import goals
from files import Frame
from measuring import interleaved, peak_memory, ratio, small_frame
from report import Table, goal, mebibytes, milliseconds

EDGES = (96, 256, 1024)  # of the squares that thumbnails are asked for


def is_exact(system, frame, edge):
    """Whether the bitmap is the naive reference's, bit for bit."""
    system.worker.ask("bitmap", edge, frame.file, "ours.bitmap")
    system.worker.ask("naive", edge, frame.pixel_format, frame.width, frame.height, frame.first_pixel,
                      frame.pixel_stride, frame.row_stride, frame.file, "naive.bitmap")
    pictures = [system.folder / f"{name}.bitmap" for name in ("ours", "naive")]
    same = pictures[0].read_bytes() == pictures[1].read_bytes()
    for picture in pictures:
        picture.unlink()
    return same


def thumbnail_memory(system, frame, edge):
    """Peak memory above idle, in bytes, the output left out."""
    with small_frame(frame).in_folder(system.folder) as small:
        peak = peak_memory(system.new_worker, ("thumbnail", 16, small.file), ("thumbnail", edge, frame.file))
    return max(0, peak - frame.output_bytes(edge))


def measure_thumbnails(frames, systems, rounds):
    table = Table("From the file to the bitmap", workload=22, asked=5, factor=6, system=6, read_ms=8,
                  bitmap_ms=9, ratio=5, goal=9, time=7, MiB=5, memory=7, exact=5)
    results = []
    for frame in frames:
        with frame.in_folder(systems[0].folder):
            for edge in EDGES:
                contenders = {}
                for system in systems:
                    contenders[system.name, "read"] = system.reading(frame)
                    contenders[system.name, "way"] = system.asking("thumbnail", edge, frame.file)
                times = interleaved(contenders, rounds)
                for system in systems:
                    reads, ways = (times[system.name, what] for what in ("read", "way"))
                    results.append(thumbnail_result(frame, edge, system, reads, ways))
                    print_thumbnail(table, results[-1])
    return results


def thumbnail_result(frame, edge, system, reads, ways):
    factor = frame.factor(edge)
    aim = goals.way(frame.pixel_format, factor)
    times_of_read = ratio(ways, reads)
    memory = thumbnail_memory(system, frame, edge)
    return {
        "workload": frame.name,
        "asked": edge,
        "factor": factor,
        "system": system.name,
        "read_ns": statistics.median(reads),
        "bitmap_ns": statistics.median(ways),
        "ratio": times_of_read,
        "goal": aim,
        "verdict": goals.verdict(times_of_read, aim),
        "memory_bytes": memory,
        "memory_verdict": goals.verdict(memory, goals.MEMORY),
        "exact": is_exact(system, frame, edge),
    }


def print_thumbnail(table, result):
    table.row(result["workload"], result["asked"], result["factor"], result["system"],
              milliseconds(result["read_ns"]), milliseconds(result["bitmap_ns"]), f"{result['ratio']:.2f}",
              goal(result["goal"]), result["verdict"], mebibytes(result["memory_bytes"]),
              result["memory_verdict"], "yes" if result["exact"] else "NO")


def measure_kernels(frames, program, rounds):
    """The reduction alone, of those frames that `program` knows; it names its measurements frame/edge. For
    complex frames also the logarithms by themselves, with each kind of vectors."""
    prefixes = [frame.name for frame in frames]
    if any(frame.pixel_format.startswith("complex") for frame in frames):
        prefixes.append("logarithms")
    output = subprocess.run(
        [program, f"--benchmark_filter=^({'|'.join(prefixes)})/", "--benchmark_format=json",
         f"--benchmark_repetitions={rounds}", "--benchmark_min_time=0.05",
         "--benchmark_enable_random_interleaving=true", "--benchmark_report_aggregates_only=true"],
        check=True, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, text=True).stdout
    if not output:
        return []
    times = {run["run_name"]: 1e9 / run["items_per_second"] for run in json.loads(output)["benchmarks"]
             if run["aggregate_name"] == "median"}
    table = Table("The kernel alone, on a band in the cache", workload=22, asked=5, factor=6, ns_a_pixel=10,
                  goal=9, time=7)
    results = []

    def add(name, edge, factor, aim):
        if f"{name}/{edge}" in times:
            time = times[f"{name}/{edge}"]
            results.append({"workload": name, "asked": edge, "factor": factor, "ns_a_pixel": time, "goal": aim,
                            "verdict": goals.verdict(time, aim)})
            table.row(name, edge, factor, f"{time:.3f}", goal(aim), results[-1]["verdict"])

    for frame in frames:
        for edge in EDGES:
            factor = frame.factor(edge)
            add(frame.name, edge, factor, goals.kernel(frame.pixel_format, factor))
    for vectors in ("SSE2", "AVX2"):
        add("logarithms", vectors, "", None)
    return results


def measure_stack(stack, systems, rounds):
    """The middle frame of a stack, beside a file that holds such a frame alone."""
    table = Table("One frame of a stack", workload=22, asked=5, system=6, alone_ms=8, in_stack_ms=11, ratio=5,
                  goal=11, time=7, MiB=5, memory=7, exact=5)
    results = []
    alone = Frame("alone", stack.pixel_format, stack.width, stack.height, stack.kind)
    with stack.in_folder(systems[0].folder), alone.in_folder(systems[0].folder):
        for system in systems:
            edge = 256
            times = interleaved({frame.name: system.asking("thumbnail", edge, frame.file)
                                 for frame in (stack, alone)}, rounds)
            times_of_one = ratio(times[stack.name], times[alone.name])
            memory = thumbnail_memory(system, stack, edge)
            results.append({
                "workload": stack.name,
                "asked": edge,
                "system": system.name,
                "alone_ns": statistics.median(times[alone.name]),
                "in_stack_ns": statistics.median(times[stack.name]),
                "ratio": times_of_one,
                "goal": goals.STACK,
                "verdict": goals.verdict(times_of_one, goals.STACK),
                "memory_bytes": memory,
                "memory_verdict": goals.verdict(memory, goals.MEMORY),
                "exact": is_exact(system, stack, edge),
            })
            result = results[-1]
            table.row(stack.name, edge, system.name, milliseconds(result["alone_ns"]),
                      milliseconds(result["in_stack_ns"]), f"{times_of_one:.2f}", goal(goals.STACK),
                      result["verdict"], mebibytes(memory), result["memory_verdict"],
                      "yes" if result["exact"] else "NO")
    return results
