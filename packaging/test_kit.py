"""What the test kit holds: the Windows test programs, what they test, and the data that they read."""

import pathlib
import subprocess
import sys
import tempfile

SOURCES = pathlib.Path(__file__).resolve().parent.parent

# The licence of the test library that is in every test program asks to come along with them.
TEST_LIBRARY_NOTICE = pathlib.Path("/usr/share/doc/googletest/copyright")


def with_windows_line_ends(text):
    """The bytes of a text, for editors and interpreters that know no other line ends."""
    return text.replace("\n", "\r\n").encode()


def written_mrc_files():
    """Files by another writer of the format, and what the tests expect of them, by their names."""
    with tempfile.TemporaryDirectory() as folder:
        subprocess.run([sys.executable, SOURCES / "tests" / "formats" / "write_mrc_files.py", folder], check=True)
        return {path.name: path.read_bytes() for path in pathlib.Path(folder).iterdir()}


def test_kit_files(build, registry_scripts):
    """The bytes of each file by its path in the kit, without the release's own programs."""
    programs = [build / name for name in (build / "tests" / "kit_programs.txt").read_text().split()]
    data = [SOURCES / "docs" / "formats.md", *registry_scripts.glob("*.rgs")]
    files = {"run-tests.cmd": with_windows_line_ends((SOURCES / "tests" / "kit" / "run-tests.cmd").read_text("utf-8")),
             "tests/NOTICES.txt": with_windows_line_ends(TEST_LIBRARY_NOTICE.read_text("utf-8"))}
    files |= {f"tests/{program.name}": program.read_bytes() for program in programs}
    files |= {f"tests/data/{path.name}": path.read_bytes() for path in data}
    files |= {f"tests/data/{name}": content for name, content in written_mrc_files().items()}
    return files
