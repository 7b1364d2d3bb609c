#!/usr/bin/env python3
"""Checks that the documents lead to places that exist and name the version that is built.

usage: documents_test.py PROJECT_FOLDER VERSION
"""

import pathlib
import re
import sys
import unittest

PROJECT, VERSION = pathlib.Path(sys.argv[1]), sys.argv[2]


def anchors(text):
    """The places in a document that a link can name: its headings in small letters, blanks as hyphens."""
    return {re.sub(r"[^\w\- ]", "", heading.lower()).replace(" ", "-")
            for heading in re.findall(r"(?m)^#+ +(.+)$", text)}


class Documents(unittest.TestCase):
    documents = [*PROJECT.glob("*.md"), *PROJECT.glob("docs/*.md")]

    def test_link_to_files_and_headings_that_are_there(self):
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

    def test_name_scripts_that_are_there(self):
        for document in self.documents:
            for script in re.findall(r"(?<![\w/])scripts/([a-z]+)", document.read_text("utf-8")):
                with self.subTest(document=document.name, script=script):
                    self.assertTrue((PROJECT / "scripts" / script).exists())

    def test_are_all_reached_from_the_readme(self):
        reached = set(re.findall(r"\]\(([^)\s#]+\.md)", (PROJECT / "README.md").read_text("utf-8"))) | {"README.md"}
        self.assertEqual(reached, {str(document.relative_to(PROJECT)) for document in self.documents})

    def test_tell_of_the_version_that_is_built(self):
        versions = re.findall(r"(?m)^## \[([\d.]+)\]", (PROJECT / "CHANGELOG.md").read_text("utf-8"))
        self.assertEqual(versions[0], VERSION)
        packages = re.findall(r"QelShellExt-([\d.]+)-x64", (PROJECT / "README.md").read_text("utf-8"))
        self.assertEqual(set(packages), {VERSION})


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
