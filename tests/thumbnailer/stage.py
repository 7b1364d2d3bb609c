"""qelthumb, installed in a temporary folder as its package installs it, with samples of every kind."""

import os
import pathlib
import subprocess
import tempfile

SYSTEM_TYPES = pathlib.Path("/usr/share/mime/packages/freedesktop.org.xml")


def run(*command, **options):
    """Runs a program that must succeed. Returns its standard output."""
    result = subprocess.run([*map(str, command)], stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                            stderr=subprocess.PIPE, text=True, **options)
    if result.returncode != 0:
        raise AssertionError(f"{command[0]} exited with {result.returncode}: {result.stdout}{result.stderr}")
    return result.stdout


def make_types(folder, *definitions):
    """Makes a database of the MIME types that these files define. Returns its folder, for XDG_DATA_DIRS."""
    packages = folder / "mime" / "packages"
    packages.mkdir(parents=True, exist_ok=True)
    for definition in definitions:
        (packages / definition.name).write_bytes(definition.read_bytes())
    run("update-mime-database", folder / "mime", env=os.environ | {"PKGSYSTEM_ENABLE_FSYNC": "0"})
    return folder


def types_of(files, types):
    """Returns the types that GLib finds for files, with the database in the folder `types`."""
    environment = os.environ | {"XDG_DATA_DIRS": str(types), "XDG_DATA_HOME": "/nonexistent", "LC_ALL": "C.UTF-8"}
    attribute = "standard::content-type"
    lines = run("gio", "info", "--attributes", attribute, *files, env=environment).splitlines()
    return [line.split()[-1] for line in lines if line.strip().startswith(attribute)]


class Stage:
    """An installation in a temporary folder, which close() deletes."""

    def __init__(self, build):
        self.folder = tempfile.TemporaryDirectory()
        root = pathlib.Path(self.folder.name)
        run("cmake", "--install", build, "--prefix", root / "usr")
        self.program = root / "usr" / "bin" / "qelthumb"
        self.share = root / "usr" / "share"
        make_types(self.share, self.share / "mime" / "packages" / "qelthumb.xml", SYSTEM_TYPES)
        self.samples = root / "samples"
        run(pathlib.Path(build) / "qelsamples", self.samples)

        self.home = root / "home"
        self.cache = self.home / ".cache"
        self.runtime = root / "runtime"
        self.runtime.mkdir(mode=0o700)
        self.cache.mkdir(parents=True)

    def close(self):
        self.folder.cleanup()

    def files(self):
        return sorted(self.samples.iterdir())

    def pictures(self):
        """Returns the samples that have a thumbnail."""
        return [file for file in self.files() if not file.name.startswith(("damaged", "truncated"))]

    def thumbnail(self, size, file, output):
        """Runs qelthumb. Returns its exit status and its message."""
        result = subprocess.run([self.program, str(size), file, output], stdin=subprocess.DEVNULL,
                                capture_output=True, env=os.environ | {"LC_ALL": "C.UTF-8"})
        return result.returncode, os.fsdecode(result.stderr)

    def environment(self):
        """Returns the environment of a desktop session that sees only this installation and the system's own."""
        return {
            "PATH": f"{self.program.parent}:/usr/bin:/bin",
            "HOME": str(self.home),
            "XDG_CACHE_HOME": str(self.cache),
            "XDG_CONFIG_HOME": str(self.home / ".config"),
            "XDG_DATA_HOME": str(self.home / ".local" / "share"),
            "XDG_DATA_DIRS": f"{self.share}:/usr/share",
            "XDG_RUNTIME_DIR": str(self.runtime),
            "LC_ALL": "C.UTF-8",
        }
