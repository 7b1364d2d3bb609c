#!/usr/bin/env python3
"""Runs qelshow as its users do and looks at what it prints, writes and answers.

usage: qelshow_test.py EMULATOR QELSHOW SERVER FAULTY_SERVER [TEST_CLASS ...]
"""

import json
import os
import pathlib
import re
import struct
import subprocess
import sys
import tempfile
import unittest

EMULATOR, QELSHOW, SERVER, FAULTY_SERVER = sys.argv[1:5]

COMMANDS = ("info", "thumbnail", "page")
DONE, FAILED, USAGE, UNSUPPORTED, DAMAGED = range(5)


def run(*arguments, server=SERVER, folder=None):
    """Runs qelshow; the answer has its exit status, and its output as text."""
    command = [EMULATOR, QELSHOW, *map(str, arguments)]
    if server:
        command += ["--server", server]
    return subprocess.run(command, capture_output=True, encoding="utf-8", errors="strict", cwd=folder,
                          stdin=subprocess.DEVNULL, env=os.environ | {"LC_ALL": "C.UTF-8"})


def mrc(width=4, height=3, frames=1, mode=0, label=b"", pixels=None):
    """The bytes of an .mrc file whose pixels count upwards."""
    pixel_bytes = {0: 1, 1: 2, 2: 4, 16: 3}.get(mode, 1)
    header = bytearray(1024)
    struct.pack_into("<4i", header, 0, width, height, frames, mode)
    struct.pack_into("<i", header, 220, 1 if label else 0)
    header[224:224 + len(label)] = label
    if pixels is None:
        pixels = bytes(i % 251 for i in range(width * height * frames * pixel_bytes))
    return bytes(header) + pixels


def raw(width, height, value_class, bits, pixels):
    """The bytes of a .raw file with packed rows."""
    step = bits // 8
    return (b"QEL RawImage\0" + struct.pack("<9i", 1, width, height, 1, bits, value_class, 0, step, width * step)
            + pixels)


def png_facts(png):
    """Width, height, bits of a sample and colour type of a PNG file."""
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
        """A failure is told in one line, which names what it is about."""
        self.assertEqual(len(text.strip().splitlines()), 1, text)
        for part in parts:
            self.assertIn(str(part), text)

    def info(self, *paths, server=SERVER):
        """The files of the JSON that info prints."""
        result = run("info", *paths, "--json", server=server)
        document = json.loads(result.stdout)
        self.assertEqual(document["schema"], 1)
        return document["files"]


class CommandLine(Test):
    def test_help_is_for_the_program_and_for_each_command(self):
        texts = [run("--help", server=None)] + [run(command, "--help", server=None) for command in COMMANDS]
        for result in texts:
            self.assertEqual((result.returncode, result.stderr), (DONE, ""))
            self.assertIn("--server PATH", result.stdout)
            self.assertIn("exit status", result.stdout)
            self.assertLessEqual(max(map(len, result.stdout.splitlines())), 80)
        for command in COMMANDS:
            self.assertIn(f"  {command} ", texts[0].stdout)
        self.assertEqual(len({result.stdout for result in texts}), 4)

    def test_what_cannot_be_understood_is_a_usage_error_of_one_sentence(self):
        for arguments, *parts in (
            ((), "No command"),
            (("show",), '"show"', "qelshow --help"),
            (("info",), "No file", "qelshow info --help"),
            (("info", "a.mrc", "--pretty"), '"--pretty"'),
            (("info", "a.mrc", "--out", "x"), '"--out"'),
            (("info", "a.mrc", "--server"), '"--server"', "value"),
            (("info", "a.mrc", "--size", "0"), '"0"', "1 to 4096"),
            (("info", "a.mrc", "--size=4097"), '"4097"'),
            (("info", "a.mrc", "--size", "12x"), '"12x"'),
            (("thumbnail", "a.mrc"), "--out"),
            (("thumbnail", "a.mrc", "b.mrc", "-o", "-"), "one file", "2"),
            (("page", "a.mrc"), "--out"),
            (("page", "a.mrc", "--json", "--out", "x"), '"--json"'),
        ):
            with self.subTest(arguments=arguments):
                result = run(*arguments, server=None)
                self.assertEqual((result.returncode, result.stdout), (USAGE, ""))
                self.assertOneSentence(result.stderr, *parts)

    def test_a_server_that_cannot_be_loaded_is_named(self):
        missing = self.folder / "no such.dll"
        other = self.write("text.dll", b"this is no DLL")
        for server in (missing, other):
            result = run("info", self.write("a.mrc", mrc()), server=str(server))
            self.assertEqual((result.returncode, result.stdout), (FAILED, ""))
            self.assertOneSentence(result.stderr, server)


class ExitStatus(Test):
    def test_tells_how_the_worst_file_is(self):
        good = self.write("good.mrc", mrc())
        missing = self.folder / "missing.mrc"
        text = self.write("notes.txt", b"notes")
        damaged = self.write("damaged.mrc", mrc(mode=17))
        for paths, status in (
            ((good,), DONE),
            ((good, missing, good), FAILED),
            ((missing, text), UNSUPPORTED),
            ((damaged, text, good), DAMAGED),
        ):
            with self.subTest(paths=paths):
                self.assertEqual(run("info", *paths).returncode, status)
        for path, status in ((missing, FAILED), (text, UNSUPPORTED)):
            with self.subTest(path=path):
                self.assertEqual(run("thumbnail", path, "-o", self.folder / "out.png").returncode, status)

    def test_a_failure_is_one_sentence_that_names_the_file_and_what_is_wrong(self):
        files = []
        ser = struct.pack("<3H5I", 0x4949, 0x0197, 0x0210, 0x4122, 0x4152, 1, 1, 30) + struct.pack("<I", 0)
        element = bytes(40) + struct.pack("<hII", 11, 1, 1) + b"\0"
        for name, contents, *parts in (
            ("nx.mrc", mrc(width=0), "nx is 0", "at least 1"),
            ("ny.ali", mrc(height=-5, pixels=b""), "ny is -5"),
            ("nz.rec", mrc(frames=0), "nz is 0"),
            ("mode.mrc", mrc(mode=17), "mode is 17", "0 to 16"),
            ("short.mrc", mrc()[:1000], "1000 bytes"),
            ("empty.mrc", b"", "0 bytes"),
            ("cut.mrc", mrc(200, 100, 3)[:41000], "41024", "41000 bytes"),
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
            ("text.emi", b"\x4A\x4B\0\x02\0\0\0\0\x60\0\0\x01\0\0\0\0", "bad EMI object index"),
        ):
            files.append((self.write(name, contents), parts))
        result = run("info", *(path for path, _ in files))
        self.assertEqual(result.returncode, DAMAGED)
        told = result.stderr.splitlines()
        self.assertEqual(len(told), len(files))
        for line, (path, parts) in zip(told, files):
            with self.subTest(path.name):
                self.assertOneSentence(line, path, *parts)

    def test_a_thumbnail_that_is_not_there_is_not_written(self):
        path = self.write("mode.mrc", mrc(mode=17))
        result = run("thumbnail", path, "-o", self.folder / "out.png")
        self.assertEqual((result.returncode, result.stdout), (DAMAGED, ""))
        self.assertOneSentence(result.stderr, path, "mode is 17")
        self.assertFalse((self.folder / "out.png").exists())

    def test_a_folder_is_no_file(self):
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
        piped = subprocess.run([EMULATOR, QELSHOW, "thumbnail", path, "--out", "-", "--size=128", "--server", SERVER],
                               capture_output=True, stdin=subprocess.DEVNULL)
        self.assertEqual((piped.returncode, piped.stdout), (DONE, out.read_bytes()))

    def test_of_a_colour_picture_is_in_colour(self):
        out = self.folder / "out.png"
        self.assertEqual(run("thumbnail", self.write("c.mrc", mrc(300, 260, mode=16)), "-o", out).returncode, DONE)
        self.assertEqual(png_facts(out.read_bytes()), (300, 260, 8, 2))

    def test_that_cannot_be_written_is_a_failure_that_names_the_place(self):
        out = self.folder / "no such folder" / "out.png"
        result = run("thumbnail", self.write("a.mrc", mrc()), "-o", out)
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, "out.png", "cannot be written")


class Faults(Test):
    def test_of_the_extension_end_one_question_and_not_the_run(self):
        # Smaller than the request, a colour picture divides by zero.
        small = self.write("small.raw", raw(8, 6, 3, 24, bytes(8 * 6 * 3)))
        good = self.write("good.mrc", mrc())
        files = self.info(small, good)
        self.assertIn("0xC0000094", files[0]["remark"])
        self.assertIn("division by zero", files[0]["remark"])
        self.assertEqual((files[0]["verdict"], files[0]["thumbnail"]["request"]), ("good", 8))
        self.assertEqual((files[0]["thumbnail"]["width"], files[0]["thumbnail"]["height"]), (8, 6))
        self.assertEqual((files[1]["verdict"], files[1]["remark"]), ("good", None))

    def test_in_any_question_are_reported_for_their_file(self):
        names = ("fault in load.mrc", "fault in tip.mrc", "quiet.mrc")
        load, tip, quiet = self.info(*(self.write(name, mrc()) for name in names), server=FAULTY_SERVER)
        self.assertIn("0xC0000005 (access violation)", load["tip"]["problem"])
        self.assertIn("0xC0000005 (access violation)", load["thumbnail"]["problem"])
        self.assertEqual(load["problem"], load["thumbnail"]["problem"])
        self.assertIn("0xC00000FD (stack overflow)", tip["tip"]["problem"])
        self.assertIn("0x80004005", tip["thumbnail"]["problem"])
        self.assertIn("0x80004001, not implemented", quiet["tip"]["problem"])
        self.assertIn("no such interface", quiet["columns"]["problem"])
        self.assertIn("no such class", quiet["propertyStore"]["problem"])
        self.assertEqual([file["verdict"] for file in (load, tip, quiet)], ["damaged"] * 3)

    def test_exceptions_are_caught_with_their_text(self):
        error, number = self.info(self.write("error thrown.mrc", mrc()), self.write("number thrown.mrc", mrc()),
                                  server=FAULTY_SERVER)
        self.assertIn('"no such luck"', error["thumbnail"]["problem"])
        self.assertIn("unknown type", number["thumbnail"]["problem"])

    def test_a_file_that_makes_a_reader_throw_is_damaged(self):
        path = self.write("text.emi", b"\x4A\x4B\0\x02\0\0\0\0\x60\0\0\x01\0\0\0\0")
        result = run("info", path, "--json")
        file, = json.loads(result.stdout)["files"]
        self.assertEqual((result.returncode, file["verdict"]), (DAMAGED, "damaged"))
        self.assertIn("bad EMI object index", file["problem"])
        self.assertIn('throws "bad EMI object index"', file["thumbnail"]["problem"])


class Json(Test):
    def test_is_valid_whatever_the_names_and_texts_are(self):
        name = "a & b's (ü é 樹 🔬) #100%.mrc"
        label = b"</script><script>alert(1)</script> \" \\ \x01 \xe9"
        file, = self.info(self.write(name, mrc(label=label)))
        self.assertEqual((file["name"], file["verdict"]), (name, "good"))
        self.assertTrue(file["path"].endswith(name))

    def test_says_of_an_unsupported_file_what_is_supported(self):
        file, = self.info(self.write("notes.txt", b"notes"))
        self.assertEqual((file["verdict"], file["kind"], file["width"]), ("unsupported", "txt", 0))
        self.assertIn(".mrc", file["problem"])

    def test_has_the_file_s_size_and_kind(self):
        file, = self.info(self.write("UPPER.MRC", mrc()))
        self.assertEqual((file["bytes"], file["kind"]), (1024 + 12, "mrc"))


class Answers(Test):
    """What the shell learns, from the extension to the report."""

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
        self.assertEqual(self.rows(file["columns"], "title", "set", "id", "declared", "delivered", "value"), [
            ("Width", self.IMAGE_SUMMARY, 3, "VT_I4", "VT_I4", "40"),
            ("Height", self.IMAGE_SUMMARY, 4, "VT_I4", "VT_I4", "30"),
            ("Bit Depth", self.IMAGE_SUMMARY, 7, "VT_UI4", "VT_I4", "16"),
            ("Frame Count", self.IMAGE_SUMMARY, 12, "VT_UI4", "VT_I4", "7"),
            ("Dimensions", self.IMAGE_SUMMARY, 13, "VT_LPWSTR", "VT_BSTR", "40 x 30"),
            ("Comments", self.SUMMARY, 6, "VT_LPWSTR", "VT_BSTR", "Line one"),
        ])
        self.assertEqual(self.rows(file["columns"], "index", "characters", "state"),
                         [(0, 5, 0x101), (1, 5, 0x101), (2, 5, 1), (3, 5, 1), (4, 20, 0x11), (5, 30, 0x11)])
        self.assertEqual(self.rows(file["propertySets"], "set", "id", "type", "value"), [
            (self.IMAGE_SUMMARY, 3, "VT_INT", "40"),
            (self.IMAGE_SUMMARY, 4, "VT_INT", "30"),
            (self.IMAGE_SUMMARY, 7, "VT_INT", "16"),
            (self.IMAGE_SUMMARY, 12, "VT_INT", "7"),
            (self.IMAGE_SUMMARY, 13, "VT_BSTR", "40 x 30"),
            (self.SUMMARY, 6, "VT_BSTR", "Line one"),
        ])
        self.assertEqual(self.rows(file["propertyStore"], "name", "set", "id", "type", "value"), [
            ("System.Image.HorizontalSize", self.IMAGE_SUMMARY, 3, "VT_UI4", "40"),
            ("System.Image.VerticalSize", self.IMAGE_SUMMARY, 4, "VT_UI4", "30"),
            ("System.Image.BitDepth", self.IMAGE_SUMMARY, 7, "VT_UI4", "16"),
            ("System.Media.FrameCount", self.IMAGE_SUMMARY, 12, "VT_UI4", "7"),
            ("System.Image.Dimensions", self.IMAGE_SUMMARY, 13, "VT_LPWSTR", "(40 x 30) 16 bit signed"),
            ("System.Comment", self.SUMMARY, 6, "VT_LPWSTR", ""),
        ])

        text = run("info", path).stdout
        for part in ("40 x 30", "Frames      7", "16 bit signed", "Thumbnail   40 x 30, 8 bits per pixel",
                     "    Line one\n", "VT_UI4     VT_I4      16", "System.Media.FrameCount"):
            self.assertIn(part, text)

    def test_a_kind_without_a_property_store_says_so(self):
        files = self.info(*(self.write("a." + kind, b"") for kind in ("ali", "rec", "ser", "emi")))
        for file in files:
            self.assertEqual(file["propertyStore"]["items"], [])
            self.assertIn(f"no property store for .{file['kind']} files", file["propertyStore"]["problem"])

    def test_of_a_damaged_file_say_why_they_are_missing(self):
        file, = self.info(self.write("a.mrc", mrc(mode=17)))
        self.assertIn("0x80004005", file["tip"]["problem"])
        self.assertIn("0x80004005", file["propertySets"]["problem"])
        self.assertEqual({column["problem"] for column in file["columns"]["items"]}, {"0x00000001, no value"})
        self.assertEqual({value["problem"] for value in file["propertyStore"]["items"]}, {"0x80004005, failed"})


class Page(Test):
    def files_of(self, page):
        """The facts in a page."""
        text = page.read_text("utf-8")
        data = re.search(r'<script id="files" type="application/json">(.*?)</script>', text, re.DOTALL)
        document = json.loads(data[1])
        self.assertEqual(document["schema"], 1)
        return document["files"]

    def test_has_every_file_of_a_folder_with_its_picture(self):
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
            picture = file["thumbnail"]["picture"]
            if file["name"] == "broken.ser":
                self.assertIsNone(picture)
                self.assertIn("0 bytes", file["problem"])
            else:
                width, height, _, _ = png_facts((out / picture).read_bytes())
                self.assertEqual((width, height), (file["thumbnail"]["width"], file["thumbnail"]["height"]))
        self.assertEqual(len({file["thumbnail"]["picture"] for file in files}), 5)
        self.assertEqual(sorted(path.name for path in out.iterdir()), ["index.html", "pictures"])

        lines = result.stdout.splitlines()
        self.assertEqual(len(lines), 1 + len(names) + 2)
        self.assertIn("4 thumbnails of 5 files", lines[-1])
        self.assertRegex(result.stdout, r"(?m)^big.MRC .* 4 x 3$")
        self.assertRegex(result.stdout, r"(?m)^broken.ser .* none: .*0 bytes")

    def test_shows_files_that_are_named_even_if_they_cannot_be_shown(self):
        out = self.folder / "page"
        result = run("page", self.write("b.mrc", mrc()), self.folder / "gone.mrc", self.write("a.txt", b""),
                     "--out", out)
        self.assertEqual(result.returncode, DONE)
        self.assertEqual([(file["name"], file["verdict"]) for file in self.files_of(out / "index.html")],
                         [("b.mrc", "good"), ("gone.mrc", "failed"), ("a.txt", "unsupported")])

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

    def test_that_cannot_be_written_leaves_an_earlier_one_as_it_is(self):
        out = self.folder / "page"
        self.write("page/index.html", b"earlier")
        (out / "pictures").write_bytes(b"a file where the folder has to be")
        result = run("page", self.write("a.mrc", mrc()), "--out", out)
        self.assertEqual(result.returncode, FAILED)
        self.assertOneSentence(result.stderr, "pictures", "cannot be written")
        self.assertEqual((out / "index.html").read_bytes(), b"earlier")

    def test_is_the_same_in_two_runs(self):
        path = self.write("a.mrc", mrc(300, 300))
        for out in ("one", "two"):
            run("page", path, "--out", self.folder / out)
        for name in ("index.html", "pictures/1.png"):
            self.assertEqual((self.folder / "one" / name).read_bytes(), (self.folder / "two" / name).read_bytes())


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[5:])
