#!/usr/bin/env python3
"""Opens the pages that qelshow writes in a browser, and uses them as a reader does, with the keyboard only.

usage: page_test.py EMULATOR QELSHOW SAMPLES_PROGRAM SERVER [unittest arguments]
"""

import itertools
import json
import os
import pathlib
import re
import shutil
import subprocess
import sys
import tempfile
import unittest

from browser import Browser

PROJECT = pathlib.Path(__file__).resolve().parents[2]
sys.path.append(str(PROJECT / "formats"))
from file_kinds import EXTENSIONS  # noqa: E402

EMULATOR, QELSHOW, SAMPLES, SERVER = sys.argv[1:5]

AXE = PROJECT / "build" / "npm" / "node_modules" / "axe-core" / "axe.min.js"  # scripts/setup puts it there

NAMES = "shown.map(file => file.name)"
SEEN = "[...document.querySelectorAll('.cards .name')].map(name => name.textContent)"
FOCUSED = "document.activeElement.querySelector?.('.name')?.textContent ?? document.activeElement.tagName"
PRESSED = "[...document.querySelectorAll('.kinds [aria-pressed=true]')].map(button => button.firstChild.data)"
COUNT = "document.querySelector('.count').textContent"
DATA = re.compile(r'(?<=application/json">)(.*?)(?=</script>)', re.DOTALL)  # the data in the page's source
DIALOG = "document.querySelector('dialog')"
DIALOG_NAME = DIALOG + ".open && " + DIALOG + ".querySelector('h2').textContent"

# The facts in the dialog, as pairs of name and text.
FACTS = "[...document.querySelectorAll('dt')].map(name => [name.innerText, name.nextElementSibling.innerText])"

# The words of a page that a line break divides although a whole line could hold them. A line may break at a blank,
# after a hyphen and after the backslash of a path. In a table no word may be divided, however long it is.
BROKEN_WORDS = r"""(() => {
  const broken = [];
  const context = document.createElement('canvas').getContext('2d');
  const texts = document.createTreeWalker(document.body, NodeFilter.SHOW_TEXT);
  while (texts.nextNode()) {
    const text = texts.currentNode, parent = text.parentElement;
    if (!parent.checkVisibility() || parent.closest('script, template')) continue;
    for (const word of text.data.matchAll(/[^\s\\-]+/g)) {
      const range = document.createRange();
      range.setStart(text, word.index);
      range.setEnd(text, word.index + word[0].length);
      if (new Set([...range.getClientRects()].map(box => Math.round(box.top))).size < 2) continue;
      const block = parent.closest('td, th, dt, dd, p, h1, h2, h3, summary, .name, .folder, .line, .reason, pre, button');
      const style = getComputedStyle(block);
      context.font = getComputedStyle(parent).font;
      const line = block.clientWidth - parseFloat(style.paddingLeft) - parseFloat(style.paddingRight);
      if (block.matches('td, th') || context.measureText(word[0]).width < line - 1) broken.push(word[0]);
    }
  }
  return broken;
})()"""

# Whether the focused element is entirely visible: below the bar, or below the top of the window once the bar has been
# scrolled out of it, and above the bottom of the window.
IN_SIGHT = """(() => {
  const box = document.activeElement.getBoundingClientRect();
  const top = Math.max(0, document.querySelector('.bar').getBoundingClientRect().bottom);
  return box.height > 0 && box.top >= top && box.bottom <= innerHeight;
})()"""

# The problems that axe-core finds, and the texts whose contrast it cannot determine, except symbols that are not
# letters, which it never judges.
FINDINGS = """axe.run().then(({violations, incomplete, passes}) => {
  const list = (results) => results.flatMap(({id, nodes}) =>
      nodes.map(({html, any}) => [id, html.slice(0, 120), any[0]?.message, any[0]?.data?.messageKey]));
  const undetermined = incomplete.filter(({id}) => id === 'color-contrast');
  return {
    problems: [...list(violations), ...list(undetermined).filter(([, , , key]) => key !== 'nonBmp')],
    contrasts: passes.find(({id}) => id === 'color-contrast')?.nodes.length ?? 0,
  };
})"""

# The contrast between the edge of each control that shows or accepts text and the background of the page.
EDGES = """[...document.querySelectorAll('input, select, .bar button')].map(control => {
  const light = (colour) => {
    const [r, g, b] = colour.match(/[\\d.]+/g).map(value => value / 255)
        .map(value => value <= 0.04045 ? value / 12.92 : ((value + 0.055) / 1.055) ** 2.4);
    return 0.2126 * r + 0.7152 * g + 0.0722 * b + 0.05;
  };
  const edge = light(getComputedStyle(control).borderTopColor);
  const ground = light(getComputedStyle(document.body).backgroundColor);
  return Math.max(edge, ground) / Math.min(edge, ground);
})"""


def comment_of(file):
    """Returns the comment from the columns of a file."""
    return next((column["value"] or "" for column in file["columns"]["items"]
                 if column["set"].startswith("{F29F85E0") and column["id"] == 6), "")


class PageTest(unittest.TestCase):
    maxDiff = None

    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.folder = pathlib.Path(folder.name)
        environment = os.environ | {"LC_ALL": "C.UTF-8"}
        samples = cls.folder / "samples"

        def run(*arguments):
            subprocess.run([EMULATOR, *arguments], check=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                           env=environment)

        run(SAMPLES, samples)
        (samples / "grid 2").mkdir()
        shutil.copy(samples / "atlas.mrc", samples / "grid 2")
        for i, path in enumerate(sorted(samples.rglob("*.*"), key=lambda path: path.stat().st_size)):
            os.utime(path, (0, 1614834367 + i * 7777777 % 1000003))
        run(QELSHOW, "page", samples, "--out", cls.folder / "page", "--server", SERVER)
        cls.page = cls.folder / "page" / "index.html"
        cls.names = sorted(str(pathlib.PureWindowsPath(path.relative_to(samples))) for path in samples.rglob("*.*"))
        cls.document = json.loads(DATA.search(cls.page.read_text("utf-8"))[0])
        cls.files = {file["name"]: file for file in cls.document["files"]}

        cls.browser = Browser()
        cls.addClassCleanup(cls.browser.close)

    def open(self, page=None, **options):
        tab = self.browser.open((page or self.page).as_uri(), **options)
        self.addCleanup(tab.close)
        return tab

    def assertBecomes(self, tab, expression, expected):
        """Waits until the expression has this value. The effect of a key may come a little later."""
        wanted = json.dumps(expected)
        tab.run("""new Promise(done => {
            const giveUp = Date.now() + 60000;
            const look = () => JSON.stringify(%s) === JSON.stringify(%s) || Date.now() > giveUp
                ? done() : setTimeout(look, 10);
            look();
        })""" % (expression, wanted))
        self.assertEqual(tab.run(expression), expected, expression)

    def tab_to(self, tab, selector):
        """Moves the focus with the tab key to the element that the selector matches."""
        for _ in range(60):
            if tab.run(f"document.activeElement.matches({json.dumps(selector)})"):
                return
            tab.press("Tab")
        self.fail(f"the tab key does not reach {selector}")

    def show(self, tab, name):
        tab.run(f"show(files.find(file => file.name === {json.dumps(name)}))")

    def assertQuiet(self, tab):
        """Checks that the page had no errors and requested nothing except itself and its thumbnails."""
        self.assertEqual(tab.complaints, [])
        for url in tab.requests:
            self.assertRegex(url, "^(data:|" + re.escape(self.folder.as_uri()) + "/)")

    def edited(self, name, **members):
        """Writes the page with other facts to a file of this name. Returns its path."""
        data = json.dumps(self.document | members).replace("<", "\\u003c")
        page = self.page.with_name(name)
        page.write_text(DATA.sub(lambda _: data, self.page.read_text("utf-8"), count=1), "utf-8")
        return page

    def many(self, count):
        """Makes a page of `count` files by repeating the samples with other names and thumbnails. Returns its path."""
        files = []
        for i, own in zip(range(count), itertools.cycle(self.files.values())):
            file = own["thumbnail"]["file"]
            thumbnail = own["thumbnail"] | {"file": file and f"{file}?{i}"}
            name = pathlib.PureWindowsPath(own["name"]).name
            files.append(own | {"name": f"{i:05} {name}", "thumbnail": thumbnail})
        return self.edited("many.html", files=files)


class Page(PageTest):
    def test_shows_every_thumbnail_and_needs_no_network(self):
        tab = self.open(height=6000)  # high enough to show all thumbnails
        tab.run("Promise.all([...document.images].map(image => image.decode()))")
        self.assertEqual(sorted(tab.run(SEEN)), sorted(pathlib.PureWindowsPath(name).name for name in self.names))
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

    def test_names_the_folder(self):
        tab = self.open()
        self.assertEqual(tab.run("document.querySelector('h1').textContent"), "samples")
        self.assertEqual(tab.run("document.title"), "samples")
        nowhere = self.open(self.edited("nowhere.html", folder=""))
        self.assertEqual(nowhere.run("document.querySelector('h1').textContent"), "Electron-microscopy files")
        self.assertQuiet(tab)

    def test_fits_a_narrow_window(self):
        for width in (240, 320, 360, 500):
            tab = self.open(width=width)
            self.assertLessEqual(tab.run("document.documentElement.scrollWidth"), width)
            self.show(tab, "exposure.ebn")
            self.assertLessEqual(tab.run(DIALOG + ".scrollWidth"), width)

    def test_breaks_no_word(self):
        for width in (240, 320, 480, 640, 800, 1200, 1900):
            with self.subTest(width=width):
                tab = self.open(width=width, height=6000)
                self.assertEqual(tab.run(BROKEN_WORDS), [])
                for name in ("exposure.ebn", "transform integer.mrc", "grid 2\\atlas.mrc", "truncated.mrc"):
                    self.show(tab, name)
                    tab.run("document.querySelectorAll('details').forEach(section => { section.open = true; })")
                    self.assertEqual(tab.run(BROKEN_WORDS), [], name)
                    self.assertGreater(tab.run("document.querySelectorAll('dialog td').length"), 10)

    def test_can_be_searched_with_the_keyboard(self):
        tab = self.open()
        tab.type("TrUnC")
        self.assertBecomes(tab, NAMES, ["truncated.ebn", "truncated.mrc"])
        self.assertBecomes(tab, COUNT, f"2 of {len(self.names)} files, 0 with a thumbnail")
        tab.type("zzz")
        self.assertBecomes(tab, "document.querySelector('.none')?.textContent", "No file matches. Clear the search or choose other kinds.")
        tab.press("Escape")
        self.assertBecomes(tab, NAMES + ".length", len(self.names))
        self.assertQuiet(tab)

    def test_can_be_searched_by_comment_pixel_type_and_folder(self):
        tab = self.open()
        for text, matches in (
            ("fiducials", lambda file: "Fiducials" in comment_of(file)),
            ("128 BIT complex", lambda file: "128 bit complex" in (file["type"] or "")),
            ("signed ice", lambda file: "signed" in (file["type"] or "") and "in ice" in comment_of(file)),
            ("grid 2", lambda file: "grid 2" in file["name"]),
        ):
            tab.type(text)
            expected = [name for name in tab.run("files.map(file => file.name)") if matches(self.files[name])]
            self.assertGreater(len(expected), 0)
            self.assertBecomes(tab, NAMES, expected)
            tab.press("Escape")
        self.assertQuiet(tab)

    def test_shows_several_kinds_at_once(self):
        tab = self.open()
        labels = ["all kinds", *(f".{extension}" for extension in EXTENSIONS), "no thumbnail"]
        self.assertEqual(tab.run("[...document.querySelectorAll('.kinds button')].map(button => button.firstChild.data)"),
                         labels)
        self.assertEqual(tab.run(PRESSED), ["all kinds"])
        bad = [name for name in self.names if re.match("damaged|truncated", name)]

        def choose(label, key, pressed, names):
            self.tab_to(tab, f".kinds button:nth-child({labels.index(label) + 1})")
            tab.press(key)
            self.assertBecomes(tab, PRESSED, pressed)
            self.assertEqual(sorted(tab.run(NAMES)), sorted(names))
            tab.press(*["Shift+Tab"] * len(labels))

        def of(*kinds):
            return [name for name in self.names if name.endswith(kinds)]

        choose(".ser", "Enter", [".ser"], of(".ser"))
        choose(".emi", "Space", [".ser", ".emi"], of(".ser", ".emi"))
        choose("no thumbnail", "Enter", [".ser", ".emi", "no thumbnail"],
               [name for name in of(".ser", ".emi") if name in bad])
        choose(".ser", "Enter", [".emi", "no thumbnail"], [name for name in of(".emi") if name in bad])
        choose("all kinds", "Enter", ["all kinds", "no thumbnail"], bad)
        choose("no thumbnail", "Enter", ["all kinds"], self.names)
        self.assertQuiet(tab)

    def test_can_be_sorted_with_the_keyboard_in_both_directions(self):
        tab = self.open()
        names = tab.run("files.map(file => file.name)")
        self.assertEqual(names, sorted(names))
        self.tab_to(tab, "select")
        for order, key, first, second in (
            ("name", lambda file: names.index(file["name"]), "A to Z", "Z to A"),
            ("kind", lambda file: file["kind"], "A to Z", "Z to A"),
            ("pixels", lambda file: file["width"] * file["height"] or None, "largest first", "smallest first"),
            ("frames", lambda file: file["frames"] or None, "most first", "fewest first"),
            ("bytes", lambda file: file["bytes"], "largest first", "smallest first"),
            ("date", lambda file: file["modified"], "newest first", "oldest first"),
        ):
            if order != "name":
                tab.press("ArrowDown")
            for label in (first, second):
                self.assertBecomes(tab, "[order.value, direction.textContent.slice(2)]", [order, label])
                # Files with equal values keep the order of their names. Files without a value come last.
                known = [name for name in names if key(self.files[name]) is not None]
                known.sort(key=lambda name: key(self.files[name]),
                           reverse=label in ("Z to A", "largest first", "most first", "newest first"))
                self.assertEqual(tab.run(NAMES), known + [name for name in names if name not in known])
                tab.press("Tab", "Enter", "Shift+Tab")
        self.assertEqual(len({file["modified"] for file in self.files.values()}), len(names))
        self.assertQuiet(tab)

    def test_distinguishes_files_of_the_same_name(self):
        tab = self.open()
        tab.type("atlas.mrc")
        self.assertBecomes(tab, NAMES, ["atlas.mrc", "grid 2\\atlas.mrc"])
        self.assertEqual(tab.run(SEEN), ["atlas.mrc"] * 2)
        folders = "[...document.querySelectorAll('.cards .card')].map(card => card.querySelector('.folder').innerText)"
        self.assertEqual(tab.run(folders), ["", "grid 2"])
        tab.press("Enter", "Enter")
        for key, part in ((None, r"\samples\atlas.mrc"), ("ArrowRight", r"\samples\grid 2\atlas.mrc")):
            tab.press(*filter(None, [key]))
            self.assertBecomes(tab, f"Object.fromEntries({FACTS}).Path.includes({json.dumps(part)})", True)
        self.assertQuiet(tab)

    def test_keeps_the_focus_visible(self):
        for width, height in ((1200, 900), (1000, 704), (640, 704), (900, 520), (360, 640)):
            with self.subTest(width=width, height=height):
                tab = self.open(self.many(200), width=width, height=height)
                tab.press("Enter")
                for key, times in (("ArrowDown", 7), ("ArrowUp", 5), ("End", 1), ("ArrowUp", 5), ("ArrowLeft", 7),
                                   ("Home", 1), ("ArrowDown", 3)):
                    for _ in range(times):
                        tab.press(key)
                        self.assertBecomes(tab, IN_SIGHT, True)
                # The tab key returns to a card that has been scrolled out of the window.
                tab.press("Tab")
                tab.run("scrollTo(0, document.documentElement.scrollHeight)")
                tab.press("Shift+Tab")
                self.assertBecomes(tab, f"({FOCUSED}).length > 7 && " + IN_SIGHT, True)

    def test_shows_everything_about_a_file_with_the_keyboard(self):
        tab = self.open()
        tab.type("exposure")
        tab.press("Enter")  # from the search to the first card
        self.assertBecomes(tab, FOCUSED, "exposure.ebn")
        tab.press("Enter")
        self.assertBecomes(tab, DIALOG + ".open", True)
        tab.run("document.querySelectorAll('details').forEach(section => { section.open = true; })")
        text = tab.run(DIALOG + ".innerText")
        for part in ("exposure.ebn", "Dimensions: (448 × 336) 16 bit unsigned", "Halden 30 FEG CryoPOLE D3415 300.0 kV",
                     "Bit Depth", "VT_UI4", "Image summary information", "System.Image.HorizontalSize"):
            self.assertIn(part, text)
        tab.press("Escape")
        self.assertBecomes(tab, DIALOG + ".open", False)
        self.assertBecomes(tab, FOCUSED, "exposure.ebn")
        self.assertQuiet(tab)

    def test_shows_plain_facts_first(self):
        tab = self.open()
        self.show(tab, "tilt series.ali")
        file = self.files["tilt series.ali"]
        facts = dict(tab.run(FACTS))
        self.assertEqual(list(facts), ["Frame size", "Frames", "Pixel type", "Comment", "File size", "Date modified",
                                       "Path"])
        self.assertEqual((facts["Frame size"], facts["Frames"], facts["Pixel type"]), ("256 × 256", "11", "8 bit unsigned"))
        self.assertEqual(facts["Comment"], comment_of(file).replace("\r\n", "\n"))
        self.assertEqual(facts["File size"], "705 KB (721,920 bytes)")
        self.assertEqual(tab.run("document.querySelector('dialog time').dateTime"), file["modified"])
        self.assertRegex(facts["Date modified"], r"^March \d+, 2021 at \d+:\d\d\s[AP]M$")
        self.assertTrue(facts["Path"].startswith(file["path"]))
        # They are above the developers' tables, which are closed.
        above = "document.querySelector('dialog details').getBoundingClientRect().top"
        self.assertLess(tab.run("Math.max(...[...document.querySelectorAll('dd')].map(fact => fact.getBoundingClientRect().bottom))"),
                        tab.run(above))
        self.assertEqual(tab.run("document.querySelectorAll('dialog table').length > 0"
                                 " && ![...document.querySelectorAll('dialog table')].some(table => table.checkVisibility())"),
                         True)

    def test_shows_what_the_header_says_before_the_tables(self):
        header = [{"name": "Beam energy", "value": 300, "unit": "kV"}, {"name": "Tilt", "value": -12.5, "unit": None},
                  {"name": "Description", "value": "", "unit": None}]
        tab = self.open(self.edited("header.html", files=[self.files["exposure.ebn"] | {"header": header},
                                                          self.files["atoms.raw"] | {"header": []}]))
        tab.run("show(files.find(file => file.name === 'exposure.ebn'))")
        self.assertEqual(tab.run(FACTS)[-2:], [["Beam energy", "300 kV"], ["Tilt", "-12.5"]])
        headings = "[...document.querySelectorAll('dialog h3')].map(heading => heading.textContent)"
        self.assertEqual(tab.run(headings)[0], "Other header values")
        self.assertTrue(tab.run("[...document.querySelectorAll('dd')].every(fact => "
                                "fact.compareDocumentPosition(document.querySelector('details'))"
                                " & Node.DOCUMENT_POSITION_FOLLOWING)"))
        tab.run("show(files.find(file => file.name === 'atoms.raw'))")
        self.assertEqual(len(tab.run(headings)), 1)
        self.assertQuiet(tab)

    def test_keeps_a_section_open_from_file_to_file(self):
        tab = self.open()
        tab.press("Enter", "Enter")
        self.tab_to(tab, "details:nth-of-type(2) summary")
        tab.press("Enter")
        opened = "[...document.querySelectorAll('details')].map(section => section.open)"
        self.assertBecomes(tab, opened, [False, True, False, False])
        self.assertIn("Bit Depth", tab.run(DIALOG + ".innerText"))
        tab.press("ArrowRight")
        self.assertBecomes(tab, DIALOG_NAME, tab.run("shown[1].ownName"))
        self.assertEqual(tab.run(opened), [False, True, False, False])

    def test_copies_the_path(self):
        tab = self.open()
        tab.press("Enter", "Enter")
        self.tab_to(tab, ".copy")
        tab.press("Enter")
        self.assertBecomes(tab, "document.querySelector('dialog [role=status]').textContent", "Copied.")
        tab.press("Escape")
        self.assertBecomes(tab, FOCUSED, "atlas.mrc")
        self.tab_to(tab, "input")
        tab.press("Control+v")
        self.assertBecomes(tab, "search.value", self.files["atlas.mrc"]["path"])
        self.assertQuiet(tab)

    def test_selects_a_path_that_the_browser_does_not_copy(self):
        tab = self.open()
        tab.run("navigator.clipboard.writeText = () => Promise.reject(new Error('no'))")
        tab.press("Enter", "Enter")
        self.tab_to(tab, ".copy")
        tab.press("Enter")
        self.assertBecomes(tab, "getSelection().toString()", self.files["atlas.mrc"]["path"])
        self.assertIn("Ctrl+C", tab.run("document.querySelector('dialog [role=status]').textContent"))

    def test_disables_the_arrows_at_the_ends(self):
        tab = self.open()
        tab.type("trunc")
        tab.press("Enter", "Enter")
        disabled = "[...document.querySelectorAll('[data-step]')].map(button => button.disabled)"
        position = "document.querySelector('.position').textContent"
        self.assertBecomes(tab, DIALOG_NAME, "truncated.ebn")
        self.assertEqual((tab.run(disabled), tab.run(position)), ([True, False], "1 of 2"))
        self.tab_to(tab, "[data-step='1']")
        tab.press("Enter")
        self.assertBecomes(tab, DIALOG_NAME, "truncated.mrc")
        self.assertEqual((tab.run(disabled), tab.run(position)), ([False, True], "2 of 2"))
        # The dialog still receives the keys.
        self.assertTrue(tab.run(DIALOG + ".contains(document.activeElement)"))
        tab.press("ArrowRight", "ArrowLeft")
        self.assertBecomes(tab, DIALOG_NAME, "truncated.ebn")
        self.assertQuiet(tab)

    def test_says_why_something_is_missing_and_what_to_do(self):
        tab = self.open()
        for name, part in (("damaged.mrc", "mode is 99"), ("truncated.mrc", "cut short"),
                           ("tilt series.ali", "no property store for .ali files")):
            self.show(tab, name)
            tab.run("document.querySelectorAll('details').forEach(section => { section.open = true; })")
            text = tab.run(DIALOG + ".innerText")
            self.assertIn(part, text)
            self.assertIn(self.files[name]["advice"] or "", text)
        self.assertTrue(self.files["truncated.mrc"]["advice"])

    def test_moves_from_card_to_card_and_from_file_to_file(self):
        tab = self.open()
        names = tab.run(NAMES)
        columns = tab.run("getComputedStyle(document.querySelector('.cards')).gridTemplateColumns.split(' ').length")
        self.assertGreater(columns, 2)
        self.tab_to(tab, ".card")
        self.assertBecomes(tab, FOCUSED, names[0])
        for key, index in (("ArrowRight", 1), ("ArrowDown", 1 + columns), ("ArrowLeft", columns), ("ArrowUp", 0),
                           ("ArrowLeft", 0), ("End", len(names) - 1), ("ArrowRight", len(names) - 1), ("Home", 0)):
            tab.press(key)
            self.assertBecomes(tab, FOCUSED, names[index])
        tab.press("Enter")
        for key, index in ((None, 0), ("ArrowRight", 1), ("ArrowRight", 2), ("ArrowLeft", 1)):
            tab.press(*filter(None, [key]))
            self.assertBecomes(tab, DIALOG_NAME, names[index])
        tab.press("Escape")
        self.assertBecomes(tab, FOCUSED, names[1])
        self.assertQuiet(tab)

    def test_shows_names_and_strings_as_plain_text(self):
        text = self.page.read_text("utf-8")
        bad = "<img src=x onerror='document.title=1'>"
        page = self.page.with_name("bad.html")
        page.write_text(text.replace("atlas.mrc", json.dumps(bad)[1:-1].replace("<", "\\u003c")), "utf-8")
        tab = self.open(page)
        self.assertIn(bad, tab.run(SEEN))
        tab.run("show(files.find(file => file.name.includes('onerror')))")
        self.assertIn(bad, tab.run(DIALOG + ".innerText"))
        self.assertEqual(tab.run("document.title"), "samples")
        self.assertQuiet(tab)


class Accessibility(PageTest):
    def assertAccessible(self, tab, least_contrasts):
        """Checks that axe-core finds no problem and can determine the contrast of all text."""
        tab.load(AXE)
        findings = tab.run(FINDINGS)
        self.assertEqual(findings["problems"], [])
        self.assertGreater(findings["contrasts"], least_contrasts)

    def test_of_the_cards(self):
        for dark, width in itertools.product((False, True), (360, 1200)):
            with self.subTest(dark=dark, width=width):
                tab = self.open(dark=dark, width=width, height=9000)
                self.tab_to(tab, ".kinds button:nth-child(2)")
                tab.press("Enter")
                self.assertBecomes(tab, PRESSED, [".mrc"])
                self.assertAccessible(tab, 30)
                self.tab_to(tab, "input")
                tab.type("zzz")
                self.assertBecomes(tab, "document.querySelector('.none')?.textContent", "No file matches. Clear the search or choose other kinds.")
                self.assertAccessible(tab, 10)

    def test_of_the_dialog(self):
        for dark, width in itertools.product((False, True), (360, 1200)):
            tab = self.open(dark=dark, width=width, height=3000)
            for name in ("exposure.ebn", "truncated.mrc", "damaged.emi"):
                with self.subTest(dark=dark, width=width, name=name):
                    self.show(tab, name)
                    if width > 1000:  # wide enough to show the tables without scrolling
                        tab.run("document.querySelectorAll('details').forEach(section => { section.open = true; })")
                    self.assertAccessible(tab, 15)

    def test_of_the_edges_of_controls(self):
        for dark in (False, True):
            edges = self.open(dark=dark).run(EDGES)
            self.assertGreater(len(edges), 10)
            self.assertGreaterEqual(min(edges), 3)


class ManyFiles(PageTest):
    FILES = 2000

    def test_cost_time_only_for_the_visible_cards(self):
        tab = self.open(self.many(self.FILES))
        self.assertEqual(tab.run(SEEN + ".length"), self.FILES)
        in_sight = """[...document.images].filter(image => image.checkVisibility({contentVisibilityAuto: true})
                      && image.getBoundingClientRect().top < innerHeight)"""
        self.assertBecomes(tab, in_sight + ".length > 5 && " + in_sight
                           + ".every(image => image.complete && image.naturalWidth > 0)", True)
        self.assertLess(len(tab.requests), 200)
        before = tab.counters()
        # A visible card has about twenty boxes, a hidden one only its own.
        self.assertLess(before["LayoutObjects"], 2 * self.FILES)
        # There is not one layout per file.
        tab.press(*"0199")
        self.assertBecomes(tab, SEEN + ".length", sum("0199" in f"{i:05}" for i in range(self.FILES)))
        self.assertLess(tab.counters()["LayoutCount"] - before["LayoutCount"], 50)
        self.assertQuiet(tab)

    def test_can_be_searched_filtered_and_reached(self):
        tab = self.open(self.many(self.FILES))
        tab.type(f"{self.FILES - 1:05}")
        self.assertBecomes(tab, NAMES + ".length", 1)
        tab.press("Escape", "Enter", "End")
        last = tab.run("shown[shown.length - 1].name")
        self.assertTrue(last.startswith(f"{self.FILES - 1:05} "), last)
        self.assertBecomes(tab, FOCUSED, last)
        self.assertBecomes(tab, IN_SIGHT, True)
        self.assertQuiet(tab)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[5:])
