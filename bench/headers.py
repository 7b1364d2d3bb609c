"""Measures what is read of a file without its pixels."""

import statistics

import goals
from file_events import OpenCounter
from files import SER_ELEMENT_HEADER_BYTES, Folder, Series
from measuring import interleaved, peak_memory, ratio
from report import Table, goal, mebibytes, milliseconds


def measure_series(counts, systems, rounds):
    """Opening series of the given numbers of elements, the smallest first, beside reading the header of each
    element by one call of the system. That the cost is linear shows in the last column."""
    table = Table("Opening a series", workload=18, system=6, headers_ms=10, open_ms=8, ratio=5, goal=9, time=7,
                  MiB=5, us_an_element=13)
    results = []
    for count in counts:
        with Series(count).in_folder(systems[0].folder) as series:
            for system in systems:
                times = interleaved({
                    "headers": system.asking("headers", series.first_element, series.element_bytes, count,
                                             SER_ELEMENT_HEADER_BYTES, series.file),
                    "open": system.asking("open", series.file),
                }, rounds)
                times_of_headers = ratio(times["open"], times["headers"])
                open_time = statistics.median(times["open"])
                with Series(1).in_folder(system.folder) as small:
                    memory = peak_memory(system.new_worker, ("open", small.file), ("open", series.file))
                results.append({
                    "workload": f"series of {count}",
                    "system": system.name,
                    "headers_ns": statistics.median(times["headers"]),
                    "open_ns": open_time,
                    "ratio": times_of_headers,
                    "goal": goals.SERIES,
                    "verdict": goals.verdict(times_of_headers, goals.SERIES),
                    "memory_bytes": memory,
                    "ns_an_element": open_time / count,
                })
                table.row(f"series of {count}", system.name, milliseconds(results[-1]["headers_ns"]),
                          milliseconds(open_time), f"{times_of_headers:.2f}", goal(goals.SERIES),
                          results[-1]["verdict"], mebibytes(memory), f"{open_time / count / 1000:.3f}")
    return results


def measure_folder(kind, count, systems, rounds):
    """What is shown of every file of a folder beside its picture, beside opening each file once and reading
    its header. The bytes read tell that no pixels are."""
    table = Table(f"A folder of {count} .{kind} files", question=10, system=6, start_us=8, answer_us=9,
                  ratio=5, opens=5, opens_due=9, bytes_read=10)
    results = []
    with Folder(kind, count).in_folder(systems[0].folder) as folder:
        for system in systems:
            questions = {"start": ("starts", folder.header_bytes, *folder.files)}
            questions.update({what: ("metadata", what, *folder.files) for what in system.metadata})
            times = interleaved({name: system.asking(*words) for name, words in questions.items()}, rounds)
            for what, due in system.metadata.items():
                few = folder.files[:100]  # as the kernel counts up to some 16,000 events at a time
                with OpenCounter(system.folder / folder.file) as opens:
                    before = system.worker.bytes_read()
                    system.worker.ask("metadata", what, *few)
                    results.append({
                        "question": what,
                        "system": system.name,
                        "start_ns": statistics.median(times["start"]) / count,
                        "answer_ns": statistics.median(times[what]) / count,
                        "ratio": ratio(times[what], times["start"]),
                        "opens": opens.count() / len(few),
                        "opens_due": due,
                        "bytes_read": (system.worker.bytes_read() - before) / len(few),
                    })
                result = results[-1]
                table.row(what, system.name, f"{result['start_ns'] / 1000:.1f}",
                          f"{result['answer_ns'] / 1000:.1f}", f"{result['ratio']:.2f}",
                          f"{result['opens']:.2f}", due, f"{result['bytes_read']:.0f}")
    return results
