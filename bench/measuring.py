"""Worker processes that measure on command, alternating rounds, and peak memory."""

import pathlib
import statistics
import subprocess


class Failure(Exception):
    """A measurement that failed."""


class Worker:
    """A program that reads requests, each a line of words separated by tabs, and replies to each with one line."""

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
        """Returns by how many bytes the request `large` raises the memory in use at its peak. The request `small` runs
        first and loads everything that is loaded only once. Must be the first use of the process."""
        self.nanoseconds(*small)
        process = pathlib.Path("/proc") / str(self._process.pid)
        (process / "clear_refs").write_text("5")  # resets the peak
        before = _kibibytes(process, "VmRSS")
        self.nanoseconds(*large)
        return (_kibibytes(process, "VmHWM") - before) * 1024


def _kibibytes(process, field):
    for line in (process / "status").read_text().splitlines():
        name, value = line.split(":", 1)
        if name == field:
            return int(value.split()[0])
    raise Failure(f"{process}/status has no field {field}")


def interleaved(contenders, rounds):
    """Calls every contender once per round, in an order that rotates, after one round for warming up. Returns
    the times of each contender by its name."""
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
    """Returns the median of the ratios of all rounds, which a slow round does not change."""
    return statistics.median(time / base for time, base in zip(times, bases))
