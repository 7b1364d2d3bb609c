#!/usr/bin/env python3
"""Checks that the links of the documents work, that the documents name the current version and all file kinds, and that
no file contains a phrase to avoid.

usage: documents_test.py PROJECT_FOLDER VERSION
"""

import pathlib
import re
import subprocess
import sys
import unittest

PROJECT, VERSION = pathlib.Path(sys.argv[1]), sys.argv[2]

sys.path.append(str(PROJECT / "formats"))
from file_kinds import EXTENSIONS, KINDS  # noqa: E402


def anchors(text):
    """Returns the anchors that a link to a document can name: its headings in lower case, with hyphens for spaces."""
    return {re.sub(r"[^\w\- ]", "", heading.lower()).replace(" ", "-")
            for heading in re.findall(r"(?m)^#+ +(.+)$", text)}


class Documents(unittest.TestCase):
    documents = [*PROJECT.glob("*.md"), *PROJECT.glob("docs/*.md")]

    def test_link_to_files_and_headings_that_exist(self):
        links = [(document, link) for document in self.documents
                 for link in re.findall(r"\]\(([^)\s]+)\)", document.read_text("utf-8"))]
        self.assertGreater(len(links), 10)
        for document, link in links:
            if re.match("https?:", link):
                continue
            with self.subTest(document=document.name, link=link):
                path, _, anchor = link.partition("#")
                target = document.parent / path if path else document
                self.assertTrue(target.exists())
                if anchor:
                    self.assertIn(anchor, anchors(target.read_text("utf-8")))

    def test_name_scripts_that_exist(self):
        for document in self.documents:
            for script in re.findall(r"(?<![\w/])scripts/([a-z-]+)", document.read_text("utf-8")):
                with self.subTest(document=document.name, script=script):
                    self.assertTrue((PROJECT / "scripts" / script).exists())

    def test_are_all_reached_from_the_readme(self):
        reached = set(re.findall(r"\]\(([^)\s#]+\.md)", (PROJECT / "README.md").read_text("utf-8"))) | {"README.md"}
        self.assertEqual(reached, {str(document.relative_to(PROJECT)) for document in self.documents})

    def test_begin_with_a_readme_that_is_read_in_a_minute(self):
        self.assertLessEqual(len((PROJECT / "README.md").read_text("utf-8").splitlines()), 90)

    def test_name_the_current_version(self):
        versions = re.findall(r"(?m)^## \[([\d.]+)\]", (PROJECT / "CHANGELOG.md").read_text("utf-8"))
        self.assertEqual(versions[0], VERSION)
        for name in ("README.md", "docs/user-guide.md"):
            with self.subTest(document=name):
                packages = re.findall(r"QelShellExt-([\d.]+)-x64", (PROJECT / name).read_text("utf-8"))
                self.assertEqual(set(packages), {VERSION})


class Prose(unittest.TestCase):
    """Each line of phrases_to_avoid.txt is a regular expression, a tab and what to write instead."""

    phrases = [line.split("\t") for line in
               (pathlib.Path(__file__).parent / "phrases_to_avoid.txt").read_text("utf-8").splitlines()]

    def texts(self):
        """Yields the name and the text of each file; a line break and the comment mark after it count as a space."""
        listed = subprocess.run(["git", "ls-files", "-z"], cwd=PROJECT, stdout=subprocess.PIPE, check=True).stdout
        for name in listed.decode().split("\0")[:-1]:
            content = (PROJECT / name).read_bytes()
            # The notices quote licences.
            if b"\0" in content or name in ("packaging/NOTICES.txt", "tests/documents/phrases_to_avoid.txt"):
                continue
            yield name, re.sub(r"\s*\n\s*(?:(?:///?<?|#|\*|REM) )?\s*", " ", content.decode())

    def test_avoids_the_phrases_that_stop_a_reader(self):
        self.assertGreater(len(self.phrases), 10)
        patterns = [(re.compile(rf"\b(?:{phrase})\b", re.IGNORECASE), better) for phrase, better in self.phrases]
        found = [f"{name}: “{text[max(0, match.start() - 30):match.end() + 30]}”: write {better}"
                 for name, text in self.texts() for pattern, better in patterns for match in pattern.finditer(text)]
        self.assertEqual(found, [], "\n".join(found))


class FileKinds(unittest.TestCase):
    """Checks the places that name every file kind and are not derived from the list (formats/file_kinds.h)."""

    def assertSame(self, found, expected):
        self.assertEqual(sorted(found), sorted(expected))

    def test_are_all_read_from_the_list(self):
        rows = (PROJECT / "formats" / "file_kinds.h").read_text("utf-8").count("    FileKind<")
        self.assertGreater(rows, 0)
        self.assertEqual(len(EXTENSIONS), rows)

    def test_are_all_named_in_the_introduction_of_the_readme(self):
        first_sentences = " ".join((PROJECT / "README.md").read_text("utf-8")[:800].split())
        self.assertSame(re.findall(r"\.([a-z]+)`?(?:, | and | files)", first_sentences), EXTENSIONS)

    def test_have_a_row_in_every_table_of_kinds(self):
        tables = [(name, table) for name in ("README.md", "docs/user-guide.md")
                  for table in re.findall(r"(?m)(?:^\|.*\n)+", (PROJECT / name).read_text("utf-8"))]
        columns = [(name, re.findall(r"`\.([a-z]+)`", "".join(re.findall(r"(?m)^\|[^|]*", table)))) for name, table in tables]
        columns = [(name, extensions) for name, extensions in columns if "mrc" in extensions]
        self.assertEqual({name for name, _ in columns}, {"README.md", "docs/user-guide.md"})
        for name, extensions in columns:
            with self.subTest(document=name):
                self.assertSame(extensions, EXTENSIONS)

    def test_have_a_section_that_describes_their_format(self):
        text = (PROJECT / "docs" / "formats.md").read_text("utf-8")
        self.assertSame(re.findall(r"(?m)^## (\w+)$", text), [kind.upper() for kind in KINDS])

    def test_have_a_dictionary_for_the_fuzzer(self):
        dictionaries = {path.stem for path in (PROJECT / "fuzz" / "dictionaries").glob("*.dict")}
        self.assertSame(dictionaries - {"combuf", "registrar"}, KINDS)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
