"""Breaks the code one place at a time and names what no test notices; started by tools/mutate."""

import argparse
import json
import os
import random
import re
import shlex
import sys
import time
from concurrent.futures import ThreadPoolExecutor, as_completed

import mutants
import suites
import switched

FOLDERS = ("editor", "extension", "overlay", "support", "publishing", "linux/photos", "linux/posix", "linux/xdg",
           "linux/dbus", "app/host")
ROUNDS = 12  # of building without what does not compile


def say(text):
    print(text, file=sys.stderr, flush=True)


def sourcesOf(top, folders):
    for folder in folders:
        for at, _, names in sorted(os.walk(os.path.join(top, "src", folder))):
            yield from (os.path.join(at, name) for name in sorted(names) if name.endswith((".h", ".cpp")))


def argumentsOf(command):
    """What the parser needs of a line of compile_commands.json."""
    words = shlex.split(command)
    words = words[next(i for i, word in enumerate(words) if re.search(r"(g\+\+|clang\+\+|c\+\+)$", word)) + 1:]
    kept, step = [], iter(words)
    for word in step:
        if word == "-o":
            next(step)
        elif word in ("-isystem", "-include"):
            kept += [word, next(step)]
        elif word.startswith(("-I", "-D", "-std", "-isystem")):
            kept.append(word)
    return kept


def findMutants(top, folders, only):
    with open(os.path.join(top, "build/dev/compile_commands.json")) as file:
        commands = {each["file"]: each["command"] for each in json.load(file)}
    found = []
    for path in sourcesOf(top, folders):
        name = os.path.relpath(path, top)
        if not re.search(only, name):
            continue
        # A header is read as part of the source beside it, or of any in its folder.
        main = path if path.endswith(".cpp") else path[:-2] + ".cpp"
        if main not in commands:
            near = [each for each in commands if each.startswith(os.path.dirname(path) + "/")]
            if not near:
                say(f"{name} is left out: nothing beside it is compiled")
                continue
            main = near[0]
        source = mutants.Source(path, argumentsOf(commands[main]) + (["-x", "c++"] if main == path else []), main)
        found += source.mutants
    return found


def broken(output, tree, byPath):
    """The mutants that the compiler complains of."""
    gone = []
    for kind in ("error", "note"):
        for path, line in re.findall(rf"^([^\s:]+):(\d+):\d+: (?:fatal )?{kind}:", output, re.M):
            name = os.path.relpath(os.path.realpath(os.path.join(tree, "build/dev", path)), os.path.realpath(tree))
            here = [each for each in byPath.get(name, []) if each.line == int(line)]
            gone += here or nearest(byPath.get(name, []), int(line)) if kind == "error" else here
        if gone:
            break
    return {each.number for each in gone}


def nearest(found, line):
    """Whose broken half begins above: a statement of several lines."""
    above = [each for each in found if each.line < line]
    last = max((each.line for each in above), default=0)
    return [each for each in above if each.line == last and line - last < 12]


def build(top, tree, runner, found):
    """Writes and builds until all compiles. Gives the mutants that do."""
    header = os.path.join(top, "tools/mutation/switch.h")
    touched = set()
    for turn in range(ROUNDS):
        byPath = {}
        for each in found:
            byPath.setdefault(os.path.relpath(each.path, top), []).append(each)
        for name in touched | set(byPath):
            with open(os.path.join(top, name), "rb") as file:
                source = file.read()
            text = switched.withSwitches(source, byPath[name], header) if name in byPath else source
            writeIfOther(os.path.join(tree, name), text)
        touched |= set(byPath)
        say(f"Building with {len(found)} mutants…")
        output = runner.compile()
        if not output:
            return found
        gone = broken(output, tree, byPath)
        if not gone:
            sys.exit(output[-4000:] + "\nmutate: this does not build, and no mutant is near")
        found = [each for each in found if each.number not in gone]
    sys.exit(output[-4000:] + "\nmutate: this does not build after many attempts")


def writeIfOther(path, text):
    if os.path.exists(path):
        with open(path, "rb") as file:
            if file.read() == text:
                return
    with open(path, "wb") as file:
        file.write(text)


def parse():
    parser = argparse.ArgumentParser(prog="tools/mutate", description=__doc__)
    parser.add_argument("folders", nargs="*", metavar="FOLDER", help="below src/ (those without a window or an engine)")
    parser.add_argument("--only", default="", metavar="EXPRESSION", help="sources whose path has this")
    parser.add_argument("--tests", default="", metavar="EXPRESSION", help="tests whose name has this")
    parser.add_argument("--suites", default="", metavar="EXPRESSION", help="suites whose folder has this")
    parser.add_argument("--again", metavar="FILE", help="those that FILE names, as an earlier run printed them")
    parser.add_argument("--sample", type=int, metavar="N", help="so many of the mutants, by chance")
    parser.add_argument("--seed", type=int, default=1)
    parser.add_argument("--jobs", type=int, default=os.cpu_count())
    parser.add_argument("--list", action="store_true", help="name the mutants, and run nothing")
    parser.add_argument("--top", required=True, help=argparse.SUPPRESS)
    arguments = parser.parse_args()
    arguments.folders = [re.sub(r"^(\./)?src/|/$", "", each) for each in arguments.folders or FOLDERS]
    for folder in arguments.folders:
        if not os.path.isdir(os.path.join(arguments.top, "src", folder)):
            parser.error(f"there is no src/{folder}")
    return arguments


def main():
    arguments = parse()
    top, begin = arguments.top, time.monotonic()
    found = findMutants(top, arguments.folders, arguments.only)
    if arguments.again:
        with open(arguments.again) as file:
            named = {withoutLine(line) for line in file}
        found = [each for each in found if withoutLine(describe(each, top)) in named]
    if arguments.sample and arguments.sample < len(found):
        found = random.Random(arguments.seed).sample(found, arguments.sample)
    found.sort(key=lambda each: (each.path, each.line))
    for number, each in enumerate(found):
        each.number = number
    if arguments.list:
        for each in found:
            print(describe(each, top))
        return 0
    count = len(found)
    tree = os.path.join(top, "build/mutate")
    suites.copyTree(top, tree)
    chosen = [each for each in suites.suitesThatLink(top, arguments.folders) if re.search(arguments.suites, each)]
    runner = suites.Runner(tree, os.path.join(top, "build/dev/test-movies"), chosen, arguments.jobs)
    if not runner.expectConfined():
        sys.exit("mutate: a broken program could remove anything, and cannot be kept from it here: namespaces are needed")
    found = build(top, tree, runner, found)
    runner.findTests()
    say("Running each test by itself…")
    for name in runner.measure(count, arguments.tests):
        say(f"{name} fails, or takes too long, by itself: it is not used")
    return judge(found, count, runner, top, arguments.jobs, begin)


def judge(found, count, runner, top, jobs, begin):
    say(f"Running the tests of {len(found)} mutants ({count - len(found)} do not compile)…")
    survivors, done = [], 0
    with ThreadPoolExecutor(jobs) as pool:
        running = {pool.submit(runner.notices, each): each for each in found}
        for each in as_completed(running):
            done += 1
            if not each.result():
                survivors.append((running[each], each.result()))
                say(describe(running[each], top))  # at once: the rest can take long
            if done % 100 == 0:
                say(f"{done} of {len(found)}, {len(survivors)} survive")
    survivors.sort(key=lambda each: (each[0].path, each[0].line))
    for mutant, noticed in survivors:
        print(describe(mutant, top) + ("  (no test reaches it)" if noticed is None else ""))
    killed = len(found) - len(survivors)
    print(f"{killed} of {len(found)} mutants are noticed, {100 * killed / max(1, len(found)):.1f} %; "
          f"{count - len(found)} do not compile; {(time.monotonic() - begin) / 60:.0f} min")
    return 0 if not survivors else 1


def describe(mutant, top):
    return f"{os.path.relpath(mutant.path, top)}:{mutant.line}: {mutant.kind}: {mutant.text}"


def withoutLine(description):
    """Lines move between two runs."""
    return re.sub(r":\d+:", ":", description, count=1).split("  (no test")[0].strip()


if __name__ == "__main__":
    sys.exit(main())
