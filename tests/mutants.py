#!/usr/bin/env python3
"""Changes the provider library in one place at a time and asks whether the tests notice.

A mutant is the library with one literal, one comparison or the order of two calls changed. Each is built and the tests
are run, those nearest to the changed source first, until one fails: the mutant is killed. A mutant that no test kills
survives; each survivor is printed with its place. Mutants are drawn at random, but alike for the same --seed, from all
sources of its folders in proportion to what can be changed in them.

Work is done on copies of the tree under build/mutants; the checkout itself is not touched.

Exits 0 where fewer than --allowed in a hundred survive, 1 where more do, 2 where the run could not be made.
"""
import argparse
import dataclasses
import pathlib
import queue
import random
import re
import shutil
import subprocess
import sys
import threading
import time

FOLDERS = ["cmpi/support", "trace", "model", "settings", "factory", "providers"]
# The programs that test the library, and which of them are nearest to a source. The faults are left out: they test
# whether the library survives, which no mutant changes, and take a minute.
PROGRAMS = [
    "cmpi_support_test", "trace_test", "model_test", "settings_test", "settings_line_feed_test", "factory_client_test",
    "factory_setting_test", "factory_association_targets_test", "provider_client_test", "provider_setting_test",
    "provider_associations_test", "conformance_test", "library_test",
]
NEAREST = [
    (r"cmpi/support/", ["cmpi_support_test", "factory_client_test", "provider_associations_test"]),
    (r"trace/", ["trace_test"]),
    (r"model/", ["model_test"]),
    (r"settings/", ["settings_test", "settings_line_feed_test"]),
    (r"factory/(CmpiSupport|AssociationTargets)", ["factory_association_targets_test", "factory_client_test",
                                                   "provider_associations_test"]),
    (r"factory/ExtrinsicMethods", ["provider_client_test"]),
    (r"factory/DNSClientObjFactory", ["factory_client_test", "provider_client_test"]),
    (r"factory/", ["factory_setting_test", "provider_setting_test"]),
    (r"providers/(DNSClientProvider|DNSRemoteServiceAccess|ProviderFrame)", ["provider_client_test"]),
    (r"providers/DNS(General)?SettingDataProvider", ["provider_setting_test"]),
    (r"providers/", ["provider_associations_test"]),
]
# All cases but those that run every case again over a broker whose states lie.
ONCE = "-*.HoldWhere*"
TEST_TIMEOUT = 120  # seconds for one program; a mutant that hangs is killed


@dataclasses.dataclass(frozen=True)
class Mutant:
    file: str
    line: int  # counted from 0
    kind: str
    changed: tuple  # the lines that replace as many lines from `line` on


def runs_for(file, programs):
    """The tests that judge a mutant of this file, as programs and filters: the likeliest to fail first, at last all."""
    runs = []
    provider = re.match(r"providers/(DNS\w+Provider)\.cpp", file)
    if provider:
        runs.append(("conformance_test", f"{provider.group(1)}Cases.*{ONCE}"))
    nearest = next((names for pattern, names in NEAREST if re.match(pattern, file)), [])
    runs += [(name, "*") for name in nearest]
    if file.startswith(("factory/", "providers/")):
        runs.append(("conformance_test", ONCE))
    runs += [(name, "*") for name in programs if name not in nearest]
    return [run for run in runs if run[0] in programs]


def code_of(line):
    """The line without a comment at its end."""
    quoted = False
    for i, c in enumerate(line):
        if c == '"' and line[i - 1:i] != "\\":
            quoted = not quoted
        if not quoted and line.startswith("//", i):
            return line[:i]
    return line


def mutants_of_line(file, number, line):
    code = code_of(line)
    text = code.strip()
    if not text or text.startswith(("#", "static_assert")) or ".reserve(" in text:
        return
    strings = [m.span() for m in re.finditer(r'"(?:[^"\\]|\\.)*"', code)]

    def outside(position):
        return all(not start <= position < end for start, end in strings)

    def replaced(start, end, new, kind):
        return Mutant(file, number, kind, (line[:start] + new + line[end:],))

    for start, end in strings:
        if "extern" in code[:start]:
            continue
        letters = [i for i in range(start + 1, end - 1) if code[i].isalnum() and code[i - 1] not in "%\\"]
        if letters:
            last = letters[-1]
            yield replaced(last, last + 1, "q" if code[last] != "q" else "z", "text")
        blank = code.find("  ", start, end)
        if blank >= 0:
            yield replaced(blank, blank + 1, "", "blank in text")
    for m in re.finditer(r"(?<![\w.])(\d+)(?![\w.])", code):
        if outside(m.start()):
            # 1 is often a failure, which callers only compare with 0.
            other = "0" if m.group() == "1" else str(int(m.group()) + 1)
            yield replaced(m.start(), m.end(), other, "number")
    for m in re.finditer(r" (==|!=|<=|>=|<|>) ", code):
        if outside(m.start()):
            other = {"==": "!=", "!=": "==", "<": "<=", "<=": "<", ">": ">=", ">=": ">"}[m.group(1)]
            yield replaced(m.start(1), m.end(1), other, "comparison")
    for m in re.finditer(r" (&&|\|\|) ", code):
        if outside(m.start()):
            yield replaced(m.start(1), m.end(1), {"&&": "||", "||": "&&"}[m.group(1)], "comparison")
    for m in re.finditer(r"\b(true|false)\b", code):
        if outside(m.start()):
            yield replaced(m.start(), m.end(), {"true": "false", "false": "true"}[m.group()], "literal")
    for m in re.finditer(r"!(?=[\w(])", code):
        if outside(m.start()):
            yield replaced(m.start(), m.end(), "", "comparison")


# A call that is a whole statement on one line.
CALL = re.compile(r"\s*[\w:]+(?:(?:->|\.)\w+)*\(.*\);(\s*//.*)?$")


def mutants_of(file, text):
    lines = text.split("\n")
    for number, line in enumerate(lines):
        yield from mutants_of_line(file, number, line)
        following = lines[number + 1] if number + 1 < len(lines) else ""
        indent = len(line) - len(line.lstrip())
        if CALL.match(line) and CALL.match(following) and indent == len(following) - len(following.lstrip()):
            if ".reserve(" not in line + following:
                yield Mutant(file, number, "call order", (following, line))


def sources(root):
    for folder in FOLDERS:
        for path in sorted((root / folder).iterdir()):
            if path.suffix in (".h", ".cpp") and "_test" not in path.name:
                yield path.relative_to(root).as_posix()


def draw(root, count, seed):
    """All possible mutants in an order in which every beginning is spread over all sources."""
    generator = random.Random(seed)
    placed = []
    for file in sources(root):
        own = list(mutants_of(file, (root / file).read_text()))
        generator.shuffle(own)
        placed += [((i + generator.random()) / len(own), mutant) for i, mutant in enumerate(own)]
    # Every source gets at least one, even if little can be changed in it.
    placed.sort(key=lambda pair: pair[0])
    seen, first, rest = set(), [], []
    for _, mutant in placed:
        (rest if mutant.file in seen else first).append(mutant)
        seen.add(mutant.file)
    return first + rest


class Worker:
    """A copy of the tree with its own build."""

    def __init__(self, root, directory, programs):
        self.tree = directory / "tree"
        self.build = directory / "build"
        self.programs = programs
        ignored = shutil.ignore_patterns("build", ".git")
        if self.tree.exists():
            shutil.rmtree(self.tree)
        shutil.copytree(root, self.tree, symlinks=True, ignore=ignored)

    def run(self, *command, timeout=None):
        return subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, stdin=subprocess.DEVNULL,
                              text=True, errors="replace", timeout=timeout)

    def prepare(self):
        # A mutant is never debugged: without debug information it is built in half the time.
        steps = [["cmake", "-S", str(self.tree), "-B", str(self.build), "-G", "Ninja", "-DCMAKE_BUILD_TYPE=Debug",
                  "-DCMAKE_CXX_FLAGS_DEBUG=-O0", "-DZORVA_TEST_DEBUG_INFO=-g0"],
                 ["cmake", "--build", str(self.build), "-j1", "--target", *self.programs]]
        for step in steps:
            done = self.run(*step)
            if done.returncode != 0:
                raise RuntimeError(f"{' '.join(step[:4])} failed:\n{done.stdout[-2000:]}")
        for program in self.programs:
            if not self.passes(program):
                raise RuntimeError(f"{program} fails without any change")

    def passes(self, program, tests="*"):
        try:
            done = self.run(str(self.build / "bin" / program), "--gtest_fail_fast", "--gtest_brief=1",
                            f"--gtest_filter={tests}", timeout=TEST_TIMEOUT)
        except subprocess.TimeoutExpired:
            return False
        return done.returncode == 0

    def judge(self, mutant):
        """The program that kills the mutant, "" if none does, None if it does not compile."""
        path = self.tree / mutant.file
        original = path.read_text()
        lines = original.split("\n")
        lines[mutant.line:mutant.line + len(mutant.changed)] = mutant.changed
        try:
            path.write_text("\n".join(lines))
            for program, tests in runs_for(mutant.file, self.programs):
                built = self.run("cmake", "--build", str(self.build), "-j1", "--target", program)
                if built.returncode != 0:
                    return None
                if not self.passes(program, tests):
                    return program
            return ""
        finally:
            path.write_text(original)


def main():
    arguments = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    arguments.add_argument("--count", type=int, default=300, help="how many mutants to try (default: 300)")
    arguments.add_argument("--seed", type=int, default=1, help="which mutants are drawn (default: 1)")
    arguments.add_argument("--jobs", type=int, default=2, help="how many are tried at a time (default: 2)")
    arguments.add_argument("--allowed", type=float, default=3.0, help="survivors in a hundred (default: fewer than 3)")
    arguments.add_argument("--only", default="", help="only sources whose path matches this regular expression")
    given = arguments.parse_args()

    root = pathlib.Path(__file__).resolve().parent.parent
    work = root / "build" / "mutants"
    work.mkdir(parents=True, exist_ok=True)
    programs = [p for p in PROGRAMS if any(f"({p}" in f.read_text() for f in root.glob("*/**/CMakeLists.txt")
                                           if "build" not in f.relative_to(root).parts)]
    waiting = queue.Queue()
    for mutant in draw(root, given.count, given.seed):
        if re.search(given.only, mutant.file):
            waiting.put(mutant)
    print(f"{waiting.qsize()} places can be changed; {min(given.count, waiting.qsize())} of them are tried", flush=True)

    lock = threading.Lock()
    tried, survivors, kinds, problems = [], [], {}, []
    began = time.monotonic()

    def work_through(number):
        try:
            worker = Worker(root, work / str(number), programs)
            worker.prepare()
            while True:
                with lock:
                    if len(tried) >= given.count or problems:
                        return
                mutant = waiting.get_nowait()
                killer = worker.judge(mutant)
                if killer is None:
                    continue
                with lock:
                    if len(tried) >= given.count:
                        return
                    tried.append(mutant)
                    kinds[mutant.kind] = kinds.get(mutant.kind, 0) + 1
                    if killer == "":
                        survivors.append(mutant)
                        print(f"SURVIVED {mutant.file}:{mutant.line + 1} {mutant.kind}: "
                              f"{' / '.join(part.strip() for part in mutant.changed)}", flush=True)
                    if len(tried) % 25 == 0:
                        print(f"{len(tried)} tried, {len(survivors)} survived, "
                              f"{int(time.monotonic() - began)} s", flush=True)
        except queue.Empty:
            pass
        except (OSError, RuntimeError) as error:
            with lock:
                problems.append(str(error))

    threads = [threading.Thread(target=work_through, args=(n,)) for n in range(given.jobs)]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    if problems or not tried:
        print("\n".join(problems) or "nothing could be changed", file=sys.stderr)
        return 2
    share = 100.0 * len(survivors) / len(tried)
    files = len({mutant.file for mutant in tried})
    print(f"{len(tried)} mutants in {files} sources "
          f"({', '.join(f'{n} {kind}' for kind, n in sorted(kinds.items()))}): "
          f"{len(survivors)} survived, {share:.1f} in 100")
    return 0 if share < given.allowed else 1


if __name__ == "__main__":
    sys.exit(main())
