#!/usr/bin/python3
"""Makes the packages of a release from the programs in a build folder.

usage: make_packages.py [--without-tests] BUILD OUT

BUILD is the build folder of the preset windows, and OUT is the folder for the packages, whose paths are printed.
scripts/package runs this program; its help describes the packages and how to sign them. The same programs and the
same SOURCE_DATE_EPOCH give the same packages, byte by byte. SOURCE_DATE_EPOCH is the time, in seconds since 1970, of
everything in the packages.

It needs Debian's Python, because Debian packages the bindings of libmsi for that one only.
"""

import argparse
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

# The compiler of the programs, and one file of each library that NOTICES.txt names. gdtoa is part of libmingwex.
COMPILER = "x86_64-w64-mingw32-g++-posix"
LIBRARIES = ("libgcc.a", "libstdc++.a", "libssp.a", "libmingw32.a", "libmingwex.a", "libwinpthread.a",
             "/usr/include/nlohmann/json.hpp")

# Identifies all versions of the product to Windows Installer. Must never change.
UPGRADE_CODE = uuid.UUID("{D5320353-60A9-41CE-A794-4CBF1BCBA0D4}")

# The codes of the components that are older than the rule that derives codes from extensions. Must never change.
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

# Makes Windows run the thumbnail handler in the requesting process, where it need not be initialised with a stream.
# Only the feature of this name writes this value. It is off by default, and DllRegisterServer does not write it.
IN_PROCESS = ("inprocess", Entry(r"SOFTWARE\Classes\CLSID\{79E696A1-2FA5-4b3e-9610-D5F760417E62}",
                                 "DisableProcessIsolation", 1))

# Numbers that Windows Installer defines for its tables Component, Feature and Registry.
COMPONENT_64_BIT, COMPONENT_KEY_PATH_IS_REGISTRY = 256, 4
FEATURE_NOT_ADVERTISED, FEATURE_ALWAYS = 8, 16
ROOT_LOCAL_MACHINE = 2
SUMMARY_PROPERTIES = 20

LANGUAGE_US_ENGLISH = "1033"  # the language of the DLL's version resource


def fail(sentence):
    sys.exit(f"package: {sentence}")


def run(*command, **options):
    result = subprocess.run([*map(str, command)], stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                            stderr=subprocess.STDOUT, text=True, **options)
    if result.returncode != 0:
        fail(f"{command[0]} failed: {result.stdout.strip()}")
    return result.stdout


class Project:
    """The version and the description of the project, which are set in CMakeLists.txt only."""

    def __init__(self, build):
        cache = (build / "CMakeCache.txt").read_text()
        self.version, self.description = (
            re.search(rf"^CMAKE_PROJECT_{name}:STATIC=(.*)$", cache, re.MULTILINE)[1]
            for name in ("VERSION", "DESCRIPTION"))


def library_packages():
    """Returns the Debian packages that contain the libraries, with their versions, one per line."""
    lines = set()
    for library in LIBRARIES:
        path = os.path.realpath(run(COMPILER, f"-print-file-name={library}").strip())
        package = run("dpkg-query", "--search", path).partition(":")[0]
        version = run("dpkg-query", "--show", "--showformat=${Version}", package)
        lines.add(f"  {package} {version}")
    return "\n".join(sorted(lines))


class Signing:
    """Signs programs and packages if there is a certificate."""

    def __init__(self, environment, epoch):
        self.certificate = environment.get("QEL_SIGN_PKCS12")
        if not self.certificate:
            print("== Not signing: QEL_SIGN_PKCS12 is not set; see scripts/package --help", file=sys.stderr)
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
    """The database of an installer package, which is changed with libmsi's SQL."""

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
        file_time = (epoch + 11644473600) * 10**7  # in units of 100 ns since 1601
        summary.set_string(Libmsi.Property.UUID, braced(package_code))
        summary.set_filetime(Libmsi.Property.CREATED_TM, file_time)
        summary.set_filetime(Libmsi.Property.LASTSAVED_TM, file_time)
        summary.persist()

    def commit(self):
        self.database.commit()


def braced(code):
    return f"{{{code}}}".upper()


def add_registry(database, scripts):
    """Adds the registry entries of DllRegisterServer, each to the component of its file-name extension or else to the
    component of the DLL, and the entry of the feature inprocess to the component of that name.
    """
    replacements = {"MODULE": "[InstallFolder]QelShellExt.dll", "APPID": APP_ID}
    key_paths = {}
    for number, (feature, entry) in enumerate([*registered_entries(scripts, replacements), IN_PROCESS]):
        row, component = f"registry{number}", feature or "Server"
        # An asterisk creates the key on installation, and deletes it with everything in it on removal.
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
    """Writes the description of the package, and repeats every line that has @EXTENSION@ for each extension."""
    lines = []
    for line in template.read_text("utf-8").splitlines(keepends=True):
        lines += [line.replace("@EXTENSION@", extension).replace("@CODE@", component_code(extension))
                  for extension in EXTENSIONS] if "@EXTENSION@" in line else [line]
    path.write_text("".join(lines), "utf-8")


def make_msi(content, scripts, project, epoch, msi):
    """Makes the installer package with wixl, and then changes in its database what wixl cannot express."""
    for name in (*PROGRAMS, *TEXTS):
        os.utime(content / name, (epoch, epoch))
    product_code = uuid.uuid5(UPGRADE_CODE, f"product {project.version}")
    variables = {"Version": project.version, "Description": project.description, "ProductCode": braced(product_code),
                 "UpgradeCode": braced(UPGRADE_CODE)}
    wxs = content / "QelShellExt.wxs"
    write_wxs(HERE / wxs.name, wxs)
    # The cabinet contains local times, so the time zone must be fixed.
    run("wixl", "--arch", "x64", "--output", msi, *(f"--define={name}={value}" for name, value in variables.items()),
        wxs, cwd=content, env=os.environ | {"TZ": "UTC"})

    database = Database(msi)
    add_registry(database, scripts)
    database.execute("UPDATE `Feature` SET `Attributes` = ? WHERE `Feature` = 'QelShellExt'",
                     FEATURE_NOT_ADVERTISED | FEATURE_ALWAYS)
    # Windows Installer never replaces a file that has a version with one that has none in this table. A file with a
    # version is compared by its version and must not have a hash.
    database.execute("UPDATE `File` SET `Version` = ?, `Language` = ? WHERE `File` = 'QelShellExt.dll'",
                     f"{project.version}.0", LANGUAGE_US_ENGLISH)
    database.execute("DELETE FROM `MsiFileHash` WHERE `File_` = 'QelShellExt.dll'")
    # Removes the older version inside the transaction of the new one, so that it is restored if the installation fails.
    database.execute("UPDATE `InstallExecuteSequence` SET `Sequence` = ? WHERE `Action` = 'RemoveExistingProducts'", 1501)
    # Windows considers packages with the same code to be identical, so the code is derived from the contents.
    database.set_summary(UPGRADE_CODE, epoch)
    database.commit()
    contents = hashlib.sha256(msi.read_bytes()).hexdigest()
    database = Database(msi)
    database.set_summary(uuid.uuid5(UPGRADE_CODE, f"package {contents}"), epoch)
    database.commit()


def make_zip(path, files, epoch):
    """Writes an archive of `files`, which maps paths to bytes, in a folder with the name of the archive."""
    date = time.gmtime(epoch)[:6]
    with zipfile.ZipFile(path, "w", zipfile.ZIP_DEFLATED) as archive:
        for name, content in sorted(files.items()):
            entry = zipfile.ZipInfo(f"{path.stem}/{name}", date)
            entry.external_attr = 0o100644 << 16
            archive.writestr(entry, content, zipfile.ZIP_DEFLATED)


def make_packages(build, out, epoch, with_tests):
    project = Project(build)
    signing = Signing(os.environ, epoch)
    out.mkdir(parents=True, exist_ok=True)
    out = out.resolve()  # wixl runs in another folder
    name = f"QelShellExt-{project.version}-x64"
    msi = out / f"{name}.msi"
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
        make_msi(content, registry_scripts, project, epoch, msi)
        signing.sign(msi)
        released = {name: (content / name).read_bytes() for name in (*PROGRAMS, *TEXTS)}
        symbols = {f"{program}.debug": (build / f"{program}.debug").read_bytes() for program in PROGRAMS}
        archives = {out / f"{name}.zip": released, out / f"{name}-symbols.zip": symbols}
        if with_tests:
            # The kit tests the released programs, signed if the release is.
            archives[out / f"{name}-tests.zip"] = test_kit_files(build, registry_scripts) | {
                name: content for name, content in released.items() if name != "README.txt"}
        for path, files in archives.items():
            make_zip(path, files, epoch)
    packages = [msi, *archives]
    sums = [f"{hashlib.sha256(package.read_bytes()).hexdigest()}  {package.name}\n" for package in packages]
    (out / "SHA256SUMS").write_text("".join(sums))
    for path in (*packages, out / "SHA256SUMS"):
        print(path)


if __name__ == "__main__":
    parser = argparse.ArgumentParser(allow_abbrev=False)
    parser.add_argument("--without-tests", action="store_true")
    parser.add_argument("build", type=pathlib.Path)
    parser.add_argument("out", type=pathlib.Path)
    arguments = parser.parse_args()
    try:
        make_packages(arguments.build, arguments.out, int(os.environ["SOURCE_DATE_EPOCH"]), not arguments.without_tests)
    except OSError as error:
        fail(f"{error.filename}: {error.strerror}")
