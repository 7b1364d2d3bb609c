"""What DllRegisterServer writes, read from the same scripts (registration/scripts), for the installer package.

registration/registry_script.h describes the language of the scripts. Only the project's own scripts are read, and tests
parse them, so invalid text is not explained here: it only fails.
"""

import re

# The scripts that DllRegisterServer runs, in its order: the module's own, then those of the object map.
REGISTERED_SCRIPTS = ("module", "shell_ext", "ebn", "raw", "mrc")

# HKEY_CLASSES_ROOT of a whole machine: with one name for each key, what two scripts say of the same key meets.
_ROOTS = {"HKCR": r"SOFTWARE\Classes", "HKLM": ""}

_TOKEN = re.compile(r"'(?:[^']|'')*'|[{}=]|[^\s{}=']+")


class Entry:
    """A value, or a key that is to be there (name and data are None), below HKEY_LOCAL_MACHINE.

    `name` is "" for the default value; `data` is text or a number. `owned` says of a key that everything in it, whoever
    wrote it, goes when the server goes.
    """

    def __init__(self, key, name=None, data=None, owned=False):
        self.key, self.name, self.data, self.owned = key, name, data, owned

    def place(self):
        """The same for entries of which the later replaces the earlier."""
        return self.key.lower(), None if self.name is None else self.name.lower()


def read_script(text, replacements):
    """The entries of one script, in its order."""
    for name, value in replacements.items():
        text = text.replace(f"%{name}%", value.replace("'", "''"))
    tokens = _TOKEN.findall(text)[::-1]
    entries = []
    while tokens:
        _read_block(_ROOTS[tokens.pop()], tokens, entries)
    return entries


def _read_block(key, tokens, entries):
    """The values and keys between two braces, which are those of `key`."""
    assert tokens.pop() == "{"
    while tokens[-1] != "}":
        word = tokens.pop()
        if word == "val":
            entries.append(Entry(key, _bare(tokens.pop()), _read_data(tokens)))
            continue
        mark = word if word in ("ForceRemove", "NoRemove") else None
        subkey = "\\".join(filter(None, (key, _bare(tokens.pop() if mark else word))))
        if mark == "ForceRemove":
            entries.append(Entry(subkey, owned=True))
        if tokens[-1] == "=":
            entries.append(Entry(subkey, "", _read_data(tokens)))
        if tokens[-1] == "{":
            _read_block(subkey, tokens, entries)
    tokens.pop()


def _read_data(tokens):
    assert tokens.pop() == "="
    kind, data = tokens.pop(), _bare(tokens.pop())
    return {"s": str, "d": int}[kind](data)


def _bare(token):
    return token[1:-1].replace("''", "'") if token.startswith("'") else token


def registered_entries(folder, replacements):
    """Pairs of an extension ("" for what all of them share) and an entry, for all that registering writes.

    Of entries for the same place only the last stands, as it does in the registry. A key without a mark and without
    values of its own is not listed: it comes and goes with what is in it.
    """
    placed = {}
    for script in REGISTERED_SCRIPTS:
        for entry in read_script((folder / f"{script}.rgs").read_text("ascii"), replacements):
            in_key = re.search(r"\\\.([a-z]+)(\\|$)", entry.key)
            extension = in_key[1] if in_key else "" if script in ("module", "shell_ext") else script
            placed[entry.place()] = (extension, entry)
    return list(placed.values())
