#!/usr/bin/env python3
"""Runs the test kit as its users do, under Wine in a prefix of its own, and tests its runner.

usage: kit_test.py SOURCES BUILD FAULTY_TEST [TEST_CLASS ...]

BUILD is the folder of the preset windows. The environment names the prefix (with_own_prefix).
"""

import os
import pathlib
import re
import shutil
import subprocess
import sys
import tempfile
import unittest
import zipfile

SOURCES, BUILD, FAULTY_TEST = map(pathlib.Path, sys.argv[1:4])

CMD = r"C:\windows\system32\cmd.exe"  # the full path: otherwise Wine starts another program to find it


class Test(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.addCleanup(subprocess.run, ["wineserver", "-k"], stderr=subprocess.DEVNULL)
        self.folder = pathlib.Path(folder.name) / "a folder"
        self.folder.mkdir()

    def run_kit(self, kit, **environment):
        """Returns the exit status of run-tests.cmd, the lines that it prints, and the lines of its log."""
        out = self.folder / "out"
        with out.open("wb") as file:  # Wine's desktop process would keep a pipe open
            status = subprocess.run(["wine", CMD, "/c", "run-tests.cmd"], cwd=kit, stdin=subprocess.DEVNULL,
                                    stdout=file, stderr=subprocess.DEVNULL,  # Wine's own messages
                                    env=os.environ | environment).returncode
        log = kit / "test-log.txt"
        return status, out.read_text().splitlines(), log.read_text("utf-8", "replace").splitlines()


class Runner(Test):
    def setUp(self):
        super().setUp()
        self.kit = self.folder / "kit"
        self.data = self.kit / "tests" / "data"
        self.data.mkdir(parents=True)
        shutil.copyfile(SOURCES / "tests" / "kit" / "run-tests.cmd", self.kit / "run-tests.cmd")
        self.add(BUILD / "tests" / "kit" / "run_tests.exe")

    def add(self, program):
        shutil.copyfile(program, self.kit / "tests" / program.name)

    def test_counts_every_test_even_of_a_program_that_ends_early(self):
        self.add(BUILD / "tests" / "com_test.exe")
        self.add(FAULTY_TEST)
        (self.kit / "tests" / "other_test.exe").write_text("no program")
        status, out, log = self.run_kit(self.kit)
        self.assertEqual(status, 1)
        passed = int(re.fullmatch(r"com_test: (\d+) passed, 0 failed, 0 skipped", out[1])[1])
        self.assertEqual(out[2:-1], ["  Exited with status 7.", "faulty_test: 1 passed, 2 failed, 1 skipped",
                                     "  Skipped: for a reason", "  Could not be started: error 193.",
                                     "other_test: 0 passed, 1 failed, 0 skipped"])
        self.assertEqual(out[-1], f"{passed + 1} passed, 3 failed, 1 skipped")
        self.assertEqual([line for line in out if line not in log], [])
        self.assertIn("[ RUN      ] Faulty.EndsTheProgram", log)

    def test_succeeds_only_when_tests_have_passed(self):
        status, out, _ = self.run_kit(self.kit)
        self.assertEqual((status, out[1:]), (1, ["0 passed, 0 failed, 0 skipped"]))
        self.add(BUILD / "tests" / "com_test.exe")
        status, out, _ = self.run_kit(self.kit)
        self.assertEqual(status, 0, out)


class Kit(Test):
    def test_passes(self):
        out = self.folder / "packages"
        subprocess.run([SOURCES / "packaging" / "make_packages.py", BUILD, out], check=True,
                       stdin=subprocess.DEVNULL, capture_output=True,
                       env=os.environ | {"SOURCE_DATE_EPOCH": "1700000000"})
        [archive] = out.glob("*-tests.zip")
        with zipfile.ZipFile(archive) as files:
            files.extractall(self.folder)
        kit = self.folder / archive.stem
        # Two tests take almost as long as all the others and need no file of the kit. ctest runs them separately.
        long = "InterruptedRegistration.IsRepaired"
        status, printed, log = self.run_kit(kit, GTEST_FILTER=f"-{long}*")
        self.assertEqual([line for line in log if line.startswith(f"[ RUN      ] {long}")], [])
        programs = sorted(path.stem for path in (kit / "tests").glob("*_test.exe"))
        self.assertGreater(len(programs), 15)
        self.assertEqual([line.split(":")[0] for line in printed[1:-1] if not line.startswith("  ")], programs)
        for line in printed:
            print(line)
        self.assertEqual(status, 0, "\n".join(log))
        self.assertRegex(printed[-1], r"^\d{3,} passed, 0 failed, \d+ skipped$")


if __name__ == "__main__":
    unittest.main(argv=[sys.argv[0], *sys.argv[4:]], verbosity=2)
