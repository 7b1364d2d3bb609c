#!/usr/bin/env python3
"""Runs qelshow as its users do, and checks its output, its files and its exit status.

usage: qelshow_test.py EMULATOR QELSHOW SERVER FAULTY_SERVER [TEST_CLASS ...]
"""

import contextlib
import json
import os
import pathlib
import pty
import random
import re
import shutil
import struct
import subprocess
import sys
import tempfile
import time
import unittest
import zlib

sys.path.append(str(pathlib.Path(__file__).resolve().parents[2] / "formats"))
from file_kinds import EXTENSIONS  # noqa: E402

EMULATOR, QELSHOW, SERVER, FAULTY_SERVER = sys.argv[1:5]

COMMANDS = ("info", "thumbnail", "page", "doctor")
DONE, FAILED, USAGE, UNSUPPORTED, NO_THUMBNAIL = range(5)


def run(*arguments, server=SERVER, folder=None, program=QELSHOW):
    """Runs qelshow. Returns the finished process, with its output as strings."""
    result = run_for_bytes(*arguments, server=server, folder=folder, program=program)
    result.stdout = result.stdout.decode("utf-8")
    return result


def run_for_bytes(*arguments, server=SERVER, folder=None, program=QELSHOW):
    """Runs qelshow. Returns the finished process, with standard output as bytes and standard error as a string."""
    # Files, because Wine's desktop process would keep pipes open for a second after the program has ended.
    with tempfile.TemporaryFile() as out, tempfile.TemporaryFile() as errors:
        process = start(*arguments, server=server, program=program, cwd=folder, stdout=out, stderr=errors)
        process.wait()
        out.seek(0)
        errors.seek(0)
        return subprocess.CompletedProcess(process.args, process.returncode, out.read(), errors.read().decode("utf-8"))


def start(*arguments, server=SERVER, program=QELSHOW, **options):
    command = [EMULATOR, program, *map(str, arguments), *(["--server", server] if server else [])]
    return subprocess.Popen(command, stdin=subprocess.DEVNULL, env=os.environ | {"LC_ALL": "C.UTF-8"}, **options)


def read_terminal(terminal):
    """Returns the next part of a terminal's output; an empty string once no process can write to it any more."""
    try:
        return os.read(terminal, 4096).decode("utf-8", "replace")
    except OSError:
        return ""


def mrc(width=4, height=3, frames=1, mode=0, label=b"", pixels=None):
    """Returns the bytes of an .mrc file whose pixel bytes count upwards."""
    pixel_bytes = {0: 1, 1: 2, 2: 4, 16: 3}.get(mode, 1)
    header = bytearray(1024)
    struct.pack_into("<4i", header, 0, width, height, frames, mode)
    struct.pack_into("<i", header, 220, 1 if label else 0)
    header[224:224 + len(label)] = label
    if pixels is None:
        pixels = bytes(i % 251 for i in range(width * height * frames * pixel_bytes))
    return bytes(header) + pixels


def raw(width, height, value_class, bits, pixels):
    """Returns the bytes of a .raw file with packed rows."""
    step = bits // 8
    return (b"QEL RawImage\0" + struct.pack("<9i", 1, width, height, 1, bits, value_class, 0, step, width * step)
            + pixels)


def ebn(*instrument):
    return struct.pack("<Hiii5d", 1, 2, 2, 54, *instrument) + bytes(4)


def ser(units):
    axis = struct.pack("<ddi", 0, 1.2e-9, 4)
    dimension = struct.pack("<Iddi", 3, -1.5, 0.25, 2) + b"".join(
        struct.pack("<i", len(text)) + text for text in (b"Defocus", units))
    header = struct.pack("<HHHIIIIII", 0x4949, 0x0197, 0x0210, 0x4122, 0x4152, 1, 1, 30 + len(dimension), 1)
    element = axis + axis + struct.pack("<hII", 1, 2, 2) + bytes(4)
    return header + dimension + struct.pack("<II", 30 + len(dimension) + 8, 0) + element


def png_facts(png):
    """Returns the width, height, bits per sample and colour type of a PNG file."""
    assert png[:8] == b"\x89PNG\r\n\x1a\n" and png[12:16] == b"IHDR"
    return struct.unpack(">IIBB", png[16:26])


class Test(unittest.TestCase):
    maxDiff = None

    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = pathlib.Path(folder.name)

    def write(self, name, contents):
        path = self.folder / name
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_bytes(contents)
        return path

    def assertOneSentence(self, text, *parts):
        """Checks that a message is a single line that contains these parts."""
        self.assertEqual(len(text.strip().splitlines()), 1, text)
        for part in parts:
            self.assertIn(str(part), text)

    def info(self, *paths, server=SERVER):
        """Returns the files of the JSON document that info prints."""
        result = run("info", *paths, "--json", server=server)
        document = json.loads(result.stdout)
        self.assertEqual(document["schema"], 3)
        return document["files"]


class CommandLine(Test):
    def test_help_exists_for_the_program_and_for_each_command(self):
        texts = [run("--help", server=None)] + [run(command, "--help", server=None) for command in COMMANDS]
        for result in texts:
            self.assertEqual((result.returncode, result.stderr), (DONE, ""))
            self.assertIn("exit status", result.stdout)
            self.assertLessEqual(max(map(len, result.stdout.splitlines())), 80)
        for command in COMMANDS:
            self.assertIn(f"  {command} ", texts[0].stdout)
        self.assertEqual(len({result.stdout for result in texts}), 5)

    def test_help_has_other_spellings(self):
        whole, info = run("--help", server=None).stdout, run("info", "--help", server=None).stdout
        for arguments, text in ((("/?",), whole), (("-h",), whole), (("help",), whole), (("info", "/?"), info),
                                (("info", "-h"), info), (("help", "info"), info)):
            with self.subTest(arguments=arguments):
                result = run(*arguments, server=None)
                self.assertEqual((result.returncode, result.stdout, result.stderr), (DONE, text, ""))

    def test_prints_its_version(self):
        result = run("--version", server=None)
        self.assertEqual((result.returncode, result.stderr), (DONE, ""))
        self.assertRegex(result.stdout, r"\Aqelshow \d+\.\d+\.\d+\n\Z")

    def test_two_hyphens_end_the_options(self):
        self.write("--json", mrc())
        self.write("-a.mrc", mrc())
        result = run("info", "--server", SERVER, "--json", "--", "-a.mrc", "--json", server=None, folder=self.folder)
        files = json.loads(result.stdout)["files"]
        self.assertEqual([(file["name"], file["verdict"]) for file in files],
                         [("-a.mrc", "good"), ("--json", "unsupported")])
        self.assertEqual(run("info", "--", server=None).returncode, USAGE)

    def test_a_pattern_without_a_match_says_so(self):
        result = run("info", "*.mrc", folder=self.folder)
        self.assertEqual((result.returncode, result.stdout, result.stderr),
                         (FAILED, "", "*.mrc: No file matches. Check the pattern and the folder.\n"))
        result = run("page", "*.mrc", folder=self.folder)
        self.assertEqual((result.returncode, result.stdout), (FAILED, ""))
        self.assertOneSentence(result.stderr, 'No file matches "*.mrc".')

    def test_invalid_arguments_are_a_usage_error_of_one_sentence(self):
        for arguments, *parts in (
            ((), "No command"),
            (("show",), '"show"', "qelshow --help"),
            (("info",), "No file", "qelshow info --help"),
            (("info", "a.mrc", "--pretty"), '"--pretty"'),
            (("info", "a.mrc", "--json=1"), '"--json=1"', "no value"),
            (("info", "a.mrc", "--json="), '"--json="', "no value"),
            (("help", "show"), '"show"', "qelshow --help"),
            (("help", "info", "page"), '"page"'),
            (("--version", "info"), '"info"'),
            (("info", "a.mrc", "--out", "x"), '"--out"'),
            (("info", "a.mrc", "--server"), '"--server"', "value"),
            (("info", "a.mrc", "--size", "0"), '"0"', "1 to 4096"),
            (("info", "a.mrc", "--size=4097"), '"4097"'),
            (("info", "a.mrc", "--size", "12x"), '"12x"'),
            (("thumbnail", "a.mrc"), "--out"),
            (("thumbnail", "a.mrc", "b.mrc", "-o", "-"), "one file", "2"),
            (("page", "a.mrc", "--out="), '"--out="', "value"),
            (("page", "a.mrc", "--out", ""), '"--out"', "value"),
            (("page", "a.mrc", "--json", "--out", "x"), '"--json"'),
            (("page", "a.mrc", "--out", "-"), "standard output"),
            (("doctor", "--server", "a.dll"), '"--server"'),
            (("doctor", "--size=8"), '"--size=8"'),
        ):
            with self.subTest(arguments=arguments):
                result = run(*arguments, server=None)
                self.assertEqual((result.returncode, result.stdout), (USAGE, ""))
                self.assertOneSentence(result.stderr, *parts)

    def test_sizes_go_up_to_4096(self):
        result = run("info", self.write("a.mrc", mrc()), "--json", "--size", "4096")
        file, = json.loads(result.stdout)["files"]
        self.assertEqual((result.returncode, file["thumbnail"]["request"]), (DONE, 4096))

    def test_a_single_hyphen_is_the_name_of_a_file(self):
        result = run("info", "-")
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, "-: The file cannot be opened")

    def test_a_server_that_cannot_be_loaded_is_named(self):
        missing = self.folder / "no such.dll"
        other = self.write("text.dll", b"this is not a DLL")
        for server in (missing, other):
            result = run("info", self.write("a.mrc", mrc()), server=str(server))
            self.assertEqual((result.returncode, result.stdout), (FAILED, ""))
            self.assertOneSentence(result.stderr, server)

    def test_the_fault_of_a_server_is_reported(self):
        dll = bytearray(pathlib.Path(SERVER).read_bytes())
        machine = struct.unpack_from("<i", dll, 60)[0] + 4
        for name, contents, part in (
            ("empty.dll", b"", "damaged or not a DLL"),
            ("cut.dll", dll[:len(dll) // 2], "damaged or not a DLL"),
            ("x86.dll", dll[:machine] + b"\x4C\x01" + dll[machine + 2:], "32-bit"),
            ("arm.dll", dll[:machine] + b"\x64\xAA" + dll[machine + 2:], "another kind of processor"),
            ("needy.dll", dll.replace(b"SHLWAPI.dll", b"NOTHERE.dll"), "another DLL that it needs is missing"),
        ):
            with self.subTest(name):
                server = self.write(name, contents)
                result = run("info", self.write("a.mrc", mrc()), server=str(server))
                self.assertEqual((result.returncode, result.stdout), (FAILED, ""))
                self.assertOneSentence(result.stderr, server, part)

    def test_a_pattern_is_replaced_by_the_files_that_it_matches(self):
        # The command interpreters of Windows leave patterns to the program.
        for name in ("ä 1.mrc", "ä 2.mrc", "ä 3.ali"):
            self.write(name, mrc())
        files = self.info(str(self.folder / "*.mrc"), str(self.folder / "?3.ali"), str(self.folder / "??3.ali"))
        self.assertEqual([(file["name"], file["verdict"]) for file in files],
                         [("ä 1.mrc", "good"), ("ä 2.mrc", "good"), ("?3.ali", "failed"), ("ä 3.ali", "good")])


class ExitStatus(Test):
    def test_is_that_of_the_worst_file(self):
        good = self.write("good.mrc", mrc())
        missing = self.folder / "missing.mrc"
        text = self.write("notes.txt", b"notes")
        damaged = self.write("damaged.mrc", mrc(mode=17))
        for paths, status in (
            ((good,), DONE),
            ((good, missing, good), FAILED),
            ((missing, text), UNSUPPORTED),
            ((damaged, text, good), NO_THUMBNAIL),
        ):
            with self.subTest(paths=paths):
                self.assertEqual(run("info", *paths).returncode, status)
        for path, status in ((missing, FAILED), (text, UNSUPPORTED)):
            with self.subTest(path=path):
                self.assertEqual(run("thumbnail", path, "-o", self.folder / "out.png").returncode, status)

    def test_a_failure_is_one_sentence_that_names_the_file_and_the_fault(self):
        files = []
        ser = struct.pack("<3H5I", 0x4949, 0x0197, 0x0210, 0x4122, 0x4152, 1, 1, 30) + struct.pack("<I", 0)
        element = bytes(40) + struct.pack("<hII", 11, 1, 1) + b"\0"
        for name, contents, *parts in (
            ("nx.mrc", mrc(width=0), "nx is 0", "at least 1"),
            ("ny.ali", mrc(height=-5, pixels=b""), "ny is -5"),
            ("nz.rec", mrc(frames=0), "nz is 0"),
            ("mode.mrc", mrc(mode=17), "mode is 17", "0 to 16"),
            ("swapped.mrc", mrc(0x7FFFFFFF, 0x7FFFFFFF, 0x7FFFFFFF, pixels=b""), "nx is -129", "appears to be big-endian"),
            ("short.mrc", mrc()[:1000], "1000 bytes"),
            ("empty.mrc", b"", "The file is empty."),
            ("cut.mrc", mrc(200, 100, 3)[:41000], "41024", "41000 bytes"),
            ("even.mrc", mrc(200, 100, 4)[:61023], "61024", "61023 bytes"),
            ("far.mrc", mrc(50000, 50000, pixels=b""), "2 GiB"),
            ("magic.raw", b"QEL RawPicture" + bytes(60), "magic", "QEL RawImage"),
            ("type.raw", raw(1, 1, 3, 32, bytes(4)), "0x30020"),
            ("cut.raw", raw(10, 10, 0, 16, bytes(199)), "249", "248 bytes"),
            ("code.ebn", struct.pack("<Hiii5d", 9, 1, 1, 54, 0, 0, 0, 0, 0) + b"\0", "data type code is 9"),
            ("offset.ebn", struct.pack("<Hiii5d", 1, 1, 1, 53, 0, 0, 0, 0, 0) + b"\0", "data offset is 53"),
            ("cut.ebn", struct.pack("<Hiii5d", 1, 9, 9, 54, 0, 0, 0, 0, 0) + b"\0", "135", "55 bytes"),
            ("order.ser", b"\0" + ser[1:], "byte order is 0x4900", "0x4949"),
            ("lines.ser", ser[:6] + b"\x20\x41" + ser[8:] + struct.pack("<2I", 38, 0) + bytes(40)
             + struct.pack("<hII", 1, 1, 1) + b"\0", "series of lines"),
            ("element.ser", ser + struct.pack("<2I", 38, 0) + element, "element is 11", "1 to 10"),
            ("magic.emi", b"\x4A\x4C\0\x02\0\0\0\0", "0x4C4A", "0x4B4A"),
            ("version.emi", b"\x4A\x4B\x01\x02\0\0\0\0", "version is 0x0201"),
            ("bare.emi", b"\x4A\x4B\0\x02\0\0\0\0\0\0", "no image object"),
            ("text.emi", b"\x4A\x4B\0\x02\0\0\0\0\x60\0\0\x01\0\0\0\0", "beyond byte 12", "bad EMI object index"),
            ("length.ser", ser[:-4] + struct.pack("<IIddii", 1, 1, 0, 1, 0, -5) + b"\0", "beyond byte 58", "negative"),
        ):
            files.append((self.write(name, contents), parts))
        result = run("info", *(path for path, _ in files))
        self.assertEqual(result.returncode, NO_THUMBNAIL)
        reported = result.stderr.splitlines()
        self.assertEqual(len(reported), len(files))
        for line, (path, parts) in zip(reported, files):
            with self.subTest(path.name):
                self.assertOneSentence(line, path, *parts)

    def test_a_missing_thumbnail_is_not_written(self):
        path = self.write("mode.mrc", mrc(mode=17))
        result = run("thumbnail", path, "-o", self.folder / "out.png")
        self.assertEqual((result.returncode, result.stdout), (NO_THUMBNAIL, ""))
        self.assertOneSentence(result.stderr, path, "mode is 17")
        self.assertFalse((self.folder / "out.png").exists())

    def test_output_that_cannot_be_printed_is_a_failure(self):
        self.assertTrue(pathlib.Path("/dev/full").is_char_device(), "/dev/full is not a device on this machine")
        path = self.write("a.mrc", mrc())
        for arguments in (("info", path), ("info", path, "--json"), ("thumbnail", path, "-o", "-"),
                          ("page", path, "--out", self.folder / "page")):
            with self.subTest(arguments=arguments), open("/dev/full", "wb") as full, tempfile.TemporaryFile() as errors:
                self.assertEqual(start(*arguments, stdout=full, stderr=errors).wait(), FAILED)
                errors.seek(0)
                self.assertOneSentence(errors.read().decode(), "Standard output cannot be written: Disk full")

    def test_output_that_nobody_reads_is_not_a_failure(self):
        path = self.write("a.mrc", mrc())
        for arguments in (("info", path), ("info", path, "--json"), ("thumbnail", path, "-o", "-")):
            reading, writing = os.pipe()
            os.close(reading)
            with self.subTest(arguments=arguments), tempfile.TemporaryFile() as errors:
                process = start(*arguments, stdout=writing, stderr=errors)
                os.close(writing)
                self.assertEqual(process.wait(), DONE)
                errors.seek(0)
                self.assertEqual(errors.read(), b"")

    def test_each_problem_is_printed_once(self):
        paths = (self.write("mode.mrc", mrc(mode=17)), self.write("notes.txt", b""), self.folder / "gone.mrc")
        result = run("info", *paths)
        printed = result.stdout + result.stderr
        for path, part in zip(paths, ("mode is 17", "supports only", "cannot be opened")):
            self.assertEqual(printed.count(part), 1, part)
            self.assertIn(str(path), result.stderr)
        self.assertEqual(result.stdout.count("\n\n"), 0)
        self.assertNotIn("notes.txt", result.stdout)

    def test_a_folder_is_not_a_file(self):
        result = run("info", self.folder)
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, self.folder, "folder")


class Thumbnail(Test):
    def test_is_written_as_png_to_a_file_and_to_standard_output(self):
        path = self.write("stack.mrc", mrc(300, 200, 5))
        out = self.folder / "out.png"
        result = run("thumbnail", path, "-o", out, "--size", "128")
        self.assertEqual((result.returncode, result.stdout, result.stderr), (DONE, "", ""))
        self.assertEqual(png_facts(out.read_bytes()), (150, 100, 8, 0))
        piped = run_for_bytes("thumbnail", path, "--out", "-", "--size=128")
        self.assertEqual((piped.returncode, piped.stdout), (DONE, out.read_bytes()))

    def test_of_a_colour_frame_is_in_colour(self):
        out = self.folder / "out.png"
        self.assertEqual(run("thumbnail", self.write("c.mrc", mrc(300, 260, mode=16)), "-o", out).returncode, DONE)
        self.assertEqual(png_facts(out.read_bytes()), (300, 260, 8, 2))

    def test_that_cannot_be_written_is_a_failure_that_names_the_file(self):
        out = self.folder / "no such folder" / "out.png"
        result = run("thumbnail", self.write("a.mrc", mrc()), "-o", out)
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, "out.png", "cannot be written")


class Output(Test):
    """What qelshow writes, and what it never overwrites."""

    NO_SERVER = "no such.dll"  # refused outputs are reported before the server is needed

    def setUp(self):
        super().setUp()
        self.source = self.write("source.mrc", mrc(20, 10))

    def contents(self, *folders):
        """Returns the bytes of all files in the test's folder, by path."""
        return {path: path.read_bytes() for path in self.folder.rglob("*") if path.is_file()}

    def assertRefused(self, *arguments, parts):
        before = self.contents()
        result = run(*arguments, server=self.NO_SERVER, folder=self.folder)
        self.assertEqual((result.returncode, result.stdout), (USAGE, ""))
        self.assertOneSentence(result.stderr, *parts)
        self.assertEqual(self.contents(), before)

    def test_is_never_the_input_however_it_is_spelled(self):
        os.link(self.source, self.folder / "hard.png")
        os.symlink(self.source, self.folder / "soft.png")
        for out in ("source.mrc", "./SOURCE.MRC", self.source, "hard.png", "soft.png"):
            with self.subTest(out=out):
                self.assertRefused("thumbnail", "source.mrc", "-o", out, parts=(out, "is the input file"))

    def test_never_has_the_extension_of_an_image_file(self):
        self.write("other.mrc", mrc())
        for out in ("other.mrc", "new.Ebn", "deep.er/new.raw"):
            with self.subTest(out=out):
                self.assertRefused("thumbnail", "source.mrc", "-o", out, parts=(out, "extension"))
                self.assertRefused("page", "source.mrc", "--out", out, parts=(out, "extension"))

    def test_does_not_replace_the_files_of_other_programs(self):
        header = struct.pack(">I4sIIBBBBB", 13, b"IHDR", 1, 1, 8, 0, 0, 0, 0)
        self.write("photo.png", b"\x89PNG\r\n\x1a\n" + header + bytes(100))
        self.write("empty.png", b"")
        self.write("site/index.html", b"<!DOCTYPE html><title>Mine</title>")
        self.write("album/thumbnails/1.png", b"mine")
        for out in ("photo.png", "empty.png"):
            self.assertRefused("thumbnail", "source.mrc", "-o", out, parts=(out, "not written by qelshow", "delete it", "--out"))
        for folder, file in (("site", "index.html"), ("album", "1.png")):
            self.assertRefused("page", "source.mrc", "--out", folder, parts=(folder, file, "not written by qelshow", "delete it", "--out"))

    def test_is_not_a_folder_in_place_of_a_file_nor_a_file_in_place_of_a_folder(self):
        (self.folder / "folder").mkdir()
        self.write("file", b"mine")
        self.assertRefused("thumbnail", "source.mrc", "-o", "folder", parts=("folder", "is a folder"))
        self.assertRefused("page", "source.mrc", "--out", "file", parts=("file", "is a file"))

    def test_replaces_a_png_of_its_own_in_one_step(self):
        out = self.folder / "out.png"
        self.assertEqual(run("thumbnail", self.source, "-o", out).returncode, DONE)
        earlier = out.read_bytes()
        os.link(out, self.folder / "earlier.png")  # would change if qelshow wrote into the existing file
        self.write("out.png.part", b"mine")
        self.assertEqual(run("thumbnail", self.write("larger.mrc", mrc(60, 40)), "-o", out).returncode, DONE)
        self.assertEqual(png_facts(out.read_bytes())[:2], (60, 40))
        self.assertEqual((self.folder / "earlier.png").read_bytes(), earlier)
        self.assertEqual(sorted(path.name for path in self.folder.iterdir()),
                         ["earlier.png", "larger.mrc", "out.png", "out.png.part", "source.mrc"])
        self.assertEqual((self.folder / "out.png.part").read_bytes(), b"mine")

    def test_is_a_png_whose_parts_are_all_intact(self):
        png = run_for_bytes("thumbnail", self.source, "-o", "-").stdout
        place, kinds = 8, []
        while place < len(png):
            length, kind = struct.unpack_from(">I4s", png, place)
            end = place + 8 + length
            self.assertEqual(struct.unpack_from(">I", png, end)[0], zlib.crc32(png[place + 4:end]), kind)
            kinds.append(kind)
            place = end + 4
        self.assertEqual((kinds[0], kinds[-1]), (b"IHDR", b"IEND"))

    def make_page(self, *paths, **options):
        return run("page", *paths, "--out", "page", folder=self.folder, **options)

    def test_replaces_an_earlier_page_with_its_thumbnails(self):
        other = self.write("other.mrc", mrc(8, 6))
        self.assertEqual(self.make_page(self.source, other, other).returncode, DONE)
        self.write("page/thumbnails/mine.png", b"mine")
        self.write("page/thumbnails/2.txt", b"mine")
        self.write("page/notes.txt", b"mine")
        self.assertEqual(self.make_page(other).returncode, DONE)
        self.assertEqual(sorted(str(path.relative_to(self.folder)) for path in self.contents()),
                         ["other.mrc", "page/index.html", "page/notes.txt", "page/thumbnails/1.png",
                          "page/thumbnails/2.txt", "page/thumbnails/mine.png", "source.mrc"])
        self.assertEqual(png_facts((self.folder / "page/thumbnails/1.png").read_bytes())[:2], (8, 6))

    def test_that_is_not_finished_leaves_the_earlier_page_unchanged(self):
        self.make_page(self.source)
        before = self.contents()
        other = self.write("other.mrc", mrc(8, 6))
        before[other] = other.read_bytes()
        with open("/dev/full", "wb") as full:
            process = start("page", other, other, "--out", "page", stdout=full, stderr=subprocess.DEVNULL,
                            cwd=self.folder)
            self.assertEqual(process.wait(), FAILED)
        self.assertEqual(self.contents(), before)
        self.assertEqual(sorted(path.name for path in (self.folder / "page").iterdir()), ["index.html", "thumbnails"])


class Faults(Test):
    def test_of_the_extension_end_one_request_and_not_the_run(self):
        # A colour frame that is smaller than the request causes a division by zero.
        small = self.write("small.raw", raw(8, 6, 3, 24, bytes(8 * 6 * 3)))
        good = self.write("good.mrc", mrc())
        files = self.info(small, good)
        self.assertOneSentence(files[0]["problem"], "in colour and smaller", "256 x 256", "0xC0000094",
                               "division by zero")
        self.assertIn("smaller icons", files[0]["advice"])
        self.assertEqual((files[0]["verdict"], files[0]["thumbnail"]["width"]), ("no thumbnail", 0))
        self.assertEqual((files[1]["verdict"], files[1]["problem"], files[1]["advice"]), ("good", None, None))

    def test_a_colour_frame_has_a_thumbnail_unless_both_sides_are_smaller_than_the_request(self):
        small = self.write("small.raw", raw(8, 6, 3, 24, bytes(8 * 6 * 3)))
        out = self.folder / "out.png"
        result = run("thumbnail", small, "-o", out, "--size", 9)
        self.assertEqual((result.returncode, out.exists()), (NO_THUMBNAIL, False))
        self.assertOneSentence(result.stderr, small, "in colour and smaller")
        result = run("thumbnail", small, "-o", out, "--size", 8)
        self.assertEqual((result.returncode, result.stderr, out.exists()), (DONE, "", True))

    def test_a_frame_has_no_thumbnail_if_its_shorter_side_has_fewer_pixels_than_the_factor(self):
        for width, height, shown in ((1000, 3, True), (1000, 2, False), (2, 1000, False)):
            with self.subTest(width=width, height=height):
                [file] = self.info(self.write("line.mrc", mrc(width, height)))
                self.assertEqual(file["thumbnail"]["width"] > 0, shown)
                if not shown:
                    self.assertOneSentence(file["problem"], f"{width} x {height}", "too narrow", "256 x 256")
                    self.assertIn("larger --size", file["advice"])

    def test_in_any_request_are_reported_for_their_file(self):
        names = ("fault in load.mrc", "fault in tip.mrc", "quiet.mrc")
        load, tip, quiet = self.info(*(self.write(name, mrc()) for name in names), server=FAULTY_SERVER)
        self.assertIn("0xC0000005 (access violation)", load["tip"]["problem"])
        self.assertIn("0xC0000005 (access violation)", load["thumbnail"]["problem"])
        self.assertEqual(load["problem"], load["thumbnail"]["problem"])
        self.assertIn("0xC00000FD (stack overflow)", tip["tip"]["problem"])
        self.assertIn(": unspecified failure.", tip["thumbnail"]["problem"])
        self.assertIn(": not implemented.", quiet["tip"]["problem"])
        self.assertIn("no such interface", quiet["columns"]["problem"])
        self.assertIn("no such class", quiet["propertyStore"]["problem"])
        self.assertEqual([file["verdict"] for file in (load, tip, quiet)], ["no thumbnail"] * 3)

    def test_exceptions_are_caught_with_their_text(self):
        error, number = self.info(self.write("error thrown.mrc", mrc()), self.write("number thrown.mrc", mrc()),
                                  server=FAULTY_SERVER)
        self.assertIn(": no such luck.", error["thumbnail"]["problem"])
        self.assertIn("unknown type", number["thumbnail"]["problem"])

    def test_a_file_that_makes_a_reader_throw_has_no_thumbnail(self):
        path = self.write("text.emi", b"\x4A\x4B\0\x02\0\0\0\0\x60\0\0\x01\0\0\0\0")
        result = run("info", path, "--json")
        file, = json.loads(result.stdout)["files"]
        self.assertEqual((result.returncode, file["verdict"]), (NO_THUMBNAIL, "no thumbnail"))
        self.assertIn("bad EMI object index", file["problem"])
        self.assertIn("an exception: bad EMI object index", file["thumbnail"]["problem"])


    def test_the_worker_process_ends_with_the_program(self):
        program = self.write("a program of its own.exe", pathlib.Path(QELSHOW).read_bytes())
        self.assertEqual(run("info", self.write("a.mrc", mrc()), program=program).returncode, DONE)
        deadline = time.monotonic() + 60
        while self.processes(program.name) and time.monotonic() < deadline:
            time.sleep(0.1)
        self.assertEqual(self.processes(program.name), [])

    def processes(self, name):
        """Returns the command lines of the running processes that contain `name`."""
        found = []
        for path in pathlib.Path("/proc").glob("[0-9]*/cmdline"):
            with contextlib.suppress(OSError):
                line = path.read_bytes()
                found += [line] if name.encode() in line else []
        return found


class Json(Test):
    def test_is_valid_whatever_the_names_and_texts_are(self):
        name = "a & b's (ü é 樹 🔬) #100%.mrc"
        label = b"</script><script>alert(1)</script> \" \\ \x01 \xe9"
        file, = self.info(self.write(name, mrc(label=label)))
        self.assertEqual((file["name"], file["verdict"]), (name, "good"))
        self.assertEqual(file["path"], f"Z:{self.folder / name}".replace("/", "\\"))

    def test_keeps_control_characters_and_line_separators(self):
        name = "a\u2028b\u2029c.mrc"
        file, = self.info(self.write(name, mrc(label=b"a\x1fb")))
        self.assertEqual(file["name"], name)
        self.assertTrue(file["tip"]["text"].endswith("a\x1fb"))

    def test_lists_the_supported_kinds_for_an_unsupported_file(self):
        file, = self.info(self.write("notes.txt", b"notes"))
        self.assertEqual((file["verdict"], file["kind"], file["width"]), ("unsupported", "txt", 0))
        self.assertIn(".mrc", file["problem"])

    def test_has_the_file_s_size_and_kind(self):
        file, = self.info(self.write("UPPER.MRC", mrc()))
        self.assertEqual((file["bytes"], file["kind"]), (1024 + 12, "mrc"))

    def test_has_the_time_at_which_the_file_was_last_written(self):
        path = self.write("a.mrc", mrc())
        os.utime(path, (0, 1614834367))
        file, = self.info(path)
        self.assertEqual(file["modified"], "2021-03-04T05:06:07Z")
        file, = self.info(self.folder / "gone.mrc")
        self.assertIsNone(file["modified"])

    def test_has_the_size_of_a_file_beyond_4_GiB(self):
        path = self.write("large.mrc", mrc())
        os.truncate(path, (5 << 32) + 7)
        file, = self.info(path)
        self.assertEqual((file["bytes"], file["verdict"]), ((5 << 32) + 7, "good"))


class Answers(Test):
    """The answers of the extension in the report."""

    IMAGE_SUMMARY = "{6444048F-4C8B-11D1-8B70-080036B11A03}"
    SUMMARY = "{F29F85E0-4FF9-1068-AB91-08002B27B3D9}"

    def rows(self, answer, *members):
        self.assertIsNone(answer["problem"])
        return [tuple(item[member] for member in members) for item in answer["items"]]

    def test_of_a_stack(self):
        path = self.write("stack.mrc", mrc(40, 30, 7, 1, b"Line one"))
        file, = self.info(path)
        self.assertEqual([file[name] for name in ("width", "height", "frames", "bitDepth", "type")],
                         [40, 30, 7, 16, "16 bit signed"])
        self.assertRegex(file["tip"]["text"], r"\ADimensions: 7 images \(40 × 30\) 16 bit signed\r\nType: \r\n"
                                              r"Date Modified: .+\r\nSize: 17.4 KB\r\nLine one\Z")
        self.assertEqual(self.rows(file["columns"], "title", "set", "id", "declared", "returned", "value"), [
            ("Width", self.IMAGE_SUMMARY, 3, "VT_I4", "VT_I4", 40),
            ("Height", self.IMAGE_SUMMARY, 4, "VT_I4", "VT_I4", 30),
            ("Bit Depth", self.IMAGE_SUMMARY, 7, "VT_UI4", "VT_I4", 16),
            ("Frame Count", self.IMAGE_SUMMARY, 12, "VT_UI4", "VT_I4", 7),
            ("Dimensions", self.IMAGE_SUMMARY, 13, "VT_LPWSTR", "VT_BSTR", "40 x 30"),
            ("Comments", self.SUMMARY, 6, "VT_LPWSTR", "VT_BSTR", "Line one"),
        ])
        self.assertEqual(self.rows(file["columns"], "index", "characters", "state"),
                         [(0, 5, 0x101), (1, 5, 0x101), (2, 5, 1), (3, 5, 1), (4, 20, 0x11), (5, 30, 0x11)])
        self.assertEqual(self.rows(file["propertySets"], "set", "id", "type", "value"), [
            (self.IMAGE_SUMMARY, 3, "VT_INT", 40),
            (self.IMAGE_SUMMARY, 4, "VT_INT", 30),
            (self.IMAGE_SUMMARY, 7, "VT_INT", 16),
            (self.IMAGE_SUMMARY, 12, "VT_INT", 7),
            (self.IMAGE_SUMMARY, 13, "VT_BSTR", "40 x 30"),
            (self.SUMMARY, 6, "VT_BSTR", "Line one"),
        ])
        self.assertEqual(self.rows(file["propertyStore"], "name", "set", "id", "type", "value"), [
            ("System.Image.HorizontalSize", self.IMAGE_SUMMARY, 3, "VT_UI4", 40),
            ("System.Image.VerticalSize", self.IMAGE_SUMMARY, 4, "VT_UI4", 30),
            ("System.Image.BitDepth", self.IMAGE_SUMMARY, 7, "VT_UI4", 16),
            ("System.Media.FrameCount", self.IMAGE_SUMMARY, 12, "VT_UI4", 7),
            ("System.Image.Dimensions", self.IMAGE_SUMMARY, 13, "VT_LPWSTR", "(40 x 30) 16 bit signed"),
            ("System.Comment", self.SUMMARY, 6, "VT_LPWSTR", ""),
        ])

        text = run("info", path).stdout
        for part in ("40 x 30", "Frames      7", "16 bit signed", "Thumbnail   40 x 30, 8 bits per pixel",
                     "    Line one\n", "VT_UI4     VT_I4     16", "System.Media.FrameCount"):
            self.assertIn(part, text)

    def test_contain_the_facts_of_the_header(self):
        path = self.write("a.raw", raw(4, 3, 0, 8, bytes(12)))
        file, = self.info(path)
        facts = [("Offset of the first pixel", 0, "B"), ("Pixel stride", 1, "B"), ("Row stride", 4, "B")]
        self.assertEqual([(fact["name"], fact["value"], fact["unit"]) for fact in file["header"]], facts)
        text = run("info", path).stdout
        self.assertIn("  Header\n"
                      "    Offset of the first pixel  0 B\n"
                      "    Pixel stride               1 B\n"
                      "    Row stride                 4 B\n"
                      "  Tip\n", text)

        path = self.write("a.ebn", ebn(2.0, float("nan"), -1.6, 1.2e-9, 300.0))
        file, = self.info(path)
        self.assertEqual([(fact["name"], fact["value"], fact["unit"]) for fact in file["header"]],
                         [("Microscope model code", 2, None), ("Electron source code", "nan", None),
                          ("Objective lens code", -1.6, None), ("D number", 1.2e-9, None),
                          ("Accelerating voltage", 300, "kV")])
        text = run("info", path).stdout
        for line in ("Microscope model code  2\n", "Electron source code   nan\n", "Objective lens code    -1.6\n",
                     "D number               1.2e-09\n", "Accelerating voltage   300 kV\n"):
            self.assertIn(line, text)

        # A string in UTF-8, one in code page 1252, and one with two lines.
        for units, decoded in ((b"\xc2\xb5m", "µm"), (b"\xb5m", "µm"), (b"n\r\nm", "n\r\nm")):
            path = self.write("a.ser", ser(units))
            file, = self.info(path)
            self.assertEqual(
                [(fact["name"], fact["value"], fact["unit"]) for fact in file["header"]],
                [("Tags", "times", None), ("Number of dimensions", 1, None), ("Dimension 1 size", 3, None),
                 ("Dimension 1 calibration offset", -1.5, decoded), ("Dimension 1 calibration delta", 0.25, decoded),
                 ("Dimension 1 calibration element", 2, None), ("Dimension 1 description", "Defocus", None),
                 ("Dimension 1 units", decoded, None), ("X calibration offset", 0, None),
                 ("X calibration delta", 1.2e-9, None), ("X calibration element", 4, None),
                 ("Y calibration offset", 0, None), ("Y calibration delta", 1.2e-9, None),
                 ("Y calibration element", 4, None)])
            self.assertIn("    Dimension 1 calibration delta    0.25 " + decoded.replace("\r\n", " ") + "\n",
                          run("info", path).stdout)

        path = self.write("a.mrc", mrc())
        self.assertEqual(self.info(path)[0]["header"], [])
        self.assertNotIn("Header", run("info", path).stdout)

    def test_a_kind_without_a_property_store_says_so(self):
        files = self.info(*(self.write("a." + kind, b"") for kind in ("ali", "rec", "ser", "emi")))
        for file in files:
            self.assertEqual(file["propertyStore"]["items"], [])
            self.assertIn(f"no property store for .{file['kind']} files", file["propertyStore"]["problem"])

    def test_have_columns_up_to_a_path_of_259_characters(self):
        folder = str(self.folder) + "/" + "f" * 100
        names = ["n" * (length - len("Z:" + folder + "/")) for length in (259, 260)]
        longest, too_long = self.info(*(self.write(f"{folder}/{name[:-4]}.mrc", mrc()) for name in names))
        self.assertEqual([len(file["columns"]["items"]) for file in (longest, too_long)], [6, 0])
        self.assertEqual([(file["width"], file["height"], file["frames"]) for file in (longest, too_long)], [(4, 3, 1)] * 2)
        self.assertIn("260 characters or more", too_long["columns"]["problem"])
        self.assertIsNone(longest["remark"])
        self.assertOneSentence(too_long["remark"], "260 characters", "no columns")

    def test_of_a_damaged_file_say_why_they_are_missing(self):
        file, = self.info(self.write("a.mrc", mrc(mode=17)))
        self.assertEqual(file["tip"]["problem"], "The extension returned no tip: unspecified failure.")
        self.assertEqual(file["propertySets"]["problem"], "The extension returned no property sets: unspecified failure.")
        self.assertEqual({column["problem"] for column in file["columns"]["items"]}, {"no value"})
        self.assertEqual({value["problem"] for value in file["propertyStore"]["items"]}, {"unspecified failure"})
        self.assertEqual({item["value"] for name in ("columns", "propertyStore") for item in file[name]["items"]}, {None})


class Page(Test):
    def document_of(self, page):
        """Returns the files of the JSON document in a page."""
        text = page.read_text("utf-8")
        data = re.search(r'<script id="files" type="application/json">(.*?)</script>', text, re.DOTALL)
        document = json.loads(data[1])
        self.assertEqual(document["schema"], 3)
        return document

    def files_of(self, page):
        return self.document_of(page)["files"]

    def test_has_every_file_of_a_folder_with_its_thumbnail(self):
        names = ["a & b's (ü é 樹) #100%.mrc", "big.MRC", "deep/below/three.ali", "broken.ser", "small.raw"]
        for name in names[:3]:
            self.write("in/" + name, mrc(label=b"</script><img src=x onerror=alert(1)>"))
        self.write("in/broken.ser", b"")
        self.write("in/small.raw", raw(8, 6, 5, 24, bytes(8 * 6 * 3)))
        self.write("in/notes.txt", b"not shown")
        out = self.folder / "page"
        result = run("page", self.folder / "in", "--out", out)
        self.assertEqual((result.returncode, result.stderr), (DONE, ""))

        files = self.files_of(out / "index.html")
        self.assertEqual(sorted(file["name"].replace("\\", "/") for file in files), sorted(names))
        for file in files:
            thumbnail = file["thumbnail"]["file"]
            if file["name"] == "broken.ser":
                self.assertIsNone(thumbnail)
                self.assertEqual(file["problem"], "The file is empty.")
                self.assertIn("Copy it again", file["advice"])
            elif file["name"] == "small.raw":
                self.assertIsNone(thumbnail)
                self.assertIn("in colour and smaller", file["problem"])
            else:
                width, height, _, _ = png_facts((out / thumbnail).read_bytes())
                self.assertEqual((width, height), (file["thumbnail"]["width"], file["thumbnail"]["height"]))
        self.assertEqual(len({file["thumbnail"]["file"] for file in files}), 4)
        self.assertEqual(sorted(path.name for path in out.iterdir()), ["index.html", "thumbnails"])

        lines = result.stdout.splitlines()
        self.assertEqual(len(lines), 1 + len(names) + 2)
        self.assertIn("5 files, 3 with a thumbnail", lines[-1])
        self.assertRegex(result.stdout, r"(?m)^small.raw .* none: The frame is in colour and smaller")
        self.assertRegex(result.stdout, r"(?m)^big.MRC .* 4 x 3$")
        self.assertRegex(result.stdout, r"(?m)^broken.ser .* none: The file is empty\.$")

    def test_lists_named_files_even_if_they_cannot_be_shown(self):
        out = self.folder / "page"
        result = run("page", self.write("b.mrc", mrc()), self.folder / "gone.mrc", self.write("a.txt", b""),
                     "--out", out)
        self.assertEqual(result.returncode, DONE)
        self.assertEqual([(file["name"], file["verdict"]) for file in self.files_of(out / "index.html")],
                         [("b.mrc", "good"), ("gone.mrc", "failed"), ("a.txt", "unsupported")])

    def test_has_the_files_of_each_folder_in_the_order_of_the_folders(self):
        for name in ("1/b.mrc", "1/a.mrc", "2/d 10.mrc", "2/d 9.mrc"):
            self.write(name, mrc())
        out = self.folder / "page"
        run("page", self.folder / "2", self.folder / "1", "--out", out)
        self.assertEqual([file["name"] for file in self.files_of(out / "index.html")],
                         [r"2\d 9.mrc", r"2\d 10.mrc", r"1\a.mrc", r"1\b.mrc"])

    def test_names_the_files_relative_to_the_folder_that_contains_them_all(self):
        for name in ("in/one/a.mrc", "in/ONE more/a.mrc"):
            self.write(name, mrc())
        out = self.folder / "page"
        one, more = (["in/one"], r"in\one", ["a.mrc"]), (["in/ONE more"], r"in\ONE more", ["a.mrc"])
        for paths, folder, names in (
            one, more,
            (["in/ONE/../one/"], *one[1:]),
            (["in"], "in", [r"one\a.mrc", r"ONE more\a.mrc"]),
            (["in/one", "in/ONE more/a.mrc"], "in", [r"one\a.mrc", r"ONE more\a.mrc"]),
            (["IN/one/a.mrc", "in/ONE more"], "in", [r"one\a.mrc", r"ONE more\a.mrc"]),
            (["in", r"C:\gone.mrc"], None, [rf"{self.windows_path('in/one')}\a.mrc",
                                            rf"{self.windows_path('in/ONE more')}\a.mrc", r"C:\gone.mrc"]),
        ):
            with self.subTest(paths=paths):
                self.assertEqual(run("page", *paths, "--out", out, folder=self.folder).returncode, DONE)
                document = self.document_of(out / "index.html")
                self.assertEqual(document["folder"].lower(), self.windows_path(folder).lower() if folder else "")
                self.assertEqual(sorted(file["name"].lower() for file in document["files"]),
                                 sorted(name.lower() for name in names))

    def windows_path(self, name):
        return f"Z:{self.folder / pathlib.PureWindowsPath(name).as_posix()}".replace("/", "\\")

    def test_lists_files_whose_names_windows_does_not_allow(self):
        for name in ("in/a.mrc", "in/b?.mrc"):
            self.write(name, mrc())
        result = run("page", self.folder / "in", "--out", self.folder / "page")
        self.assertEqual(result.returncode, DONE)
        named, other = self.files_of(self.folder / "page" / "index.html")
        self.assertEqual((named["verdict"], other["name"], other["verdict"]), ("good", "b?.mrc", "failed"))
        self.assertOneSentence(other["problem"], "characters that Windows does not allow")
        self.assertIn("2 files, 1 with a thumbnail", result.stdout)

    def test_loads_nothing_from_a_network(self):
        out = self.folder / "page"
        run("page", self.write("a.mrc", mrc()), "--out", out)
        self.assertNotRegex((out / "index.html").read_text("utf-8"), r"(?i)\b(https?:)?//[a-z0-9.-]+\.[a-z]")

    def test_of_a_folder_without_files_of_a_supported_kind_is_not_made(self):
        self.write("in/notes.txt", b"notes")
        result = run("page", self.folder / "in", "--out", self.folder / "page")
        self.assertEqual(result.returncode, UNSUPPORTED)
        self.assertOneSentence(result.stderr, self.folder / "in")
        self.assertFalse((self.folder / "page").exists())

    def test_is_not_made_when_no_file_can_be_shown(self):
        gone, text = self.folder / "gone.mrc", self.write("notes.txt", b"notes")
        for paths, status, *parts in (
            ((gone,), FAILED, gone, "cannot be opened"),
            ((text, gone), FAILED, gone, "cannot be opened"),
            ((self.folder / "no folder",), FAILED, "no folder", "cannot be opened"),
            ((text,), UNSUPPORTED, text, ".mrc"),
        ):
            with self.subTest(paths=paths):
                result = run("page", *paths, "--out", self.folder / "page")
                self.assertEqual((result.returncode, result.stdout), (status, ""))
                self.assertOneSentence(result.stderr, *parts)
                self.assertFalse((self.folder / "page").exists())

    def test_is_written_to_the_current_folder_by_default(self):
        self.write("in/a.mrc", mrc())
        result = run("page", "in", folder=self.folder)
        self.assertEqual((result.returncode, result.stderr), (DONE, ""))
        page = self.folder / "qelshow-page" / "index.html"
        self.assertEqual([file["name"] for file in self.files_of(page)], ["a.mrc"])
        self.assertIn(f"Z:{page}".replace("/", "\\") + ": 1 file, 1 with a thumbnail\n", result.stdout)

    def test_of_a_single_file_says_so(self):
        result = run("page", self.write("a.mrc", mrc()), "--out", self.folder / "page")
        self.assertTrue(result.stdout.endswith(": 1 file, 1 with a thumbnail\n"), result.stdout)

    def test_that_cannot_be_written_leaves_an_earlier_one_unchanged(self):
        out, path = self.folder / "page", self.write("a.txt", b"")
        run("page", path, self.write("b.mrc", mrc()), "--out", out)
        earlier = (out / "index.html").read_bytes()
        shutil.rmtree(out / "thumbnails")
        (out / "thumbnails").write_bytes(b"a file in place of the folder")
        result = run("page", self.folder / "b.mrc", "--out", out)
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, "thumbnails", "cannot be written: Not a directory.")
        self.assertEqual((out / "index.html").read_bytes(), earlier)

    def test_is_the_same_in_two_runs(self):
        path = self.write("a.mrc", mrc(300, 300))
        for out in ("one", "two"):
            run("page", path, "--out", self.folder / out)
        for name in ("index.html", "thumbnails/1.png"):
            self.assertEqual((self.folder / "one" / name).read_bytes(), (self.folder / "two" / name).read_bytes())

    def test_shows_its_progress_on_a_terminal(self):
        for name in ("a.mrc", "b.mrc", "c.mrc"):
            self.write("in/" + name, mrc())
        terminal, errors = pty.openpty()
        with tempfile.TemporaryFile() as out:
            process = start("page", self.folder / "in", "--out", self.folder / "page", stdout=out, stderr=errors)
            os.close(errors)
            seen = "".join(iter(lambda: read_terminal(terminal), ""))
            self.assertEqual(process.wait(), DONE)
            out.seek(0)
            self.assertIn(b"3 files, 3 with a thumbnail", out.read())
        os.close(terminal)
        for part in ("[                              ] 0 of 3  a.mrc", "[==========                    ] 1 of 3  b.mrc",
                     "[====================          ] 2 of 3  c.mrc"):
            self.assertIn(part, seen)
        # The progress disappears: the line is empty at the end.
        self.assertRegex(re.sub("\x1b\\[[?]25[hl]", "", seen), "\r(\x1b\\[K| +\r)\\Z")

    def test_takes_no_more_memory_for_more_thumbnails(self):
        # Each thumbnail is a megabyte of noise, which PNG cannot compress.
        path = self.write("noise.mrc", mrc(1024, 1024, pixels=random.Random(1).randbytes(1 << 20)))
        few, many = (self.peak_memory("page", *[path] * count, "--size", "1024", "--out", self.folder / "page")
                     for count in (2, 32))
        self.assertEqual(len(list((self.folder / "page" / "thumbnails").iterdir())), 32)
        self.assertGreater((self.folder / "page" / "thumbnails" / "32.png").stat().st_size, 1000000)
        self.assertLess(many, few + (15 << 20))

    def peak_memory(self, *arguments):
        """Returns the peak memory of the program in bytes, without that of its worker process."""
        process = start(*arguments, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        _, status, usage = os.wait4(process.pid, 0)
        process.returncode = os.waitstatus_to_exitcode(status)
        self.assertEqual(process.returncode, DONE)
        return usage.ru_maxrss << 10


# The doctor's message under Wine, whose shell gives programs no thumbnails and properties.
UNANSWERED = "This system does not report what it shows for a file, which is normal under Wine."


class Doctor(Test):
    """Changes the registry of the Wine prefix, so nothing else may use the prefix at the same time."""

    EXTENSION = "{79E696A1-2FA5-4B3E-9610-D5F760417E62}"
    EBN_STORE = "{E37DEDA9-F652-401B-B619-A1A88EADD003}"
    RAW_STORE = "{E217E970-5E2E-11E1-B86C-0800200C9A66}"
    MRC_STORE = "{ADF28042-3A9F-4409-9C62-444B018A7810}"
    FOREIGN = "{0FF0FF0F-0000-4000-8000-00000000F0F0}"
    CLASSES = "HKEY_LOCAL_MACHINE\\Software\\Classes\\"
    THUMBNAIL = "ShellEx\\{BB2E617C-0920-11D1-9A0B-00C04FC2D6C1}"
    INFO_TIP = "ShellEx\\{00021500-0000-0000-C000-000000000046}"
    NEWER_THUMBNAIL = "ShellEx\\{E357FCCD-A995-4576-B01F-234630154E96}"
    PROPERTY_STORES = ("HKEY_LOCAL_MACHINE\\Software\\Microsoft\\Windows\\CurrentVersion\\PropertySystem\\"
                       "PropertyHandlers\\")

    @classmethod
    def setUpClass(cls):
        cls.register("/u")

    def setUp(self):
        super().setUp()
        self.addCleanup(self.register, "/u")

    @staticmethod
    def wine(*command):
        subprocess.run([EMULATOR, *map(str, command)], check=True, stdin=subprocess.DEVNULL,
                       stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)

    @classmethod
    def register(cls, *options, dll=SERVER):
        cls.wine("regsvr32", "/s", *options, f"Z:{dll}")

    def set_registry(self, values):
        """Sets registry values to strings and numbers. A place is KEY or KEY@NAME. None deletes the value, or the
        key if there is no name."""
        lines = ["Windows Registry Editor Version 5.00"]
        for place, text in values.items():
            key, _, name = place.partition("@")
            if text is None:
                lines += [f"[{key}]", f'"{name}"=-'] if name else [f"[-{key}]"]
            elif isinstance(text, int):
                lines += [f"[{key}]", f'"{name}"=dword:{text:08x}']
            else:
                name, text = (part.replace("\\", r"\\").replace('"', r'\"') for part in (name, text))
                lines += [f"[{key}]", (f'"{name}"' if name else "@") + f'="{text}"']
        self.wine("regedit", "/S", self.write("change.reg", "\r\n".join(lines + [""]).encode("utf-16")))

    def set_dll(self, path, *classes):
        self.set_registry({f"{self.CLASSES}CLSID\\{clsid}\\InProcServer32": f"Z:{path}".replace("/", "\\")
                           for clsid in classes})

    def doctor(self, *files):
        """Returns the finished process and the JSON document that it prints."""
        result = run("doctor", *files, "--json", server=None)
        self.assertEqual(result.stderr, "")
        document = json.loads(result.stdout)
        self.assertEqual(document["schema"], 3)
        return result, document

    def statuses(self, document):
        """Returns the statuses of the classes by name, and of the handlers by extension and role."""
        return ({each["name"]: each["status"] for each in document["classes"]}
                | {(kind["extension"], each["role"]): each["status"]
                   for kind in document["kinds"] for each in kind["handlers"]})

    def assertWorksBut(self, document, differences):
        """Checks that everything works except `differences`, which have these statuses."""
        statuses = self.statuses(document)
        self.assertEqual(len(statuses), 4 + 3 * len(EXTENSIONS) + 3)
        self.assertEqual({name: each for name, each in statuses.items() if each != "works"}, differences)

    def assertProblems(self, *problems, files=()):
        """Checks that exactly these problems are reported, each with its parts. Returns the JSON document."""
        result, document = self.doctor(*files)
        self.assertEqual(result.returncode, FAILED)
        self.assertEqual(len(document["problems"]), len(problems), document["problems"])
        for problem, parts in zip(document["problems"], problems):
            self.assertOneSentence(problem, *parts)
        return document

    def assertProblem(self, *parts, files=()):
        return self.assertProblems(parts, files=files)

    def test_finds_nothing_when_everything_works(self):
        self.register()
        result, document = self.doctor()
        self.assertEqual((result.returncode, document["problems"], document["files"]), (DONE, [], []))
        self.assertWorksBut(document, {})
        for each in document["classes"]:
            self.assertEqual((each["dll"].replace("\\", "/"), each["problem"]), (f"Z:{SERVER}", None))
            self.assertRegex(each["version"], r"^\d+\.\d+\.\d+$")
        self.assertEqual([kind["extension"] for kind in document["kinds"]], [f".{extension}" for extension in EXTENSIONS])
        result = run("doctor", server=None)
        self.assertEqual((result.returncode, result.stderr), (DONE, ""))
        self.assertRegex(result.stdout, r"(?m)^ +\.mrc( +works){4}$")
        self.assertRegex(result.stdout, r"(?m)^ +\.ser( +works){3}$")
        self.assertRegex(result.stdout, r"(?m)^ +\.raw property store +works +[\d.]+ +Z:.*QelShellExt\.dll$")
        self.assertIn("QelShellExt is registered and can be loaded.", result.stdout)

    def test_reports_of_each_file_whether_it_is_read_and_why_not(self):
        self.register()
        good = self.write("good ä.mrc", mrc(300, 200, 2))
        gone = self.folder / "gone.mrc"
        bad = {gone: "cannot be opened", self.write("a.txt", b""): ".mrc",
               self.write("mode.mrc", mrc(mode=17)): "mode is 17"}
        for files, status in (((good, gone), FAILED), ((good, *bad), NO_THUMBNAIL)):
            with self.subTest(files=files):
                result = run("doctor", *files, server=None)
                self.assertEqual((result.returncode, result.stderr), (status, ""))
                self.assertRegex(result.stdout, rf"{re.escape(str(good))}: can be read: 300 x 200 pixels, 2 frames, 8 bit.*\n"
                                                rf" +{re.escape(UNANSWERED)}\n")
                for path, part in bad.items():
                    lines = [line for line in result.stdout.splitlines() if str(path) in line]
                    self.assertEqual(len(lines), int(path in files))
                    for line in lines:
                        self.assertOneSentence(line, path, "no thumbnail", part)
        result, document = self.doctor(good)
        self.assertEqual(result.returncode, DONE)
        self.assertEqual([(each["verdict"], each["frames"], each["shell"]) for each in document["files"]],
                         [("good", 2, UNANSWERED)])

    def test_reports_that_nothing_is_registered(self):
        document = self.assertProblem("not registered on this computer", f'regsvr32 "Z:{SERVER}"'.replace("/", "\\"),
                                      "administrator")
        self.assertEqual(set(self.statuses(document).values()), {"not registered"})
        self.assertEqual({each["dll"] for each in document["classes"]}, {None})
        document = self.assertProblem("not registered", files=(self.write("a.mrc", mrc()),))
        self.assertEqual(document["files"][0]["verdict"], "failed")
        self.assertOneSentence(document["files"][0]["problem"], "not registered")
        for text in (document["files"][0]["problem"], document["files"][0]["advice"]):
            self.assertNotRegex(text, "qelshow doctor|--server")  # this advice would lead in a circle
        result = run("info", self.write("a.mrc", mrc()), server=None)
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, "not registered", "qelshow doctor", "--server")
        alone = self.write("alone/qelshow.exe", pathlib.Path(QELSHOW).read_bytes())
        result = run("doctor", server=None, program=alone)
        self.assertEqual(result.returncode, FAILED)
        self.assertIn("with the path of QelShellExt.dll", result.stdout)

    def test_advises_the_installer_only_if_the_installer_has_installed_the_extension(self):
        entry = "HKEY_LOCAL_MACHINE\\Software\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\{0FF1CE}"
        self.addCleanup(self.set_registry, {entry: None})
        self.set_registry({entry + "@DisplayName": "QelShellExt"})
        self.assertProblem("run regsvr32")
        self.set_registry({entry + "@WindowsInstaller": 0})
        self.assertProblem("run regsvr32")
        self.set_registry({entry + "@WindowsInstaller": 1})
        self.assertProblem("run msiexec /i {0FF1CE} REINSTALL=ALL")

    def test_reports_the_version_of_the_dll(self):
        dll = bytearray(pathlib.Path(SERVER).read_bytes())
        struct.pack_into("<4H", dll, dll.index(struct.pack("<I", 0xFEEF04BD)) + 8, 2, 1, 4, 3)
        self.register(dll=self.write("QelShellExt.dll", dll))
        _, document = self.doctor()
        self.assertEqual({each["version"] for each in document["classes"]}, {"1.2.3"})

    def test_reports_that_the_dll_was_moved_away(self):
        dll = self.write("it's here, ä Ω/QelShellExt.dll", pathlib.Path(SERVER).read_bytes())
        self.register(dll=dll)
        self.assertEqual(self.doctor()[0].returncode, DONE)
        dll.rename(self.folder / "moved.dll")
        document = self.assertProblem(f"Z:{dll}".replace("/", "\\"), "cannot be found", "regsvr32", SERVER.split("/")[-1])
        self.assertEqual(set(self.statuses(document).values()), {"DLL not found"})
        self.assertEqual({each["version"] for each in document["classes"]}, {None})

    def test_reports_why_the_dll_does_not_load(self):
        self.register()
        dll = bytearray(pathlib.Path(SERVER).read_bytes())
        machine = struct.unpack_from("<i", dll, 60)[0] + 4
        for clsid, name, contents in (
            (self.EBN_STORE, "text.dll", b"this is not a DLL"),
            (self.RAW_STORE, "x86.dll", dll[:machine] + b"\x4C\x01" + dll[machine + 2:]),
            (self.MRC_STORE, "plain.dll", dll.replace(b"DllGetClassObject", b"DllGetCrassObject")),
        ):
            self.set_dll(self.write(name, contents), clsid)
        document = self.assertProblems(
            ("text.dll", "damaged or not a DLL", "Reinstall QelShellExt."),
            ("x86.dll", "32-bit", "Reinstall QelShellExt."),
            ("plain.dll", "does not export DllGetClassObject", "Reinstall QelShellExt."))
        self.assertWorksBut(document, {f".{kind} property store": "DLL not loaded" for kind in ("ebn", "raw", "mrc")}
                            | {(f".{kind}", "property store"): "DLL not loaded" for kind in ("ebn", "raw", "mrc")})

    def test_reports_that_no_objects_can_be_made(self):
        self.register()
        self.set_dll(FAULTY_SERVER, self.EBN_STORE, self.MRC_STORE)
        document = self.assertProblems(("faulty_server.dll", "crashes", "access violation", "Reinstall QelShellExt."),
                                       (self.MRC_STORE, "no such class", "Reinstall QelShellExt."))
        self.assertWorksBut(document, dict.fromkeys(
            (".ebn property store", (".ebn", "property store"), ".mrc property store", (".mrc", "property store")),
            "object not created"))

    def test_reports_which_part_of_the_registration_is_missing(self):
        self.register()
        self.set_registry({self.CLASSES + ".mrc\\" + self.THUMBNAIL: None,
                           self.CLASSES + ".mrc\\ShellEx\\PropertyHandler": None,
                           self.PROPERTY_STORES + ".raw": None,
                           f"{self.CLASSES}CLSID\\{self.EBN_STORE}\\InProcServer32": None,
                           f"{self.CLASSES}CLSID\\{self.MRC_STORE}": None})
        document = self.assertProblems(
            (self.EBN_STORE, "registered, but without a DLL", "regsvr32"),
            (self.MRC_STORE, "is not registered", "regsvr32"),
            (".mrc", "(missing: thumbnail, property sets)", f'regsvr32 "Z:{SERVER}"'.replace("/", "\\")),
            (".raw", "(missing: property store)"))
        self.assertWorksBut(document, dict.fromkeys(
            (".ebn property store", (".ebn", "property store"), ".mrc property store", (".mrc", "property store"),
             (".mrc", "thumbnail"), (".mrc", "property sets"), (".raw", "property store")), "not registered"))

    def leave_out(self, kind, *classes):
        """Removes a kind from the registration, as an installation without it does."""
        self.set_registry(dict.fromkeys([f"{self.CLASSES}.{kind}\\ShellEx", self.PROPERTY_STORES + "." + kind,
                                         *(f"{self.CLASSES}CLSID\\{clsid}" for clsid in classes)]))

    def left_out(self, document):
        """Returns what is reported about the kinds that were left out, by kind."""
        return {kind["extension"]: kind["leftOut"] for kind in document["kinds"] if kind["leftOut"]}

    def test_does_not_report_a_kind_that_was_left_out_as_a_fault(self):
        self.register()
        self.leave_out("raw", self.RAW_STORE)
        self.leave_out("ser")
        result, document = self.doctor()
        self.assertEqual((result.returncode, document["problems"]), (DONE, []))
        left_out = self.left_out(document)
        self.assertEqual(list(left_out), [".ser", ".raw"])
        for kind, sentence in left_out.items():
            self.assertOneSentence(sentence, f"QelShellExt is not registered for {kind} files",
                                   f'run regsvr32 "Z:{SERVER}"'.replace("/", "\\"))
        missing = [".raw property store", (".raw", "property store")] + [
            (kind, role) for kind in left_out for role in ("thumbnail", "tip", "property sets")]
        self.assertWorksBut(document, dict.fromkeys(missing, "not registered"))

    def test_reports_a_missing_dll_even_if_a_kind_was_left_out(self):
        self.register()
        self.leave_out("ser")
        self.set_dll(self.folder / "gone.dll", self.EXTENSION)
        document = self.assertProblem("gone.dll", "cannot be found")
        self.assertEqual(list(self.left_out(document)), [".ser"])

    def test_reports_that_windows_does_not_use_it_for_files_of_a_kind_that_was_left_out(self):
        self.register()
        self.leave_out("ser")
        self.leave_out("raw", self.RAW_STORE)
        file = self.write("a.raw", raw(4, 4, 0, 8, bytes(16)))
        result = run("doctor", file, server=None)
        self.assertEqual((result.returncode, result.stderr), (FAILED, ""))
        self.assertRegex(result.stdout, r"a\.raw: can be read: 4 x 4 .*\n +QelShellExt is not registered for \.raw files, so ")
        self.assertRegex(result.stdout, r"Unregistered file kinds .*\n +QelShellExt .*\.ser files.*\n +QelShellExt .*\.raw files")
        result, document = self.doctor(self.write("a.mrc", mrc()))
        self.assertEqual((result.returncode, document["files"][0]["remark"]), (DONE, None))
        result, document = self.doctor(file)
        self.assertIn(".raw", document["files"][0]["remark"])
        self.assertEqual((result.returncode, document["files"][0]["verdict"]), (FAILED, "good"))

    def test_names_the_program_to_which_a_kind_was_left(self):
        foreign = f"{self.CLASSES}CLSID\\{self.FOREIGN}"
        thumbnail = self.CLASSES + ".raw\\" + self.THUMBNAIL
        self.addCleanup(self.set_registry, {foreign: None, thumbnail: None})
        self.register()
        self.leave_out("raw", self.RAW_STORE)
        self.set_registry({foreign: "Stack Peeker", foreign + "\\InprocServer32": "C:\\peek.dll", thumbnail: self.FOREIGN})
        result, document = self.doctor()
        self.assertEqual((result.returncode, document["problems"]), (DONE, []))
        self.assertOneSentence(self.left_out(document)[".raw"], "Stack Peeker", self.FOREIGN, "C:\\peek.dll")
        self.assertEqual(self.statuses(document)[".raw", "thumbnail"], "another program")

    def test_reports_a_kind_that_is_only_partly_left_out_as_a_fault(self):
        self.register()
        self.leave_out("raw")
        document = self.assertProblem(".raw", "(missing: thumbnail, tip, property sets, property store)")
        self.assertEqual(self.left_out(document), {})

    def test_sees_that_a_class_is_blocked(self):
        blocked = "Software\\Microsoft\\Windows\\CurrentVersion\\Shell Extensions\\Blocked"
        keys = [f"{root}\\{blocked}" for root in ("HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER")]
        self.addCleanup(self.set_registry, dict.fromkeys(keys))
        self.register()
        self.set_registry({f"{keys[0]}@{self.RAW_STORE}": "", f"{keys[1]}@{self.MRC_STORE.lower()}": "by me"})
        document = self.assertProblems((".raw property store", "blocked", self.RAW_STORE, keys[0]),
                                       (".mrc property store", "blocked", self.MRC_STORE, keys[1]))
        self.assertWorksBut(document, dict.fromkeys(
            (".raw property store", (".raw", "property store"), ".mrc property store", (".mrc", "property store")),
            "blocked"))

    def test_normalises_the_spelling_of_classes_and_paths(self):
        dll = self.write("QelShellExt.dll", pathlib.Path(SERVER).read_bytes())
        self.register(dll=dll)
        self.set_registry({self.CLASSES + ".mrc\\" + self.THUMBNAIL: self.EXTENSION.lower()})
        self.set_dll(self.folder / "below" / ".." / "QelShellExt.dll", self.EBN_STORE)
        (self.folder / "below").mkdir()
        result, document = self.doctor()
        self.assertEqual(result.returncode, DONE)
        self.assertEqual({each["dll"] for each in document["classes"]}, {f"Z:{dll}".replace("/", "\\")})
        self.assertEqual({handler["class"] for kind in document["kinds"] for handler in kind["handlers"]},
                         {self.EXTENSION, self.EBN_STORE, self.RAW_STORE, self.MRC_STORE})

    def test_explains_damaged_and_hidden_files_and_says_what_to_do(self):
        good = self.write("good.mrc", mrc())
        os.symlink("circle.mrc", self.folder / "circle.mrc")
        windows = "\\Software\\Microsoft\\Windows\\CurrentVersion\\"
        icons = "HKEY_CURRENT_USER" + windows + "Explorer\\Advanced@IconsOnly"
        policy = "HKEY_LOCAL_MACHINE" + windows + "Policies\\Explorer@DisableThumbnails"
        self.addCleanup(self.set_registry, {icons: None, policy: None})

        def explains(file, status, *parts):
            with self.subTest(parts):
                result = run("doctor", file, server=None)
                self.assertEqual((result.returncode, result.stderr), (status, ""))
                self.assertRegex(result.stdout, "(?s)" + ".*".join(map(re.escape, parts)))

        explains(good, FAILED, "is not registered on this computer", "Problems", "run regsvr32", "as administrator.")
        self.register()
        explains(self.write("cut.mrc", mrc(200, 100, 3)[:41000]), NO_THUMBNAIL, "cut short", "41000 bytes", "Copy it again")
        explains(self.write("empty.ser", b""), NO_THUMBNAIL, "The file is empty.", "Copy it again, or wait")
        explains(self.write("photo.raw", b"II*\0" + bytes(300)), NO_THUMBNAIL, "must be the text \"QEL RawImage\"",
                 "Check that the file-name extension is right.")
        explains(self.write("notes.txt", b"notes"), UNSUPPORTED, "supports only .mrc", "give it the right file-name extension")
        explains(self.write("small.raw", raw(8, 6, 3, 24, bytes(8 * 6 * 3))), NO_THUMBNAIL, "in colour and smaller",
                 "View it with smaller icons")
        explains(self.write("f" * 120 + "/" + "n" * 140 + ".mrc", mrc()), DONE, "can be read: 4 x 3 pixels, 1 frame, 8 bit",
                 "260 characters", "shorten a name")
        explains(self.folder / "circle.mrc", FAILED, "cannot be opened", "Check that you have permission")
        self.set_registry({icons: 1, policy: 0})
        explains(good, FAILED, "\"Always show icons, never thumbnails\"", "clear it in Folder Options")
        self.set_registry({icons: 0, policy: 1})
        explains(good, FAILED, "the policy \"Turn off the display of thumbnails", "ask an administrator to disable the policy")
        self.set_registry({policy: 0})
        self.leave_out("raw", self.RAW_STORE)
        explains(self.write("a.raw", raw(4, 4, 0, 8, bytes(16))), FAILED, "is not registered for .raw files",
                 "To register it, run regsvr32")

    def test_names_the_settings_of_windows_that_hide_thumbnails(self):
        windows = "\\Software\\Microsoft\\Windows\\CurrentVersion\\"
        policies = [root + windows + "Policies\\Explorer" for root in ("HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER")]
        names = ("IconsOnly", "DisableThumbnails", "DisableThumbnailsOnNetworkFolders")
        values = {"HKEY_CURRENT_USER" + windows + "Explorer\\Advanced@" + names[0]: 1, f"{policies[0]}@{names[1]}": 1,
                  f"{policies[1]}@{names[1]}": 1, f"{policies[0]}@{names[2]}": 1, f"{policies[1]}@{names[2]}": 1}
        self.addCleanup(self.set_registry, dict.fromkeys(values))
        self.register()
        self.set_registry(values)
        self.assertProblems((names[1], policies[0]), (names[1], policies[1]),
                            (names[2], "in network folders", policies[0]), (names[2], policies[1]),
                            (names[0], "Folder Options"))
        self.set_registry(dict.fromkeys(values, 0))
        self.assertEqual(self.doctor()[0].returncode, DONE)

    def test_sees_that_a_class_is_not_in_the_list_that_a_policy_requires(self):
        windows = "\\Software\\Microsoft\\Windows\\CurrentVersion\\"
        enforced = "HKEY_CURRENT_USER" + windows + "Policies\\Explorer@EnforceShellExtensionSecurity"
        approved = "HKEY_LOCAL_MACHINE" + windows + "Shell Extensions\\Approved"
        self.addCleanup(self.set_registry, {enforced: None})
        self.register()
        self.set_registry({enforced: 1})
        self.assertEqual(self.doctor()[0].returncode, DONE)  # registering adds the classes to the list
        classes = (self.EXTENSION, self.EBN_STORE, self.RAW_STORE, self.MRC_STORE)
        self.set_registry({f"{approved}@{clsid}": None for clsid in classes})
        _, document = self.doctor()
        self.assertEqual({each["status"] for each in document["classes"]}, {"not approved"})
        self.assertEqual(len(document["problems"]), 4)
        self.assertOneSentence(document["problems"][0], self.EXTENSION, "approved", "policy", "run regsvr32")
        self.set_registry({enforced: 0})
        self.assertEqual(self.doctor()[0].returncode, DONE)

    def test_sees_that_a_class_has_the_wrong_threading_model(self):
        self.register()
        self.set_registry({f"{self.CLASSES}CLSID\\{self.EXTENSION}\\InProcServer32@ThreadingModel": "Free"})
        _, document = self.doctor()
        self.assertEqual(len(document["problems"]), 1)
        self.assertOneSentence(document["problems"][0], "shell extension", '"Free"', "Apartment", "run regsvr32")
        self.assertEqual([each["status"] for each in document["classes"]], ["wrong ThreadingModel"] + ["works"] * 3)

    def test_names_the_program_that_has_taken_a_handler(self):
        foreign = f"{self.CLASSES}CLSID\\{self.FOREIGN}"
        self.addCleanup(self.set_registry, {foreign: None})
        self.register()
        self.set_registry({foreign: "Stack Peeker", foreign + "\\InprocServer32": 'C:\\peek "er".dll',
                           self.CLASSES + ".ser\\" + self.THUMBNAIL: self.FOREIGN,
                           self.PROPERTY_STORES + ".ebn": self.FOREIGN})
        parts = ("Stack Peeker", self.FOREIGN, 'C:\\peek "er".dll', "run regsvr32")
        document = self.assertProblems((".ser", "thumbnail", *parts), (".ebn", "property store", *parts))
        self.assertWorksBut(document, {(".ser", "thumbnail"): "another program",
                                       (".ebn", "property store"): "another program"})

    def test_sees_the_handlers_that_take_precedence_over_the_extension_s_own(self):
        choice = ("HKEY_CURRENT_USER\\Software\\Microsoft\\Windows\\CurrentVersion\\Explorer\\FileExts\\"
                  ".ser\\UserChoice")
        newer_key = self.CLASSES + ".mrc\\" + self.NEWER_THUMBNAIL
        types = [self.CLASSES + name for name in ("Peeker.Chosen", "Peeker.Newer", "Peeker.Plain")]
        self.addCleanup(self.set_registry, dict.fromkeys([choice, newer_key, *types])
                        | {self.CLASSES + extension: "" for extension in (".emi", ".raw")})
        self.register()
        self.set_registry({newer_key: self.FOREIGN,
                           choice + "@ProgId": "Peeker.Chosen", types[0] + "\\" + self.INFO_TIP: self.FOREIGN,
                           self.CLASSES + ".emi": "Peeker.Newer", types[1] + "\\" + self.NEWER_THUMBNAIL: self.FOREIGN,
                           self.CLASSES + ".raw": "Peeker.Plain", types[2] + "\\" + self.THUMBNAIL: self.FOREIGN})
        parts = (self.FOREIGN, "takes precedence", "delete this key")
        document = self.assertProblems(
            (".mrc", r"HKEY_CLASSES_ROOT\.mrc" + "\\" + self.NEWER_THUMBNAIL, *parts),
            (".ser", r"HKEY_CLASSES_ROOT\Peeker.Chosen" + "\\" + self.INFO_TIP, *parts),
            (".emi", r"HKEY_CLASSES_ROOT\Peeker.Newer" + "\\" + self.NEWER_THUMBNAIL, *parts),
            (".raw", r"HKEY_CLASSES_ROOT\Peeker.Plain" + "\\" + self.THUMBNAIL, *parts))
        self.assertWorksBut(document, dict.fromkeys(
            ((".mrc", "thumbnail"), (".ser", "tip"), (".emi", "thumbnail"), (".raw", "thumbnail")),
            "another program"))


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[5:])
