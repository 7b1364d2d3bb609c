"""The registry entries that DllRegisterServer writes, for the installer package.

They are read from the same scripts (registration/scripts). registration/registry_script.h describes the language of the
scripts. This module reads only the project's own scripts, which tests parse, so it fails without explanation for an
invalid script.
"""

import re

# The scripts that DllRegisterServer runs, in that order: the module's own, then those of the object map.
REGISTERED_SCRIPTS = ("module", "shell_ext", "ebn", "raw", "mrc")

# Where the roots are for all users of a machine, below HKEY_LOCAL_MACHINE. Each key has only one name this way, so
# entries of two scripts for the same key coincide.
_ROOTS = {"HKCR": r"SOFTWARE\Classes", "HKLM": ""}

_TOKEN = re.compile(r"'(?:[^']|'')*'|[{}=]|[^\s{}=']+")


class Entry:
    """A value below HKEY_LOCAL_MACHINE, or a key that must exist (`name` and `data` are None).

    `name` is "" for the default value; `data` is a string or a number. If `owned`, removing the server deletes the key
    with everything in it, including entries of other programs.
    """

    def __init__(self, key, name=None, data=None, owned=False):
        self.key, self.name, self.data, self.owned = key, name, data, owned

    def place(self):
        """Returns a value that is equal for two entries if the later one replaces the earlier one."""
        return self.key.lower(), None if self.name is None else self.name.lower()


def read_script(text, replacements):
    """Returns the entries of one script, in its order."""
    for name, value in replacements.items():
        text = text.replace(f"%{name}%", value.replace("'", "''"))
    tokens = _TOKEN.findall(text)[::-1]
    entries = []
    while tokens:
        _read_block(_ROOTS[tokens.pop()], tokens, entries)
    return entries


def _read_block(key, tokens, entries):
    """Appends the values and keys in the braces after `key` to `entries`."""
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
    """Returns a pair for each entry that registering writes: its file-name extension, or "" if all share it, and the
    entry.

    The last of several entries for the same place wins, as in the registry. A key without a mark and without values of
    its own is not listed, because it is created and deleted with its contents.
    """
    placed = {}
    for script in REGISTERED_SCRIPTS:
        for entry in read_script((folder / f"{script}.rgs").read_text("ascii"), replacements):
            in_key = re.search(r"\\\.([a-z]+)(\\|$)", entry.key)
            extension = in_key[1] if in_key else "" if script in ("module", "shell_ext") else script
            placed[entry.place()] = (extension, entry)
    return list(placed.values())
