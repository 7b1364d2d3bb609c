"""The list of file kinds, read from file_kinds.h, for the Python scripts of the project."""

import pathlib
import re

_HEADER = pathlib.Path(__file__).with_name("file_kinds.h")

# Pairs of a parser's name and one of its file-name extensions, in the order of registration.
_ROWS = re.findall(r'(?m)^ *FileKind<(\w+)Parser>\{L"(\w+)"', _HEADER.read_text("utf-8"))

# The kind of each extension, which is also the prefix of its parser's source files.
KIND_OF = {extension: parser.lower() for parser, extension in _ROWS}
EXTENSIONS = list(KIND_OF)
KINDS = list(dict.fromkeys(KIND_OF.values()))

# For sentences, for instance ".mrc, .ser and .raw".
EXTENSIONS_IN_WORDS = " and ".join(", .".join(["", *EXTENSIONS])[2:].rsplit(", ", 1))
