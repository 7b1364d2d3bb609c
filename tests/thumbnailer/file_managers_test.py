#!/usr/bin/python3
"""Has the thumbnailers of file managers make the thumbnails of all samples, as in a fresh installation.

usage: file_managers_test.py BUILD [TEST ...]
"""

import hashlib
import os
import subprocess
import sys
import tempfile
import time
import unittest

from PIL import Image, ImageChops

from stage import Stage, run

BUILD = sys.argv.pop(1) if len(sys.argv)>1 else None
SECONDS = 240  # the limit for each wait

QUEUE = """
import sys
from gi.repository import Gio, GLib

uris, types = sys.argv[1].split("\\n"), sys.argv[2].split("\\n")
thumbnailer = Gio.DBusProxy.new_for_bus_sync(
    Gio.BusType.SESSION, Gio.DBusProxyFlags.NONE, None, "org.freedesktop.thumbnails.Thumbnailer1",
    "/org/freedesktop/thumbnails/Thumbnailer1", "org.freedesktop.thumbnails.Thumbnailer1", None)
loop = GLib.MainLoop()
thumbnailer.connect("g-signal", lambda proxy, sender, signal, values: signal == "Finished" and loop.quit())
thumbnailer.call_sync("Queue", GLib.Variant("(asasssu)", (uris, types, "normal", "foreground", 0)), 0, -1, None)
loop.run()
"""

FACTORY = """
import gi, sys
gi.require_version("GnomeDesktop", "4.0")
from gi.repository import GnomeDesktop

factory = GnomeDesktop.DesktopThumbnailFactory.new(GnomeDesktop.DesktopThumbnailSize.NORMAL)
for uri, mime in zip(sys.argv[1].split("\\n"), sys.argv[2].split("\\n")):
    assert factory.can_thumbnail(uri, mime, 1), (uri, mime)
    factory.save_thumbnail(factory.generate_thumbnail(uri, mime, None), uri, 1, None)
"""


class Test(unittest.TestCase):
    def setUp(self):
        self.stage = Stage(BUILD)
        self.addCleanup(self.stage.close)
        self.files = self.stage.pictures()
        for file in set(self.stage.files()) - set(self.files):
            file.unlink()

    def types(self):
        """Returns the types of the samples. Asks a separate program, with the environment that the thumbnailers get."""
        lines = run("gio", "info", "--attributes", "standard::content-type", *self.files,
                    env=self.stage.environment()).splitlines()
        types = [line.split()[-1] for line in lines if "standard::content-type" in line]
        self.assertEqual(len(types), len(self.files))
        return types

    def ask(self, script, *session, **environment):
        """Runs a script that requests the thumbnails of all samples."""
        log = subprocess.run([*session, "/usr/bin/python3", "-c", script, "\n".join(map(self.uri, self.files)),
                              "\n".join(self.types())], env=self.stage.environment() | environment, timeout=SECONDS,
                             stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)
        self.assertEqual(log.returncode, 0, log.stdout)

    @staticmethod
    def uri(file):
        return file.as_uri()

    def cached(self, file):
        """Returns the path of a file's thumbnail in the cache that all file managers share."""
        name = hashlib.md5(self.uri(file).encode()).hexdigest()
        return self.stage.cache / "thumbnails" / "normal" / f"{name}.png"

    def assertThumbnails(self):
        """Checks that every sample's thumbnail equals the one that qelthumb makes, pixel by pixel."""
        for file in self.files:
            with self.subTest(file=file.name):
                expected = self.stage.home / "expected.png"
                run(self.stage.program, 128, file, expected)
                with Image.open(expected) as ours, Image.open(self.cached(file)) as theirs:
                    self.assertEqual(theirs.size, ours.size)
                    self.assertIsNone(ImageChops.difference(theirs.convert("RGB"), ours.convert("RGB")).getbbox())


class Tumbler(Test):
    """Makes thumbnails for Thunar and other file managers."""

    def test(self):
        self.ask(QUEUE, "dbus-run-session", "--")
        self.assertThumbnails()


class Gnome(Test):
    """The part of GNOME that makes thumbnails for Nautilus.

    It runs without its sandbox, which has only the programs in /usr and so lacks the qelthumb of this test.
    """

    def test(self):
        self.ask(FACTORY, "dbus-run-session", "--", SNAP_NAME="qelthumb")
        self.assertThumbnails()


class PcManFm(Test):
    """Makes its thumbnails itself when it shows a folder."""

    def test(self):
        with tempfile.TemporaryFile("w+") as log:
            process = subprocess.Popen(["xvfb-run", "--auto-servernum", "dbus-run-session", "--", "pcmanfm",
                                        "--no-desktop", self.stage.samples], env=self.stage.environment(),
                                       stdin=subprocess.DEVNULL, stdout=log, stderr=log, start_new_session=True)
            try:
                deadline = time.monotonic() + SECONDS
                while not all(map(self.is_complete, map(self.cached, self.files))):
                    log.seek(0)
                    self.assertLess(time.monotonic(), deadline, log.read())
                    self.assertIsNone(process.poll())
                    time.sleep(0.1)
            finally:
                os.killpg(process.pid, 15)
                process.wait()
        self.assertThumbnails()

    @staticmethod
    def is_complete(path):
        return path.exists() and path.read_bytes()[-8:-4] == b"IEND"


if __name__ == "__main__":
    unittest.main()
