"""Runs clang-tidy on the named sources and says what it finds; started by tools/lint --tidy.

What passed is remembered in build/dev/tidy, by the contents of the source, of all of our headers that it includes, and of
what configures the check: so a second run costs nothing."""

import argparse
import hashlib
import json
import os
import re
import subprocess
import sys
import time
from concurrent.futures import ThreadPoolExecutor
from functools import lru_cache

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
BUILD = os.path.join(TOP, "build/dev")
PASSED = os.path.join(BUILD, "tidy")


def commandsBySource():
    with open(os.path.join(BUILD, "compile_commands.json")) as file:
        return {os.path.relpath(each["file"], TOP): each for each in json.load(file)}


def headersByObject():
    """What ninja learned from the compiler: of each object, the files of ours that it is made of."""
    log = subprocess.run(["ninja", "-C", BUILD, "-t", "deps"], capture_output=True, text=True, check=True).stdout
    found = {}
    for block in log.split("\n\n"):
        lines = block.splitlines()
        if lines and "(VALID)" in lines[0]:
            paths = (os.path.normpath(os.path.join(BUILD, line.strip())) for line in lines[1:])
            found[lines[0].split(":")[0]] = sorted(each for each in paths if each.startswith(TOP + os.sep))
    return found


@lru_cache(maxsize=None)
def hashOf(path):
    if not os.path.exists(path):
        return b""
    with open(path, "rb") as file:
        return hashlib.sha256(file.read()).digest()


def contentsOf(stamp):
    with open(stamp) as file:
        return file.read()


def remember(stamp, digest):
    if digest is not None:
        os.makedirs(os.path.dirname(stamp), exist_ok=True)
        with open(stamp, "w") as file:
            file.write(digest)


def configuration():
    version = subprocess.run(["clang-tidy", "--version"], capture_output=True, check=True).stdout
    files = sorted(os.path.join(at, ".clang-tidy") for at in (TOP, os.path.join(TOP, "tests"), os.path.join(TOP, "benches")))
    return hashlib.sha256(version + b"".join(hashOf(each) for each in files))


def digestOf(command, headers, base):
    digest = base.copy()
    digest.update(command["command"].encode())
    for each in [command["file"], *headers]:
        digest.update(each.encode() + hashOf(each))
    return digest.hexdigest()


def findings(source):
    """The lines that clang-tidy says about a source, or what kept it from reading it."""
    run = subprocess.run(["clang-tidy", "-quiet", "-p", BUILD, os.path.join(TOP, source)], capture_output=True, text=True)
    return run.stdout if run.stdout.strip() or run.returncode == 0 else run.stderr


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("--minutes", type=float, default=float("inf"), help="begin with no source after so long")
    parser.add_argument("sources", nargs="*")
    arguments = parser.parse_args()
    until = time.monotonic() + arguments.minutes * 60

    commands, headers, base = commandsBySource(), headersByObject(), configuration()
    for unknown in (each for each in arguments.sources if each not in commands):
        print(f"{unknown} is not compiled, so it is left out", file=sys.stderr)
    todo = []
    for source in (each for each in arguments.sources if each in commands):
        command = commands[source]
        known = headers.get(command.get("output") or re.search(r" -o (\S+)", command["command"])[1])
        digest = digestOf(command, known, base) if known is not None else None
        stamp = os.path.join(PASSED, source)
        if digest is None or not os.path.exists(stamp) or contentsOf(stamp) != digest:
            todo.append((source, stamp, digest))
    if todo:
        print(f"Checking {len(todo)} sources with clang-tidy…", file=sys.stderr, flush=True)

    said, late = set(), 0
    with ThreadPoolExecutor(os.cpu_count()) as pool:
        results = pool.map(lambda each: findings(each[0]) if time.monotonic() < until else None, todo)
        for (source, stamp, digest), text in zip(todo, results):
            if text is None:
                late += 1
            elif not text.strip():
                remember(stamp, digest)
            elif text not in said:  # a header's finding is said by each who includes it
                said.add(text)
                print(text.rstrip(), flush=True)
    if late:
        print(f"{late} sources were not reached in {arguments.minutes:g} minutes; the next run goes on with them", file=sys.stderr)
    return 1 if said else 0


if __name__ == "__main__":
    sys.exit(main())
