"""The contents of the test kit: the Windows test programs, the programs that they test, and the data that they read."""

import pathlib
import subprocess
import sys
import tempfile

SOURCES = pathlib.Path(__file__).resolve().parent.parent

# Every test program contains the test library, whose licence must accompany it.
TEST_LIBRARY_NOTICE = pathlib.Path("/usr/share/doc/googletest/copyright")


def with_windows_line_ends(text):
    """Returns the bytes of a text with CR LF, for editors and interpreters that need it."""
    return text.replace("\n", "\r\n").encode()


def written_mrc_files():
    """Returns MRC files of another program and the tests' expectations of them: their bytes by name."""
    with tempfile.TemporaryDirectory() as folder:
        subprocess.run([sys.executable, SOURCES / "tests" / "formats" / "write_mrc_files.py", folder], check=True)
        return {path.name: path.read_bytes() for path in pathlib.Path(folder).iterdir()}


def test_kit_files(build, registry_scripts):
    """Returns the bytes of each file by its path in the kit, without the programs of the release."""
    programs = [build / name for name in (build / "tests" / "kit_programs.txt").read_text().split()]
    data = [SOURCES / "docs" / "formats.md", *registry_scripts.glob("*.rgs")]
    files = {"run-tests.cmd": with_windows_line_ends((SOURCES / "tests" / "kit" / "run-tests.cmd").read_text("utf-8")),
             "tests/NOTICES.txt": with_windows_line_ends(TEST_LIBRARY_NOTICE.read_text("utf-8"))}
    files |= {f"tests/{program.name}": program.read_bytes() for program in programs}
    files |= {f"tests/data/{path.name}": path.read_bytes() for path in data}
    files |= {f"tests/data/{name}": content for name, content in written_mrc_files().items()}
    return files
