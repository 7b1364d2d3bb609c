"""What all measurements share: the systems that are measured, rounds that interleave, memory."""

import dataclasses
import pathlib
import statistics

from files import Frame
from processes import Worker


@dataclasses.dataclass
class System:
    """One way in which the project is built and run, with a process of it that measures."""

    name: str
    command: list
    metadata: dict  # what its workers can be asked of a file beside the picture: how often that opens the file
    folder: pathlib.Path  # of the files
    worker: Worker = None

    def __enter__(self):
        self.worker = self.new_worker()
        return self

    def __exit__(self, *exception):
        self.worker.__exit__(*exception)

    def new_worker(self):
        return Worker(self.command, self.folder)

    def asking(self, *words):
        return lambda: self.worker.nanoseconds(*words)

    def reading(self, frame):
        """The bare read of the frame's bytes."""
        return self.asking("read", frame.block_position, frame.block_bytes, frame.file)


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


def peak_memory(new_worker, small, large):
    """Bytes that a new process needs at most for the question `large`, above what it has in use after the
    question `small`, which loads what is loaded only once."""
    with new_worker() as worker:
        worker.ask(*small)
        idle = worker.reset_peak_memory()
        worker.ask(*large)
        return worker.peak_memory() - idle


def small_frame(frame):
    """A frame of the same pixels that costs next to nothing."""
    return Frame("small", frame.pixel_format, 64, 64, frame.kind)
