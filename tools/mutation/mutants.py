"""Finds what can be broken in a C++ source, one place at a time, with the compiler's own view of it (libclang)."""

import os
import re
from dataclasses import dataclass, field

from clang.cindex import CursorKind, Index, TranslationUnit

OPERATORS = {"==": "!=", "!=": "==", "<": "<=", "<=": "<", ">": ">=", ">=": ">", "&&": "||", "||": "&&",
             "+": "-", "-": "+", "*": "/", "/": "*"}
HOPS = ("post", "postAfter")
LARGE = 1e6  # one more would change nothing

BODIES = (CursorKind.COMPOUND_STMT, CursorKind.CASE_STMT, CursorKind.DEFAULT_STMT, CursorKind.IF_STMT,
          CursorKind.FOR_STMT, CursorKind.CXX_FOR_RANGE_STMT, CursorKind.WHILE_STMT, CursorKind.DO_STMT)
CALLS = (CursorKind.CALL_EXPR, CursorKind.COMPOUND_ASSIGNMENT_OPERATOR, CursorKind.BINARY_OPERATOR,
         CursorKind.UNARY_OPERATOR, CursorKind.UNEXPOSED_EXPR)


@dataclass
class Edit:
    """A change of the bytes from start to end. `form` is how the broken and the whole are told apart at run time:
    expression, guard (nothing in its place), instead (of a statement), before (a statement is put before it),
    capture (of a lambda, at `start`), and word (for both alike)."""
    start: int
    end: int
    form: str
    text: str = ""


@dataclass
class Mutant:
    kind: str
    line: int
    text: str  # what is broken, for people
    edits: list
    path: str = ""
    number: int = -1
    words: list = field(default_factory=list)


class Source:
    """The cursors of one translation unit that stand in one of its files."""

    def __init__(self, path, arguments, main):
        self.path, self.files = path, {}
        with open(path, "rb") as file:
            self.bytes = file.read()
        unit = Index.create().parse(main, args=arguments, options=TranslationUnit.PARSE_NONE)
        self.mutants = []
        self.seen = set()
        for cursor in unit.cursor.get_children():
            if self.isHere(cursor.location):
                self.visit(cursor, [])

    def isHere(self, location):
        """Headers are found through links."""
        name = location.file.name if location.file else None
        if name not in self.files:
            self.files[name] = name is not None and os.path.realpath(name) == os.path.realpath(self.path)
        return self.files[name]

    def textOf(self, start, end):
        return self.bytes[start:end].decode()

    def rangeOf(self, cursor):
        """None for what a macro has made or what is not of this file."""
        extent = cursor.extent
        if not self.isHere(extent.start) or not self.isHere(extent.end):
            return None
        start, end = extent.start.offset, extent.end.offset
        return (start, end) if start < end else None

    def add(self, kind, what, edits, words=()):
        start = edits[0].start
        key = (kind, start, edits[0].end, edits[0].text)
        if key in self.seen:
            return
        self.seen.add(key)
        line = self.bytes.count(b"\n", 0, start) + 1
        self.mutants.append(Mutant(kind, line, oneLine(what)[:100], edits, self.path, -1, list(words)))

    def visit(self, cursor, ancestors):
        kind = cursor.kind
        if kind in (CursorKind.STATIC_ASSERT, CursorKind.ENUM_CONSTANT_DECL, CursorKind.FRIEND_DECL):
            return
        if kind in BODIES:
            self.statements(cursor)
        if kind in (CursorKind.IF_STMT, CursorKind.CONDITIONAL_OPERATOR):
            self.condition(cursor)
        elif kind in (CursorKind.BINARY_OPERATOR, CursorKind.CALL_EXPR):
            self.operator(cursor)
        elif kind in (CursorKind.INTEGER_LITERAL, CursorKind.FLOATING_LITERAL, CursorKind.CXX_BOOL_LITERAL_EXPR):
            self.constant(cursor, ancestors)
        elif kind == CursorKind.LAMBDA_EXPR:
            self.captures(cursor)
        ancestors.append(cursor)
        for child in cursor.get_children():
            self.visit(child, ancestors)
        ancestors.pop()

    def statementRange(self, cursor):
        """Of an expression that stands as a statement, with its semicolon."""
        place = self.rangeOf(cursor)
        if cursor.kind not in CALLS or not place:
            return None
        if "::" in self.textOf(*place).split("(")[0] and doesNothing(callOf(cursor)):
            return None
        match = re.compile(rb"\s*;").match(self.bytes, place[1])
        text = self.textOf(*place)
        # What only says which thread we are on is no more than an assertion.
        if not match or text.startswith("static_cast<void>") or re.match(r"(?:\w+(?:\.|->))?assert(?:Here)?\(", text):
            return None
        if cursor.kind == CursorKind.BINARY_OPERATOR and not re.search(r"[^=!<>]=[^=]", text):
            return None
        return place[0], match.end()

    def statements(self, parent):
        children = list(parent.get_children())
        places = [self.statementRange(child) for child in children]
        for child, place in zip(children, places):
            if not place:
                continue
            text = self.textOf(*place)
            self.add("removed", text, [Edit(*place, "guard")])
            call = callOf(child)
            if call is not None and call.spelling in HOPS:
                arguments = list(call.get_arguments())
                work = self.rangeOf(arguments[-1]) if arguments else None
                if work:
                    self.add("without the hop", text, [Edit(*place, "instead", f"({oneLine(self.textOf(*work))})();")])
        if parent.kind != CursorKind.COMPOUND_STMT:
            return
        for (first, second) in zip(places, places[1:]):
            if first and second and not commute(self.textOf(*first), self.textOf(*second)):
                later = oneLine(self.textOf(*second))
                self.add("swapped", f"{oneLine(self.textOf(*first))} {later}",
                         [Edit(*first, "before", later), Edit(*second, "guard")])

    def condition(self, cursor):
        children = list(cursor.get_children())
        whole = self.rangeOf(cursor)
        if not whole:
            return
        if cursor.kind == CursorKind.CONDITIONAL_OPERATOR:
            place = self.rangeOf(children[0])
        else:
            opening = self.bytes.find(b"(", whole[0])
            closing = matching(self.bytes, opening)
            inside = [place for place in map(self.rangeOf, children) if place and place[1] <= closing]
            place = inside[-1] if inside else None
            # Not of a declaration: what it names is not there then, and every test dies of it.
            if place and (self.bytes[place[1]:closing].strip()
                          or not re.search(rb"[(;]\s*$", self.bytes[opening:place[0]])):
                return
        if place:
            text = self.textOf(*place)
            self.add("negated", text, [Edit(*place, "expression", f"!({oneLine(text)})")])

    def operator(self, cursor):
        children = list(cursor.get_children())
        place = self.rangeOf(cursor)
        if not place:
            return
        if cursor.kind == CursorKind.CALL_EXPR:
            if not cursor.spelling.startswith("operator") or cursor.spelling[8:] not in OPERATORS:
                return
            # Texts are joined, never taken from each other: such a break would only take its line's others along.
            if re.search(r"basic_string|QString|QStringBuilder|filesystem::path", cursor.type.get_canonical().spelling):
                return
            sides = [child for child in children if self.rangeOf(child)
                     and self.textOf(*self.rangeOf(child)) != cursor.spelling[8:]]
        else:
            sides = children
        if len(sides) != 2 or not self.rangeOf(sides[0]) or not self.rangeOf(sides[1]):
            return
        sides.sort(key=lambda side: self.rangeOf(side)[0])
        between = (self.rangeOf(sides[0])[1], self.rangeOf(sides[1])[0])
        sign = self.textOf(*between).strip()
        if sign not in OPERATORS:
            return
        broken = (self.textOf(place[0], between[0]) + f" {OPERATORS[sign]} " + self.textOf(between[1], place[1]))
        self.add(f"{sign} to {OPERATORS[sign]}", self.textOf(*place), [Edit(*place, "expression", oneLine(broken))])

    def constant(self, cursor, ancestors):
        place = self.rangeOf(cursor)
        if not place:
            return
        text = self.textOf(*place)
        if cursor.kind == CursorKind.CXX_BOOL_LITERAL_EXPR:
            if text not in ("true", "false"):
                return
            broken = "false" if text == "true" else "true"
        elif not re.fullmatch(r"[0-9][0-9a-fA-FxX.'uUlLfF]*|[0-9.]+e[0-9+-]+", text):
            return
        else:
            try:
                isLarge = float(text.replace("'", "").rstrip("uUlLfF")) >= LARGE
            except ValueError:
                isLarge = False  # hexadecimal
            broken = f"{text} * 2" if isLarge else f"{text} + 1"
        declared = [each for each in ancestors
                    if each.kind in (CursorKind.VAR_DECL, CursorKind.FIELD_DECL, CursorKind.PARM_DECL)]
        # How long an answer is waited for at most: who noticed one more would have waited as long.
        if declared and re.search(r"limit", declared[-1].spelling, re.I) and re.search(
                r"chrono|seconds", self.textOf(*(self.rangeOf(declared[-1]) or place)), re.I):
            return
        words = []
        if declared and self.rangeOf(declared[-1]):
            # A constant that may be another one is none to the compiler.
            start = self.bytes.rfind(b"\n", 0, self.rangeOf(declared[-1])[0]) + 1
            head = self.textOf(start, place[0])
            at = re.search(r"\bconstexpr\b", head)
            if at:
                isMember = declared[-1].semantic_parent.kind in (CursorKind.CLASS_DECL, CursorKind.STRUCT_DECL)
                words = [Edit(start + at.start(), start + at.end(), "word", "inline const" if isMember else "const")]
        self.add("constant", text + "  in  " + self.lineAt(place[0]), [Edit(*place, "expression", broken)], words)

    def captures(self, cursor):
        place = self.rangeOf(cursor)
        if not place or self.bytes[place[0]:place[0] + 1] != b"[":
            return
        closing = matching(self.bytes, place[0])
        for capture in splitAtCommas(self.textOf(place[0] + 1, closing)):
            name, _, value = (part.strip() for part in capture.partition("="))
            if "weak" in name.lower():
                self.add("held strongly", capture.strip(), [Edit(closing, closing, "capture", oneLine(value or name))])

    def lineAt(self, offset):
        start = self.bytes.rfind(b"\n", 0, offset) + 1
        return self.textOf(start, self.bytes.find(b"\n", offset)).strip()


def callOf(cursor):
    while cursor.kind == CursorKind.UNEXPOSED_EXPR:
        children = list(cursor.get_children())
        if len(children) != 1:
            return None
        cursor = children[0]
    return cursor if cursor.kind == CursorKind.CALL_EXPR else None


# What only puts a value into a place: m_style = style; button->setAlpha(0.0); names.push_back(…) is none.
PLAIN = re.compile(r"(?:[\w.>:\-]|\(\))*(?:\b_?(?:set|add|insert|sizeToFit|connect)\w*\(.*\)| = [^=].*"
                   r"|qDBusRegisterMetaType<.*>\(\));", re.S)


def commute(first, second):
    """Whether these statements can as well stand the other way round: both put values into places of their own."""
    if not PLAIN.fullmatch(first) or not PLAIN.fullmatch(second):
        return False
    one, other = (placeOf(text) for text in (first, second))
    # What is added to one thing is added in an order; but of handlers, each has events of its own.
    return one != other or bool(re.search(r"addTarget|\bconnect\(|RegisterMetaType", first + second)
                                or re.search(r"\b_?set\w*$", one))


def placeOf(text):
    """What a plain statement puts a value into: m_style, avTrimmer()->setDelegate; of what is added, the whole thing."""
    place = re.match(r"((?:[\w.>:\-]|\(\)(?=->|\.))*)", text).group(1)
    isWhole = text[len(place):].startswith(" = ") or re.search(r"\b_?set\w*$", place)
    return place if isWhole else re.sub(r"(->|\.)\w+$", "", place)


def doesNothing(call):
    """Whether it is seen here that the called function has an empty body: a base class's call that is there to be
    overridden."""
    target = call.referenced.get_definition() if call is not None and call.referenced else None
    if target is None or target.kind != CursorKind.CXX_METHOD:
        return False
    bodies = [child for child in target.get_children() if child.kind == CursorKind.COMPOUND_STMT]
    return len(bodies) == 1 and not list(bodies[0].get_children())


def oneLine(text):
    """Without comments, so that lines keep their numbers."""
    text = re.sub(r'("(?:\\.|[^"\\])*")|//[^\n]*', lambda match: match.group(1) or "", text)
    return re.sub(r"\s*\n\s*", " ", text)


def matching(text, opening):
    """Where the bracket at `opening` is closed; strings and characters are stepped over."""
    pairs = {ord("("): ord(")"), ord("["): ord("]"), ord("{"): ord("}")}
    stack, at = [], opening
    while at < len(text):
        byte = text[at]
        if byte in b"\"'" and not (byte == ord("'") and text[at - 1:at].isalnum()):
            at += 1
            while text[at] != byte:
                at += 2 if text[at] == ord("\\") else 1
        elif byte in pairs:
            stack.append(pairs[byte])
        elif stack and byte == stack[-1]:
            stack.pop()
            if not stack:
                return at
        at += 1
    return len(text)


def splitAtCommas(text):
    parts, depth, start = [], 0, 0
    for at, letter in enumerate(text):
        depth += (letter in "([{<") - (letter in ")]}>" and text[at - 1:at] != "-")
        if letter == "," and depth == 0:
            parts.append(text[start:at])
            start = at + 1
    return parts + [text[start:]]
