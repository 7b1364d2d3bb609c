#!/usr/bin/python3
"""Makes the packages of a release from the programs in a build folder.

usage: make_packages.py BUILD OUT

BUILD is the folder of the preset windows, OUT that of the packages, whose paths are printed. scripts/package, which
runs this, tells what the packages are and how they are signed. The same programs give the same packages, byte by byte,
when SOURCE_DATE_EPOCH is the same: the time, in seconds since 1970, that everything in them carries.

Debian's Python, as libmsi is one of its packages.
"""

import hashlib
import os
import pathlib
import re
import shutil
import subprocess
import sys
import tempfile
import time
import uuid
import zipfile

import gi

gi.require_version("Libmsi", "1.0")
from gi.repository import Libmsi  # noqa: E402

from registry_entries import Entry, registered_entries  # noqa: E402
from test_kit import test_kit_files, with_windows_line_ends  # noqa: E402

HERE = pathlib.Path(__file__).resolve().parent

sys.path.append(str(HERE.parent / "formats"))
from file_kinds import EXTENSIONS, EXTENSIONS_IN_WORDS  # noqa: E402

PROGRAMS = ("QelShellExt.dll", "qelshow.exe")
TEXTS = ("README.txt", "NOTICES.txt")

# The compiler of the programs, and a file of each library that NOTICES.txt names; gdtoa is in libmingwex.
COMPILER = "x86_64-w64-mingw32-g++-posix"
LIBRARIES = ("libgcc.a", "libstdc++.a", "libssp.a", "libmingw32.a", "libmingwex.a", "libwinpthread.a",
             "/usr/include/nlohmann/json.hpp")

# What makes a product of Windows Installer another version of this one. Never to be changed.
UPGRADE_CODE = uuid.UUID("{D5320353-60A9-41CE-A794-4CBF1BCBA0D4}")

# The codes of the components that were made before codes were derived from extensions. Never to be changed.
COMPONENT_CODES = {
    "mrc": "{391B1E31-23C5-483B-BA33-E4239E5B6DF0}",
    "ali": "{9BADCDF1-0601-41C7-987D-74C1A271EB24}",
    "rec": "{3AA43BE5-06C6-4158-BAD1-828B5EC88B4E}",
    "ser": "{740C5EF6-9115-48B3-B949-B76EC1CEB2BC}",
    "emi": "{0A445D8E-A1B9-4180-9268-7463A27B6D76}",
    "ebn": "{56C4E05E-F9D1-4270-AE88-330510AB3CD4}",
    "raw": "{6B2969AC-EE3C-4CC3-AF34-B35B3AD9DDCB}",
}

APP_ID = "{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}"

# Has Windows run the thumbnail handler in the process that asks, where it need not be initialised with a stream. Only
# the feature of this name, which is off by default, writes it; DllRegisterServer does not.
IN_PROCESS = ("inprocess", Entry(r"SOFTWARE\Classes\CLSID\{79E696A1-2FA5-4b3e-9610-D5F760417E62}",
                                 "DisableProcessIsolation", 1))

# Windows Installer's numbers, from its tables Component, Feature and Registry.
COMPONENT_64_BIT, COMPONENT_KEY_PATH_IS_REGISTRY = 256, 4
FEATURE_NOT_ADVERTISED, FEATURE_ALWAYS = 8, 16
ROOT_LOCAL_MACHINE = 2
SUMMARY_PROPERTIES = 20

LANGUAGE_US_ENGLISH = "1033"  # that of the DLL's version


def fail(sentence):
    sys.exit(f"package: {sentence}")


def run(*command, **options):
    result = subprocess.run([*map(str, command)], stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                            stderr=subprocess.STDOUT, text=True, **options)
    if result.returncode != 0:
        fail(f"{command[0]} failed: {result.stdout.strip()}")
    return result.stdout


class Project:
    """What CMake knows of the project, so that there is one place for it."""

    def __init__(self, build):
        cache = (build / "CMakeCache.txt").read_text()
        self.version, self.description = (
            re.search(rf"^CMAKE_PROJECT_{name}:STATIC=(.*)$", cache, re.MULTILINE)[1]
            for name in ("VERSION", "DESCRIPTION"))


def library_packages():
    """The Debian packages that contain the libraries, with their versions, one a line."""
    lines = set()
    for library in LIBRARIES:
        path = os.path.realpath(run(COMPILER, f"-print-file-name={library}").strip())
        package = run("dpkg-query", "--search", path).partition(":")[0]
        version = run("dpkg-query", "--show", "--showformat=${Version}", package)
        lines.add(f"  {package} {version}")
    return "\n".join(sorted(lines))


class Signing:
    """Puts signatures on programs and packages, if there is a certificate."""

    def __init__(self, environment, epoch):
        self.certificate = environment.get("QEL_SIGN_PKCS12")
        if not self.certificate:
            print("== Not signing: QEL_SIGN_PKCS12 names no certificate", file=sys.stderr)
            return
        self.options = ["-pkcs12", self.certificate, "-h", "sha256", "-n", "QelShellExt"]
        if "QEL_SIGN_PASSWORD_FILE" in environment:
            self.options += ["-readpass", environment["QEL_SIGN_PASSWORD_FILE"]]
        if "QEL_SIGN_TIMESTAMP_URL" in environment:
            self.options += ["-ts", environment["QEL_SIGN_TIMESTAMP_URL"]]
        else:
            self.options += ["-st", str(epoch)]

    def sign(self, path):
        if not self.certificate:
            return
        signed = path.with_name(path.name + ".signed")
        run("osslsigncode", "sign", *self.options, "-in", path, "-out", signed)
        signed.replace(path)


class Database:
    """An installer package, changed by its own kind of SQL."""

    def __init__(self, path):
        self.database = Libmsi.Database.new(str(path), Libmsi.DbFlags.TRANSACT, None)

    def execute(self, sql, *values):
        query = Libmsi.Query.new(self.database, sql)
        record = Libmsi.Record.new(len(values)) if values else None
        for i, value in enumerate(values, 1):
            if isinstance(value, int):
                record.set_int(i, value)
            elif value is not None:
                record.set_string(i, value)
        query.execute(record)
        query.close()

    def set_summary(self, package_code, epoch):
        summary = Libmsi.SummaryInfo.new(self.database, SUMMARY_PROPERTIES)
        file_time = (epoch + 11644473600) * 10**7  # since 1601, in units of 100 ns
        summary.set_string(Libmsi.Property.UUID, braced(package_code))
        summary.set_filetime(Libmsi.Property.CREATED_TM, file_time)
        summary.set_filetime(Libmsi.Property.LASTSAVED_TM, file_time)
        summary.persist()

    def commit(self):
        self.database.commit()


def braced(code):
    return f"{{{code}}}".upper()


def add_registry(database, scripts):
    """What DllRegisterServer writes, each entry in the component of its extension or in that of the DLL, and the entry
    of the feature inprocess in its own.
    """
    replacements = {"MODULE": "[InstallFolder]QelShellExt.dll", "APPID": APP_ID}
    key_paths = {}
    for number, (feature, entry) in enumerate([*registered_entries(scripts, replacements), IN_PROCESS]):
        row, component = f"registry{number}", feature or "Server"
        # An asterisk makes the key, and removes it with everything in it.
        name, data = ("*", None) if entry.owned else (entry.name or None, entry.data)
        data = f"#{data}" if isinstance(data, int) else data
        database.execute("INSERT INTO `Registry` (`Registry`, `Root`, `Key`, `Name`, `Value`, `Component_`) "
                         "VALUES (?, ?, ?, ?, ?, ?)", row, ROOT_LOCAL_MACHINE, entry.key, name, data, component)
        if not entry.owned and feature:
            key_paths.setdefault(feature, row)
    for action, sequence in (("RemoveRegistryValues", 2600), ("WriteRegistryValues", 5000)):
        database.execute("INSERT INTO `InstallExecuteSequence` (`Action`, `Sequence`) VALUES (?, ?)", action, sequence)
    for feature, row in key_paths.items():
        database.execute("UPDATE `Component` SET `KeyPath` = ?, `Attributes` = ? WHERE `Component` = ?",
                         row, COMPONENT_64_BIT | COMPONENT_KEY_PATH_IS_REGISTRY, feature)
        database.execute("UPDATE `Feature` SET `Attributes` = ? WHERE `Feature` = ?",
                         FEATURE_NOT_ADVERTISED, feature)


def component_code(extension):
    return COMPONENT_CODES.get(extension) or braced(uuid.uuid5(UPGRADE_CODE, f"component {extension}"))


def write_wxs(template, path):
    """Writes what is to be installed, with every line of an extension once for each."""
    lines = []
    for line in template.read_text("utf-8").splitlines(keepends=True):
        lines += [line.replace("@EXTENSION@", extension).replace("@CODE@", component_code(extension))
                  for extension in EXTENSIONS] if "@EXTENSION@" in line else [line]
    path.write_text("".join(lines), "utf-8")


def make_msi(content, scripts, project, epoch, msi):
    """wixl does the most, and what it cannot do follows."""
    for name in (*PROGRAMS, *TEXTS):
        os.utime(content / name, (epoch, epoch))
    product_code = uuid.uuid5(UPGRADE_CODE, f"product {project.version}")
    variables = {"Version": project.version, "Description": project.description, "ProductCode": braced(product_code),
                 "UpgradeCode": braced(UPGRADE_CODE)}
    wxs = content / "QelShellExt.wxs"
    write_wxs(HERE / wxs.name, wxs)
    # The cabinet inside has local times.
    run("wixl", "--arch", "x64", "--output", msi, *(f"--define={name}={value}" for name, value in variables.items()),
        wxs, cwd=content, env=os.environ | {"TZ": "UTC"})

    database = Database(msi)
    add_registry(database, scripts)
    database.execute("UPDATE `Feature` SET `Attributes` = ? WHERE `Feature` = 'QelShellExt'",
                     FEATURE_NOT_ADVERTISED | FEATURE_ALWAYS)
    # A file without a version in this table never replaces one that has a version in itself. One with a version is
    # compared by it, not by its hash.
    database.execute("UPDATE `File` SET `Version` = ?, `Language` = ? WHERE `File` = 'QelShellExt.dll'",
                     f"{project.version}.0", LANGUAGE_US_ENGLISH)
    database.execute("DELETE FROM `MsiFileHash` WHERE `File_` = 'QelShellExt.dll'")
    # An older version goes within the transaction of the new one, so that it comes back if that fails.
    database.execute("UPDATE `InstallExecuteSequence` SET `Sequence` = ? WHERE `Action` = 'RemoveExistingProducts'", 1501)
    # Windows takes packages of the same code to be the same, so the code follows from the contents.
    database.set_summary(UPGRADE_CODE, epoch)
    database.commit()
    contents = hashlib.sha256(msi.read_bytes()).hexdigest()
    database = Database(msi)
    database.set_summary(uuid.uuid5(UPGRADE_CODE, f"package {contents}"), epoch)
    database.commit()


def make_zip(path, files, epoch):
    """The files, bytes by path, in a folder that has the name of the archive."""
    date = time.gmtime(epoch)[:6]
    with zipfile.ZipFile(path, "w", zipfile.ZIP_DEFLATED) as archive:
        for name, content in sorted(files.items()):
            entry = zipfile.ZipInfo(f"{path.stem}/{name}", date)
            entry.external_attr = 0o100644 << 16
            archive.writestr(entry, content, zipfile.ZIP_DEFLATED, 9)


def make_packages(build, out, epoch):
    project = Project(build)
    signing = Signing(os.environ, epoch)
    out.mkdir(parents=True, exist_ok=True)
    out = out.resolve()  # wixl runs in another folder
    name = f"QelShellExt-{project.version}-x64"
    packages = [out / f"{name}{ending}" for ending in (".msi", ".zip", "-symbols.zip", "-tests.zip")]
    registry_scripts = build / "registration" / "scripts"
    with tempfile.TemporaryDirectory() as folder:
        content = pathlib.Path(folder)
        for program in PROGRAMS:
            shutil.copyfile(build / program, content / program)
            signing.sign(content / program)
        packages_used = library_packages()
        for text in TEXTS:
            contents = (HERE / text).read_text().replace("@PACKAGES@", packages_used)
            contents = contents.replace("@EXTENSIONS@", EXTENSIONS_IN_WORDS)
            (content / text).write_bytes(with_windows_line_ends(contents))
        make_msi(content, registry_scripts, project, epoch, packages[0])
        signing.sign(packages[0])
        released = {name: (content / name).read_bytes() for name in (*PROGRAMS, *TEXTS)}
        symbols = {f"{program}.debug": (build / f"{program}.debug").read_bytes() for program in PROGRAMS}
        tests = test_kit_files(build, registry_scripts)
        # The tests test the released programs, signed if they are.
        tests |= {name: content for name, content in released.items() if name != "README.txt"}
        for path, files in zip(packages[1:], (released, symbols, tests)):
            make_zip(path, files, epoch)
    sums = [f"{hashlib.sha256(package.read_bytes()).hexdigest()}  {package.name}\n" for package in packages]
    (out / "SHA256SUMS").write_text("".join(sums))
    for path in (*packages, out / "SHA256SUMS"):
        print(path)


if __name__ == "__main__":
    if len(sys.argv) != 3:
        sys.exit("usage: make_packages.py BUILD OUT")
    try:
        make_packages(pathlib.Path(sys.argv[1]), pathlib.Path(sys.argv[2]), int(os.environ["SOURCE_DATE_EPOCH"]))
    except OSError as error:
        fail(f"{error.filename}: {error.strerror}")
