#!/usr/bin/env python3
"""Tests the project's scripts: copies of them with substitutes for slow programs, and the original scripts/wine.

usage: scripts_test.py ROOT [unittest arguments]
"""

import os
import pathlib
import shutil
import subprocess
import sys
import tempfile
import unittest

ROOT = pathlib.Path(sys.argv[1]).resolve()

# The default substitutes. The program that keeps Wine's server running reads until the script ends.
SUBSTITUTES = {
    "apt-get": "",
    "cmake": "",
    "dpkg-query": "echo installed",
    "sudo": 'exec "$@"',
    "wine": '[[ $1 != cmd ]] || cat >/dev/null',
    "wineserver": "",
}


class WithSubstitutes(unittest.TestCase):
    """Runs a copy of the scripts in a separate folder, in which nothing is built."""

    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = pathlib.Path(folder.name)
        shutil.copytree(ROOT / "scripts", self.folder / "scripts")
        self.calls = self.folder / "calls"
        self.errors = self.folder / "errors"

    def run_script(self, name, *arguments, **substitutes):
        """Returns the exit status and the standard error of the script. `calls` gets the programs that it runs."""
        programs = self.folder / "programs"
        programs.mkdir()
        for program, text in (SUBSTITUTES | substitutes).items():
            path = programs / program
            path.write_text(f'#!/bin/bash\necho "{program} $*" >>"{self.calls}"\n{text}\n')
            path.chmod(0o755)
        environment = os.environ | {"PATH": f"{programs}:{os.environ['PATH']}"}
        for variable in ("QEL_WINEPREFIX", "QEL_ALONE_IN"):
            environment.pop(variable, None)
        with open(self.errors, "wb") as errors:
            status = subprocess.run([self.folder / "scripts" / name, *arguments], env=environment, stderr=errors,
                                    stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL).returncode
        return status, self.errors.read_text()


class Show(WithSubstitutes):
    def test_rejects_a_wrong_command_line_before_anything_is_built(self):
        for arguments, part in ((["--size", "5000"], "from 1 to 4096, not '5000'"), (["--size=0"], "not '0'"),
                                (["--size", "12x"], "not '12x'"), (["--size"], "value"), (["--fast"], "'--fast'"),
                                (["no such file"], "'no such file'")):
            with self.subTest(arguments):
                shutil.rmtree(self.folder / "programs", ignore_errors=True)
                status, errors = self.run_script("show", *arguments)
                self.assertEqual((status, errors.count("\n")), (1, 1), errors)
                self.assertIn(part, errors)
                self.assertFalse(self.calls.exists())
                self.assertFalse((self.folder / "build").exists())

    def page(self):
        """Writes the page of an earlier run. Returns its path."""
        path = self.folder / "build" / "show" / "index.html"
        path.parent.mkdir(parents=True)
        path.write_text("earlier")
        return path

    def test_announces_the_page(self):
        page = self.page()
        status, errors = self.run_script("show")
        self.assertEqual(status, 0, errors)
        self.assertTrue(errors.endswith(f"== The page is {page}\n"), errors)

    def test_does_not_announce_an_earlier_page_when_it_fails(self):
        self.page()
        status, errors = self.run_script("show", wine=SUBSTITUTES["wine"] + "; [[ $1 != */qelshow.exe ]] || exit 3")
        self.assertEqual(status, 3)
        self.assertNotIn("The page is", errors)

    def test_does_not_announce_an_earlier_page_after_ctrl_c(self):
        self.page()
        # Programs under Wine may end with status 0 after Ctrl-C.
        status, errors = self.run_script("show", wine=SUBSTITUTES["wine"] + "; [[ $1 != */qelshow.exe ]] || kill -INT $PPID")
        self.assertEqual(status, 130)
        self.assertIn("qelshow.exe page", self.calls.read_text())
        self.assertNotIn("The page is", errors)


class NothingToDo(WithSubstitutes):
    def test_is_reported_with_an_example(self):
        for script in ("build", "wine"):
            with self.subTest(script):
                shutil.rmtree(self.folder / "programs", ignore_errors=True)
                status, errors = self.run_script(script)
                self.assertEqual((status, errors.count("\n")), (1, 1), errors)
                self.assertIn(f"for example: scripts/{script} ", errors)
                self.assertFalse(self.calls.exists())


class LongStages(WithSubstitutes):
    """Tests the progress lines of stages. Each stage lasts until the script has written two lines."""

    def setUp(self):
        super().setUp()
        common = self.folder / "scripts" / "lib" / "common.sh"
        text = common.read_text()
        self.assertIn("seconds_between_lines=20\n", text)
        common.write_text(text.replace("seconds_between_lines=20\n", "seconds_between_lines=0.1\n"))

    def until_two_lines(self, stage):
        return f"until (($(grep -c '^   {stage}.*: [0-9]* s so far$' '{self.errors}') >= 2)); do sleep 0.05; done"

    def test_of_an_installation(self):
        status, _ = self.run_script("setup", "wine", **{
            "dpkg-query": "", "apt-get": "[[ $* != *install* ]] || " + self.until_two_lines("Installing wine")})
        self.assertEqual(status, 0)

    def test_of_a_build(self):
        status, _ = self.run_script("build", "windows", cmake=f"""
            if [[ $1 == --build ]]; then {self.until_two_lines("Building windows")}; fi""")
        self.assertEqual(status, 0)

    def test_of_a_new_wine_prefix(self):
        status, _ = self.run_script("wine", "a.exe", wine=f"""
            if [[ $* == "wineboot --init" ]]; then {self.until_two_lines("Making a Wine prefix")}; fi""")
        self.assertEqual(status, 0)

    def test_end_with_their_command(self):
        status, errors = self.run_script("build", "windows", cmake="if [[ $1 == --build ]]; then echo No; exit 1; fi")
        self.assertEqual(status, 1)
        self.assertTrue(errors.endswith("No\nbuild: cannot build the preset windows, see above\n"), errors)


class Wine(unittest.TestCase):
    def test_starts_while_another_program_runs_and_leaves_it_running(self):
        program = subprocess.Popen([ROOT / "scripts" / "wine", "cmd"], stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                                   stderr=subprocess.DEVNULL)
        self.addCleanup(program.stdout.close)
        self.addCleanup(program.kill)

        def answers(word):
            program.stdin.write(f"echo {word}\r\n".encode())
            program.stdin.flush()
            # After the prompt, which ends in ">".
            return any(line.strip().endswith(f">{word}".encode()) for line in iter(program.stdout.readline, b""))

        self.assertTrue(answers("first"))
        script = f'. "{ROOT}/scripts/lib/wine.sh"; wine_start; wine cmd /c "echo second"'
        with tempfile.TemporaryFile() as out:
            subprocess.run(["bash", "-c", script], check=True, stdin=subprocess.DEVNULL, stdout=out)
            out.seek(0)
            self.assertEqual(out.read().split(), [b"second"])
        self.assertTrue(answers("third"))
        program.stdin.close()
        self.assertEqual(program.wait(), 0)


if __name__ == "__main__":
    unittest.main(argv=[sys.argv[0], *sys.argv[2:]])
