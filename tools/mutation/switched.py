"""Writes a source with all its mutants in it, each behind a switch of its own: one build serves them all."""

# The whole warns of nothing that its broken halves do.
IGNORED = ("conversion", "sign-compare", "parentheses", "shadow", "unused-value", "unused-variable", "bool-compare",
           "unused-but-set-variable", "bool-operation", "int-in-bool-context", "narrowing", "extra", "empty-body",
           "maybe-uninitialized", "pedantic", "return-type", "array-bounds", "stringop-overflow", "nonnull", "logical-op",
           "unused-result", "type-limits", "tautological-compare", "div-by-zero", "address", "float-conversion",
           "unused-const-variable", "unused-parameter", "unused-function", "stringop-overread", "dangling-reference")


def withSwitches(source, mutants, header):
    """The bytes of a source with these mutants. Its lines keep their numbers."""
    edits = [(edit, mutant) for mutant in mutants for edit in mutant.edits]
    words = {(word.start, word.end): word for mutant in mutants for word in mutant.words}
    edits += [(word, None) for word in words.values()]
    # Outer before inner; of two for the same place the statement's is the outer one.
    order = {"before": 0, "guard": 1, "instead": 2, "expression": 3, "capture": 4, "word": 5}
    edits.sort(key=lambda each: (each[0].start, -each[0].end, order[each[0].form]))
    body = rendered(source, 0, len(source), edits)
    pragmas = "".join(f'#pragma GCC diagnostic ignored "-W{name}"\n' for name in ("pragmas",) + IGNORED)
    return f'{pragmas}#include "{header}"\n#line 1\n'.encode() + body


def rendered(source, start, end, edits):
    pieces, at = [], start
    while edits:
        edit, mutant = edits[0]
        inner = [each for each in edits[1:] if each[0].start < edit.end and each[0].end <= edit.end]
        pieces.append(source[at:edit.start])
        pieces.append(wrapped(edit, mutant, rendered(source, edit.start, edit.end, inner)))
        edits = [each for each in edits[1:] if each not in inner]
        at = edit.end
        # Two that cross are none that the compiler's tree knows; the later one is left out.
        edits = [each for each in edits if each[0].start >= at]
    pieces.append(source[at:end])
    return b"".join(pieces)


def wrapped(edit, mutant, whole):
    if edit.form == "word":
        return edit.text.encode()
    switch, broken = f"mutation::isOn({mutant.number})".encode(), edit.text.encode()
    if edit.form == "expression":
        return b"(" + switch + b" ? (" + broken + b") : (" + whole + b"))"
    if edit.form == "guard":
        return b"{ if (!" + switch + b") { " + whole + b" } }"
    if edit.form == "instead":
        return b"{ if (" + switch + b") { " + broken + b" } else { " + whole + b" } }"
    if edit.form == "before":
        return b"{ if (" + switch + b") { " + broken + b" } } " + whole
    return f", heldBy{mutant.number} = mutation::held({mutant.number}, {edit.text})".encode()
