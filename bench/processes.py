"""Processes that measure on command, and their memory."""

import os
import pathlib
import subprocess
import time


class Failure(Exception):
    """A measurement that could not be made."""


class Worker:
    """A program that answers each line of its input, words separated by tabs, by one line of output."""

    def __init__(self, command, folder):
        self._process = subprocess.Popen(command, cwd=folder, text=True, stdin=subprocess.PIPE,
                                         stdout=subprocess.PIPE)

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        self._process.stdin.close()
        self._process.wait()
        self._process.stdout.close()

    def ask(self, *words):
        print(*words, sep="\t", file=self._process.stdin, flush=True)
        answer = self._process.stdout.readline().strip()
        if not answer or answer.startswith("error"):
            raise Failure(f"{' '.join(map(str, words))}: {answer or 'the worker ended'}")
        return answer

    def nanoseconds(self, *words):
        return int(self.ask(*words))

    def reset_peak_memory(self):
        """From now on the peak is counted anew. Returns the memory in use, in bytes."""
        (self._proc / "clear_refs").write_text("5")
        return self._memory("VmRSS")

    def peak_memory(self):
        return self._memory("VmHWM")

    def bytes_read(self):
        """Bytes that the process has read in all its life, from whatever."""
        return self._number(self._proc / "io", "rchar")

    @property
    def _proc(self):
        return pathlib.Path("/proc") / str(self._process.pid)

    def _memory(self, field):
        return self._number(self._proc / "status", field) * 1024

    @staticmethod
    def _number(path, field):
        for line in path.read_text().splitlines():
            name, value = line.split(":", 1)
            if name == field:
                return int(value.split()[0])
        raise Failure(f"there is no {field} in {path}")


def run_command(command, folder):
    """Runs a command to its end. Returns its nanoseconds and its peak memory in bytes."""
    begin = time.perf_counter_ns()
    process = subprocess.Popen(command, cwd=folder, stdout=subprocess.DEVNULL)
    _, status, usage = os.wait4(process.pid, 0)
    end = time.perf_counter_ns()
    process.returncode = os.waitstatus_to_exitcode(status)
    if process.returncode != 0:
        raise Failure(f"{' '.join(map(str, command))}: exit status {process.returncode}")
    return end - begin, usage.ru_maxrss * 1024
