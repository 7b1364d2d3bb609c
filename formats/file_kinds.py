"""The list of file kinds, read from file_kinds.h, for the Python scripts of the project."""

import pathlib
import re

_HEADER = pathlib.Path(__file__).with_name("file_kinds.h")

# Pairs of the name that a parser's files begin with and one of its extensions, in the order of registration.
_ROWS = re.findall(r'(?m)^ *FileKind<(\w+)Parser>\{L"(\w+)"', _HEADER.read_text("utf-8"))

EXTENSIONS = [extension for _, extension in _ROWS]
KINDS = list(dict.fromkeys(parser.lower() for parser, _ in _ROWS))
