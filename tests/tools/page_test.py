#!/usr/bin/env python3
"""Opens pages that qelshow writes in a browser and uses them as a reader does, with the keyboard alone.

usage: page_test.py EMULATOR QELSHOW SAMPLES_PROGRAM SERVER [unittest arguments]
"""

import itertools
import json
import os
import pathlib
import re
import subprocess
import sys
import tempfile
import unittest

from browser import Browser

sys.path.append(str(pathlib.Path(__file__).resolve().parents[2] / "formats"))
from file_kinds import EXTENSIONS  # noqa: E402

EMULATOR, QELSHOW, SAMPLES, SERVER = sys.argv[1:5]

NAMES = "[...document.querySelectorAll('.cards .name')].map(name => name.textContent)"
FOCUSED = "document.activeElement.querySelector?.('.name')?.textContent ?? document.activeElement.tagName"
PRESSED = "document.querySelector('[aria-pressed=true]').textContent"
COUNT = "document.querySelector('.count').textContent"
DATA = re.compile(r'(?<=application/json">)(.*?)(?=</script>)', re.DOTALL)  # in the page's text
DIALOG = "document.querySelector('dialog')"


class PageTest(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.folder = pathlib.Path(folder.name)
        environment = os.environ | {"LC_ALL": "C.UTF-8"}
        for arguments in ((SAMPLES, cls.folder / "samples"),
                          (QELSHOW, "page", cls.folder / "samples", "--out", cls.folder / "page", "--server", SERVER)):
            subprocess.run([EMULATOR, *arguments], check=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                           env=environment)
        cls.page = cls.folder / "page" / "index.html"
        cls.names = sorted(path.name for path in (cls.folder / "samples").iterdir())
        cls.document = json.loads(DATA.search(cls.page.read_text("utf-8"))[0])
        cls.files = {file["name"]: file for file in cls.document["files"]}

        cls.browser = Browser()
        cls.addClassCleanup(cls.browser.close)

    def open(self, page=None, **options):
        tab = self.browser.open((page or self.page).as_uri(), **options)
        self.addCleanup(tab.close)
        return tab

    def assertBecomes(self, tab, expression, expected):
        """What a key brings about may come a little after the key."""
        wanted = json.dumps(expected)
        tab.run("""new Promise(done => {
            const giveUp = Date.now() + 60000;
            const look = () => JSON.stringify(%s) === JSON.stringify(%s) || Date.now() > giveUp
                ? done() : setTimeout(look, 10);
            look();
        })""" % (expression, wanted))
        self.assertEqual(tab.run(expression), expected, expression)

    def assertQuiet(self, tab):
        """No complaint, and nothing asked for but the page and its pictures."""
        self.assertEqual(tab.complaints, [])
        for url in tab.requests:
            self.assertRegex(url, "^(data:|" + re.escape(self.folder.as_uri()) + "/)")

    def many(self, count):
        """The page with `count` files: its own files over and over, under other names and with other pictures."""
        text = self.page.read_text("utf-8")
        files = []
        for i, own in zip(range(count), itertools.cycle(self.files.values())):
            picture = own["thumbnail"]["picture"]
            thumbnail = own["thumbnail"] | {"picture": picture and f"{picture}?{i}"}
            files.append(own | {"name": f"{i:05} {own['name']}", "thumbnail": thumbnail})
        data = json.dumps(self.document | {"files": files}).replace("<", "\\u003c")
        page = self.page.with_name("many.html")
        page.write_text(DATA.sub(lambda _: data, text, count=1), "utf-8")
        return page


class Page(PageTest):
    def test_shows_every_picture_and_asks_no_network(self):
        tab = self.open(height=6000)  # high enough for all pictures to be in sight
        tab.run("Promise.all([...document.images].map(image => image.decode()))")
        self.assertEqual(sorted(tab.run(NAMES)), self.names)
        facts = tab.run("[...document.images].map(image => [image.naturalWidth, image.naturalHeight, image.alt])")
        shown = [name for name in self.names if not re.match("damaged|truncated", name)]
        self.assertEqual(sorted(alt for *_, alt in facts), sorted("Thumbnail of " + name for name in shown))
        for width, height, alt in facts:
            self.assertGreater(width * height, 0, alt)
        reasons = tab.run("[...document.querySelectorAll('.reason')].map(reason => reason.textContent)")
        self.assertEqual(len(reasons), len(self.names) - len(shown))
        self.assertTrue(all(reason.endswith(".") for reason in reasons), reasons)
        self.assertEqual(len([url for url in tab.requests if url.endswith(".png")]), len(shown))
        self.assertQuiet(tab)

    def test_has_light_and_dark_colours(self):
        brightness = """(() => { const [r, g, b] = getComputedStyle(document.body).backgroundColor.match(/\\d+/g);
                        return (+r + +g + +b) / 3; })()"""
        self.assertGreater(self.open(dark=False).run(brightness), 200)
        self.assertLess(self.open(dark=True).run(brightness), 60)

    def test_fits_a_narrow_window(self):
        tab = self.open(width=360)
        self.assertLessEqual(tab.run("document.documentElement.scrollWidth"), 360)

    def test_is_searched_by_name_with_the_keyboard(self):
        tab = self.open()
        tab.press("/")
        tab.type("TrUnC")
        self.assertBecomes(tab, NAMES, ["truncated.ebn", "truncated.mrc"])
        self.assertBecomes(tab, COUNT, f"2 of {len(self.names)} files, 0 with a thumbnail")
        tab.type("zzz")
        self.assertBecomes(tab, "document.querySelector('.none')?.textContent", "No file matches.")
        tab.press("Escape")
        self.assertBecomes(tab, NAMES + ".length", len(self.names))
        self.assertQuiet(tab)

    def test_is_filtered_by_kind_with_the_keyboard(self):
        tab = self.open()
        labels = tab.run("[...document.querySelectorAll('.kinds button')].map(button => button.textContent)")
        self.assertEqual([re.sub(r"\d+$", "", label) for label in labels],
                         ["all", *(f".{extension}" for extension in EXTENSIONS), "no thumbnail"])
        tab.press("Tab", "Tab", "Tab", "Tab", "Tab", "Enter")  # the fifth button
        self.assertBecomes(tab, PRESSED, labels[4])
        self.assertEqual(sorted(tab.run(NAMES)), [name for name in self.names if name.endswith(".ser")])
        tab.press("Tab", "Tab", "Tab", "Tab", "Enter")
        self.assertBecomes(tab, PRESSED, labels[8])
        self.assertEqual(sorted(tab.run(NAMES)),
                         [name for name in self.names if re.match("damaged|truncated", name)])
        self.assertQuiet(tab)

    def test_is_sorted_with_the_keyboard(self):
        tab = self.open()
        names = tab.run(NAMES)
        self.assertEqual(names, sorted(names))
        tab.press("/", "Tab")
        self.assertBecomes(tab, "document.activeElement.tagName", "SELECT")
        for order, key in (("kind", lambda file: file["kind"]),
                           ("pixels", lambda file: -file["width"] * file["height"]),
                           ("frames", lambda file: -file["frames"]),
                           ("bytes", lambda file: -file["bytes"])):
            tab.press("ArrowDown")
            self.assertBecomes(tab, "order.value", order)
            self.assertEqual(tab.run(NAMES), sorted(names, key=lambda name: (key(self.files[name]), name)))
        self.assertQuiet(tab)

    def test_shows_everything_about_a_file_with_the_keyboard(self):
        tab = self.open()
        tab.press("/")
        tab.type("exposure")
        tab.press("Enter")  # from the search to the first card
        self.assertBecomes(tab, FOCUSED, "exposure.ebn")
        tab.press("Enter")
        self.assertBecomes(tab, DIALOG + ".open", True)
        text = tab.run(DIALOG + ".innerText")
        for part in ("exposure.ebn", "Dimensions: (448 × 336) 16 bit unsigned", "Halden 30 FEG CryoPOLE D3415 300.0 kV",
                     "Bit Depth", "VT_UI4", "Image summary information", "System.Image.HorizontalSize"):
            self.assertIn(part, text)
        tab.press("Escape")
        self.assertBecomes(tab, DIALOG + ".open", False)
        self.assertBecomes(tab, FOCUSED, "exposure.ebn")
        self.assertQuiet(tab)

    def test_says_why_something_is_missing(self):
        tab = self.open()
        for name, part in (("damaged.mrc", "mode is 99"), ("truncated.mrc", "cut short"),
                           ("tilt series.ali", "no property store for .ali files")):
            tab.run(f"show(files.find(file => file.name === '{name}'))")
            self.assertIn(part, tab.run(DIALOG + ".innerText"))

    def test_moves_from_card_to_card_and_from_file_to_file(self):
        tab = self.open()
        names = tab.run(NAMES)
        columns = tab.run("getComputedStyle(document.querySelector('.cards')).gridTemplateColumns.split(' ').length")
        self.assertGreater(columns, 2)
        tab.press("/", "Tab", "Tab")
        self.assertBecomes(tab, FOCUSED, names[0])
        for key, index in (("ArrowRight", 1), ("ArrowDown", 1 + columns), ("ArrowLeft", columns), ("ArrowUp", 0),
                           ("ArrowLeft", 0), ("End", len(names) - 1), ("ArrowRight", len(names) - 1), ("Home", 0)):
            tab.press(key)
            self.assertBecomes(tab, FOCUSED, names[index])
        tab.press("Enter")
        for key, index in ((None, 0), ("ArrowRight", 1), ("ArrowRight", 2), ("ArrowLeft", 1)):
            tab.press(*filter(None, [key]))
            self.assertBecomes(tab, DIALOG + ".open && " + DIALOG + ".querySelector('h2').textContent", names[index])
        tab.press("Escape")
        self.assertBecomes(tab, FOCUSED, names[1])
        self.assertQuiet(tab)

    def test_takes_names_and_texts_as_text(self):
        text = self.page.read_text("utf-8")
        bad = "<img src=x onerror='document.title=1'>"
        page = self.page.with_name("bad.html")
        page.write_text(text.replace("atlas.mrc", json.dumps(bad)[1:-1].replace("<", "\\u003c")), "utf-8")
        tab = self.open(page)
        self.assertIn(bad, tab.run(NAMES))
        tab.run("show(files.find(file => file.name.includes('onerror')))")
        self.assertIn(bad, tab.run(DIALOG + ".innerText"))
        self.assertEqual(tab.run("document.title"), "Electron-microscopy files")
        self.assertQuiet(tab)


class ManyFiles(PageTest):
    FILES = 2000

    def test_take_time_only_for_the_cards_in_sight(self):
        tab = self.open(self.many(self.FILES))
        self.assertEqual(tab.run(NAMES + ".length"), self.FILES)
        in_sight = """[...document.images].filter(image => image.checkVisibility({contentVisibilityAuto: true})
                      && image.getBoundingClientRect().top < innerHeight)"""
        self.assertBecomes(tab, in_sight + ".length > 5 && " + in_sight
                           + ".every(image => image.complete && image.naturalWidth > 0)", True)
        self.assertLess(len(tab.requests), 200)
        before = tab.counters()
        # A card in sight is made of some twenty boxes, one out of sight of its own only.
        self.assertLess(before["LayoutObjects"], 2 * self.FILES)
        # Not a layout for each of the files.
        tab.press("/", "1", "9")
        self.assertBecomes(tab, NAMES + ".length", sum("19" in f"{i:05}" for i in range(self.FILES)))
        self.assertLess(tab.counters()["LayoutCount"] - before["LayoutCount"], 50)
        self.assertQuiet(tab)

    def test_are_searched_filtered_and_reached(self):
        tab = self.open(self.many(self.FILES))
        tab.press("/")
        tab.type("01999")
        self.assertBecomes(tab, NAMES + ".length", 1)
        tab.press("Escape", "Enter", "End")
        last = tab.run("shown[shown.length - 1].name")
        self.assertTrue(last.startswith("01999 "), last)
        self.assertBecomes(tab, FOCUSED, last)
        self.assertBecomes(tab, """(() => { const box = document.activeElement.getBoundingClientRect();
                                   return box.top >= 0 && box.bottom <= innerHeight; })()""", True)
        self.assertQuiet(tab)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[5:])
