"""Processes that measure on command, rounds that take turns, and memory."""

import pathlib
import statistics
import subprocess


class Failure(Exception):
    """A measurement that could not be made."""


class Worker:
    """A program that answers each line of its input, words separated by tabs, with one line of output."""

    def __init__(self, command, folder):
        self._process = subprocess.Popen(command, cwd=folder, text=True, stdin=subprocess.PIPE,
                                         stdout=subprocess.PIPE)

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        self._process.stdin.close()
        self._process.wait()
        self._process.stdout.close()

    def nanoseconds(self, *words):
        print(*words, sep="\t", file=self._process.stdin, flush=True)
        answer = self._process.stdout.readline().strip()
        if not answer.isdecimal():
            raise Failure(f"{' '.join(map(str, words))[:200]}: {answer or 'the worker ended'}")
        return int(answer)

    def peak_memory(self, small, large):
        """Bytes in use at the peak of the request `large`, above those in use after the request `small`, which
        loads what is loaded only once. For a process that has done nothing else."""
        self.nanoseconds(*small)
        process = pathlib.Path("/proc") / str(self._process.pid)
        (process / "clear_refs").write_text("5")  # starts the peak anew
        before = _kibibytes(process, "VmRSS")
        self.nanoseconds(*large)
        return (_kibibytes(process, "VmHWM") - before) * 1024


def _kibibytes(process, field):
    for line in (process / "status").read_text().splitlines():
        name, value = line.split(":", 1)
        if name == field:
            return int(value.split()[0])
    raise Failure(f"there is no {field} in {process}/status")


def interleaved(contenders, rounds):
    """Calls every contender once a round, in an order that rotates, after one round that does not count.
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
    """The median of the ratios of each round, which a slow round does not change."""
    return statistics.median(time / base for time, base in zip(times, bases))
