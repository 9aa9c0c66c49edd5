#!/usr/bin/env python3
"""Reads the includes of the product's sources and says whether they form a cycle.

A header and the source of the same name count as one file. Three graphs are checked: of files, of folders, and of the
top folders. The provider library's folders may include each other and the folders in LIBRARY_SEES, nothing else. Test
code is left out: it may use everything.

  tests/include_graph.py            checks; exits 1 and prints each cycle where there is one
  tests/include_graph.py --folders  prints which folder includes which
"""
import pathlib
import re
import subprocess
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent
LIBRARY = {"trace", "model", "settings", "factory", "providers"}
LIBRARY_SEES = LIBRARY | {"cmpi", "cmpi/support", "agent/interface", "util"}
NOT_PRODUCT = {"tests", "bench", "fuzz", "examples", "packaging", "cmake"}
# These folders are on the include path, so that the library's sources compile against another vendor's headers.
ON_PATH = ["", "cmpi", "agent/interface"]
INCLUDE = re.compile(r'^\s*#\s*include\s+["<]([^">]+)[">]', re.MULTILINE)


def sources():
    listed = subprocess.run(["git", "ls-files", "*.h", "*.cpp", "*.c"], cwd=ROOT, check=True, capture_output=True, text=True)
    for name in listed.stdout.split():
        path = pathlib.PurePosixPath(name)
        if path.parts[0] in NOT_PRODUCT or "testing" in path.parts or path.stem.endswith("_test") or not (ROOT / path).is_file():
            continue
        yield path


def resolve(including, name, known):
    for base in [str(including.parent), *ON_PATH]:
        candidate = pathlib.PurePosixPath(base) / name if base else pathlib.PurePosixPath(name)
        if candidate in known:
            return candidate
    return None


def file_arrows():
    known = set(sources())
    # The standard has these two include each other.
    standard = {pathlib.PurePosixPath("cmpi/cmpift.h"), pathlib.PurePosixPath("cmpi/cmpimacs.h")}
    for path in sorted(known):
        for name in INCLUDE.findall((ROOT / path).read_text(encoding="utf-8")):
            target = resolve(path, name, known)
            if target is not None and {path, target} != standard:
                yield path, target


def graph(arrows, node):
    """The edges between the nodes that `node` makes of files."""
    result = {}
    for source, target in arrows:
        a, b = node(source), node(target)
        result.setdefault(a, set())
        if a != b:
            result[a].add(b)
            result.setdefault(b, set())
    return result


def cycles(edges):
    """The strongly connected components of more than one node (Tarjan)."""
    index, low, stack, found = {}, {}, [], []

    def visit(node):
        index[node] = low[node] = len(index)
        stack.append(node)
        for target in sorted(edges[node]):
            if target not in index:
                visit(target)
                low[node] = min(low[node], low[target])
            elif target in stack:
                low[node] = min(low[node], index[target])
        if low[node] == index[node]:
            component = []
            while not component or component[-1] != node:
                component.append(stack.pop())
            if len(component) > 1:
                found.append(sorted(component))

    for node in sorted(edges):
        if node not in index:
            visit(node)
    return found


def top_folder(path):
    return path.parts[0]


def main():
    sys.setrecursionlimit(10000)
    arrows = list(file_arrows())
    if not arrows:
        print("no include was found: is this the project's folder?")
        return 1
    folders = graph(arrows, lambda path: str(path.parent))
    if "--folders" in sys.argv:
        for folder in sorted(folders):
            print(f"{folder}: {' '.join(sorted(folders[folder])) or '-'}")
        return 0
    problems = []
    for what, edges in (
        ("files", graph(arrows, lambda path: str(path.with_suffix("")))),
        ("folders", folders),
        ("top folders", graph(arrows, top_folder)),
    ):
        problems += [f"a cycle of {what}: {', '.join(cycle)}" for cycle in cycles(edges)]
    for source, target in arrows:
        if str(source.parent) in LIBRARY and str(target.parent) not in LIBRARY_SEES:
            problems.append(f"{source} includes {target}, which the provider library may not see")
    print("\n".join(problems) or "no cycle")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
