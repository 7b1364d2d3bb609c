#!/usr/bin/env python3
"""Makes the packages and uses them as an administrator does, in a separate Wine prefix.

usage: package_test.py SOURCES BUILD EXTENSION_USER [TEST_CLASS ...]

BUILD is the folder of the preset windows. The environment names the prefix (with_own_prefix).
"""

import contextlib
import hashlib
import os
import pathlib
import re
import shutil
import struct
import subprocess
import sys
import tempfile
import unittest
import zipfile

import gi

gi.require_version("Libmsi", "1.0")
from gi.repository import Libmsi  # noqa: E402

SOURCES, BUILD, EXTENSION_USER = map(pathlib.Path, sys.argv[1:4])

sys.path.append(str(SOURCES / "packaging"))
from make_packages import component_code  # noqa: E402

FILES = ("NOTICES.txt", "QelShellExt.dll", "README.txt", "qelshow.exe")
PROGRAMS = ("QelShellExt.dll", "qelshow.exe")
EPOCH = "1700000000"

# The full paths: otherwise Wine starts another program to find them.
SYSTEM, REGEDIT = "C:\\windows\\system32\\", r"C:\windows\regedit.exe"

# The exit statuses of msiexec. Linux sees only the low 8 bits.
DONE, FAILED, RESTART_NEEDED = 0, 1603 & 0xFF, 3010 & 0xFF


def make_packages(out, build=BUILD, epoch=EPOCH, **options):
    environment = os.environ | {"SOURCE_DATE_EPOCH": epoch} | options.pop("environment", {})
    return subprocess.run([SOURCES / "packaging" / "make_packages.py", build, out], check=True, text=True,
                          stdin=subprocess.DEVNULL, capture_output=True, env=environment, **options)


def package(out, ending=".msi"):
    """Returns the path of the only package of this kind in a folder."""
    [path] = out.glob("*-x64" + ending)
    return path


def copy_build(folder):
    """Copies the files that packages are made of, and nothing else."""
    folder.mkdir()
    tests = pathlib.Path("tests", "kit_programs.txt")
    for name in ("CMakeCache.txt", *PROGRAMS, *(f"{program}.debug" for program in PROGRAMS), tests,
                 *(BUILD / tests).read_text().split()):
        (folder / name).parent.mkdir(parents=True, exist_ok=True)
        shutil.copyfile(BUILD / name, folder / name)
    shutil.copytree(BUILD / "registration" / "scripts", folder / "registration" / "scripts",
                    ignore=lambda _, names: [name for name in names if not name.endswith(".rgs")])
    return folder


def next_version(build):
    """Raises the version of a build by one patch level, also in the DLL's version resource."""
    cache = build / "CMakeCache.txt"
    text = cache.read_text()
    version = re.search(r"^CMAKE_PROJECT_VERSION:STATIC=(.*)$", text, re.MULTILINE)[1]
    major, minor, patch = map(int, version.split("."))
    cache.write_text(text.replace(f"VERSION:STATIC={version}", f"VERSION:STATIC={major}.{minor}.{patch + 1}"))
    dll = bytearray((build / "QelShellExt.dll").read_bytes())
    fixed_info = dll.index(struct.pack("<I", 0xFEEF04BD))
    struct.pack_into("<2I", dll, fixed_info + 8, major << 16 | minor, (patch + 1) << 16)
    (build / "QelShellExt.dll").write_bytes(dll)
    return build


def digest(path):
    return hashlib.sha256(path.read_bytes()).hexdigest()


class Test(unittest.TestCase):
    maxDiff = None

    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = pathlib.Path(folder.name)


class Contents(Test):
    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.out = pathlib.Path(folder.name)
        cls.reported = make_packages(cls.out).stderr

    def test_are_identical_whoever_makes_them_wherever_and_whenever(self):
        first, second = self.out, self.folder / "second"
        make_packages(second.relative_to("/"), copy_build(self.folder / "another folder"), umask=0o077, cwd="/",
                      environment={"TZ": "Asia/Tokyo", "LC_ALL": "C"})
        self.assertEqual(sorted(path.name for path in first.iterdir()),
                         sorted(path.name for path in second.iterdir()))
        for path in first.iterdir():
            self.assertEqual(digest(path), digest(second / path.name), path.name)

    def test_contain_the_built_programs_and_their_checksums(self):
        sums = dict(reversed(line.split()) for line in (self.out / "SHA256SUMS").read_text().splitlines())
        self.assertEqual(sums, {path.name: digest(path) for path in self.out.iterdir() if path.name != "SHA256SUMS"})
        self.assertEqual(len(sums), 4)
        archive = package(self.out, ".zip")
        with zipfile.ZipFile(archive) as files:
            self.assertEqual(files.namelist(), [f"{archive.stem}/{name}" for name in FILES])
            for program in PROGRAMS:
                self.assertEqual(files.read(f"{archive.stem}/{program}"), (BUILD / program).read_bytes())

    def test_contain_tests_of_the_same_programs_without_paths_of_this_machine(self):
        archive = package(self.out, "-tests.zip")
        with zipfile.ZipFile(archive) as files:
            self.assertGreater(len(files.namelist()), 60)
            for program in PROGRAMS:
                self.assertEqual(files.read(f"{archive.stem}/{program}"), (BUILD / program).read_bytes())
            for name in files.namelist():
                with self.subTest(name=name):
                    self.assertNotIn(bytes(SOURCES), files.read(name))

    def test_name_the_versions_of_the_libraries_in_the_programs(self):
        archive = package(self.out, ".zip")
        with zipfile.ZipFile(archive) as files:
            notices = files.read(f"{archive.stem}/NOTICES.txt").decode()
        compiler = re.search(r"^  g\+\+-mingw-w64-x86-64-posix (\d+)\.", notices, re.MULTILINE)[1]
        for program in PROGRAMS:
            self.assertIn(f"GCC: (GNU) {compiler}-posix".encode(), (BUILD / program).read_bytes())
        runtime = re.search(r"^  mingw-w64-x86-64-dev (\d+)\.", notices, re.MULTILINE)[1]
        headers = subprocess.run(["x86_64-w64-mingw32-g++-posix", "-E", "-P", "-x", "c++", "-"], check=True, text=True,
                                 input="#include <_mingw_mac.h>\n__MINGW64_VERSION_MAJOR", capture_output=True).stdout
        self.assertEqual(runtime, headers.split()[-1])

    def test_that_cannot_be_made_are_reported_in_one_sentence(self):
        file = self.folder / "file"
        file.touch()
        for build, out, name in ((BUILD, file, file), (BUILD, file / "below", file), (file, self.folder / "out", file)):
            with self.subTest(build=build, out=out), self.assertRaises(subprocess.CalledProcessError) as caught:
                make_packages(out, build)
            reported = caught.exception.stderr.replace(self.reported, "")
            self.assertRegex(reported, rf"\Apackage: {re.escape(str(name))}.*: .+\n\Z")

    def test_contain_resources_that_are_rebuilt_when_anything_in_them_changes(self):
        def ninja(*arguments):
            return subprocess.run(["ninja", "-C", BUILD, "-t", *arguments], check=True, capture_output=True,
                                  text=True).stdout
        targets = re.findall(r"(?m)^((?:registration|server|tools)/.+\.rc\.obj): ", ninja("targets", "all"))
        self.assertEqual(len(targets), 4)
        for target in targets:
            inputs = ninja("query", target)
            script = re.search(r"(?m)^    (/.+\.rc)$", inputs)[1]
            inputs += ninja("deps", target)
            for name in re.findall(r'(?m)^(?:#include|.*(?:RCDATA|REGISTRY)) "(.+)"$', pathlib.Path(script).read_text()):
                with self.subTest(target=target, name=name):
                    self.assertRegex(inputs, rf"(?m)(^ *|/){re.escape(name)}$")

    def test_symbols_give_the_line_of_an_address_in_the_released_dll(self):
        symbols = package(self.out, "-symbols.zip")
        with zipfile.ZipFile(symbols) as files:
            files.extractall(self.folder)
        debug = self.folder / symbols.stem / "QelShellExt.dll.debug"
        names = subprocess.run(["x86_64-w64-mingw32-nm", debug], check=True, capture_output=True, text=True).stdout
        address = re.search(r"^([0-9a-f]+) T DllRegisterServer$", names, re.MULTILINE)[1]
        dll = self.folder / "QelShellExt.dll"
        shutil.copyfile(BUILD / dll.name, dll)
        shutil.move(debug, self.folder)  # the folder in which addr2line looks for it
        line = subprocess.run(["x86_64-w64-mingw32-addr2line", "-e", dll, address], check=True, capture_output=True,
                              text=True).stdout
        self.assertRegex(line, r"/server/\w+\.(cpp|h):\d+$")
        self.assertNotIn(str(SOURCES), line)

    def test_are_signed_when_there_is_a_certificate(self):
        self.assertIn("Not signing", self.reported)
        key, certificate, both, password = (self.folder / name for name in ("key", "certificate", "both", "password"))
        password.write_text("open sesame")
        for command in (
            ("req", "-x509", "-newkey", "rsa:2048", "-nodes", "-keyout", key, "-out", certificate, "-days", "2",
             "-subj", "/CN=Nobody", "-addext", "extendedKeyUsage=codeSigning"),
            ("pkcs12", "-export", "-inkey", key, "-in", certificate, "-out", both, "-passout", f"file:{password}"),
        ):
            subprocess.run(["openssl", *command], check=True, capture_output=True)
        out = self.folder / "signed"
        # A time at which the certificate is valid.
        result = make_packages(out, epoch=str(int(certificate.stat().st_mtime) + 60),
                               environment={"QEL_SIGN_PKCS12": str(both), "QEL_SIGN_PASSWORD_FILE": str(password)})
        self.assertEqual(result.stderr, "")
        with zipfile.ZipFile(package(out, ".zip")) as files:
            for name in PROGRAMS:
                (self.folder / name).write_bytes(files.read(f"{package(out, '.zip').stem}/{name}"))
        for path in (package(out), *(self.folder / name for name in PROGRAMS)):
            subprocess.run(["osslsigncode", "verify", "-CAfile", certificate, "-in", path], check=True,
                           capture_output=True)
        with self.assertRaises(subprocess.CalledProcessError):
            subprocess.run(["osslsigncode", "verify", "-CAfile", certificate, "-in", package(self.out)],
                           check=True, capture_output=True)


# Windows Installer recognises components by these codes in all versions. A new component adds its own code.
COMPONENT_CODES = {
    "Server": "{F8215D5A-6F96-4564-BD55-BB9B40A76325}",
    "Qelshow": "{AB40842A-41B6-4C7F-892D-800CB74FE713}",
    "Readme": "{C65546FD-ADAA-4A15-A93E-765ED872F442}",
    "Notices": "{2C5542BD-A7B8-4F23-8320-7C62D90C7C64}",
    "mrc": "{391B1E31-23C5-483B-BA33-E4239E5B6DF0}",
    "ali": "{9BADCDF1-0601-41C7-987D-74C1A271EB24}",
    "rec": "{3AA43BE5-06C6-4158-BAD1-828B5EC88B4E}",
    "ser": "{740C5EF6-9115-48B3-B949-B76EC1CEB2BC}",
    "emi": "{0A445D8E-A1B9-4180-9268-7463A27B6D76}",
    "ebn": "{56C4E05E-F9D1-4270-AE88-330510AB3CD4}",
    "raw": "{6B2969AC-EE3C-4CC3-AF34-B35B3AD9DDCB}",
    "inprocess": "{2CBB922D-6861-4AC6-A65E-AE0EAB4F0327}",
}
UPGRADE_CODE = "{D5320353-60A9-41CE-A794-4CBF1BCBA0D4}"


class Database:
    """The tables of an installer package."""

    def __init__(self, msi):
        self.database = Libmsi.Database.new(str(msi), Libmsi.DbFlags.READONLY, None)
        self.properties = dict(self.rows("Property"))
        summary = Libmsi.SummaryInfo.new(self.database, 0)
        self.package_code = summary.get_string(Libmsi.Property.UUID)
        self.times = {summary.get_filetime(time) for time in (Libmsi.Property.CREATED_TM, Libmsi.Property.LASTSAVED_TM)}

    def rows(self, table):
        """Returns each row as a tuple of strings, in the order of the table's columns."""
        query = Libmsi.Query.new(self.database, f"SELECT * FROM `{table}`")
        query.execute(None)
        return [tuple(record.get_string(i + 1) for i in range(record.get_field_count()))
                for record in iter(query.fetch, None)]


class InstallerPackage(Test):
    """Checks the tables of the package, because Wine ignores much of their contents."""

    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.folder = pathlib.Path(folder.name)
        make_packages(cls.folder / "out")
        cls.database = Database(package(cls.folder / "out"))

    def test_keeps_its_codes(self):
        codes = {row[0]: row[1] for row in self.database.rows("Component")}
        self.assertEqual(codes | COMPONENT_CODES, codes)
        self.assertEqual(len(set(codes.values())), len(codes))
        self.assertEqual(component_code("abc"), "{F678095A-EDEF-5557-B64D-F8448E982C9C}")  # a file-name extension that could be added later
        self.assertEqual(self.database.properties["UpgradeCode"], UPGRADE_CODE)
        self.assertEqual({row[0] for row in self.database.rows("Upgrade")}, {UPGRADE_CODE})

    def test_has_a_product_code_for_each_version_and_a_package_code_for_each_content(self):
        build = copy_build(self.folder / "build")
        (build / "qelshow.exe").write_bytes((build / "qelshow.exe").read_bytes() + b"changed")
        make_packages(self.folder / "changed", build)
        changed = Database(package(self.folder / "changed"))
        make_packages(self.folder / "next", next_version(build))
        following = Database(package(self.folder / "next"))
        self.assertEqual(changed.properties["ProductCode"], self.database.properties["ProductCode"])
        self.assertNotEqual(changed.properties["ProductCode"], following.properties["ProductCode"])
        self.assertEqual(len({database.package_code for database in (self.database, changed, following)}), 3)

    def test_never_closes_explorer_restarts_windows_or_offers_a_dialog(self):
        expected = {"ALLUSERS": "1", "ARPNOMODIFY": "1", "MSIRESTARTMANAGERCONTROL": "DisableShutdown",
                    "REBOOT": "ReallySuppress"}
        self.assertEqual({name: self.database.properties.get(name) for name in expected}, expected)

    def test_installs_64_bit_components_that_a_registry_value_of_their_kind_identifies(self):
        is_64_bit, key_path_is_registry = 256, 4
        keys = {row[0]: row for row in self.database.rows("Registry")}
        for name, _, folder, attributes, _, key_path in self.database.rows("Component"):
            with self.subTest(component=name):
                self.assertEqual(folder, "InstallFolder")
                if name in ("Server", "Qelshow", "Readme", "Notices"):
                    self.assertEqual(int(attributes), is_64_bit)
                else:
                    self.assertEqual(int(attributes), is_64_bit | key_path_is_registry)
                    self.assertEqual(keys[key_path][-1], name)
                    self.assertNotIn(keys[key_path][3], ("*", "+"))

    def test_has_features_that_are_never_advertised_and_one_that_is_off(self):
        not_advertised, always = 8, 16
        features = {row[0]: (int(row[5]), int(row[7])) for row in self.database.rows("Feature")}
        self.assertEqual(features.pop("QelShellExt"), (1, not_advertised | always))
        self.assertEqual(features.pop("inprocess"), (2, not_advertised))
        self.assertEqual(set(features.values()), {(1, not_advertised)})
        self.assertGreaterEqual(set(features), {"mrc", "ali", "rec", "ser", "emi", "ebn", "raw"})

    def test_replaces_the_dll_by_its_version_and_an_older_product_within_the_transaction(self):
        version = self.database.properties["ProductVersion"]
        files = {row[0]: (row[4], row[5]) for row in self.database.rows("File")}
        self.assertEqual(files["QelShellExt.dll"], (f"{version}.0", "1033"))
        self.assertEqual({row[0] for row in self.database.rows("MsiFileHash")}, set(FILES) - {"QelShellExt.dll"})
        actions = {row[0]: int(row[2]) for row in self.database.rows("InstallExecuteSequence")}
        order = ("InstallInitialize", "RemoveExistingProducts", "ProcessComponents", "RemoveRegistryValues",
                 "RemoveFiles", "InstallFiles", "WriteRegistryValues", "RegisterProduct", "InstallFinalize")
        self.assertEqual(sorted(order, key=actions.get), list(order))

    def test_has_the_given_time(self):
        self.assertEqual(self.database.times, {(int(EPOCH) + 11644473600) * 10**7})


class Prefix:
    """A Wine prefix that stands for a machine, and whose state can be saved and restored."""

    def __init__(self):
        self.path = pathlib.Path(os.environ["WINEPREFIX"])
        self.drive = self.path / "drive_c"
        self.installed = self.drive / "Program Files" / "QelShellExt"
        self.shut_down()
        if not (self.path / "new").exists():
            self.save("new")

    def save(self, state):
        """Saves the machine's registry. The machine must be shut down."""
        (self.path / state).mkdir(exist_ok=True)
        for hive in self.path.glob("*.reg"):
            shutil.copyfile(hive, self.path / state / hive.name)

    def renew(self, state):
        self.shut_down()
        for hive in (self.path / state).iterdir():
            shutil.copyfile(hive, self.path / hive.name)
        shutil.rmtree(self.installed, ignore_errors=True)
        shutil.rmtree(self.drive / "windows" / "Installer", ignore_errors=True)
        self.start()

    def start(self):
        for command in (("wineserver", "-p"), ("wine", "wineboot")):
            # Wine's services would inherit a pipe and keep its reader waiting.
            subprocess.run(command, check=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                           stderr=subprocess.DEVNULL)
        # On a busy machine the first program sometimes fails to start.
        for _ in range(5):
            if self.run(SYSTEM + "cmd.exe", "/c", "exit 0").returncode == 0:
                break

    def shut_down(self):
        for option in ("-k", "-w"):
            subprocess.run(["wineserver", option], stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)

    def restart(self):
        self.shut_down()
        self.start()

    @staticmethod
    def run(*arguments):
        # Files, because Wine's desktop process would keep a pipe open for a second after the program has ended.
        with tempfile.TemporaryFile() as out, tempfile.TemporaryFile() as errors:
            result = subprocess.run(["wine", *map(str, arguments)], stdin=subprocess.DEVNULL, stdout=out,
                                    stderr=errors)
            for file in (out, errors):
                file.seek(0)
            result.stdout, result.stderr = out.read(), errors.read()
        return result

    def msiexec(self, *arguments):
        return self.run(SYSTEM + "msiexec.exe", "/qn", *arguments)

    def qelshow(self, *arguments):
        return self.run(self.installed / "qelshow.exe", *arguments)

    def registry(self):
        """Returns the lines of HKEY_LOCAL_MACHINE\\Software, each with its key."""
        with tempfile.TemporaryDirectory() as folder:
            out = pathlib.Path(folder) / "out.reg"
            self.run(REGEDIT, "/E", out, r"HKEY_LOCAL_MACHINE\Software").check_returncode()
            text = out.read_text("utf-16")
        lines, key = set(), ""
        for line in text.replace("\\\n  ", "").splitlines()[1:]:
            if line.startswith("["):
                key = line[len(r"[HKEY_LOCAL_MACHINE\Software"):-1]
                lines.add(key)
            elif line:
                lines.add(f"{key} : {line}")
        return lines

    @contextlib.contextmanager
    def program_that_uses_the_extension(self):
        """Yields a function that ends the program and returns its exit status."""
        process = subprocess.Popen(["wine", EXTENSION_USER], stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                                   stderr=subprocess.DEVNULL)
        try:
            assert process.stdout.readline().strip() == b"using"
            yield lambda: (process.communicate(b"\n"), process.returncode)[1]
        finally:
            process.kill()
            process.communicate()


# The keys in which Windows Installer records what it has installed. Some of them remain, empty.
BOOKKEEPING = (r"\Classes\Installer", r"\Microsoft\Windows\CurrentVersion\Installer")
UNINSTALL = r"\Microsoft\Windows\CurrentVersion\Uninstall"

# Entries of other programs in the same keys: Windows Installer deletes keys that have become empty.
OTHERS = r"""REGEDIT4

[HKEY_LOCAL_MACHINE\Software\Classes\.raw]
"Content Type"="image/x-other"

[HKEY_LOCAL_MACHINE\Software\Classes\.mrc\ShellEx\{8895B1C6-B41F-4C1C-A562-0D564250836F}]
@="another handler"

[HKEY_LOCAL_MACHINE\Software\Classes\Wow6432Node\CLSID\{0B5A2D0C-7F0E-4C57-9E61-0A5B0F3D5A11}]
@="another class"

[HKEY_LOCAL_MACHINE\Software\Microsoft\Windows\CurrentVersion\Shell Extensions\Approved]
"another"="program"
"""


def without(lines, *keys):
    keys = tuple(key.lower() for key in keys)
    return {line for line in lines if not line.lower().startswith(keys)}


class Installation(Test):
    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.out, cls.next_out = (pathlib.Path(folder.name) / name for name in ("out", "next out"))
        make_packages(cls.out)
        cls.next_build = next_version(copy_build(pathlib.Path(folder.name) / "next build"))
        make_packages(cls.next_out, cls.next_build)
        cls.msi, cls.next_msi = package(cls.out), package(cls.next_out)
        cls.prefix = Prefix()
        cls.addClassCleanup(cls.prefix.shut_down)
        cls.prefix.renew("new")
        others = pathlib.Path(folder.name) / "others.reg"
        others.write_text(OTHERS)
        cls.prefix.run(REGEDIT, "/S", others).check_returncode()
        cls.before = cls.prefix.registry()
        cls.prefix.shut_down()
        cls.prefix.save("shared")

    def setUp(self):
        super().setUp()
        self.prefix.renew("shared")
        self.image = self.folder / "image.mrc"
        self.image.write_bytes(struct.pack("<4i", 16, 12, 1, 0).ljust(1024, b"\0") + bytes(range(16 * 12)))

    def install(self, msi, *properties, status=DONE):
        result = self.prefix.msiexec("/i", msi, *properties)
        self.assertEqual(result.returncode, status, result)

    def remove(self, msi):
        result = self.prefix.msiexec("/x", msi)
        self.assertEqual(result.returncode, DONE, result)

    def ours(self):
        """Returns what has been added to the registry, without Windows Installer's own records."""
        after = self.prefix.registry()
        self.assertEqual(self.before - after, set())
        return without(after - self.before, *BOOKKEEPING, UNINSTALL)

    def assertWorks(self):
        doctor = self.prefix.qelshow("doctor", self.image)
        self.assertEqual(doctor.returncode, 0, doctor.stdout.decode())
        thumbnail = self.prefix.qelshow("thumbnail", self.image, "-o", "-")
        self.assertEqual((thumbnail.returncode, thumbnail.stdout[:8]), (0, b"\x89PNG\r\n\x1a\n"))
        built = self.prefix.qelshow("thumbnail", self.image, "-o", "-", "--server", BUILD / "QelShellExt.dll")
        self.assertEqual(thumbnail.stdout, built.stdout)

    def assertRemoved(self):
        after = without(self.prefix.registry(), *BOOKKEEPING)
        self.assertEqual(after ^ without(self.before, *BOOKKEEPING), set())
        self.assertFalse(self.prefix.installed.exists())

    def test_writes_what_registering_writes_and_removes_it_again(self):
        self.install(self.msi)
        installed = self.ours()
        self.assertEqual(sorted(path.name for path in self.prefix.installed.iterdir()), sorted(FILES))
        self.assertWorks()
        self.remove(self.msi)
        self.assertRemoved()

        self.prefix.installed.mkdir()
        shutil.copyfile(BUILD / "QelShellExt.dll", self.prefix.installed / "QelShellExt.dll")
        dll = r"C:\Program Files\QelShellExt\QelShellExt.dll"
        self.assertEqual(self.prefix.run(SYSTEM + "regsvr32.exe", "/s", dll).returncode, 0)
        self.assertEqual(installed ^ self.ours(), set())

    def advice(self, status):
        """Returns the arguments of the msiexec commands that the doctor advises: the product, then the rest."""
        doctor = self.prefix.qelshow("doctor")
        text = doctor.stdout.decode()
        self.assertEqual(doctor.returncode, status, text)
        self.assertNotIn("regsvr32", text)  # it would register the omitted file-name extension too
        return re.findall(r"run msiexec /i (\{[-0-9A-F]+\}) (.+) as administrator", text)

    def test_a_file_name_extension_can_be_left_to_other_programs(self):
        self.install(self.msi, "ADDLOCAL=QelShellExt,mrc,ali,rec,ser,emi,ebn")
        fewer = self.ours()
        self.assertEqual({line for line in fewer if "raw" in line.lower()}, set())
        # The doctor's commands repair exactly what is missing, and add the omitted feature.
        key = r"HKLM\Software\Classes\.ser\ShellEx\PropertyHandler"
        self.prefix.run(SYSTEM + "reg.exe", "delete", key, "/f").check_returncode()
        (product, add), (_, repair) = self.advice(status=1)
        self.assertEqual((add, repair), ("ADDLOCAL=raw", "REINSTALL=ALL"))
        self.install(product, repair)
        self.assertEqual(self.ours() ^ fewer, set())
        self.assertEqual(self.advice(status=0), [(product, add)])
        self.install(product, add)
        self.assertEqual(self.advice(status=0), [])
        everything = self.ours()
        # Everything that was added belongs to .raw: it is in one of its keys, or of its class.
        self.assertEqual(fewer - everything, set())
        self.assertGreater(len(everything - fewer), 20)
        for line in everything - fewer:
            self.assertRegex(line, r"\\\.raw|\{E217E970-5E2E-11E1-B86C-0800200C9A66\}")
        self.install(self.msi, "REMOVE=raw")
        self.assertEqual(self.ours() ^ fewer, set())
        self.remove(self.msi)
        self.assertRemoved()

    def test_thumbnails_leave_the_isolated_process_only_on_request(self):
        value = (r"\Classes\CLSID\{79E696A1-2FA5-4b3e-9610-D5F760417E62} : "
                 '"DisableProcessIsolation"=dword:00000001')
        self.install(self.msi)
        default = self.ours()
        self.install(self.msi, "ADDLOCAL=inprocess")
        self.assertEqual(self.ours() ^ default, {value})
        self.assertWorks()
        self.install(self.msi, "REMOVE=inprocess")
        self.assertEqual(self.ours() ^ default, set())
        self.install(self.msi, "ADDLOCAL=inprocess")
        self.remove(self.msi)
        self.assertRemoved()

    def test_the_commands_of_the_readme_install_the_package_diagnose_a_file_and_remove_the_package(self):
        text = (SOURCES / "README.md").read_text("utf-8")
        commands = re.findall(r"(?m)^    (scripts/wine .*)$", text)
        self.assertEqual(len(commands), 3)
        self.image.write_bytes(struct.pack("<4i", 16, 12, 1, 99).ljust(1024, b"\0"))
        files = {f"build/package/{self.msi.name}": self.msi, "build/samples/damaged.mrc": self.image}
        environment = os.environ | {"QEL_WINEPREFIX": str(self.prefix.path)}
        results = []
        for command in commands:
            for name, path in files.items():
                command = command.replace(name, str(path))
            with tempfile.TemporaryFile() as out:
                status = subprocess.run(["sh", "-c", command], cwd=SOURCES, env=environment, stdin=subprocess.DEVNULL,
                                        stdout=out, stderr=out).returncode
                out.seek(0)
                results.append((status, out.read().decode()))
        (installed, _), (found, reported), (removed, _) = results
        self.assertEqual((installed, found, removed), (DONE, 4, DONE), results)
        self.assertIn(f"{self.image}: no thumbnail. The header is invalid: mode is 99", reported)
        self.assertIn("QelShellExt is registered and can be loaded.", reported)
        self.assertRemoved()

    def test_an_upgrade_replaces_a_dll_that_is_in_use(self):
        self.install(self.msi)
        installed = self.ours()
        with self.prefix.program_that_uses_the_extension() as end:
            self.install(self.next_msi, status=RESTART_NEEDED)
            self.assertEqual(end(), 0)
        self.prefix.restart()
        self.assertEqual(digest(self.prefix.installed / "QelShellExt.dll"),
                         digest(self.next_build / "QelShellExt.dll"))
        self.assertEqual(sorted(path.name for path in self.prefix.installed.iterdir()), sorted(FILES))
        self.assertEqual(installed ^ self.ours(), set())
        self.assertWorks()

        self.install(self.msi, status=FAILED)  # refuses an older version
        self.assertEqual(digest(self.prefix.installed / "QelShellExt.dll"),
                         digest(self.next_build / "QelShellExt.dll"))
        self.remove(self.next_msi)
        self.assertRemoved()


if __name__ == "__main__":
    unittest.main(argv=[sys.argv[0], *sys.argv[4:]], verbosity=2)
