"""Fills the words of all languages into what a desktop and a software catalogue read of Clipsa: describe.py TEMPLATE OUTPUT

A line of the template that says @tag:KEY@ becomes a line for each language: `tag[de]=…` in a desktop entry,
`<tag xml:lang="de">…</tag>` in metainfo. Started by packaging/CMakeLists.txt."""

import os
import re
import sys
from xml.sax.saxutils import escape

import words

BUNDLE = os.path.join(words.BUNDLES, "Clipsa.bundle")
LINE = re.compile(r"^( *)@(\w+):(\w+)@\n", re.M)


def posixName(language):
    return {"zh-Hans": "zh_CN", "zh-Hant": "zh_TW"}.get(language, language.replace("-", "_"))


def textsOf(key):
    """By language; English, which has no name, first."""
    languages = sorted(name[:-6] for name in os.listdir(BUNDLE) if name.endswith(".lproj"))
    languages.sort(key=lambda each: each != words.MASTER)
    for language in languages:
        table = words.tableAt(os.path.join(BUNDLE, language + ".lproj", "Packaging.strings"))
        yield None if language == words.MASTER else posixName(language), words.plain(table[key])


def entryLine(indent, tag, language, text):
    return f"{indent}{tag}{f'[{language}]' if language else ''}={text}\n"


def elementLine(indent, tag, language, text):
    attribute = f' xml:lang="{language}"' if language else ""
    return f"{indent}<{tag}{attribute}>{escape(text)}</{tag}>\n"


def main():
    template, output = sys.argv[1:]
    lineOf = entryLine if ".desktop" in template else elementLine
    with open(template, encoding="utf-8") as file:
        text = file.read()
    text = LINE.sub(lambda found: "".join(lineOf(found[1], found[2], *each) for each in textsOf(found[3])), text)
    with open(output, "w", encoding="utf-8") as file:
        file.write(text)


if __name__ == "__main__":
    main()
