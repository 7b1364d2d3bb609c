#!/usr/bin/python3
"""Runs qelthumb as file managers do.

usage: qelthumb_test.py BUILD [TEST ...]
"""

import contextlib
import os
import pathlib
import resource
import struct
import subprocess
import sys
import tempfile
import time
import unittest

from PIL import Image

from stage import Stage

sys.path.append(str(pathlib.Path(__file__).resolve().parents[2] / "formats"))
from file_kinds import EXTENSIONS_IN_WORDS  # noqa: E402

BUILD = sys.argv.pop(1)
DONE, FAILED, USAGE = range(3)
UNSUPPORTED = f"Only {EXTENSIONS_IN_WORDS} files are supported."


def mrc(width, height, pixels, mode=0):
    header = bytearray(1024)
    struct.pack_into("<4i", header, 0, width, height, 1, mode)
    return bytes(header) + pixels


class Test(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.stage = Stage(BUILD)
        cls.addClassCleanup(cls.stage.close)

    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = pathlib.Path(folder.name)
        self.out = self.folder / "out" / "thumbnail.png"
        self.out.parent.mkdir()

    def write(self, name, contents):
        path = self.folder / name
        path.write_bytes(contents)
        return path

    def thumbnail(self, size, file):
        """Makes the thumbnail of a file and returns it."""
        self.assertEqual(self.stage.thumbnail(size, file, self.out), (DONE, ""))
        with Image.open(self.out) as picture:
            picture.load()
        return picture

    def assertFails(self, status, *arguments, says):
        """Runs qelthumb, which must fail with this status and message, and leave the output folder unchanged."""
        before = self.outputs()
        result = subprocess.run([self.stage.program, *map(str, arguments)], stdin=subprocess.DEVNULL,
                                stdout=subprocess.PIPE, stderr=subprocess.PIPE)
        errors = os.fsdecode(result.stderr)
        self.assertEqual((result.returncode, result.stdout), (status, b""), errors)
        self.assertIn(says, errors)
        self.assertEqual(self.outputs(), before)
        return errors

    def outputs(self):
        return {path: path.is_file() and path.read_bytes() for path in self.out.parent.iterdir()}


class Usage(Test):
    def test_invalid_arguments_are_answered_by_the_usage(self):
        file = self.stage.samples / "atlas.mrc"
        for arguments in ((), ("128",), ("128", file), ("128", file, self.out, "more"), ("0", file, self.out),
                          ("-1", file, self.out), ("4097", file, self.out), ("12x", file, self.out),
                          ("", file, self.out), (" 12", file, self.out), ("99999999999", file, self.out),
                          ("--help",)):
            with self.subTest(arguments=arguments):
                self.assertFails(USAGE, *arguments, says="usage: qelthumb SIZE INPUT OUTPUT.png")

    def test_the_thumbnail_cannot_replace_its_own_file(self):
        contents = (self.stage.samples / "atlas.mrc").read_bytes()
        file = self.write("out/a.mrc", contents)
        symbolic, hard = self.out.parent / "symbolic.png", self.out.parent / "hard.png"
        symbolic.symlink_to(file)
        os.link(file, hard)
        for output in (file, symbolic, hard, f"{self.out.parent}/../out/a.mrc"):
            with self.subTest(output=output):
                self.assertFails(USAGE, 128, file, output, says="a.mrc: This is also the output file. Name another output file.\n")
        self.assertEqual(file.read_bytes(), contents)


class Thumbnail(Test):
    def test_is_never_larger_than_the_request(self):
        for file in self.stage.pictures():
            for size in (7, 100, 128, 256, 512, 4096):
                with self.subTest(file=file.name, size=size):
                    picture = self.thumbnail(size, file)
                    self.assertLessEqual(max(picture.size), size)

    def test_is_as_large_as_a_whole_factor_allows(self):
        # 640 pixels become 128 with the factor 5, 213 with 3, 640 with 1. 300 pixels use the factors 3, 2 and 1.
        file = self.stage.samples / "micrograph.mrc"
        for size, expected in ((127, 106), (128, 128), (256, 213), (639, 320), (640, 640), (1024, 640)):
            with self.subTest(size=size):
                self.assertEqual(self.thumbnail(size, file).size, (expected, expected))
        file = self.write("wide.mrc", mrc(300, 100, bytes(30000)))
        for size, expected in ((128, (100, 33)), (256, (150, 50)), (512, (300, 100))):
            with self.subTest(size=size):
                self.assertEqual(self.thumbnail(size, file).size, expected)

    def test_of_a_small_colour_frame_does_not_crash(self):
        file = self.write("small.mrc", mrc(3, 2, bytes(range(18)), mode=16))
        picture = self.thumbnail(256, file)
        self.assertEqual((picture.mode, picture.size), ("RGB", (3, 2)))
        # The bottom row comes first in the file.
        self.assertEqual(picture.getpixel((0, 0)), (9, 10, 11))
        self.assertEqual(picture.getpixel((2, 1)), (6, 7, 8))

    def test_shows_grey_values_from_black_to_white_from_the_top(self):
        file = self.write("grey.mrc", mrc(2, 2, bytes((10, 20, 30, 61))))
        picture = self.thumbnail(128, file)
        self.assertEqual((picture.mode, list(picture.getdata())), ("L", [100, 255, 0, 50]))

    def test_is_made_for_files_with_any_name(self):
        contents = (self.stage.samples / "atlas.mrc").read_bytes()
        for name in (b"\xff\xfe not UTF-8.mrc", "Größe 樹.MRC".encode(), b"-1.mrc", b"two\nlines.mrc", b"%s %i.mrc"):
            with self.subTest(name=name):
                file = os.path.join(os.fsencode(self.folder), name)
                with open(file, "wb") as out:
                    out.write(contents)
                output = os.path.join(os.fsencode(self.out.parent), name + b".png")
                self.assertEqual(self.stage.thumbnail(100, file, output), (DONE, ""))
                with Image.open(output) as picture:
                    self.assertEqual(picture.size, (89, 89))


class Fault(Test):
    def test_of_a_damaged_file_is_reported_in_the_words_of_qelshow(self):
        wrong_kind = ("Check that the file-name extension is right. If it is, copy the file again. If that does not "
                      "help, the original is damaged or of an unsupported version.")
        for name, text in (
            ("damaged.mrc", f"The header is invalid: mode is 99, but must be from 0 to 16. {wrong_kind}"),
            ("damaged.ser", f"The header is invalid: series id is 0x0198, but must be 0x0197. {wrong_kind}"),
            ("damaged.emi", "The file cannot be read beyond byte 12: bad EMI object index. "
                            "The file is damaged: copy it again."),
            ("truncated.mrc", "The file is cut short: the frame ends at byte 820224, but the file has only "
                              "102528 bytes. Copy it again, or wait until it has been written completely."),
        ):
            with self.subTest(name=name):
                file = self.stage.samples / name
                self.assertEqual(self.assertFails(FAILED, 128, file, self.out, says=text), f"{file}: {text}\n")

    def test_of_a_frame_that_is_too_narrow_is_reported(self):
        file = self.write("line.mrc", mrc(1000, 1, bytes(1000)))
        self.assertFails(FAILED, 128, file, self.out, says="is too narrow to be reduced to 125 pixels. Request a larger size.")

    def test_of_a_path_without_an_image_is_reported(self):
        pipe = self.folder / "pipe.mrc"
        os.mkfifo(pipe)
        for file, says in (
            (self.write("empty.mrc", b""), "The file is empty."),
            (self.write("picture.png", b"\x89PNG"), UNSUPPORTED),
            (self.write("none", b""), UNSUPPORTED),
            (self.folder / "missing.mrc", "The file cannot be opened: No such file or directory."),
            (self.folder, "This is a folder or a device, not a file."),
            (pipe, "This is a folder or a device, not a file."),
        ):
            with self.subTest(file=file):
                self.assertFails(FAILED, 128, file, self.out, says=says)

    def test_of_the_output_keeps_the_previous_thumbnail(self):
        file = self.stage.samples / "atlas.mrc"
        self.out.write_bytes(b"an earlier thumbnail")
        (self.out.parent / "folder").mkdir()
        self.assertFails(FAILED, 128, file, self.folder / "no folder" / "a.png",
                         says="no folder/a.png cannot be written: No such file or directory.")
        self.assertFails(FAILED, 128, file, self.out.parent / "folder", says="cannot be written: Is a directory.")
        self.assertFails(FAILED, 128, self.stage.samples / "damaged.mrc", self.out, says="mode is 99")


class Output(Test):
    """What happens to an output file that exists, or that others have open."""

    def test_replaces_the_previous_thumbnail_at_once(self):
        self.out.write_bytes(b"an earlier thumbnail")
        with open(self.out, "rb") as before:
            self.thumbnail(128, self.stage.samples / "atlas.mrc")
            self.assertEqual(before.read(), b"an earlier thumbnail")
        self.assertEqual(list(self.out.parent.iterdir()), [self.out])

    def test_is_written_to_the_file_that_the_caller_has_made(self):
        with open(self.out, "x+b") as made:
            self.thumbnail(128, self.stage.samples / "atlas.mrc")
            self.assertEqual(made.read(), self.out.read_bytes())
        self.assertEqual(list(self.out.parent.iterdir()), [self.out])


class Limits(Test):
    def test_are_those_of_memory_and_processor_time(self):
        # While qelthumb waits to write its message to a full pipe, its limits can be read.
        reader, writer = os.pipe()
        self.addCleanup(os.close, reader)
        os.set_blocking(writer, False)
        with contextlib.suppress(BlockingIOError):
            while True:
                os.write(writer, bytes(4096))
        os.set_blocking(writer, True)
        process = subprocess.Popen([self.stage.program, "128", self.stage.samples / "damaged.mrc", self.out],
                                   stdin=subprocess.DEVNULL, stderr=writer)
        os.close(writer)
        self.addCleanup(process.wait)
        self.addCleanup(process.kill)
        wanted = {"Max address space": str(512 << 20), "Max cpu time": "30"}
        deadline = time.monotonic() + 60
        limits = {}
        while limits != wanted:
            self.assertLess(time.monotonic(), deadline, limits)
            self.assertIsNone(process.poll())
            lines = pathlib.Path(f"/proc/{process.pid}/limits").read_text().splitlines()
            limits = {name: line.removeprefix(name).split()[1] for name in wanted for line in lines
                      if line.startswith(name)}
            time.sleep(0.01)

    def test_that_are_lower_already_are_kept(self):
        file = self.write("large.mrc", mrc(4000, 4000, bytes(4 * 4000 * 4000), mode=2))
        limit = 48 << 20
        result = subprocess.run([self.stage.program, "4096", file, self.out], stdin=subprocess.DEVNULL,
                                stderr=subprocess.PIPE, text=True,
                                preexec_fn=lambda: resource.setrlimit(resource.RLIMIT_AS, (limit, limit)))
        self.assertEqual((result.returncode, result.stderr), (FAILED, f"{file}: The thumbnail needs more memory than qelthumb may use.\n"))
        self.assertEqual(list(self.out.parent.iterdir()), [])

    def test_are_kept_for_a_large_sparse_file(self):
        # Nearly all of the file's 256 MB are a hole. The frame's size must not increase the memory that is used.
        file = self.folder / "huge.mrc"
        with open(file, "wb") as out:
            out.write(mrc(16000, 16000, b""))
            out.truncate(1024 + 16000 * 16000)
        process = subprocess.Popen([self.stage.program, "128", file, self.out], stdin=subprocess.DEVNULL)
        _, status, usage = os.wait4(process.pid, 0)
        process.returncode = os.waitstatus_to_exitcode(status)
        self.assertEqual(process.returncode, DONE)
        self.assertLess(usage.ru_maxrss, 32 * 1024)


if __name__ == "__main__":
    unittest.main()
