"""Checks the tables of words in resources/bundles; started by tools/lint.

Of each table all languages have the same keys, and of each text the same places. No text is empty, all is UTF-8. Every key of
the program's own table stands in the sources, and every key that the sources ask for is there."""

import os
import re
import sys

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
BUNDLES = os.path.join(TOP, "resources/bundles")
MASTER = "en"
ENTRY = re.compile(r'\s*(?:/\*.*?\*/|//[^\n]*)|\s*"((?:[^"\\]|\\.)*)"\s*=\s*"((?:[^"\\]|\\.)*)"\s*;', re.S)
said = []


def complain(path, text):
    said.append(f"{os.path.relpath(path, TOP)}: {text}")


def tableAt(path):
    """Keys and texts; what is not understood is complained of."""
    try:
        with open(path, encoding="utf-8") as file:
            text = file.read()
    except UnicodeDecodeError as error:
        complain(path, f"this is not UTF-8 ({error})")
        return {}
    table, at = {}, 0
    while text[at:].strip():
        entry = ENTRY.match(text, at)
        if not entry:
            complain(path, f"line {text.count(chr(10), 0, at) + 1}: this is neither an entry nor a comment")
            break
        at = entry.end()
        key, value = entry.groups()
        if key is None:
            continue
        if key in table:
            complain(path, f"{key} comes twice")
        if not value.strip():
            complain(path, f"{key} has no text")
        table[key] = value
    return table


def plain(text):
    """Without the backslashes that tables need."""
    return re.sub(r"\\(.)", lambda found: {"n": "\n", "t": "\t"}.get(found[1], found[1]), text)


def placesOf(text):
    """What is filled in: names in braces of the message itself, and %@ in their order."""
    places, depth, start = set(), 0, 0
    for at, letter in enumerate(text):
        if letter == "{":
            depth += 1
            start = at if depth == 1 else start
        elif letter == "}":
            depth -= 1
            if depth == 0:
                name, _, form = text[start + 1:at].partition(",")
                kind = form.strip().split(",")[0].strip()
                places.add((name.strip(), kind))
                if kind in ("plural", "select") and not re.search(r"\bother\s*\{", form):
                    places.add((name.strip(), "without other"))
    if depth != 0:
        places.add(("braces", "not closed"))
    plain = [number or str(index + 1) for index, number in enumerate(re.findall(r"%(?:(\d+)\$)?@", text))]
    return places | {("%", each) for each in plain}


def checkLanguages(bundle):
    languages = sorted(name[:-6] for name in os.listdir(bundle) if name.endswith(".lproj"))
    if MASTER not in languages:
        complain(bundle, "there are no English words")
        return
    folder = lambda language: os.path.join(bundle, language + ".lproj")
    for name in sorted(os.listdir(folder(MASTER))):
        master = tableAt(os.path.join(folder(MASTER), name))
        for language in languages:
            path = os.path.join(folder(language), name)
            if not os.path.exists(path):
                complain(path, "this table is missing")
                continue
            table = tableAt(path)
            for key in master.keys() - table.keys():
                complain(path, f"{key} is missing")
            for key in table.keys() - master.keys():
                complain(path, f"{key} is not in the English table")
            for key in master.keys() & table.keys():
                if placesOf(master[key]) != placesOf(table[key]):
                    complain(path, f"{key} has other places than the English text")
    for language in languages:
        for name in set(os.listdir(folder(language))) - set(os.listdir(folder(MASTER))):
            complain(os.path.join(folder(language), name), "this table is not in English")
    return languages


def checkUse(bundle):
    table = tableAt(os.path.join(bundle, MASTER + ".lproj", "Localizable.strings"))
    sources = ""
    for at, _, names in os.walk(os.path.join(TOP, "src")):
        for name in names:
            if name.endswith((".h", ".cpp")):
                with open(os.path.join(at, name), encoding="utf-8") as file:
                    sources += file.read()
    for key in table:
        if f'"{key}"' not in sources:
            complain(bundle, f"nobody says {key}")
    for key in re.findall(r'\bwords(?:\(\))?(?:\.|->)text\(\s*"(\w+)"', sources):
        if key not in table:
            complain(bundle, f"{key} has no words")


def main():
    languages = None
    for at, folders, _ in os.walk(BUNDLES):
        if any(each.endswith(".lproj") for each in folders):
            known = checkLanguages(at)
            if languages is not None and known != languages:
                complain(at, f"its languages are {known}, and not {languages}")
            languages = languages or known
    checkUse(os.path.join(BUNDLES, "Clipsa.bundle"))
    print("\n".join(said))
    return 1 if said else 0


if __name__ == "__main__":
    sys.exit(main())
