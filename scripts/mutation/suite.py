# SPDX-License-Identifier: Apache-2.0
"""The tests: which of them can notice a change of a file, in which order, and what they say."""
import json
import re
import subprocess
from pathlib import Path

from .copies import BUILD, TREE

# A test may take this many times as long as when it last passed, and this many seconds more.
PATIENCE = 3
EXTRA_SECONDS = 20
UNKNOWN_LIMIT = 300


class Test:
    """A test of ctest: the programs it runs, and how long it took."""

    def __init__(self, name, programs, reads_sources):
        self.name = name
        self.programs = programs
        self.reads_sources = reads_sources
        self.seconds = None
        self.proven = False

    def is_end_to_end(self):
        """Whether it runs the client itself."""
        return "zentw-info" in self.programs

    def limit(self):
        """Seconds after which it hangs."""
        return UNKNOWN_LIMIT if self.seconds is None else PATIENCE * self.seconds + EXTRA_SECONDS

    def run(self, copy):
        """"passed", "failed" or "timed out" in the copy. What fails has failed twice."""
        status, output = copy.run(["ctest", "--test-dir", str(BUILD), "-R", f"^{re.escape(self.name)}$", "--repeat",
                                   "until-pass:2"], 2 * self.limit())
        if status is None or "***Timeout" in output:
            return "timed out"
        if status != 0:
            return "failed"
        seconds = re.search(r"Total Test time \(real\) = +([\d.]+) sec", output)
        self.seconds = max(self.seconds or 0, float(seconds.group(1)))
        return "passed"


def _lines(*command):
    return subprocess.run(command, check=True, stdout=subprocess.PIPE, text=True).stdout.splitlines()


class Suite:
    """All tests of the build directory whose name matches."""

    def __init__(self, pattern):
        listed = json.loads("\n".join(_lines("ctest", "--test-dir", str(BUILD), "--show-only=json-v1")))
        programs = sorted((path for path in (BUILD / "bin").iterdir()), key=lambda path: -len(path.name))
        self.tests = []
        for test in listed["tests"]:
            words = " ".join(test.get("command", []))
            used = [path.name for path in programs if re.search(re.escape(str(path)) + r"\b", words)]
            labels = [one["value"] for one in test["properties"] if one["name"] == "LABELS"]
            reads_sources = ["reads_sources"] in labels
            if (used or reads_sources) and re.search(pattern, test["name"]):
                self.tests.append(Test(test["name"], used, reads_sources))
        self._read_inputs()
        self._sources = {path.name: self._linked(path) for path in programs}

    def _read_inputs(self):
        """Notes the files of the tree that each object was made from."""
        self._inputs = {}
        current = set()
        for line in _lines("ninja", "-C", str(BUILD), "-t", "deps"):
            if line.startswith(" "):
                path = (BUILD / line.strip()).resolve()
                if TREE in path.parents:
                    current.add(str(path.relative_to(TREE)))
            elif line:
                current = self._inputs.setdefault(line.split(": #deps")[0], set())

    @staticmethod
    def _linked(program):
        """Names of the sources whose objects the linker took into the program."""
        return {line.split()[-1] for line in _lines("nm", "-a", str(program)) if line.endswith(".cpp")}

    def knowing(self, file):
        """The tests that have something of the file in them: first those whose own source includes its header, then
        the others, then those that run the client; of each the quick ones first. What only reads the sources comes
        last, since a fault has compiled by then."""
        objects = [name for name, inputs in self._inputs.items() if file in inputs]
        sources = {Path(name).name[:-len(".o")] for name in objects} - {"mocs_compilation.cpp"}
        header = str(Path(file).with_suffix(".h"))
        near = {match.group(1) for name, inputs in self._inputs.items() if header in inputs or file in inputs
                for match in [re.search(r"/(test_\w+|fuzzreplay)\.dir/", name)] if match}

        def rank(test):
            return (test.reads_sources, test.is_end_to_end(), not near.intersection(test.programs), test.seconds or 0)
        knowing = [test for test in self.tests
                   if test.reads_sources or any(sources & self._sources[name] for name in test.programs)]
        return sorted(knowing, key=rank)

    def drop(self, test):
        """Leaves a test out that fails without any fault."""
        if test in self.tests:
            self.tests.remove(test)


def judge(suite, copy, fault, content):
    """What the tests say of the fault, in a copy as it was: ("killed", test), ("timed out", test), ("survived", None)
    or ("broken", None) when it does not compile."""
    while True:
        copy.write(fault.file, fault.apply(content))
        try:
            word, test = _run_tests(suite, copy, fault)
        finally:
            copy.restore(fault.file)
        if word != "killed" or test.proven:
            return word, test
        # A test counts once it has passed without a fault.
        test.proven = test.run(copy) == "passed"
        if test.proven:
            return word, test
        print(f"mutate: {test.name} fails without any fault and is left out", flush=True)
        suite.drop(test)


def _run_tests(suite, copy, fault):
    built = set()
    hung = None
    for test in suite.knowing(fault.file):
        missing = set(test.programs) - built
        if missing and not copy.build(sorted(missing)):
            return "broken", None
        built |= missing
        word = test.run(copy)
        if word == "failed":
            return "killed", test
        if word == "timed out":
            hung = hung or test
    return ("timed out", hung) if hung else ("survived", None)
