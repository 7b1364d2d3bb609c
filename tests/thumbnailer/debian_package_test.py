#!/usr/bin/env python3
"""Checks the Debian package of qelthumb: its contents, owners, times and dependencies.

usage: debian_package_test.py BUILD
"""

import gzip
import pathlib
import re
import sys
import tempfile
import unittest

from stage import run

BUILD = pathlib.Path(sys.argv[1])
EPOCH = 1700000000


class Package(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.folder = pathlib.Path(folder.name)
        run("cpack", "--config", BUILD / "CPackConfig.cmake", "-B", cls.folder / "package", umask=0o022,
            env={"PATH": "/usr/bin:/bin", "SOURCE_DATE_EPOCH": str(EPOCH)})
        [cls.package] = (cls.folder / "package").glob("*.deb")
        cls.root = cls.folder / "root"
        run("dpkg-deb", "--extract", cls.package, cls.root)

    def field(self, name):
        return run("dpkg-deb", "--field", self.package, name).strip()

    def test_contains_these_files_owned_by_root(self):
        listed = run("dpkg-deb", "--contents", self.package, env={"PATH": "/usr/bin:/bin", "TZ": "UTC"}).splitlines()
        found = {}
        for line in listed:
            mode, owner, _, date, time, path = line.split()
            self.assertEqual((owner, date, time), ("root/root", "2023-11-14", "22:13"), line)
            if mode.startswith("d"):
                self.assertEqual(mode, "drwxr-xr-x", line)
            else:
                found[path] = mode
        self.assertEqual(found, {
            "./usr/bin/qelthumb": "-rwxr-xr-x",
            "./usr/share/doc/qelthumb/changelog.gz": "-rw-r--r--",
            "./usr/share/doc/qelthumb/copyright": "-rw-r--r--",
            "./usr/share/man/man1/qelthumb.1.gz": "-rw-r--r--",
            "./usr/share/mime/packages/qelthumb.xml": "-rw-r--r--",
            "./usr/share/thumbnailers/qelthumb.thumbnailer": "-rw-r--r--",
        })

    def test_has_the_name_and_description_that_debian_requires(self):
        version = self.field("Version")
        self.assertRegex(version, r"\A\d+\.\d+\.\d+\Z")
        architecture = run("dpkg", "--print-architecture").strip()
        self.assertEqual((self.field("Package"), self.field("Architecture"), self.field("Section")),
                         ("qelthumb", architecture, "graphics"))
        self.assertEqual(self.package.name, f"qelthumb_{version}_{architecture}.deb")
        summary, *description = self.field("Description").splitlines()
        self.assertNotRegex(summary, r"\A(A|The)\b|\.\Z")
        for line in description:
            self.assertLessEqual(len(line), 80)
        self.assertIn(".mrc", " ".join(description))

    def test_depends_on_the_libraries_of_the_program_and_on_the_package_that_reads_its_types(self):
        depends = self.field("Depends")
        for package in ("libc6", "libpng16-16", "libstdc++6", "shared-mime-info"):
            self.assertRegex(depends, rf"(^|, ){re.escape(package)}(t64)?( \(|,|$)")

    def test_contains_a_stripped_program_with_read_only_relocations(self):
        program = self.root / "usr" / "bin" / "qelthumb"
        self.assertNotIn(".symtab", run("readelf", "--wide", "--section-headers", program))
        self.assertIn("GNU_RELRO", run("readelf", "--wide", "--program-headers", program))
        self.assertRegex(run("readelf", "--wide", "--dynamic", program), r"BIND_NOW|Flags: .*NOW")
        self.assertNotIn(bytes(BUILD.resolve().parent.parent), program.read_bytes())

    def test_registers_every_type_that_it_defines(self):
        share = self.root / "usr" / "share"
        types = re.findall(r'<mime-type type="([^"]+)"', (share / "mime/packages/qelthumb.xml").read_text())
        self.assertGreater(len(types), 4)
        thumbnailer = (share / "thumbnailers/qelthumb.thumbnailer").read_text()
        self.assertEqual(re.search(r"(?m)^MimeType=(.*)$", thumbnailer)[1].strip(";").split(";"), types)

    def test_contains_documents_that_are_compressed_without_a_time(self):
        for name, beginning in (("doc/qelthumb/changelog.gz", f"qelthumb ({self.field('Version')})"),
                                ("man/man1/qelthumb.1.gz", ".TH QELTHUMB 1 ")):
            content = (self.root / "usr" / "share" / name).read_bytes()
            self.assertEqual(content[4:8], bytes(4), name)
            text = gzip.decompress(content).decode()
            self.assertTrue(text.startswith(beginning), text)
            self.assertIsNone(re.search(r"@[A-Z_]+@", text), name)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
