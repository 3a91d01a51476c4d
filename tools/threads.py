"""Names the headers that promise one thread and do not assert it: threads.py FOLDER.

A header promises one when a sentence of its opening comment begins with it ("GUI thread.", "One thread at a time.", "Main
queue only, but for …") or says what is on it ("Lives on one thread, whose …", "Made, used and ended on the GUI thread.").
What keeps nothing (no member) has nothing to assert. The assertion may stand in the header, or in a source that is named
as the header or as one of its classes.
"""
import pathlib
import re
import sys

ONE = r"(?:main queue|main thread|GUI thread|one thread)"
PROMISE = re.compile(rf"(?:^|[.;:] +)(?:{ONE}(?: only| at a time)?(?:[.,;:]|$)|(?:Lives|Made|Set up)\b[^.;]* on (?:the )?{ONE})", re.I)
MEMBER = re.compile(r"\bm_\w+\b")
ASSERTION = re.compile(r"\b(?:assertHere|here)\(")


def opening(text):
    lines = []
    for line in text.splitlines():
        if not line.startswith("///"):
            break
        lines.append(line[3:].strip())
    return " ".join(lines)


def asserts(header, code):
    names = [header.stem, *re.findall(r"\bclass (?:[A-Z_]+ )?(\w+)", code)]
    sources = [header, *(source for name in names for source in header.parent.glob(f"{name}*.cpp"))]
    return any(ASSERTION.search(source.read_text()) for source in sources)


silent = []
for header in sorted(pathlib.Path(sys.argv[1]).rglob("*.h")):
    text = header.read_text()
    code = re.sub(r"//.*", "", text)
    if PROMISE.search(opening(text)) and MEMBER.search(code) and not asserts(header, code):
        silent.append(str(header))
if silent:
    sys.exit("\n".join(silent))
