"""Builds the copy with the mutants in it, finds which tests reach which of them, and runs those."""

import os
import re
import shutil
import subprocess
import tempfile
import time
from concurrent.futures import ThreadPoolExecutor

CHUNKS = (1.0, 6.0, float("inf"))  # seconds: the quick tests come first, as the first failure ends
LONGEST = 60  # seconds: of a test that is run for each of its mutants
CONFINED = os.path.join(os.path.dirname(os.path.abspath(__file__)), "confined")


class Suite:
    def __init__(self, folder, program):
        self.folder, self.program = folder, program
        self.seconds = {}  # of each test


def suitesThatLink(top, folders):
    """The folders below tests/ whose program has the code of one of these layers in it, as the CMake files say."""
    links = {}
    with open(os.path.join(top, "src/CMakeLists.txt")) as file:
        text = file.read()
    app = os.path.join(top, "src/app/CMakeLists.txt")
    if os.path.exists(app):
        with open(app) as file:
            text += file.read()
    for name, rest in re.findall(r"^layer\(([\w/]+)([^)]*)\)", text, re.M):
        links[name] = linked(rest)

    def reach(names):
        todo, seen = list(names), set()
        while todo:
            name = todo.pop()
            if name not in seen:
                seen.add(name)
                todo += links.get(name, [])
        return seen

    with open(os.path.join(top, "tests/CMakeLists.txt")) as file:
        suites = re.findall(r"^suite\(([\w/]+)([^)]*)\)", file.read(), re.M)
    layers = {layer for layer in links for folder in folders if folder == layer or folder.startswith(layer + "/")}
    return [name for name, rest in suites if layers & reach(linked(rest))]


def linked(arguments):
    match = re.search(r"LINKS([\w/\s]*?)(?:LIBRARIES|TIMEOUT|$)", arguments)
    return match.group(1).split() if match else []


class Runner:
    """In `tree`, with the test movies of another build."""

    def __init__(self, tree, movies, suites, jobs):
        self.tree, self.movies, self.jobs = tree, movies, jobs
        self.build = os.path.join(tree, "build/dev")
        self.suites = [Suite(each, os.path.join(self.build, "bin", "tests-" + each.replace("/", "-"))) for each in suites]
        self.reached = {}  # of each test: the bytes

    def expectConfined(self):
        """A broken program is run only where it can harm nothing but what is its own."""
        with tempfile.TemporaryDirectory(prefix="clipsa-mutate.") as directory:
            seen = subprocess.run([CONFINED, directory, "sh", "-c", 'echo >/tmp/here; echo 2>&1 >"$0"', self.tree + "/mine"],
                                  capture_output=True).returncode
            return seen not in (0, 125) and os.path.exists(os.path.join(directory, "here"))

    def environment(self, home, **more):
        values = dict(os.environ, HOME=home, LC_ALL="C.UTF-8", TZ="UTC", QT_QPA_PLATFORM="offscreen",
                      QT_QUICK_BACKEND="software", XDG_RUNTIME_DIR=os.path.join(home, "runtime"), TMPDIR=home,
                      **{f"XDG_{name}_HOME": os.path.join(home, name.lower())
                         for name in ("CACHE", "CONFIG", "DATA", "STATE")}, **more)
        for name in ("DISPLAY", "WAYLAND_DISPLAY", "DBUS_SESSION_BUS_ADDRESS"):
            values.pop(name, None)
        return values

    def run(self, command, limit, files=None, reached=0, **more):
        """Gives the exit status and, of so many mutants, the bytes that tell which were reached; of a program that takes
        too long, None. It has a /tmp of its own, with `files` in it, and a home there."""
        with tempfile.TemporaryDirectory(prefix="clipsa-mutate.", ignore_cleanup_errors=True) as directory:
            os.makedirs(os.path.join(directory, "home/runtime"), 0o700)
            os.chmod(directory, 0o1777)
            for name, contents in (files or {}).items():
                with open(os.path.join(directory, name), "w") as file:
                    file.write(contents)
            if reached:
                more["CLIPSA_MUTANTS_REACHED"] = "/tmp/reached"
                with open(os.path.join(directory, "reached"), "wb") as file:
                    file.truncate(reached)
            # A session of its own, so that what it has started ends with it.
            process = subprocess.Popen([CONFINED, directory, *command], env=self.environment("/tmp/home", **more),
                                       start_new_session=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                                       stderr=subprocess.DEVNULL)
            try:
                status = process.wait(limit)
            except subprocess.TimeoutExpired:
                status = None
            finally:
                try:
                    os.killpg(process.pid, 9)
                except ProcessLookupError:
                    pass
                process.wait()
            if not reached:
                return status, b""
            with open(os.path.join(directory, "reached"), "rb") as file:
                return status, file.read()

    def compile(self):
        """Builds the suites. Gives what the compiler says, empty when all is well."""
        if not os.path.exists(os.path.join(self.build, "build.ninja")):
            subprocess.run(["cmake", "-S", self.tree, "--preset", "dev", "-DCLIPSA_TEST_MOVIES=" + self.movies],
                           check=True, stdout=subprocess.DEVNULL, cwd=self.tree)
        targets = [os.path.basename(suite.program) for suite in self.suites]
        done = subprocess.run(["ninja", "-C", self.build, "-k", "0", *targets], capture_output=True, text=True)
        return done.stdout + done.stderr if done.returncode else ""

    def findTests(self):
        for suite in self.suites:
            listed = subprocess.run([suite.program, "--gtest_list_tests"], capture_output=True, text=True, check=True,
                                    env=self.environment(self.tree)).stdout
            group = ""
            for line in listed.splitlines():
                name = line.split("#")[0].rstrip()
                if name.endswith(".") and not name.startswith(" "):
                    group = name
                elif name.startswith("  ") and group:
                    suite.seconds[group + name.strip()] = None

    def measure(self, count, chosen):
        """Runs each test whole, once: how long it takes, and which mutants it reaches. Gives those that fail by
        themselves, which are not used."""
        failing = []
        with ThreadPoolExecutor(self.jobs) as pool:
            tests = [(suite, test) for suite in self.suites for test in suite.seconds if re.search(chosen, test)]
            for (suite, test), (status, seconds, bytesOfIt) in zip(tests, pool.map(
                    lambda each: self.measured(*each, count), tests)):
                if status != 0:
                    failing.append(f"{suite.folder}: {test}")
                elif seconds <= LONGEST:
                    suite.seconds[test] = seconds
                    self.reached[suite.folder, test] = bytesOfIt
        return failing

    def measured(self, suite, test, count):
        begin = time.monotonic()
        status, reached = self.run([suite.program, "--gtest_filter=" + test], 300, reached=count)
        return status, time.monotonic() - begin, reached

    def reaching(self, mutant):
        return [(self.seconds(place), *place) for place, reached in self.reached.items() if reached[mutant.number]]

    def seconds(self, place):
        return next(suite.seconds[place[1]] for suite in self.suites if suite.folder == place[0])

    def notices(self, mutant):
        """Whether a test fails on it. None when no test reaches it."""
        tests = sorted(self.reaching(mutant))
        if not tests:
            return None
        total, chunks = 0.0, [[] for _ in CHUNKS]
        for test in tests:
            total += test[0]
            chunks[next(i for i, limit in enumerate(CHUNKS) if total <= limit)].append(test)
        for chunk in chunks:
            for suite in self.suites:
                mine = [test for test in chunk if test[1] == suite.folder]
                if mine and self.fails(suite, mine, mutant):
                    return True
        return False

    def fails(self, suite, tests, mutant):
        flags = "--gtest_fail_fast\n--gtest_filter=" + ":".join(test for _, _, test in tests) + "\n"
        limit = 10 + 4 * sum(seconds for seconds, _, _ in tests)
        return self.run([suite.program, "--gtest_flagfile=/tmp/flags"], limit, {"flags": flags},
                        CLIPSA_MUTANT=str(mutant.number))[0] != 0


def copyTree(top, tree):
    """What git knows of, and what is new; only what differs is written, so that the build does not begin anew."""
    names = subprocess.run(["git", "-C", top, "ls-files", "-co", "--exclude-standard", "-z"], capture_output=True,
                           check=True).stdout.decode().split("\0")
    names = {name for name in names if name and os.path.exists(os.path.join(top, name))}
    for name in names:
        source, target = os.path.join(top, name), os.path.join(tree, name)
        if not os.path.exists(target) or not sameFile(source, target):
            os.makedirs(os.path.dirname(target), exist_ok=True)
            shutil.copy2(source, target, follow_symlinks=False)
    for folder in ("src", "tests", "cmake", "plugins"):
        for at, _, files in os.walk(os.path.join(tree, folder)):
            for name in files:
                path = os.path.join(at, name)
                if os.path.relpath(path, tree) not in names:
                    os.remove(path)


def sameFile(one, other):
    with open(one, "rb") as first, open(other, "rb") as second:
        return first.read() == second.read()
